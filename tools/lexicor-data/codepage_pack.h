// Packs a codepage into its object: the payload, the multibyte-to-Unicode section, and the low and high arrays
// behind the Unicode page table.
//
// A section holds 65,535 bytes. What packs best is found by trying, in this order: type rows that are exact,
// then looser in three steps (TypeRows); two-byte characters as words (kind 1), then as two arrays of bytes
// (kind 4). When a section still does not fit, characters are dropped where the rows are sparsest. A row is a
// trie leaf's characters when the payload or the trie section is too large, a page of Unicode values when an
// array is; it takes cells from its first to its last character. Cuts are made at the ends of rows: the next
// cut takes the characters at one end of a row that free the most cells for each character, the row with the
// highest numbers among equals, until the section fits. A dropped character goes with every mapping of its code
// and of its value.
#pragma once

#include <string>
#include <vector>

#include "codepage_model.h"
#include "object_file.h"
#include "trie_builder.h"

namespace lexicor_data {

struct PackedCodepage {
  ObjectFile object;         ///< without the origin
  CodepageModel model;       ///< what the object holds
  size_t retyped_chars = 0;  ///< characters of unassigned type that have the type of their row
  TypeRows type_rows = TypeRows::kExact;
};

/// Packs the model; what had to be dropped is appended to `left_out`. Throws SourceError when the single-byte
/// characters alone do not fit.
PackedCodepage pack_codepage(CodepageModel model, const std::string& file_name, std::vector<LeftOut>& left_out);

}  // namespace lexicor_data
