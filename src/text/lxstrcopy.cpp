// Copying and concatenation of strings by whole characters: what fits, and never a part of one.
#include <cstring>

#include "core/lxcall.h"
#include "text/lxwalk.h"

using namespace lx;

namespace {

RAS1_Unit unit = RAS1_UNIT("lxstrcopy");

/// Of an empty text there may be no address.
template <class Unit>
void move_units(Unit* to, const Unit* from, size_t units) {
  if (units != 0) memmove(to, from, units * sizeof(Unit));
}

template <class Unit>
int32_t copy(LXLocale* given, Form form, Unit* output, int32_t size, const Text<Unit>& text,
             LXShiftState* state, uint32_t flags) {
  Call call(unit, given);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, -1);
  if ((flags & ~uint32_t{LX_CHARACTERS}) != 0) return call.fail(LX_E_INVALID, -1);
  const Codepage& cp = codepage_of(call.codepage());
  const bool characters = (flags & LX_CHARACTERS) != 0;
  const Part taken = part_that_fits(cp, form, text, size, characters);
  if constexpr (sizeof(Unit) == 1)
    if (state != nullptr) *state = state_behind(cp, text.p, text.state, taken.units);
  move_units(output, text.p, taken.units);
  return call.exit(static_cast<int32_t>(characters ? taken.chars : taken.units));
}

/// The buffer that a text is appended to.
template <class Unit>
struct Target {
  Unit* p;
  LXShiftState state;
  size_t used;      // units before the null
  size_t most;      // units or characters before a null
  bool characters;  // which of them
};

/// What the buffer holds, the null included. `bytes` of text are there.
Part append_shifting(const Codepage& cp, const Target<uint8_t>& to, const ByteText& text, size_t bytes) {
  ShiftCursor old{cp, to.p, to.p + to.used, to.state};
  ShiftSink out{cp, to.p, to.characters ? no_end<uint8_t>() : to.p + to.most, to.state};
  Part held{0, 1};
  LXWChar code = 0;
  for (; old.next(&code); ++held.chars) {
    out.p = to.p + (old.p - to.p);
    out.state = old.state;
  }
  if (to.characters && held.chars > to.most + 1) return {0, 0};
  ShiftCursor in{cp, text.p, text.p + bytes, text.state};
  for (; (!to.characters || held.chars <= to.most) && in.next(&code); ++held.chars) {
    ShiftSink ahead(out);
    // A Shift-In must fit behind it.
    if (!ahead.put(code) || (ahead.state == LX_SHIFT_DOUBLE && ahead.p == ahead.end)) break;
    go_on_at(out, ahead);
  }
  if (out.state == LX_SHIFT_DOUBLE && out.p != out.end) *out.p++ = out.take_shift_byte();
  *out.p++ = 0;
  held.units = static_cast<size_t>(out.p - to.p);
  return held;
}

Part first_chars(const Codepage& cp, Form form, const ByteText& text, size_t bytes, size_t most) {
  return with_cursor(cp, form, text, bytes, [&](const auto& in) {
    Walk at(in);
    size_t chars = 0;
    while (chars < most && at.next()) ++chars;
    return Part{room(in.p, at.in.p), chars};
  });
}

Part append(const Codepage& cp, Form form, const Target<uint8_t>& to, const ByteText& text, size_t bytes) {
  if (form == Form::kEx && cp.shift_sensitive) return append_shifting(cp, to, text, bytes);
  const Part old = whole_chars(cp, form, to.p, to.state, to.used, to.used);
  const size_t held = to.characters ? old.chars : old.units;
  if (held > to.most) return {0, 0};
  const size_t left = to.most - held;
  const Part taken = to.characters ? first_chars(cp, form, text, bytes, left)
                                   : whole_chars(cp, form, text.p, text.state, least(bytes, left), bytes);
  move_units(to.p + old.units, text.p, taken.units);
  to.p[old.units + taken.units] = 0;
  return {old.units + taken.units + 1, old.chars + taken.chars + 1};
}

template <class Unit>
Part append(const Codepage&, Form, const Target<Unit>& to, const Text<Unit>& text, size_t units) {
  const size_t taken = least(units, to.most - to.used);
  move_units(to.p + to.used, text.p, taken);
  to.p[to.used + taken] = 0;
  return {to.used + taken + 1, to.used + taken + 1};
}

template <class Unit>
int32_t concatenate(LXLocale* given, Form form, Unit* buffer, LXShiftState buffer_state, int32_t size,
                    const Text<Unit>& text, uint32_t flags) {
  Call call(unit, given);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, -1);
  if ((flags & ~uint32_t{LX_CHARACTERS}) != 0) return call.fail(LX_E_INVALID, -1);
  if (size < 1) return call.exit(0);
  const Codepage& cp = codepage_of(call.codepage());
  const bool characters = sizeof(Unit) == 1 && (flags & LX_CHARACTERS) != 0;
  const size_t most = static_cast<size_t>(size) - 1;
  size_t used = 0;
  while ((characters || used < most) && buffer[used] != 0) ++used;
  if (buffer[used] != 0) return call.exit(0);
  const Part held = append(cp, form, Target<Unit>{buffer, buffer_state, used, most, characters}, text,
                           units_of(cp, text, characters));
  return call.exit(static_cast<int32_t>(characters ? held.chars : held.units));
}

}  // namespace

extern "C" {

int32_t LXStrcat(LXLocale* locale, char* buffer, int32_t size, const char* text, int32_t length,
                 uint32_t flags) {
  return concatenate(locale, Form::kPlain, bytes_of(buffer), 0, size, text_of(text, length), flags);
}
int32_t LXStrcatEx(LXLocale* locale, char* buffer, LXShiftState buffer_state, int32_t size, const char* text,
                   LXShiftState text_state, int32_t length, uint32_t flags) {
  return concatenate(locale, Form::kEx, bytes_of(buffer), buffer_state, size, text_of(text, length, text_state),
                     flags);
}
int32_t LXWcscat(LXLocale* locale, LXWChar* buffer, int32_t size, const LXWChar* text, int32_t length,
                 uint32_t flags) {
  return concatenate(locale, Form::kPlain, buffer, 0, size, text_of(text, length), flags);
}
int32_t LXStrcatU(LXLocale* locale, LXUChar* buffer, int32_t size, const LXUChar* text, int32_t length,
                  uint32_t flags) {
  return concatenate(locale, Form::kPlain, buffer, 0, size, text_of(text, length), flags);
}

int32_t LXStrcpy(LXLocale* locale, char* output, int32_t size, const char* text, int32_t length,
                 uint32_t flags) {
  return copy(locale, Form::kPlain, bytes_of(output), size, text_of(text, length), nullptr, flags);
}
int32_t LXStrcpyEx(LXLocale* locale, char* output, int32_t size, const char* text, LXShiftState text_state,
                   int32_t length, LXShiftState* state, uint32_t flags) {
  const ByteText in = text_of(text, length, text_state);
  return copy(locale, Form::kEx, bytes_of(output), size, in, state, flags);
}
int32_t LXWcscpy(LXLocale* locale, LXWChar* output, int32_t size, const LXWChar* text, int32_t length,
                 uint32_t flags) {
  return copy(locale, Form::kPlain, output, size, text_of(text, length), nullptr, flags);
}
int32_t LXStrcpyU(LXLocale* locale, LXUChar* output, int32_t size, const LXUChar* text, int32_t length,
                  uint32_t flags) {
  return copy(locale, Form::kPlain, output, size, text_of(text, length), nullptr, flags);
}

}  // extern "C"
