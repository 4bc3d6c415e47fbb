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
  constexpr size_t kWord = sizeof(uint64_t) / sizeof(Unit), kHalf = kWord / 2;
  constexpr size_t kLong = 32 * kWord;
  const auto bytes_at = [](const Unit* text, size_t at) { return reinterpret_cast<const uint8_t*>(text + at); };
  const auto words = [&](size_t at) { return le64(bytes_at(a, at)) ^ le64(bytes_at(b, at)); };
  const auto halves = [&](size_t at) { return uint64_t{le32(bytes_at(a, at)) ^ le32(bytes_at(b, at))}; };
  const auto units_in = [](uint64_t bits) {
    return static_cast<size_t>(__builtin_ctzll(bits)) / (8 * sizeof(Unit));
  };
  size_t n = 0;
  while (most - n >= kLong && memcmp(a + n, b + n, kLong * sizeof(Unit)) == 0) n += kLong;
  for (; most - n >= kWord; n += kWord)
    if (const uint64_t bits = words(n)) return n + units_in(bits);
  // What is left ends a word or half of one: no count of single units, which nothing foresees.
  if (n == most) return n;
  if (most >= kWord) {
    const uint64_t bits = words(most - kWord);
    return bits == 0 ? most : most - kWord + units_in(bits);
  }
  if (most >= kHalf) {
    if (const uint64_t bits = halves(0)) return units_in(bits);
    const uint64_t bits = halves(most - kHalf);
    return bits == 0 ? most : most - kHalf + units_in(bits);
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
  if (units == 0) return 0;
  if (cp.plain_utf8) {
    // Most texts are well-formed: the last place of three where no character goes on.
    const auto none_goes_on = [text](size_t n) {
      return n == 0 || (text[n - 1] < 0xC2 && (n == 1 || text[n - 2] < 0xE0));
    };
    if (none_goes_on(units)) return units;
    if (text[units - 1] >= 0xC2 && text[units - 1] < 0xF0 && none_goes_on(units - 1)) return units - 1;
  }
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
