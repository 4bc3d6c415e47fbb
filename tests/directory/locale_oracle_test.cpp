// Languages and territories against ICU with the same locale of CLDR: names, codes and case mapping, and
// numbers, amounts, times and dates as the library writes them, in every shipped territory and every language
// in its own. ICU is set up as the library writes everywhere: Latin digits, no rounding, plain signs and
// spaces. What else differs is what locale_differences.txt lists, each line with its reason.
#include <gtest/gtest.h>
#include <unicode/uchar.h>
#include <unicode/udat.h>
#include <unicode/uldnames.h>
#include <unicode/uloc.h>
#include <unicode/ulocdata.h>
#include <unicode/unistr.h>
#include <unicode/unum.h>
#include <unicode/uset.h>
#include <unicode/ustring.h>

#include <cmath>
#include <ctime>
#include <map>
#include <random>
#include <set>

#include "directory/listed_differences.h"
#include "import/icu_text.h"
#include "import/locale_table.h"
#include "support/forms.h"
#include "support/library.h"

namespace lx::test {
namespace {

using lexicor_import::ascii_signs;
using lexicor_import::icu_locale;
using lexicor_import::IcuPtr;
using lexicor_import::Language;
using lexicor_import::Territory;
using NumberPtr = IcuPtr<UNumberFormat, unum_close>;

using Text16 = std::u16string;

/// The text of an ICU function that ends in buffer, room and error.
template <class Function, class... Arguments>
Text16 icu(Function function, Arguments... arguments) {
  return lexicor_import::icu_text("ICU", [&](UChar* out, int32_t room, UErrorCode* error) {
    return function(arguments..., out, room, error);
  });
}

std::string utf8(const Text16& text) {
  std::string out;
  return ::icu::UnicodeString(text.data(), static_cast<int32_t>(text.size())).toUTF8String(out);
}

/// ASCII, or 16-bit Unicode of another type.
template <class Text>
Text16 widen(const Text& text) {
  return Text16(text.begin(), text.end());
}

using DatePtr = IcuPtr<UDateFormat, udat_close>;

/// The ways in which what is written may differ, as locale_differences.txt explains them. What ICU is asked, or
/// both texts, are changed accordingly.
const std::vector<std::string> kKinds = {
    "parentheses",  "sign_space",  "code_space",  "currency", "money_groups", "code_digits",  // amounts
    "one_language", "stand_alone", "day_periods", "era",      "two_digit_day"};               // times
using Kinds = std::set<std::string>;
bool has(const Kinds& kinds, const char* kind) {
  return kinds.count(kind) != 0;
}

Text16 with(Text16 text, const Text16& from, const Text16& to) {
  for (size_t at = 0; !from.empty() && (at = text.find(from, at)) != Text16::npos; at += to.size())
    text.replace(at, from.size(), to);
  return text;
}

/// A text of either side without what the kinds are about. `code`: that of the currency.
Text16 level(Text16 text, const Kinds& kinds, const Text16& code) {
  if (has(kinds, "code_space") && !code.empty()) text = with(with(text, code + u" ", code), u" " + code, code);
  if (has(kinds, "sign_space")) text = with(text, u" -", u"-");
  if (has(kinds, "two_digit_day")) text = with(text, u" 0", u" ");
  if (has(kinds, "parentheses") && text.front() == '(') text = u"-" + text.substr(1, text.size() - 2);
  return with(with(text, u" inf", u"inf"), u" nan", u"nan");
}

class Differences {
 public:
  void compare(const std::string& object, const std::string& item, const Text16& ours, const Text16& theirs) {
    if (ours != theirs) listed_.add(object, item, utf8(ours) + " / " + utf8(theirs));
  }
  /// `ours` against what `peer(kinds)` gives: where they differ, the fewest kinds that level both.
  template <class Peer>
  void compare_written(const std::string& place, const std::string& area, const Text16& ours, Peer peer,
                       const Text16& code = {}) {
    const auto equal = [&](const Kinds& kinds) {
      return level(ascii_signs(ours), kinds, code) == level(ascii_signs(peer(kinds)), kinds, code);
    };
    Kinds& last = last_[place + area];  // mostly those that the next value needs too
    if (equal({}) || (!last.empty() && equal(last))) return;
    Kinds kinds(kKinds.begin(), kKinds.end());
    const std::string example = utf8(ours) + " / " + utf8(peer({}));
    if (!equal(kinds)) return listed_.add(place, area, example + " / " + utf8(peer(kinds)));
    for (auto kind = kKinds.rbegin(); kind != kKinds.rend(); ++kind) {
      kinds.erase(*kind);
      if (!equal(kinds)) kinds.insert(*kind);
    }
    for (const std::string& kind : kinds) found_[{kind, area}].emplace(place, example);
    last = kinds;
  }
  /// Where a kind befalls a few, the list names them.
  void expect_listed() {
    for (const auto& [kind, examples] : found_) {
      std::string where = kind.second;
      for (const auto& [place, example] : examples)
        if (examples.size() < 6) where += (where == kind.second ? ":" : ",") + place;
      listed_.add(kind.first, where, examples.begin()->second);
    }
    listed_.expect_listed("locale_differences.txt");
  }

