// ICU's root collator, asked for what the root of sorts is made of: collation elements and contractions.
#pragma once

#include <unicode/ucol.h>

#include <cstdint>
#include <set>
#include <string>
#include <vector>

#include "icu_text.h"

namespace lexicor_import {

/// A collation element, with weights as large as ICU's.
struct Ce {
  uint32_t primary;
  uint32_t secondary;
  uint32_t tertiary;
  unsigned letter_case;  ///< 0 none or small, else capital
};

class Collator {
 public:
  Collator();

  /// The elements of a text; characters that are ignored altogether give none.
  std::vector<Ce> elements(const std::u16string& text) const;
  /// Whether a primary weight is that of punctuation or a blank.
  bool is_variable(uint32_t primary) const { return primary != 0 && primary <= variable_top_; }
  /// The contractions, but for those that depend on the character before them.
  std::set<std::u16string> contractions() const;

  /// The tertiary weight of what has no case and no other form.
  static constexpr uint32_t kCommonTertiary = 0x0500;

 private:
  IcuPtr<UCollator, ucol_close> collator_;
  uint32_t variable_top_ = 0;
};

}  // namespace lexicor_import
