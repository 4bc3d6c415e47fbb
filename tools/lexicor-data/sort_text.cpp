// Reader and writer of sort sources. The reader keeps the place of each element, so that faults of the sort as
// a whole, found at the end, are reported where they stand.
#include "sort_text.h"

#include <algorithm>
#include <istream>
#include <ostream>
#include <set>
#include <tuple>
#include <vector>

#include "sort_check.h"
#include "sort_line.h"

namespace lexicor_data {
namespace {

using Pair = std::pair<char16_t, char16_t>;

struct LevelName {
  const char* text;
  uint8_t bit;
};
constexpr LevelName kLevels[] = {
    {"primary", LX_APPEND_PRIMARY},
    {"secondary", LX_APPEND_SECONDARY},
    {"tertiary", LX_APPEND_TERTIARY},
    {"special", LX_APPEND_SPECIAL},
};
constexpr const char* kNoLevels = "none";

/// A directive that says which weights go ahead of the run.
struct Insertion {
  SortPlace place;
  uint8_t char_class = kAppendAll;
  SortLine::Range range;
  bool contraction = false;  ///< the range's ends are the two characters
};

class SortReader {
 public:
  SortReader(std::istream& in, const std::string& file) : in_(in), file_(file) {}

  SortSource read() {
    read_sort_lines(
        in_, file_, &line_, [&](SortLine& line) { read_directive(line); },
        [&](SortLine& line) { read_element(line); });
    settle_pages();
    settle_insertions();
    for (auto entry = sort_.characters.begin(); entry != sort_.characters.end();)
      entry = entry->second.ignored() ? sort_.characters.erase(entry) : std::next(entry);
    check_sort(sort_, file_);
    return std::move(sort_);
  }

 private:
  void read_directive(SortLine& line) {
    const SortPlace start{line_, line.here().column - 1};
    const std::string name = line.word();
    if (name == "defaults") {
      if (sort_.defaults_place.line != 0) line.fail(start, already(sort_.defaults_place));
      sort_.defaults_place = line.here();
      sort_.default_secondary = static_cast<uint8_t>(line.number(0xFF, "a secondary weight"));
      sort_.default_tertiary = static_cast<uint8_t>(line.number(0xFF, "a tertiary weight"));
    } else if (name == "primaries") {
      read_pages(line, SortPageKind::kPrimary);
    } else if (name == "specials") {
      read_pages(line, SortPageKind::kSpecial);
    } else if (name == "uncovered") {
      read_pages(line, SortPageKind::kUncovered);
    } else if (name == "insert") {
      read_insertion(line, start);
    } else {
      line.fail(start, "unknown directive @" + name);
    }
    line.expect_end();
  }

  void read_pages(SortLine& line, SortPageKind kind) {
    const SortPlace start = line.here();
    const SortLine::Range range = line.range();
    if (range.first % 256 != 0 || range.last % 256 != 255)
      line.fail(start, "the range is not one of whole pages");
    SortPlace place = start;
    unsigned base = 0;
    if (kind != SortPageKind::kUncovered) {
      line.expect(";");
      place = line.here();
      base = line.number(0xFFFF, "a weight");
      if (base + (range.last - range.first) > 0xFFFF)
        line.fail(place, "the weights of the range go beyond FFFF");
    }
    for (unsigned first = range.first; first < range.last; first += 256) {
      SortPage& page = sort_.pages[first >> 8];
      if (named_[first >> 8]) line.fail(start, "page " + hex4(first) + ": " + already(page.place));
      if (listed_.count(static_cast<uint8_t>(first >> 8)) != 0)
        line.fail(start, "page " + hex4(first) + ": characters of it stand before");
      named_[first >> 8] = true;
      page.kind = kind;
      page.base = static_cast<uint16_t>(base + (first - range.first));
      page.place = place;
    }
  }

  void read_insertion(SortLine& line, SortPlace start) {
    Insertion insertion;
    insertion.place = line.here();
    if (!line.take(kNoLevels)) {
      do {
        const SortPlace place = line.here();
        const std::string word = line.word();
        const auto level = std::find_if(std::begin(kLevels), std::end(kLevels),
                                        [&](const LevelName& candidate) { return word == candidate.text; });
        if (level == std::end(kLevels))
          line.fail(place, "found '" + word + "', expected primary, secondary, tertiary, special or none");
        insertion.char_class &= static_cast<uint8_t>(~level->bit);
      } while (!line.done() && line.peek() != ';');
    }
    if (line.done()) {
      if (usual_place_.line != 0) line.fail(start, already(usual_place_));
      usual_place_ = start;
      usual_class_ = insertion.char_class;
      return;
    }
    line.expect(";");
    insertion.place = line.here();
    insertion.range = line.range();
    if (!line.done() && insertion.range.first == insertion.range.last) {
      insertion.contraction = true;
      insertion.range.last = line.number(0xFFFF, "a code point");
    }
    insertions_.push_back(insertion);
  }

