// The catalog compiler's files: their bytes in both byte orders, the way to a source and back, and damage. What
// sources become and what is said of them stands in tests/cases/cli.
#include <gtest/gtest.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>
#include <iterator>
#include <random>
#include <sstream>

#include "catalog_file.h"
#include "gencat.h"
#include "lexicor/command.h"
#include "support/damage.h"

namespace lexicor_gencat {
namespace {

namespace fs = std::filesystem;
using lexicor_cli::Failure;

TEST(CatalogCompiler, BytesInBothOrders) {
  Catalog catalog{"German", ByteOrder::kBig, {{2, {{1, "a"}, {0x01020304, ""}}}, {7, {{3, "bc"}}}}};
  const std::string big = pack_catalog(catalog);
  catalog.byte_order = ByteOrder::kLittle;
  const std::string little = pack_catalog(catalog);
  const uint32_t words[] = {0x476CF463, 0x10000000, 1, 2, 152};
  const uint32_t records[] = {2, 180, 2, 208, 244, 3,          0, 7, 0, 1, 232, 247,
                              3, 0,   1, 2,   0,   0x01020304, 1, 2, 3, 3, 0};
  std::string expected[2];
  for (const bool is_little : {false, true}) {
    auto put = [&](uint32_t word) {
      for (int i = 0; i < 4; ++i) expected[is_little] += static_cast<char>(word >> 8 * (is_little ? i : 3 - i));
    };
    for (const uint32_t word : words) put(word == 1 && is_little ? 2 : word);
    expected[is_little] += "German" + std::string(132 - 6, '\0');
    for (const uint32_t word : records) put(word);
    expected[is_little] += std::string("a\0\0bc\0", 6);
  }
  EXPECT_EQ(big, expected[false]);
  EXPECT_EQ(little, expected[true]);
  const std::string own = native_byte_order() == ByteOrder::kBig ? big : little;
  EXPECT_EQ(std::string(own, 0, 4), std::string(reinterpret_cast<const char*>(words), 4));
  catalog.locale = std::string(132, 'x');
  EXPECT_THROW(pack_catalog(catalog), Failure);
}

// Texts of random bytes, of random characters and of odd shift bytes, as sources in UTF-8 and in the codepage
// itself.
TEST(CatalogCompiler, DumpCompilesToTheSameBytes) {
  const fs::path directory = fs::path(testing::TempDir()) / ("lexicor-gencat-" + std::to_string(getpid()));
  fs::create_directory(directory);
  const std::string source = directory / "z.msg", file = directory / "z.cat", again = directory / "again.cat";
  const auto contents = [](const std::string& path) {
    std::ifstream in(path, std::ios::binary);
    return std::string{std::istreambuf_iterator<char>(in), {}};
  };
  lexicor_cli::Session session({LEXICOR_LOCALE_DIR});
  std::mt19937 random(20);
  auto below = [&](uint32_t limit) { return static_cast<uint32_t>(random() % limit); };
  const std::string pieces[] = {"\\",
                                "\"",
                                " ",
                                "\n",
                                "$",
                                "1",
                                "a",
                                "\x0E",
                                "\x0F",
                                "\x95\x5C",
                                "\x0E\x44\x81\x0F",
                                "\xC3\xA4",
                                "\x5C\x6E",
                                std::string(1, '\0')};
  for (const char* codepage :
       {"UTF-8", "Latin1", "MS932", "IBM943", "JapanEUC", "IBM930", "IBM939", "IBM273", "IBM949", "EUC-TW"}) {
    for (int round = 0; round < 8; ++round) {
      Catalog catalog;
      catalog.locale = std::string("English_UnitedStates.") + codepage;
      if (below(2) == 0) catalog.byte_order = ByteOrder::kBig;
      for (uint32_t sets = below(4); sets > 0; --sets) {
        auto& messages = catalog.sets[1 + below(1U << below(32))];
        for (uint32_t count = 1 + below(20); count > 0; --count) {
          std::string& text = messages[1 + below(1U << below(32))];
          for (uint32_t length = below(12); length > 0; --length)
            text += below(3) == 0 ? std::string(1, static_cast<char>(below(256)))
                                  : pieces[below(static_cast<uint32_t>(std::size(pieces)))];
        }
      }
      const std::string bytes = pack_catalog(catalog);
      for (const char* encoding : {"", codepage}) {
        Options options;
        options.catalog = file;
        options.output = source;
        options.source_encoding = encoding;
        std::ofstream(file, std::ios::binary) << bytes;
        dump(session, options);
        options.catalog = again;
        options.sources = {source};
        options.fresh = true;
        std::ostringstream log;
        ASSERT_TRUE(compile(session, options, log)) << log.str();
        ASSERT_EQ(contents(again), bytes) << codepage << " as " << encoding << "\n" << contents(source);
      }
    }
  }
  fs::remove_all(directory);
}

// A layout that the compiler does not write: sets and texts from behind, a text shared, an empty set.
TEST(CatalogCompiler, ForeignLayoutsAndDamage) {
  const Catalog catalog{"German", ByteOrder::kBig, {{1, {{1, "ab"}, {2, "b"}}}, {2, {{1, "x"}}}}};
  std::string bytes = pack_catalog(catalog);
  auto put = [&](size_t at, uint32_t word) {
    for (size_t i = 0; i < 4; ++i) bytes[at + i] = static_cast<char>(word >> 8 * (3 - i));
  };
  auto fault = [&](const std::string& damaged) -> std::string {
    try {
      unpack_catalog(damaged, "f");
      return "";
    } catch (const Failure& failure) {
      return failure.what();
    }
  };
  put(208 + 12 + 8, 1);  // message 2 of set 1 is the end of message 1
  EXPECT_EQ(unpack_catalog(bytes, "f").sets.at(1).at(2), "b");

  const struct {
    size_t at;
    uint32_t word;
    const char* expected;
  } damages[] = {
      {0, 0x476CF462, "f: offset 0: the magic number is 62F46C47, expected 476CF463"},
      {4, 0, "f: offset 4: the format version is 00000000, expected 10000000"},
      {8, 2, "f: offset 8: the byte-order code is 00000002, expected 00000001"},
      {12, 0, "f: offset 12: the number of sets is 0, expected at least 1"},
      {12, 3, "f: offset 184: the record of set 2 of 3 has 0 as the next offset: the header counts more sets"},
      {12, 1,
       "f: offset 156: the record of set 1 of 1 has 180 as the next offset, expected 0: the header counts no "
       "more sets"},
      {16, 240,
       "f: offset 240: the record of set 1 of 2 has 28 bytes here and passes the end of the file, 251"},
      {156, 152, "f: offset 152: set 1 stands behind 1; expected ascending numbers from 1"},
      {160, 0xFFFFFFFF,
       "f: offset 208: the index of set 1 has 51539607540 bytes here and passes the end of the file, 251"},
      {168, 0xFFFFFFFF,
       "f: offset 4294967295: the text block of set 1 has 5 bytes here and passes the end of the file, 251"},
      {220, 1, "f: offset 220: message 1 stands behind 1; expected ascending numbers from 1"},
      {212, 6,
       "f: offset 208: the text of message 1 of set 1 (6 bytes at 0) passes the end of its block of 5 bytes"},
      {212, 2, "f: offset 244: the text of message 1 of set 1 does not end with a null byte"},
  };
  const std::string sound = bytes;
  for (const auto& row : damages) {
    bytes = sound;
    put(row.at, row.word);
    EXPECT_EQ(fault(bytes), row.expected);
  }
  lx::test::for_each_damage(sound, [&](const std::string& damaged) {
    const std::string text = fault(damaged);
    EXPECT_TRUE(text.empty() ? damaged.size() == sound.size() : text.find("f: offset ") == 0) << text;
  });
}

}  // namespace
}  // namespace lexicor_gencat
