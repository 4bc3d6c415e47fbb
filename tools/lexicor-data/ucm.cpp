// Reader and writer of codepage tables. The reader walks the text line by line with a cursor, so that every
// error names its line and column; what concerns the table as a whole (lengths against leads, duplicates) is
// checked at the end, at the positions kept for each mapping.
#include "ucm.h"

#include <algorithm>
#include <istream>
#include <map>
#include <ostream>
#include <tuple>

#include "lexicor/hex.h"
#include "line_text.h"

namespace lexicor_data {
namespace {

using lexicor_cli::hex_text;

constexpr uint32_t kLastCodePoint = 0x10FFFF;
constexpr size_t kMaxCodeBytes = 4;

struct Key {
  const char* text;
  bool required;
};

constexpr Key kKeys[] = {
    {"code_set_name", true}, {"uconv_class", true},        {"mb_cur_max", true},
    {"subchar", true},       {"lexicor:leads", false},     {"lexicor:line_ends", true},
    {"lexicor:ascii", true}, {"lexicor:algorithm", false}, {"lexicor:source", false},
};

struct ClassWord {
  const char* text;
  CodepageClass kind;
};

constexpr ClassWord kClasses[] = {
    {"SBCS", CodepageClass::kSingleByte},
    {"MBCS", CodepageClass::kMultiByte},
    {"EBCDIC_STATEFUL", CodepageClass::kShiftStateful},
};

std::string located(const std::string& file, int line, int column, const std::string& what) {
  std::string text = file;
  if (line > 0) text += ":" + std::to_string(line);
  if (line > 0 && column > 0) text += ":" + std::to_string(column);
  return text + ": " + what;
}

std::string byte_text(uint32_t byte) {
  return "\\x" + hex_text(byte, 2);
}

std::string code_text(uint32_t code, unsigned bytes) {
  std::string text;
  for (unsigned shift = bytes * 8; shift > 0; shift -= 8) text += byte_text(code >> (shift - 8) & 0xFF);
  return text;
}

std::string unicode_text(uint32_t unicode) {
  return "<U" + hex_text(unicode, 4) + ">";
}

uint32_t first_byte(const Mapping& mapping) {
  return mapping.code >> (8 * (mapping.bytes - 1));
}

bool canonical_less(const Mapping& a, const Mapping& b) {
  return std::tie(a.unicode, a.precision, a.code) < std::tie(b.unicode, b.precision, b.code);
}

struct Position {
  int line = 0;
  int column = 0;
};

/// A position in one line. Comments (# outside quotes) and blanks at the end are not part of the line.
class Cursor {
 public:
  Cursor(const std::string& file, std::string line, int number)
      : file_(file), line_(std::move(line)), number_(number) {
    bool quoted = false;
    for (size_t i = 0; i < line_.size(); ++i) {
      if (line_[i] == '"') quoted = !quoted;
      if (line_[i] == '#' && !quoted) line_.resize(i);
    }
    while (!line_.empty() && is_blank(line_.back())) line_.pop_back();
  }

  Position here() const { return {number_, static_cast<int>(at_) + 1}; }
  bool done() const { return at_ >= line_.size(); }
  char peek() const { return done() ? '\0' : line_[at_]; }
  void skip_blanks() {
    while (is_blank(peek())) ++at_;
  }
  bool take(char c) {
    if (peek() != c) return false;
    ++at_;
    return true;
  }
  bool is_text(const char* text) const { return line_ == text; }

  [[noreturn]] void fail(const std::string& what) const { fail(here(), what); }
  [[noreturn]] void fail(Position where, const std::string& what) const {
    throw SourceError(file_, where.line, where.column, what);
  }
  /// "found ..., expected ...": the word at the cursor against what should stand there.
  [[noreturn]] void fail_expected(const std::string& expected) const {
    fail("found " + found() + ", expected " + expected);
  }

  void expect(char c, const std::string& what) {
    if (!take(c)) fail_expected(what);
  }
  void expect_end() {
    skip_blanks();
    if (!done()) fail_expected("the end of the line");
  }

