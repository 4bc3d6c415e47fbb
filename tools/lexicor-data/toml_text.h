// What the TOML sources share: reading a table key by key with the place of every error, and writing texts.
#pragma once

#include <toml++/toml.h>

#include <cstdint>
#include <iosfwd>
#include <string>
#include <vector>

namespace lexicor_data {

/// Reads one table. Every key that is read must be there. All errors are SourceErrors with line and column.
class TomlTable {
 public:
  TomlTable(const toml::table& table, std::string file_name)
      : table_(table), file_name_(std::move(file_name)) {}

  /// Refuses other keys than these, before what is missing is: a misspelt key is both.
  void allow(const std::vector<std::string>& keys) const;
  bool has(const std::string& key) const { return table_.contains(key); }
  std::u16string text(const std::string& key);
  char16_t character(const std::string& key);  ///< a text of one 16-bit unit
  uint16_t number(const std::string& key, int64_t highest);
  bool flag(const std::string& key);
  std::vector<std::u16string> texts(const std::string& key, size_t fewest, size_t most);
  TomlTable table(const std::string& key);
  std::vector<TomlTable> tables(const std::string& key);
  const toml::node& node(const std::string& key);

  [[noreturn]] void fail(const toml::node& at, const std::string& what) const;

 private:
  std::u16string text_of(const toml::node& node) const;

  const toml::table& table_;
  std::string file_name_;
};

/// Parses a whole file.
toml::table parse_toml(std::istream& in, const std::string& file_name);

/// A text as a TOML basic string.
std::string toml_quote(const std::u16string& text);

/// `[ "a", "b" ]` of texts.
std::string toml_list(const std::u16string* texts, size_t count);

}  // namespace lexicor_data
