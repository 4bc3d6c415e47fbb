// Collation beside ICU and, where the system has the locale, glibc: words compared in random pairs and with
// their neighbours in sorted order, sorted, and made into keys. Comparison by code value and search stand
// beside them, on the same words.
#include <locale.h>
#include <string.h>
#include <unicode/ucol.h>
#include <unicode/ustring.h>

#include <algorithm>
#include <cstdio>
#include <random>

#include "lexicor.hpp"
#include "rows.h"

namespace bench {
namespace {

constexpr size_t kWords = 50000;
constexpr size_t kComparedWords = 2000;  // they stay in the second-level cache
constexpr int32_t kKeyBytes = 1024;

struct Text {
  const char* label;
  Language language;
  const char* locale;
  const char* icu;
  const char* glibc;
};
constexpr Text kTexts[] = {
    {"German", Language::kGerman, "German.UTF-8@Default", "de", "de_DE.UTF-8"},
    {"Swedish", Language::kGerman, "Swedish.UTF-8@Swedish", "sv", "sv_SE.UTF-8"},
    {"Russian", Language::kRussian, "Russian.UTF-8@Default", "root", "ru_RU.UTF-8"},
};

struct Word {
  std::u16string units;
  std::string utf8;
};

std::vector<Word> words_of(Language language) {
  const std::u16string text = make_text(language, Mixture::kNative, utf8_bytes, 12 * kWords);
  std::vector<Word> words;
  std::u16string current;
  for (const char16_t c : text) {
    if (c > u'9' && c != u'?' && c != u';' && c != u':') {
      current += c;
      continue;
    }
    if (current.size() > 1 && words.size() < kWords) words.push_back({current, to_utf8(current)});
    current.clear();
  }
  return words;
}

/// Compares two words: below 0, 0, above 0.
using Compare = std::function<int(const Word&, const Word&)>;

struct Library {
  const char* name;
  Compare utf16, utf8;  // null: it cannot
  std::function<size_t(const Word&, char*)> key;
  Compare caseless;  // by code value, UTF-16
  /// Looks for a word in a text.
  std::function<bool(const std::u16string& text, const Word&)> find;
};

int32_t length(size_t n) {
  return static_cast<int32_t>(n);
}
const LXUChar* lx_units(const Word& word) {
  return reinterpret_cast<const LXUChar*>(word.units.data());
}

/// Null where the locale is not there, as long as its sort is not in the directory.
std::vector<Library> libraries_of(const Text& text) {
  std::vector<Library> libraries;
  const std::shared_ptr<LXLocale> locale(LXGetLocale(text.locale, 0, nullptr), LXReleaseLocale);
  if (locale == nullptr) return libraries;
  libraries.push_back(
      {kOurs,
       [locale](const Word& a, const Word& b) {
         return LXStrcollU(locale.get(), lx_units(a), length(a.units.size()), lx_units(b),
                           length(b.units.size()), 0);
       },
       [locale](const Word& a, const Word& b) {
         return LXStrcoll(locale.get(), a.utf8.data(), length(a.utf8.size()), b.utf8.data(),
                          length(b.utf8.size()), 0);
       },
       [locale](const Word& word, char* out) {
         return static_cast<size_t>(LXStrxfrmU(locale.get(), reinterpret_cast<uint8_t*>(out), kKeyBytes,
                                               lx_units(word), length(word.units.size()), 0));
       },
       [locale](const Word& a, const Word& b) {
         return LXStrcmpU(locale.get(), lx_units(a), length(a.units.size()), lx_units(b),
                          length(b.units.size()), LX_CASE_INSENSITIVE);
       },
       [locale](const std::u16string& all, const Word& word) {
         return LXStrstrU(locale.get(), reinterpret_cast<const LXUChar*>(all.data()), length(all.size()),
                          lx_units(word), length(word.units.size()), 0) != nullptr;
       }});
  const auto owner = std::make_shared<const lexicor::Locale>(text.locale);
  libraries.push_back({kWrapped,
                       [owner](const Word& a, const Word& b) { return owner->compare(a.units, b.units); },
                       [owner](const Word& a, const Word& b) { return owner->compare(a.utf8, b.utf8); },
                       [owner, key = std::string()](const Word& word, char*) mutable {
                         owner->key(word.units, &key);
                         return key.size();
                       },
                       nullptr, nullptr});
  UErrorCode error = U_ZERO_ERROR;
  const std::shared_ptr<UCollator> icu(ucol_open(text.icu, &error), ucol_close);
  // The order that the shipped sorts have: punctuation counts only where all else is equal.
  ucol_setAttribute(icu.get(), UCOL_ALTERNATE_HANDLING, UCOL_SHIFTED, &error);
  ucol_setAttribute(icu.get(), UCOL_STRENGTH, UCOL_QUATERNARY, &error);
  libraries.push_back(
      {kIcu,
       [icu](const Word& a, const Word& b) {
         return static_cast<int>(ucol_strcoll(icu.get(), a.units.data(), length(a.units.size()), b.units.data(),
                                              length(b.units.size())));
       },
       [icu](const Word& a, const Word& b) {
         UErrorCode failed = U_ZERO_ERROR;
         return static_cast<int>(ucol_strcollUTF8(icu.get(), a.utf8.data(), length(a.utf8.size()),
                                                  b.utf8.data(), length(b.utf8.size()), &failed));
       },
       [icu](const Word& word, char* out) {
         return static_cast<size_t>(ucol_getSortKey(icu.get(), word.units.data(), length(word.units.size()),
                                                    reinterpret_cast<uint8_t*>(out), kKeyBytes));
       },
       [](const Word& a, const Word& b) {
         UErrorCode failed = U_ZERO_ERROR;
         return static_cast<int>(u_strCaseCompare(a.units.data(), length(a.units.size()), b.units.data(),
                                                  length(b.units.size()), U_FOLD_CASE_DEFAULT, &failed));
       },
       [](const std::u16string& all, const Word& word) {
         return u_strFindFirst(all.data(), length(all.size()), word.units.data(), length(word.units.size())) !=
                nullptr;
       }});
  if (const locale_t system = newlocale(LC_COLLATE_MASK | LC_CTYPE_MASK, text.glibc, nullptr)) {
    libraries.push_back(
        {kGlibc, nullptr,
         [system](const Word& a, const Word& b) { return strcoll_l(a.utf8.c_str(), b.utf8.c_str(), system); },
         nullptr, nullptr, nullptr});
  }
  return libraries;
}

using Words = std::shared_ptr<const std::vector<Word>>;

std::shared_ptr<const Pieces> pieces_of(const std::vector<Word>& words) {
  auto pieces = std::make_shared<Pieces>();
  for (const Word& word : words) {
    pieces->bytes += word.utf8;
    pieces->ends.push_back(pieces->bytes.size());
    pieces->chars += word.units.size();
  }
  return pieces;
}

/// Compares each word with the next one: how many are less.
Peer compare_peer(const char* name, const Words& words, const Compare& compare) {
  return {name, [words, compare](char*) {
            size_t less = 1;
            for (size_t i = 1; i < words->size(); ++i) less += compare((*words)[i - 1], (*words)[i]) < 0;
            return less;
          }};
}

Peer sort_peer(const char* name, const Words& words, const Compare& compare) {
  return {name, [words, compare](char*) {
            std::vector<const Word*> order;
            for (const Word& word : *words) order.push_back(&word);
            std::sort(order.begin(), order.end(),
                      [&](const Word* a, const Word* b) { return compare(*a, *b) < 0; });
            return order.size();
          }};
}

class Rows {
 public:
  Rows(std::vector<Row>* rows, const std::string& filter) : rows_(rows), filter_(filter) {}

