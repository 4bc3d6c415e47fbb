// Initialisation: counting, return codes, hooks, what happens after a failed or a final call, and that every
// function is refused while the library is not initialised.
#include <climits>

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
  constexpr int kMany = 0x10000;  // uses, that a count of 16 bits would not tell from none
  for (int i = 1; i < kMany; ++i) LXInit(nullptr, nullptr, nullptr, nullptr, 0);
  for (int i = 0; i < kMany; ++i) ASSERT_EQ(LXTerm(), LX_OK);
  LXLocale* locale = LXGetLocale("english", 0, nullptr);
  ASSERT_NE(locale, nullptr);
  EXPECT_EQ(LXReleaseLocale(locale), 0);
  EXPECT_EQ(LXTerm(), LX_OK);
  EXPECT_EQ(hooks.live_blocks(), 0u);
  EXPECT_EQ(LXTerm(), LX_E_NOT_INITIALIZED);
}

// Only the whole option forbids the built-in objects.
TEST_F(InitTest, WorksOnTheBuiltInObjects) {
  for (uint32_t options : {0u, 0x80000000u, 0x00000001u, 0x80000003u}) {
    EXPECT_EQ(init(directory.path().c_str(), options), LX_W_DEFAULTS);
    EXPECT_EQ(init(), LX_OK) << "a further use is no warning";
    for (const char* name : {"", "English_UnitedStates.US-ASCII@BINARY"}) {
      LXLocale* locale = LXGetLocale(name, 0, nullptr);
      ASSERT_NE(locale, nullptr) << name;
      EXPECT_EQ(LXNumChars(locale, "text", -1), 4);
      EXPECT_EQ(LXReleaseLocale(locale), 0);
    }
    terminate();
  }
  EXPECT_EQ(init(directory.path().c_str(), LX_NO_DEFAULTS), LX_W_DEFAULTS);
  int32_t rc = -1;
  EXPECT_EQ(LXGetObjFromID(nullptr, LX_LANGUAGE, 1, LX_FIND_AND_LOAD, &rc), nullptr);
  EXPECT_EQ(rc, LX_E_NOT_FOUND);
  EXPECT_EQ(LXGetLocale("", 0, &rc), nullptr);
  EXPECT_EQ(rc, LX_E_NO_LANGUAGE);
}

// The area of a failed call serves a further try, unless that has other hooks.
TEST_F(InitTest, TriesAgainAfterAFailedCall) {
  hooks.fail_at(2);
  EXPECT_EQ(init_with_locale(), LX_E_NOT_INITIALIZED);
  hooks.fail_at(0);
  const std::vector<std::string> texts = messages(RAS1_LEVEL_DETAIL, [&] { EXPECT_EQ(init(), LX_OK); });
  for (const std::string& text : texts) EXPECT_NE(text, "Creating global area");
  EXPECT_EQ(LXTerm(), LX_OK);
  hooks.fail_at(2);
  EXPECT_EQ(init_with_locale(), LX_E_NOT_INITIALIZED);
  Hooks other_hooks;
  EXPECT_EQ(LXInit(directory.path().c_str(), Hooks::allocate, Hooks::release, &other_hooks, 0), LX_OK);
  EXPECT_EQ(hooks.live_blocks(), 0u);
  EXPECT_EQ(LXTerm(), LX_OK);
  EXPECT_EQ(other_hooks.live_blocks(), 0u);
}

int32_t counted_frees;
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
  const auto allocate = [](void* context, size_t bytes) {
    return context == nullptr ? malloc(bytes) : nullptr;
  };
  EXPECT_EQ(LXInit(directory.path().c_str(), allocate, nullptr, nullptr, 0), LX_W_DEFAULTS);
  EXPECT_EQ(LXTerm(), LX_OK);
  void* block = LXDefAlloc(this, 40);
  EXPECT_NE(block, nullptr);
  EXPECT_EQ(LXDefFree(this, block), 1);
}

