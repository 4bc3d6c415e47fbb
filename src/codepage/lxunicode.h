// Character types, case and width of Unicode values: fixed ranges over tables that are generated from the
// Unicode character database (lxunicode_tables.inc).
#pragma once

#include <cstdint>

#include "lx/codepage.h"

namespace lx {

/// The character-type word: bits 0-9 classification, 10-21 bidirectional category, 22-31 text properties.
uint32_t unicode_type(uint16_t u);

/// Full-width and half-width counterparts; a value without one maps to itself.
uint16_t unicode_half_to_full(uint16_t u);
uint16_t unicode_full_to_half(uint16_t u);

/// The simple case mapping of one direction: what each value moves by, by pages of those that do.
struct CaseTable {
  uint8_t page[256];
  uint16_t delta[13][256];

  uint16_t other(uint16_t u) const { return static_cast<uint16_t>(u + delta[page[u >> 8]][u & 0xFF]); }
};
extern const CaseTable kCaseTables[2];  // to lower case, to upper case

inline uint16_t unicode_lower(uint16_t u) {
  return kCaseTables[0].other(u);
}
inline uint16_t unicode_upper(uint16_t u) {
  return kCaseTables[1].other(u);
}

/// The ASCII digit of a decimal digit, superscript or subscript; 0 for any other value. It knows the digits
/// U+0F20 to U+0F29, whose type word lacks the decimal-digit bit: who maps text tests the bit first.
uint16_t unicode_digit(uint16_t u);

/// The ASCII digit that text is mapped to; 0: none.
inline uint16_t digit_of(uint16_t u) {
  return (unicode_type(u) & LX_C1_DIGIT) != 0 ? unicode_digit(u) : 0;
}

/// The type word of a value that has no character.
inline constexpr uint32_t kTypeUnassigned = 0x400;

}  // namespace lx
