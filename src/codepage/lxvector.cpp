// The loops of the base of a machine, in SSE2 or none; and which level is used.
#include "codepage/lxvectorlevels.h"

namespace lx {
namespace {

/// Reads a character of one byte or two.
inline bool read_short(const uint8_t** p, size_t left, uint16_t* value) {
  const uint8_t* const q = *p;
  if (left == 0 || (q[0] >= kAscii && (left < 2 || q[0] < 0xC2 || q[0] > 0xDF))) return false;
  *value = q[0] < kAscii ? q[0] : utf8_unicode(q);
  *p += q[0] < kAscii ? 1 : 2;
  return true;
}

size_t ones(size_t bits) {
  constexpr size_t kAll = SIZE_MAX;
  bits -= bits >> 1 & kAll / 3;
  bits = (bits & kAll / 5) + (bits >> 2 & kAll / 5);
  bits = (bits + (bits >> 4)) & kAll / 17;
  return bits * (kAll / 255) >> (CharBlock::kBytes - 8);
}

}  // namespace

namespace base {

PassedRun pass(const LeadRanges& leads, const uint8_t* p, const uint8_t* end, size_t most) {
  constexpr size_t kBytes = CharBlock::kBytes;
  size_t chars = 0, trails = 0, last_starts = 0;
  const uint8_t* const stop = p + least(most, room(p, end));  // so many bytes are not more characters
  for (; kVectors && room(p, stop) >= kBytes; p += kBytes) {
    if (leads.above_ascii && trails == 0 && CharBlock::is_ascii(p)) {
      chars += kBytes;
      continue;
    }
    const CharBlock block(p, leads);
    const CharStarts<size_t> chars_of(block.two, block.three, leads.has_three, SIZE_MAX, trails);
    if (!chars_of.known) break;
    last_starts = chars_of.starts;
    chars += ones(last_starts);
    trails = chars_of.trails();
  }
  if (trails != 0) {  // the last one goes on behind the blocks
    p -= 1 + static_cast<size_t>(__builtin_clzl(last_starts));
    --chars;
  }
  return {p, chars};
}

/// Characters of three bytes are read in a loop of their own, others by blocks.
ReadRun read_utf8(const uint8_t* q, const uint8_t* end, uint16_t* values, size_t most, RunRule rule) {
  size_t n = 0;
  while (n < most) {
    const size_t left = room(q, end);
    if (left >= 3 && (*q & 0xF0) == 0xE0) {
      const size_t run_end = n + least(most - n, left / 3);
      do {
        values[n++] = utf8_unicode(q);
        q += 3;
      } while (n < run_end && (*q & 0xF0) == 0xE0);
      continue;
    }
    // A block leaves a value behind its last one: there is one more character, whose value overwrites it.
    if (!kVectors || most - n <= kBlock || left < kBlock + kMaxCharBytes) {
      const size_t few = least(most - n, left);
      const size_t ascii = lx::copy_same(values + n, q, few, kAscii);
      n += ascii;
      q += ascii;
      if (ascii != 0) continue;
      if (!read_short(&q, left, values + n)) break;
      ++n;
      continue;
    }
    Utf8Block block(q);
    if (block.ascii()) {
      if (rule.below != 0 && n != 0 && left >= 2 * kBlock && is_same_block(q + kBlock, rule.below)) break;
      const size_t same = copy_same_blocks(values + n, q, least(most - n, left), kAscii);
      n += same;
      q += same;
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
    } else {
      if (!read_short(&q, left, values + n)) break;
      ++n;
    }
  }
  return {q, n};
}

ReadRun read_pairs(const PairRows& pairs, const uint8_t* q, const uint8_t* end, uint16_t* values, size_t most,
                   RunRule rule) {
  const PairRows rows = pairs;  // in registers
  const LeadRanges& leads = rows.leads;
  size_t n = 0;
  while (kVectors && most - n >= CharBlock::kBytes && room(q, end) > CharBlock::kBytes) {
    if (pairs.ascii && is_same_block(q, kAscii)) {
      if (rule.below != 0 && n != 0 && is_same_block(q + kBlock, kAscii)) break;
      copy_block(values + n, q);
      n += kBlock;
      q += kBlock;
      continue;
    }
    const CharBlock block(q, leads);
    const CharStarts<size_t> chars(block.two, block.three, leads.has_three, SIZE_MAX, 0);
    if (chars.three != 0) break;
    for (size_t starts = chars.starts; starts != 0; starts &= starts - 1)
      values[n++] = pair_value(rows, q + __builtin_ctzl(starts));
    q += CharBlock::kBytes + chars.trails();
  }
  return {q, n};
}

void translate(const uint8_t table[256], const uint8_t* p, size_t count, uint8_t* to) {
  for (size_t i = 0; i < count; ++i) to[i] = table[p[i]];
}

uint8_t* write_utf8(uint8_t* p, const uint16_t* values, size_t count) {
  size_t i = 0;
  while (i < count) {
    if (values[i] < kAscii) {
      const size_t same = copy_same_blocks(p, values + i, count - i, kAscii);
      p += same;
      i += same;
      if (same != 0) continue;
    }
    // A character follows the batch, so that the byte that may be behind it is written again.
    if (count - i > kUtf8Batch && put_short_batch(values + i, &p)) {
      i += kUtf8Batch;
      continue;
    }
    const size_t batch_end = i + least(count - i, kUtf8Batch);
    for (; i < batch_end; ++i) {
      const size_t n = utf8_bytes(values[i]);
      store_utf8(p, values[i], n);
      p += n;
    }
  }
  return p;
}

bool copy_same(uint8_t* to, const uint8_t* from, size_t count, unsigned below) {
  size_t i = 0;
  while (count - i >= kBlock && is_same_block(from + i, below)) i += kBlock;
  if (count - i >= kBlock) return false;
  for (; i < count; ++i)
    if (from[i] >= below) return false;
  memcpy(to, from, count);
  return true;
}

void look_up(const uint16_t table[256], const uint8_t* p, size_t count, uint16_t* values, RunRule) {
  size_t i = 0;
  for (; count - i >= kBlock; i += kBlock)
#pragma GCC unroll 16
    for (size_t k = 0; k < kBlock; ++k) values[i + k] = table[p[i + k]];
  for (; i < count; ++i) values[i] = table[p[i]];
}

uint8_t* write_pairs(const PairCodes& codes, uint8_t* p, const uint16_t* values, size_t count) {
  const PairCodes at = codes;
  // Whether a character has one byte or two is not predictable, so there is no branch.
  for (size_t i = 0; i < count; ++i) {
    const unsigned code = at.codes[at.page_start[values[i] >> 8] + (values[i] & 0xFFu)];
    const unsigned two = (0xFFu - code) >> 31;
    p[0] = static_cast<uint8_t>(code >> 8);
    p[two] = static_cast<uint8_t>(code);
    p += 1 + two;
  }
  return p;
}

uint8_t* write_wide(const WideCodes& codes, uint8_t* p, const uint16_t* values, size_t count) {
  const WideCodes at = codes;
  for (; count != 0; ++values, --count) {
    const uint32_t code = at.codes[at.page_start[*values >> 8] + (*values & 0xFFu)];
    const size_t bytes = code_bytes(code);
    // All bytes that a code may have are stored, where enough characters follow.
    if (count > kMaxCharBytes)
      put_le32(p, __builtin_bswap32(code << 8 * (kMaxCharBytes - bytes)));
    else
      store_code(p, code, bytes);
    p += bytes;
  }
  return p;
}

uint8_t* write_bytes(const PairCodes& codes, uint8_t* p, const uint16_t* values, size_t count) {
  constexpr size_t kBatch = 8;
  const PairCodes at = codes;
  const auto code = [&](unsigned u) {
    return static_cast<uint8_t>(at.codes[at.page_start[u >> 8] + (u & 0xFF)]);
  };
  size_t i = 0;
  for (; count - i >= kBatch; i += kBatch) {
    uint8_t batch[kBatch];
#pragma GCC unroll 8
    for (size_t k = 0; k < kBatch; ++k) batch[k] = code(values[i + k]);
    memcpy(p + i, batch, kBatch);
  }
  for (; i < count; ++i) p[i] = code(values[i]);
  return p + count;
}

}  // namespace base

namespace {

constexpr Vectors kBaseVectors = {kVectors ? "SSE2" : "none",
                                  kBasePivotBytes,
                                  kBasePairPivotBytes,
                                  kBaseLeastPassed,
                                  base::pass,
                                  base::read_utf8,
                                  base::read_pairs,
                                  base::copy_same,
                                  base::look_up,
                                  base::translate,
                                  nullptr,
                                  base::write_utf8,
                                  base::write_pairs,
                                  nullptr,
                                  base::write_wide,
                                  base::write_bytes};

}  // namespace

const Vectors* vectors = &kBaseVectors;

size_t vectors_here(const Vectors* found[kMostVectors]) {
  size_t count = 0;
#if defined(__SSE2__)
  __builtin_cpu_init();
#if defined(__x86_64__)
  if (has_avx512()) found[count++] = &kAvx512Vectors;
#endif
  if (has_sse4()) found[count++] = &kSse4Vectors;
#endif
  found[count++] = &kBaseVectors;
  return count;
}

namespace {

[[gnu::constructor(101)]] void choose_vectors() {
  const Vectors* found[kMostVectors];
  vectors_here(found);
  vectors = found[0];
}

}  // namespace
}  // namespace lx
