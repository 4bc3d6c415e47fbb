// Numbers, amounts, times and dates as the library writes them against ICU's own, with the conventions and
// patterns that CLDR has for the same territory: every shipped territory, and every language in its own. What
// differs is of the kinds that format_differences.txt lists, each with its reason.
#include <gtest/gtest.h>
#include <unicode/unum.h>

#include <cmath>
#include <ctime>
#include <map>
#include <random>

#include "directory/icu_peer.h"
#include "directory/listed_differences.h"
#include "import/locale_table.h"
#include "support/library.h"
#include "support/forms.h"

namespace lx::test {
namespace {

using lexicor_import::Language;
using lexicor_import::Territory;
using NumberPtr = lexicor_import::IcuPtr<UNumberFormat, unum_close>;

/// The ways in which the library may differ, as format_differences.txt explains them. What ICU is asked, or
/// both texts, are changed accordingly.
// clang-format off
enum Kind {
  kLatinDigits, kNoBreakSpace, kDirection, kMinusSign, kApostrophe, kFourDigits, kCut, kDecimalEnd, kExactDigits,
  kMinusZero, kNotFinite, kParentheses, kSignSpace, kCodeSpace, kCurrency, kOneLanguage, kStandAlone,
  kDayPeriods, kEra, kTwoDigitDay, kMoneyGroups, kCodeDigits, kKinds
};
constexpr const char* kNames[kKinds] = {
  "latin_digits", "no_break_space", "direction", "minus_sign", "apostrophe", "four_digits", "cut", "decimal_end",
  "exact_digits", "minus_zero", "not_finite", "parentheses", "sign_space", "code_space", "currency",
  "one_language", "stand_alone", "day_periods", "era", "two_digit_day", "money_groups", "code_digits"};
// clang-format on
using Kinds = uint32_t;
constexpr bool has(Kinds kinds, Kind kind) {
  return (kinds >> kind & 1) != 0;
}

void replace_all(Text16* text, const Text16& from, const Text16& to) {
  for (size_t at = 0; !from.empty() && (at = text->find(from, at)) != Text16::npos; at += to.size())
    text->replace(at, from.size(), to);
}

/// Changes a text of either side. `code`: that of the currency.
void level(Text16* text, Kinds kinds, const Text16& code) {
  const struct {
    Kind kind;
    Text16 from, to;
  } changes[] = {
      {kNoBreakSpace, u"\u00A0", u" "}, {kNoBreakSpace, u"\u202F", u" "}, {kDirection, u"\u200E", u""},
      {kDirection, u"\u200F", u""},     {kDirection, u"\u061C", u""},     {kMinusSign, u"\u2212", u"-"},
      {kApostrophe, u"\u2019", u"'"},   {kCodeSpace, code + u" ", code},  {kCodeSpace, u" " + code, code},
      {kSignSpace, u" -", u"-"},        {kNotFinite, u" inf", u"inf"},    {kNotFinite, u" nan", u"nan"},
      {kTwoDigitDay, u" 0", u" "},
  };
  if (code.empty()) kinds &= ~(1U << kCodeSpace);
  for (const auto& change : changes)
    if (has(kinds, change.kind)) replace_all(text, change.from, change.to);
  if (has(kinds, kParentheses) && text->front() == '(') *text = u"-" + text->substr(1, text->size() - 2);
}

/// The differences, gathered by kind and area.
class Differences {
 public:
  /// `ours` against what `peer(kinds)` gives: where they differ, the kinds that are needed to level both.
  template <class Peer>
  void compare(const std::string& place, const std::string& area, const Text16& ours, Peer peer,
               const Text16& code = {}) {
    ++compared;
    const auto equal = [&](Kinds kinds) {
      Text16 left = ours, right = peer(kinds);
      level(&left, kinds, code);
      level(&right, kinds, code);
      return left == right;
    };
    if (equal(0)) return;
    Kinds kinds = (1U << kKinds) - 1;
    const std::string example = utf8(ours) + " / " + utf8(peer(0));
    if (!equal(kinds)) return other_.add("other", place + "/" + area, example + " / " + utf8(peer(kinds)));
    for (int kind = kKinds; kind-- > 0;)
      if (equal(kinds & ~(1U << kind))) kinds &= ~(1U << kind);
    for (int kind = 0; kind < kKinds; ++kind)
      if (has(kinds, static_cast<Kind>(kind))) found_[{kNames[kind], area}].emplace(place, example);
  }
  /// Where a kind befalls a few, the list names them.
  void expect_listed() const {
    ListedDifferences all = other_;
    for (const auto& [kind, examples] : found_) {
      std::string where = kind.second;
      for (const auto& [place, example] : examples)
        if (examples.size() < 6) where += (where == kind.second ? ":" : ",") + place;
      all.add(kind.first, where, examples.begin()->second);
    }
    all.expect_listed("format_differences.txt");
  }
  size_t compared = 0;

