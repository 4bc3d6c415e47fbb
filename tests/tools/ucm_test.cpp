// Codepage tables in the .ucm form: what the reader refuses and where it says so, and the tables, the object
// list and the aliases that are shipped.
#include "ucm.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <map>
#include <set>
#include <sstream>

#include "control_source.h"

namespace lexicor_data {
namespace {

namespace fs = std::filesystem;

constexpr char kSingleHeader[] =
    "<code_set_name> \"Test\"\n"                  // line 1
    "<uconv_class> \"SBCS\"\n"                    // 2
    "<mb_cur_max> 1\n"                            // 3
    "<subchar> \\x3F\n"                           // 4
    "<lexicor:line_ends> \\x0A\\x0D\\x0A\\x0A\n"  // 5
    "<lexicor:ascii> yes\n";                      // 6

std::string replaced(std::string text, const std::string& from, const std::string& to) {
  const size_t at = text.find(from);
  EXPECT_NE(at, std::string::npos) << from;
  return text.replace(at, from.size(), to);
}

std::string multi_header() {
  std::string text = replaced(kSingleHeader, "SBCS", "MBCS");
  return replaced(text, "max> 1", "max> 3") + "<lexicor:leads> 81-8E:2 8F:3 90-9F:2\n";
}

std::string multi_table(const std::string& mappings) {
  return multi_header() + "CHARMAP\n" + mappings + "END CHARMAP\n";
}

std::string with_leads(const std::string& leads) {
  return replaced(multi_header(), "81-8E:2 8F:3 90-9F:2", leads);
}

std::string shift_table(const std::string& mappings) {
  const std::string text = replaced(kSingleHeader, "SBCS", "EBCDIC_STATEFUL");
  return replaced(text, "max> 1", "max> 2") + "CHARMAP\n" + mappings + "END CHARMAP\n";
}

std::string single_table(const std::string& mappings) {
  return kSingleHeader + ("CHARMAP\n" + mappings) + "END CHARMAP\n";
}

CodepageSource read_text(const std::string& text) {
  std::istringstream in(text);
  return read_ucm(in, "test.ucm");
}

std::string write_text(const CodepageSource& source) {
  std::ostringstream out;
  write_ucm(out, source);
  return out.str();
}

struct Refusal {
  std::string text;
  int line;
  int column;
  const char* what;  ///< a part of the message
};

TEST(Ucm, RefusesAndSaysWhere) {
  const std::string head = kSingleHeader;
  const Refusal cases[] = {
      // Keys.
      {"", 1, 1, "<code_set_name> is missing"},
      {head, 7, 1, "CHARMAP is missing"},
      {replaced(head, "<subchar> \\x3F\n", "") + "CHARMAP\nEND CHARMAP\n", 6, 1, "<subchar> is missing"},
      {head + "<icu:base> \"x\"\n", 7, 1, "unknown key <icu:base>"},
      {head + "<subchar> \\x1A\n", 7, 1, "line 4 already"},
      {head + "<subchar \\x1A\n", 7, 2, "closing bracket"},
      {head + "charmap\n", 7, 1, "found 'charmap', expected"},
      {replaced(head, "\"Test\"", "Test"), 1, 17, "found 'Test', expected a text in quotes"},
      {replaced(head, "\"Test\"", "\"Test"), 1, 18, "closing quote"},
      {replaced(head, "\"Test\"", "\"\""), 1, 17, "empty"},
      {replaced(head, "\"Test\"", "\"Test\" 1"), 1, 24, "found '1', expected the end of the line"},
      {replaced(head, "SBCS", "DBCS"), 2, 15, "found class \"DBCS\", expected \"SBCS\""},
      {replaced(head, "max> 1", "max> 5"), 3, 14, "found '5', expected a width"},
      {replaced(head, "\\x3F", "3F"), 4, 11, "found '3F', expected a byte"},
      {replaced(head, "\\x3F", "\\x3"), 4, 14, "found the end of the line, expected a hexadecimal digit"},
      {replaced(head, "\\x3F", "\\x3F\\x40"), 4, 15, "expected the end of the line"},
      {replaced(head, "\\x0D\\x0A\\x0A", "\\x0D\\x0A"), 5, 33, "expected a byte"},
      {replaced(head, "yes", "maybe"), 6, 17, "found 'maybe', expected yes or no"},
      {head + "<lexicor:algorithm> \"UTF-7\"\n", 7, 21, "expected \"UTF-8\""},
      // Keys that contradict each other.
      {replaced(head, "max> 1", "max> 2") + "CHARMAP\nEND CHARMAP\n", 3, 1, "does not agree with the class"},
      {head + "<lexicor:leads> 81:2\nCHARMAP\n", 7, 1, "only the class MBCS has leads"},
      {head + "<lexicor:algorithm> \"UTF-8\"\n", 7, 1, "needs the class MBCS"},
      {with_leads("81-9F:2 8F:3"), 7, 25, "lead 8F is named twice"},
      {with_leads("81:2") + "CHARMAP\n", 3, 1, "not that of the longest lead, 2"},
      {with_leads("9F-81:2"), 7, 17, "runs backwards"},
      {with_leads("81-9F:1"), 7, 23, "found '1', expected a length"},
      {with_leads("81-9F2"), 7, 22, "expected a colon"},
      {with_leads("00:2"), 7, 17, "byte 00"},
      {replaced(with_leads("X"), "<lexicor:leads> X\n", "") + "CHARMAP\n", 7, 1, "is missing"},
      {replaced(multi_table(""), "CHARMAP", "<lexicor:algorithm> \"UTF-8\"\nCHARMAP"), 9, 1,
       "computed codepage"},
      // Mappings: line 8 is the first.
      {single_table("\\x41 |0\n"), 8, 1, "found '\\x41', expected a mapping"},
      {single_table("<X0041> \\x41 |0\n"), 8, 2, "expected a code point"},
      {single_table("<U041> \\x41 |0\n"), 8, 6, "expected a hexadecimal digit"},
      {single_table("<U0000041> \\x41 |0\n"), 8, 9, "closing bracket"},
      {single_table("<U110000> \\x41 |0\n"), 8, 1, "above <U10FFFF>"},
      {single_table("<U00E6><U0300> \\x41 |0\n"), 8, 8, "one code point a mapping"},
      {single_table("<U00E6>+<U0300> \\x41 |0\n"), 8, 8, "one code point a mapping"},
      {single_table("<U0041>\\x41 |0\n"), 8, 8, "expected a blank"},
      {single_table("<U0041> 0x41 |0\n"), 8, 9, "expected a byte"},
      {single_table("<U0041> \\x41\\x42\\x43\\x44\\x45 |0\n"), 8, 25, "at most 4 bytes"},
      {single_table("<U0041> \\x41\n"), 8, 13, "expected the precision"},
      {single_table("<U0041> \\x41 |2\n"), 8, 15, "found '2', expected precision 0, 1 or 3"},
      {single_table("<U0041> \\x41 |0 |0\n"), 8, 17, "expected the end of the line"},
      {kSingleHeader + std::string("CHARMAP\n<U0041> \\x41 |0\n"), 9, 1, "END CHARMAP is missing"},
      {single_table("") + "<U0041> \\x41 |0\n", 9, 1, "nothing after END CHARMAP"},
      // Lengths against class and leads, in every direction of mapping.
      {single_table("<U0041> \\x41\\x42 |0\n"), 8, 9, "2 bytes, but \\x41 begins characters of 1"},
      {multi_table("<U0041> \\xA0\\x42 |3\n"), 9, 9, "\\xA0 begins characters of 1"},
      {multi_table("<U0041> \\xA0\\x42 |0\n"), 9, 9, "\\xA0 begins characters of 1"},
      {multi_table("<U0041> \\x81 |1\n"), 9, 9, "1 byte, but \\x81 begins characters of 2"},
      {multi_table("<U0041> \\x8F\\x42 |0\n"), 9, 9, "begins characters of 3"},
      {shift_table("<U0041> \\x41\\x42\\x43 |0\n"), 8, 9, "3 bytes, expected 1 or 2"},
      {shift_table("<U000E> \\x0E |0\n"), 8, 9, "shift byte"},
      {shift_table("<U000F> \\x0F |3\n"), 8, 9, "shift byte"},
      {shift_table("<U0041> \\x00\\x42 |0\n"), 8, 9, "begins with a zero byte"},
      // Duplicates: the later line, wherever the lines stand.
      {single_table("<U0041> \\x41 |0\n<U0043> \\x43 |0\n<U0042> \\x41 |3\n"), 10, 9,
       "\\x41 is mapped on line 8"},
      {single_table("<U0041> \\x41 |3\n<U0042> \\x41 |3\n"), 9, 9, "\\x41 is mapped on line 8"},
      {single_table("<U0041> \\x41 |0\n\n<U0041> \\x42 |1\n"), 10, 1, "<U0041> is mapped on line 8"},
      {single_table("<U0041> \\x41 |1\n<U0041> \\x42 |1\n"), 9, 1, "<U0041> is mapped on line 8"},
  };
  for (const Refusal& refusal : cases) {
    try {
      read_text(refusal.text);
      ADD_FAILURE() << "accepted:\n" << refusal.text;
    } catch (const SourceError& error) {
      EXPECT_EQ(error.file, "test.ucm");
      EXPECT_EQ(error.line, refusal.line) << error.what() << "\n" << refusal.text;
      EXPECT_EQ(error.column, refusal.column) << error.what() << "\n" << refusal.text;
      EXPECT_NE(std::string(error.what()).find(refusal.what), std::string::npos) << error.what() << "\n"
                                                                                 << refusal.text;
      const std::string place =
          "test.ucm:" + std::to_string(refusal.line) + ":" + std::to_string(refusal.column) + ": ";
      EXPECT_EQ(std::string(error.what()).find(place), 0u) << error.what();
    }
  }
}

TEST(Ucm, ReadsFreelyAndWritesCanonically) {
  const std::string text =
      "# a comment\r\n"
      "<lexicor:ascii>\tyes # a comment\n"
      "<lexicor:source> \"table #1\"\n"
      "  <uconv_class>\"MBCS\"\n"
      "<mb_cur_max> 3\n"
      "<subchar> \\x1a\n"
      "<lexicor:leads> 8f:3   81-8E:2 90:2\n"
      "<lexicor:line_ends> \\x0A\\x0D\\x0A\\x85 \n"
      "<code_set_name> \"Test\"\n"
      "\n"
      "CHARMAP\n"
      "  <U20BB7> \\x8f\\xa1\\xa1 |0\n"
      "<U00A5> \\x41 |1\n"
      "<U0041>\t\\x42  |3 # twice\r\n"
      "<U0041> \\x41 |0\n"
      "END CHARMAP # end\n"
      "# after\n";
  const CodepageSource source = read_text(text);
  EXPECT_EQ(source.width, 3);
  EXPECT_EQ(source.leads[0x8F], 3);
  EXPECT_EQ(source.leads[0x8E], 2);
  EXPECT_EQ(source.leads[0x91], 1);
  EXPECT_EQ(write_text(source),
            "<code_set_name>       \"Test\"\n"
            "<lexicor:source>      \"table #1\"\n"
            "<uconv_class>         \"MBCS\"\n"
            "<mb_cur_max>          3\n"
            "<subchar>             \\x1A\n"
            "<lexicor:line_ends>   \\x0A\\x0D\\x0A\\x85\n"
            "<lexicor:ascii>       yes\n"
            "<lexicor:leads>       81-8E:2 8F:3 90:2\n"
            "CHARMAP\n"
            "<U0041> \\x41 |0\n"
            "<U0041> \\x42 |3\n"
            "<U00A5> \\x41 |1\n"
            "<U20BB7> \\x8F\\xA1\\xA1 |0\n"
            "END CHARMAP\n");
}

TEST(Ucm, WriterRefusesTextThatCannotBeReadBack) {
  CodepageSource source = read_text(single_table(""));
  for (const char* text : {"a \"quoted\" word", "two\nlines"}) {
    source.source = text;
    EXPECT_THROW(write_text(source), SourceError) << text;
  }
}

// The shipped files.

const fs::path kData = LEXICOR_DATA_DIR;

std::string file_text(const fs::path& path) {
  std::ifstream in(path, std::ios::binary);
  std::ostringstream text;
  text << in.rdbuf();
  EXPECT_TRUE(in.good()) << path;
  return text.str();
}

CodepageSource shipped(const std::string& name) {
  const fs::path path = kData / "codepages" / (name + ".ucm");
  std::ifstream in(path, std::ios::binary);
  return read_ucm(in, path.string());
}

Control shipped_control() {
  std::ifstream in(kData / "control.txt", std::ios::binary);
  return read_control(in, "control.txt");
}

std::string upper(std::string text) {
  std::transform(text.begin(), text.end(), text.begin(), [](unsigned char c) { return std::toupper(c); });
  return text;
}

std::set<std::string> shipped_codepages() {
  std::set<std::string> names;
  for (const ObjectName& object : shipped_control().objects) {
    if (object.type == ObjectType::kCodepage) names.insert(object.name);
  }
  return names;
}

TEST(ShippedCodepages, StandInControlOrderAndAreAllThere) {
  std::string listed;
  std::istringstream control(file_text(kData / "control.txt"));
  for (std::string line; std::getline(control, line);) {
    if (!line.empty() && line[0] != '#') listed += line + "\n";
  }
  std::ostringstream ordered;
  write_control(ordered, shipped_control());
  EXPECT_EQ(listed, ordered.str());

  std::set<std::string> files;
  for (const auto& entry : fs::directory_iterator(kData / "codepages"))
    files.insert(entry.path().stem().string());
  EXPECT_EQ(files, shipped_codepages());
  EXPECT_GE(files.size(), 120u);
}

TEST(ShippedCodepages, ReadBackToTheSameBytes) {
  for (const std::string& name : shipped_codepages()) {
    const CodepageSource source = shipped(name);
    EXPECT_EQ(source.name, name);
    EXPECT_TRUE(write_text(source) == file_text(kData / "codepages" / (name + ".ucm"))) << name;
  }
}

/// By code point, then by code, as text is converted.
struct Directions {
  std::map<uint32_t, Mapping> from_unicode;
  std::map<uint32_t, uint32_t> to_unicode;

