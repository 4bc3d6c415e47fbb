// The text sources beside codepages: languages, territories, the object list and the aliases. What they become,
// and where each fault is reported.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstring>
#include <fstream>
#include <functional>
#include <iterator>
#include <set>
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

/// A shipped source without the comment on its first line.
std::string shipped(const std::string& file) {
  std::ifstream in(std::string(LEXICOR_DATA_DIR) + '/' + file, std::ios::binary);
  std::string comment;
  std::getline(in, comment);
  return {std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>()};
}

/// `text` with its first `from` replaced.
std::string with(std::string text, const std::string& from, const std::string& to) {
  const size_t at = text.find(from);
  EXPECT_NE(at, std::string::npos) << from;
  return at == std::string::npos ? text : text.replace(at, from.size(), to);
}

std::string fault_of(const std::function<void()>& step) {
  try {
    step();
  } catch (const SourceError& error) {
    return error.what();
  }
  return "none";
}

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
TEST(LocaleText, BuiltInValuesHaveTheBuiltInLayout) {
  const std::string language_text =
      with(with(shipped("languages/English.toml"), "\"UTF-8\"", "1"), "\"Default\"", "0");
  std::istringstream language_in(language_text), territory_in(shipped("territories/UnitedStates.toml"));
  const ByteVector language = pack_language(read_language(language_in, "e", built_in_control()), "e");
  const ByteVector territory = pack_territory(read_territory(territory_in, "u"), "u");
  auto word = [](const ByteVector& payload, int n) { return lx::le16(&payload[static_cast<size_t>(2 * n)]); };

  ASSERT_EQ(language.size(), 578U);
  for (auto [n, value] : {std::pair{0, 1}, {1, 1}, {2, 0}, {3, 0}, {4, 0}, {5, 102}, {49, 578}, {50, 578}})
    EXPECT_EQ(word(language, n), value) << n;
  EXPECT_EQ(lx::le16(&language[word(language, 33)]), 0) << "the 13th month is empty";
  EXPECT_EQ(lx::le16(&language[word(language, 47)]), 'A');

  ASSERT_EQ(territory.size(), 192U);
  const int words[] = {'.', ',', ',', '.', ',', 2, 2, 2, 3, 0, 0x6B, 46};
  for (int n = 0; n < 12; ++n) EXPECT_EQ(word(territory, n), words[n]) << n;
  EXPECT_EQ(word(territory, 22), 192);
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
  const uint8_t stored[] = {0xDF, 0, 0, 0, 'S', 0, 'S', 0};
  EXPECT_EQ(memcmp(special, stored, sizeof(stored)), 0);
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

TEST(ObjectList, OrderAndTable) {
  std::istringstream in("# list\ncodepage 819 Latin1 # comment\n\n  language\t7 B\r\nlanguage 2 A\n");
  const Control control = read_control(in, "c");
  std::ostringstream out;
  write_control(out, control);
  EXPECT_EQ(out.str(), "language 2 A\nlanguage 7 B\ncodepage 819 Latin1\n");
  EXPECT_EQ(control.find(ObjectType::kCodepage, "LATIN1")->id, 819);

  const ByteVector table = pack_control(control);
  ASSERT_EQ(table.size(), 3 * 38U);
  EXPECT_EQ(unpack_control(table, "c").objects[2].name, "Latin1");
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

TEST(Sources, FaultsNameTheirPlace) {
  const std::string language =
      with(with(shipped("languages/English.toml"), "\"UTF-8\"", "1"), "\"Default\"", "0");
  const std::string territory = shipped("territories/UnitedStates.toml");
  const Control control = built_in_control();
  using In = std::istream;
  const std::function<void(In&)> as_language = [&](In&in) { read_language(in, "f", control); },
                                 as_territory = [&](In&in) { read_territory(in, "f"); },
                                 as_control = [&](In&in) { read_control(in, "f"); },
                                 as_aliases = [&](In&in) { check_aliases(in, "f", control); };
  const struct {
    const std::function<void(In&)>& read;
    std::string text;
    std::string fault;
  } cases[] = {
      {as_language, with(language, "name = \"English\"\n", ""), "f:1:1: the key name is missing"},
      {as_language, with(language, "\"Sunday\", ", ""), "f:4:8: expected a list of 7 texts"},
      {as_language, with(language, "\"UnitedStates\"", "\"Mu\""), "f:3:25: no territory has the name Mu"},
      {as_language, with(language, "page = 1", "page = 2"), "f:3:52: no codepage has the identifier 2"},
      {as_language, with(language, "\"Sun\"", "7"), "f:5:15: expected a text"},
      {as_language, with(language, "\"AM\"", "\"A"), "f:8:"},
      {as_language, with(language, "\"AM\"", "\"A\\u0000\""), "f:8:11: a text cannot hold U+0000"},
      {as_language, with(language, "morning", "evening = 1\nmorning"), "f:8:1: unknown key evening"},
      {as_language, with(language, "morning", "mornnig"), "f:8:1: unknown key mornnig; did you mean morning?"},
      {as_language, with(language, "morning", "special_upper = [{ from = \"\", to = \"x\" }]\nmorning"),
       "f:8:27: expected one or two characters"},
      {as_territory, with(territory, "= \".\"", "= \"..\""), "f:9:11: expected one character up to U+FFFF"},
      {as_territory, with(territory, "e_position = 3", "e_position = 5"),
       "f:31:21: expected a number from 0 to 4"},
      {as_territory, with(territory, "\nsymbol =", "\nsymbols ="),
       "f:25:1: unknown key symbols; did you mean symbol?"},
      {as_territory, with(territory, "flag58 = true", "flag58 = 1"), "f:3:10: expected true or false"},
      {as_control, "# none\n", "f: lists no objects"},
      {as_control, "language 1", "f:1:1: expected: type identifier name"},
      {as_control, "tongue 1 A", "f:1:1: unknown type tongue"},
      {as_control, "language 0 A", "f:1:10: the identifier"},
      {as_control, "language 65536 A", "f:1:10: the identifier"},
      {as_control, "language 1 " + std::string(34, 'x'), "f:1:12: the name is longer than 33 bytes"},
      {as_control, "language 1 a/b", "f:1:12: the name holds"},
      {as_control, "language 1 ..", "f:1:12: the name begins with a dot"},
      {as_control, "sort 1 binary", "f:1:8: Binary is"},
      {as_control, "language 1 A\nlanguage 1 B", "f:2:1: identifier 1 is used twice"},
      {as_control, "language 1 A\nlanguage 2 a", "f:2:1: name a is used twice"},
      {as_aliases, "# none\n\nus-ascii ASCII ascii\n C POSIX\n", "none"},
      {as_aliases, " C\n", "f:1:2: aliases stand before the first codepage name"},
      {as_aliases, "US-ASCII C\nLatin1 L1\n", "f:2:1: no codepage has the name Latin1"},
      {as_aliases, "\tUS-ASCII C\n", "f:1:1: a line begins with"},
      {as_aliases, "US-ASCII " + std::string(64, 'x') + "\n", "none"},
      {as_aliases, "US-ASCII C " + std::string(65, 'x'), "f:1:12: the alias is longer than 64 bytes"},
      {as_aliases, "US-ASCII C\rX\n", "f:1:11: a carriage return"},
      {as_aliases, "\xEF\xBB\xBFUS-ASCII C\r\n D\r\n", "none"},
  };
  for (const auto& test : cases) {
    std::istringstream in(test.text);
    const std::string fault = fault_of([&] { test.read(in); });
    EXPECT_EQ(fault.substr(0, test.fault.size()), test.fault) << fault;
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
  std::istringstream in(shipped("alias.txt"));
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