 private:
  ListedDifferences listed_;
  std::map<std::pair<std::string, std::string>, std::map<std::string, std::string>> found_;
  std::map<std::string, Kinds> last_;  ///< that were found at a place
};

/// ICU's numbers of a territory; the formats are kept.
struct NumberPeer {
  const Territory& row;
  LXLocale* l;
  Text16 code = widen(item(l, LX_ITEM_INTERNATIONAL_CURRENCY));
  std::map<std::pair<int, Kinds>, NumberPtr> formats{};

  Text16 operator()(UNumberFormatStyle style, int32_t digits, double value, const Kinds& kinds) {
    NumberPtr& format = formats[{style, kinds}];
    if (!format) format = open(style, kinds);
    const bool bare = style == UNUM_DECIMAL;
    if (bare) unum_setAttribute(format.get(), UNUM_FRACTION_DIGITS, digits);
    unum_setAttribute(format.get(), UNUM_DECIMAL_ALWAYS_SHOWN, digits != 0 || !bare);
    if (value == 0) value = 0;  // no minus zero
    if (std::isnan(value)) value = std::copysign(value, bare ? 1 : -1);
    return icu([&](UChar* out, int32_t room, UErrorCode* error) {
      if (!std::isfinite(value)) return unum_formatDouble(format.get(), value, out, room, nullptr, error);
      const std::string exact = std::to_string(value);
      const auto length = static_cast<int32_t>(exact.size());
      return unum_formatDecimal(format.get(), exact.c_str(), length, out, room, nullptr, error);
    });
  }

