// Characters of a codepage: how long they are, where the next and the previous one start, how many there are, and
// their packed codes and Unicode values. Per-character primitives: no trace.
#include <string.h>

#include "codepage/lxprimitive.h"

namespace {

using lx::bytes_of;
using lx::Codepage;
using lx::Primitive;

char* same(const char* text) {
  return const_cast<char*>(text);
}

/// Steps over whole characters of `bytes` bytes by lead-byte lengths, at most `limit` of them.
struct Walk {
  size_t position = 0;
  int32_t chars = 0;
};
Walk walk(const Codepage& cp, const uint8_t* text, size_t bytes) {
  Walk at;
  while (at.position < bytes) {
    const size_t length = cp.length(text[at.position]);
    if (length > bytes - at.position) break;
    at.position += length;
    ++at.chars;
  }
  return at;
}

/// Steps over characters, each with the shift bytes on both sides of it.
struct CountedChars {
  const Codepage& cp;
  const uint8_t* p;
  const uint8_t* end;
  LXShiftState state;

  size_t left(const uint8_t* q) const {
    return reinterpret_cast<uintptr_t>(end) - reinterpret_cast<uintptr_t>(q);
  }
  /// False, with nothing passed, at the end and before a character that it cuts.
  bool step() {
    const uint8_t* q = p;
    LXShiftState behind = state;
    if (q == end || (cp.shift_sensitive && lx::take_shift(cp, &q, &behind) && q == end)) return false;
    const size_t length = cp.shift_sensitive ? cp.width_in(behind) : cp.length(*q);
    if (length > left(q)) return false;
    q += length;
    if (cp.shift_sensitive && q != end) lx::take_shift(cp, &q, &behind);
    p = q;
    state = behind;
    return true;
  }
};

size_t length_of(const char* text, int32_t bytes) {
  return bytes < 0 ? strlen(text) : static_cast<size_t>(bytes);
}

int32_t valid_bytes(const char* text, size_t length) {
  return static_cast<int32_t>(strnlen(text, length));
}

}  // namespace

namespace lx {

uint32_t unicode_to_code(const Codepage& cp, uint16_t u) {
  if (!cp.utf8) return cp.pages.code(u);
  uint8_t bytes[kMaxCharBytes];
  const size_t count = utf8_bytes(u);
  store_utf8(bytes, u, count);
  return pack(bytes, count);
}

uint16_t code_to_unicode(const Codepage& cp, uint32_t code) {
  if (code <= 0xFF) return cp.unicode[code];
  uint8_t bytes[kMaxCharBytes] = {};
  const uint32_t stored = without_zero_bytes(code);
  store_code(bytes, stored, code_bytes(stored));
  return multibyte_unicode(cp, bytes);
}

size_t bytes_of_chars(const Codepage& cp, const uint8_t* text, LXShiftState state, int32_t chars, size_t most) {
  const auto* const no_end = reinterpret_cast<const uint8_t*>(UINTPTR_MAX);
  CountedChars at{cp, text, most == SIZE_MAX ? no_end : text + most, state};
  while (chars > 0 && at.step()) --chars;
  return static_cast<size_t>(at.p - text);
}

int32_t chars_counted(const Codepage& cp, const uint8_t* text, LXShiftState state, size_t bytes) {
  CountedChars at{cp, text, text + bytes, state};
  int32_t chars = 0;
  while (at.step()) ++chars;
  return chars;
}

int32_t chars_in_bytes(const Codepage& cp, const uint8_t* text, LXShiftState state, size_t bytes) {
  if (!cp.shift_sensitive) return walk(cp, text, bytes).chars;
  const uint8_t* p = text;
  const uint8_t* const end = text + bytes;
  int32_t chars = 0;
  while (p < end) {
    if (take_shift(cp, &p, &state) && p == end) break;
    if (cp.width_in(state) > end - p) break;
    p += cp.width_in(state);
    ++chars;
  }
  return chars;
}

}  // namespace lx

