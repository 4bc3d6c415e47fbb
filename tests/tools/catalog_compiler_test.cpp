// The catalog compiler's files: the way to a source and back, and damage. Their bytes, what sources become and
// what is said of them stands in tests/cases/cli.
#include <gtest/gtest.h>

#include <csignal>
#include <filesystem>
#include <iterator>
#include <random>
#include <sstream>

#include "catalog_file.h"
#include "gencat.h"
#include "lexicor/command.h"
#include "lexicor/output.h"
#include "support/damage.h"
#include "support/object_files.h"

namespace lexicor_gencat {
namespace {

using lexicor_cli::Failure;

// Texts of random bytes, of random characters and of odd shift bytes, as sources in UTF-8 and in the codepage
// itself.
TEST(CatalogCompiler, DumpCompilesToTheSameBytes) {
  const lx::test::ScratchDirectory directory;
  lexicor_cli::Session session({LEXICOR_LOCALE_DIR});
  std::mt19937 random(20);
  auto below = [&](uint32_t limit) { return static_cast<uint32_t>(random() % limit); };
  const std::string pieces[] = {
      "\\",       "\"",      " ", "\n", "$", "1", "a", "\x0E", "\x0F", "\x95\x5C", "\x0E\x44\x81\x0F",
      "\xC3\xA4", "\x5C\x6E"};
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
        options.catalog = directory.file("z.cat");
        options.output = directory.file("z.msg");
        options.source_encoding = encoding;
        directory.write_text("z.cat", bytes);
        dump(session, options);
        options.catalog = directory.file("again.cat");
        options.sources = {options.output};
        options.fresh = true;
        std::ostringstream log;
        ASSERT_TRUE(compile(session, options, log)) << log.str();
        const auto again = directory.read("again.cat");
        ASSERT_EQ(std::string(again.begin(), again.end()), bytes) << codepage << " as " << encoding;
      }
    }
  }
}

TEST(CatalogCompiler, SignalLeavesNoPartOfItsFiles) {
  const lx::test::ScratchDirectory directory;
  const auto stop = [&] {
    const lexicor_cli::Output catalog(directory.file("a.cat")), header(directory.file("a.h"));
    std::raise(SIGTERM);
  };
  EXPECT_EXIT(stop(), testing::KilledBySignal(SIGTERM), "");
  EXPECT_TRUE(std::filesystem::is_empty(directory.path()));
}

TEST(CatalogCompiler, DamageIsNamedOrHarmless) {
  Catalog catalog{"German", ByteOrder::kBig, {{1, {{1, "ab"}, {2, "b"}}}, {2, {{1, "x"}}}}};
  const std::string sound = pack_catalog(catalog);
  lx::test::for_each_damage(sound, [&](const std::string& damaged) {
    std::string fault;
    try {
      unpack_catalog(damaged, "f");
    } catch (const Failure& failure) {
      fault = failure.what();
    }
    EXPECT_TRUE(fault.empty() ? damaged.size() == sound.size() : fault.find("f: offset ") == 0) << fault;
  });
  catalog.locale = std::string(132, 'x');
  EXPECT_THROW(pack_catalog(catalog), Failure);
}

}  // namespace
}  // namespace lexicor_gencat
