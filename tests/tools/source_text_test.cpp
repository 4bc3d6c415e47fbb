// The text sources beside codepages: languages, territories, the object list and the aliases. What they become,
// and where each fault is reported.
#include <gtest/gtest.h>

#include <fstream>
#include <iterator>
#include <sstream>

#include "alias_source.h"
#include "compile.h"
#include "control_source.h"
#include "core/lxbytes.h"
#include "language_toml.h"
#include "row_packer.h"
#include "sha256.h"
#include "territory_toml.h"
#include "ucm.h"

namespace lexicor_data {
namespace {

/// The objects of the library's built-in data.
Control built_in_control() {
  std::istringstream text("codepage 1 US-ASCII\nlanguage 1 English\nterritory 1 UnitedStates\n");
  return read_control(text, "control.txt");
}

std::string shipped(const std::string& file) {
  std::ifstream in(std::string(LEXICOR_DATA_DIR) + '/' + file, std::ios::binary);
  return {std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>()};
}

/// `text` with its first `from` replaced.
std::string with(std::string text, const std::string& from, const std::string& to) {
  const size_t at = text.find(from);
  EXPECT_NE(at, std::string::npos) << from;
  return at == std::string::npos ? text : text.replace(at, from.size(), to);
}

template <typename Step>
std::string fault_of(Step step) {
  try {
    step();
  } catch (const SourceError& error) {
    return error.what();
  }
  return "";
}

TEST(Sha256, StandardVectors) {
  auto hex = [](const std::string& text) {
    std::string out;
    for (uint8_t byte : sha256(text)) {
      out += "0123456789abcdef"[byte >> 4];
      out += "0123456789abcdef"[byte & 15];
    }
    return out;
  };
  EXPECT_EQ(hex(""), "e3b0c44298fc1c149afbf4c8996fb92427ae41e4649b934ca495991b7852b855");
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
  for (int round = 0; round < 50; ++round) {
    RowPacker<uint16_t> packer(0xFFFF);
    size_t total = 0;
    for (int turn = 0; turn < 2; ++turn) {
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
        for (size_t k = 0; k < requests[i].row.size(); ++k) {
          ASSERT_EQ(packer.pool().at(positions[i] + k), requests[i].row[k]);
        }
      }
    }
    EXPECT_LT(packer.pool().size(), total + 40);
  }
  RowPacker<int> packer(0);
  packer.place({{{1, 2, 3, 4}, 0}, {{2, 3}, 0}, {{4, 5}, 0}, {{1, 2, 3, 4}, 0}});
  EXPECT_EQ(packer.pool(), (std::vector<int>{1, 2, 3, 4, 5}));
}

// The library's built-in payloads are these values: 578 and 192 bytes.
TEST(LocaleText, BuiltInValuesHaveTheBuiltInLayout) {
  const std::string language_text = with(shipped("languages/English.toml"), "\"Latin1\"", "1");
  std::istringstream language_in(language_text), territory_in(shipped("territories/UnitedStates.toml"));
  const ByteVector language = pack_language(read_language(language_in, "e", built_in_control()), "e");
  const ByteVector territory = pack_territory(read_territory(territory_in, "u"), "u");
  auto word = [](const ByteVector& payload, size_t n) { return lx::le16(&payload[2 * n]); };

  ASSERT_EQ(language.size(), 578U);
  const std::vector<std::pair<size_t, uint16_t>> language_words = {{0, 1}, {1, 1},   {2, 0},    {3, 0},
                                                                   {4, 0}, {5, 102}, {49, 578}, {50, 578}};
  for (const auto& [n, value] : language_words) EXPECT_EQ(word(language, n), value) << n;
  EXPECT_EQ(lx::le16(&language[word(language, 33)]), 0) << "the 13th month is empty";
  EXPECT_EQ(lx::le16(&language[word(language, 47)]), 'A');

  ASSERT_EQ(territory.size(), 192U);
  const std::vector<std::pair<size_t, uint16_t>> territory_words = {
      {0, '.'}, {1, ','}, {2, ','}, {3, '.'},   {4, ','}, {5, 2},   {6, 2},
      {7, 2},   {8, 3},   {9, 0},   {10, 0x6B}, {11, 46}, {22, 192}};
  for (const auto& [n, value] : territory_words) EXPECT_EQ(word(territory, n), value) << n;
  EXPECT_EQ(lx::le16(&territory[word(territory, 17)]), 0) << "no positive sign";
  EXPECT_EQ(lx::le16(&territory[word(territory, 18)]), '-');
}

// Thirteen months, special mappings, characters that need quoting or two units, all flags apart.
TEST(LocaleText, DumpsReadBack) {
  const std::string text =
      "abbreviation = \"\\\"\\\\\"\nname = \"\\u05E2\\u2009\\U0001F600\\t\"\n"
      "default = { territory = 1, codepage = \"us-ascii\", sort = 0 }\n"
      "days = [\"1\",\"2\",\"3\",\"4\",\"5\",\"6\",\"7\"]\nshort_days = [\"\",\"\",\"\",\"\",\"\",\"\",\"\"]\n"
      "months = [\"1\",\"2\",\"3\",\"4\",\"5\",\"6\",\"7\",\"8\",\"9\",\"10\",\"11\",\"12\",\"13\"]\n"
      "short_months = [\"1\",\"2\",\"3\",\"4\",\"5\",\"6\",\"7\",\"8\",\"9\",\"10\",\"11\",\"12\"]\n"
      "morning = \"\"\nafternoon = \"\\u00A0\"\n"
      "special_upper = [{ from = \"\\u00DF\", to = \"SS\" }]\n"
      "special_lower = [{ from = \"I\\u0307\", to = \"i\" }]\n";
  std::istringstream in(text);
  const Control control = built_in_control();
  const ByteVector payload = pack_language(read_language(in, "l", control), "l");
  EXPECT_EQ(lx::le16(&payload[2 * 3]), 1);
  EXPECT_EQ(lx::le16(&payload[2 * 50]), lx::le16(&payload[2 * 49]) + 8);
  const uint8_t* special = &payload[lx::le16(&payload[2 * 49])];
  EXPECT_EQ((std::vector<int>{lx::le16(special), lx::le16(special + 2), lx::le16(special + 4),
                              lx::le16(special + 6)}),
            (std::vector<int>{0xDF, 0, 'S', 'S'}));
  for (const Control* names : {&control, static_cast<const Control*>(nullptr)}) {
    std::stringstream dump;
    write_language(dump, unpack_language(payload), names);
    EXPECT_EQ(pack_language(read_language(dump, "d", control), "d"), payload) << dump.str();
  }

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

TEST(LocaleText, FaultsNameTheirPlace) {
  const std::string language = with(shipped("languages/English.toml"), "\"Latin1\"", "1");
  const std::string territory = shipped("territories/UnitedStates.toml");
  const struct {
    bool is_language;
    const char *from, *to, *fault;
  } cases[] = {
      {true, "name = \"English\"\n", "", "f:1:1: the key name is missing"},
      {true, "morning", "evening", "f:1:1: the key morning is missing"},
      {true, "\"Sunday\", ", "", "f:4:8: expected a list of 7 texts"},
      {true, "\"UnitedStates\"", "\"Atlantis\"", "f:3:25: no territory has the name Atlantis"},
      {true, "codepage = 1", "codepage = 2", "f:3:52: no codepage has the identifier 2"},
      {true, "\"Sun\"", "7", "f:5:15: expected a text"},
      {true, "\"AM\"", "\"A", "f:8:"},
      {true, "\"AM\"", "\"A\\u0000\"", "f:8:11: a text cannot hold U+0000"},
      {true, "morning", "evening = 1\nmorning", "f:8:11: unknown key evening"},
      {true, "morning", "special_upper = [{ from = \"\", to = \"x\" }]\nmorning",
       "f:8:27: expected one or two characters"},
      {false, "decimal = \".\"", "decimal = \"..\"", "f:9:11: expected one character up to U+FFFF"},
      {false, "positive_position = 3", "positive_position = 5", "f:31:21: expected a number from 0 to 4"},
      {false, "flag58 = true", "flag58 = 1", "f:3:10: expected true or false"},
      {false, "[placement]", "[other]", "f:1:1: the key placement is missing"},
  };
  for (const auto& test : cases) {
    SCOPED_TRACE(test.to);
    std::istringstream in(with(test.is_language ? language : territory, test.from, test.to));
    const std::string fault = fault_of([&] {
      if (test.is_language) {
        read_language(in, "f", built_in_control());
      } else {
        read_territory(in, "f");
      }
    });
    EXPECT_EQ(fault.substr(0, std::string(test.fault).size()), test.fault) << fault;
  }
}

TEST(ObjectList, OrderNamesAndFaults) {
  std::istringstream in("# list\ncodepage 819 Latin1 # comment\n\n  language\t7 B\r\nlanguage 2 A\n");
  const Control control = read_control(in, "c");
  std::ostringstream out;
  write_control(out, control);
  EXPECT_EQ(out.str(), "language 2 A\nlanguage 7 B\ncodepage 819 Latin1\n");
  EXPECT_EQ(control.find(ObjectType::kCodepage, "LATIN1")->id, 819);

  const ByteVector table = pack_control(control);
  ASSERT_EQ(table.size(), 3 * 38U);
  EXPECT_EQ(unpack_control(table, "c").objects[2].name, "Latin1");

  const std::string long_name(34, 'x');
  const std::pair<std::string, std::string> cases[] = {
      {"language 1", "c:1:1: expected: type identifier name"},
      {"tongue 1 A", "c:1:1: unknown type tongue"},
      {"language 0 A", "c:1:10: the identifier"},
      {"language 65536 A", "c:1:10: the identifier"},
      {"language 1 " + long_name, "c:1:12: the name is longer than 33 bytes"},
      {"language 1 a/b", "c:1:12: the name holds"},
      {"language 1 ..", "c:1:12: the name begins with a dot"},
      {"sort 1 binary", "c:1:8: Binary is"},
      {"language 1 A\nlanguage 1 B", "c:2:1: identifier 1 is used twice"},
      {"language 1 A\nlanguage 2 a", "c:2:1: name a is used twice"},
  };
  for (const auto& [text, fault] : cases) {
    std::istringstream faulty(text);
    EXPECT_EQ(fault_of([&] { read_control(faulty, "c"); }).substr(0, fault.size()), fault) << text;
  }

  auto broken = [&](size_t at, uint8_t value) {
    ByteVector bytes = table;
    bytes[at] = value;
    return fault_of([&] { unpack_control(bytes, "c"); });
  };
  EXPECT_EQ(broken(38, 2), "c: record 1: identifiers do not ascend");
  EXPECT_EQ(broken(2, 1), "c: record 1: types do not ascend");
  EXPECT_EQ(broken(3, 1), "c: record 0: the flags byte is not 0");
  EXPECT_EQ(broken(2 * 38 + 2, 4), "c: record 2: the type is not 0 to 3");
}

TEST(AliasFile, FaultsNameTheirPlace) {
  const Control control = built_in_control();
  const std::pair<std::string, std::string> cases[] = {
      {"# none\n\nus-ascii ASCII ascii\n C POSIX\n", ""},
      {" C\n", "a:1:2: aliases stand before the first codepage name"},
      {"US-ASCII C\nLatin1 L1\n", "a:2:1: no codepage has the name Latin1"},
      {"\tUS-ASCII C\n", "a:1:1: a line begins with"},
      {"US-ASCII " + std::string(64, 'x') + "\n", ""},
      {"US-ASCII C " + std::string(65, 'x') + "\n", "a:1:12: the alias is longer than 64 bytes"},
      {"US-ASCII C\r\n", "a:1:11: a carriage return"},
  };
  for (const auto& [text, fault] : cases) {
    std::istringstream in(text);
    const std::string found = fault_of([&] { check_aliases(in, "a", control); });
    EXPECT_EQ(fault.empty() ? found : found.substr(0, fault.size()), fault) << text;
  }
}

}  // namespace
}  // namespace lexicor_data
