// The layouts of the locale directory's files: every record as a plain struct that is read from and written to
// bytes, with its layout drawn above it, and the fields of the fixed parts as named offsets. Integers are
// little-endian. Shared by the library, the compiler and the tests; nothing else knows where a field stands.
// Message catalogs are described in lxcatformat.h.
#pragma once

#include <cstddef>
#include <cstdint>

#include "core/lxbytes.h"
#include "lx/codepage.h"

namespace lx::format {

inline constexpr uint32_t kMagic = 0x476CF462;
inline constexpr size_t kMaxSections = 4;
inline constexpr size_t kMaxSectionBytes = 65535;
inline constexpr uint32_t kFormatVersion = 2;

// Common file header: the control file and every object file begin with it. Of the sizes of sections 1 to 3 the
// low 16 bits are used. Maker, compiler and digest identify the data; loaders do not read them, nor what stands
// behind the sections.
//
//   0       4        8          10      12         16      20         24 .. 40      42         44       76
//   +-------+--------+----------+-------+----------+-------+----------+-----+-------+----------+--------+
//   | magic | format | sections | size0 | offset0  | size1 | offset1  | ... | maker | compiler | digest |
//   +-------+--------+----------+-------+----------+-------+----------+-----+-------+----------+--------+
//     u32     u32      u16        u16     u32        u32     u32              u16     u16        32 bytes
//
//   format:   the version in the top four bits
//   maker:    kMaker when the two fields behind it hold what follows
//   compiler: the version of the compiler's output
//   digest:   SHA-256 of the sections, as digest_of() takes it
//
// Behind the last section, at a multiple of four: what the object was made from, as UTF-8 up to the end of the file.
inline constexpr size_t kHeaderBytes = 76;
inline constexpr size_t kHeaderSections = 8;
inline constexpr size_t header_section_size(size_t n) {
  return n == 0 ? 10 : 8 + 8 * n;
}
inline constexpr size_t header_section_offset(size_t n) {
  return 12 + 8 * n;
}

struct Header {
  static constexpr size_t kIdentity = 40;
  static constexpr uint16_t kMaker = 0x584C;  // "LX"
  static constexpr size_t kDigestBytes = 32;
  static constexpr int kVersionShift = 28;
  struct Section {
    uint16_t bytes;
    uint32_t offset;
  };

  uint32_t magic = kMagic;
  uint32_t format = kFormatVersion << kVersionShift;
  uint16_t sections = 0;
  Section section[kMaxSections] = {};
  uint16_t maker = 0;
  uint16_t compiler = 0;
  uint8_t digest[kDigestBytes] = {};

  uint32_t version() const { return format >> kVersionShift; }

  static Header read(const uint8_t* p) {
    Header header{le32(p), le32(p + 4), le16(p + kHeaderSections)};
    for (size_t n = 0; n < kMaxSections; ++n)
      header.section[n] = {le16(p + header_section_size(n)), le32(p + header_section_offset(n))};
    header.maker = le16(p + kIdentity);
    header.compiler = le16(p + kIdentity + 2);
    memcpy(header.digest, p + kIdentity + 4, sizeof(header.digest));
    return header;
  }
  void write(uint8_t* p) const {
    put_le32(p, magic);
    put_le32(p + 4, format);
    put_le16(p + kHeaderSections, sections);
    for (size_t n = 0; n < kMaxSections; ++n) {
      put_le16(p + header_section_size(n), section[n].bytes);
      put_le32(p + header_section_offset(n), section[n].offset);
    }
    put_le16(p + kIdentity, maker);
    put_le16(p + kIdentity + 2, compiler);
    memcpy(p + kIdentity + 4, digest, sizeof(digest));
  }
};

// Control file: section 0 is a run of records, grouped by ascending type, ascending identifier in a type.
//
//   0    2      3       4                          38
//   +----+------+-------+--------------------------+
//   | id | type | flags | name, null-terminated    |
//   +----+------+-------+--------------------------+
//     u16  u8     u8: 0   34 bytes
struct ControlRecord {
  static constexpr size_t kBytes = 38;
  static constexpr size_t kName = 4;

  uint16_t id = 0;
  uint8_t type = 0;
  uint8_t flags = 0;
  char name[kBytes - kName] = {};

