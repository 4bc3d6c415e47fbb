// One pass over the alias file with the library's limits.
#include "alias_source.h"

#include <algorithm>

#include "line_text.h"
#include "source_error.h"

namespace lexicor_data {
namespace {

constexpr size_t kMaxLineBytes = 32767, kMaxCodepageBytes = 32, kMaxAliasBytes = 64;

class AliasReader {
 public:
  AliasReader(const std::string& file_name, const Control& control)
      : file_name_(file_name), control_(control) {}

  Aliases read(std::istream& in) {
    SourceErrors errors;
    std::string text;
    while (!errors.full() && next_line(in, &text, &line_)) errors.attempt([&] { read_line(text); });
    errors.throw_if_any();
    return std::move(codepage_of_);
  }

 private:
  [[noreturn]] void fail(size_t at, const std::string& what) const {
    throw SourceError(file_name_, line_, static_cast<int>(at) + 1, what);
  }

  void read_line(const std::string& text) {
    if (text.size() > kMaxLineBytes) fail(0, "the line is longer than 32,767 bytes");
    const size_t carriage_return = text.find('\r');
    if (carriage_return != std::string::npos) fail(carriage_return, "a carriage return, expected a blank");
    const size_t null = text.find('\0');
    if (null != std::string::npos) fail(null, "a null byte, expected a blank");
    size_t at = text.find_first_not_of(" \t");
    if (at == std::string::npos || text[0] == '#') return;
    if (text[0] == '\t') fail(0, "a line begins with a name or with a blank, not with a tab");
    bool is_codepage = text[0] != ' ';
    if (!is_codepage && codepage_.empty()) fail(at, "aliases stand before the first codepage name");
    while (at != std::string::npos) {
      const size_t end = std::min(text.find_first_of(" \t", at), text.size());
      const std::string token = text.substr(at, end - at);
      if (is_codepage)
        begin_codepage(token, at);
      else
        add_alias(token, at);
      is_codepage = false;
      at = text.find_first_not_of(" \t", end);
    }
  }

  void begin_codepage(const std::string& name, size_t at) {
    codepage_ = name;
    if (name.size() > kMaxCodepageBytes) fail(at, "the codepage name is longer than 32 bytes");
    if (control_.find(ObjectType::kCodepage, name) == nullptr) fail(at, "no codepage has the name " + name);
  }

  void add_alias(const std::string& alias, size_t at) {
    if (alias.size() > kMaxAliasBytes) fail(at, "the alias is longer than 64 bytes");
    const auto [entry, is_new] = codepage_of_.try_emplace(alias_key(alias), codepage_);
    if (!is_new && entry->second != codepage_)
      fail(at, "the alias " + alias + " belongs to " + entry->second + " already");
  }

  const std::string& file_name_;
  const Control& control_;
  int line_ = 0;
  std::string codepage_;
  Aliases codepage_of_;
};

}  // namespace

std::string alias_key(const std::string& alias) {
  std::string key = alias;
  for (char& c : key) {
    if (c >= 'a' && c <= 'z') c = static_cast<char>(c - ('a' - 'A'));
  }
  return key;
}

Aliases read_aliases(std::istream& in, const std::string& file_name, const Control& control) {
  return AliasReader(file_name, control).read(in);
}

}  // namespace lexicor_data
