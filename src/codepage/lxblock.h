// Blocks of units: all the code that is written for vectors, behind one interface, and its portable form.
// `below` bounds values that are one unit on both sides: 0x80 (ASCII), or 0x100 (all of ISO 8859-1).
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>

#include "core/lxbytes.h"

#if defined(__SSE2__)
#include <emmintrin.h>
#endif

namespace lx {

inline constexpr unsigned kAscii = 0x80;
inline constexpr size_t kBlock = 16;  // units looked at or moved at a time
inline constexpr size_t kHalfBlock = kBlock / 2;
inline constexpr size_t kUtf8Batch = kHalfBlock;  // characters written at a time

/// The bytes that begin characters of several bytes, in ranges: two for characters of two bytes, which may be
/// the same, and one for those of three.
struct LeadRanges {
  struct Range {
    uint8_t first;
    uint8_t others;  // how many bytes follow it
  };
  Range two[2];
  Range three;
  bool has_three;
  bool above_ascii;  // none of them is ASCII
  bool known;        // else the first bytes are otherwise
};

#if defined(__SSE2__)

inline constexpr bool kVectors = true;

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

/// Where one of two bytes stands in a block, one bit a byte.
inline unsigned places_of_either(const uint8_t* from, uint8_t a, uint8_t b) {
  const __m128i v = load_block(from);
  const __m128i is_a = _mm_cmpeq_epi8(v, _mm_set1_epi8(static_cast<char>(a)));
  const __m128i is_b = _mm_cmpeq_epi8(v, _mm_set1_epi8(static_cast<char>(b)));
  return static_cast<unsigned>(_mm_movemask_epi8(_mm_or_si128(is_a, is_b)));
}

/// Where one value stands in half a block with another one behind it, two bits a unit.
inline unsigned places_of_pair(const uint16_t* from, uint16_t first, uint16_t second) {
  const __m128i is_first = _mm_cmpeq_epi16(load_block(from), _mm_set1_epi16(static_cast<short>(first)));
  const __m128i is_second = _mm_cmpeq_epi16(load_block(from + 1), _mm_set1_epi16(static_cast<short>(second)));
  return static_cast<unsigned>(_mm_movemask_epi8(_mm_and_si128(is_first, is_second)));
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

/// Stores the first `count` units of a vector; the others stay as they are.
inline void store_first(uint8_t* to, __m128i v, size_t count) {
  const __m128i place = _mm_setr_epi8(0, 1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12, 13, 14, 15);
  const __m128i stored = _mm_cmplt_epi8(place, _mm_set1_epi8(static_cast<char>(count)));
  store_block(to, _mm_or_si128(_mm_and_si128(stored, v), _mm_andnot_si128(stored, load_block(to))));
}

/// Stores the units of a block that stand at any address, as bytes or as they are, up to the first one that is 0 or not
/// below `below`: how many they are. There is room for a block, of which the rest stays as it is.
inline size_t copy_text_block(uint8_t* to, const uint8_t* units, unsigned below) {
  const __m128i first = load_block(units), second = load_block(units + kBlock), zero = _mm_setzero_si128();
  const __m128i high = _mm_set1_epi16(static_cast<short>(-below));
  const auto copied = [=](__m128i v) {
    return _mm_andnot_si128(_mm_cmpeq_epi16(v, zero), _mm_cmpeq_epi16(_mm_and_si128(v, high), zero));
  };
  const __m128i all = _mm_packs_epi16(copied(first), copied(second));
  const auto count = static_cast<size_t>(__builtin_ctz(~static_cast<unsigned>(_mm_movemask_epi8(all))));
  store_first(to, _mm_packus_epi16(first, second), count);
  return count;
}
inline size_t copy_text_block(uint16_t* to, const uint8_t* units, unsigned) {
  const __m128i first = load_block(units), second = load_block(units + kBlock), zero = _mm_setzero_si128();
  const __m128i ends = _mm_packs_epi16(_mm_cmpeq_epi16(first, zero), _mm_cmpeq_epi16(second, zero));
  const auto count =
      static_cast<size_t>(__builtin_ctz(static_cast<unsigned>(_mm_movemask_epi8(ends)) | 1u << kBlock));
  auto* const bytes = reinterpret_cast<uint8_t*>(to);
  store_first(bytes, first, count < kHalfBlock ? 2 * count : kBlock);
  store_first(bytes + kBlock, second, count < kHalfBlock ? 0 : 2 * count - kBlock);
  return count;
}

inline unsigned byte_mask(__m128i v) {
  return static_cast<unsigned>(_mm_movemask_epi8(v));
}

/// A block of UTF-8 at the start of a character, walked by its first bytes, so that no character waits for the
/// length of the one before. What counts are the characters of one and two bytes up to the first longer one.
/// One bit a byte.
class Utf8Block {
 public:
  explicit Utf8Block(const uint8_t* p) : bytes_(load_block(p)), high_(byte_mask(bytes_)) {}

  bool ascii() const { return high_ == 0; }
  /// The bytes of ASCII at the start.
  size_t ascii_bytes() const { return static_cast<size_t>(__builtin_ctz(high_ | 1u << kBlock)); }

  /// False when there is none, or one of two bytes has no trailing byte, or the reverse.
  bool find_chars() {
    first_ = above(0xBF);
    const unsigned longer = above(0xDF) & high_;
    ours_ = (longer - 1) & ~longer & 0xFFFF;
    const unsigned two = first_ & high_ & ours_;
    return ours_ != 0 && (two & ~above(0xC1)) == 0 && (two << 1 & 0xFFFF) == (~first_ & ours_);
  }

  /// Stores the values of characters that end in the block for certain, and maybe behind them one that does not
  /// count. At the end of the block they are so many that one may be left over.
  size_t store_values(uint16_t* values) {
    uint16_t by_byte[kBlock];
    const __m128i zero = _mm_setzero_si128();
    const __m128i trail = _mm_and_si128(_mm_srli_si128(bytes_, 1), _mm_set1_epi8(0x3F));
    store_block(by_byte, eight(_mm_unpacklo_epi8(bytes_, zero), _mm_unpacklo_epi8(trail, zero)));
    store_block(by_byte + kBlock / 2, eight(_mm_unpackhi_epi8(bytes_, zero), _mm_unpackhi_epi8(trail, zero)));
    if (ours_ == 0xFFFF && !at_most_three(first_ & high_)) {
      constexpr size_t kSure = kBlock / 2;  // so many begin in a block; of many more, the rest waits
#pragma GCC unroll 8
      for (size_t i = 0; i < kSure; ++i, first_ &= first_ - 1) values[i] = by_byte[__builtin_ctz(first_)];
      return kSure;
    }
    constexpr size_t kStarts = kBlock - 1;  // of two bytes, one that begins before this byte ends in the block
    ours_ &= (1u << kStarts) - 1;
    uint16_t* value = values;
    unsigned left = first_ & ours_;
#pragma GCC unroll 15
    for (size_t i = 0; i < kStarts; ++i, left >>= 1) {
      *value = by_byte[i];
      value += left & 1;
    }
    first_ &= ~ours_;
    return static_cast<size_t>(value - values);
  }

  /// The bytes of the characters that were stored.
  size_t bytes() const {
    return static_cast<size_t>(__builtin_ctz(first_ | 1u << kBlock));
  }

 private:
  static bool at_most_three(unsigned bits) {
    bits &= bits - 1;
    bits &= bits - 1;
    return (bits & (bits - 1)) == 0;
  }
  /// In signed order 0x80 to 0xFF stand below ASCII.
  unsigned above(int byte) const {
    return byte_mask(_mm_cmpgt_epi8(bytes_, _mm_set1_epi8(static_cast<char>(byte))));
  }
  /// The values of characters that begin with `lead`.
  static __m128i eight(__m128i lead, __m128i trail) {
    const __m128i two = _mm_or_si128(_mm_slli_epi16(_mm_and_si128(lead, _mm_set1_epi16(0x1F)), 6), trail);
    const __m128i one = _mm_cmplt_epi16(lead, _mm_set1_epi16(0x80));
    return _mm_or_si128(_mm_and_si128(one, lead), _mm_andnot_si128(one, two));
  }

  __m128i bytes_;
  unsigned high_;       // not ASCII
  unsigned first_ = 0;  // begins a character that is not stored
  unsigned ours_ = 0;   // before the first longer character
};

/// A block of multibyte text, where every byte is one bit: those that can begin characters of two bytes and of three.
struct CharBlock {
  static constexpr size_t kBytes = 8 * sizeof(size_t);

  CharBlock(const uint8_t* p, const LeadRanges& leads) : two(in(leads.two[0], p)) {
    if (leads.two[1].first != leads.two[0].first) two |= in(leads.two[1], p);
    if (leads.has_three) three = in(leads.three, p);
  }
  static bool is_ascii(const uint8_t* p) {
    __m128i any = load_block(p);
    for (size_t i = kBlock; i < kBytes; i += kBlock) any = _mm_or_si128(any, load_block(p + i));
    return byte_mask(any) == 0;
  }

  size_t two = 0, three = 0;

 private:
  static size_t in(LeadRanges::Range range, const uint8_t* p) {
    const __m128i first = _mm_set1_epi8(static_cast<char>(range.first));
    const __m128i others = _mm_set1_epi8(static_cast<char>(range.others));
    size_t found = 0;
    for (size_t i = 0; i < kBytes; i += kBlock) {
      const __m128i above = _mm_sub_epi8(load_block(p + i), first);
      found |= size_t{byte_mask(_mm_cmpeq_epi8(_mm_min_epu8(above, others), above))} << i;
    }
    return found;
  }
};

/// Which of kBytes bytes of UTF-8 begin characters of two bytes and three, one bit a byte, and how many bytes the
/// characters have that begin there; false where a byte is not what its place says.
template <size_t kBytes>
inline bool find_long_utf8(const uint8_t* p, size_t* begins, size_t* bytes) {
  size_t high = 0, first = 0, lead = 0, three = 0, four = 0;
  for (size_t i = 0; i < kBytes; i += kBlock) {
    const __m128i v = load_block(p + i);
    const auto above = [&](int byte) {  // in signed order 0x80 to 0xFF stand below ASCII
      return size_t{byte_mask(_mm_cmpgt_epi8(v, _mm_set1_epi8(static_cast<char>(byte))))} << i;
    };
    high |= size_t{byte_mask(v)} << i;
    first |= above(0xBF);
    lead |= above(0xC1);
    three |= above(0xDF);
    four |= above(0xEF);
  }
  *begins = first & high;
  three &= high;
  constexpr size_t kLast = kBytes - 1;
  const size_t trails = (*begins << 1 | three << 2) & SIZE_MAX >> (8 * sizeof(size_t) - kBytes);
  *bytes = kBytes + (*begins >> kLast) + (three >> kLast) + (three >> (kLast - 1) & 1);
  return (*begins | trails) == high && (*begins & trails) == 0 && lead == first && (four & high) == 0;
}

/// Writes a batch of characters when all of them have one or two bytes, and maybe one byte behind the last one.
inline bool put_short_batch(const uint16_t* values, uint8_t** p) {
  const __m128i v = load_block(values);
  const __m128i longer = _mm_and_si128(v, _mm_set1_epi16(static_cast<short>(0xF800)));
  if (byte_mask(_mm_cmpeq_epi16(longer, _mm_setzero_si128())) != 0xFFFF) return false;
  const __m128i trail = _mm_slli_epi16(_mm_and_si128(v, _mm_set1_epi16(0x3F)), 8);
  const __m128i marks = _mm_set1_epi16(static_cast<short>(0x80C0));
  const __m128i two = _mm_or_si128(_mm_or_si128(_mm_srli_epi16(v, 6), trail), marks);
  const __m128i ascii = _mm_cmplt_epi16(v, _mm_set1_epi16(0x80));
  uint16_t stored[kUtf8Batch];
  store_block(stored, _mm_or_si128(_mm_and_si128(ascii, v), _mm_andnot_si128(ascii, two)));
  unsigned one = byte_mask(_mm_packs_epi16(ascii, ascii));
  uint8_t* q = *p;
#pragma GCC unroll 8
  for (size_t k = 0; k < kUtf8Batch; ++k, one >>= 1) {
    put_le16(q, stored[k]);
    q += 2 - (one & 1);
  }
  *p = q;
  return true;
}

#else

inline constexpr bool kVectors = false;

template <class From>
inline bool is_same_block(const From* from, unsigned below) {
  unsigned all = 0;
  for (size_t i = 0; i < kBlock; ++i) all |= from[i];
  return all < below;
}
inline unsigned places_of_either(const uint8_t* from, uint8_t a, uint8_t b) {
  unsigned places = 0;
  for (size_t i = 0; i < kBlock; ++i) places |= unsigned{from[i] == a || from[i] == b} << i;
  return places;
}
inline unsigned places_of_pair(const uint16_t* from, uint16_t first, uint16_t second) {
  unsigned places = 0;
  for (size_t i = 0; i < kBlock / 2; ++i)
    places |= unsigned{from[i] == first && from[i + 1] == second} << 2 * i;
  return places;
}
template <class To, class From>
inline void copy_block(To* to, const From* from) {
  for (size_t i = 0; i < kBlock; ++i) to[i] = static_cast<To>(from[i]);
}

/// No vectors: UTF-8 is read and written character by character.
class Utf8Block {
 public:
  explicit Utf8Block(const uint8_t*) {}
  bool ascii() const { return false; }
  size_t ascii_bytes() const { return 0; }
  bool find_chars() { return false; }
  size_t store_values(uint16_t*) { return 0; }
  size_t bytes() const { return 0; }
};
template <size_t kBytes>
inline bool find_long_utf8(const uint8_t*, size_t*, size_t*) {
  return false;
}
inline bool put_short_batch(const uint16_t*, uint8_t**) {
  return false;
}
inline size_t copy_text_block(void*, const uint8_t*, unsigned) {
  return 0;
}
struct CharBlock {
  static constexpr size_t kBytes = 8 * sizeof(size_t);
  CharBlock(const uint8_t*, const LeadRanges&) {}
  static bool is_ascii(const uint8_t*) { return false; }
  size_t two = 0, three = 0;
};

#endif

/// Copies the blocks of units below `below` at the start of `n` units: how many units there were. What is left of less
/// than a block is copied with units before it.
template <class To, class From>
inline size_t copy_same_blocks(To* to, const From* from, size_t n, unsigned below) {
  size_t i = 0;
  for (; n - i >= kBlock && is_same_block(from + i, below); i += kBlock) copy_block(to + i, from + i);
  const size_t last = n - kBlock;
  if (i == 0 || n - i >= kBlock || !is_same_block(from + last, below)) return i;
  copy_block(to + last, from + last);
  return n;
}

/// The same with the single units behind them. Writes nothing behind the last one.
template <class To, class From>
inline size_t copy_same(To* to, const From* from, size_t n, unsigned below) {
  size_t i = copy_same_blocks(to, from, n, below);
  for (; i < n && from[i] < below; ++i) to[i] = static_cast<To>(from[i]);
  return i;
}

/// How many of `n` bytes stand before one of two.
inline size_t units_before_either(const uint8_t* p, size_t n, uint8_t a, uint8_t b) {
  size_t i = 0;
  while (n - i >= kBlock && places_of_either(p + i, a, b) == 0) i += kBlock;
  while (i < n && p[i] != a && p[i] != b) ++i;
  return i;
}

/// How many of `n` units stand before a value with another one behind it, or before the last one.
inline size_t units_before_pair(const uint16_t* p, size_t n, uint16_t first, uint16_t second) {
  constexpr size_t kHalf = kBlock / 2;
  size_t i = 0;
  for (; n - i > kHalf; i += kHalf)
    if (const unsigned places = places_of_pair(p + i, first, second))
      return i + static_cast<size_t>(__builtin_ctz(places)) / 2;
  while (n - i > 1 && (p[i] != first || p[i + 1] != second)) ++i;
  return i;
}

/// The letters of a block of ASCII in one case; input and output may be the same.
template <class Unit>
inline void case_block(Unit* to, const Unit* from, bool upper) {
  Unit block[kBlock];
  memcpy(block, from, sizeof(block));
  const Unit first = upper ? 'a' : 'A';
  for (Unit& c : block) {
    const Unit above = static_cast<Unit>(c - first);
    c = static_cast<Unit>(c ^ (above < 26 ? 0x20 : 0));
  }
  memcpy(to, block, sizeof(block));
}

}  // namespace lx
