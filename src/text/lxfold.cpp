#include "text/lxfold.h"

#include <cstring>

#include "core/lxmemory.h"
#include "lx/string.h"

namespace lx {

LXWChar capital(const Codepage& cp, LXWChar code) {
  if (code <= 0xFF) return cp.payload[format::codepage::kUpper + code];
  const uint32_t stored = without_zero_bytes(code);
  const uint32_t other = other_case(type_record_of_code(cp, code), stored, LX_C1_LOWER);
  return other != stored ? other : code;
}

void find_full_width_blank(const LXLocale& locale, LXWChar* code) {
  const uint8_t blank = blank_of(locale);
  const LXWChar full = WidthTables(codepage_of(*locale.codepage)).full_of_byte(blank);
  *code = full != 0 ? full : blank;
}
void find_full_width_blank(const LXLocale& locale, LXUChar* u) {
  *u = unicode_half_to_full(blank_of(locale));
}

void drop_blanks(LXLocale* locale, Form form, CountedText<uint8_t>* text1, CountedText<uint8_t>* text2,
                 uint32_t flags, bool second_as_long) {
  const size_t longer = text1->units > text2->units ? text1->units : text2->units;
  if (longer >= INT32_MAX) return;
  const WorkBuffer buffer(longer + 1);
  if (!buffer) return;
  char* const copy = buffer.as<char>();
  const auto drop = [&](CountedText<uint8_t>* text, size_t copied) {
    if (copied != 0) memcpy(copy, text->p, copied);
    copy[copied] = '\0';
    const auto size = static_cast<int32_t>(text->units + 1);
    // By these functions: a trace shows the calls.
    const int32_t kept = form == Form::kEx ? LXTruncateStringEx(locale, copy, text->state, size, flags)
                                           : LXTruncateString(locale, copy, size, flags);
    text->units = static_cast<size_t>(kept) - 1;
  };
  drop(text1, text1->units);
  drop(text2, second_as_long ? least(text1->units, text2->units) : text2->units);
}

}  // namespace lx
