// Every shipped sort against ICU's collator of the locale that it comes from, and the default sort of a language
// that has that of another one against the collator of the language: names that CLDR has in the language, words made of its letters with
// accents and cases varied, and words of several scripts. Pairs of words must be in ICU's order on the primary,
// secondary and tertiary level, punctuation aside, or equal there, in comparison and in keys. A pair that
// differs must hold what sort_differences.txt lists for the sort or the language, with the reason.
#include <gtest/gtest.h>
#include <unicode/coll.h>
#include <unicode/locdspnm.h>
#include <unicode/normalizer2.h>
#include <unicode/regex.h>
#include <unicode/tblcoll.h>
#include <unicode/ucurr.h>
#include <unicode/ulocdata.h>
#include <unicode/uniset.h>
#include <unicode/usetiter.h>

#include <algorithm>
#include <fstream>
#include <random>
#include <set>
#include <sstream>

#include "import/icu_text.h"
#include "import/locale_table.h"
#include "import/sort_import.h"
#include "support/library.h"

namespace lx::test {
namespace {

using icu::UnicodeString;
using lexicor_import::Sort;
using Words = std::vector<UnicodeString>;

constexpr size_t kLeastWords = 2000;
constexpr size_t kMadeWords = 2400;
constexpr size_t kNeighbours = 16;  ///< each word is compared with as many behind it in ICU's order
constexpr size_t kOthers = 8;       ///< and with as many others

/// The error that an ICU function leaves; a failure ends the test.
class Status {
 public:
  ~Status() noexcept(false) { lexicor_import::require(error_, "ICU"); }
  operator UErrorCode&() { return error_; }
  operator UErrorCode*() { return &error_; }

