// Collation beside ICU and glibc on the words of dictionaries: compared in random pairs and with their
// neighbours in sorted order, sorted, and made into keys. Comparison by code value without case, and search,
// stand beside them.
#include <string.h>

#include <cstdio>

#include "codepages.h"
#include "families.h"
#include "icu.h"
#include "lexicor.hpp"
#include "system.h"
#include "words.h"

namespace bench {
namespace {

constexpr size_t kWords = 50000;

struct Subject {
  const char* language;
  const char* locale;
  const char* icu;
  const char* system;
  bool folds_alike;  // the order of upper-case letters, which counts without case, is that of lower-case ones
};
constexpr Subject kSubjects[] = {
    {"English", "English.UTF-8@Default", "en", "en_US.UTF-8", true},
    {"German", "German.UTF-8@Default", "de", "de_DE.UTF-8", false},
    {"Czech", "Czech.UTF-8", "cs", "cs_CZ.UTF-8", true},
    {"Swedish", "Swedish.UTF-8@Swedish", "sv", "sv_SE.UTF-8", true},
    {"Russian", "Russian.UTF-8@Default", "root", "ru_RU.UTF-8", false},
};

const LXUChar* lx_units(const std::u16string& text) {
  return reinterpret_cast<const LXUChar*>(text.data());
}

int32_t compare_utf16(LXLocale* locale, const Word& a, const Word& b) {
  return LXStrcollU(locale, lx_units(a.units), length(a.units.size()), lx_units(b.units),
                    length(b.units.size()), 0);
}
int32_t compare_utf8(LXLocale* locale, const Word& a, const Word& b) {
  return LXStrcoll(locale, a.utf8.data(), length(a.utf8.size()), b.utf8.data(), length(b.utf8.size()), 0);
}

Words words_of(const std::vector<std::u16string>& all) {
  auto words = std::make_shared<std::vector<Word>>();
  for (const std::u16string& word : all)
    if (words->size() < kWords) words->push_back({word, to_utf8(word)});
  return words;
}

Words part_of(const std::vector<Word>& words, size_t start) {
  const auto first = words.begin() + static_cast<std::ptrdiff_t>(std::min(start, words.size()));
  const size_t n = std::min<size_t>(kManyPieces, static_cast<size_t>(words.end() - first));
  return std::make_shared<std::vector<Word>>(first, first + static_cast<std::ptrdiff_t>(n));
}

class SubjectRows {
 public:
  SubjectRows(Table* table, const Subject& subject, LocalePointer locale, const Words& words)
      : table_(*table), subject_(subject), locale_(std::move(locale)), words_(words) {
    wrapped_ = std::make_shared<const lexicor::Locale>(subject.locale);
    system_ = open_system_locale(subject.system);
  }

  void add() {
    std::vector<Word> sorted = *words_;
    std::sort(sorted.begin(), sorted.end(),
              [&](const Word& a, const Word& b) { return compare_utf8(locale_.get(), a, b) < 0; });
    check_system(sorted);
    const Words random = part_of(*words_, 0), neighbours = part_of(sorted, sorted.size() / 2);
    add_order("random", Order::kNeighbours, random);
    add_order("neighbours", Order::kNeighbours, neighbours);
    add_order("sort", Order::kSort, words_);
    add_keys(random);
    if (subject_.folds_alike) add_caseless(neighbours);
    add_find(random);
  }

 private:
  /// glibc's table has another order for some characters: it is a peer where it agrees on the words.
  void check_system(const std::vector<Word>& sorted) {
    for (size_t i = 1; system_ != nullptr && i < sorted.size(); ++i) {
      if (strcoll_l(sorted[i - 1].utf8.c_str(), sorted[i].utf8.c_str(), system_.get()) <= 0) continue;
      std::fprintf(stderr, "collate/%s: glibc has another order for %s and %s, and is left out\n",
                   subject_.language, sorted[i - 1].utf8.c_str(), sorted[i].utf8.c_str());
      system_ = nullptr;
    }
  }

  void add_row(const char* family, const std::string& work, const Words& words, std::vector<Peer> peers,
               Same same) {
    size_t chars = 0;
    for (const Word& word : *words) chars += word.units.size();
    const std::string name = std::string(family) + "/" + subject_.language + "/" + work;
    table_.add({name, std::move(peers), chars, words->size(), kKeyBytes, same});
  }

