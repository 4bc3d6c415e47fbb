// Whole-string conversions without shift states, in all forms, against one model: which characters fit, when a
// null ends the output, and that nothing behind it is touched. Every output size, length and flag value.
#include <gtest/gtest.h>

#include <algorithm>
#include <functional>

#include "core/lxformat.h"
#include "support/tiny_codepages.h"

namespace {

namespace fmt = lx::format::codepage;

using lx::test::TinyCodepage;
using lx::test::TinyLibrary;

using I = int32_t;

constexpr int32_t kModes[] = {0, LX_TERMINATE, LX_CHARACTERS, LX_TERMINATE | LX_CHARACTERS};

/// What a conversion should give: pieces of output, one a character, in order.
template <class Unit>
struct Model {
  std::vector<std::vector<Unit>> pieces;
  bool cut = false;              // the input ends inside a character
  bool null_terminated = false;  // the length is given as -1
  bool sized_in_chars = true;    // LX_CHARACTERS concerns the output too
  bool ends_with_null = true;    // the forms that do not convert the null themselves

  std::vector<Unit> output(int32_t size, int32_t flags, int32_t* result) const {
    std::vector<Unit> out;
    *result = 0;
    const bool terminate = (flags & LX_TERMINATE) != 0;
    if (size <= 0 || (pieces.empty() && !cut && !null_terminated && !terminate)) return out;
    const bool chars = (flags & LX_CHARACTERS) != 0 && sized_in_chars;
    const size_t limit = static_cast<size_t>(size) - terminate;
    size_t used = 0;
    size_t taken = 0;
    for (const auto& piece : pieces) {
      const size_t grown = used + (chars ? 1 : piece.size());
      if (grown > limit) break;
      used = grown;
      ++taken;
      out.insert(out.end(), piece.begin(), piece.end());
    }
    const bool all = taken == pieces.size() && !cut;
    if (terminate || (ends_with_null && null_terminated && all && used < limit)) {
      out.push_back(0);
      ++used;
    }
    *result = static_cast<int32_t>(used);
    return out;
  }
};

/// Calls a conversion for every size up to two more than it can use, and compares result, output and canaries.
template <class Unit, class Call>
void check(const Model<Unit>& model, int32_t flags, const Call& convert) {
  size_t needed = 1;
  for (const auto& piece : model.pieces) needed += piece.size();
  const Unit canary = static_cast<Unit>(0xA5A5A5A5);
  for (int32_t size = 0; size <= static_cast<int32_t>(needed) + 2; ++size) {
    int32_t result = 0;
    std::vector<Unit> expected = model.output(size, flags, &result);
    std::vector<Unit> output(needed + 4, canary);
    expected.resize(output.size(), canary);
    EXPECT_EQ(convert(output.data(), size, flags), result) << "size " << size << " flags " << flags;
    EXPECT_EQ(output, expected) << "size " << size << " flags " << flags;
  }
}

template <class Unit>
std::vector<Unit> terminated(std::vector<Unit> text, bool null) {
  if (null) text.push_back(0);
  return text;  // no more room than that: reading behind it is seen
}

std::vector<char> bytes_of(const std::string& text) {
  return {text.begin(), text.end()};
}

class Convert : public testing::Test {
 protected:
  void TearDown() override { EXPECT_TRUE(library_.close()); }

