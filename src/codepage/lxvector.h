// Runs of characters by the widest vectors of the processor: the loops that pay for more than what every machine
// has. Which ones are used is chosen once; all of them give the same.
#pragma once

#include <cstddef>
#include <cstdint>

#include "codepage/lxblock.h"

namespace lx {

/// Characters of one and two bytes as the rows of a codepage have them.
struct PairRows {
  /// By first byte, in the upper bits where the row of such characters begins in `rows`, or where the value of a
  /// single byte stands, and in the lower eight what of the byte behind it counts: all, or nothing.
  const uint32_t* first;  // null: there are none, or other first bytes than `leads` can say
  const uint16_t* rows;
  LeadRanges leads;
  bool ascii;  // ASCII is what it is
};

/// The value of the character of one byte or two at `p`; a byte is read behind it.
inline uint16_t pair_value(const PairRows& pairs, const uint8_t* p) {
  const uint32_t where = pairs.first[p[0]];
  return pairs.rows[(where >> 8) + (p[1] & where)];
}

/// How a run of values is read.
struct RunRule {
  uint32_t below;  // not 0: ends also before ASCII that follows other characters
  uint32_t slack;  // so many values behind the last one may be written over
};
inline constexpr uint32_t kRunSlack = 64;  // what is of use

/// What a run has read: where it goes on, and how many values there are.
struct ReadRun {
  const uint8_t* p;
  size_t count;
};

/// What a run has passed, in the same way.
using PassedRun = ReadRun;
inline constexpr size_t kPassedBytes = 64;  // at most at a time

/// Where the codes of values of at most two bytes stand: of the value u at page_start[u >> 8] + (u & 0xFF).
struct PairCodes {
  const uint32_t* page_start;
  const uint16_t* codes;
};

/// The same with the bytes that lead to the single-byte state and to the double-byte one.
struct ShiftCodes {
  PairCodes codes;
  uint8_t shift_in;
  uint8_t shift_out;
};

/// The same of codes of up to four bytes.
struct WideCodes {
  const uint32_t* page_start;
  const uint32_t* codes;
};

/// The other case of characters of two bytes of UTF-8 that have the same first byte, by the six bits of the second byte
/// that count.
struct PairCaseRow {
  uint8_t first[64];  // 0 where it has not two bytes
  uint8_t second[64];
};

/// How characters of UTF-8 are mapped to their other case.
struct Utf8Case {
  const PairCaseRow* rows;
  const uint8_t* row;       // by first byte of two, from 1 on; 0: ...
  const uint8_t* caseless;  // ... where this is 0 too some of its characters may have another case, else none
  uint16_t special;         // a character of two bytes that is left; 0: none
  bool special_three;       // all those of three bytes are left
  bool upper;
};
inline constexpr size_t kMappedBytes = 64 + 2;  // of a block, and more that belong to its last character

/// Which characters of those that were mapped are left to be mapped otherwise.
struct MappedBlock {
  uint64_t left;  // where they begin, one bit a byte
  // Filled when there are any: what stands in the text, and what stood where the mapped ones are now.
  uint8_t given[kMappedBytes];
  uint8_t before[kMappedBytes];
};

/// One choice of loops. They read nothing behind the end of a text, and write nothing behind their last unit but for
/// a slack.
struct Vectors {
  const char* name;

  /// From so many bytes on a text goes from one codepage to another by way of a run of values.
  size_t pivot_bytes;
  /// ... where one of them has characters of several bytes that are not UTF-8, and none has shift states.
  size_t pair_pivot_bytes;

  /// From so many bytes on characters are passed by blocks.
  size_t least_passed;
  /// Passes whole characters by their first bytes, at most `most`, which is kPassedBytes or more. It stops where
  /// first bytes follow each other in a way that does not tell, and sooner.
  PassedRun (*pass)(const LeadRanges& leads, const uint8_t* p, const uint8_t* end, size_t most);

  /// Reads characters of UTF-8, well-formed and of at most three bytes: as many as `most`, or fewer. None where there
  /// is another character, one that the end cuts, or where a character at a time is as good.
  ReadRun (*read_utf8)(const uint8_t* p, const uint8_t* end, uint16_t* values, size_t most, RunRule rule);

  /// The same of characters of one and two bytes.
  ReadRun (*read_pairs)(const PairRows& pairs, const uint8_t* p, const uint8_t* end, uint16_t* values,
                        size_t most, RunRule rule);

  /// Copies at most kRunSlack bytes if all are below `below`, 0x80 or 0x100; else none.
  bool (*copy_same)(uint8_t* to, const uint8_t* from, size_t count, unsigned below);

  /// Looks up `count` bytes in a table.
  void (*look_up)(const uint16_t table[256], const uint8_t* p, size_t count, uint16_t* values, RunRule rule);

  /// Looks up `count` bytes in a table of bytes.
  void (*translate)(const uint8_t table[256], const uint8_t* p, size_t count, uint8_t* to);

  /// Maps characters of UTF-8 at the start of `count` bytes, well-formed and of at most three bytes, which keep their
  /// length: how many bytes they have. Those of two bytes that are left may be anything in `to`, longer ones are as they
  /// were. `to` may be `p`. Null where vectors do not tell the case of other characters than ASCII.
  size_t (*map_utf8)(const Utf8Case& how, const uint8_t* p, size_t count, uint8_t* to, MappedBlock* block);

  // Write characters where all of them fit: where they end. As UTF-8, ...
  uint8_t* (*write_utf8)(uint8_t* p, const uint16_t* values, size_t count);
  // ... as codes of one byte and two, ...
  uint8_t* (*write_pairs)(const PairCodes& codes, uint8_t* p, const uint16_t* values, size_t count);
  // ... with the shift bytes that are due, where `two` is whether the character before them is one of two bytes (null:
  // there is no such loop), ...
  uint8_t* (*write_shift)(const ShiftCodes& codes, bool* two, uint8_t* p, const uint16_t* values, size_t count);
  // ... as codes of up to four, ...
  uint8_t* (*write_wide)(const WideCodes& codes, uint8_t* p, const uint16_t* values, size_t count);
  // ... and as codes of one byte.
  uint8_t* (*write_bytes)(const PairCodes& codes, uint8_t* p, const uint16_t* values, size_t count);
};

/// The ones that this processor can run, the best one first: how many.
inline constexpr size_t kMostVectors = 3;
size_t vectors_here(const Vectors* found[kMostVectors]);

/// The best one, chosen when the library is loaded.
extern const Vectors* vectors;

}  // namespace lx
