// Special case mappings by asking ICU's full mapping for each letter of a language.
#include <unicode/uchar.h>
#include <unicode/uloc.h>
#include <unicode/ulocdata.h>
#include <unicode/uset.h>
#include <unicode/ustring.h>

#include <set>

#include "codepage/lxunicode.h"
#include "icu_text.h"
#include "locale_import.h"

namespace lexicor_import {
namespace {

using lexicor_data::SpecialMapping;

constexpr char16_t kDotAbove = 0x0307, kCapitalSigma = 0x03A3, kFinalSigma = 0x03C2;

std::u16string map_case(const std::u16string& text, const std::string& rules, bool upper) {
  return icu_text("case mapping", [&](UChar* out, int32_t room, UErrorCode* error) {
    const auto units = static_cast<int32_t>(text.size());
    return upper ? u_strToUpper(out, room, text.data(), units, rules.c_str(), error)
                 : u_strToLower(out, room, text.data(), units, rules.c_str(), error);
  });
}

/// The single 16-bit characters of an exemplar set.
std::set<char16_t> exemplars(const std::string& locale, ULocaleDataExemplarSetType type) {
  UErrorCode error = U_ZERO_ERROR;
  const IcuPtr<ULocaleData, ulocdata_close> data(ulocdata_open(locale.c_str(), &error));
  const IcuPtr<USet, uset_close> set(ulocdata_getExemplarSet(data.get(), nullptr, 0, type, &error));
  require(error, "exemplars");
  std::set<char16_t> characters;
  for (int32_t item = 0; item < uset_getItemCount(set.get()); ++item) {
    UChar32 first = 0, last = 0;
    if (uset_getItem(set.get(), item, &first, &last, nullptr, 0, &error) != 0) continue;  // a sequence
    for (UChar32 value = first; value <= last && value <= 0xFFFF; ++value) {
      characters.insert(static_cast<char16_t>(value));
    }
  }
  return characters;
}

SpecialMapping entry(const std::u16string& from, const std::u16string& to) {
  SpecialMapping mapping;
  from.copy(mapping.from, 2);
  to.copy(mapping.to, 2);
  return mapping;
}

void add_final_sigma(const std::string& locale, std::vector<SpecialMapping>& mappings) {
  std::set<char16_t> ends = exemplars(locale, ULOCDATA_ES_PUNCTUATION);
  for (char16_t unit = 0; unit <= 0xA0; ++unit) ends.insert(unit);
  for (char16_t end : ends) {
    const bool blank = end != 0 && (u_isUWhiteSpace(end) || u_isblank(end));
    if ((!blank && !u_ispunct(end)) || u_hasBinaryProperty(end, UCHAR_CASE_IGNORABLE)) continue;
    mappings.push_back(entry({kCapitalSigma, end}, {kFinalSigma, end}));
  }
}

}  // namespace

std::vector<SpecialMapping> special_mappings(const std::string& locale, bool upper) {
  char language[ULOC_LANG_CAPACITY] = {};
  UErrorCode error = U_ZERO_ERROR;
  uloc_getLanguage(locale.c_str(), language, sizeof language, &error);
  require(error, "language");
  const std::string code = language;
  const std::string rules = code == "el" ? "" : code;  // Greek capitals keep their accents
  const auto library = [&](char16_t unit) {
    return static_cast<char16_t>(upper ? lx::unicode_upper(unit) : lx::unicode_lower(unit));
  };

  std::set<char16_t> letters = exemplars(locale, ULOCDATA_ES_STANDARD);
  for (char16_t letter : std::set<char16_t>(letters)) {
    const std::u16string capital = map_case(std::u16string(1, letter), rules, true);
    if (capital.size() == 1) letters.insert(capital[0]);
  }
  std::vector<SpecialMapping> mappings;
  for (char16_t letter : letters) {
    const std::u16string from(1, letter), to = map_case(from, rules, upper);
    const bool alone = to != std::u16string(1, library(letter));
    if (alone && to.size() <= 2) mappings.push_back(entry(from, to));
    if (alone || rules.empty()) continue;
    const std::u16string pair{letter, kDotAbove}, pair_to = map_case(pair, rules, upper);
    if (pair_to.size() <= 2 && pair_to != std::u16string{library(letter), kDotAbove})
      mappings.push_back(entry(pair, pair_to));
  }
  if (code == "el" && !upper) add_final_sigma(locale, mappings);
  return mappings;
}

}  // namespace lexicor_import