 private:
  UErrorCode error_ = U_ZERO_ERROR;
};

std::string utf8(const UnicodeString& text) {
  std::string out;
  return text.toUTF8String(out);
}

const LXUChar* units(const UnicodeString& text) {
  return reinterpret_cast<const LXUChar*>(text.getBuffer());
}

int sign(int64_t value) {
  return (value > 0) - (value < 0);
}

/// A sort or a language: a locale that has it, and the one whose collator ICU has.
struct Order {
  std::string name;
  std::string ours;
  std::string locale;
};

/// Whether CLDR tailors an order for a locale.
bool is_tailored(const char* locale) {
  Status status;
  const std::unique_ptr<icu::Collator> collator(icu::Collator::createInstance(icu::Locale(locale), status));
  return !dynamic_cast<const icu::RuleBasedCollator&>(*collator).getRules().isEmpty();
}

/// All sorts, and the languages with the sort of another one: one order for a sort and a language of one locale.
std::vector<Order> orders() {
  std::vector<Order> list;
  for (const auto& row : lexicor_import::kLanguages)
    if (row.sort != std::string("Binary") && row.sort != std::string("Default"))
      list.push_back({row.name, row.name, row.locale});
  for (const Sort& sort : lexicor_import::kSorts) {
    const auto same =
        std::find_if(list.begin(), list.end(), [&](const Order& o) { return o.locale == sort.locale; });
    if (same == list.end() || same->name != sort.name)
      list.push_back({sort.name, std::string("English.UTF-8@") + sort.name, sort.locale});
  }
  return list;
}

/// The locales whose names and letters an order is tried with; the common order, with several.
std::vector<std::string> locales_of(const Order& order) {
  const std::string& locale = order.locale;
  if (locale == "root") return {"en", "fr", "de", "it", "nl", "pt", "ga", "el", "ru", "bg", "sr", "he"};
  return {locale.substr(0, locale.find('@'))};
}

/// Names of languages, countries and currencies.
void add_names(const std::string& locale, std::set<UnicodeString>& words) {
  const std::unique_ptr<icu::LocaleDisplayNames> names(
      icu::LocaleDisplayNames::createInstance(icu::Locale(locale.c_str())));
  UnicodeString name;
  for (const char* const* code = uloc_getISOLanguages(); *code != nullptr; ++code)
    words.insert(names->languageDisplayName(*code, name));
  for (const char* const* code = uloc_getISOCountries(); *code != nullptr; ++code)
    words.insert(names->regionDisplayName(*code, name));
  Status status;
  const lexicor_import::IcuPtr<UEnumeration, uenum_close> currencies(
      ucurr_openISOCurrencies(UCURR_ALL, status));
  while (const UChar* code = uenum_unext(currencies.get(), nullptr, status)) {
    int32_t length = 0;
    const UChar* text = ucurr_getName(code, locale.c_str(), UCURR_LONG_NAME, nullptr, &length, status);
    words.insert(UnicodeString(text, length));
  }
}

/// The letters of a language, and those of other languages that it meets; digraphs are letters too.
Words letters_of(const std::string& locale) {
  Status status;
  const lexicor_import::IcuPtr<ULocaleData, ulocdata_close> data(ulocdata_open(locale.c_str(), status));
  Words letters;
  for (auto type : {ULOCDATA_ES_STANDARD, ULOCDATA_ES_AUXILIARY}) {
    icu::UnicodeSet set;
    ulocdata_getExemplarSet(data.get(), set.toUSet(), 0, type, status);
    for (icu::UnicodeSetIterator letter(set); letter.next();) letters.push_back(letter.getString());
  }
  return letters;
}

/// Words of up to four letters, with case and accents varied; a mark stands behind a letter.
void add_made(const std::string& locale, size_t count, std::set<UnicodeString>& words) {
  Status status;
  const icu::Locale language(locale.c_str());
  const icu::Normalizer2 &apart = *icu::Normalizer2::getNFDInstance(status),
                         &composed = *icu::Normalizer2::getNFCInstance(status);
  icu::RegexMatcher accents("[\\u0300-\\u036F]", 0, status);
  const Words letters = letters_of(locale);
  std::mt19937 random(5489);
  for (const size_t least = words.size() + count; words.size() < least;) {
    UnicodeString word;
    for (size_t length = 1 + random() % 4; length > 0; --length) {
      const UnicodeString& letter = letters[random() % letters.size()];
      if (u_isalpha(letter[0]) || (!word.isEmpty() && u_isalpha(word[word.length() - 1]))) word += letter;
    }
    UnicodeString lower(word), upper(word), title(word);
    for (const UnicodeString& form :
         {lower.toLower(language), upper.toUpper(language), title.toTitle(nullptr, language),
          accents.reset(apart.normalize(word, status)).replaceAll("", status)}) {
      words.insert(composed.normalize(form, status));
    }
  }
}

Words words_of(const Order& order) {
  std::set<UnicodeString> words{u"Zebra", u"Ωμέγα", u"Ящик", u"תל", u"يوم", u"ฮา", u"ンー", u"१", u"9"};
  for (const std::string& locale : locales_of(order)) {
    add_names(locale, words);
    add_made(locale, kMadeWords / locales_of(order).size(), words);
  }
  Words list;
  for (const UnicodeString& word : words) {
    if (word.countChar32() == word.length()) list.push_back(word);  // sorts have no characters above U+FFFF
  }
  return list;
}

std::string key_of(LXLocale* locale, const UnicodeString& text) {
  std::string key(1024, '\0');
  const int32_t bytes =
      LXStrxfrmU(locale, reinterpret_cast<uint8_t*>(key.data()), 1024, units(text), text.length(), 0);
  EXPECT_TRUE(bytes >= 3 && bytes <= 1024) << utf8(text);
  key.resize(static_cast<size_t>(bytes));
  return key;
}

/// The levels of a key but the last one, with the zero byte behind each.
std::string letters_of_key(const std::string& key) {
  size_t at = 0;
  while (key.at(at) != '\0') at += 2;
  for (int level = 0; level < 2; ++level) at = key.find('\0', at + 1);
  return key.substr(0, at + 1);
}

/// A line of sort_differences.txt: the sort, a regular expression for what a word holds, and the reason.
struct Difference {
  std::string sort, pattern;
  std::unique_ptr<icu::RegexMatcher> matcher;
  size_t pairs = 0;