  std::string word() {
    const size_t start = at_;
    while (!done() && !is_blank(peek())) ++at_;
    return line_.substr(start, at_ - start);
  }
  std::string bracketed() {
    expect('<', "a key in angle brackets");
    const size_t end = line_.find('>', at_);
    if (end == std::string::npos) fail("the key has no closing bracket");
    const std::string text = line_.substr(at_, end - at_);
    at_ = end + 1;
    return text;
  }
  std::string quoted() {
    expect('"', "a text in quotes");
    const size_t end = line_.find('"', at_);
    if (end == std::string::npos) fail("the text has no closing quote");
    const std::string text = line_.substr(at_, end - at_);
    at_ = end + 1;
    return text;
  }
  /// Between `least` and `most` hex digits, greedily.
  uint32_t hex_number(int least, int most) {
    uint32_t value = 0;
    int digits = 0;
    for (; digits < most && hex_value(peek()) >= 0; ++digits) {
      value = value << 4 | static_cast<uint32_t>(hex_value(peek()));
      ++at_;
    }
    if (digits < least) fail_expected("a hexadecimal digit");
    return value;
  }
  /// One \xHH.
  uint8_t byte() {
    if (peek() != '\\' || at_ + 1 >= line_.size() || line_[at_ + 1] != 'x') fail_expected("a byte as \\xHH");
    at_ += 2;
    return static_cast<uint8_t>(hex_number(2, 2));
  }

 private:
  std::string found() const {
    if (done()) return "the end of the line";
    size_t end = at_;
    while (end < line_.size() && !is_blank(line_[end])) ++end;
    return "'" + line_.substr(at_, end - at_) + "'";
  }

  const std::string& file_;
  std::string line_;
  int number_;
  size_t at_ = 0;
};

class UcmReader {
 public:
  UcmReader(std::istream& in, const std::string& file) : in_(in), file_(file) {}

  CodepageSource read() {
    std::string text;
    while (next_line(in_, &text, &line_)) {
      Cursor cursor(file_, std::move(text), line_);
      cursor.skip_blanks();
      if (!cursor.done()) read_line(cursor);
    }
    if (in_.bad()) throw SourceError(file_, line_, 0, "the file cannot be read");
    if (place_ == Place::kMappings) throw SourceError(file_, line_ + 1, 1, "END CHARMAP is missing");
    if (place_ == Place::kHeader) {
      check_header({line_ + 1, 1});
      if (!source_.utf8) throw SourceError(file_, line_ + 1, 1, "CHARMAP is missing");
    }
    check_mappings();
    std::sort(source_.mappings.begin(), source_.mappings.end(), canonical_less);
    return std::move(source_);
  }

 private:
  enum class Place { kHeader, kMappings, kEnd };

  void read_line(Cursor& cursor) {
    switch (place_) {
      case Place::kHeader:
        if (cursor.peek() == '<') return read_key(cursor);
        if (!cursor.is_text("CHARMAP")) cursor.fail_expected("a key in angle brackets or CHARMAP");
        check_header(cursor.here());
        if (source_.utf8) cursor.fail("CHARMAP stands in a computed codepage");
        place_ = Place::kMappings;
        return;
      case Place::kMappings:
        if (cursor.peek() == '<') return read_mapping(cursor);
        if (!cursor.is_text("END CHARMAP")) cursor.fail_expected("a mapping or END CHARMAP");
        place_ = Place::kEnd;
        return;
      case Place::kEnd:
        cursor.fail_expected("nothing after END CHARMAP");
    }
  }

  void read_key(Cursor& cursor) {
    const Position start = cursor.here();
    const std::string key = cursor.bracketed();
    const auto known = std::find_if(std::begin(kKeys), std::end(kKeys),
                                    [&](const Key& candidate) { return key == candidate.text; });
    if (known == std::end(kKeys)) cursor.fail(start, "unknown key <" + key + ">");
    const auto added = keys_.emplace(key, start);
    if (!added.second) {
      cursor.fail(start,
                  "key <" + key + "> stands on line " + std::to_string(added.first->second.line) + " already");
    }
    cursor.skip_blanks();
    read_value(cursor, key);
    cursor.expect_end();
  }

