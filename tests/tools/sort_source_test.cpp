// Sort sources: what they become, byte by byte where the layout counts, and that dumping gives the source back.
#include <gtest/gtest.h>

#include <fstream>
#include <iterator>
#include <sstream>

#include "compile.h"
#include "core/lxbytes.h"
#include "object_check.h"
#include "sort_check.h"
#include "sort_pack.h"
#include "ucm.h"

namespace lexicor_data {
namespace {

namespace layout = lx::format::sort;

/// Everything that a source can say, in its canonical form.
const std::string kExample =
    "@defaults 0002 0003\n"
    "@insert secondary\n"
    "@insert none ; 0041..0061\n"
    "@insert primary special ; 4E00..4EFF\n"
    "@insert tertiary ; 0063 0068\n"
    "@uncovered 0200..02FF\n"
    "@uncovered 0400..26FF\n"
    "@specials 2700..27FF ; 0400\n"
    "@uncovered 2800..4CFF\n"
    "@primaries 4D00..4DFF ; 9000\n"
    "@primaries 4E00..4FFF ; 8000\n"
    "@uncovered 5000..FFFF\n"
    "002D ; [*0001.0000.0000] # -\n"
    "0301 ; [.0000.0004.0003] # \u0301\n"
    "0061 ; [.0200.0002.0003] # a\n"
    "0041 ; [.0200.0002.0005] # A\n"
    "00E6 ; [.0200.0002.0004][.0210.0002.0004] # æ\n"
    "0063 0068 ; [.0205.0002.0003] # ch\n"
    "0065 ; [.0210.0002.0003] # e\n"
    "0101 ; [.0211.0002.0003] # ā\n";

const ObjectName kName{ObjectType::kSort, 1, "s", 0};

SortSource read_text(const std::string& text) {
  std::istringstream in(text);
  return read_sort(in, "s.txt");
}

std::string written(const SortSource& sort) {
  std::ostringstream out;
  write_sort(out, sort);
  return out.str();
}

ByteVector payload_of(const std::string& text) {
  ByteVector payload = pack_sort(read_text(text), "s.txt");
  check_object({{payload}, 2, ""}, kName, "s");
  return payload;
}

TEST(Sort, BecomesItsPayloadAndComesBack) {
  const ByteVector payload = payload_of(kExample);
  EXPECT_EQ(written(unpack_sort(payload)), kExample);
  EXPECT_EQ(payload_of("# any order\n" + kExample.substr(kExample.find("002D")) +
                       kExample.substr(0, kExample.find("002D"))),
            payload);

  auto word = [&](size_t at) { return size_t{lx::le16(&payload.at(at))}; };
  auto page = [&](size_t number) { return layout::kPages + layout::Page::kBytes * number; };
  EXPECT_EQ(payload[0], 2);
  EXPECT_EQ(payload[1], 3);
  EXPECT_EQ(word(2), 1U) << "expansions";
  EXPECT_EQ(word(4), 1U) << "contractions";
  const struct {
    size_t page;
    uint8_t flags, char_class;
    size_t base;
  } pages[] = {{0x27, 4, 0b1011, 0x400},
               {0x4D, 2, 0b1011, 0x9000},
               {0x4E, 2, 0b0110, 0x8000},
               {0x4F, 2, 0b1011, 0x8100},
               {0x50, 1, 0, 0}};
  for (const auto& expected : pages) {
    EXPECT_EQ(payload[page(expected.page)], expected.flags) << expected.page;
    EXPECT_EQ(payload[page(expected.page) + 1], expected.char_class) << expected.page;
    EXPECT_EQ(word(page(expected.page) + 2), expected.base) << expected.page;
  }
  auto record = [&](size_t code) {
    const size_t at = word(1030) + 6 * (word(page(code >> 8) + 2) + (code & 0xFF));
    return ByteVector(payload.begin() + static_cast<std::ptrdiff_t>(at),
                      payload.begin() + static_cast<std::ptrdiff_t>(at) + 6);
  };
  EXPECT_EQ(record(0x2D), (ByteVector{1, 0, 0, 0, 0, 0x80 | 0b1011 << 2}));
  EXPECT_EQ(record(0x41), (ByteVector{0, 2, 2, 5, 0, 0b1111 << 2}));
  EXPECT_EQ(record(0xE6), (ByteVector{0, 0, 0, 0, 0, 0x40 | 0b1011 << 2}));
  EXPECT_EQ(record(0x42), (ByteVector{0, 0, 0, 0, 0, 0})) << "no line, no weights";
  const ByteVector tail(payload.begin() + static_cast<std::ptrdiff_t>(word(1032)), payload.end());
  EXPECT_EQ(tail, (ByteVector{0xE6, 0, 0,    2, 2, 4, 0x10, 2, 2, 4,          0, 0, 0, 0,  //
                              0x63, 0, 0x68, 0, 5, 2, 2,    3, 0, 0b1101 << 2}));
}

TEST(Sort, PagesShareWhatTheyHaveAlike) {
  // Three pages of the same weights, and one that begins with the zeros that they end with.
  std::string text = "@defaults 0001 0001\n@uncovered 0400..FFFF\n";
  for (const char* code : {"0041", "0141", "0241", "03FF"})
    text += code + std::string(" ; [.0300.0001.0001]\n");
  EXPECT_LT(payload_of(text).size(), layout::kFixedBytes + 2 * 256 * layout::WeightRecord::kBytes);
  text = "@defaults 0001 0001\n@uncovered 3000..FFFF\n";
  for (unsigned code = 0; code < 0x3000; ++code) {
    char line[32];
    std::snprintf(line, sizeof line, "%04X ; [.%04X.0001.0001]\n", code, code + 0x200);
    text += line;
  }
  try {
    payload_of(text);
    ADD_FAILURE() << "it has room";
  } catch (const SourceError& error) {
    EXPECT_STREQ(error.what(),
                 "s.txt: the payload takes 74764 bytes, more than 65535: weights 73728, expansions 0, "
                 "contractions 0");
  }
}

TEST(Sort, CheckFindsWhatIsBrokenInAPayload) {
  const ByteVector sound = payload_of(kExample +
                                      "00C6 ; [.0200.0002.0006][.0210.0002.0006]\n"
                                      "0063 0069 ; [.0206.0002.0003]\n");
  const size_t expansions = lx::le16(&sound[layout::kExpansions]);
  const size_t contractions = lx::le16(&sound[layout::kContractions]);
  const struct {
    size_t at, value;
    const char* fault;
  } cases[] = {
      {layout::kExpansionCount, 0x7FFF, "expansions lie outside"},
      {layout::kContractionCount, 0x7FFF, "contractions lie outside"},
      {layout::kWeights, 0xFFF0, "section 0, offset 6: the weights of a page lie outside"},
      {layout::kWeights, 0, "weights of page 0 lie inside"},
      {layout::kPages + 2, 0xFFFF, "weights of a page lie outside"},
      {layout::kExpansionCount, 1, "has no expansion"},
      {expansions, 0xE7, "expansions are not sorted"},
      {contractions + 2, 0x69, "contractions are not sorted"},
      {contractions, 0x64, "contractions are not sorted"},
  };
  for (const auto& test : cases) {
    ByteVector broken = sound;
    lx::put_le16(&broken[test.at], static_cast<uint16_t>(test.value));
    try {
      check_object({{broken}, 2, ""}, kName, "s");
      ADD_FAILURE() << test.fault;
    } catch (const SourceError& error) {
      EXPECT_NE(std::string(error.what()).find(test.fault), std::string::npos) << error.what();
    }
  }
  // Whatever a byte becomes: a sort that is refused, or one that is written and read again.
  for (size_t at = 0; at < sound.size(); ++at) {
    ByteVector bytes = sound;
    bytes[at] = static_cast<uint8_t>(~bytes[at]);
    try {
      check_object({{bytes}, 2, ""}, kName, "s");
      const SortSource sort = unpack_sort(bytes);
      check_sort(sort, "s");
      EXPECT_EQ(written(read_text(written(sort))), written(sort)) << at;
    } catch (const SourceError&) {
      continue;
    }
  }
}

TEST(Sort, ShippedSourcesAreCanonical) {
  const Control control = read_source_control(LEXICOR_DATA_DIR);
  size_t sorts = 0;
  for (const ObjectName& name : control.objects) {
    if (name.type != ObjectType::kSort) continue;
    const std::string file = LEXICOR_DATA_DIR "/" + source_file_name(name);
    std::ifstream in(file, std::ios::binary);
    std::string comment;
    std::getline(in, comment);
    const std::string text{std::istreambuf_iterator<char>(in), {}};
    std::istringstream source(text);
    const CompiledObject object = compile_object(source, file, name, control);
    EXPECT_TRUE(dump_object(read_object(object.bytes, file), name, &control, file) == text) << file;
    ++sorts;
  }
  EXPECT_GT(sorts, 0U);
}

}  // namespace
}  // namespace lexicor_data
