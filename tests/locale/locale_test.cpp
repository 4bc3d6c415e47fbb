// Locale handles: names in all three forms, defaults and fallback, the default locale, enumeration, the
// operating system's name, release; and items, of which tests/cases/items.txt says what may be set to what.
#include <cstdio>
#include <set>

#include "core/tiny_directory.h"
#include "support/case_rows.h"
#include "support/forms.h"

namespace lx::test {
namespace {

class LocaleTest : public LibraryTest {
 protected:
  // English, French, and three whose defaults are not there, although objects of other types stand where they
  // would be.
  void init_directory() {
    directory.write_locale({{367, "US-ASCII", ascii_codepage()},
                            {850, "Tiny", tiny_shift_jis().file.sections},
                            {930, "Shift", tiny_shift().file.sections}},
                           {{{2, LX_LANGUAGE, "French"}, language(250, 850, 5)},
                            {{3, LX_LANGUAGE, "NoTerritory"}, language(9999, 367, 0)},
                            {{4, LX_LANGUAGE, "NoCodepage"}, language(840, 9999, 0)},
                            {{5, LX_LANGUAGE, "NoSort"}, language(840, 367, 9999)},
                            {{250, LX_TERRITORY, "France"}, payload_of(kBuiltInTerritory)},
                            {{5, LX_SORT, "Default"}, SortBuilder{}.payload()}});
    ASSERT_EQ(init(), LX_OK);
  }

  /// The identifiers of a locale's four objects, and its flags.
  static std::string describe(const LXLocale* locale) {
    if (locale == nullptr) return "none";
    std::string text;
    for (const LXObject* object : {locale->language, locale->territory, locale->codepage, locale->sort})
      text += (object != nullptr ? std::to_string(object->disk.id) : "-") + " ";
    char flags[16];
    snprintf(flags, sizeof(flags), "%X", locale->flags & 0x1C0u);
    return text + flags;
  }

