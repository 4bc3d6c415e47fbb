// Mapping's faster ways: which characters may begin a special mapping, runs of characters of one unit whose
// case one table tells, and characters of several bytes that have no case.
#pragma once

#include "codepage/lxmaptext.h"
#include "codepage/lxunicode.h"

namespace lx {

inline constexpr size_t kLongText = 2 * kBlock;  // units from which on preparing a faster way pays

/// The special mappings that a call uses, and which characters may begin one: below U+0100 exactly, above by
/// their low byte.
class SpecialFilter {
 public:
  SpecialFilter(const LXObject& language, bool used, bool upper)
      : specials_(used ? specials_of(language, upper) : Specials{nullptr, 0}) {
    for (size_t i = 0; i < specials_.count; ++i) {
      const unsigned slot = slot_of(specials_.entry(i).first);
      bits_[slot / 32] |= 1u << slot % 32;
    }
  }
  bool any() const { return specials_.count != 0; }
  bool any_ascii() const { return (bits_[0] | bits_[1] | bits_[2] | bits_[3]) != 0; }
  bool may_begin(uint16_t u) const {
    const unsigned slot = slot_of(u);
    return (bits_[slot / 32] >> slot % 32 & 1) != 0;
  }
  const Specials& specials() const { return specials_; }

 private:
  static unsigned slot_of(uint16_t u) { return (u & 0xFFu) | (u > 0xFF ? 0x100u : 0); }
  Specials specials_;
  uint32_t bits_[16] = {};
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
};

inline Runs runs_of(const UnicodeText&, const SpecialFilter& filter, bool upper) {
  return {kAsciiCase[upper].to, kAscii, !filter.any_ascii(), upper};
}
inline Runs runs_of(const LeadByteText& text, const SpecialFilter& filter, bool upper) {
  const uint8_t* table = text.in.cp.payload + (upper ? format::codepage::kUpper : format::codepage::kLower);
  if (text.in.cp.single_byte) return {table, 0x100, false, upper};
  if (text.in.cp.same_below < kAscii) return {table, 0, false, upper};
  const bool blocks =
      !filter.any_ascii() && most_units(text) >= kLongText && memcmp(table, kAsciiCase[upper].to, kAscii) == 0;
  return {table, kAscii, blocks, upper};
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

/// Behind how many characters of one unit the next ones are left to map_run().
inline constexpr size_t kFewUnits = kBlock;

/// What map_run() leaves: copies whole characters of several bytes that have no case, and maps those of two bytes
/// that have one and keep their length, with the few bytes below `below` that stand between; false for none.
template <class Mapper>
bool map_rest(LeadByteText& text, const Mapper& mapper, unsigned below) {
  const Codepage& cp = text.in.cp;
  const uint8_t* const p = text.in.p;
  uint8_t* const to = text.out.p;
  const uint8_t* const lengths = cp.caseless;
  const PairCase pairs = cp.pair_case;
  const size_t n = most_units(text);
  size_t i = 0;
  for (size_t start = n; i != start && i < n;) {
    start = i;
    while (i < n) {
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
      if (row == 0) break;
      const auto type = format::codepage::TypeRecord::read(pairs.record(row, p[i + 1]));
      const uint32_t code = pack(p + i, 2) + ((type.type & mapper.mask) != 0 ? type.case_delta : 0);
      if (code_bytes(code) != 2) break;
      to[i] = static_cast<uint8_t>(code >> 8);
      to[i + 1] = static_cast<uint8_t>(code);
    }
    if (i == start) break;
    const size_t few = i + least(n - i, kFewUnits);
    for (; i < few && p[i] < below; ++i) to[i] = mapper.table[p[i]];
    if (i == few) break;
  }
  text.in.p += i;
  text.out.p += i;
  return i != 0;
}

/// ... and maps the characters of Unicode text.
template <class Mapper>
bool map_rest(UnicodeText& text, const Mapper& mapper, unsigned below) {
  const CaseTable& table = kCaseTables[mapper.mode.upper];
  const LXUChar* const p = text.in.p;
  LXUChar* const to = text.out.p;
  const size_t n = most_units(text);
  size_t i = 0;
  while (i < n && (p[i] >= below || n - i < kFewUnits || !is_same_block(p + i, below))) {
    const size_t few = i + least(n - i, kFewUnits);
    for (; i < few; ++i) to[i] = table.other(p[i]);
  }
  text.in.p += i;
  text.out.p += i;
  return i != 0;
}

}  // namespace lx
