#include "sort_tailoring.h"

#include <algorithm>

#include "lexicor/near_names.h"
#include "sort_line.h"

namespace lexicor_data {
namespace {

constexpr const char* kKinds[] = {"space", "punct", "symbol", "currency", "digit"};
constexpr const char* kOthers[] = {"others", "Zzzz"};
/// Scripts that stand with another one.
constexpr std::pair<const char*, const char*> kTogether[] = {
    {"Hira", "Kana"}, {"Hrkt", "Kana"}, {"Jpan", "Kana"}, {"Hans", "Hani"}, {"Hant", "Hani"}, {"Kore", "Hang"}};

constexpr uint32_t kHighestTertiary = 0xFF;
/// Of a text that rules name, so that rules for one another do not grow for ever.
constexpr size_t kMostElements = 31;

bool is_kind(const std::string& name) {
  return std::find(std::begin(kKinds), std::end(kKinds), name) != std::end(kKinds);
}

Strength strength_of(const CollationElement& element) {
  return element.primary != 0     ? Strength::kPrimary
         : element.secondary != 0 ? Strength::kSecondary
         : element.tertiary != 0  ? Strength::kTertiary
                                  : Strength::kIdentical;
}

bool in_ranges(const std::vector<SortRange>& ranges, unsigned code) {
  return std::any_of(ranges.begin(), ranges.end(), [&](SortRange range) { return range.holds(code); });
}

bool same(const CollationElements& a, const CollationElements& b) {
  return std::equal(a.begin(), a.end(), b.begin(), b.end(),
                    [](const CollationElement& x, const CollationElement& y) {
                      return x.primary == y.primary && x.secondary == y.secondary && x.tertiary == y.tertiary;
                    });
}

void append(CollationElements& to, const CollationElements& from) {
  to.insert(to.end(), from.begin(), from.end());
}

std::string named(const std::u16string& text) {
  std::string name = "'" + rule_text(text) + "' (";
  return name + code_points_text(text) + ")";
}

}  // namespace

SortTailoring::SortTailoring(const SortRoot& root, FindRules find)
    : root_(root), find_(std::move(find)), tables_(root.tables), last_variable_(root.last_variable) {
  for (const auto& [text, elements] : root.contractions) {
    if (root.decomposed(text) != text) continue;
    contractions_.emplace(text, Contraction{elements, {}});
    size_t& longest = longest_[text[0]];
    longest = std::max(longest, text.size());
  }
  for (size_t group = 0; group < root.groups.size(); ++group) group_ranks_.push_back(group);
  weight_places_.fill({1, 1});
}

void SortTailoring::fail(SortPlace place, const std::string& what) const {
  throw SourceError(file_, place.line, place.column, what);
}

void SortTailoring::apply(const RuleFile& file) {
  apply_rules(file);
  check_reordered();
}

void SortTailoring::apply_rules(const RuleFile& file) {
  const std::string outer = file_;
  file_ = file.file_name;
  for (const SortRule& rule : read_rules(file.text, file.file_name)) {
    if (files_.empty()) own_place_ = rule.place;
    switch (rule.kind) {
      case SortRule::Kind::kSetting:
        set(rule);
        break;
      case SortRule::Kind::kReset:
        reset(rule);
        break;
      case SortRule::Kind::kRelation:
        relate(rule);
        break;
    }
  }
  file_ = outer;
}

// Settings.

void SortTailoring::set(const SortRule& rule) {
  using Set = void (SortTailoring::*)(const SortRule&);
  const struct {
    const char* name;
    bool has_set;
    Set set;
  } kSettings[] = {
      {"reorder", false, &SortTailoring::set_reorder},
      {"import", false, &SortTailoring::import},
      {"tables", true, &SortTailoring::set_tables},
      {"compose", true, &SortTailoring::set_composed},
      {"separate", true, &SortTailoring::set_separate},
      {"suppressContractions", true, &SortTailoring::suppress},
  };
  const std::string& name = rule.words[0].text;
  for (const auto& setting : kSettings) {
    if (name != setting.name) continue;
    if (rule.has_set != setting.has_set)
      fail(rule.place, setting.has_set ? "expected a set of characters, such as [" + name + " [a-z]]"
                                       : "[" + name + "] has no set of characters");
    if (rule.has_set && rule.words.size() > 1) fail(rule.words[1].place, "expected a set of characters");
    return (this->*setting.set)(rule);
  }
  if (name == "optimize" && rule.has_set) return;
  set_value(rule);
}

void SortTailoring::set_value(const SortRule& rule) {
  const std::string& name = rule.words[0].text;
  if (name == "backwards") {
    backwards_ = value_of(rule, {"2", "off"}) == "2";
  } else if (name == "caseFirst") {
    const std::string value = value_of(rule, {"upper", "lower", "off"});
    case_first_ = value == "upper" ? CaseFirst::kUpper : value == "lower" ? CaseFirst::kLower : CaseFirst::kOff;
  } else if (name == "alternate") {
    shifted_ = value_of(rule, {"shifted", "non-ignorable"}) == "shifted";
  } else if (name == "maxVariable") {
    const std::string value = value_of(rule, {"space", "punct", "symbol", "currency"});
    for (size_t i = 0; i + 1 < root_.groups.size(); ++i) {
      if (root_.groups[i].name == value) last_variable_ = root_.groups[i + 1].first - 1;
    }
  } else if (name == "strength") {
    value_of(rule, {"3"});
  } else if (name == "normalization" || name == "caseLevel" || name == "numericOrdering" ||
             name == "hiraganaQ") {
    value_of(rule, {"off"});
  } else {
    static const std::vector<std::string> names = {
        "alternate",   "backwards", "caseFirst", "compose",  "import",
        "maxVariable", "reorder",   "separate",  "strength", "suppressContractions",
        "tables"};
    fail(rule.place,
         "unknown setting [" + name + "]" + lexicor_cli::did_you_mean(lexicor_cli::nearest_name(name, names)));
  }
}

/// The one value of a setting. What a sort cannot do is not among the values.
std::string SortTailoring::value_of(const SortRule& rule, const std::vector<std::string>& values) const {
  std::string expected;
  for (const std::string& value : values) {
    if (rule.words.size() == 2 && !rule.has_set && rule.words[1].text == value) return value;
    expected += (expected.empty() ? "[" : ", [") + rule.words[0].text + ' ' + value + ']';
  }
  const bool is_valued = rule.words.size() == 2 && !rule.has_set;
  fail(is_valued ? rule.words[1].place : rule.place,
       (is_valued ? "a sort cannot do '" + rule.words[1].text + "', expected " : "expected ") + expected);
}

void SortTailoring::set_reorder(const SortRule& rule) {
  std::vector<size_t> listed;
  std::vector<bool> is_listed(root_.groups.size());
  size_t others_at = std::string::npos;
  for (size_t i = 1; i < rule.words.size(); ++i) {
    const SortWord& word = rule.words[i];
    if (word.text == kOthers[0] || word.text == kOthers[1]) {
      if (others_at != std::string::npos) fail(word.place, word.text + " stands twice");
      others_at = listed.size();
      continue;
    }
    std::string name = word.text;
    for (const auto& [script, with] : kTogether) {
      if (name == script) name = with;
    }
    size_t group = 0;
    while (group < root_.groups.size() && root_.groups[group].name != name) ++group;
    if (group == root_.groups.size()) {
      std::vector<std::string> names;
      for (const SortGroup& known : root_.groups) names.push_back(known.name);
      fail(word.place, "unknown script or group '" + name + "'" +
                           lexicor_cli::did_you_mean(lexicor_cli::nearest_name(name, names)));
    }
    if (is_listed[group]) fail(word.place, name + " stands twice");
    is_listed[group] = true;
    listed.push_back(group);
    if (!is_kind(name)) reordered_[group] = {file_, word.place};
  }
  std::vector<size_t> order;
  auto add_rest = [&](bool kinds) {
    for (size_t group = 0; group < root_.groups.size(); ++group) {
      if (!is_listed[group] && is_kind(root_.groups[group].name) == kinds) order.push_back(group);
    }
  };
  add_rest(true);
  for (size_t i = 0; i <= listed.size(); ++i) {
    if (i == std::min(others_at, listed.size())) add_rest(false);
    if (i < listed.size()) order.push_back(listed[i]);
  }
  for (size_t rank = 0; rank < order.size(); ++rank) group_ranks_[order[rank]] = rank;
}

/// A script without a table stands in code point order behind everything: to reorder it would do nothing.
void SortTailoring::check_reordered() const {
  for (const auto& [group, origin] : reordered_) {
    const uint32_t first = root_.groups[group].first;
    const uint32_t end = group + 1 < root_.groups.size() ? root_.groups[group + 1].first : kFirstIdeograph;
    SortRange found{kCharacters, 0};
    bool has_table = root_.groups[group].name == "Hani";
    for (unsigned code = 0; code < kCharacters && !has_table; ++code) {
      const CollationElements& elements = root_.characters[code];
      if (elements.empty() || elements[0].primary < first || elements[0].primary >= end) continue;
      has_table = tables_[code >> 8];
      found = {std::min(found.first, code), std::max(found.last, code)};
    }
    if (has_table) continue;
    throw SourceError(origin.file, origin.place.line, origin.place.column,
                      root_.groups[group].name + " has no table here, add [tables [\\u" + hex4(found.first) +
                          "-\\u" + hex4(found.last) + "]]");
  }
}

void SortTailoring::set_tables(const SortRule& rule) {
  for (const SortRange& range : rule.characters) {
    for (unsigned code = range.first; code <= range.last; ++code) {
      if (root_.is_computed(code))
        fail(rule.place, lexicor_cli::code_point_name(code) + " has a computed weight and no table");
      completed_.set(code);
      add_table(code >> 8);
    }
  }
}

void SortTailoring::add_table(unsigned page) {
  if (tables_[page]) return;
  tables_.set(page);
  page_place_ = own_place_;
}

void SortTailoring::set_composed(const SortRule& rule) {
  for (const auto& [composed, text] : root_.decompositions) {
    if (text.size() < 2 || !root_.listed[composed] || root_.combining_class[text[0]] != 0) continue;
    const bool named = in_ranges(rule.characters, composed) ||
                       std::any_of(text.begin() + 1, text.end(),
                                   [&](char16_t mark) { return in_ranges(rule.characters, mark); });
    if (!named) continue;
    const CollationElements now = elements(composed);
    pinned_[composed] = now;
    for (const std::u16string& pair : pairs_of(text)) pinned_pairs_[pair] = {now, rule.place};
  }
}

void SortTailoring::set_separate(const SortRule& rule) {
  for (const SortRange& range : rule.characters) {
    for (unsigned code = range.first; code <= range.last; ++code) separate_.set(code);
  }
}

void SortTailoring::suppress(const SortRule& rule) {
  auto is_suppressed = [&](const std::u16string& text) { return in_ranges(rule.characters, text[0]); };
  for (auto entry = contractions_.begin(); entry != contractions_.end();) {
    const bool dropped = is_suppressed(entry->first);
    if (dropped) changed_.set(entry->first[0]);
    entry = dropped ? contractions_.erase(entry) : std::next(entry);
  }
  // What [compose] has made goes with the pair of two characters that it begins with.
  std::set<std::u16string> begins;
  for (const auto& entry : pinned_pairs_) {
    if (is_suppressed(entry.first)) begins.insert(entry.first);
  }
  auto goes = [&](const std::u16string& text) {
    return begins.count(root_.decomposed(text).substr(0, 2)) != 0;
  };
  for (auto entry = pinned_.begin(); entry != pinned_.end();)
    entry = goes({entry->first}) ? pinned_.erase(entry) : std::next(entry);
  for (auto entry = pinned_pairs_.begin(); entry != pinned_pairs_.end();)
    entry = goes(entry->first) ? pinned_pairs_.erase(entry) : std::next(entry);
}

void SortTailoring::import(const SortRule& rule) {
  if (rule.words.size() != 2)
    fail(rule.place, "expected the name of a file of rules, such as [import Swedish]");
  const SortWord& name = rule.words[1];
  if (std::find(files_.begin(), files_.end(), name.text) != files_.end())
    fail(name.place, "a cycle of imports: " + name.text + " is being read already");
  const RuleFile file = find_(name.text);
  if (file.file_name.empty()) fail(name.place, "there are no rules " + name.text);
  files_.push_back(name.text);
  apply_rules(file);
  files_.pop_back();
}

// Resets and relations.

void SortTailoring::reset(const SortRule& rule) {
  before_ = rule.strength;
  is_several_ = false;
  if (!rule.words.empty()) {
    place_ = special_place(rule);
    return;
  }
  check_known(rule, rule.text, false);
  place_ = elements(rule.text);
  const std::u16string text = root_.decomposed(rule.text);
  is_several_ = text.size() > 1 && root_.compositions(text).empty() && contractions_.count(text) == 0;
}

/// Whether elements end in those of the letters of a syllable.
bool SortTailoring::is_syllable(const CollationElements& elements_of_text) const {
  for (size_t letters = 2; letters <= std::min<size_t>(3, elements_of_text.size()); ++letters) {
    uint32_t primaries[3];
    for (size_t i = 0; i < letters; ++i)
      primaries[i] = (elements_of_text.end() - static_cast<std::ptrdiff_t>(letters - i))->primary;
    if (root_.syllable(primaries, letters) != 0) return true;
  }
  return false;
}

CollationElements SortTailoring::special_place(const SortRule& rule) const {
  std::string name;
  for (const SortWord& word : rule.words) name += (name.empty() ? "" : " ") + word.text;
  const bool last = rule.words[0].text == "last";
  auto letter = [](uint32_t primary) {
    return CollationElements{{primary, kCommonSecondary, kCommonTertiary, LetterCase::kLower}};
  };
  auto ignorable = [&](bool secondary) {
    CollationElements place;
    for (const SortRoot::Use& use : root_.ignorables()) {
      if ((use.secondary != 0) != secondary || use.tertiary == 0 || (!last && !place.empty())) continue;
      place = {{0, use.secondary, use.tertiary, LetterCase::kLower}};
    }
    return place;
  };
  if (name == "first tertiary ignorable" || name == "last tertiary ignorable") return {};
  if (name == "first secondary ignorable" || name == "last secondary ignorable") return ignorable(false);
  if (name == "first primary ignorable" || name == "last primary ignorable") return ignorable(true);
  if (name == "first variable") return letter(1);
  if (name == "last variable") return letter(root_.last_variable);
  if (name == "first regular") return letter(root_.last_variable + 1);
  if (name == "last regular" || name == "top") return letter(root_.last_primary());
  fail(rule.place, "unknown place [" + name +
                       "], expected [first ...] or [last ...] of: tertiary ignorable, secondary ignorable, "
                       "primary ignorable, variable, regular");
}

void SortTailoring::check_known(const SortRule& rule, const std::u16string& text, bool tailored) const {
  for (const char16_t unit : text) {
    const bool computed = root_.is_computed(unit);
    const bool weighed = root_.is_ideograph(unit) || root_.decomposition(unit).size() > 1;
    if (tailored && computed)
      fail(rule.place,
           lexicor_cli::code_point_name(unit) + " has a computed weight, which rules cannot change");
    if (computed ? !weighed : !root_.listed[unit])
      fail(rule.place,
           lexicor_cli::code_point_name(unit) + (computed ? " has a computed weight, which is no place"
                                                          : " is a character that the root does not have"));
  }
}

void SortTailoring::relate(const SortRule& rule) {
  if (!rule.before.empty())
    fail(rule.place, "a sort has no weights that depend on the character before, as in 'a|b'");
  if (rule.strength == Strength::kQuaternary)
    fail(rule.place, "a sort has no level for '<<<<', expected <, <<, <<< or =");
  check_known(rule, rule.text, true);
  check_known(rule, rule.extension, false);
  const std::u16string text = root_.decomposed(rule.text);
  if (text.size() > 2 && root_.compositions(text).empty() && pairs_of(text).empty())
    fail(rule.place, named(rule.text) + " has " + std::to_string(rule.text.size()) +
                         " characters, a contraction has two at most");
  if (before_ != Strength::kNone && rule.strength != before_)
    fail(rule.place, "expected " + std::string(static_cast<size_t>(before_), '<') + " behind [before " +
                         std::to_string(static_cast<int>(before_)) + "]");
  if (rule.strength != Strength::kIdentical) {
    insert(rule);
    set_case(text, place_);
  }
  before_ = Strength::kNone;
  CollationElements elements_of_text = place_;
  if (!rule.extension.empty()) append(elements_of_text, elements(rule.extension));
  if (elements_of_text.size() > kMostElements)
    fail(rule.place, named(rule.text) + " has " + std::to_string(elements_of_text.size()) +
                         " elements, more than " + std::to_string(kMostElements));
  map(rule, text, std::move(elements_of_text));
}

/// A weight behind, or ahead of, that of the last element which has one on the relation's level.
void SortTailoring::insert(const SortRule& rule) {
  while (!place_.empty() && strength_of(place_.back()) > rule.strength) place_.pop_back();
  if (place_.empty()) place_.emplace_back();
  CollationElement& last = place_.back();
  const bool ahead = before_ != Strength::kNone;
  auto next_to = [&](WeightOrder::Level level, uint32_t weight, uint32_t below) {
    WeightOrder::Context context{level, 0, 0, false};
    if (level >= WeightOrder::kSecondary) context.primary = last.primary;
    if (level == WeightOrder::kTertiary) context.secondary = last.secondary;
    if (level == WeightOrder::kPrimary && ahead)
      context.next_group = root_.group_of(below) != root_.group_of(weight);
    return ahead ? order_.insert_before(context, weight, below) : order_.insert_after(context, weight);
  };
  const bool ignored = strength_of(last) > Strength::kSecondary;
  if (is_syllable(place_))
    fail(rule.place,
         "nothing stands next to a syllable of Hangul, whose weight is computed, but what equals it");
  if (ahead && last.primary == 0 && place_.size() > 1 && is_several_)
    fail(rule.place,
         "nothing stands ahead of a letter and an accent that are no character by an accent or by case");
  if (ahead && rule.strength != Strength::kPrimary && order_.anchor(last.primary) >= kFirstIdeograph)
    fail(rule.place,
         "nothing stands ahead of an ideograph by an accent or by case, since its weight is computed");
  if (rule.strength == Strength::kPrimary) {
    if (last.primary == 0) fail(rule.place, "a letter cannot stand next to what is ignored on the first level");
    if (order_.anchor(last.primary) >= kFirstIdeograph)
      fail(rule.place, "a letter cannot stand among ideographs, whose weights are computed");
    last = {
        next_to(WeightOrder::kPrimary, last.primary, last.primary - 1), kCommonSecondary, kCommonTertiary, {}};
  } else if (rule.strength == Strength::kSecondary) {
    if (ignored) fail(rule.place, "an accent cannot stand next to what is ignored on the second level");
    const uint32_t below = root_.secondary_before(last.primary, last.secondary);
    last.secondary = next_to(WeightOrder::kSecondary, last.secondary, below);
    last.tertiary = kCommonTertiary;
  } else {
    // A weight that stands alone counts more than any behind a letter or an accent.
    if (strength_of(last) == Strength::kIdentical) last.tertiary = kHighestTertiary;
    const uint32_t below = root_.tertiary_before(last.primary, last.secondary, last.tertiary);
    last.tertiary = next_to(WeightOrder::kTertiary, last.tertiary, below);
  }
  weight_places_[static_cast<size_t>(rule.strength)] = own_place_;
  if (order_.full()) fail(rule.place, "there are too many weights behind one of the root");
}

/// Elements of a tailored text have the case of its characters in the root: those of the letters at its end that
/// have no element of their own make the last one mixed if they differ.
void SortTailoring::set_case(const std::u16string& text, CollationElements& elements_of_text) const {
  size_t letters = 0;
  for (const CollationElement& element : elements_of_text) letters += element.primary != 0;
  std::vector<LetterCase> cases;
  for (const CollationElement& element : walk(text, false)) {
    if (element.primary == 0 || letters == 0) continue;
    if (cases.size() < letters)
      cases.push_back(element.letter_case);
    else if (element.letter_case != cases.back())
      cases.back() = LetterCase::kMixed;
  }
  size_t next = 0;
  for (CollationElement& element : elements_of_text) {
    element.letter_case = LetterCase::kLower;
    if (element.primary == 0) continue;
    if (next < cases.size()) element.letter_case = cases[next];
    ++next;
  }
}

void SortTailoring::map(const SortRule& rule, const std::u16string& text, CollationElements elements_of_text) {
  for (const char16_t unit : rule.text) add_table(unit >> 8u);
  for (const char16_t composed : root_.compositions(text)) pinned_.erase(composed);
  changed_.set(text[0]);
  if (text.size() == 1) {
    characters_[text[0]] = std::move(elements_of_text);
    return;
  }
  for (const std::u16string& pair : pairs_of(text)) pinned_pairs_.erase(pair);
  if (rule.text.size() == 2) written_[rule.text] = {file_, rule.place};
  contractions_[text] = {std::move(elements_of_text), rule.place};
  size_t& longest = longest_[text[0]];
  longest = std::max(longest, text.size());
}

// Elements.

CollationElements SortTailoring::single(char16_t unit, bool tailored) const {
  if (tailored && changed_[unit]) {
    const auto found = characters_.find(unit);
    if (found != characters_.end()) return found->second;
  }
  if (root_.is_ideograph(unit)) return {{kFirstIdeograph + unit, kCommonSecondary, kCommonTertiary, {}}};
  return root_.characters[unit];
}

const CollationElements* SortTailoring::contraction(const std::u16string& text, bool tailored) const {
  if (tailored) {
    const auto found = contractions_.find(text);
    return found == contractions_.end() ? nullptr : &found->second.elements;
  }
  const auto found = root_.contractions.find(text);
  return found == root_.contractions.end() ? nullptr : &found->second;
}

/// The length of the longest contraction at a place of a text, or 1.
size_t SortTailoring::match(const std::u16string& text, size_t at, bool tailored) const {
  const auto longest = longest_.find(text[at]);
  if (longest == longest_.end()) return 1;
  for (size_t length = std::min(longest->second, text.size() - at); length > 1; --length) {
    if (contraction(text.substr(at, length), tailored) != nullptr) return length;
  }
  return 1;
}

/// The elements of a decomposed text. A contraction takes in marks that stand behind others, as long as these do
/// not block them.
CollationElements SortTailoring::walk(std::u16string text, bool tailored) const {
  CollationElements out;
  for (size_t at = 0; at < text.size();) {
    std::u16string head = text.substr(at, match(text, at, tailored));
    at += head.size();
    uint8_t skipped = 0;
    for (size_t mark = at; longest_.count(head[0]) != 0 && mark < text.size();) {
      const uint8_t number = root_.combining_class[text[mark]];
      if (number == 0) break;
      if (number > skipped && contraction(head + text[mark], tailored) != nullptr) {
        head += text[mark];
        text.erase(mark, 1);
        continue;
      }
      skipped = number;
      ++mark;
    }
    append(out, head.size() == 1 ? single(head[0], tailored) : *contraction(head, tailored));
  }
  return out;
}

CollationElements SortTailoring::elements(const std::u16string& text) const {
  return walk(root_.decomposed(text), true);
}

CollationElements SortTailoring::elements(char16_t unit) const {
  const auto pinned = pinned_.find(unit);
  if (pinned != pinned_.end()) return pinned->second;
  if (changed_.none()) return root_.characters[unit];
  if (!root_.decomposes(unit)) return single(unit, changed_[unit]);
  const std::u16string text = root_.decomposition(unit);
  const bool changed = std::any_of(text.begin(), text.end(), [&](char16_t part) { return changed_[part]; });
  return changed ? walk(text, true) : root_.characters[unit];
}

CollationElements SortTailoring::contraction_elements(const std::u16string& pair) const {
  const auto pinned = pinned_pairs_.find(pair);
  return pinned != pinned_pairs_.end() ? pinned->second.elements : elements(pair);
}

/// The texts of two characters that decompose to a text of two or more.
std::vector<std::u16string> SortTailoring::pairs_of(const std::u16string& text) const {
  std::set<std::u16string> pairs;
  auto add = [&](char16_t first, const std::u16string& rest) {
    for (const char16_t second : root_.compositions(rest)) {
      std::u16string pair{first, second};
      if (root_.decomposed(pair) == text) pairs.insert(std::move(pair));
    }
  };
  if (text.size() < 2) return {};
  for (const char16_t first : root_.compositions(text.substr(0, 1))) add(first, text.substr(1));
  for (const char16_t first : root_.compositions_from(text[0])) {
    std::u16string rest = text;
    bool part = true;
    for (const char16_t unit : root_.decomposition(first)) {
      const size_t at = rest.find(unit);
      part = part && at != std::u16string::npos;
      if (part) rest.erase(at, 1);
    }
    if (part && !rest.empty()) add(first, rest);
  }
  return {pairs.begin(), pairs.end()};
}

/// A contraction also holds where its last character is composed with a mark, or its last letter with one that
/// stands ahead of the contraction's.
void SortTailoring::add_tails(const std::u16string& text, SortPlace place,
                              std::map<std::u16string, SortPlace>& pairs) const {
  if (text.size() != 2) return;
  auto add = [&](const std::u16string& pair) {
    const std::u16string first = root_.decomposition(pair[0]), second = root_.decomposition(pair[1]);
    // Texts whose marks are out of order are left to who normalizes.
    const uint8_t begin = root_.combining_class[second[0]];
    if (begin != 0 && root_.combining_class[first.back()] > begin) return;
    CollationElements apart = elements(pair[0]);
    append(apart, elements(pair[1]));
    if (!same(elements(pair), apart)) pairs.emplace(pair, place);
  };
  for (const size_t at : {size_t{0}, size_t{1}}) {
    if (at == 0 && root_.combining_class[text[1]] == 0) continue;
    for (const char16_t composed : root_.compositions_from(text[at])) {
      std::u16string pair = text;
      pair[at] = composed;
      for (const std::u16string& equal : pairs_of(root_.decomposed(pair))) add(equal);
    }
  }
}

std::map<std::u16string, SortPlace> SortTailoring::contractions() const {
  std::map<std::u16string, SortPlace> pairs;
  for (const auto& [text, entry] : contractions_) {
    if (entry.place.line == 0 && !completed_[text[0]]) continue;
    for (std::u16string& pair : pairs_of(text)) pairs.emplace(std::move(pair), entry.place);
    add_tails(text, entry.place, pairs);
  }
  for (const auto& [pair, entry] : pinned_pairs_) pairs.emplace(pair, SortPlace{});
  return pairs;
}

const RulePlace* SortTailoring::written(const std::u16string& pair) const {
  const auto found = written_.find(pair);
  return found == written_.end() ? nullptr : &found->second;
}

std::vector<std::u16string> SortTailoring::long_contractions() const {
  std::vector<std::u16string> list;
  for (const auto& [text, entry] : contractions_) {
    const bool held = entry.place.line != 0 || completed_[text[0]];
    if (held && pairs_of(text).empty()) list.push_back(text);
  }
  return list;
}

bool SortTailoring::is_variable(uint32_t primary) const {
  return shifted_ && primary != 0 && WeightOrder::in_group_of(order_.number(primary)) <= last_variable_;
}

}  // namespace lexicor_data
