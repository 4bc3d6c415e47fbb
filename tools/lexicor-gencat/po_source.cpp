// One pass over the lines; an entry is stored when the next one begins. Only translations that become messages
// are converted: what else a file says may be in characters that the catalog's codepage lacks.
#include "po_source.h"

#include <algorithm>
#include <optional>

#include "lexicor-data/line_text.h"
#include "message_source.h"
#include "source_parser.h"

namespace lexicor_gencat {

namespace {

// No language has more plural forms; an entry without a number of its own takes as many numbers, so that the
// numbers behind it are the same in all languages.
constexpr uint32_t kPluralForms = 6;

bool is_blank(uint32_t c) {
  return c == ' ' || c == '\t' || c == '\r';
}

int hex_value(uint32_t c) {
  return c < 0x80 ? lexicor_data::hex_value(static_cast<char>(c)) : -1;
}

bool is_word(uint32_t c) {
  return (c >= 'a' && c <= 'z') || c == '_';
}

struct Number {
  uint32_t set, message;
};

constexpr uint32_t kLastNumber = UINT32_MAX - kPluralForms;

/// "SET:NUMBER" or "SET.NUMBER"; numbers that no message can have are 0.
std::optional<Number> parse_context(const std::string& context) {
  uint64_t values[2] = {0, 0};
  size_t part = 0, digits[2] = {};
  for (const char c : context) {
    if ((c == ':' || c == '.') && part == 0)
      part = 1;
    else if (c >= '0' && c <= '9') {
      values[part] = std::min<uint64_t>(values[part] * 10 + static_cast<uint64_t>(c - '0'), 1ULL << 33);
      ++digits[part];
    } else
      return std::nullopt;
  }
  if (digits[0] == 0 || digits[1] == 0) return std::nullopt;
  if (values[0] > UINT32_MAX || values[1] > kLastNumber) return Number{0, 0};
  return Number{static_cast<uint32_t>(values[0]), static_cast<uint32_t>(values[1])};
}

class PoReader : SourceParser {
 public:
  PoReader(const std::string& source, const std::string& file_name, const Recoder& recoder,
           CatalogBuilder& builder, Problems& problems)
      : SourceParser(source, file_name, recoder, builder, problems), text_(recoder.target().codepage()) {}

  void read() {
    builder_.begin_source();
    while (reader_.next(line_)) read_line();
    finish_entry();
  }

 private:
  enum class Field { kNone, kContext, kId, kPlural, kText };

  struct Entry {
    bool fuzzy = false, has_context = false, has_id = false, plural = false;
    std::string context;
    size_t id_chars = 0;
    Place place;                     // of its msgid
    std::vector<std::string> texts;  // the translations
  };

  bool is_header() const { return entry_.has_id && entry_.id_chars == 0 && !entry_.has_context; }

  void read_line() {
    at_ = 0;
    skip(is_blank);
    if (at_ == line_.size()) return;
    if (peek() == '#') return read_comment();
    if (peek() == '"') {
      if (field_ == Field::kNone) error(at_, "a text without a keyword before it; expected msgid or msgstr");
      return read_string();
    }
    read_keyword();
  }

  void read_comment() {
    // An obsolete entry, "#~", is a comment like any other; flags belong to the entry that follows.
    if (field_ == Field::kText) finish_entry();
    if (at_ + 1 >= line_.size()) return;
    if (line_[at_ + 1].syntax == '~') entry_.fuzzy = false;  // the flag before it was of the obsolete entry
    if (line_[at_ + 1].syntax != ',') return;
    std::string flags;
    for (const Character& c : line_) flags += c.syntax < 0x7F ? static_cast<char>(c.syntax) : '?';
    if (flags.find("fuzzy") != std::string::npos) entry_.fuzzy = true;
  }

