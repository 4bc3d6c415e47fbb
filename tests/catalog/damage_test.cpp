// Damaged catalogs, every truncation and changed byte: 71 or a safe result, no memory that the file does not
// justify, nothing left behind.
#include "support/damage.h"

#include <algorithm>

#include "catalog/catalog_fixture.h"

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
    directory.write("catalog", file);
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
    fmt::put_word(&file[c.offset], c.value);
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
  ByteString other = small_catalog();
  for (size_t at = 0; at < fmt::kHeaderLocale; at += 4) std::reverse(&other[at], &other[at + 4]);
  EXPECT_EQ(message(open(other, 0), 1, 1, "default"), "71");
  ByteString no_null = small_catalog();
  std::fill_n(no_null.begin() + fmt::kHeaderLocale, fmt::kHeaderLocaleBytes, 'E');
  EXPECT_EQ(message(open(no_null, 0), 1, 1), "71");
  // The first index entry must be in the file, even of a set without messages.
  ByteString behind = catalog_file({});
  fmt::put_word(&behind[fmt::kHeaderBytes + fmt::kSetIndex], static_cast<uint32_t>(behind.size()));
  EXPECT_EQ(message(open(behind, 0), 1, 1), "72");
  EXPECT_EQ(open(LX_CATALOG_LOAD), nullptr);
}

// In a file with room for thousands of sets a chain that ends early ends there, and one that loops ends too.
TEST_F(CatalogDamageTest, TheChainEndsAtTheLatestWithTheCountOfSets) {
  ByteString file = small_catalog();
  file.resize(3000 * fmt::kSetBytes);
  fmt::put_word(&file[fmt::kHeaderSets], 2990);
  EXPECT_EQ(message(open(file, 0), 9, 1), "72");
  EXPECT_EQ(open(LX_CATALOG_LOAD), nullptr);
  fmt::put_word(&file[kSecondSet + fmt::kSetNext], fmt::kHeaderBytes);
  for (uint32_t mode : kModes) EXPECT_EQ(message(open(file, mode), 9, 1), "72");
}

TEST_F(CatalogDamageTest, FailingFreesAreNotReported) {
  library.hooks().fail_frees(true);
  for (uint32_t mode : kModes) EXPECT_EQ(message(open(small_catalog(), mode), 3, 4), "four");
  EXPECT_EQ(LXGetError(single()), LX_OK);
  library.hooks().fail_frees(false);
}

}  // namespace
}  // namespace lx::test
