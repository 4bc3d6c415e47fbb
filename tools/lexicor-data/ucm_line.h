// A line of a codepage table: the cursor that reads it, and the texts of bytes, codes and code points.
#pragma once

#include <cstdint>
#include <string>

#include "source_error.h"

namespace lexicor_data {

struct Position {
  int line = 0;
  int column = 0;
};

std::string byte_text(uint32_t byte);                  ///< \xHH
std::string code_text(uint32_t code, unsigned bytes);  ///< \xHH\xHH
std::string unicode_text(uint32_t unicode);            ///< <UXXXX>

/// A position in one line. Comments (# outside quotes) and blanks at the end are not part of the line.
class UcmLine {
 public:
  UcmLine(const std::string& file, std::string line, int number);

  Position here() const { return {number_, static_cast<int>(at_) + 1}; }
  bool done() const { return at_ >= line_.size(); }
  char peek() const { return done() ? '\0' : line_[at_]; }
  void skip_blanks();
  bool take(char c);
  bool take(const char* text);
  bool is_text(const char* text) const { return line_ == text; }

  [[noreturn]] void fail(const std::string& what) const { fail(here(), what); }
  [[noreturn]] void fail(Position where, const std::string& what) const;
  /// "found ..., expected ...": the word at the cursor against what should stand there.
  [[noreturn]] void fail_expected(const std::string& expected) const;

  void expect(char c, const std::string& what) {
    if (!take(c)) fail_expected(what);
  }
  void expect_end();

  std::string word();
  std::string bracketed();  ///< what stands between < and >
  std::string quoted();
  std::string quoted_or_word() { return peek() == '"' ? quoted() : word(); }
  /// A number of `least` to `most` hexadecimal digits, as many as there are.
  uint32_t hex_number(int least, int most);
  /// One \xHH.
  uint8_t byte();

 private:
  std::string up_to(char closing, const char* missing);
  std::string found() const;

  const std::string& file_;
  std::string line_;
  int number_;
  size_t at_ = 0;
};

}  // namespace lexicor_data