  void read_value(Cursor& cursor, const std::string& key) {
    const Position start = cursor.here();
    if (key == "code_set_name") {
      source_.name = cursor.quoted();
      if (source_.name.empty()) cursor.fail(start, "the name is empty");
    } else if (key == "uconv_class") {
      const std::string word = cursor.quoted();
      const auto found = std::find_if(std::begin(kClasses), std::end(kClasses),
                                      [&](const ClassWord& candidate) { return word == candidate.text; });
      if (found == std::end(kClasses)) {
        cursor.fail(start, "found class \"" + word + "\", expected \"SBCS\", \"MBCS\" or \"EBCDIC_STATEFUL\"");
      }
      source_.kind = found->kind;
    } else if (key == "mb_cur_max") {
      const char digit = cursor.peek();
      if (digit < '1' || digit > '4') cursor.fail_expected("a width from 1 to 4");
      cursor.take(digit);
      source_.width = static_cast<uint8_t>(digit - '0');
    } else if (key == "subchar") {
      source_.substitution = cursor.byte();
    } else if (key == "lexicor:line_ends") {
      for (uint8_t& byte : source_.line_ends) byte = cursor.byte();
    } else if (key == "lexicor:ascii") {
      const std::string word = cursor.word();
      if (word != "yes" && word != "no") cursor.fail(start, "found '" + word + "', expected yes or no");
      source_.ascii = word == "yes";
    } else if (key == "lexicor:leads") {
      read_leads(cursor);
    } else if (key == "lexicor:algorithm") {
      const std::string word = cursor.quoted();
      if (word != "UTF-8") cursor.fail(start, "found algorithm \"" + word + "\", expected \"UTF-8\"");
      source_.utf8 = true;
    } else {
      source_.source = cursor.quoted();
    }
  }

  void read_leads(Cursor& cursor) {
    do {
      const Position start = cursor.here();
      const uint32_t first = cursor.hex_number(2, 2);
      const uint32_t last = cursor.take('-') ? cursor.hex_number(2, 2) : first;
      cursor.expect(':', "a colon and the length");
      const char digit = cursor.peek();
      if (digit < '2' || digit > '4') cursor.fail_expected("a length from 2 to 4");
      cursor.take(digit);
      if (last < first) cursor.fail(start, "the range runs backwards");
      if (first == 0) cursor.fail(start, "the byte 00 cannot begin a longer character");
      for (uint32_t byte = first; byte <= last; ++byte) {
        if (source_.leads[byte] != 1) cursor.fail(start, "lead " + hex_text(byte, 2) + " is named twice");
        source_.leads[byte] = static_cast<uint8_t>(digit - '0');
      }
      if (!cursor.done() && !is_blank(cursor.peek())) cursor.fail_expected("a blank between ranges");
      cursor.skip_blanks();
    } while (!cursor.done());
  }

  /// `end` is where the header ends; an error about a key that is there names the key's own place.
  void check_header(Position end) {
    for (const Key& key : kKeys) {
      if (key.required && keys_.count(key.text) == 0) {
        throw SourceError(file_, end.line, end.column, "key <" + std::string(key.text) + "> is missing");
      }
    }
    auto fail = [&](const char* key, const std::string& what) {
      const auto place = keys_.find(key);
      const Position where = place == keys_.end() ? end : place->second;
      throw SourceError(file_, where.line, where.column, what);
    };
    const bool multi_byte = source_.kind == CodepageClass::kMultiByte;
    const bool has_leads = keys_.count("lexicor:leads") != 0;
    if ((source_.kind == CodepageClass::kSingleByte) != (source_.width == 1)) {
      fail("mb_cur_max", "width " + std::to_string(source_.width) + " does not agree with the class");
    }
    if (multi_byte != has_leads) {
      fail("lexicor:leads", multi_byte ? "key <lexicor:leads> is missing" : "only the class MBCS has leads");
    }
    const uint8_t longest = *std::max_element(source_.leads.begin(), source_.leads.end());
    if (multi_byte && longest != source_.width) {
      fail("mb_cur_max", "width " + std::to_string(source_.width) + " is not that of the longest lead, " +
                             std::to_string(longest));
    }
    if (source_.utf8 && !multi_byte) fail("lexicor:algorithm", "the algorithm UTF-8 needs the class MBCS");
    const auto check_single = [&](const char* key, uint8_t byte) {
      const bool shift =
          source_.kind == CodepageClass::kShiftStateful && (byte == kShiftOut || byte == kShiftIn);
      if (shift || source_.leads[byte] != 1) fail(key, byte_text(byte) + " is no character of one byte");
    };
    check_single("subchar", source_.substitution);
    for (const uint8_t byte : source_.line_ends) check_single("lexicor:line_ends", byte);
  }

