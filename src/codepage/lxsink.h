// Text as it is written: a sink for each kind.
//
// p, end: the place, and where the output ends.
// put(): writes a character, of a Unicode value or a packed code, and the shift byte that is due; false, with
//   nothing written, when they do not fit. put_bytes() writes one as its bytes.
// kOneUnit: every character is one unit, encode() of it. kUnicode: the units are Unicode values.
// kShifts: the text has shift states; `state` is that of what was written last.
// kCloses: close() ends the text in the single-byte state: room for the Shift-In is kept behind every
//   double-byte character.
// kRuns: put_run() writes characters that are known to fit, each of at most most_units(), and nothing behind
//   the last one.
#pragma once

#include "codepage/lxcursor.h"

namespace lx {

/// Text of which every unit is a character of the codepage: single bytes, or packed codes.
template <class UnitOf>
struct UnitSink {
  using Unit = UnitOf;
  static constexpr bool kOneUnit = true, kShifts = false, kCloses = false, kUnicode = false;
  static constexpr bool kRuns = sizeof(Unit) == 1;
  const Codepage& cp;
  Unit* p;
  Unit* end;

  static UnitSink over(const Codepage& cp, Unit* p, Unit* end, LXShiftState) { return {cp, p, end}; }
  unsigned same_below() const { return cp.same_below; }
  Unit encode(LXUChar u) const {
    if constexpr (sizeof(Unit) == 1) return static_cast<Unit>(cp.codes16[cp.page_start[u >> 8] + (u & 0xFFu)]);
    return static_cast<Unit>(unicode_to_code(cp, u));
  }
  Unit encode(LXWChar code) const { return static_cast<Unit>(code); }
  size_t most_units() const { return 1; }
  void put_run(const LXUChar* values, size_t count);
  template <class V>
  bool put(V value) {
    if (p == end) return false;
    *p++ = encode(value);
    return true;
  }
};
using SingleByteSink = UnitSink<uint8_t>;
using CodeSink = UnitSink<LXWChar>;
template <>
void SingleByteSink::put_run(const LXUChar* values, size_t count);

/// Multibyte text without shift bytes; where UTF-8 is computed, by its formula.
template <bool kUtf8>
struct LeadByteSink {
  using Unit = uint8_t;
  static constexpr bool kOneUnit = false, kShifts = false, kCloses = false, kUnicode = false, kRuns = true;
  const Codepage& cp;
  uint8_t* p;
  uint8_t* end;

  static LeadByteSink over(const Codepage& cp, Unit* p, Unit* end, LXShiftState) { return {cp, p, end}; }
  unsigned same_below() const { return cp.same_below; }
  size_t most_units() const { return kUtf8 ? 3 : cp.width; }
  void put_run(const LXUChar* values, size_t count);
  bool put(LXUChar u) {
    if constexpr (!kUtf8) return store(row_code(cp, u));
    const size_t count = utf8_bytes(u);
    if (count > room(p, end)) return false;
    store_utf8(p, u, count);
    p += count;
    return true;
  }
  bool put(LXWChar code) { return store(without_zero_bytes(code)); }
  bool put_bytes(const uint8_t* bytes, size_t count) {
    if (count > room(p, end)) return false;
    *p++ = *bytes;
    for (size_t i = 1; i < count; ++i) *p++ = bytes[i];
    return true;
  }

 private:
  bool store(uint32_t code) {
    const size_t count = code_bytes(code);
    if (count > room(p, end)) return false;
    store_code(p, code, count);
    p += count;
    return true;
  }
};
using Utf8Sink = LeadByteSink<true>;
using MultiByteSink = LeadByteSink<false>;
template <>
inline void Utf8Sink::put_run(const LXUChar* values, size_t count) {
  p = vectors->write_utf8(p, values, count);
}
template <>
void MultiByteSink::put_run(const LXUChar* values, size_t count);

/// Shift-stateful text; where it closes, room for the Shift-In is kept.
template <bool kClosed>
struct ShiftSinkOf {
  using Unit = uint8_t;
  static constexpr bool kOneUnit = false, kShifts = true, kCloses = kClosed, kUnicode = false, kRuns = !kClosed;
  const Codepage& cp;
  uint8_t* p;
  uint8_t* end;
  LXShiftState state;

  static ShiftSinkOf over(const Codepage& cp, Unit* p, Unit* end, LXShiftState state) {
    return {cp, p, end, state};
  }
  unsigned same_below() const { return 0; }
  size_t most_units() const { return 1 + cp.width; }
  void put_run(const LXUChar* values, size_t count);
  bool put(LXUChar u) { return store(row_code(cp, u)); }
  bool put(LXWChar code) { return store(without_zero_bytes(code)); }
  /// A character as its bytes.
  bool put_bytes(const uint8_t* bytes, size_t count) {
    uint8_t* const to = make_room(count);
    if (to == nullptr) return false;
    for (size_t i = 0; i < count; ++i) to[i] = bytes[i];
    return true;
  }

  /// The shift byte that is due before a character of `count` bytes, and the state that it leads to.
  bool shift_due(size_t count) const { return (count == 1) != (state == LX_SHIFT_SINGLE); }
  uint8_t take_shift_byte() {
    state = state == LX_SHIFT_SINGLE ? LX_SHIFT_DOUBLE : LX_SHIFT_SINGLE;
    return shift_byte(cp, state);
  }

  /// Ends the text in the single-byte state, where there is room.
  void close() {
    if (state != LX_SHIFT_SINGLE && p != end) *p++ = take_shift_byte();
  }
  /// Takes back the double-byte character that was written last.
  void take_back() { p -= cp.width; }

 private:
  /// Writes the shift byte that is due, and takes the room of the character: where it stands, null without
  /// room.
  uint8_t* make_room(size_t count) {
    const bool shift = shift_due(count);
    const size_t closing = kClosed && count != 1 ? 1 : 0;
    if (count + shift + closing > room(p, end)) return nullptr;
    if (shift) *p++ = take_shift_byte();
    p += count;
    return p - count;
  }
  bool store(uint32_t code) {
    const size_t count = code_bytes(code);
    uint8_t* const to = make_room(count);
    if (to == nullptr) return false;
    store_code(to, code, count);
    return true;
  }
};
using ShiftSink = ShiftSinkOf<false>;
using ClosedShiftSink = ShiftSinkOf<true>;
template <>
void ShiftSink::put_run(const LXUChar* values, size_t count);

struct UnicodeSink {
  using Unit = LXUChar;
  static constexpr bool kOneUnit = true, kShifts = false, kCloses = false, kUnicode = true, kRuns = true;
  LXUChar* p;
  LXUChar* end;

  static UnicodeSink over(const Codepage&, Unit* p, Unit* end, LXShiftState) { return {p, end}; }
  unsigned same_below() const { return kAnySame; }
  Unit encode(LXUChar u) const { return u; }
  bool put(LXUChar u) {
    if (p == end) return false;
    *p++ = u;
    return true;
  }
};

/// Ends a text in the state that it must end in.
template <class Sink>
void close_text(Sink& out) {
  if constexpr (Sink::kCloses) out.close();
}

/// The units that can be written before the output is full: a Shift-In that is due has its own.
template <class Sink>
size_t units_left(const Sink& out) {
  const size_t left = room(out.p, out.end);
  if constexpr (Sink::kCloses) return left - (out.state == LX_SHIFT_DOUBLE && left != 0 ? 1 : 0);
  return left;
}

}  // namespace lx
