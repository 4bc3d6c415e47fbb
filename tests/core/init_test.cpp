// Initialisation: counting, return codes, hooks, what happens after a failed or a final call, and that every
// function is refused while the library is not initialised.
#include <climits>
#include <cstring>

#include "core/library_fixture.h"
#include "core/small_codepages.h"

namespace lx::test {
namespace {

class InitTest : public LibraryTest {};

TEST_F(InitTest, CountsUsesAndEndsWithTheLast) {
  ASSERT_EQ(init_with_locale(), LX_OK);
  Hooks other_hooks;
  ScratchDirectory other_directory;
  EXPECT_EQ(
      LXInit(other_directory.path().c_str(), Hooks::allocate, Hooks::release, &other_hooks, LX_NO_DEFAULTS),
      LX_OK);
  EXPECT_EQ(other_hooks.calls(), 0u);
  EXPECT_EQ(LXTerm(), LX_OK);
  LXLocale* locale = LXGetLocale("english", 0, nullptr);
  ASSERT_NE(locale, nullptr);
  EXPECT_EQ(LXReleaseLocale(locale), 0);
  EXPECT_EQ(LXTerm(), LX_OK);
  EXPECT_EQ(hooks.live_blocks(), 0u);
  EXPECT_EQ(LXTerm(), LX_E_NOT_INITIALIZED);
}

TEST_F(InitTest, StartsAfreshAfterTheLastTerm) {
  ASSERT_EQ(init_with_locale(), LX_OK);
  ASSERT_EQ(LXSetLocale("English", 0), LX_OK);
  ASSERT_EQ(LXTerm(), LX_OK);
  Hooks other_hooks;
  ScratchDirectory empty;
  EXPECT_EQ(LXInit(empty.path().c_str(), Hooks::allocate, Hooks::release, &other_hooks, 0), LX_W_DEFAULTS);
  EXPECT_GT(other_hooks.live_blocks(), 0u);
  EXPECT_EQ(LXGetError(nullptr), LX_E_NOT_INITIALIZED) << "no default locale is left over";
  EXPECT_EQ(LXTerm(), LX_OK);
  EXPECT_EQ(other_hooks.live_blocks(), 0u);
}

TEST_F(InitTest, WorksOnTheBuiltInObjects) {
  EXPECT_EQ(init(), LX_W_DEFAULTS);
  EXPECT_EQ(init(), LX_OK) << "a further use is no warning";
  for (const char* name : {"", "English_UnitedStates.US-ASCII@BINARY"}) {
    int32_t rc = -1;
    LXLocale* locale = LXGetLocale(name, 0, &rc);
    ASSERT_NE(locale, nullptr) << name;
    EXPECT_EQ(rc, LX_OK);
    EXPECT_EQ(LXNumChars(locale, "text", -1), 4);
    EXPECT_EQ(LXReleaseLocale(locale), 0);
  }
}

TEST_F(InitTest, HasNoObjectsWithoutDefaults) {
  EXPECT_EQ(init(directory.path().c_str(), LX_NO_DEFAULTS), LX_W_DEFAULTS);
  for (int32_t type = LX_LANGUAGE; type <= LX_SORT; ++type) {
    int32_t rc = -1;
    EXPECT_EQ(LXGetObjFromID(nullptr, type, 1, LX_FIND_AND_LOAD, &rc), nullptr);
    EXPECT_EQ(rc, LX_E_NOT_FOUND);
    rc = -1;
    EXPECT_EQ(LXGetObjFromName(nullptr, type, "English", 7, LX_FIND_AND_LOAD, &rc), nullptr);
    EXPECT_EQ(rc, LX_E_NOT_FOUND);
  }
  int32_t rc = -1;
  EXPECT_EQ(LXGetLocale("", 0, &rc), nullptr);
  EXPECT_EQ(rc, LX_E_NO_LANGUAGE);
}

TEST_F(InitTest, OnlyTheWholeOptionForbidsDefaults) {
  for (uint32_t options : {0x80000000u, 0x00000001u, 0x80000003u}) {
    EXPECT_EQ(init(directory.path().c_str(), options), LX_W_DEFAULTS);
    int32_t rc = -1;
    EXPECT_NE(LXGetObjFromID(nullptr, LX_LANGUAGE, 1, LX_FIND_ONLY, &rc), nullptr) << options;
    EXPECT_EQ(LXTerm(), LX_OK);
  }
}

TEST_F(InitTest, FailsWithoutMemoryForTheArea) {
  hooks.fail_at(1);
  EXPECT_EQ(init_with_locale(), LX_E_MEMORY);
  EXPECT_EQ(hooks.calls(), 1u);
  EXPECT_EQ(LXGetError(nullptr), LX_E_NOT_INITIALIZED);
  hooks.fail_at(0);
  EXPECT_EQ(init(), LX_OK);
}

TEST_F(InitTest, RetriesWithTheAreaOfAFailedCall) {
  hooks.fail_at(2);
  EXPECT_EQ(init_with_locale(), LX_E_NOT_INITIALIZED);
  EXPECT_EQ(hooks.live_blocks(), 1u) << "the area";
  const size_t area_bytes = hooks.live_bytes();
  hooks.fail_at(0);
  const std::vector<std::string> texts = messages(RAS1_LEVEL_DETAIL, [&] { EXPECT_EQ(init(), LX_OK); });
  for (const std::string& text : texts) EXPECT_NE(text, "Creating global area");
  EXPECT_EQ(LXTerm(), LX_OK);
  EXPECT_EQ(hooks.live_blocks(), 0u) << area_bytes;
}

TEST_F(InitTest, DropsTheAreaOfAFailedCallWhenOtherHooksTryAgain) {
  hooks.fail_at(2);
  EXPECT_EQ(init_with_locale(), LX_E_NOT_INITIALIZED);
  Hooks other_hooks;
  EXPECT_EQ(LXInit(directory.path().c_str(), Hooks::allocate, Hooks::release, &other_hooks, 0), LX_OK);
  EXPECT_EQ(hooks.live_blocks(), 0u);
  EXPECT_EQ(LXTerm(), LX_OK);
  EXPECT_EQ(other_hooks.live_blocks(), 0u);
}

TEST_F(InitTest, TermReleasesTheAreaOfAFailedCall) {
  hooks.fail_at(2);
  EXPECT_EQ(init(), LX_E_NOT_INITIALIZED);
  EXPECT_EQ(LXTerm(), LX_E_NOT_INITIALIZED);
  EXPECT_EQ(hooks.live_blocks(), 0u);
}

int32_t counted_frees;
void* allocate_without_context(void* context, size_t bytes) {
  EXPECT_EQ(context, nullptr);
  return malloc(bytes);
}
int32_t count_free(void* context, void* block) {
  EXPECT_EQ(context, nullptr);
  ++counted_frees;
  free(block);
  return INT_MIN;  // any non-zero value is success
}

TEST_F(InitTest, TakesEitherHookAlone) {
  counted_frees = 0;
  EXPECT_EQ(LXInit(directory.path().c_str(), nullptr, count_free, nullptr, 0), LX_W_DEFAULTS);
  EXPECT_EQ(LXTerm(), LX_OK);
  EXPECT_GT(counted_frees, 0);
  EXPECT_EQ(LXInit(directory.path().c_str(), allocate_without_context, nullptr, nullptr, 0), LX_W_DEFAULTS);
  EXPECT_EQ(LXTerm(), LX_OK);
  EXPECT_EQ(LXInit(nullptr, nullptr, nullptr, nullptr, 0), LX_W_DEFAULTS);
  EXPECT_EQ(LXTerm(), LX_OK);
}

TEST_F(InitTest, DefaultHooks) {
  void* block = LXDefAlloc(this, 40);
  ASSERT_NE(block, nullptr);
  memset(block, 1, 40);
  EXPECT_EQ(LXDefFree(this, block), 1);
}

// What the last LXTerm returns when the free hook reports failure: 1 from the default locale and from the
// manager, 21 from an object with a section that was allocated rather than read. Data that was read goes
// through LXUnloadFile, which does not report.
TEST_F(InitTest, TermReportsTheFirstFailingRelease) {
  struct Case {
    const char* what;
    bool load_version_1;
    bool load_version_2;
    bool set_default_locale;
    int32_t code;
  };
  const Case cases[] = {
      {"nothing loaded", false, false, false, 1},
      {"a codepage read from its file", false, true, false, 1},
      {"a converted codepage", true, false, false, LX_E_FREE},
      {"a default locale", true, true, true, 1},
  };
  directory.write_locale({{367, "US-ASCII", ascii_codepage()}, {500, "Old", version1_ascii_codepage(), 1}});
  for (const Case& c : cases) {
    SCOPED_TRACE(c.what);
    ASSERT_EQ(init(), LX_OK);
    int32_t rc = LX_OK;
    if (c.load_version_1) LXGetObjFromID(nullptr, LX_CODEPAGE, 500, LX_FIND_AND_LOAD, &rc);
    ASSERT_EQ(rc, LX_OK);
    if (c.load_version_2) LXGetObjFromID(nullptr, LX_CODEPAGE, 367, LX_FIND_AND_LOAD, &rc);
    ASSERT_EQ(rc, LX_OK);
    if (c.set_default_locale) {
      ASSERT_EQ(LXSetLocale("", 0), LX_OK);
    }
    hooks.fail_frees(true);
    EXPECT_EQ(LXTerm(), c.code);
    hooks.fail_frees(false);
    EXPECT_EQ(hooks.live_blocks(), 0u);
  }
}

TEST_F(InitTest, EnvironmentAccess) {
  unsetenv("LX_TEST_VALUE");
  char buffer[16];
  EXPECT_EQ(LXGetEnv("LX_TEST_VALUE", buffer, sizeof(buffer)), 0);
  struct Case {
    const char* value;
    int32_t size;
    int32_t result;
    bool copied;
  };
  const Case cases[] = {{"abcde", 16, 6, true}, {"abcde", 6, 6, true},   {"abcde", 5, 6, false},
                        {"abcde", 0, 6, false}, {"abcde", -1, 6, false}, {"", 1, 1, true},
                        {"", 0, 1, false}};
  for (const Case& c : cases) {
    SCOPED_TRACE(c.size);
    setenv("LX_TEST_VALUE", c.value, 1);
    memset(buffer, '#', sizeof(buffer));
    EXPECT_EQ(LXGetEnv("LX_TEST_VALUE", buffer, c.size), c.result);
    const size_t copied = c.copied ? strlen(c.value) + 1 : 0;
    if (c.copied) {
      EXPECT_STREQ(buffer, c.value);
    }
    for (size_t i = copied; i < sizeof(buffer); ++i) EXPECT_EQ(buffer[i], '#');
  }
  unsetenv("LX_TEST_VALUE");
}

TEST_F(InitTest, ErrorOfTheDefaultLocale) {
  ASSERT_EQ(init_with_locale(), LX_OK);
  EXPECT_EQ(LXGetError(nullptr), LX_E_NOT_INITIALIZED);
  ASSERT_EQ(LXSetLocale("English", 0), LX_OK);
  EXPECT_EQ(LXGetError(nullptr), LX_OK);
  char name[16];
  EXPECT_EQ(LXConvertLocale(nullptr, name, 0x100), 0);
  EXPECT_EQ(LXGetError(nullptr), LX_E_INVALID);
}

// Pointers that crash when anything reads through them: a refused call touches nothing.
template <class T>
T* poison() {
  return reinterpret_cast<T*>(uintptr_t{64});
}

int32_t fail_callback(void*, int32_t, const char*) {
  ADD_FAILURE() << "called";
  return 0;
}
int32_t fail_callback_w(void*, int32_t, const LXWChar*) {
  ADD_FAILURE() << "called";
  return 0;
}
int32_t fail_callback_u(void*, int32_t, const LXUChar*) {
  ADD_FAILURE() << "called";
  return 0;
}
int32_t fail_alias_callback(void*, const char*, const char*) {
  ADD_FAILURE() << "called";
  return 0;
}

void expect_frame_and_objects_refused() {
  LXLocale* const locale = poison<LXLocale>();
  EXPECT_EQ(LXGetError(locale), LX_E_NOT_INITIALIZED);
  EXPECT_EQ(LXGetError(nullptr), LX_E_NOT_INITIALIZED);

  for (LXObjManager* manager : {static_cast<LXObjManager*>(nullptr), poison<LXObjManager>()}) {
    int32_t rc = -1;
    EXPECT_EQ(LXGetObjFromName(manager, 0, poison<char>(), 7, 0, &rc), nullptr);
    EXPECT_EQ(rc, LX_E_NOT_INITIALIZED);
    rc = -1;
    const LXWChar wide[] = {'E', 'n', 'g', 'l', 'i', 's', 'h', 0};
    EXPECT_EQ(LXGetObjFromNameW(manager, 0, wide, 7, 0, &rc), nullptr);
    EXPECT_EQ(rc, LX_E_NOT_INITIALIZED);
    rc = -1;
    EXPECT_EQ(LXGetObjFromID(manager, 0, 1, 0, &rc), nullptr);
    EXPECT_EQ(rc, LX_E_NOT_INITIALIZED);
    EXPECT_EQ(LXGetCodepageFromAlias(manager, poison<char>()), nullptr);
    EXPECT_EQ(LXEnumAliases(manager, fail_alias_callback, nullptr), LX_E_NOT_INITIALIZED);
  }
  int32_t rc = -1;
  EXPECT_EQ(LXInitObjManager(poison<char>(), 0, &rc), nullptr);
  EXPECT_EQ(rc, LX_E_NOT_INITIALIZED);
  char buffer[64] = "#";
  EXPECT_EQ(LXGetDataFileName("/d", LX_CODEPAGE, 1, buffer, sizeof(buffer)), nullptr);
  EXPECT_STREQ(buffer, "#");
}

void expect_locales_refused() {
  LXLocale* const locale = poison<LXLocale>();
  int32_t rc = -1;
  EXPECT_EQ(LXGetLocale(poison<char>(), 0, &rc), nullptr);
  EXPECT_EQ(rc, LX_E_NOT_INITIALIZED);
  rc = -1;
  EXPECT_EQ(LXGetLocaleW(poison<LXWChar>(), 0, &rc), nullptr);
  EXPECT_EQ(rc, LX_E_NOT_INITIALIZED);
  rc = -1;
  EXPECT_EQ(LXGetLocaleU(poison<LXUChar>(), 0, &rc), nullptr);
  EXPECT_EQ(rc, LX_E_NOT_INITIALIZED);
  EXPECT_EQ(LXGetLocale("", 0, nullptr), nullptr);
  EXPECT_EQ(LXReleaseLocale(locale), 1);
  EXPECT_EQ(LXSetLocale(poison<char>(), 0), LX_E_NOT_INITIALIZED);
  EXPECT_EQ(LXSetLocaleW(poison<LXWChar>(), 0), LX_E_NOT_INITIALIZED);
  EXPECT_EQ(LXSetLocaleU(poison<LXUChar>(), 0), LX_E_NOT_INITIALIZED);
  EXPECT_EQ(LXConvertLocale(locale, poison<char>(), LX_FALLBACK), 0);
  EXPECT_EQ(LXEnumLocales(fail_callback, nullptr), 0);
  EXPECT_EQ(LXEnumLocalesW(fail_callback_w, nullptr), 0);
  EXPECT_EQ(LXEnumLocalesU(fail_callback_u, nullptr), 0);
}

void expect_characters_refused() {
  LXLocale* const locale = poison<LXLocale>();
  char* const text = poison<char>();
  EXPECT_EQ(LXGetChar(locale, text), 0u);
  EXPECT_EQ(LXGetCharEx(locale, text, 1), 0u);
  EXPECT_EQ(LXPutChar(locale, text, 'A'), 0);
  LXPutCharEx(locale, text, 1, 'A');
  EXPECT_EQ(LXNextChar(locale, text), text);
  EXPECT_EQ(LXPrevChar(locale, text, text + 9), text + 9);
  LXShiftState state = 9;
  EXPECT_EQ(LXNextCharEx(locale, text, 1, &state, 0), text);
  EXPECT_EQ(state, 1u);
  state = 9;
  EXPECT_EQ(LXPrevCharEx(locale, text, text + 9, 1, &state), text + 9);
  EXPECT_EQ(state, 1u);
  EXPECT_EQ(LXNumChars(locale, text, -1), 0);
  EXPECT_EQ(LXNumCharsEx(locale, text, 0, -1), 0);
  EXPECT_EQ(LXMoveStringPointer(locale, text, 5, 0), text);
  EXPECT_EQ(LXMoveStringPointerEx(locale, text, 0, 5, &state, 0), text);
  EXPECT_EQ(LXValidChar(locale, text), 0);
  EXPECT_EQ(LXValidCharEx(locale, text, 1), 0);
  EXPECT_EQ(LXByteLength(locale, text), 0);
  EXPECT_EQ(LXByteLengthW(locale, 0x8140), 0);
  EXPECT_EQ(LXByteLengthEx(locale, text, 1), 0);
  EXPECT_EQ(LXGetCharType(locale, text, LX_CTYPE1), 0u);
  EXPECT_EQ(LXGetCharTypeW(locale, 'A', LX_CTYPE1), 0u);
  EXPECT_EQ(LXGetCharTypeU(locale, 'A', LX_CTYPE1), 0u);
  EXPECT_EQ(LXGetCharTypeEx(locale, text, 1, LX_CTYPE1), 0u);
  const LXObject* const object = poison<LXObject>();
  EXPECT_EQ(LXGetMbCtype(object, text), nullptr);
  EXPECT_EQ(LXGetMbCtypeW(object, 0x8140), nullptr);
  EXPECT_EQ(LXMbToW(object, text), 0u);
  EXPECT_EQ(LXMbToWS(object, text, 1), 0u);
  EXPECT_EQ(LXCpMbToUnicode(object, text), 0xFFFD);
  EXPECT_EQ(LXCpMbToUnicodeW(object, 0x8140), 0xFFFD);
  EXPECT_EQ(LXCpUnicodeToChar(object, 'A', text), 0);
  EXPECT_EQ(LXCpUnicodeToCharW(object, 'A'), 0u);
  EXPECT_EQ(LXCpStrCharToByteLen(object, text, 0, 3), 0);
  EXPECT_EQ(LXCpStrByteToCharLen(object, text, 0, -1), 0);
  LXUChar result1 = 9, result2 = 9;
  EXPECT_EQ(LXLangGetSpecial(object, 'a', 0, &result1, &result2, 44), 0);
  EXPECT_EQ(result1, 9);
  void* section = locale;
  EXPECT_EQ(LXCpV1toV2(text, 4372, nullptr, 0, &section), nullptr);
  EXPECT_EQ(section, nullptr);
}

void expect_conversion_refused() {
  LXLocale* const locale = poison<LXLocale>();
  char* const text = poison<char>();
  LXWChar* const codes = poison<LXWChar>();
  LXUChar* const unicode = poison<LXUChar>();
  EXPECT_EQ(LXOpenConversion(locale, locale), nullptr);
  EXPECT_EQ(LXCloseConversion(poison<LXConversion>()), LX_E_NOT_INITIALIZED);
  EXPECT_EQ(LXConversionRatio(locale, locale), 1);
  EXPECT_EQ(LXConvertString(locale, text, 9, locale, text, -1, 0), -1);
  EXPECT_EQ(LXConvertStringEx(locale, text, 0, 9, locale, text, 0, -1, 0), -1);
  EXPECT_EQ(LXConvertStringW(locale, codes, 9, locale, codes, -1, 0), -1);
  EXPECT_EQ(LXMbToWide(locale, codes, 9, text, -1, 0), -1);
  EXPECT_EQ(LXMbToWideEx(locale, codes, 9, text, 0, -1, 0), -1);
  EXPECT_EQ(LXWideToMb(locale, text, 9, codes, -1, 0), -1);
  EXPECT_EQ(LXWideToMbEx(locale, text, 0, 9, codes, -1, 0), -1);
  EXPECT_EQ(LXStringToUnicode(unicode, 9, locale, text, -1, 0), -1);
  EXPECT_EQ(LXStringToUnicodeW(unicode, 9, locale, codes, -1, 0), -1);
  EXPECT_EQ(LXStringToUnicodeEx(unicode, 9, locale, text, 0, -1, 0), -1);
  EXPECT_EQ(LXUnicodeToString(locale, text, 9, unicode, -1, 0), -1);
  EXPECT_EQ(LXUnicodeToStringW(locale, codes, 9, unicode, -1, 0), -1);
  EXPECT_EQ(LXUnicodeToStringEx(locale, text, 0, 9, unicode, -1, 0), -1);
  EXPECT_EQ(LXCpStrToUnicode(poison<LXObject>(), text, -1, unicode), -1);
  EXPECT_EQ(LXCpUnicodeToStr(poison<LXObject>(), unicode, 0, -1, text), 0);
  // These two store their terminating null whatever happens.
  LXUChar no_units[4] = {9, 9, 9, 9};
  EXPECT_EQ(LXComStrToUnicode("abc", -1, no_units), -1);
  EXPECT_EQ(no_units[0], 0);
  EXPECT_EQ(no_units[1], 9);
  char no_bytes[4] = {9, 9, 9, 9};
  const LXUChar abc[] = {'a', 'b', 'c', 0};
  EXPECT_EQ(LXComUnicodeToStr(abc, -1, no_bytes), -1);
  EXPECT_EQ(no_bytes[0], 0);
  EXPECT_EQ(no_bytes[1], 9);
}

void expect_refused(const char* when) {
  SCOPED_TRACE(when);
  EXPECT_EQ(LXTerm(), LX_E_NOT_INITIALIZED);
  EXPECT_EQ(LXTermObjManager(poison<LXObjManager>()), LX_E_INVALID);
  expect_frame_and_objects_refused();
  expect_locales_refused();
  expect_characters_refused();
  expect_conversion_refused();
}

TEST_F(InitTest, EverythingIsRefusedOutside) {
  setenv("LX_LANG", "English", 1);
  expect_refused("before LXInit");
  hooks.fail_at(1);
  ASSERT_EQ(init_with_locale(), LX_E_MEMORY);
  expect_refused("after LXInit found no memory");
  hooks.fail_at(0);
  ASSERT_EQ(init(), LX_OK);
  ASSERT_EQ(LXSetLocale("", 0), LX_OK);
  ASSERT_EQ(LXTerm(), LX_OK);
  expect_refused("after the last LXTerm");
}

TEST_F(InitTest, EverythingIsRefusedWhileAFailedAreaIsLeft) {
  struct Group {
    const char* what;
    void (*expect_refused)();
  };
  const Group groups[] = {
      {"frame and objects", expect_frame_and_objects_refused},
      {"manager", [] { EXPECT_EQ(LXTermObjManager(poison<LXObjManager>()), LX_E_INVALID); }},
      {"locales", expect_locales_refused},
      {"characters", expect_characters_refused},
      {"conversion", expect_conversion_refused},
      {"files",
       [] {
         int32_t rc = -1;
         EXPECT_EQ(LXOpenFile(0, "/dev/null", LX_READ, 0, &rc), nullptr);
         EXPECT_EQ(rc, LX_E_NOT_INITIALIZED);
       }},
  };
  hooks.fail_at(2);
  ASSERT_EQ(init_with_locale(), LX_E_NOT_INITIALIZED);
  for (const Group& group : groups) expect_in_child(group.what, group.expect_refused);
}

TEST_F(InitTest, RefusedCallsDoNotReadDeadHandles) {
  expect_in_child("a stream outside", [] {
    char* output = poison<char>();
    const char* input = output;
    int32_t output_left = 9, input_left = 9;
    EXPECT_EQ(LXConvertBuffer(poison<LXConversion>(), &output, &output_left, &input, &input_left),
              LX_E_NOT_INITIALIZED);
    EXPECT_EQ(output_left, 9);
    EXPECT_EQ(input_left, 9);
  });
  expect_in_child("a name of packed codes outside", [] {
    int32_t rc = -1;
    EXPECT_EQ(LXGetObjFromNameW(nullptr, LX_LANGUAGE, poison<LXWChar>(), 7, 0, &rc), nullptr);
    EXPECT_EQ(rc, LX_E_NOT_INITIALIZED);
  });
  expect_in_child("a file of an earlier use", [this] {
    init_with_locale();
    int32_t rc = -1;
    LXFile* file = LXOpenFile(0, directory.file("control.nls").c_str(), LX_READ, 0, &rc);
    LXTerm();
    EXPECT_EQ(LXLoadFile(file, 0, 4, &rc), nullptr);
  });
}

}  // namespace
}  // namespace lx::test
