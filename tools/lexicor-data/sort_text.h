// A sort's source: collation weights in the allkeys.txt form of the Unicode Collation Algorithm, read, checked
// and written.
//
//   0061      ; [.0A31.0001.0001]                     a character: primary, secondary and tertiary weight
//   00E6      ; [.0A31.0001.0003][.0A61.0001.0003]    an expansion: two elements at most
//   0063 0068 ; [.0A55.0001.0001]                     a contraction: two characters, one element
//   0020      ; [*0201.0000.0000]                     a special weight; it has no others beside it
//   0000      ; [.0000.0000.0000]                     a character without weights
//
// Numbers are hexadecimal; `#` begins a comment. Weights have 16, 8 and 8 bits, code points 16. Lines may stand
// in any order. What the form cannot say is said by directives; a page is 256 code points:
//
//   @defaults 0001 0001               secondary and tertiary weight that keys drop at their end
//   @primaries 4E00..9FFF ; 2000      whole pages with computed weights: 4E00 has primary 2000, 4E01 2001, ...
//   @specials 2700..27FF ; 0400       the same with special weights
//   @uncovered D800..DFFF             whole pages whose characters have no weights
//   @insert secondary                 the weights of these levels go ahead of the run, in every line of the
//   file
//   @insert none ; 0030..0039         the same for some characters, instead of what holds for the file
//   @insert primary special ; 0063 0068   the same for a contraction
//
// Every page must have a line or be named by a directive. On a page with lines, characters without a line have
// no weights.
#pragma once

#include <array>
#include <cstdint>
#include <iosfwd>
#include <map>
#include <string>
#include <utility>

#include "lx/collate.h"

namespace lexicor_data {

inline constexpr uint8_t kAppendAll =
    LX_APPEND_PRIMARY | LX_APPEND_SECONDARY | LX_APPEND_TERTIARY | LX_APPEND_SPECIAL;

/// Where a source says something, 1-based; 0: nowhere, as it was read from an object.
struct SortPlace {
  int line = 0;
  int column = 0;
};

struct SortSet {
  uint16_t primary = 0;
  uint8_t secondary = 0;
  uint8_t tertiary = 0;
  uint16_t special = 0;
};

/// The weights of a character or a contraction.
struct SortElement {
  std::array<SortSet, 2> sets{};
  uint8_t count = 1;  ///< 2: an expansion
  uint8_t char_class = kAppendAll;
  SortPlace place;

  bool ignored() const;  ///< no weight on any level
};

enum class SortPageKind : uint8_t { kUncovered, kTable, kPrimary, kSpecial };

struct SortPage {
  SortPageKind kind = SortPageKind::kUncovered;
  uint16_t base = 0;  ///< weight of a computed page's first character
  uint8_t char_class = kAppendAll;
  SortPlace place;

  bool computed() const { return kind == SortPageKind::kPrimary || kind == SortPageKind::kSpecial; }
};

struct SortSource {
  uint8_t default_secondary = 0, default_tertiary = 0;
  SortPlace defaults_place, size_place;  ///< size_place: of the last rule that adds weights
  std::array<SortPage, 256> pages{};
  std::map<char16_t, SortElement> characters;  ///< of table pages; without weights: none
  std::map<std::pair<char16_t, char16_t>, SortElement> contractions;
};

/// Reads a source and checks it (sort_check.h). Throws SourceError.
SortSource read_sort(std::istream& in, const std::string& file_name);

/// Writes the canonical text, in the order of the weights: equal sorts give equal bytes.
void write_sort(std::ostream& out, const SortSource& sort);

}  // namespace lexicor_data
