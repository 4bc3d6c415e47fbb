// Every shipped language and territory, read from the compiled objects through the library, against ICU's own
// services: codes, names, the territory where most speakers live, symbols, currencies and case mapping.
// Numbers, amounts and times written out are the matter of format_oracle_test.cpp. What differs must be what
// locale_differences.txt lists, each line with its reason.
#include <gtest/gtest.h>
#include <unicode/uchar.h>
#include <unicode/ucurr.h>
#include <unicode/uldnames.h>
#include <unicode/uloc.h>
#include <unicode/ulocdata.h>
#include <unicode/unum.h>
#include <unicode/uset.h>
#include <unicode/ustring.h>

#include <algorithm>
#include <vector>

#include "compile.h"
#include "directory/icu_peer.h"
#include "directory/listed_differences.h"
#include "import/locale_table.h"
#include "support/library.h"

namespace lx::test {
namespace {

using lexicor_import::IcuPtr;
using Text = Text16;

/// The items of a locale: the territory's own values.
class Items {
 public:
  explicit Items(const std::string& name) : locale_(LXGetLocale((name + ".UTF-8@BINARY").c_str(), 0, nullptr)) {
    if (!locale_) throw std::runtime_error("no locale " + name);
  }
  LXLocale* locale() const { return locale_.get(); }
  Text text(int32_t item) const {
    LXUChar units[256];
    const int32_t count = LXGetLocaleTextInfoU(locale_.get(), item, units, 256, LX_TERRITORY_VALUES);
    if (count < 1) throw std::runtime_error("no text of item " + std::to_string(item));
    return Text(units, units + count - 1);
  }
  Text texts(int32_t first, int32_t count) const {
    Text all;
    for (int32_t i = 0; i < count; ++i) all += text(first + i) + u'|';
    return all;
  }
  int32_t number(int32_t item) const { return LXGetLocaleNumInfo(locale_.get(), item, LX_TERRITORY_VALUES); }

 private:
  LocalePtr locale_;
};

/// The differences found: object, item and both sides.
class Differences {
 public:
  void compare(const std::string& object, const std::string& item, const Text& ours, const Text& theirs) {
    ++compared_;
    if (ours != theirs) found_.add(object, item, utf8(ours) + " / " + utf8(theirs));
  }
  void expect_listed() const {
    EXPECT_GT(compared_, 1500U);
    found_.expect_listed("locale_differences.txt");
  }

