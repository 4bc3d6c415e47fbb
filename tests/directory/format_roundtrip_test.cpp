// What the library writes it reads: numbers, amounts and times of every shipped language and territory, in
// every codepage that has all of their letters, in all four forms, which write the same characters. What does
// not come back is what format_roundtrip_exceptions.txt lists.
#include <gtest/gtest.h>

#include <cmath>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <set>
#include <vector>

#include "compile.h"
#include "directory/listed_differences.h"
#include "import/locale_table.h"
#include "support/forms.h"
#include "support/library.h"

namespace lx::test {
namespace {

/// An amount without its symbol and the blanks beside it, its sign in front: what the number reader takes.
Units bare(const Units& negative, Units text, const Units& symbol) {
  const auto erase = [&](const Units& part) {
    const size_t at = text.find(part);
    if (at != Units::npos) text.erase(at, part.size());
    return at != Units::npos;
  };
  EXPECT_TRUE(erase(symbol)) << shown(text);
  const bool parentheses = erase(units("(")) && erase(units(")"));
  const bool below_zero = erase(negative) || parentheses;
  while (!text.empty() && text.back() == ' ') text.pop_back();
  text.erase(0, text.find_first_not_of(' '));
  return (below_zero ? negative : Units()) + text;
}

struct Place {
  std::string pair;  ///< language_territory
  std::string codepage;
  size_t every;  ///< the part of the cases that it takes
  LocalePtr locale = locale_with(codepage, pair);
  LXLocale* get() const { return locale.get(); }
  bool is(int32_t number) const { return LXGetLocaleNumInfo(get(), number, 0) == 1; }
  /// A text as the codepage has it.
  template <class F>
  Units seen(const F& form, const Units& text) const {
    return decode(form, get(), encode(form, get(), text));
  }
  /// Whether a form can have this text: the plain one does not know shift bytes.
  template <class F>
  bool can(const F& form, const Units& text) const {
    return form.name != kPlain.name || !is(LX_ITEM_CODEPAGE_SHIFT) ||
           encode(kEx, get(), text).find('\x0E') == std::string::npos;
  }
  bool has_names() const {
    Units names;
    for (int32_t number = LX_ITEM_DAY; number <= LX_ITEM_LONG_DATE_FORMAT; ++number)
      if (number <= LX_ITEM_AFTERNOON || number >= LX_ITEM_TIME_FORMAT) names += item(get(), number);
    return seen(kEx, names) == names;
  }
  /// Whether directives stand where formats look for them.
  bool has_directives(bool plain) const {
    const auto letters = encode(kEx, get(), units("%#a"));
    return is(LX_ITEM_CODEPAGE_ASCII) || letters == "\x6C\x7B\x81" ||
           (!plain && codepage == "IBM930" && letters == "\x6C\x7B\x62");
  }
};

struct RoundTrip {
  ListedDifferences differences;
  size_t trips = 0, cases = 0;

  template <class F>
  void number(const F& form, const Place& place, const Value& v, const Units& whole) {
    LXLocale* const l = place.get();
    ++trips;
    Units text = decode(form, l, write(form, l, v));
    EXPECT_EQ(LXGetError(l), LX_OK) << place.pair;
    if (text != place.seen(form, whole)) fail("characters", place, form.name, shown(text));
    if (v.kind == Value::kAmount) {
      const bool local = (v.flags & LX_INTERNATIONAL) == 0;
      const Units symbol = item(l, local ? LX_ITEM_CURRENCY : LX_ITEM_INTERNATIONAL_CURRENCY);
      text = bare(item(l, LX_ITEM_NEGATIVE_SIGN), text, place.seen(form, symbol));
    }
    const auto bytes = encode(form, l, text);
    const auto [value, end] = read(form, l, {bytes.begin(), bytes.end()}, v);
    const double most = v.kind == Value::kLong ? 0 : std::pow(10, -v.digits) + std::fabs(v.number) * 1e-14;
    if (end == count_of(bytes) && std::fabs(value - v.number) <= most) return;
    const std::string example = shown(text) + " reads as " + std::to_string(value);
    if (end != static_cast<ptrdiff_t>(text.find(' '))) return fail("number", place, form.name, example);
    EXPECT_EQ(value, strtod(shown(text).c_str(), nullptr)) << example;
    differences.add(v.kind == Value::kAmount ? "grouped_amount" : "grouped_number",
                    place.pair.substr(place.pair.find('_') + 1), example);
  }

  template <class F>
  void time(const F& form, const Place& place, const LXTime& t, const std::string& ascii_format,
            const Units& whole) {
    LXLocale* const l = place.get();
    ++trips;
    const auto format = encode(form, l, units(ascii_format));
    const auto text = write(form, l, t, format);
    const int32_t code = LXGetError(l);
    if (code == LX_E_FORMAT && sizeof(typename F::Unit) != 2 && !place.has_directives(form.name == kPlain.name))
      return differences.add("directives", place.codepage, ascii_format);
    const Units expected = place.seen(form, whole);
    if (const Units written = decode(form, l, text); code != LX_OK || written != expected) {
      const bool cut = code == LX_OK && written.size() < expected.size() && sizeof(typename F::Unit) == 1;
      fail(cut ? "name" : "time_characters", place, cut ? "" : form.name, shown(written));
    }
    LXTime back{-1, -1, -1, -1, -1, -10000, -1, -1};  // what is not read cannot be written again
    const std::vector<typename F::Unit> exact(text.begin(), text.end());
    const auto count =
        form.read_time(l, &back, exact.data(), count_of(text), format.data(), count_of(format), 0);
    if (count != count_of(text) || write(form, l, back, format) != text)
      fail("time", place, form.name, ascii_format + " " + shown(decode(form, l, text)));
  }

