// Whole-string conversions without shift states, in all forms, against one model: which characters fit, when a
// null ends the output, and that nothing behind it is touched. Every output size, length and flag value.
#include "core/lxrecords.h"
#include "support/case_test.h"
#include "support/conversion.h"

namespace lx::test {
namespace {

using I = int32_t;
constexpr I kModes[] = {0, LX_CHARACTERS, LX_TERMINATE, LX_TERMINATE | LX_CHARACTERS};

class Convert : public CaseTest {
 protected:
  static std::vector<TinyCodepage> codepages() {
    std::vector<TinyCodepage> all;
    for (const char* name : {"SINGLE", "SJIS", "EUC", "FOUR", "UTF8"}) all.push_back(case_codepage(name));
    return all;
  }
  LXLocale* locale(const TinyCodepage& cp) { return library.locale(cp); }

  /// A mixed text of one codepage in another one, by `call(output, size, input, length, flags)`: whole,
  /// null-terminated, and with its last character cut.
  template <class In, class Out, class Call>
  static void conversion(const TinyCodepage& from, const TinyCodepage& to, bool null_converted,
                         const Call& call) {
    SCOPED_TRACE(from.file.name + " to " + to.file.name + " " + In::name + " " + Out::name);
    Units text;
    for (LXUChar u : Units{'a', 0x3042, 'Z', 0x4E9C, 0xFF71, 0x101, 0xE9, 0x20AC, 0x4E02, '~', 0x4E04, '\n'})
      if (from.find(u) != nullptr) text.push_back(u);
    for (const bool cut : {false, true}) {
      const auto bytes_of_last = [&] { return Encoded<In>(from, {text.back()}).size(); };
      while (cut && !text.empty() && bytes_of_last() == 1) text.pop_back();
      if (text.empty()) break;
      auto input = Encoded<In>(from, text).units;
      if (cut) {
        input.pop_back();
        text.pop_back();
      }
      for (const bool null : {false, true}) {
        if (cut && null && null_converted) continue;  // the null would be the rest of the character
        OutputModel<typename Out::Unit> model;
        model.cut = cut;
        model.null_terminated = null;
        model.null_converted = null_converted;
        for (LXUChar u : text) model.pieces.push_back(Encoded<Out>(to, {u}).units);
        if (null && null_converted) model.pieces.push_back({0});
        if (null) input.push_back(0);
        const std::vector<typename In::Unit> block(input);  // of its exact size
        for (size_t mode = 0; mode < (null_converted ? 2 : 4); ++mode) {
          const bool chars = (kModes[mode] & LX_CHARACTERS) != 0;
          if (chars && cut && !null) continue;  // a count has no end to cut
          const I length = null ? -1 : chars ? count_of(text) : count_of(block);
          expect_at_every_size(model, kModes[mode], [&](auto* out, I size, I flags) {
            return call(out, size, block.data(), length, flags);
          });
        }
      }
    }
  }
};

TEST_F(Convert, BytesUnicodeAndCodes) {
  for (const TinyCodepage& cp : codepages()) {
    LXLocale* const l = locale(cp);
    const auto bytes = [&](const auto& form) {
      using F = std::decay_t<decltype(form)>;
      states.text = states.output = std::is_same_v<F, Ex>;  // stateless codepages do not look at it
      conversion<F, Unicode>(cp, cp, false,
                             [&](auto* o, I n, auto* p, I m, I f) { return F::decode(o, n, l, p, m, f); });
      conversion<Unicode, F>(cp, cp, false,
                             [&](auto* o, I n, auto* p, I m, I f) { return F::encode(l, o, n, p, m, f); });
      conversion<F, Wide>(cp, cp, true,
                          [&](auto* o, I n, auto* p, I m, I f) { return F::to_codes(l, o, n, p, m, f); });
      conversion<Wide, F>(cp, cp, true,
                          [&](auto* o, I n, auto* p, I m, I f) { return F::from_codes(l, o, n, p, m, f); });
      states = {};
    };
    bytes(kPlain), bytes(kEx);
    conversion<Wide, Unicode>(
        cp, cp, false, [&](auto* o, I n, auto* p, I m, I f) { return LXStringToUnicodeW(o, n, l, p, m, f); });
    conversion<Unicode, Wide>(
        cp, cp, false, [&](auto* o, I n, auto* p, I m, I f) { return LXUnicodeToStringW(l, o, n, p, m, f); });
  }
}

TEST_F(Convert, BetweenCodepages) {
  for (const TinyCodepage& from : codepages())
    for (const TinyCodepage& to : codepages()) {
      const auto between = [&](const auto& form) {
        using F = std::decay_t<decltype(form)>;
        states.text = std::is_same_v<F, Ex>;
        conversion<F, F>(from, to, false, [&](auto* o, I n, auto* p, I m, I f) {
          return F::convert(locale(to), o, n, locale(from), p, m, f);
        });
        states = {};
      };
      between(kPlain), between(kEx), between(kWide);
    }
}

/// With LX_CHARACTERS beside an undefined flag the functions between locales give 0, and the others -1: callers
/// rely on it.
TEST_F(Convert, UndefinedFlagsBesideCharacters) {
  LXLocale* const l = locale(case_codepage("SJIS"));
  const I flags = LX_CHARACTERS | 0x10;
  LXWChar codes[4];
  const auto refuse = [&](const auto& form) {
    typename std::decay_t<decltype(form)>::Unit in[] = {'a', 0}, out[4];
    LXUChar unicode[4];
    EXPECT_EQ(form.convert(l, out, 4, l, in, 1, flags), 0);
    EXPECT_EQ(LXGetError(l), LX_E_INVALID);
    EXPECT_EQ(form.decode(unicode, 4, l, in, 1, flags), -1);
  };
  refuse(kPlain), refuse(kEx), refuse(kWide);
  EXPECT_EQ(LXMbToWide(l, codes, 4, "a", 1, flags), -1);
}

/// ASCII is moved in blocks: another character at every place of a text that is longer than two of them, also
/// one whose value has a low byte of ASCII.
TEST_F(Convert, RunsOfAsciiAroundOtherCharacters) {
  Units run;
  for (LXUChar u = '!'; u < '!' + 37; ++u) run.push_back(u);
  for (const TinyCodepage& from : codepages())
    for (const LXUChar other : {from.characters.back().unicode, from.characters[0x5C].unicode, uint16_t{0x100},
                                uint16_t{0x3041}, uint16_t{0xE0}})
      for (size_t at = 0; at < run.size() && from.find(other) != nullptr; ++at) {
        SCOPED_TRACE(from.file.name + " at " + std::to_string(at) + ": " + std::to_string(other));
        Units text = run;
        text[at] = other;
        const auto input = Encoded<Plain>(from, text);
        for (const TinyCodepage& to : codepages()) {
          const auto output = made<char>([&](char* out, I size) {
            return LXConvertString(locale(to), out, size, locale(from), input.units.data(), input.size(), 0);
          });
          EXPECT_EQ(std::vector<char>(output.begin(), output.end()), Encoded<Plain>(to, text).units)
              << to.file.name;
        }
      }
}

/// Bytes of ASCII that are something else, though ASCII becomes these bytes; and codes are stored as they are,
/// also by a codepage that no Unicode value becomes two bytes in.
TEST(ConvertOneWay, ReadingDiffersFromWriting) {
  namespace fmt = format::codepage;
  TinyCodepage yen = tiny_shift_jis(), low_lead = tiny_shift_jis(), one_way = tiny_shift_jis();
  yen.file.id = 9300, yen.file.name = "TINY-YEN";
  one_way.file.id = 9301, one_way.file.name = "TINY-ONE-WAY";
  yen.file.sections[0][fmt::kUnicode + 2 * 0x5C] = 0xA5;  // 0x5C is U+00A5; U+005C becomes 0x5C
  low_lead.file.sections[0][fmt::kLengths + 0x7E] = 2;    // U+007E becomes 0x7E, which begins a character
  for (size_t page = 1; page < 256; ++page)
    fmt::PageEntry().write(&one_way.file.sections[0][fmt::kPages + page * fmt::PageEntry::kBytes]);
  TinyLibrary library({yen, low_lead, one_way});
  const Units run(20, 'x');
  const Text<char> bytes = std::string(20, 'x') + "\x5C" + std::string(20, 'x') + "~a" + std::string(20, 'x');
  const Units as_yen = run + Units(1, 0xA5) + run + units("~a") + run;
  EXPECT_EQ(decode(kPlain, library.locale(yen), bytes), as_yen);
  const Units cut = run + units("\\") + run + Units(1, 0xFFFD) + run;
  EXPECT_EQ(decode(kPlain, library.locale(low_lead), bytes), cut);
  EXPECT_EQ(LXNumChars(library.locale(low_lead), std::string(70, '~').c_str(), -1), 35);
  const LXWChar codes[] = {0x82A0, 'a', 0x8340};
  char out[8] = {};
  EXPECT_EQ(LXWideToMb(library.locale(one_way), out, 5, codes, 3, 0), 5);
  EXPECT_STREQ(out, "\x82\xA0\x61\x83\x40");
  EXPECT_EQ(LXWideToMb(library.locale(one_way), out, 1, codes, 3, 0), 0) << "never half a character";
  EXPECT_TRUE(library.close());
}

/// The common codepage, with a null behind what is stored; nothing gives -1.
TEST_F(Convert, ThroughTheCommonCodepage) {
  const struct {
    std::string text;  // no more bytes than these may be read
    I length, result;
  } rows[] = {{{"ab\0", 3}, -1, 2}, {{"ab\0", 3}, -2, 2}, {{"ab\0z", 4}, 4, 2}, {"abc", 3, 3},
              {"abc", 2, 2},        {{"\0", 1}, -1, -1},  {{"\0a", 2}, 2, -1},  {"a", 0, -1}};
  for (const auto& row : rows) {
    SCOPED_TRACE(testing::PrintToString(row.text) + std::to_string(row.length));
    const std::vector<char> text(row.text.begin(), row.text.end());
    const std::vector<LXUChar> input(row.text.begin(), row.text.end());
    const auto stored = static_cast<size_t>(std::max(row.result, 0));
    std::vector<LXUChar> units(stored + 1, 0xA5A5);
    EXPECT_EQ(LXComStrToUnicode(text.data(), row.length, units.data()), row.result);
    std::vector<char> out(stored + 1, '\xA5');
    EXPECT_EQ(LXComUnicodeToStr(input.data(), row.length, out.data()), row.result);
    const std::string expected = row.text.substr(0, stored) + '\0';
    EXPECT_TRUE(std::equal(units.begin(), units.end(), expected.begin()));
    EXPECT_TRUE(std::equal(out.begin(), out.end(), expected.begin()));
  }
  const LXUChar beyond[] = {0xE9, 0x3042, 0};
  char out[3];
  EXPECT_EQ(LXComUnicodeToStr(beyond, -1, out), 2);
  EXPECT_STREQ(out, "??");
  LXUChar unit[2];
  EXPECT_EQ(LXComStrToUnicode("\xE9", -1, unit), 1);
  EXPECT_EQ(unit[0], 0xFFFD);
}

}  // namespace
}  // namespace lx::test
