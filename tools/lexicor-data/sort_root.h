// The root of all sorts, in the allkeys.txt form of the Unicode Collation Algorithm: what every character weighs
// before rules tailor it, and what the compiler needs to know about characters besides.
//
//   0061      ; [.0A31.0020.0002]                     a character: primary, secondary and tertiary weight
//   0020      ; [*0009.0020.0002]                     an element of punctuation or a blank
//   00E6      ; [.0A31.0020.0004][.0000.0110.0004]... as many elements as it has
//   0438 0306 ; [.0FC5.0020.0002]                     a contraction
//   3220      ; ...[.FB40.0020.0004][.CE00.0000.0000] an ideograph, by the formula of the algorithm
//
// Numbers are hexadecimal; `#` begins a comment. The primary weights are 1, 2, 3, ... in the order of the
// characters; 0020 and 0002 are the common secondary and tertiary weight. What the form cannot say is said by
// directives:
//
//   @tables 0000..06FF 0900..09FF     pages whose characters have a table in every sort
//   @group Latn 08C6                  the primary weight with which a group begins that [reorder] moves
//   @upper 0008 0009                  tertiary weights of capitals, for [caseFirst]
//   @ideographs 4E00..9FFF 3400..4DBF computed weights behind all others, in this order
//   @syllables AC00..D7FF             computed weights behind the letters that they are made of
//   @computed A000..A4FF E000..F8FF   computed weights in code point order, behind everything
//   @uncovered D800..DFFF             no weights
//   @combining 0300..0314 ; 00E6      canonical combining classes
//   @canonical 00C0 ; 0041 0300       full canonical decompositions
#pragma once

#include <bitset>
#include <cstdint>
#include <iosfwd>
#include <map>
#include <string>
#include <vector>

#include "sort_text.h"

namespace lexicor_data {

enum class LetterCase : uint8_t { kLower, kMixed, kUpper };

/// An element of the collation algorithm; a weight of 0 is none. Ideographs have kFirstIdeograph and their code
/// point as primary weight, characters behind them kFirstBehind and theirs, and rules add weights from
/// kFirstTailored on.
struct CollationElement {
  uint32_t primary = 0, secondary = 0, tertiary = 0;
  LetterCase letter_case = LetterCase::kLower;
};
using CollationElements = std::vector<CollationElement>;

inline constexpr uint32_t kFirstIdeograph = 0x10000, kFirstBehind = 0x50000, kFirstTailored = 0x80000;
inline constexpr uint32_t kCommonSecondary = 0x20, kCommonTertiary = 0x02;
inline constexpr unsigned kCharacters = 0x10000;

/// A range of code points, its last one included.
struct SortRange {
  unsigned first = 0, last = 0;
  bool holds(unsigned code) const { return code >= first && code <= last; }
};

/// Scripts, or kinds of characters without one, that have their place together.
struct SortGroup {
  std::string name;  ///< space, punct, symbol, currency, digit, or a script's code of four letters
  uint32_t first = 0;
};

class SortRoot {
 public:
  std::vector<CollationElements> characters{kCharacters};
  std::bitset<kCharacters> listed;
  std::map<std::u16string, CollationElements> contractions;
  std::vector<SortGroup> groups;  ///< in ascending order
  uint32_t last_variable = 0;     ///< the primary weights of blanks and punctuation end here
  std::bitset<256> tables, upper_tertiaries;
  std::vector<SortRange> ideographs, syllables, computed, uncovered;
  std::vector<uint8_t> combining_class = std::vector<uint8_t>(kCharacters);
  std::map<char16_t, std::u16string> decompositions;

  /// Derives what the functions below need; the fields stay as they are from then on.
  void settle();

  uint32_t last_primary() const { return static_cast<uint32_t>(uses_.size()) - 1; }

  /// The next lower weight that elements of this primary weight have, and of this primary and secondary one; 0
  /// for none.
  uint32_t secondary_before(uint32_t primary, uint32_t secondary) const;
  uint32_t tertiary_before(uint32_t primary, uint32_t secondary, uint32_t tertiary) const;

  /// Secondary and tertiary weight of an element.
  struct Use {
    uint16_t secondary, tertiary;
  };
  /// What elements without a primary weight have, in order.
  const std::vector<Use>& ignorables() const { return uses_[0]; }

  size_t group_of(uint32_t primary) const;  ///< its number in `groups`

  bool is_ideograph(unsigned code) const;
  bool is_computed(unsigned code) const;  ///< or an ideograph or a syllable
  bool decomposes(char16_t unit) const { return decomposes_[unit]; }
  std::u16string decomposition(char16_t unit) const;
  std::u16string decomposed(const std::u16string& text) const;
  /// Characters whose decomposition is the text.
  std::vector<char16_t> compositions(const std::u16string& text) const;
  /// Characters that decompose, by the first character that they become.
  const std::vector<char16_t>& compositions_from(char16_t first) const;

  /// The syllable of Hangul that letters with these primary weights make; 0 for none.
  char16_t syllable(const uint32_t* primaries, size_t count) const;

 private:
  void settle_uses();
  void settle_syllables();

  std::vector<std::vector<Use>> uses_;  ///< by primary weight, in order
  std::bitset<kCharacters> decomposes_;
  std::map<std::u16string, std::vector<char16_t>> compositions_;
  std::map<char16_t, std::vector<char16_t>> compositions_from_;
  std::map<uint32_t, unsigned>
      jamos_[3];  ///< the number of a leading, middle and trailing letter by its weight
};

/// Throws SourceError.
SortRoot read_root(std::istream& in, const std::string& file_name);

/// Writes the source, in the order of the weights.
void write_root(std::ostream& out, const SortRoot& root);

}  // namespace lexicor_data