  void read_mapping(Cursor& cursor) {
    Mapping mapping;
    const Position start = cursor.here();
    cursor.take('<');
    cursor.expect('U', "a code point as <UXXXX>");
    mapping.unicode = cursor.hex_number(4, 6);
    cursor.expect('>', "the closing bracket of a code point of 4 to 6 digits");
    if (mapping.unicode > kLastCodePoint) {
      cursor.fail(start, "code point " + unicode_text(mapping.unicode) + " lies above <U10FFFF>");
    }
    if (cursor.peek() == '<' || cursor.peek() == '+') {
      cursor.fail("found a sequence of code points, expected one code point a mapping");
    }
    if (!is_blank(cursor.peek())) cursor.fail_expected("a blank");
    cursor.skip_blanks();
    const Position code_start = cursor.here();
    size_t bytes = 0;
    do {
      mapping.code = mapping.code << 8 | cursor.byte();
      ++bytes;
    } while (bytes < kMaxCodeBytes && cursor.peek() == '\\');
    mapping.bytes = static_cast<uint8_t>(bytes);
    if (!cursor.done() && !is_blank(cursor.peek())) cursor.fail_expected("a blank after at most 4 bytes");
    check_length(cursor, code_start, mapping);
    cursor.skip_blanks();
    cursor.expect('|', "the precision");
    const char precision = cursor.peek();
    if (precision != '0' && precision != '1' && precision != '3') cursor.fail_expected("precision 0, 1 or 3");
    cursor.take(precision);
    mapping.precision = static_cast<uint8_t>(precision - '0');
    cursor.expect_end();
    source_.mappings.push_back(mapping);
    places_.push_back({start, code_start});
  }

  void check_length(const Cursor& cursor, Position where, const Mapping& mapping) const {
    const uint32_t first = first_byte(mapping);
    const std::string code = code_text(mapping.code, mapping.bytes);
    if (source_.kind == CodepageClass::kShiftStateful) {
      if (mapping.bytes != 1 && mapping.bytes != source_.width) {
        cursor.fail(where, "code " + code + " has " + std::to_string(mapping.bytes) + " bytes, expected 1 or " +
                               std::to_string(source_.width));
      }
      if (mapping.bytes == 1 && (first == kShiftOut || first == kShiftIn)) {
        cursor.fail(where, code + " is a shift byte and carries no character");
      }
    } else if (mapping.bytes != source_.leads[first]) {
      cursor.fail(where, "code " + code + " has " + std::to_string(mapping.bytes) +
                             (mapping.bytes == 1 ? " byte, but " : " bytes, but ") + byte_text(first) +
                             " begins characters of " + std::to_string(source_.leads[first]));
    }
    if (mapping.bytes > 1 && first == 0) cursor.fail(where, "code " + code + " begins with a zero byte");
  }

