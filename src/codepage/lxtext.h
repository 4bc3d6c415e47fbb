// The kinds of text. A reader gives one character after the other, as its Unicode value or its packed code, and
// never splits one; a writer takes them and refuses one that does not fit. These are the only places that know
// lead bytes, shift bytes and units; an algorithm is a template over them.
//
// Bytes come in four kinds: single-byte, UTF-8, multibyte (by lead-byte lengths) and shift-stateful; beside
// them stand packed codes and 16-bit Unicode. read_bytes() and write_bytes() choose the kind of a byte text.
#pragma once

#include <cstring>

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

// Readers. next() is false at the end of the text, with p == end, and before a character that the end cuts,
// with p < end. kOneUnit: every unit is a character, so that next() fails only at the end.

struct SingleByteReader {
  using Unit = uint8_t;
  static constexpr bool kOneUnit = true;
  static constexpr bool kAsciiRuns = true;
  const Codepage& cp;
  const uint8_t* p;
  const uint8_t* end;

  bool ascii() const { return cp.ascii_transparent; }
  void decode(Unit unit, LXUChar* u) const { *u = cp.unicode[unit]; }
  void decode(Unit unit, LXWChar* code) const { *code = unit; }
  template <class Value>
  bool next(Value* value) {
    if (p == end) return false;
    decode(*p++, value);
    return true;
  }
};

struct Utf8Reader {
  using Unit = uint8_t;
  static constexpr bool kOneUnit = false;
  static constexpr bool kAsciiRuns = true;
  const Codepage& cp;
  const uint8_t* p;
  const uint8_t* end;

  bool ascii() const { return cp.ascii_transparent; }
  void decode(size_t length, LXUChar* u) const { *u = length == 1 ? cp.unicode[*p] : utf8_unicode(p); }
  void decode(size_t length, LXWChar* code) const { *code = pack(p, length); }
  template <class Value>
  bool next(Value* value) {
    if (p == end) return false;
    const size_t length = cp.length(*p);
    if (length > static_cast<size_t>(end - p)) return false;
    decode(length, value);
    p += length;
    return true;
  }
};

struct MultiByteReader {
  using Unit = uint8_t;
  static constexpr bool kOneUnit = false;
  static constexpr bool kAsciiRuns = true;
  const Codepage& cp;
  const uint8_t* p;
  const uint8_t* end;

  bool ascii() const { return cp.ascii_transparent; }
  void decode(size_t length, LXUChar* u) const { *u = length == 1 ? cp.unicode[*p] : row_unicode(cp, p); }
  void decode(size_t length, LXWChar* code) const { *code = pack(p, length); }
  template <class Value>
  bool next(Value* value) {
    if (p == end) return false;
    const size_t length = cp.length(*p);
    if (length > static_cast<size_t>(end - p)) return false;
    decode(length, value);
    p += length;
    return true;
  }
};

/// One shift byte before a character is eaten; a second one in a row is a character. A shift byte at the very
/// end ends the text.
struct ShiftReader {
  using Unit = uint8_t;
  static constexpr bool kOneUnit = false;
  static constexpr bool kAsciiRuns = false;
  const Codepage& cp;
  const uint8_t* p;
  const uint8_t* end;
  LXShiftState state;

  void decode(LXUChar* u) const { *u = state == LX_SHIFT_DOUBLE ? multibyte_unicode(cp, p) : cp.unicode[*p]; }
  void decode(LXWChar* code) const { *code = pack(p, cp.width_in(state)); }
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
  static constexpr bool kAsciiRuns = false;
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
  static constexpr bool kAsciiRuns = true;
  const LXUChar* p;
  const LXUChar* end;

  bool ascii() const { return true; }
  void decode(Unit unit, LXUChar* u) const { *u = unit; }
  bool next(LXUChar* u) {
    if (p == end) return false;
    *u = *p++;
    return true;
  }
};

// Writers. put() is false, with nothing written, when the character and the shift byte that is due do not fit.
// kOneUnit: every character is one unit, encode() of it.

struct SingleByteWriter {
  using Unit = uint8_t;
  static constexpr bool kOneUnit = true;
  static constexpr bool kAsciiRuns = true;
  const Codepage& cp;
  uint8_t* p;
  uint8_t* end;

