// Runs of characters: the inner loops of conversion. A loop keeps its places in local variables, because a
// store of a byte may change any member, and steps by branches rather than by looked-up lengths, because a
// branch is predicted and a load is waited for.
#include "codepage/lxsink.h"
#include "codepage/lxvector.h"

namespace lx {
namespace {

/// The Unicode value of a two-byte character where the root's children are leaves.
uint16_t two_byte_unicode(const uint16_t* rows, const uint8_t* p) {
  const size_t node = rows[p[0]];
  const uint16_t value = rows[node << 8 | p[1]];
  return node != 0 ? value : kNoUnicode;
}

bool is_long_same(const uint8_t* p, const uint8_t* end, unsigned below) {
  return below != 0 && room(p, end) >= 2 * kBlock && is_same_block(p, below) &&
         is_same_block(p + kBlock, below);
}

/// How many of `count` units stand before a block of units below `below`.
template <class Unit>
size_t units_before_same(const Unit* units, size_t count, unsigned below) {
  if (below == 0) return count;
  size_t n = 0;
  while (count - n >= kBlock && !is_same_block(units + n, below)) n += kBlock;
  return count - n < kBlock ? count : n;
}

/// Writes values: blocks of those that stay what they are copied, others by `put(values, count, to)`, which
/// returns where they end.
template <class Put>
uint8_t* put_values(uint8_t* to, const LXUChar* values, size_t count, unsigned below, Put&& put) {
  while (count != 0) {
    const size_t same = below != 0 ? copy_same_blocks(to, values, count, below) : 0;
    to += same;
    values += same;
    count -= same;
    const size_t others = units_before_same(values, count, below);
    to = put(values, others, to);
    values += others;
    count -= others;
  }
  return to;
}

}  // namespace

template <>
size_t SingleByteCursor::read_run(LXUChar* values, size_t most, RunRule rule) {
  const size_t n = units_before_same(p, least(most, room(p, end)), rule.below);
  size_t i = cp.same_below > kAscii ? copy_same(values, p, n, cp.same_below) : 0;
  if (i != n) vectors->look_up(cp.unicode, p + i, n - i, values + i, rule);
  p += n;
  return n;
}

ReadRun read_odd_utf8(const Codepage& cp, const uint8_t* q, const uint8_t* end, LXUChar* values, size_t most) {
  size_t n = 0;
  while (n < most) {
    const size_t left = room(q, end);
    if (left == 0) break;
    const size_t length = cp.length(*q);
    if (length > left) break;
    if (length == 1) {
      values[n++] = cp.unicode[*q++];
    } else {
      values[n++] = utf8_unicode(q);
      q += length;
    }
    // Behind one that was odd the text may go on as any other.
    if (cp.plain_utf8 && left > kBlock) break;
  }
  return {q, n};
}

template <>
size_t MultiByteCursor::read_run(LXUChar* values, size_t most, RunRule rule) {
  constexpr size_t kFewChars = 64;  // then others may follow
  const PairRows& pairs = cp.pairs;
  if (pairs.first != nullptr) {
    const ReadRun run = vectors->read_pairs(pairs, p, end, values, most, rule);
    p = run.p;
    if (run.count != 0) return run.count;
  }
  const uint8_t* q = p;
  size_t n = 0;
  while (n < most) {
    const size_t left = room(q, end);
    if (left == 0 || (n >= kFewChars && left > kFewChars)) break;
    if (*q < cp.same_below) {
      if (n >= kBlock && is_long_same(q, end, rule.below)) break;
      const size_t same = copy_same(values + n, q, least(most - n, left), cp.same_below);
      n += same;
      q += same;
      continue;
    }
    const size_t length = cp.length(*q);
    if (length > left) break;
    if (length == 1) {
      values[n++] = cp.unicode[*q++];
    } else {
      values[n++] = length == 2 && pairs.first != nullptr ? pair_value(pairs, q) : row_unicode(cp, q);
      q += length;
    }
  }
  p = q;
  return n;
}

constexpr size_t kManyShiftChars = 32;  // of fewer, one run after the other is as good

/// Reads blocks of characters up to a shift byte each, where the rows have two levels. A shift byte is looked for in
/// all of a block at once, and its characters are read whether they stand before it or not: what comes is not guessed.
/// Values that do not count are written over by those of the characters that follow.
size_t read_shift_blocks(ShiftCursor* in, LXUChar* values, size_t most, RunRule rule) {
  constexpr size_t kChars = kBlock / 2;
  constexpr size_t kBytesBehind = kChars * 3;  // of so many characters, with shift bytes
  constexpr unsigned kPairs = 0x5555;
  const Codepage& c = in->cp;
  const uint16_t* const rows = c.rows;
  const uint8_t *q = in->p, *const end = in->end;
  LXShiftState s = in->state;
  size_t n = 0;
  while (most - n >= kChars && room(q, end) > kBlock + kBytesBehind) {
    take_shift(c, &q, &s);
    // The character behind a shift byte is not looked at: a second shift byte in a row is one.
    const unsigned shifts = places_of_either(q, c.shift_out, c.shift_in) & ~1u;
    size_t chars;
    if (s == LX_SHIFT_DOUBLE) {
      chars = static_cast<size_t>(__builtin_ctz((shifts & kPairs) | 1u << kBlock)) / 2;
      for (size_t i = 0; i < kChars; ++i) values[n + i] = two_byte_unicode(rows, q + 2 * i);
      q += 2 * chars;
    } else if (shifts != 0) {
      chars = static_cast<size_t>(__builtin_ctz(shifts | 1u << kChars));
      for (size_t i = 0; i < kChars; ++i) values[n + i] = c.unicode[q[i]];
      q += chars;
    } else {
      chars = least(most - n, room(q, end));
      chars = 1 + units_before_either(q + 1, chars - 1, c.shift_out, c.shift_in);
      vectors->look_up(c.unicode, q, chars, values + n, rule);
      q += chars;
    }
    n += chars;
  }
  in->p = q;
  in->state = s;
  return n;
}

size_t ShiftCursor::read_run(LXUChar* values, size_t most, RunRule rule) {
  constexpr size_t kMostBytes = 1 + kMaxCharBytes;
  const Codepage& c = cp;
  const uint16_t* const rows = c.two_level_rows && c.width == 2 ? c.rows : nullptr;
  const unsigned shift_out = c.shift_out, shift_in = c.shift_in;
  size_t n =
      rows != nullptr && room(p, end) >= 2 * kManyShiftChars ? read_shift_blocks(this, values, most, rule) : 0;
  const uint8_t* q = p;
  LXShiftState s = state;
  while (n < most && room(q, end) >= kMostBytes) {
    take_shift(c, &q, &s);
    size_t chars = least(most - n, room(q, end) / c.width_in(s));
    // The character behind a shift byte is not looked at: a second shift byte in a row is one.
    if (s != LX_SHIFT_DOUBLE) {
      chars = 1 + units_before_either(q + 1, chars - 1, c.shift_out, c.shift_in);
      vectors->look_up(c.unicode, q, chars, values + n, rule);
      n += chars;
      q += chars;
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

PassedRun pass_blocks(const Codepage& cp, const uint8_t* p, const uint8_t* end, size_t most) {
  size_t chars = 0;
  while (cp.leads.known && most - chars >= kPassedBytes && room(p, end) >= vectors->least_passed) {
    const PassedRun run = vectors->pass(cp.leads, p, end, most - chars);
    p = run.p;
    chars += run.count;
    if (run.count != 0) continue;
    for (size_t i = 0; i < kPassedBytes / kMaxCharBytes && room(p, end) >= kMaxCharBytes; ++i, ++chars)
      p += cp.length(*p);
  }
  return {p, chars};
}

template <>
void SingleByteSink::put_run(const LXUChar* values, size_t count) {
  const PairCodes codes{cp.page_start, cp.codes16};
  p = put_values(p, values, count, cp.same_below,
                 [&](const LXUChar* v, size_t n, uint8_t* q) { return vectors->write_bytes(codes, q, v, n); });
}

template <>
void MultiByteSink::put_run(const LXUChar* values, size_t count) {
  const PairCodes codes{cp.page_start, cp.codes16};
  const WideCodes wide{cp.page_start, cp.codes32};
  p = put_values(p, values, count, cp.same_below, [&](const LXUChar* v, size_t n, uint8_t* q) {
    return wide.codes != nullptr ? vectors->write_wide(wide, q, v, n) : vectors->write_pairs(codes, q, v, n);
  });
}

/// Writes blocks of characters: a shift byte and two bytes are stored for every one, and those that it does not have are
/// written over by the next one, of which there is one behind the last block. How many were written.
size_t put_shift_blocks(ShiftSink* out, const LXUChar* values, size_t count) {
  constexpr size_t kChars = kBlock / 2;
  const uint32_t* const page_start = out->cp.page_start;
  const uint16_t* const codes = out->cp.codes16;
  const uint8_t shift_bytes[] = {out->cp.shift_in, out->cp.shift_out};
  unsigned two = out->state == LX_SHIFT_DOUBLE;
  uint8_t* q = out->p;
  size_t n = 0;
  for (; count - n > kChars; n += kChars) {
    uint16_t block[kChars];
    unsigned twos = 0;
    for (size_t i = 0; i < kChars; ++i) {
      block[i] = codes[page_start[values[n + i] >> 8] + (values[n + i] & 0xFFu)];
      twos += block[i] > 0xFF;
    }
    if (twos == 0 && two == 0) {
      for (size_t i = 0; i < kChars; ++i) *q++ = static_cast<uint8_t>(block[i]);
    } else if (twos == kChars && two != 0) {
      for (size_t i = 0; i < kChars; ++i, q += 2) put_le16(q, __builtin_bswap16(block[i]));
    } else {
      for (const unsigned code : block) {
        const unsigned before = two;
        two = code > 0xFF;
        *q = shift_bytes[two];
        q += two ^ before;
        put_le16(q, static_cast<uint16_t>(code << 8 * two | code >> 8));
        q += 1 + two;
      }
    }
  }
  out->p = q;
  out->state = two != 0 ? LX_SHIFT_DOUBLE : LX_SHIFT_SINGLE;
  return n;
}

template <>
void ShiftSink::put_run(const LXUChar* values, size_t count) {
  size_t i = 0;
  if (cp.codes16 != nullptr) {
    const uint32_t* const page_start = cp.page_start;
    const uint16_t* const codes = cp.codes16;
    if (vectors->write_shift != nullptr) {
      bool two = state == LX_SHIFT_DOUBLE;
      p = vectors->write_shift({{page_start, codes}, cp.shift_in, cp.shift_out}, &two, p, values, count);
      state = two ? LX_SHIFT_DOUBLE : LX_SHIFT_SINGLE;
      return;
    }
    if (count >= kManyShiftChars) i = put_shift_blocks(this, values, count);
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