  static std::vector<TinyCodepage> codepages() {
    return {lx::test::tiny_single(), lx::test::tiny_shift_jis(), lx::test::tiny_euc(), lx::test::tiny_four(),
            lx::test::tiny_utf8()};
  }
  /// The Unicode values of a mixed text that this codepage has.
  static std::vector<uint16_t> text_in(const TinyCodepage& cp) {
    const uint16_t mixed[] = {'a',  0x3042, 'Z',    0x4E9C, 0xFF71, 0x0101,
                              0xE9, 0x20AC, 0x4E02, '~',    0x4E04, '\n'};
    std::vector<uint16_t> text;
    for (uint16_t u : mixed)
      if (cp.find(u) != nullptr) text.push_back(u);
    return text;
  }
  static std::vector<char> encoded(const TinyCodepage& cp, uint16_t u) {
    if (cp.file.id != 57352) return bytes_of(cp.encode({u}));
    std::string utf8;  // what is not listed is computed all the same
    if (u < 0x80)
      utf8 = {static_cast<char>(u)};
    else if (u < 0x800)
      utf8 = {static_cast<char>(0xC0 | u >> 6), static_cast<char>(0x80 | (u & 0x3F))};
    else
      utf8 = {static_cast<char>(0xE0 | u >> 12), static_cast<char>(0x80 | (u >> 6 & 0x3F)),
              static_cast<char>(0x80 | (u & 0x3F))};
    return bytes_of(utf8);
  }
  static uint32_t code_of(const TinyCodepage& cp, uint16_t u) {
    uint32_t code = 0;
    for (char byte : encoded(cp, u)) code = code << 8 | static_cast<uint8_t>(byte);
    return code;
  }
  static std::vector<char> encoded(const TinyCodepage& cp, const std::vector<uint16_t>& text) {
    std::vector<char> bytes;
    for (uint16_t u : text)
      for (char byte : encoded(cp, u)) bytes.push_back(byte);
    return bytes;
  }

  /// The three ways to give a byte text: whole, null-terminated, and with its last character cut.
  struct Input {
    std::vector<char> bytes;
    int32_t length, chars;
    size_t whole_chars;
    bool cut, null_terminated;
  };
  static std::vector<Input> inputs(const TinyCodepage& cp, const std::vector<uint16_t>& text) {
    const std::vector<char> bytes = encoded(cp, text);
    const int32_t length = static_cast<int32_t>(bytes.size());
    const int32_t chars = static_cast<int32_t>(text.size());
    std::vector<Input> made{{bytes, length, chars, text.size(), false, false},
                            {terminated(bytes, true), -1, -1, text.size(), false, true}};
    for (size_t n = text.size(); n-- > 0;) {
      if (encoded(cp, text[n]).size() == 1) continue;
      std::vector<char> cut = encoded(cp, {text.begin(), text.begin() + static_cast<long>(n) + 1});
      cut = std::vector<char>(cut.begin(), cut.end() - 1);
      made.push_back({cut, static_cast<int32_t>(cut.size()), 0, n, true, false});
      made.push_back({terminated(cut, true), -1, -1, n, true, true});
      break;
    }
    return made;
  }

