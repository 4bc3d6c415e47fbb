// A language from ICU's date symbols and display names.
#include <unicode/udat.h>
#include <unicode/uldnames.h>
#include <unicode/uloc.h>
#include <unicode/ulocdata.h>
#include <unicode/uversion.h>

#include "icu_text.h"
#include "locale_import.h"

namespace lexicor_import {
namespace {

using lexicor_data::Control;
using lexicor_data::LanguageSource;
using lexicor_data::ObjectType;

constexpr char kDefaultCodepage[] = "UTF-8";

uint16_t default_id(const Control& control, ObjectType type, const char* name) {
  const lexicor_data::ObjectName* object = control.find(type, name);
  if (object == nullptr) throw std::runtime_error(std::string("no object ") + name + " for a default");
  return object->id;
}

class DateSymbols {
 public:
  explicit DateSymbols(const std::string& locale) {
    UErrorCode error = U_ZERO_ERROR;
    format_.reset(udat_open(UDAT_NONE, UDAT_FULL, locale.c_str(), u"UTC", -1, nullptr, 0, &error));
    require(error, "date symbols");
    pattern_ = icu_text("date pattern", [&](UChar* out, int32_t room, UErrorCode* status) {
      return udat_toPattern(format_.get(), 0, out, room, status);
    });
  }

  /// Whether full dates use the stand-alone form of a field.
  bool stand_alone(char16_t letter) const { return pattern_.find(letter) != std::u16string::npos; }

  template <class List>
  void read(UDateFormatSymbolType type, int32_t first, int32_t count, List& list) const {
    for (int32_t i = 0; i < count; ++i) list[static_cast<size_t>(i)] = text(type, first + i);
  }

  std::u16string text(UDateFormatSymbolType type, int32_t index) const {
    return plain(icu_text("date symbol", [&](UChar* out, int32_t room, UErrorCode* error) {
      return udat_getSymbols(format_.get(), type, index, out, room, error);
    }));
  }

 private:
  IcuPtr<UDateFormat, udat_close> format_;
  std::u16string pattern_;
};

/// The language's name for itself, with its script or country where CLDR has a name for the two together.
std::u16string own_name(const char* locale) {
  UErrorCode error = U_ZERO_ERROR;
  const IcuPtr<ULocaleDisplayNames, uldn_close> names(uldn_open(locale, ULDN_DIALECT_NAMES, &error));
  require(error, "display names");
  return plain(icu_text("language name", [&](UChar* out, int32_t room, UErrorCode* status) {
    return uldn_localeDisplayName(names.get(), locale, out, room, status);
  }));
}

std::u16string upper_code(const char* locale) {
  std::u16string code;
  for (const char* at = locale; *at >= 'a' && *at <= 'z'; ++at) {
    code += static_cast<char16_t>(*at - ('a' - 'A'));
  }
  return code;
}

}  // namespace

std::string source_comment(const char* locale) {
  UVersionInfo cldr;
  UErrorCode error = U_ZERO_ERROR;
  ulocdata_getCLDRVersion(cldr, &error);
  require(error, "version");
  return "# Written by lexicor-import from CLDR " + std::to_string(cldr[0]) +
         " (ICU " U_ICU_VERSION "), locale " + locale + ".\n";
}

LanguageSource import_language(const Language& row, const Control& control) {
  LanguageSource language;
  language.territory = default_id(control, ObjectType::kTerritory, row.territory);
  language.codepage = default_id(control, ObjectType::kCodepage, kDefaultCodepage);
  const bool binary = std::string(row.sort) == "Binary";
  language.sort = binary ? 0 : default_id(control, ObjectType::kSort, row.sort);
  language.abbreviation = upper_code(row.locale);
  language.name = own_name(row.locale);

  const DateSymbols symbols(icu_locale(row.locale));
  const bool own_days = symbols.stand_alone('c'), own_months = symbols.stand_alone('L');
  constexpr int32_t kSunday = 1, kDays = 7, kMonths = 12;
  symbols.read(own_days ? UDAT_STANDALONE_WEEKDAYS : UDAT_WEEKDAYS, kSunday, kDays, language.days);
  symbols.read(own_days ? UDAT_STANDALONE_SHORT_WEEKDAYS : UDAT_SHORT_WEEKDAYS, kSunday, kDays,
               language.short_days);
  symbols.read(own_months ? UDAT_STANDALONE_MONTHS : UDAT_MONTHS, 0, kMonths, language.months);
  symbols.read(own_months ? UDAT_STANDALONE_SHORT_MONTHS : UDAT_SHORT_MONTHS, 0, kMonths,
               language.short_months);
  language.morning = symbols.text(UDAT_AM_PMS, 0);
  language.afternoon = symbols.text(UDAT_AM_PMS, 1);
  language.special_upper = special_mappings(row.locale, true);
  language.special_lower = special_mappings(row.locale, false);
  return language;
}

}  // namespace lexicor_import
