// A territory from ICU's number symbols, date patterns, regions and currency amounts.
#include <unicode/ucurr.h>
#include <unicode/udat.h>
#include <unicode/uloc.h>
#include <unicode/unum.h>
#include <unicode/uregion.h>

#include <map>
#include <set>
#include <sstream>

#include "date_pattern.h"
#include "icu_text.h"
#include "locale_import.h"
#include "sense.h"

namespace lexicor_import {
namespace {

using lexicor_data::TerritorySource;

constexpr uint16_t kFirstOwnId = 1001;  ///< ISO 3166 numbers have three digits
constexpr uint16_t kNumberDigits = 2;

using Overrides = std::map<std::string, std::string>;

void add_overrides(const char* text, Overrides& overrides) {
  std::istringstream in(text);
  for (std::string part; std::getline(in, part, '|');) {
    const size_t sign = part.find('=');
    if (sign == std::string::npos) throw std::runtime_error("override " + part + " says nothing");
    if (!overrides.emplace(part.substr(0, sign), part.substr(sign + 1)).second)
      throw std::runtime_error("two overrides " + part.substr(0, sign));
  }
}

std::string country_of(const char* locale) {
  UErrorCode error = U_ZERO_ERROR;
  char code[ULOC_COUNTRY_CAPACITY] = {};
  uloc_getCountry(locale, code, sizeof code, &error);
  require(error, "country");
  return code;
}

/// What the territory's row and the facts say of it.
Overrides overrides_of(const Territory& row) {
  Overrides overrides;
  add_overrides(row.overrides, overrides);
  for (const Fact& fact : kFacts)
    if (country_of(row.locale) == fact.country) add_overrides(fact.overrides, overrides);
  return overrides;
}

/// Fraction digits by ISO 4217; CLDR has fewer where daily use has none.
uint16_t iso_fraction_digits(const std::u16string& currency) {
  static const std::set<std::u16string> none{u"BIF", u"CLP", u"DJF", u"GNF", u"ISK", u"JPY", u"KMF", u"KRW",
                                             u"PYG", u"RWF", u"UGX", u"VND", u"VUV", u"XAF", u"XOF", u"XPF"};
  static const std::set<std::u16string> three{u"BHD", u"IQD", u"JOD", u"KWD", u"LYD", u"OMR", u"TND"};
  return none.count(currency) != 0 ? 0 : three.count(currency) != 0 ? 3 : 2;
}

std::u16string widen(const std::string& text) {
  return {text.begin(), text.end()};
}

/// Takes an override out of the list, for the text that CLDR gives; false: there is none. One that CLDR has
/// come to agree with must leave the table.
bool take(Overrides& overrides, const char* key, std::u16string& text) {
  const auto found = overrides.find(key);
  if (found == overrides.end()) return false;
  const std::u16string instead = widen(found->second);
  if (instead == text) throw std::runtime_error(std::string("override ") + key + " is what CLDR says");
  text = instead;
  overrides.erase(found);
  return true;
}

/// The same for a number of one digit.
template <class Number>
void take_digit(Overrides& overrides, const char* key, Number& number) {
  std::u16string text = widen(std::to_string(number));
  if (take(overrides, key, text)) number = text.at(0) & 0xF;
}

class NumberFormat {
 public:
  NumberFormat(UNumberFormatStyle style, const std::string& locale) {
    UErrorCode error = U_ZERO_ERROR;
    format_.reset(unum_open(style, nullptr, 0, locale.c_str(), nullptr, &error));
    require(error, "number format");
  }

  void set_currency(const std::u16string& code) {
    UErrorCode error = U_ZERO_ERROR;
    unum_setTextAttribute(format_.get(), UNUM_CURRENCY_CODE, code.data(), static_cast<int32_t>(code.size()),
                          &error);
    require(error, "currency");
  }

  std::u16string symbol(UNumberFormatSymbol symbol) const {
    return ascii_signs(icu_text("number symbol", [&](UChar* out, int32_t room, UErrorCode* error) {
      return unum_getSymbol(format_.get(), symbol, out, room, error);
    }));
  }

