// ICU's old-style collation elements, joined again to whole ones.
#include "sort_collator.h"

#include <unicode/ucoleitr.h>
#include <unicode/uset.h>

namespace lexicor_import {
namespace {

// An element of 64 bits comes as one or two of 32; the second has this mark, which no tertiary weight has.
constexpr uint32_t kContinuation = 0xC0, kTertiaryBits = 0x3F;

}  // namespace

Collator::Collator() {
  UErrorCode error = U_ZERO_ERROR;
  collator_.reset(ucol_open("root", &error));
  require(error, "ucol_open");
  variable_top_ = ucol_getVariableTop(collator_.get(), &error);
  require(error, "ucol_getVariableTop");
}

std::vector<Ce> Collator::elements(const std::u16string& text) const {
  UErrorCode error = U_ZERO_ERROR;
  const IcuPtr<UCollationElements, ucol_closeElements> iterator(
      ucol_openElements(collator_.get(), text.data(), static_cast<int32_t>(text.size()), &error));
  require(error, "ucol_openElements");
  std::vector<Ce> elements;
  for (int32_t next; (next = ucol_next(iterator.get(), &error)) != UCOL_NULLORDER;) {
    const auto order = static_cast<uint32_t>(next);
    if (order == 0) continue;
    const uint32_t primary = order >> 16, secondary = order >> 8 & 0xFF, low = order & 0xFF;
    if ((low & kContinuation) == kContinuation && !elements.empty()) {
      elements.back().primary |= primary;
      elements.back().secondary |= secondary;
      elements.back().tertiary |= low & kTertiaryBits;
    } else {
      elements.push_back({primary << 16, secondary << 8, (low & kTertiaryBits) << 8, low >> 6});
    }
  }
  require(error, "ucol_next");
  return elements;
}

std::set<std::u16string> Collator::contractions() const {
  UErrorCode error = U_ZERO_ERROR;
  const IcuPtr<USet, uset_close> set(uset_openEmpty());
  ucol_getContractionsAndExpansions(collator_.get(), set.get(), nullptr, false, &error);
  require(error, "ucol_getContractionsAndExpansions");
  std::set<std::u16string> texts;
  for (int32_t item = 0; item < uset_getItemCount(set.get()); ++item) {
    char16_t text[64];
    UChar32 first = 0, last = 0;
    const int32_t units = uset_getItem(set.get(), item, &first, &last, text, 64, &error);
    require(error, "uset_getItem");
    if (units >= 2) texts.emplace(text, static_cast<size_t>(units));
  }
  return texts;
}

}  // namespace lexicor_import
