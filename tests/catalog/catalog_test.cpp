// Catalogs: every message in both modes, in every codepage, form and size; where a catalog is looked for; and
// damaged ones, every truncation and changed byte: 71 or a safe result, no memory that the file does not justify,
// nothing left behind.
#include <algorithm>
#include <random>

#include "core/library_fixture.h"
#include "support/catalog_builder.h"
#include "support/damage.h"
#include "support/encoded_text.h"

namespace lx::test {
namespace {

namespace fmt = format::catalog;

constexpr size_t kSecondSet = fmt::kHeaderBytes + fmt::kSetBytes;
constexpr size_t kIndex = fmt::kHeaderBytes + 2 * fmt::kSetBytes;  // of the first set
constexpr size_t kMostForOpening = 6000;                           // the search list and its path

ByteString small_catalog() {
  return catalog_file({{1, {{1, "one"}, {2, "two"}}}, {3, {{4, "four"}}}}, "English.TINY-SJIS");
}

struct CatalogCloser {
  void operator()(LXCatalog* catalog) const { EXPECT_EQ(LXCloseCatalog(catalog), LX_OK); }
};
using CatalogPtr = std::unique_ptr<LXCatalog, CatalogCloser>;

constexpr uint32_t kModes[] = {0, LX_CATALOG_LOAD};

class CatalogTest : public LibraryTest {
 protected:
  void SetUp() override {
    unsetenv("LX_NLSPATH");
    // What catalogs need of the locale directory is loaded before files and memory are looked at.
    library.locale(tiny_shift_jis());
    LXReleaseLocale(LXGetLocale("", LX_FALLBACK, nullptr));
  }
  void TearDown() override { EXPECT_TRUE(library.close()); }

  LXLocale* single() { return library.locale(tiny_single()); }

  /// Opens the catalog that was written last, or writes one.
  CatalogPtr open(uint32_t flags) {
    return CatalogPtr(LXOpenCatalog(single(), nullptr, directory.file("catalog").c_str(), flags));
  }
  CatalogPtr open(const ByteString& file, uint32_t flags) {
    directory.write("catalog", file);
    return open(flags);
  }

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

  /// The message, or its code as a number.
  static std::string message(const CatalogPtr& catalog, uint32_t set, uint32_t number,
                             const char* default_text = nullptr) {
    char text[300] = "";
    const int32_t code = LXGetMessage(catalog.get(), set, number, text, sizeof(text), default_text);
    return code == LX_OK ? text : std::to_string(code);
  }

