// Every shipped sort against ICU's collator of the locale that it comes from: names that CLDR has in the
// language, and words made of its letters with accents and cases varied. Pairs of words must be in ICU's order
// on the primary, secondary and tertiary level, punctuation aside, or equal there, in comparison and in keys. A
// pair that differs must hold what sort_differences.txt lists for the sort, with the reason.
//
// LEXICOR_WRITE_DIFFERENCES=FILE appends the pairs that nothing explains.
#include <gtest/gtest.h>
#include <unicode/uchar.h>
#include <unicode/ucol.h>
#include <unicode/ucurr.h>
#include <unicode/uldnames.h>
#include <unicode/uloc.h>
#include <unicode/ulocdata.h>
#include <unicode/unorm2.h>
#include <unicode/uregex.h>
#include <unicode/uset.h>
#include <unicode/ustring.h>

#include <algorithm>
#include <cstdlib>
#include <fstream>
#include <random>
#include <set>
#include <sstream>

#include "import/icu_text.h"
#include "import/sort_import.h"
#include "support/library.h"

namespace lx::test {
namespace {

using lexicor_import::IcuPtr;
using lexicor_import::Sort;
using Text = std::u16string;
using Words = std::vector<Text>;

constexpr size_t kLeastWords = 2000;
constexpr size_t kMadeWords = 2000;
constexpr size_t kNeighbours = 16;  ///< each word is compared with as many behind it in ICU's order
constexpr size_t kOthers = 8;       ///< and with as many others

/// The text of an ICU function that ends in buffer, room and error.
template <class Function, class... Arguments>
Text icu(Function function, Arguments... arguments) {
  return lexicor_import::icu_text("ICU", [&](UChar* out, int32_t room, UErrorCode* error) {
    return function(arguments..., out, room, error);
  });
}

std::string utf8(const Text& text) {
  std::string out(3 * text.size(), '\0');
  UErrorCode error = U_ZERO_ERROR;
  int32_t bytes = 0;
  u_strToUTF8(out.data(), static_cast<int32_t>(out.size()), &bytes, text.data(),
              static_cast<int32_t>(text.size()), &error);
  return out.substr(0, static_cast<size_t>(bytes));
}

Text utf16(const std::string& text) {
  return icu([&](UChar* out, int32_t room, UErrorCode* error) {
    int32_t units = 0;
    u_strFromUTF8(out, room, &units, text.data(), static_cast<int32_t>(text.size()), error);
    return units;
  });
}

int sign(int64_t value) {
  return (value > 0) - (value < 0);
}

/// The locales whose names and letters a sort is tried with; the common order, with several.
std::vector<std::string> locales_of(const Sort& sort) {
  const std::string locale = sort.locale;
  if (locale == "root") return {"en", "fr", "de", "it", "nl", "pt", "ga", "el", "ru", "bg", "sr", "he"};
  return {locale.substr(0, locale.find('@'))};
}

void add_names(const std::string& locale, std::set<Text>& words) {
  UErrorCode error = U_ZERO_ERROR;
  const IcuPtr<ULocaleDisplayNames, uldn_close> names(uldn_open(locale.c_str(), ULDN_STANDARD_NAMES, &error));
  for (const char* const* code = uloc_getISOLanguages(); *code != nullptr; ++code)
    words.insert(icu(uldn_languageDisplayName, names.get(), *code));
  for (const char* const* code = uloc_getISOCountries(); *code != nullptr; ++code)
    words.insert(icu(uldn_regionDisplayName, names.get(), *code));
  const IcuPtr<UEnumeration, uenum_close> currencies(ucurr_openISOCurrencies(UCURR_ALL, &error));
  while (const UChar* code = uenum_unext(currencies.get(), nullptr, &error)) {
    int32_t units = 0;
    const UChar* name = ucurr_getName(code, locale.c_str(), UCURR_LONG_NAME, nullptr, &units, &error);
    words.emplace(name, static_cast<size_t>(units));
  }
  lexicor_import::require(error, "names");
}

/// The letters of a language, and those of other languages that it meets; digraphs are letters too.
Words letters_of(const std::string& locale) {
  UErrorCode error = U_ZERO_ERROR;
  const IcuPtr<ULocaleData, ulocdata_close> data(ulocdata_open(locale.c_str(), &error));
  Words letters;
  for (auto type : {ULOCDATA_ES_STANDARD, ULOCDATA_ES_AUXILIARY}) {
    const IcuPtr<USet, uset_close> set(ulocdata_getExemplarSet(data.get(), nullptr, 0, type, &error));
    lexicor_import::require(error, "exemplar set");
    for (int32_t item = 0; item < uset_getItemCount(set.get()); ++item) {
      UChar text[16];
      UChar32 first = 0, last = 0;
      const int32_t units = uset_getItem(set.get(), item, &first, &last, text, 16, &error);
      if (units > 0) letters.emplace_back(text, static_cast<size_t>(units));
      for (UChar32 code = first; units == 0 && code <= std::min(last, 0xFFFF); ++code)
        letters.emplace_back(1, static_cast<char16_t>(code));
    }
  }
  return letters;
}

/// Words of up to four letters, with case and accents varied; a mark stands behind a letter.
void add_made(const std::string& locale, size_t count, std::set<Text>& words) {
  UErrorCode error = U_ZERO_ERROR;
  const Words letters = letters_of(locale);
  const UNormalizer2* apart = unorm2_getNFDInstance(&error);
  const UNormalizer2* composed = unorm2_getNFCInstance(&error);
  std::mt19937 random(5489);
  for (size_t least = words.size() + count; words.size() < least;) {
    Text word;
    for (size_t length = 1 + random() % 4; length > 0; --length) {
      const Text& letter = letters[random() % letters.size()];
      if (u_isalpha(letter[0]) || (!word.empty() && u_isalpha(word.back()))) word += letter;
    }
    const auto units = static_cast<int32_t>(word.size());
    auto add = [&](auto function) {
      const Text form = icu([&](UChar* out, int32_t room, UErrorCode* status) {
        return function(out, room, word.data(), units, locale.c_str(), status);
      });
      words.insert(icu(unorm2_normalize, composed, form.data(), static_cast<int32_t>(form.size())));
    };
    add(u_strToLower);
    add(u_strToUpper);
    add([](UChar* out, int32_t room, const UChar* text, int32_t length, const char* name, UErrorCode* status) {
      return u_strToTitle(out, room, text, length, nullptr, name, status);
    });
    Text plain = icu(unorm2_normalize, apart, word.data(), units);
    const auto is_accent = [](char16_t unit) { return unit >= 0x300 && unit < 0x370; };
    plain.erase(std::remove_if(plain.begin(), plain.end(), is_accent), plain.end());
    words.insert(icu(unorm2_normalize, composed, plain.data(), static_cast<int32_t>(plain.size())));
  }
}

Words words_of(const Sort& sort) {
  std::set<Text> words;
  for (const std::string& locale : locales_of(sort)) {
    add_names(locale, words);
    add_made(locale, kMadeWords / locales_of(sort).size(), words);
  }
  Words list;
  for (const Text& word : words) {
    const bool plane_0 =
        std::none_of(word.begin(), word.end(), [](char16_t u) { return u >= 0xD800 && u < 0xE000; });
    if (plane_0) list.push_back(word);
  }
  return list;
}

class Peer {
 public:
  explicit Peer(const Sort& sort) {
    UErrorCode error = U_ZERO_ERROR;
    collator_.reset(ucol_open(sort.locale, &error));
    ucol_setAttribute(collator_.get(), UCOL_ALTERNATE_HANDLING, UCOL_SHIFTED, &error);
    ucol_setStrength(collator_.get(), UCOL_TERTIARY);
    lexicor_import::require(error, "ucol_open");
  }
  int compare(const Text& a, const Text& b) const {
    return ucol_strcoll(collator_.get(), a.data(), static_cast<int32_t>(a.size()), b.data(),
                        static_cast<int32_t>(b.size()));
  }

