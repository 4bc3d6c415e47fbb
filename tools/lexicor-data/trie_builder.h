// The two tries of a multibyte codepage object: from bytes to Unicode values, and from bytes to type records.
#pragma once

#include <cstddef>

#include "codepage_model.h"
#include "object_file.h"

namespace lexicor_data {

struct UnicodeTrie {
  ByteVector section;        ///< the nodes, then the values
  size_t values_offset = 0;  ///< of the values, in bytes
};

/// The multibyte-to-Unicode section. A look-up leaves it at a byte outside its node's range, so rows are stored
/// from the lowest to the highest byte that occurs.
UnicodeTrie build_unicode_trie(const CodepageModel& model);

struct TypeTrie {
  ByteVector nodes;
  ByteVector records;
  size_t retyped_chars = 0;  ///< characters of unassigned type that have their row's record (kLoose)
};

/// What byte sequences that are no characters have for a type.
enum class TypeRows {
  kExact,    ///< the type word 0, all of them
  kShared,   ///< that, if their trail bytes occur as trail bytes of the codepage; others share what packs best
  kUniform,  ///< as kShared, but where the characters of a row have one record the whole row has it
  kLoose,    ///< as kUniform, but the characters of unassigned type (0x400) have no say in their row's record
};

/// The type trie and its records. Look-ups check no range: each index that any bytes lead to lies inside.
TypeTrie build_type_trie(const CodepageModel& model, TypeRows rows);

/// The smallest mask of low bits under which the bytes from `lowest` to `highest` stay distinct and in order.
uint8_t mask_for_range(uint8_t lowest, uint8_t highest);

}  // namespace lexicor_data
