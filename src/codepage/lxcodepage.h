// A codepage as the code works with it: tables that are laid flat when the object is loaded, and the operations
// on single characters that everything else is built from. All of them trust the tables, which were validated
// then.
#pragma once

#include "codepage/lxvector.h"
#include "core/lxbytes.h"
#include "core/lxformat.h"
#include "core/lxobjman.h"
#include "core/lxobjtypes.h"

namespace lx {

inline constexpr uint16_t kNoUnicode = 0xFFFD;
inline constexpr size_t kMaxCharBytes = 4;

/// The codes of Unicode values as the page table of a codepage and its arrays have them.
struct PageCodes {
  const uint8_t* payload;
  const uint8_t* low_array;
  const uint8_t* high_array;

  format::codepage::PageEntry entry(size_t page) const {
    using format::codepage::PageEntry;
    return PageEntry::read(payload + format::codepage::kPages + page * PageEntry::kBytes);
  }
  bool maps(size_t page) const { return entry(page).lowest <= entry(page).highest; }
  /// The packed code, a zero byte inside it still there, or the substitution byte.
  uint32_t code(uint16_t u) const;
};

/// The case of characters of two bytes whose first byte begins some that have another one.
struct PairCase {
  static constexpr int16_t kFar = INT16_MIN;
  const int16_t* deltas;  // from the code to the other case, by row and second byte; kFar where that is farther
  const uint8_t* row;     // by first byte; 0: none
  uint8_t bits;           // how many of a second byte count
  const PairCaseRow* bytes;  // of UTF-8 the same as bytes; null: of others

  /// Stores a character in its other case, which is itself where it has none; false, and anything is stored, where that
  /// has not two bytes.
  [[gnu::always_inline]] bool map(size_t of_row, const uint8_t* p, uint8_t* to) const {
    const int32_t delta = deltas[((of_row - 1) << bits) + (p[1] & ((1u << bits) - 1))];
    const uint32_t code = (unsigned{p[0]} << 8 | p[1]) + static_cast<uint32_t>(delta);
    put_le16(to, __builtin_bswap16(static_cast<uint16_t>(code)));
    return delta != kFar && code - 0x100 < 0xFF00;
  }
};

/// Derived data of a codepage object, one block with the arrays behind it.
///
/// Towards Unicode: `unicode` for single bytes; for longer characters `rows`, one row of 256 values a trie
/// node. A leaf's row holds Unicode values, another node's row the numbers of the next nodes, 0 for none (node
/// 0 is the root, which is nobody's child). Behind them one row has no values, and one has those of single bytes. From
/// Unicode: `codes16` or, where a character has more than two bytes, `codes32`: from page_start[u >> 8] on they hold for
/// every low byte the bytes to store, packed; unmapped values hold the substitution byte.
struct Codepage {
  const uint8_t* payload;
  PageCodes pages;
  const uint16_t* rows;  // null: no multibyte characters
  const uint8_t* leaf;   // by node
  const uint16_t* codes16;
  const uint32_t* codes32;
  const uint16_t* halves;  // what WidthTables::to_half() finds, by hash; null: nothing
  size_t halves_mask;
  uint16_t unicode[256];
  uint32_t page_start[256];
  uint8_t width;  // of a character in bytes: the longest, or that of the double-byte state
  uint8_t substitution;
  uint8_t shift_out;
  uint8_t shift_in;
  bool single_byte;
  bool shift_sensitive;
  bool utf8;            // conversion is computed
  bool plain_utf8;      // ... and the lengths of characters are those of UTF-8
  bool two_level_rows;  // the root's children are leaves
  bool plain_case;      // single bytes have the case of ASCII, and others none
  bool plain_digits;    // no byte where ASCII or EBCDIC has a digit is white space
  // Bytes below this are the Unicode values of the same number, both ways, wherever they begin a character:
  // 0x100 for ISO 8859-1, 0x80 where ASCII is, else 0.
  uint16_t same_below;
  LeadRanges leads;
  PairRows pairs;
  // By first byte: the length of the characters of several bytes that begin with it, if none of them has
  // another case; else 0.
  uint8_t caseless[256];
  PairCase pair_case[2];  // lower, upper
  uint8_t pair_case_rows[256];

