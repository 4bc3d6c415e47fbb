// Text as it is read: a cursor for each kind. Bytes come in four kinds: single-byte, UTF-8, multibyte (by
// lead-byte lengths) and shift-stateful; beside them stand packed codes and 16-bit Unicode. With the sinks
// these are the only places that know lead bytes, shift bytes and units; an algorithm is a template over them.
//
// p, end: the place, and where the text ends.
// pass(): passes a character; `units` are those it takes, without a shift byte. False at the end of the text,
//   with p == end, and before a character that the end cuts, with p < end.
// next(): passes a character and gives its Unicode value or its packed code.
// Value: what tells a character where text is compared: its packed code, or its 16-bit unit.
// kOneUnit: every unit is a character. kUnicode: the units are Unicode values.
// kShifts: the text has shift states; `state` is that of the character passed last.
// kRuns: read_run() gives the Unicode values of many characters at once, the ones that next() would give; by its
//   rule it stops before a block of characters below a bound, because those are copied. Where it gives none,
//   next() decides what stands there.
//
// A cursor is small: to look ahead, copy it, and go_on_at() the copy to take what it found.
#pragma once

#include "codepage/lxblock.h"
#include "codepage/lxcodepage.h"
#include "codepage/lxlength.h"
#include "codepage/lxvector.h"

namespace lx {

inline constexpr unsigned kAnySame = 0x10000;  // same_below() of 16-bit Unicode

/// Text of which every unit is a character of the codepage: single bytes, or packed codes.
template <class UnitOf>
struct UnitCursor {
  using Unit = UnitOf;
  using Value = LXWChar;
  static constexpr bool kOneUnit = true, kShifts = false, kUnicode = false, kRuns = sizeof(Unit) == 1;
  const Codepage& cp;
  const Unit* p;
  const Unit* end;

  static UnitCursor over(const Codepage& cp, const Unit* p, const Unit* end, LXShiftState) {
    return {cp, p, end};
  }
  unsigned same_below() const { return cp.same_below; }
  void decode(uint8_t byte, LXUChar* u) const { *u = cp.unicode[byte]; }
  void decode(LXWChar code, LXUChar* u) const { *u = code_to_unicode(cp, code); }
  void decode(Unit unit, LXWChar* code) const { *code = unit; }
  size_t read_run(LXUChar* values, size_t most, RunRule rule);
  bool pass() {
    if (p == end) return false;
    ++p;
    return true;
  }
  template <class V>
  bool next(V* value) {
    if (p == end) return false;
    decode(*p++, value);
    return true;
  }
};
using SingleByteCursor = UnitCursor<uint8_t>;
using CodeCursor = UnitCursor<LXWChar>;
template <>
size_t SingleByteCursor::read_run(LXUChar* values, size_t most, RunRule rule);

/// Multibyte text by lead-byte lengths; where UTF-8 is computed, by its formula.
template <bool kUtf8>
struct LeadByteCursor {
  using Unit = uint8_t;
  using Value = LXWChar;
  static constexpr bool kOneUnit = false, kShifts = false, kUnicode = false, kRuns = true;
  const Codepage& cp;
  const uint8_t* p;
  const uint8_t* end;

  static LeadByteCursor over(const Codepage& cp, const Unit* p, const Unit* end, LXShiftState) {
    return {cp, p, end};
  }
  unsigned same_below() const { return cp.same_below; }
  void decode(const uint8_t* c, size_t length, LXUChar* u) const {
    *u = length == 1 ? cp.unicode[*c] : kUtf8 ? utf8_unicode(c) : row_unicode(cp, c);
  }
  void decode(const uint8_t* c, size_t length, LXWChar* code) const { *code = pack(c, length); }
  size_t read_run(LXUChar* values, size_t most, RunRule rule);
  /// Of the character here, wherever the text ends. Computed where that is sooner done than looked up.
  size_t length() const {
    if constexpr (kUtf8)
      if (cp.plain_utf8) return 1u + (*p - 0xC2u < 0xF0 - 0xC2) + (*p - 0xE0u < 0xF0 - 0xE0);
    return cp.length(*p);
  }
  bool pass() {
    size_t units;
    return pass(&units);
  }
  bool pass(size_t* units) {
    if (p == end) return false;
    *units = length();
    if (*units > room(p, end)) return false;
    p += *units;
    return true;
  }
  template <class V>
  [[gnu::always_inline]] bool next(V* value) {
    if (p == end) return false;
    if (*p < cp.same_below) {  // apart: the next character does not wait for the length of this one
      *value = *p++;
      return true;
    }
    size_t length;
    if (!pass(&length)) return false;
    decode(p - length, length, value);
    return true;
  }
};
using Utf8Cursor = LeadByteCursor<true>;
using MultiByteCursor = LeadByteCursor<false>;
/// Reads what no vector does.
ReadRun read_odd_utf8(const Codepage& cp, const uint8_t* p, const uint8_t* end, LXUChar* values, size_t most);
template <>
inline size_t Utf8Cursor::read_run(LXUChar* values, size_t most, RunRule rule) {
  ReadRun run{p, 0};
  if (cp.plain_utf8) run = vectors->read_utf8(p, end, values, most, rule);
  if (run.count == 0) run = read_odd_utf8(cp, p, end, values, most);
  p = run.p;
  return run.count;
}
template <>
size_t MultiByteCursor::read_run(LXUChar* values, size_t most, RunRule rule);

/// One shift byte before a character is eaten, also when the end cuts the character; a second one in a row is a
/// character. A shift byte at the very end ends the text.
struct ShiftCursor {
  using Unit = uint8_t;
  using Value = LXWChar;
  static constexpr bool kOneUnit = false, kShifts = true, kUnicode = false, kRuns = true;
  const Codepage& cp;
  const uint8_t* p;
  const uint8_t* end;
  LXShiftState state;

