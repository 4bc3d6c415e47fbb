// The kinds of text. A reader gives one character after the other, as its Unicode value or its packed code, and
// never splits one; a writer takes them and refuses one that does not fit. These are the only places that know
// lead bytes, shift bytes and units; an algorithm is a template over them.
//
// Bytes come in four kinds: single-byte, UTF-8, multibyte (by lead-byte lengths) and shift-stateful; beside
// them stand packed codes and 16-bit Unicode. read_bytes() and write_bytes() choose the kind of a byte text.
#pragma once

#include <cstring>
#include <type_traits>

#include "codepage/lxascii.h"
#include "codepage/lxcodepage.h"

namespace lx {

/// The end of an output that has no size of its own.
template <class Unit>
inline Unit* no_end() {
  return reinterpret_cast<Unit*>(UINTPTR_MAX & ~(sizeof(Unit) - 1));
}

/// Units from `p` to `end`; also where `end` is no_end().
template <class Unit>
inline size_t room(const Unit* p, const Unit* end) {
  return (reinterpret_cast<uintptr_t>(end) - reinterpret_cast<uintptr_t>(p)) / sizeof(Unit);
}

inline size_t least(size_t a, size_t b) {
  return a < b ? a : b;
}
inline size_t least(size_t a, size_t b, size_t c) {
  return least(least(a, b), c);
}

/// Where an output of `units` units ends; one that is longer than memory ends there.
template <class Unit>
inline Unit* end_of(Unit* p, size_t units) {
  return p + least(units, room(p, no_end<Unit>()));
}

/// The units of a text before its null, or the length where one is given.
template <class Unit>
inline size_t text_units(const Unit* text, int32_t length) {
  if (length >= 0) return static_cast<size_t>(length);
  size_t n = 0;
  while (text[n] != 0) ++n;
  return n;
}
inline size_t text_units(const char* text, int32_t length) {
  return length < 0 ? strlen(text) : static_cast<size_t>(length);
}
inline size_t text_units(const uint8_t* text, int32_t length) {
  return text_units(reinterpret_cast<const char*>(text), length);
}
/// The bytes of a text whose length counts bytes, or with LX_CHARACTERS characters.
inline size_t text_bytes(const Codepage& cp, const char* text, LXShiftState state, int32_t length,
                         uint32_t flags) {
  if (length < 0 || (flags & LX_CHARACTERS) == 0) return text_units(text, length);
  return bytes_of_chars(cp, bytes_of(text), state, length);
}

inline constexpr unsigned kAnySame = 0x10000;  // same_below() of 16-bit Unicode
inline constexpr size_t kRunChars = 128;       // moved at a time through a buffer on the stack
inline constexpr size_t kRunUnits = 48;        // of shorter texts the characters are moved one by one
inline constexpr size_t kShiftRunUnits = 16;   // the same where shift states are kept

// Readers. next() is false at the end of the text, with p == end, and before a character that the end cuts,
// with p < end. kOneUnit: every unit is a character, so that next() fails only at the end.
//
// kRuns: read_run() gives the Unicode values of many characters at once, the ones that next() would give. It
// stops before a block of characters below `below` (0: never), because those are copied. When it returns 0,
// next() decides what stands there.

struct SingleByteReader {
  using Unit = uint8_t;
  static constexpr bool kOneUnit = true;
  static constexpr bool kRuns = true;
  const Codepage& cp;
  const uint8_t* p;
  const uint8_t* end;

  unsigned same_below() const { return cp.same_below; }
  void decode(Unit unit, LXUChar* u) const { *u = cp.unicode[unit]; }
  void decode(Unit unit, LXWChar* code) const { *code = unit; }
  size_t read_run(LXUChar* values, size_t most, unsigned below);
  template <class Value>
  bool next(Value* value) {
    if (p == end) return false;
    decode(*p++, value);
    return true;
  }
};

/// Multibyte text by lead-byte lengths; where UTF-8 is computed, by its formula.
template <bool kUtf8>
struct LeadByteReader {
  using Unit = uint8_t;
  static constexpr bool kOneUnit = false;
  static constexpr bool kRuns = true;
  const Codepage& cp;
  const uint8_t* p;
  const uint8_t* end;

