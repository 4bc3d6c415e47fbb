// Damaged catalogs, every truncation and changed byte, and every allocation failing: 71 or a safe result, no
// memory that the file does not justify, nothing left behind.
#include "support/damage.h"

#include <algorithm>
#include <cstring>

#include "catalog/catalog_fixture.h"
#include "core/lxformat.h"

namespace lx::test {
namespace {

namespace fmt = format::catalog;

constexpr size_t kSecondSet = fmt::kHeaderBytes + fmt::kSetBytes;
constexpr size_t kIndex = fmt::kHeaderBytes + 2 * fmt::kSetBytes;  // of the first set
constexpr size_t kMostForOpening = 6000;                           // the search list and its path

ByteString small_catalog() {
  return catalog_file({{1, {{1, "one"}, {2, "two"}}}, {3, {{4, "four"}}}}, "English.TINY-SJIS");
}

class CatalogDamageTest : public CatalogTest {
 protected:
  /// Opens in both modes and asks for everything: each answer has one of the codes and is terminated.
  void use(const ByteString& file) {
    files.write("catalog", file);
    library.hooks().fail_at(0);
    for (uint32_t mode : kModes) {
      const CatalogPtr catalog = open(mode);
      if (catalog == nullptr) {
        EXPECT_EQ(LXGetError(single()), LX_E_CATALOG);
        continue;
      }
      for (uint32_t set : {0, 1, 3, 4})
        for (uint32_t number : {0, 1, 2, 4}) {
          std::string text(40, 'x');
          const int32_t code = LXGetMessage(catalog.get(), set, number, text.data(), 40, nullptr);
          EXPECT_TRUE(code == LX_OK || code == LX_E_CATALOG || code == LX_E_MESSAGE) << code;
          EXPECT_NE(text.find('\0'), std::string::npos);
        }
    }
    EXPECT_LT(library.hooks().largest(), kMostForOpening);
  }
};

TEST_F(CatalogDamageTest, TruncatedAndChangedFiles) {
  for_each_damage(small_catalog(), [&](const ByteString& file) { use(file); });
}

// What a wrong integer does: "open" that a loaded catalog is refused, else the first and the last message. A
// catalog that is not loaded can always be opened.
TEST_F(CatalogDamageTest, WrongIntegers) {
  const uint32_t end = static_cast<uint32_t>(small_catalog().size());
  struct Case {
    size_t offset;
    uint32_t value;
    const char* loaded;
    const char* in_file;
  };
  const Case cases[] = {
      {fmt::kHeaderMagic, 0x476CF462, "open", "71 71"},
      {fmt::kHeaderVersion, 0x20000000, "open", "71 71"},
      {fmt::kHeaderByteOrder, 3 - LXMcGetByteOrder(), "open", "71 71"},
      {fmt::kHeaderSets, 0, "open", "71 71"},
      {fmt::kHeaderSets, 1, "one 72", "one 72"},
      {fmt::kHeaderSets, 3, "open", "one four"},
      {fmt::kHeaderSets, 0xFFFFFFFF, "open", "71 71"},
      {fmt::kHeaderFirstSet, end - 27, "open", "71 71"},
      {fmt::kHeaderFirstSet, 0xFFFFFFFF, "open", "71 71"},
      {fmt::kHeaderLocale, 0x58585858, "open", "71 71"},                           // no such locale
      {fmt::kHeaderBytes + fmt::kSetNext, fmt::kHeaderBytes, "one 72", "one 72"},  // a loop
      {fmt::kHeaderBytes + fmt::kSetNext, 0x80000000, "open", "one 71"},
      {fmt::kHeaderBytes + fmt::kSetMessages, 0, "72 four", "72 four"},
      {fmt::kHeaderBytes + fmt::kSetMessages, 0xFFFFFFFF, "open", "one four"},
      {fmt::kHeaderBytes + fmt::kSetIndex, end, "open", "71 four"},
      {fmt::kHeaderBytes + fmt::kSetIndex, 0xFFFFFFFC, "open", "71 four"},
      {kSecondSet + fmt::kSetTexts, end - 4, "open", "one 71"},
      {kSecondSet + fmt::kSetTextBytes, 0xFFFFFFFF, "open", "one 71"},
      {kSecondSet + fmt::kSetUnread, 0xFFFFFFFF, "one four", "one four"},
      {kIndex + fmt::kEntryTextBytes, 0xFFFFFFFF, "71 four", "71 four"},
      {kIndex + fmt::kEntryTextBytes, 2, "on four", "on four"},  // a text without its null
      {kIndex + fmt::kEntryTextBytes, 0, " four", " four"},
      {kIndex + fmt::kEntryTextBytes, 8, "one four", "one four"},
      {kIndex + fmt::kEntryText, 5, "71 four", "71 four"},
      {kIndex + fmt::kEntryText, 0xFFFFFFFF, "71 four", "71 four"},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(std::to_string(c.offset) + " " + std::to_string(c.value));
    ByteString file = small_catalog();
    put_catalog_word(&file, c.offset, c.value);
    use(file);
    for (uint32_t mode : kModes) {
      const CatalogPtr catalog = open(mode);
      const std::string opened = mode == 0 ? c.in_file : c.loaded;
      ASSERT_EQ(catalog == nullptr, opened == "open");
      if (catalog != nullptr) {
        EXPECT_EQ(message(catalog, 1, 1) + " " + message(catalog, 3, 4), opened);
      }
    }
  }
  // No default text stands in for a damaged catalog, nor for one of the other byte order.
  const CatalogPtr other = open(catalog_file({{1, {{1, "one"}}}}, "", true), 0);
  EXPECT_EQ(message(other, 1, 1, "default") + message(other, 2, 1, "default"), "7171");
  ByteString no_null = small_catalog();
  std::fill_n(no_null.begin() + fmt::kHeaderLocale, fmt::kHeaderLocaleBytes, 'E');
  EXPECT_EQ(message(open(no_null, 0), 1, 1), "71");
  // The first index entry must be in the file, even of a set without messages.
  EXPECT_EQ(message(open(catalog_file({{1, {}}}), 0), 1, 1), "72");
  EXPECT_EQ(open(LX_CATALOG_LOAD), nullptr);
}

// In a file with room for thousands of sets a chain that ends early ends there, and one that loops ends too.
TEST_F(CatalogDamageTest, TheChainEndsAtTheLatestWithTheCountOfSets) {
  ByteString file = small_catalog();
  file.resize(3000 * fmt::kSetBytes);
  put_catalog_word(&file, fmt::kHeaderSets, 2990);
  EXPECT_EQ(message(open(file, 0), 9, 1), "72");
  EXPECT_EQ(open(LX_CATALOG_LOAD), nullptr);
  put_catalog_word(&file, kSecondSet + fmt::kSetNext, fmt::kHeaderBytes);
  for (uint32_t mode : kModes) EXPECT_EQ(message(open(file, mode), 9, 1), "72");
}

// Everything from opening to closing, with each allocation failing in turn; a failing free hook is not
// reported.
TEST_F(CatalogDamageTest, EveryAllocationFailing) {
  files.write("catalog", small_catalog());
  const std::string path = files.file("catalog");
  const std::basic_string<LXUChar> path16(path.begin(), path.end()), long16(400, 'd'), directory16(400, 'x');
  LXLocale* const locale = single();
  Hooks& hooks = library.hooks();
  const size_t before = hooks.live_blocks();
  for (uint32_t mode : kModes)
    for (bool frees_fail : {false, true}) {
      hooks.fail_frees(frees_fail);
      size_t n = 0;
      do {
        hooks.fail_at(++n);
        LXCatalog* catalog = LXOpenCatalogU(locale, directory16.c_str(), path16.c_str(), mode);
        std::vector<int32_t> codes = {LXGetError(locale)};
        if (catalog != nullptr) {
          char text[500];
          LXUChar units[500];
          codes.push_back(LXGetMessage(catalog, 3, 4, text, 500, nullptr));
          codes.push_back(LXGetMessageU(catalog, 3, 4, units, 500, nullptr));
          codes.push_back(LXGetMessageU(catalog, 3, 9, units, 500, long16.c_str()));
          EXPECT_EQ(LXCloseCatalog(catalog), LX_OK);
        }
        for (int32_t code : codes)
          EXPECT_TRUE(code == LX_OK || (hooks.failed() && (code == LX_E_CATALOG || code == LX_E_MEMORY)))
              << code;
        EXPECT_EQ(hooks.live_blocks(), before) << n;
      } while (hooks.failed());
      EXPECT_GT(n, 5u);
    }
  hooks.fail_frees(false);
}

TEST_F(CatalogDamageTest, MemoryHelpersUseTheHooks) {
  const size_t before = library.hooks().live_blocks();
  void* block = LXMcRealloc(nullptr, 0, 4);
  LXMcMemcpy(block, "abcd", 4);
  library.hooks().fail_at(1);
  EXPECT_EQ(LXMcRealloc(block, 4, 8), nullptr);
  block = LXMcRealloc(block, 4, 8);
  LXMcSetZero(static_cast<char*>(block) + 2, 6);
  EXPECT_EQ(memcmp(block, "ab\0\0\0\0\0\0", 8), 0);
  EXPECT_NE(LXMcFree(LXMcRealloc(block, 8, 1)), 0);
  EXPECT_EQ(library.hooks().live_blocks(), before);
}

}  // namespace
}  // namespace lx::test
