// Sorts from ICU's collators, at tertiary strength with punctuation shifted behind the other levels.
//
// ICU's collation elements are brought into the form that a sort holds: an element and the accents behind it
// become one, with one secondary and one tertiary weight. What has no weight but those of punctuation has one
// special weight. Primary and special weights are numbered anew, densely and in their order; secondary and
// tertiary ones are numbered within each primary weight, the only place where they are compared.
//
// Pages with characters that a shipped codepage writes, and those of the scripts in the sort's row, are tables
// with all their assigned characters. Ideographs and Hangul syllables have computed weights, in the order of
// their code points, where the collator has its first ideograph, and behind the letters of Hangul. All other
// pages follow behind everything, in the order of their code points; surrogates have no weights.
//
// What a sort cannot hold is noted:
//   - of characters with more than two elements the first two count, the others only as a tertiary difference,
//     as does punctuation inside a character;
//   - contractions of more than two characters, or with more than one element, are left out.
// The contractions of the common order are left out without a note, but for the scripts of the sort's row.
#pragma once

#include <cstdint>
#include <set>
#include <string>
#include <vector>

#include "locale_import.h"
#include "sort_text.h"

namespace lexicor_import {

struct Sort {
  const char* name;
  uint16_t id;
  const char* locale;
  const char* scripts;
  const char* marks;
};

inline constexpr Sort kSorts[] = {
#include "sorts.inc"
};

/// Imports one sort. `repertoire`: the characters that the shipped codepages write.
lexicor_data::SortSource import_sort(const Sort& sort, const std::set<char16_t>& repertoire, Notes& notes);

}  // namespace lexicor_import
