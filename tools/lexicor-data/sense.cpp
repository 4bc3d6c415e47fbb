// Checks of values, on the parsed text, so that each fault has its place.
#include "sense.h"

#include <algorithm>
#include <set>

#include "toml_text.h"

namespace lexicor_data {
namespace {

// Fraction digits come from a conversion that gives six.
constexpr int64_t kMaxDigits = 6;
// %c, %x and %X stand for these formats themselves.
constexpr char16_t kDirectives[] = u"%aAbBdHIjmMpSUwWyY";

bool is_digit(char16_t unit) {
  return unit >= '0' && unit <= '9';
}

void require_code(TomlTable& table, const char* key, size_t fewest, size_t most) {
  const std::u16string code = table.text(key);
  const bool letters = std::all_of(code.begin(), code.end(), [](char16_t c) { return c >= 'A' && c <= 'Z'; });
  if (!letters || code.size() < fewest || code.size() > most) {
    table.fail(table.node(key), "expected a code of " + std::to_string(most) + " capital letters" +
                                    (fewest == most ? "" : " or " + std::to_string(fewest)));
  }
}

void require_text(TomlTable& table, const char* key) {
  if (table.text(key).empty()) table.fail(table.node(key), "the text is empty");
}

void check_names(TomlTable& root, const char* key, size_t count) {
  const std::vector<std::u16string> names = root.texts(key, count, 13);
  for (size_t i = 0; i < count; ++i) {
    if (names[i].empty()) root.fail((*root.node(key).as_array())[i], "the name is empty");
  }
}

/// A character alone is looked up before a pair that begins with it, and the first entry that matches counts.
void check_specials(TomlTable& root, const char* key) {
  if (!root.has(key)) return;
  std::set<std::u16string> seen;
  std::vector<TomlTable> entries = root.tables(key);
  for (TomlTable& entry : entries) {
    const std::u16string from = entry.text("from");
    if (from.size() == 1 && !seen.insert(from).second) entry.fail(entry.node("from"), "stands twice");
  }
  for (TomlTable& entry : entries) {
    const std::u16string from = entry.text("from");
    if (from.size() != 2) continue;
    if (seen.count(from.substr(0, 1)) != 0) {
      entry.fail(entry.node("from"), "is never reached: its first character has an entry of its own");
    }
    if (!seen.insert(from).second) entry.fail(entry.node("from"), "stands twice");
  }
}

void check_separators(TomlTable separators) {
  constexpr const char* kPairs[][2] = {
      {"decimal", "thousands"}, {"decimal", "list"}, {"monetary_decimal", "monetary_thousands"}};
  for (const char* key : {"decimal", "thousands", "list", "monetary_decimal", "monetary_thousands"}) {
    const char16_t unit = separators.character(key);
    if (unit >= 0x80) separators.fail(separators.node(key), "a separator is one byte in UTF-8 too: ASCII");
    if (unit < 0x20 || unit == 0x7F || is_digit(unit))
      separators.fail(separators.node(key), "a separator is no digit and no control");
  }
  for (const auto& [decimal, other] : kPairs) {
    if (separators.character(decimal) == separators.character(other)) {
      separators.fail(separators.node(other), std::string("is the same as ") + decimal);
    }
  }
}

/// Sizes of 1 to 9 with ";" between them, and a last 0 that repeats the size before it; or nothing.
void check_grouping(TomlTable grouping) {
  for (const char* key : {"number", "monetary"}) {
    const std::u16string text = grouping.text(key);
    bool sound = text.empty() || text.size() % 2 == 1;
    for (size_t i = 0; i < text.size(); ++i) {
      const bool last = i + 1 == text.size();
      sound =
          sound && (i % 2 == 1 ? text[i] == ';' : is_digit(text[i]) && (text[i] != '0' || (last && i != 0)));
    }
    if (!sound) grouping.fail(grouping.node(key), "expected sizes of groups, as in \"3;0\" or \"3;2;0\"");
  }
}

void check_formats(TomlTable formats) {
  for (const char* key : {"time", "short_date", "long_date"}) {
    const std::u16string text = formats.text(key);
    const toml::node& at = formats.node(key);
    if (text.empty()) formats.fail(at, "the format is empty");
    if (utf8_bytes(text) > kMaxFormatBytes) {
      formats.fail(at,
                   "the format takes " + std::to_string(utf8_bytes(text)) + " bytes in UTF-8, more than 31");
    }
    for (size_t i = 0; i < text.size(); ++i) {
      if (text[i] != '%') continue;
      ++i;
      if (i < text.size() && text[i] == '#') ++i;
      if (i >= text.size()) formats.fail(at, "the format ends inside a directive");
      if (std::u16string(kDirectives).find(text[i]) == std::u16string::npos)
        formats.fail(at, "unknown directive at character " + std::to_string(i + 1));
    }
  }
}

}  // namespace

size_t utf8_bytes(const std::u16string& text) {
  size_t bytes = 0;
  for (char16_t unit : text) bytes += unit < 0x80 ? 1 : unit < 0x800 ? 2 : 3;
  return bytes;
}

void check_language_sense(std::istream& in, const std::string& file_name) {
  const toml::table parsed = parse_toml(in, file_name);
  TomlTable root(parsed, file_name);
  require_code(root, "abbreviation", 2, 3);
  require_text(root, "name");
  check_names(root, "days", 7);
  check_names(root, "short_days", 7);
  check_names(root, "months", 12);
  check_names(root, "short_months", 12);
  check_specials(root, "special_upper");
  check_specials(root, "special_lower");
}

void check_territory_sense(std::istream& in, const std::string& file_name) {
  const toml::table parsed = parse_toml(in, file_name);
  TomlTable root(parsed, file_name);
  require_code(root, "abbreviation", 3, 3);
  require_text(root, "name");
  check_separators(root.table("separators"));
  TomlTable digits = root.table("digits");
  for (const char* key : {"number", "currency", "international"}) digits.number(key, kMaxDigits);
  check_grouping(root.table("grouping"));
  TomlTable currency = root.table("currency");
  require_text(currency, "symbol");
  require_code(currency, "international", 3, 3);
  TomlTable signs = root.table("signs");
  if (signs.text("negative").empty() && signs.number("negative_position", 4) != 0) {
    signs.fail(signs.node("negative"), "without a sign only parentheses, position 0, tell a negative amount");
  }
  check_formats(root.table("formats"));
}

}  // namespace lexicor_data
