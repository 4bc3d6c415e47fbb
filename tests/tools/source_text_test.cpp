// What sources become and what is written of objects, where a transcript cannot show it: damaged objects, and
// packing. tests/cases/cli says the rest, and faults_test.cpp what is wrong with sources.
#include <gtest/gtest.h>

#include <sstream>

#include "compile.h"
#include "core/lxobjtypes.h"
#include "row_packer.h"
#include "support/tiny_codepages.h"
#include "ucm.h"

namespace lexicor_data {
namespace {

// Equal rows once, contained rows reused.
TEST(RowPacker, SharesRows) {
  RowPacker<int> packer(0);
  packer.place({{{1, 2, 3, 4}, 0}, {{2, 3}, 0}, {{4, 5}, 0}, {{1, 2, 3, 4}, 0}});
  EXPECT_EQ(packer.pool(), (std::vector<int>{1, 2, 3, 4, 5}));
}

TEST(Ucm, WriterRefusesTextThatCannotBeReadBack) {
  for (const char* text : {"a \"quoted\" word", "two\nlines"}) {
    CodepageSource source;
    source.source = text;
    std::ostringstream out;
    EXPECT_THROW(write_ucm(out, source), SourceError) << text;
  }
}

// Whatever a byte of an object becomes, checking and dumping end with a source or a SourceError, and the source
// of a sort is one that is read and written again.
TEST(Objects, AnyByteMayBeWrong) {
  const auto built_in = [](const lx::BuiltIn& object) {
    const lx::Bytes payload = object.sections.section[0];
    return std::vector<ByteVector>{ByteVector(payload.data, payload.data + payload.size)};
  };
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
  } objects[] = {{{ObjectType::kLanguage, 1, "L", 0}, built_in(lx::kBuiltInLanguage)},
                 {{ObjectType::kTerritory, 1, "T", 0}, built_in(lx::kBuiltInTerritory)},
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
    uint32_t step = 0;
    for (size_t at = 0; at < sound.size(); at += 1 + step % 23, ++step) {
      for (const uint8_t value : {static_cast<uint8_t>(sound[at] ^ (1U << step % 8)), uint8_t{0xFF}}) {
        ByteVector bytes = sound;
        bytes[at] = value;
        use(bytes);
      }
    }
    for (size_t size = 0; size < sound.size(); size += 1 + size / 16)
      use(ByteVector(sound.begin(), sound.begin() + static_cast<std::ptrdiff_t>(size)));
    EXPECT_GT(refused, 0u) << object.name.name;
  }
}

}  // namespace
}  // namespace lexicor_data
