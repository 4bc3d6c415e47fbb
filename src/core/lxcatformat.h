// The layout of message catalogs. Integers are 32-bit and unsigned, in the byte order of the machine that reads
// the file; offsets count from its start. A chain of set records leads to each set's index and block of texts;
// texts end with a null byte that their length counts. Shared by the library, the compiler and the tests.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>

namespace lx::format::catalog {

inline constexpr uint32_t kMagic = 0x476CF463;
inline constexpr uint32_t kVersion = 0x10000000;
inline constexpr uint32_t kBigEndian = 1;  // byte-order codes
inline constexpr uint32_t kLittleEndian = 2;

/// An integer of a catalog in this machine's byte order or, `swapped`, in the other one.
inline uint32_t get_word(const uint8_t* p, bool swapped = false) {
  uint32_t word;
  memcpy(&word, p, sizeof(word));
  return swapped ? __builtin_bswap32(word) : word;
}
inline void put_word(uint8_t* p, uint32_t word, bool swapped = false) {
  if (swapped) word = __builtin_bswap32(word);
  memcpy(p, &word, sizeof(word));
}

// Header. There is at least one set.
//
//   0       4         8            12     16          20                              152
//   +-------+---------+------------+------+-----------+-------------------------------+
//   | magic | version | byte order | sets | first set | locale's name, null-terminated |
//   +-------+---------+------------+------+-----------+-------------------------------+
//                                   number  offset      132 bytes
inline constexpr size_t kHeaderBytes = 152;
inline constexpr size_t kHeaderMagic = 0;
inline constexpr size_t kHeaderVersion = 4;
inline constexpr size_t kHeaderByteOrder = 8;
inline constexpr size_t kHeaderSets = 12;
inline constexpr size_t kHeaderFirstSet = 16;
inline constexpr size_t kHeaderLocale = 20;
inline constexpr size_t kHeaderLocaleBytes = 132;

struct Header {
  uint32_t magic = kMagic;
  uint32_t version = kVersion;
  uint32_t byte_order = 0;
  uint32_t sets = 0;
  uint32_t first_set = 0;
  char locale[kHeaderLocaleBytes] = {};

  static Header read(const uint8_t* p, bool swapped = false) {
    Header header{get_word(p + kHeaderMagic, swapped), get_word(p + kHeaderVersion, swapped),
                  get_word(p + kHeaderByteOrder, swapped), get_word(p + kHeaderSets, swapped),
                  get_word(p + kHeaderFirstSet, swapped)};
    memcpy(header.locale, p + kHeaderLocale, sizeof(header.locale));
    return header;
  }
  void write(uint8_t* p, bool swapped = false) const {
    put_word(p + kHeaderMagic, magic, swapped);
    put_word(p + kHeaderVersion, version, swapped);
    put_word(p + kHeaderByteOrder, byte_order, swapped);
    put_word(p + kHeaderSets, sets, swapped);
    put_word(p + kHeaderFirstSet, first_set, swapped);
    memcpy(p + kHeaderLocale, locale, sizeof(locale));
  }
};

// Set record, in ascending order of the numbers. `next` is 0 in the last one.
//
//   0        4      8          12      16      20           24       28
//   +--------+------+----------+-------+-------+------------+--------+
//   | number | next | messages | index | texts | text bytes | unread |
//   +--------+------+----------+-------+-------+------------+--------+
//              offset number     offset  offset
inline constexpr size_t kSetBytes = 28;
inline constexpr size_t kSetNumber = 0;
inline constexpr size_t kSetNext = 4;
inline constexpr size_t kSetMessages = 8;
inline constexpr size_t kSetIndex = 12;
inline constexpr size_t kSetTexts = 16;
inline constexpr size_t kSetTextBytes = 20;
inline constexpr size_t kSetUnread = 24;

struct SetRecord {
  uint32_t number = 0;
  uint32_t next = 0;
  uint32_t messages = 0;
  uint32_t index = 0;
  uint32_t texts = 0;
  uint32_t text_bytes = 0;

  static SetRecord read(const uint8_t* p, bool swapped = false) {
    return {get_word(p + kSetNumber, swapped),   get_word(p + kSetNext, swapped),
            get_word(p + kSetMessages, swapped), get_word(p + kSetIndex, swapped),
            get_word(p + kSetTexts, swapped),    get_word(p + kSetTextBytes, swapped)};
  }
  void write(uint8_t* p, bool swapped = false) const {
    put_word(p + kSetNumber, number, swapped);
    put_word(p + kSetNext, next, swapped);
    put_word(p + kSetMessages, messages, swapped);
    put_word(p + kSetIndex, index, swapped);
    put_word(p + kSetTexts, texts, swapped);
    put_word(p + kSetTextBytes, text_bytes, swapped);
    put_word(p + kSetUnread, 0, swapped);
  }
};

// Index entry, in ascending order of the numbers. `text` is an offset in the set's block of texts.
//
//   0        4            8      12
//   +--------+------------+------+
//   | number | text bytes | text |
//   +--------+------------+------+
inline constexpr size_t kEntryBytes = 12;
inline constexpr size_t kEntryNumber = 0;
inline constexpr size_t kEntryTextBytes = 4;
inline constexpr size_t kEntryText = 8;

struct IndexEntry {
  uint32_t number = 0;
  uint32_t text_bytes = 0;
  uint32_t text = 0;

  static IndexEntry read(const uint8_t* p, bool swapped = false) {
    return {get_word(p + kEntryNumber, swapped), get_word(p + kEntryTextBytes, swapped),
            get_word(p + kEntryText, swapped)};
  }
  void write(uint8_t* p, bool swapped = false) const {
    put_word(p + kEntryNumber, number, swapped);
    put_word(p + kEntryTextBytes, text_bytes, swapped);
    put_word(p + kEntryText, text, swapped);
  }
};

}  // namespace lx::format::catalog
