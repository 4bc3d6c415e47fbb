// The operating system's names of locales and its conventions, on a system runtime that the test makes.
#include <algorithm>
#include <climits>
#include <cstring>

#include "core/library_fixture.h"
#include "support/case_rows.h"
#include "support/forms.h"
#include "support/system_locale.h"
#include "support/tiny_codepages.h"

namespace lx::test {
namespace {

using Strings = std::vector<std::string>;

std::string mapped(const std::string& native, int32_t size = 132) {
  std::vector<char> buffer(static_cast<size_t>(std::max(size, 8)), '#');
  EXPECT_EQ(LXMapNativeLocale(native.c_str(), buffer.data(), size), buffer.data());
  return buffer.data();
}

TEST(NativeNames, TableAndMapping) {
  std::vector<std::pair<std::string, std::string>> rows;
  const auto note = [](void* user, const char* native, const char* locale) {
    static_cast<decltype(rows)*>(user)->emplace_back(native, locale);
    return 1;
  };
  EXPECT_EQ(LXEnumNativeLocales(note, &rows), LX_OK);
  EXPECT_FALSE(rows.empty());
  for (const auto& [native, locale] : rows) EXPECT_EQ(mapped(native), locale) << "each row is found";
  for (const CaseRow& row : case_rows("locale/native_names.txt")) {
    SCOPED_TRACE(row.where);
    EXPECT_EQ(mapped(row[0]), row[1]);
  }
  int calls = 0;
  const auto stop = [](void* user, const char*, const char*) { return ++*static_cast<int*>(user), 0; };
  LXEnumNativeLocales(stop, &calls);
  EXPECT_EQ(calls, 1);
  EXPECT_EQ(mapped("de_DE", 12), "German_Germ") << "cut to the buffer";
  EXPECT_EQ(mapped("de_DE.UTF-8", 1), "Unknown") << "whatever the size";
}

class NativeTest : public LibraryTest {
 protected:
  void SetUp() override {
    LibraryTest::SetUp();
    // Latin1 and US-ASCII under the names that the table knows; German is English here.
    TinyCodepage latin = tiny_single();
    directory.write_locale(
        {{367, "US-ASCII", ascii_codepage()}, {819, "Latin1", latin.file.sections}, tiny_shift().file});
    ASSERT_EQ(init(), LX_OK);
    for (const char* name : {"LC_ALL", "LANG"}) unsetenv(name);
    german = SystemLocale::nothing();
    german.frac_digits = 3;
    german.int_frac_digits = 4;
    german.p_cs_precedes = german.n_sep_by_space = 1;
    german.n_cs_precedes = german.p_sep_by_space = 0;
    german.n_sign_posn = 2;
    german.grouping = grouping;
    german.mon_grouping = mon_grouping;
    german.decimal_point = decimal;
    german.thousands_sep = thousands;
    german.mon_decimal_point = two_bytes;
    german.mon_thousands_sep = apostrophe;
    german.currency_symbol = euro;
    german.negative_sign = minus;
  }

  std::string item(LXLocale* locale, int32_t number) {
    char text[64];
    EXPECT_GT(LXGetLocaleTextInfo(locale, number, text, sizeof(text), 0), 0) << number;
    return text;
  }
  /// The numbers and the texts that the system can change.
  std::string conventions(LXLocale* locale) {
    std::string all;
    for (int32_t number : {63, 69, 70, 73, 74, 75, 76, 77, 78})
      all += std::to_string(LXGetLocaleNumInfo(locale, number, 0));
    for (int32_t number : {62, 68, 59, 60, 66, 67, 64, 71, 72}) all += ' ' + item(locale, number);
    return all;
  }

