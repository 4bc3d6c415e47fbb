// Types, case, width and digits of Unicode values: a character of each sort, for builds without the comparison
// of all values with ICU.
#include <gtest/gtest.h>

#include "codepage/lxunicode.h"

TEST(UnicodeTables, KnownCharacters) {
  const struct {
    uint16_t u;
    uint32_t type1, type2, type3;
    uint16_t lower, upper, full, digit;
  } rows[] = {
      {0x0030, 0x218, 0x008, 0x040, 0x0030, 0x0030, 0xFF10, '0'},  // 0
      {0x0041, 0x213, 0x002, 0x040, 0x0061, 0x0041, 0xFF21, 0},    // A
      {0x01C5, 0x001, 0x002, 0x000, 0x01C6, 0x01C4, 0x01C5, 0},    // titlecase Dz with caron
      {0x0669, 0x008, 0x040, 0x000, 0x0669, 0x0669, 0x0669, '9'},  // Arabic-Indic nine
      {0x0F20, 0x000, 0x001, 0x000, 0x0F20, 0x0F20, 0x0F20, '0'},  // Tibetan zero: a digit without a type
      {0xFF71, 0x001, 0x002, 0x050, 0xFF71, 0xFF71, 0x30A2, 0},    // half-width katakana a
      // Callers rely on these: no symbol, unassigned, and case ranges that lead one way.
      {0x221E, 0x020, 0x800, 0x000, 0x221E, 0x221E, 0x221E, 0},
      {0xFBE9, 0x000, 0x001, 0x000, 0xFBE9, 0xFBE9, 0xFBE9, 0},
      {0x10A0, 0x003, 0x002, 0x000, 0x10D0, 0x10A0, 0x10A0, 0},
      {0x10D0, 0x005, 0x002, 0x000, 0x10D0, 0x10D0, 0x10D0, 0},
      {0x0400, 0x003, 0x002, 0x003, 0x0400, 0x0400, 0x0400, 0},
      {0x0450, 0x005, 0x002, 0x003, 0x0450, 0x0400, 0x0450, 0},
      {0x212A, 0x003, 0x002, 0x000, 0x212A, 0x212A, 0x212A, 0},
  };
  for (const auto& row : rows) {
    SCOPED_TRACE(row.u);
    EXPECT_EQ(lx::unicode_type(row.u), row.type3 << 22 | row.type2 << 10 | row.type1);
    EXPECT_EQ(lx::unicode_lower(row.u), row.lower);
    EXPECT_EQ(lx::unicode_upper(row.u), row.upper);
    EXPECT_EQ(lx::unicode_half_to_full(row.u), row.full);
    EXPECT_EQ(lx::unicode_full_to_half(row.full), row.u);
    EXPECT_EQ(lx::unicode_digit(row.u), row.digit);
  }
}
