// ICU's old-style collation elements, joined again to whole ones.
#include "sort_collator.h"

#include <unicode/ucoleitr.h>
#include <unicode/uset.h>

namespace lexicor_import {
namespace {

// An element of 64 bits comes as one or two of 32; the second has this mark, which no tertiary weight has.
constexpr uint32_t kContinuation = 0xC0;
constexpr uint32_t kCaseBits = 0xC000;
constexpr uint32_t kTertiaryBits = 0x3F3F;

}  // namespace

Collator::Collator(const std::string& locale) {
  UErrorCode error = U_ZERO_ERROR;
  collator_.reset(ucol_open(locale.c_str(), &error));
  require(error, "ucol_open");
  if (error == U_USING_DEFAULT_WARNING && locale != "root")
    throw std::runtime_error("no collator for " + locale);
  primaries_.reset(ucol_clone(collator_.get(), &error));
  ucol_setStrength(primaries_.get(), UCOL_PRIMARY);
  ucol_setAttribute(primaries_.get(), UCOL_ALTERNATE_HANDLING, UCOL_NON_IGNORABLE, &error);
  variable_top_ = ucol_getVariableTop(collator_.get(), &error);
  backwards_ = ucol_getAttribute(collator_.get(), UCOL_FRENCH_COLLATION, &error) == UCOL_ON;
  case_first_ = ucol_getAttribute(collator_.get(), UCOL_CASE_FIRST, &error);
  require(error, "ucol_getAttribute");
}

/// With a case first, the case counts before the form; upper case first turns the case around.
uint32_t Collator::tertiary(uint32_t bits) const {
  if (bits == 0 || case_first_ == UCOL_OFF) return bits & kTertiaryBits;
  const uint32_t all = bits & (kCaseBits | kTertiaryBits);
  return case_first_ == UCOL_UPPER_FIRST ? all ^ kCaseBits : all;
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
      elements.back().tertiary |= low & 0x3F;
    } else {
      elements.push_back({primary << 16, secondary << 8, low << 8});
    }
  }
  require(error, "ucol_next");
  for (Ce& element : elements) element.tertiary = tertiary(element.tertiary);
  return elements;
}

std::vector<uint8_t> Collator::primary_key(const std::u16string& text) const {
  std::vector<uint8_t> key(64);
  const int32_t bytes = ucol_getSortKey(primaries_.get(), text.data(), static_cast<int32_t>(text.size()),
                                        key.data(), static_cast<int32_t>(key.size()));
  if (bytes <= 0 || static_cast<size_t>(bytes) > key.size()) throw std::runtime_error("a sort key is too long");
  key.resize(static_cast<size_t>(bytes));
  return key;
}

std::set<std::u16string> Collator::contractions(bool contexts) const {
  UErrorCode error = U_ZERO_ERROR;
  const IcuPtr<USet, uset_close> set(uset_openEmpty());
  ucol_getContractionsAndExpansions(collator_.get(), set.get(), nullptr, contexts, &error);
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