  void read_keyword() {
    const size_t begin = at_;
    std::string word;
    for (; is_word(peek()); ++at_) word += static_cast<char>(peek());
    if (word == "msgctxt" || word == "msgid") {
      if (field_ == Field::kText) finish_entry();
      const bool context = word == "msgctxt";
      if (context ? entry_.has_id || entry_.has_context : entry_.has_id)
        error(begin, word + " stands where msgstr is expected");
      (context ? entry_.has_context : entry_.has_id) = true;
      if (!context) entry_.place = place(begin);
      field_ = context ? Field::kContext : Field::kId;
    } else if (word == "msgid_plural") {
      if (field_ != Field::kId) error(begin, "msgid_plural stands without msgid before it");
      entry_.plural = true;
      field_ = Field::kPlural;
    } else if (word == "msgstr") {
      if (!read_msgstr(begin)) return;
    } else {
      error(begin, "expected msgctxt, msgid, msgid_plural, msgstr, a text in double quotes or a comment");
      return;
    }
    skip(is_blank);
    if (peek() != '"') return error(at_, "expected a text in double quotes");
    read_string();
  }

  bool read_msgstr(size_t begin) {
    size_t form = 0;
    const bool indexed = peek() == '[';
    if (indexed) {
      ++at_;
      const size_t digits = at_;
      for (; peek() >= '0' && peek() <= '9'; ++at_) form = std::min<size_t>(form * 10 + (peek() - '0'), 1000);
      if (at_ == digits || peek() != ']') {
        error(at_, "expected msgstr[0] to msgstr[5]");
        return false;
      }
      ++at_;
    }
    if (!entry_.has_id) error(begin, "msgstr stands without msgid before it");
    if (indexed != entry_.plural)
      error(begin, indexed ? "msgstr[...] stands without msgid_plural; expected msgstr"
                           : "msgstr stands behind msgid_plural; expected msgstr[0]");
    if (form != entry_.texts.size() || form >= kPluralForms)
      error(begin, "expected msgstr[" + std::to_string(entry_.texts.size()) + "], of at most " +
                       std::to_string(kPluralForms) + " forms");
    finish_text();
    entry_.texts.emplace_back();
    field_ = Field::kText;
    return true;
  }

  /// The text in double quotes at `at_`, which goes to the field.
  void read_string() {
    const size_t begin = at_++;
    while (at_ < line_.size() && peek() != '"') {
      const size_t start = at_++;
      if (line_[start].syntax == '\\')
        read_escape(start);
      else
        add(start);
    }
    if (at_ == line_.size()) return error(begin, "the closing quote is missing");
    ++at_;
    skip(is_blank);
    if (at_ < line_.size()) error(at_, "expected nothing behind the closing quote");
  }

  /// Ends a text, which stands in as many pairs of quotes as its author likes.
  void finish_text() {
    if (!entry_.texts.empty()) entry_.texts.back() += text_.finish();
  }

  bool is_wanted() const { return field_ == Field::kText && !entry_.fuzzy && !is_header(); }

  void add(size_t at) {
    const Character& c = line_[at];
    if (is_wanted()) recoder_.put(text_, c, place(at), problems_);
    if (field_ == Field::kContext) entry_.context += c.syntax < 0x7F ? static_cast<char>(c.syntax) : '?';
    if (field_ == Field::kId) ++entry_.id_chars;
  }

  void read_escape(size_t start) {
    const uint32_t next = peek();
    if (next == Character::kNone) return error(start, "a backslash without a character behind it");
    if (next >= '0' && next <= '7') {
      const char byte = read_octal(line_, at_);
      if (is_wanted()) text_.put_byte(byte);
    } else if (next == 'x') {
      ++at_;
      int value = 0, digits = 0;
      for (; digits < 2 && hex_value(peek()) >= 0; ++digits, ++at_) value = value * 16 + hex_value(peek());
      if (digits == 0) return error(start, "expected hexadecimal digits behind \\x");
      if (is_wanted()) text_.put_byte(static_cast<char>(value));
    } else if (next == '\\' || next == '"') {
      add(at_++);
    } else {
      const uint32_t value = next == 'a' ? '\a' : escape_value(next);
      if (value == 0)
        return error(start,
                     "unknown escape; expected one of \\n \\t \\v \\b \\r \\f \\a \\\\ \\\" \\ooo \\xhh");
      ++at_;
      if (is_wanted()) recoder_.put_unicode(text_, value, place(start), problems_);
    }
    if (field_ == Field::kId) ++entry_.id_chars;
  }

