// The lists of the locale directory's languages and territories, and which locale of CLDR each comes from.
#pragma once

#include <cstdint>
#include <string>

namespace lexicor_import {

struct Language {
  const char* name;
  uint16_t id;
  const char* locale;
  const char* territory;  ///< defaults, by object name
  const char* sort;
};

struct Territory {
  const char* name;
  uint16_t id;
  const char* language;  ///< the language that its name and formats are written for
  const char* locale;
  const char* overrides;  ///< "key=value", separated by "|"
};

/// What CLDR does not know yet.
struct Fact {
  const char* country;
  const char* overrides;  ///< as those of a territory
  const char* since;
  const char* source;
};

inline constexpr Language kLanguages[] = {
#include "languages.inc"
};

inline constexpr Territory kTerritories[] = {
#include "territories.inc"
};

inline constexpr Fact kFacts[] = {
#include "facts.inc"
};

/// The locale as ICU takes it: Gregorian calendar and Latin digits, whatever its own are.
inline std::string icu_locale(const std::string& locale) {
  return locale + "@calendar=gregorian;numbers=latn";
}

}  // namespace lexicor_import
