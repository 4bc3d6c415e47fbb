// How much of a byte text a copy takes.
#include "codepage/lxcopy.h"

namespace lx {

Copied whole_chars(const Codepage& cp, Form form, const uint8_t* text, LXShiftState state, size_t bytes,
                   size_t text_bytes) {
  if (cp.single_byte) return {bytes, bytes};
  const bool shift = form == Form::kEx && cp.shift_sensitive;
  const uint8_t* p = text;
  const uint8_t* const end = text + bytes;
  size_t chars = 0;
  while (p < end) {
    const uint8_t* q = p;
    LXShiftState behind = state;
    if (shift && take_shift(cp, &q, &behind) && q == end) break;
    const size_t length = shift ? cp.width_in(behind) : cp.length(*q);
    if (length > static_cast<size_t>(end - q)) break;
    p = q + length;
    state = behind;
    ++chars;
  }
  if (shift && p < end && cp.is_shift(*p) && (*p == cp.shift_in || p + 1 == text + text_bytes)) ++p;
  return {static_cast<size_t>(p - text), chars};
}

Copied whole_bytes(const Codepage& cp, Form form, const uint8_t* text, LXShiftState state, int32_t length,
                   int32_t size, bool characters) {
  if (size < 1 || length == 0) return {0, 0};
  const size_t given = length < 0 ? units_with_null(text) : static_cast<size_t>(length);
  const size_t wanted = static_cast<size_t>(size);
  if (!characters) return whole_chars(cp, form, text, state, least(given, wanted), given);
  const size_t there = length < 0 ? static_cast<size_t>(chars_in_bytes(cp, text, state, given)) : given;
  if (length < 0 && there <= wanted) return {given, there};  // nothing behind the null is looked at
  const size_t chars = least(there, wanted);
  // Two shift bytes side by side may be counted as a character; the null still ends the text.
  return {bytes_of_chars(cp, text, state, static_cast<int32_t>(chars), length < 0 ? given : SIZE_MAX), chars};
}

}  // namespace lx
