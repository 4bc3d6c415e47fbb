// Catalogs that are as they should be: every message in both modes, in every codepage, form and size, and where
// a catalog is looked for.
#include <algorithm>
#include <cstring>
#include <random>
#include <set>

#include "catalog/catalog_fixture.h"
#include "core/lxrecords.h"
#include "platform/ras1.h"
#include "platform/recording_ras1.h"

namespace lx::test {
namespace {

using Numbers = std::vector<uint32_t>;

Numbers ascending(uint32_t count, uint32_t first, uint32_t most_step) {
  std::mt19937 random(count + most_step);
  Numbers numbers;
  for (uint32_t at = first; numbers.size() < count; at += 1 + static_cast<uint32_t>(random()) % most_step)
    numbers.push_back(at);
  return numbers;
}

std::string text_of(uint32_t set, uint32_t number) {
  return "<" + std::to_string(set) + ":" + std::to_string(number) + ">";
}

TEST_F(CatalogTest, BothModesFindWhatIsThereAndNothingElse) {
  const Numbers dense = ascending(40, 1, 1), sparse = ascending(60, 3, 7), high = {5, 0x80000000u, 0xFFFFFFFFu};
  const Numbers huge = ascending(100000, 1, 1), huge_sparse = ascending(100000, 2, 3);
  struct Case {
    Numbers sets, messages;
  };
  const Case cases[] = {{{1}, dense}, {dense, sparse},     {sparse, dense}, {high, high},
                        {{7}, {}},    {{1, 2, 3}, {0, 9}}, {{1}, huge},     {{4}, huge_sparse}};
  for (const Case& c : cases) {
    SCOPED_TRACE(c.messages.size());
    std::vector<CatalogSet> sets;
    for (uint32_t set : c.sets) {
      sets.push_back({set, {}});
      for (uint32_t number : c.messages) sets.back().messages.emplace_back(number, text_of(set, number));
    }
    // Without messages, what stands at the index must be in the file all the same.
    if (c.messages.empty()) sets.push_back({8, {{1, "behind"}}});
    const std::set<uint32_t> there(c.messages.begin(), c.messages.end());
    Numbers asked = {0, 1, 2, 99998, 99999, 100000, 100001, 0x7FFFFFFF, 0xFFFFFFFE, 0xFFFFFFFF};
    for (uint32_t n = 3; n < 250; ++n)
      if (c.messages.size() < 1000 || n % 8 == 0) asked.push_back(c.messages.size() < 1000 ? n : n * 799);
    files.write("catalog", catalog_file(sets));
    for (uint32_t mode : kModes) {
      const CatalogPtr catalog = open(mode);
      ASSERT_NE(catalog, nullptr);
      for (uint32_t set : {1u, 2u, 3u, 4u, 5u, 7u, 40u, 41u, 0xFFFFFFFFu})
        for (uint32_t number : asked) {
          const bool found = std::count(c.sets.begin(), c.sets.end(), set) != 0 && there.count(number) != 0;
          ASSERT_EQ(message(catalog, set, number), found ? text_of(set, number) : "72") << set << ' ' << number;
        }
      EXPECT_EQ(message(catalog, c.sets[0], 0xABCDEF, "instead"), "instead");
    }
  }
}

// A loaded catalog is searched from where a number stands when all numbers from 1 on are there: found at once
// there, whatever stands elsewhere, and not found behind a number 0.
TEST_F(CatalogTest, ALoadedCatalogIsSearchedFromTheDensePlace) {
  const CatalogSet set{1, {{9, "a"}, {2, "b"}, {9, "c"}}};
  const CatalogSet with_zero{1, {{0, "z"}, {1, "a"}, {2, "b"}}};
  const CatalogPtr loaded = open(catalog_file({set}), LX_CATALOG_LOAD);
  EXPECT_EQ(message(loaded, 1, 2), "b");
  EXPECT_EQ(message(open(catalog_file({with_zero}), LX_CATALOG_LOAD), 1, 2), "72");
  EXPECT_EQ(message(open(catalog_file({with_zero}), 0), 1, 2), "b");
  files.write("catalog", {});
  EXPECT_EQ(message(loaded, 1, 2), "b") << "the file is not read again";
}

/// What a function wrote to a buffer of exactly this size; a sanitizer sees a write behind it.
template <class Unit, class Fetch>
std::basic_string<Unit> written(size_t size, Fetch fetch) {
  std::vector<Unit> buffer(size, Unit{'x'});
  EXPECT_EQ(fetch(buffer.data(), static_cast<int32_t>(size)), LX_OK);
  const auto end = std::find(buffer.begin(), buffer.end(), Unit{0});
  EXPECT_NE(end, buffer.end()) << "not terminated";
  return {buffer.begin(), end};
}

// Of a message and of a default text each size gets the characters that fit, terminated in the single-byte
// state.
TEST_F(CatalogTest, EveryCodepageFormAndSize) {
  const std::vector<uint16_t> units = {'A', 0x3042, 0x3043, 'B', 0x3044};
  const std::basic_string<LXUChar> whole(units.begin(), units.end());
  for (const TinyCodepage& cp : {tiny_shift_jis(), tiny_shift(), tiny_utf8()}) {
    SCOPED_TRACE(cp.file.name);
    LXLocale* locale = library.locale(cp);
    std::vector<std::string> prefixes;  // of each number of characters, closed
    std::vector<size_t> needs;          // the bytes that a default text takes: a Shift-In always has room
    for (size_t chars = 0; chars <= units.size(); ++chars) {
      LXShiftState state = LX_SHIFT_SINGLE;
      prefixes.push_back(cp.encode({units.begin(), units.begin() + static_cast<ptrdiff_t>(chars)}, &state));
      needs.push_back(prefixes.back().size() + (cp.shift && chars != 0) + 1);
      if (state == LX_SHIFT_DOUBLE) prefixes.back() += cp.shift_in;
    }
    const std::string& own = prefixes.back();
    std::basic_string<LXWChar> codes(8, 0);
    ASSERT_EQ(LXMbToWideEx(locale, codes.data(), 8, own.c_str(), 0, -1, 0), 6);
    files.write("catalog",
                catalog_file({{1, {{1, tiny_shift_jis().encode(units)}}}}, "English_UnitedStates.TINY-SJIS"));
    for (uint32_t mode : kModes) {
      const CatalogPtr catalog(LXOpenCatalog(locale, nullptr, files.file("catalog").c_str(), mode));
      ASSERT_NE(catalog, nullptr);
      for (uint32_t number : {1u, 2u})  // the message, the default text
        for (size_t size = 1; size <= own.size() + 3; ++size) {
          SCOPED_TRACE(size);
          size_t chars = units.size();
          while (number == 2 ? needs[chars] > size : prefixes[chars].size() >= size) --chars;
          const auto bytes = written<char>(size, [&](char* out, int32_t n) {
            return LXGetMessage(catalog.get(), 1, number, out, n, own.c_str());
          });
          const auto unicode = written<LXUChar>(size, [&](LXUChar* out, int32_t n) {
            return LXGetMessageU(catalog.get(), 1, number, out, n, whole.c_str());
          });
          const auto wide = written<LXWChar>(size, [&](LXWChar* out, int32_t n) {
            return LXGetMessageW(catalog.get(), 1, number, out, n, codes.c_str());
          });
          EXPECT_EQ(bytes, prefixes[chars]);
          EXPECT_EQ(unicode, whole.substr(0, size - 1));
          EXPECT_EQ(wide, std::basic_string<LXWChar>(codes.c_str()).substr(0, size - 1));
        }
    }
  }
}

TEST_F(CatalogTest, ArgumentsAndCodes) {
  files.write("catalog", catalog_file({{1, {{1, "text"}}}}));
  const std::string path = files.file("catalog");
  LXLocale* locale = single();
  for (uint32_t flags : {0u, 1u, 0x60u, uint32_t{LX_CATALOG_LOAD}, 2u, 0x80000063u})
    for (const std::string& name : {path, std::string()}) {
      SCOPED_TRACE(flags);
      const bool good = (flags & ~uint32_t{LX_CATALOG_LOAD}) == 0 && !name.empty();
      const std::basic_string<LXUChar> name16(name.begin(), name.end());
      const std::basic_string<LXWChar> name32(name.begin(), name.end());
      const CatalogPtr catalogs[] = {CatalogPtr(LXOpenCatalog(locale, "", name.c_str(), flags)),
                                     CatalogPtr(LXOpenCatalogW(locale, nullptr, name32.c_str(), flags)),
                                     CatalogPtr(LXOpenCatalogU(locale, nullptr, name16.c_str(), flags))};
      EXPECT_EQ(LXGetError(locale), good ? LX_OK : LX_E_INVALID);
      for (const CatalogPtr& catalog : catalogs) {
        ASSERT_EQ(catalog != nullptr, good);
        EXPECT_EQ(message(catalog, 1, 1), good ? "text" : "70");
      }
    }
  const CatalogPtr catalog = open(0);
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
  struct Case {
    std::string directory, name;
    Paths paths, default_paths;  // with the given locale, and with the default one
  };
  const Paths long_paths = {longest, "x" + long_name, long_name};
  const Case cases[] = {{"/no\x81;no2\x83%N", "z", {"/no\x81;no2\x83%N", "z"}, {"/no\x81", "no2\x83z", "z"}},
                        {"", "cut\x81", {}, {"cut\x81"}},
                        {longest + ";" + longest + "p;%N%N;x%N", long_name, long_paths, long_paths}};
  LXLocale* locale = library.locale(tiny_shift_jis());
  for (const Case& c : cases) {
    SCOPED_TRACE(c.directory.substr(0, 40));
    for (bool one_locale : {false, true}) {
      Paths expected = c.paths;
      if (!one_locale) expected.insert(expected.end(), c.default_paths.begin(), c.default_paths.end());
      RecordingTrace::take();
      RecordingTrace::set_level(RAS1_LEVEL_INPUT);
      EXPECT_EQ(LXOpenCatalog(locale, c.directory.c_str(), c.name.c_str(), one_locale ? LX_CATALOG_LOAD : 0),
                nullptr);
      RecordingTrace::set_level(0);
      EXPECT_EQ(LXGetError(locale), LX_E_CATALOG);
      Paths tried;
      const std::string prefix = "Opening file ";
      for (const TraceRecord& record : RecordingTrace::take())
        if (record.kind == TraceRecord::kMessage && record.text.rfind(prefix, 0) == 0)
          tried.push_back(record.text.substr(prefix.size()));
      EXPECT_EQ(tried, expected);
    }
  }
  // The first that opens is taken, whatever it is: a directory too, which then has no messages.
  files.write("app", catalog_file({{1, {{1, "text"}}}}));
  const std::string both = "/no;" + files.file("%N") + ";" + files.path();
  const std::string directory_first = files.path() + ";" + both;
  EXPECT_EQ(message(CatalogPtr(LXOpenCatalog(locale, both.c_str(), "app", 0)), 1, 1), "text");
  const CatalogPtr directory(LXOpenCatalog(locale, directory_first.c_str(), "app", 0));
  EXPECT_EQ(message(directory, 1, 1, "default"), "71");
  EXPECT_EQ(LXOpenCatalog(locale, directory_first.c_str(), "app", LX_CATALOG_LOAD), nullptr);
  // Paths are bytes: what another form turns into EBCDIC is another path.
  const std::string path = files.file("app");
  LXLocale* host = library.locale(tiny_shift());
  EXPECT_NE(CatalogPtr(LXOpenCatalog(host, nullptr, path.c_str(), 0)), nullptr);
  EXPECT_EQ(LXOpenCatalogU(host, nullptr, std::basic_string<LXUChar>(path.begin(), path.end()).c_str(), 0),
            nullptr);
}

}  // namespace
}  // namespace lx::test
