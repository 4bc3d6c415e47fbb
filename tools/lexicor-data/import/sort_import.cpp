// From collation elements to a sort's weights: first every character's elements in a form that keeps ICU's
// weights apart (Draft), then the numbers that take their place, level by level.
#include "sort_import.h"

#include <unicode/uchar.h>
#include <unicode/unorm2.h>

#include <algorithm>
#include <cstdio>
#include <map>
#include <sstream>
#include <stdexcept>

#include "codepage_table.h"
#include "sort_collator.h"

namespace lexicor_import {
namespace {

using lexicor_data::SortElement;
using lexicor_data::SortPage;
using lexicor_data::SortPageKind;
using lexicor_data::SortSet;
using lexicor_data::SortSource;
using Text = std::u16string;
using Weights = std::vector<uint32_t>;  ///< ordered as a dictionary orders words

constexpr unsigned kFirstPrimary = 0x0200;
constexpr uint8_t kLowestWeight = 1;
constexpr uint32_t kCommonSecondary = 0x0500;

/// A page of letters with accents, Vietnamese ones among them, of which codepages write only some.
constexpr unsigned kAccentedLatin = 0x1E;

/// Pages with computed weights, and where they stand among the other weights.
struct Block {
  unsigned first_page, last_page;
};
constexpr Block kIdeographs[] = {{0x4E, 0x9F}, {0x34, 0x4D}};
constexpr Block kSyllables[] = {{0xAC, 0xD7}};
constexpr Block kSurrogates = {0xD8, 0xDF};
constexpr Block kOthers[] = {{0xA0, 0xA4},
                             {0xE0, 0xF8}};  ///< Yi and private use: in code point order by nature
constexpr unsigned kFirstSyllable = 0xAC00, kLastSyllable = 0xD7A3;
constexpr unsigned kFirstJamo = 0x1100, kLastJamo = 0x11FF;

bool within(unsigned page, const Block& block) {
  return page >= block.first_page && page <= block.last_page;
}

/// A weight of the primary level before it has a number: one of ICU, a computed character, or a contraction
/// that is an element of its own.
struct Primary {
  enum Kind : uint8_t { kNone, kWeight, kComputed, kContraction } kind = kNone;
  uint32_t value = 0;  ///< ICU's weight, the code point, or both code points of the contraction

  bool operator<(const Primary& other) const {
    return kind != other.kind ? kind < other.kind : value < other.value;
  }
};

struct DraftElement {
  Primary primary;
  Weights secondary, tertiary;
};

/// What a character or a contraction becomes: elements, or a special weight, or nothing.
struct Draft {
  std::vector<DraftElement> elements;
  Weights special;
  bool cut = false;  ///< there were more elements
};

std::string code_text(const Text& text) {
  std::string out;
  for (char16_t unit : text) {
    char code[16];
    std::snprintf(code, sizeof code, "%s%04X", out.empty() ? "" : " ", static_cast<unsigned>(unit));
    out += code;
  }
  return out;
}

bool is_ideograph(unsigned code) {
  return within(code >> 8, kIdeographs[0]) || (within(code >> 8, kIdeographs[1]) && code <= 0x4DBF);
}

/// Numbers of the weights of a level, in their order.
class Numbers {
 public:
  void add(const Weights& weights) { numbers_[weights]; }
  /// Gives the numbers from `first` on and returns the one behind them.
  unsigned settle(unsigned first) {
    for (auto& entry : numbers_) entry.second = first++;
    return first;
  }
  unsigned of(const Weights& weights) const { return numbers_.at(weights); }

 private:
  std::map<Weights, unsigned> numbers_;
};

/// Numbers of the secondary or tertiary level, by primary weight: such weights are compared only where the
/// primary ones are equal. The lowest of each primary weight has the default number, so that keys can drop it;
/// a computed character has no weight there, which comes before the default one.
class LevelNumbers {
 public:
  explicit LevelNumbers(const char* what) : what_(what) {}
  void add(const Primary& primary, const Weights& weights) { numbers_[primary].add(weights); }
  /// `marks_last`: the weights of marks by themselves come behind all others, as they do on the secondary level
  /// where one text has an accent and the other its next letter.
  void settle(bool marks_last) {
    unsigned next = kLowestWeight;
    for (auto& [primary, numbers] : numbers_) {
      if (primary.kind == Primary::kNone) continue;
      next = std::max(next,
                      numbers.settle(primary.kind == Primary::kComputed ? kLowestWeight + 1 : kLowestWeight));
    }
    next = std::max(next, numbers_[{}].settle(marks_last ? next : kLowestWeight));
    if (next > 0x100)
      throw std::runtime_error(std::to_string(next - kLowestWeight) + " " + what_ + " weights, more than 255");
  }
  uint8_t of(const Primary& primary, const Weights& weights) const {
    return weights.empty() ? uint8_t{0} : static_cast<uint8_t>(numbers_.at(primary).of(weights));
  }

