// Characters and contractions are brought into the order of each sort. What a longest run of them in both orders does
// not hold has moved: it is shown behind what it follows in the second sort. Characters with two elements are shown
// by the letters that they count as.
#include "sort_explain.h"

#include <algorithm>
#include <array>
#include <map>
#include <ostream>
#include <tuple>
#include <vector>

#include "sort_line.h"
#include "sort_rules.h"

namespace lexicor_data {
namespace {

using Text = std::u16string;

constexpr size_t kLongestRun = 12;  ///< that is shown whole

SortElement element_of(const SortSource& sort, const Text& text) {
  if (text.size() == 2) {
    const auto pair = sort.contractions.find({text[0], text[1]});
    return pair == sort.contractions.end() ? SortElement{} : pair->second;
  }
  const auto found = sort.characters.find(text[0]);
  if (found != sort.characters.end()) return found->second;
  SortElement element;
  const SortPage& page = sort.pages[text[0] >> 8];
  const auto weight = static_cast<uint16_t>(page.base + (text[0] & 0xFF));
  if (page.kind == SortPageKind::kPrimary) element.sets[0].primary = weight;
  if (page.kind == SortPageKind::kSpecial) element.sets[0].special = weight;
  return element;
}

/// The level on which two single elements differ.
Strength difference(const SortSet& a, const SortSet& b) {
  if (a.special != b.special || a.primary != b.primary) return Strength::kPrimary;
  if (a.secondary != b.secondary) return Strength::kSecondary;
  return a.tertiary != b.tertiary ? Strength::kTertiary : Strength::kIdentical;
}

auto key_of(const SortSet& set) {
  return std::make_tuple(set.special == 0 && set.primary != 0, set.special, set.primary, set.secondary,
                         set.tertiary);
}

/// One of the sorts: its single elements in order, and the letters that stand for primary weights.
class Order {
 public:
  /// `levels`: which of them order.
  Order(const SortSource& sort, const std::vector<Text>& texts, Strength levels)
      : sort_(sort), levels_(levels) {
    for (const Text& text : texts) {
      const SortElement element = element_of(sort, text);
      if (element.count == 1 && !element.ignored()) list_.push_back(text);
    }
    std::sort(list_.begin(), list_.end(), [&](const Text& a, const Text& b) {
      const auto x = key_of(seen(set_of(a))), y = key_of(seen(set_of(b)));
      return x != y ? x < y : std::make_pair(a.size(), a) < std::make_pair(b.size(), b);
    });
    for (size_t i = 0; i < list_.size(); ++i) {
      ranks_[list_[i]] = i;
      letters_.emplace(set_of(list_[i]).primary, list_[i]);
    }
  }

  const std::vector<Text>& list() const { return list_; }
  bool holds(const Text& text) const { return ranks_.count(text) != 0; }
  size_t rank(const Text& text) const { return ranks_.at(text); }
  SortElement element(const Text& text) const { return element_of(sort_, text); }
  SortSet set_of(const Text& text) const { return element(text).sets[0]; }

  /// The level on which texts differ, among those that order.
  Strength between(const Text& a, const Text& b) const { return difference(seen(set_of(a)), seen(set_of(b))); }

  /// The first text with the weights of a text, as far as a relation of this strength sees them.
  Text place_of(const Text& text, Strength strength) const {
    size_t at = rank(text);
    while (at > 0 && difference(set_of(list_[at - 1]), set_of(text)) > strength) --at;
    return list_[at];
  }

  /// The letters whose primary weights two elements have, and how the elements differ from them.
  std::pair<Text, Strength> expansion(const SortElement& element) const {
    Text text;
    Strength strength = Strength::kIdentical;
    for (const SortSet& set : element.sets) {
      const auto letter = letters_.find(set.primary);
      if (set.primary == 0 || letter == letters_.end()) {
        text += set.primary == 0 ? Text(1, u'\u25CC') : Text();
        strength = std::min(strength, Strength::kSecondary);
        continue;
      }
      text += letter->second;
      strength = std::min(strength, difference(set_of(letter->second), set));
    }
    return {text, strength};
  }

 private:
  SortSet seen(SortSet set) const {
    if (levels_ < Strength::kTertiary) set.tertiary = 0;
    return set;
  }

