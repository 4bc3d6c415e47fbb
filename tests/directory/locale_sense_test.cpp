// What `lexicor-data check` says about languages and territories whose form is sound and whose values are not,
// and what the shipped ones promise to every program.
#include <gtest/gtest.h>

#include <fstream>
#include <iterator>
#include <sstream>

#include "compile.h"
#include "sense.h"
#include "support/library.h"
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

// Each operating-system name leads to objects that the directory has.
TEST(LocaleSense, OperatingSystemNames) {
  const lx::test::Library library(LEXICOR_LOCALE_DIR);
  const auto create = [](void* user, const char* native, const char* name) -> int32_t {
    int32_t rc = LX_OK;
    const lx::test::LocalePtr locale(LXGetLocale(name, 0, &rc));
    EXPECT_TRUE(locale != nullptr) << native << ": " << name << ": " << rc;
    ++*static_cast<int*>(user);
    return 1;
  };
  int names = 0;
  LXEnumNativeLocales(create, &names);
  EXPECT_EQ(names, 107);
}

TEST(LocaleSense, ShippedSpecialMappings) {
  const struct {
    const char* language;
    const char* mapping;
    bool has;
  } cases[] = {
      {"English", "special_", false},
      {"German", R"({ from = "ß", to = "SS" })", true},
      {"Turkish", R"({ from = "i", to = "İ" })", true},
      {"Turkish", R"({ from = "I", to = "ı" })", true},
      {"Azerbaijani", R"({ from = "i", to = "İ" })", true},
      {"Lithuanian", "{ from = \"į\u0307\", to = \"Į\" }", true},
      {"Greek", R"({ from = "Σ,", to = "ς," })", true},
      {"Greek", R"({ from = "Σ.")", false},  // may stand inside an abbreviation
  };
  for (const auto& test : cases) {
    const std::string text = shipped(std::string("languages/") + test.language + ".toml");
    EXPECT_EQ(text.find(test.mapping) != std::string::npos, test.has) << test.language << ": " << test.mapping;
  }
}

}  // namespace
}  // namespace lexicor_data