  static ShiftCursor over(const Codepage& cp, const Unit* p, const Unit* end, LXShiftState state) {
    return {cp, p, end, state};
  }
  unsigned same_below() const { return 0; }
  void decode(const uint8_t* c, LXUChar* u) const {
    *u = state == LX_SHIFT_DOUBLE ? row_unicode(cp, c) : cp.unicode[*c];
  }
  void decode(const uint8_t* c, LXWChar* code) const { *code = pack(c, cp.width_in(state)); }
  size_t read_run(LXUChar* values, size_t most, RunRule rule);
  /// Of the character here, wherever the text ends; a shift byte before it has been passed.
  size_t length() const { return cp.width_in(state); }
  /// Passes a shift byte, if one stands here.
  bool pass_shift() { return p != end && take_shift(cp, &p, &state); }
  /// The same where nothing follows it.
  bool pass_last_shift() { return room(p, end) == 1 && pass_shift(); }
  bool pass() {
    size_t units;
    return pass(&units);
  }
  bool pass(size_t* units) {
    if (p == end || (take_shift(cp, &p, &state) && p == end)) return false;
    *units = length();
    if (*units > room(p, end)) return false;
    p += *units;
    return true;
  }
  template <class V>
  bool next(V* value) {
    size_t length;
    if (!pass(&length)) return false;
    decode(p - length, value);
    return true;
  }
};

struct UnicodeCursor {
  using Unit = LXUChar;
  using Value = LXUChar;
  static constexpr bool kOneUnit = true, kShifts = false, kUnicode = true, kRuns = true;
  const LXUChar* p;
  const LXUChar* end;

  static UnicodeCursor over(const Codepage&, const Unit* p, const Unit* end, LXShiftState) { return {p, end}; }
  unsigned same_below() const { return kAnySame; }
  void decode(Unit unit, LXUChar* u) const { *u = unit; }
  bool pass() {
    if (p == end) return false;
    ++p;
    return true;
  }
  bool next(LXUChar* u) {
    if (p == end) return false;
    *u = *p++;
    return true;
  }
};

/// Takes over the place, and the shift state, from a copy that has gone on; of cursors and of sinks.
template <class Text>
inline void go_on_at(Text& text, const Text& place) {
  text.p = place.p;
  if constexpr (Text::kShifts) text.state = place.state;
}

/// A cursor like another one, over another text. Made of its parts: a copy of what was just stored in parts
/// would wait for the stores.
template <class Cursor>
inline Cursor like(const Cursor& first, const typename Cursor::Unit* p, size_t units, LXShiftState state) {
  return Cursor::over(first.cp, p, p + units, state);
}
inline UnicodeCursor like(const UnicodeCursor&, const LXUChar* p, size_t units, LXShiftState) {
  return {p, p + units};
}

/// Passes whole characters of multibyte text, at most `most`, as long as blocks of them can be passed.
PassedRun pass_blocks(const Codepage& cp, const uint8_t* p, const uint8_t* end, size_t most);

/// Passes the characters up to the next shift byte, at most `most`; of other text none.
template <class Cursor>
size_t pass_in_state(Cursor* in, size_t most) {
  size_t chars = 0;
  if constexpr (Cursor::kShifts) {
    const size_t width = in->length();
    const uint8_t* p = in->p;
    for (; chars < most && room(p, in->end) >= width && !in->cp.is_shift(*p); p += width) ++chars;
    in->p = p;
  }
  return chars;
}

/// Passes at most `most` characters: how many there were.
template <class Cursor>
size_t pass_chars(Cursor* in, size_t most) {
  size_t chars = 0;
  if constexpr (Cursor::kOneUnit) {
    chars = least(most, room(in->p, in->end));
    in->p += chars;
  } else if constexpr (Cursor::kShifts) {
    while (chars < most && in->pass()) chars += 1 + pass_in_state(in, most - chars - 1);
  } else {
    const Codepage& cp = in->cp;
    const uint8_t *p = in->p, *const end = in->end;
    // So many characters have at least the bytes of a block, also where no end is known.
    if (most >= kPassedBytes && room(p, end) >= vectors->least_passed) {
      const PassedRun run = pass_blocks(cp, p, end, most);
      p = run.p;
      chars = run.count;
    }
    for (; chars < most && p != end; ++chars) {
      const size_t length = cp.length(*p);
      if (length > room(p, end)) break;
      p += length;
    }
    in->p = p;
  }
  return chars;
}

/// Passes all characters that are left: how many they are.
template <class Cursor>
size_t pass_all(Cursor* in) {
  return pass_chars(in, SIZE_MAX);
}

/// The state at a place of a text; of a text without shift bytes the one that was given.
template <class Cursor>
LXShiftState state_at(const Cursor& at, LXShiftState given) {
  if constexpr (Cursor::kShifts) return at.state;
  return given;
}

}  // namespace lx
