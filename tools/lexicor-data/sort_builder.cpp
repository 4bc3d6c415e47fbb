// First every character's elements in a form that keeps all weights apart (Draft), then the numbers that take
// their place, level by level.
#include "sort_builder.h"

#include <algorithm>
#include <functional>
#include <map>

#include "sort_check.h"
#include "sort_line.h"

namespace lexicor_data {
namespace {

using Text = std::u16string;
using Weights = std::vector<uint64_t>;  ///< ordered as a dictionary orders words

constexpr unsigned kFirstPrimary = 0x0200;
constexpr uint8_t kLowestWeight = 1;
constexpr unsigned kFirstJamo = 0x1100, kLastJamo = 0x11FF;
constexpr uint64_t kNoAccent =
    1ULL << 32;  ///< with a weight that stands behind those of a letter and its accents

/// A weight of the primary level before it has its number: one of the tailoring, a computed character, or two
/// weights that became one.
struct Primary {
  enum Kind : uint8_t { kNone, kWeight, kComputed, kPair } kind = kNone;
  uint32_t value = 0;  ///< the order's number, the code point, or the number of the pair

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

/// Values in order, each once.
template <class Value, class Less = std::less<Value>>
class Ranks {
 public:
  explicit Ranks(Less less = {}) : less_(less) {}

  void add(Value value) { values_.push_back(std::move(value)); }
  /// Orders what was added.
  void settle() {
    std::sort(values_.begin(), values_.end(), less_);
    const auto same = [&](const Value& a, const Value& b) { return !less_(a, b); };  // of two in order
    values_.erase(std::unique(values_.begin(), values_.end(), same), values_.end());
  }
  const std::vector<Value>& values() const { return values_; }
  size_t of(const Value& value) const {
    const auto place = std::lower_bound(values_.begin(), values_.end(), value, less_);
    return static_cast<size_t>(place - values_.begin());
  }

 private:
  Less less_;
  std::vector<Value> values_;
};

using LevelWeights = std::pair<Primary, Weights>;

/// The order of weights of a level, by primary weight. Behind the last accent stand common weights, as many as there
/// may be accents: what is lower comes ahead of them, and what is no accent behind them.
struct LevelOrder {
  uint32_t common;

  bool operator()(const LevelWeights& a, const LevelWeights& b) const {
    if (a.first < b.first || b.first < a.first) return a.first < b.first;
    for (size_t i = 0; i < std::max(a.second.size(), b.second.size()); ++i) {
      const uint64_t x = rank(a.second, i), y = rank(b.second, i);
      if (x != y) return x < y;
    }
    return false;
  }

 private:
  uint64_t rank(const Weights& weights, size_t i) const {
    const auto weight = i < weights.size() ? static_cast<uint32_t>(weights[i]) : common;
    const bool accent = i >= weights.size() || (weights[i] & kNoAccent) == 0;
    return accent ? uint64_t{weight} << 32 : uint64_t{std::max(weight, common)} << 32 | weight;
  }
};

/// Numbers of the secondary or tertiary level, by primary weight: such weights are compared only where the
/// primary ones are equal. The lowest of each primary weight has the default number, so that keys can drop it;
/// a computed character has no weight there, which comes before the default one.
class LevelNumbers {
 public:
  explicit LevelNumbers(uint32_t common) : ranks_(LevelOrder{common}) {}

