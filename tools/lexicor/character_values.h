// What a character of a codepage is in Unicode, and whether a Unicode value is a character of a codepage: the
// library itself puts U+FFFD or the substitution byte where there is none.
#pragma once

#include <lx.h>

#include <cstddef>
#include <cstdint>
#include <vector>

#include "codepage.h"

namespace lexicor_cli {

inline constexpr LXUChar kReplacement = 0xFFFD;

/// The Unicode values of a codepage's single bytes; U+FFFD for one that is not a character.
std::vector<LXUChar> single_byte_values(const Codepage& codepage);

/// Tells the substitution byte from the character that a Unicode value maps to.
class Substitution {
 public:
  explicit Substitution(const Codepage& codepage);

  bool stands_for(LXUChar unicode, LXWChar code) const;

 private:
  std::vector<LXUChar> single_;
  LXWChar byte_ = 0;
  bool known_ = false;
};

// A UTF-8 character of four bytes lies beyond 16-bit Unicode: the library takes it as four bytes without a
// value, messages as the one character that its writer meant.
inline constexpr size_t kLongUtf8Bytes = 4;

inline bool is_long_utf8_lead(char c) {
  const auto byte = static_cast<unsigned char>(c);
  return byte >= 0xF0 && byte <= 0xF4;
}
inline bool is_utf8_trail(char c) {
  return (static_cast<unsigned char>(c) & 0xC0) == 0x80;
}
/// The code point of the four-byte UTF-8 character at `text`, or 0.
uint32_t long_utf8_code_point(const char* text, const char* end);

}  // namespace lexicor_cli
