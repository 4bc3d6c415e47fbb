// Characters moved from a cursor to a sink.
#pragma once

#include "codepage/lxtext.h"

namespace lx {

inline constexpr size_t kRunChars = 128;  // moved at a time through a buffer on the stack
// With few registers more calls cost more than they save.
inline constexpr bool kManyRegisters = sizeof(size_t) == 8;
inline constexpr size_t kRunUnits =
    kManyRegisters ? 8 : 48;                      // of shorter Unicode characters are moved one by one
inline constexpr size_t kTranslatedBytes = 1024;  // from so many on a table from bytes to bytes pays
inline constexpr size_t kShiftRunUnits = 16;      // the same where shift states are kept

/// Why a transfer of characters stopped.
enum class Stop { kInputEnd, kInputCut, kOutputFull, kCount };

template <class Value>
struct Transfer {
  Stop stop;
  size_t chars;  // written
  Value held;    // kOutputFull: the character that was read and did not fit
};

/// What both sides have the same below.
template <class Cursor, class Sink>
inline unsigned same_below(const Cursor& in, const Sink& out) {
  return in.same_below() < out.same_below() ? in.same_below() : out.same_below();
}

/// Moves the characters that fit for certain, as Unicode values: how many they were. Not inline: the loops of
/// transfer(), which the shortest texts take, stay small.
template <class Cursor, class Sink>
[[gnu::noinline]] size_t move_runs(Cursor* in_at, Sink* out_at, size_t count) {
  Cursor in = *in_at;
  Sink out = *out_at;
  const unsigned below = same_below(in, out);
  size_t left = count;
  if constexpr (std::is_same_v<Cursor, SingleByteCursor> && std::is_same_v<Sink, SingleByteSink>) {
    const size_t n = least(left, room(in.p, in.end), room(out.p, out.end));
    if (n >= kTranslatedBytes && below <= kAscii) {
      uint8_t table[256];
      for (size_t b = 0; b < sizeof(table); ++b) table[b] = out.encode(in.cp.unicode[b]);
      vectors->translate(table, in.p, n, out.p);
      in.p += n;
      out.p += n;
      left -= n;
    }
  }
  for (size_t n = 1; n != 0 && in.p != in.end; left -= n) {
    if constexpr (Sink::kUnicode) {
      n = in.read_run(out.p, least(left, room(out.p, out.end)), RunRule{});
      out.p += n;
    } else if constexpr (Cursor::kUnicode) {
      n = least(left, room(in.p, in.end), room(out.p, out.end) / out.most_units());
      out.put_run(in.p, n);
      in.p += n;
    } else {
      if (below != 0) {
        n = copy_same_blocks(out.p, in.p, least(left, room(in.p, in.end), room(out.p, out.end)), below);
        in.p += n;
        out.p += n;
        left -= n;
      }
      LXUChar values[kRunChars + kRunSlack];
      n = in.read_run(values, least(left, kRunChars, room(out.p, out.end) / out.most_units()),
                      {below, kRunSlack});
      out.put_run(values, n);
    }
  }
  go_on_at(*in_at, in);
  go_on_at(*out_at, out);
  return count - left;
}

/// Moves characters from a cursor to a sink, at most `count` of them, as Unicode values or as packed codes.
template <class Value, class Cursor, class Sink>
inline Transfer<Value> transfer(Cursor& in, Sink& out, size_t count) {
  // Units that stay what they are need no runs of equal ones; and runs are of Unicode values, which some codes lack.
  constexpr bool kRuns =
      Cursor::kRuns && Sink::kRuns && !(Cursor::kUnicode && Sink::kUnicode) && std::is_same_v<Value, LXUChar>;
  size_t left = count;
  unsigned below = 0;
  if constexpr (kRuns) {
    constexpr bool kShift = Cursor::kShifts || Sink::kShifts;
    constexpr bool kPivot = !Cursor::kUnicode && !Sink::kUnicode;
    constexpr bool kPairs =
        kPivot && (std::is_same_v<Cursor, MultiByteCursor> || std::is_same_v<Sink, MultiByteSink>);
    const size_t worth = kShift   ? kShiftRunUnits
                         : kPairs ? vectors->pair_pivot_bytes
                         : kPivot ? vectors->pivot_bytes
                                  : kRunUnits;
    if (room(in.p, in.end) >= worth) {
      // On copies: what other functions see in memory cannot stay in registers below.
      Cursor long_in = in;
      Sink long_out = out;
      left -= move_runs(&long_in, &long_out, left);
      go_on_at(in, long_in);
      go_on_at(out, long_out);
      if (in.p == in.end) return {Stop::kInputEnd, count - left, Value{}};
    }
    below = same_below(in, out);
  }
  if constexpr (Cursor::kOneUnit && Sink::kOneUnit) {
    const size_t n = least(left, room(in.p, in.end), room(out.p, out.end));
    const auto* const from = in.p;
    auto* const to = out.p;
    for (size_t i = 0; i < n; ++i) {
      Value value{};
      in.decode(from[i], &value);
      to[i] = out.encode(value);
    }
    in.p += n;
    out.p += n;
    left -= n;
  }
  Value value{};
  for (;;) {
    if constexpr (kRuns && !(Cursor::kOneUnit && Sink::kOneUnit)) {
      if (below != 0) {
        const size_t n = copy_same(out.p, in.p, least(left, room(in.p, in.end), room(out.p, out.end)), below);
        in.p += n;
        out.p += n;
        left -= n;
      }
    }
    do {
      if (!in.next(&value)) return {in.p == in.end ? Stop::kInputEnd : Stop::kInputCut, count - left, value};
      if (left == 0) return {Stop::kCount, count, value};
      if (!out.put(value)) return {Stop::kOutputFull, count - left, value};
      --left;
    } while (value >= below);
  }
}

}  // namespace lx