  static ControlRecord read(const uint8_t* p) {
    ControlRecord record{le16(p), p[2], p[3]};
    memcpy(record.name, p + kName, sizeof(record.name));
    return record;
  }
  void write(uint8_t* p) const {
    put_le16(p, id);
    p[2] = type;
    p[3] = flags;
    memcpy(p + kName, name, sizeof(name));
  }
};
inline constexpr size_t kRecordBytes = ControlRecord::kBytes;

inline constexpr const char* kControlFile = "control.nls";
inline constexpr const char* kAliasFile = "alias.txt";
inline constexpr const char* kDataExtension = ".nls";
inline constexpr size_t kTypes = 4;
inline constexpr const char* kTypePrefix[kTypes] = {"la", "te", "cp", "so"};

// Language payload: 51 words, then null-terminated 16-bit texts and two tables of special mappings.
namespace language {
inline constexpr size_t kWords = 51;
inline constexpr size_t kHeaderBytes = 2 * kWords;
inline constexpr size_t kDefaultTerritory = 0;  // word numbers
inline constexpr size_t kDefaultCodepage = 1;
inline constexpr size_t kDefaultSort = 2;
inline constexpr size_t kUpperSpecials = 3;  // entry counts
inline constexpr size_t kLowerSpecials = 4;
inline constexpr size_t kFirstText = 5;  // 5 abbreviation, 6 name, 7 days, 14 short days, 21 months,
inline constexpr size_t kLastText = 48;  // 34 short months, 47 morning, 48 afternoon
inline constexpr size_t kFirstDay = 7;   // items 16 to 57 are the words from here to kLastText
inline constexpr size_t kUpperSpecialTable = 49;
inline constexpr size_t kLowerSpecialTable = 50;

// Special mapping: one or two characters become one or two others.
//
//   0       2        4         6         8
//   +-------+--------+---------+---------+
//   | first | second | result1 | result2 |   all u16; 0: there is no second one
//   +-------+--------+---------+---------+
struct SpecialMapping {
  static constexpr size_t kBytes = 8;

  uint16_t first = 0;
  uint16_t second = 0;
  uint16_t result1 = 0;
  uint16_t result2 = 0;

  static constexpr SpecialMapping read(const uint8_t* p) {
    return {le16(p), le16(p + 2), le16(p + 4), le16(p + 6)};
  }
  constexpr void write(uint8_t* p) const {
    put_le16(p, first);
    put_le16(p + 2, second);
    put_le16(p + 4, result1);
    put_le16(p + 6, result2);
  }
};
}  // namespace language

// Territory payload: 23 words, then null-terminated 16-bit texts in the order of their words; the texts of
// words 13 to 15 and 17 to 21 reach to the offset that the next word holds.
namespace territory {
inline constexpr size_t kWords = 23;
inline constexpr size_t kHeaderBytes = 2 * kWords;
inline constexpr size_t kSeparators = 0;  // 5 words: items 59, 60, 61, 66, 67
inline constexpr size_t kNumbers = 5;     // 3 words: items 63, 69, 70
inline constexpr size_t kSignPositions = 8;
inline constexpr size_t kValue84 = 9;
inline constexpr size_t kFlags = 10;
inline constexpr size_t kFirstText = 11;
inline constexpr size_t kInternationalCurrency = 16;
inline constexpr size_t kLastText = 21;
inline constexpr size_t kPayloadBytes = 22;
}  // namespace territory

// Sort payload: a fixed part, then the tables that its last three words locate.
namespace sort {
inline constexpr size_t kFixedBytes = 1036;
inline constexpr size_t kDefaultSecondary = 0;  // u8: trailing ones are left out of keys
inline constexpr size_t kDefaultTertiary = 1;   // u8
inline constexpr size_t kExpansionCount = 2;
inline constexpr size_t kContractionCount = 4;
inline constexpr size_t kPages = 6;       // 256 pages, by the high byte
inline constexpr size_t kWeights = 1030;  // offsets in the payload
inline constexpr size_t kExpansions = 1032;
inline constexpr size_t kContractions = 1034;

// Page: a class is of LX_APPEND_ bits.
//
//   0       1            2      4
//   +-------+------------+------+
//   | flags | char class | base |   u8, u8, u16
//   +-------+------------+------+
//
//   uncovered: characters without weights
//   primary:   the primary weight is base + low byte, the class that of the page
//   special:   the special weight is base + low byte, the class that of the page
//   none:      a table page; the weight record is number base + low byte
inline constexpr uint8_t kPageUncovered = 0x01;
inline constexpr uint8_t kPagePrimary = 0x02;
inline constexpr uint8_t kPageSpecial = 0x04;
struct Page {
  static constexpr size_t kBytes = 4;