  TinyLibrary library_;
};

TEST_F(Convert, BytesToBytes) {
  for (const TinyCodepage& from : codepages()) {
    for (const TinyCodepage& to : codepages()) {
      SCOPED_TRACE(from.file.name + " to " + to.file.name);
      LXLocale* from_l = library_.locale(from);
      LXLocale* to_l = library_.locale(to);
      const auto text = text_in(from);
      for (const Input& in : inputs(from, text)) {
        const char* bytes = in.bytes.data();
        Model<char> model;
        for (size_t i = 0; i < in.whole_chars; ++i) model.pieces.push_back(encoded(to, text[i]));
        model.cut = in.cut;
        model.null_terminated = in.null_terminated;
        for (int32_t flags : kModes) {
          if ((flags & LX_CHARACTERS) != 0 && in.cut && !in.null_terminated)
            continue;  // a count has no end to cut
          const int32_t length = (flags & LX_CHARACTERS) != 0 ? in.chars : in.length;
          check(model, flags,
                [&](auto* o, I n, I f) { return LXConvertString(to_l, o, n, from_l, bytes, length, f); });
          check(model, flags, [&](auto* o, I n, I f) {
            return LXConvertStringEx(to_l, o, 0, n, from_l, bytes, 1, length, f);
          });
        }
      }
    }
  }
}

TEST_F(Convert, BytesToUnicodeAndCodes) {
  for (const TinyCodepage& cp : codepages()) {
    SCOPED_TRACE(cp.file.name);
    LXLocale* l = library_.locale(cp);
    const auto text = text_in(cp);
    for (const Input& in : inputs(cp, text)) {
      const char* bytes = in.bytes.data();
      Model<LXUChar> units;
      Model<LXWChar> codes;
      units.cut = codes.cut = in.cut;
      units.null_terminated = codes.null_terminated = in.null_terminated;
      units.sized_in_chars = codes.sized_in_chars = codes.ends_with_null = false;
      for (size_t i = 0; i < in.whole_chars; ++i) {
        units.pieces.push_back({text[i]});
        codes.pieces.push_back({code_of(cp, text[i])});
      }
      for (int32_t flags : kModes) {
        if ((flags & LX_CHARACTERS) != 0 && in.cut && !in.null_terminated) continue;
        const int32_t length = (flags & LX_CHARACTERS) != 0 ? in.chars : in.length;
        check(units, flags, [&](auto* o, I n, I f) { return LXStringToUnicode(o, n, l, bytes, length, f); });
        check(units, flags,
              [&](auto* o, I n, I f) { return LXStringToUnicodeEx(o, n, l, bytes, 1, length, f); });
      }
      if (in.cut && in.null_terminated) continue;  // the null would be the rest of the character
      if (in.null_terminated) codes.pieces.push_back({0});
      for (int32_t flags : {0, static_cast<int32_t>(LX_CHARACTERS)}) {
        if (flags != 0 && in.cut) continue;
        const int32_t length = flags != 0 ? in.chars : in.length;
        check(codes, flags, [&](auto* o, I n, I f) { return LXMbToWide(l, o, n, bytes, length, f); });
        check(codes, flags, [&](auto* o, I n, I f) { return LXMbToWideEx(l, o, n, bytes, 1, length, f); });
      }
    }
  }
}

TEST_F(Convert, UnicodeAndCodesToBytes) {
  for (const TinyCodepage& cp : codepages()) {
    SCOPED_TRACE(cp.file.name);
    LXLocale* l = library_.locale(cp);
    auto text = text_in(cp);
    for (bool null : {false, true}) {
      Model<char> model;
      model.null_terminated = null;
      for (uint16_t u : text) model.pieces.push_back(encoded(cp, u));
      const auto units = terminated<LXUChar>(text, null);
      std::vector<LXWChar> codes;
      for (uint16_t u : text) codes.push_back(code_of(cp, u));
      codes = terminated(codes, null);
      const int32_t length = null ? -1 : static_cast<int32_t>(text.size());
      for (int32_t flags : kModes) {
        check(model, flags,
              [&](auto* o, I n, I f) { return LXUnicodeToString(l, o, n, units.data(), length, f); });
        check(model, flags,
              [&](auto* o, I n, I f) { return LXUnicodeToStringEx(l, o, 1, n, units.data(), length, f); });
      }
      if (null) model.pieces.push_back({'\0'});
      model.ends_with_null = false;
      for (int32_t flags : {0, static_cast<int32_t>(LX_CHARACTERS)}) {
        check(model, flags, [&](auto* o, I n, I f) { return LXWideToMb(l, o, n, codes.data(), length, f); });
        check(model, flags,
              [&](auto* o, I n, I f) { return LXWideToMbEx(l, o, 1, n, codes.data(), length, f); });
      }
    }
  }
}

TEST_F(Convert, CodesAndUnicode) {
  for (const TinyCodepage& from : codepages()) {
    const auto text = text_in(from);
    for (const TinyCodepage& to : codepages()) {
      SCOPED_TRACE(from.file.name + " to " + to.file.name);
      LXLocale* from_l = library_.locale(from);
      LXLocale* to_l = library_.locale(to);
      for (bool null : {false, true}) {
        Model<LXWChar> codes;
        Model<LXUChar> units;
        std::vector<LXWChar> input;
        for (uint16_t u : text) {
          input.push_back(code_of(from, u));
          codes.pieces.push_back({code_of(to, u)});
          units.pieces.push_back({u});
        }
        codes.null_terminated = units.null_terminated = null;
        input = terminated(input, null);
        const auto unicode = terminated<LXUChar>(text, null);
        const int32_t length = null ? -1 : static_cast<int32_t>(text.size());
        for (int32_t flags : kModes) {
          check(codes, flags, [&](auto* o, I n, I f) {
            return LXConvertStringW(to_l, o, n, from_l, input.data(), length, f);
          });
          check(units, flags,
                [&](auto* o, I n, I f) { return LXStringToUnicodeW(o, n, from_l, input.data(), length, f); });
          check(codes, flags,
                [&](auto* o, I n, I f) { return LXUnicodeToStringW(to_l, o, n, unicode.data(), length, f); });
        }
      }
    }
  }
}

/// ASCII is moved in blocks: another character at every place of a text that is longer than two of them; from
/// Unicode also values whose low byte looks like ASCII.
TEST_F(Convert, RunsOfAsciiAroundOtherCharacters) {
  constexpr I kChars = 37;
  std::vector<uint16_t> run;
  for (I i = 0; i < kChars; ++i) run.push_back(static_cast<uint16_t>('!' + i));
  for (const TinyCodepage& from : codepages()) {
    LXLocale* source = library_.locale(from);
    const uint16_t last = from.characters.back().unicode, yen = from.characters[0x5C].unicode;
    for (size_t at = 0; at < run.size(); ++at) {
      for (const uint16_t other : std::initializer_list<uint16_t>{last, yen, 0x80, 0xFF, 0x100, 0x3041, 0x7F00,
                                                                  0x8041, 0xD800, 0xFFFF}) {
        SCOPED_TRACE(from.file.name + " at " + std::to_string(at) + ": " + std::to_string(other));
        std::vector<uint16_t> text = run;
        text[at] = other;
        const auto input = encoded(from, text);
        const I length = static_cast<I>(input.size());
        std::vector<char> output(input.size());
        EXPECT_EQ(LXUnicodeToString(source, output.data(), length, text.data(), kChars, 0), length);
        EXPECT_EQ(output, input);
        if (other != last && other != yen) continue;
        std::vector<LXUChar> units(text.size());
        EXPECT_EQ(LXStringToUnicode(units.data(), kChars, source, input.data(), length, 0), kChars);
        EXPECT_EQ(units, text);
        for (const TinyCodepage& to : codepages()) {
          const auto expected = encoded(to, text);
          const I size = static_cast<I>(expected.size());
          output.assign(expected.size(), 0);
          EXPECT_EQ(LXConvertString(library_.locale(to), output.data(), size, source, input.data(), length, 0),
                    size);
          EXPECT_EQ(output, expected) << to.file.name;
        }
      }
    }
  }
}

/// Bytes of ASCII that are something else, though ASCII becomes these bytes.
TEST(ConvertAscii, ReadingDiffersFromWriting) {
  TinyCodepage yen = lx::test::tiny_shift_jis();
  yen.file.id = 9300;
  yen.file.name = "TINY-YEN";
  yen.file.sections[0][fmt::kUnicode + 2 * 0x5C] = 0xA5;  // 0x5C is U+00A5; U+005C becomes 0x5C
  TinyCodepage low_lead = lx::test::tiny_shift_jis();
  low_lead.file.sections[0][fmt::kLengths + 0x7E] = 2;  // U+007E becomes 0x7E, which begins a character
  TinyLibrary library({yen, low_lead});
  const std::string run(20, 'x');
  const std::string text = run + "\x5C" + run + "~a" + run;
  std::vector<LXUChar> expected(text.begin(), text.end()), units(text.size());
  expected[20] = 0xA5;
  const int32_t length = static_cast<int32_t>(text.size());
  EXPECT_EQ(LXStringToUnicode(units.data(), length, library.locale(yen), text.data(), length, 0), length);
  EXPECT_EQ(units, expected);
  expected[20] = 0x5C;
  expected[41] = 0xFFFD;
  expected.erase(expected.begin() + 42);
  EXPECT_EQ(LXStringToUnicode(units.data(), length, library.locale(low_lead), text.data(), length, 0),
            length - 1);
  units.pop_back();
  EXPECT_EQ(units, expected);
  EXPECT_TRUE(library.close());
}

/// Flags that are not defined: the result, error 2, and an output that is not touched, even with nothing to do.
TEST_F(Convert, UndefinedFlags) {
  LXLocale* l = library_.locale(lx::test::tiny_shift_jis());
  LXLocale* other = library_.locale(lx::test::tiny_euc());
  const char* text = "ab";
  const LXUChar units[] = {'a', 'b', 0};
  const LXWChar codes[] = {'a', 'b', 0};
  uint32_t space[8];
  char* out = reinterpret_cast<char*>(space);
  LXUChar* units_out = reinterpret_cast<LXUChar*>(space);
  LXWChar* wide = space;
  struct Row {
    std::function<I(I size, I length, I flags)> call;
    I in_characters;  // result when LX_CHARACTERS is among the flags
    bool terminates;  // LX_TERMINATE is defined
  };
  const Row rows[] = {
      {[&](I s, I n, I f) { return LXConvertString(l, out, s, other, text, n, f); }, 0, true},
      {[&](I s, I n, I f) { return LXConvertStringEx(l, out, 0, s, other, text, 0, n, f); }, 0, true},
      {[&](I s, I n, I f) { return LXConvertStringW(l, wide, s, other, codes, n, f); }, 0, true},
      {[&](I s, I n, I f) { return LXMbToWide(l, wide, s, text, n, f); }, -1, false},
      {[&](I s, I n, I f) { return LXMbToWideEx(l, wide, s, text, 0, n, f); }, -1, false},
      {[&](I s, I n, I f) { return LXWideToMb(l, out, s, codes, n, f); }, -1, false},
      {[&](I s, I n, I f) { return LXWideToMbEx(l, out, 0, s, codes, n, f); }, -1, false},
      {[&](I s, I n, I f) { return LXStringToUnicode(units_out, s, l, text, n, f); }, -1, true},
      {[&](I s, I n, I f) { return LXStringToUnicodeW(units_out, s, l, codes, n, f); }, -1, true},
      {[&](I s, I n, I f) { return LXStringToUnicodeEx(units_out, s, l, text, 0, n, f); }, -1, true},
      {[&](I s, I n, I f) { return LXUnicodeToString(l, out, s, units, n, f); }, -1, true},
      {[&](I s, I n, I f) { return LXUnicodeToStringW(l, wide, s, units, n, f); }, -1, true},
      {[&](I s, I n, I f) { return LXUnicodeToStringEx(l, out, 0, s, units, n, f); }, -1, true},
  };
  for (const Row& row : rows) {
    SCOPED_TRACE(&row - rows);
    std::fill(std::begin(space), std::end(space), 0xA5A5A5A5);
    std::vector<int32_t> undefined{1, 2, 4, 0x10, 0x4001, 0x4010, 0x8000, -1};
    if (!row.terminates) undefined.insert(undefined.end(), {LX_TERMINATE, LX_TERMINATE | LX_CHARACTERS});
    for (int32_t flags : undefined) {
      for (int32_t size : {0, 4}) {
        for (int32_t length : {0, 2, -1}) {
          EXPECT_EQ(row.call(size, length, flags), (flags & LX_CHARACTERS) != 0 ? row.in_characters : -1)
              << flags;
          EXPECT_EQ(LXGetError(l), LX_E_INVALID);
        }
      }
    }
    for (uint32_t word : space) EXPECT_EQ(word, 0xA5A5A5A5);
    // Nothing to do clears the error.
    EXPECT_EQ(row.call(5, 0, 0), 0);
    EXPECT_EQ(LXGetError(l), LX_OK);
  }
}

/// Codes are stored as they are, also by a codepage that no Unicode value becomes two bytes in.
TEST(ConvertCodes, CodesNeedNoMappingBack) {
  TinyCodepage one_way = lx::test::tiny_shift_jis();
  using fmt::PageEntry;
  for (size_t page = 1; page < 256; ++page)
    PageEntry().write(one_way.file.sections[0].data() + fmt::kPages + PageEntry::kBytes * page);
  TinyLibrary library({one_way});
  LXLocale* locale = library.locale(one_way);
  const LXWChar codes[] = {0x82A0, 'a', 0x8340};
  char out[8] = {};
  EXPECT_EQ(LXWideToMb(locale, out, 5, codes, 3, 0), 5);
  EXPECT_EQ(std::string(out),
            "\x82\xA0"
            "a\x83\x40");
  EXPECT_EQ(LXWideToMb(locale, out, 1, codes, 3, 0), 0) << "never half a character";
  EXPECT_TRUE(library.close());
}

TEST_F(Convert, ByCodepageObject) {
  const TinyCodepage cp = lx::test::tiny_euc();
  const LXObject* object = library_.object(cp);
  struct Row {
    std::string text;
    int32_t length, result;
    std::vector<uint16_t> units;
  };
  const Row rows[] = {
      {std::string("a\xA4\xA2\0z", 5), 5, 2, {'a', 0x3042}},  // a null ends it
      {std::string("a\xA4\xA2\0", 4), -1, 2, {'a', 0x3042}},
      {std::string("a\xA4\xA2\0", 4), -2, 2, {'a', 0x3042}},
      {"a\xA4\xA2", 2, 1, {'a'}},  // cut
      {std::string("\0", 1), -1, -1, {}},
      {"a", 0, 0, {}},
      {std::string("\0", 1), 1, 0, {}},
  };
  for (const Row& row : rows) {
    SCOPED_TRACE(testing::PrintToString(row.text));
    const auto text = bytes_of(row.text);
    std::vector<LXUChar> units(row.units.size() + 1, 0xA5A5);
    EXPECT_EQ(LXCpStrToUnicode(object, text.data(), row.length, units.data()), row.result);
    EXPECT_EQ(units.back(), 0xA5A5) << "no null is stored";
    units.pop_back();
    EXPECT_EQ(units, row.units);
  }
  const LXUChar units[] = {'a', 0, 0x3042, 0x4E02, 0};
  char out[16] = {};
  EXPECT_EQ(LXCpUnicodeToStr(object, units, 0, -1, out), 1);
  EXPECT_EQ(LXCpUnicodeToStr(object, units, 1, 4, out), 7) << "a length goes past nulls";
  EXPECT_EQ(std::string(out, 8), std::string("a\0\xA4\xA2\x8F\xB0\xA1\0", 8));
}

TEST_F(Convert, ThroughTheCommonCodepage) {
  struct Row {
    std::string text;  // no more bytes than these may be read
    int32_t length, result;
  };
  const Row rows[] = {
      {std::string("ab\0", 3), -1, 2},
      {std::string("ab\0", 3), -2, 2},
      {std::string("ab\0z", 4), 4, 2},
      {"abc", 3, 3},
      {"abc", 2, 2},
      {std::string("\0", 1), -1, -1},
      {std::string("\0a", 2), 2, -1},
      {"a", 0, -1},
  };
  for (const Row& row : rows) {
    SCOPED_TRACE(testing::PrintToString(row.text) + std::to_string(row.length));
    const size_t n = row.result > 0 ? static_cast<size_t>(row.result) : 0;
    const auto text = bytes_of(row.text);
    std::vector<LXUChar> units(n + 1, 0xA5A5);
    EXPECT_EQ(LXComStrToUnicode(text.data(), row.length, units.data()), row.result);
    EXPECT_TRUE(std::equal(units.begin(), units.end() - 1, row.text.begin()));
    EXPECT_EQ(units.back(), 0);
    const std::vector<LXUChar> input(row.text.begin(), row.text.end());
    std::vector<char> out(n + 1, '\xA5');
    EXPECT_EQ(LXComUnicodeToStr(input.data(), row.length, out.data()), row.result);
    EXPECT_EQ(std::string(out.data(), n), row.text.substr(0, n));
    EXPECT_EQ(out.back(), 0);
  }
  const LXUChar beyond[] = {0xE9, 0x3042, 0};
  char out[3];
  EXPECT_EQ(LXComUnicodeToStr(beyond, -1, out), 2);
  EXPECT_STREQ(out, "??");
  LXUChar unit[2];
  EXPECT_EQ(LXComStrToUnicode("\xE9", -1, unit), 1);
  EXPECT_EQ(unit[0], 0xFFFD);
}

TEST(ConvertCommon, MissingCommonCodepage) {
  TinyLibrary library({lx::test::tiny_single()});
  LXUChar unit = 0xA5A5;
  EXPECT_EQ(LXComStrToUnicode("a", -1, &unit), -1);
  EXPECT_EQ(unit, 0);
  const LXUChar units[] = {'a', 0};
  char out = 'x';
  EXPECT_EQ(LXComUnicodeToStr(units, -1, &out), -1);
  EXPECT_EQ(out, 0);
  EXPECT_TRUE(library.close());
}

}  // namespace