 private:
  ListedDifferences other_;
  std::map<std::pair<std::string, std::string>, std::map<std::string, std::string>> found_;
};

std::string icu_name(const char* locale, Kinds kinds) {
  return has(kinds, kLatinDigits) ? lexicor_import::icu_locale(locale)
                                  : std::string(locale) + "@calendar=gregorian";
}

/// ICU's numbers of a territory; the formats are kept.
struct NumberPeer {
  const Territory& row;
  LXLocale* l;
  Text16 code = widen(item(l, LX_ITEM_INTERNATIONAL_CURRENCY));
  std::map<std::pair<int, Kinds>, NumberPtr> formats{};

  Text16 operator()(UNumberFormatStyle style, int32_t digits, double value, Kinds kinds) {
    NumberPtr& format = formats[{style, kinds}];
    if (!format) format = open(style, kinds);
    const bool bare = style == UNUM_DECIMAL;
    if (bare) unum_setAttribute(format.get(), UNUM_FRACTION_DIGITS, digits);
    unum_setAttribute(format.get(), UNUM_DECIMAL_ALWAYS_SHOWN,
                      has(kinds, kDecimalEnd) && (digits != 0 || !bare));
    if (has(kinds, kMinusZero) && value == 0) value = 0;
    if (has(kinds, kNotFinite) && std::isnan(value)) value = std::copysign(value, bare ? 1 : -1);
    const std::string exact = has(kinds, kExactDigits) && std::isfinite(value) ? std::to_string(value) : "";
    const auto length = static_cast<int32_t>(exact.size());
    return icu([&](UChar* out, int32_t room, UErrorCode* error) {
      return length == 0 ? unum_formatDouble(format.get(), value, out, room, nullptr, error)
                         : unum_formatDecimal(format.get(), exact.c_str(), length, out, room, nullptr, error);
    });
  }

  NumberPtr open(UNumberFormatStyle style, Kinds kinds) const {
    UErrorCode error = U_ZERO_ERROR;
    NumberPtr format(unum_open(style, nullptr, 0, icu_name(row.locale, kinds).c_str(), nullptr, &error));
    const auto symbol = [&](UNumberFormatSymbol which, const Text16& text) {
      unum_setSymbol(format.get(), which, text.data(), static_cast<int32_t>(text.size()), &error);
    };
    if (has(kinds, kCurrency) && style != UNUM_DECIMAL) {
      unum_setTextAttribute(format.get(), UNUM_CURRENCY_CODE, code.data(), 3, &error);
      if (style == UNUM_CURRENCY) symbol(UNUM_CURRENCY_SYMBOL, widen(item(l, LX_ITEM_CURRENCY)));
    }
    if (has(kinds, kMoneyGroups) && style != UNUM_DECIMAL) {
      const NumberPtr numbers = open(UNUM_DECIMAL, kinds);
      const int32_t size = unum_getAttribute(numbers.get(), UNUM_SECONDARY_GROUPING_SIZE);
      unum_setAttribute(format.get(), UNUM_SECONDARY_GROUPING_SIZE, size);
    }
    if (has(kinds, kCodeDigits) && style == UNUM_CURRENCY_ISO)
      unum_setAttribute(format.get(), UNUM_FRACTION_DIGITS,
                        LXGetLocaleNumInfo(l, LX_ITEM_INTERNATIONAL_DIGITS, 0));
    if (has(kinds, kNotFinite)) symbol(UNUM_INFINITY_SYMBOL, u"inf"), symbol(UNUM_NAN_SYMBOL, u"nan");
    if (has(kinds, kCut)) unum_setAttribute(format.get(), UNUM_ROUNDING_MODE, UNUM_ROUND_DOWN);
    unum_setAttribute(format.get(), UNUM_MINIMUM_GROUPING_DIGITS,
                      has(kinds, kFourDigits) ? 1 : UNUM_MINIMUM_GROUPING_DIGITS_AUTO);
    EXPECT_TRUE(U_SUCCESS(error)) << row.name << u_errorName(error);
    return format;
  }
};

void compare_numbers(const Territory& row, std::mt19937* random, Differences* differences) {
  const LocalePtr locale = locale_with("UTF-8", std::string(row.language) + "_" + row.name);
  LXLocale* const l = locale.get();
  NumberPeer peer{row, l};
  const auto compare = [&](const char* area, UNumberFormatStyle style, const Value& v) {
    differences->compare(
        row.name, area, widen(write(kUnicode, l, v)),
        [&](Kinds kinds) { return peer(style, v.digits, v.number, kinds); }, peer.code);
  };
  std::vector<double> values{0,     -0.0,      0.5,      -0.25,        7,     -8,       999,
                             -1000, 1234.5,    -12345,   99999.999999, 1.239, -0.001,   1e15,
                             -1e23, 0.9999996, INFINITY, -INFINITY,    NAN,   INT32_MIN};
  for (int i = 0; i < 20; ++i) values.push_back(std::ldexp(static_cast<int32_t>((*random)()), 10 - i));
  for (double value : values) {
    if (std::fabs(value) < 0x1p31)
      compare("integer", UNUM_DECIMAL, {Value::kLong, std::trunc(value) + 0, 0, 0});
    compare("number", UNUM_DECIMAL, {Value::kDouble, value, 0, LXGetLocaleNumInfo(l, LX_ITEM_DIGITS, 0)});
    compare("amount", UNUM_CURRENCY, {Value::kAmount, value, 0, 0});
    compare("international", UNUM_CURRENCY_ISO, {Value::kAmount, value, LX_INTERNATIONAL, 0});
  }
}

/// ICU's times of a territory in a language, by CLDR's pattern of a style or by a pattern; the formats are
/// kept.
struct TimePeer {
  const Language& language;
  const Territory& territory;
  std::map<std::pair<Text16, Kinds>, DatePtr> formats{};