  uint8_t flags = 0;
  uint8_t char_class = 0;
  uint16_t base = 0;

  constexpr bool is_table() const { return (flags & (kPageUncovered | kPagePrimary | kPageSpecial)) == 0; }

  static constexpr Page read(const uint8_t* p) { return {p[0], p[1], le16(p + 2)}; }
  constexpr void write(uint8_t* p) const {
    p[0] = flags;
    p[1] = char_class;
    put_le16(p + 2, base);
  }
};

// Weight record.
//
//   0        2           3          4       6
//   +--------+-----------+----------+-------+       flags:  15        14          13..10   9..0
//   | weight | secondary | tertiary | flags |               special | expansion | class  | 0
//   +--------+-----------+----------+-------+
//     u16      u8          u8         u16
//
//   special:   the weight is the special one and there is no other; else it is the primary weight
//   expansion: the character's weights stand in the expansion table
struct WeightRecord {
  static constexpr size_t kBytes = 6;
  static constexpr uint16_t kSpecial = 0x8000;
  static constexpr uint16_t kExpansion = 0x4000;
  static constexpr int kClassShift = 10;

  uint16_t weight = 0;
  uint8_t secondary = 0;
  uint8_t tertiary = 0;
  uint16_t flags = 0;

  constexpr bool is_special() const { return (flags & kSpecial) != 0; }
  constexpr bool is_expansion() const { return (flags & kExpansion) != 0; }
  constexpr uint8_t char_class() const { return flags >> kClassShift & 0xF; }

  static constexpr WeightRecord read(const uint8_t* p) { return {le16(p), p[2], p[3], le16(p + 4)}; }
  constexpr void write(uint8_t* p) const {
    put_le16(p, weight);
    p[2] = secondary;
    p[3] = tertiary;
    put_le16(p + 4, flags);
  }
};

// Expansion: a character with two sets of weights.
//
//   0           2         4           5          6         8           9          10       14
//   +-----------+---------+-----------+----------+---------+-----------+----------+--------+
//   | character | primary | secondary | tertiary | primary | secondary | tertiary | unread |
//   +-----------+---------+-----------+----------+---------+-----------+----------+--------+
//     u16         u16       u8          u8         u16       u8          u8         4 bytes
struct Expansion {
  static constexpr size_t kBytes = 14;
  struct Set {
    uint16_t primary = 0;
    uint8_t secondary = 0;
    uint8_t tertiary = 0;
  };

  uint16_t character = 0;
  Set sets[2] = {};

  static constexpr Expansion read(const uint8_t* p) {
    return {le16(p), {{le16(p + 2), p[4], p[5]}, {le16(p + 6), p[8], p[9]}}};
  }
  constexpr void write(uint8_t* p) const {
    put_le16(p, character);
    put_le16(p + 2, sets[0].primary);
    p[4] = sets[0].secondary;
    p[5] = sets[0].tertiary;
    put_le16(p + 6, sets[1].primary);
    p[8] = sets[1].secondary;
    p[9] = sets[1].tertiary;
    put_le32(p + 10, 0);
  }
};

// Contraction: two characters that weigh as one.
//
//   0       2        4                10
//   +-------+--------+----------------+
//   | first | second | weight record  |   u16, u16, 6 bytes
//   +-------+--------+----------------+
struct Contraction {
  static constexpr size_t kBytes = 10;

  uint16_t first = 0;
  uint16_t second = 0;
  WeightRecord weights;

