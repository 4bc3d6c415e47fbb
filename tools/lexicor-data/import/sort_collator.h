// A collator of ICU, asked for what the weights of a sort are made of: collation elements, contractions, and
// the order of primary weights, the reordering of scripts included.
#pragma once

#include <unicode/ucol.h>

#include <cstdint>
#include <set>
#include <string>
#include <vector>

#include "icu_text.h"

namespace lexicor_import {

/// A collation element, with weights as large as ICU's. The tertiary weight has the order of the collator's
/// case-first setting.
struct Ce {
  uint32_t primary;
  uint32_t secondary;
  uint32_t tertiary;
  bool operator==(const Ce& other) const {
    return primary == other.primary && secondary == other.secondary && tertiary == other.tertiary;
  }
};

class Collator {
 public:
  explicit Collator(const std::string& locale);

  /// The elements of a text; characters that are ignored altogether give none.
  std::vector<Ce> elements(const std::u16string& text) const;
  /// The bytes that order texts by their primary weights, punctuation included.
  std::vector<uint8_t> primary_key(const std::u16string& text) const;
  /// Whether a primary weight is that of punctuation or a blank.
  bool is_variable(uint32_t primary) const { return primary != 0 && primary <= variable_top_; }
  /// Secondary weights are compared from the end.
  bool backwards() const { return backwards_; }
  /// The tertiary weight of what has no case and no other form.
  uint32_t common_tertiary() const { return tertiary(kCommonTertiary); }

  /// The contractions; with their contexts, those that depend on the character before them too.
  std::set<std::u16string> contractions(bool contexts) const;

 private:
  static constexpr uint32_t kCommonTertiary = 0x0500;

  uint32_t tertiary(uint32_t bits) const;

  IcuPtr<UCollator, ucol_close> collator_;
  IcuPtr<UCollator, ucol_close> primaries_;  ///< the same, at primary strength
  uint32_t variable_top_ = 0;
  bool backwards_ = false;
  UColAttributeValue case_first_ = UCOL_OFF;
};

}  // namespace lexicor_import