  void finish_entry() {
    const bool header = is_header();
    finish_text();
    const Entry entry = std::move(entry_);
    entry_ = {};
    field_ = Field::kNone;
    if (!entry.has_id) {
      if (entry.has_context) error(0, "msgctxt stands without msgid behind it");
      return;
    }
    if (entry.texts.empty()) problems_.error(entry.place, "the entry has no msgstr");
    if (header) return;
    std::optional<Number> number;
    if (entry.has_context) number = parse_context(entry.context);
    if (number.has_value() && (number->set == 0 || number->message == 0)) {
      problems_.error(entry.place, "msgctxt \"" + entry.context +
                                       "\" is out of range; expected a set from 1 to " +
                                       std::to_string(UINT32_MAX) + " and a number from 1 to " +
                                       std::to_string(kLastNumber));
      return;
    }
    if (!number.has_value()) {
      number = Number{1, next_number_};
      next_number_ += entry.plural ? kPluralForms : 1;
    }
    if (entry.fuzzy) return;
    builder_.select_set(number->set);
    for (const std::string& text : entry.texts) {
      if (!text.empty()) builder_.put(number->message, text, entry.place);
      ++number->message;
    }
  }

  TextWriter text_;
  Field field_ = Field::kNone;
  Entry entry_;
  uint32_t next_number_ = 1;
};

/// The text of the entry with an empty msgid and no msgctxt, in ASCII, as it stands between the quotes.
std::string header_entry(const std::string& source) {
  std::string keyword, id, text;
  bool context = false;
  for (size_t at = 0, end = 0; at < source.size(); at = end + 1) {
    end = std::min(source.find('\n', at), source.size());
    const size_t begin = source.find_first_not_of(" \t", at);
    const size_t quote = source.find('"', at), last = source.rfind('"', end);
    if (begin >= end || source[begin] == '#' || quote >= end || last <= quote) continue;
    if (begin < quote) {
      const std::string word = source.substr(begin, source.find_first_of(" \t\"[", begin) - begin);
      if (keyword == "msgstr" && id.empty() && !context) return text;
      if (keyword == "msgstr") context = false;
      if (word == "msgctxt") context = true;
      if (word == "msgid") id.clear();
      if (word == "msgstr") text.clear();
      keyword = word;
    }
    const std::string piece = source.substr(quote + 1, last - quote - 1);
    if (keyword == "msgid") id += piece;
    if (keyword == "msgstr") text += piece;
  }
  return keyword == "msgstr" && id.empty() && !context ? text : "";
}

}  // namespace

std::string po_charset(const std::string& source) {
  const std::string text = header_entry(source);
  const size_t type = text.find("Content-Type:");
  if (type == std::string::npos) return {};
  constexpr char kKey[] = "charset=";
  const size_t at = text.find(kKey, type);
  if (at == std::string::npos || at > text.find("\\n", type)) return {};
  const size_t begin = at + sizeof kKey - 1;
  const std::string name = text.substr(begin, text.find_first_of("\\; \t", begin) - begin);
  // What a template has in place of a name.
  return name == "CHARSET" ? "" : name;
}

void read_po_source(const std::string& source, const std::string& file_name, const Recoder& recoder,
                    CatalogBuilder& builder, Problems& problems) {
  PoReader(source, file_name, recoder, builder, problems).read();
}

}  // namespace lexicor_gencat
