// Reader and writer of collation rules.
#include "sort_rules.h"

#include <algorithm>
#include <ostream>

#include "sort_line.h"

namespace lexicor_data {
namespace {

constexpr int32_t kEnd = -1;

bool is_letter_or_digit(int32_t c) {
  return (c >= '0' && c <= '9') || (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z');
}
/// Of ASCII, what has a meaning in rules.
bool is_syntax(int32_t c) {
  return c > ' ' && c < 0x7F && !is_letter_or_digit(c);
}
bool is_space(int32_t c) {
  return (c >= 9 && c <= 13) || c == ' ' || c == 0x85 || c == 0x200E || c == 0x200F || c == 0x2028 ||
         c == 0x2029;
}

/// The characters of a source, one after the other, with their places.
class Characters {
 public:
  Characters(const std::string& text, const std::string& file) : text_(text), file_(file) {
    if (text_.compare(0, sizeof kByteOrderMark - 1, kByteOrderMark) == 0) at_ = sizeof kByteOrderMark - 1;
    read();
  }

  int32_t peek() const { return next_; }
  SortPlace here() const { return place_; }
  int32_t take() {
    const int32_t taken = next_;
    at_ += bytes_;
    if (taken == '\n')
      place_ = {place_.line + 1, 1};
    else if (taken != kEnd)
      ++place_.column;
    read();
    return taken;
  }
  bool take(int32_t c) {
    if (next_ != c) return false;
    take();
    return true;
  }

  /// Blanks, line ends and comments.
  void skip_space() {
    while (is_space(next_) || next_ == '#') {
      if (take() != '#') continue;
      while (next_ != kEnd && next_ != '\n') take();
    }
  }

  [[noreturn]] void fail(SortPlace where, const std::string& what) const {
    throw SourceError(file_, where.line, where.column, what);
  }
  std::string found() const {
    if (next_ == kEnd) return "found the end of the file";
    if (next_ < ' ' || is_space(next_))
      return "found " + lexicor_cli::code_point_name(static_cast<uint32_t>(next_));
    return "found '" + text_.substr(at_, bytes_) + "'";
  }
  [[noreturn]] void fail_expected(const std::string& expected) const {
    fail(place_, found() + ", expected " + expected);
  }
  void expect(int32_t c, const std::string& expected) {
    if (!take(c)) fail_expected(expected);
  }

 private:
  /// Decodes the next character.
  void read() {
    bytes_ = 0;
    next_ = kEnd;
    if (at_ >= text_.size()) return;
    const auto byte = [&](size_t i) {
      return at_ + i < text_.size() ? static_cast<uint8_t>(text_[at_ + i]) : uint8_t{0};
    };
    const uint8_t lead = byte(0);
    bytes_ = lead < 0x80 ? 1 : lead < 0xC2 ? 0 : lead < 0xE0 ? 2 : lead < 0xF0 ? 3 : lead < 0xF5 ? 4 : 0;
    uint32_t value = bytes_ <= 1 ? lead : lead & (0x7Fu >> bytes_);
    bool sound = bytes_ != 0;
    for (size_t i = 1; i < bytes_; ++i) {
      sound = sound && (byte(i) & 0xC0) == 0x80;
      value = value << 6 | (byte(i) & 0x3Fu);
    }
    constexpr uint32_t kLeast[] = {0, 0, 0x80, 0x800, 0x10000};
    if (!sound || value < kLeast[bytes_] || value > 0x10FFFF || (value >= 0xD800 && value <= 0xDFFF))
      fail(place_, "the bytes are not UTF-8");
    next_ = static_cast<int32_t>(value);
  }

  const std::string& text_;
  const std::string& file_;
  size_t at_ = 0, bytes_ = 0;
  int32_t next_ = kEnd;
  SortPlace place_{1, 1};
};

class RuleReader {
 public:
  RuleReader(const std::string& text, const std::string& file) : in_(text, file) {}

  std::vector<SortRule> read() {
    for (in_.skip_space(); in_.peek() != kEnd; in_.skip_space()) {
      const SortPlace place = in_.here();
      if (in_.take('&'))
        read_reset(place);
      else if (in_.take('['))
        read_setting(place);
      else if (in_.peek() == '<' || in_.peek() == '=')
        read_relation(place);
      else
        in_.fail_expected(after_reset_ ? "'<', '=', '&', '[' or a comment" : "'&', '[' or a comment");
    }
    return std::move(rules_);
  }

 private:
  SortRule& add(SortRule::Kind kind, SortPlace place) {
    rules_.emplace_back();
    rules_.back().kind = kind;
    rules_.back().place = place;
    return rules_.back();
  }

  void read_setting(SortPlace place) {
    SortRule& rule = add(SortRule::Kind::kSetting, place);
    after_reset_ = false;
    rule.words = read_words();
    if (rule.words.empty()) in_.fail_expected("the name of a setting");
    rule.place = rule.words[0].place;
    if (in_.peek() == '[') {
      rule.has_set = true;
      rule.characters = read_set();
      in_.skip_space();
    }
    in_.expect(']', "']'");
  }

  void read_reset(SortPlace place) {
    SortRule& rule = add(SortRule::Kind::kReset, place);
    after_reset_ = true;
    in_.skip_space();
    while (in_.peek() == '[') {
      const SortPlace start = in_.here();
      in_.take();
      std::vector<SortWord> words = read_words();
      if (words.empty()) in_.fail_expected("before or the name of a place");
      in_.expect(']', "']'");
      in_.skip_space();
      const bool before = !words.empty() && words[0].text == "before";
      if (!before) {
        rule.words = std::move(words);
        return;
      }
      const std::string level = words.size() == 2 ? words[1].text : "";
      if (level != "1" && level != "2" && level != "3")
        in_.fail(start, "expected [before 1], [before 2] or [before 3]");
      if (rule.strength != Strength::kNone) in_.fail(start, "[before " + level + "] stands behind another one");
      rule.strength = static_cast<Strength>(level[0] - '0');
    }
    rule.text = read_text("a text to reset to");
  }

  void read_relation(SortPlace place) {
    if (!after_reset_) in_.fail(place, "a relation stands without a reset before it, such as &a < b");
    SortRule rule;
    rule.kind = SortRule::Kind::kRelation;
    rule.place = place;
    int level = 0;
    while (level < 4 && in_.take('<')) ++level;
    rule.strength = level == 0 ? Strength::kIdentical : static_cast<Strength>(level);
    if (level == 0) in_.take('=');
    const bool list = in_.take('*');
    in_.skip_space();
    if (list) return read_list(rule);
    rule.place = in_.here();
    rule.text = read_text("a text behind the relation");
    in_.skip_space();
    if (in_.take('|')) {
      in_.skip_space();
      rule.before = std::move(rule.text);
      rule.text = read_text("a text behind '|'");
      in_.skip_space();
    }
    if (in_.take('/')) {
      in_.skip_space();
      rule.extension = read_text("a text behind '/'");
    }
    rules_.push_back(std::move(rule));
  }

  /// A relation for each character; `-` makes ranges.
  void read_list(SortRule& rule) {
    bool any = false;
    for (unsigned last = 0;; any = true) {
      const SortPlace place = in_.here();
      if (any && in_.peek() == '-') {
        in_.take();
        const unsigned end = read_character("the end of the range");
        if (end <= last) in_.fail(place, "the range runs backwards");
        for (unsigned code = last + 1; code <= end; ++code) add_listed(rule, code, place);
        last = end;
        continue;
      }
      if (!at_text()) break;
      for (const char16_t unit : read_piece()) {
        last = unit;
        add_listed(rule, unit, place);
      }
    }
    if (!any) in_.fail_expected("characters behind the relation");
  }

  void add_listed(const SortRule& rule, unsigned code, SortPlace place) {
    SortRule one = rule;
    one.place = place;
    one.text.assign(1, static_cast<char16_t>(code));
    rules_.push_back(std::move(one));
  }

  std::vector<SortWord> read_words() {
    std::vector<SortWord> words;
    for (;;) {
      in_.skip_space();
      const SortPlace place = in_.here();
      std::string word;
      while (is_letter_or_digit(in_.peek()) || in_.peek() == '-' || in_.peek() == '_')
        word += static_cast<char>(in_.take());
      if (word.empty()) return words;
      words.push_back({std::move(word), place});
    }
  }

  std::vector<SortRange> read_set() {
    std::vector<SortRange> ranges;
    in_.take();
    for (in_.skip_space(); !in_.take(']'); in_.skip_space()) {
      const unsigned first = read_character("a character, a range or ']'");
      ranges.push_back({first, first});
      in_.skip_space();
      const SortPlace place = in_.here();
      if (!in_.take('-')) continue;
      in_.skip_space();
      ranges.back().last = read_character("the end of the range");
      if (ranges.back().last < first) in_.fail(place, "the range runs backwards");
    }
    return ranges;
  }

  unsigned read_character(const std::string& expected) {
    if (!at_text()) in_.fail_expected(expected);
    const SortPlace place = in_.here();
    const std::u16string piece = read_piece();
    if (piece.size() != 1) in_.fail(place, "expected one character");
    return piece[0];
  }

  bool at_text() const {
    const int32_t c = in_.peek();
    return c == '\'' || c == '\\' || (c != kEnd && !is_space(c) && !is_syntax(c) && c != 0);
  }

  std::u16string read_text(const std::string& expected) {
    if (!at_text()) in_.fail_expected(expected);
    std::u16string text;
    while (at_text()) text += read_piece();
    return text;
  }

  /// A character, an escape or a quotation.
  std::u16string read_piece() {
    const SortPlace place = in_.here();
    const int32_t c = in_.take();
    if (c == '\\') return unit(read_escape(place), place);
    if (c != '\'') return unit(c, place);
    if (in_.take('\'')) return u"'";
    std::u16string text;
    for (;;) {
      const SortPlace start = in_.here();
      const int32_t quoted = in_.take();
      if (quoted == kEnd) in_.fail(place, "the quotation does not end");
      if (quoted == '\'' && !in_.take('\'')) return text;
      text += unit(quoted, start);
    }
  }

  std::u16string unit(int32_t c, SortPlace place) const {
    if (c > 0xFFFF) in_.fail(place, "a sort holds characters up to U+FFFF");
    if (c >= 0xD800 && c <= 0xDFFF) in_.fail(place, "a surrogate is no character");
    return std::u16string(1, static_cast<char16_t>(c));
  }

  int32_t read_escape(SortPlace place) {
    const int32_t c = in_.take();
    if (c == kEnd) in_.fail(place, "expected a character behind the backslash");
    if (c == 'u' && in_.take('{')) {
      const int32_t value = read_digits(1, 6, place);
      in_.expect('}', "'}'");
      return value;
    }
    if (c == 'u') return read_digits(4, 4, place);
    if (c == 'x') return read_digits(2, 2, place);
    if (is_letter_or_digit(c)) in_.fail(place, "bad escape, expected \\u0301, \\u{301} or \\x41");
    return c;
  }

  int32_t read_digits(int least, int most, SortPlace place) {
    int32_t value = 0;
    int digits = 0;
    for (; digits < most && in_.peek() >= 0 && in_.peek() < 0x80; ++digits) {
      const int digit = hex_value(static_cast<char>(in_.peek()));
      if (digit < 0) break;
      value = value << 4 | digit;
      in_.take();
    }
    if (digits < least)
      in_.fail(place, "bad escape, expected " + std::to_string(least) + " hexadecimal digits at least");
    return value;
  }

  Characters in_;
  std::vector<SortRule> rules_;
  bool after_reset_ = false;
};

bool is_right_to_left(char16_t unit) {
  return (unit >= 0x0590 && unit <= 0x08FF) || (unit >= 0xFB1D && unit <= 0xFDFF) ||
         (unit >= 0xFE70 && unit <= 0xFEFE);
}

/// Marks that would join what stands before them.
bool is_mark(char16_t unit) {
  constexpr SortRange kMarks[] = {
      {0x0300, 0x036F}, {0x0483, 0x0489}, {0x0591, 0x05C7}, {0x0610, 0x061A}, {0x064B, 0x065F},
      {0x0670, 0x0670}, {0x06D6, 0x06ED}, {0x0900, 0x0903}, {0x093A, 0x094F}, {0x0981, 0x0983},
      {0x09BC, 0x09CD}, {0x0A01, 0x0A03}, {0x0A3C, 0x0A51}, {0x0A70, 0x0A71}, {0x0A81, 0x0A83},
      {0x0ABC, 0x0ACD}, {0x0B01, 0x0B03}, {0x0B3C, 0x0B57}, {0x0B82, 0x0B82}, {0x0BBE, 0x0BCD},
      {0x0C00, 0x0C04}, {0x0C3E, 0x0C56}, {0x0C81, 0x0C83}, {0x0CBC, 0x0CD6}, {0x0D00, 0x0D03},
      {0x0D3B, 0x0D4D}, {0x0D57, 0x0D57}, {0x0D81, 0x0D83}, {0x0DCA, 0x0DDF}, {0x0E31, 0x0E31},
      {0x0E34, 0x0E3A}, {0x0E47, 0x0E4E}, {0x0EB1, 0x0EB1}, {0x0EB4, 0x0EBC}, {0x0EC8, 0x0ECD},
      {0x102B, 0x103E}, {0x135D, 0x135F}, {0x17B4, 0x17D3}, {0x17DD, 0x17DD}, {0x3099, 0x309A}};
  return std::any_of(std::begin(kMarks), std::end(kMarks), [&](SortRange range) { return range.holds(unit); });
}

/// Keeps operators and Arabic or Hebrew texts apart on the screen; a blank of the syntax.
std::string apart(const std::u16string& text) {
  return !text.empty() && is_right_to_left(text.back()) ? "\xE2\x80\x8E" : "";
}

void write_set(std::ostream& out, const std::vector<SortRange>& ranges) {
  out << " [";
  for (const SortRange& range : ranges) {
    out << rule_text({static_cast<char16_t>(range.first)});
    if (range.last != range.first) out << '-' << rule_text({static_cast<char16_t>(range.last)});
  }
  out << ']';
}

void write_words(std::ostream& out, const std::vector<SortWord>& words) {
  for (const SortWord& word : words) out << (&word == &words.front() ? "" : " ") << word.text;
}

}  // namespace

std::vector<SortRule> read_rules(const std::string& text, const std::string& file_name) {
  return RuleReader(text, file_name).read();
}

std::string rule_text(const std::u16string& text) {
  std::string out;
  for (const char16_t unit : text) {
    const bool odd = visible_text(unit).empty() || (unit >= 0xD800 && unit <= 0xF8FF) ||
                     (is_mark(unit) && out.empty()) || is_space(unit);
    if (odd)
      out += "\\u" + hex4(unit);
    else if (unit == '\'')
      out += "''";
    else if (is_syntax(unit))
      out += std::string("\\") + static_cast<char>(unit);
    else
      out += utf8_text({&unit, 1});
  }
  return out;
}

void write_rules(std::ostream& out, const std::vector<SortRule>& rules) {
  constexpr const char* kRelations[] = {"", "<", "<<", "<<<", "<<<<", "="};
  bool begun = false;
  for (const SortRule& rule : rules) {
    if (rule.kind == SortRule::Kind::kRelation) {
      out << ' ' << kRelations[static_cast<size_t>(rule.strength)] << ' ';
      if (!rule.before.empty()) out << rule_text(rule.before) << '|';
      out << rule_text(rule.text) << apart(rule.text);
      if (!rule.extension.empty()) out << '/' << rule_text(rule.extension) << apart(rule.extension);
      continue;
    }
    if (begun) out << '\n';
    begun = true;
    if (rule.kind == SortRule::Kind::kSetting) {
      out << '[';
      write_words(out, rule.words);
      if (rule.has_set) write_set(out, rule.characters);
      out << ']';
      continue;
    }
    out << '&';
    if (rule.strength != Strength::kNone) out << "[before " << static_cast<int>(rule.strength) << ']';
    if (!rule.words.empty()) {
      out << '[';
      write_words(out, rule.words);
      out << ']';
    }
    out << rule_text(rule.text) << apart(rule.text);
  }
  if (begun) out << '\n';
}

}  // namespace lexicor_data
