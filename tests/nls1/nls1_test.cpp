// The process interface. A process is initialised once, so every case runs in a process of its own, which ends
// through its exit routines: those of the library, and of a leak checker, are part of what is tested.
#include "nls1.h"

#include <atomic>
#include <clocale>
#include <thread>

#include "core/library_fixture.h"
#include "support/case_rows.h"

/// The code that LXInit fails with, which is called through --wrap; 0: it goes on.
namespace lx::test {
int32_t init_failure;
}

extern "C" {
int32_t __real_LXInit(const char*, LXAllocHook, LXFreeHook, void*, uint32_t);
int32_t __wrap_LXInit(const char* directory, LXAllocHook allocate, LXFreeHook release, void* context,
                      uint32_t options) {
  if (lx::test::init_failure != 0) return lx::test::init_failure;
  return __real_LXInit(directory, allocate, release, context, options);
}
}

namespace lx::test {
namespace {

using Strings = std::vector<std::string>;

constexpr int kThreads = 8;
constexpr char kEnglish[] = "English_UnitedStates.US-ASCII@Binary";
constexpr char kJapanese[] = "Japanese_Japan.JapanEUC@Binary";
constexpr int32_t kJapaneseInJapan = NLS1_LANGUAGE_TERRITORY(2, 392);

std::string name_of(LXLocale* locale) {
  char name[160] = "none";
  NLS1_GetLocaleTextInfo(locale, LX_ITEM_LOCALE_STRING, name, sizeof(name), 0);
  return name;
}
std::string thread_name() {
  LXLocale* locale = NLS1_PrivateFunction_GetThreadLocale();
  return locale != nullptr ? name_of(locale) : "null";
}

/// That there is no library for any service; the table of doors says what each of them answers.
void expect_refusals() {
  EXPECT_EQ(NLS1_PrivateFunction_GetThreadLocale(), nullptr);
  EXPECT_EQ(NLS1_SetLocale(1, 0, 0), LX_E_NOT_INITIALIZED);
}

class Nls1Test : public LibraryTest {
 protected:
  void SetUp() override {
    LibraryTest::SetUp();
    for (const char* variable : {"NLS1_LOCALEDIR", "LC_ALL", "LANG", "LX_TRACE"}) unsetenv(variable);
  }

  /// English and Japanese with what they need, and a sort that is none.
  void write_directory() {
    const ByteString territory = payload_of(kBuiltInTerritory);
    directory.write_locale({{367, "US-ASCII", ascii_codepage()}, {954, "JapanEUC", ascii_codepage()}},
                           {{{2, LX_LANGUAGE, "Japanese"}, language(392, 954, 0)},
                            {{392, LX_TERRITORY, "Japan"}, territory},
                            {{40001, LX_TERRITORY, "Far"}, territory},
                            {{5, LX_SORT, "Default"}, {}}});
    directory.write_text("alias.txt", "JapanEUC ujis\n");
    setenv("NLS1_LOCALEDIR", directory.path().c_str(), 1);
  }

