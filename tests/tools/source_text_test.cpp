// What the text sources of codepages, languages, territories, the object list and the aliases become, and that
// what is written of an object reads back. Their faults are the matter of faults_test.cpp.
#include <gtest/gtest.h>

#include <algorithm>
#include <fstream>
#include <iterator>
#include <set>
#include <sstream>

#include "compile.h"
#include "core/lxbytes.h"
#include "row_packer.h"
#include "sha256.h"
#include "territory_toml.h"
#include "ucm.h"

namespace lexicor_data {
namespace {

TEST(Sha256, StandardVectors) {
  auto hex = [](const std::string& text) {
    std::string out;
    for (uint8_t byte : sha256(text)) (out += "0123456789abcdef"[byte >> 4]) += "0123456789abcdef"[byte & 15];
    return out;
  };
  EXPECT_EQ(hex("abcdbcdecdefdefgefghfghighijhijkijkljklmklmnlmnomnopnopq"),
            "248d6a61d20638b8e5c026930c3e6039a33ce45964ff2167f6ecedd419db06c1");
  EXPECT_EQ(hex(std::string(1000000, 'a')), "cdc76e5c9914fb9281a1c7e284d73e67f1809a48a497200e046d39ccc7112cd0");
}

// Equal rows once, contained rows reused, every row where it was promised, none before its index.
TEST(RowPacker, RowsStandWhereTheyWerePlaced) {
  uint32_t random = 12345;
  auto next = [&](uint32_t limit) {
    random = random * 1664525 + 1013904223;
    return (random >> 16) % limit;
  };
  RowPacker<uint16_t> packer(0xFFFF);
  for (int round = 0; round < 100; ++round) {
    if (round % 2 == 0) packer = RowPacker<uint16_t>(0xFFFF);  // a round adds to an empty or to a filled pool
    size_t total = packer.pool().size();
    std::vector<RowPacker<uint16_t>::Request> requests;
    for (int i = 0; i < 20; ++i) {
      RowPacker<uint16_t>::Request request;
      request.first_index = next(40);
      for (uint32_t length = 1 + next(30); length > 0; --length) {
        request.row.push_back(static_cast<uint16_t>(next(2)));
      }
      total += request.row.size();
      requests.push_back(request);
    }
    const auto positions = packer.place(requests);
    for (size_t i = 0; i < requests.size(); ++i) {
      ASSERT_GE(positions[i], requests[i].first_index);
      for (size_t k = 0; k < requests[i].row.size(); ++k)
        ASSERT_EQ(packer.pool().at(positions[i] + k), requests[i].row[k]);
    }
    EXPECT_LT(packer.pool().size(), total + 40);
  }
  RowPacker<int> small(0);
  small.place({{{1, 2, 3, 4}, 0}, {{2, 3}, 0}, {{4, 5}, 0}, {{1, 2, 3, 4}, 0}});
  EXPECT_EQ(small.pool(), (std::vector<int>{1, 2, 3, 4, 5}));
}

// The library's built-in payloads are these values: 578 and 192 bytes.
// All flags apart, positions, separators that ASCII has not.
TEST(LocaleText, TerritoriesReadBack) {
  for (size_t bit = 0; bit < 7; ++bit) {
    TerritorySource territory;
    territory.flags[bit] = true;
    territory.separators.fill(u'\u00A0');
    territory.positive_position = 4, territory.negative_position = 1;
    const ByteVector packed = pack_territory(territory, "t");
    EXPECT_EQ(lx::le16(&packed[20]), 1U << bit);
    EXPECT_EQ(lx::le16(&packed[16]), 0x0104);
    std::stringstream dump;
    write_territory(dump, territory);
    EXPECT_EQ(pack_territory(read_territory(dump, "d"), "d"), packed);
  }
}

TEST(Ucm, WriterRefusesTextThatCannotBeReadBack) {
  for (const char* text : {"a \"quoted\" word", "two\nlines"}) {
    CodepageSource source;
    source.source = text;
    std::ostringstream out;
    EXPECT_THROW(write_ucm(out, source), SourceError) << text;
  }
}

// An editor's byte-order mark and carriage returns change nothing.
TEST(Sources, LineEndsOfAnyKind) {
  const Control control = read_source_control(LEXICOR_DATA_DIR);
  for (const ObjectType type :
       {ObjectType::kLanguage, ObjectType::kTerritory, ObjectType::kCodepage, ObjectType::kSort}) {
    const ObjectName& name = *std::find_if(control.objects.begin(), control.objects.end(),
                                           [&](const ObjectName& object) { return object.type == type; });
    std::ifstream in(std::string(LEXICOR_DATA_DIR) + '/' + source_file_name(name), std::ios::binary);
    const std::string plain{std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>()};
    std::string edited = "\xEF\xBB\xBF";
    for (const char c : plain) edited += c == '\n' ? "\r\n" : std::string(1, c);
    std::istringstream edited_in(edited), plain_in(plain);
    EXPECT_EQ(compile_object(edited_in, "e", name, control).bytes,
              compile_object(plain_in, "p", name, control).bytes);
  }
}

TEST(ShippedAliases, StandOnceAndNeverHideAnObject) {
  auto upper = [](std::string text) {
    for (char& c : text) c = static_cast<char>(toupper(c));
    return text;
  };
  std::set<std::string> objects, headings, names;
  for (const ObjectName& object : read_source_control(LEXICOR_DATA_DIR).objects)
    if (object.type == ObjectType::kCodepage) objects.insert(upper(object.name));
  std::ifstream in(LEXICOR_DATA_DIR "/alias.txt");
  for (std::string line, word; std::getline(in, line);) {
    if (line.empty() || line[0] == '#') continue;
    std::istringstream words(line);
    if (line[0] != ' ' && words >> word) headings.insert(upper(word)), words.seekg(0);
    while (words >> word) EXPECT_TRUE(names.insert(upper(word)).second) << word;
  }
  EXPECT_EQ(headings, objects);
}

}  // namespace
}  // namespace lexicor_data
