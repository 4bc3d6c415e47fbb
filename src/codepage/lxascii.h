// Runs of ASCII, moved a machine word or a vector at a time between bytes and 16-bit units.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>

#if defined(__SSE2__)
#include <emmintrin.h>
#endif

namespace lx {

inline constexpr size_t kAsciiBlock = 16;  // units moved at a time

#if defined(__SSE2__)

/// Copies a block if all of it is ASCII.
inline bool copy_ascii_block(uint8_t* to, const uint8_t* from) {
  const __m128i v = _mm_loadu_si128(reinterpret_cast<const __m128i*>(from));
  if (_mm_movemask_epi8(v) != 0) return false;
  _mm_storeu_si128(reinterpret_cast<__m128i*>(to), v);
  return true;
}
inline bool copy_ascii_block(uint16_t* to, const uint8_t* from) {
  const __m128i v = _mm_loadu_si128(reinterpret_cast<const __m128i*>(from));
  if (_mm_movemask_epi8(v) != 0) return false;
  const __m128i zero = _mm_setzero_si128();
  _mm_storeu_si128(reinterpret_cast<__m128i*>(to), _mm_unpacklo_epi8(v, zero));
  _mm_storeu_si128(reinterpret_cast<__m128i*>(to + 8), _mm_unpackhi_epi8(v, zero));
  return true;
}
inline bool copy_ascii_block(uint8_t* to, const uint16_t* from) {
  const __m128i a = _mm_loadu_si128(reinterpret_cast<const __m128i*>(from));
  const __m128i b = _mm_loadu_si128(reinterpret_cast<const __m128i*>(from + 8));
  const __m128i high = _mm_and_si128(_mm_or_si128(a, b), _mm_set1_epi16(static_cast<short>(0xFF80)));
  if (_mm_movemask_epi8(_mm_cmpeq_epi16(high, _mm_setzero_si128())) != 0xFFFF) return false;
  _mm_storeu_si128(reinterpret_cast<__m128i*>(to), _mm_packus_epi16(a, b));
  return true;
}

#else

template <class To, class From>
inline bool copy_ascii_block(To* to, const From* from) {
  From all = 0;
  for (size_t i = 0; i < kAsciiBlock; ++i) all = static_cast<From>(all | from[i]);
  if (all >= 0x80) return false;
  for (size_t i = 0; i < kAsciiBlock; ++i) to[i] = static_cast<To>(from[i]);
  return true;
}

#endif

/// Copies the ASCII units at the start of `n` units: how many there were. Writes nothing behind them.
template <class To, class From>
inline size_t copy_ascii(To* to, const From* from, size_t n) {
  size_t i = 0;
  while (n - i >= kAsciiBlock && copy_ascii_block(to + i, from + i)) i += kAsciiBlock;
  while (i < n && from[i] < 0x80) {
    to[i] = static_cast<To>(from[i]);
    ++i;
  }
  return i;
}

}  // namespace lx
