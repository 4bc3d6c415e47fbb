// From the elements of a tailoring to the weights of a sort object, at tertiary strength with punctuation behind the
// other levels.
//
// Elements are brought into the form that a sort holds: an element and the accents behind it become one, with one
// secondary and one tertiary weight. What has no weight but those of punctuation has one special weight. Primary
// and special weights are numbered densely and in their order; secondary and tertiary ones are numbered within
// each primary weight, the only place where they are compared.
//
// Pages with tables hold the weights of all their characters. Ideographs and Hangul syllables have computed
// weights, in the order of their code points, behind all letters, and behind the letters of Hangul. All other pages
// follow behind everything, in the order of their code points; surrogates have no weights.
//
// What a sort cannot hold is noted:
//   - of characters with more than two elements the first two count, the others only as a tertiary difference,
//     as does punctuation inside a character;
//   - contractions of more than two characters, or with more than one element, are left out, where they follow
//     from other rules; those that a rule names are an error.
#pragma once

#include <string>
#include <vector>

#include "sort_tailoring.h"
#include "sort_text.h"

namespace lexicor_data {

/// What a sort does not hold, a line for each reason with the characters concerned.
using SortNotes = std::vector<std::string>;

/// Builds the sort of a source of rules. Throws SourceError.
SortSource build_sort(const SortRoot& root, const RuleFile& rules, const FindRules& find, SortNotes& notes);

}  // namespace lexicor_data
