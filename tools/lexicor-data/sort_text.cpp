// Reader and writer of sort sources. The reader keeps the place of each element, so that faults of the sort as
// a whole, found at the end, are reported where they stand.
#include "sort_text.h"

#include <algorithm>
#include <cctype>
#include <istream>
#include <ostream>
#include <set>
#include <tuple>
#include <vector>

#include "lexicor/hex.h"
#include "line_text.h"
#include "sort_check.h"
#include "ucm.h"

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

std::string hex(unsigned value) {
  return lexicor_cli::hex_text(value, 4);
}

bool is_surrogate(unsigned code) {
  return code >= 0xD800 && code <= 0xDFFF;
}

/// A position in one line, without its comment. Every take skips the blanks before it.
class Line {
 public:
  Line(const std::string& file, std::string text, int number)
      : file_(file), text_(std::move(text)), number_(number) {
    text_.resize(std::min(text_.find('#'), text_.size()));
    while (!text_.empty() && is_blank(text_.back())) text_.pop_back();
  }

  bool done() {
    skip_blanks();
    return at_ >= text_.size();
  }
  char peek() {
    skip_blanks();
    return at_ < text_.size() ? text_[at_] : '\0';
  }
  SortPlace here() {
    skip_blanks();
    return {number_, static_cast<int>(at_) + 1};
  }

  [[noreturn]] void fail(SortPlace where, const std::string& what) const {
    throw SourceError(file_, where.line, where.column, what);
  }
  [[noreturn]] void fail_expected(const std::string& expected) {
    std::string found = "the end of the line";
    if (!done()) {
      const size_t end = std::min(text_.find_first_of(" \t", at_), text_.size());
      found = "'" + text_.substr(at_, end - at_) + "'";
    }
    fail(here(), "found " + found + ", expected " + expected);
  }

  bool take(const std::string& text) {
    skip_blanks();
    if (text_.compare(at_, text.size(), text) != 0) return false;
    at_ += text.size();
    return true;
  }
  void expect(const std::string& text) {
    if (!take(text)) fail_expected("'" + text + "'");
  }
  void expect_end() {
    if (!done()) fail_expected("the end of the line");
  }
  /// Letters, digits and underscores; empty when there is none.
  std::string word() {
    skip_blanks();
    const size_t start = at_;
    while (at_ < text_.size() && (std::isalnum(static_cast<unsigned char>(text_[at_])) || text_[at_] == '_'))
      ++at_;
    return text_.substr(start, at_ - start);
  }
  /// 4 to 6 hexadecimal digits, a value up to `most`.
  unsigned number(unsigned most, const std::string& what) {
    const SortPlace start = here();
    unsigned value = 0;
    int digits = 0;
    for (; digits < 6 && at_ < text_.size() && hex_value(text_[at_]) >= 0; ++digits)
      value = value << 4 | static_cast<unsigned>(hex_value(text_[at_++]));
    if (digits == 0) fail_expected(what);
    if (digits < 4) fail(start, what + " has 4 hexadecimal digits");
    if (value > most) fail(start, what + " is above " + hex(most));
    return value;
  }

 private:
  void skip_blanks() {
    while (at_ < text_.size() && is_blank(text_[at_])) ++at_;
  }

  const std::string& file_;
  std::string text_;
  int number_;
  size_t at_ = 0;
};

struct Range {
  unsigned first = 0, last = 0;
};

/// A directive that says which weights go ahead of the run.
struct Insertion {
  SortPlace place;
  uint8_t char_class = kAppendAll;
  Range range;
  bool contraction = false;  ///< the range's ends are the two characters
};

class SortReader {
 public:
  SortReader(std::istream& in, const std::string& file) : in_(in), file_(file) {}

  SortSource read() {
    std::string text;
    while (next_line(in_, &text, &line_)) {
      Line line(file_, std::move(text), line_);
      if (line.done()) continue;
      if (line.take("@"))
        read_directive(line);
      else
        read_element(line);
    }
    if (in_.bad()) throw SourceError(file_, line_, 0, "the file cannot be read");
    settle_pages();
    settle_insertions();
    for (auto entry = sort_.characters.begin(); entry != sort_.characters.end();)
      entry = entry->second.ignored() ? sort_.characters.erase(entry) : std::next(entry);
    check_sort(sort_, file_);
    return std::move(sort_);
  }