 private:
  const char* what_;
  std::map<Primary, Numbers> numbers_;
};

class Importer {
 public:
  Importer(const Sort& row, const std::set<char16_t>& repertoire, Notes& notes)
      : row_(row), repertoire_(repertoire), notes_(notes), collator_(row.locale) {}

  SortSource run() {
    choose_pages();
    find_computed();
    draft_characters();
    draft_contractions();
    number_primaries();
    number_levels();
    return build();
  }

 private:
  void choose_pages() {
    for (char16_t unit : repertoire_) table_pages_.insert(unit >> 8);
    table_pages_.insert(kAccentedLatin);
    for (const std::string& page : words(row_.scripts))
      scripts_.insert(static_cast<unsigned>(std::stoul(page, nullptr, 16)));
    table_pages_.insert(scripts_.begin(), scripts_.end());
    for (const Block& block :
         {kIdeographs[0], kIdeographs[1], kSyllables[0], kSurrogates, kOthers[0], kOthers[1]}) {
      for (unsigned page = block.first_page; page <= block.last_page; ++page) table_pages_.erase(page);
    }
  }

  bool in_tables(char16_t unit) const {
    return table_pages_.count(unit >> 8) != 0 && u_charType(unit) != U_UNASSIGNED && unit < 0xFFFE;
  }

  /// Which elements of ICU are ideographs and syllables.
  void find_computed() {
    for (const Block& block : kIdeographs) {
      for (unsigned code = block.first_page << 8; code <= (block.last_page << 8 | 0xFF); ++code) {
        if (!is_ideograph(code)) continue;
        const std::vector<Ce> elements = collator_.elements(Text(1, static_cast<char16_t>(code)));
        if (elements.size() != 1) continue;
        ideographs_.emplace(elements[0].primary, code);
        if (first_ideograph_.empty() || elements[0].primary < first_ideograph_weight_) {
          first_ideograph_weight_ = elements[0].primary;
          first_ideograph_ = Text(1, static_cast<char16_t>(code));
        }
      }
    }
    for (unsigned code = kFirstSyllable; code <= kLastSyllable; ++code) {
      Weights primaries;
      for (const Ce& ce : collator_.elements(Text(1, static_cast<char16_t>(code))))
        primaries.push_back(ce.primary);
      syllables_.emplace(primaries, code);
    }
  }

  /// Elements with their accents, and the punctuation among them.
  Draft draft(const Text& text) const {
    Draft result;
    bool after_variable = false;
    for (const Ce& ce : collator_.elements(text)) {
      if (collator_.is_variable(ce.primary)) {
        result.special.insert(result.special.end(), {ce.primary, ce.secondary, ce.tertiary});
        after_variable = true;
      } else if (ce.primary != 0 || (result.elements.empty() && !after_variable)) {
        result.elements.push_back({primary_of(ce.primary), {ce.secondary}, {ce.tertiary}});
        after_variable = false;
      } else if (!after_variable) {
        result.elements.back().secondary.push_back(ce.secondary);
        result.elements.back().tertiary.push_back(ce.tertiary);
      }
    }
    join_syllables(result.elements);
    for (DraftElement& element : result.elements) settle(element);
    fit(result);
    return result;
  }

  Primary primary_of(uint32_t weight) const {
    if (weight == 0) return {};
    const auto ideograph = ideographs_.find(weight);
    if (ideograph != ideographs_.end()) return {Primary::kComputed, ideograph->second};
    return {Primary::kWeight, weight};
  }

