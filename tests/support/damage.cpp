#include "support/damage.h"

#include <map>
#include <sstream>

#include "core/lxformat.h"
#include "object_file.h"

namespace lx::test {
namespace {

namespace fmt = format::codepage;
using S = std::vector<ByteString>;

/// The place of the node that a byte leads to from a root.
template <class Node>
size_t child_at(const ByteString& section, size_t root, const std::string& byte) {
  return root +
         Node::read(&section[root]).next(static_cast<unsigned>(std::stoul(byte, nullptr, 16))) * Node::kBytes;
}

size_t operand(const S& s, const std::string& name) {
  static const std::map<std::string, size_t> kFields{
      {"width", fmt::kWidth},
      {"flags", fmt::kFlags},
      {"substitution", fmt::kSubstitution},
      {"line_ends", fmt::kLineEnds},
      {"shift_out", fmt::kShiftOut},
      {"shift_in", fmt::kShiftIn},
      {"lengths", fmt::kLengths},
      {"unicode", fmt::kUnicode},
      {"pages", fmt::kPages},
      {"full_width", fmt::kFullWidth},
      {"pairs", fmt::kPairs},
      {"pair_count", fmt::kPairCount},
      {"type_trie", fmt::kTypeTrie},
      {"type_records", fmt::kTypeRecords},
      {"unicode_values", fmt::kUnicodeValues},
      {"old.unicode_values", fmt::in_version1(fmt::kUnicodeValues)},
      {"fixed", fmt::kFixedBytes},
      {"unode", 0}};
  if (isdigit(name[0]) != 0) return std::stoul(name, nullptr, 0);
  if (name.rfind("size", 0) == 0) return s.at(std::stoul(name.substr(4))).size();
  if (name[0] == '@') return le16(&s[0][operand(s, name.substr(1))]);
  if (name.rfind("low.", 0) == 0)
    return fmt::PageEntry::read(
               &s[0][fmt::kPages + fmt::PageEntry::kBytes * std::stoul(name.substr(4), nullptr, 16)])
        .low;
  if (name == "tnode") return le16(&s[0][fmt::kTypeTrie]);
  if (name.rfind("unode.", 0) == 0) return child_at<fmt::UnicodeNode>(s[1], 0, name.substr(6));
  if (name.rfind("tnode.", 0) == 0) return child_at<fmt::TypeNode>(s[0], operand(s, "tnode"), name.substr(6));
  return kFields.at(name);
}

size_t result(const S& s, const std::string& expression) {
  size_t left = 0;
  char operation = '+';
  for (size_t at = 0; at < expression.size();) {
    const size_t end = std::min(expression.find_first_of("+-*/", at), expression.size());
    const size_t right = operand(s, expression.substr(at, end - at));
    left = operation == '+'   ? left + right
           : operation == '-' ? left - right
           : operation == '*' ? left * right
                              : left / right;
    operation = expression[end];
    at = end + 1;
  }
  return left;
}

ByteString value_of(const S& s, size_t section, const std::string& value) {
  ByteString bytes;
  const size_t colon = value.find(':');
  if (colon != std::string::npos) {
    const uint8_t* const from = &s[section][result(s, value.substr(0, colon))];
    return ByteString(from, from + result(s, value.substr(colon + 1)));
  }
  if (value.size() == 2)
    bytes.push_back(static_cast<uint8_t>(std::stoul(value, nullptr, 16)));
  else
    lexicor_data::append_le16(bytes, static_cast<uint16_t>(result(s, value)));
  return bytes;
}

}  // namespace

void change_sections(S* sections, const std::string& changes) {
  const S sound = *sections;
  std::istringstream list(changes);
  for (std::string change; std::getline(list, change, ';');) {
    std::istringstream words(change);
    std::string place, value;
    words >> place >> value;  // which is "="
    const size_t number = std::stoul(place);
    ByteString& section = sections->at(number);
    place.erase(0, 2);
    size_t at = place == "size" ? 0 : result(sound, place);
    while (words >> value) {
      if (place == "size") {
        section.resize(result(sound, value));
        continue;
      }
      for (const uint8_t byte : value_of(sound, number, value)) section.at(at++) = byte;
    }
  }
}

}  // namespace lx::test
