// Characters of a codepage: how long they are, where the next and the previous one start, how many there are,
// and their packed codes and Unicode values. Per-character primitives: no trace.
#include <string.h>

#include "codepage/lxprimitive.h"
#include "codepage/lxtext.h"

using namespace lx;

namespace {

char* same(const char* text) {
  return const_cast<char*>(text);
}

/// Calls `body` with the cursor of a text whose end is not known: by lead bytes, or where the codepage has them
/// by shift bytes, of which one that stands here is passed.
template <class Body>
auto at_char(const Primitive& in, const char* text, Body body) {
  return body(MultiByteCursor{in.cp(), bytes_of(text), no_end<const uint8_t>()});
}
template <class Body>
auto at_char(const Primitive& in, const char* text, LXShiftState state, Body body) {
  if (!in.shift_sensitive()) return at_char(in, text, body);
  const uint8_t* p = bytes_of(text);
  take_shift(in.cp(), &p, &state);
  return body(ShiftCursor{in.cp(), p, no_end<const uint8_t>(), state});
}

/// By branches where they tell: a branch is predicted, what a look-up gives is waited for.
template <class Cursor>
size_t length_at(const Cursor& at) {
  if constexpr (!Cursor::kShifts) {
    const unsigned first = *at.p;
    if (first < at.cp.same_below) return 1;
    if (at.cp.plain_utf8 && first - 0xC2u < 0xF0 - 0xC2) return first < 0xE0 ? 2 : 3;
  }
  return at.length();
}

constexpr auto kCode = [](const auto& at) {
  const size_t length = length_at(at);
  return LXWChar{length == 1 ? *at.p : length == 2 ? pack(at.p, 2) : pack(at.p, length)};
};
constexpr auto kBytes = [](const auto& at) { return static_cast<int32_t>(length_at(at)); };

/// Lead bytes can only be told from the front.
char* previous_char(const Primitive& in, const char* start, const char* current) {
  if (in.single_byte()) return same(current - 1);
  const uint8_t* last = bytes_of(start);
  for (MultiByteCursor at{in.cp(), last, bytes_of(current)}; at.pass() && at.p < at.end;) last = at.p;
  return chars_of(last);
}

/// Moves by a length above 0, in whole characters.
char* move_by(const Codepage& cp, Form form, const char* text, LXShiftState state, int32_t length,
              int32_t flags, LXShiftState* new_state) {
  const size_t bytes = units_of(cp, text_of(text, length, state), (flags & LX_CHARACTERS) != 0);
  return with_cursor(cp, form, state, bytes_of(text), bytes, [&](auto at) {
    pass_all(&at);
    put_state(new_state, state_at(at, state));
    return chars_of(at.p);
  });
}

int32_t valid_bytes(const char* text, size_t length) {
  return static_cast<int32_t>(strnlen(text, length));
}

/// Whether a text of 4 to 15 bytes is ASCII, each byte of which is a character.
bool is_short_ascii(const Codepage& cp, const uint8_t* p, size_t bytes) {
  constexpr uint64_t kHigh = 0x8080808080808080;
  if (bytes - 4 >= 12 || !cp.leads.above_ascii) return false;
  if (bytes < 8) return ((le32(p) | le32(p + bytes - 4)) & kHigh) == 0;
  return ((le64(p) | le64(p + bytes - 8)) & kHigh) == 0;
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
  store_packed(bytes, code);
  return multibyte_unicode(cp, bytes);
}

}  // namespace lx

