// Truncation of a string to a buffer, at a whole character and with or without the blanks at its end; and the
// end of a string in a stateful codepage.
#include <cstring>

#include "codepage/lxtext.h"
#include "core/lxcall.h"
#include "text/lxfold.h"
#include "text/lxwalk.h"

using namespace lx;

namespace {

RAS1_Unit unit = RAS1_UNIT("lxtruncate");

/// What is dropped. A full-width blank of 0 is none.
struct Blanks {
  bool dropped;
  uint8_t blank;
  LXWChar full;

  Blanks(const LXLocale& locale, uint32_t flags)
      : dropped((flags & LX_DROP_BLANKS) != 0), blank(blank_of(locale)), full(0) {
    if ((flags & LX_DROP_FULL_BLANKS) == LX_DROP_FULL_BLANKS) find_full_width_blank(locale, &full);
  }
};

/// How the two forms word their messages.
struct Words {
  const char* run;       // a run of blanks begins, with a blank
  const char* full_run;  // ... with a full-width blank
  const char* reset;
  const char* index;
};
constexpr Words kPlainWords = {"Blank position set to", "Blank position set to", "Blank position reset",
                               "index set to"};
constexpr Words kExWords = {"Setting blank position to", "Blank position set to", "Resetting blank position",
                            "Setting index to"};

/// Where to cut a text that is to take `size` units with its null. Blanks are sought from the end.
size_t cut_single_bytes(const uint8_t* text, size_t size, const Blanks& blanks) {
  size_t end = size - 1;
  for (; blanks.dropped && end > 0 && text[end - 1] == blanks.blank; --end)
    LX_TRACE(unit, RAS1_LEVEL_DETAIL, "Stripping blank at position %d", static_cast<int>(end - 1));
  return end;
}

/// The same of characters of several bytes: `in` reads the `size` - 1 bytes before the place of the null.
template <class Cursor>
size_t cut_characters(const Cursor& in, const Blanks& blanks, const Words& words) {
  Walk<Cursor> at(in);
  const uint8_t* run = nullptr;  // the first of the blanks that end what was read
  while (at.next()) {
    if (!blanks.dropped) continue;
    const int index = static_cast<int>(at.start - in.p);
    const bool single = at.units() == 1;
    const bool blank = single && *at.start == blanks.blank;
    if (blank || (!single && at.value == blanks.full)) {
      LX_TRACE(unit, RAS1_LEVEL_DETAIL, "%s encountered at %d", blank ? "Blank" : "Full width blank", index);
      if (run != nullptr) continue;
      LX_TRACE(unit, RAS1_LEVEL_DETAIL, "%s %d", blank ? words.run : words.full_run, index);
      run = at.start;
    } else if (run != nullptr && !(single && *at.in.p == 0)) {
      // A last character of one byte does not end the run: callers rely on results that lack it.
      LX_TRACE(unit, RAS1_LEVEL_DETAIL, "%s", words.reset);
      run = nullptr;
    }
  }
  if (run == nullptr) return static_cast<size_t>(at.in.p - in.p);
  const size_t end = static_cast<size_t>(run - in.p);
  LX_TRACE(unit, RAS1_LEVEL_DETAIL, "%s %d", words.index, static_cast<int>(end));
  return end;
}

/// The bytes that the first `chars` characters take, the null being one of them; what follows the null does not
/// count.
size_t size_in_bytes(const Codepage& cp, const uint8_t* text, LXShiftState state, size_t bytes, int32_t chars) {
  if (chars > chars_counted(cp, text, state, bytes)) return bytes + 1;
  return bytes_of_chars(cp, text, state, chars);
}

/// The bytes that the text takes after the cut.
size_t truncate(LXLocale* locale, Form form, uint8_t* text, LXShiftState state, int32_t given, uint32_t flags) {
  const Codepage& cp = codepage_of(*locale->codepage);
  if (given < 1) {
    text[0] = 0;
    return 1;
  }
  const size_t bytes = units_before_null(text);
  size_t size = static_cast<size_t>(given);
  if ((flags & LX_CHARACTERS) != 0) size = size_in_bytes(cp, text, state, bytes, given);
  const Blanks blanks(*locale, flags);
  if (bytes < size && !blanks.dropped) return bytes + 1;
  if (bytes < size) size = bytes + 1;
  size_t end = 0;
  if (cp.single_byte) {
    LX_TRACE(unit, RAS1_LEVEL_DETAIL, "Single byte code page, string length = %d", static_cast<int>(bytes));
    end = cut_single_bytes(text, size, blanks);
  } else {
    const Words& words = form == Form::kEx && cp.shift_sensitive ? kExWords : kPlainWords;
    end = with_cursor(cp, form, state, text, size - 1,
                      [&](const auto& in) { return cut_characters(in, blanks, words); });
  }
  text[end] = 0;
  return end + 1;
}

int32_t truncate_string(LXLocale* given, Form form, char* buffer, LXShiftState state, int32_t size,
                        uint32_t flags) {
  Call call(unit, given);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, 0);
  LX_TRACE(unit, RAS1_LEVEL_INPUT, "Input length = %d", size);
  uint8_t* const text = bytes_of(buffer);
  size_t result = truncate(call.locale(), form, text, state, size, flags);
  if ((flags & LX_CHARACTERS) != 0)
    result = whole_chars(codepage_of(call.codepage()), form, text, state, result, result).chars;
  LX_TRACE(unit, RAS1_LEVEL_DETAIL, "Truncated string: %s", buffer);
  return call.exit(static_cast<int32_t>(result));
}

}  // namespace

extern "C" {

int32_t LXTruncateString(LXLocale* locale, char* buffer, int32_t size, uint32_t flags) {
  return truncate_string(locale, Form::kPlain, buffer, LX_SHIFT_SINGLE, size, flags);
}

int32_t LXTruncateStringEx(LXLocale* locale, char* buffer, LXShiftState state, int32_t size, uint32_t flags) {
  return truncate_string(locale, Form::kEx, buffer, state, size, flags);
}

int32_t LXTerminateStringEx(LXLocale* locale, char* output, LXShiftState state, uint32_t flags) {
  Call call(unit, locale);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, -1);
  if (flags != 0 && flags != LX_TERMINATE) return call.fail(LX_E_INVALID, -1);
  const Codepage& cp = codepage_of(call.codepage());
  char* p = output;
  if (cp.shift_sensitive && state == LX_SHIFT_DOUBLE) *p++ = static_cast<char>(cp.shift_in);
  if (flags == LX_TERMINATE) *p++ = '\0';
  return call.exit(static_cast<int32_t>(p - output));
}

}  // extern "C"
