// The width tables of a codepage: which of its characters are the full-width and half-width forms of each
// other.
#pragma once

#include <cstring>

#include "codepage/lxcodepage.h"

namespace lx {

struct WidthTables {
  const uint8_t* full;  // by single byte; null: the codepage has none
  const uint8_t* pairs;
  size_t pair_count;

  explicit WidthTables(const Codepage& cp)
      : full(table(cp, format::codepage::kFullWidth)),
        pairs(table(cp, format::codepage::kPairs)),
        pair_count(pairs != nullptr ? le16(cp.payload + format::codepage::kPairCount) : 0) {}

  format::codepage::WidthPair pair(size_t i) const {
    using format::codepage::WidthPair;
    return WidthPair::read(pairs + WidthPair::kBytes * i);
  }
  uint32_t full_of_byte(size_t byte) const { return full != nullptr ? le32(full + 4 * byte) : 0; }

  uint32_t to_full(uint32_t half) const {
    size_t low = 0;
    size_t high = pair_count;
    while (low < high) {
      const size_t middle = low + (high - low) / 2;
      if (pair(middle).half == half) return pair(middle).full;
      if (pair(middle).half < half)
        low = middle + 1;
      else
        high = middle;
    }
    return 0;
  }

  /// The first match in the order of the tables counts.
  uint32_t to_half(uint32_t code) const {
    for (size_t byte = 0; full != nullptr && byte < 256; ++byte)
      if (full_of_byte(byte) == code) return static_cast<uint32_t>(byte);
    for (size_t i = 0; i < pair_count; ++i)
      if (pair(i).full == code) return pair(i).half;
    return 0;
  }

 private:
  static const uint8_t* table(const Codepage& cp, size_t field) {
    const size_t offset = le16(cp.payload + field);
    return cp.single_byte || offset == 0 ? nullptr : cp.payload + offset;
  }
};

/// The same answers as WidthTables::to_half() from chains by a hash of the code, for texts that are long enough
/// to pay for them. Code 0 stands for no full-width form in the table, so it is not chained.
class HalfWidthIndex {
 public:
  HalfWidthIndex(const WidthTables& tables, bool wanted) : tables_(tables) {
    const size_t entries = 256 + tables.pair_count;
    used_ = wanted && tables.full != nullptr && entries <= kMostEntries;
    if (!used_) return;
    memset(heads_, 0, sizeof(heads_));
    // From the back, so that a chain begins with the first entry.
    for (size_t i = entries; i-- > 0;) {
      const uint32_t full = full_of(i);
      if (full == 0) continue;
      uint16_t* head = &heads_[full % kChains];
      next_[i] = *head;
      *head = static_cast<uint16_t>(i + 1);
    }
  }
  uint32_t to_half(uint32_t code) const {
    if (!used_ || code == 0) return tables_.to_half(code);
    for (size_t at = heads_[code % kChains]; at != 0; at = next_[at - 1])
      if (full_of(at - 1) == code)
        return at <= 256 ? static_cast<uint32_t>(at - 1) : tables_.pair(at - 257).half;
    return 0;
  }

 private:
  static constexpr size_t kChains = 251;
  static constexpr size_t kMostEntries = 1024;
  uint32_t full_of(size_t entry) const {
    return entry < 256 ? tables_.full_of_byte(entry) : tables_.pair(entry - 256).full;
  }
  const WidthTables& tables_;
  bool used_;
  uint16_t heads_[kChains];      // entry + 1; 0: the chain is empty
  uint16_t next_[kMostEntries];  // by entry
};

}  // namespace lx