  /// `make(library)` gives the peer of a library, or one without a function where it cannot do the work.
  template <class Make>
  void add(const std::string& name, const Words& words, const std::vector<Library>& libraries, Make make) {
    if (name.find(filter_) == std::string::npos) return;
    Row row{name, pieces_of(*words), {}, kKeyBytes};
    for (const Library& library : libraries) {
      Peer peer = make(library);
      if (peer.run) row.peers.push_back(std::move(peer));
    }
    rows_->push_back(std::move(row));
  }

 private:
  std::vector<Row>* rows_;
  const std::string& filter_;
};

Peer optional_peer(Peer peer, bool there) {
  return there ? std::move(peer) : Peer{peer.name, nullptr};
}

}  // namespace

void add_collation_rows(std::vector<Row>* rows, const std::string& filter) {
  const auto wanted = [&](const std::string& family) {
    return family.find(filter) != std::string::npos || filter.find(family) != std::string::npos;
  };
  if (!wanted("collate") && !wanted("compare") && !wanted("find")) return;
  Rows table(rows, filter);
  for (const Text& text : kTexts) {
    const std::vector<Library> libraries = libraries_of(text);
    if (libraries.empty()) continue;
    const std::vector<Word> all = words_of(text.language);
    std::vector<Word> some(all.begin(), all.begin() + kComparedWords);
    const auto random = std::make_shared<const std::vector<Word>>(some);
    std::sort(some.begin(), some.end(),
              [&](const Word& a, const Word& b) { return libraries[0].utf16(a, b) < 0; });
    const auto sorted = std::make_shared<const std::vector<Word>>(some);
    const auto every = std::make_shared<const std::vector<Word>>(all);
    const std::string stem = std::string("collate/") + text.label + "/";
    for (const auto& [label, words] : {std::pair{"random", random}, {"neighbours", sorted}}) {
      table.add(stem + label + "_utf16", words, libraries, [&, words = words](const Library& l) {
        return optional_peer(compare_peer(l.name, words, l.utf16), l.utf16 != nullptr);
      });
      table.add(stem + label + "_utf8", words, libraries, [&, words = words](const Library& l) {
        return optional_peer(compare_peer(l.name, words, l.utf8), l.utf8 != nullptr);
      });
    }
    table.add(stem + "sort_utf8", every, libraries, [&](const Library& l) {
      return optional_peer(sort_peer(l.name, every, l.utf8), l.utf8 != nullptr);
    });
    table.add(std::string("compare/") + text.label + "/caseless_utf16", sorted, libraries,
              [&](const Library& l) {
                return optional_peer(compare_peer(l.name, sorted, l.caseless), l.caseless != nullptr);
              });
    table.add(std::string("find/") + text.label + "/utf16", random, libraries, [&](const Library& l) {
      return optional_peer({l.name,
                            [random, find = l.find](char*) {
                              std::u16string joined;
                              for (const Word& word : *random) joined += word.units;
                              return size_t{1} + find(joined, {u"not to be found", ""});
                            }},
                           l.find != nullptr);
    });
    table.add(stem + "keys", random, libraries, [&](const Library& l) {
      return optional_peer({l.name,
                            [random, key = l.key](char* out) {
                              size_t bytes = 0;
                              for (const Word& word : *random) bytes += key(word, out);
                              return bytes;
                            }},
                           l.key != nullptr);
    });
  }
}

}  // namespace bench
