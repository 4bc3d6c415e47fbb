// Sorts from CLDR's collations: its rules, without what a sort cannot say, and our own behind them.
//
// Left out, with a note:
//   - settings that a sort does not have, or that it has anyway;
//   - relations of contractions of more than two characters, of weights that depend on the character before, of
//     ideographs, and of characters whose page has no table;
//   - scripts in [reorder] none of whose characters has a table.
// A difference on the fourth level becomes none.
#pragma once

#include <string>

#include "locale_import.h"
#include "sort_root.h"

namespace lexicor_import {

struct Sort {
  const char* name;
  uint16_t id;
  const char* locale;
  const char* rules;
};

/// What our own rules begin with when they stand instead of CLDR's.
#define LEXICOR_INSTEAD "!"

// A pair of a letter and a mark that makes a letter of the script is that letter. In the order of rules, this is the
// last word on them.
inline constexpr char kCyrillicPairs[] =
    "# A letter and a mark behind it are the letter that they make.\n"
    "[compose [\\u0400-\\u04FF]]";
inline constexpr char kGreekPairs[] =
    "# A letter and a mark behind it are the letter that they make.\n"
    "[compose [\\u0370-\\u03FF]]";

inline constexpr char kVietnameseTones[] =
    "# Tones stay apart in letters, so that they count alike in a letter and behind one.\n"
    "[separate [ÀÁÃÈÉÌÍÒÓÕÙÚÝàáãèéìíòóõùúýĨĩŨũẠ-ỹ]]";

// CLDR has &AE<<ä, where ä as two characters would have two elements. Here the dots have the second one.
inline constexpr char kGermanUmlauts[] = LEXICOR_INSTEAD
    "# The dots of ä, ö and ü count as an e that differs by an accent, and those of other letters as an "
    "accent.\n"
    "[compose [\\u0308]]\n"
    "[suppressContractions [AOUaou]]\n"
    "&e << \\u0308";

inline constexpr char kHalfWidthKana[] =
    "# Half-width kana and their voice marks are one element.\n"
    "&ｳﾞ=ｳﾞ &ｶﾞ=ｶﾞ &ｷﾞ=ｷﾞ &ｸﾞ=ｸﾞ &ｹﾞ=ｹﾞ &ｺﾞ=ｺﾞ &ｻﾞ=ｻﾞ &ｼﾞ=ｼﾞ &ｽﾞ=ｽﾞ &ｾﾞ=ｾﾞ &ｿﾞ=ｿﾞ\n"
    "&ﾀﾞ=ﾀﾞ &ﾁﾞ=ﾁﾞ &ﾂﾞ=ﾂﾞ &ﾃﾞ=ﾃﾞ &ﾄﾞ=ﾄﾞ &ﾊﾞ=ﾊﾞ &ﾋﾞ=ﾋﾞ &ﾌﾞ=ﾌﾞ &ﾍﾞ=ﾍﾞ &ﾎﾞ=ﾎﾞ\n"
    "&ﾊﾟ=ﾊﾟ &ﾋﾟ=ﾋﾟ &ﾌﾟ=ﾌﾟ &ﾍﾟ=ﾍﾟ &ﾎﾟ=ﾎﾟ &ﾜﾞ=ﾜﾞ &ｦﾞ=ｦﾞ";

inline constexpr Sort kSorts[] = {
#include "sorts.inc"
};

/// The rules of a sort. The text that becomes its source.
std::string import_rules(const Sort& sort, const lexicor_data::SortRoot& root, Notes& notes);

}  // namespace lexicor_import
