// One pass over the lines. A backslash at the end joins a line with the next one before anything is looked at,
// in comments too.
#include "message_source.h"

#include <algorithm>
#include <optional>

#include "lexicor-data/line_text.h"
#include "source_parser.h"

namespace lexicor_gencat {

namespace {

constexpr char kSetWord[] = "set", kDelsetWord[] = "delset", kQuoteWord[] = "quote";

bool is_digit(uint32_t c) {
  return c >= '0' && c <= '9';
}
bool is_octal(uint32_t c) {
  return c >= '0' && c <= '7';
}
bool is_name(uint32_t c) {
  return is_digit(c) || (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z') || c == '_';
}
bool is_space(uint32_t c) {
  return c == ' ' || (c >= '\t' && c <= '\r');
}

/// An odd number of backslashes at the end.
bool is_continued(const std::vector<Character>& line) {
  size_t backslashes = 0;
  while (backslashes < line.size() && line[line.size() - 1 - backslashes].syntax == '\\') ++backslashes;
  return backslashes % 2 == 1;
}

/// A line with those that continue it; false at the end of the source.
bool next_joined(LineReader& reader, std::vector<Character>& line) {
  if (!reader.next(line)) return false;
  std::vector<Character> more;
  while (is_continued(line)) {
    const Character backslash = line.back();
    line.pop_back();
    if (!reader.next(more)) {
      line.push_back(backslash);
      return true;
    }
    line.insert(line.end(), more.begin(), more.end());
  }
  return true;
}

/// The value of "KEY=VALUE" in a comment's text.
void read_declaration(const std::string& comment, const char* key, std::string& value) {
  const std::string prefix = std::string(key) + "=";
  if (!value.empty() || comment.compare(0, prefix.size(), prefix) != 0) return;
  value = comment.substr(prefix.size(), comment.find_first_of(" \t\r", prefix.size()) - prefix.size());
}

class SourceReader : SourceParser {
 public:
  using SourceParser::SourceParser;

  void read() {
    builder_.begin_source();
    while (next_joined(reader_, line_)) read_line();
  }

 private:
  void read_line() {
    at_ = 0;
    const uint32_t first = peek();
    if (first == '$') return read_directive();
    if (is_name(first)) return read_message();
    skip(is_space);
    if (at_ < line_.size())
      error(at_, at_ == 0 ? "expected a message number, a directive that begins with $, or an empty line"
                          : "expected the message number at the begin of the line, without blanks before it");
  }

  std::string word(size_t begin, size_t end) const {
    std::string text;
    for (size_t i = begin; i < end; ++i)
      text += line_[i].syntax < 0x7F ? static_cast<char>(line_[i].syntax) : '?';
    return text;
  }

  /// The word behind "$" is `name`, and ends there; `at_` is then behind it.
  bool takes(const char* name) {
    size_t at = 1;
    for (; *name != 0; ++name, ++at) {
      if (at >= line_.size() || line_[at].syntax != static_cast<unsigned char>(*name)) return false;
    }
    if (at < line_.size() && !is_space(line_[at].syntax) && !is_digit(line_[at].syntax)) return false;
    at_ = at;
    return true;
  }

  void read_directive() {
    if (line_.size() == 1 || is_space(line_[1].syntax)) return;
    if (takes(kSetWord)) return read_set(false);
    if (takes(kDelsetWord)) return read_set(true);
    if (takes(kQuoteWord)) return read_quote();
    const size_t end = static_cast<size_t>(
        std::find_if(line_.begin() + 1, line_.end(), [](const Character& c) { return is_space(c.syntax); }) -
        line_.begin());
    error(0, "unknown directive " + word(0, end) +
                 "; expected $set, $delset, $quote, or $ and a blank before a comment");
  }

  void read_quote() {
    skip(is_space);
    quote_ = at_end() ? 0 : peek();
  }

  void read_set(bool deletes) {
    skip(is_space);
    const size_t begin = at_;
    const Place where = place(begin);
    if (is_digit(peek())) {
      uint32_t number;
      if (!read_number("set", number)) return;
      deletes ? builder_.delete_set(number) : builder_.select_set(number);
      return;
    }
    skip(is_name);
    if (at_ == begin) return error(begin, "expected a set number from 1, or a name of letters, digits and _");
    const std::string name = word(begin, at_);
    deletes ? builder_.delete_named_set(name, where) : builder_.select_named_set(name, where);
  }

  /// Digits; what stands behind them up to the next blank is passed with a warning.
  bool read_number(const char* what, uint32_t& number) {
    const size_t begin = at_;
    uint64_t value = 0;
    for (; !at_end() && is_digit(peek()); ++at_)
      value = std::min<uint64_t>(value * 10 + (peek() - '0'), 1ULL << 33);
    if (value == 0 || value > UINT32_MAX) {
      error(begin, std::string(what) + " number " + word(begin, at_) + "; expected 1 to 4294967295");
      return false;
    }
    number = static_cast<uint32_t>(value);
    const size_t end = at_;
    skip([](uint32_t c) { return !is_space(c); });
    if (at_ != end)
      problems_.warning(place(end), "'" + word(end, at_) + "' behind the " + what + " number " +
                                        std::to_string(number) + " is ignored; expected a blank");
    return true;
  }

  void read_message() {
    const Place where = place(0);
    uint32_t number = 0;
    std::string name;
    if (is_digit(peek())) {
      if (!read_number("message", number)) return;
    } else {
      skip(is_name);
      name = word(0, at_);
      if (!at_end() && !is_space(peek()))
        return error(at_, "expected a name of letters, digits and _, and a blank behind it");
    }
    // A number alone deletes; with a blank behind it the text is empty.
    if (name.empty() && at_end()) return builder_.remove(number);
    const size_t errors = problems_.errors();
    std::string text = read_message_text(line_, at_ + 1, quote_, file_name_, recoder_, problems_);
    if (problems_.errors() != errors) text.clear();
    name.empty() ? builder_.put(number, std::move(text), where)
                 : builder_.put_named(name, std::move(text), where);
  }

  uint32_t quote_ = 0;
};

constexpr char kEscapeLetters[] = "ntvbrf", kEscapeValues[] = "\n\t\v\b\r\f";
constexpr size_t kEscapes = sizeof kEscapeLetters - 1;

}  // namespace

uint32_t escape_value(uint32_t letter) {
  for (size_t i = 0; i < kEscapes; ++i) {
    if (letter == static_cast<unsigned char>(kEscapeLetters[i]))
      return static_cast<unsigned char>(kEscapeValues[i]);
  }
  return 0;
}

char escape_letter(uint32_t value) {
  for (size_t i = 0; i < kEscapes; ++i) {
    if (value == static_cast<unsigned char>(kEscapeValues[i])) return kEscapeLetters[i];
  }
  return 0;
}

char read_octal(const std::vector<Character>& line, size_t& at) {
  constexpr size_t kMostDigits = 3;
  uint32_t value = 0;
  for (size_t digits = 0;
       digits < kMostDigits && value <= 0377 / 8 && at < line.size() && is_octal(line[at].syntax);
       ++digits, ++at)
    value = value * 8 + (line[at].syntax - '0');
  return static_cast<char>(value);
}

std::string read_message_text(const std::vector<Character>& line, size_t at, uint32_t quote,
                              const std::string& file_name, const Recoder& recoder, Problems& problems) {
  TextWriter text(recoder.target().codepage());
  auto place = [&](size_t i) { return Place{file_name, line[i].line, line[i].column}; };
  const size_t begin = at;
  const bool quoted = quote != 0 && at < line.size() && line[at].syntax == quote;
  if (quoted) ++at;
  while (at < line.size() && (quote == 0 || line[at].syntax != quote)) {
    const size_t start = at++;
    if (line[start].syntax != '\\') {
      recoder.put(text, line[start], place(start), problems);
      continue;
    }
    if (at == line.size()) break;
    const uint32_t next = line[at].syntax;
    if (is_octal(next)) {
      text.put_byte(read_octal(line, at));
    } else if (next == '\\' || (quote != 0 && next == quote)) {
      recoder.put(text, line[at], place(at), problems);
      ++at;
    } else if (escape_value(next) != 0) {
      recoder.put_unicode(text, escape_value(next), place(start), problems);
      ++at;
    }
    // Before any other character the backslash is ignored.
  }
  if (quoted && at == line.size()) problems.error(place(begin), "the closing quote is missing");
  const auto rest = std::find_if(line.begin() + static_cast<std::ptrdiff_t>(std::min(at + 1, line.size())),
                                 line.end(), [](const Character& c) { return !is_space(c.syntax); });
  if (rest != line.end())
    problems.warning({file_name, rest->line, rest->column}, "text behind the closing quote is ignored");
  return text.finish();
}

Declarations read_declarations(const std::string& source, const Encoding* encoding) {
  Declarations found;
  std::vector<Character> line;
  size_t at = has_byte_order_mark(source) ? kByteOrderMarkBytes : 0;
  std::optional<LineReader> reader;
  if (encoding != nullptr) reader.emplace(*encoding, source);
  int line_number = 1;
  for (std::string text;; text.clear(), ++line_number) {
    if (reader.has_value()) {
      if (!reader->next(line)) return found;
      for (const Character& c : line) text += c.syntax < 0x7F ? static_cast<char>(c.syntax) : '?';
    } else {
      if (at >= source.size()) return found;
      const size_t end = std::min(source.find('\n', at), source.size());
      text = source.substr(at, end - at);
      at = end + 1;
    }
    if (text.find_first_not_of(" \t\r") == std::string::npos) continue;
    if (text[0] != '$') return found;
    if (text.size() < 2 || !lexicor_data::is_blank(text[1])) continue;
    const size_t begin = text.find_first_not_of(" \t", 1);
    if (begin == std::string::npos) continue;
    const std::string comment = text.substr(begin);
    read_declaration(comment, "locale", found.locale);
    read_declaration(comment, "codeset", found.codeset);
    read_declaration(comment, "byte-order", found.byte_order);
    if (found.byte_order_line == 0 && !found.byte_order.empty()) found.byte_order_line = line_number;
  }
}

void read_message_source(const std::string& source, const std::string& file_name, const Recoder& recoder,
                         CatalogBuilder& builder, Problems& problems) {
  SourceReader(source, file_name, recoder, builder, problems).read();
}

}  // namespace lexicor_gencat