  void add(const Primary& primary, const Weights& weights) { ranks_.add({primary, weights}); }
  /// Returns how many there are. `marks_last`: the weights of marks by themselves come behind all others, as
  /// they do on the secondary level where one text has an accent and the other its next letter.
  unsigned settle(bool marks_last) {
    ranks_.settle();
    unsigned next = kLowestWeight, most = kLowestWeight;
    size_t marks = 0;  // they stand first
    const auto& values = ranks_.values();
    for (size_t i = 0; i < values.size(); ++i) {
      const Primary& primary = values[i].first;
      if (primary.kind == Primary::kNone) ++marks;
      const bool first = i == 0 || values[i - 1].first < primary;
      if (first) next = primary.kind == Primary::kComputed ? kLowestWeight + 1 : kLowestWeight;
      numbers_.push_back(next++);
      if (primary.kind != Primary::kNone) most = std::max(most, next);
    }
    const unsigned shift = marks_last ? most - kLowestWeight : 0;
    for (size_t i = 0; i < marks; ++i) numbers_[i] += shift;
    return std::max(most, static_cast<unsigned>(marks) + kLowestWeight + shift) - kLowestWeight;
  }
  uint8_t of(const Primary& primary, const Weights& weights) const {
    return weights.empty() ? uint8_t{0} : static_cast<uint8_t>(numbers_[ranks_.of({primary, weights})]);
  }

 private:
  Ranks<LevelWeights, LevelOrder> ranks_;
  std::vector<unsigned> numbers_;
};

class Builder {
 public:
  Builder(const SortTailoring& tailoring, const std::string& file, SortNotes& notes)
      : tailoring_(tailoring), root_(tailoring.root()), file_(file), notes_(notes) {}

  SortSource run() {
    for (unsigned page = 0; page < 256; ++page)
      is_table_[page] = tailoring_.tables()[page] && !root_.is_computed(page << 8);
    draft_characters();
    draft_contractions();
    join_turned_characters();
    number_primaries();
    number_levels();
    return build();
  }

 private:
  [[noreturn]] void fail(SortPlace place, const std::string& what) const {
    throw SourceError(file_, place.line, place.column, what);
  }
  void check_count(size_t count, size_t most, Strength level, const char* name) const {
    if (count <= most) return;
    fail(tailoring_.weight_place(level),
         std::to_string(count) + " " + name + " weights, more than " + std::to_string(most));
  }

  bool in_tables(char16_t unit) const { return is_table_[unit >> 8] && root_.listed[unit]; }

  uint32_t tertiary_of(const CollationElement& element) const {
    constexpr unsigned kCaseShift = 28;
    if (element.tertiary == 0) return 0;
    const uint32_t number = tailoring_.order().number(element.tertiary);
    const auto letter_case = static_cast<uint32_t>(element.letter_case);
    switch (tailoring_.case_first()) {
      case CaseFirst::kLower:
        return number | letter_case << kCaseShift;
      case CaseFirst::kUpper:
        return number | (2 - letter_case) << kCaseShift;
      default:
        return number;
    }
  }
  uint32_t common_tertiary() const { return tertiary_of({0, 0, kCommonTertiary, LetterCase::kLower}); }

  Primary primary_of(uint32_t weight) const {
    if (weight == 0) return {};
    const unsigned code = weight - kFirstIdeograph;
    if (weight >= kFirstIdeograph && code < kCharacters && root_.is_computed(code))
      return {Primary::kComputed, code};
    return {Primary::kWeight, tailoring_.order().number(weight)};
  }

  /// Elements with their accents, and the punctuation among them. `separate`: the last accent by itself.
  Draft draft(const CollationElements& from, bool separate = false) const {
    Draft result;
    bool after_variable = false;
    const CollationElements elements = joined(from);
    for (const CollationElement& element : elements) {
      if (element.primary == 0 && element.secondary == 0 && element.tertiary == 0) continue;
      const uint32_t secondary = element.secondary == 0 ? 0 : tailoring_.order().number(element.secondary);
      const uint32_t tertiary = tertiary_of(element);
      const bool apart = separate && &element == &elements.back() && result.elements.size() == 1;
      if (tailoring_.is_variable(element.primary)) {
        result.special.insert(result.special.end(),
                              {tailoring_.order().number(element.primary), secondary, tertiary});
        after_variable = true;
      } else if (element.primary != 0 || ((result.elements.empty() || apart) && !after_variable)) {
        result.elements.push_back({primary_of(element.primary), {secondary}, {tertiary}});
        after_variable = false;
      } else if (!after_variable) {
        result.elements.back().secondary.push_back(secondary);
        result.elements.back().tertiary.push_back(tertiary);
      }
    }
    for (DraftElement& element : result.elements) settle(element);
    fit(result);
    return result;
  }

