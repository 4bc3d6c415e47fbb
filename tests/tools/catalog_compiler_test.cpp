// The catalog compiler: what sources and PO files become, what is refused and where, merging, the bytes of the
// file in both byte orders, the way to a source and back, and damaged files.
#include <gtest/gtest.h>
#include <unistd.h>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <random>
#include <sstream>

#include "catalog_file.h"
#include "gencat.h"
#include "lexicor/command.h"
#include "lexicor/hex.h"

namespace lexicor_gencat {
namespace {

namespace fs = std::filesystem;
using lexicor_cli::Failure;

class CatalogCompiler : public testing::Test {
 protected:
  CatalogCompiler() : session_({LEXICOR_LOCALE_DIR}) {
    fs::create_directory(directory_);
    options_.catalog = file("x.cat");
  }
  ~CatalogCompiler() override { fs::remove_all(directory_); }

  std::string file(const std::string& name) const { return (directory_ / name).string(); }
  static std::string read(const std::string& path) {
    std::ifstream in(path, std::ios::binary);
    return {std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>()};
  }
  std::string write(const std::string& name, const std::string& bytes) const {
    std::ofstream(file(name), std::ios::binary) << bytes;
    return file(name);
  }

  /// Compiles sources, and gives the messages that come of it without the directory's name, or
  /// "SET.NUMBER=TEXT" of the catalog with what is not printable ASCII in hexadecimal.
  std::string result(const std::vector<std::string>& sources, const std::string& suffix = ".msg") {
    options_.sources.clear();
    for (const std::string& source : sources)
      options_.sources.push_back(write(std::to_string(options_.sources.size()) + suffix, source));
    std::ostringstream log;
    try {
      const bool done = compile(session_, options_, log);
      return without_directory(log.str()) + (done ? texts_of(options_.catalog) : "");
    } catch (const Failure& failure) {
      return without_directory(failure.what());
    }
  }

  std::string without_directory(std::string text) const {
    for (size_t at; (at = text.find(directory_.string() + "/")) != std::string::npos;)
      text.erase(at, directory_.string().size() + 1);
    return text;
  }

  static std::string texts_of(const std::string& path) {
    std::string out;
    for (const auto& [set, messages] : unpack_catalog(read(path), path).sets) {
      for (const auto& [number, text] : messages) {
        out += (out.empty() ? "" : " ") + std::to_string(set) + "." + std::to_string(number) + "=";
        for (const char c : text)
          out +=
              c > ' ' && c < 0x7F && c != '<' ? std::string(1, c) : "<" + lexicor_cli::hex_bytes({&c, 1}) + ">";
      }
    }
    return out;
  }

  std::string dumped(const std::string& catalog, const std::string& source_encoding) {
    Options options;
    options.catalog = write("y.cat", catalog);
    options.output = file("y.msg");
    options.source_encoding = source_encoding;
    dump(session_, options);
    return read(options.output);
  }

