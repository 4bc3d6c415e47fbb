// Runs of characters that are one unit of the same value on both sides (ASCII, or all of ISO 8859-1), moved a
// vector at a time between bytes and 16-bit units. `below` bounds the values: 0x80, or 0x100.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>

#if defined(__SSE2__)
#include <emmintrin.h>
#endif

namespace lx {

inline constexpr size_t kBlock = 16;  // units looked at or moved at a time

#if defined(__SSE2__)

inline __m128i load_block(const void* from) {
  return _mm_loadu_si128(static_cast<const __m128i*>(from));
}
inline void store_block(void* to, __m128i v) {
  _mm_storeu_si128(static_cast<__m128i*>(to), v);
}

/// Whether all units of a block are below `below`: none has a bit of -below.
inline bool is_same_block(__m128i bytes, unsigned below) {
  return _mm_movemask_epi8(_mm_and_si128(bytes, _mm_set1_epi8(static_cast<char>(-below)))) == 0;
}
inline bool is_same_block(const uint8_t* from, unsigned below) {
  return is_same_block(load_block(from), below);
}
inline bool is_same_block(const uint16_t* from, unsigned below) {
  const __m128i all = _mm_or_si128(load_block(from), load_block(from + kBlock / 2));
  const __m128i high = _mm_and_si128(all, _mm_set1_epi16(static_cast<short>(-below)));
  return _mm_movemask_epi8(_mm_cmpeq_epi8(high, _mm_setzero_si128())) == 0xFFFF;
}

inline void copy_block(uint8_t* to, const uint8_t* from) {
  store_block(to, load_block(from));
}
inline void copy_block(uint16_t* to, const uint8_t* from) {
  const __m128i v = load_block(from);
  store_block(to, _mm_unpacklo_epi8(v, _mm_setzero_si128()));
  store_block(to + kBlock / 2, _mm_unpackhi_epi8(v, _mm_setzero_si128()));
}
inline void copy_block(uint8_t* to, const uint16_t* from) {
  store_block(to, _mm_packus_epi16(load_block(from), load_block(from + kBlock / 2)));
}

#else

template <class From>
inline bool is_same_block(const From* from, unsigned below) {
  unsigned all = 0;
  for (size_t i = 0; i < kBlock; ++i) all |= from[i];
  return all < below;
}
template <class To, class From>
inline void copy_block(To* to, const From* from) {
  for (size_t i = 0; i < kBlock; ++i) to[i] = static_cast<To>(from[i]);
}

#endif

/// Copies the blocks of units below `below` at the start of `n` units: how many units there were.
template <class To, class From>
inline size_t copy_same_blocks(To* to, const From* from, size_t n, unsigned below) {
  size_t i = 0;
  for (; n - i >= kBlock && is_same_block(from + i, below); i += kBlock) copy_block(to + i, from + i);
  return i;
}

/// The same with the single units behind them. Writes nothing behind the last one.
template <class To, class From>
inline size_t copy_same(To* to, const From* from, size_t n, unsigned below) {
  size_t i = copy_same_blocks(to, from, n, below);
  for (; i < n && from[i] < below; ++i) to[i] = static_cast<To>(from[i]);
  return i;
}

}  // namespace lx
