// Where the names of the operating system lead, and what their codepages can hold.
#include <gtest/gtest.h>

#include <fstream>

#include "import/locale_table.h"
#include "support/forms.h"
#include "support/library.h"

namespace lx::test {
namespace {

/// The texts of a locale that its codepage cannot hold: "number text, number text".
std::string unwritable(const char* name) {
  int32_t rc = LX_OK;
  const LocalePtr locale(LXGetLocale(name, 0, &rc));
  EXPECT_TRUE(locale != nullptr) << name << ": " << rc;
  const LocalePtr utf8 = locale_with("UTF-8");
  std::string list;
  for (int32_t number = 1; locale && number <= LX_ITEM_LONG_DATE_FORMAT; ++number) {
    const Units text = item(locale.get(), number);
    if (decode(kPlain, locale.get(), encode(kPlain, locale.get(), text)) != text)
      list += (list.empty() ? "" : ", ") + std::to_string(number) + " " + encode(kPlain, utf8.get(), text);
  }
  return list;
}

// Each operating-system name leads to objects that the directory has. docs/native-names.md says of which of
// their texts its codepage holds not all characters; the codepage of a language holds them all.
TEST(LocaleSense, OperatingSystemNames) {
  const Library library(LEXICOR_LOCALE_DIR);
  std::pair<size_t, std::string> all;  // names, and rows of the page
  const auto add = [](void* user, const char* native, const char* name) -> int32_t {
    auto& [names, rows] = *static_cast<std::pair<size_t, std::string>*>(user);
    const std::string list = unwritable(name), locale = name;
    const size_t dot = locale.find('.') + 1;
    const std::string codepage = locale.substr(dot, locale.find('@') - dot);
    if (!list.empty()) rows += std::string("| ") + native + " | " + codepage + " | " + list + " |\n";
    ++names;
    return 1;
  };
  LXEnumNativeLocales(add, &all);
  EXPECT_EQ(all.first, 107U);
  std::string listed, line;
  for (std::ifstream page(LEXICOR_DATA_DIR "/../docs/native-names.md"); std::getline(page, line);)
    if (line.rfind("| ", 0) == 0 && line.rfind("| Name", 0) != 0) listed += line + '\n';
  EXPECT_EQ(listed, all.second) << "the page's table, and what it must be";
  for (const auto& row : lexicor_import::kLanguages) EXPECT_EQ(unwritable(row.name), "") << row.name;
}

}  // namespace
}  // namespace lx::test
