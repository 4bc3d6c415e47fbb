// Mapping's faster ways: which characters may begin a special mapping, runs of characters of one unit whose
// case one table tells, and characters of several bytes that have no case.
#pragma once

#include "codepage/lxmaptext.h"
#include "codepage/lxunicode.h"

namespace lx {

inline constexpr size_t kLongText = 2 * kBlock;  // units from which on preparing a faster way pays
inline constexpr size_t kUtf8Block = 8 * sizeof(size_t);
inline constexpr size_t kLongUtf8 = kUtf8Block + 2;  // of characters that begin in a block, at most

/// The special mappings that a call uses, and which characters may begin one: below U+0100 exactly, above by
/// their low byte.
class SpecialFilter {
 public:
  SpecialFilter(const LXObject& language, bool used, bool upper)
      : specials_(used ? specials_of(language, upper) : Specials{nullptr, 0}) {
    uint16_t last = 0;
    for (size_t i = 0; i < specials_.count; ++i) {
      const uint16_t first = specials_.entry(i).first;
      if (i != 0 && first == last) continue;  // those of one character stand together
      last = first;
      const unsigned slot = slot_of(first);
      bits_[slot / 32] |= 1u << slot % 32;
      any_three_ |= first > 0x7FF;
      if (first < 0x80 || first > 0x7FF || first == pair_) continue;
      one_pair_ = pair_ == 0;
      pair_ = first;
    }
  }
  bool any() const { return specials_.count != 0; }
  bool any_ascii() const { return (bits_[0] | bits_[1] | bits_[2] | bits_[3]) != 0; }
  bool may_begin(uint16_t u) const {
    const unsigned slot = slot_of(u);
    return (bits_[slot / 32] >> slot % 32 & 1) != 0;
  }
  const Specials& specials() const { return specials_; }
  /// The one that begins some of those that are two bytes in UTF-8, 0 for none; only where there is just one.
  uint16_t pair() const { return pair_; }
  bool one_pair() const { return one_pair_; }
  bool any_three() const { return any_three_; }