  explicit Directions(const CodepageSource& source) {
    for (const Mapping& mapping : source.mappings) {
      if (mapping.precision != 3) from_unicode[mapping.unicode] = mapping;
      if (mapping.precision != 1) to_unicode[mapping.code] = mapping.unicode;
    }
  }
};

/// What the formatting and stream functions take for granted about a codepage's family.
TEST(ShippedCodepages, HoldTheCharactersThatFormattingNeeds) {
  for (const std::string& name : shipped_codepages()) {
    const CodepageSource source = shipped(name);
    if (source.utf8) continue;
    const Directions directions(source);
    auto byte_of = [&](uint32_t unicode) {
      const auto found = directions.from_unicode.find(unicode);
      const bool there = found != directions.from_unicode.end() && found->second.bytes == 1;
      return there ? found->second.code : 0x100;
    };
    const std::string syntax = "0123456789+-,./: ABCDEFGHIJKLMNOPQRSTUVWXYZ";
    for (char c : syntax) EXPECT_NE(byte_of(static_cast<uint8_t>(c)), 0x100u) << name << " lacks " << c;
    for (uint32_t digit = 0; digit < 10; ++digit)
      EXPECT_EQ(byte_of('0' + digit), (source.ascii ? 0x30 : 0xF0) + digit);
    EXPECT_EQ(byte_of('-'), source.ascii ? 0x2Du : 0x60u) << name;
    EXPECT_EQ(source.line_ends[0], byte_of('\n')) << name;
    EXPECT_EQ(source.line_ends[1], byte_of('\r')) << name;
    EXPECT_EQ(source.line_ends[2], source.ascii ? 0x0Au : byte_of(0x85)) << name;
    EXPECT_EQ(directions.to_unicode.count(source.substitution), 1u) << name;
    if (!source.ascii) continue;
    for (uint32_t control = 0; control < 0x20; ++control) EXPECT_EQ(byte_of(control), control) << name;
    EXPECT_EQ(byte_of(0x7F), 0x7Fu) << name;
  }
}

TEST(ShippedCodepages, MapWhatTheyAreKnownFor) {
  struct Fact {
    const char* name;
    uint32_t unicode;
    uint32_t code;
    char way;  ///< '=' both, '>' from Unicode only, '<' to Unicode only
  };
  const Fact facts[] = {
      {"MS1252", 0x20AC, 0x80, '='},       {"ISO-8859-15", 0x20AC, 0xA4, '='},
      {"ISO-8859-7", 0x20AC, 0xA4, '='},   {"ISO-8859-16", 0x0218, 0xAA, '='},
      {"IBM437", 0x00B5, 0xE6, '='},       {"IBM437", 0x03BC, 0xE6, '>'},
      {"IBM437", 0x001A, 0x1A, '='},       {"IBM852", 0x00AC, 0xAA, '='},
      {"KOI8-R", 0x0430, 0xC1, '='},       {"TIS-620", 0x0E01, 0xA1, '='},
      {"IBM037", 'A', 0xC1, '='},          {"IBM037", 0x0A, 0x25, '='},
      {"IBM037", 0x85, 0x15, '='},         {"IBM1047", '[', 0xAD, '='},
      {"IBM1140", 0x20AC, 0x9F, '='},      {"IBM930", 'a', 0x62, '='},
      {"IBM930", 0x3042, 0x4481, '='},     {"IBM939", 'a', 0x81, '='},
      {"MS932", 0x3042, 0x82A0, '='},      {"MS932", 0x5C, 0x5C, '='},
      {"MS932", 0xFF5E, 0x8160, '='},      {"MS932", 0x00A2, 0x8191, '>'},
      {"MS932", 0x2252, 0x8790, '<'},      {"MS932", 0x2252, 0x81E0, '='},
      {"JapanEUC", 0x3042, 0xA4A2, '='},   {"JapanEUC", 0xFF71, 0x8EB1, '='},
      {"JapanEUC", 0x4E28, 0x8FB0A9, '='}, {"JapanEUC", 0x4E28, 0xF9AD, '<'},
      {"JapanEUC", 0x301C, 0xA1C1, '>'},   {"MS936", 0x20AC, 0x80, '='},
      {"MS936", 0x4E00, 0xD2BB, '='},      {"MS949", 0xAC02, 0x8141, '='},
      {"EUC-KR", 0xAC00, 0xB0A1, '='},     {"Johab", 0xAC00, 0x8861, '='},
      {"MS950", 0x4E00, 0xA440, '='},      {"EUC-TW", 0x4E00, 0xC4A1, '='},
      {"EUC-TW", 0x4E42, 0x8EA2A1A1, '='},
  };
  std::map<std::string, Directions> tables;
  for (const Fact& fact : facts) {
    if (tables.count(fact.name) == 0) tables.emplace(fact.name, Directions(shipped(fact.name)));
    const Directions& table = tables.at(fact.name);
    const auto forth = table.from_unicode.find(fact.unicode);
    const bool writes = forth != table.from_unicode.end() && forth->second.code == fact.code;
    const auto back = table.to_unicode.find(fact.code);
    const bool reads = back != table.to_unicode.end() && back->second == fact.unicode;
    const char way = writes && reads ? '=' : writes ? '>' : reads ? '<' : ' ';
    EXPECT_EQ(way, fact.way) << fact.name << ' ' << std::hex << fact.unicode << ' ' << fact.code;
  }
}

TEST(ShippedAliases, StandOnceAndNeverHideAnObject) {
  std::set<std::string> objects, headings;
  for (const std::string& name : shipped_codepages()) objects.insert(upper(name));
  std::map<std::string, std::string> codepage_of;
  std::istringstream in(file_text(kData / "alias.txt"));
  std::string codepage;
  for (std::string line; std::getline(in, line);) {
    if (line.empty() || line[0] == '#') continue;
    EXPECT_LE(line.size(), 110u) << line;
    std::istringstream line_words(line);
    if (line[0] != ' ') {
      line_words >> codepage;
      EXPECT_TRUE(headings.insert(upper(codepage)).second) << codepage;
    }
    for (std::string alias; line_words >> alias;) {
      EXPECT_LE(alias.size(), 64u) << alias;
      EXPECT_EQ(objects.count(upper(alias)), 0u) << alias;
      EXPECT_TRUE(codepage_of.emplace(upper(alias), codepage).second) << alias;
    }
  }
  EXPECT_EQ(headings, objects);

  const std::pair<const char*, const char*> typed[] = {
      {"utf8", "UTF-8"},
      {"cp1252", "MS1252"},
      {"windows-1252", "MS1252"},
      {"ibm-037", "IBM037"},
      {"cp037", "IBM037"},
      {"037", "IBM037"},
      {"ebcdic-cp-us", "IBM037"},
      {"sjis", "MS932"},
      {"Shift_JIS", "MS932"},
      {"EUC-JP", "JapanEUC"},
      {"gbk", "MS936"},
      {"big5", "MS950"},
      {"iso8859-1", "Latin1"},
      {"ISO-8859-1", "Latin1"},
      {"ANSI_X3.4-1968", "US-ASCII"},
      {"ISO_8859-2", "ISO-8859-2"},
      {"latin9", "ISO-8859-15"},
      {"IBM01140", "IBM1140"},
  };
  for (const auto& [alias, name] : typed) EXPECT_EQ(codepage_of[upper(alias)], name) << alias;
}

}  // namespace
}  // namespace lexicor_data