  /// Letters of Hangul that make a syllable become it; the longest one.
  CollationElements joined(CollationElements elements) const {
    for (size_t i = 0; i + 1 < elements.size(); ++i) {
      for (size_t length = std::min<size_t>(3, elements.size() - i); length >= 2; --length) {
        uint32_t primaries[3];
        for (size_t j = 0; j < length; ++j) primaries[j] = elements[i + j].primary;
        const char16_t syllable = root_.syllable(primaries, length);
        if (syllable == 0) continue;
        elements[i].primary = kFirstIdeograph + syllable;
        const auto next = elements.begin() + static_cast<std::ptrdiff_t>(i) + 1;
        elements.erase(next, next + static_cast<std::ptrdiff_t>(length) - 1);
        break;
      }
    }
    return elements;
  }

  /// Accents of the common form do not count on the tertiary level, nor does a level on which there is no
  /// weight. A computed character has no weights but the primary one where it is in its common form.
  void settle(DraftElement& element) const {
    auto trim = [](Weights& weights, uint32_t common) {
      while (weights.size() > 1 && (weights.back() == common || weights.back() == 0)) weights.pop_back();
      if (weights.size() == 1 && weights[0] == 0) weights.clear();
    };
    trim(element.secondary, 0);
    if (tailoring_.backwards()) std::reverse(element.secondary.begin(), element.secondary.end());
    trim(element.tertiary, common_tertiary());
    if (element.primary.kind != Primary::kComputed) return;
    if (element.secondary == Weights{tailoring_.order().number(kCommonSecondary)}) element.secondary.clear();
    if (element.tertiary == Weights{common_tertiary()}) element.tertiary.clear();
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
    if (tertiary.empty()) tertiary.push_back(common_tertiary());
    for (const uint64_t weight : rest) tertiary.push_back(weight | kNoAccent);
  }

  void draft_characters() {
    for (unsigned code = 0; code < kCharacters; ++code) {
      const auto unit = static_cast<char16_t>(code);
      if (!in_tables(unit)) continue;
      characters_.emplace_back(unit, draft(tailoring_.elements(unit), tailoring_.is_separate(unit)));
      if (characters_.back().second.cut) note("more than two elements", Text(1, unit));
    }
  }

  const Draft& character(char16_t unit) const {
    return std::lower_bound(characters_.begin(), characters_.end(), unit,
                            [](const auto& entry, char16_t value) { return entry.first < value; })
        ->second;
  }

  /// Whether a pair is a vowel that is written before the consonant behind which it counts. No other letter of
  /// its script comes behind such vowels, so both become one element behind the consonant's.
  static bool is_turned_around(const Draft& both, const Draft& first, const Draft& second) {
    auto same = [](const DraftElement& a, const DraftElement& b) {
      return a.primary.kind == Primary::kWeight && !(a.primary < b.primary) && !(b.primary < a.primary);
    };
    return both.elements.size() == 2 && first.elements.size() == 1 && second.elements.size() == 1 &&
           same(both.elements[0], second.elements[0]) && same(both.elements[1], first.elements[0]);
  }

  void draft_contractions() {
    for (const Text& text : tailoring_.long_contractions()) {
      if (std::all_of(text.begin(), text.end(), [&](char16_t unit) { return in_tables(unit); }))
        note("contraction of more than two characters", text);
    }
    for (const auto& [text, place] : tailoring_.contractions()) {
      if (!in_tables(text[0]) || !in_tables(text[1])) continue;
      Draft drafted = draft(tailoring_.contraction_elements(text));
      if (is_turned_around(drafted, character(text[0]), character(text[1]))) turn(drafted);
      const RulePlace* const written = tailoring_.written(text);
      if (drafted.elements.size() > 1 && written != nullptr) {
        throw SourceError(written->file, written->place.line, written->place.column,
                          "'" + rule_text(text) + "' (" + code_points_text(text) +
                              ") has two elements, a contraction of two characters has one");
      }
      if (drafted.elements.size() > 1)
        note("contraction with more than one element", text);
      else
        contractions_.emplace(text, std::move(drafted));
    }
  }