  Text16 operator()(UDateFormatStyle time, UDateFormatStyle date, Text16 pattern, UDate when, Kinds kinds) {
    DatePtr& format = formats[{Text16{char16_t(time + 2), char16_t(date + 2)} + pattern, kinds}];
    if (!format) {
      const DatePtr own = open_date(time, date, icu_name(territory.locale, kinds), pattern);
      pattern = icu([&](UChar* out, int32_t room, UErrorCode* error) {
        return udat_toPattern(own.get(), 0, out, room, error);
      });
      if (has(kinds, kDayPeriods)) replace_all(&pattern, u"B", u"a");
      if (has(kinds, kEra)) replace_all(&pattern, u"G ", u"");
      if (has(kinds, kStandAlone)) replace_all(&pattern, u"EEEE", u"cccc");
      const bool of_territory = territory.language == std::string(language.name) && !has(kinds, kOneLanguage);
      const char* const texts = of_territory ? territory.locale : language.locale;
      format = open_date(UDAT_PATTERN, UDAT_PATTERN, icu_name(texts, kinds), pattern);
    }
    return formatted(format, when);
  }
};

void compare_times(const Language& language, const Territory& territory, std::mt19937* random,
                   Differences* differences) {
  const std::string place = std::string(language.name) + "_" + territory.name;
  const LocalePtr locale = locale_with("UTF-8", place);
  TimePeer peer{language, territory};
  const struct {
    const char *area, *format;
    UDateFormatStyle time, date;
    const char16_t* pattern;
  } areas[] = {
      {"time", "%X", UDAT_MEDIUM, UDAT_NONE, u""},
      {"short_date", "%x", UDAT_NONE, UDAT_SHORT, u""},
      {"long_date", "%#x", UDAT_NONE, UDAT_FULL, u""},
      {"words", "%a %A %b %B %p", UDAT_PATTERN, UDAT_PATTERN, u"EEE EEEE MMM MMMM a"},
      {"fields", "%d %#d %H %#H %I %#I %m %#m %M %S %y %Y", UDAT_PATTERN, UDAT_PATTERN,
       u"dd d HH H hh h MM M mm ss yy yyyy"},
  };
  for (int i = 0; i < 40; ++i) {
    const auto seconds = static_cast<time_t>((*random)());  // to 2106
    tm date;
    gmtime_r(&seconds, &date);
    const LXTime t = fields_of(date);
    const auto ours = [&](const char* format) {
      return widen(write(kUnicode, locale.get(), t, units(format)));
    };
    EXPECT_EQ(ours("%c"), ours("%x") + u" " + ours("%X"));
    EXPECT_EQ(ours("%#c"), ours("%#x") + u" " + ours("%X"));
    for (const auto& area : areas)
      differences->compare(place, area.area, ours(area.format), [&](Kinds kinds) {
        return peer(area.time, area.date, area.pattern, static_cast<UDate>(seconds) * 1000, kinds);
      });
  }
}

TEST(FormatPeers, NumbersAndTimesAsInIcu) {
  const Library library(LEXICOR_LOCALE_DIR);
  Differences differences;
  std::mt19937 random(7);
  for (const Territory& territory : lexicor_import::kTerritories) {
    compare_numbers(territory, &random, &differences);
    for (const Language& language : lexicor_import::kLanguages)
      if (territory.language == std::string(language.name) || language.territory == std::string(territory.name))
        compare_times(language, territory, &random, &differences);
  }
  EXPECT_GT(differences.compared, 20000U);
  differences.expect_listed();
}

}  // namespace
}  // namespace lx::test