  uint8_t length(uint8_t first_byte) const { return payload[format::codepage::kLengths + first_byte]; }
  bool is_shift(uint8_t byte) const { return byte == shift_out || byte == shift_in; }
  uint8_t width_in(LXShiftState state) const { return state == LX_SHIFT_DOUBLE ? width : 1; }
  uint32_t type(uint8_t byte) const { return le32(payload + format::codepage::kTypes + 4 * byte); }
};

extern const ObjectType kCodepageType;
extern const BuiltIn kBuiltInCodepage;
void* derive_codepage(uint16_t id, const Sections& sections);
int32_t upgrade_codepage(const Sections& version1, Sections* upgraded);

/// The derived data of a loaded codepage object.
inline const Codepage& codepage_of(const LXObject& object) {
  return *static_cast<const Codepage*>(object.derived);
}

inline const uint8_t* bytes_of(const char* text) {
  return reinterpret_cast<const uint8_t*>(text);
}
inline uint8_t* bytes_of(char* text) {
  return reinterpret_cast<uint8_t*>(text);
}
inline char* chars_of(const uint8_t* text) {
  return reinterpret_cast<char*>(const_cast<uint8_t*>(text));
}

/// The number of bytes that a packed code takes.
inline size_t code_bytes(uint32_t code) {
  return 1u + (code > 0xFF) + (code > 0xFFFF) + (code > 0xFFFFFF);
}

inline uint32_t pack(const uint8_t* p, size_t count) {
  uint32_t code = 0;
  for (size_t i = 0; i < count; ++i) code = code << 8 | p[i];
  return code;
}

/// Stores the low `count` bytes of a packed code, first byte most significant.
inline void store_code(uint8_t* p, uint32_t code, size_t count) {
  for (size_t i = count; i-- > 0; code >>= 8) p[i] = static_cast<uint8_t>(code);
}

/// The code whose bytes are those that storing `code` leaves: a zero byte behind the first one is not stored,
/// since the lengths of the encodings carry none.
inline uint32_t without_zero_bytes(uint32_t code) {
  if (code <= 0xFFFF) return code;  // none stands inside
  uint32_t kept = 0;
  for (int shift = 24; shift > 0; shift -= 8)
    if ((code >> shift & 0xFF) != 0) kept = kept << 8 | (code >> shift & 0xFF);
  return kept << 8 | (code & 0xFF);
}

/// Stores a packed code without its zero bytes: the bytes written.
inline size_t store_packed(uint8_t* p, uint32_t code) {
  const uint32_t stored = without_zero_bytes(code);
  const size_t count = code_bytes(stored);
  store_code(p, stored, count);
  return count;
}

/// UTF-8 of 16-bit values, by formula: nothing is checked and surrogates are values like any other.
inline uint16_t utf8_unicode(const uint8_t* p) {
  if (p[0] > 0xDF) return static_cast<uint16_t>((p[0] & 0x0F) << 12 | (p[1] & 0x3F) << 6 | (p[2] & 0x3F));
  return static_cast<uint16_t>((p[0] & 0x1F) << 6 | (p[1] & 0x3F));
}
inline size_t utf8_bytes(uint16_t u) {
  return 1u + (u >= 0x80) + (u >= 0x800);
}
inline void store_utf8(uint8_t* p, uint16_t u, size_t count) {
  if (count == 1) {
    p[0] = static_cast<uint8_t>(u);
  } else if (count == 2) {
    p[0] = static_cast<uint8_t>(0xC0 | u >> 6);
    p[1] = static_cast<uint8_t>(0x80 | (u & 0x3F));
  } else {
    p[0] = static_cast<uint8_t>(0xE0 | u >> 12);
    p[1] = static_cast<uint8_t>(0x80 | (u >> 6 & 0x3F));
    p[2] = static_cast<uint8_t>(0x80 | (u & 0x3F));
  }
}

/// Walks the rows for the character at `p`.
inline uint16_t row_unicode(const Codepage& cp, const uint8_t* p) {
  if (cp.rows == nullptr) return kNoUnicode;
  size_t node = 0;
  while (cp.leaf[node] == 0) {
    node = cp.rows[node << 8 | *p++];
    if (node == 0) return kNoUnicode;
  }
  return cp.rows[node << 8 | *p];
}

/// The Unicode value of a character of two or more bytes.
inline uint16_t multibyte_unicode(const Codepage& cp, const uint8_t* p) {
  return cp.utf8 ? utf8_unicode(p) : row_unicode(cp, p);
}

/// The bytes to store for a Unicode value, packed; not for UTF-8.
inline uint32_t row_code(const Codepage& cp, uint16_t u) {
  const uint32_t index = cp.page_start[u >> 8] + (u & 0xFFu);
  return cp.codes32 != nullptr ? cp.codes32[index] : cp.codes16[index];
}

/// The packed code of a Unicode value, or the substitution byte.
uint32_t unicode_to_code(const Codepage& cp, uint16_t u);

/// The Unicode value of a packed code of any length.
uint16_t code_to_unicode(const Codepage& cp, uint32_t code);

/// Stores the character of a Unicode value, or the substitution byte: the bytes written.
inline size_t store_unicode(const Codepage& cp, uint16_t u, uint8_t* p) {
  const uint32_t code = cp.utf8 ? 0 : row_code(cp, u);
  const size_t count = cp.utf8 ? utf8_bytes(u) : code_bytes(code);
  if (cp.utf8)
    store_utf8(p, u, count);
  else
    store_code(p, code, count);
  return count;
}

/// The type record of the character at `p`. Null in a single-byte codepage. There is no range check: the trie
/// covers every byte sequence.
const uint8_t* type_record(const Codepage& cp, const uint8_t* p);
const uint8_t* type_record_of_code(const Codepage& cp, uint32_t code);

/// A packed code in the other case, when its type record, if it has one, has a bit of the mask; else the code.
uint32_t other_case(const uint8_t* record, uint32_t code, uint32_t mask);

/// A language's special mappings of one direction.
struct Specials {
  const uint8_t* entries;
  size_t count;

  format::language::SpecialMapping entry(size_t i) const {
    return format::language::SpecialMapping::read(entries + i * format::language::SpecialMapping::kBytes);
  }
  /// Looks for one character (`second` 0) or a pair: the number of results stored, 0 for no mapping.
  int32_t find(uint16_t first, uint16_t second, uint16_t* result1, uint16_t* result2) const;
};
Specials specials_of(const LXObject& language, bool upper);

/// Where a caller may leave out the place.
inline void put_state(LXShiftState* to, LXShiftState state) {
  if (to != nullptr) *to = state;
}

/// The shift byte that leads to a state.
inline uint8_t shift_byte(const Codepage& cp, LXShiftState state) {
  return state == LX_SHIFT_DOUBLE ? cp.shift_out : cp.shift_in;
}

/// Consumes a shift byte at `*p`, if there is one: true, and the state is set.
inline bool take_shift(const Codepage& cp, const uint8_t** p, LXShiftState* state) {
  if (!cp.is_shift(**p)) return false;
  *state = **p == cp.shift_out ? LX_SHIFT_DOUBLE : LX_SHIFT_SINGLE;
  ++*p;
  return true;
}

}  // namespace lx
