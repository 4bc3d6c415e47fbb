// The width tables of a codepage: which of its characters are the full-width and half-width forms of each
// other.
#pragma once

#include "codepage/lxcodepage.h"

namespace lx {

struct WidthTables {
  const Codepage& cp;
  const uint8_t* full;  // by single byte; null: the codepage has none
  const uint8_t* pairs;
  size_t pair_count;

  explicit WidthTables(const Codepage& codepage)
      : cp(codepage),
        full(table(cp, format::codepage::kFullWidth)),
        pairs(table(cp, format::codepage::kPairs)),
        pair_count(pairs != nullptr ? le16(cp.payload + format::codepage::kPairCount) : 0) {}

  format::codepage::WidthPair pair(size_t i) const {
    using format::codepage::WidthPair;
    return WidthPair::read(pairs + WidthPair::kBytes * i);
  }
  uint32_t full_of_byte(size_t byte) const { return full != nullptr ? le32(full + 4 * byte) : 0; }

  uint32_t to_full(uint32_t half) const {
    const size_t at = lower_bound(pair_count, [&](size_t i) { return pair(i).half < half; });
    return at != pair_count && pair(at).half == half ? pair(at).full : 0;
  }
  /// The first match in the order of the tables counts.
  uint32_t to_half(uint32_t full_code) const {
    if (cp.halves == nullptr) return 0;
    const size_t entry = cp.halves[slot_of(full_code)];
    return entry == 0 ? 0 : entry <= kBytes ? static_cast<uint32_t>(entry - 1) : pair(entry - 1 - kBytes).half;
  }

  /// How many slots Codepage::halves has, a power of two; 0: no character has a full-width form.
  size_t slots() const {
    const size_t entries = (full != nullptr ? kBytes : 0) + pair_count;
    size_t slots = entries != 0 ? 4 : 0;
    while (slots < 2 * entries) slots *= 2;
    return slots;
  }
  void fill(uint16_t* halves) const {
    for (size_t entry = full != nullptr ? 0 : kBytes; entry < kBytes + pair_count; ++entry) {
      uint16_t& slot = halves[slot_of(full_of(entry))];
      if (slot == 0) slot = static_cast<uint16_t>(entry + 1);
    }
  }

 private:
  static constexpr size_t kBytes = 256;

  /// By entry: the single bytes, then the pairs.
  uint32_t full_of(size_t entry) const {
    return entry < kBytes ? full_of_byte(entry) : pair(entry - kBytes).full;
  }
  /// The slot of a full-width code, or the empty one where it belongs.
  size_t slot_of(uint32_t code) const {
    size_t slot = (code * 0x9E3779B1u >> 16) & cp.halves_mask;
    while (cp.halves[slot] != 0 && full_of(cp.halves[slot] - 1u) != code) slot = (slot + 1) & cp.halves_mask;
    return slot;
  }
  static const uint8_t* table(const Codepage& cp, size_t field) {
    const size_t offset = le16(cp.payload + field);
    return cp.single_byte || offset == 0 ? nullptr : cp.payload + offset;
  }
};

}  // namespace lx
