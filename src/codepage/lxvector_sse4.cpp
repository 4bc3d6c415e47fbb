// UTF-8 in blocks of 16 bytes with the shuffles of SSSE3, which most processors have.
#include "codepage/lxvectorlevels.h"

#if defined(__SSE2__)
#include <immintrin.h>

namespace lx {
namespace {

// Shuffles: which bytes of a vector go to its front, by a bit for each of what is there.

/// Of eight bytes those that have a bit.
struct KeptBytes {
  uint8_t of[256][8];
  constexpr KeptBytes() : of() {
    for (unsigned bits = 0; bits < 256; ++bits) {
      unsigned n = 0;
      for (unsigned i = 0; i < 8; ++i) of[bits][i] = 0x80;
      for (unsigned i = 0; i < 8; ++i)
        if ((bits >> i & 1) != 0) of[bits][n++] = static_cast<uint8_t>(i);
    }
  }
};
constexpr KeptBytes kKeptBytes;

/// Of eight pairs of bytes the first ones, and the second ones of those that have no bit.
struct KeptPairs {
  uint8_t of[256][16];
  constexpr KeptPairs() : of() {
    for (unsigned bits = 0; bits < 256; ++bits) {
      unsigned n = 0;
      for (unsigned i = 0; i < 16; ++i) of[bits][i] = 0x80;
      for (unsigned i = 0; i < 8; ++i) {
        of[bits][n++] = static_cast<uint8_t>(2 * i);
        if ((bits >> i & 1) == 0) of[bits][n++] = static_cast<uint8_t>(2 * i + 1);
      }
    }
  }
};
constexpr KeptPairs kKeptPairs;

/// Of four groups of four bytes the first one, the second one where the lower four bits say so, and the third one
/// where the upper ones do.
struct KeptGroups {
  uint8_t of[256][16];
  uint8_t count[256];
  constexpr KeptGroups() : of(), count() {
    for (unsigned bits = 0; bits < 256; ++bits) {
      unsigned n = 0;
      for (unsigned i = 0; i < 16; ++i) of[bits][i] = 0x80;
      for (unsigned i = 0; i < 4; ++i) {
        of[bits][n++] = static_cast<uint8_t>(4 * i);
        if ((bits >> i & 1) != 0) of[bits][n++] = static_cast<uint8_t>(4 * i + 1);
        if ((bits >> i & 0x10) != 0) of[bits][n++] = static_cast<uint8_t>(4 * i + 2);
      }
      count[bits] = static_cast<uint8_t>(n);
    }
  }
};
constexpr KeptGroups kKeptGroups;

#define LX_TARGET [[gnu::target("sse4.1,ssse3,popcnt")]]

using Marks = Utf8Marks<uint16_t>;
constexpr size_t kShort = 48;  // bytes that are read otherwise

LX_TARGET inline unsigned above(__m128i bytes, int byte) {
  return byte_mask(_mm_cmpgt_epi8(bytes, _mm_set1_epi8(static_cast<char>(byte))));
}

inline __m128i load_eight(const void* from) {
  return _mm_loadl_epi64(static_cast<const __m128i*>(from));
}

/// The values of the characters that begin where `leads` has a bit, of eight bytes and two more.
LX_TARGET inline __m128i values_at(const uint8_t* p, unsigned leads) {
  const __m128i kept = load_eight(kKeptBytes.of[leads]);
  const __m128i low_six = _mm_set1_epi16(0x3F);
  const __m128i lead = _mm_cvtepu8_epi16(_mm_shuffle_epi8(load_eight(p), kept));
  const __m128i next = _mm_and_si128(_mm_cvtepu8_epi16(_mm_shuffle_epi8(load_eight(p + 1), kept)), low_six);
  const __m128i last = _mm_and_si128(_mm_cvtepu8_epi16(_mm_shuffle_epi8(load_eight(p + 2), kept)), low_six);
  const __m128i both = _mm_or_si128(_mm_slli_epi16(lead, 6), next);
  const __m128i two = _mm_and_si128(both, _mm_set1_epi16(0x7FF));
  const __m128i three = _mm_or_si128(_mm_slli_epi16(both, 6), last);
  const __m128i is_long = _mm_cmpgt_epi16(lead, _mm_set1_epi16(0x7F));
  const __m128i is_three = _mm_cmpgt_epi16(lead, _mm_set1_epi16(0xDF));
  return _mm_blendv_epi8(_mm_blendv_epi8(lead, two, is_long), three, is_three);
}

/// Reads blocks, behind which so much is left that the values stored behind the last one are written over.
LX_TARGET inline ReadRun read_blocks(const uint8_t* q, const uint8_t* end, uint16_t* values, size_t most,
                                     RunRule rule) {
  size_t n = 0;
  while (room(q, end) >= kShort && most - n >= 2 * kBlock) {
    const __m128i block = load_block(q);
    const unsigned high = byte_mask(block);
    if (high == 0) {
      if (rule.below != 0 && n != 0 && is_same_block(q + kBlock, kAscii)) break;
      const size_t same = copy_same_blocks(values + n, q, least(most - n, room(q, end)), kAscii);
      n += same;
      q += same;
      continue;
    }
    Marks marks;
    const unsigned leads = above(block, 0xBF) | (~high & 0xFFFF);
    marks.trails = static_cast<uint16_t>(~leads);
    marks.leads = static_cast<uint16_t>(leads);
    marks.three = static_cast<uint16_t>(above(block, 0xDF) & high);
    marks.others = static_cast<uint16_t>((above(block, 0xEF) & high) | (leads & high & ~above(block, 0xC1)));
    const unsigned used = marks.usable(static_cast<uint16_t>(leads & high), kBlock);
    if (used == 0) break;
    const unsigned chars = leads & ((1u << used) - 1);
    store_block(values + n, values_at(q, chars & 0xFF));
    n += static_cast<size_t>(__builtin_popcount(chars & 0xFF));
    store_block(values + n, values_at(q + 8, chars >> 8));
    n += static_cast<size_t>(__builtin_popcount(chars >> 8));
    q += used;
  }
  return {q, n};
}

LX_TARGET ReadRun read_utf8(const uint8_t* q, const uint8_t* end, uint16_t* values, size_t most, RunRule rule) {
  ReadRun run = read_blocks(q, end, values, most, rule);
  if (run.count == 0 || room(run.p, end) < kShort) {
    const ReadRun rest = base::read_utf8(run.p, end, values + run.count, most - run.count, rule);
    run = {rest.p, run.count + rest.count};
  }
  return run;
}

/// Writes four characters, and maybe up to a block behind them.
LX_TARGET inline uint8_t* write_four(uint8_t* p, __m128i v) {
  const __m128i low_six = _mm_set1_epi32(0x3F);
  const __m128i last = _mm_and_si128(v, low_six);
  const __m128i middle = _mm_and_si128(_mm_srli_epi32(v, 6), low_six);
  const __m128i two =
      _mm_or_si128(_mm_or_si128(_mm_srli_epi32(v, 6), _mm_slli_epi32(last, 8)), _mm_set1_epi32(0x80C0));
  const __m128i three = _mm_or_si128(_mm_or_si128(_mm_srli_epi32(v, 12), _mm_slli_epi32(middle, 8)),
                                     _mm_or_si128(_mm_slli_epi32(last, 16), _mm_set1_epi32(0x8080E0)));
  const __m128i is_long = _mm_cmpgt_epi32(v, _mm_set1_epi32(0x7F));
  const __m128i is_three = _mm_cmpgt_epi32(v, _mm_set1_epi32(0x7FF));
  const auto lanes = static_cast<unsigned>(_mm_movemask_ps(_mm_castsi128_ps(is_long)) |
                                           _mm_movemask_ps(_mm_castsi128_ps(is_three)) << 4);
  const __m128i bytes = _mm_blendv_epi8(_mm_blendv_epi8(v, two, is_long), three, is_three);
  store_block(p, _mm_shuffle_epi8(bytes, load_block(kKeptGroups.of[lanes])));
  return p + kKeptGroups.count[lanes];
}

LX_TARGET uint8_t* write_utf8(uint8_t* p, const uint16_t* values, size_t count) {
  size_t i = 0;
  // Behind so many there are bytes enough for a block that is written over.
  while (count - i >= kUtf8Batch + kBlock) {
    if (is_same_block(values + i, kAscii)) {
      const size_t same = copy_same_blocks(p, values + i, count - i, kAscii);
      p += same;
      i += same;
      continue;
    }
    const __m128i v = load_block(values + i);
    const __m128i longer = _mm_and_si128(v, _mm_set1_epi16(static_cast<short>(0xFF80)));
    const __m128i one = _mm_cmpeq_epi16(longer, _mm_setzero_si128());
    if (_mm_testz_si128(v, _mm_set1_epi16(static_cast<short>(0xF800))) != 0) {
      const __m128i trail = _mm_slli_epi16(_mm_and_si128(v, _mm_set1_epi16(0x3F)), 8);
      const __m128i two =
          _mm_or_si128(_mm_or_si128(_mm_srli_epi16(v, 6), trail), _mm_set1_epi16(static_cast<short>(0x80C0)));
      const unsigned ones = byte_mask(_mm_packs_epi16(one, one)) & 0xFF;
      store_block(p, _mm_shuffle_epi8(_mm_blendv_epi8(two, v, one), load_block(kKeptPairs.of[ones])));
      p += kBlock - static_cast<size_t>(__builtin_popcount(ones));
    } else {
      p = write_four(p, _mm_cvtepu16_epi32(v));
      p = write_four(p, _mm_cvtepu16_epi32(_mm_srli_si128(v, 8)));
    }
    i += kUtf8Batch;
  }
  return base::write_utf8(p, values + i, count - i);
}

}  // namespace

const Vectors kSse4Vectors = {
    "SSE4",           kBasePivotBytes,  kBasePairPivotBytes, kBaseLeastPassed, base::pass,
    read_utf8,        base::read_pairs, base::copy_same,     base::look_up,    base::translate,
    nullptr,          write_utf8,       base::write_pairs,   nullptr,          base::write_wide,
    base::write_bytes};

bool has_sse4() {
  return __builtin_cpu_supports("sse4.1") && __builtin_cpu_supports("ssse3") &&
         __builtin_cpu_supports("popcnt");
}

}  // namespace lx

#endif
