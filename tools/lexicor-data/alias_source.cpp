// One pass over the alias file with the library's limits.
#include "alias_source.h"

#include <algorithm>
#include <map>

#include "line_text.h"
#include "ucm.h"

namespace lexicor_data {
namespace {

constexpr size_t kMaxLineBytes = 32767, kMaxCodepageBytes = 32, kMaxAliasBytes = 64;

std::string upper_ascii(std::string text) {
  for (char& c : text) {
    if (c >= 'a' && c <= 'z') c = static_cast<char>(c - ('a' - 'A'));
  }
  return text;
}

}  // namespace

void check_aliases(std::istream& in, const std::string& file_name, const Control& control) {
  std::map<std::string, std::string> codepage_of;  // by alias
  std::string text, codepage;
  for (int line = 0; next_line(in, &text, &line);) {
    auto fail = [&](size_t at, const std::string& what) {
      throw SourceError(file_name, line, static_cast<int>(at) + 1, what);
    };
    if (text.size() > kMaxLineBytes) fail(0, "the line is longer than 32,767 bytes");
    const size_t carriage_return = text.find('\r');
    if (carriage_return != std::string::npos) fail(carriage_return, "a carriage return is no separator here");
    size_t at = text.find_first_not_of(" \t");
    if (at == std::string::npos || text[0] == '#') continue;
    if (text[0] == '\t') fail(0, "a line begins with a name or with a blank, not with a tab");
    bool is_codepage = text[0] != ' ';
    if (!is_codepage && codepage.empty()) fail(at, "aliases stand before the first codepage name");
    while (at != std::string::npos) {
      const size_t end = std::min(text.find_first_of(" \t", at), text.size());
      const std::string token = text.substr(at, end - at);
      if (is_codepage) {
        if (token.size() > kMaxCodepageBytes) fail(at, "the codepage name is longer than 32 bytes");
        if (control.find(ObjectType::kCodepage, token) == nullptr)
          fail(at, "no codepage has the name " + token);
        codepage = token;
        is_codepage = false;
      } else {
        if (token.size() > kMaxAliasBytes) fail(at, "the alias is longer than 64 bytes");
        const auto [entry, is_new] = codepage_of.try_emplace(upper_ascii(token), codepage);
        if (!is_new && entry->second != codepage) {
          fail(at, "the alias " + token + " belongs to " + entry->second + " already");
        }
      }
      at = text.find_first_not_of(" \t", end);
    }
  }
}

}  // namespace lexicor_data
