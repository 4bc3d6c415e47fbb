// What the library writes it reads: numbers, amounts and times of every shipped language and territory, in UTF-8, in
// the codepages that the operating system's names give them and in some of those that have all of their letters, so
// that every codepage meets many, in all four forms, which write the same characters. What does not come back is what
// format_roundtrip_exceptions.txt lists. And where the names of the operating system lead, and what their codepages
// can hold.
#include <gtest/gtest.h>

#include <cmath>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <fstream>
#include <set>
#include <vector>

#include "compile_directory.h"
#include "directory/listed_differences.h"
#include "import/locale_table.h"
#include "support/forms.h"
#include "support/library.h"
#include "support/slowness.h"

namespace lx::test {
namespace {

struct Place {
  std::string pair;  ///< language_territory
  std::string codepage;
  size_t every;  ///< the part of the cases that it takes
  LocalePtr owner = locale_with(codepage, pair);
  LXLocale* l = owner.get();
  bool is(int32_t number) const { return LXGetLocaleNumInfo(l, number, 0) == 1; }
  /// A text as the codepage has it.
  template <class F>
  Units seen(const F& form, const Units& text) const {
    return decode(form, l, encode(form, l, text));
  }
  /// Whether a form can have this text: the plain one does not know shift bytes.
  template <class F>
  bool can(const F& form, const Units& text) const {
    return form.name != kPlain.name || !is(LX_ITEM_CODEPAGE_SHIFT) ||
           encode(kEx, l, text).find('\x0E') == std::string::npos;
  }
  /// Whether directives stand where formats of bytes look for them.
  bool has_directives(bool plain) const {
    const auto letters = encode(kEx, l, units("%#a"));
    return is(LX_ITEM_CODEPAGE_ASCII) || letters == "\x6C\x7B\x81" || (!plain && codepage == "IBM930");
  }
  /// Whether byte forms cut a name.
  bool has_long_name() const {
    for (int32_t number = LX_ITEM_DAY; number <= LX_ITEM_AFTERNOON; ++number)
      if (encode(kEx, l, item(l, number)).size() > 31) return true;
    return false;
  }
};

/// All that formats write in words.
Units names_of(LXLocale* l) {
  Units names;
  for (int32_t number = LX_ITEM_DAY; number <= LX_ITEM_LONG_DATE_FORMAT; ++number)
    if (number <= LX_ITEM_AFTERNOON || number >= LX_ITEM_TIME_FORMAT) names += item(l, number);
  return names;
}

struct RoundTrip {
  ListedDifferences differences;
  size_t cases = 0;

  /// Gives a case to all forms that can have its text.
  template <class Case>
  void run(const Place& place, const Units& whole, Case test) {
    const auto one = [&](const auto& form) {
      if (place.can(form, whole)) test(form);
    };
    in_all_forms(one);
  }
  void fail(const std::string& what, const Place& place, const std::string& form, const std::string& example) {
    differences.add(what, place.pair + "." + place.codepage + (form.empty() ? "" : "/" + form), example);
  }

  /// Of an amount the number is read, from its first digit to its last.
  void number(const Place& place, const Value& v) {
    LXLocale* const l = place.l;
    if (++cases % place.every != 0) return;
    const Units whole = write(kUnicode, l, v), digits = units("0123456789");
    const bool amount = v.kind == Value::kAmount;
    run(place, whole, [&](const auto& form) {
      const Units written = decode(form, l, write(form, l, v));
      EXPECT_EQ(LXGetError(l), LX_OK) << place.pair;
      if (written != place.seen(form, whole)) fail("characters", place, form.name, shown(written));
      const size_t first = amount ? written.find_first_of(digits) : 0, last = written.find_last_of(digits);
      const Units text = amount ? written.substr(first, last + 1 - first) : written;
      const auto exact = encode(form, l, text);
      const auto [value, end] = read(form, l, {exact.begin(), exact.end()}, v);
      const double expected = amount ? std::fabs(v.number) : v.number;
      const double most = v.kind == Value::kLong ? 0 : std::pow(10, -v.digits) + std::fabs(expected) * 1e-14;
      if (end == count_of(exact) && std::fabs(value - expected) <= most) return;
      const std::string example = shown(text) + " reads as " + std::to_string(value);
      if (end != static_cast<ptrdiff_t>(text.find(' '))) return fail("number", place, form.name, example);
      EXPECT_EQ(value, strtod(shown(text).c_str(), nullptr)) << example;
      differences.add(amount ? "amount" : "number", "blank", example);
    });
  }

