// The kinds of text as mapping walks them: a cursor and a sink side by side. Unlike conversion, mapping knows
// which bytes a character stood in, because one without a mapping is copied as it is.
#pragma once

#include "codepage/lxtext.h"

namespace lx {

struct UnicodeChar {
  LXUChar u;
  void set(const LXUChar* p, size_t) { u = *p; }
};

/// A character of a codepage as its bytes.
struct ByteChar {
  const uint8_t* p;
  size_t length;
  void set(const uint8_t* at, size_t bytes) { p = at, length = bytes; }
};

/// A packed code, unpacked into its bytes.
struct CodeChar : ByteChar {
  LXWChar code;
  uint8_t bytes[kMaxCharBytes];

  CodeChar() = default;
  CodeChar(const CodeChar&) = delete;
  CodeChar& operator=(const CodeChar&) = delete;
  void set(const LXWChar* at, size_t) {
    code = *at;
    memset(bytes, 0, sizeof(bytes));
    p = bytes;
    length = store_packed(bytes, code);
  }
};

inline bool put_copy(UnicodeSink& out, const UnicodeChar& c) {
  return out.put(c.u);
}
inline bool put_copy(CodeSink& out, const CodeChar& c) {
  return out.put(c.code);
}
inline bool put_copy(MultiByteSink& out, const ByteChar& c) {
  return out.put_bytes(c.p, c.length);
}

// Texts. take() gives the next whole character; put() and copy() write, or are false when there is no room.
// `taken` is the state behind what was taken, `written` behind what was written: pass_before() passes on what
// stands before a character that does not fit, finish() ends the output. kRuns: characters of one unit may be
// mapped side by side.

template <class CursorOf, class SinkOf, class CharOf, bool kRunsOf>
struct MapText {
  using Cursor = CursorOf;
  using Char = CharOf;
  static constexpr bool kRuns = kRunsOf;
  Cursor in;
  SinkOf out;

  static bool take_from(Cursor& at, Char* c) {
    const auto* const p = at.p;
    if (!at.pass()) return false;
    c->set(p, room(p, at.p));
    return true;
  }
  bool take(Char* c) { return take_from(in, c); }
  template <class Value>
  bool put(Value value, const Char&) {
    return out.put(value);
  }
  bool copy(const Char& c) { return put_copy(out, c); }
  void skip_to(const Cursor& ahead, const Char&, Char*) { in.p = ahead.p; }
  void note_written(Char*) {}
  void pass_before() {}
  void finish() {}
};
using UnicodeText = MapText<UnicodeCursor, UnicodeSink, UnicodeChar, true>;
using WideText = MapText<CodeCursor, CodeSink, CodeChar, false>;
using LeadByteText = MapText<MultiByteCursor, MultiByteSink, ByteChar, true>;

/// How many units can be mapped unit by unit.
template <class Text>
size_t most_units(const Text& text) {
  return least(room(text.in.p, text.in.end), room(text.out.p, text.out.end));
}

/// A character of shift-stateful text, and the states before and behind the shift byte in front of it, if there
/// is one.
struct ShiftChar : ByteChar {
  LXShiftState before;
  LXShiftState state;
  bool shifted;
};

/// Shift-stateful text is written apart: shift bytes of the input are passed through while both sides are in
/// the same state, also those that change nothing. A character that changes its width gets the shift byte that
/// is due, and must fit together with the one that leads back to the state of the input, so that finish()
/// always has room for it.
struct ShiftText {
  using Cursor = ShiftCursor;
  using Char = ShiftChar;
  static constexpr bool kRuns = false;
  ShiftCursor in;
  ShiftSink out;
  LXShiftState reached = LX_SHIFT_SINGLE;  // of the input, behind the last character that was written
  bool behind_shift_in = false;            // the last character taken, and nothing of it is written

  static bool take_from(Cursor& at, Char* c) {
    Cursor ahead(at);
    size_t length;
    if (!ahead.pass(&length)) return false;
    c->set(ahead.p - length, length);
    c->before = at.state;
    c->state = ahead.state;
    c->shifted = c->p != at.p;
    go_on_at(at, ahead);
    return true;
  }
  bool take(Char* c) {
    if (!take_from(in, c)) return false;
    behind_shift_in = c->shifted && c->state == LX_SHIFT_SINGLE && out.state == c->before;
    return true;
  }
  bool put(LXWChar value, const Char& c) {
    uint8_t bytes[kMaxCharBytes];
    const size_t count = store_packed(bytes, value);
    return write(bytes, count, count == 1 ? LX_SHIFT_SINGLE : LX_SHIFT_DOUBLE, c);
  }
  bool copy(const Char& c) { return write(c.p, c.length, c.state, c); }

  /// Goes on behind `next`, which was taken together with `*c`.
  void skip_to(const Cursor& ahead, const Char& next, Char* c) {
    go_on_at(in, ahead);
    c->state = next.state;
    c->shifted = false;
  }
  /// Something that stands for a character was written, and the shift byte in front of it.
  void note_written(Char* c) {
    reached = c->state;
    c->shifted = false;
  }

  /// Passes the Shift-In before a character that could not be written itself.
  void pass_before() {
    if (!behind_shift_in || out.p == out.end) return;
    *out.p++ = in.cp.shift_in;
    out.state = reached = LX_SHIFT_SINGLE;
  }

  /// A shift byte that ends the input belongs to the last character that was written as well.
  void finish() {
    const bool in_step = out.state == reached;
    in.state = reached;
    const bool shifted = in.pass_last_shift();
    if ((out.state != in.state || (in_step && shifted)) && out.p != out.end)
      *out.p++ = shift_byte(in.cp, in.state);
  }

 private:
  bool write(const uint8_t* bytes, size_t count, LXShiftState needed, const Char& c) {
    const bool passed = c.shifted && needed == c.state && out.state == c.before;
    const bool lead = passed || out.state != needed;
    if (lead + count + (needed != c.state ? 1 : 0) > room(out.p, out.end)) return false;
    if (lead) *out.p++ = shift_byte(in.cp, needed);
    out.state = needed;
    behind_shift_in = false;
    for (size_t i = 0; i < count; ++i) *out.p++ = bytes[i];
    return true;
  }
};

}  // namespace lx