  bool ascii() const { return cp.ascii_transparent; }
  Unit encode(LXUChar u) const {
    return static_cast<uint8_t>(cp.codes16[static_cast<size_t>(cp.page_row[u >> 8]) << 8 | (u & 0xFF)]);
  }
  Unit encode(LXWChar code) const { return static_cast<uint8_t>(code); }
  template <class Value>
  bool put(Value value) {
    if (p == end) return false;
    *p++ = encode(value);
    return true;
  }
};

struct Utf8Writer {
  using Unit = uint8_t;
  static constexpr bool kOneUnit = false;
  static constexpr bool kAsciiRuns = true;
  const Codepage& cp;
  uint8_t* p;
  uint8_t* end;

  bool ascii() const { return cp.ascii_transparent; }
  bool put(LXUChar u) {
    const size_t count = utf8_bytes(u);
    if (count > room(p, end)) return false;
    store_utf8(p, u, count);
    p += count;
    return true;
  }
  bool put(LXWChar code) {
    code = without_zero_bytes(code);
    const size_t count = code_bytes(code);
    if (count > room(p, end)) return false;
    store_code(p, code, count);
    p += count;
    return true;
  }
};

struct MultiByteWriter {
  using Unit = uint8_t;
  static constexpr bool kOneUnit = false;
  static constexpr bool kAsciiRuns = true;
  const Codepage& cp;
  uint8_t* p;
  uint8_t* end;

  bool ascii() const { return cp.ascii_transparent; }
  bool put(LXUChar u) { return store(row_code(cp, u)); }
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

struct ShiftWriter {
  using Unit = uint8_t;
  static constexpr bool kOneUnit = false;
  static constexpr bool kAsciiRuns = false;
  const Codepage& cp;
  uint8_t* p;
  uint8_t* end;
  LXShiftState state;

  /// The shift byte that is due before a character of `count` bytes, and the state that it leads to.
  bool shift_due(size_t count) const { return (count == 1) != (state == LX_SHIFT_SINGLE); }
  uint8_t take_shift_byte() {
    state = state == LX_SHIFT_SINGLE ? LX_SHIFT_DOUBLE : LX_SHIFT_SINGLE;
    return state == LX_SHIFT_DOUBLE ? cp.shift_out : cp.shift_in;
  }

  bool put(LXUChar u) { return store(cp.utf8 ? unicode_to_code(cp, u) : row_code(cp, u)); }
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

struct CodeWriter {
  using Unit = LXWChar;
  static constexpr bool kOneUnit = true;
  static constexpr bool kAsciiRuns = false;
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
  static constexpr bool kAsciiRuns = true;
  LXUChar* p;
  LXUChar* end;

  bool ascii() const { return true; }
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
  if (cp.single_byte && cp.one_byte_codes) return body(SingleByteWriter{cp, p, end});
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

/// Moves characters from a reader to a writer, at most `count` of them, as Unicode values or as packed codes.
template <class Value, class Reader, class Writer>
inline Transfer<Value> transfer(Reader& in, Writer& out, size_t count) {
  size_t left = count;
  Value value{};
  if constexpr (Reader::kOneUnit && Writer::kOneUnit) {
    size_t n = room(in.p, in.end);
    if (room(out.p, out.end) < n) n = room(out.p, out.end);
    if (left < n) n = left;
    for (size_t i = 0; i < n; ++i) {
      in.decode(in.p[i], &value);
      out.p[i] = out.encode(value);
    }
    in.p += n;
    out.p += n;
    left -= n;
  }
  constexpr bool kAscii = Reader::kAsciiRuns && Writer::kAsciiRuns && sizeof(Value) == sizeof(LXUChar);
  bool ascii = false;
  if constexpr (kAscii) ascii = in.ascii() && out.ascii();
  for (;;) {
    if constexpr (kAscii && !(Reader::kOneUnit && Writer::kOneUnit)) {
      if (ascii) {
        size_t n = room(in.p, in.end);
        if (room(out.p, out.end) < n) n = room(out.p, out.end);
        if (left < n) n = left;
        n = copy_ascii(out.p, in.p, n);
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
    } while (!ascii || value >= 0x80);
  }
}

}  // namespace lx
