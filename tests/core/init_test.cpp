// Initialisation: counting, return codes, hooks, and what happens after a failed or a final call.
#include <climits>
#include <fstream>
#include <set>

#include "core/library_fixture.h"
#include "core/lxalias.h"

namespace lx::test {
namespace {

class InitTest : public LibraryTest {};

TEST_F(InitTest, CountsUsesAndEndsWithTheLast) {
  directory.write_locale({{367, "US-ASCII", ascii_codepage()}});
  ASSERT_EQ(init(), LX_OK);
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

// Every code of the headers has a name and words of its own.
TEST_F(InitTest, SaysWhatACodeMeans) {
  std::ifstream header(LEXICOR_DATA_DIR "/../include/lx/base.h");
  std::set<std::string> texts = {LXGetErrorText(3)};
  EXPECT_STREQ(LXGetErrorText(INT32_MIN), LXGetErrorText(INT32_MAX));
  char name[32];
  int code;
  for (std::string line; std::getline(header, line);)
    if (sscanf(line.c_str(), "  LX_%31[A-Z_] = %d", name, &code) == 2 && strchr("OEW", name[0]) != nullptr) {
      const std::string text = LXGetErrorText(code);
      EXPECT_TRUE(islower(text[0]) && text.back() != '.' && texts.insert(text).second) << line << ": " << text;
    }
  EXPECT_EQ(texts.size(), 35u);
  const char* version = nullptr;
  int part[3];
  EXPECT_EQ(LXVersion(nullptr), LXVersion(&version));
  ASSERT_EQ(sscanf(version, "%d.%d.%d", &part[0], &part[1], &part[2]), 3);
  EXPECT_EQ(LXVersion(nullptr), static_cast<uint32_t>(part[0] << 16 | part[1] << 8 | part[2]));
}

// Only the whole option forbids the built-in objects.
TEST_F(InitTest, WorksOnTheBuiltInObjects) {
  for (uint32_t options : {0u, 0x80000000u, 0x00000001u, 0x80000003u}) {
    EXPECT_EQ(init(directory.path().c_str(), options), LX_W_DEFAULTS);
    EXPECT_EQ(init(), LX_OK) << "a further use is no warning";
    LXLocale* locale = LXGetLocale("English_UnitedStates.US-ASCII@BINARY", 0, nullptr);
    EXPECT_EQ(LXNumChars(locale, "text", -1), 4);
    EXPECT_EQ(LXReleaseLocale(locale), 0);
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
  directory.write_locale({{367, "US-ASCII", ascii_codepage()}});
  Hooks other_hooks;
  for (Hooks* next : {&hooks, &other_hooks}) {
    hooks.fail_at(2);
    EXPECT_EQ(init(), LX_E_NOT_INITIALIZED);
    hooks.fail_at(0);
    const std::vector<std::string> said = messages(RAS1_LEVEL_DETAIL, [&] {
      EXPECT_EQ(LXInit(directory.path().c_str(), Hooks::allocate, Hooks::release, next, 0), LX_OK);
    });
    EXPECT_EQ(said.at(0) == "Creating global area", next == &other_hooks);
    EXPECT_EQ(hooks.live_blocks() == 0, next == &other_hooks);
    EXPECT_EQ(LXTerm(), LX_OK);
    EXPECT_EQ(next->live_blocks(), 0u);
  }
}

// What is said of each block that the beginning of a use needs. Aliases that were read stay.
TEST_F(InitTest, SaysForWhatThereIsNoMemory) {
  directory.write_locale({{367, "US-ASCII", ascii_codepage()}});
  directory.write_text("alias.txt", "A one two three\n");
  ASSERT_EQ(init(), LX_OK);
  const size_t calls = hooks.calls();
  const struct {
    size_t allocation, bytes;
    const char* what;
  } rows[] = {{1, sizeof(GlobalArea), "globals"},
              {2, sizeof(LXObjManager), "object manager"},
              {5, 3 * format::kRecordBytes, "control data"},
              {calls - 1, sizeof(AliasRecord), "codepage A, alias two"}};
  for (const auto& row : rows) {
    terminate();
    hooks.fail_at(row.allocation);
    EXPECT_EQ(messages(RAS1_LEVEL_ERRORS, [&] { init(); }).at(0),
              "Unable to allocate " + std::to_string(row.bytes) + " bytes for " + row.what);
  }
  hooks.fail_at(0);
  EXPECT_STREQ(LXGetCodepageFromAlias(nullptr, "one"), "A");
  EXPECT_EQ(LXGetCodepageFromAlias(nullptr, "two"), nullptr);
}

TEST_F(InitTest, TakesEitherHookAlone) {
  static int32_t frees = 0;
  const auto release = [](void* context, void* block) {
    EXPECT_EQ(context, nullptr);
    ++frees;
    return free(block), INT_MIN;  // any non-zero value is success
  };
  EXPECT_EQ(LXInit(directory.path().c_str(), nullptr, release, nullptr, 0), LX_W_DEFAULTS);
  EXPECT_EQ(LXTerm(), LX_OK);
  EXPECT_GT(frees, 0);
  const auto allocate = [](void* context, size_t bytes) {
    return context == nullptr ? malloc(bytes) : nullptr;
  };
  EXPECT_EQ(LXInit(directory.path().c_str(), allocate, nullptr, nullptr, 0), LX_W_DEFAULTS);
  EXPECT_EQ(LXTerm(), LX_OK);
  void* block = LXDefAlloc(this, 40);
  EXPECT_NE(block, nullptr);
  EXPECT_EQ(LXDefFree(this, block), 1);
}

// What is returned when the free hook reports failure. The last LXTerm: 1 from the default locale and from the
// manager, 21 from an object with a section that was allocated rather than read. Data that was read goes through
// LXUnloadFile, which does not report; nor does the previous default locale.
TEST_F(InitTest, FailingFrees) {
  directory.write_locale(
      {{367, "US-ASCII", ascii_codepage()}, {500, "Old", version1_codepage(ascii_codepage()), 1}});
  const struct {
    uint16_t codepage;  // loaded before: one that is read, one that is converted
    bool default_locale;
    int32_t code;
  } cases[] = {{367, false, 1}, {500, false, LX_E_FREE}, {500, true, 1}};
  const auto transfer = [](void*, char*, int32_t) { return 0; };
  for (const auto& c : cases) {
    SCOPED_TRACE(c.code);
    ASSERT_EQ(init(), LX_OK);
    int32_t rc = -1;
    LXGetObjFromID(nullptr, LX_CODEPAGE, c.codepage, LX_FIND_AND_LOAD, &rc);
    ASSERT_EQ(rc, LX_OK);
    LXLocale* const locale = LXGetLocale("", 0, nullptr);
    LXStream* const stream = LXOpenStream(locale, transfer, nullptr, LX_STREAM_READ);
    LXConversion* const conversion = LXOpenConversion(locale, locale);
    LXFile* const file = LXOpenFile(1, (directory.path() + "/control.nls").c_str(), LX_READ, 0, &rc);
    if (c.default_locale) LXSetLocale("", 0);
    const LXLocale* const previous = globals.default_locale;
    hooks.fail_frees(true);
    EXPECT_EQ(LXCloseStream(stream, locale), 0);
    EXPECT_EQ(LXGetError(locale), LX_E_FREE);
    EXPECT_EQ(LXCloseFile(file, 0), LX_E_FREE);
    EXPECT_EQ(LXCloseConversion(conversion), LX_E_FREE);
    EXPECT_EQ(LXReleaseLocale(locale), 1);
    if (c.default_locale) {
      EXPECT_EQ(LXSetLocale("", 0), LX_OK);
      EXPECT_NE(globals.default_locale, previous);
    }
    EXPECT_EQ(LXTerm(), c.code);
    hooks.fail_frees(false);
  }
}

}  // namespace
}  // namespace lx::test
