// The parts of a line that order it: from a character of a field to a character of a field, as the option -k of the
// system's sort names them.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "codepage.h"

namespace lexicor_cli {

/// One part, from a character on, both counted from 0, to the end of a field or of some characters of it.
struct SortField {
  size_t first_field = 0, first_char = 0;
  size_t last_field = 0;  // counted from 1; 0: all of them
  size_t last_chars = 0;  // of the last field; 0: all of them
  bool skips_first_blanks = false, skips_end_blanks = false;
  bool ignore_case = false, reverse = false;
};

/// What holds for all parts that have no letters of their own.
struct SortFieldDefaults {
  bool skip_blanks, ignore_case, reverse;
};

/// Reads FIELD[.CHAR][LETTERS][,FIELD[.CHAR][LETTERS]], the letters being of b, f and r. Throws a Failure.
SortField parse_sort_field(const std::string& text, const SortFieldDefaults& defaults);

/// Finds the parts of lines.
class FieldFinder {
 public:
  /// `separator`: what stands between two fields, a character in UTF-8 or "\0"; none: each field begins with the
  /// blanks in front of it. Throws a Failure when the codepage lacks it.
  FieldFinder(const Codepage& codepage, const std::optional<std::string>& separator);

  /// The part of a text without idle shift bytes, from its first character to its last one. It is in `text`, or in
  /// `room` where it begins between double-byte characters.
  std::string_view find(std::string_view text, const SortField& field, std::string* room) const;

 private:
  struct Walker;

  /// Among lines that end with null characters a line feed is a blank.
  bool is_blank(LXWChar code) const { return code == blank_ || code == tab_ || code == feed_; }
  void skip_blanks(Walker* walker) const;
  void skip_field(Walker* walker) const;
  void skip_fields(Walker* walker, size_t count) const;

  const Codepage& codepage_;
  const bool separated_;
  const LXWChar separator_, blank_, tab_, feed_;
};

}  // namespace lexicor_cli
