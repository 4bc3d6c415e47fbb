// Comparison of byte texts whose characters have lengths, without regard to case or width. Written apart from
// the readers, though on their places: shift bytes count here, and so does the length of a character that the
// end cuts.
#pragma once

#include <cstring>

#include "core/lxtrace.h"
#include "text/lxfold.h"

namespace lx {

template <class Unit>
void dump_texts(RAS1_Unit& unit, const CountedText<Unit>& a, const CountedText<Unit>& b) {
  if ((trace_level(unit) & RAS1_LEVEL_DETAIL) == 0) return;
  RAS1_Dump(&unit, __LINE__, a.p, a.units * sizeof(Unit), "String1");
  RAS1_Dump(&unit, __LINE__, b.p, b.units * sizeof(Unit), "String2");
}

/// Shift bytes are passed apart from characters.
template <class Cursor>
bool pass_shift(Cursor* in) {
  if constexpr (Cursor::kShifts) return in->pass_shift();
  return false;
}
template <class Cursor>
size_t left(const Cursor& in) {
  return room(in.p, in.end);
}
template <class Cursor>
int32_t left_difference(const Cursor& a, const Cursor& b) {
  return difference(a.end - a.p, b.end - b.p);
}

/// Two characters of the same length, which are there as a whole.
inline bool same_bytes(const uint8_t* a, const uint8_t* b, size_t length) {
  size_t i = 0;
  while (i < length && a[i] == b[i]) ++i;
  return i == length;
}

/// A folded character, zeros behind it.
struct Char {
  uint8_t bytes[kMaxCharBytes];
  size_t length;
};

/// Where two characters differ first; kMaxCharBytes: nowhere.
inline size_t first_difference(const Char& x, const Char& y) {
  size_t i = 0;
  while (i < kMaxCharBytes && x.bytes[i] == y.bytes[i]) ++i;
  return i;
}

/// As many bytes as a packed code has.
inline Char unpacked(uint32_t code) {
  const uint32_t stored = without_zero_bytes(code);
  Char c{{}, code_bytes(stored)};
  store_code(c.bytes, stored, c.length);
  return c;
}

/// A character of several bytes in lower case.
inline Char small_letter(const Codepage& cp, const uint8_t* p, size_t length) {
  Char c{{}, length};
  memcpy(c.bytes, p, length);
  const uint32_t code = pack(p, length);
  const uint32_t other = other_case(type_record(cp, c.bytes), code, LX_C1_UPPER);
  return other != code && code_bytes(other) <= cp.width ? unpacked(other) : c;
}

/// Passes over what is the same in both, as long as room for any character is left behind it. Asked for now and
/// then: behind one difference there is often another.
inline void pass_equal(MultiByteCursor* a, MultiByteCursor* b) {
  const size_t most = least(left(*a), left(*b));
  if (most <= kMaxCharBytes) return;
  const size_t same = equal_units(a->p, most - kMaxCharBytes, b->p, most - kMaxCharBytes);
  const size_t whole = whole_units(a->cp, a->p, same);
  a->p += whole;
  b->p += whole;
}
inline void pass_equal(ShiftCursor*, ShiftCursor*) {}

/// The result for two characters whose folded forms differ in these bytes.
inline int32_t case_difference(const MultiByteCursor&, const MultiByteCursor&, uint8_t x, uint8_t y) {
  return x - y;
}
/// Callers rely on the order that this gives: bytes count as signed, and a text whose double-byte characters
/// end first is less. Both texts are in the same state here.
inline int32_t case_difference(const ShiftCursor& a, const ShiftCursor& b, uint8_t x, uint8_t y) {
  if (a.state == LX_SHIFT_DOUBLE && a.cp.is_shift(*a.p)) return -1;
  if (a.state == LX_SHIFT_DOUBLE && b.cp.is_shift(*b.p)) return 1;
  return static_cast<int8_t>(x) - static_cast<int8_t>(y);
}

/// Characters of different lengths, or cut ones, end the comparison: two cut ones of the same length are equal.
template <class Cursor>
int32_t compare_case(Cursor a, Cursor b) {
  const uint8_t* const fold = lower_table(a.cp);
  for (size_t chars = 0; a.p != a.end && b.p != b.end; ++chars) {
    if (chars % kBlock == 0) pass_equal(&a, &b);
    if (*a.p == *b.p && pass_shift(&a)) {
      pass_shift(&b);
      continue;
    }
    const size_t length = a.length();
    if (length != b.length() || length > left(a) || length > left(b))
      return difference(static_cast<int64_t>(length), static_cast<int64_t>(b.length()));
    if (length == 1) {
      if (fold[*a.p] != fold[*b.p]) return case_difference(a, b, fold[*a.p], fold[*b.p]);
    } else if (!same_bytes(a.p, b.p, length)) {
      const Char x = small_letter(a.cp, a.p, length);
      const Char y = small_letter(b.cp, b.p, length);
      const size_t at = first_difference(x, y);
      if (at != kMaxCharBytes) return case_difference(a, b, x.bytes[at], y.bytes[at]);
    }
    a.p += length;
    b.p += length;
  }
  return left_difference(a, b);
}

/// A character in its half-width form, or as it is: as much of it as is there.
inline Char half_width(const Codepage& cp, const uint8_t* p, size_t length, size_t there) {
  const uint32_t half = length > there ? 0 : WidthTables(cp).to_half(pack(p, length));
  if (half != 0) return unpacked(half);
  Char c{{}, length};
  memcpy(c.bytes, p, least(length, there));
  return c;
}

/// Compares the characters at both places, which differ: true when that decides, with the result.
inline bool width_differs(RAS1_Unit&, const MultiByteCursor& a, const MultiByteCursor& b, int32_t* result) {
  const Char x = half_width(a.cp, a.p, a.length(), left(a));
  const Char y = half_width(b.cp, b.p, b.length(), left(b));
  const size_t x_length = a.cp.length(x.bytes[0]);
  const size_t y_length = b.cp.length(y.bytes[0]);
  const size_t at = first_difference(x, y);
  // Callers rely on the order of these tests: a form that is longer than what is left ends the comparison.
  if (x_length != y_length || x_length > least(left(a), left(b)))
    *result = difference(static_cast<int64_t>(x_length), static_cast<int64_t>(y_length));
  else if (at != kMaxCharBytes)
    *result = x.bytes[at] - y.bytes[at];
  else
    return false;
  return true;
}
inline bool width_differs(RAS1_Unit& unit, const ShiftCursor& a, const ShiftCursor& b, int32_t* result) {
  const size_t a_length = a.length();
  const size_t b_length = b.length();
  // A cut character is not entered: what is left decides.
  if (a_length > left(a) || b_length > left(b)) {
    *result = left_difference(a, b);
    return true;
  }
  const auto folded = [&](const ShiftCursor& in, size_t length) {
    return in.state == LX_SHIFT_DOUBLE ? half_width(in.cp, in.p, length, length) : Char{{*in.p}, 1};
  };
  const Char x = folded(a, a_length);
  const Char y = folded(b, b_length);
  const size_t at = first_difference(x, y);
  if (x.length == y.length && at == kMaxCharBytes) return false;
  LX_TRACE(unit, RAS1_LEVEL_DETAIL, "Strings are unequal: len1 = %d, len2 = %d", static_cast<int>(x.length),
           static_cast<int>(y.length));
  if (x.length != y.length) {
    *result = difference(static_cast<int64_t>(x.length), static_cast<int64_t>(y.length));
  } else {
    dump_texts(unit, CountedText<uint8_t>{x.bytes, x.length}, CountedText<uint8_t>{y.bytes, y.length});
    *result = x.bytes[at] - y.bytes[at];
  }
  return true;
}

/// In the end what is left of the texts is compared, without shift bytes that stand there.
template <class Cursor>
int32_t compare_width(RAS1_Unit& unit, Cursor a, Cursor b) {
  for (size_t chars = 0;; ++chars) {
    if (chars % kBlock == 0) pass_equal(&a, &b);
    while (pass_shift(&a)) continue;
    while (pass_shift(&b)) continue;
    if (a.p == a.end || b.p == b.end) return left_difference(a, b);
    // Where there is room for every form, equal characters need not be mapped.
    const size_t length = a.length();
    const bool same =
        least(left(a), left(b)) >= a.cp.width && length == b.length() && same_bytes(a.p, b.p, length);
    int32_t result = 0;
    if (!same && width_differs(unit, a, b, &result)) return result;
    a.p += length;
    b.p += b.length();
  }
}

}  // namespace lx