  using Create = LXLocale* (*)(const std::string& name, int32_t flags, int32_t* rc);
  template <class Unit, auto kDoor>
  static LXLocale* create(const std::string& name, int32_t flags, int32_t* rc) {
    return kDoor(widened<Unit>(name).c_str(), flags, rc);
  }
  static constexpr Create kForms[] = {create<char, LXGetLocale>, create<LXWChar, LXGetLocaleW>,
                                      create<LXUChar, LXGetLocaleU>};
};

// A digest is of the data in use: equal for equal data, whoever holds them; zeros for binary order. What cannot be
// answered writes nothing.
TEST_F(LocaleTest, Digests) {
  init_directory();
  ASSERT_EQ(LXSetLocale("English", 0), LX_OK);
  using Digest = std::vector<uint8_t>;
  const auto digest = [](LXLocale* locale, int32_t type, size_t size, int32_t code) {
    Digest bytes(size, 0xEE);
    const int32_t written = LXGetLocaleDigest(locale, type, bytes.data(), static_cast<int32_t>(size));
    EXPECT_EQ(LXGetError(locale), code);
    EXPECT_EQ(written, code == LX_OK ? LX_DIGEST_BYTES : 0);
    return bytes;
  };
  const auto of_name = [&](const char* name, int32_t type) {
    LXLocale* locale = LXGetLocale(name, 0, nullptr);
    const Digest bytes = digest(locale, type, LX_DIGEST_BYTES, LX_OK);
    LXReleaseLocale(locale);
    return bytes;
  };
  EXPECT_EQ(of_name("English_France", LX_TERRITORY), of_name("English", LX_TERRITORY));
  EXPECT_NE(of_name("French", LX_LANGUAGE), of_name("English", LX_LANGUAGE));
  EXPECT_NE(of_name("English.Tiny", LX_CODEPAGE), of_name("English.Shift", LX_CODEPAGE));
  EXPECT_NE(of_name("English@Default", LX_SORT), Digest(LX_DIGEST_BYTES, 0));
  EXPECT_EQ(of_name("English@Binary", LX_SORT), Digest(LX_DIGEST_BYTES, 0));
  for (int32_t type : {-1, LX_SORT + 1})
    EXPECT_EQ(digest(nullptr, type, LX_DIGEST_BYTES, LX_E_INVALID), Digest(LX_DIGEST_BYTES, 0xEE));
  EXPECT_EQ(digest(nullptr, LX_SORT, LX_DIGEST_BYTES - 1, LX_E_SIZE), Digest(LX_DIGEST_BYTES - 1, 0xEE));
}

TEST_F(LocaleTest, Names) {
  init_directory();
  for (const CaseRow& row : case_rows("locale/locale_names.txt")) {
    const int32_t flags = row.number(1);
    const bool of_user = (flags & LX_USER_LOCALE) != 0;
    if (of_user) setenv("LX_LANG", row[0].c_str(), 1);
    for (const Create& create_in_form : kForms) {
      SCOPED_TRACE(row.where + ", form " + std::to_string(&create_in_form - kForms));
      const size_t blocks = hooks.live_blocks();
      int32_t rc = -1;
      LXLocale* locale = create_in_form(of_user ? "English" : row[0], flags, &rc);
      EXPECT_EQ(locale != nullptr ? describe(locale) : std::to_string(rc), row[2]);
      EXPECT_EQ(locale != nullptr, rc == LX_OK);
      if (locale != nullptr) {
        EXPECT_EQ(LXGetError(locale), LX_OK);
        EXPECT_EQ(LXReleaseLocale(locale), 0);
      } else if (rc == LX_E_INVALID) {
        EXPECT_EQ(hooks.live_blocks(), blocks);
      }
    }
  }
  // Wide names are not cut to bytes.
  const LXWChar name[] = {'F' + 0x100, 'r', 'e', 'n', 'c', 'h', 0};
  const LXWChar marks[] = {'F', 'r', 'e', 'n', 'c', 'h', '_' + 0x10000, 'x', 0};
  for (const LXWChar* wide : {name, marks}) EXPECT_EQ(LXSetLocaleW(wide, 0), LX_E_NO_LANGUAGE);
  // No name is an empty one, and a code need not be asked for.
  for (LXLocale* locale : {LXGetLocale(nullptr, 0, nullptr), LXGetLocaleW(nullptr, 0, nullptr),
                           LXGetLocaleU(nullptr, 0, nullptr)}) {
    EXPECT_EQ(describe(locale), "1 840 367 - C0");
    EXPECT_EQ(LXReleaseLocale(locale), 0);
  }
  EXPECT_EQ(LXGetLocaleW(name, 0, nullptr), nullptr);
}

// The 16-bit name goes through the common codepage; where there is none, the name is empty.
TEST_F(LocaleTest, UnicodeNamesNeedTheCommonCodepage) {
  directory.write_locale({{850, "Tiny", tiny_shift_jis().file.sections}},
                         {{{2, LX_LANGUAGE, "French"}, language(840, 850, 0)}});
  ASSERT_EQ(init(), LX_OK);
  int32_t rc = -1;
  LXLocale* locale = create<LXUChar, LXGetLocaleU>("French", 0, &rc);
  EXPECT_EQ(describe(locale), "1 840 850 - 80");
  EXPECT_EQ(rc, LX_OK);
  LXReleaseLocale(locale);
}

TEST_F(LocaleTest, DefaultLocale) {
  init_directory();
  setenv("LX_LANG", "German", 1);
  const auto set = [](auto* door, const auto* name, int32_t flags) {
    const int32_t code = door(name, flags);
    return std::to_string(code) + ": " + describe(lx::globals.default_locale);
  };
  EXPECT_EQ(set(LXSetLocale, "English", 0), "0: 1 840 367 - C0");
  // What fails leaves the previous one.
  EXPECT_EQ(set(LXSetLocale, "French", 0x40), "2: 1 840 367 - C0");
  EXPECT_EQ(set(LXSetLocale, "French_X", 0), "34: 1 840 367 - C0");
  EXPECT_EQ(set(LXSetLocaleW, widened<LXWChar>("X").c_str(), 0), "31: 1 840 367 - C0");
  EXPECT_EQ(set(LXSetLocaleU, widened<LXUChar>("X").c_str(), 0), "31: 1 840 367 - C0");
  EXPECT_EQ(set(LXSetLocale, static_cast<const char*>(nullptr), LX_USER_LOCALE), "31: 1 840 367 - C0");

  EXPECT_EQ(set(LXSetLocaleW, widened<LXWChar>("French").c_str(), 0), "0: 2 250 850 5 0");
  EXPECT_EQ(set(LXSetLocaleU, widened<LXUChar>("French.Shift").c_str(), 0), "0: 2 250 930 5 100");
  EXPECT_EQ(set(LXSetLocale, "German", LX_FALLBACK), "0: 1 840 367 - C0");
  // Beside the objects loaded meanwhile there is one locale, as before.
  const size_t blocks = hooks.live_blocks();
  EXPECT_EQ(LXSetLocale("English", 0), LX_OK);
  EXPECT_EQ(hooks.live_blocks(), blocks);
}

TEST_F(LocaleTest, OperatingSystemName) {
  init_directory();
  for (const CaseRow& row : case_rows("locale/system_names.txt")) {
    SCOPED_TRACE(row.where);
    LXLocale* locale = LXGetLocale(row[0].c_str(), 0, nullptr);
    char buffer[12] = "#";
    EXPECT_EQ(LXConvertLocale(locale, buffer, row.number(1)), row[2] == "C");
    EXPECT_EQ(buffer, row[2]);
    EXPECT_EQ(LXGetError(locale), row[2] == "C" ? LX_OK : LX_E_NO_NATIVE);
    LXReleaseLocale(locale);
  }
}

/// That the names come with their types up to the fourth, which is the last one. A byte that is not ASCII becomes
/// `unit`.
template <class Unit, class Door>
void expect_names(Door* enumerate, Unit unit) {
  std::vector<std::pair<int32_t, std::basic_string<Unit>>> names,
      expected{{0, widened<Unit>("English")},
               {1, widened<Unit>("UnitedStates")},
               {2, unit + widened<Unit>(std::string(32, 'x'))},
               {3, widened<Unit>("Last")}};
  const auto add = [](void* user, int32_t type, const Unit* name) {
    auto& all = *static_cast<decltype(names)*>(user);
    all.emplace_back(type, name);
    return all.size() == 4 ? 0 : 7;
  };
  EXPECT_EQ(enumerate(add, &names), 0);
  EXPECT_EQ(names, expected);
}

TEST_F(LocaleTest, Enumeration) {
  directory.write("cp_00367.nls", object_file(ascii_codepage()));
  directory.write("control.nls", control_file({{1, LX_LANGUAGE, "English"},
                                               {840, LX_TERRITORY, "UnitedStates"},
                                               {367, LX_CODEPAGE, "\xE9" + std::string(32, 'x')},
                                               {2, LX_SORT, "Last"},
                                               {3, LX_SORT, "Behind"}}));
  ASSERT_EQ(init(), LX_OK);
  expect_names(LXEnumLocales, '\xE9');
  expect_names(LXEnumLocalesW, LXWChar{0xE9});    // byte by byte, without a sign
  expect_names(LXEnumLocalesU, LXUChar{0xFFFD});  // through the common codepage
}

// An item is a text or a number, and the other functions refuse it.
TEST_F(LocaleTest, EachItemIsATextOrANumber) {
  ASSERT_EQ(init("/nonexistent"), LX_W_DEFAULTS);
  ASSERT_EQ(LXSetLocale("", 0), LX_OK);
  const std::set<int32_t> numbers{1, 5, 9, 11, 58, 63, 69, 70, 73, 74, 75, 76, 77, 78, 82, 83, 84, 85, 86, 87};
  for (int32_t item = -1; item <= LX_ITEM_LOCALE_STRING + 1; ++item) {
    SCOPED_TRACE(item);
    const bool is_number = numbers.count(item) != 0;
    const bool is_text = !is_number && item > 0 && item <= LX_ITEM_LOCALE_STRING;
    EXPECT_EQ(LXGetLocaleNumInfo(nullptr, item, 0) != -1, is_number);
    EXPECT_EQ(LXGetError(nullptr), is_number ? LX_OK : LX_E_ITEM);
    in_all_forms([&](const auto& form) {
      typename std::decay_t<decltype(form)>::Unit text[40];
      EXPECT_EQ(form.get_item(nullptr, item, text, 40, 0) != -1, is_text);
      EXPECT_EQ(LXGetError(nullptr), is_text ? LX_OK : LX_E_ITEM);
    });
  }
}

// Beyond what the codepage has, the U form keeps the caller's text, and the others have the substitution.
TEST_F(LocaleTest, TextsThatTheCodepageHasNot) {
  write_tiny_directory(directory);
  ASSERT_EQ(init(), LX_OK);
  LXLocale* locale = LXGetLocale("English_UnitedStates.TINY-SINGLE", 0, nullptr);
  const Units any{'A', 0x3041, 0x20AC, 0x4E9C, 0xE0};
  ASSERT_EQ(LXSetLocaleTextInfoU(locale, 64, any.data(), count_of(any), 0), 1);
  EXPECT_EQ(item(locale, 64), any);
  char bytes[9];
  LXWChar codes[9];
  EXPECT_EQ(LXGetLocaleTextInfo(locale, 64, bytes, 9, 0), 6);
  EXPECT_STREQ(bytes, "A?\xA4?\xE0");
  EXPECT_EQ(LXGetLocaleTextInfoW(locale, 64, codes, 9, 0), 6);
  EXPECT_EQ(Text<LXWChar>(codes), (Text<LXWChar>{'A', '?', 0xA4, '?', 0xE0}));
  ASSERT_EQ(LXSetLocaleNumInfo(locale, 5, kElsewhereId), 1);
  EXPECT_EQ(item(locale, 64), any) << "what was set stays";
  EXPECT_EQ(messages(RAS1_LEVEL_INPUT, [&] { LXSetLocaleTextInfo(locale, 64, "EUR!", 3, 0); }),
            std::vector<std::string>{"type = 64, buffer size = 3, data = EUR"});
  EXPECT_EQ(LXReleaseLocale(locale), 0);
  // Of a text that the end cuts the Shift-Out goes too: what is written behind it would be read in that state.
  locale = LXGetLocale("English_UnitedStates.TINY-SHIFT", 0, nullptr);
  ASSERT_EQ(LXSetLocaleTextInfoEx(locale, 64, "\xC1\x0E\x44", LX_SHIFT_SINGLE, 2, 0), 1);
  EXPECT_EQ(LXGetLocaleTextInfo(locale, 64, bytes, 9, 0), 2);
  EXPECT_EQ(LXReleaseLocale(locale), 0);
}

}  // namespace
}  // namespace lx::test
