// What two texts have in common, and how they differ: the first steps of comparison and of collation.
#pragma once

#include "codepage/lxtext.h"

namespace lx {

/// A text whose units are counted.
template <class Unit>
struct CountedText {
  const Unit* p;
  size_t units;
  LXShiftState state = LX_SHIFT_SINGLE;
};

/// The difference where it fits, else the farthest value of its sign.
inline int32_t difference(int64_t a, int64_t b) {
  const int64_t d = a - b;
  return static_cast<int32_t>(d > INT32_MAX ? INT32_MAX : d < INT32_MIN ? INT32_MIN : d);
}

/// How many units two texts begin with alike.
template <class Unit>
[[gnu::always_inline]] inline size_t equal_units(const Unit* a, size_t units1, const Unit* b, size_t units2) {
  const size_t most = least(units1, units2);
  if (most == 0 || a[0] != b[0]) return 0;  // most texts, and words of no foreseeable number cost more
  constexpr size_t kWord = sizeof(uint64_t) / sizeof(Unit);
  constexpr size_t kLong = 32 * kWord;
  size_t n = 0;
  while (most - n >= kLong && memcmp(a + n, b + n, kLong * sizeof(Unit)) == 0) n += kLong;
  for (; most - n >= kWord; n += kWord) {
    const auto word = [n](const Unit* text) { return le64(reinterpret_cast<const uint8_t*>(text + n)); };
    const uint64_t bits = word(a) ^ word(b);
    if (bits != 0) return n + static_cast<size_t>(__builtin_ctzll(bits)) / (8 * sizeof(Unit));
  }
  while (n < most && a[n] == b[n]) ++n;
  return n;
}

/// How many of the first `units` units of a plain text are whole characters.
template <class Unit>
size_t whole_units(const Codepage&, const Unit*, size_t units) {
  return units;
}
[[gnu::always_inline]] inline size_t whole_units(const Codepage& cp, const uint8_t* text, size_t units) {
  // From the last place where a character surely begins: behind bytes of which none can begin one that goes on.
  const auto surely_begins = [&](size_t n) {
    for (size_t back = 1; back < kMaxCharBytes && back <= n; ++back)
      if (cp.length(text[n - back]) > back) return false;
    return true;
  };
  size_t n = units;
  while (!surely_begins(n)) n = units - n < kMaxCharBytes ? n - 1 : 0;
  for (size_t length = 0; n < units && (length = cp.length(text[n])) <= units - n;) n += length;
  return n;
}

}  // namespace lx