  unsigned same_below() const { return cp.same_below; }
  void decode(size_t length, LXUChar* u) const {
    *u = length == 1 ? cp.unicode[*p] : kUtf8 ? utf8_unicode(p) : row_unicode(cp, p);
  }
  void decode(size_t length, LXWChar* code) const { *code = pack(p, length); }
  size_t read_run(LXUChar* values, size_t most, unsigned below);
  template <class Value>
  bool next(Value* value) {
    if (p == end) return false;
    if (kUtf8 && *p < cp.same_below) {  // apart: the next character does not wait for the length of this one
      *value = *p++;
      return true;
    }
    const size_t length = cp.length(*p);
    if (length > static_cast<size_t>(end - p)) return false;
    decode(length, value);
    p += length;
    return true;
  }
};
using Utf8Reader = LeadByteReader<true>;
using MultiByteReader = LeadByteReader<false>;
template <>
size_t Utf8Reader::read_run(LXUChar* values, size_t most, unsigned below);
template <>
size_t MultiByteReader::read_run(LXUChar* values, size_t most, unsigned below);

/// One shift byte before a character is eaten; a second one in a row is a character. A shift byte at the very
/// end ends the text.
struct ShiftReader {
  using Unit = uint8_t;
  static constexpr bool kOneUnit = false;
  static constexpr bool kRuns = true;
  const Codepage& cp;
  const uint8_t* p;
  const uint8_t* end;
  LXShiftState state;

  unsigned same_below() const { return 0; }
  void decode(LXUChar* u) const { *u = state == LX_SHIFT_DOUBLE ? row_unicode(cp, p) : cp.unicode[*p]; }
  void decode(LXWChar* code) const { *code = pack(p, cp.width_in(state)); }
  size_t read_run(LXUChar* values, size_t most, unsigned below);
  template <class Value>
  bool next(Value* value) {
    if (p == end) return false;
    if (take_shift(cp, &p, &state) && p == end) return false;
    const size_t length = cp.width_in(state);
    if (length > static_cast<size_t>(end - p)) return false;
    decode(value);
    p += length;
    return true;
  }
};

struct CodeReader {
  using Unit = LXWChar;
  static constexpr bool kOneUnit = true;
  static constexpr bool kRuns = false;
  const Codepage& cp;
  const LXWChar* p;
  const LXWChar* end;

  void decode(Unit unit, LXUChar* u) const { *u = code_to_unicode(cp, unit); }
  void decode(Unit unit, LXWChar* code) const { *code = unit; }
  template <class Value>
  bool next(Value* value) {
    if (p == end) return false;
    decode(*p++, value);
    return true;
  }
};

struct UnicodeReader {
  using Unit = LXUChar;
  static constexpr bool kOneUnit = true;
  static constexpr bool kRuns = true;
  const LXUChar* p;
  const LXUChar* end;

  unsigned same_below() const { return kAnySame; }
  void decode(Unit unit, LXUChar* u) const { *u = unit; }
  /// How many of `most` units stand before a block of units below `below`.
  size_t run_units(size_t most, unsigned below) const {
    size_t n = 0;
    while (most - n >= kBlock && (n == 0 || below == 0 || !is_same_block(p + n, below))) n += kBlock;
    return most - n < kBlock ? most : n;
  }
  bool next(LXUChar* u) {
    if (p == end) return false;
    *u = *p++;
    return true;
  }
};

// Writers. put() is false, with nothing written, when the character and the shift byte that is due do not fit.
// kOneUnit: every character is one unit, encode() of it. kRuns: put_run() writes characters that are known to
// fit, each of at most most_units(), and nothing behind the last one.

struct SingleByteWriter {
  using Unit = uint8_t;
  static constexpr bool kOneUnit = true;
  static constexpr bool kRuns = true;
  const Codepage& cp;
  uint8_t* p;
  uint8_t* end;

  unsigned same_below() const { return cp.same_below; }
  Unit encode(LXUChar u) const { return static_cast<uint8_t>(cp.codes16[cp.page_start[u >> 8] + (u & 0xFFu)]); }
  Unit encode(LXWChar code) const { return static_cast<uint8_t>(code); }
  size_t most_units() const { return 1; }
  void put_run(const LXUChar* values, size_t count);
  template <class Value>
  bool put(Value value) {
    if (p == end) return false;
    *p++ = encode(value);
    return true;
  }
};

/// Multibyte text without shift bytes; where UTF-8 is computed, by its formula.
template <bool kUtf8>
struct LeadByteWriter {
  using Unit = uint8_t;
  static constexpr bool kOneUnit = false;
  static constexpr bool kRuns = true;
  const Codepage& cp;
  uint8_t* p;
  uint8_t* end;

  unsigned same_below() const { return cp.same_below; }
  size_t most_units() const { return kUtf8 ? 3 : cp.width; }
  void put_run(const LXUChar* values, size_t count);
  bool put(LXUChar u) {
    if constexpr (!kUtf8) return store(row_code(cp, u));
    const size_t count = utf8_bytes(u);
    if (count > room(p, end)) return false;
    store_utf8(p, u, count);
    p += count;
    return true;
  }
  bool put(LXWChar code) { return store(without_zero_bytes(code)); }

