// Line ends in strings, in the four forms against one model on characters; and character streams against a
// scripted callback that moves any number of bytes, fails or ends at any call: the bytes that pass are those of
// the text, whatever the form and the codepage.
#include <cstring>

#include "stream/lxstream.h"
#include "stream/stream_peer.h"
#include "support/case_test.h"
#include "support/slowness.h"

namespace lx::test {
namespace {

/// A text full of line ends of every kind.
Units random_text(const TinyCodepage& cp, std::mt19937& random, size_t most) {
  const Units ends = line_ends(cp), often = ends.substr(0, 2);
  Units alphabet = ends + often + often + LXUChar(cp.characters.back().unicode), text(random() % most, 0);
  for (size_t i = 0; i < cp.characters.size(); i += cp.characters.size() / 7)
    alphabet.push_back(cp.characters[i].unicode);
  for (LXUChar& u : text) u = alphabet[random() % alphabet.size()];
  return text;
}

struct FoundEol {
  size_t past;  // characters up to and with it
  uint32_t kind;
  int32_t length;
};
/// The line ends one after the other at each character, in the order in which they are looked for.
FoundEol find_eol(const Units& ends, const Units& text, size_t from, uint32_t kinds) {
  for (size_t i = from; i < text.size(); ++i) {
    const bool pair = text[i] == ends[1] && i + 1 < text.size() && text[i + 1] == ends[0];
    if ((kinds & LX_EOL_CRLF) != 0 && pair) return {i + 2, LX_EOL_CRLF, 2};
    for (const auto& [kind, end] : {std::pair{LX_EOL_LF, 0}, {LX_EOL_THIRD, 2}, {LX_EOL_FOURTH, 3}})
      if ((kinds & kind) != 0 && text[i] == ends[static_cast<size_t>(end)]) return {i + 1, kind, 1};
  }
  return {text.size(), LX_EOL_NONE, 0};
}

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
  /// Looks for line ends in the text, in a block of its exact size and with `behind` after it: by its length in
  /// units and in characters and, without a null in it and nothing behind, null-terminated.
  template <class F>
  static void find_in(LXLocale* locale, const TinyCodepage& cp, const Units& text, const Units& behind,
                      uint32_t kinds) {
    const FoundEol model = find_eol(line_ends(cp), text, 0, kinds != 0 ? kinds : LX_EOL_LF);
    const Encoded<F> before(cp, text.substr(0, model.past)), whole(cp, text);
    auto units = whole.units;
    const bool terminated = behind.empty() && std::count(units.begin(), units.end(), 0) == 0;
    const auto rest = Encoded<F>(cp, behind).units;
    units.insert(units.end(), rest.begin(), rest.end());
    // A count of characters looks at the byte behind the last one.
    if (terminated || rest.empty()) units.push_back(terminated ? 0 : 0x41);
    units.shrink_to_fit();
    for (const auto& [length, flag] :
         {std::pair(whole.size(), 0u), {count_of(text), LX_CHARACTERS}, {-1, 0u}}) {
      if (length < 0 && !terminated) continue;
      SCOPED_TRACE(length);
      uint32_t kind = 1;
      int32_t eol_length = -1;
      const auto* end = F::get_eol(locale, units.data(), length, &kind, &eol_length, kinds | flag);
      EXPECT_EQ(LXGetError(locale), LX_OK);
      EXPECT_EQ(kind, model.kind);
      EXPECT_EQ(eol_length, model.length);
      EXPECT_EQ(end, model.kind == LX_EOL_NONE ? nullptr : units.data() + before.size());
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

TEST_F(Streams, LineEndsAreFoundAlikeInAllForms) {
  in_all_codepages([&](const TinyCodepage& cp, LXLocale* locale) {
    for (int round = 0; round < 300 / kSlowness; ++round) {
      const Units text = random_text(cp, random, 9), behind = random_text(cp, random, 1 + round % 3);
      const uint32_t kinds = (random() % 16) << 8;
      SCOPED_TRACE(kinds);
      forms_of(cp, [&](const auto& form) {
        find_in<std::decay_t<decltype(form)>>(locale, cp, text, behind, kinds);
      });
    }
  });
}

// The order is fixed and line feeds add up; two together are no line end that anybody wants, and stay.
TEST_F(Streams, LineEndsAreStored) {
  const std::pair<uint32_t, std::string> rows[] = {
      // flags, indexes of the line ends
      {0, "0"},       {0x1000, "0"},  {0x100, "0"},   {0x200, "10"}, {0x400, "2"},     {0x800, "3"},
      {0x1200, "10"}, {0x1100, "00"}, {0x300, "010"}, {0xC00, "32"}, {0x1F00, "32010"}};
  in_all_codepages([&](const TinyCodepage& cp, LXLocale* locale) {
    for (const auto& [flags, order] : rows) {
      SCOPED_TRACE(flags);
      Units text;
      for (char index : order) text += line_ends(cp)[static_cast<size_t>(index - '0')];
      in_all_forms([&, flags = flags](const auto& form) {
        using F = std::decay_t<decltype(form)>;
        const auto expected = Encoded<F>(cp, text).units;
        std::vector<typename F::Unit> out(expected.size());
        EXPECT_EQ(F::put_eol(locale, out.data(), flags), out.data() + out.size());
        EXPECT_EQ(out, expected);
      });
    }
  });
}

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
    for (int round = 0; round < 100 / kSlowness; ++round) scripts.push_back(random_script(200));
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
    for (int round = 0; round < 100 / kSlowness; ++round) {
      const Units text = random_text(cp, random, 60);
      Peer peer{true, stream_bytes<Wide>(cp, text), random_script(150)};
      LXStream* const in = open(locale, peer);
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
      EXPECT_EQ(LXCloseStream(in, locale), 1);
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
    for (int round = 0; round < 150 / kSlowness; ++round)
      in_all_forms([&](const auto& form) { check(form, cp, locale); });
  });
}

}  // namespace
}  // namespace lx::test