  NumberPtr open(UNumberFormatStyle style, const Kinds& kinds) const {
    UErrorCode error = U_ZERO_ERROR;
    NumberPtr format(unum_open(style, nullptr, 0, icu_locale(row.locale).c_str(), nullptr, &error));
    const auto symbol = [&](UNumberFormatSymbol which, const Text16& text) {
      unum_setSymbol(format.get(), which, text.data(), static_cast<int32_t>(text.size()), &error);
    };
    const bool money = style != UNUM_DECIMAL;
    if (has(kinds, "currency") && money) {
      unum_setTextAttribute(format.get(), UNUM_CURRENCY_CODE, code.data(), 3, &error);
      if (style == UNUM_CURRENCY) symbol(UNUM_CURRENCY_SYMBOL, widen(item(l, LX_ITEM_CURRENCY)));
    }
    if (has(kinds, "money_groups") && money) {
      const NumberPtr numbers = open(UNUM_DECIMAL, kinds);
      const int32_t size = unum_getAttribute(numbers.get(), UNUM_SECONDARY_GROUPING_SIZE);
      unum_setAttribute(format.get(), UNUM_SECONDARY_GROUPING_SIZE, size);
    }
    if (has(kinds, "code_digits") && style == UNUM_CURRENCY_ISO)
      unum_setAttribute(format.get(), UNUM_FRACTION_DIGITS,
                        LXGetLocaleNumInfo(l, LX_ITEM_INTERNATIONAL_DIGITS, 0));
    symbol(UNUM_INFINITY_SYMBOL, u"inf"), symbol(UNUM_NAN_SYMBOL, u"nan");
    unum_setAttribute(format.get(), UNUM_ROUNDING_MODE, UNUM_ROUND_DOWN);
    unum_setAttribute(format.get(), UNUM_MINIMUM_GROUPING_DIGITS, 1);
    EXPECT_TRUE(U_SUCCESS(error)) << row.name << u_errorName(error);
    return format;
  }
};

void compare_numbers(const Territory& row, std::mt19937* random, Differences* differences) {
  const LocalePtr locale = locale_with("UTF-8", std::string(row.language) + "_" + row.name);
  LXLocale* const l = locale.get();
  NumberPeer peer{row, l};
  const auto compare = [&](const char* area, UNumberFormatStyle style, const Value& v) {
    differences->compare_written(
        row.name, area, widen(write(kUnicode, l, v)),
        [&](const Kinds& kinds) { return peer(style, v.digits, v.number, kinds); }, peer.code);
  };
  std::vector<double> values{0,     -0.0,      0.5,      -0.25,        7,     -8,       999,
                             -1000, 1234.5,    -12345,   99999.999999, 1.239, -0.001,   1e15,
                             -1e23, 0.9999996, INFINITY, -INFINITY,    NAN,   INT32_MIN};
  for (int i = 0; i < 8; ++i) values.push_back(std::ldexp(static_cast<int32_t>((*random)()), 10 - i));
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

  Text16 operator()(UDateFormatStyle time, UDateFormatStyle date, Text16 pattern, UDate when,
                    const Kinds& kinds) {
    const auto open = [](UDateFormatStyle t, UDateFormatStyle d, const char* locale, const Text16& text) {
      UErrorCode error = U_ZERO_ERROR;
      const auto length = static_cast<int32_t>(text.size());
      return DatePtr(udat_open(t, d, icu_locale(locale).c_str(), u"UTC", -1, text.data(), length, &error));
    };
    DatePtr& format = formats[{Text16{char16_t(time + 2), char16_t(date + 2)} + pattern, kinds}];
    if (!format) {
      const DatePtr own = open(time, date, territory.locale, pattern);
      pattern = icu([&](UChar* out, int32_t room, UErrorCode* error) {
        return udat_toPattern(own.get(), 0, out, room, error);
      });
      if (has(kinds, "day_periods")) pattern = with(pattern, u"B", u"a");
      if (has(kinds, "era")) pattern = with(pattern, u"G ", u"");
      if (has(kinds, "stand_alone")) pattern = with(pattern, u"EEEE", u"cccc");
      const bool of_territory = territory.language == std::string(language.name) && !has(kinds, "one_language");
      format = open(UDAT_PATTERN, UDAT_PATTERN, of_territory ? territory.locale : language.locale, pattern);
    }
    return icu([&](UChar* out, int32_t room, UErrorCode* error) {
      return udat_format(format.get(), when, out, room, nullptr, error);
    });
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
  for (int i = 0; i < 16; ++i) {
    // All months, days of the week and halves of a day; then random ones to 2106.
    const time_t seconds = i < 12 ? i * 62 * 43200 + i % 2 * 43200 : static_cast<time_t>((*random)());
    tm date;
    gmtime_r(&seconds, &date);
    const LXTime t = fields_of(date);
    const auto ours = [&](const char* format) {
      return widen(write(kUnicode, locale.get(), t, units(format)));
    };
    EXPECT_EQ(ours("%c"), ours("%x") + u" " + ours("%X"));
    EXPECT_EQ(ours("%#c"), ours("%#x") + u" " + ours("%X"));
    for (const auto& area : areas)
      differences->compare_written(place, area.area, ours(area.format), [&](const Kinds& kinds) {
        return peer(area.time, area.date, area.pattern, static_cast<UDate>(seconds) * 1000, kinds);
      });
  }
}

/// The letters of a language that have case, each in place of x in a frame.
Text16 letters_of(const char* locale, const Text16& frame) {
  UErrorCode error = U_ZERO_ERROR;
  const IcuPtr<ULocaleData, ulocdata_close> data(ulocdata_open(locale, &error));
  const IcuPtr<USet, uset_close> set(
      ulocdata_getExemplarSet(data.get(), nullptr, USET_ADD_CASE_MAPPINGS, ULOCDATA_ES_STANDARD, &error));
  Text16 letters;
  for (char16_t value = 0x21; value != 0xFFFF; ++value)
    if (uset_contains(set.get(), value) && u_hasBinaryProperty(value, UCHAR_CHANGES_WHEN_CASEMAPPED))
      letters += with(frame, u"?", Text16(1, value));
  return letters;
}

void compare_language(const Language& row, Differences* differences) {
  const LocalePtr locale = locale_with("UTF-8", row.name);
  const auto compare = [&](const std::string& what, const Text16& ours, const Text16& theirs) {
    differences->compare(row.name, what, ours, theirs);
  };
  UErrorCode error = U_ZERO_ERROR;
  char likely[ULOC_FULLNAME_CAPACITY] = {};
  uloc_addLikelySubtags(row.locale, likely, sizeof likely, &error);
  std::string code(row.locale, strcspn(row.locale, "_"));
  for (char& c : code) c = static_cast<char>(c & ~0x20);
  const IcuPtr<ULocaleDisplayNames, uldn_close> names(uldn_open(row.locale, ULDN_DIALECT_NAMES, &error));
  const auto text = [&](int32_t number) { return widen(item(locale.get(), number)); };
  compare("abbreviation", text(LX_ITEM_LANGUAGE_ABBREVIATION), widen(code));
  compare("territory", text(LX_ITEM_TERRITORY_ABBREVIATION), widen(std::string(uloc_getISO3Country(likely))));
  compare("name", text(LX_ITEM_LANGUAGE_NAME), icu(uldn_localeDisplayName, names.get(), row.locale));
  Text16 dates;
  for (int32_t number = LX_ITEM_DAY; number < LX_ITEM_MORNING; ++number) dates += text(number);
  const std::pair<std::string, Text16> frames[] = {
      {"words", u"?? ??, "}, {"sentences", u"??. "}, {"letters", u"? ?\u0307 "}};
  for (const auto& [kind, frame] : frames) {
    const Text16 source = letters_of(row.locale, frame) + dates;
    const auto length = static_cast<int32_t>(source.size());
    for (bool upper : {true, false}) {
      const Units given(source.begin(), source.end());
      const auto ours = [&](LXUChar* out, int32_t room) {
        return LXMapStringU(locale.get(), out, room, given.data(), length, upper ? LX_MAP_UPPER : LX_MAP_LOWER);
      };
      const auto theirs = [&](UChar* out, int32_t room, UErrorCode* status) {
        return (upper ? u_strToUpper : u_strToLower)(out, room, source.data(), length, row.locale, status);
      };
      compare((upper ? "upper_" : "lower_") + kind, widen(made<LXUChar>(ours, 3 * source.size())), icu(theirs));
    }
  }
}

TEST(LocalePeers, LanguagesAndTerritoriesAsInIcu) {
  const Library library(LEXICOR_LOCALE_DIR);
  Differences differences;
  std::mt19937 random(7);
  for (const Language& language : lexicor_import::kLanguages) compare_language(language, &differences);
  for (const Territory& territory : lexicor_import::kTerritories) {
    const LocalePtr locale = locale_with("UTF-8", std::string(territory.language) + "_" + territory.name);
    const auto text = [&](int32_t number) { return widen(item(locale.get(), number)); };
    differences.compare(territory.name, "abbreviation", text(LX_ITEM_TERRITORY_ABBREVIATION),
                        widen(std::string(uloc_getISO3Country(territory.locale))));
    differences.compare(territory.name, "name", text(LX_ITEM_TERRITORY_NAME),
                        icu(uloc_getDisplayCountry, territory.locale, territory.locale));
    compare_numbers(territory, &random, &differences);
    for (const Language& language : lexicor_import::kLanguages)
      if (territory.language == std::string(language.name) || language.territory == std::string(territory.name))
        compare_times(language, territory, &random, &differences);
  }
  differences.expect_listed();
}

}  // namespace
}  // namespace lx::test
