// Texts as characters of a codepage: the walk over a source that never takes a trail byte for a character, and
// the way from a source's codepage to that of a catalog.
#pragma once

#include <lx.h>

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "lexicor/character_values.h"
#include "lexicor/codepage.h"

namespace lexicor_gencat {

struct Character {
  static constexpr uint32_t kNone = 0xFFFFFFFF;

  uint32_t unicode = kNone;  // a code point, above 0xFFFF too; kNone: the bytes are no character
  LXWChar code = 0;          // the bytes, first most significant
  uint8_t bytes = 1;
  /// What the character means to a source's syntax: its Unicode value, but a backslash where the codepage shows
  /// another sign in its place.
  uint32_t syntax = kNone;
  int line = 0, column = 0;
};

class Encoding {
 public:
  explicit Encoding(const lexicor_cli::Codepage& codepage);

  const lexicor_cli::Codepage& codepage() const { return codepage_; }
  /// Whether the ASCII characters have their ASCII bytes.
  bool ascii_based() const { return ascii_based_; }

  /// Reads the character at `text`, which is no shift byte.
  Character read(const char* text, const char* end, LXShiftState state) const;
  /// The packed code of a Unicode value, or nothing when the codepage lacks it.
  std::optional<LXWChar> find(uint32_t unicode) const;

 private:
  uint32_t unicode_of(const char* text, int32_t bytes, LXWChar code, LXShiftState state) const;
  uint32_t syntax_of(const Character& character) const;

  const lexicor_cli::Codepage& codepage_;
  lexicor_cli::Substitution substitution_;
  std::vector<LXUChar> single_;
  std::optional<LXWChar> replacement_;  // the packed code of U+FFFD
  bool ascii_based_;
};

/// Whether a file begins with the mark that some editors put before UTF-8.
bool has_byte_order_mark(const std::string& file);
inline constexpr size_t kByteOrderMarkBytes = 3;

/// A text character by character; shift bytes are passed and set the state.
class CharacterReader {
 public:
  CharacterReader(const Encoding& encoding, const std::string& text);

  bool at_end();
  Character next();

 private:
  const Encoding& encoding_;
  const char* at_;
  const char* end_;
  LXShiftState state_ = LX_SHIFT_SINGLE;
};

/// Lines of a source as characters. A line ends with a line feed, which may have a carriage return before it.
class LineReader {
 public:
  LineReader(const Encoding& encoding, const std::string& text);

  /// The next line without its end; false behind the last one.
  bool next(std::vector<Character>& line);
  int line_number() const { return line_; }

 private:
  bool is_line_end(const Character& character) const;

  const Encoding& encoding_;
  CharacterReader reader_;
  int line_ = 0;
};

/// Puts the bytes of a text together, with the shift bytes that are due.
class TextWriter {
 public:
  explicit TextWriter(const lexicor_cli::Codepage& codepage) : codepage_(codepage) {}

  void put(LXWChar code);
  /// A byte as it is, in the single-byte state.
  void put_byte(char byte);
  std::string finish();

 private:
  void set_state(LXShiftState state);

  const lexicor_cli::Codepage& codepage_;
  LXShiftState state_ = LX_SHIFT_SINGLE;
  std::string text_;
};

/// The bytes of a character in their order.
std::string bytes_of(LXWChar code, size_t bytes);

/// "byte E4" or "bytes 81 AD".
std::string bytes_name(const Character& character);

}  // namespace lexicor_gencat
