// Types, case, width and digits of Unicode values: known characters, the borders of the ranges, results that
// are odd and must stay so, and properties that hold for all values. unicode_oracle_test.cpp compares with ICU.
#include <gtest/gtest.h>

#include <cstdio>
#include <string>

#include "codepage/lxunicode.h"
#include "lx/codepage.h"

namespace {

constexpr uint32_t kLastUnit = 0xFFFF;

uint32_t type1(uint32_t u) {
  return lx::unicode_type(static_cast<uint16_t>(u)) & 0x3FF;
}
uint32_t type2(uint32_t u) {
  return lx::unicode_type(static_cast<uint16_t>(u)) >> 10 & 0xFFF;
}
uint32_t type3(uint32_t u) {
  return lx::unicode_type(static_cast<uint16_t>(u)) >> 22;
}
uint32_t lower(uint32_t u) {
  return lx::unicode_lower(static_cast<uint16_t>(u));
}
uint32_t upper(uint32_t u) {
  return lx::unicode_upper(static_cast<uint16_t>(u));
}
uint32_t half_to_full(uint32_t u) {
  return lx::unicode_half_to_full(static_cast<uint16_t>(u));
}
uint32_t full_to_half(uint32_t u) {
  return lx::unicode_full_to_half(static_cast<uint16_t>(u));
}
uint32_t digit(uint32_t u) {
  return lx::unicode_digit(static_cast<uint16_t>(u));
}

std::string hex(uint32_t u) {
  char text[16];
  snprintf(text, sizeof text, "U+%04X", u);
  return text;
}

TEST(UnicodeType, KnownCharacters) {
  struct Row {
    uint32_t u, type1, type2, type3;
  };
  const Row rows[] = {
      {0x0000, 0x300, 0x001, 0x000},  // null
      {0x0009, 0x3C0, 0x200, 0x000},  // tab
      {0x000A, 0x340, 0x100, 0x000},  // line feed
      {0x000C, 0x340, 0x400, 0x000},  // form feed
      {0x0020, 0x2C0, 0x400, 0x048},  // space
      {0x0021, 0x220, 0x800, 0x048},  // !
      {0x002B, 0x220, 0x020, 0x048},  // +
      {0x002C, 0x220, 0x080, 0x048},  // ,
      {0x002D, 0x220, 0x020, 0x048},  // -
      {0x002F, 0x220, 0x010, 0x048},  // /
      {0x0030, 0x218, 0x008, 0x040},  // 0
      {0x0041, 0x213, 0x002, 0x040},  // A
      {0x0047, 0x203, 0x002, 0x040},  // G
      {0x005E, 0x220, 0x800, 0x048},  // ^
      {0x0061, 0x215, 0x002, 0x040},  // a
      {0x007A, 0x205, 0x002, 0x040},  // z
      {0x007F, 0x300, 0x001, 0x000},  // delete
      {0x0085, 0x140, 0x100, 0x000},  // next line
      {0x00A0, 0x0C0, 0x080, 0x008},  // no-break space
      {0x00A2, 0x020, 0x020, 0x048},  // cent sign, which has a full-width form
      {0x00A8, 0x020, 0x800, 0x00A},  // diaeresis
      {0x00AA, 0x005, 0x002, 0x000},  // feminine ordinal, a small letter without a capital
      {0x00AD, 0x020, 0x001, 0x008},  // soft hyphen
      {0x00B2, 0x008, 0x008, 0x000},  // superscript two
      {0x00BD, 0x020, 0x800, 0x008},  // one half
      {0x00C0, 0x003, 0x002, 0x003},  // A with grave
      {0x00C6, 0x003, 0x002, 0x000},  // AE
      {0x00D7, 0x020, 0x800, 0x008},  // multiplication sign
      {0x00DF, 0x005, 0x002, 0x000},  // sharp s
      {0x01C5, 0x001, 0x002, 0x000},  // titlecase Dz with caron: neither upper nor lower
      {0x0300, 0x000, 0x800, 0x003},  // combining grave
      {0x05B4, 0x001, 0x800, 0x007},  // hiriq
      {0x05BC, 0x001, 0x800, 0x003},  // dagesh, no vowel
      {0x05D0, 0x001, 0x004, 0x000},  // alef
      {0x0628, 0x001, 0x004, 0x000},  // beh
      {0x0640, 0x001, 0x004, 0x200},  // kashida
      {0x064E, 0x001, 0x800, 0x007},  // fatha
      {0x0651, 0x001, 0x800, 0x003},  // shadda, no vowel
      {0x0660, 0x008, 0x040, 0x000},  // Arabic-Indic zero
      {0x06F0, 0x008, 0x008, 0x000},  // extended Arabic-Indic zero
      {0x093E, 0x001, 0x002, 0x004},  // vowel sign aa, which takes space
      {0x093F, 0x001, 0x002, 0x004},  // vowel sign i
      {0x0941, 0x001, 0x800, 0x007},  // vowel sign u, which does not
      {0x0E33, 0x001, 0x002, 0x004},  // sara am
      {0x1E00, 0x003, 0x002, 0x003},  // A with ring below
      {0x200B, 0x100, 0x001, 0x000},  // zero-width space
      {0x200F, 0x100, 0x004, 0x000},  // right-to-left mark
      {0x2028, 0x140, 0x400, 0x000},  // line separator
      {0x202A, 0x100, 0x001, 0x000},  // left-to-right embedding
      {0x2066, 0x100, 0x800, 0x000},  // left-to-right isolate
      {0x207B, 0x020, 0x020, 0x008},  // superscript minus
      {0x20A9, 0x020, 0x020, 0x048},  // won sign
      {0x20AC, 0x020, 0x020, 0x008},  // euro sign
      {0x2160, 0x003, 0x002, 0x000},  // roman numeral one
      {0x2212, 0x020, 0x020, 0x008},  // minus sign
      {0x24B6, 0x003, 0x002, 0x000},  // circled A counts as a letter
      {0x3000, 0x0C0, 0x400, 0x088},  // ideographic space
      {0x3007, 0x001, 0x002, 0x100},  // ideographic zero
      {0x3042, 0x001, 0x002, 0x020},  // hiragana a
      {0x304C, 0x001, 0x002, 0x023},  // hiragana ga
      {0x30A2, 0x001, 0x002, 0x010},  // katakana a
      {0x30FC, 0x001, 0x002, 0x032},  // prolonged sound mark, of both
      {0x4E00, 0x001, 0x002, 0x100},  // CJK ideograph
      {0xAC00, 0x001, 0x002, 0x000},  // Hangul syllable
      {0xFB1D, 0x001, 0x004, 0x003},  // yod with hiriq
      {0xFB29, 0x020, 0x020, 0x008},  // Hebrew plus
      {0xFE63, 0x020, 0x020, 0x008},  // small hyphen-minus
      {0xFEFF, 0x100, 0x001, 0x000},  // zero-width no-break space
      {0xFF0B, 0x020, 0x020, 0x088},  // full-width plus
      {0xFF0F, 0x020, 0x010, 0x088},  // full-width solidus
      {0xFF10, 0x018, 0x008, 0x080},  // full-width zero
      {0xFF21, 0x013, 0x002, 0x080},  // full-width A
      {0xFF71, 0x001, 0x002, 0x050},  // half-width katakana a
      {0xFFA0, 0x001, 0x002, 0x040},  // half-width Hangul filler
      {0xFFE6, 0x020, 0x020, 0x088},  // full-width won sign
      {0xFFE9, 0x020, 0x800, 0x048},  // half-width arrow
      {0xFFFD, 0x020, 0x800, 0x008},  // replacement character
  };
  for (const Row& row : rows) {
    EXPECT_EQ(type1(row.u), row.type1) << hex(row.u);
    EXPECT_EQ(type2(row.u), row.type2) << hex(row.u);
    EXPECT_EQ(type3(row.u), row.type3) << hex(row.u);
  }
}

TEST(UnicodeType, FixedRanges) {
  struct Span {
    uint32_t first, last, word;
  };
  const Span spans[] = {
      {0x06FA, 0x0900, 0x400},      {0x0EDE, 0x109F, 0x400},     {0x11FA, 0x1DFF, 0x400},
      {0x2200, 0x2211, 0x2200020},  {0x2214, 0x221D, 0x2200020}, {0x221F, 0x22F1, 0x2200020},
      {0x27BF, 0x2FFF, 0x400},      {0x33FF, 0x4DFF, 0x400},     {0x4E00, 0x9FA5, 0x40000801},
      {0x9FA6, 0xABFF, 0x400},      {0xAC00, 0xD7A3, 0x801},     {0xD7A4, 0xF8FF, 0x400},
      {0xF900, 0xFA2D, 0x40000801}, {0xFA2E, 0xFAFF, 0x400},     {0xFBD3, 0xFBE8, 0x1001},
      {0xFBEA, 0xFCE0, 0x1001},     {0xFCE2, 0xFD3D, 0x1001},
  };
  for (const Span& span : spans)
    for (uint32_t u = span.first; u <= span.last; ++u)
      ASSERT_EQ(lx::unicode_type(static_cast<uint16_t>(u)), span.word) << hex(u);
}

// The values on both sides of the fixed ranges come from the tables: an index that is off by one shows here.
TEST(UnicodeType, BordersOfTheTables) {
  struct Row {
    uint32_t u, word;
  };
  const Row rows[] = {
      {0x06F9, 0x00002008},  // digit nine
      {0x0901, 0x00E00001},  // Devanagari candrabindu
      {0x0EDD, 0x00000801},  // Lao ho mo
      {0x10A0, 0x00000803},  // Georgian capital an
      {0x11F9, 0x00000801},  // Hangul jongseong yeorinhieuh
      {0x1E00, 0x00C00803},  // A with ring below
      {0x21FF, 0x02200020},  // left right open-headed arrow
      {0x22F2, 0x02200020},  // element of with long horizontal stroke
      {0x27BE, 0x02200020},  // open-outlined rightwards arrow
      {0x3000, 0x221000C0},  // ideographic space
      {0x33FE, 0x02000820},  // telegraph symbol for day thirty-one
      {0xFB00, 0x00000805},  // ligature ff
      {0xFBD2, 0x00000400},  // unassigned; U+FBD3 is a letter
      {0xFD3E, 0x02200020},  // ornate left parenthesis
      {0xFFFF, 0x00000400},  // no character
  };
  for (const Row& row : rows) EXPECT_EQ(lx::unicode_type(static_cast<uint16_t>(row.u)), row.word) << hex(row.u);
}

// Callers rely on these: one value of the operators is no symbol, and two letters are unassigned.
TEST(UnicodeType, KeptExceptions) {
  EXPECT_EQ(lx::unicode_type(0x2212), 0x02008020u);
  EXPECT_EQ(lx::unicode_type(0x2213), 0x02008020u);
  EXPECT_EQ(lx::unicode_type(0x221E), 0x00200020u);
  EXPECT_EQ(lx::unicode_type(0xFBE9), lx::kTypeUnassigned);
  EXPECT_EQ(lx::unicode_type(0xFCE1), lx::kTypeUnassigned);
}

TEST(UnicodeType, BitsOfEveryValueAgree) {
  for (uint32_t u = 0; u <= kLastUnit; ++u) {
    const uint32_t c1 = type1(u), c2 = type2(u), c3 = type3(u);
    ASSERT_TRUE(c2 != 0 && (c2 & (c2 - 1)) == 0) << hex(u) << ": one bidirectional category";
    ASSERT_EQ((c1 & LX_C1_ASCII) != 0, u < 0x80) << hex(u);
    int32_t kinds = 0;
    for (uint32_t kind : {LX_C1_ALPHA, LX_C1_DIGIT, LX_C1_PUNCT, LX_C1_SPACE}) kinds += (c1 & kind) != 0;
    ASSERT_LE(kinds, 1) << hex(u);
    ASSERT_FALSE((c1 & LX_C1_UPPER) && (c1 & LX_C1_LOWER)) << hex(u);
    ASSERT_TRUE((c1 & LX_C1_ALPHA) || !(c1 & (LX_C1_UPPER | LX_C1_LOWER))) << hex(u);
    ASSERT_TRUE((c1 & LX_C1_SPACE) || !(c1 & LX_C1_BLANK)) << hex(u);
    ASSERT_TRUE((c3 & LX_C3_DIACRITIC) || !(c3 & LX_C3_NON_SPACING)) << hex(u);
    ASSERT_FALSE((c3 & LX_C3_HALF_WIDTH) && (c3 & LX_C3_FULL_WIDTH)) << hex(u);
  }
}

// A full-width form of an ASCII character differs from it in the ASCII bit and the width alone.
TEST(UnicodeType, FullWidthFormsAreLikeAscii) {
  for (uint32_t u = 0x21; u <= 0x7E; ++u) {
    const uint32_t full = half_to_full(u);
    EXPECT_EQ(type1(full) | LX_C1_ASCII, type1(u)) << hex(full);
    EXPECT_EQ(type2(full), type2(u)) << hex(full);
    EXPECT_EQ(type3(full) ^ (LX_C3_FULL_WIDTH | LX_C3_HALF_WIDTH), type3(u)) << hex(full);
  }
}

TEST(UnicodeCase, KnownCharacters) {
  struct Row {
    uint32_t u, lower, upper;
  };
  const Row rows[] = {
      {0x0040, 0x0040, 0x0040}, {0x0041, 0x0061, 0x0041}, {0x005A, 0x007A, 0x005A}, {0x005B, 0x005B, 0x005B},
      {0x0061, 0x0061, 0x0041}, {0x007A, 0x007A, 0x005A}, {0x007B, 0x007B, 0x007B}, {0x00C0, 0x00E0, 0x00C0},
      {0x00D7, 0x00D7, 0x00D7}, {0x00DE, 0x00FE, 0x00DE}, {0x00DF, 0x00DF, 0x00DF}, {0x00F7, 0x00F7, 0x00F7},
      {0x00FE, 0x00FE, 0x00DE}, {0x00FF, 0x00FF, 0x0178}, {0x0100, 0x0101, 0x0100}, {0x0101, 0x0101, 0x0100},
      {0x0130, 0x0069, 0x0130}, {0x0131, 0x0131, 0x0049}, {0x0178, 0x00FF, 0x0178}, {0x017F, 0x017F, 0x0053},
      {0x01C4, 0x01C6, 0x01C4}, {0x01C5, 0x01C6, 0x01C4}, {0x01C6, 0x01C6, 0x01C4}, {0x01FE, 0x01FF, 0x01FE},
      {0x01FF, 0x01FF, 0x01FE}, {0x0200, 0x0201, 0x0200}, {0x0220, 0x019E, 0x0220}, {0x023A, 0x2C65, 0x023A},
      {0x0250, 0x0250, 0x2C6F}, {0x0275, 0x0275, 0x019F}, {0x0292, 0x0292, 0x01B7}, {0x0386, 0x03AC, 0x0386},
      {0x03AC, 0x03AC, 0x0386}, {0x03C2, 0x03C2, 0x03A3}, {0x03EE, 0x03EF, 0x03EE}, {0x03F1, 0x03F1, 0x03A1},
      {0x0401, 0x0451, 0x0401}, {0x0430, 0x0430, 0x0410}, {0x04F8, 0x04F9, 0x04F8}, {0x04F9, 0x04F9, 0x04F8},
      {0x0531, 0x0561, 0x0531}, {0x0556, 0x0586, 0x0556}, {0x0586, 0x0586, 0x0556}, {0x0587, 0x0587, 0x0587},
      {0x1E00, 0x1E01, 0x1E00}, {0x1E9E, 0x00DF, 0x1E9E}, {0x1EF8, 0x1EF9, 0x1EF8}, {0x1EF9, 0x1EF9, 0x1EF8},
      {0x1F00, 0x1F00, 0x1F08}, {0x1F08, 0x1F00, 0x1F08}, {0x1FBE, 0x1FBE, 0x0399}, {0x1FF3, 0x1FF3, 0x1FFC},
      {0x1FFC, 0x1FF3, 0x1FFC}, {0x2160, 0x2170, 0x2160}, {0x217F, 0x217F, 0x216F}, {0x24B6, 0x24D0, 0x24B6},
      {0x24E9, 0x24E9, 0x24CF}, {0xFF3A, 0xFF5A, 0xFF3A}, {0xFF5A, 0xFF5A, 0xFF3A}, {0xFF5B, 0xFF5B, 0xFF5B},
      {0x0561, 0x0561, 0x0531}, {0x216F, 0x217F, 0x216F}, {0x2170, 0x2170, 0x2160}, {0x24CF, 0x24E9, 0x24CF},
      {0x24D0, 0x24D0, 0x24B6}, {0x24EA, 0x24EA, 0x24EA}, {0xFF21, 0xFF41, 0xFF21}, {0xFF41, 0xFF41, 0xFF21},
  };
  for (const Row& row : rows) {
    EXPECT_EQ(lower(row.u), row.lower) << hex(row.u);
    EXPECT_EQ(upper(row.u), row.upper) << hex(row.u);
  }
}

// Mappings of the database that lie outside the ranges are not made, in one direction or in both.
TEST(UnicodeCase, RangesAreNotSymmetric) {
  EXPECT_EQ(lower(0x10A0), 0x10D0u);  // Georgian capitals are lowered,
  EXPECT_EQ(lower(0x10C5), 0x10F5u);
  EXPECT_EQ(upper(0x10D0), 0x10D0u);  // but nothing is raised to them
  EXPECT_EQ(lower(0x0400), 0x0400u);  // Cyrillic ie with grave is raised only
  EXPECT_EQ(upper(0x0450), 0x0400u);
  EXPECT_EQ(upper(0x00B5), 0x00B5u);              // micro sign
  for (uint32_t u : {0x2126u, 0x212Au, 0x212Bu})  // ohm, kelvin and angstrom sign
    EXPECT_EQ(lower(u), u);
  for (uint32_t u : {0x0370u, 0x03F4u, 0x0500u, 0x1EFAu, 0x2C00u}) EXPECT_EQ(lower(u), u) << hex(u);
  for (uint32_t u : {0x0371u, 0x03F2u, 0x0501u, 0x1EFBu, 0x2C30u}) EXPECT_EQ(upper(u), u) << hex(u);
}

TEST(UnicodeWidth, KnownCharacters) {
  struct Row {
    uint32_t half, full;
  };
  const Row rows[] = {
      {0x0020, 0x3000}, {0x0021, 0xFF01}, {0x0041, 0xFF21}, {0x007E, 0xFF5E}, {0x00A2, 0xFFE0},
      {0x00A3, 0xFFE1}, {0x00A5, 0xFFE5}, {0x00A6, 0xFFE4}, {0x00AC, 0xFFE2}, {0x00AF, 0xFFE3},
      {0x20A9, 0xFFE6}, {0xFF61, 0x3002}, {0xFF65, 0x30FB}, {0xFF70, 0x30FC}, {0xFF71, 0x30A2},
      {0xFF9E, 0x3099}, {0xFFA0, 0x3164}, {0xFFA1, 0x3131}, {0xFFDC, 0x3163}, {0xFFE8, 0x2502},
      {0xFFE9, 0x2190}, {0xFFEC, 0x2193}, {0xFFED, 0x25A0}, {0xFFEE, 0x25CB},
  };
  for (const Row& row : rows) {
    EXPECT_EQ(half_to_full(row.half), row.full) << hex(row.half);
    EXPECT_EQ(full_to_half(row.full), row.half) << hex(row.full);
  }
  // Neighbours of the ranges and gaps in them, and full-width brackets whose half-width forms lie elsewhere.
  for (uint32_t u :
       {0x001Fu, 0x007Fu, 0x00A1u, 0x00A4u, 0x00B0u, 0x218Fu, 0x2194u, 0x2501u, 0x2503u, 0x25CCu,
        0x3003u, 0x30ACu, 0x30FDu, 0x3130u, 0x3165u, 0xFF5Fu, 0xFF60u, 0xFFBFu, 0xFFE7u, 0xFFEFu}) {
    EXPECT_EQ(half_to_full(u), u) << hex(u);
    EXPECT_EQ(full_to_half(u), u) << hex(u);
  }
}

TEST(UnicodeWidth, EveryMappingLeadsBack) {
  int32_t mapped = 0;
  for (uint32_t u = 0; u <= kLastUnit; ++u) {
    if (half_to_full(u) != u) {
      EXPECT_EQ(full_to_half(half_to_full(u)), u) << hex(u);
      ++mapped;
    }
    if (full_to_half(u) != u) {
      EXPECT_EQ(half_to_full(full_to_half(u)), u) << hex(u);
    }
  }
  EXPECT_EQ(mapped, 95 + 6 + 1 + 63 + 52 + 7);  // ASCII, Latin-1 signs, won, katakana, jamo, arrows and shapes
}

TEST(UnicodeDigit, ExactlyTheDigitsOfTheTable) {
  struct Run {
    uint32_t first, value, count;
  };
  const Run runs[] = {
      {0x0030, 0, 10}, {0x00B2, 2, 2},  {0x00B9, 1, 1},  {0x0660, 0, 10}, {0x06F0, 0, 10}, {0x0966, 0, 10},
      {0x09E6, 0, 10}, {0x0A66, 0, 10}, {0x0AE6, 0, 10}, {0x0B66, 0, 10}, {0x0BE7, 1, 9},  {0x0C66, 0, 10},
      {0x0CE6, 0, 10}, {0x0D66, 0, 10}, {0x0E50, 0, 10}, {0x0ED0, 0, 10}, {0x0F20, 0, 10}, {0x2070, 0, 1},
      {0x2074, 4, 6},  {0x2080, 0, 10}, {0xFF10, 0, 10},
  };
  uint32_t expected[kLastUnit + 1] = {};
  uint32_t count = 0;
  for (const Run& run : runs)
    for (uint32_t n = 0; n < run.count; ++n, ++count) expected[run.first + n] = '0' + run.value + n;
  EXPECT_EQ(count, 179u);
  for (uint32_t u = 0; u <= kLastUnit; ++u) {
    ASSERT_EQ(digit(u), expected[u]) << hex(u);
    // The Tibetan digits lie in a range without types: text mapping, which tests the bit, leaves them alone.
    const bool tibetan = 0x0F20 <= u && u <= 0x0F29;
    ASSERT_EQ((type1(u) & LX_C1_DIGIT) != 0, expected[u] != 0 && !tibetan) << hex(u);
  }
}

}  // namespace
