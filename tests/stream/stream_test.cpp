// Character streams against a scripted callback that moves any number of bytes, fails or ends at any call: the
// bytes that pass are those of the text, whatever the form and the codepage.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstring>

#include "stream/lxstream.h"
#include "stream/stream_texts.h"

namespace {

using namespace lx::test;

constexpr int32_t kAll = 1000;       // moves what it is asked to
constexpr int32_t kNonsense = 2000;  // claims more than that

/// The far end of a stream: what each call does, and behind the script all that is asked for.
struct Peer {
  std::string bytes;  // what a write stream sent, or what a read stream is to get
  std::vector<int32_t> script;
  size_t calls = 0;
  size_t given = 0;

  static int32_t transfer(void* user, char* buffer, int32_t wanted) {
    Peer& peer = *static_cast<Peer*>(user);
    const int32_t step = peer.calls < peer.script.size() ? peer.script[peer.calls] : kAll;
    ++peer.calls;
    EXPECT_GE(wanted, 1);
    if (step == kNonsense) return wanted + 1;
    return step < 0 ? step : peer.move(buffer, std::min(step, wanted));
  }
  virtual ~Peer() = default;
  virtual int32_t move(char* buffer, int32_t count) = 0;
};
struct Sender : Peer {
  int32_t move(char* buffer, int32_t count) override {
    const size_t n = std::min(static_cast<size_t>(count), bytes.size() - given);
    bytes.copy(buffer, n, given);
    given += n;
    return static_cast<int32_t>(n);
  }
};
struct Receiver : Peer {
  int32_t move(char* buffer, int32_t count) override {
    bytes.append(buffer, static_cast<size_t>(count));
    return count;
  }
};

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

/// "LINE|LINE|..." of a text that is read with this size, nulls as dots; "=COUNT" behind lines of characters.
template <auto kRead>
std::string lines(LXLocale* locale, const std::string& text, int32_t size, uint32_t flags) {
  Sender peer;
  peer.bytes = text;
  LXStream* stream = LXOpenStream(locale, Peer::transfer, &peer, LX_STREAM_READ);
  const bool characters = (flags & LX_CHARACTERS) != 0;
  std::string all;
  for (int32_t n = 0, calls = 0; n >= 0 && calls < 20; ++calls) {
    std::string block(static_cast<size_t>(size) * (characters ? 4 : 1), '#');
    block.shrink_to_fit();
    n = kRead(stream, locale, block.data(), size, flags);
    if (n < 0) all += std::to_string(n);
    if (n >= 0 && !characters) all += block.substr(0, static_cast<size_t>(n)) + '|';
    if (n >= 0 && characters) all += block.substr(0, block.find('#')) + '=' + std::to_string(n) + '|';
  }
  LXCloseStream(stream, locale);
  std::replace(all.begin(), all.end(), '\0', '.');
  return all;
}

TEST_F(Streams, SizesOfStrings) {
  LXLocale* jis = library_.locale(codepages_[1]);
  LXLocale* shift = library_.locale(codepages_[4]);
  const auto plain = lines<LXReadString>;
  const auto ex = lines<LXReadStringEx>;
  const uint32_t kDrop = LX_DROP_RETURNS;
  const uint32_t kChars = LX_CHARACTERS;
  // A pair that does not fit waits; alone in a room of one it is parted.
  EXPECT_EQ(plain(jis, "ab\r\nc", 3, LX_EOL_CRLF), "ab|\r\n|c|-1");
  EXPECT_EQ(plain(jis, "\r\na", 1, LX_EOL_CRLF), "\r|\n|a|-1");
  EXPECT_EQ(plain(jis, "ab\r\nc", 3, LX_EOL_CRLF | kDrop), "ab\n|c|-1");
  EXPECT_EQ(plain(jis, "a\r\r\nb\r", 9, kDrop), "a\r\nb\r|-1");
  EXPECT_EQ(plain(jis, "\x82\xA0\x82\xA0z", 3, 0), "\x82\xA0|\x82\xA0z|-1");
  EXPECT_EQ(plain(jis, "\x82\xA0\x82\xA0z", 3, LX_TERMINATE), "\x82\xA0.|\x82\xA0.|z.|-1");
  EXPECT_EQ(plain(jis, "\x82\xA0zz", 2, kChars), "\x82\xA0z=2|z=1|-1");
  EXPECT_EQ(plain(jis, "\x82\xA0zz", 2, kChars | LX_TERMINATE), "\x82\xA0.=2|z.=2|z.=2|-1");
  EXPECT_EQ(plain(jis, "ab", 1, LX_TERMINATE).substr(0, 4), ".|.|") << "no room for a character";
  EXPECT_EQ(plain(jis, "a\x82", 9, 0), "a|-2") << "half a character";
  EXPECT_EQ(plain(jis, "a", 9, 0x1000), "-2");
  // A string of the Ex form has room for its Shift-In.
  EXPECT_EQ(ex(shift, "\x0E\x44\x47\x44\x48\x0F\xC1", 6, 0), "\x0E\x44\x47\x44\x48\x0F|\xC1|-1");
  EXPECT_EQ(ex(shift, "\x0E\x44\x47\x44\x48\x0F\xC1", 5, 0), "\x0E\x44\x47\x0F|\x0E\x44\x48\x0F\xC1|-1");
  EXPECT_EQ(ex(shift, "\x0E\x44\x47\x0F\x0E\x44\x48", 1, kChars), "\x0E\x44\x47\x0F=1|\x0E\x44\x48\x0F=1|-1");
  EXPECT_EQ(ex(shift, "\x0E\x44\x47\x44\x25\x0F\x25\xC1", 9, LX_EOL_LF),
            "\x0E\x44\x47\x44\x25\x0F\x25|\xC1|-1");
  EXPECT_EQ(ex(shift, "\x0E\x44\x47", 3, 0).substr(0, 2), "||") << "no room for a character";
}

TEST_F(Streams, UnitsByHalves) {
  struct Row {
    std::vector<int32_t> script;  // the first read takes the first step
    int32_t first, second;        // codes; 0xFFFF comes with them, or the unit 'AB'
    bool end;                     // the first one: no unit, and no error
  };
  const Row rows[] = {{{1}, 63, 0, false},     {{-1}, 0, 0, true},
                      {{0}, 64, 0, false},     {{kNonsense}, 64, 0, false},
                      {{-2}, 64, 0, false},    {{1, -1}, 63, 61, false},
                      {{1, 0}, 63, 63, false}, {{1, kNonsense}, 63, 63, false},
                      {{1, -2}, 63, 63, false}};
  LXLocale* locale = library_.locale(codepages_[0]);
  for (const Row& row : rows) {
    SCOPED_TRACE(&row - rows);
    Sender peer;
    peer.bytes = "AB";
    peer.script = row.script;
    LXStream* stream = open(locale, peer, LX_STREAM_READ);
    LXUChar unit = 0;
    memcpy(&unit, "AB", 2);
    EXPECT_EQ(LXReadCharU(stream, locale), LX_STREAM_NO_UNIT);
    EXPECT_EQ(LXGetError(locale), row.end ? LX_OK : row.first);
    EXPECT_EQ(LXReadCharU(stream, locale), row.second == 0 ? unit : LX_STREAM_NO_UNIT);
    EXPECT_EQ(LXGetError(locale), row.second);
    if (row.second != 0) {
      EXPECT_EQ(LXReadCharU(stream, locale), unit) << "the half is kept";
    }
    EXPECT_EQ(LXCloseStream(stream, locale), 1);
  }
}

TEST_F(Streams, PushedBackToTheLimit) {
  LXLocale* jis = library_.locale(codepages_[1]);
  Sender peer;
  LXStream* stream = open(jis, peer, LX_STREAM_READ);
  for (int i = 0; i < 39; ++i) EXPECT_EQ(LXUngetChar(stream, jis, "\x82\xA0"), 1);
  EXPECT_EQ(LXUngetChar(stream, jis, "a"), 1);
  EXPECT_EQ(LXUngetCharU(stream, jis, 0x4141), 0);
  EXPECT_EQ(LXGetError(jis), LX_E_SIZE);
  EXPECT_EQ(LXUngetCharEx(stream, jis, "b", 1), 1)
      << "the 80th byte; without shift states the state says nothing";
  EXPECT_EQ(LXUngetCharW(stream, jis, 'c'), 0);
  EXPECT_EQ(LXGetError(jis), LX_E_SIZE);
  EXPECT_EQ(LXReadCharW(stream, jis), LXWChar{'b'});
  EXPECT_EQ(LXReadCharW(stream, jis), LXWChar{'a'});
  for (int i = 0; i < 39; ++i) EXPECT_EQ(LXReadCharW(stream, jis), LXWChar{0x82A0});
  EXPECT_EQ(LXReadCharW(stream, jis), LX_STREAM_END);
  EXPECT_EQ(LXUngetChar(stream, jis, "a"), 1);
  EXPECT_EQ(LXFlushStream(stream, jis), 1);
  EXPECT_EQ(LXReadCharW(stream, jis), LX_STREAM_END) << "flushed";
  peer.script.assign(peer.calls + 1, -1);
  EXPECT_EQ(LXReadCharW(stream, jis), LX_STREAM_END) << "a failure before the first byte";
  EXPECT_EQ(LXGetError(jis), LX_OK);
  EXPECT_EQ(LXCloseStream(stream, jis), 1);

  // Flushing keeps the state of what follows.
  LXLocale* shift = library_.locale(codepages_[4]);
  peer.bytes = "\x0E\x44\x47\x44\x48";
  stream = open(shift, peer, LX_STREAM_READ);
  EXPECT_EQ(LXReadCharW(stream, shift), LXWChar{0x4447});
  EXPECT_EQ(LXUngetCharW(stream, shift, 0xC1), 1);
  EXPECT_EQ(LXFlushStream(stream, shift), 1);
  EXPECT_EQ(LXReadCharW(stream, shift), LXWChar{0x4448});
  EXPECT_EQ(LXCloseStream(stream, shift), 1);
}

TEST_F(Streams, WhatTheCallbackDoesNotTake) {
  LXLocale* shift = library_.locale(codepages_[4]);
  Receiver peer;
  LXStream* stream = open(shift, peer, LX_STREAM_WRITE);
  peer.script = {-1};
  EXPECT_EQ(LXWriteCharW(stream, shift, 0x4447, 0), 0);
  EXPECT_EQ(LXGetError(shift), LX_E_STREAM_KEPT);
  peer.script.assign(1000, -1);
  for (int i = 0; i < 38; ++i) EXPECT_EQ(LXWriteCharEx(stream, shift, "\x44\x48", 1, 0), 0);
  EXPECT_EQ(LXWriteCharW(stream, shift, 0xC1, 0), 0) << "79 bytes are kept; a Shift-In and a byte do not fit";
  EXPECT_EQ(LXGetError(shift), LX_E_SIZE);
  EXPECT_EQ(LXWriteChar(stream, shift, "\xC2"), 0);
  EXPECT_EQ(LXGetError(shift), LX_E_STREAM_KEPT) << "the plain form knows no shift byte: 80";
  peer.script.assign(2 * LX_STREAM_OFFERS, 0);
  peer.script[LX_STREAM_OFFERS - 1] = 1;  // in a row: it counts from here again
  peer.calls = 0;
  EXPECT_EQ(LXFlushStream(stream, shift), 0);
  EXPECT_EQ(peer.calls, peer.script.size());
  EXPECT_EQ(LXGetError(shift), LX_E_STREAM_KEPT);
  EXPECT_EQ(LXFlushStream(stream, shift), 1);
  std::string expected = "\x0E\x44\x47";
  for (int i = 0; i < 38; ++i) expected += "\x44\x48";
  EXPECT_EQ(printed(peer.bytes), printed(expected + "\xC2"));
  peer.bytes.clear();
  peer.calls = 0;
  peer.script = {0, -1, -1};
  EXPECT_EQ(LXWriteCharW(stream, shift, 0x4448, 0), 0);
  EXPECT_EQ(LXFlushStream(stream, shift), 0);
  EXPECT_EQ(LXGetError(shift), LX_E_STREAM_FLUSH);
  EXPECT_EQ(LXFlushStream(stream, shift), 1) << "dropped";
  // Closing: the Shift-In in a call of its own.
  const size_t calls = peer.calls;
  EXPECT_EQ(LXCloseStream(stream, shift), 1);
  EXPECT_EQ(peer.bytes, "\x0F");
  EXPECT_EQ(peer.calls, calls + 1);
  for (bool kept : {false, true}) {
    peer.script.assign(kept ? peer.calls + 99 : 0, -1);
    stream = open(shift, peer, LX_STREAM_WRITE);
    EXPECT_EQ(LXWriteCharW(stream, shift, 0x4447, 0), kept ? 0 : 1);
    peer.script.assign(peer.calls + 99, -1);
    EXPECT_EQ(LXCloseStream(stream, shift), 0);
    EXPECT_EQ(LXGetError(shift), LX_E_STREAM_FLUSH);
  }
}

TEST_F(Streams, RefusedCalls) {
  LXLocale* locale = library_.locale(codepages_[1]);
  Sender from;
  Receiver to;
  EXPECT_EQ(LXOpenStream(locale, Peer::transfer, &to, 0x80000052u), nullptr);
  EXPECT_EQ(LXGetError(locale), LX_E_INVALID);
  library_.hooks().fail_at(1);
  EXPECT_EQ(LXOpenStream(locale, Peer::transfer, &to, LX_STREAM_WRITE), nullptr);
  EXPECT_EQ(LXGetError(locale), LX_E_MEMORY);
  LXStream* in = open(locale, from, LX_STREAM_READ);
  LXStream* out = open(locale, to, LX_STREAM_WRITE);
  char byte = 0;
  EXPECT_EQ(LXReadCharU(out, locale), LX_STREAM_NO_UNIT);
  EXPECT_EQ(LXReadCharW(out, locale), LX_STREAM_FAILURE);
  EXPECT_EQ(LXReadStringEx(out, locale, &byte, 1, 0), -2);
  EXPECT_EQ(LXUngetChar(out, locale, "a"), 0);
  EXPECT_EQ(LXWriteChar(in, locale, "a"), 0);
  EXPECT_EQ(LXGetError(locale), LX_E_STREAM_DIRECTION);
  EXPECT_EQ(in->count + out->count, 0);
  EXPECT_EQ(from.calls + to.calls, 0u);
  library_.hooks().fail_frees(true);
  EXPECT_EQ(LXCloseStream(in, locale), 0);
  EXPECT_EQ(LXGetError(locale), LX_E_FREE);
  library_.hooks().fail_frees(false);
  EXPECT_EQ(LXCloseStream(out, locale), 1);
}

}  // namespace
