// Look-ups in a codepage object, each written as the format describes it and none the packer's own: what the
// compiler's tests hold its objects against. Every read is bounds-checked, so a table that leads outside its
// section ends the test with std::out_of_range.
#pragma once

#include <cstdint>
#include <vector>

#include "compile.h"
#include "object_file.h"

namespace lexicor_data {

class CodepageTables {
 public:
  explicit CodepageTables(const ByteVector& file) : object_(read_object(file, "object")) {
    object_.sections.resize(4);
  }

  const ByteVector& section(size_t n) const { return object_.sections[n]; }
  uint8_t u8(size_t offset) const { return byte(0, offset); }
  uint32_t u16(size_t offset) const { return word(0, offset); }
  uint32_t u32(size_t offset) const { return word(0, offset) | word(0, offset + 2) << 16; }

  /// The Unicode value of a byte, and of a longer character by its trie.
  uint32_t single(uint8_t byte) const { return u16(778 + 2 * byte); }
  uint32_t to_unicode(const uint8_t* p) const {
    size_t node = 0;
    for (;; ++p) {
      if (*p < byte(1, node + 2) || *p > byte(1, node + 3)) return 0xFFFD;
      const size_t next = word(1, node + 4) + (byte(1, node + 1) & *p);
      if (byte(1, node) != 0) return word(1, u16(4374) + 2 * next);
      node = 6 * next;
    }
  }

  /// The packed code of a Unicode value.
  uint32_t from_unicode(uint32_t u) const {
    const size_t page = 2316 + 8 * (u >> 8);
    const uint32_t low = u & 0xFF;
    if (low < u8(page + 2) || low > u8(page + 3)) return u8(0);
    const size_t at = u16(page + 4) + (low & u8(page + 1)), high = u16(page + 6) + (low & u8(page + 1));
    switch (u8(page)) {
      case 0:
        return byte(2, at);
      case 1:
        return word(2, 2 * at);
      case 2:
        return static_cast<uint32_t>(byte(3, high)) << 16 | word(2, 2 * at);
      case 3:
        return word(3, 2 * high) << 16 | word(2, 2 * at);
      case 4:
        return byte(3, high) * 256U + byte(2, at);
      default:
        return 0;
    }
  }

  struct TypeRecord {
    uint32_t type;
    uint32_t delta;
    size_t bytes;  ///< that the walk took
  };
  TypeRecord type_of(const uint8_t* p) const {
    const size_t root = u16(4370);
    size_t node = root;
    for (size_t bytes = 1;; ++bytes, ++p) {
      const size_t next = u16(node + 2) + (u8(node + 1) & *p);
      if (u8(node) != 0) return {u32(u16(4372) + 8 * next), u32(u16(4372) + 8 * next + 4), bytes};
      node = root + 4 * next;
    }
  }

 private:
  uint8_t byte(size_t section, size_t offset) const { return object_.sections[section].at(offset); }
  uint32_t word(size_t section, size_t offset) const {
    return byte(section, offset) | static_cast<uint32_t>(byte(section, offset + 1)) << 8;
  }

  ObjectFile object_;
};

/// The bytes of a packed code, first byte first.
inline std::vector<uint8_t> bytes_of_code(uint32_t code, size_t count) {
  std::vector<uint8_t> bytes;
  while (count-- > 0) bytes.push_back(static_cast<uint8_t>(code >> 8 * count));
  return bytes;
}

}  // namespace lexicor_data