  void time(const Place& place, const LXTime& t, const std::string& ascii_format) {
    LXLocale* const l = place.l;
    if (++cases % place.every != 0 && ascii_format != "%#c") return;  // which has all names
    const Units whole = write(kUnicode, l, t, units(ascii_format));
    run(place, whole, [&](const auto& form) {
      const auto format = encode(form, l, units(ascii_format));
      const auto text = write(form, l, t, format);
      const int32_t code = LXGetError(l);
      constexpr bool kBytes = sizeof(text[0]) == 1;
      if (code == LX_E_FORMAT && sizeof(text[0]) != 2 && !place.has_directives(form.name == kPlain.name))
        return differences.add("directives", place.codepage, ascii_format);
      const Units written = decode(form, l, text), expected = place.seen(form, whole);
      if (code != LX_OK || written != expected) {
        const bool cut = code == LX_OK && written.size() < expected.size() && kBytes && place.has_long_name();
        if (cut) return differences.add("name", "long", place.pair + "." + place.codepage);
        fail("time_characters", place, form.name, shown(written));
      }
      LXTime back{-1, -1, -1, -1, -1, -10000, -1, -1};  // what is not read cannot be written again
      const auto exact = std::vector(text.begin(), text.end());
      const auto count =
          form.read_time(l, &back, exact.data(), count_of(text), format.data(), count_of(format), 0);
      if (count != count_of(text) || write(form, l, back, format) != text)
        fail("time", place, form.name, ascii_format + " " + shown(written));
    });
  }
};

void numbers(RoundTrip* trip, const Place& place) {
  LXLocale* const l = place.l;
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
      trip->number(place, {Value::kLong, double(value), values, 0});
      trip->number(place, {Value::kLong, double(static_cast<uint32_t>(value)), values | LX_UNSIGNED, 0});
    }
    for (double value : {0.0, 0.5, -0.25, 7.0, 1234.5, -1234567.891, 99999.999999, -2.3e-5, 1e15, -1e300}) {
      trip->number(place, {Value::kDouble, value, values, digits});
      for (int32_t number : {LX_ITEM_CURRENCY_DIGITS, LX_ITEM_INTERNATIONAL_DIGITS}) {
        const uint32_t international = number == LX_ITEM_CURRENCY_DIGITS ? 0 : LX_INTERNATIONAL;
        const int32_t money_digits = LXGetLocaleNumInfo(l, number, static_cast<int32_t>(values));
        trip->number(place, {Value::kAmount, value, values | international, money_digits});
      }
    }
  }
}

void times(RoundTrip* trip, const Place& place) {
  for (const char* format : {"%c", "%#c", "%x", "%#x", "%X", "%x %A %j", "%#x, %H:%M", "%c %w",
                             "%Y-%m-%d %H:%M:%S", "%A %#d %B %Y, %I:%M:%S %p", "%a %b %d %#y", "%%%j%%%p%#I"}) {
    for (int n = 0; n < 12; ++n) {  // all months and weekdays, noon and midnight
      tm date{59 - n, n, n == 0 ? 12 : 2 * n % 22, 1 + 11 * n % 28, n, 70 + 5 * n, 0, 0, 0, 0, nullptr};
      timegm(&date);
      trip->time(place, fields_of(date), format);
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
  int count = 0;
  const auto objects = lexicor_data::read_source_control(LEXICOR_DATA_DIR).objects;
  constexpr int kPairs = 16;  // of those whose letters a codepage has, it takes one in so many
  std::map<std::string, int> met;
  for (const std::string& pair : pairs) {
    const Units names = names_of(locale_with("UTF-8", pair).get());
    for (const auto& object : objects) {
      if (object.type != lexicor_data::ObjectType::kCodepage) continue;
      const bool all = own.count(pair + "." + object.name) != 0 || object.name == "UTF-8";
      if (count++ % kSlowness != 0) continue;
      const Place place{pair, object.name, all ? 1U : 7U};
      if (!all && (place.seen(kEx, names) != names || met[object.name]++ % kPairs != 0)) continue;
      times(&trip, place);
      numbers(&trip, place);
    }
  }
  EXPECT_GT(trip.cases * kSlowness, 600000U);
  trip.differences.expect_listed("format_roundtrip_exceptions.txt");
}

/// The texts of a locale that its codepage cannot hold: "number text, number text".
std::string unwritable(const char* name) {
  int32_t rc = LX_OK;
  const LocalePtr locale(LXGetLocale(name, 0, &rc));
  EXPECT_TRUE(locale != nullptr) << name << ": " << rc;
  const LocalePtr utf8 = locale_with("UTF-8");
  std::string list;
  for (int32_t number = 1; locale && number <= LX_ITEM_LONG_DATE_FORMAT; ++number) {
    const Units text = item(locale.get(), number);
    if (decode(kPlain, locale.get(), encode(kPlain, locale.get(), text)) != text)
      list += (list.empty() ? "" : ", ") + std::to_string(number) + " " + encode(kPlain, utf8.get(), text);
  }
  return list;
}

// Each operating-system name leads to objects that the directory has. docs/native-names.md says of which of
// their texts its codepage holds not all characters; the codepage of a language holds them all.
TEST(NativeNames, LeadToLocalesWhoseTextsTheirCodepagesHold) {
  const Library library(LEXICOR_LOCALE_DIR);
  std::pair<size_t, std::string> all;  // names, and rows of the page
  const auto add = [](void* user, const char* native, const char* name) -> int32_t {
    auto& [names, rows] = *static_cast<std::pair<size_t, std::string>*>(user);
    const std::string list = unwritable(name), locale = name;
    const size_t dot = locale.find('.') + 1;
    const std::string codepage = locale.substr(dot, locale.find('@') - dot);
    if (!list.empty()) rows += std::string("| ") + native + " | " + codepage + " | " + list + " |\n";
    ++names;
    return 1;
  };
  LXEnumNativeLocales(add, &all);
  EXPECT_EQ(all.first, 107U);
  std::string listed, line;
  for (std::ifstream page(LEXICOR_DATA_DIR "/../docs/native-names.md"); std::getline(page, line);)
    if (line.rfind("| ", 0) == 0 && line.rfind("| Name", 0) != 0) listed += line + '\n';
  EXPECT_EQ(listed, all.second) << "the page's table, and what it must be";
  for (const auto& row : lexicor_import::kLanguages) EXPECT_EQ(unwritable(row.name), "") << row.name;
}

}  // namespace
}  // namespace lx::test
