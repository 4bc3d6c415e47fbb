// What the shipped languages and territories promise to every program.
#include <gtest/gtest.h>

#include <fstream>

#include "compile.h"
#include "import/locale_table.h"
#include "sense.h"
#include "support/forms.h"
#include "support/library.h"

namespace lexicor_data {
namespace {

// Every shipped language and territory makes sense, has a name that both the file system and a locale name can
// hold, and a territory of a whole country the number of ISO 3166.
TEST(LocaleSense, ShippedObjects) {
  for (const ObjectName& object : read_source_control(LEXICOR_DATA_DIR).objects) {
    if (object.type > ObjectType::kTerritory) continue;
    const bool language = object.type == ObjectType::kLanguage;
    std::ifstream in(LEXICOR_DATA_DIR "/" + source_file_name(object));
    EXPECT_NO_THROW((language ? check_language_sense : check_territory_sense)(in, object.name)) << object.name;
    EXPECT_LE(object.name.size(), 32U) << object.name;
    EXPECT_EQ(object.name.find_first_of("_.@"), std::string::npos) << object.name;
    EXPECT_EQ(!language && object.id > 1000, object.name.find('-') != std::string::npos) << object.name;
  }
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
  for (std::ifstream page(LEXICOR_DATA_DIR "/../docs/native-names.md"); std::getline(page, line);)
    if (line.rfind("| ", 0) == 0 && line.rfind("| Name", 0) != 0) listed += line + '\n';
  EXPECT_EQ(listed, found) << "the page's table, and what it must be";
  for (const auto& row : lexicor_import::kLanguages) EXPECT_EQ(unwritable(row.name), "") << row.name;
}

}  // namespace
}  // namespace lexicor_data
