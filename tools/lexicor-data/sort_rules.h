// Collation rules in the syntax of LDML, read into a list and written from one. A list says what a file says; what
// it means is the matter of sort_tailoring.h.
//
//   [reorder Grek]              a setting
//   &c < č <<< Č                a reset, then relations: <, <<, <<< differ on the first, second and third level
//   &z < aa = å                 = differs on none
//   &ae << ä                    a text of several characters as a place
//   &t <<< þ/h                  an expansion: þ counts as this relation's element and h
//   &[before 1]b < á            ahead of a place; &[last regular] and its like are places
//   &k <<* ab-d                 one relation for each character, ranges among them
//   # ...                       a comment, to the end of the line
//
// Blanks and line ends separate. Of ASCII, letters and digits stand for themselves, other characters in '...' or
// behind a backslash; '' is an apostrophe, \u0301, \u{301} and \x41 are code points. Columns count characters.
#pragma once

#include <iosfwd>
#include <string>
#include <utility>
#include <vector>

#include "sort_root.h"
#include "sort_text.h"

namespace lexicor_data {

/// The level on which a relation makes a difference, and the n of [before n].
enum class Strength : uint8_t { kNone, kPrimary, kSecondary, kTertiary, kQuaternary, kIdentical };

struct SortWord {
  std::string text;
  SortPlace place;
};

/// One setting, reset or relation.
struct SortRule {
  enum class Kind : uint8_t { kSetting, kReset, kRelation };
  Kind kind = Kind::kSetting;
  SortPlace place;
  std::vector<SortWord> words;          ///< setting: its name and values; reset: those of [last regular]
  std::vector<SortRange> characters;    ///< setting: of a set in brackets
  bool has_set = false;                 ///< setting: it has one, which may be empty
  Strength strength = Strength::kNone;  ///< relation: its level; reset: [before n]
  std::u16string text;                  ///< reset, relation
  std::u16string before, extension;     ///< relation: before|text/extension
};

/// Throws SourceError.
std::vector<SortRule> read_rules(const std::string& text, const std::string& file_name);

/// Writes rules, a line for each setting and reset.
void write_rules(std::ostream& out, const std::vector<SortRule>& rules);

/// A text as it stands in rules.
std::string rule_text(const std::u16string& text);

}  // namespace lexicor_data
