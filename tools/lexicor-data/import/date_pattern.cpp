// One pass over a pattern: runs of letters are fields, quoted texts and all else literals.
#include "date_pattern.h"

#include <stdexcept>

namespace lexicor_import {
namespace {

bool is_letter(char16_t unit) {
  return (unit >= 'a' && unit <= 'z') || (unit >= 'A' && unit <= 'Z');
}

/// The directive of a field; empty for the era.
std::u16string directive(char16_t letter, size_t count) {
  const auto by_count = [&](const char16_t* one, const char16_t* two) { return count == 1 ? one : two; };
  switch (letter) {
    case 'h':
      return by_count(u"%#I", u"%I");
    case 'H':
      return by_count(u"%#H", u"%H");
    case 'm':
      return u"%M";
    case 's':
      return u"%S";
    case 'a':
    case 'B':
      return u"%p";
    case 'd':
      return by_count(u"%#d", u"%d");
    case 'y':
      return count == 2 ? u"%y" : u"%Y";
    case 'E':
    case 'c':
      return count == 4 ? u"%A" : u"%a";
    case 'M':
    case 'L':
      return count == 4 ? u"%B" : count == 3 ? u"%b" : by_count(u"%#m", u"%m");
    case 'G':
      return {};
    default:
      throw std::runtime_error(std::string("no directive shows the field ") + static_cast<char>(letter));
  }
}

void append_literal(std::u16string& out, char16_t unit) {
  out += unit;
  if (unit == '%') out += unit;
}

}  // namespace

std::u16string rewrite_pattern(const std::u16string& pattern) {
  std::u16string out;
  bool quoted = false;
  for (size_t i = 0; i < pattern.size();) {
    const char16_t unit = pattern[i];
    if (unit == '\'') {
      const bool doubled = i + 1 < pattern.size() && pattern[i + 1] == '\'';
      if (doubled) out += unit;
      if (!doubled) quoted = !quoted;
      i += doubled ? 2 : 1;
      continue;
    }
    if (quoted || !is_letter(unit)) {
      append_literal(out, unit);
      ++i;
      continue;
    }
    size_t count = 1;
    while (i + count < pattern.size() && pattern[i + count] == unit) ++count;
    i += count;
    out += directive(unit, count);
    if (unit != 'G') continue;
    if (i < pattern.size() && pattern[i] == ' ') {
      ++i;
    } else if (!out.empty() && out.back() == ' ') {
      out.pop_back();
    }
  }
  return out;
}

}  // namespace lexicor_import
