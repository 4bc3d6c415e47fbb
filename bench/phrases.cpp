// lexicor_bench_phrases LOCALE: the names of the language's own CLDR data as ICU carries them, a line each in
// UTF-8: territories, languages, scripts, currencies and time zones.
#include <unicode/ucal.h>
#include <unicode/ucurr.h>
#include <unicode/uenum.h>
#include <unicode/uldnames.h>
#include <unicode/uloc.h>
#include <unicode/uscript.h>
#include <unicode/ustring.h>

#include <cstdio>
#include <functional>
#include <set>
#include <string>

namespace {

constexpr int32_t kUnits = 256;

/// The lines that were printed, so that none comes twice.
class Lines {
 public:
  /// Adds what `name(buffer, &error)` writes; codes that have no name stand for themselves and are left out.
  void add(const char* code, const std::function<int32_t(char16_t*, UErrorCode*)>& name) {
    char16_t units[kUnits];
    char bytes[3 * kUnits + 1];
    UErrorCode error = U_ZERO_ERROR;
    int32_t written = 0;
    const int32_t count = name(units, &error);
    u_strToUTF8(bytes, sizeof(bytes), &written, units, count, &error);
    if (U_SUCCESS(error) && std::string(bytes) != code && known_.insert(bytes).second) std::puts(bytes);
  }

 private:
  std::set<std::string> known_;
};

void add_names(const char* locale, Lines* lines) {
  UErrorCode error = U_ZERO_ERROR;
  ULocaleDisplayNames* const names = uldn_open(locale, ULDN_STANDARD_NAMES, &error);
  for (const char* const* code = uloc_getISOCountries(); *code != nullptr; ++code)
    lines->add(*code, [&](char16_t* out, UErrorCode* e) {
      return uldn_regionDisplayName(names, *code, out, kUnits, e);
    });
  for (const char* const* code = uloc_getISOLanguages(); *code != nullptr; ++code)
    lines->add(*code, [&](char16_t* out, UErrorCode* e) {
      return uldn_languageDisplayName(names, *code, out, kUnits, e);
    });
  for (int script = 0; script < USCRIPT_CODE_LIMIT; ++script) {
    const char* const code = uscript_getShortName(static_cast<UScriptCode>(script));
    lines->add(code, [&](char16_t* out, UErrorCode* e) {
      return uldn_scriptDisplayName(names, code, out, kUnits, e);
    });
  }
  uldn_close(names);
}

void add_currencies(const char* locale, Lines* lines) {
  UErrorCode error = U_ZERO_ERROR;
  UEnumeration* const currencies = ucurr_openISOCurrencies(UCURR_ALL, &error);
  while (const char* const code = uenum_next(currencies, nullptr, &error)) {
    lines->add(code, [&](char16_t* out, UErrorCode* e) {
      char16_t units[4];
      u_charsToUChars(code, units, 4);
      int32_t count = 0;
      const char16_t* const name = ucurr_getName(units, locale, UCURR_LONG_NAME, nullptr, &count, e);
      u_memcpy(out, name, count);
      return count;
    });
  }
  uenum_close(currencies);
}

void add_time_zones(const char* locale, Lines* lines) {
  UErrorCode error = U_ZERO_ERROR;
  UEnumeration* const zones =
      ucal_openTimeZoneIDEnumeration(UCAL_ZONE_TYPE_CANONICAL_LOCATION, nullptr, nullptr, &error);
  int32_t count = 0;
  while (const char16_t* const id = uenum_unext(zones, &count, &error)) {
    UCalendar* const calendar = ucal_open(id, count, locale, UCAL_GREGORIAN, &error);
    for (const UCalendarDisplayNameType type : {UCAL_STANDARD, UCAL_DST})
      lines->add("", [&](char16_t* out, UErrorCode* e) {
        return ucal_getTimeZoneDisplayName(calendar, type, locale, out, kUnits, e);
      });
    ucal_close(calendar);
  }
  uenum_close(zones);
}

}  // namespace

int main(int argc, char** argv) {
  if (argc != 2) return std::fprintf(stderr, "usage: lexicor_bench_phrases LOCALE\n"), 2;
  Lines lines;
  add_names(argv[1], &lines);
  add_currencies(argv[1], &lines);
  add_time_zones(argv[1], &lines);
}