  void add_order(const std::string& work, Order order, const Words& words) {
    add_row("collate", work + "_utf16", words,
            {{kOurs, order_work(order, words,
                                [locale = locale_](const Word& a, const Word& b) {
                                  return compare_utf16(locale.get(), a, b);
                                })},
             {kWrapped,
              order_work(order, words,
                         [locale = wrapped_](const Word& a, const Word& b) {
                           return locale->compare(a.units, b.units);
                         }),
              false},
             {kIcu, icu::order_utf16(order, words, subject_.icu)}},
            Same::kNumber);
    const auto glibc = [system = system_](const Word& a, const Word& b) {
      return strcoll_l(a.utf8.c_str(), b.utf8.c_str(), system.get());
    };
    add_row("collate", work + "_utf8", words,
            {{kOurs, order_work(order, words,
                                [locale = locale_](const Word& a, const Word& b) {
                                  return compare_utf8(locale.get(), a, b);
                                })},
             {kIcu, icu::order_utf8(order, words, subject_.icu)},
             {kGlibc, system_ == nullptr ? nullptr : order_work(order, words, glibc)}},
            Same::kNumber);
  }

  /// Each library has keys of its own.
  void add_keys(const Words& words) {
    add_row(
        "keys", "utf16", words,
        {{kOurs, key_work(words,
                          [locale = locale_](const Word& word, char* out) {
                            return count(LXStrxfrmU(locale.get(), reinterpret_cast<uint8_t*>(out), kKeyBytes,
                                                    lx_units(word.units), length(word.units.size()), 0));
                          })},
         {kWrapped,
          key_work(words,
                   [locale = wrapped_, key = std::string()](const Word& word, char*) mutable {
                     locale->key(word.units, &key);
                     return key.size();
                   }),
          false},
         {kIcu, icu::keys(words, subject_.icu)}},
        Same::kNothing);
    const auto glibc = [system = system_](const Word& word, char* out) {
      return strxfrm_l(out, word.utf8.c_str(), kKeyBytes, system.get());
    };
    add_row("keys", "utf8", words,
            {{kOurs, key_work(words,
                              [locale = locale_](const Word& word, char* out) {
                                return count(LXStrxfrm(locale.get(), reinterpret_cast<uint8_t*>(out), kKeyBytes,
                                                       word.utf8.data(), length(word.utf8.size()), 0));
                              })},
             {kGlibc, system_ == nullptr ? nullptr : key_work(words, glibc)}},
            Same::kNothing);
  }

  void add_caseless(const Words& words) {
    add_row("compare", "caseless_utf16", words,
            {{kOurs, order_work(Order::kNeighbours, words,
                                [locale = locale_](const Word& a, const Word& b) {
                                  return LXStrcmpU(locale.get(), lx_units(a.units), length(a.units.size()),
                                                   lx_units(b.units), length(b.units.size()),
                                                   LX_CASE_INSENSITIVE);
                                })},
             {kIcu, icu::order_caseless(words)}},
            Same::kNumber);
  }

  void add_find(const Words& words) {
    auto text = std::make_shared<std::u16string>();
    for (const Word& word : *words) *text += word.units + u' ';
    add_row("find", "utf16", words,
            {{kOurs, find_work(text,
                               [locale = locale_](const std::u16string& all, const std::u16string& part) {
                                 return LXStrstrU(locale.get(), lx_units(all), length(all.size()),
                                                  lx_units(part), length(part.size()), 0) != nullptr;
                               })},
             {kIcu, icu::find(text)}},
            Same::kNumber);
  }

  Table& table_;
  const Subject& subject_;
  LocalePointer locale_;
  std::shared_ptr<const lexicor::Locale> wrapped_;
  SystemLocale system_;
  Words words_;
};

}  // namespace

void add_collation_rows(Table* table, Texts* texts) {
  for (const Subject& subject : kSubjects) {
    const std::string language = std::string("/") + subject.language + "/";
    if (!table->wants_some("collate" + language) && !table->wants_some("keys" + language) &&
        !table->wants_some("compare" + language) && !table->wants_some("find" + language))
      continue;
    const LocalePointer locale = open_locale(subject.locale);
    const Words words = words_of(texts->words(subject.language));
    if (locale != nullptr && !words->empty()) SubjectRows(table, subject, locale, words).add();
  }
}

}  // namespace bench
