// How long texts are and where they end, in units, and in bytes where a length counts characters.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>

namespace lx {

/// The end of an output that has no size of its own.
template <class Unit>
inline Unit* no_end() {
  return reinterpret_cast<Unit*>(UINTPTR_MAX & ~(sizeof(Unit) - 1));
}

/// Units from `p` to `end`; also where `end` is no_end().
template <class Unit>
inline size_t room(const Unit* p, const Unit* end) {
  return (reinterpret_cast<uintptr_t>(end) - reinterpret_cast<uintptr_t>(p)) / sizeof(Unit);
}

inline size_t least(size_t a, size_t b) {
  return a < b ? a : b;
}
inline size_t least(size_t a, size_t b, size_t c) {
  return least(least(a, b), c);
}

/// Where a text of `units` units ends; one that is longer than memory ends there.
template <class Unit>
inline Unit* end_of(Unit* p, size_t units) {
  return p + least(units, room<Unit>(p, no_end<Unit>()));
}

/// The units of a text before its null, at most `most`.
template <class Unit>
inline size_t units_before_null(const Unit* text, size_t most = SIZE_MAX) {
  size_t n = 0;
  while (n < most && text[n] != 0) ++n;
  return n;
}
inline size_t units_before_null(const char* text, size_t most = SIZE_MAX) {
  return most == SIZE_MAX ? strlen(text) : strnlen(text, most);
}
inline size_t units_before_null(const uint8_t* text, size_t most = SIZE_MAX) {
  return units_before_null(reinterpret_cast<const char*>(text), most);
}

/// The units of a text up to a null, or to its length where one is given.
template <class Unit>
inline size_t units_up_to(const Unit* text, int32_t length) {
  return units_before_null(text, length < 0 ? SIZE_MAX : static_cast<size_t>(length));
}

/// The units of a text: the length where one is given, below 0 those before its null.
template <class Unit>
inline size_t text_units(const Unit* text, int32_t length) {
  return length < 0 ? units_before_null(text) : static_cast<size_t>(length);
}
/// The same with the null that ends a text without a length.
template <class Unit>
inline size_t text_units_with_null(const Unit* text, int32_t length) {
  return length < 0 ? units_before_null(text) + 1 : static_cast<size_t>(length);
}

}  // namespace lx