  char16_t separator(UNumberFormatSymbol which) const {
    const std::u16string text = symbol(which);
    if (text.size() != 1 || text[0] >= 0x80) throw std::runtime_error("a separator is no ASCII character");
    return text[0];
  }

  std::u16string format(int32_t value) const {
    return ascii_signs(icu_text("amount", [&](UChar* out, int32_t room, UErrorCode* error) {
      return unum_format(format_.get(), value, out, room, nullptr, error);
    }));
  }

  /// "3;0", "3;2;0"; empty without grouping.
  std::u16string grouping() const {
    if (unum_getAttribute(format_.get(), UNUM_GROUPING_USED) == 0) return {};
    const int32_t first = unum_getAttribute(format_.get(), UNUM_GROUPING_SIZE);
    const int32_t second = unum_getAttribute(format_.get(), UNUM_SECONDARY_GROUPING_SIZE);
    std::string text = std::to_string(first) + ";";
    if (second > 0 && second != first) text += std::to_string(second) + ";";
    return widen(text + "0");
  }

 private:
  IcuPtr<UNumberFormat, unum_close> format_;
};

/// Where the symbol and the sign of an amount stand.
struct Layout {
  bool precedes = true;
  bool space = false;
  uint8_t position = 1;
};

/// Reads the layout off an amount of one unit. Around the number stand symbol, sign and blanks only.
Layout read_layout(const std::u16string& amount, const std::u16string& symbol) {
  constexpr char16_t kDigits[] = u"0123456789";
  const size_t at = amount.find(symbol), sign = amount.find(u'-');
  if (at == std::u16string::npos) throw std::runtime_error("an amount without its symbol");
  // A symbol may hold a full stop, so the number is looked for outside it.
  const bool precedes = amount.find_first_of(kDigits) > at;
  const size_t first = amount.find_first_of(kDigits), last = amount.find_last_of(kDigits);
  const size_t symbol_end = at + symbol.size();
  Layout layout;
  layout.precedes = precedes;
  layout.space = precedes ? amount[first - 1] == ' ' : amount[last + 1] == ' ';
  if (sign == std::u16string::npos) return layout;
  if (sign > last) {
    layout.position = !precedes && sign < at ? 3 : 2;
  } else if (precedes && sign >= symbol_end) {
    layout.position = 4;
  }
  return layout;
}

void read_currency(const std::string& locale, Overrides& overrides, TerritorySource& territory) {
  territory.international_currency = icu_text("currency", [&](UChar* out, int32_t room, UErrorCode* error) {
    return ucurr_forLocale(locale.c_str(), out, room, error);
  });
  take(overrides, "currency", territory.international_currency);
  NumberFormat amounts(UNUM_CURRENCY, locale);
  amounts.set_currency(territory.international_currency);
  territory.separators[3] = amounts.separator(UNUM_MONETARY_SEPARATOR_SYMBOL);
  territory.separators[4] = amounts.separator(UNUM_MONETARY_GROUPING_SEPARATOR_SYMBOL);
  territory.monetary_grouping = amounts.grouping();
  take(overrides, "monetary_grouping", territory.monetary_grouping);
  territory.currency = amounts.symbol(UNUM_CURRENCY_SYMBOL);
  const Layout positive = read_layout(amounts.format(1), territory.currency);
  const Layout negative = read_layout(amounts.format(-1), territory.currency);
  territory.flags[1] = positive.precedes;
  territory.flags[2] = positive.space;
  territory.flags[3] = negative.precedes;
  territory.flags[4] = negative.space;
  territory.positive_position = territory.negative_position = negative.position;
  territory.negative_sign = u"-";
  take(overrides, "symbol", territory.currency);

  UErrorCode error = U_ZERO_ERROR;
  const int32_t digits = ucurr_getDefaultFractionDigits(territory.international_currency.c_str(), &error);
  require(error, "fraction digits");
  territory.digits = {kNumberDigits, static_cast<uint16_t>(digits),
                      iso_fraction_digits(territory.international_currency)};
}

/// The format of the first style that is short enough; empty: there is none.
std::u16string format_of(const std::string& locale, bool time, int style, Notes& notes) {
  for (; style <= UDAT_SHORT; ++style) {
    UErrorCode error = U_ZERO_ERROR;
    const auto chosen = static_cast<UDateFormatStyle>(style);
    const IcuPtr<UDateFormat, udat_close> format(udat_open(time ? chosen : UDAT_NONE, time ? UDAT_NONE : chosen,
                                                           locale.c_str(), u"UTC", -1, nullptr, 0, &error));
    require(error, "date format");
    const std::u16string text =
        ascii_signs(rewrite_pattern(icu_text("pattern", [&](UChar* out, int32_t room, UErrorCode* status) {
          return udat_toPattern(format.get(), 0, out, room, status);
        })));
    if (lexicor_data::utf8_bytes(text) <= lexicor_data::kMaxFormatBytes) return text;
    notes.push_back(std::string(time ? "time" : "date") + " style " + std::to_string(style) + " is too long");
  }
  return {};
}

void read_region(const Territory& row, Overrides& overrides, TerritorySource& territory) {
  UErrorCode error = U_ZERO_ERROR;
  const URegion* region = uregion_getRegionFromCode(country_of(row.locale).c_str(), &error);
  require(error, "region");
  territory.abbreviation = widen(uloc_getISO3Country(row.locale));
  const bool other = take(overrides, "abbreviation", territory.abbreviation);
  if (!other && row.id < kFirstOwnId && row.id != uregion_getNumericCode(region)) {
    throw std::runtime_error("the identifier is not the country's number");
  }
  territory.name = plain(icu_text("country", [&](UChar* out, int32_t room, UErrorCode* status) {
    return uloc_getDisplayCountry(row.locale, row.locale, out, room, status);
  }));
  take(overrides, "name", territory.name);
}

}  // namespace

std::string territory_comment(const Territory& row) {
  std::string comment = source_comment(row.locale);
  comment.pop_back();  // the end of the line
  for (const Fact& fact : kFacts)
    if (country_of(row.locale) == fact.country)
      comment += std::string(" Since ") + fact.since + " " + fact.overrides + ": " + fact.source + ".";
  return comment + '\n';
}

TerritorySource import_territory(const Territory& row, Notes& notes) {
  const std::string locale = icu_locale(row.locale);
  Overrides overrides = overrides_of(row);
  TerritorySource territory;
  read_region(row, overrides, territory);
  territory.flags[0] = territory.flags[5] = territory.flags[6] = true;

  const NumberFormat numbers(UNUM_DECIMAL, locale);
  territory.separators[0] = numbers.separator(UNUM_DECIMAL_SEPARATOR_SYMBOL);
  territory.separators[1] = numbers.separator(UNUM_GROUPING_SEPARATOR_SYMBOL);
  territory.separators[2] = territory.separators[0] == ',' ? ';' : ',';
  territory.number_grouping = numbers.grouping();
  read_currency(locale, overrides, territory);

  territory.time_format = format_of(locale, true, UDAT_MEDIUM, notes);
  territory.short_date_format = format_of(locale, false, UDAT_SHORT, notes);
  territory.long_date_format = format_of(locale, false, UDAT_FULL, notes);
  take(overrides, "time", territory.time_format);
  take(overrides, "long_date", territory.long_date_format);
  if (territory.time_format.empty() || territory.long_date_format.empty())
    throw std::runtime_error("no format is short enough");
  take_digit(overrides, "positive_position", territory.positive_position);
  take_digit(overrides, "negative_position", territory.negative_position);
  if (!overrides.empty()) throw std::runtime_error("unknown override " + overrides.begin()->first);
  return territory;
}

}  // namespace lexicor_import