// What the last LXTerm returns when the free hook reports failure: 1 from the default locale and from the
// manager, 21 from an object with a section that was allocated rather than read. Data that was read goes
// through LXUnloadFile, which does not report.
TEST_F(InitTest, TermReportsTheFirstFailingRelease) {
  struct Case {
    const char* what;
    uint16_t codepage;  // loaded before
    bool set_default_locale;
    int32_t code;
  };
  directory.write_locale({{367, "US-ASCII", ascii_codepage()}, {500, "Old", version1_ascii_codepage(), 1}});
  for (const Case& c :
       {Case{"a codepage read from its file", 367, false, 1},
        Case{"a converted codepage", 500, false, LX_E_FREE}, Case{"a default locale", 500, true, 1}}) {
    SCOPED_TRACE(c.what);
    ASSERT_EQ(init(), LX_OK);
    int32_t rc = -1;
    LXGetObjFromID(nullptr, LX_CODEPAGE, c.codepage, LX_FIND_AND_LOAD, &rc);
    ASSERT_EQ(rc, LX_OK);
    ASSERT_EQ(c.set_default_locale ? LXSetLocale("", 0) : LX_OK, LX_OK);
    hooks.fail_frees(true);
    EXPECT_EQ(LXTerm(), c.code);
    hooks.fail_frees(false);
    EXPECT_EQ(hooks.live_blocks(), 0u);
  }
}

TEST_F(InitTest, EnvironmentAccess) {
  char buffer[16] = "#";
  EXPECT_EQ(LXGetEnv("LX_LANG", buffer, sizeof(buffer)), 0);
  setenv("LX_LANG", "abcde", 1);
  for (int32_t size : {-1, 5}) EXPECT_EQ(LXGetEnv("LX_LANG", buffer, size), 6);
  EXPECT_STREQ(buffer, "#");
  EXPECT_EQ(LXGetEnv("LX_LANG", buffer, 6), 6);
  EXPECT_STREQ(buffer, "abcde");
}

// Pointers that crash when anything reads through them: a refused call touches nothing.
template <class T>
T* poison() {
  return reinterpret_cast<T*>(uintptr_t{64});
}

template <class... Arguments>
int32_t fail_callback(Arguments...) {
  ADD_FAILURE() << "called";
  return 0;
}
/// `call` returns nothing and stores the code.
void expect_nothing(const std::function<void*(int32_t*)>& call) {
  int32_t rc = -1;
  EXPECT_EQ(call(&rc), nullptr);
  EXPECT_EQ(rc, LX_E_NOT_INITIALIZED);
}

void expect_frame_and_objects_refused() {
  LXLocale* const locale = poison<LXLocale>();
  EXPECT_EQ(LXGetError(locale), LX_E_NOT_INITIALIZED);
  EXPECT_EQ(LXGetError(nullptr), LX_E_NOT_INITIALIZED);

  for (LXObjManager* manager : {static_cast<LXObjManager*>(nullptr), poison<LXObjManager>()}) {
    expect_nothing([=](int32_t* rc) { return LXGetObjFromName(manager, 0, poison<char>(), 7, 0, rc); });
    expect_nothing([=](int32_t* rc) { return LXGetObjFromNameW(manager, 0, poison<LXWChar>(), 7, 0, rc); });
    expect_nothing([=](int32_t* rc) { return LXGetObjFromID(manager, 0, 1, 0, rc); });
    EXPECT_EQ(LXGetCodepageFromAlias(manager, poison<char>()), nullptr);
    EXPECT_EQ(LXEnumAliases(manager, fail_callback, nullptr), LX_E_NOT_INITIALIZED);
  }
  expect_nothing([](int32_t* rc) { return LXInitObjManager(poison<char>(), 0, rc); });
  char buffer[64] = "#";
  EXPECT_EQ(LXGetDataFileName("/d", LX_CODEPAGE, 1, buffer, sizeof(buffer)), nullptr);
  EXPECT_STREQ(buffer, "#");
}

