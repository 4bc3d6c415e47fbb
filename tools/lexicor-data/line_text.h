// What the readers of line-based sources share: lines, whatever editor has written them, and what is asked of a
// character.
#pragma once

#include <istream>
#include <string>

namespace lexicor_data {

inline constexpr char kByteOrderMark[] = "\xEF\xBB\xBF";

/// Reads a line without its end, which is a line feed or a carriage return and one. A byte-order mark before
/// the first line is no part of it. `*line` counts the lines from 1.
inline bool next_line(std::istream& in, std::string* text, int* line) {
  text->clear();
  if (!std::getline(in, *text)) return false;
  if (!text->empty() && text->back() == '\r') text->pop_back();
  if (++*line == 1 && text->compare(0, sizeof kByteOrderMark - 1, kByteOrderMark) == 0)
    text->erase(0, sizeof kByteOrderMark - 1);
  return true;
}

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
