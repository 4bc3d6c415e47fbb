// The layouts of the locale directory's files and of message catalogs: every offset and size as a named
// constant. Integers of the locale directory are little-endian; those of a catalog are in the byte order of the
// machine that reads it. Shared by the library, the compilers and the tests.
#pragma once

#include <cstddef>
#include <cstdint>

namespace lx::format {

// Common file header: the control file and every object file begin with it.
//
//   0  u32 magic          8  u16 sections (1..4)
//   4  u32 format word   10  u16 size 0, 12 u32 offset 0, 16 u32 size 1, 20 u32 offset 1, ... 36 u32 offset 3
//                        40  36 bytes that loaders do not read
inline constexpr uint32_t kMagic = 0x476CF462;
inline constexpr size_t kHeaderBytes = 76;
inline constexpr size_t kHeaderMagic = 0;
inline constexpr size_t kHeaderFormat = 4;  // the version in the top four bits
inline constexpr size_t kHeaderSections = 8;
inline constexpr size_t kHeaderUnread = 40;
inline constexpr size_t kHeaderUnreadBytes = 36;
inline constexpr size_t kMaxSections = 4;
inline constexpr size_t kMaxSectionBytes = 65535;
inline constexpr uint32_t kFormatVersion = 2;
inline constexpr int kFormatVersionShift = 28;

/// Where section `n`'s size stands: 16 bits are used of each, though only the first is stored in 16.
inline constexpr size_t header_section_size(size_t n) {
  return n == 0 ? 10 : 8 + 8 * n;
}
inline constexpr size_t header_section_offset(size_t n) {
  return 12 + 8 * n;
}

// Control file: section 0 is a run of records, grouped by ascending type, ascending identifier in a type.
//
//   0 u16 identifier   2 u8 type   3 u8 flags (0 on disk)   4 34 bytes name, null-terminated
inline constexpr size_t kRecordBytes = 38;
inline constexpr size_t kRecordId = 0;
inline constexpr size_t kRecordType = 2;
inline constexpr size_t kRecordFlags = 3;
inline constexpr size_t kRecordName = 4;
inline constexpr size_t kRecordNameBytes = 34;

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
inline constexpr size_t kSpecialBytes = 8;  // first, second or 0, result 1, result 2 or 0
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
//
// Page: u8 flags, u8 class of an algorithmic page's characters, u16 base. Weight record: u16 weight, u8
// secondary, u8 tertiary, u16 flags. Expansion record: u16 code point, two sets of u16 primary, u8 secondary,
// u8 tertiary, and four bytes that nobody reads. Contraction record: u16 first, u16 second, then as a weight
// record.
namespace sort {
inline constexpr size_t kFixedBytes = 1036;
inline constexpr size_t kDefaultSecondary = 0;  // u8: trailing ones are left out of keys
inline constexpr size_t kDefaultTertiary = 1;   // u8
inline constexpr size_t kExpansionCount = 2;
inline constexpr size_t kContractionCount = 4;
inline constexpr size_t kPages = 6;       // 256 x 4, by the high byte
inline constexpr size_t kWeights = 1030;  // offsets in the payload
inline constexpr size_t kExpansions = 1032;
inline constexpr size_t kContractions = 1034;

inline constexpr size_t kPageBytes = 4;
inline constexpr uint8_t kPageUncovered = 0x01;
inline constexpr uint8_t kPagePrimary = 0x02;  // primary weight = base + low byte
inline constexpr uint8_t kPageSpecial = 0x04;  // special weight = base + low byte
inline constexpr size_t kWeightBytes = 6;      // a table page's character: record base + low byte
inline constexpr uint16_t kWeightSpecial = 0x8000;
inline constexpr uint16_t kWeightExpansion = 0x4000;
inline constexpr uint16_t kWeightClass = 0x3C00;
inline constexpr int kWeightClassShift = 10;
inline constexpr size_t kExpansionBytes = 14;
inline constexpr size_t kContractionBytes = 10;

// Class bits: whether a level's weight is appended, else inserted ahead of the run.
inline constexpr uint8_t kAppendPrimary = 8;
inline constexpr uint8_t kAppendSecondary = 4;
inline constexpr uint8_t kAppendTertiary = 2;
inline constexpr uint8_t kAppendSpecial = 1;
}  // namespace sort

// Codepage payload, version 2: a fixed part, then in a multibyte codepage the full-width table, the width
// pairs, the type trie and the type records. Section 1: multibyte-to-Unicode nodes and values. Sections 2 and
// 3: the low and high arrays that the page table points into.
namespace codepage {
inline constexpr size_t kFixedBytes = 4376;
inline constexpr size_t kSubstitution = 0;
inline constexpr size_t kLineEnds = 1;  // 4 bytes: line feed, carriage return, and two further line ends
inline constexpr size_t kWidth = 5;
inline constexpr size_t kPairCount = 6;
inline constexpr size_t kShiftOut = 8;
inline constexpr size_t kShiftIn = 9;
inline constexpr size_t kLengths = 10;   // 256 x u8
inline constexpr size_t kUpper = 266;    // 256 x u8
inline constexpr size_t kLower = 522;    // 256 x u8
inline constexpr size_t kUnicode = 778;  // 256 x u16
inline constexpr size_t kTypes = 1292;   // 256 x u32; two bytes before it are not used
inline constexpr size_t kPages = 2316;   // 256 x 8
inline constexpr size_t kFlags = 4364;
inline constexpr size_t kFullWidth = 4366;  // offsets in the payload, 0 for none
inline constexpr size_t kPairs = 4368;
inline constexpr size_t kTypeTrie = 4370;
inline constexpr size_t kTypeRecords = 4372;
inline constexpr size_t kUnicodeValues = 4374;  // offset in section 1

inline constexpr uint16_t kFlagAscii = 0x0001;
inline constexpr uint16_t kFlagShift = 0x0002;

inline constexpr size_t kFullWidthBytes = 1024;  // 256 x u32
inline constexpr size_t kPairBytes = 8;          // u32 half-width code, u32 full-width code
inline constexpr size_t kTypeNodeBytes = 4;      // u8 leaf, u8 mask, u16 base
inline constexpr size_t kTypeRecordBytes = 8;    // u32 type word, u32 case delta
inline constexpr size_t kNodeBytes = 6;          // u8 leaf, u8 mask, u8 lowest, u8 highest, u16 base
inline constexpr size_t kPageBytes = 8;          // u8 kind, u8 mask, u8 lowest, u8 highest, u16 low, u16 high

// Page kinds: how the packed code is put together from the low and the high array.
enum PageKind : uint8_t {
  kKindByte = 0,      // low: bytes
  kKindWord = 1,      // low: words
  kKindByteWord = 2,  // high: bytes << 16, low: words
  kKindWordWord = 3,  // high: words << 16, low: words
  kKindByteByte = 4,  // high: bytes << 8, low: bytes
};

inline constexpr uint16_t kUtf8Id = 57352;
inline constexpr uint16_t kCommonId = 367;

// Version 1: four bytes less in the fixed part, no Shift bytes, 4-byte trie nodes without a range.
namespace v1 {
inline constexpr size_t kFixedBytes = 4372;
inline constexpr size_t kLengths = 8;
inline constexpr size_t kUpper = 264;
inline constexpr size_t kLower = 520;
inline constexpr size_t kUnicode = 776;
inline constexpr size_t kTypes = 1288;
inline constexpr size_t kPages = 2312;
inline constexpr size_t kFlags = 4360;
inline constexpr size_t kFullWidth = 4362;
inline constexpr size_t kPairs = 4364;
inline constexpr size_t kTypeTrie = 4366;
inline constexpr size_t kTypeRecords = 4368;
inline constexpr size_t kUnicodeValues = 4370;
inline constexpr size_t kNodeBytes = 4;  // u8 leaf, u8 mask, u16 base
}  // namespace v1
}  // namespace codepage

// Message catalog: 32-bit unsigned integers, offsets from the start of the file. A chain of set records leads
// to each set's index and block of texts; texts end with a null byte that their length counts.
namespace catalog {
inline constexpr uint32_t kMagic = 0x476CF463;
inline constexpr uint32_t kVersion = 0x10000000;
inline constexpr uint32_t kBigEndian = 1;  // byte-order codes
inline constexpr uint32_t kLittleEndian = 2;

inline constexpr size_t kHeaderBytes = 152;
inline constexpr size_t kHeaderMagic = 0;
inline constexpr size_t kHeaderVersion = 4;
inline constexpr size_t kHeaderByteOrder = 8;
inline constexpr size_t kHeaderSets = 12;      // number of sets, at least 1
inline constexpr size_t kHeaderFirstSet = 16;  // offset of the first set record
inline constexpr size_t kHeaderLocale = 20;    // null-terminated name of the texts' locale
inline constexpr size_t kHeaderLocaleBytes = 132;

// Set records, in ascending order of their numbers.
inline constexpr size_t kSetBytes = 28;
inline constexpr size_t kSetNumber = 0;
inline constexpr size_t kSetNext = 4;  // offset of the next set record, 0 for the last
inline constexpr size_t kSetMessages = 8;
inline constexpr size_t kSetIndex = 12;
inline constexpr size_t kSetTexts = 16;
inline constexpr size_t kSetTextBytes = 20;
inline constexpr size_t kSetUnread = 24;

// Index entries, in ascending order of their numbers.
inline constexpr size_t kEntryBytes = 12;
inline constexpr size_t kEntryNumber = 0;
inline constexpr size_t kEntryTextBytes = 4;
inline constexpr size_t kEntryText = 8;  // offset in the set's block of texts
}  // namespace catalog

}  // namespace lx::format