  bool matches(const UnicodeString& word) { return matcher->reset(word).find(); }
};

class SortOracle : public testing::Test {
 protected:
  void SetUp() override {
    std::ifstream in(LEXICOR_DATA_DIR "/../tests/collate/sort_differences.txt");
    ASSERT_TRUE(in);
    for (std::string line; std::getline(in, line);) {
      std::istringstream fields(line);
      Difference entry;
      std::string reason;
      if (line.rfind("#", 0) == 0 || !(fields >> entry.sort)) continue;
      fields >> entry.pattern >> reason;
      EXPECT_FALSE(reason.empty()) << line;
      Status status;
      entry.matcher = std::make_unique<icu::RegexMatcher>(UnicodeString::fromUTF8(entry.pattern),
                                                          UREGEX_CASE_INSENSITIVE, status);
      differences_.push_back(std::move(entry));
    }
  }

  bool explained(const Order& order, const UnicodeString& a, const UnicodeString& b) {
    bool found = false;
    for (Difference& difference : differences_) {
      if (difference.sort != order.name || (!difference.matches(a) && !difference.matches(b))) continue;
      ++difference.pairs;
      found = true;
    }
    return found;
  }

  /// Compares the words of an order; a pair that differs is explained.
  void compare(const Order& order) {
    const LocalePtr locale(LXGetLocale(order.ours.c_str(), 0, nullptr));
    if (!locale) throw std::runtime_error("there is no such sort");
    Status status;
    const std::unique_ptr<icu::Collator> peer(
        icu::Collator::createInstance(icu::Locale(order.locale.c_str()), status));
    peer->setAttribute(UCOL_ALTERNATE_HANDLING, UCOL_SHIFTED, status);
    Words words = words_of(order);
    EXPECT_GE(words.size(), kLeastWords);
    std::stable_sort(words.begin(), words.end(), [&](const UnicodeString& a, const UnicodeString& b) {
      return peer->compare(a, b, status) < 0;
    });
    std::vector<std::string> keys, letters;
    for (const UnicodeString& word : words) {
      keys.push_back(key_of(locale.get(), word));
      letters.push_back(letters_of_key(keys.back()));
    }
    std::mt19937 random(5489);
    for (size_t i = 0; i < words.size(); ++i) {
      for (size_t step = 1; step <= kNeighbours + kOthers; ++step) {
        const size_t j = step <= kNeighbours ? std::min(i + step, words.size() - 1) : random() % words.size();
        const UnicodeString &a = words[i], &b = words[j];
        const int expected = peer->compare(a, b, status), keyed = sign(letters[i].compare(letters[j]));
        const int compared = sign(LXStrcollU(locale.get(), units(a), a.length(), units(b), b.length(), 0));
        EXPECT_EQ(compared, sign(keys[i].compare(keys[j]))) << utf8(a) << ' ' << utf8(b);
        if (keyed == expected && (expected == 0 || compared == expected)) continue;
        if (explained(order, a, b)) continue;
        ADD_FAILURE() << order.name << '\t' << utf8(a) << '\t' << utf8(b) << '\t' << expected << keyed
                      << compared;
      }
    }
  }

  std::vector<Difference> differences_;
};

// A language has the common order where CLDR tailors none for it, and where its order is not among the sorts.
// ArabicPunjabi would inherit that of Gurmukhi.
TEST_F(SortOracle, LanguagesHaveTheirOrders) {
  std::string common;
  for (const auto& row : lexicor_import::kLanguages)
    if (row.sort == std::string("Default") && is_tailored(row.locale)) common += row.name + std::string(" ");
  EXPECT_EQ(common, "ArabicPunjabi ");
}

TEST_F(SortOracle, OrdersWordsAsIcu) {
  const Library library(LEXICOR_LOCALE_DIR);
  for (const Order& order : orders()) compare(order);
  for (const Difference& entry : differences_)
    EXPECT_GT(entry.pairs, 0U) << entry.sort << ' ' << entry.pattern << " does not occur";
}

}  // namespace
}  // namespace lx::test
