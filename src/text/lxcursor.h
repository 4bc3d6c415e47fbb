// Texts as the string family is given them, and a reader with a memory: the character that it gave last, as it
// stands in its text.
#pragma once

#include "codepage/lxcopy.h"

namespace lx {

template <class Reader>
inline constexpr bool kShifts = std::is_same_v<Reader, ShiftReader>;

template <class Reader>
struct Cursor {
  using Unit = typename Reader::Unit;
  using Value = std::conditional_t<std::is_same_v<Reader, UnicodeReader>, LXUChar, LXWChar>;

  Reader in;
  const Unit* start;  // of the character, behind its shift byte
  Value value;

  explicit Cursor(const Reader& text) : in(text), start(text.p), value(0) {}

  bool next() {
    start = in.p;
    if (!in.next(&value)) return false;
    if constexpr (kShifts<Reader>) start = in.p - in.cp.width_in(in.state);
    return true;
  }
  size_t units() const { return static_cast<size_t>(in.p - start); }
  /// Codes of characters of different lengths may be equal where a byte is zero.
  bool same_as(const Cursor& other) const { return value == other.value && units() == other.units(); }
  bool holds_null() const {
    for (const Unit* p = start; p < in.p; ++p)
      if (*p == 0) return true;
    return false;
  }
};

/// A text as it is given: a length below 0 means null-terminated.
template <class Unit>
struct Text {
  const Unit* p;
  int32_t length;
  LXShiftState state = LX_SHIFT_SINGLE;
};
using ByteText = Text<uint8_t>;

/// Its units; at most those up to the end of memory, so that the end of a text never wraps.
template <class Unit>
size_t units_of(const Codepage& cp, const Text<Unit>& text, bool characters) {
  if (text.length < 0) return units_with_null(text.p) - 1;
  if constexpr (sizeof(Unit) == 1)
    if (characters) return bytes_of_chars(cp, text.p, text.state, text.length);
  return least(static_cast<size_t>(text.length), room<Unit>(text.p, no_end<const Unit>()));
}

/// Calls `body` with the reader of a text.
template <class Body>
inline auto read(const Codepage& cp, Form form, const ByteText& text, size_t bytes, Body&& body) {
  return read_bytes(cp, form, text.state, text.p, bytes, body);
}
template <class Body>
inline auto read(const Codepage& cp, Form, const Text<LXWChar>& text, size_t codes, Body&& body) {
  return body(CodeReader{cp, text.p, text.p + codes});
}
template <class Body>
inline auto read(const Codepage&, Form, const Text<LXUChar>& text, size_t units, Body&& body) {
  return body(UnicodeReader{text.p, text.p + units});
}

/// The state at a place of a text; of a text without shift bytes the one that was given.
template <class Reader>
LXShiftState state_at(const Reader& in, LXShiftState given) {
  if constexpr (kShifts<Reader>) return in.state;
  return given;
}

}  // namespace lx