  const SortSource& sort_;
  const Strength levels_;
  std::vector<Text> list_;
  std::map<Text, size_t> ranks_;
  std::map<uint16_t, Text> letters_;
};

/// A longest ascending sequence of numbers: its places.
std::vector<size_t> longest_ascent(const std::vector<size_t>& numbers) {
  std::vector<size_t> ends, before(numbers.size());
  for (size_t i = 0; i < numbers.size(); ++i) {
    const auto end = std::upper_bound(ends.begin(), ends.end(), numbers[i],
                                      [&](size_t number, size_t place) { return number < numbers[place]; });
    before[i] = end == ends.begin() ? i : *(end - 1);
    if (end == ends.end())
      ends.push_back(i);
    else
      *end = i;
  }
  std::vector<size_t> places(ends.size());
  for (size_t i = ends.size(), place = ends.empty() ? 0 : ends.back(); i-- > 0; place = before[place])
    places[i] = place;
  return places;
}

class Explainer {
 public:
  Explainer(const SortSource& from, const SortSource& to, Strength levels, const SortRoot* root)
      : root_(root), texts_(texts_of(from, to)), from_(from, texts_, levels), to_(to, texts_, levels) {}

  void write(std::ostream& out) {
    find_moved();
    write_moved();
    write_expansions();
    write_ignored();
    flush(out);
  }

 private:
  static std::vector<Text> texts_of(const SortSource& from, const SortSource& to) {
    std::vector<Text> texts;
    for (const SortSource* sort : {&from, &to}) {
      for (const auto& entry : sort->characters) texts.emplace_back(1, entry.first);
      for (const auto& entry : sort->contractions) texts.push_back({entry.first.first, entry.first.second});
    }
    std::sort(texts.begin(), texts.end());
    texts.erase(std::unique(texts.begin(), texts.end()), texts.end());
    return texts;
  }

  void find_moved() {
    std::vector<size_t> places, ranks;
    const std::vector<Text>& list = to_.list();
    for (size_t i = 0; i < list.size(); ++i) {
      if (!from_.holds(list[i])) continue;
      places.push_back(i);
      ranks.push_back(from_.rank(list[i]));
    }
    moved_.assign(list.size(), true);
    for (size_t place : longest_ascent(ranks)) moved_[places[place]] = false;
  }

  /// Relations of what has moved, and of what differs on another level from what it followed before.
  void write_moved() {
    const std::vector<Text>& list = to_.list();
    const Text* stayed = nullptr;
    for (size_t i = 0; i < list.size(); ++i) {
      bool differs = moved_[i];
      if (!differs && stayed != nullptr)
        differs = to_.between(*stayed, list[i]) != from_.between(*stayed, list[i]);
      if (!moved_[i]) stayed = &list[i];
      if (!differs) continue;
      if (!follows(list[i]))
        relate(i);
      else if (last_ + 1 == i)
        last_ = i;  // the chain goes on behind it
    }
  }

  /// Whether a relation of the text follows from that of another one: it is made of the same letter and marks, or of
  /// these and further marks.
  bool follows(const Text& text) {
    if (root_ == nullptr) return false;
    const Text whole = root_->decomposed(text);
    std::vector<Text>& shown = shown_[whole[0]];
    const bool part_shown = std::any_of(shown.begin(), shown.end(), [&](const Text& part) {
      size_t found = 0;
      for (const char16_t unit : whole) found += found < part.size() && unit == part[found];
      return found == part.size();
    });
    if (!part_shown) shown.push_back(whole);
    return part_shown;
  }

  void relate(size_t i) {
    const std::vector<Text>& list = to_.list();
    Text before = i > 0 ? list[i - 1] : Text();
    const bool goes_on = i > 0 && last_ + 1 == i;
    if (goes_on) before = rules_.back().text;
    const Strength strength =
        before.empty() ? Strength::kPrimary : difference(to_.set_of(before), to_.set_of(list[i]));
    if (before.empty())
      start_special("first regular");
    else if (!goes_on)
      start(to_.place_of(before, strength));
    add_relation(list[i], strength);
    last_ = i;
  }

  void add_relation(const Text& text, Strength strength) {
    SortRule relation;
    relation.kind = SortRule::Kind::kRelation;
    relation.text = text;
    relation.strength = strength;
    rules_.push_back(relation);
  }

  void start(const Text& text) {
    SortRule reset;
    reset.kind = SortRule::Kind::kReset;
    reset.text = text;
    rules_.push_back(reset);
  }
  void start_special(const char* place) {
    start({});
    rules_.back().words = {{place, {}}};
  }