  TinyLibrary library;
};

using Numbers = std::vector<uint32_t>;

Numbers ascending(uint32_t count, uint32_t first, uint32_t most_step) {
  std::mt19937 random(count + most_step);
  Numbers numbers;
  for (uint32_t at = first; numbers.size() < count; at += 1 + static_cast<uint32_t>(random()) % most_step)
    numbers.push_back(at);
  return numbers;
}

TEST_F(CatalogTest, BothModesFindWhatIsThereAndNothingElse) {
  const Numbers dense = ascending(40, 1, 1), sparse = ascending(60, 3, 7), high = {5, 0x80000000u, 0xFFFFFFFFu};
  const std::pair<Numbers, Numbers> cases[] = {// sets, messages of each
                                               {{1}, dense},
                                               {dense, sparse},
                                               {sparse, dense},
                                               {high, high},
                                               {{1, 2, 3}, {0, 9}},
                                               {{1}, ascending(100000, 1, 1)},
                                               {{4}, ascending(100000, 2, 3)}};
  for (const auto& [set_numbers, numbers] : cases) {
    SCOPED_TRACE(numbers.size());
    CatalogSets sets;
    for (uint32_t set : set_numbers)
      for (uint32_t number : numbers) sets[set][number] = std::to_string(set) + ":" + std::to_string(number);
    Numbers asked = {0, 1, 2, 99998, 99999, 100000, 100001, 0x7FFFFFFF, 0xFFFFFFFE, 0xFFFFFFFF};
    for (uint32_t n = 3; n < 250; ++n)
      if (numbers.size() < 1000 || n % 8 == 0) asked.push_back(numbers.size() < 1000 ? n : n * 799);
    directory.write("catalog", catalog_file(sets));
    for (uint32_t mode : kModes) {
      const CatalogPtr catalog = open(mode);
      ASSERT_NE(catalog, nullptr);
      for (uint32_t set : {1u, 2u, 3u, 4u, 5u, 7u, 40u, 41u, 0xFFFFFFFFu})
        for (uint32_t number : asked) {
          const auto found = sets[set].find(number);
          ASSERT_EQ(message(catalog, set, number), found != sets[set].end() ? found->second : "72")
              << set << ' ' << number;
        }
      EXPECT_EQ(message(catalog, set_numbers[0], 0xABCDEF, "instead"), "instead");
    }
  }
}

// A loaded catalog is searched from where a number stands when all numbers from 1 on are there: found at once
// there, whatever stands elsewhere, and not found behind a number 0.
TEST_F(CatalogTest, ALoadedCatalogIsSearchedFromTheDensePlace) {
  ByteString others = catalog_file({{1, {{1, "a"}, {2, "b"}, {3, "c"}}}});
  const size_t index = fmt::kHeaderBytes + fmt::kSetBytes;
  for (size_t entry : {0, 2}) fmt::put_word(&others[index + entry * fmt::kEntryBytes + fmt::kEntryNumber], 9);
  const CatalogPtr loaded = open(others, LX_CATALOG_LOAD);
  EXPECT_EQ(message(loaded, 1, 2), "b");
  const ByteString with_zero = catalog_file({{1, {{0, "z"}, {1, "a"}, {2, "b"}}}});
  EXPECT_EQ(message(open(with_zero, LX_CATALOG_LOAD), 1, 2), "72");
  directory.write("catalog", {});
  EXPECT_EQ(message(loaded, 1, 2), "b") << "the file is not read again";
}

/// What a function wrote to a buffer of this size. Nothing is written behind it.
template <class Unit, class Fetch>
Text<Unit> written(size_t size, Fetch fetch) {
  constexpr Unit kCanary{'x'};
  std::vector<Unit> buffer(size + 4, kCanary);
  EXPECT_EQ(fetch(buffer.data(), static_cast<int32_t>(size)), LX_OK);
  EXPECT_EQ(std::count(buffer.end() - 4, buffer.end(), kCanary), 4);
  const auto end = std::find(buffer.begin(), buffer.end() - 4, Unit{0});
  EXPECT_NE(end, buffer.end() - 4) << "not terminated";
  return {buffer.begin(), end};
}

// Of a message and of a default text each size gets the characters that fit, terminated in the single-byte
// state.
TEST_F(CatalogTest, EveryCodepageFormAndSize) {
  const Units units = {'A', 0x3042, 0x3043, 'B', 0x3044};
  for (const TinyCodepage& cp : {tiny_shift_jis(), tiny_shift(), tiny_utf8()}) {
    SCOPED_TRACE(cp.file.name);
    LXLocale* locale = library.locale(cp);
    std::vector<std::string> prefixes;  // of each number of characters, closed
    for (size_t chars = 0; chars <= units.size(); ++chars) {
      const auto closed = Encoded<Ex>(cp, units.substr(0, chars)).units;
      prefixes.emplace_back(closed.begin(), closed.end());
    }
    const std::string own = prefixes.back();
    const std::string given = own + (cp.file.name == "TINY-UTF8" ? "\xE3" : "");  // ends inside a character
    const auto codes = Encoded<Wide>(cp, units).terminated();
    directory.write("catalog", catalog_file({{1, {{1, tiny_shift_jis().encode({units.begin(), units.end()})}}}},
                                            "English_UnitedStates.TINY-SJIS"));
    for (uint32_t mode : kModes) {
      const CatalogPtr catalog(LXOpenCatalog(locale, nullptr, directory.file("catalog").c_str(), mode));
      ASSERT_NE(catalog, nullptr);
      for (uint32_t number : {1u, 2u})  // the message, the default text
        for (size_t size = 1; size <= own.size() + 3; ++size) {
          SCOPED_TRACE(size);
          size_t chars = units.size();
          while (prefixes[chars].size() >= size) --chars;
          const auto fetched = [&](auto* door, const auto* default_text) {
            using Unit = std::decay_t<decltype(*default_text)>;
            return written<Unit>(size, [&](Unit* out, int32_t n) {
              return door(catalog.get(), 1, number, out, n, default_text);
            });
          };
          EXPECT_EQ(fetched(LXGetMessage, given.c_str()), prefixes[chars]);
          EXPECT_EQ(fetched(LXGetMessageU, units.c_str()), units.substr(0, size - 1));
          EXPECT_EQ(fetched(LXGetMessageW, codes.data()), Text<LXWChar>(codes.data()).substr(0, size - 1));
        }
    }
  }
}

TEST_F(CatalogTest, ArgumentsAndCodes) {
  directory.write("catalog", catalog_file({{1, {{1, "text"}}}}));
  const std::string path = directory.file("catalog");
  LXLocale* locale = single();
  const Text<LXWChar> codes(path.begin(), path.end());
  for (LXCatalog* opened :
       {LXOpenCatalog(locale, "", path.c_str(), 0), LXOpenCatalogW(locale, nullptr, codes.c_str(), 0),
        LXOpenCatalogU(locale, nullptr, units(path).c_str(), 0)})
    EXPECT_EQ(message(CatalogPtr(opened), 1, 1), "text");
  EXPECT_EQ(message(nullptr, 1, 1), "70");
  const CatalogPtr catalog = open(0);
  char both[] = "default";
  EXPECT_EQ(LXGetMessage(catalog.get(), 1, 9, both, sizeof(both) - 1, both + 1), LX_OK);
  EXPECT_STREQ(both, "efault");
  for (int32_t size : {0, 4}) {
    char text[4] = "abc";
    const int32_t code = size == 0 ? LX_OK : LX_E_MESSAGE;
    EXPECT_EQ(LXGetMessage(catalog.get(), 1, 9, text, size, nullptr), code)
        << "a null is written beyond size 0";
    EXPECT_EQ(LXGetError(locale), code);
    EXPECT_STREQ(text, "");
  }
  ASSERT_EQ(LXSetLocale("English.TINY-SINGLE", 0), LX_OK);
  EXPECT_EQ(LXCloseCatalog(nullptr), LX_E_CATALOG_NULL);
  EXPECT_EQ(LXGetError(nullptr), LX_E_CATALOG_NULL);
  // Opened for the default locale, a catalog follows it.
  const CatalogPtr by_default(LXOpenCatalog(nullptr, nullptr, path.c_str(), 0));
  ASSERT_EQ(LXSetLocale("English.TINY-SHIFT", 0), LX_OK);
  EXPECT_EQ(message(by_default, 1, 1), tiny_shift().encode({'t', 'e', 'x', 't'}));
}

// The paths tried, in order: characters of two bytes are not parted, and long ones are passed over. What else
// directories may hold shows in tests/cases/cli/message.txt.
TEST_F(CatalogTest, WhereACatalogIsLookedFor) {
  const std::string long_name(2048, 'n'), longest(LX_CATALOG_PATH_BYTES - 1, 'p');
  using Paths = std::vector<std::string>;
  const Paths long_paths = {longest, "x" + long_name, long_name};
  const struct {
    std::string directory, name;
    Paths paths, default_paths;  // with the given locale, and with the default one
  } cases[] = {{"/no\x81;no2\x83%N", "z", {"/no\x81;no2\x83%N", "z"}, {"/no\x81", "no2\x83z", "z"}},
               {"", "cut\x81", {}, {"cut\x81"}},
               {longest + ";" + longest + "p;%N%N;x%N", long_name, long_paths, long_paths}};
  LXLocale* locale = library.locale(tiny_shift_jis());
  for (const auto& c : cases)
    for (uint32_t one_locale : {0u, uint32_t{LX_CATALOG_LOAD}}) {
      SCOPED_TRACE(c.directory.substr(0, 40));
      Paths expected = c.paths;
      if (one_locale == 0) expected.insert(expected.end(), c.default_paths.begin(), c.default_paths.end());
      const auto open = [&] { LXOpenCatalog(locale, c.directory.c_str(), c.name.c_str(), one_locale); };
      EXPECT_EQ(opened(open), expected);
      EXPECT_EQ(LXGetError(locale), LX_E_CATALOG);
    }
  // Paths are bytes: what another form turns into EBCDIC is another path.
  directory.write("app", catalog_file({{1, {{1, "text"}}}}));
  const std::string path = directory.file("app");
  LXLocale* host = library.locale(tiny_shift());
  EXPECT_NE(CatalogPtr(LXOpenCatalog(host, nullptr, path.c_str(), 0)), nullptr);
  EXPECT_EQ(LXOpenCatalogU(host, nullptr, units(path).c_str(), 0), nullptr);
}

TEST_F(CatalogTest, MemoryHelpers) {
  void* const block = LXMcMalloc(4);
  LXMcMemcpy(block, "abcd", 4);
  char* const larger = static_cast<char*>(LXMcRealloc(block, 4, 8));
  LXMcSetZero(larger + 2, 6);
  EXPECT_EQ(std::string(larger, 8), std::string("ab\0\0\0\0\0\0", 8));
  EXPECT_EQ(LXMcFree(LXMcRealloc(larger, 8, 1)), 1);
}

TEST_F(CatalogTest, TruncatedAndChangedFiles) {
  for_each_damage(small_catalog(), [&](const ByteString& file) { use(file); });
}

// What a wrong integer does: "open" that a loaded catalog is refused, else the first and the last message. A
// catalog that is not loaded can always be opened.
TEST_F(CatalogTest, WrongIntegers) {
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
TEST_F(CatalogTest, TheChainEndsAtTheLatestWithTheCountOfSets) {
  ByteString file = small_catalog();
  file.resize(3000 * fmt::kSetBytes);
  fmt::put_word(&file[fmt::kHeaderSets], 2990);
  EXPECT_EQ(message(open(file, 0), 9, 1), "72");
  EXPECT_EQ(open(LX_CATALOG_LOAD), nullptr);
  fmt::put_word(&file[kSecondSet + fmt::kSetNext], fmt::kHeaderBytes);
  for (uint32_t mode : kModes) EXPECT_EQ(message(open(file, mode), 9, 1), "72");
}

}  // namespace
}  // namespace lx::test
