// What rules make of the root: the elements of every text, and the contractions that a sort is to hold. Rules are
// applied one after the other, so that the last of two that say different things counts.
//
// Characters that are canonically equal have equal elements as far as a sort can say it. Elements are found in the
// decomposed text, so that a rule for a letter holds for all letters that are made of it. A contraction is written
// in every form that has two characters.
//
// Settings:
//   [caseFirst upper], lower, off   capitals, or small letters, come first
//   [backwards 2], off              accents count from the end of the text
//   [alternate shifted]             punctuation counts behind all levels, as it does without this setting;
//                                   non-ignorable: as letters do
//   [maxVariable punct]             the last group that is punctuation: space, punct, symbol, currency
//   [reorder Cyrl Grek]             groups of the root that come first, in this order
//   [suppressContractions [и]]      no contraction begins with these characters
//   [import NAME]                   the rules of another file, at this place
//   [tables [\u0E00-\u0EFF]]        characters that have a table, with the contractions of the root that begin
//                                   with them
//   [compose [\u0308]]              composed characters, or marks at their end: a pair that makes one is a
//                                   contraction with its elements
//   [separate [áà]]                 composed characters whose last mark keeps an element of its own, as it has
//                                   behind a letter
// Accepted, since they are what a sort does: [strength 3], [normalization off], [caseLevel off],
// [numericOrdering off], [hiraganaQ off], and [optimize [...]].
#pragma once

#include <array>
#include <bitset>
#include <functional>
#include <map>
#include <set>
#include <string>
#include <vector>

#include "sort_order.h"
#include "sort_root.h"
#include "sort_rules.h"

namespace lexicor_data {

/// A source of rules; an empty file name: there is none.
struct RuleFile {
  std::string file_name;
  std::string text;
};
using FindRules = std::function<RuleFile(const std::string& name)>;

/// Where rules say something.
struct RulePlace {
  std::string file;
  SortPlace place;
};

enum class CaseFirst : uint8_t { kOff, kLower, kUpper };

class SortTailoring {
 public:
  /// `find` gives the files that [import] names.
  SortTailoring(const SortRoot& root, FindRules find);

  /// Throws SourceError.
  void apply(const RuleFile& file);

  const SortRoot& root() const { return root_; }
  const WeightOrder& order() const { return order_; }

  /// The elements of a character that has a table, or of a text.
  CollationElements elements(char16_t unit) const;
  CollationElements elements(const std::u16string& text) const;
  /// The contractions to hold, of two characters, with the place of their rules.
  std::map<std::u16string, SortPlace> contractions() const;
  CollationElements contraction_elements(const std::u16string& pair) const;
  /// Whether a relation names the pair itself, and where.
  const RulePlace* written(const std::u16string& pair) const;
  /// Contractions of more than two characters.
  std::vector<std::u16string> long_contractions() const;

  /// The last rule of the file itself that adds pages, or weights of a level: what is at fault when there are too many.
  SortPlace page_place() const { return page_place_; }
  SortPlace weight_place(Strength level) const { return weight_places_[static_cast<size_t>(level)]; }

  bool backwards() const { return backwards_; }
  CaseFirst case_first() const { return case_first_; }
  bool is_variable(uint32_t primary) const;
  std::bitset<256> tables() const { return tables_; }
  /// The number of a group in the order of [reorder].
  size_t group_rank(size_t group) const { return group_ranks_[group]; }
  bool is_separate(char16_t unit) const { return separate_[unit]; }

 private:
  struct Contraction {
    CollationElements elements;
    SortPlace place;  ///< none: the root's
  };

  void apply_rules(const RuleFile& file);
  void set(const SortRule& rule);
  void set_value(const SortRule& rule);
  void set_reorder(const SortRule& rule);
  void set_tables(const SortRule& rule);
  void add_table(unsigned page);
  void set_composed(const SortRule& rule);
  void set_separate(const SortRule& rule);
  void suppress(const SortRule& rule);
  void import(const SortRule& rule);
  std::string value_of(const SortRule& rule, const std::vector<std::string>& values) const;
  void check_reordered() const;

  void reset(const SortRule& rule);
  bool is_syllable(const CollationElements& elements) const;
  CollationElements special_place(const SortRule& rule) const;
  void relate(const SortRule& rule);
  void insert(const SortRule& rule);
  void set_case(const std::u16string& text, CollationElements& elements) const;
  void map(const SortRule& rule, const std::u16string& text, CollationElements elements);

  void check_known(const SortRule& rule, const std::u16string& text, bool tailored) const;
  [[noreturn]] void fail(SortPlace place, const std::string& what) const;

  CollationElements walk(std::u16string decomposed, bool tailored) const;
  size_t match(const std::u16string& text, size_t at, bool tailored) const;
  CollationElements single(char16_t unit, bool tailored) const;
  const CollationElements* contraction(const std::u16string& text, bool tailored) const;
  std::vector<std::u16string> pairs_of(const std::u16string& decomposed) const;
  void add_tails(const std::u16string& decomposed, SortPlace place,
                 std::map<std::u16string, SortPlace>& pairs) const;

  const SortRoot& root_;
  FindRules find_;
  WeightOrder order_;
  std::vector<std::string> files_;  ///< that are being read, by name
  std::string file_;                ///< for errors

  SortPlace own_place_, page_place_{1, 1};  ///< own_place_: of the rule being applied, or what imports it
  std::array<SortPlace, 4> weight_places_;  ///< by Strength

  CollationElements place_;            ///< where the next relation stands
  Strength before_ = Strength::kNone;  ///< of a reset whose relation comes
  bool is_several_ = false;            ///< the reset's text: characters that do not become one

  std::map<char16_t, CollationElements> characters_;    ///< tailored
  std::map<std::u16string, Contraction> contractions_;  ///< by decomposed text, those of the root among them
  std::map<std::u16string, RulePlace> written_;         ///< pairs of rules, as they stand there
  std::map<char16_t, size_t> longest_;                  ///< contraction, by first character
  std::bitset<kCharacters> changed_;                    ///< with a mapping, or beginning a contraction
  std::bitset<kCharacters> completed_;                  ///< of [tables]
  std::map<char16_t, CollationElements> pinned_;        ///< composed characters of [compose]
  std::map<std::u16string, Contraction> pinned_pairs_;
  std::bitset<kCharacters> separate_;

  std::bitset<256> tables_;
  std::vector<size_t> group_ranks_;
  std::map<size_t, RulePlace> reordered_;  ///< scripts of [reorder]
  uint32_t last_variable_;
  bool shifted_ = true, backwards_ = false;
  CaseFirst case_first_ = CaseFirst::kOff;
};

}  // namespace lexicor_data
