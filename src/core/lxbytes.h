// Little-endian reads and writes over byte ranges: the only way file memory is read. The compiler turns each
// into one load or store. And the search in tables that are in order.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>

namespace lx {

inline constexpr uint16_t le16(const uint8_t* p) {
  return static_cast<uint16_t>(p[0] | p[1] << 8);
}
inline constexpr uint32_t le32(const uint8_t* p) {
  return static_cast<uint32_t>(p[0]) | static_cast<uint32_t>(p[1]) << 8 | static_cast<uint32_t>(p[2]) << 16 |
         static_cast<uint32_t>(p[3]) << 24;
}
inline constexpr uint64_t le64(const uint8_t* p) {
  return le32(p) | uint64_t{le32(p + 4)} << 32;
}
inline constexpr void put_le16(uint8_t* p, uint16_t v) {
  p[0] = static_cast<uint8_t>(v);
  p[1] = static_cast<uint8_t>(v >> 8);
}
inline constexpr void put_le32(uint8_t* p, uint32_t v) {
  put_le16(p, static_cast<uint16_t>(v));
  put_le16(p + 2, static_cast<uint16_t>(v >> 16));
}

/// The first of `count` places in order for which `less(i)` is false, or `count`.
template <class Less>
inline size_t lower_bound(size_t count, Less less) {
  size_t low = 0;
  while (low < count) {
    const size_t middle = low + (count - low) / 2;
    if (less(middle))
      low = middle + 1;
    else
      count = middle;
  }
  return low;
}

/// A range of bytes with its size, as a section of an object file is handed around.
struct Bytes {
  const uint8_t* data = nullptr;
  size_t size = 0;

  /// Whether `count` bytes at `offset` lie inside; cannot wrap.
  constexpr bool holds(size_t offset, size_t count) const { return offset <= size && count <= size - offset; }
};

}  // namespace lx
