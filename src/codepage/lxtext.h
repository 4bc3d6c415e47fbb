// The forms of a function, the kind of text that a form has in a codepage, and texts as callers give them. One
// dispatch, with_kind(), tells an algorithm which cursor and which sink it works with.
#pragma once

#include <type_traits>

#include "codepage/lxsink.h"

namespace lx {

/// The four forms of a function. Plain text is walked by lead bytes in every codepage; Ex text by its shift
/// bytes where the codepage has them, else as plain text; W text is packed codes, U text 16-bit Unicode.
enum class Form { kPlain, kEx, kWide, kUnicode };

template <Form kForm>
using FormUnit = std::conditional_t<kForm == Form::kWide, LXWChar,
                                    std::conditional_t<kForm == Form::kUnicode, LXUChar, uint8_t>>;

/// A kind of text: its cursor, and the sink to it.
template <class CursorOf, class SinkOf>
struct Kind {
  using Cursor = CursorOf;
  using Sink = SinkOf;
  using Unit = typename Cursor::Unit;
  using Value = typename Cursor::Value;

  static Cursor cursor(const Codepage& cp, const Unit* p, size_t units, LXShiftState state = LX_SHIFT_SINGLE) {
    return Cursor::over(cp, p, p + units, state);
  }
  static Sink sink(const Codepage& cp, Unit* p, Unit* end, LXShiftState state = LX_SHIFT_SINGLE) {
    return Sink::over(cp, p, end, state);
  }
};
using WideKind = Kind<CodeCursor, CodeSink>;
using UnicodeKind = Kind<UnicodeCursor, UnicodeSink>;

/// Calls `body` with the kind that a text of these units has. Shift-stateful output goes to a `Shifting` sink.
template <class Unit, class Shifting = ShiftSink, class Body>
[[gnu::always_inline]] inline auto with_kind(const Codepage& cp, Form form, Body&& body) {
  if constexpr (std::is_same_v<Unit, LXUChar>) {
    return body(UnicodeKind{});
  } else if constexpr (std::is_same_v<Unit, LXWChar>) {
    return body(WideKind{});
  } else {
    if (form == Form::kEx && cp.shift_sensitive) return body(Kind<ShiftCursor, Shifting>{});
    if (cp.single_byte) return body(Kind<SingleByteCursor, SingleByteSink>{});
    if (cp.utf8) return body(Kind<Utf8Cursor, Utf8Sink>{});
    return body(Kind<MultiByteCursor, MultiByteSink>{});
  }
}

/// Calls `body` with the cursor of a text of `units` units.
template <class Unit, class Body>
[[gnu::always_inline]] inline auto with_cursor(const Codepage& cp, Form form, LXShiftState state, const Unit* p,
                                               size_t units, Body&& body) {
  return with_kind<Unit>(cp, form, [&](auto kind) { return body(kind.cursor(cp, p, units, state)); });
}

/// Calls `body` with the sink of an output that ends at `end`. Not inline in all callers where bytes are
/// written: what follows is.
template <class Unit, class Body>
[[gnu::always_inline]] inline auto with_sink(const Codepage& cp, Form form, LXShiftState state, Unit* p,
                                             Unit* end, Body&& body) {
  return with_kind<Unit>(cp, form, [&](auto kind) { return body(kind.sink(cp, p, end, state)); });
}
template <class Body>
auto with_sink(const Codepage& cp, Form form, LXShiftState state, uint8_t* p, uint8_t* end, Body&& body) {
  return with_kind<uint8_t>(cp, form, [&](auto kind) { return body(kind.sink(cp, p, end, state)); });
}

// How many characters stand in how many bytes. Of a text without shift states all counts are of whole
// characters by lead bytes; where shift bytes count is said with each.

/// The bytes that `chars` characters take; without `most` no end is checked, else whole characters in that many
/// bytes count. A shift byte on either side belongs to a character.
size_t bytes_of_chars(const Codepage& cp, const uint8_t* text, LXShiftState state, int32_t chars,
                      size_t most = SIZE_MAX);
/// How many characters those are for which bytes_of_chars() finds at most `bytes` bytes.
int32_t chars_counted(const Codepage& cp, const uint8_t* text, LXShiftState state, size_t bytes);

/// The whole characters in `bytes` bytes. Of several shift bytes in front of a character one is passed over,
/// the next one counts as a character.
int32_t chars_in_bytes(const Codepage& cp, const uint8_t* text, LXShiftState state, size_t bytes);

/// A part of a text, in units and in characters.
struct Part {
  size_t units;
  size_t chars;
};

/// The whole characters in `bytes` bytes. A Shift-In behind the last one belongs to them, a Shift-Out only at
/// the end of the text, which is `text_bytes` long.
Part whole_chars(const Codepage& cp, Form form, const uint8_t* text, LXShiftState state, size_t bytes,
                 size_t text_bytes);

/// The state behind all characters of a text and the shift byte that may end it.
LXShiftState state_behind(const Codepage& cp, const uint8_t* text, LXShiftState state, size_t bytes);

/// Copies at most `chars` whole characters of a text of `bytes` bytes, and the Shift-In that is due behind
/// them.
Part copy_chars(const Codepage& cp, Form form, LXShiftState state, const uint8_t* text, size_t bytes,
                size_t chars, uint8_t* out);

/// A text as it is given: a length below 0 means null-terminated.
template <class Unit>
struct Text {
  const Unit* p;
  int32_t length;
  LXShiftState state = LX_SHIFT_SINGLE;
};
using ByteText = Text<uint8_t>;
inline ByteText text_of(const char* p, int32_t length, LXShiftState state = LX_SHIFT_SINGLE) {
  return {bytes_of(p), length, state};
}
template <class Unit>
Text<Unit> text_of(const Unit* p, int32_t length) {
  return {p, length};
}

/// By how many characters the count of `rest`, which stands in `text`, is below that of `text`, as
/// chars_counted() counts both; -1 when what stands before `end` does not tell.
int32_t chars_before(const Codepage& cp, const ByteText& text, const ByteText& rest, const uint8_t* end);

/// Its units, where a length counts units or, of bytes, characters. At most those up to the end of memory, so
/// that the end of a text never wraps.
template <class Unit>
size_t units_of(const Codepage& cp, const Text<Unit>& text, bool characters) {
  if (text.length < 0) return units_before_null(text.p);
  if constexpr (sizeof(Unit) == 1)
    if (characters) return bytes_of_chars(cp, text.p, text.state, text.length);
  return least(static_cast<size_t>(text.length), room<Unit>(text.p, no_end<const Unit>()));
}

template <class Unit, class Body>
[[gnu::always_inline]] inline auto with_cursor(const Codepage& cp, Form form, const Text<Unit>& text,
                                               size_t units, Body&& body) {
  return with_cursor(cp, form, text.state, text.p, units, body);
}

/// How much of a text a copy into `size` units, or bytes or characters, takes. A length below 0:
/// null-terminated, with the null.
template <class Unit>
Part part_that_fits(const Codepage&, Form, const Text<Unit>& text, int32_t size, bool) {
  if (size < 1 || text.length == 0) return {0, 0};
  const size_t n = least(text_units_with_null(text.p, text.length), static_cast<size_t>(size));
  return {n, n};
}
Part part_that_fits(const Codepage& cp, Form form, const ByteText& text, int32_t size, bool characters);

}  // namespace lx
