// The lines of a text, read block by block.
#pragma once

#include <lx.h>

#include <cstdint>
#include <functional>
#include <string>
#include <string_view>

#include "arena.h"
#include "codepage.h"
#include "input.h"
#include "rows.h"

namespace lexicor_cli {

/// A line as it is written.
struct Line {
  const char* text;
  uint32_t bytes;
  uint32_t end_bytes;  // of them: what is behind the text that counts

  std::string_view whole() const { return {text, bytes}; }
  std::string_view counted() const { return {text, bytes - end_bytes}; }
};

/// Reads lines that end with a line feed, or with a carriage return and one, or with a null character. Every file ends
/// its last line. Throws a Failure for a line that ends inside a character, or is too long.
class LineReader {
 public:
  /// `fits` is asked of each line without its end.
  LineReader(const Codepage& codepage, Input& input, bool null_ended, size_t block_bytes,
             std::function<bool(std::string_view)> fits);

  /// Adds the lines of the next block, whose text is kept in `texts`. False: the input has ended, with the lines that
  /// were added.
  bool read(Arena* texts, Rows<Line>* lines);
  /// How much has been read, in bytes.
  uint64_t offset() const { return offset_; }

 private:
  const char* find_end(const char* at, const char* end) const;
  void add_line(const char* begin, const char* end, uint64_t offset, Rows<Line>* lines);
  void add_last(char* text, Rows<Line>* lines);
  void check_length(std::string_view text, uint64_t offset) const;
  [[noreturn]] void refuse_length(const std::string& bytes, uint64_t offset) const;
  LXShiftState check_whole(std::string_view text, uint64_t offset, bool ended) const;
  bool ends_whole(std::string_view text) const;
  size_t whole_bytes(std::string_view text, LXShiftState* state) const;

  const Codepage& codepage_;
  Input& input_;
  const size_t most_block_bytes_;
  size_t block_bytes_;
  const std::function<bool(std::string_view)> fits_;
  const char end_;
  const char carriage_return_;
  const bool null_ended_;
  std::string begun_;        // a line whose end has not been read
  bool two_ = false;         // the line before ended with two characters
  uint64_t file_lines_ = 0;  // of the file that is read
  uint64_t offset_ = 0;      // of what is read next
};

/// How much of a text is in front of the first shift byte that changes nothing, as one that no character follows does
/// not: all of it where there is none. In bytes.
size_t bytes_before_idle_shift(const Codepage& codepage, std::string_view text);
/// A text without the shift bytes that change nothing: the library takes the second of two for a character.
std::string without_idle_shifts(const Codepage& codepage, std::string_view text);

}  // namespace lexicor_cli
