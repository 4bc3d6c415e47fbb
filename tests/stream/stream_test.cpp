// Character streams against a scripted callback that moves any number of bytes, fails or ends at any call: the
// bytes that pass are those of the text, whatever the form and the codepage.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstring>

#include "stream/lxstream.h"
#include "stream/stream_texts.h"

namespace {

using namespace lx::test;

std::string printed(const std::string& bytes) {
  return testing::PrintToString(bytes);
}

class Streams : public testing::Test {
 protected:
  void TearDown() override { EXPECT_TRUE(library_.close()); }

  LXStream* open(LXLocale* locale, Peer& peer, uint32_t mode) {
    LXStream* stream = LXOpenStream(locale, Peer::transfer, &peer, mode);
    EXPECT_NE(stream, nullptr);
    return stream;
  }
  /// Steps of every kind, failures in bursts.
  std::vector<int32_t> random_script(size_t steps) {
    std::vector<int32_t> script;
    while (script.size() < steps) {
      constexpr int32_t kSteps[] = {1, 1, 2, 3, kAll, 0, -1, -7, kNonsense};
      const int32_t step = kSteps[random_() % std::size(kSteps)];
      script.insert(script.end(), step > 0 && step != kNonsense ? 1 : 1 + random_() % 40, step);
    }
    return script;
  }

