// Reading and writing of TOML values; texts are UTF-8 in the file and 16-bit units in memory.
#include "toml_text.h"

#include <algorithm>
#include <cstdio>
#include <istream>
#include <iterator>

#include "lexicor/near_names.h"
#include "lexicor/utf8_text.h"
#include "line_text.h"
#include "source_error.h"

namespace lexicor_data {
namespace {

/// UTF-8 that the TOML parser has checked, as 16-bit units.
std::u16string to_units(const std::string& text) {
  std::u16string units;
  for (size_t i = 0; i < text.size();) {
    const auto lead = static_cast<uint8_t>(text[i]);
    const size_t length = lead < 0x80 ? 1 : lead < 0xE0 ? 2 : lead < 0xF0 ? 3 : 4;
    uint32_t value = length == 1 ? lead : lead & (0x7F >> length);
    for (size_t k = 1; k < length; ++k) value = value << 6 | (static_cast<uint8_t>(text.at(i + k)) & 0x3F);
    i += length;
    if (value > 0xFFFF) {
      units.push_back(static_cast<char16_t>(0xD7C0 + (value >> 10)));
      units.push_back(static_cast<char16_t>(0xDC00 | (value & 0x3FF)));
    } else {
      units.push_back(static_cast<char16_t>(value));
    }
  }
  return units;
}

/// Looks for what the parser has no defined behaviour on: characters outside ASCII beside texts and comments, or in a text
/// that stands in a number. Behind an error of another kind it may miss some, but there the parser does not come.
class Precheck {
 public:
  Precheck(const std::string& text, const std::string& file_name) : text_(text), file_name_(file_name) {}

  void run() {
    const size_t mark_bytes = sizeof kByteOrderMark - 1;
    if (text_.compare(0, mark_bytes, kByteOrderMark) == 0) at_ = mark_bytes;
    while (at_ < text_.size()) {
      const char c = text_[at_];
      if (static_cast<uint8_t>(c) >= 0x80)
        fail("a character outside ASCII stands outside of texts and comments");
      const bool is_text = c == '"' || c == '\'';
      if (is_text && in_token_) fail("a text begins inside a key or a value");
      follow(c);
      if (is_text)
        skip_string();
      else if (c == '#')
        at_ = std::min(text_.find('\n', at_), text_.size());
      else
        ++at_;
    }
  }

 private:
  [[noreturn]] void fail(const std::string& what) const {
    const auto is_trail = [](char c) { return (static_cast<uint8_t>(c) & 0xC0) == 0x80; };
    int line = 1, column = 1;
    for (size_t i = 0; i < at_; ++i) {
      if (text_[i] == '\n')
        ++line, column = 1;
      else if (!is_trail(text_[i]))
        ++column;
    }
    throw SourceError(file_name_, line, column, what);
  }

  /// Follows whether a key or a value goes on; the parser takes all signs but blanks, commas and closing brackets for
  /// parts of a value.
  void follow(char c) {
    switch (c) {
      case ' ':
      case '\t':
      case '\r':
      case '#':
        in_token_ = false;
        return;
      case '\n':
        in_token_ = false;
        in_value_ = !open_.empty();
        return;
      case ',':
        in_token_ = false;
        in_value_ = open_.empty() || open_.back() == '[';
        return;
      case '=':
        in_token_ = in_value_;
        in_value_ = true;
        return;
      case '[':
      case '{':
        if (in_token_) return;
        open_.push_back(c);
        in_value_ = c == '[';
        return;
      case ']':
      case '}':
        in_token_ = false;
        in_value_ = true;
        if (!open_.empty()) open_.pop_back();
        return;
      default:
        in_token_ = true;
    }
  }

  /// Goes behind the closing quotes, one or three of them.
  void skip_string() {
    const char quote = text_[at_];
    const std::string triple(3, quote);
    const size_t quotes = text_.compare(at_, 3, triple) == 0 ? 3 : 1;
    if (quotes == 3 && !in_value_) fail("a key has one quote at its begin");
    for (at_ += quotes; at_ < text_.size(); ++at_) {
      if (quotes == 1 && text_[at_] == '\n') return;
      if (quote == '"' && text_[at_] == '\\') {
        ++at_;
      } else if (text_.compare(at_, quotes, triple, 0, quotes) == 0) {
        at_ += quotes;
        return;
      }
    }
    at_ = text_.size();
  }

