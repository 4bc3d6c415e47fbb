// Runs of characters: the inner loops of conversion. A loop keeps its places in local variables, because a
// store of a byte may change any member, and steps by branches rather than by looked-up lengths, because a
// branch is predicted and a load is waited for.
#include "codepage/lxsink.h"

namespace lx {
namespace {

bool stops_at(const uint8_t* p, unsigned below) {
  return below != 0 && is_same_block(p, below);
}

/// The Unicode value of a two-byte character where the root's children are leaves.
uint16_t two_byte_unicode(const uint16_t* rows, const uint8_t* p) {
  const size_t node = rows[p[0]];
  return node != 0 ? rows[node << 8 | p[1]] : kNoUnicode;
}

}  // namespace

template <>
size_t SingleByteCursor::read_run(LXUChar* values, size_t most, unsigned below) {
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
size_t Utf8Cursor::read_run(LXUChar* values, size_t most, unsigned below) {
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
    // A block leaves a value behind its last one: there is one more character, whose value overwrites it.
    if (kVectors && plain && most - n > kBlock && left >= kBlock + kMaxCharBytes) {
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
size_t MultiByteCursor::read_run(LXUChar* values, size_t most, unsigned below) {
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

size_t ShiftCursor::read_run(LXUChar* values, size_t most, unsigned) {
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

Passed pass_blocks(const Codepage& cp, const uint8_t* p, const uint8_t* end, size_t most) {
  const LeadRanges leads = cp.leads;
  size_t chars = 0;
  // So many characters have at least the bytes that are looked at, also where no end is known.
  while (kVectors && leads.known && most - chars >= CharBlock::kBytes &&
         room(p, end) >= CharBlock::kBytes + kMaxCharBytes) {
    const CharBlock block(p, leads);
    if (block.known()) {
      chars += block.chars();
      p += block.bytes();
      continue;
    }
    for (size_t i = 0; i < CharBlock::kBytes / kMaxCharBytes; ++i, ++chars) p += cp.length(*p);
  }
  return {p, chars};
}

template <>
void SingleByteSink::put_run(const LXUChar* values, size_t count) {
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
void Utf8Sink::put_run(const LXUChar* values, size_t count) {
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
void MultiByteSink::put_run(const LXUChar* values, size_t count) {
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

template <>
void ShiftSink::put_run(const LXUChar* values, size_t count) {
  size_t i = 0;
  if (cp.codes16 != nullptr) {
    const uint32_t* const page_start = cp.page_start;
    const uint16_t* const codes = cp.codes16;
    uint8_t* q = p;
    const auto code_at = [=](size_t at) {
      return unsigned{codes[page_start[values[at] >> 8] + (values[at] & 0xFFu)]};
    };
    while (i < count) {
      unsigned code = code_at(i);
      if (shift_due(code <= 0xFF ? 1 : 2)) *q++ = take_shift_byte();
      if (state == LX_SHIFT_SINGLE) {
        for (; code <= 0xFF; code = code_at(i)) {
          *q++ = static_cast<uint8_t>(code);
          if (++i == count) break;
        }
      } else {
        for (; code > 0xFF; code = code_at(i)) {
          put_le16(q, static_cast<uint16_t>(code << 8 | code >> 8));
          q += 2;
          if (++i == count) break;
        }
      }
    }
    p = q;
  }
  for (; i < count; ++i) put(values[i]);
}

}  // namespace lx