  char grouping[3] = "\3\3", mon_grouping[4] = {2, 3, CHAR_MAX, 9}, decimal[2] = ",", thousands[2] = ".";
  char two_bytes[3] = "ab", apostrophe[2] = "'", euro[2] = "\xA4", minus[2] = "~";
  lconv german;
  SystemLocale system;
};

TEST_F(NativeTest, UserLocale) {
  char buffer[132];
  system.known["da_DK"] = SystemLocale::nothing();
  system.current = "da_DK";
  const auto user = [&] {
    system.set.clear();
    return LXGetUserLocale(buffer, sizeof(buffer)) == 2 ? std::string(buffer) : "failed";
  };
  // The variables count only where the runtime adopts nothing; an empty one is none.
  const struct {
    const char *environment, *lang, *lc_all, *locale;
  } rows[] = {{"de_DE", nullptr, nullptr, "German_Germany.Latin1@Default"},
              {"", nullptr, nullptr, "English_UnitedStates.US-ASCII@Binary"},
              {"", "", "", "English_UnitedStates.US-ASCII@Binary"},
              {"", "fr_FR", "", "French_France.Latin1@Default"},
              {"", "fr_FR", "it_IT", "Italian_Italy.Latin1@Default"}};
  for (const auto& row : rows) {
    system.environment = row.environment;
    if (row.lang != nullptr) setenv("LANG", row.lang, 1);
    if (row.lc_all != nullptr) setenv("LC_ALL", row.lc_all, 1);
    EXPECT_EQ(user(), row.locale);
    EXPECT_EQ(system.set, (Strings{"", "da_DK"})) << "adopted, and put back";
    EXPECT_EQ(system.current, "da_DK");
  }

  // The longest name that can be kept, and one more.
  system.current = std::string(1023, 'x');
  EXPECT_EQ(user(), "Italian_Italy.Latin1@Default");
  EXPECT_EQ(system.set, (Strings{"", std::string(1023, 'x')}));
  system.current = std::string(1024, 'x');
  EXPECT_EQ(
      messages(RAS1_LEVEL_ERRORS, [&] { EXPECT_EQ(user(), "failed"); }),
      Strings{"Unable to save current locale to restore. len 1024 > 1024 '" + std::string(1024, 'x') + "'"});
  EXPECT_EQ(LXSetLocale(nullptr, LX_USER_LOCALE), LX_E_NO_NATIVE);
  EXPECT_EQ(system.set, Strings{}) << "the system's locale is left alone";

  // With LX_LANG it is not even asked for; a value as long as the buffer is not terminated.
  system.queries = 0;
  setenv("LX_LANG", "English@Binary", 1);
  memset(buffer, '#', sizeof(buffer));
  EXPECT_EQ(LXGetUserLocale(buffer, 7), 1);
  EXPECT_EQ(std::string(buffer, 8), "English#");
  EXPECT_EQ(LXSetLocale(nullptr, LX_USER_LOCALE), LX_OK);
  EXPECT_EQ(system.queries, 0u);
  EXPECT_EQ(system.set, Strings{});
}

TEST_F(NativeTest, ConventionsOfTheSystem) {
  system.known["de_DE"] = system.known["xx_YY"] = system.known["de_AT"] = german;
  system.known["de_AT"].mon_decimal_point = apostrophe;
  const struct {
    const char *codepage, *native, *conventions;
  } rows[] = {
      // A text of two bytes is no separator.
      {"Latin1", "de_DE", "234100132 3;3;0 2;3;0 , . . ' \xA4  ~"},
      {"Latin1", "de_AT", "234100132 3;3;0 2;3;0 , . ' ' \xA4  ~"},
      // Of another codepage, or of no known one: numbers and groupings only.
      {"US-ASCII", "de_DE", "234100132 3;3;0 2;3;0 . , . , $  -"},
      {"Latin1", "xx_YY", "234100132 3;3;0 2;3;0 . , . , $  -"},
      // A name that the system refuses: nothing.
      {"Latin1", "xx_XX", "222101030 3;0 3;0 . , . , $  -"},
  };
  for (const auto& row : rows) {
    SCOPED_TRACE(std::string(row.codepage) + " " + row.native);
    LXLocale* locale = LXGetLocale((std::string("English.") + row.codepage).c_str(), 0, nullptr);
    system.set.clear();
    LXMapNativeInfo(row.native, locale);
    EXPECT_EQ(system.set, (Strings{row.native, "C"}));
    EXPECT_EQ(conventions(locale), row.conventions);
    EXPECT_EQ(test::item(locale, 64), Units(1, item(locale, 64) == "$" ? '$' : 0x20AC));
    EXPECT_EQ(LXReleaseLocale(locale), 0);
    EXPECT_EQ(system.current, "C");
  }
}

TEST_F(NativeTest, GroupingInEbcdic) {
  system.known["de_DE"] = german;
  LXLocale* locale = LXGetLocale("English.TINY-SHIFT", 0, nullptr);
  LXMapNativeInfo("de_DE", locale);
  EXPECT_EQ(item(locale, 62), "\xF3\x5E\xF3\x5E\xF0");
  EXPECT_EQ(LXReleaseLocale(locale), 0);
}

TEST_F(NativeTest, UserLocaleAndConvertedNamesHaveTheConventions) {
  system.known["de_DE"] = german;
  system.environment = "de_DE";
  int32_t rc = -1;
  EXPECT_EQ(LXGetLocale(nullptr, LX_USER_LOCALE, &rc), nullptr);
  EXPECT_EQ(rc, LX_E_NO_LANGUAGE) << "no German here";
  for (LXLocale* locale : {LXGetLocale(nullptr, LX_USER_LOCALE | LX_FALLBACK, &rc),
                           LXConvertNativeLocale("de_DE", LX_FALLBACK | LX_TERRITORY_VALUES, &rc)}) {
    ASSERT_NE(locale, nullptr);
    EXPECT_EQ(item(locale, 88), "English_UnitedStates.Latin1@Binary");
    EXPECT_EQ(item(locale, 62) + item(locale, 59), "3;3;0,");
    EXPECT_EQ(LXReleaseLocale(locale), 0);
    EXPECT_EQ(system.current, "C");
  }
  EXPECT_EQ(LXConvertNativeLocale("de_DE", 0, &rc), nullptr);
  EXPECT_EQ(rc, LX_E_NO_LANGUAGE);
  system.set.clear();
  EXPECT_EQ(LXConvertNativeLocale("C", LX_USER_LOCALE, &rc), nullptr);
  EXPECT_EQ(rc, LX_E_INVALID);
  EXPECT_EQ(system.set, Strings{});
}

}  // namespace
}  // namespace lx::test