  const std::string& text_;
  const std::string& file_name_;
  size_t at_ = 0;
  bool in_token_ = false, in_value_ = false;
  std::string open_;  ///< brackets
};

bool is_high_surrogate(uint32_t unit) {
  return unit >= 0xD800 && unit <= 0xDBFF;
}
bool is_low_surrogate(uint32_t unit) {
  return unit >= 0xDC00 && unit <= 0xDFFF;
}

}  // namespace

void TomlTable::fail(const toml::node& at, const std::string& what) const {
  throw SourceError(file_name_, static_cast<int>(at.source().begin.line),
                    static_cast<int>(at.source().begin.column), what);
}

const toml::node& TomlTable::node(const std::string& key) {
  const toml::node* found = table_->get(key);
  if (found == nullptr) fail(*table_, "the key " + key + " is missing");
  return *found;
}

std::u16string TomlTable::text_of(const toml::node& node) const {
  if (!node.is_string()) fail(node, "expected a text");
  const std::u16string units = to_units(node.as_string()->get());
  if (units.find(u'\0') != std::u16string::npos) fail(node, "a text cannot hold U+0000");
  return units;
}

std::u16string TomlTable::text(const std::string& key) {
  return reading(key, [&] { return text_of(node(key)); });
}

char16_t TomlTable::character(const std::string& key) {
  return reading(key, [&] {
    const toml::node& at = node(key);
    const std::u16string units = text_of(at);
    if (units.size() != 1) fail(at, "expected one character up to U+FFFF");
    return units[0];
  });
}

uint16_t TomlTable::number(const std::string& key, int64_t highest) {
  return reading(key, [&] {
    const toml::node& at = node(key);
    const auto value = at.is_integer() ? at.as_integer()->get() : -1;
    if (value < 0 || value > highest) fail(at, "expected a number from 0 to " + std::to_string(highest));
    return static_cast<uint16_t>(value);
  });
}

bool TomlTable::flag(const std::string& key) {
  return reading(key, [&] {
    const toml::node& at = node(key);
    if (!at.is_boolean()) fail(at, "expected true or false");
    return at.as_boolean()->get();
  });
}

std::vector<std::u16string> TomlTable::texts(const std::string& key, size_t fewest, size_t most) {
  return reading(key, [&] {
    const toml::node& at = node(key);
    const toml::array* list = at.as_array();
    if (list == nullptr || list->size() < fewest || list->size() > most) {
      fail(at, "expected a list of " + std::to_string(fewest) +
                   (most == fewest ? "" : " to " + std::to_string(most)) + " texts");
    }
    std::vector<std::u16string> texts;
    for (const toml::node& item : *list) texts.push_back(text_of(item));
    return texts;
  });
}

TomlTable TomlTable::table(const std::string& key) {
  const auto found = reading(key, [&] {
    const toml::node& at = node(key);
    if (!at.is_table()) fail(at, "expected a table");
    return at.as_table();
  });
  static const toml::table kNone;
  TomlTable table(found != nullptr ? *found : kNone, file_name_, errors_);
  table.is_none_ = found == nullptr;
  return table;
}

std::vector<TomlTable> TomlTable::tables(const std::string& key) {
  return reading(key, [&] {
    const toml::node& at = node(key);
    const toml::array* list = at.as_array();
    if (list == nullptr) fail(at, "expected a list of tables");
    std::vector<TomlTable> tables;
    for (const toml::node& item : *list) {
      if (!item.is_table()) fail(item, "expected a table");
      tables.emplace_back(*item.as_table(), file_name_, errors_);
    }
    return tables;
  });
}

void TomlTable::allow(const std::vector<std::string>& keys) {
  for (const auto& [key, value] : *table_) {
    const std::string name(key.str());
    if (std::find(keys.begin(), keys.end(), name) != keys.end()) continue;
    std::vector<std::string> missing;
    std::copy_if(keys.begin(), keys.end(), std::back_inserter(missing),
                 [&](const std::string& known) { return !has(known); });
    const std::string meant = lexicor_cli::nearest_name(name, missing);
    const toml::source_position at = key.source().begin;
    reading(name, [&]() -> bool {
      throw SourceError(file_name_, static_cast<int>(at.line), static_cast<int>(at.column),
                        "unknown key " + name + lexicor_cli::did_you_mean(meant));
    });
    misspelt_.insert(meant);
  }
}

toml::table parse_toml(std::istream& in, const std::string& file_name) {
  const std::string text{std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>()};
  Precheck(text, file_name).run();
  try {
    return toml::parse(text, file_name);
  } catch (const toml::parse_error& error) {
    throw SourceError(file_name, static_cast<int>(error.source().begin.line),
                      static_cast<int>(error.source().begin.column), std::string(error.description()));
  }
}

std::string toml_quote(const std::u16string& text) {
  std::string out = "\"";
  for (size_t i = 0; i < text.size(); ++i) {
    uint32_t value = text[i];
    if (is_high_surrogate(value) && i + 1 < text.size() && is_low_surrogate(text[i + 1])) {
      value = ((value - 0xD7C0) << 10) | (text[++i] & 0x3FF);
    }
    if (value == '"' || value == '\\') {
      out += '\\';
      out += static_cast<char>(value);
    } else if (value < 0x20 || (value >= 0x7F && value <= 0xA0) || (value >= 0x2000 && value <= 0x200F) ||
               value == 0xFEFF) {
      // Characters that an editor does not show.
      char escape[8];
      std::snprintf(escape, sizeof escape, "\\u%04X", static_cast<unsigned>(value));
      out += escape;
    } else {
      lexicor_cli::append_utf8(out, value);
    }
  }
  return out + '"';
}

std::string toml_list(const std::u16string* texts, size_t count) {
  std::string out = "[";
  for (size_t i = 0; i < count; ++i) out += (i == 0 ? "" : ", ") + toml_quote(texts[i]);
  return out + "]";
}

}  // namespace lexicor_data