  const std::vector<TinyCodepage> codepages_ = line_codepages();
  TinyLibrary library_{codepages_};
  std::mt19937 random_{20};
};

/// Writes one character by a form's door.
template <class F>
int32_t write(LXStream* stream, LXLocale* locale, const TinyCharacter& c) {
  const std::vector<char> exact(c.bytes.begin(), c.bytes.end());
  if (std::is_same_v<F, Plain>) return LXWriteChar(stream, locale, exact.data());
  if (std::is_same_v<F, Ex>) return LXWriteCharEx(stream, locale, exact.data(), exact.size() > 1, 99);
  if (std::is_same_v<F, Wide>) return LXWriteCharW(stream, locale, c.code, 99);
  return LXWriteCharU(stream, locale, c.unicode);
}

/// Writes a text as the error codes ask for: a character is given again after 40 and never after 65.
template <class F>
void write_text(LXStream* stream, LXLocale* locale, const Text& text) {
  for (const TinyCharacter& c : text) {
    while (write<F>(stream, locale, c) == 0) {
      const int32_t code = LXGetError(locale);
      EXPECT_TRUE(code == LX_E_STREAM_KEPT || code == LX_E_SIZE) << code;
      if (code != LX_E_SIZE) break;
    }
    EXPECT_LE(stream->count, LX_STREAM_BUFFER);
  }
}

TEST_F(Streams, WritingLosesNothing) {
  for (const TinyCodepage& cp : codepages_) {
    SCOPED_TRACE(cp.file.name);
    LXLocale* locale = library_.locale(cp);
    std::vector<std::vector<int32_t>> scripts;
    for (size_t n = 0; n < 24; ++n) {
      for (int32_t stop : {-1, 0, 1, kNonsense, -9}) {
        scripts.emplace_back(n, 1);
        scripts.back().insert(scripts.back().end(), stop == 0 ? 400 : 60, stop);
      }
    }
    for (int round = 0; round < 100; ++round) scripts.push_back(random_script(200));
    for (const auto& script : scripts) {
      const Text text = random_text(cp, random_, 80);
      in_all_forms([&](auto form) {
        using F = decltype(form);
        if (cp.shift && std::is_same_v<F, Plain>) return;
        Receiver peer;
        peer.script = script;
        LXStream* stream = open(locale, peer, LX_STREAM_WRITE);
        write_text<F>(stream, locale, text);
        peer.script.clear();  // closing would drop what is not taken
        EXPECT_EQ(LXCloseStream(stream, locale), 1) << LXGetError(locale);
        EXPECT_EQ(printed(peer.bytes), printed(stream_bytes<F>(cp, text)));
      });
    }
  }
}

TEST_F(Streams, ReadingLosesNothing) {
  for (const TinyCodepage& cp : codepages_) {
    SCOPED_TRACE(cp.file.name);
    LXLocale* locale = library_.locale(cp);
    for (int round = 0; round < 100; ++round) {
      const Text text = random_text(cp, random_, 60);
      Sender peer, units;
      peer.bytes = stream_bytes<Wide>(cp, text);
      units.bytes = stream_bytes<Unicode>(cp, text);
      peer.script = random_script(150);
      units.script = random_script(150);
      LXStream* in = open(locale, peer, LX_STREAM_READ);
      LXStream* in_units = open(locale, units, LX_STREAM_READ);
      std::vector<LXWChar> codes;
      for (;;) {
        const LXWChar code = LXReadCharW(in, locale);
        if (code < LX_STREAM_FAILURE) {
          EXPECT_EQ(LXGetError(locale), LX_OK);
          codes.push_back(code);
        } else {
          EXPECT_EQ(code == LX_STREAM_END, LXGetError(locale) == LX_OK);
          if (peer.calls > peer.script.size()) break;
        }
        for (size_t n = random_() % 8 == 0 ? random_() % 6 : 0; n > 0 && !codes.empty(); --n, codes.pop_back())
          EXPECT_EQ(LXUngetCharW(in, locale, codes.back()), 1);
      }
      EXPECT_EQ(codes, Wide::encode(cp, text));
      std::vector<LXUChar> read;
      for (;;) {
        const LXUChar u = LXReadCharU(in_units, locale);
        if (u != LX_STREAM_NO_UNIT) read.push_back(u);
        if (u == LX_STREAM_NO_UNIT && units.calls > units.script.size()) break;
      }
      EXPECT_EQ(read, Unicode::encode(cp, text));
      EXPECT_EQ(LXCloseStream(in, locale) + LXCloseStream(in_units, locale), 2);
    }
  }
}

/// Reads strings until the input is over; each in a block of its exact size.
template <class F>
std::vector<std::vector<typename F::Unit>> strings(LXStream* stream, LXLocale* locale, const Peer& peer,
                                                   uint32_t flags, const std::function<int32_t()>& size) {
  std::vector<std::vector<typename F::Unit>> all;
  for (;;) {
    std::vector<typename F::Unit> block(static_cast<size_t>(size()));
    const int32_t n = F::read(stream, locale, block.data(), static_cast<int32_t>(block.size()), flags);
    if (n < 0) {
      EXPECT_EQ(n == -1, LXGetError(locale) == LX_OK);
      if (n == -1 && peer.calls > peer.script.size()) return all;
      continue;
    }
    block.resize(static_cast<size_t>(n));
    if ((flags & LX_TERMINATE) != 0) {
      EXPECT_EQ(block.back(), 0);
      block.pop_back();
    }
    all.push_back(block);
  }
}

/// The parts behind one another, without shift bytes.
template <class Unit>
std::vector<Unit> joined(const TinyCodepage& cp, const std::vector<std::vector<Unit>>& parts) {
  std::vector<Unit> all;
  for (const auto& part : parts)
    for (Unit u : part)
      if (!cp.shift || (u != Unit(cp.shift_out) && u != Unit(cp.shift_in))) all.push_back(u);
  return all;
}

TEST_F(Streams, LinesAreThoseOfTheModel) {
  const auto check = [&](auto form, const TinyCodepage& cp) {
    using F = decltype(form);
    using Strings = std::vector<std::vector<typename F::Unit>>;
    LXLocale* locale = library_.locale(cp);
    const Text text = random_text(cp, random_, 40);
    const uint32_t flags =
        (random_() % 16) << 8 | (random_() % 2) * LX_DROP_RETURNS | (random_() % 2) * LX_TERMINATE;
    SCOPED_TRACE(flags);
    Sender peer;
    peer.bytes = stream_bytes<F>(cp, text);
    // Any number of bytes a call, but for units: half of one ends a string.
    if (!std::is_same_v<F, Unicode>)
      for (int i = 0; i < 100; ++i) peer.script.push_back(1 + static_cast<int32_t>(random_() % 3));
    LXStream* stream = open(locale, peer, LX_STREAM_READ);
    Strings expected;
    for (const Text& line : lines_of(cp, text, flags)) expected.push_back(F::encode(cp, line));
    EXPECT_EQ(strings<F>(stream, locale, peer, flags, [] { return 300; }), expected);

    // In rooms of any size and with failures, the text comes in pieces.
    peer.given = peer.calls = 0;
    peer.script = random_script(60);
    const auto any_size = [&] { return 6 + static_cast<int32_t>(random_() % 9); };
    const Strings pieces = strings<F>(stream, locale, peer, flags & ~LX_DROP_RETURNS, any_size);
    EXPECT_EQ(joined(cp, pieces), joined(cp, Strings{F::encode(cp, text)}));
    EXPECT_EQ(LXCloseStream(stream, locale), 1);
  };
  for (const TinyCodepage& cp : codepages_) {
    SCOPED_TRACE(cp.file.name);
    for (int round = 0; round < 150; ++round) in_all_forms([&](auto form) { check(form, cp); });
  }
}

TEST_F(Streams, ModesAndMemory) {
  LXLocale* locale = library_.locale(codepages_[1]);
  Receiver peer;
  EXPECT_EQ(LXOpenStream(locale, Peer::transfer, &peer, 0x80000052u), nullptr);
  EXPECT_EQ(LXGetError(locale), LX_E_INVALID);
  library_.hooks().fail_at(1);
  EXPECT_EQ(LXOpenStream(locale, Peer::transfer, &peer, LX_STREAM_WRITE), nullptr);
  EXPECT_EQ(LXGetError(locale), LX_E_MEMORY);
  LXStream* stream = open(locale, peer, LX_STREAM_WRITE);
  library_.hooks().fail_frees(true);
  EXPECT_EQ(LXCloseStream(stream, locale), 0);
  EXPECT_EQ(LXGetError(locale), LX_E_FREE);
  library_.hooks().fail_frees(false);
}

}  // namespace
