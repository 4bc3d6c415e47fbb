// What the readers and writers of sort sources share: a position in a line of fields, code points and weights in
// hexadecimal, and characters in comments.
#pragma once

#include <algorithm>
#include <cctype>
#include <string>

#include "lexicor/hex.h"
#include "lexicor/utf8_text.h"
#include "line_text.h"
#include "sort_text.h"
#include "ucm.h"

namespace lexicor_data {

/// A value up to FFFF; files have hundreds of thousands.
inline std::string hex4(unsigned value) {
  std::string text(4, '0');
  for (size_t i = 4; i-- > 0; value >>= 4) text[i] = "0123456789ABCDEF"[value & 0xF];
  return text;
}

inline std::string range_text(unsigned first, unsigned last) {
  return first == last ? hex4(first) : hex4(first) + ".." + hex4(last);
}

using lexicor_cli::utf8_text;

/// The characters of a text as code points with blanks between them.
std::string code_points_text(const std::u16string& text);

/// A character in UTF-8, where a text file shows it well; else empty.
std::string visible_text(char16_t unit);

/// A position in one line, without its comment. Every take skips the blanks before it.
class SortLine {
 public:
  SortLine(const std::string& file, std::string text, int number)
      : file_(file), text_(std::move(text)), number_(number) {
    text_.resize(std::min(text_.find('#'), text_.size()));
    while (!text_.empty() && is_blank(text_.back())) text_.pop_back();
  }

  bool done() {
    skip_blanks();
    return at_ >= text_.size();
  }
  char peek() {
    skip_blanks();
    return at_ < text_.size() ? text_[at_] : '\0';
  }
  SortPlace here() {
    skip_blanks();
    return {number_, static_cast<int>(at_) + 1};
  }

  [[noreturn]] void fail(SortPlace where, const std::string& what) const {
    throw SourceError(file_, where.line, where.column, what);
  }
  [[noreturn]] void fail_expected(const std::string& expected) {
    std::string found = "the end of the line";
    if (!done()) {
      const size_t end = std::min(text_.find_first_of(" \t", at_), text_.size());
      found = "'" + text_.substr(at_, end - at_) + "'";
    }
    fail(here(), "found " + found + ", expected " + expected);
  }

  bool take(const std::string& text) {
    skip_blanks();
    if (text_.compare(at_, text.size(), text) != 0) return false;
    at_ += text.size();
    return true;
  }
  void expect(const std::string& text) {
    if (!take(text)) fail_expected("'" + text + "'");
  }
  void expect_end() {
    if (!done()) fail_expected("the end of the line");
  }
  /// Letters, digits and underscores; empty when there is none.
  std::string word() {
    skip_blanks();
    const size_t start = at_;
    while (at_ < text_.size() && (std::isalnum(static_cast<unsigned char>(text_[at_])) || text_[at_] == '_'))
      ++at_;
    return text_.substr(start, at_ - start);
  }
  /// 4 to 6 hexadecimal digits, a value up to `most`.
  unsigned number(unsigned most, const std::string& what) {
    const SortPlace start = here();
    unsigned value = 0;
    int digits = 0;
    for (; digits < 6 && at_ < text_.size() && hex_value(text_[at_]) >= 0; ++digits)
      value = value << 4 | static_cast<unsigned>(hex_value(text_[at_++]));
    if (digits == 0) fail_expected(what);
    if (digits < 4) fail(start, what + " has 4 hexadecimal digits");
    if (value > most) fail(start, what + " is above " + lexicor_cli::hex_text(most, 4));
    return value;
  }

  struct Range {
    unsigned first = 0, last = 0;
  };
  /// A code point, or two with `..` between them.
  Range range() {
    Range range;
    const SortPlace start = here();
    range.first = range.last = number(0xFFFF, "a code point");
    if (take("..")) range.last = number(0xFFFF, "a code point");
    if (range.last < range.first) fail(start, "the range runs backwards");
    return range;
  }
  /// A code point that is a character.
  char16_t character() {
    const SortPlace start = here();
    const unsigned code = number(0x10FFFF, "a code point");
    if (code > 0xFFFF) fail(start, "a sort holds code points up to FFFF");
    if (code >= 0xD800 && code <= 0xDFFF) fail(start, "a surrogate is no character");
    return static_cast<char16_t>(code);
  }

 private:
  void skip_blanks() {
    while (at_ < text_.size() && is_blank(text_[at_])) ++at_;
  }

  const std::string& file_;
  std::string text_;
  int number_;
  size_t at_ = 0;
};

/// Reads a source: what follows `@` on a line goes to `directive`, any other line that says something to `entry`.
/// `*number` is the line that is read, at last the last one.
template <class Directive, class Entry>
void read_sort_lines(std::istream& in, const std::string& file, int* number, Directive directive, Entry entry) {
  std::string text;
  while (next_line(in, &text, number)) {
    SortLine line(file, std::move(text), *number);
    if (line.done()) continue;
    if (line.take("@"))
      directive(line);
    else
      entry(line);
  }
}

}  // namespace lexicor_data