extern "C" {

LXWChar LXGetChar(LXLocale* locale, const char* text) {
  const Primitive in(locale);
  return in ? lx::pack(bytes_of(text), in.cp().length(bytes_of(text)[0])) : 0;
}

LXWChar LXGetCharEx(LXLocale* locale, const char* text, LXShiftState state) {
  const Primitive in(locale);
  if (!in) return 0;
  const uint8_t* p = bytes_of(text);
  if (!in.shift_sensitive()) return lx::pack(p, in.cp().length(*p));
  lx::take_shift(in.cp(), &p, &state);
  return lx::pack(p, in.cp().width_in(state));
}

int32_t LXPutChar(LXLocale* locale, char* text, LXWChar code) {
  const Primitive in(locale);
  if (in) LXWToMb(text, code);
  return 0;
}

void LXPutCharEx(LXLocale* locale, char* text, LXShiftState state, LXWChar code) {
  const Primitive in(locale);
  if (!in) return;
  const LXShiftState needed = code > 0xFF ? LX_SHIFT_DOUBLE : LX_SHIFT_SINGLE;
  if (in.shift_sensitive() && needed != state)
    *text++ = static_cast<char>(needed == LX_SHIFT_DOUBLE ? in.cp().shift_out : in.cp().shift_in);
  LXWToMb(text, code);
}

char* LXNextChar(LXLocale* locale, const char* text) {
  const Primitive in(locale);
  return in ? same(text + in.cp().length(bytes_of(text)[0])) : same(text);
}

char* LXNextCharEx(LXLocale* locale, const char* text, LXShiftState state, LXShiftState* new_state, int32_t) {
  const Primitive in(locale);
  const uint8_t* p = bytes_of(text);
  if (in && in.shift_sensitive()) {
    lx::take_shift(in.cp(), &p, &state);
    p += in.cp().width_in(state);
    lx::take_shift(in.cp(), &p, &state);
  } else if (in) {
    p += in.cp().length(*p);
  }
  lx::put_state(new_state, state);
  return same(text + (p - bytes_of(text)));
}

char* LXPrevChar(LXLocale* locale, const char* start, const char* current) {
  const Primitive in(locale);
  if (!in) return same(current);
  if (in.single_byte()) return same(current - 1);
  // Lead bytes can only be told from the front.
  const char* p = start;
  while (p + in.cp().length(bytes_of(p)[0]) < current) p += in.cp().length(bytes_of(p)[0]);
  return same(p);
}

char* LXPrevCharEx(LXLocale* locale, const char* start, const char* current, LXShiftState state,
                   LXShiftState* new_state) {
  const Primitive in(locale);
  lx::put_state(new_state, state);
  if (!in || !in.shift_sensitive()) return LXPrevChar(locale, start, current);
  const Codepage& cp = in.cp();
  const char* p = current;
  if (p > start && cp.is_shift(bytes_of(p)[-1])) {
    // The shift byte tells the state of what stands before it: before a Shift-In it is double-byte.
    --p;
    state = bytes_of(p)[0] == cp.shift_in ? LX_SHIFT_DOUBLE : LX_SHIFT_SINGLE;
  }
  const ptrdiff_t step = cp.width_in(state);
  p = p - start > step ? p - step : start;
  lx::put_state(new_state, state);
  return same(p);
}

int32_t LXNumChars(LXLocale* locale, const char* text, int32_t bytes) {
  const Primitive in(locale);
  if (!in) return 0;
  const size_t length = length_of(text, bytes);
  return in.single_byte() ? static_cast<int32_t>(length) : walk(in.cp(), bytes_of(text), length).chars;
}

int32_t LXNumCharsEx(LXLocale* locale, const char* text, LXShiftState state, int32_t bytes) {
  const Primitive in(locale);
  if (!in) return 0;
  if (!in.shift_sensitive()) return LXNumChars(locale, text, bytes);
  return lx::chars_in_bytes(in.cp(), bytes_of(text), state, length_of(text, bytes));
}

char* LXMoveStringPointer(LXLocale* locale, const char* text, int32_t length, int32_t flags) {
  const Primitive in(locale);
  if (!in || length <= 0) return same(text);
  size_t bytes = static_cast<size_t>(length);
  if ((flags & LX_CHARACTERS) != 0)
    bytes = lx::bytes_of_chars(in.cp(), bytes_of(text), LX_SHIFT_SINGLE, length);
  if (in.single_byte()) return same(text + bytes);
  return same(text + walk(in.cp(), bytes_of(text), bytes).position);
}

char* LXMoveStringPointerEx(LXLocale* locale, const char* text, LXShiftState state, int32_t length,
                            LXShiftState* new_state, int32_t flags) {
  const Primitive in(locale);
  if (in && !in.shift_sensitive()) lx::put_state(new_state, state);
  if (!in || !in.shift_sensitive()) return LXMoveStringPointer(locale, text, length, flags);
  if (length <= 0) return same(text);
  const Codepage& cp = in.cp();
  size_t bytes = static_cast<size_t>(length);
  if ((flags & LX_CHARACTERS) != 0) bytes = lx::bytes_of_chars(cp, bytes_of(text), state, length);
  const uint8_t* p = bytes_of(text);
  const uint8_t* const end = p + bytes;
  while (p < end) {
    lx::take_shift(cp, &p, &state);
    if (cp.width_in(state) > end - p) break;
    p += cp.width_in(state);
  }
  lx::put_state(new_state, state);
  return same(text + (p - bytes_of(text)));
}

int32_t LXValidChar(LXLocale* locale, const char* text) {
  const Primitive in(locale);
  return in ? valid_bytes(text, in.cp().length(bytes_of(text)[0])) : 0;
}

int32_t LXValidCharEx(LXLocale* locale, const char* text, LXShiftState state) {
  const Primitive in(locale);
  if (!in) return 0;
  if (!in.shift_sensitive()) return LXValidChar(locale, text);
  return valid_bytes(text, state != LX_SHIFT_SINGLE ? in.cp().width : 1);
}

int32_t LXByteLength(LXLocale* locale, const char* text) {
  const Primitive in(locale);
  return in ? in.cp().length(bytes_of(text)[0]) : 0;
}

int32_t LXByteLengthW(LXLocale* locale, LXWChar code) {
  const Primitive in(locale);
  return in ? LXStrByteLength(code) : 0;
}

int32_t LXByteLengthEx(LXLocale* locale, const char* text, LXShiftState state) {
  const Primitive in(locale);
  if (!in) return 0;
  const uint8_t* p = bytes_of(text);
  if (!in.shift_sensitive()) return in.cp().length(*p);
  lx::take_shift(in.cp(), &p, &state);
  return in.cp().width_in(state);
}

int32_t LXStrByteLength(LXWChar code) {
  return static_cast<int32_t>(lx::code_bytes(code));
}

void LXStrBigEndian(char* buffer, int32_t bytes) {
  for (int32_t i = 0; i + 1 < bytes; i += 2) {
    const char first = buffer[i];
    buffer[i] = buffer[i + 1];
    buffer[i + 1] = first;
  }
}

void LXInitState(LXLocale* locale, LXShiftState* state) {
  const Primitive in(locale);
  *state = LX_SHIFT_SINGLE;
}

LXWChar LXMbToW(const LXObject* codepage, const char* text) {
  if (!lx::initialized()) return 0;
  return lx::pack(bytes_of(text), lx::codepage_of(*codepage).length(bytes_of(text)[0]));
}

LXWChar LXMbToWS(const LXObject* codepage, const char* text, LXShiftState state) {
  return lx::initialized() ? lx::pack(bytes_of(text), lx::codepage_of(*codepage).width_in(state)) : 0;
}

int32_t LXWToMb(char* text, LXWChar code) {
  const uint32_t stored = lx::without_zero_bytes(code);
  const size_t count = lx::code_bytes(stored);
  lx::store_code(bytes_of(text), stored, count);
  return static_cast<int32_t>(count);
}

LXUChar LXCpMbToUnicode(const LXObject* codepage, const char* text) {
  if (!lx::initialized()) return lx::kNoUnicode;
  return lx::multibyte_unicode(lx::codepage_of(*codepage), bytes_of(text));
}

LXUChar LXCpMbToUnicodeW(const LXObject* codepage, LXWChar code) {
  char text[lx::kMaxCharBytes] = {};
  LXWToMb(text, code);
  return LXCpMbToUnicode(codepage, text);
}

int32_t LXCpUnicodeToChar(const LXObject* codepage, LXUChar unicode, char* text) {
  if (!lx::initialized()) return 0;
  return static_cast<int32_t>(lx::store_unicode(lx::codepage_of(*codepage), unicode, bytes_of(text)));
}

LXWChar LXCpUnicodeToCharW(const LXObject* codepage, LXUChar unicode) {
  return lx::initialized() ? lx::unicode_to_code(lx::codepage_of(*codepage), unicode) : 0;
}

int32_t LXCpStrCharToByteLen(const LXObject* codepage, const char* text, LXShiftState state, int32_t chars) {
  if (!lx::initialized()) return 0;
  return static_cast<int32_t>(lx::bytes_of_chars(lx::codepage_of(*codepage), bytes_of(text), state, chars));
}

int32_t LXCpStrByteToCharLen(const LXObject* codepage, const char* text, LXShiftState state, int32_t bytes) {
  if (!lx::initialized() || bytes == 0) return 0;
  const Codepage& cp = lx::codepage_of(*codepage);
  const size_t length = length_of(text, bytes);
  if (cp.single_byte) return static_cast<int32_t>(length);
  return lx::chars_in_bytes(cp, bytes_of(text), state, length);
}

}  // extern "C"
