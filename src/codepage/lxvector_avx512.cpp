// Blocks of 64 bytes and masks, with which a short text is one block too. For 64 bits: with eight vectors and masks in
// two parts it is slower than what it replaces.
#include "codepage/lxvectorlevels.h"

#if defined(__x86_64__)
#include <immintrin.h>
#if !defined(__clang__)
#pragma GCC diagnostic ignored "-Wmaybe-uninitialized"  // the header's own undefined vectors
#endif

namespace lx {
namespace {

#define LX_TARGET [[gnu::target("avx512f,avx512bw,avx512vl,avx512vbmi,avx512vbmi2,popcnt,lzcnt,bmi,bmi2")]]

constexpr size_t kBytes = 64;          // a vector
constexpr size_t kUnits = kBytes / 2;  // ... of units
using Marks = Utf8Marks<uint64_t>;

LX_TARGET inline uint64_t ones(size_t count) {
  return _bzhi_u64(~uint64_t{0}, static_cast<unsigned>(count));
}

/// Stores the bytes of a block as units.
LX_TARGET inline void widen_block(uint16_t* to, __m512i block) {
  _mm512_storeu_si512(to, _mm512_cvtepu8_epi16(_mm512_castsi512_si256(block)));
  _mm512_storeu_si512(to + kUnits, _mm512_cvtepu8_epi16(_mm512_extracti64x4_epi64(block, 1)));
}

/// The values of characters of which the first, second and third bytes are given. A missing one does not count.
LX_TARGET inline __m512i values_of(__m256i first, __m256i second, __m256i third) {
  const __m512i low_six = _mm512_set1_epi16(0x3F);
  const __m512i lead = _mm512_cvtepu8_epi16(first);
  const __m512i next = _mm512_and_si512(_mm512_cvtepu8_epi16(second), low_six);
  const __m512i last = _mm512_and_si512(_mm512_cvtepu8_epi16(third), low_six);
  const __m512i both = _mm512_or_si512(_mm512_slli_epi16(lead, 6), next);
  const __m512i two = _mm512_and_si512(both, _mm512_set1_epi16(0x7FF));
  const __m512i three = _mm512_or_si512(_mm512_slli_epi16(both, 6), last);
  const __mmask32 is_long = _mm512_cmpge_epu16_mask(lead, _mm512_set1_epi16(0x80));
  const __mmask32 is_three = _mm512_cmpge_epu16_mask(lead, _mm512_set1_epi16(0xE0));
  return _mm512_mask_mov_epi16(_mm512_mask_mov_epi16(lead, is_long, two), is_three, three);
}

/// The place of the bit behind the lowest `count` ones.
LX_TARGET inline unsigned place_of(uint64_t bits, size_t count) {
  return static_cast<unsigned>(__builtin_ctzll(_pdep_u64(uint64_t{1} << count, bits)));
}

/// Stores the first `count` units of a vector. Where more can be stored they are: what is stored in parts cannot
/// be loaded soon.
LX_TARGET inline void store_units(uint16_t* to, __m512i units, size_t count, bool all) {
  if (all)
    _mm512_storeu_si512(to, units);
  else
    _mm512_mask_storeu_epi16(to, static_cast<__mmask32>(ones(count)), units);
}

LX_TARGET inline Marks marks_of(__m512i block, uint64_t high, uint64_t inside) {
  Marks marks;
  marks.trails = _mm512_cmplt_epi8_mask(block, _mm512_set1_epi8(static_cast<char>(0xC0)));
  marks.leads = inside & ~marks.trails;
  marks.three = _mm512_cmpge_epu8_mask(block, _mm512_set1_epi8(static_cast<char>(0xE0)));
  marks.others =
      _mm512_cmpge_epu8_mask(block, _mm512_set1_epi8(static_cast<char>(0xF0))) |
      _mm512_mask_cmplt_epu8_mask(high & marks.leads, block, _mm512_set1_epi8(static_cast<char>(0xC2)));
  return marks;
}

LX_TARGET ReadRun read_utf8(const uint8_t* q, const uint8_t* end, uint16_t* values, size_t most, RunRule rule) {
  const bool all = rule.slack >= kBytes;
  size_t n = 0;
  while (q != end && n != most) {
    const size_t bytes = least(room(q, end), kBytes);
    const uint64_t inside = ones(bytes);
    const __m512i block = _mm512_maskz_loadu_epi8(inside, q);
    const uint64_t high = _mm512_movepi8_mask(block);
    if (high == 0 && bytes == kBytes && most - n >= kBytes) {
      if (rule.below != 0 && n != 0) break;
      widen_block(values + n, block);
      q += kBytes;
      n += kBytes;
      continue;
    }
    const Marks marks = marks_of(block, high, inside);
    const uint64_t longer = high & marks.leads;
    unsigned used = marks.usable(longer, static_cast<unsigned>(bytes));
    uint64_t leads = marks.leads & ones(used);
    auto chars = static_cast<size_t>(__builtin_popcountll(leads));
    if (__builtin_expect(chars > most - n, 0)) {
      chars = most - n;
      used = place_of(leads, chars);
      leads &= ones(used);
    }
    if (chars == 0) break;
    const __m512i second = _mm512_maskz_loadu_epi8(inside >> 1, q + 1);
    const __m512i third = _mm512_maskz_loadu_epi8(inside >> 2, q + 2);
    const __m512i a = _mm512_maskz_compress_epi8(leads, block);
    const __m512i b = _mm512_maskz_compress_epi8(leads, second);
    const __m512i c = _mm512_maskz_compress_epi8(leads, third);
    store_units(values + n,
                values_of(_mm512_castsi512_si256(a), _mm512_castsi512_si256(b), _mm512_castsi512_si256(c)),
                least(chars, kUnits), all);
    if (chars > kUnits)
      store_units(values + n + kUnits,
                  values_of(_mm512_extracti64x4_epi64(a, 1), _mm512_extracti64x4_epi64(b, 1),
                            _mm512_extracti64x4_epi64(c, 1)),
                  chars - kUnits, all);
    n += chars;
    q += used;
  }
  return {q, n};
}

/// The bytes of a block in a range.
LX_TARGET inline uint64_t bytes_in(LeadRanges::Range range, __m512i block) {
  const __m512i above = _mm512_sub_epi8(block, _mm512_set1_epi8(static_cast<char>(range.first)));
  return _mm512_cmple_epu8_mask(above, _mm512_set1_epi8(static_cast<char>(range.others)));
}

/// Where characters begin in those bytes of a block that are `inside`.
LX_TARGET inline CharStarts<uint64_t> chars_in(const LeadRanges& leads, __m512i block, uint64_t inside,
                                               uint64_t trails) {
  uint64_t two = bytes_in(leads.two[0], block);
  if (leads.two[0].first != leads.two[1].first) two |= bytes_in(leads.two[1], block);
  const uint64_t three = leads.has_three ? bytes_in(leads.three, block) : 0;
  return {two, three, leads.has_three, inside, trails};
}

constexpr size_t kLeastPassed = 16;

LX_TARGET PassedRun pass(const LeadRanges& leads, const uint8_t* p, const uint8_t* end, size_t most) {
  size_t chars = 0;
  uint64_t trails = 0, last_starts = 0;
  const uint64_t leads_below = leads.above_ascii ? 0 : 1;
  const uint8_t* const stop = p + least(most, room(p, end));  // so many bytes are not more characters
  for (; room(p, stop) >= kBytes; p += kBytes) {
    const __m512i block = _mm512_loadu_si512(p);
    if ((_mm512_movepi8_mask(block) | trails | leads_below) == 0) {  // one test, which is foreseen
      chars += kBytes;
      continue;
    }
    const auto found = chars_in(leads, block, ones(kBytes), trails);
    if (!found.known) break;
    last_starts = found.starts;
    chars += static_cast<size_t>(__builtin_popcountll(last_starts));
    trails = found.trails();
  }
  if (trails != 0) {  // the last one goes on behind the blocks
    p -= 1 + __builtin_clzll(last_starts);
    --chars;
  }
  const size_t bytes = room(p, end);
  if (bytes == 0 || bytes >= kBytes || most - chars < kBytes) return {p, chars};
  const uint64_t inside = ones(bytes), last = uint64_t{1} << (bytes - 1);
  const auto found = chars_in(leads, _mm512_maskz_loadu_epi8(inside, p), inside, 0);
  if (!found.known) return {p, chars};
  const uint64_t cut = (found.two & last) | (found.three & (last | last >> 1));
  const size_t used = cut == 0 ? bytes : static_cast<size_t>(__builtin_ctzll(cut));
  return {p + used, chars + static_cast<size_t>(__builtin_popcountll(found.starts & ones(used)))};
}

LX_TARGET ReadRun read_pairs(const PairRows& pairs, const uint8_t* q, const uint8_t* end, uint16_t* values,
                             size_t most, RunRule rule) {
  const PairRows rows = pairs;  // in registers
  const LeadRanges& leads = rows.leads;
  size_t n = 0;
  while (q != end && n != most) {
    const size_t bytes = least(room(q, end), kBytes);
    const uint64_t inside = ones(bytes);
    const __m512i block = _mm512_maskz_loadu_epi8(inside, q);
    if (pairs.ascii && bytes == kBytes && _mm512_movepi8_mask(block) == 0 && most - n >= kBytes) {
      if (rule.below != 0 && n != 0) break;
      widen_block(values + n, block);
      q += kBytes;
      n += kBytes;
      continue;
    }
    const auto found = chars_in(leads, block, inside, 0);
    if (found.three != 0) break;
    uint64_t starts = found.starts;
    // One that the block cuts waits for the next block.
    const uint64_t last = uint64_t{1} << (bytes - 1);
    const bool cut = (found.two & last) != 0;
    if (cut) starts &= ~last;
    size_t used = bytes - cut;
    auto chars = static_cast<size_t>(__builtin_popcountll(starts));
    if (__builtin_expect(chars > most - n, 0)) {
      chars = most - n;
      used = place_of(starts, chars);
      starts &= ones(used);
    }
    if (chars == 0) break;
    // Look-ups one by one: gathering them took as long or longer.
    uint64_t at_last = starts & last;
    for (starts &= ~last; starts != 0; starts &= starts - 1)
      values[n++] = pair_value(rows, q + __builtin_ctzll(starts));
    if (at_last != 0) values[n++] = rows.rows[rows.first[q[bytes - 1]] >> 8];  // nothing is behind it
    q += used;
  }
  return {q, n};
}

/// Writes the bytes of 16 characters; `which` are there.
LX_TARGET inline uint8_t* write_sixteen(uint8_t* p, __m256i units, __mmask16 which) {
  const __m512i v = _mm512_cvtepu16_epi32(units);
  const __m512i low_six = _mm512_set1_epi32(0x3F);
  const __m512i last = _mm512_and_si512(v, low_six);
  const __m512i middle = _mm512_and_si512(_mm512_srli_epi32(v, 6), low_six);
  // A byte that stays all ones is none of the character.
  const __m512i one = _mm512_or_si512(v, _mm512_set1_epi32(static_cast<int>(0xFFFFFF00)));
  const __m512i two = _mm512_or_si512(_mm512_or_si512(_mm512_srli_epi32(v, 6), _mm512_slli_epi32(last, 8)),
                                      _mm512_set1_epi32(static_cast<int>(0xFFFF80C0)));
  const __m512i three = _mm512_or_si512(
      _mm512_or_si512(_mm512_srli_epi32(v, 12), _mm512_slli_epi32(middle, 8)),
      _mm512_or_si512(_mm512_slli_epi32(last, 16), _mm512_set1_epi32(static_cast<int>(0xFF8080E0))));
  const __mmask16 is_long = _mm512_cmpge_epu32_mask(v, _mm512_set1_epi32(0x80));
  const __mmask16 is_three = _mm512_cmpge_epu32_mask(v, _mm512_set1_epi32(0x800));
  const __m512i bytes =
      _mm512_mask_mov_epi32(_mm512_set1_epi32(-1), which,
                            _mm512_mask_mov_epi32(_mm512_mask_mov_epi32(one, is_long, two), is_three, three));
  const uint64_t kept = _mm512_cmpneq_epi8_mask(bytes, _mm512_set1_epi8(-1));
  const auto count = static_cast<size_t>(__builtin_popcountll(kept));
  _mm512_mask_storeu_epi8(p, ones(count), _mm512_maskz_compress_epi8(kept, bytes));
  return p + count;
}

LX_TARGET uint8_t* write_utf8(uint8_t* p, const uint16_t* values, size_t count) {
  for (size_t i = 0; i < count; i += kUnits) {
    const size_t units = least(count - i, kUnits);
    const auto inside = static_cast<__mmask32>(ones(units));
    const __m512i v = _mm512_maskz_loadu_epi16(inside, values + i);
    const __mmask32 is_long = _mm512_cmpge_epu16_mask(v, _mm512_set1_epi16(0x80));
    if (is_long == 0) {
      _mm256_mask_storeu_epi8(p, inside, _mm512_cvtepi16_epi8(v));
      p += units;
    } else if (_mm512_cmpge_epu16_mask(v, _mm512_set1_epi16(0x800)) == 0) {
      const __m512i trail = _mm512_slli_epi16(_mm512_and_si512(v, _mm512_set1_epi16(0x3F)), 8);
      const __m512i two = _mm512_or_si512(_mm512_or_si512(_mm512_srli_epi16(v, 6), trail),
                                          _mm512_set1_epi16(static_cast<short>(0x80C0)));
      const __m512i one = _mm512_or_si512(v, _mm512_set1_epi16(static_cast<short>(0xFF00)));
      const __m512i bytes =
          _mm512_mask_mov_epi16(_mm512_set1_epi16(-1), inside, _mm512_mask_mov_epi16(one, is_long, two));
      const uint64_t kept = _mm512_cmpneq_epi8_mask(bytes, _mm512_set1_epi8(-1));
      const auto stored = static_cast<size_t>(__builtin_popcountll(kept));
      _mm512_mask_storeu_epi8(p, ones(stored), _mm512_maskz_compress_epi8(kept, bytes));
      p += stored;
    } else {
      p = write_sixteen(p, _mm512_castsi512_si256(v), static_cast<__mmask16>(inside));
      if (units > kUnits / 2)
        p = write_sixteen(p, _mm512_extracti64x4_epi64(v, 1), static_cast<__mmask16>(inside >> (kUnits / 2)));
    }
  }
  return p;
}

/// A table of 256 units in vectors.
struct Table {
  __m512i part[8];
  LX_TARGET explicit Table(const uint16_t* units) {
    for (size_t i = 0; i < 8; ++i) part[i] = _mm512_loadu_si512(units + i * kUnits);
  }
  LX_TARGET __m512i at(__m256i bytes) const {
    const __m512i index = _mm512_cvtepu8_epi16(bytes);
    const __m512i low = _mm512_mask_mov_epi16(_mm512_permutex2var_epi16(part[0], index, part[1]),
                                              _mm512_test_epi16_mask(index, _mm512_set1_epi16(0x40)),
                                              _mm512_permutex2var_epi16(part[2], index, part[3]));
    const __m512i high = _mm512_mask_mov_epi16(_mm512_permutex2var_epi16(part[4], index, part[5]),
                                               _mm512_test_epi16_mask(index, _mm512_set1_epi16(0x40)),
                                               _mm512_permutex2var_epi16(part[6], index, part[7]));
    return _mm512_mask_mov_epi16(low, _mm512_test_epi16_mask(index, _mm512_set1_epi16(0x80)), high);
  }
};

LX_TARGET bool copy_same(uint8_t* to, const uint8_t* from, size_t count, unsigned below) {
  const __m512i block = _mm512_maskz_loadu_epi8(ones(count), from);
  if (below <= kAscii && _mm512_movepi8_mask(block) != 0) return false;
  _mm512_mask_storeu_epi8(to, ones(count), block);
  return true;
}

LX_TARGET void look_up(const uint16_t table[256], const uint8_t* p, size_t count, uint16_t* values,
                       RunRule rule) {
  const Table vectors_of_table(table);
  for (size_t i = 0; i < count; i += kUnits) {
    const size_t units = least(count - i, kUnits);
    const auto inside = static_cast<__mmask32>(ones(units));
    store_units(values + i, vectors_of_table.at(_mm256_maskz_loadu_epi8(inside, p + i)), units,
                rule.slack >= kUnits);
  }
}

// So many characters and more are looked up side by side.
constexpr size_t kManyPairs = 12;
constexpr size_t kManyWide = 8;

/// Where the codes of 16 values stand.
LX_TARGET inline __m512i places_of_codes(const uint32_t* page_start, __mmask16 which, const uint16_t* values) {
  const __m512i u = _mm512_cvtepu16_epi32(_mm256_maskz_loadu_epi16(which, values));
  const __m512i start =
      _mm512_mask_i32gather_epi32(_mm512_setzero_si512(), which, _mm512_srli_epi32(u, 8), page_start, 4);
  return _mm512_add_epi32(start, _mm512_and_si512(u, _mm512_set1_epi32(0xFF)));
}

LX_TARGET inline __m512i codes_of(const PairCodes& at, __mmask16 which, const uint16_t* values) {
  const __m512i place = places_of_codes(at.page_start, which, values);
  const __m512i codes = _mm512_mask_i32gather_epi32(_mm512_setzero_si512(), which, place, at.codes, 2);
  return _mm512_and_si512(codes, _mm512_set1_epi32(0xFFFF));  // the upper half is of another value
}

LX_TARGET uint8_t* write_pairs(const PairCodes& at, uint8_t* p, const uint16_t* values, size_t count) {
  if (count < kManyPairs) return base::write_pairs(at, p, values, count);
  for (size_t i = 0; i < count; i += 16) {
    const auto inside = static_cast<__mmask16>(ones(least(count - i, 16)));
    const __m512i codes = codes_of(at, inside, values + i);
    const __mmask16 two = _mm512_cmpgt_epu32_mask(codes, _mm512_set1_epi32(0xFF));
    const __m256i bytes = _mm512_cvtepi32_epi16(
        _mm512_mask_or_epi32(codes, two, _mm512_srli_epi32(codes, 8), _mm512_slli_epi32(codes, 8)));
    // Of a code of one byte the upper half goes.
    const __m256i kept = _mm256_mask_mov_epi16(_mm256_set1_epi16(0xFF), two, _mm256_set1_epi16(-1));
    const __mmask32 which = _mm256_movepi8_mask(kept) & _mm256_movepi8_mask(_mm256_movm_epi16(inside));
    const auto written = static_cast<size_t>(__builtin_popcount(which));
    _mm256_mask_storeu_epi8(p, static_cast<__mmask32>(ones(written)), _mm256_maskz_compress_epi8(which, bytes));
    p += written;
  }
  return p;
}

/// Of each of 16 codes that `which` has, one of its four bytes.
LX_TARGET inline uint64_t byte_of_each(__mmask16 which, unsigned at) {
  return _pdep_u64(which, UINT64_MAX / 15 << at);
}

LX_TARGET uint8_t* write_wide(const WideCodes& at, uint8_t* p, const uint16_t* values, size_t count) {
  if (count < kManyWide) return base::write_wide(at, p, values, count);
  const __m512i first_byte_first = _mm512_set4_epi32(0x0C0D0E0F, 0x08090A0B, 0x04050607, 0x00010203);
  for (size_t i = 0; i < count; i += 16) {
    const auto inside = static_cast<__mmask16>(ones(least(count - i, 16)));
    const __m512i places = places_of_codes(at.page_start, inside, values + i);
    __m512i codes = _mm512_mask_i32gather_epi32(_mm512_setzero_si512(), inside, places, at.codes, 4);
    const __mmask16 two = _mm512_cmpgt_epu32_mask(codes, _mm512_set1_epi32(0xFF));
    const __mmask16 three = _mm512_cmpgt_epu32_mask(codes, _mm512_set1_epi32(0xFFFF));
    const __mmask16 four = _mm512_cmpgt_epu32_mask(codes, _mm512_set1_epi32(0xFFFFFF));
    codes = _mm512_mask_slli_epi32(codes, static_cast<__mmask16>(~two), codes, 8);
    codes = _mm512_mask_slli_epi32(codes, static_cast<__mmask16>(~three), codes, 8);
    codes = _mm512_mask_slli_epi32(codes, static_cast<__mmask16>(~four), codes, 8);
    const uint64_t which =
        byte_of_each(inside, 0) | byte_of_each(two, 1) | byte_of_each(three, 2) | byte_of_each(four, 3);
    const auto written = static_cast<size_t>(__builtin_popcountll(which));
    _mm512_mask_storeu_epi8(p, ones(written),
                            _mm512_maskz_compress_epi8(which, _mm512_shuffle_epi8(codes, first_byte_first)));
    p += written;
  }
  return p;
}

/// The codes of ASCII, which are looked up without gathering them.
struct AsciiCodes {
  __m512i part[4];

