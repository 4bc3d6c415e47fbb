// Characters in UTF-8.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>

namespace lexicor_cli {

/// Appends a code point.
inline void append_utf8(std::string& text, uint32_t value) {
  if (value < 0x80) {
    text += static_cast<char>(value);
    return;
  }
  const int trails = value < 0x800 ? 1 : value < 0x10000 ? 2 : 3;
  text += static_cast<char>((0xFF00 >> (trails + 1) & 0xFF) | value >> (6 * trails));
  for (int i = trails - 1; i >= 0; --i) text += static_cast<char>(0x80 | (value >> (6 * i) & 0x3F));
}

/// 16-bit units, each a character.
inline std::string utf8_text(std::u16string_view units) {
  std::string text;
  for (const char16_t unit : units) append_utf8(text, unit);
  return text;
}

}  // namespace lexicor_cli