 private:
  IcuPtr<UCollator, ucol_close> collator_;
};

/// The levels of a key but the last one, with the zero byte behind each.
std::string letters_key(LXLocale* locale, const Text& text) {
  std::string key(1024, '\0');
  const auto* units = reinterpret_cast<const LXUChar*>(text.data());
  const int32_t bytes = LXStrxfrmU(locale, reinterpret_cast<uint8_t*>(key.data()), 1024, units,
                                   static_cast<int32_t>(text.size()), 0);
  EXPECT_GE(bytes, 3);
  EXPECT_LE(bytes, 1024) << utf8(text);
  size_t at = 0;
  while (key.at(at) != '\0') at += 2;
  for (int level = 0; level < 2; ++level) at = key.find('\0', at + 1);
  return key.substr(0, at + 1);
}

/// A line of sort_differences.txt: the sort, a regular expression for what a word holds, and the reason.
struct Difference {
  std::string sort, pattern;
  IcuPtr<URegularExpression, uregex_close> expression;
  size_t pairs = 0;

  bool matches(const Text& word) {
    UErrorCode error = U_ZERO_ERROR;
    uregex_setText(expression.get(), word.data(), static_cast<int32_t>(word.size()), &error);
    return uregex_find(expression.get(), 0, &error) != 0;
  }
};

class SortOracle : public testing::Test {
 protected:
  void SetUp() override {
    std::ifstream in(LEXICOR_DATA_DIR "/../tests/collate/sort_differences.txt");
    ASSERT_TRUE(in);
    for (std::string line; std::getline(in, line);) {
      std::istringstream fields(line);
      Difference difference;
      std::string reason;
      if (line.rfind("#", 0) == 0 || !(fields >> difference.sort)) continue;
      fields >> difference.pattern >> reason;
      EXPECT_FALSE(reason.empty()) << line;
      UErrorCode error = U_ZERO_ERROR;
      const Text pattern = utf16(difference.pattern);
      difference.expression.reset(uregex_open(pattern.data(), static_cast<int32_t>(pattern.size()),
                                              UREGEX_CASE_INSENSITIVE, nullptr, &error));
      lexicor_import::require(error, difference.pattern.c_str());
      differences_.push_back(std::move(difference));
    }
    if (const char* file = std::getenv("LEXICOR_WRITE_DIFFERENCES")) report_.open(file, std::ios::app);
  }