  void read_element(SortLine& line) {
    const SortPlace start = line.here();
    const char16_t first = line.character();
    char16_t second = 0;
    const bool contraction = line.peek() != ';';
    if (contraction) second = line.character();
    if (line.peek() != ';' && hex_value(line.peek()) >= 0)
      line.fail(line.here(), "a contraction has two characters");
    line.expect(";");
    SortElement element;
    element.place = line.here();
    element.count = 0;
    do {
      if (element.count == 2) line.fail(line.here(), "a character has two elements at most");
      element.sets[element.count++] = read_set(line);
    } while (!line.done());
    if (element.count == 2 && (element.sets[0].special != 0 || element.sets[1].special != 0))
      line.fail(element.place, "a special weight stands alone");
    if (contraction) {
      const auto added = sort_.contractions.emplace(Pair(first, second), element);
      if (!added.second) line.fail(start, already(added.first->second.place));
      return;
    }
    const SortPage& page = sort_.pages[first >> 8];
    if (named_[first >> 8]) line.fail(start, "its page is named on line " + std::to_string(page.place.line));
    listed_.insert(static_cast<uint8_t>(first >> 8));
    const auto added = sort_.characters.emplace(first, element);
    if (!added.second) line.fail(start, already(added.first->second.place));
  }

  /// [.0000.0000.0000] or [*0000.0000.0000].
  SortSet read_set(SortLine& line) {
    SortSet set;
    line.expect("[");
    const bool special = line.take("*");
    if (!special) line.expect(".");
    const SortPlace first = line.here();
    (special ? set.special : set.primary) = static_cast<uint16_t>(line.number(0xFFFF, "a weight"));
    line.expect(".");
    const SortPlace place = line.here();
    set.secondary = static_cast<uint8_t>(line.number(0xFF, "a secondary weight"));
    line.expect(".");
    set.tertiary = static_cast<uint8_t>(line.number(0xFF, "a tertiary weight"));
    line.expect("]");
    if (special && set.special == 0) line.fail(first, "a special weight is 0");
    if (special && (set.secondary != 0 || set.tertiary != 0))
      line.fail(place, "an element with a special weight has no others");
    return set;
  }

  void settle_pages() {
    for (unsigned number = 0; number < 256; ++number) {
      if (named_[number]) continue;
      SortPage& page = sort_.pages[number];
      if (listed_.count(static_cast<uint8_t>(number)) == 0) {
        throw SourceError(
            file_, line_ + 1, 1,
            "page " + hex4(number << 8) + " has no line; name it with @uncovered or another directive");
      }
      page.kind = SortPageKind::kTable;
    }
  }

  void settle_insertions() {
    for (auto& entry : sort_.characters) entry.second.char_class = usual_class_;
    for (auto& entry : sort_.contractions) entry.second.char_class = usual_class_;
    for (SortPage& page : sort_.pages) page.char_class = page.computed() ? usual_class_ : kAppendAll;
    for (const Insertion& insertion : insertions_) {
      const bool used = insertion.contraction ? insert_contraction(insertion) : insert_range(insertion);
      if (!used) {
        throw SourceError(
            file_, insertion.place.line, insertion.place.column,
            insertion.contraction ? "there is no such contraction" : "the range holds no character");
      }
    }
  }

  bool insert_contraction(const Insertion& insertion) {
    const auto found = sort_.contractions.find(
        {static_cast<char16_t>(insertion.range.first), static_cast<char16_t>(insertion.range.last)});
    if (found == sort_.contractions.end()) return false;
    found->second.char_class = insertion.char_class;
    return true;
  }

  bool insert_range(const Insertion& insertion) {
    const SortLine::Range& range = insertion.range;
    bool used = false;
    auto entry = sort_.characters.lower_bound(static_cast<char16_t>(range.first));
    for (; entry != sort_.characters.end() && entry->first <= range.last; ++entry) {
      entry->second.char_class = insertion.char_class;
      used = true;
    }
    for (unsigned number = range.first >> 8; number <= range.last >> 8; ++number) {
      SortPage& page = sort_.pages[number];
      if (!page.computed()) continue;
      if (range.first > number << 8 || range.last < (number << 8 | 0xFF)) {
        throw SourceError(file_, insertion.place.line, insertion.place.column,
                          "the range holds only a part of computed page " + hex4(number << 8));
      }
      page.char_class = insertion.char_class;
      used = true;
    }
    return used;
  }

  static std::string already(SortPlace place) {
    return "stands on line " + std::to_string(place.line) + " already";
  }

  std::istream& in_;
  const std::string& file_;
  int line_ = 0;
  SortSource sort_;
  std::array<bool, 256> named_{};  ///< by a directive
  std::set<uint8_t> listed_;       ///< pages with lines
  SortPlace usual_place_;
  uint8_t usual_class_ = kAppendAll;
  std::vector<Insertion> insertions_;
};

std::string class_text(uint8_t char_class) {
  std::string text;
  for (const LevelName& level : kLevels) {
    if ((char_class & level.bit) == 0) text += std::string(text.empty() ? "" : " ") + level.text;
  }
  return text.empty() ? kNoLevels : text;
}

std::string sets_text(const SortElement& element) {
  std::string text;
  for (size_t i = 0; i < element.count; ++i) {
    const SortSet& set = element.sets[i];
    text += set.special != 0 ? "[*" + hex4(set.special) : "[." + hex4(set.primary);
    text += "." + hex4(set.secondary) + "." + hex4(set.tertiary) + "]";
  }
  return text;
}

/// A line of the source, in the order in which lines are written: specials, then the weights.
struct Entry {
  const SortElement* element;
  char16_t first, second;
  bool contraction;

