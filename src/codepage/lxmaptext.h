// The kinds of text as mapping walks them: input and output side by side. Unlike the readers and writers of
// conversion they know which bytes a character stood in, because one without a mapping is copied as it is, and
// shift bytes are passed through.
#pragma once

#include <cstring>

#include "codepage/lxtext.h"

namespace lx {

struct UnicodeChar {
  uint16_t u;
};

/// A character of a codepage. In a shift-stateful text also the states before and behind the shift byte that
/// stands in front of it, if one does.
struct ByteChar {
  const uint8_t* p;
  size_t length;
  LXShiftState before;
  LXShiftState state;
  bool shifted;
};

// Texts: input and output side by side. take() gives the next whole character and moves the input; put() and
// copy() write, or are false when there is no room. finish() ends the output. most() is how
// many units can be mapped unit by unit.

struct UnicodeText {
  using Char = UnicodeChar;
  static constexpr bool kRuns = true;
  const LXUChar* p;
  const LXUChar* end;
  LXUChar* out;
  LXUChar* out_end;

  size_t most() const { return least(room(p, end), room(out, out_end)); }
  bool take(Char* c) {
    if (p == end) return false;
    c->u = *p++;
    return true;
  }
  bool put(LXUChar value, const Char&) {
    if (out == out_end) return false;
    *out++ = value;
    return true;
  }
  bool copy(const Char& c) { return put(c.u, c); }
  void finish(LXShiftState) {}
};

/// Packed codes; a code is unpacked into its bytes.
struct CodeText {
  static constexpr bool kRuns = false;
  const Codepage& cp;
  const LXWChar* p;
  const LXWChar* end;
  LXWChar* out;
  LXWChar* out_end;

  struct Char : ByteChar {
    LXWChar code;
    uint8_t bytes[kMaxCharBytes];
    Char() : ByteChar{bytes, 0, 0, 0, false} {}
    Char(const Char&) = delete;
    Char& operator=(const Char&) = delete;
  };
  bool take(Char* c) {
    if (p == end) return false;
    c->code = *p++;
    const uint32_t stored = without_zero_bytes(c->code);
    c->length = code_bytes(stored);
    memset(c->bytes, 0, sizeof(c->bytes));
    store_code(c->bytes, stored, c->length);
    return true;
  }
  bool put(LXWChar value, const ByteChar&) {
    if (out == out_end) return false;
    *out++ = value;
    return true;
  }
  bool copy(const Char& c) { return put(c.code, c); }
  void finish(LXShiftState) {}
};

/// Bytes by lead-byte lengths.
struct LeadByteText {
  static constexpr bool kRuns = true;
  const Codepage& cp;
  const uint8_t* p;
  const uint8_t* end;
  uint8_t* out;
  uint8_t* out_end;

  using Char = ByteChar;
  size_t most() const { return least(room(p, end), room(out, out_end)); }
  bool take(Char* c) {
    if (p == end) return false;
    const size_t length = cp.length(*p);
    if (length > static_cast<size_t>(end - p)) return false;
    *c = {p, length, LX_SHIFT_SINGLE, LX_SHIFT_SINGLE, false};
    p += length;
    return true;
  }
  bool put(LXWChar value, const Char&) {
    const uint32_t stored = without_zero_bytes(value);
    const size_t count = code_bytes(stored);
    if (count > room(out, out_end)) return false;
    store_code(out, stored, count);
    out += count;
    return true;
  }
  bool copy(const Char& c) {
    if (c.length > room(out, out_end)) return false;
    for (size_t i = 0; i < c.length; ++i) *out++ = c.p[i];
    return true;
  }
  void finish(LXShiftState) {}
};

/// Shift-stateful bytes. Shift bytes of the input are passed through while both sides are in the same state. A
/// character that changes its width gets the shift byte that is due, and must fit together with the one that
/// leads back to the state of the input, so that finish() always has room for it.
struct ShiftText {
  static constexpr bool kRuns = false;
  const Codepage& cp;
  const uint8_t* p;
  const uint8_t* end;
  uint8_t* out;
  uint8_t* out_end;
  LXShiftState in_state = LX_SHIFT_SINGLE;
  LXShiftState out_state = LX_SHIFT_SINGLE;
  bool behind_shift_in = false;  // the last character taken, and nothing of it is written

  using Char = ByteChar;
  bool take(Char* c) {
    if (p == end) return false;
    const uint8_t* q = p;
    LXShiftState state = in_state;
    const bool shifted = take_shift(cp, &q, &state);
    const size_t length = cp.width_in(state);
    if (length > static_cast<size_t>(end - q)) return false;
    *c = {q, length, in_state, state, shifted};
    behind_shift_in = shifted && state == LX_SHIFT_SINGLE && out_state == in_state;
    p = q + length;
    in_state = state;
    return true;
  }
  bool put(LXWChar value, const Char& c) {
    uint8_t bytes[kMaxCharBytes];
    const uint32_t stored = without_zero_bytes(value);
    const size_t count = code_bytes(stored);
    store_code(bytes, stored, count);
    return write(bytes, count, count == 1 ? LX_SHIFT_SINGLE : LX_SHIFT_DOUBLE, c);
  }
  bool copy(const Char& c) { return write(c.p, c.length, c.state, c); }

  /// Passes the Shift-In before a character that could not be written itself: the state reached by it.
  LXShiftState pass_shift_in(LXShiftState reached) {
    if (!behind_shift_in || out == out_end) return reached;
    *out++ = cp.shift_in;
    return out_state = LX_SHIFT_SINGLE;
  }

  /// `reached`: the state of the input behind the last character that was written. A shift byte that ends the
  /// input belongs to it as well.
  void finish(LXShiftState reached) {
    const bool in_step = out_state == reached;
    const uint8_t* q = p;
    const bool shifted = end - p == 1 && take_shift(cp, &q, &reached);
    if (out_state != reached || (in_step && shifted))
      if (out != out_end) *out++ = shift_byte(reached);
  }

 private:
  uint8_t shift_byte(LXShiftState to) const { return to == LX_SHIFT_DOUBLE ? cp.shift_out : cp.shift_in; }
  bool write(const uint8_t* bytes, size_t count, LXShiftState needed, const Char& c) {
    const bool passed = c.shifted && needed == c.state && out_state == c.before;
    const bool lead = passed || out_state != needed;
    if (lead + count + (needed != c.state ? 1 : 0) > room(out, out_end)) return false;
    if (lead) *out++ = shift_byte(needed);
    out_state = needed;
    behind_shift_in = false;
    for (size_t i = 0; i < count; ++i) *out++ = bytes[i];
    return true;
  }
};

/// Passes on what stands before a character that does not fit: the state that the input has reached by it.
template <class Text>
LXShiftState pass_before(Text&, LXShiftState reached) {
  return reached;
}
inline LXShiftState pass_before(ShiftText& text, LXShiftState reached) {
  return text.pass_shift_in(reached);
}

/// What follows a character, for pairs.
inline LXShiftState state_of(const UnicodeChar&) {
  return LX_SHIFT_SINGLE;
}
inline LXShiftState state_of(const ByteChar& c) {
  return c.state;
}
inline void set_state(UnicodeChar*, LXShiftState) {}
inline void set_state(ByteChar* c, LXShiftState state) {
  c->state = state;
  c->shifted = false;
}
template <class Text>
void skip_to(Text* text, const Text& place) {
  text->p = place.p;
}
inline void skip_to(ShiftText* text, const ShiftText& place) {
  text->p = place.p;
  text->in_state = place.in_state;
}

}  // namespace lx
