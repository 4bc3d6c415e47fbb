// How much of a text a copy takes: whole characters while they fit, and nothing added. Shared by the copy mode
// of string mapping and by functions that copy strings.
#pragma once

#include <cstring>

#include "codepage/lxtext.h"

namespace lx {

template <class Unit>
inline size_t units_with_null(const Unit* text) {
  return text_units(text, -1) + 1;
}

/// What a copy takes, in units and in characters.
struct Copied {
  size_t units;
  size_t chars;
};

/// Where units are characters. A length below 0: null-terminated, with the null.
template <class Unit>
inline Copied whole_units(const Unit* text, int32_t length, int32_t size) {
  if (size < 1 || length == 0) return {0, 0};
  const size_t n =
      least(length < 0 ? units_with_null(text) : static_cast<size_t>(length), static_cast<size_t>(size));
  return {n, n};
}

/// The whole characters in `bytes` bytes. Of a shift-stateful text a Shift-In behind the last one belongs to
/// them, a Shift-Out only at the end of the text, which is `text_bytes` long.
Copied whole_chars(const Codepage& cp, Form form, const uint8_t* text, LXShiftState state, size_t bytes,
                   size_t text_bytes);

/// Of a byte text: lengths count bytes, or characters.
Copied whole_bytes(const Codepage& cp, Form form, const uint8_t* text, LXShiftState state, int32_t length,
                   int32_t size, bool characters);

}  // namespace lx
