// What `lexicor-data check` says about languages and territories whose form is sound and whose values are not,
// and what the shipped ones promise to every program.
#include <gtest/gtest.h>

#include <fstream>
#include <iterator>
#include <sstream>

#include "compile.h"
#include "import/locale_table.h"
#include "sense.h"
#include "support/library.h"
#include "support/forms.h"
#include "ucm.h"

namespace lexicor_data {
namespace {

std::string shipped(const std::string& file) {
  std::ifstream in(std::string(LEXICOR_DATA_DIR) + '/' + file, std::ios::binary);
  return {std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>()};
}

std::string fault_of(void (*check)(std::istream&, const std::string&), const std::string& text) {
  std::istringstream in(text);
  try {
    check(in, "f");
  } catch (const SourceError& error) {
    return error.what();
  }
  return "none";
}

TEST(LocaleSense, FaultsNameTheirPlace) {
  const std::string specials = "\nmorning = \"AM\"\nspecial_lower = [\n";
  const struct {
    const char* file;
    std::string from, to;
    const char* fault;
  } cases[] = {
      {"languages/English.toml", "\"EN\"", "\"en\"", "f:2:16: expected a code of 3 capital letters or 2"},
      {"languages/English.toml", "\"Monday\"", "\"\"", "f:5:19: the name is empty"},
      {"languages/English.toml", "\nmorning = \"AM\"\n",
       specials + "{ from = \"AB\", to = \"a\" },\n{ from = \"A\", to = \"a\" },\n]\n",
       "f:11:10: is never reached"},
      {"languages/English.toml", "\nmorning = \"AM\"\n",
       specials + "{ from = \"AB\", to = \"a\" },\n{ from = \"AB\", to = \"b\" },\n]\n",
       "f:12:10: stands twice"},
      {"territories/Germany.toml", "\"DEU\"", "\"DE\"", "f:2:16: expected a code of 3 capital letters"},
      {"territories/Germany.toml", "thousands = \".\"", "thousands = \"\\u00A0\"",
       "f:11:13: a separator is one byte"},
      {"territories/Germany.toml", "list = \";\"", "list = \"1\"", "f:12:8: a separator is no digit"},
      {"territories/Germany.toml", "list = \";\"", "list = \",\"", "f:12:8: is the same as decimal"},
      {"territories/Germany.toml", "monetary_thousands = \".\"", "monetary_thousands = \",\"",
       "f:14:22: is the same as monetary_decimal"},
      {"territories/Germany.toml", "number = 2", "number = 7", "f:17:10: expected a number from 0 to 6"},
      {"territories/Germany.toml", "\"3;0\"", "\"3;2;0\"", "none"},
      {"territories/Germany.toml", "\"3;0\"", "\"\"", "none"},
      {"territories/Germany.toml", "\"3;0\"", "\"3;\"", "f:22:10: expected sizes of groups"},
      {"territories/Germany.toml", "\"3;0\"", "\"0\"", "f:22:10: expected sizes of groups"},
      {"territories/Germany.toml", "\"3;0\"", "\"3;0;2\"", "f:22:10: expected sizes of groups"},
      {"territories/Germany.toml", "\"EUR\"", "\"EURO\"", "f:27:17: expected a code of 3 capital letters"},
      {"territories/Germany.toml", "negative = \"-\"", "negative = \"\"", "f:31:12: without a sign"},
      {"territories/Germany.toml", "%H:%M:%S", "%H:%M:%Z", "f:42:8: unknown directive at character 8"},
      {"territories/Germany.toml", "%H:%M:%S", "%X", "f:42:8: unknown directive at character 2"},
      {"territories/Germany.toml", "%H:%M:%S", "%H:%#", "f:42:8: the format ends inside a directive"},
      {"territories/Germany.toml", "%H:%M:%S", "%H%%年年年年年年年年年", "none"},
      {"territories/Germany.toml", "%H:%M:%S", "%H%%%S年年年年年年年年年", "f:42:8: the format takes 33 bytes"},
  };
  for (const auto& test : cases) {
    std::string text = shipped(test.file);
    const size_t at = text.find(test.from);
    ASSERT_NE(at, std::string::npos) << test.from;
    text.replace(at, test.from.size(), test.to);
    const std::string fault =
        fault_of(test.file[0] == 'l' ? check_language_sense : check_territory_sense, text);
    EXPECT_EQ(fault.substr(0, std::string(test.fault).size()), test.fault) << fault << "\n" << test.to;
  }
}

// Every shipped language and territory makes sense, has a name that both the file system and a locale name can
// hold, and a territory of a whole country the number of ISO 3166.
TEST(LocaleSense, ShippedObjects) {
  size_t languages = 0, territories = 0;
  for (const ObjectName& object : read_source_control(LEXICOR_DATA_DIR).objects) {
    if (object.type != ObjectType::kLanguage && object.type != ObjectType::kTerritory) continue;
    const bool language = object.type == ObjectType::kLanguage;
    ++(language ? languages : territories);
    EXPECT_EQ(
        fault_of(language ? check_language_sense : check_territory_sense, shipped(source_file_name(object))),
        "none")
        << object.name;
    EXPECT_LE(object.name.size(), 32U) << object.name;
    EXPECT_EQ(object.name.find_first_of("_.@"), std::string::npos) << object.name;
    EXPECT_EQ(!language && object.id > 1000, object.name.find('-') != std::string::npos) << object.name;
  }
  EXPECT_GE(languages, 55U);
  EXPECT_GE(territories, 66U);
}

/// The texts of a locale that its codepage cannot hold: "number text, number text".
std::string unwritable(const char* name) {
  int32_t rc = LX_OK;
  const lx::test::LocalePtr locale(LXGetLocale(name, 0, &rc));
  EXPECT_TRUE(locale != nullptr) << name << ": " << rc;
  const lx::test::LocalePtr utf8 = lx::test::locale_with("UTF-8");
  std::string list;
  for (int32_t item = 1; locale && item <= LX_ITEM_LONG_DATE_FORMAT; ++item) {
    LXUChar whole[256], back[256];
    char bytes[768];
    const int32_t units = LXGetLocaleTextInfoU(locale.get(), item, whole, 256, LX_TERRITORY_VALUES);
    if (units < 1) continue;  // a number
    const int32_t written = LXGetLocaleTextInfo(locale.get(), item, bytes, sizeof bytes, LX_TERRITORY_VALUES);
    const int32_t read = LXStringToUnicode(back, 256, locale.get(), bytes, written - 1, 0);
    const lx::test::Units expected(whole, whole + units - 1), found(back, back + read);
    if (found == expected) continue;
    list += (list.empty() ? "" : ", ") + std::to_string(item) + " " +
            encode(lx::test::kPlain, utf8.get(), expected);
  }
  return list;
}

// Each operating-system name leads to objects that the directory has. docs/native-names.md says of which of
// their texts its codepage holds not all characters; the codepage of a language holds them all.
TEST(LocaleSense, OperatingSystemNames) {
  const lx::test::Library library(LEXICOR_LOCALE_DIR);
  std::vector<std::string> rows;
  LXEnumNativeLocales(
      [](void* user, const char* native, const char* name) -> int32_t {
        const std::string list = unwritable(name), locale = name;
        const size_t dot = locale.find('.') + 1;
        const std::string codepage = locale.substr(dot, locale.find('@') - dot);
        static_cast<std::vector<std::string>*>(user)->push_back(
            list.empty() ? "" : std::string("| ") + native + " | " + codepage + " | " + list + " |");
        return 1;
      },
      &rows);
  EXPECT_EQ(rows.size(), 107U);
  std::string found, listed, line;
  for (const std::string& row : rows) found += row.empty() ? row : row + '\n';
  for (std::istringstream page(shipped("../docs/native-names.md")); std::getline(page, line);)
    if (line.rfind("| ", 0) == 0 && line.rfind("| Name", 0) != 0) listed += line + '\n';
  EXPECT_EQ(listed, found) << "the page's table, and what it must be";
  for (const auto& row : lexicor_import::kLanguages) EXPECT_EQ(unwritable(row.name), "") << row.name;
}

}  // namespace
}  // namespace lexicor_data
