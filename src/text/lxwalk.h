// A cursor with a memory: the character that it gave last, as it stands in its text.
#pragma once

#include "codepage/lxtext.h"

namespace lx {

template <class Cursor>
struct Walk {
  using Unit = typename Cursor::Unit;
  using Value = typename Cursor::Value;

  Cursor in;
  const Unit* start;  // of the character, behind its shift byte
  Value value;

  explicit Walk(const Cursor& text) : in(text), start(text.p), value(0) {}

  bool next() {
    start = in.p;
    if (!in.next(&value)) return false;
    if constexpr (Cursor::kShifts) start = in.p - in.cp.width_in(in.state);
    return true;
  }
  size_t units() const { return static_cast<size_t>(in.p - start); }
  /// Codes of characters of different lengths may be equal where a byte is zero.
  bool same_as(const Walk& other) const { return value == other.value && units() == other.units(); }
  bool holds_null() const {
    for (const Unit* p = start; p < in.p; ++p)
      if (*p == 0) return true;
    return false;
  }
};

}  // namespace lx
