// Reader and writer of the root of sorts, and what follows from it.
#include "sort_root.h"

#include <algorithm>
#include <istream>
#include <ostream>
#include <tuple>

#include "sort_line.h"

namespace lexicor_data {
namespace {

// Implicit weights of the algorithm: two elements, the second one with the low bits of the code point.
constexpr unsigned kUnified = 0xFB40, kUnifiedExtension = 0xFB80, kUnassigned = 0xFBC0, kImplicitEnd = 0xFC00;
constexpr unsigned kImplicitBits = 15, kImplicitMark = 0x8000;

// Hangul syllables: leading, middle and trailing letters by the formula of Unicode.
constexpr unsigned kFirstSyllable = 0xAC00, kSyllableCount = 11172;
constexpr unsigned kJamos[3] = {0x1100, 0x1161, 0x11A7}, kJamoCounts[3] = {19, 21, 28};

constexpr uint32_t kNone = 0;

class RootReader {
 public:
  RootReader(std::istream& in, const std::string& file) : in_(in), file_(file) {}

  SortRoot read() {
    read_sort_lines(
        in_, file_, &line_, [&](SortLine& line) { read_directive(line); },
        [&](SortLine& line) { read_elements(line); });
    if (root_.groups.empty()) throw SourceError(file_, line_, 0, "there is no @group");
    for (uint32_t primary = 1; primary < seen_.size(); ++primary) {
      if (!seen_[primary])
        throw SourceError(file_, line_, 0, "primary weight " + hex4(primary) + " is left out");
    }
    root_.settle();
    return std::move(root_);
  }

 private:
  void read_directive(SortLine& line) {
    const SortPlace start{line_, line.here().column - 1};
    const std::string name = line.word();
    const std::pair<const char*, std::vector<SortRange>*> lists[] = {{"ideographs", &root_.ideographs},
                                                                     {"syllables", &root_.syllables},
                                                                     {"computed", &root_.computed},
                                                                     {"uncovered", &root_.uncovered}};
    for (const auto& [list, ranges] : lists) {
      if (name != list) continue;
      while (!line.done()) ranges->push_back(range(line));
      return;
    }
    if (name == "tables") {
      while (!line.done()) {
        const SortRange pages = range(line);
        for (unsigned page = pages.first >> 8; page <= pages.last >> 8; ++page) root_.tables.set(page);
      }
    } else if (name == "upper") {
      while (!line.done()) root_.upper_tertiaries.set(line.number(0xFF, "a tertiary weight"));
    } else if (name == "group") {
      read_group(line);
    } else if (name == "combining") {
      const SortRange marks = range(line);
      line.expect(";");
      const unsigned number = line.number(0xFF, "a combining class");
      for (unsigned code = marks.first; code <= marks.last; ++code)
        root_.combining_class[code] = static_cast<uint8_t>(number);
    } else if (name == "canonical") {
      const char16_t composed = line.character();
      line.expect(";");
      std::u16string& text = root_.decompositions[composed];
      do text += line.character();
      while (!line.done());
    } else {
      line.fail(start, "unknown directive @" + name);
    }
    line.expect_end();
  }

  static SortRange range(SortLine& line) {
    const SortLine::Range range = line.range();
    return {range.first, range.last};
  }

  void read_group(SortLine& line) {
    SortGroup group;
    group.name = line.word();
    if (group.name.empty()) line.fail_expected("the name of a group");
    const SortPlace place = line.here();
    group.first = line.number(0xFFFF, "a primary weight");
    if (!root_.groups.empty() && group.first <= root_.groups.back().first)
      line.fail(place, "groups stand in the order of their weights");
    root_.groups.push_back(std::move(group));
  }

  void read_elements(SortLine& line) {
    const SortPlace start = line.here();
    std::u16string text;
    do text += line.character();
    while (line.peek() != ';' && hex_value(line.peek()) >= 0);
    line.expect(";");
    CollationElements elements;
    do read_element(line, elements);
    while (!line.done());
    if (elements.size() == 1 && elements[0].primary == 0 && elements[0].secondary == 0 &&
        elements[0].tertiary == 0)
      elements.clear();
    const bool again = text.size() == 1 ? root_.listed[text[0]] : root_.contractions.count(text) != 0;
    if (again) line.fail(start, code_points_text(text) + " stands on an earlier line already");
    if (text.size() > 1) {
      root_.contractions.emplace(std::move(text), std::move(elements));
      return;
    }
    root_.listed.set(text[0]);
    root_.characters[text[0]] = std::move(elements);
  }

