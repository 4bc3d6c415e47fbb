// Character streams against a scripted callback that moves any number of bytes, fails or ends at any call: the
// bytes that pass are those of the text, whatever the form and the codepage.
#include <cstring>

#include "stream/line_texts.h"
#include "stream/lxstream.h"
#include "stream/stream_peer.h"

namespace lx::test {
namespace {

class Streams : public CaseTest {
 protected:
  /// Calls `body(codepage, locale)` with every codepage.
  template <class Body>
  void in_all_codepages(const Body& body) {
    for (const TinyCodepage& cp : case_codepages()) {
      SCOPED_TRACE(cp.file.name);
      body(cp, library.locale(cp));
    }
  }
  LXStream* open(LXLocale* locale, Peer& peer) {
    LXStream* stream =
        LXOpenStream(locale, Peer::transfer, &peer, peer.sends ? LX_STREAM_READ : LX_STREAM_WRITE);
    EXPECT_NE(stream, nullptr);
    return stream;
  }
  /// Steps of every kind, failures in bursts.
  std::vector<int32_t> random_script(size_t steps) {
    std::vector<int32_t> script;
    while (script.size() < steps) {
      constexpr int32_t kSteps[] = {1, 1, 2, 3, Peer::kAll, 0, -1, -7, Peer::kNonsense};
      const int32_t step = any_of(kSteps);
      script.insert(script.end(), step > 0 && step != Peer::kNonsense ? 1 : 1 + random() % 40, step);
    }
    return script;
  }
};

/// The bytes that a stream of a form carries: units, or bytes that begin and end in the single-byte state.
template <class F>
std::string stream_bytes(const TinyCodepage& cp, const Units& text) {
  using Carried = std::conditional_t<std::is_same_v<F, Unicode>, Unicode, Ex>;
  const auto units = Encoded<Carried>(cp, text).units;
  return {reinterpret_cast<const char*>(units.data()), units.size() * sizeof(units[0])};
}

/// Writes one character by a form's door.
template <class F>
int32_t write(LXStream* stream, LXLocale* locale, const TinyCharacter& c) {
  const std::vector<char> exact(c.bytes.begin(), c.bytes.end());
  if (std::is_same_v<F, Plain>) return LXWriteChar(stream, locale, exact.data());
  if (std::is_same_v<F, Ex>) return LXWriteCharEx(stream, locale, exact.data(), exact.size() > 1, 99);
  if (std::is_same_v<F, Wide>) return LXWriteCharW(stream, locale, c.code, 99);
  return LXWriteCharU(stream, locale, c.unicode);
}

// As the error codes ask for, a character is given again after 40 and never after 65.
TEST_F(Streams, WritingLosesNothing) {
  in_all_codepages([&](const TinyCodepage& cp, LXLocale* locale) {
    std::vector<std::vector<int32_t>> scripts;
    for (size_t n = 0; n < 24; ++n)
      for (int32_t stop : {-1, 0, 1, Peer::kNonsense, -9}) {
        scripts.emplace_back(n, 1);
        scripts.back().insert(scripts.back().end(), stop == 0 ? 400 : 60, stop);
      }
    for (int round = 0; round < 100; ++round) scripts.push_back(random_script(200));
    for (const auto& script : scripts) {
      const Units text = random_text(cp, random, 80);
      forms_of(cp, [&](const auto& form) {
        using F = std::decay_t<decltype(form)>;
        Peer peer{false, "", script};
        LXStream* stream = open(locale, peer);
        for (const LXUChar u : text) {
          int32_t code = LX_E_SIZE;
          while (code == LX_E_SIZE && write<F>(stream, locale, *cp.find(u)) == 0) code = LXGetError(locale);
          EXPECT_TRUE(code == LX_E_SIZE || code == LX_E_STREAM_KEPT) << code;
          EXPECT_LE(stream->count, LX_STREAM_BUFFER);
        }
        peer.script.clear();  // closing would drop what is not taken
        EXPECT_EQ(LXCloseStream(stream, locale), 1) << LXGetError(locale);
        EXPECT_EQ(testing::PrintToString(peer.bytes), testing::PrintToString(stream_bytes<F>(cp, text)));
      });
    }
  });
}

TEST_F(Streams, ReadingLosesNothing) {
  in_all_codepages([&](const TinyCodepage& cp, LXLocale* locale) {
    for (int round = 0; round < 100; ++round) {
      const Units text = random_text(cp, random, 60);
      Peer peer{true, stream_bytes<Wide>(cp, text), random_script(150)};
      Peer units{true, stream_bytes<Unicode>(cp, text), random_script(150)};
      LXStream *const in = open(locale, peer), *const in_units = open(locale, units);
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
        for (size_t n = random() % 8 == 0 ? random() % 6 : 0; n > 0 && !codes.empty(); --n, codes.pop_back())
          EXPECT_EQ(LXUngetCharW(in, locale, codes.back()), 1);
      }
      EXPECT_EQ(codes, Encoded<Wide>(cp, text).codes);
      Units read;
      for (;;) {
        const LXUChar u = LXReadCharU(in_units, locale);
        if (u != LX_STREAM_NO_UNIT) read.push_back(u);
        if (u == LX_STREAM_NO_UNIT && units.calls > units.script.size()) break;
      }
      EXPECT_EQ(read, text);
      EXPECT_EQ(LXCloseStream(in, locale) + LXCloseStream(in_units, locale), 2);
    }
  });
}

/// Reads strings until the input is over; each in a block of its exact size.
template <class F>
std::vector<std::vector<typename F::Unit>> strings(LXStream* stream, LXLocale* locale, const Peer& peer,
                                                   uint32_t flags, const std::function<int32_t()>& size) {
  std::vector<std::vector<typename F::Unit>> all;
  for (;;) {
    std::vector<typename F::Unit> block(static_cast<size_t>(size()));
    const int32_t n = F::read_string(stream, locale, block.data(), count_of(block), flags);
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

/// The lines of a text in a form, as the model of line ends has them.
template <class F>
std::vector<std::vector<typename F::Unit>> lines_of(const TinyCodepage& cp, const Units& text, uint32_t flags) {
  const Units ends = line_ends(cp);
  std::vector<std::vector<typename F::Unit>> lines;
  for (size_t at = 0; at < text.size();) {
    const size_t past = find_eol(ends, text, at, flags & LX_EOL_ALL).past;
    Units line;
    for (; at < past; ++at) {
      const bool pair = at + 1 < past && text[at] == ends[1] && text[at + 1] == ends[0];
      if (!pair || (flags & LX_DROP_RETURNS) == 0) line.push_back(text[at]);
    }
    lines.push_back(Encoded<F>(cp, line).units);
  }
  return lines;
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
  const auto check = [&](const auto& form, const TinyCodepage& cp, LXLocale* locale) {
    using F = std::decay_t<decltype(form)>;
    const Units text = random_text(cp, random, 40);
    const uint32_t flags =
        (random() % 16) << 8 | (random() % 2) * LX_DROP_RETURNS | (random() % 2) * LX_TERMINATE;
    SCOPED_TRACE(flags);
    Peer peer{true, stream_bytes<F>(cp, text)};
    // Any number of bytes a call, but for units: half of one ends a string.
    if (!std::is_same_v<F, Unicode>)
      for (int i = 0; i < 100; ++i) peer.script.push_back(1 + static_cast<int32_t>(random() % 3));
    LXStream* stream = open(locale, peer);
    EXPECT_EQ(strings<F>(stream, locale, peer, flags, [] { return 300; }), lines_of<F>(cp, text, flags));

    // In rooms of any size and with failures, the text comes in pieces.
    peer.given = peer.calls = 0;
    peer.script = random_script(60);
    const auto any_size = [&] { return 6 + static_cast<int32_t>(random() % 9); };
    const auto pieces = strings<F>(stream, locale, peer, flags & ~LX_DROP_RETURNS, any_size);
    EXPECT_EQ(joined(cp, pieces), joined(cp, lines_of<F>(cp, text, 0)));
    EXPECT_EQ(LXCloseStream(stream, locale), 1);
  };
  in_all_codepages([&](const TinyCodepage& cp, LXLocale* locale) {
    for (int round = 0; round < 150; ++round) in_all_forms([&](const auto& form) { check(form, cp, locale); });
  });
}

TEST_F(Streams, ModesAndFailingFrees) {
  LXLocale* locale = library.locale(case_codepage("SJIS"));
  Peer peer{false};
  EXPECT_EQ(LXOpenStream(locale, Peer::transfer, &peer, 0x80000052u), nullptr);
  EXPECT_EQ(LXGetError(locale), LX_E_INVALID);
  LXStream* stream = open(locale, peer);
  library.hooks().fail_frees(true);
  EXPECT_EQ(LXCloseStream(stream, locale), 0);
  EXPECT_EQ(LXGetError(locale), LX_E_FREE);
  library.hooks().fail_frees(false);
}

}  // namespace
}  // namespace lx::test