  LX_TARGET explicit AsciiCodes(const PairCodes& at) {
    for (size_t i = 0; i < 4; ++i) part[i] = _mm512_loadu_si512(at.codes + at.page_start[0] + i * kUnits);
  }
  LX_TARGET __m256i at(__m256i values) const {
    const __m512i index = _mm512_castsi256_si512(values);
    const __m512i low = _mm512_permutex2var_epi16(part[0], index, part[1]);
    const __m512i high = _mm512_permutex2var_epi16(part[2], index, part[3]);
    const __mmask32 is_high = _mm512_test_epi16_mask(index, _mm512_set1_epi16(0x40));
    return _mm512_castsi512_si256(_mm512_mask_mov_epi16(low, is_high, high));
  }
};

LX_TARGET uint8_t* write_shift(const ShiftCodes& at, bool* two_before, uint8_t* p, const uint16_t* values,
                               size_t count) {
  const __m512i shift_in = _mm512_set1_epi32(at.shift_in), shift_out = _mm512_set1_epi32(at.shift_out);
  const AsciiCodes ascii(at.codes);
  unsigned before = *two_before;
  for (size_t i = 0; i < count; i += 16) {
    const size_t chars = least(count - i, 16);
    const auto inside = static_cast<__mmask16>(ones(chars));
    const __m256i v = _mm256_maskz_loadu_epi16(inside, values + i);
    const bool is_ascii = _mm256_test_epi16_mask(v, _mm256_set1_epi16(static_cast<short>(-int{kAscii}))) == 0;
    const __m512i codes =
        is_ascii ? _mm512_cvtepu16_epi32(ascii.at(v)) : codes_of(at.codes, inside, values + i);
    const __mmask16 two = _mm512_mask_cmpgt_epu32_mask(inside, codes, _mm512_set1_epi32(0xFF));
    const auto shifted = static_cast<__mmask16>((two ^ (unsigned{two} << 1 | before)) & inside);
    before = unsigned{two} >> (chars - 1) & 1;
    // A shift byte, and the one or two bytes of the code.
    const __m512i low = _mm512_mask_slli_epi32(_mm512_slli_epi32(codes, 8), two,
                                               _mm512_and_si512(codes, _mm512_set1_epi32(0xFF)), 16);
    const __m512i high = _mm512_maskz_and_epi32(two, codes, _mm512_set1_epi32(0xFF00));
    const __m512i shift = _mm512_mask_mov_epi32(shift_in, two, shift_out);
    const uint64_t which = byte_of_each(shifted, 0) | byte_of_each(inside, 1) | byte_of_each(two, 2);
    const auto written = static_cast<size_t>(__builtin_popcountll(which));
    _mm512_mask_storeu_epi8(
        p, ones(written),
        _mm512_maskz_compress_epi8(which, _mm512_or_si512(shift, _mm512_or_si512(high, low))));
    p += written;
  }
  *two_before = before != 0;
  return p;
}

LX_TARGET void translate(const uint8_t table[256], const uint8_t* p, size_t count, uint8_t* to) {
  const __m512i part[] = {_mm512_loadu_si512(table), _mm512_loadu_si512(table + kBytes),
                          _mm512_loadu_si512(table + 2 * kBytes), _mm512_loadu_si512(table + 3 * kBytes)};
  for (size_t i = 0; i < count; i += kBytes) {
    const uint64_t inside = ones(least(count - i, kBytes));
    const __m512i index = _mm512_maskz_loadu_epi8(inside, p + i);
    const __m512i found =
        _mm512_mask_mov_epi8(_mm512_permutex2var_epi8(part[0], index, part[1]), _mm512_movepi8_mask(index),
                             _mm512_permutex2var_epi8(part[2], index, part[3]));
    _mm512_mask_storeu_epi8(to + i, inside, found);
  }
}

/// The first of the units that `which` has.
LX_TARGET inline unsigned first_of(__m512i units, __mmask32 which) {
  return static_cast<uint16_t>(
      _mm_cvtsi128_si32(_mm512_castsi512_si128(_mm512_maskz_compress_epi16(which, units))));
}

/// Where a character of two bytes stands.
LX_TARGET inline uint64_t places_of_pair(unsigned u, __m512i block, __m512i next) {
  return _mm512_cmpeq_epi8_mask(block, _mm512_set1_epi8(static_cast<char>(0xC0 | u >> 6))) &
         _mm512_cmpeq_epi8_mask(next, _mm512_set1_epi8(static_cast<char>(0x80 | (u & 0x3F))));
}

LX_TARGET size_t map_utf8(const Utf8Case& how, const uint8_t* p, size_t count, uint8_t* to,
                          MappedBlock* mapped) {
  auto used = static_cast<unsigned>(least(count, kBytes));
  const uint64_t inside = ones(used);
  const __m512i block = _mm512_maskz_loadu_epi8(inside, p);
  const __m512i above = _mm512_sub_epi8(block, _mm512_set1_epi8(how.upper ? 'a' : 'A'));
  const __mmask64 letters = _mm512_cmplt_epu8_mask(above, _mm512_set1_epi8(26));
  __m512i result = _mm512_xor_si512(block, _mm512_maskz_set1_epi8(letters, 0x20));
  const uint64_t high = _mm512_movepi8_mask(block);
  uint64_t left = 0;
  if (high != 0) {
    const Marks marks = marks_of(block, high, inside);
    const uint64_t longer = high & marks.leads;
    used = marks.usable(longer, used);
    const __m512i next = _mm512_maskz_loadu_epi8(inside >> 1, p + 1);
    const __m512i caseless = _mm512_permutex2var_epi8(_mm512_loadu_si512(how.caseless + 0x80), block,
                                                      _mm512_loadu_si512(how.caseless + 0xC0));
    const uint64_t cased = longer & ones(used) & _mm512_testn_epi8_mask(caseless, caseless);
    left = marks.three & (how.special_three ? ~uint64_t{0} : cased);
    if (how.special != 0) left |= places_of_pair(how.special, block, next);
    left &= longer & ones(used);
    // First byte by first byte: a text has few.
    for (uint64_t pairs = cased & ~marks.three; pairs != 0;) {
      const uint8_t first = p[__builtin_ctzll(pairs)];
      const uint64_t here =
          _mm512_mask_cmpeq_epi8_mask(pairs, block, _mm512_set1_epi8(static_cast<char>(first)));
      pairs &= ~here;
      if (how.row[first] != 0) {
        const PairCaseRow& row = how.rows[how.row[first] - 1];
        const __m512i firsts = _mm512_permutexvar_epi8(next, _mm512_loadu_si512(row.first));
        const __m512i seconds = _mm512_permutexvar_epi8(block, _mm512_loadu_si512(row.second));
        left |= _mm512_mask_testn_epi8_mask(here, firsts, firsts);
        result = _mm512_mask_mov_epi8(result, here, firsts);
        result = _mm512_mask_mov_epi8(result, here << 1, seconds);
      } else {
        left |= here;
      }
    }
  }
  mapped->left = left;
  if (left != 0) {
    _mm512_storeu_si512(mapped->given, block);
    _mm512_storeu_si512(mapped->before, _mm512_maskz_loadu_epi8(ones(used), to));
  }
  _mm512_mask_storeu_epi8(to, ones(used), result);
  return used;
}

LX_TARGET uint8_t* write_bytes(const PairCodes& at, uint8_t* p, const uint16_t* values, size_t count) {
  for (size_t i = 0; i < count; i += kUnits) {
    const auto inside = static_cast<__mmask32>(ones(least(count - i, kUnits)));
    const __m512i v = _mm512_maskz_loadu_epi16(inside, values + i);
    const __m512i pages = _mm512_srli_epi16(v, 8);
    const __m256i low = _mm512_cvtepi16_epi8(v);
    __m512i codes = v;
    // Page by page: a text has few.
    for (__mmask32 left = inside; left != 0;) {
      const unsigned page = first_of(pages, left);
      const __mmask32 here =
          _mm512_mask_cmpeq_epi16_mask(left, pages, _mm512_set1_epi16(static_cast<short>(page)));
      codes = _mm512_mask_mov_epi16(codes, here, Table(at.codes + at.page_start[page]).at(low));
      left &= ~here;
    }
    _mm256_mask_storeu_epi8(p + i, inside, _mm512_cvtepi16_epi8(codes));
  }
  return p + count;
}

}  // namespace

const Vectors kAvx512Vectors = {"AVX-512",   1,           1,          kLeastPassed, pass,     read_utf8,
                                read_pairs,  copy_same,   look_up,    translate,    map_utf8, write_utf8,
                                write_pairs, write_shift, write_wide, write_bytes};

bool has_avx512() {
  return __builtin_cpu_supports("avx512vbmi2") && __builtin_cpu_supports("avx512vbmi") &&
         __builtin_cpu_supports("avx512bw") && __builtin_cpu_supports("avx512vl") &&
         __builtin_cpu_supports("bmi2") && __builtin_cpu_supports("popcnt");
}

}  // namespace lx

#endif