  /// The last message of `action` at a level.
  static std::string said(uint32_t level, const std::function<void()>& action) {
    const Strings texts = messages(level, action);
    return texts.empty() ? "" : texts.back();
  }
};

// Each makes its first call at the same moment, has a locale of its own, changes it, and ends.
TEST_F(Nls1Test, EightThreads) {
  write_directory();
  setenv("LC_ALL", "C.UTF-8", 1);
  expect_in_child("threads", exit, [] {
    std::atomic<int> ready{0}, changed{0};
    std::vector<std::thread> threads;
    const auto meet = [](std::atomic<int>& arrived) {
      for (++arrived; arrived < kThreads;) std::this_thread::yield();
    };
    for (int i = 0; i < kThreads; ++i) {
      threads.emplace_back([&, i] {
        const std::string name = i % 2 == 0 ? kJapanese : kEnglish;
        meet(ready);
        EXPECT_EQ(i % 3 == 0 ? NLS1_GetLanguageId("Japanese", nullptr) : 2, 2);
        EXPECT_EQ(thread_name(), kEnglish);
        EXPECT_EQ(NLS1_SetLocaleFromNative(i % 2 == 0 ? "ja_JP.eucJP" : "C", NLS1_THREAD), LX_OK);
        LXLocale* mine = NLS1_PrivateFunction_GetThreadLocale();
        EXPECT_EQ(NLS1_SetLocaleNumInfo(mine, LX_ITEM_DIGITS, 10 + i), 1);
        meet(changed);
        EXPECT_EQ(NLS1_PrivateFunction_GetThreadLocale(), mine);
        EXPECT_EQ(name_of(mine), name);
        EXPECT_EQ(NLS1_GetLocaleNumInfo(mine, LX_ITEM_DIGITS, 0), 10 + i);
        LXLocale* own = NLS1_GetLocale(kJapaneseInJapan, 0, 0, nullptr);
        EXPECT_EQ(name_of(own), kJapanese);
        EXPECT_EQ(LXReleaseLocale(own), 0);
      });
    }
    for (std::thread& thread : threads) thread.join();
    EXPECT_STREQ(setlocale(LC_ALL, nullptr), "C") << "the system's locale is as it was";
    EXPECT_EQ(name_of(nullptr), kEnglish);
  });
}

TEST_F(Nls1Test, ThreadsReleaseTheirLocales) {
  write_directory();
  expect_in_child("blocks", _exit, [this] {
    // The program's own initialisation comes first, so the blocks are its hooks'.
    ASSERT_EQ(init(), LX_OK);
    EXPECT_EQ(thread_name(), kEnglish);
    const size_t blocks = hooks.live_blocks();
    std::thread([] { EXPECT_EQ(thread_name(), kEnglish); }).join();
    std::thread([] { EXPECT_EQ(NLS1_SetLocaleFromNative("C", NLS1_THREAD), LX_OK); }).join();
    EXPECT_EQ(hooks.live_blocks(), blocks);
    EXPECT_EQ(LXTerm(), LX_OK);
    EXPECT_EQ(thread_name(), kEnglish) << "the program's last use is not the process's";
    std::thread([] {
      EXPECT_EQ(thread_name(), kEnglish);
      EXPECT_EQ(LXTerm(), LX_OK);
      expect_refusals();
    }).join();
    EXPECT_EQ(hooks.wrong_frees(), 0u);
    expect_refusals();
  });  // what the last LXTerm left behind are handles that nobody may release
}

TEST_F(Nls1Test, WithoutALibrary) {
  expect_in_child("initialisation fails", exit, [] {
    atexit([] {
      if (LXTerm() != LX_OK) _exit(4);
    });
    init_failure = LX_E_NOT_INITIALIZED;
    EXPECT_EQ(messages(RAS1_LEVEL_PROCESS, expect_refusals),
              (Strings{"Unable to determine location of locale definitions\n",
                       "Unable to initialize Lexicor, rc = 11"}));
    init_failure = 0;
    expect_refusals();  // it is not tried again
    // The program's own initialisation, which the library's exit routines leave alone.
    EXPECT_EQ(LXInit(nullptr, nullptr, nullptr, nullptr, 0), LX_W_DEFAULTS);
    expect_refusals();
  });
  write_directory();
  expect_in_child("after the end of the process", exit, [] {
    // Registered before the library's, so it runs after them.
    atexit([] {
      expect_refusals();
      if (HasFailure()) _exit(4);
    });
    EXPECT_EQ(thread_name(), kEnglish);
    EXPECT_EQ(NLS1_SetLocale(kJapaneseInJapan, 0, 0), LX_OK);
    EXPECT_EQ(NLS1_SetLocaleFromNative("ja_JP.eucJP", NLS1_THREAD), LX_OK);
  });
}

TEST_F(Nls1Test, LocalesFromIdentifiers) {
  write_directory();
  expect_in_child("creation", exit, [] {
    for (const CaseRow& row : case_rows("nls1/locale_identifiers.txt")) {
      SCOPED_TRACE(row.where);
      const int32_t both = NLS1_LANGUAGE_TERRITORY(row.number(0), row.number(1));
      const int32_t codepage = row.number(2), flags = row.number(3);
      int32_t rc = -1;
      LXLocale* locale = NLS1_GetLocale(both, codepage, flags, &rc);
      EXPECT_EQ(locale != nullptr ? name_of(locale) : std::to_string(rc), row[4]);
      EXPECT_EQ(locale != nullptr, rc == LX_OK);
      LXReleaseLocale(locale);
      if (row.fields.size() > 5) {
        EXPECT_EQ(said(RAS1_LEVEL_DETAIL, [&] { NLS1_GetLocale(both, codepage, flags, nullptr); }), row[5]);
      }
      // The process's default: undefined flags are taken off.
      ASSERT_EQ(NLS1_SetLocale(0, 0, 0), LX_OK);
      const int32_t set_code = rc == LX_E_INVALID ? LX_OK : rc;
      EXPECT_EQ(NLS1_SetLocale(both, codepage, flags | NLS1_PROCESS), set_code);
      EXPECT_EQ(name_of(nullptr), rc == LX_OK ? row[4] : kEnglish);
      // The thread's locale: never, and the process's then neither.
      for (int32_t scope : {NLS1_THREAD, NLS1_THREAD | NLS1_PROCESS}) {
        ASSERT_EQ(NLS1_SetLocale(0, 0, 0), LX_OK);
        EXPECT_EQ(NLS1_SetLocale(both, codepage, flags | scope), set_code == LX_OK ? LX_E_INVALID : set_code);
        EXPECT_EQ(name_of(nullptr), kEnglish);
        EXPECT_EQ(thread_name(), kEnglish);
      }
    }
  });
}

TEST_F(Nls1Test, NativeLocales) {
  write_directory();
  expect_in_child("native", exit, [] {
    int32_t rc = -1;
    LXLocale* locale = NLS1_ConvertNativeLocale("ja_JP.eucJP", 0, &rc);
    EXPECT_EQ(rc, LX_OK);
    EXPECT_EQ(name_of(locale), kJapanese);
    EXPECT_EQ(NLS1_GetLocaleNumInfo(locale, LX_ITEM_DEFAULT_CODEPAGE, 0), 954) << "a number here";
    const auto set = [&](int32_t category, int32_t flags, int32_t code) {
      EXPECT_EQ(NLS1_SetNativeFromLocale(locale, category, flags), code);
    };
    EXPECT_EQ(said(RAS1_LEVEL_ERRORS, [&] { set(LC_NUMERIC, 0, LX_E_NO_NATIVE); }),
              "NLS1_ConvertLocale failed with rc = 32");
    set(LC_NUMERIC, LX_FALLBACK, LX_OK);
    EXPECT_EQ(said(RAS1_LEVEL_ERRORS, [&] { set(99, LX_FALLBACK, LX_E_NO_NATIVE); }),
              "setlocale failed to setlocale to C");
    LXReleaseLocale(locale);
    for (const char* unknown : {"xx_XX", "", static_cast<const char*>(nullptr)}) {
      EXPECT_EQ(NLS1_ConvertNativeLocale(unknown, 0, &rc), nullptr);
      EXPECT_EQ(rc, LX_E_NO_LANGUAGE);
      EXPECT_EQ(NLS1_SetLocaleFromNative(unknown, NLS1_THREAD), LX_E_NO_LANGUAGE);
    }
    EXPECT_EQ(said(RAS1_LEVEL_ERRORS, [] { NLS1_ConvertNativeLocale("xx_XX", 0, nullptr); }),
              "LXConvertNativeLocale failed for xx_XX with rc 31");
    if (setlocale(LC_ALL, "C.UTF-8") != nullptr) {
      EXPECT_EQ(NLS1_SetNativeLocale(kJapaneseInJapan, 0, LC_CTYPE, 0), LX_E_NO_NATIVE);
      EXPECT_EQ(NLS1_SetNativeLocale(NLS1_LANGUAGE_TERRITORY(1, 840), 367, LC_CTYPE, 0), LX_OK);
      EXPECT_STREQ(setlocale(LC_CTYPE, nullptr), "C");
      EXPECT_STREQ(setlocale(LC_TIME, nullptr), "C.UTF-8");
    }
    EXPECT_EQ(NLS1_SetNativeLocale(392, 0, LC_CTYPE, 0), LX_E_NO_LANGUAGE);

    // The name for the process begins with the territory: no language is called Japan.
    EXPECT_EQ(NLS1_SetLocaleFromNative("ja_JP.eucJP", NLS1_PROCESS), LX_E_NO_LANGUAGE);
    EXPECT_EQ(name_of(nullptr), kEnglish);
    EXPECT_EQ(thread_name(), kEnglish);
    EXPECT_EQ(NLS1_SetLocaleFromNative("ja_JP.eucJP", NLS1_PROCESS | NLS1_THREAD | LX_FALLBACK), LX_OK);
    EXPECT_EQ(name_of(nullptr), "English_UnitedStates.JapanEUC@Binary");
    EXPECT_EQ(thread_name(), kJapanese);
    EXPECT_EQ(NLS1_SetLocaleFromNative("C", 0), LX_OK) << "nothing is asked for, nothing changes";
    EXPECT_EQ(thread_name(), kJapanese);
  });
}

TEST_F(Nls1Test, ObjectsByNameAndIdentifier) {
  write_directory();
  expect_in_child("objects", exit, [] {
    const struct {
      const char* type;
      int32_t (*id_of)(const char*, int32_t*);
      int32_t (*name_of)(int32_t, char*, int32_t);
    } types[] = {{"language", NLS1_GetLanguageId, NLS1_GetLanguageName},
                 {"territory", NLS1_GetTerritoryId, NLS1_GetTerritoryName},
                 {"codepage", NLS1_GetCodepageId, NLS1_GetCodepageName},
                 {"sort", NLS1_GetSortId, NLS1_GetSortName}};
    const auto functions = [&](const CaseRow& row) {
      return *std::find_if(types, types + 4, [&](const auto& type) { return type.type == row[0]; });
    };
    for (const CaseRow& row : case_rows("nls1/object_names.txt")) {
      SCOPED_TRACE(row.where);
      const char* const name = row[1].empty() ? nullptr : row[1].c_str();
      int32_t rc = -1;
      EXPECT_EQ(functions(row).id_of(name, &rc), row.number(2));
      EXPECT_EQ(rc, row.number(3));
      EXPECT_EQ(functions(row).id_of(name, nullptr), row.number(2));
    }
    for (const CaseRow& row : case_rows("nls1/object_identifiers.txt")) {
      SCOPED_TRACE(row.where);
      char name[40] = "#";
      EXPECT_EQ(functions(row).name_of(row.number(1), name, row.number(2)), row.number(4));
      EXPECT_EQ(name, row[3]);
    }
    char name[8];
    EXPECT_EQ(said(RAS1_LEVEL_ERRORS, [&] { NLS1_GetLanguageName(2, name, sizeof(name)); }),
              "Object name length (8) for Japanese exceeds output buffer length (8)");
  });
  // The search by identifier looks at the entry beside types that have none: another type is not found.
  directory.write("la_00840.nls", directory.read("la_00001.nls"));
  directory.write("control.nls", control_file({{840, LX_LANGUAGE, "English"}, {5, LX_CODEPAGE, "Five"}}));
  expect_in_child("another type", exit, [] {
    EXPECT_EQ(messages(RAS1_LEVEL_PROCESS, [] { EXPECT_EQ(thread_name(), "null"); }),
              (Strings{"Unable to set global locale, rc = 34", "Unable to set thread locale, rc = 34"}));
    char name[40] = "#";
    EXPECT_EQ(NLS1_GetSortName(5, name, sizeof(name)), LX_E_NOT_FOUND);
    EXPECT_EQ(NLS1_GetLocale(NLS1_LANGUAGE_TERRITORY(840, 840), 0, 0, nullptr), nullptr);
    EXPECT_EQ(name_of(nullptr), "none") << "English has no territory here";
  });
}

TEST_F(Nls1Test, TheUsersLocaleOfTheCoresDirectory) {
  write_directory();
  expect_in_child("variables", exit, [this] {
    unsetenv("NLS1_LOCALEDIR");
    setenv("LX_LOCALEDIR", directory.path().c_str(), 1);
    setenv("LX_LANG", "Japanese", 1);
    EXPECT_EQ(thread_name(), kJapanese);
    EXPECT_EQ(name_of(nullptr), kJapanese);
  });
}

}  // namespace
}  // namespace lx::test