  bool explained(const Sort& sort, const Text& a, const Text& b) {
    bool found = false;
    for (Difference& difference : differences_) {
      if (difference.sort != sort.name || (!difference.matches(a) && !difference.matches(b))) continue;
      ++difference.pairs;
      found = true;
    }
    return found;
  }

  /// Compares the words of a sort; the number of pairs that differ and are not explained.
  size_t compare(const Sort& sort) {
    const LocalePtr locale(
        LXGetLocale((std::string("English_UnitedStates.UTF-8@") + sort.name).c_str(), 0, nullptr));
    if (!locale) return ADD_FAILURE() << "no sort", 0;
    const Peer peer(sort);
    Words words = words_of(sort);
    EXPECT_GE(words.size(), kLeastWords);
    std::stable_sort(words.begin(), words.end(),
                     [&](const Text& a, const Text& b) { return peer.compare(a, b) < 0; });
    std::vector<std::string> keys;
    for (const Text& word : words) keys.push_back(letters_key(locale.get(), word));
    std::mt19937 random(5489);
    size_t wrong = 0;
    for (size_t i = 0; i < words.size(); ++i) {
      for (size_t step = 1; step <= kNeighbours + kOthers; ++step) {
        const size_t j = step <= kNeighbours ? std::min(i + step, words.size() - 1) : random() % words.size();
        const Text &a = words[i], &b = words[j];
        const int expected = peer.compare(a, b), keyed = sign(keys[i].compare(keys[j]));
        const int compared = sign(
            LXStrcollU(locale.get(), reinterpret_cast<const LXUChar*>(a.data()), static_cast<int32_t>(a.size()),
                       reinterpret_cast<const LXUChar*>(b.data()), static_cast<int32_t>(b.size()), 0));
        if (keyed == expected && (expected == 0 || compared == expected)) continue;
        if (explained(sort, a, b)) continue;
        ++wrong;
        report_ << sort.name << '\t' << utf8(a) << '\t' << utf8(b) << '\t' << expected << keyed << compared
                << '\n';
      }
    }
    return wrong;
  }

  std::vector<Difference> differences_;
  std::ofstream report_;
};

TEST_F(SortOracle, OrdersWordsAsIcu) {
  const Library library(LEXICOR_LOCALE_DIR);
  for (const Sort& sort : lexicor_import::kSorts) {
    SCOPED_TRACE(sort.name);
    EXPECT_EQ(compare(sort), 0U) << "pairs in another order";
  }
  for (const Difference& difference : differences_)
    EXPECT_GT(difference.pairs, 0U) << difference.sort << ' ' << difference.pattern << " does not occur";
}

}  // namespace
}  // namespace lx::test