 private:
  bool store(uint32_t code) {
    const size_t count = code_bytes(code);
    if (count > room(p, end)) return false;
    store_code(p, code, count);
    p += count;
    return true;
  }
};
using Utf8Writer = LeadByteWriter<true>;
using MultiByteWriter = LeadByteWriter<false>;
template <>
void Utf8Writer::put_run(const LXUChar* values, size_t count);
template <>
void MultiByteWriter::put_run(const LXUChar* values, size_t count);

struct ShiftWriter {
  using Unit = uint8_t;
  static constexpr bool kOneUnit = false;
  static constexpr bool kRuns = true;
  const Codepage& cp;
  uint8_t* p;
  uint8_t* end;
  LXShiftState state;

  unsigned same_below() const { return 0; }

  /// The shift byte that is due before a character of `count` bytes, and the state that it leads to.
  bool shift_due(size_t count) const { return (count == 1) != (state == LX_SHIFT_SINGLE); }
  uint8_t take_shift_byte() {
    state = state == LX_SHIFT_SINGLE ? LX_SHIFT_DOUBLE : LX_SHIFT_SINGLE;
    return state == LX_SHIFT_DOUBLE ? cp.shift_out : cp.shift_in;
  }

  size_t most_units() const { return 1 + cp.width; }
  void put_run(const LXUChar* values, size_t count);
  bool put(LXUChar u) { return store(row_code(cp, u)); }
  bool put(LXWChar code) { return store(without_zero_bytes(code)); }

 private:
  bool store(uint32_t code) {
    const size_t count = code_bytes(code);
    const bool shift = shift_due(count);
    if (count + shift > room(p, end)) return false;
    if (shift) *p++ = take_shift_byte();
    store_code(p, code, count);
    p += count;
    return true;
  }
};

/// A shift-stateful writer that never leaves a double-byte character without room for the Shift-In behind it,
/// so that close() can end the text in the single-byte state.
struct ClosedShiftWriter {
  using Unit = uint8_t;
  static constexpr bool kOneUnit = false;
  static constexpr bool kRuns = false;
  const Codepage& cp;
  uint8_t* p;
  uint8_t* end;
  LXShiftState state;

  bool put(LXUChar u) { return put(LXWChar{unicode_to_code(cp, u)}); }
  bool put(LXWChar code) {
    uint8_t bytes[kMaxCharBytes];
    const uint32_t stored = without_zero_bytes(code);
    const size_t count = code_bytes(stored);
    store_code(bytes, stored, count);
    return copy(bytes, count, count == 1 ? LX_SHIFT_SINGLE : LX_SHIFT_DOUBLE);
  }
  /// Writes the bytes of a character of a state.
  bool copy(const uint8_t* bytes, size_t count, LXShiftState needed) {
    const size_t shift = state != needed ? 1 : 0;
    if (shift + count + (needed == LX_SHIFT_DOUBLE ? 1 : 0) > room(p, end)) return false;
    if (shift != 0) *p++ = needed == LX_SHIFT_DOUBLE ? cp.shift_out : cp.shift_in;
    state = needed;
    for (size_t i = 0; i < count; ++i) *p++ = bytes[i];
    return true;
  }
  void close() {
    if (state == LX_SHIFT_SINGLE || p == end) return;
    *p++ = cp.shift_in;
    state = LX_SHIFT_SINGLE;
  }
};

/// Ends a text in the state that it must end in.
template <class Writer>
void close_text(Writer&) {}
inline void close_text(ClosedShiftWriter& out) {
  out.close();
}

struct CodeWriter {
  using Unit = LXWChar;
  static constexpr bool kOneUnit = true;
  static constexpr bool kRuns = false;
  const Codepage& cp;
  LXWChar* p;
  LXWChar* end;

  Unit encode(LXUChar u) const { return unicode_to_code(cp, u); }
  Unit encode(LXWChar code) const { return code; }
  template <class Value>
  bool put(Value value) {
    if (p == end) return false;
    *p++ = encode(value);
    return true;
  }
};

struct UnicodeWriter {
  using Unit = LXUChar;
  static constexpr bool kOneUnit = true;
  static constexpr bool kRuns = true;
  LXUChar* p;
  LXUChar* end;

