// Locale items: which are texts and which are numbers, and texts that the codepage has not.
// What may be set to what, in every form and size, stands in tests/cases/items.txt.
#include <set>

#include "core/tiny_directory.h"
#include "support/forms.h"

namespace lx::test {
namespace {

class ItemTest : public LibraryTest {};

// An item is a text or a number, and the other functions refuse it.
TEST_F(ItemTest, EachIsATextOrANumber) {
  ASSERT_EQ(init("/nonexistent"), LX_W_DEFAULTS);
  ASSERT_EQ(LXSetLocale("", 0), LX_OK);
  const std::set<int32_t> numbers{1, 5, 9, 11, 58, 63, 69, 70, 73, 74, 75, 76, 77, 78, 82, 83, 84, 85, 86, 87};
  std::vector<int32_t> items{-1, INT32_MAX, INT32_MIN};
  for (int32_t item = 0; item <= LX_ITEM_LOCALE_STRING + 1; ++item) items.push_back(item);
  for (int32_t item : items) {
    SCOPED_TRACE(item);
    const bool is_number = numbers.count(item) != 0;
    const bool is_text = !is_number && item > 0 && item <= LX_ITEM_LOCALE_STRING;
    EXPECT_EQ(LXGetLocaleNumInfo(nullptr, item, 0) != -1, is_number);
    EXPECT_EQ(LXGetError(nullptr), is_number ? LX_OK : LX_E_ITEM);
    in_all_forms([&](const auto& form) {
      typename std::decay_t<decltype(form)>::Unit text[40];
      EXPECT_EQ(form.get_item(nullptr, item, text, 40, 0) != -1, is_text);
      EXPECT_EQ(LXGetError(nullptr), is_text ? LX_OK : LX_E_ITEM);
    });
  }
}

// Beyond what the codepage has, the U form keeps the caller's text, and the others have the substitution.
TEST_F(ItemTest, TextsThatTheCodepageHasNot) {
  write_tiny_directory(directory);
  ASSERT_EQ(init(), LX_OK);
  LXLocale* locale = LXGetLocale("English_UnitedStates.TINY-SINGLE", 0, nullptr);
  const Units any{'A', 0x3041, 0x20AC, 0x4E9C, 0xE0};
  ASSERT_EQ(LXSetLocaleTextInfoU(locale, 64, any.data(), count_of(any), 0), 1);
  EXPECT_EQ(item(locale, 64), any);
  char bytes[9];
  LXWChar codes[9];
  EXPECT_EQ(LXGetLocaleTextInfo(locale, 64, bytes, 9, 0), 6);
  EXPECT_STREQ(bytes, "A?\xA4?\xE0");
  EXPECT_EQ(LXGetLocaleTextInfoW(locale, 64, codes, 9, 0), 6);
  EXPECT_EQ(Text<LXWChar>(codes), (Text<LXWChar>{'A', '?', 0xA4, '?', 0xE0}));
  ASSERT_EQ(LXSetLocaleNumInfo(locale, 5, kElsewhereId), 1);
  EXPECT_EQ(item(locale, 64), any) << "what was set stays";
  EXPECT_EQ(messages(RAS1_LEVEL_INPUT, [&] { LXSetLocaleTextInfo(locale, 64, "EUR!", 3, 0); }),
            std::vector<std::string>{"type = 64, buffer size = 3, data = EUR"});
  EXPECT_EQ(LXReleaseLocale(locale), 0);
}

}  // namespace
}  // namespace lx::test