 private:
  void read_directive(Line& line) {
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

  Range read_range(Line& line) {
    Range range;
    const SortPlace start = line.here();
    range.first = range.last = line.number(0xFFFF, "a code point");
    if (line.take("..")) range.last = line.number(0xFFFF, "a code point");
    if (range.last < range.first) line.fail(start, "the range runs backwards");
    return range;
  }

  void read_pages(Line& line, SortPageKind kind) {
    const SortPlace start = line.here();
    const Range range = read_range(line);
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
      if (named_[first >> 8]) line.fail(start, "page " + hex(first) + ": " + already(page.place));
      named_[first >> 8] = true;
      page.kind = kind;
      page.base = static_cast<uint16_t>(base + (first - range.first));
      page.place = place;
    }
  }

  void read_insertion(Line& line, SortPlace start) {
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
    insertion.range = read_range(line);
    if (!line.done() && insertion.range.first == insertion.range.last) {
      insertion.contraction = true;
      insertion.range.last = line.number(0xFFFF, "a code point");
    }
    insertions_.push_back(insertion);
  }

  char16_t read_character(Line& line) {
    const SortPlace start = line.here();
    const unsigned code = line.number(0x10FFFF, "a code point");
    if (code > 0xFFFF) line.fail(start, "a sort holds code points up to FFFF");
    if (is_surrogate(code)) line.fail(start, "a surrogate is no character");
    return static_cast<char16_t>(code);
  }

  void read_element(Line& line) {
    const SortPlace start = line.here();
    const char16_t first = read_character(line);
    char16_t second = 0;
    const bool contraction = line.peek() != ';';
    if (contraction) second = read_character(line);
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
  SortSet read_set(Line& line) {
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
            "page " + hex(number << 8) + " has no line; name it with @uncovered or another directive");
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
    const Range& range = insertion.range;
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
                          "the range holds only a part of computed page " + hex(number << 8));
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

std::string range_text(unsigned first, unsigned last) {
  return first == last ? hex(first) : hex(first) + ".." + hex(last);
}

/// The character as a comment, where a text file shows it well.
std::string comment(char16_t unit) {
  const bool invisible = unit <= 0x20 || (unit >= 0x7F && unit <= 0xA0) || unit == 0xAD || unit == 0x61C ||
                         (unit >= 0x2000 && unit <= 0x200F) || (unit >= 0x2028 && unit <= 0x202F) ||
                         (unit >= 0x205F && unit <= 0x206F) || unit == 0x3000 || unit == 0xFEFF ||
                         unit >= 0xFFF0;
  if (invisible) return "";
  std::string text;
  if (unit < 0x80) {
    text += static_cast<char>(unit);
  } else if (unit < 0x800) {
    text += static_cast<char>(0xC0 | unit >> 6);
    text += static_cast<char>(0x80 | (unit & 0x3F));
  } else {
    text += static_cast<char>(0xE0 | unit >> 12);
    text += static_cast<char>(0x80 | (unit >> 6 & 0x3F));
    text += static_cast<char>(0x80 | (unit & 0x3F));
  }
  return text;
}

std::string sets_text(const SortElement& element) {
  std::string text;
  for (size_t i = 0; i < element.count; ++i) {
    const SortSet& set = element.sets[i];
    text += set.special != 0 ? "[*" + hex(set.special) : "[." + hex(set.primary);
    text += "." + hex(set.secondary) + "." + hex(set.tertiary) + "]";
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
      if (page.computed()) out << " ; " << hex(page.base);
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
    out << "@insert " << class_text(element.char_class) << " ; " << hex(pair.first) << ' ' << hex(pair.second)
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
  out << "@defaults " << hex(sort.default_secondary) << ' ' << hex(sort.default_tertiary) << '\n';
  write_insertions(out, sort);
  write_pages(out, sort);
  std::set<unsigned> empty;
  for (unsigned number = 0; number < 256; ++number) {
    if (sort.pages[number].kind == SortPageKind::kTable) empty.insert(number);
  }
  for (const auto& entry : sort.characters) empty.erase(entry.first >> 8);
  for (unsigned number : empty) out << hex(number << 8) << " ; [.0000.0000.0000]\n";
  for (const Entry& entry : entries_of(sort)) {
    out << hex(entry.first);
    std::string shown = comment(entry.first);
    if (entry.contraction) {
      out << ' ' << hex(entry.second);
      const std::string second = comment(entry.second);
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
