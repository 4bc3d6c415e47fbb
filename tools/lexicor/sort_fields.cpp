// Texts are walked by characters, so that a separator is never found inside one.
#include "sort_fields.h"

#include <algorithm>
#include <charconv>
#include <limits>

#include "character_values.h"
#include "hex.h"
#include "utf8_text.h"

namespace lexicor_cli {

namespace {

/// Reads the positions of a part.
class Parser {
 public:
  explicit Parser(const std::string& text) : text_(text), at_(text.data()), end_(text.data() + text.size()) {}

  SortField field(const SortFieldDefaults& defaults) {
    SortField field;
    bool lettered = false;
    field.first_field = number() - 1;
    if (take('.')) field.first_char = number() - 1;
    field.skips_first_blanks = letters(&field, &lettered);
    if (take(',')) {
      field.last_field = number();
      if (take('.')) field.last_chars = number_or_zero();
      field.skips_end_blanks = letters(&field, &lettered);
    }
    if (at_ != end_) fail();
    if (lettered) return field;
    field.ignore_case = defaults.ignore_case;
    field.reverse = defaults.reverse;
    field.skips_first_blanks = field.skips_end_blanks = defaults.skip_blanks;
    return field;
  }

 private:
  bool take(char c) {
    if (at_ == end_ || *at_ != c) return false;
    ++at_;
    return true;
  }
  size_t number_or_zero() {
    size_t value = 0;
    const auto read = std::from_chars(at_, end_, value);
    if (read.ec == std::errc::invalid_argument) fail();
    at_ = read.ptr;
    return read.ec == std::errc() ? value : std::numeric_limits<size_t>::max();
  }
  size_t number() {
    const size_t value = number_or_zero();
    if (value == 0) fail();
    return value;
  }
  /// Whether 'b' is among the letters.
  bool letters(SortField* field, bool* lettered) {
    bool blanks = false;
    for (; at_ != end_ && *at_ != ','; ++at_) {
      blanks |= *at_ == 'b';
      field->ignore_case |= *at_ == 'f';
      field->reverse |= *at_ == 'r';
      if (*at_ != 'b' && *at_ != 'f' && *at_ != 'r') fail();
      *lettered = true;
    }
    return blanks;
  }
  [[noreturn]] void fail() const {
    throw Failure(kUsageError,
                  "-k takes FIELD[.CHAR][bfr][,FIELD[.CHAR][bfr]], counted from 1, not '" + text_ + "'");
  }

  const std::string& text_;
  const char* at_;
  const char* const end_;
};

/// The separator's packed code. It is written in UTF-8.
LXWChar separator_code(const Codepage& codepage, const std::string& text) {
  if (text == "\\0") return 0;
  const auto bits = [&](size_t i) { return static_cast<uint32_t>(static_cast<uint8_t>(text[i])); };
  const uint32_t value = text.size() == 1   ? bits(0)
                         : text.size() == 2 ? (bits(0) & 0x1F) << 6 | (bits(1) & 0x3F)
                         : text.size() == 3 ? (bits(0) & 0x0F) << 12 | (bits(1) & 0x3F) << 6 | (bits(2) & 0x3F)
                                            : 0;
  std::string again;
  append_utf8(again, value);
  if (value == 0 || again != text)
    throw Failure(kUsageError, "a field separator is one character, up to U+FFFF, or \\0, not '" + text + "'");
  const auto unit = static_cast<LXUChar>(value);
  const LXWChar code = LXCpUnicodeToCharW(codepage.object(), unit);
  if (Substitution(codepage).stands_for(unit, code))
    throw Failure(kUsageError,
                  "the field separator " + code_point_name(value) + " is not in " + codepage.name());
  return code;
}

}  // namespace

SortField parse_sort_field(const std::string& text, const SortFieldDefaults& defaults) {
  return Parser(text).field(defaults);
}

/// A place in a text, between two characters; shift bytes in front of a character are passed with it.
struct FieldFinder::Walker {
  const Codepage& codepage;
  const char* at;
  const char* end;
  LXShiftState state;
  const char* past;  // the last character that was passed

  bool at_end() {
    while (at != end && codepage.is_shift(*at)) state = codepage.state_after(*at++);
    return at == end;
  }
  size_t bytes() const {
    return std::min<size_t>(static_cast<size_t>(codepage.char_bytes(at, state)), static_cast<size_t>(end - at));
  }
  LXWChar code() const {
    LXWChar code = 0;
    for (size_t i = 0; i < bytes(); ++i) code = code << 8 | static_cast<uint8_t>(at[i]);
    return code;
  }
  void next() { past = at += bytes(); }
};

FieldFinder::FieldFinder(const Codepage& codepage, const std::optional<std::string>& separator)
    : codepage_(codepage),
      separated_(separator.has_value()),
      separator_(separated_ ? separator_code(codepage, *separator) : 0),
      blank_(LXCpUnicodeToCharW(codepage.object(), ' ')),
      tab_(LXCpUnicodeToCharW(codepage.object(), '\t')),
      feed_(LXCpUnicodeToCharW(codepage.object(), '\n')) {}

void FieldFinder::skip_blanks(Walker* walker) const {
  while (!walker->at_end() && is_blank(walker->code())) walker->next();
}

/// Goes to the end of the field: before the separator, or before the blanks that the next field begins with.
void FieldFinder::skip_field(Walker* walker) const {
  if (!separated_) skip_blanks(walker);
  for (; !walker->at_end(); walker->next()) {
    const LXWChar code = walker->code();
    if (separated_ ? code == separator_ : is_blank(code)) return;
  }
}

/// Goes to a field of the line that the walker is at the beginning of.
void FieldFinder::skip_fields(Walker* walker, size_t count) const {
  for (; count > 0 && !walker->at_end(); --count) {
    skip_field(walker);
    if (separated_ && !walker->at_end()) walker->next();
  }
}

std::string_view FieldFinder::find(std::string_view text, const SortField& field, std::string* room) const {
  const auto skip_chars = [](Walker* walker, size_t count) {
    for (; count > 0 && !walker->at_end(); --count) walker->next();
  };
  const char* const text_end = text.data() + text.size();
  Walker begin{codepage_, text.data(), text_end, LX_SHIFT_SINGLE, text.data()};
  Walker end = begin;
  skip_fields(&begin, field.first_field);
  if (field.skips_first_blanks) skip_blanks(&begin);
  skip_chars(&begin, field.first_char);
  if (field.last_field == 0) {
    end.past = text_end;
  } else {
    skip_fields(&end, field.last_field - 1);
    if (field.last_chars == 0) skip_field(&end);
    if (field.last_chars != 0 && field.skips_end_blanks) skip_blanks(&end);
    skip_chars(&end, field.last_chars);
  }
  // Shift bytes between two parts are of neither.
  if (begin.at_end() || begin.at >= end.past) return {};
  const std::string_view part(begin.at, static_cast<size_t>(end.past - begin.at));
  if (begin.state == LX_SHIFT_SINGLE) return part;
  const char shift_out = codepage_.shift_byte(LX_SHIFT_DOUBLE);
  if (begin.at != text.data() && begin.at[-1] == shift_out) return {begin.at - 1, part.size() + 1};
  *room = shift_out;
  return *room += part;
}

}  // namespace lexicor_cli
