// Types, case, width and digits of Unicode values: a character of each sort, and results that are odd and must
// stay so. unicode_oracle_test.cpp compares all values with ICU.
#include <gtest/gtest.h>

#include <cstdio>
#include <string>

#include "codepage/lxunicode.h"
#include "lx/codepage.h"

namespace {

uint32_t lower(uint32_t u) {
  return lx::unicode_lower(static_cast<uint16_t>(u));
}
uint32_t upper(uint32_t u) {
  return lx::unicode_upper(static_cast<uint16_t>(u));
}
std::string hex(uint32_t u) {
  char text[16];
  snprintf(text, sizeof text, "U+%04X", u);
  return text;
}

TEST(UnicodeTables, KnownCharacters) {
  struct Row {
    uint32_t u, type1, type2, type3, lower, upper, full, digit;
  };
  const Row rows[] = {
      {0x0009, 0x3C0, 0x200, 0x000, 0x0009, 0x0009, 0x0009, 0},    // tab
      {0x0030, 0x218, 0x008, 0x040, 0x0030, 0x0030, 0xFF10, '0'},  // 0
      {0x0041, 0x213, 0x002, 0x040, 0x0061, 0x0041, 0xFF21, 0},    // A
      {0x00B2, 0x008, 0x008, 0x000, 0x00B2, 0x00B2, 0x00B2, '2'},  // superscript two
      {0x00DF, 0x005, 0x002, 0x000, 0x00DF, 0x00DF, 0x00DF, 0},    // sharp s
      {0x01C5, 0x001, 0x002, 0x000, 0x01C6, 0x01C4, 0x01C5, 0},    // titlecase Dz with caron
      {0x064E, 0x001, 0x800, 0x007, 0x064E, 0x064E, 0x064E, 0},    // fatha
      {0x0669, 0x008, 0x040, 0x000, 0x0669, 0x0669, 0x0669, '9'},  // Arabic-Indic nine
      {0x0F20, 0x000, 0x001, 0x000, 0x0F20, 0x0F20, 0x0F20, '0'},  // Tibetan zero: a digit without a type
      {0x304C, 0x001, 0x002, 0x023, 0x304C, 0x304C, 0x304C, 0},    // hiragana ga
      {0x4E00, 0x001, 0x002, 0x100, 0x4E00, 0x4E00, 0x4E00, 0},    // CJK ideograph
      {0xFF71, 0x001, 0x002, 0x050, 0xFF71, 0xFF71, 0x30A2, 0},    // half-width katakana a
  };
  for (const Row& row : rows) {
    const auto u = static_cast<uint16_t>(row.u);
    EXPECT_EQ(lx::unicode_type(u), row.type3 << 22 | row.type2 << 10 | row.type1) << hex(row.u);
    EXPECT_EQ(lower(u), row.lower) << hex(row.u);
    EXPECT_EQ(upper(u), row.upper) << hex(row.u);
    EXPECT_EQ(lx::unicode_half_to_full(u), row.full) << hex(row.u);
    EXPECT_EQ(lx::unicode_full_to_half(static_cast<uint16_t>(row.full)), u) << hex(row.u);
    EXPECT_EQ(lx::unicode_digit(u), row.digit) << hex(row.u);
  }
}

// Callers rely on these: one value of the operators is no symbol, and two letters are unassigned.
TEST(UnicodeType, KeptExceptions) {
  EXPECT_EQ(lx::unicode_type(0x2212), 0x02008020u);
  EXPECT_EQ(lx::unicode_type(0x2213), 0x02008020u);
  EXPECT_EQ(lx::unicode_type(0x221E), 0x00200020u);
  EXPECT_EQ(lx::unicode_type(0xFBE9), lx::kTypeUnassigned);
  EXPECT_EQ(lx::unicode_type(0xFCE1), lx::kTypeUnassigned);
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

}  // namespace