  /// Makes two elements one with a primary weight of their own.
  void turn(Draft& drafted) {
    DraftElement &first = drafted.elements[0], &second = drafted.elements[1];
    const auto key = std::make_pair(first.primary.value, second.primary.value);
    const auto number = pairs_.emplace(key, static_cast<uint32_t>(pairs_.size())).first->second;
    first.primary = {Primary::kPair, number};
    if (second.tertiary != Weights{common_tertiary()}) {
      first.tertiary.resize(1);
      first.tertiary.insert(first.tertiary.end(), second.tertiary.begin(), second.tertiary.end());
    }
    drafted.elements.pop_back();
  }

  /// A character with the elements of a pair that was turned around becomes the same one element.
  void join_turned_characters() {
    for (auto& [unit, drafted] : characters_) {
      if (drafted.elements.size() != 2) continue;
      const Primary &first = drafted.elements[0].primary, &second = drafted.elements[1].primary;
      const bool both = first.kind == Primary::kWeight && second.kind == Primary::kWeight;
      if (both && pairs_.count({first.value, second.value}) != 0) turn(drafted);
    }
  }

  template <class Action>
  void for_each_element(Action action) const {
    for (auto& entry : characters_) {
      for (const DraftElement& element : entry.second.elements) action(element);
    }
    for (auto& entry : contractions_) {
      for (const DraftElement& element : entry.second.elements) action(element);
    }
  }

  /// The place of a primary weight among all of them.
  struct Place {
    size_t group = 0;
    uint32_t number = 0, second = 0;
    bool operator<(const Place& other) const {
      return std::tie(group, number, second) < std::tie(other.group, other.number, other.second);
    }
  };
  Place place_of(uint32_t number, uint32_t second = 0) const {
    const uint32_t weight = WeightOrder::in_group_of(number);
    if (weight >= kFirstBehind) return {root_.groups.size(), number, second};
    return {tailoring_.group_rank(root_.group_of(weight)), number, second};
  }

  /// The place behind the letters of Hangul.
  Place behind_jamos() const {
    Place last;
    for (unsigned code = kFirstJamo; code <= kLastJamo; ++code) {
      for (const CollationElement& element : root_.characters[code])
        last = std::max(last, place_of(tailoring_.order().number(element.primary), UINT32_MAX));
    }
    return last;
  }

  /// The order of all weights of the primary level, and of the blocks among them.
  void number_primaries() {
    for_each_element([&](const DraftElement& element) {
      if (element.primary.kind == Primary::kWeight || element.primary.kind == Primary::kPair)
        primaries_.add(element.primary);
    });
    primaries_.settle();
    std::map<uint32_t, Place> pair_places;
    for (const auto& [both, number] : pairs_) pair_places[number] = place_of(both.first, both.second);
    struct Item {
      Place place;
      size_t rank;  ///< of a primary weight, or a block
      bool operator<(const Item& other) const { return place < other.place; }
    };
    std::vector<Item> items;
    const auto& values = primaries_.values();
    for (size_t rank = 0; rank < values.size(); ++rank) {
      const Primary& primary = values[rank];
      items.push_back(
          {primary.kind == Primary::kPair ? pair_places[primary.value] : place_of(primary.value), rank});
    }
    const size_t syllables = values.size(), ideographs = values.size() + 1;
    items.push_back({behind_jamos(), syllables});
    items.push_back({place_of(tailoring_.order().number(kFirstIdeograph)), ideographs});
    std::sort(items.begin(), items.end());
    numbers_.resize(values.size());
    for (const Item& item : items) {
      if (item.rank < values.size())
        numbers_[item.rank] = next_primary_++;
      else
        add_pages(item.rank == syllables ? root_.syllables : root_.ideographs);
    }
    for (unsigned page = 0; page < 256; ++page) {
      const bool uncovered = std::any_of(root_.uncovered.begin(), root_.uncovered.end(),
                                         [&](SortRange range) { return range.holds(page << 8); });
      if (!is_table_[page] && !uncovered && pages_[page].base == 0) add_page(page);
    }
    if (next_primary_ > 0x10000)
      fail(tailoring_.weight_place(Strength::kPrimary), "the primary weights go beyond FFFF");
  }