  static constexpr Contraction read(const uint8_t* p) {
    return {le16(p), le16(p + 2), WeightRecord::read(p + 4)};
  }
  constexpr void write(uint8_t* p) const {
    put_le16(p, first);
    put_le16(p + 2, second);
    weights.write(p + 4);
  }
};
}  // namespace sort

// Codepage payload, version 2: a fixed part, then in a multibyte codepage the full-width table, the width
// pairs, the type trie and the type records. Section 1: multibyte-to-Unicode nodes and values. Sections 2 and
// 3: the low and high arrays that the page table points into.
namespace codepage {
inline constexpr size_t kFixedBytes = 4376;
inline constexpr size_t kSubstitution = 0;
inline constexpr size_t kLineEnds = 1;  // line feed, carriage return, and two further line ends
inline constexpr size_t kLineEndBytes = 4;
inline constexpr size_t kWidth = 5;
inline constexpr size_t kPairCount = 6;
inline constexpr size_t kShiftOut = 8;
inline constexpr size_t kShiftIn = 9;
inline constexpr size_t kLengths = 10;   // 256 x u8
inline constexpr size_t kUpper = 266;    // 256 x u8
inline constexpr size_t kLower = 522;    // 256 x u8
inline constexpr size_t kUnicode = 778;  // 256 x u16
inline constexpr size_t kTypes = 1292;   // 256 x u32; two bytes before it are not used
inline constexpr size_t kPages = 2316;   // 256 page entries
inline constexpr size_t kFlags = 4364;
inline constexpr size_t kFullWidth = 4366;  // offsets in the payload, 0 for none
inline constexpr size_t kPairs = 4368;
inline constexpr size_t kTypeTrie = 4370;
inline constexpr size_t kTypeRecords = 4372;
inline constexpr size_t kUnicodeValues = 4374;  // offset in section 1

inline constexpr uint16_t kFlagAscii = 0x0001;
inline constexpr uint16_t kFlagShift = 0x0002;

inline constexpr uint16_t kUtf8Id = LX_CODEPAGE_UTF8;
inline constexpr uint16_t kCommonId = 367;

inline constexpr size_t kFullWidthBytes = 1024;  // 256 packed codes, u32

/// Version 1 has no Shift bytes and no unused bytes before the types: where a field of version 2 stands in it.
inline constexpr size_t in_version1(size_t field) {
  return field - (field < kLengths ? 0 : 2) - (field < kTypes ? 0 : 2);
}

// Width pair: a character of several bytes and its full-width form. Sorted by the first one.
//
//   0            4            8
//   +------------+------------+
//   | half width | full width |   packed codes, u32
//   +------------+------------+
struct WidthPair {
  static constexpr size_t kBytes = 8;

  uint32_t half = 0;
  uint32_t full = 0;

  static constexpr WidthPair read(const uint8_t* p) { return {le32(p), le32(p + 4)}; }
  constexpr void write(uint8_t* p) const {
    put_le32(p, half);
    put_le32(p + 4, full);
  }
};

// Node of the type trie, and in version 1 of the multibyte-to-Unicode trie. A byte leads to number base +
// (mask & byte): of a value or record in a leaf, of a node elsewhere.
//
//   0      1      2      4
//   +------+------+------+
//   | leaf | mask | base |   u8, u8, u16; leaf: 0 or not
//   +------+------+------+
struct TypeNode {
  static constexpr size_t kBytes = 4;
  static constexpr uint8_t lowest = 0x00;  // no byte is outside
  static constexpr uint8_t highest = 0xFF;

  uint8_t leaf = 0;
  uint8_t mask = 0;
  uint16_t base = 0;

  constexpr size_t next(unsigned byte) const { return base + (mask & byte); }

  static constexpr TypeNode read(const uint8_t* p) { return {p[0], p[1], le16(p + 2)}; }
  constexpr void write(uint8_t* p) const {
    p[0] = leaf;
    p[1] = mask;
    put_le16(p + 2, base);
  }
};

// Node of the multibyte-to-Unicode trie: a byte outside lowest to highest begins or continues no character.
//
//   0      1      2        3         4      6
//   +------+------+--------+---------+------+
//   | leaf | mask | lowest | highest | base |   u8 each, u16
//   +------+------+--------+---------+------+
struct UnicodeNode {
  static constexpr size_t kBytes = 6;

  uint8_t leaf = 0;
  uint8_t mask = 0;
  uint8_t lowest = 0;
  uint8_t highest = 0;
  uint16_t base = 0;