  /// Whether a place takes the next case.
  bool takes(const Place& place) { return ++cases % place.every == 0; }
  /// Gives a case to all forms that can have its text.
  template <class Case>
  void run(const Place& place, const Units& whole, Case test) {
    const auto one = [&](const auto& form) {
      if (place.can(form, whole)) test(form);
    };
    in_all_forms(one);
  }

  void fail(const char* what, const Place& place, const std::string& form, const std::string& example) {
    differences.add(what, place.pair + "." + place.codepage + (form.empty() ? "" : "/" + form), example);
  }
};

void numbers(RoundTrip* trip, const Place& place) {
  LXLocale* const l = place.get();
  const auto check = [&](const Value& v) {
    if (!trip->takes(place)) return;
    const Units whole = write(kUnicode, l, v);
    trip->run(place, whole, [&](const auto& form) { trip->number(form, place, v, whole); });
  };
  const struct {
    uint32_t values;
    int32_t digits;
    const char* grouping;
  } settings[] = {{LX_TERRITORY_VALUES, 2, "0"}, {0, 0, "3;0"}, {0, 6, "0"}};
  for (const auto& [values, digits, grouping] : settings) {
    for (int32_t number : {LX_ITEM_GROUPING, LX_ITEM_MONETARY_GROUPING})
      ASSERT_EQ(LXSetLocaleTextInfoU(l, number, units(grouping).c_str(), -1, 0), 1);
    for (int32_t number : {LX_ITEM_DIGITS, LX_ITEM_CURRENCY_DIGITS, LX_ITEM_INTERNATIONAL_DIGITS})
      ASSERT_EQ(LXSetLocaleNumInfo(l, number, digits), 1);
    for (int32_t value : {0, 7, -8, 999, -1000, 1234567, -20406080, INT32_MAX, INT32_MIN}) {
      check({Value::kLong, double(value), values, 0});
      check({Value::kLong, double(static_cast<uint32_t>(value)), values | LX_UNSIGNED, 0});
    }
    for (double value : {0.0, 0.5, -0.25, 7.0, 1234.5, -1234567.891, 99999.999999, -2.3e-5, 1e15, -1e300}) {
      check({Value::kDouble, value, values, digits});
      for (int32_t number : {LX_ITEM_CURRENCY_DIGITS, LX_ITEM_INTERNATIONAL_DIGITS}) {
        const uint32_t international = number == LX_ITEM_CURRENCY_DIGITS ? 0 : LX_INTERNATIONAL;
        const int32_t money_digits = LXGetLocaleNumInfo(l, number, static_cast<int32_t>(values));
        check({Value::kAmount, value, values | international, money_digits});
      }
    }
  }
}

void times(RoundTrip* trip, const Place& place) {
  LXLocale* const l = place.get();
  for (const char* format : {"%c", "%#c", "%x", "%#x", "%X", "%x %A %j", "%#x, %H:%M", "%c %w",
                             "%Y-%m-%d %H:%M:%S", "%A %#d %B %Y, %I:%M:%S %p", "%a %b %d %#y", "%%%j%%%p%#I"}) {
    for (int n = 0; n < 12; ++n) {  // all months and weekdays, noon and midnight
      if (!trip->takes(place) && strcmp(format, "%#c") != 0) continue;  // which has all names
      tm date{59 - n, n, n == 0 ? 12 : 2 * n % 22, 1 + 11 * n % 28, n, 70 + 5 * n, 0, 0, 0, 0, nullptr};
      timegm(&date);
      const LXTime t = fields_of(date);
      const Units whole = write(kUnicode, l, t, units(format));
      trip->run(place, whole, [&](const auto& form) { trip->time(form, place, t, format, whole); });
    }
  }
}

TEST(FormatRoundTrip, EveryLocale) {
  const Library library(LEXICOR_LOCALE_DIR);
  std::set<std::string> pairs, own;
  for (const auto& row : lexicor_import::kTerritories) pairs.insert(std::string(row.language) + "_" + row.name);
  for (const auto& row : lexicor_import::kLanguages) pairs.insert(std::string(row.name) + "_" + row.territory);
  const auto add = [](void* user, const char*, const char* name) -> int32_t {
    return static_cast<std::set<std::string>*>(user)->insert(std::string(name, strchr(name, '@'))), 1;
  };
  LXEnumNativeLocales(add, &own);
  for (const std::string& name : own) pairs.insert(name.substr(0, name.find('.')));
  RoundTrip trip;
  size_t ebcdic = 0, shift = 0;
  const auto objects = lexicor_data::read_source_control(LEXICOR_DATA_DIR).objects;
  for (const std::string& pair : pairs)
    for (const auto& object : objects) {
      if (object.type != lexicor_data::ObjectType::kCodepage) continue;
      const bool all = own.count(pair + "." + object.name) != 0 || object.name == "UTF-8";
      const Place place{pair, object.name, all ? 1U : 7U};
      if (!all && !place.has_names()) continue;
      shift += place.is(LX_ITEM_CODEPAGE_SHIFT);
      ebcdic += !place.is(LX_ITEM_CODEPAGE_ASCII);
      times(&trip, place);
      numbers(&trip, place);
    }
  EXPECT_GT(ebcdic, 1500U);
  EXPECT_GT(shift, 250U);
  EXPECT_GT(trip.trips, 400000U);
  trip.differences.expect_listed("format_roundtrip_exceptions.txt");
}

}  // namespace
}  // namespace lx::test
