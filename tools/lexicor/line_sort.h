// Sorts lines by the bytes of their keys, in several threads.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string_view>

#include "arena.h"

namespace lexicor_cli {

/// A line while it is sorted: eight bytes of its key as a number, and where the key is. Behind a key there is slack.
struct KeyEntry {
  uint64_t head;
  const char* key;
  uint32_t key_bytes;
  uint32_t line;  // its number, which orders what is equal

  KeyEntry() = default;
  KeyEntry(std::string_view given, uint32_t number)
      : key(given.data()), key_bytes(static_cast<uint32_t>(given.size())), line(number) {
    load(0);
  }

  std::string_view view() const { return {key, key_bytes}; }
  /// Makes the head of the bytes from `depth` on; what is beyond the end counts as zeros.
  void load(size_t depth) {
    static_assert(Arena::kSlack >= sizeof head);
    head = 0;
    if (depth >= key_bytes) return;
    std::memcpy(&head, key + depth, sizeof head);
    if constexpr (__BYTE_ORDER__ == __ORDER_LITTLE_ENDIAN__) head = __builtin_bswap64(head);
    const size_t left = key_bytes - depth;
    if (left < sizeof head) head &= ~uint64_t{0} << 8 * (sizeof head - left);
  }
};

/// Sorts entries with the heads of their keys' beginnings. What is equal keeps its order, also in descending order. The
/// heads are of no use afterwards.
void sort_entries(KeyEntry* entries, size_t count, bool descending);

}  // namespace lexicor_cli