extern "C" {

LXWChar LXGetChar(LXLocale* locale, const char* text) {
  const Primitive in(locale);
  return in ? at_char(in, text, kCode) : 0;
}

LXWChar LXGetCharEx(LXLocale* locale, const char* text, LXShiftState state) {
  const Primitive in(locale);
  return in ? at_char(in, text, state, kCode) : 0;
}

int32_t LXPutChar(LXLocale* locale, char* text, LXWChar code) {
  const Primitive in(locale);
  if (in) store_packed(bytes_of(text), code);
  return 0;
}

void LXPutCharEx(LXLocale* locale, char* text, LXShiftState state, LXWChar code) {
  const Primitive in(locale);
  if (!in) return;
  const LXShiftState needed = code > 0xFF ? LX_SHIFT_DOUBLE : LX_SHIFT_SINGLE;
  if (in.shift_sensitive() && needed != state) *text++ = static_cast<char>(shift_byte(in.cp(), needed));
  store_packed(bytes_of(text), code);
}

char* LXNextChar(LXLocale* locale, const char* text) {
  const Primitive in(locale);
  return same(in ? text + at_char(in, text, kBytes) : text);
}

char* LXNextCharEx(LXLocale* locale, const char* text, LXShiftState state, LXShiftState* new_state, int32_t) {
  const Primitive in(locale);
  put_state(new_state, state);
  if (!in) return same(text);
  return at_char(in, text, state, [&](auto at) {
    at.p += at.length();
    if constexpr (decltype(at)::kShifts) at.pass_shift();
    put_state(new_state, state_at(at, state));
    return chars_of(at.p);
  });
}

char* LXPrevChar(LXLocale* locale, const char* start, const char* current) {
  const Primitive in(locale);
  if (!in) return same(current);
  return previous_char(in, start, current);
}

char* LXPrevCharEx(LXLocale* locale, const char* start, const char* current, LXShiftState state,
                   LXShiftState* new_state) {
  const Primitive in(locale);
  put_state(new_state, state);
  if (!in) return same(current);
  if (!in.shift_sensitive()) return previous_char(in, start, current);
  const Codepage& cp = in.cp();
  const char* p = current;
  if (p > start && cp.is_shift(bytes_of(p)[-1])) {
    // The shift byte tells the state of what stands before it: before a Shift-In it is double-byte.
    --p;
    state = bytes_of(p)[0] == cp.shift_in ? LX_SHIFT_DOUBLE : LX_SHIFT_SINGLE;
  }
  const ptrdiff_t step = cp.width_in(state);
  p = p - start > step ? p - step : start;
  put_state(new_state, state);
  return same(p);
}

int32_t LXNumChars(LXLocale* locale, const char* text, int32_t bytes) {
  const Primitive in(locale);
  if (!in) return 0;
  const size_t units = text_units(text, bytes);
  if (is_short_ascii(in.cp(), bytes_of(text), units)) return static_cast<int32_t>(units);
  return with_cursor(in.cp(), Form::kPlain, LX_SHIFT_SINGLE, bytes_of(text), units,
                     [](auto at) { return static_cast<int32_t>(pass_all(&at)); });
}

int32_t LXNumCharsEx(LXLocale* locale, const char* text, LXShiftState state, int32_t bytes) {
  const Primitive in(locale);
  if (!in) return 0;
  return chars_in_bytes(in.cp(), bytes_of(text), state, text_units(text, bytes));
}

char* LXMoveStringPointer(LXLocale* locale, const char* text, int32_t length, int32_t flags) {
  const Primitive in(locale);
  if (!in || length <= 0) return same(text);
  return move_by(in.cp(), Form::kPlain, text, LX_SHIFT_SINGLE, length, flags, nullptr);
}

char* LXMoveStringPointerEx(LXLocale* locale, const char* text, LXShiftState state, int32_t length,
                            LXShiftState* new_state, int32_t flags) {
  const Primitive in(locale);
  if (in && !in.shift_sensitive()) put_state(new_state, state);
  if (!in || length <= 0) return same(text);
  return move_by(in.cp(), Form::kEx, text, state, length, flags, new_state);
}

int32_t LXValidChar(LXLocale* locale, const char* text) {
  const Primitive in(locale);
  return in ? valid_bytes(text, in.cp().length(bytes_of(text)[0])) : 0;
}

int32_t LXValidCharEx(LXLocale* locale, const char* text, LXShiftState state) {
  const Primitive in(locale);
  if (!in) return 0;
  if (!in.shift_sensitive()) return valid_bytes(text, in.cp().length(bytes_of(text)[0]));
  return valid_bytes(text, state != LX_SHIFT_SINGLE ? in.cp().width : 1);
}

int32_t LXByteLength(LXLocale* locale, const char* text) {
  const Primitive in(locale);
  return in ? at_char(in, text, kBytes) : 0;
}

int32_t LXByteLengthW(LXLocale* locale, LXWChar code) {
  const Primitive in(locale);
  return in ? static_cast<int32_t>(code_bytes(code)) : 0;
}

int32_t LXByteLengthEx(LXLocale* locale, const char* text, LXShiftState state) {
  const Primitive in(locale);
  return in ? at_char(in, text, state, kBytes) : 0;
}

int32_t LXStrByteLength(LXWChar code) {
  return static_cast<int32_t>(code_bytes(code));
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
  if (!initialized()) return 0;
  return pack(bytes_of(text), codepage_of(*codepage).length(bytes_of(text)[0]));
}

LXWChar LXMbToWS(const LXObject* codepage, const char* text, LXShiftState state) {
  return initialized() ? pack(bytes_of(text), codepage_of(*codepage).width_in(state)) : 0;
}

int32_t LXWToMb(char* text, LXWChar code) {
  return static_cast<int32_t>(store_packed(bytes_of(text), code));
}

LXUChar LXCpMbToUnicode(const LXObject* codepage, const char* text) {
  if (!initialized()) return kNoUnicode;
  return multibyte_unicode(codepage_of(*codepage), bytes_of(text));
}

LXUChar LXCpMbToUnicodeW(const LXObject* codepage, LXWChar code) {
  if (!initialized()) return kNoUnicode;
  uint8_t text[kMaxCharBytes] = {};
  store_packed(text, code);
  return multibyte_unicode(codepage_of(*codepage), text);
}

int32_t LXCpUnicodeToChar(const LXObject* codepage, LXUChar unicode, char* text) {
  if (!initialized()) return 0;
  return static_cast<int32_t>(store_unicode(codepage_of(*codepage), unicode, bytes_of(text)));
}

LXWChar LXCpUnicodeToCharW(const LXObject* codepage, LXUChar unicode) {
  return initialized() ? unicode_to_code(codepage_of(*codepage), unicode) : 0;
}

int32_t LXCpStrCharToByteLen(const LXObject* codepage, const char* text, LXShiftState state, int32_t chars) {
  if (!initialized()) return 0;
  return static_cast<int32_t>(bytes_of_chars(codepage_of(*codepage), bytes_of(text), state, chars));
}

int32_t LXCpStrByteToCharLen(const LXObject* codepage, const char* text, LXShiftState state, int32_t bytes) {
  if (!initialized() || bytes == 0) return 0;
  return chars_in_bytes(codepage_of(*codepage), bytes_of(text), state, text_units(text, bytes));
}

}  // extern "C"