  /// Letters of Hangul that make a syllable become it; the longest one.
  void join_syllables(std::vector<DraftElement>& elements) const {
    for (size_t i = 0; i < elements.size(); ++i) {
      for (size_t length = 3; length >= 2; --length) {
        if (i + length > elements.size()) continue;
        Weights primaries;
        for (size_t j = i; j < i + length; ++j) primaries.push_back(elements[j].primary.value);
        const auto found = syllables_.find(primaries);
        if (found == syllables_.end()) continue;
        elements[i].primary = {Primary::kComputed, found->second};
        const auto next = elements.begin() + static_cast<std::ptrdiff_t>(i) + 1;
        elements.erase(next, next + static_cast<std::ptrdiff_t>(length) - 1);
        break;
      }
    }
  }

  /// Accents of the common form do not count on the tertiary level, nor does a level on which there is no
  /// weight. A computed character has no weights but the primary one where it is in its common form.
  void settle(DraftElement& element) const {
    auto trim = [](Weights& weights, uint32_t common) {
      while (weights.size() > 1 && (weights.back() == common || weights.back() == 0)) weights.pop_back();
      if (weights.size() == 1 && weights[0] == 0) weights.clear();
    };
    trim(element.secondary, 0);
    if (collator_.backwards()) std::reverse(element.secondary.begin(), element.secondary.end());
    trim(element.tertiary, collator_.common_tertiary());
    if (element.primary.kind != Primary::kComputed) return;
    if (element.secondary == Weights{kCommonSecondary}) element.secondary.clear();
    if (element.tertiary == Weights{collator_.common_tertiary()}) element.tertiary.clear();
  }

  /// Brings a draft down to two elements, or one special weight: the rest goes behind the tertiary weight.
  void fit(Draft& draft) const {
    if (draft.elements.empty()) return;
    Weights rest;
    for (size_t i = 2; i < draft.elements.size(); ++i) {
      draft.cut = true;
      rest.push_back(draft.elements[i].primary.value);
    }
    if (draft.elements.size() > 2) draft.elements.resize(2);
    rest.insert(rest.end(), draft.special.begin(), draft.special.end());
    draft.special.clear();
    if (rest.empty()) return;
    Weights& tertiary = draft.elements.back().tertiary;
    if (tertiary.empty()) tertiary.push_back(collator_.common_tertiary());
    tertiary.insert(tertiary.end(), rest.begin(), rest.end());
  }

  void draft_characters() {
    for (unsigned code = 0; code < 0x10000; ++code) {
      const auto unit = static_cast<char16_t>(code);
      if (!in_tables(unit)) continue;
      const Text text(1, unit);
      Draft& drafted = characters_.emplace(unit, draft(text)).first->second;
      if (drafted.cut) note("more than two elements", text);
      note_primaries(text, drafted);
    }
  }

  /// A text that is nothing but one weight of the primary level stands for it.
  void note_primaries(const Text& text, const Draft& drafted) {
    for (const DraftElement& element : drafted.elements) {
      if (element.primary.kind == Primary::kNone || element.primary.kind == Primary::kComputed) continue;
      Text& example = primaries_[element.primary];
      if (example.empty() && drafted.elements.size() == 1) example = text;
    }
  }

  void draft_contractions() {
    const Collator root("root");
    const std::set<Text> of_root = root.contractions(true);
    for (const Text& text : collator_.contractions(true)) {
      if (!std::all_of(text.begin(), text.end(), [&](char16_t unit) { return in_tables(unit); })) continue;
      const bool scripted = scripts_.count(text[0] >> 8) != 0;
      if (!scripted && of_root.count(text) != 0 && same_letters(collator_.elements(text), root.elements(text)))
        continue;
      add_contraction(text);
    }
    for (const std::string& word : words(row_.marks)) {
      const auto mark = static_cast<char16_t>(std::stoul(word, nullptr, 16));
      for (const auto& entry : characters_) {
        const Text text{entry.first, mark};
        if (composes(text)) add_contraction(text);
      }
    }
  }

  /// Whether elements agree on all levels but the tertiary one, which the case-first setting changes.
  static bool same_letters(const std::vector<Ce>& a, const std::vector<Ce>& b) {
    return std::equal(a.begin(), a.end(), b.begin(), b.end(), [](const Ce& x, const Ce& y) {
      return x.primary == y.primary && x.secondary == y.secondary;
    });
  }