  /// Characters with two elements, those of the same letters in their order.
  void write_expansions() {
    struct Expansion {
      Text letters;
      std::array<SortSet, 2> sets;
      Text text;
      Strength strength;
      auto key() const {
        return std::make_tuple(letters, sets[0].secondary, sets[1].secondary, sets[0].tertiary,
                               sets[1].tertiary, text);
      }
    };
    std::vector<Expansion> expansions;
    for (const Text& text : texts_) {
      const SortElement now = to_.element(text), then = from_.element(text);
      if (now.count != 2 || follows(text)) continue;
      const auto [letters, strength] = to_.expansion(now);
      if (then.count != 2 || from_.expansion(then) != std::make_pair(letters, strength))
        expansions.push_back({letters, now.sets, text, strength});
    }
    std::sort(expansions.begin(), expansions.end(),
              [](const Expansion& a, const Expansion& b) { return a.key() < b.key(); });
    for (size_t i = 0; i < expansions.size(); ++i) {
      const Expansion& now = expansions[i];
      if (i == 0 || expansions[i - 1].letters != now.letters) {
        start(now.letters);
        add_relation(now.text, now.strength);
        continue;
      }
      const auto& before = expansions[i - 1].sets;
      add_relation(now.text, std::min(difference(before[0], now.sets[0]), difference(before[1], now.sets[1])));
    }
  }

  /// What has weights in the first sort only; a contraction that is none is two characters again.
  void write_ignored() {
    SortRule suppressed;
    suppressed.words = {{"suppressContractions", {}}};
    suppressed.has_set = true;
    for (const Text& text : texts_) {
      if (!to_.element(text).ignored() || from_.element(text).ignored()) continue;
      if (text.size() == 2) {
        const unsigned first = text[0];
        if (root_ != nullptr && root_->decomposed(text) != text) continue;  // goes with another one
        if (suppressed.characters.empty() || suppressed.characters.back().first != first)
          suppressed.characters.push_back({first, first});
        continue;
      }
      start_special("last tertiary ignorable");
      add_relation(text, Strength::kIdentical);
    }
    if (!suppressed.characters.empty()) rules_.insert(rules_.begin(), suppressed);
  }

  /// Long runs are shown by their ends.
  void flush(std::ostream& out) const {
    for (size_t i = 0; i < rules_.size();) {
      size_t end = i + 1;
      while (end < rules_.size() && rules_[end].kind == SortRule::Kind::kRelation) ++end;
      std::vector<SortRule> chain(rules_.begin() + static_cast<std::ptrdiff_t>(i),
                                  rules_.begin() + static_cast<std::ptrdiff_t>(end));
      if (chain.size() > kLongestRun + 1) {
        const SortRule& last = chain.back();
        out << "# " << chain.size() - 1 << " relations, from " << rule_text(chain[1].text) << " to "
            << rule_text(last.text) << ", the first ones:\n";
        chain.resize(kLongestRun / 2 + 1);
      }
      write_rules(out, chain);
      i = end;
    }
  }

  const SortRoot* const root_;
  std::map<char16_t, std::vector<Text>> shown_;  ///< decomposed, by first character
  const std::vector<Text> texts_;
  const Order from_, to_;
  std::vector<bool> moved_;
  std::vector<SortRule> rules_;
  size_t last_ = SIZE_MAX - 1;  ///< the place of the last relation, or of what follows from it behind it
};

bool inserts_secondaries(const SortSource& sort) {
  return std::any_of(sort.characters.begin(), sort.characters.end(),
                     [](const auto& entry) { return (entry.second.char_class & LX_APPEND_SECONDARY) == 0; });
}

/// Whether capitals come first.
bool capitals_first(const SortSource& sort) {
  return difference(element_of(sort, u"a").sets[0], element_of(sort, u"A").sets[0]) == Strength::kTertiary &&
         key_of(element_of(sort, u"A").sets[0]) < key_of(element_of(sort, u"a").sets[0]);
}

}  // namespace

void explain_sorts(std::ostream& out, const SortSource& from, const SortSource& to, const SortRoot* root) {
  if (inserts_secondaries(from) != inserts_secondaries(to))
    out << (inserts_secondaries(to) ? "[backwards 2]\n" : "[backwards off]\n");
  const bool same_case = capitals_first(from) == capitals_first(to);
  if (!same_case) out << (capitals_first(to) ? "[caseFirst upper]\n" : "[caseFirst off]\n");
  // With another case first every letter differs on the third level.
  Explainer(from, to, same_case ? Strength::kTertiary : Strength::kSecondary, root).write(out);
}

}  // namespace lexicor_data
