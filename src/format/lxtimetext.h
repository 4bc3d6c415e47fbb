// What the writing and the reading of times share: the items of a locale in a kind of text, and what both
// directions ask of a format.
#pragma once

#include <cstring>

#include "codepage/lxtext.h"
#include "core/lxrecords.h"
#include "format/lxtime.h"
#include "locale/lxlocale.h"

namespace lx {

/// Only packed codes and shift-stateful text tell codepage 930 from other EBCDIC.
template <class Text>
const TimeSymbols& time_symbols(const LXLocale& locale) {
  if (Text::Cursor::kUnicode || keeps_ascii(locale)) return kAsciiTime;
  const bool katakana = sizeof(typename Text::Unit) != 1 || Text::Cursor::kShifts;
  return katakana && locale.codepage->disk.id == kKatakanaCodepage ? kKatakanaTime : kEbcdicTime;
}

/// Whether the character that was read can be a letter or digit: in the double-byte state none is.
template <class Cursor>
bool read_single(const Cursor& in) {
  return state_at(in, LX_SHIFT_SINGLE) != LX_SHIFT_DOUBLE;
}

/// Whether characters follow. A shift byte at the very end is none.
template <class Cursor>
bool has_more(const Cursor& in) {
  if constexpr (Cursor::kShifts)
    if (ShiftCursor(in).pass_last_shift()) return false;
  return in.p != in.end;
}

/// Copies the character that `in` has just read, bytes and all. `before`: where it stood.
template <class Text>
bool copy_char(const typename Text::Cursor& in, const typename Text::Unit* before, typename Text::Value value,
               typename Text::Sink* out) {
  using Cursor = typename Text::Cursor;
  if constexpr (Cursor::kOneUnit) {
    return out->put(value);
  } else {
    const size_t count = Cursor::kShifts ? in.cp.width_in(state_at(in, LX_SHIFT_SINGLE)) : room(before, in.p);
    return out->put_bytes(in.p - count, count);
  }
}

/// The cursor of a text that a caller gave, whose length counts units or, of bytes, characters as LXNumCharsEx counts
/// them. Nothing behind the last character is looked at.
template <class Kind, class Unit = typename Kind::Unit>
typename Kind::Cursor given_text(const Codepage& cp, const Text<Unit>& text, bool characters) {
  if (text.length < 0 || !characters)
    return Kind::cursor(cp, text.p, text_units(text.p, text.length), text.state);
  auto in = Kind::Cursor::over(cp, text.p, no_end<const Unit>(), text.state);
  pass_chars(&in, static_cast<size_t>(text.length));
  return Kind::cursor(cp, text.p, room(text.p, in.p), text.state);
}

/// Names and nested formats are used as far as they fit before a null.
inline constexpr size_t kItemUnits = 31;

/// Writes a null-terminated 16-bit text, as far as it fits. Up to `end` there is more than it.
template <class Sink>
inline void write_time_unicode(const uint8_t* text, const uint8_t* end, Sink* out) {
  Sink copy = *out;  // in registers
  if constexpr (sizeof(typename Sink::Unit) <= 2 && !Sink::kShifts) {
    const unsigned below = copy.same_below();
    size_t units = kVectors && below != 0 ? kBlock : 0;
    while (units == kBlock && room(text, end) >= 2 * kBlock && units_left(copy) >= kBlock) {
      units = copy_text_block(copy.p, text, below);
      copy.p += units;
      text += 2 * units;
    }
  }
  LXUChar u = le16(text);
  if constexpr (sizeof(typename Sink::Unit) == 1 && !Sink::kShifts) {
    const unsigned below = copy.same_below();
    for (; u != 0 && u < below && copy.p != copy.end; u = le16(text += 2)) *copy.p++ = static_cast<uint8_t>(u);
  }
  for (; u != 0 && copy.put(u); u = le16(text += 2)) {
  }
  go_on_at(*out, copy);
}

/// The text of a name, all of which are the language's.
inline const uint8_t* time_name(const LXLocale& locale, int32_t item) {
  return payload_text(*locale.language, format::language::kFirstDay + static_cast<size_t>(item - LX_ITEM_DAY));
}
template <class Sink>
inline void write_time_name(const LXLocale& locale, int32_t item, Sink* out) {
  const LXObject& language = *locale.language;
  write_time_unicode(time_name(locale, item), payload_of(language) + language.section_bytes[0], out);
}

/// Writes an item of the locale, as far as it fits.
template <class Text, class Sink = typename Text::Sink>
void write_time_item(const LXLocale& locale, int32_t item, bool current, Sink* out) {
  TextKind kind{};
  const auto get = Text::Cursor::kUnicode ? LXLocaleGetTextItemU : LXLocaleGetTextItem;
  const auto* text = static_cast<const uint8_t*>(get(&locale, item, current, &kind));
  if (kind == TextKind::kUnicode) {
    write_time_unicode(text, text, out);
  } else if constexpr (!Text::Cursor::kUnicode) {
    const Codepage& cp = codepage_of(*locale.codepage);
    const size_t bytes = strlen(reinterpret_cast<const char*>(text));
    const auto fill = [&](auto in) {
      if constexpr (!Sink::kOneUnit && !Sink::kShifts)
        for (const unsigned below = in.same_below(); in.p != in.end && *in.p < below && out->p != out->end;)
          *out->p++ = *in.p++;
      for (LXWChar code = 0; in.next(&code) && out->put(code);) {
      }
    };
    if constexpr (sizeof(typename Text::Unit) == 1)
      fill(Text::cursor(cp, text, bytes));
    else
      with_cursor(cp, Form::kEx, LX_SHIFT_SINGLE, text, bytes, fill);
  }
  close_text(*out);
}

template <class Text>
struct TimeItem {
  typename Text::Unit units[kItemUnits];
  size_t count;

  TimeItem(const LXLocale& locale, int32_t number, bool current) {
    auto out = Text::sink(codepage_of(*locale.codepage), units, units + kItemUnits);
    write_time_item<Text>(locale, number, current, &out);
    count = static_cast<size_t>(out.p - units);
  }
  typename Text::Cursor cursor(const LXLocale& locale) const {
    return Text::cursor(codepage_of(*locale.codepage), units, count);
  }
};

/// The directive that the character just read names.
template <class Cursor, class Value>
const TimeDirective& directive_at(const Cursor& format, Value value, const TimeSymbols& symbols) {
  return symbols.directive(read_single(format) ? value : sizeof(symbols.directives));
}

/// Whether the character just read begins a directive.
template <class Cursor, class Value>
bool is_percent(const Cursor& format, Value value, const TimeSymbols& symbols) {
  return value == symbols.percent && read_single(format);
}

/// Reads what follows a "%": kNone or kFlag where that is no directive.
template <class Cursor, class Value>
const TimeDirective& take_directive(Cursor* format, const TimeSymbols& symbols, bool* flag, Value* value) {
  *flag = false;
  for (;;) {
    if (!format->next(value)) return kTimeDirectives[0];
    const TimeDirective& directive = directive_at(*format, *value, symbols);
    if (directive.action != TimeAction::kFlag || *flag) return directive;
    *flag = true;
  }
}

}  // namespace lx
