// Runs of characters: the inner loops of conversion. A loop keeps its places in local variables, because a
// store of a byte may change any member, and steps by branches rather than by looked-up lengths, because a
// branch is predicted and a load is waited for.
#include "codepage/lxtext.h"

namespace lx {
namespace {

constexpr size_t kUtf8Batch = kBlock / 2;

bool stops_at(const uint8_t* p, unsigned below) {
  return below != 0 && is_same_block(p, below);
}

/// The Unicode value of a two-byte character where the root's children are leaves.
uint16_t two_byte_unicode(const uint16_t* rows, const uint8_t* p) {
  const size_t node = rows[p[0]];
  return node != 0 ? rows[node << 8 | p[1]] : kNoUnicode;
}

#if defined(__SSE2__)

unsigned byte_mask(__m128i v) {
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
  size_t store_values(LXUChar* values) {
    LXUChar by_byte[kBlock];
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
    LXUChar* value = values;
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

/// Writes a batch of characters when all of them have one or two bytes, and maybe one byte behind the last one.
bool put_short_batch(const LXUChar* values, uint8_t** p) {
  const __m128i v = load_block(values);
  const __m128i longer = _mm_and_si128(v, _mm_set1_epi16(static_cast<short>(0xF800)));
  if (byte_mask(_mm_cmpeq_epi16(longer, _mm_setzero_si128())) != 0xFFFF) return false;
  const __m128i trail = _mm_slli_epi16(_mm_and_si128(v, _mm_set1_epi16(0x3F)), 8);
  const __m128i marks = _mm_set1_epi16(static_cast<short>(0x80C0));
  const __m128i two = _mm_or_si128(_mm_or_si128(_mm_srli_epi16(v, 6), trail), marks);
  const __m128i ascii = _mm_cmplt_epi16(v, _mm_set1_epi16(0x80));
  LXUChar stored[kUtf8Batch];
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

bool put_short_batch(const LXUChar*, uint8_t**) {
  return false;
}

#endif

}  // namespace

size_t SingleByteReader::read_run(LXUChar* values, size_t most, unsigned below) {
  const uint16_t* const unicode = cp.unicode;
  const uint8_t* const start = p;
  const size_t n = least(most, room(p, end));
  size_t i = 0;
  for (; n - i >= kBlock; i += kBlock) {
    if (i != 0 && stops_at(start + i, below)) break;
#pragma GCC unroll 16
    for (size_t k = 0; k < kBlock; ++k) values[i + k] = unicode[start[i + k]];
  }
  if (n - i < kBlock)
    for (; i < n; ++i) values[i] = unicode[start[i]];
  p = start + i;
  return i;
}

template <>
size_t Utf8Reader::read_run(LXUChar* values, size_t most, [[maybe_unused]] unsigned below) {
  const bool plain = cp.same_below != 0;
  const uint8_t* q = p;
  size_t n = 0;
  while (n < most) {
    const size_t left = room(q, end);
    if (left == 0) break;
    if (plain && (*q & 0xF0) == 0xE0 && left >= 3) {
      const size_t run_end = n + least(most - n, left / 3);
      do {
        values[n++] = static_cast<LXUChar>(q[0] << 12 | (q[1] & 0x3F) << 6 | (q[2] & 0x3F));
        q += 3;
      } while (n < run_end && (*q & 0xF0) == 0xE0);
      continue;
    }
#if defined(__SSE2__)
    // A block leaves a value behind its last one: there is one more character, whose value overwrites it.
    if (plain && most - n > kBlock && left >= kBlock + kMaxCharBytes) {
      Utf8Block block(q);
      if (block.ascii()) {
        if (n != 0 && left >= 2 * kBlock && stops_at(q + kBlock, below)) break;
        copy_block(values + n, q);
        n += kBlock;
        q += kBlock;
        continue;
      }
      // Where other letters are few, the ASCII up to the next one is widened at once. The values stored behind
      // it are overwritten: at least a block of characters follows.
      constexpr size_t kWorthIt = 4;
      if (block.ascii_bytes() >= kWorthIt && left >= 4 * kBlock) {
        copy_block(values + n, q);
        n += block.ascii_bytes();
        q += block.ascii_bytes();
      } else if (block.find_chars()) {
        n += block.store_values(values + n);
        q += block.bytes();
        continue;
      }
    }
#endif
    const size_t length = cp.length(*q);
    if (length > left) break;
    if (length == 1) {
      values[n++] = cp.unicode[*q++];
    } else {
      values[n++] = utf8_unicode(q);
      q += length;
    }
  }
  p = q;
  return n;
}

template <>
size_t MultiByteReader::read_run(LXUChar* values, size_t most, unsigned below) {
  const uint16_t* const unicode = cp.unicode;
  const uint16_t* const rows = cp.two_level_rows ? cp.rows : nullptr;
  const uint8_t* q = p;
  size_t n = 0;
  bool after_long = false;
  while (n < most) {
    const size_t left = room(q, end);
    if (left == 0) break;
    const size_t length = cp.length(*q);
    if (length == 1) {
      if (after_long && left >= kBlock && stops_at(q, below)) break;
      after_long = false;
      values[n++] = unicode[*q++];
      continue;
    }
    if (length > left) break;
    after_long = true;
    if (length == 2 && rows != nullptr) {
      values[n++] = two_byte_unicode(rows, q);
      q += 2;
    } else {
      values[n++] = row_unicode(cp, q);
      q += length;
    }
  }
  p = q;
  return n;
}

size_t ShiftReader::read_run(LXUChar* values, size_t most, unsigned) {
  constexpr size_t kMostBytes = 1 + kMaxCharBytes;
  const Codepage& c = cp;
  const uint16_t* const rows = c.two_level_rows && c.width == 2 ? c.rows : nullptr;
  const unsigned shift_out = c.shift_out, shift_in = c.shift_in;
  const uint8_t* q = p;
  LXShiftState s = state;
  size_t n = 0;
  while (n < most && room(q, end) >= kMostBytes) {
    take_shift(c, &q, &s);
    size_t chars = least(most - n, room(q, end) / c.width_in(s));
    // The character behind a shift byte is not looked at: a second shift byte in a row is one.
    if (s != LX_SHIFT_DOUBLE) {
      do {
        values[n++] = c.unicode[*q++];
      } while (--chars != 0 && *q != shift_out && *q != shift_in);
    } else if (rows != nullptr) {
      do {
        values[n++] = two_byte_unicode(rows, q);
        q += 2;
      } while (--chars != 0 && *q != shift_out && *q != shift_in);
    } else {
      values[n++] = multibyte_unicode(c, q);
      q += c.width;
    }
  }
  p = q;
  state = s;
  return n;
}

void SingleByteWriter::put_run(const LXUChar* values, size_t count) {
  constexpr size_t kBatch = 8;
  const uint32_t* const page_start = cp.page_start;
  const uint16_t* const codes = cp.codes16;
  const auto code = [&](unsigned u) { return static_cast<uint8_t>(codes[page_start[u >> 8] + (u & 0xFF)]); };
  uint8_t* const q = p;
  size_t i = cp.same_below != 0 ? copy_same_blocks(q, values, count, cp.same_below) : 0;
  for (; count - i >= kBatch; i += kBatch) {
    uint8_t batch[kBatch];
#pragma GCC unroll 8
    for (size_t k = 0; k < kBatch; ++k) batch[k] = code(values[i + k]);
    memcpy(q + i, batch, kBatch);
  }
  for (; i < count; ++i) q[i] = code(values[i]);
  p = q + count;
}

template <>
void Utf8Writer::put_run(const LXUChar* values, size_t count) {
  uint8_t* q = p;
  size_t i = 0;
  while (i < count) {
    // A character follows the batch, so that the byte that may be behind it is written again.
    if (count - i > kUtf8Batch && put_short_batch(values + i, &q)) {
      i += kUtf8Batch;
      continue;
    }
    const size_t batch_end = i + least(count - i, kUtf8Batch);
    for (; i < batch_end; ++i) {
      const size_t n = utf8_bytes(values[i]);
      store_utf8(q, values[i], n);
      q += n;
    }
  }
  p = q;
}

template <>
void MultiByteWriter::put_run(const LXUChar* values, size_t count) {
  size_t i = 0;
  if (cp.codes16 != nullptr) {
    const uint32_t* const page_start = cp.page_start;
    const uint16_t* const codes = cp.codes16;
    uint8_t* q = p;
    // Whether a character has one byte or two is not predictable, so there is no branch.
    for (; i < count; ++i) {
      const unsigned u = values[i];
      const unsigned code = codes[page_start[u >> 8] + (u & 0xFF)];
      const unsigned two = (0xFFu - code) >> 31;
      q[0] = static_cast<uint8_t>(code >> 8);
      q[two] = static_cast<uint8_t>(code);
      q += 1 + two;
    }
    p = q;
  }
  for (; i < count; ++i) put(values[i]);
}

void ShiftWriter::put_run(const LXUChar* values, size_t count) {
  size_t i = 0;
  if (cp.codes16 != nullptr) {
    const uint32_t* const page_start = cp.page_start;
    const uint16_t* const codes = cp.codes16;
    uint8_t* q = p;
    LXShiftState s = state;
    for (; i < count; ++i) {
      const unsigned u = values[i];
      const uint16_t code = codes[page_start[u >> 8] + (u & 0xFF)];
      if (code <= 0xFF) {
        if (s != LX_SHIFT_SINGLE) {
          *q++ = cp.shift_in;
          s = LX_SHIFT_SINGLE;
        }
        *q++ = static_cast<uint8_t>(code);
      } else {
        if (s == LX_SHIFT_SINGLE) {
          *q++ = cp.shift_out;
          s = LX_SHIFT_DOUBLE;
        }
        put_le16(q, static_cast<uint16_t>(code << 8 | code >> 8));
        q += 2;
      }
    }
    p = q;
    state = s;
  }
  for (; i < count; ++i) put(values[i]);
}

}  // namespace lx
