// Line ends in strings: finding the first one, and storing them.
#include "stream/lxeol.h"

#include "core/lxcall.h"
#include "text/lxwalk.h"

using namespace lx;

namespace {

RAS1_Unit unit = RAS1_UNIT("lxeol");

template <class Unit>
struct Eol {
  const Unit* end;  // null: none
  uint32_t kind;
  int32_t length;
};

template <class Cursor>
Eol<typename Cursor::Unit> first_eol(const Codepage& cp, const Cursor& text, uint32_t kinds) {
  const LineEnds<typename Walk<Cursor>::Value> ends(cp, kinds);
  for (Walk at(text); at.next();) {
    if (at.units() != 1) continue;
    const auto* const next = at.in.p;
    const bool pair = ends.any(LX_EOL_CRLF) && at.value == ends.carriage_return && next != at.in.end;
    if (pair && *next == ends.line_feed) return {next + 1, LX_EOL_CRLF, 2};
    if (const uint32_t kind = ends.kind_of(at.value)) return {next, kind, 1};
  }
  return {nullptr, LX_EOL_NONE, 0};
}

template <class Unit>
Unit* find(LXLocale* given, Form form, const Text<Unit>& text, uint32_t* kind, int32_t* eol_length,
           uint32_t flags) {
  Unit* const none = nullptr;
  Call call(unit, given);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, none);
  const bool characters = (flags & LX_CHARACTERS) != 0;
  flags &= ~uint32_t{LX_CHARACTERS};
  *kind = LX_EOL_INVALID;
  *eol_length = 0;
  if ((flags & ~LX_EOL_ALL) != 0) return call.fail(LX_E_INVALID, none);
  const Codepage& cp = codepage_of(call.codepage());
  const size_t units = units_of(cp, text, characters);
  const uint32_t kinds = flags != 0 ? flags : LX_EOL_LF;
  const auto eol = with_cursor(cp, form, text, units, [&](const auto& in) { return first_eol(cp, in, kinds); });
  *kind = eol.kind;
  *eol_length = eol.length;
  return call.exit(const_cast<Unit*>(eol.end));
}

template <class Unit>
Unit* put(LXLocale* given, Unit* output, uint32_t flags) {
  Unit* const none = nullptr;
  Call call(unit, given);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, none);
  if ((flags & ~(LX_EOL_ALL | LX_EOL_DEFAULT)) != 0) return call.fail(LX_E_INVALID, none);
  const LineEnds<Unit> ends(codepage_of(call.codepage()), flags != 0 ? flags : LX_EOL_DEFAULT);
  if (ends.any(LX_EOL_FOURTH)) *output++ = ends.fourth;
  if (ends.any(LX_EOL_THIRD)) *output++ = ends.third;
  if (ends.any(LX_EOL_LF)) *output++ = ends.line_feed;
  if (ends.any(LX_EOL_CRLF)) *output++ = ends.carriage_return;
  if (ends.any(LX_EOL_CRLF | LX_EOL_DEFAULT)) *output++ = ends.line_feed;
  return call.exit(output);
}

}  // namespace

extern "C" {

char* LXGetEol(LXLocale* locale, const char* text, int32_t length, uint32_t* kind, int32_t* eol_length,
               uint32_t flags) {
  return chars_of(find(locale, Form::kPlain, text_of(text, length), kind, eol_length, flags));
}
char* LXGetEolEx(LXLocale* locale, const char* text, int32_t length, uint32_t* kind, int32_t* eol_length,
                 uint32_t flags) {
  return chars_of(find(locale, Form::kEx, text_of(text, length), kind, eol_length, flags));
}
LXWChar* LXGetEolW(LXLocale* locale, const LXWChar* text, int32_t length, uint32_t* kind, int32_t* eol_length,
                   uint32_t flags) {
  return find(locale, Form::kPlain, text_of(text, length), kind, eol_length, flags);
}
LXUChar* LXGetEolU(LXLocale* locale, const LXUChar* text, int32_t length, uint32_t* kind, int32_t* eol_length,
                   uint32_t flags) {
  return find(locale, Form::kPlain, text_of(text, length), kind, eol_length, flags);
}

char* LXPutEol(LXLocale* locale, char* output, uint32_t flags) {
  return chars_of(put(locale, bytes_of(output), flags));
}
char* LXPutEolEx(LXLocale* locale, char* output, uint32_t flags) {
  return chars_of(put(locale, bytes_of(output), flags));
}
LXWChar* LXPutEolW(LXLocale* locale, LXWChar* output, uint32_t flags) {
  return put(locale, output, flags);
}
LXUChar* LXPutEolU(LXLocale* locale, LXUChar* output, uint32_t flags) {
  return put(locale, output, flags);
}

}  // extern "C"