  /// No code means two characters, and no character has two codes. The first offending line is reported.
  void check_mappings() const {
    std::vector<size_t> order;
    auto refuse = [&](uint8_t one_way, uint32_t Mapping::*field, auto text, auto place) {
      order.clear();
      for (size_t i = 0; i < source_.mappings.size(); ++i) {
        if (source_.mappings[i].precision == 0 || source_.mappings[i].precision == one_way) order.push_back(i);
      }
      std::sort(order.begin(), order.end(), [&](size_t a, size_t b) {
        const uint32_t x = source_.mappings[a].*field, y = source_.mappings[b].*field;
        return x != y ? x < y : a < b;
      });
      size_t worst = SIZE_MAX, earlier = 0;
      for (size_t i = 1; i < order.size(); ++i) {
        const bool same = source_.mappings[order[i]].*field == source_.mappings[order[i - 1]].*field;
        if (same && order[i] < worst) worst = order[i], earlier = order[i - 1];
      }
      if (worst == SIZE_MAX) return;
      const Position where = place(places_[worst]);
      throw SourceError(file_, where.line, where.column,
                        text(source_.mappings[worst]) + " is mapped on line " +
                            std::to_string(places_[earlier].unicode.line) + " already");
    };
    refuse(
        3, &Mapping::code, [](const Mapping& m) { return "code " + code_text(m.code, m.bytes); },
        [](const Places& p) { return p.code; });
    refuse(
        1, &Mapping::unicode, [](const Mapping& m) { return "code point " + unicode_text(m.unicode); },
        [](const Places& p) { return p.unicode; });
  }

  struct Places {
    Position unicode;
    Position code;
  };

  std::istream& in_;
  const std::string& file_;
  int line_ = 0;
  Place place_ = Place::kHeader;
  std::map<std::string, Position> keys_;
  CodepageSource source_;
  std::vector<Places> places_;  ///< of source_.mappings, in the order of reading
};

void write_key(std::ostream& out, const char* key, const std::string& value) {
  std::string text = "<" + std::string(key) + ">";
  text.resize(std::max<size_t>(text.size() + 1, 22), ' ');
  out << text << value << '\n';
}

std::string in_quotes(const std::string& text) {
  if (text.find_first_of("\"\r\n") != std::string::npos) {
    throw SourceError("", 0, 0, "a text with quotes or line ends cannot be written");
  }
  return '"' + text + '"';
}

std::string leads_text(const std::array<uint8_t, 256>& leads) {
  std::string text;
  for (uint32_t first = 0; first < 256;) {
    uint32_t last = first;
    while (last < 255 && leads[last + 1] == leads[first]) ++last;
    if (leads[first] != 1) {
      if (!text.empty()) text += ' ';
      text += hex_text(first, 2);
      if (last > first) text += '-' + hex_text(last, 2);
      text += ':' + std::to_string(leads[first]);
    }
    first = last + 1;
  }
  return text;
}

}  // namespace

SourceError::SourceError(std::string file_name, int line_number, int column_number, const std::string& what)
    : std::runtime_error(located(file_name, line_number, column_number, what)),
      file(std::move(file_name)),
      line(line_number),
      column(column_number) {}

CodepageSource read_ucm(std::istream& in, const std::string& file_name) {
  return UcmReader(in, file_name).read();
}

void write_ucm(std::ostream& out, const CodepageSource& source) {
  const auto kind = std::find_if(std::begin(kClasses), std::end(kClasses),
                                 [&](const ClassWord& candidate) { return source.kind == candidate.kind; });
  std::string line_ends;
  for (uint8_t byte : source.line_ends) line_ends += byte_text(byte);
  write_key(out, "code_set_name", in_quotes(source.name));
  if (!source.source.empty()) write_key(out, "lexicor:source", in_quotes(source.source));
  write_key(out, "uconv_class", in_quotes(kind->text));
  write_key(out, "mb_cur_max", std::to_string(source.width));
  write_key(out, "subchar", byte_text(source.substitution));
  write_key(out, "lexicor:line_ends", line_ends);
  write_key(out, "lexicor:ascii", source.ascii ? "yes" : "no");
  if (source.kind == CodepageClass::kMultiByte) write_key(out, "lexicor:leads", leads_text(source.leads));
  if (source.utf8) {
    write_key(out, "lexicor:algorithm", in_quotes("UTF-8"));
    return;
  }
  std::vector<Mapping> mappings = source.mappings;
  std::sort(mappings.begin(), mappings.end(), canonical_less);
  out << "CHARMAP\n";
  for (const Mapping& mapping : mappings) {
    out << unicode_text(mapping.unicode) << ' ' << code_text(mapping.code, mapping.bytes) << " |"
        << static_cast<char>('0' + mapping.precision) << '\n';
  }
  out << "END CHARMAP\n";
}

}  // namespace lexicor_data
