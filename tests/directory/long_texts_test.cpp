// Long texts are mapped in blocks: what they become is what their parts become, which are too short for that.
#include <gtest/gtest.h>

#include <random>

#include "support/forms.h"
#include "support/library.h"
#include "support/slowness.h"

namespace lx::test {
namespace {

constexpr char kUntouched = '#';

/// Into room for `size` bytes, with nothing written behind the result.
std::string mapped(LXLocale* l, const std::string& text, uint32_t mode, size_t size) {
  std::string out(size, kUntouched);
  const auto bytes = static_cast<size_t>(
      LXMapString(l, out.data(), static_cast<int32_t>(size), text.data(), count_of(text), mode));
  EXPECT_EQ(out.find_first_not_of(kUntouched, bytes), std::string::npos);
  return out.substr(0, bytes);
}

TEST(LongTexts, AreMappedAsTheirParts) {
  const Library library(LEXICOR_LOCALE_DIR);
  // With other cases of fewer bytes and of more, special mappings, and bytes that are not UTF-8.
  const char* const letters[] = {"a",      "Z",      "i",      "\u00DF", "\u00C9", "\u00FF", "\u0130", "\u0131",
                                 "\u0149", "\u01F0", "\u023A", "\u2C65", "\u03A3", "\u03C3", "\u03C9", "\u0416",
                                 "\u044F", "\u1E9E", "\u1F80", "\u2126", "\u3042", "\uFF21", "\uFF5A", "\xC3",
                                 "\x80",   "\xF4",   "1",      ".",      "\u0390", "\uFB01"};
  constexpr char kBetween[] = "\u4E00";
  std::mt19937 random(20261123);
  for (const char* const name :
       {"English.UTF-8", "German.UTF-8", "Greek.UTF-8", "Turkish.UTF-8", "Lithuanian.UTF-8"}) {
    const LocalePtr locale(LXGetLocale(name, 0, nullptr));
    ASSERT_NE(locale, nullptr) << name;
    for (int n = 0; n < 4000 / kSlowness && !HasFailure(); ++n) {
      const uint32_t modes[] = {LX_MAP_UPPER, LX_MAP_LOWER, LX_MAP_UPPER_SIMPLE, LX_MAP_LOWER_SIMPLE};
      const uint32_t mode = modes[n % 4];
      const size_t kinds = n % 3 == 0 ? 8 : std::size(letters);
      const size_t first = n % 3 == 0 ? random() % (std::size(letters) - kinds) : 0;
      std::string text, expected;
      for (size_t words = 4 + random() % 30; words > 0; --words) {
        std::string word;
        for (size_t length = random() % 9; length > 0; --length) word += letters[first + random() % kinds];
        word += kBetween;
        text += word;
        expected += mapped(locale.get(), word, mode, 60);
      }
      for (const size_t size : {expected.size(), expected.size() + 80})
        EXPECT_EQ(mapped(locale.get(), text, mode, size), expected) << name << " " << mode << " " << text;
    }
  }
}

}  // namespace
}  // namespace lx::test