  /// [.0000.0000.0000] or [*0000.0000.0000]; the second part of an ideograph joins the first one.
  void read_element(SortLine& line, CollationElements& elements) {
    const SortPlace start = line.here();
    CollationElement element;
    line.expect("[");
    const bool variable = line.take("*");
    if (!variable) line.expect(".");
    element.primary = line.number(0xFFFF, "a primary weight");
    line.expect(".");
    element.secondary = line.number(0xFFFF, "a secondary weight");
    line.expect(".");
    element.tertiary = line.number(0xFF, "a tertiary weight");
    line.expect("]");
    const bool open =
        !elements.empty() && elements.back().primary >= kUnified && elements.back().primary < kImplicitEnd;
    if (open) {
      if ((element.primary & kImplicitMark) == 0 || element.secondary != 0 || element.tertiary != 0)
        line.fail(start, "expected the second element of an ideograph, such as [.CE00.0000.0000]");
      const unsigned high = elements.back().primary;
      const unsigned base = high < kUnifiedExtension ? kUnified
                            : high < kUnassigned     ? kUnifiedExtension
                                                     : kUnassigned;
      elements.back().primary = (base == kUnassigned ? kFirstBehind : kFirstIdeograph) +
                                ((high - base) << kImplicitBits | (element.primary & 0x7FFF));
      return;
    }
    if (element.primary < kUnified) {
      if (seen_.size() <= element.primary) seen_.resize(element.primary + 1);
      seen_[element.primary] = true;
    } else if (element.primary >= kImplicitEnd) {
      line.fail(start, "a primary weight is above FBFF");
    }
    if (variable) root_.last_variable = std::max(root_.last_variable, element.primary);
    if (root_.upper_tertiaries[element.tertiary]) element.letter_case = LetterCase::kUpper;
    elements.push_back(element);
  }

