// Objects and sources, where a transcript cannot show it: damage, and what is not written. tests/cases/cli says the
// rest, tests/cases/faults what is wrong with sources, and directory/codepages_test.cpp what every codepage holds.
#include <gtest/gtest.h>

#include <sstream>

#include "compile.h"
#include "core/lxobjtypes.h"
#include "support/damage.h"
#include "support/tiny_codepages.h"

namespace lexicor_data {
namespace {

// Whatever a byte of an object becomes, checking and dumping end with a source or a SourceError, and the source
// of a sort is one that is read and written again.
TEST(Objects, AnyByteMayBeWrong) {
  std::istringstream sort(
      "@defaults 0001 0001\n@insert secondary ; 0041\n@specials 2700..27FF ; 0400\n@primaries 4E00..4FFF ; "
      "8000\n"
      "@uncovered 0100..26FF\n@uncovered 2800..4DFF\n@uncovered 5000..FFFF\n002D ; [*0001.0000.0000]\n"
      "0061 ; [.0200.0001.0001]\n0041 ; [.0200.0001.0002]\n00C6 ; [.0200.0002.0002][.0201.0001.0001]\n"
      "00E6 ; [.0200.0002.0001][.0201.0001.0001]\n0062 0063 ; [.0203.0001.0001]\n0062 0064 ; "
      "[.0204.0001.0001]\n");
  const ObjectName sort_name{ObjectType::kSort, 1, "S", 0};
  const struct {
    ObjectName name;
    std::vector<ByteVector> sections;
  } objects[] = {{{ObjectType::kLanguage, 1, "L", 0}, {lx::test::payload_of(lx::kBuiltInLanguage)}},
                 {{ObjectType::kTerritory, 1, "T", 0}, {lx::test::payload_of(lx::kBuiltInTerritory)}},
                 {{ObjectType::kCodepage, 1, "C", 0}, lx::test::tiny_euc().file.sections},
                 {sort_name, read_object(compile_object(sort, "sort", sort_name, {}).bytes, "sort").sections}};
  for (const auto& object : objects) {
    const ByteVector sound = write_object({object.sections, 2, ""});
    size_t refused = 0;
    const auto use = [&](const ByteVector& bytes) {
      try {
        std::istringstream source(dump_object(read_object(bytes, "object"), object.name, nullptr, "object"));
        if (object.name.type != ObjectType::kSort) return;
        const CompiledObject again = compile_object(source, "source", object.name, {});
        EXPECT_EQ(dump_object(read_object(again.bytes, "again"), object.name, nullptr, "again"), source.str());
      } catch (const SourceError&) {
        ++refused;
      }
    };
    use(sound);
    EXPECT_EQ(refused, 0u) << object.name.name;
    lx::test::for_each_damage(sound, use, 23);
    EXPECT_GT(refused, 0u) << object.name.name;
  }
}

TEST(Objects, SourcesRefuseTextThatCannotBeReadBack) {
  for (const char* text : {"a \"quoted\" word", "two\nlines"}) {
    CodepageSource source;
    source.source = text;
    std::ostringstream out;
    EXPECT_THROW(write_ucm(out, source), SourceError) << text;
  }
}

}  // namespace
}  // namespace lexicor_data