  auto key() const {
    const auto& [one, two] = element->sets;
    return std::make_tuple(one.special == 0, one.special, one.primary, two.primary, one.secondary,
                           two.secondary, one.tertiary, two.tertiary, element->count, first, second,
                           contraction);
  }
};

std::vector<Entry> entries_of(const SortSource& sort) {
  std::vector<Entry> entries;
  for (const auto& [character, element] : sort.characters) entries.push_back({&element, character, 0, false});
  for (const auto& [pair, element] : sort.contractions)
    entries.push_back({&element, pair.first, pair.second, true});
  std::sort(entries.begin(), entries.end(), [](const Entry& a, const Entry& b) { return a.key() < b.key(); });
  return entries;
}

/// Adjacent pages that one directive says.
void write_pages(std::ostream& out, const SortSource& sort) {
  constexpr const char* kNames[] = {"@uncovered ", "", "@primaries ", "@specials "};
  for (unsigned first = 0; first < 256;) {
    const SortPage& page = sort.pages[first];
    unsigned end = first + 1;
    while (end < 256 && sort.pages[end].kind == page.kind &&
           (!page.computed() || sort.pages[end].base == page.base + (end - first) * 256)) {
      ++end;
    }
    if (page.kind != SortPageKind::kTable) {
      out << kNames[static_cast<size_t>(page.kind)] << range_text(first << 8, (end << 8) - 1);
      if (page.computed()) out << " ; " << hex4(page.base);
      out << '\n';
    }
    first = end;
  }
}

/// What the most elements have is said once, then the ranges that differ.
void write_insertions(std::ostream& out, const SortSource& sort) {
  struct Run {
    unsigned first, last;
    uint8_t char_class;
  };
  std::map<unsigned, Run> items;  // by first code point
  for (const auto& [character, element] : sort.characters)
    items[character] = {character, character, element.char_class};
  for (unsigned number = 0; number < 256; ++number) {
    const SortPage& page = sort.pages[number];
    if (page.computed()) items[number << 8] = {number << 8, number << 8 | 0xFF, page.char_class};
  }
  std::array<size_t, 16> counts{};
  for (const auto& item : items) ++counts[item.second.char_class];
  for (const auto& entry : sort.contractions) ++counts[entry.second.char_class];
  const auto most = std::max_element(counts.rbegin(), counts.rend());
  const auto usual = static_cast<uint8_t>(counts.rend() - most - 1);
  if (usual != kAppendAll) out << "@insert " << class_text(usual) << '\n';

  std::vector<Run> runs;
  for (const auto& item : items) {
    if (runs.empty() || runs.back().char_class != item.second.char_class)
      runs.push_back(item.second);
    else
      runs.back().last = item.second.last;
  }
  for (const Run& run : runs) {
    if (run.char_class != usual)
      out << "@insert " << class_text(run.char_class) << " ; " << range_text(run.first, run.last) << '\n';
  }
  for (const auto& [pair, element] : sort.contractions) {
    if (element.char_class == usual) continue;
    out << "@insert " << class_text(element.char_class) << " ; " << hex4(pair.first) << ' ' << hex4(pair.second)
        << '\n';
  }
}

}  // namespace

bool SortElement::ignored() const {
  return std::all_of(sets.begin(), sets.end(), [](const SortSet& set) {
    return set.primary == 0 && set.secondary == 0 && set.tertiary == 0 && set.special == 0;
  });
}

SortSource read_sort(std::istream& in, const std::string& file_name) {
  return SortReader(in, file_name).read();
}

void write_sort(std::ostream& out, const SortSource& sort) {
  out << "@defaults " << hex4(sort.default_secondary) << ' ' << hex4(sort.default_tertiary) << '\n';
  write_insertions(out, sort);
  write_pages(out, sort);
  std::set<unsigned> empty;
  for (unsigned number = 0; number < 256; ++number) {
    if (sort.pages[number].kind == SortPageKind::kTable) empty.insert(number);
  }
  for (const auto& entry : sort.characters) empty.erase(entry.first >> 8);
  for (unsigned number : empty) out << hex4(number << 8) << " ; [.0000.0000.0000]\n";
  for (const Entry& entry : entries_of(sort)) {
    out << hex4(entry.first);
    std::string shown = visible_text(entry.first);
    if (entry.contraction) {
      out << ' ' << hex4(entry.second);
      const std::string second = visible_text(entry.second);
      if (shown.empty() || second.empty())
        shown.clear();
      else
        shown += second;
    }
    out << " ; " << sets_text(*entry.element);
    if (!shown.empty()) out << " # " << shown;
    out << '\n';
  }
}

}  // namespace lexicor_data
