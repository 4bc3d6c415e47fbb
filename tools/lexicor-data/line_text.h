// What the readers of line-based sources ask of a character.
#pragma once

namespace lexicor_data {

inline bool is_blank(char c) {
  return c == ' ' || c == '\t';
}

/// -1 for a character that is no hexadecimal digit.
inline int hex_value(char c) {
  if (c >= '0' && c <= '9') return c - '0';
  if (c >= 'A' && c <= 'F') return c - 'A' + 10;
  if (c >= 'a' && c <= 'f') return c - 'a' + 10;
  return -1;
}

}  // namespace lexicor_data