  constexpr size_t next(unsigned byte) const { return base + (mask & byte); }

  static constexpr UnicodeNode read(const uint8_t* p) { return {p[0], p[1], p[2], p[3], le16(p + 4)}; }
  constexpr void write(uint8_t* p) const {
    p[0] = leaf;
    p[1] = mask;
    p[2] = lowest;
    p[3] = highest;
    put_le16(p + 4, base);
  }
};

// Type record, and the type word, which also stands by itself for single bytes.
//
//   0           4            8           31     22 21     10 9      0
//   +-----------+------------+           +--------+---------+--------+
//   | type word | case delta |           | type 3 | type 2  | type 1 |
//   +-----------+------------+           +--------+---------+--------+
//     u32         u32: added to the packed code it gives the other case
struct TypeRecord {
  static constexpr size_t kBytes = 8;

  uint32_t type = 0;
  uint32_t case_delta = 0;

  static constexpr TypeRecord read(const uint8_t* p) { return {le32(p), le32(p + 4)}; }
  constexpr void write(uint8_t* p) const {
    put_le32(p, type);
    put_le32(p + 4, case_delta);
  }
};
inline constexpr uint32_t type1_of(uint32_t word) {
  return word & 0x3FF;
}
inline constexpr uint32_t type2_of(uint32_t word) {
  return word >> 10 & 0xFFF;
}
inline constexpr uint32_t type3_of(uint32_t word) {
  return word >> 22;
}

/// How a page's packed codes are put together from the low and the high array. Any other kind gives 0.
enum PageKind : uint8_t {
  kKindByte = 0,      // low: bytes
  kKindWord = 1,      // low: words
  kKindByteWord = 2,  // high: bytes << 16, low: words
  kKindWordWord = 3,  // high: words << 16, low: words
  kKindByteByte = 4,  // high: bytes << 8, low: bytes
};

// Page entry, by the high byte of a Unicode value. A low byte outside lowest to highest has no code; any other
// one has element low + (mask & byte) of the low array, and where the kind has one, high + (mask & byte) of the
// high array.
//
//   0      1      2        3         4     6      8
//   +------+------+--------+---------+-----+------+
//   | kind | mask | lowest | highest | low | high |   u8 each, u16 each
//   +------+------+--------+---------+-----+------+
struct PageEntry {
  static constexpr size_t kBytes = 8;

  uint8_t kind = kKindByte;
  uint8_t mask = 0;
  uint8_t lowest = 2;  // a range that no byte lies in
  uint8_t highest = 1;
  uint16_t low = 0;
  uint16_t high = 0;

  constexpr bool maps(unsigned byte) const { return byte >= lowest && byte <= highest; }
  /// The bytes of an element of each array; 0: the kind does not use the array.
  constexpr size_t low_bytes() const {
    return kind > kKindByteByte ? 0 : kind == kKindByte || kind == kKindByteByte ? 1 : 2;
  }
  constexpr size_t high_bytes() const {
    return kind == kKindWordWord ? 2 : kind == kKindByteWord || kind == kKindByteByte ? 1 : 0;
  }
  /// The packed code of a byte in the range.
  constexpr uint32_t code(unsigned byte, const uint8_t* low_array, const uint8_t* high_array) const {
    const size_t at = low + (byte & mask);
    const size_t above = high + (byte & mask);
    switch (kind) {
      case kKindByte:
        return low_array[at];
      case kKindWord:
        return le16(low_array + 2 * at);
      case kKindByteWord:
        return uint32_t{high_array[above]} << 16 | le16(low_array + 2 * at);
      case kKindWordWord:
        return uint32_t{le16(high_array + 2 * above)} << 16 | le16(low_array + 2 * at);
      case kKindByteByte:
        return uint32_t{high_array[above]} << 8 | low_array[at];
      default:
        return 0;
    }
  }

  static constexpr PageEntry read(const uint8_t* p) {
    return {p[0], p[1], p[2], p[3], le16(p + 4), le16(p + 6)};
  }
  constexpr void write(uint8_t* p) const {
    p[0] = kind;
    p[1] = mask;
    p[2] = lowest;
    p[3] = highest;
    put_le16(p + 4, low);
    put_le16(p + 6, high);
  }
};
}  // namespace codepage

}  // namespace lx::format