  using Normalizer = const UNormalizer2* (*)(UErrorCode*);
  static Text normalized(const Text& text, Normalizer instance) {
    UErrorCode error = U_ZERO_ERROR;
    const UNormalizer2* form = instance(&error);
    require(error, "unorm2_getInstance");
    return icu_text("unorm2_normalize", [&](UChar* out, int32_t room, UErrorCode* status) {
      return unorm2_normalize(form, text.data(), static_cast<int32_t>(text.size()), out, room, status);
    });
  }

  /// Whether a pair is a vowel that is written before the consonant behind which it counts. No other letter of
  /// its script comes behind such vowels, so both become one element behind the consonant's.
  bool is_turned_around(const Text& text) const {
    const std::vector<Ce> both = collator_.elements(text), first = collator_.elements(text.substr(0, 1)),
                          second = collator_.elements(text.substr(1));
    return both.size() == 2 && first.size() == 1 && second.size() == 1 &&
           both[0].primary == second[0].primary && both[1].primary == first[0].primary;
  }

  void add_contraction(const Text& text) {
    if (text.size() != 2) return note("contraction of more than two characters", text);
    Draft drafted = draft(text);
    if (is_turned_around(text)) {
      const uint32_t both = static_cast<uint32_t>(text[0]) << 16 | text[1];
      drafted.elements[0].primary = {Primary::kContraction, both};
      drafted.elements.pop_back();
    }
    if (drafted.elements.size() > 1) return note("contraction with more than one element", text);
    note_primaries(text, drafted);
    contractions_.emplace(text, std::move(drafted));
  }

  /// Whether a character and a mark make one character; a half-width one, in its usual form.
  static bool composes(const Text& text) {
    const bool half_width = text[1] >= 0xFF00;
    if (half_width != (text[0] >= 0xFF00)) return false;
    return normalized(text, half_width ? unorm2_getNFKCInstance : unorm2_getNFCInstance).size() == 1;
  }

  template <class Action>
  void for_each_element(Action action) {
    for (auto& entry : characters_) {
      for (DraftElement& element : entry.second.elements) action(element);
    }
    for (auto& entry : contractions_) {
      for (DraftElement& element : entry.second.elements) action(element);
    }
  }

  /// The order of all weights of the primary level, and of the blocks among them.
  void number_primaries() {
    struct Item {
      std::vector<uint8_t> key;
      uint32_t value;  ///< decides among equal keys
      Primary primary;
      const Block* begin;
      const Block* end;
    };
    std::vector<Item> items;
    std::map<uint32_t, std::vector<uint8_t>> keys;  // by ICU's weight
    std::vector<uint8_t> last_letter;               // of Hangul
    for (const auto& [primary, example] : primaries_) {
      if (example.empty()) continue;
      std::vector<uint8_t> key = collator_.primary_key(example);
      if (primary.kind == Primary::kWeight) keys[primary.value] = key;
      if (example[0] >= kFirstJamo && example[0] <= kLastJamo) last_letter = std::max(last_letter, key);
      items.push_back({std::move(key), primary.value, primary, nullptr, nullptr});
    }
    for (const auto& [primary, example] : primaries_) {
      if (!example.empty()) continue;
      // A weight that no character has by itself stands behind the next lower one.
      auto next = keys.upper_bound(primary.value);
      if (next == keys.begin()) throw std::runtime_error("a primary weight without a place");
      items.push_back({std::prev(next)->second, primary.value, primary, nullptr, nullptr});
    }
    items.push_back(
        {collator_.primary_key(first_ideograph_), 0, {}, std::begin(kIdeographs), std::end(kIdeographs)});
    items.push_back({last_letter, UINT32_MAX, {}, std::begin(kSyllables), std::end(kSyllables)});
    std::sort(items.begin(), items.end(),
              [](const Item& a, const Item& b) { return a.key != b.key ? a.key < b.key : a.value < b.value; });
    for (const Item& item : items) {
      if (item.begin == nullptr) numbers_[item.primary] = next_primary_++;
      for (const Block* block = item.begin; block != item.end; ++block) {
        for (unsigned page = block->first_page; page <= block->last_page; ++page) add_page(page);
      }
    }
    for (unsigned page = 0; page < 256; ++page) {
      if (table_pages_.count(page) == 0 && !within(page, kSurrogates) && pages_[page].base == 0) add_page(page);
    }
    if (next_primary_ > 0x10000) throw std::runtime_error("more than 65,536 primary weights");
  }