  const fs::path directory_ = fs::temp_directory_path() / ("lexicor-gencat-" + std::to_string(getpid()));
  lexicor_cli::Session session_;
  Options options_;
};

TEST_F(CatalogCompiler, Sources) {
  const struct {
    const char *locale, *from, *source, *expected;
  } cases[] = {
      {"", "", "$ comment\n$\n\n1 one\n$set 3 text\n2  two \n$set 2\r\n1 x\n", "1.1=one 2.1=x 3.2=<20>two<20>"},
      {"", "", "9 b\n1 a\n$set 1\n5 c", "1.1=a 1.5=c 1.9=b"},
      {"", "", "1 \\n\\t\\v\\b\\r\\f\\\\\\q\\\"\n2 \\101\\0123\\7x\\377\\4011",
       "1.1=<0A><09><0B><08><0D><0C>\\q\" 1.2=A<0A>3<07>x<FF><20>11"},
      {"", "", "1 a\\\n b\\\\\n2 c\\\\\\\nd\n3 e\\", "1.1=a<20>b\\ 1.2=c\\d 1.3=e"},
      {"", "", "$ more \\\n1 no\n2 yes", "1.2=yes"},
      {"", "", "$quote \"\n1 \"a \"\n2 \"\"\n3 a\\\"b\n$quote\n4 \"x\"\n$quote x\n5 xyx",
       "1.1=a<20> 1.2= 1.3=a\"b 1.4=\"x\" 1.5=y"},
      {"", "", "1 x\n2 \n3 z\n1\n4\n", "1.2= 1.3=z"},
      {"", "", "$set 2\n1 x\n$set 3\n1 y\n$delset 2\n2 z\n$set 2\n5 w", "2.5=w 3.1=y 3.2=z"},
      {"", "", "$set 4\n1 x\n$set A\nM text\nN more\n1 clash\n", "4.1=x 5.1=clash 5.2=more 5.3=text"},
      {"", "", "$set 1\n$delset 1\n", ""},
      {"German.Latin1", "", "\xEF\xBB\xBF$ x\r\n1 \xC3\xA4\\\r\nb\r\n2 c\r\n2\r\n3 \r\n", "1.1=<E4>b 1.3="},
      {"German.Latin1", "", "\xEF\xBB\xBF$ codeset=MS1252\n1 a\n",
       "0.msg: begins with the byte-order mark of UTF-8, but its codepage is MS1252"},
      {"", "", "$ codeset=ISO-8859-1\n1 \xE4\n", "1.1=<E4>"},
      {"German_Germany.IBM273", "", "$ codeset=UTF-8\n1 \xC3\xBC[\n", "1.1=<D0>c"},
      {"German_Germany.IBM273", "", "\xF1\x40\x81\x25\xF2\x40\xEC\x95\x15", "1.1=<81> 1.2=%"},
      // 0x5C as the second byte of a character, and as the sign that other codepages have in its place.
      {"Japanese_Japan.MS932", "", "1 \x95\x5C\n2 \x95\x5C\\n\\\\\n", "1.1=<95>\\ 1.2=<95>\\<0A>\\"},
      {"Japanese_Japan.IBM943", "", "1 a\\tb", "1.1=a<09>b"},
      {"Japanese_Japan.IBM930", "UTF-8", "1 A\xE3\x81\x82\xE3\x81\x84z\\n\xE3\x81\x82\\101",
       "1.1=<C1><0E>D<81>D<82><0F><B9>%<0E>D<81><0F>A"},
      {"Japanese_Japan.IBM930", "",
       "\xF1\x40\xC1\x0E\x44\x81\x0F\x0E\x44\x82\x0F\x25\xF2\x40\x0E\x44\x81\x25\xF3\x40\xC1",
       "1.1=<C1><0E>D<81>D<82><0F> 1.2=<0E>D<81><0F> 1.3=<C1>"},
  };
  options_.fresh = true;
  for (const auto& row : cases) {
    options_.locale = row.locale;
    options_.source_encoding = row.from;
    EXPECT_EQ(result({row.source}), row.expected) << row.source;
  }
}

TEST_F(CatalogCompiler, FaultsWithTheirPlaces) {
  const struct {
    const char *locale, *source, *expected;
  } cases[] = {
      {"", "1 a\n1 b\n $x\n?\n$foo x\n",
       "0.msg:2:1: error: message 1 is defined already, at 0.msg:1:1\n"
       "0.msg:3:2: error: expected the message number at the begin of the line, without blanks before it\n"
       "0.msg:4:1: error: expected a message number, a directive that begins with $, or an empty line\n"
       "0.msg:5:1: error: unknown directive $foo; expected $set, $delset, $quote, or $ and a blank before a "
       "comment\n"},
      {"", "$set 0\n$set 4294967296\n$set ?\n$delset N\n$set A\n$set A\nM\nM x\nM-x y\n",
       "0.msg:1:6: error: set number 0; expected 1 to 4294967295\n"
       "0.msg:2:6: error: set number 4294967296; expected 1 to 4294967295\n"
       "0.msg:3:6: error: expected a set number from 1, or a name of letters, digits and _\n"
       "0.msg:4:9: error: unknown set N; expected a number, or a name that $set gave\n"
       "0.msg:6:6: error: set A is defined already, at 0.msg:5:6\n"
       "0.msg:8:1: error: message M is defined already, at 0.msg:7:1\n"
       "0.msg:9:2: error: expected a name of letters, digits and _, and a blank behind it\n"},
      {"", "$quote \"\n1 \xC3\xA4\\\n \"x\n2 \"a\n3 \"b\" c\n4x d",
       "0.msg:3:3: warning: text behind the closing quote is ignored\n"
       "0.msg:4:3: error: the closing quote is missing\n"
       "0.msg:5:7: warning: text behind the closing quote is ignored\n"
       "0.msg:6:2: warning: 'x' behind the message number 4 is ignored; expected a blank\n"},
      {"", "1 \xC3\xA4 \xE4\n2 \xED\n$ \xE4\n3 \xF0\x9F\x98\x80\n",
       "0.msg:1:5: error: byte E4: no character of UTF-8; expected text in this codepage (--source-encoding "
       "names another)\n"
       "0.msg:2:3: error: byte ED: no character of UTF-8; expected text in this codepage (--source-encoding "
       "names another)\n"
       "0.msg:4:3: warning: U+1F600 has no 16-bit Unicode value: programs that fetch it get U+FFFD\n"},
      {"Russian_Russia.KOI8-R", "$ codeset=UTF-8\n1 \xD0\xB9\xC3\xA4?\n2 \xF0\x9F\x98\x80",
       "0.msg:2:4: error: U+00E4: no such character in KOI8-R, the codepage of the catalog\n"
       "0.msg:3:3: error: U+1F600: no such character in KOI8-R, the codepage of the catalog\n"},
      {"", "$ codeset=nonesuch-1\n1 x",
       "0.msg: unknown codepage 'nonesuch-1'; 'lexicor list codepages' shows those there are"},
      {"Klingon", "1 x",
       "no locale 'Klingon': there is no language 'Klingon' ('lexicor list languages' shows those there are; a "
       "locale is named LANGUAGE[_TERRITORY][.CODEPAGE][@SORT])"},
  };
  write("x.cat", "");
  for (const auto& row : cases) {
    options_.locale = row.locale;
    EXPECT_EQ(result({row.source}), row.expected) << row.source;
    EXPECT_EQ(fs::file_size(options_.catalog), 0U) << "written in spite of errors";
  }
  options_.locale.clear();
  std::string many;
  for (int i = 0; i < 30; ++i) many += "?\n";
  const std::string log = result({many, "1 x"});
  EXPECT_EQ(std::count(log.begin(), log.end(), '\n'), 21);
  EXPECT_NE(log.find("0.msg: and 10 more\n"), std::string::npos) << log;
}

TEST_F(CatalogCompiler, MergesIntoWhatIsThere) {
  EXPECT_EQ(result({"1 a\n2 b\n", "2 c\n$set 2\n1 d"}), "1.1=a 1.2=c 2.1=d");
  EXPECT_EQ(result({"1\n3 e\n$delset 2\n$set 3\nM f"}), "1.2=c 1.3=e 3.1=f");
  options_.locale = "German";
  EXPECT_EQ(result({"1 x"}),
            "x.cat: its texts are in English_UnitedStates.UTF-8, not in German; --new replaces it");
  options_.locale = "english_unitedstates.utf-8";
  options_.byte_order = "big";
  EXPECT_EQ(result({"1 x"}), "1.1=x 1.2=c 1.3=e 3.1=f");
  options_.byte_order.clear();
  EXPECT_EQ(result({"$delset 3"}), "1.1=x 1.2=c 1.3=e");
  EXPECT_EQ(read(options_.catalog)[0], 0x47) << "the byte order of what is there";
  options_.fresh = true;
  options_.header = file("x.h");
  EXPECT_EQ(result({"$set 2\nA x\n7 y\n$set S\nB_1 z"}), "2.1=x 2.7=y 3.1=z");
  EXPECT_EQ(without_directory(read(options_.header)),
            "#define AutomaticSet2A 0x1\t/* 0.msg:2 */\n"
            "#define SSet 0x3\t/* 0.msg:4 */\n#define SB_1 0x1\t/* 0.msg:5 */\n");
}

TEST_F(CatalogCompiler, PoFiles) {
  const std::string header = "msgid \"\"\nmsgstr \"\"\n\"Content-Type: text/plain; charset=ISO-8859-1\\n\"\n\n";
  const struct {
    std::string source;
    const char* expected;
  } cases[] = {
      {header + "msgid \"a\"\nmsgstr \"\xE4\\n\"\n\"b\"\n\n#, fuzzy, c-format\nmsgid \"b\"\nmsgstr \"B\"\n"
                "#~ msgid \"old\"\n#~ msgstr \"x\"\nmsgid \"c\"\nmsgstr \"\"\n\nmsgctxt \"menu\"\nmsgid "
                "\"d\"\nmsgstr \"\\x41\\102\"\n",
       "1.1=<E4><0A>b 1.4=AB"},
      {"msgctxt \"5:7\"\nmsgid \"\"\nmsgstr \"m\"\nmsgctxt \"5.9\"\nmsgid \"a\"\nmsgid_plural \"as\"\n"
       "msgstr[0] \"p\"\nmsgstr[1] \"q\"\nmsgid \"x\"\nmsgid_plural \"xs\"\nmsgstr[0] \"r\"\nmsgid "
       "\"y\"\nmsgstr \"s\"",
       "1.1=r 1.7=s 5.7=m 5.9=p 5.10=q"},
      {"msgid \"\xFF\"\nmsgstr \"a\n\nmsgstr[1] \"b\"\nmsgid c\nmsgid \"d\" x\nmsgctxt \"1:1\"\nfoo "
       "\"\"\n\"\\q\"\nmsgid \"e\"\nmsgstr \"\xFF\"\n",
       "0.po:2:8: error: the closing quote is missing\n"
       "0.po:4:1: error: msgstr[...] stands without msgid_plural; expected msgstr\n"
       "0.po:5:7: error: expected a text in double quotes\n"
       "0.po:6:1: error: msgid stands where msgstr is expected\n"
       "0.po:6:11: error: expected nothing behind the closing quote\n"
       "0.po:7:1: error: msgctxt stands where msgstr is expected\n"
       "0.po:8:1: error: expected msgctxt, msgid, msgid_plural, msgstr, a text in double quotes or a comment\n"
       "0.po:9:2: error: unknown escape; expected one of \\n \\t \\v \\b \\r \\f \\a \\\\ \\\" \\ooo \\xhh\n"
       "0.po:10:1: error: msgid stands where msgstr is expected\n"
       "0.po:11:9: error: byte FF: no character of UTF-8; expected text in this codepage (--source-encoding "
       "names another)\n"},
  };
  options_.fresh = true;
  for (const auto& row : cases) EXPECT_EQ(result({row.source}, ".po"), row.expected) << row.source;
}

TEST_F(CatalogCompiler, BytesInBothOrders) {
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
TEST_F(CatalogCompiler, DumpCompilesToTheSameBytes) {
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
        options.catalog = file("z.cat");
        options.source_encoding = encoding;
        options.sources = {write("z.msg", dumped(bytes, encoding))};
        options.fresh = true;
        std::ostringstream log;
        ASSERT_TRUE(compile(session_, options, log)) << log.str();
        ASSERT_EQ(read(options.catalog), bytes) << codepage << " as " << encoding << "\n"
                                                << dumped(bytes, encoding);
      }
    }
  }
}

// A layout that the compiler does not write: sets and texts from behind, a text shared, an empty set.
TEST_F(CatalogCompiler, ForeignLayoutsAndDamage) {
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
  for (size_t length = 0; length < sound.size(); ++length)
    EXPECT_NE(fault(std::string(sound, 0, length)).find("f: offset "), std::string::npos) << length;
  for (size_t at = 0; at < sound.size(); ++at) {
    for (const char byte : {'\0', '\1', '\x7F', '\x80', '\xFF'}) {
      bytes = sound;
      bytes[at] = byte;
      const std::string text = fault(bytes);
      EXPECT_TRUE(text.empty() || text.find("f: offset ") == 0) << at << ": " << text;
    }
  }
}

}  // namespace
}  // namespace lexicor_gencat
