// The agreement of weights among themselves. A key drops the default weights at the end of a level and ends the
// level with a zero byte: what follows from that is checked here.
#include "sort_check.h"

#include <vector>

#include "lexicor/hex.h"
#include "ucm.h"

namespace lexicor_data {
namespace {

using lexicor_cli::hex_text;

/// Below it the high byte of a weight could be taken for a secondary or tertiary weight of a shorter key.
constexpr uint16_t kLowestPrimary = 0x0200;

class Checker {
 public:
  Checker(const SortSource& sort, const std::string& file_name)
      : sort_(sort), file_name_(file_name), bare_(0x10000), defaulted_(0x10000) {}

  void check() {
    if (sort_.default_secondary == 0 || sort_.default_tertiary == 0)
      fail(sort_.defaults_place, "the default weights are missing or 0");
    for (const SortPage& page : sort_.pages) check_page(page);
    for (const auto& [character, element] : sort_.characters) check_element(element);
    for (const auto& [pair, element] : sort_.contractions) {
      if (pair.first == 0xFFFF || pair.second == 0xFFFF) fail(element.place, "FFFF stands in a contraction");
      if (element.count != 1) fail(element.place, "a contraction has one element");
      check_element(element);
    }
  }

 private:
  /// The levels on which elements of one primary have no weight, and the default one.
  enum Level : uint8_t { kSecondary = 1, kTertiary = 2 };

  [[noreturn]] void fail(SortPlace place, const std::string& what) const {
    throw SourceError(file_name_, place.line, place.column, what);
  }

  void check_page(const SortPage& page) {
    if (!page.computed()) return;
    if (page.base > 0xFF00) fail(page.place, "the weights of a page go beyond FFFF");
    if (page.kind == SortPageKind::kSpecial && page.base == 0) fail(page.place, "a special weight is 0");
    if (page.kind == SortPageKind::kSpecial) return;
    if (page.base < kLowestPrimary) fail_primary(page.place, page.base);
    for (unsigned low = 0; low < 256; ++low) bare_[page.base + low] = kSecondary | kTertiary;
  }

  [[noreturn]] void fail_primary(SortPlace place, uint16_t primary) const {
    fail(place, "primary weight " + hex_text(primary, 4) + " is below 0200");
  }

  void check_element(const SortElement& element) {
    if (element.ignored()) return;
    for (size_t i = 0; i < element.count; ++i) check_set(element.sets[i], element.place);
  }

  void check_set(const SortSet& set, SortPlace place) {
    if (set.special != 0) return;
    if (set.primary == 0 && set.secondary == 0 && set.tertiary == 0) fail(place, "an element has no weight");
    if (set.primary != 0 && set.primary < kLowestPrimary) fail_primary(place, set.primary);
    check_level(set.secondary, sort_.default_secondary, "secondary", place);
    check_level(set.tertiary, sort_.default_tertiary, "tertiary", place);
    if (set.primary == 0) {
      const bool only_tertiary = set.secondary == 0;
      if (only_tertiary ? set.tertiary == sort_.default_tertiary : set.secondary == sort_.default_secondary)
        fail(place, "the first weight of an element without a primary is the default one");
      return;
    }
    note(bare_[set.primary], set.secondary == 0, set.tertiary == 0);
    note(defaulted_[set.primary], set.secondary == sort_.default_secondary,
         set.tertiary == sort_.default_tertiary);
    if ((bare_[set.primary] & defaulted_[set.primary]) != 0) {
      fail(place, "primary weight " + hex_text(set.primary, 4) +
                      " occurs both with a default weight and without a weight on the same level");
    }
  }

  void check_level(uint8_t weight, uint8_t lowest, const char* level, SortPlace place) const {
    if (weight == 0 || weight >= lowest) return;
    fail(place, std::string(level) + " weight " + hex_text(weight, 4) + " is below the default one, " +
                    hex_text(lowest, 4));
  }

  static void note(uint8_t& levels, bool secondary, bool tertiary) {
    levels = static_cast<uint8_t>(levels | (secondary ? kSecondary : 0) | (tertiary ? kTertiary : 0));
  }

  const SortSource& sort_;
  const std::string& file_name_;
  std::vector<uint8_t> bare_, defaulted_;  ///< levels by primary weight
};

}  // namespace

void check_sort(const SortSource& sort, const std::string& file_name) {
  Checker(sort, file_name).check();
}

}  // namespace lexicor_data
