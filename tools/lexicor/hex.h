// Numbers, bytes and code points in hexadecimal.
#pragma once

#include <cstdint>
#include <cstdio>
#include <string>
#include <string_view>

namespace lexicor_cli {

/// A number in at least `digits` hexadecimal digits.
inline std::string hex_text(uint32_t value, int digits) {
  char text[16];
  std::snprintf(text, sizeof text, "%0*X", digits, static_cast<unsigned>(value));
  return text;
}

/// Bytes in hexadecimal, with blanks between them.
inline std::string hex_bytes(std::string_view bytes) {
  std::string text;
  for (const char byte : bytes) text += (text.empty() ? "" : " ") + hex_text(static_cast<uint8_t>(byte), 2);
  return text;
}

inline std::string code_point_name(uint32_t code_point) {
  return "U+" + hex_text(code_point, 4);
}

}  // namespace lexicor_cli