  void add_pages(const std::vector<SortRange>& ranges) {
    for (const SortRange& range : ranges) {
      for (unsigned page = range.first >> 8; page <= range.last >> 8; ++page) add_page(page);
    }
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
    check_count(secondaries_.settle(true), 0xFF, Strength::kSecondary, "secondary");
    check_count(tertiaries_.settle(false), 0xFF, Strength::kTertiary, "tertiary");
    specials_.settle();
    check_count(specials_.values().size(), 0xFFFF, Strength::kPrimary, "special");
  }

  uint8_t char_class() const { return tailoring_.backwards() ? kAppendAll & ~LX_APPEND_SECONDARY : kAppendAll; }

  uint16_t number_of(const Primary& primary) const {
    if (primary.kind == Primary::kNone) return 0;
    if (primary.kind != Primary::kComputed) return static_cast<uint16_t>(numbers_[primaries_.of(primary)]);
    return static_cast<uint16_t>(pages_[primary.value >> 8].base + (primary.value & 0xFF));
  }

  SortElement element_of(const Draft& drafted) const {
    SortElement element;
    element.char_class = char_class();
    if (drafted.elements.empty()) {
      if (!drafted.special.empty())
        element.sets[0].special = static_cast<uint16_t>(specials_.of(drafted.special) + 1);
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
    sort.size_place = tailoring_.page_place();
    sort.pages = pages_;
    for (unsigned page = 0; page < 256; ++page) {
      if (is_table_[page]) sort.pages[page].kind = SortPageKind::kTable;
    }
    for (const auto& [unit, drafted] : characters_) {
      const SortElement element = element_of(drafted);
      if (!element.ignored()) sort.characters.emplace_hint(sort.characters.end(), unit, element);
    }
    for (const auto& [text, drafted] : contractions_)
      sort.contractions.emplace(std::make_pair(text[0], text[1]), element_of(drafted));
    for (const auto& [reason, texts] : left_out_) {
      std::string line = reason + " (" + std::to_string(texts.size()) + "):";
      for (const Text& text : texts) line += (&text == &texts.front() ? " " : ", ") + code_points_text(text);
      notes_.push_back(line);
    }
    return sort;
  }

  void note(const std::string& reason, const Text& text) { left_out_[reason].push_back(text); }

  const SortTailoring& tailoring_;
  const SortRoot& root_;
  const std::string& file_;
  SortNotes& notes_;
  std::array<bool, 256> is_table_{};
  std::vector<std::pair<char16_t, Draft>> characters_;  ///< in ascending order
  std::map<Text, Draft> contractions_;
  std::map<std::pair<uint32_t, uint32_t>, uint32_t> pairs_;  ///< of primary weights, with their numbers
  Ranks<Primary> primaries_;
  std::vector<unsigned> numbers_;  ///< of `primaries_`
  unsigned next_primary_ = kFirstPrimary;
  std::array<SortPage, 256> pages_{};
  LevelNumbers secondaries_{0}, tertiaries_{common_tertiary()};
  Ranks<Weights> specials_;
  std::map<std::string, std::vector<Text>> left_out_;  ///< by reason
};

}  // namespace

SortSource build_sort(const SortRoot& root, const RuleFile& rules, const FindRules& find, SortNotes& notes) {
  SortTailoring tailoring(root, find);
  tailoring.apply(rules);
  SortSource sort = Builder(tailoring, rules.file_name, notes).run();
  check_sort(sort, rules.file_name);
  return sort;
}

}  // namespace lexicor_data