void expect_locales_refused() {
  LXLocale* const locale = poison<LXLocale>();
  expect_nothing([](int32_t* rc) { return LXGetLocale(poison<char>(), 0, rc); });
  expect_nothing([](int32_t* rc) { return LXGetLocaleW(poison<LXWChar>(), 0, rc); });
  expect_nothing([](int32_t* rc) { return LXGetLocaleU(poison<LXUChar>(), 0, rc); });
  EXPECT_EQ(LXGetLocale("", 0, nullptr), nullptr);
  EXPECT_EQ(LXReleaseLocale(locale), 1);
  EXPECT_EQ(LXSetLocale(poison<char>(), 0), LX_E_NOT_INITIALIZED);
  EXPECT_EQ(LXSetLocaleW(poison<LXWChar>(), 0), LX_E_NOT_INITIALIZED);
  EXPECT_EQ(LXSetLocaleU(poison<LXUChar>(), 0), LX_E_NOT_INITIALIZED);
  EXPECT_EQ(LXConvertLocale(locale, poison<char>(), LX_FALLBACK), 0);
  EXPECT_EQ(LXEnumLocales(fail_callback, nullptr), 0);
  EXPECT_EQ(LXEnumLocalesW(fail_callback, nullptr), 0);
  EXPECT_EQ(LXEnumLocalesU(fail_callback, nullptr), 0);
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
  char* output = text;
  const char* input = text;
  int32_t output_left = 9, input_left = 9;
  EXPECT_EQ(LXConvertBuffer(poison<LXConversion>(), &output, &output_left, &input, &input_left),
            LX_E_NOT_INITIALIZED);
  EXPECT_EQ(output_left, 9);
  EXPECT_EQ(input_left, 9);
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
  LXUChar no_units[2] = {9, 9};
  EXPECT_EQ(LXComStrToUnicode("abc", -1, no_units), -1);
  EXPECT_EQ(no_units[0], 0);
  EXPECT_EQ(no_units[1], 9);
  char no_bytes[2] = {9, 9};
  const LXUChar abc[] = {'a', 'b', 'c', 0};
  EXPECT_EQ(LXComUnicodeToStr(abc, -1, no_bytes), -1);
  EXPECT_EQ(no_bytes[0], 0);
  EXPECT_EQ(no_bytes[1], 9);
}

void expect_refused() {
  EXPECT_EQ(LXTermObjManager(poison<LXObjManager>()), LX_E_INVALID);
  expect_frame_and_objects_refused();
  expect_locales_refused();
  expect_characters_refused();
  expect_conversion_refused();
}

TEST_F(InitTest, EverythingIsRefusedOutside) {
  setenv("LX_LANG", "English", 1);
  expect_in_child("before LXInit", expect_refused);
  hooks.fail_at(1);
  ASSERT_EQ(init_with_locale(), LX_E_MEMORY);
  expect_in_child("after LXInit found no memory for the area", expect_refused);
  EXPECT_EQ(LXTerm(), LX_E_NOT_INITIALIZED);
  hooks.fail_at(2);
  ASSERT_EQ(init(), LX_E_NOT_INITIALIZED);
  expect_in_child("while the area of a failed call is left", [] {
    expect_refused();
    expect_nothing([](int32_t* rc) { return LXOpenFile(0, "/dev/null", LX_READ, 0, rc); });
  });
  hooks.fail_at(0);
  ASSERT_EQ(init(), LX_OK);
  ASSERT_EQ(LXSetLocale("", 0), LX_OK);
  int32_t rc = -1;
  LXFile* file = LXOpenFile(0, directory.file("control.nls").c_str(), LX_READ, 0, &rc);
  ASSERT_EQ(LXTerm(), LX_OK);
  expect_in_child("after the last LXTerm", expect_refused);
  expect_in_child("a file of an earlier use", [&] { EXPECT_EQ(LXLoadFile(file, 0, 4, &rc), nullptr); });
  ASSERT_EQ(init(), LX_OK);
  EXPECT_EQ(LXCloseFile(file, 0), 0);
}

}  // namespace
}  // namespace lx::test
