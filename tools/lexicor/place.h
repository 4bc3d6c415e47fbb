// Where a byte stands in a text, for the reader of a message: its line and its column.
#pragma once

#include <lx.h>

#include <cstdint>
#include <string>

#include "codepage.h"

namespace lexicor_cli {

/// Counts the lines and the characters of a text as it passes by. A line ends with a line feed, in EBCDIC with
/// a new line too. Malformed bytes that go together are one character.
class Place {
 public:
  explicit Place(const Codepage& codepage);

  /// Goes to the beginning of a file.
  void restart();
  /// Goes past well-formed text that begins in `state`; past malformed bytes.
  void pass(const char* text, size_t bytes, LXShiftState state);
  void pass_malformed() { ++column_; }

  uint64_t line() const { return line_; }
  uint64_t column() const { return column_; }

 private:
  bool is_line_end(char c) const { return c == feed_ || c == new_line_; }
  uint64_t count_chars(const char* text, size_t bytes, LXShiftState state) const;

  const Codepage& codepage_;
  const char feed_;
  const char new_line_;  // of EBCDIC; else the line feed
  uint64_t line_ = 1, column_ = 1;
};

}  // namespace lexicor_cli
