// What the TOML sources share: reading a table key by key with the place of every error, and writing texts.
#pragma once

#include <cstdint>
#include <iosfwd>
#include <set>
#include <string>
#include <vector>

#include "source_error.h"
#include "toml_parser.h"

namespace lexicor_data {

/// Reads one table. Every key that is read must be there. All errors are SourceErrors with line and column; with a list
/// for them they go there, and what could not be read is empty.
class TomlTable {
 public:
  TomlTable(const toml::table& table, std::string file_name, SourceErrors* errors = nullptr)
      : table_(&table), file_name_(std::move(file_name)), errors_(errors) {}

  /// Refuses other keys than these. One that is meant by a misspelt key is not missing too.
  void allow(const std::vector<std::string>& keys);
  bool has(const std::string& key) const { return table_->contains(key); }
  std::u16string text(const std::string& key);
  char16_t character(const std::string& key);  ///< a text of one 16-bit unit
  uint16_t number(const std::string& key, int64_t highest);
  bool flag(const std::string& key);
  std::vector<std::u16string> texts(const std::string& key, size_t fewest, size_t most);
  TomlTable table(const std::string& key);
  std::vector<TomlTable> tables(const std::string& key);
  const toml::node& node(const std::string& key);

  [[noreturn]] void fail(const toml::node& at, const std::string& what) const;

  /// What a step reads of a key, or nothing when there is a list for its error.
  template <class Step>
  auto reading(const std::string& key, Step step) -> decltype(step()) {
    if (errors_ == nullptr) return step();
    if (is_none_ || misspelt_.count(key) != 0) return {};
    try {
      return step();
    } catch (const SourceError& error) {
      errors_->add(error);
      return {};
    }
  }

 private:
  std::u16string text_of(const toml::node& node) const;

  const toml::table* table_;
  std::string file_name_;
  SourceErrors* errors_;
  bool is_none_ = false;            ///< stands for a table that could not be read
  std::set<std::string> misspelt_;  ///< keys that others are taken for
};

/// Parses a whole file.
toml::table parse_toml(std::istream& in, const std::string& file_name);

/// A text as a TOML basic string.
std::string toml_quote(const std::u16string& text);

/// `[ "a", "b" ]` of texts.
std::string toml_list(const std::u16string* texts, size_t count);

}  // namespace lexicor_data