  std::istream& in_;
  const std::string& file_;
  int line_ = 0;
  SortRoot root_;
  std::vector<bool> seen_;  ///< primary weights
};

void write_ranges(std::ostream& out, const char* directive, const std::vector<SortRange>& ranges) {
  out << '@' << directive;
  for (const SortRange& range : ranges) out << ' ' << range_text(range.first, range.last);
  out << '\n';
}

/// Runs of equal values, those of 0 left out.
template <class Value>
void for_each_run(unsigned count, Value value, void (*write)(std::ostream&, SortRange, unsigned),
                  std::ostream& out) {
  for (unsigned first = 0, end = 0; first < count; first = end) {
    for (end = first + 1; end < count && value(end) == value(first); ++end) {
    }
    if (value(first) != 0) write(out, {first, end - 1}, value(first));
  }
}

std::string element_text(const CollationElement& element, bool variable) {
  auto part = [](char mark, unsigned primary, unsigned secondary, unsigned tertiary) {
    return std::string("[") + mark + hex4(primary) + '.' + hex4(secondary) + '.' + hex4(tertiary) + ']';
  };
  if (element.primary < kFirstIdeograph)
    return part(variable ? '*' : '.', element.primary, element.secondary, element.tertiary);
  const bool behind = element.primary >= kFirstBehind;
  const unsigned code = element.primary - (behind ? kFirstBehind : kFirstIdeograph);
  const bool in_first_block = code >= 0x4E00 && code < kCharacters;
  const unsigned base = behind ? kUnassigned : in_first_block ? kUnified : kUnifiedExtension;
  return part('.', base + (code >> kImplicitBits), element.secondary, element.tertiary) +
         part('.', kImplicitMark | (code & 0x7FFF), 0, 0);
}

struct RootLine {
  std::u16string text;
  const CollationElements* elements;
  bool operator<(const RootLine& other) const {
    auto key = [](const CollationElement& e) { return std::tie(e.primary, e.secondary, e.tertiary); };
    const auto less = [&](const CollationElement& a, const CollationElement& b) { return key(a) < key(b); };
    const CollationElements &a = *elements, &b = *other.elements;
    if (std::lexicographical_compare(a.begin(), a.end(), b.begin(), b.end(), less)) return true;
    if (std::lexicographical_compare(b.begin(), b.end(), a.begin(), a.end(), less)) return false;
    return text < other.text;
  }
};

}  // namespace

void SortRoot::settle() {
  settle_uses();
  settle_syllables();
  for (unsigned i = 0; i < kSyllableCount; ++i) decomposes_.set(kFirstSyllable + i);
  for (const auto& [composed, text] : decompositions) {
    decomposes_.set(composed);
    compositions_[text].push_back(composed);
    compositions_from_[text[0]].push_back(composed);
  }
}

void SortRoot::settle_uses() {
  auto use = [&](const CollationElements& elements) {
    for (const CollationElement& element : elements) {
      if (element.primary >= kFirstIdeograph) continue;
      if (uses_.size() <= element.primary) uses_.resize(element.primary + 1);
      uses_[element.primary].push_back(
          {static_cast<uint16_t>(element.secondary), static_cast<uint16_t>(element.tertiary)});
    }
  };
  uses_.resize(1);
  for (unsigned code = 0; code < kCharacters; ++code) use(characters[code]);
  for (const auto& entry : contractions) use(entry.second);
  for (std::vector<Use>& list : uses_) {
    auto key = [](const Use& entry) { return std::tie(entry.secondary, entry.tertiary); };
    std::sort(list.begin(), list.end(), [&](const Use& a, const Use& b) { return key(a) < key(b); });
    list.erase(
        std::unique(list.begin(), list.end(), [&](const Use& a, const Use& b) { return key(a) == key(b); }),
        list.end());
  }
}

void SortRoot::settle_syllables() {
  for (size_t part = 0; part < 3; ++part) {
    for (unsigned i = 0; i < kJamoCounts[part]; ++i) {
      const CollationElements& elements = characters[kJamos[part] + i];
      const bool absent = part == 2 && i == 0;  // no trailing letter
      if (!absent && elements.size() == 1) jamos_[part].emplace(elements[0].primary, i);
    }
  }
}

uint32_t SortRoot::secondary_before(uint32_t primary, uint32_t secondary) const {
  uint32_t before = kNone;
  if (primary >= uses_.size()) return before;
  for (const Use& entry : uses_[primary]) {
    if (entry.secondary >= secondary) break;
    before = entry.secondary;
  }
  return before;
}

uint32_t SortRoot::tertiary_before(uint32_t primary, uint32_t secondary, uint32_t tertiary) const {
  uint32_t before = kNone;
  if (primary >= uses_.size()) return before;
  for (const Use& entry : uses_[primary]) {
    if (entry.secondary == secondary && entry.tertiary < tertiary) before = entry.tertiary;
  }
  return before;
}

size_t SortRoot::group_of(uint32_t primary) const {
  const auto next =
      std::upper_bound(groups.begin(), groups.end(), primary,
                       [](uint32_t value, const SortGroup& group) { return value < group.first; });
  return next == groups.begin() ? 0 : static_cast<size_t>(next - groups.begin()) - 1;
}

bool SortRoot::is_ideograph(unsigned code) const {
  return std::any_of(ideographs.begin(), ideographs.end(), [&](SortRange r) { return r.holds(code); });
}

bool SortRoot::is_computed(unsigned code) const {
  auto within = [&](const std::vector<SortRange>& ranges) {
    return std::any_of(ranges.begin(), ranges.end(), [&](SortRange range) { return range.holds(code); });
  };
  return is_ideograph(code) || within(syllables) || within(computed) || within(uncovered);
}

std::u16string SortRoot::decomposition(char16_t unit) const {
  const unsigned syllable = static_cast<unsigned>(unit) - kFirstSyllable;
  if (unit >= kFirstSyllable && syllable < kSyllableCount) {
    const unsigned trailing = syllable % kJamoCounts[2], both = syllable / kJamoCounts[2];
    std::u16string text{static_cast<char16_t>(kJamos[0] + both / kJamoCounts[1]),
                        static_cast<char16_t>(kJamos[1] + both % kJamoCounts[1])};
    if (trailing != 0) text += static_cast<char16_t>(kJamos[2] + trailing);
    return text;
  }
  const auto found = decompositions.find(unit);
  return found == decompositions.end() ? std::u16string(1, unit) : found->second;
}

std::u16string SortRoot::decomposed(const std::u16string& text) const {
  std::u16string out;
  for (const char16_t unit : text) out += decomposition(unit);
  // Marks behind a letter stand in the order of their classes.
  for (auto first = out.begin(); first != out.end();) {
    auto end = first + 1;
    if (combining_class[*first] != 0) {
      while (end != out.end() && combining_class[*end] != 0) ++end;
      std::stable_sort(first, end,
                       [&](char16_t a, char16_t b) { return combining_class[a] < combining_class[b]; });
    }
    first = end;
  }
  return out;
}

std::vector<char16_t> SortRoot::compositions(const std::u16string& text) const {
  const auto found = compositions_.find(text);
  std::vector<char16_t> list = found == compositions_.end() ? std::vector<char16_t>() : found->second;
  if (text.size() == 1) list.push_back(text[0]);
  return list;
}

const std::vector<char16_t>& SortRoot::compositions_from(char16_t first) const {
  static const std::vector<char16_t> none;
  const auto found = compositions_from_.find(first);
  return found == compositions_from_.end() ? none : found->second;
}

char16_t SortRoot::syllable(const uint32_t* primaries, size_t count) const {
  unsigned numbers[3] = {};
  for (size_t part = 0; part < count; ++part) {
    const auto found = jamos_[part].find(primaries[part]);
    if (found == jamos_[part].end()) return 0;
    numbers[part] = found->second;
  }
  return static_cast<char16_t>(kFirstSyllable + (numbers[0] * kJamoCounts[1] + numbers[1]) * kJamoCounts[2] +
                               numbers[2]);
}

SortRoot read_root(std::istream& in, const std::string& file_name) {
  return RootReader(in, file_name).read();
}

void write_root(std::ostream& out, const SortRoot& root) {
  out << "@tables";
  for_each_run(
      256, [&](unsigned page) { return static_cast<unsigned>(root.tables[page]); },
      [](std::ostream& to, SortRange pages, unsigned) {
        to << ' ' << range_text(pages.first << 8, pages.last << 8 | 0xFF);
      },
      out);
  out << '\n';
  write_ranges(out, "ideographs", root.ideographs);
  write_ranges(out, "syllables", root.syllables);
  write_ranges(out, "computed", root.computed);
  write_ranges(out, "uncovered", root.uncovered);
  out << "@upper";
  for (unsigned tertiary = 0; tertiary < 256; ++tertiary) {
    if (root.upper_tertiaries[tertiary]) out << ' ' << hex4(tertiary);
  }
  out << '\n';
  for (const SortGroup& group : root.groups) out << "@group " << group.name << ' ' << hex4(group.first) << '\n';
  for_each_run(
      kCharacters, [&](unsigned code) { return unsigned{root.combining_class[code]}; },
      [](std::ostream& to, SortRange range, unsigned number) {
        to << "@combining " << range_text(range.first, range.last) << " ; " << hex4(number) << '\n';
      },
      out);
  for (const auto& [composed, text] : root.decompositions)
    out << "@canonical " << hex4(composed) << " ; " << code_points_text(text) << '\n';

  std::vector<RootLine> lines;
  for (unsigned code = 0; code < kCharacters; ++code) {
    if (root.listed[code])
      lines.push_back({std::u16string(1, static_cast<char16_t>(code)), &root.characters[code]});
  }
  for (const auto& [text, elements] : root.contractions) lines.push_back({text, &elements});
  std::sort(lines.begin(), lines.end());
  for (const RootLine& line : lines) {
    out << code_points_text(line.text) << " ; ";
    for (const CollationElement& element : *line.elements)
      out << element_text(element, element.primary != 0 && element.primary <= root.last_variable);
    if (line.elements->empty()) out << "[.0000.0000.0000]";
    std::string shown;
    for (const char16_t unit : line.text) shown += visible_text(unit);
    if (!shown.empty()) out << " # " << shown;
    out << '\n';
  }
}

}  // namespace lexicor_data
