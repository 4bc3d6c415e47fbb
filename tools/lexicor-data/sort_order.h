// The order of weights while rules add to it. A weight is a number of the root, or a name for one that stands behind a
// number of the root, its anchor, in a list. Secondary weights are ordered among elements of one primary weight,
// tertiary ones among those of one primary and secondary weight: those make the context of a list.
#pragma once

#include <cstdint>
#include <map>
#include <tuple>
#include <vector>

#include "sort_root.h"

namespace lexicor_data {

class WeightOrder {
 public:
  static constexpr unsigned kPositionBits = 13;  ///< of a number; its anchor takes the others
  static constexpr uint32_t kAheadOfNext = 1u << (kPositionBits - 1);  ///< of a position: in the next group

  enum Level : uint8_t { kPrimary, kSecondary, kTertiary };
  struct Context {
    Level level = kPrimary;
    uint32_t primary = 0, secondary = 0;
    bool next_group =
        false;  ///< ahead of the first letter of a group, and not behind the last one of the group before
    auto key() const { return std::tie(level, primary, secondary, next_group); }
    bool operator<(const Context& other) const { return key() < other.key(); }
  };

  /// A new weight next behind another one.
  uint32_t insert_after(const Context& context, uint32_t weight);
  /// A new weight next ahead of another one; `below` is the next lower weight of the root, 0 for none.
  uint32_t insert_before(const Context& context, uint32_t weight, uint32_t below);

  /// The weight of the root that a weight is or stands behind.
  uint32_t anchor(uint32_t weight) const;
  /// A number that orders weights of one context, and those of one level where anchors differ.
  uint32_t number(uint32_t weight) const;
  /// The weight of the root in whose group a primary weight of this number stands.
  static uint32_t in_group_of(uint32_t number) {
    return (number >> kPositionBits) + ((number & kAheadOfNext) != 0 ? 1 : 0);
  }
  /// Whether a list has more weights than numbers can tell apart.
  bool full() const { return full_; }

 private:
  using Gap = std::pair<Context, uint32_t>;  ///< behind an anchor
  struct Place {
    std::map<Gap, std::vector<uint32_t>>::iterator list;
  };
  uint32_t insert(const Gap& gap, size_t at);
  size_t position(uint32_t weight) const;

  std::map<Gap, std::vector<uint32_t>> gaps_;
  std::vector<Place> places_;  ///< of weights that are not the root's
  bool full_ = false;
};

}  // namespace lexicor_data