 private:
  static unsigned slot_of(uint16_t u) { return (u & 0xFFu) | (u > 0xFF ? 0x100u : 0); }
  Specials specials_;
  uint32_t bits_[16] = {};
  uint16_t pair_ = 0;
  bool one_pair_ = true;
  bool any_three_ = false;
};

// Runs of characters of one unit whose case one table tells.

struct AsciiTable {
  uint8_t to[kAscii];
  constexpr explicit AsciiTable(bool upper) : to() {
    for (unsigned c = 0; c < kAscii; ++c) to[c] = static_cast<uint8_t>(c ^ (is_other(c, upper) ? 0x20 : 0));
  }
  static constexpr bool is_other(unsigned c, bool upper) { return upper ? c - 'a' < 26 : c - 'A' < 26; }
};
inline constexpr AsciiTable kAsciiCase[2] = {AsciiTable(false), AsciiTable(true)};

/// What a table tells of characters of one unit.
struct Runs {
  const uint8_t* table;
  unsigned below;  // units under this are characters, and the table has their case
  bool blocks;     // ... under 0x80 the case of ASCII, and none of these is special
  bool upper;
  size_t utf8_from;  // so many units of UTF-8 are mapped by map_utf8()
};

inline Runs runs_of(const UnicodeText&, const SpecialFilter& filter, bool upper) {
  return {kAsciiCase[upper].to, kAscii, !filter.any_ascii(), upper, SIZE_MAX};
}
inline Runs runs_of(const LeadByteText& text, const SpecialFilter& filter, bool upper) {
  const uint8_t* table = text.in.cp.payload + (upper ? format::codepage::kUpper : format::codepage::kLower);
  if (text.in.cp.single_byte) return {table, 0x100, false, upper, SIZE_MAX};
  if (text.in.cp.same_below < kAscii) return {table, 0, false, upper, SIZE_MAX};
  const bool blocks = text.in.cp.plain_case && !filter.any_ascii() && most_units(text) >= kLongText;
  const bool utf8 = text.in.cp.plain_utf8 && text.in.cp.pair_case[upper].bytes != nullptr && filter.one_pair();
  return {table, kAscii, blocks, upper,
          blocks && utf8 ? vectors->map_utf8 != nullptr ? kBlock : kLongUtf8 : SIZE_MAX};
}

inline uint16_t unicode_of(const UnicodeText&, uint16_t u) {
  return u;
}
inline uint16_t unicode_of(const LeadByteText& text, uint8_t byte) {
  return text.in.cp.unicode[byte];
}

/// Inline, so that the text stays in registers.
template <class Text>
[[gnu::always_inline]] inline void map_run(Text& text, const Runs& runs, const SpecialFilter& filter) {
  const auto* const from = text.in.p;
  auto* const to = text.out.p;
  const size_t n = most_units(text);
  size_t i = 0;
  if (runs.blocks)
    for (; n - i >= kBlock && is_same_block(from + i, kAscii); i += kBlock)
      case_block(to + i, from + i, runs.upper);
  if (filter.any()) {
    for (; i < n && from[i] < runs.below && !filter.may_begin(unicode_of(text, from[i])); ++i)
      to[i] = runs.table[from[i]];
  } else {
    for (; i < n && from[i] < runs.below; ++i) to[i] = runs.table[from[i]];
  }
  text.in.p += i;
  text.out.p += i;
}

/// A character of several bytes of UTF-8 in its other case, in the same place; false where that has another length.
/// `pairs` are the codepage's.
[[gnu::always_inline]] inline bool map_long_utf8(const Codepage& cp, const PairCase& pairs, const uint8_t* p,
                                                 uint32_t mask, uint8_t* to) {
  if (const unsigned row = pairs.row[*p]) return pairs.map(row, p, to);
  if (cp.caseless[*p] != 0) return true;
  const auto type = format::codepage::TypeRecord::read(type_record(cp, p));
  if ((type.type & mask) == 0) return true;
  const size_t length = cp.length(*p);
  const uint32_t code = pack(p, length) + type.case_delta;
  store_code(to, code, length);
  return code_bytes(code) == length && without_zero_bytes(code) == code;
}

/// What Vectors::map_utf8 does, with all characters of several bytes left.
inline size_t map_utf8_block(const uint8_t* p, size_t count, bool upper, uint8_t* to, MappedBlock* block) {
  size_t begins, bytes;
  if (count < kLongUtf8 || !find_long_utf8<kUtf8Block>(p, &begins, &bytes)) return 0;
  memcpy(block->given, p, kLongUtf8);
  memcpy(block->before, to, kLongUtf8);
  for (size_t i = 0; i < kUtf8Block; i += kBlock) case_block(to + i, block->given + i, upper);
  for (size_t i = kUtf8Block; i < bytes; ++i) to[i] = block->given[i];
  block->left = begins;
  return bytes;
}

/// Maps characters of UTF-8 by blocks, and in their places those that these leave. Ends before one that map_long_utf8()
/// leaves too.
inline void map_utf8(LeadByteText& text, const Runs& runs, const SpecialFilter& filter) {
  const Codepage& cp = text.in.cp;
  const PairCase pairs = cp.pair_case[runs.upper];
  const Utf8Case how{pairs.bytes, pairs.row, cp.caseless, filter.pair(), filter.any_three(), runs.upper};
  const auto map_block = vectors->map_utf8;
  const uint32_t mask = runs.upper ? LX_C1_LOWER : LX_C1_UPPER;
  const bool special = filter.any();
  const uint8_t* p = text.in.p;
  uint8_t* to = text.out.p;
  const uint8_t* const end = p + most_units(text);
  MappedBlock block;
  for (block.left = 0; block.left == 0;) {
    size_t bytes = map_block != nullptr ? map_block(how, p, room(p, end), to, &block)
                                        : map_utf8_block(p, room(p, end), runs.upper, to, &block);
    if (bytes == 0) break;
    for (; block.left != 0; block.left &= block.left - 1) {
      const auto at = static_cast<size_t>(__builtin_ctzll(block.left));
      const bool maybe = special && filter.may_begin(utf8_unicode(block.given + at));
      if (!maybe && map_long_utf8(cp, pairs, block.given + at, mask, to + at)) continue;
      memcpy(to + at, block.before + at, bytes - at);  // nothing is written behind the last character
      bytes = at;
      break;
    }
    p += bytes;
    to += bytes;
  }
  text.in.p = p;
  text.out.p = to;
}

/// Behind how many characters of one unit the next ones are left to map_run().
inline constexpr size_t kFewUnits = kBlock;

/// What map_run() leaves: copies whole characters of several bytes that have no case, and maps those of two bytes
/// that have one and keep their length, with the few bytes below runs.below that stand between; false for none.
inline bool map_rest(LeadByteText& text, const Runs& runs, const SpecialFilter& filter) {
  const bool special = filter.any();
  if (special && !text.in.cp.plain_utf8) return false;
  const Codepage& cp = text.in.cp;
  const uint8_t* const p = text.in.p;
  uint8_t* const to = text.out.p;
  const uint8_t* const lengths = cp.caseless;
  const PairCase pairs = cp.pair_case[runs.upper];
  const size_t n = most_units(text);
  size_t i = 0;
  for (size_t start = n; i != start && i < n;) {
    start = i;
    while (!special && i < n) {
      const size_t length = lengths[p[i]];
      if (length == 0 || length > n - i) break;
      i += length;
      // Mostly the next ones are as long: then no look-up waits for the one before it.
      while (n - i >= 4 * length && lengths[p[i]] == length && lengths[p[i + length]] == length &&
             lengths[p[i + 2 * length]] == length && lengths[p[i + 3 * length]] == length)
        i += 4 * length;
    }
    if (i != start) memmove(to + start, p + start, i - start);
    for (; n - i >= 2; i += 2) {
      const unsigned row = pairs.row[p[i]];
      if (row == 0 || (special && filter.may_begin(utf8_unicode(p + i)))) break;
      uint8_t mapped[2];
      if (!pairs.map(row, p + i, mapped)) break;
      memcpy(to + i, mapped, sizeof(mapped));
    }
    if (i == start) break;
    const size_t few = i + least(n - i, kFewUnits);
    for (; i < few && p[i] < runs.below && !(special && filter.may_begin(p[i])); ++i) to[i] = runs.table[p[i]];
    if (i == few) break;
  }
  text.in.p += i;
  text.out.p += i;
  return i != 0;
}

/// ... and maps the characters of Unicode text.
inline bool map_rest(UnicodeText& text, const Runs& runs, const SpecialFilter& filter) {
  if (filter.any()) return false;
  const CaseTable& table = kCaseTables[runs.upper];
  const LXUChar* const p = text.in.p;
  LXUChar* const to = text.out.p;
  const size_t n = most_units(text);
  size_t i = 0;
  while (i < n && (p[i] >= runs.below || n - i < kFewUnits || !is_same_block(p + i, runs.below))) {
    const size_t few = i + least(n - i, kFewUnits);
    for (; i < few; ++i) to[i] = table.other(p[i]);
  }
  text.in.p += i;
  text.out.p += i;
  return i != 0;
}

}  // namespace lx