 private:
  size_t compared_ = 0;
  ListedDifferences found_;
};

/// The letters of a language that have case, each in place of x in a frame.
Text letters_of(const char* locale, const Text& frame) {
  UErrorCode error = U_ZERO_ERROR;
  const IcuPtr<ULocaleData, ulocdata_close> data(ulocdata_open(locale, &error));
  const IcuPtr<USet, uset_close> set(
      ulocdata_getExemplarSet(data.get(), nullptr, USET_ADD_CASE_MAPPINGS, ULOCDATA_ES_STANDARD, &error));
  Text letters;
  for (UChar32 value = 0x21; value <= 0xFFFF; ++value) {
    if (!uset_contains(set.get(), value) || !u_hasBinaryProperty(value, UCHAR_CHANGES_WHEN_CASEMAPPED))
      continue;
    for (char16_t unit : frame) letters += unit == 'x' ? static_cast<char16_t>(value) : unit;
  }
  return letters;
}

Text mapped(const Items& items, uint32_t mode, const Text& text) {
  const std::vector<LXUChar> source(text.begin(), text.end());
  std::vector<LXUChar> out(2 * text.size());
  const int32_t units = LXMapStringU(items.locale(), out.data(), static_cast<int32_t>(out.size()),
                                     source.data(), static_cast<int32_t>(source.size()), mode);
  return Text(out.begin(), out.begin() + std::max(units, 0));
}

void compare_language(const lexicor_import::Language& row, Differences* differences) {
  const Items items(row.name);
  const auto compare = [&](const std::string& item, const Text& ours, const Text& theirs) {
    differences->compare(row.name, item, ours, theirs);
  };
  const auto format = open_date(UDAT_NONE, UDAT_FULL, lexicor_import::icu_locale(row.locale));
  const auto symbols = [&](UDateFormatSymbolType type, int32_t first, int32_t count) {
    Text all;
    for (int32_t i = first; i < first + count; ++i) all += icu(udat_getSymbols, format.get(), type, i) + u'|';
    return all;
  };
  UErrorCode error = U_ZERO_ERROR;
  char code[ULOC_LANG_CAPACITY] = {}, likely[ULOC_FULLNAME_CAPACITY] = {};
  uloc_getLanguage(row.locale, code, sizeof code, &error);
  uloc_addLikelySubtags(row.locale, likely, sizeof likely, &error);
  std::transform(code, std::end(code), code,
                 [](char c) { return c == '\0' ? c : static_cast<char>(c & ~0x20); });
  compare("abbreviation", items.text(LX_ITEM_LANGUAGE_ABBREVIATION), widen(std::string(code)));
  compare("territory", items.text(LX_ITEM_TERRITORY_ABBREVIATION),
          widen(std::string(uloc_getISO3Country(likely))));
  const IcuPtr<ULocaleDisplayNames, uldn_close> names(uldn_open(row.locale, ULDN_DIALECT_NAMES, &error));
  compare("name", items.text(LX_ITEM_LANGUAGE_NAME), icu(uldn_localeDisplayName, names.get(), row.locale));
  compare("days", items.texts(LX_ITEM_DAY, 7), symbols(UDAT_WEEKDAYS, 1, 7));
  compare("short_days", items.texts(LX_ITEM_SHORT_DAY, 7), symbols(UDAT_SHORT_WEEKDAYS, 1, 7));
  compare("months", items.texts(LX_ITEM_MONTH, 13), symbols(UDAT_MONTHS, 0, 12) + u'|');
  compare("short_months", items.texts(LX_ITEM_SHORT_MONTH, 13), symbols(UDAT_SHORT_MONTHS, 0, 12) + u'|');
  compare("markers", items.texts(LX_ITEM_MORNING, 2), symbols(UDAT_AM_PMS, 0, 2));

  const Text dates = items.texts(LX_ITEM_DAY, 7) + items.texts(LX_ITEM_MONTH, 12);
  const std::pair<std::string, Text> frames[] = {
      {"words", u"xx xx, "}, {"sentences", u"xx. "}, {"letters", u"x x\u0307 "}};
  for (const auto& [kind, frame] : frames) {
    const Text text = letters_of(row.locale, frame) + dates;
    const auto peer = [&](auto function) {
      return icu([&](UChar* out, int32_t room, UErrorCode* status) {
        return function(out, room, text.data(), static_cast<int32_t>(text.size()), row.locale, status);
      });
    };
    compare("upper_" + kind, mapped(items, LX_MAP_UPPER, text), peer(u_strToUpper));
    compare("lower_" + kind, mapped(items, LX_MAP_LOWER, text), peer(u_strToLower));
  }
}

void compare_territory(const lexicor_import::Territory& row, Differences* differences) {
  const Items items(std::string(row.language) + "_" + row.name);
  const std::string locale = lexicor_import::icu_locale(row.locale);
  const auto compare = [&](const char* item, const Text& ours, const Text& theirs) {
    differences->compare(row.name, item, ours, theirs);
  };
  UErrorCode error = U_ZERO_ERROR;
  using NumberPtr = IcuPtr<UNumberFormat, unum_close>;
  const NumberPtr numbers(unum_open(UNUM_DECIMAL, nullptr, 0, locale.c_str(), nullptr, &error));
  const NumberPtr amounts(unum_open(UNUM_CURRENCY, nullptr, 0, locale.c_str(), nullptr, &error));
  const Text currency = items.text(LX_ITEM_INTERNATIONAL_CURRENCY);
  unum_setTextAttribute(amounts.get(), UNUM_CURRENCY_CODE, currency.c_str(), -1, &error);
  const Text digits = widen(std::to_string(ucurr_getDefaultFractionDigits(currency.c_str(), &error)));
  const struct {
    const char* name;
    int32_t item;
    Text theirs;
  } texts[] = {
      {"abbreviation", LX_ITEM_TERRITORY_ABBREVIATION, widen(std::string(uloc_getISO3Country(row.locale)))},
      {"name", LX_ITEM_TERRITORY_NAME, icu(uloc_getDisplayCountry, row.locale, row.locale)},
      {"decimal", LX_ITEM_DECIMAL, icu(unum_getSymbol, numbers.get(), UNUM_DECIMAL_SEPARATOR_SYMBOL)},
      {"thousands", LX_ITEM_THOUSANDS, icu(unum_getSymbol, numbers.get(), UNUM_GROUPING_SEPARATOR_SYMBOL)},
      {"monetary_decimal", LX_ITEM_MONETARY_DECIMAL,
       icu(unum_getSymbol, amounts.get(), UNUM_MONETARY_SEPARATOR_SYMBOL)},
      {"monetary_thousands", LX_ITEM_MONETARY_THOUSANDS,
       icu(unum_getSymbol, amounts.get(), UNUM_MONETARY_GROUPING_SEPARATOR_SYMBOL)},
      {"negative", LX_ITEM_NEGATIVE_SIGN, icu(unum_getSymbol, amounts.get(), UNUM_MINUS_SIGN_SYMBOL)},
      {"symbol", LX_ITEM_CURRENCY, icu(unum_getSymbol, amounts.get(), UNUM_CURRENCY_SYMBOL)},
      {"international", LX_ITEM_INTERNATIONAL_CURRENCY, icu(ucurr_forLocale, locale.c_str())},
  };
  for (const auto& text : texts) compare(text.name, items.text(text.item), text.theirs);
  const auto number = [&](int32_t item) { return widen(std::to_string(items.number(item))); };
  compare("digits", number(LX_ITEM_CURRENCY_DIGITS), digits);
  compare("international_digits", number(LX_ITEM_INTERNATIONAL_DIGITS), digits);
  compare("plus", number(LX_ITEM_POSITIVE_POSITION), number(LX_ITEM_NEGATIVE_POSITION));  // where the minus is
}

TEST(LocalePeers, LanguagesAndTerritoriesAsInIcu) {
  const Library library(LEXICOR_LOCALE_DIR);
  Differences differences;
  size_t compared = 0, shipped = 0;
  for (const auto& row : lexicor_import::kLanguages) compare_language(row, &differences), ++compared;
  for (const auto& row : lexicor_import::kTerritories) compare_territory(row, &differences), ++compared;
  for (const auto& object : lexicor_data::read_source_control(LEXICOR_DATA_DIR).objects)
    shipped += object.type <= lexicor_data::ObjectType::kTerritory;
  EXPECT_EQ(compared, shipped);
  differences.expect_listed();
}

}  // namespace
}  // namespace lx::test