  unsigned same_below() const { return kAnySame; }
  Unit encode(LXUChar u) const { return u; }
  bool put(LXUChar u) {
    if (p == end) return false;
    *p++ = u;
    return true;
  }
};

/// Whether a byte text is walked by lead bytes, as the plain forms do in every codepage, or by its shift bytes
/// where the codepage has them, as the Ex forms do.
enum class Form { kPlain, kEx };

/// A reader like another one, over another text. Made of its parts: a copy of what was just stored in parts
/// would wait for the stores.
template <class Reader>
inline Reader read_like(const Reader& first, const typename Reader::Unit* text, size_t units,
                        [[maybe_unused]] LXShiftState state) {
  if constexpr (std::is_same_v<Reader, UnicodeReader>)
    return {text, text + units};
  else if constexpr (std::is_same_v<Reader, ShiftReader>)
    return {first.cp, text, text + units, state};
  else
    return {first.cp, text, text + units};
}

/// Calls `body` with the reader of a byte text.
template <class Body>
auto read_bytes(const Codepage& cp, Form form, LXShiftState state, const uint8_t* p, size_t bytes,
                Body&& body) {
  const uint8_t* const end = p + bytes;
  if (form == Form::kEx && cp.shift_sensitive) return body(ShiftReader{cp, p, end, state});
  if (cp.single_byte) return body(SingleByteReader{cp, p, end});
  if (cp.utf8) return body(Utf8Reader{cp, p, end});
  return body(MultiByteReader{cp, p, end});
}

/// Calls `body` with the writer of a byte text.
template <class Body>
auto write_bytes(const Codepage& cp, Form form, LXShiftState state, uint8_t* p, uint8_t* end, Body&& body) {
  if (form == Form::kEx && cp.shift_sensitive) return body(ShiftWriter{cp, p, end, state});
  if (cp.utf8) return body(Utf8Writer{cp, p, end});
  if (cp.single_byte) return body(SingleByteWriter{cp, p, end});
  return body(MultiByteWriter{cp, p, end});
}

/// Why a transfer of characters stopped.
enum class Stop { kInputEnd, kInputCut, kOutputFull, kCount };

template <class Value>
struct Transfer {
  Stop stop;
  size_t chars;  // written
  Value held;    // kOutputFull: the character that was read and did not fit
};

/// What both sides have the same below.
template <class Reader, class Writer>
inline unsigned same_below(const Reader& in, const Writer& out) {
  return in.same_below() < out.same_below() ? in.same_below() : out.same_below();
}

/// Moves the characters that fit for certain, as Unicode values: how many they were. Not inline: the loops of
/// transfer(), which short texts take, stay small.
template <class Reader, class Writer>
[[gnu::noinline]] size_t move_runs(Reader& in, Writer& out, size_t count, unsigned below) {
  size_t left = count;
  for (;;) {
    size_t n = 0;
    if (below != 0) {
      n = copy_same_blocks(out.p, in.p, least(left, room(in.p, in.end), room(out.p, out.end)), below);
      in.p += n;
      out.p += n;
      left -= n;
    }
    if constexpr (std::is_same_v<Writer, UnicodeWriter>) {
      n = in.read_run(out.p, least(left, room(out.p, out.end)), below);
      out.p += n;
    } else if constexpr (std::is_same_v<Reader, UnicodeReader>) {
      n = least(left, room(in.p, in.end), room(out.p, out.end) / out.most_units());
      n = in.run_units(least(n, kRunChars), below);
      out.put_run(in.p, n);
      in.p += n;
    } else {
      LXUChar values[kRunChars];
      n = in.read_run(values, least(left, kRunChars, room(out.p, out.end) / out.most_units()), below);
      out.put_run(values, n);
    }
    if (n == 0) return count - left;
    left -= n;
  }
}

/// Takes over the place, and the shift state, from a copy that has gone on.
template <class Text>
inline void go_on_at(Text& text, const Text& place) {
  text.p = place.p;
  if constexpr (std::is_same_v<Text, ShiftReader> || std::is_same_v<Text, ShiftWriter> ||
                std::is_same_v<Text, ClosedShiftWriter>)
    text.state = place.state;
}

/// Moves characters from a reader to a writer, at most `count` of them, as Unicode values or as packed codes.
template <class Value, class Reader, class Writer>
inline Transfer<Value> transfer(Reader& in, Writer& out, size_t count) {
  constexpr bool kRuns = Reader::kRuns && Writer::kRuns;
  size_t left = count;
  unsigned below = 0;
  if constexpr (kRuns) {
    below = same_below(in, out);
    constexpr bool kShift = std::is_same_v<Reader, ShiftReader> || std::is_same_v<Writer, ShiftWriter>;
    if (room(in.p, in.end) >= (kShift ? kShiftRunUnits : kRunUnits)) {
      // On copies: what other functions see in memory cannot stay in registers below.
      Reader long_in = in;
      Writer long_out = out;
      left -= move_runs(long_in, long_out, left, below);
      go_on_at(in, long_in);
      go_on_at(out, long_out);
    }
  }
  if constexpr (Reader::kOneUnit && Writer::kOneUnit) {
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
    if constexpr (kRuns && !(Reader::kOneUnit && Writer::kOneUnit)) {
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