  void add_page(unsigned page) {
    pages_[page] = {SortPageKind::kPrimary, static_cast<uint16_t>(next_primary_), char_class(), {}};
    next_primary_ += 256;
  }

  void number_levels() {
    for_each_element([&](const DraftElement& element) {
      if (!element.secondary.empty()) secondaries_.add(element.primary, element.secondary);
      if (!element.tertiary.empty()) tertiaries_.add(element.primary, element.tertiary);
    });
    auto add_special = [&](const Draft& drafted) {
      if (!drafted.special.empty()) specials_.add(drafted.special);
    };
    for (const auto& entry : characters_) add_special(entry.second);
    for (const auto& entry : contractions_) add_special(entry.second);
    secondaries_.settle(true);
    tertiaries_.settle(false);
    if (specials_.settle(1) > 0x10000) throw std::runtime_error("more than 65,535 special weights");
  }

  uint8_t char_class() const {
    return collator_.backwards() ? lexicor_data::kAppendAll & ~LX_APPEND_SECONDARY : lexicor_data::kAppendAll;
  }

  uint16_t number_of(const Primary& primary) const {
    if (primary.kind == Primary::kNone) return 0;
    if (primary.kind != Primary::kComputed) return static_cast<uint16_t>(numbers_.at(primary));
    return static_cast<uint16_t>(pages_[primary.value >> 8].base + (primary.value & 0xFF));
  }

  SortElement element_of(const Draft& drafted) const {
    SortElement element;
    element.char_class = char_class();
    if (drafted.elements.empty()) {
      if (!drafted.special.empty())
        element.sets[0].special = static_cast<uint16_t>(specials_.of(drafted.special));
      return element;
    }
    element.count = static_cast<uint8_t>(drafted.elements.size());
    for (size_t i = 0; i < element.count; ++i) {
      const DraftElement& from = drafted.elements[i];
      SortSet& to = element.sets[i];
      to.primary = number_of(from.primary);
      to.secondary = secondaries_.of(from.primary, from.secondary);
      to.tertiary = tertiaries_.of(from.primary, from.tertiary);
    }
    return element;
  }

  SortSource build() {
    SortSource sort;
    sort.default_secondary = sort.default_tertiary = kLowestWeight;
    sort.pages = pages_;
    for (unsigned page : table_pages_) sort.pages[page].kind = SortPageKind::kTable;
    for (const auto& [unit, drafted] : characters_) {
      const SortElement element = element_of(drafted);
      if (!element.ignored()) sort.characters.emplace(unit, element);
    }
    for (const auto& [text, drafted] : contractions_)
      sort.contractions.emplace(std::make_pair(text[0], text[1]), element_of(drafted));
    for (const auto& [reason, texts] : left_out_) {
      std::string line = reason + " (" + std::to_string(texts.size()) + "):";
      for (const Text& text : texts) line += (&text == &texts.front() ? " " : ", ") + code_text(text);
      notes_.push_back(line);
    }
    return sort;
  }

  void note(const std::string& reason, const Text& text) { left_out_[reason].push_back(text); }

  const Sort& row_;
  const std::set<char16_t>& repertoire_;
  Notes& notes_;
  Collator collator_;
  std::set<unsigned> scripts_, table_pages_;
  std::map<uint32_t, unsigned> ideographs_;  ///< by ICU's weight
  std::map<Weights, unsigned> syllables_;    ///< by the weights of their letters
  Text first_ideograph_;                     ///< in ICU's order
  uint32_t first_ideograph_weight_ = 0;      ///< its weight
  std::map<char16_t, Draft> characters_;
  std::map<Text, Draft> contractions_;
  std::map<Primary, Text> primaries_;  ///< with a text that has this weight alone, empty where there is none
  std::map<Primary, unsigned> numbers_;
  unsigned next_primary_ = kFirstPrimary;
  std::array<SortPage, 256> pages_{};
  LevelNumbers secondaries_{"secondary"}, tertiaries_{"tertiary"};
  Numbers specials_;
  std::map<std::string, std::vector<Text>> left_out_;  ///< by reason
};

}  // namespace

SortSource import_sort(const Sort& sort, const std::set<char16_t>& repertoire, Notes& notes) {
  return Importer(sort, repertoire, notes).run();
}

}  // namespace lexicor_import
