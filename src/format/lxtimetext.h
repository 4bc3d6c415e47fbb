// The kinds of text as times walk them: the readers and writers of a kind in pairs, the items of a locale in a
// kind, and what both directions ask of a format.
#pragma once

#include <cstring>

#include "codepage/lxtext.h"
#include "core/lxrecords.h"
#include "format/lxtime.h"
#include "locale/lxlocale.h"

namespace lx {

/// A kind of text: its reader, and the writer to it.
template <class ReaderOf, class WriterOf>
struct TimeText {
  using Reader = ReaderOf;
  using Writer = WriterOf;
  using Unit = typename Reader::Unit;
  static constexpr bool kUnicode = std::is_same_v<Reader, UnicodeReader>;
  static constexpr bool kShift = std::is_same_v<Reader, ShiftReader>;
  static constexpr bool kBytes = sizeof(Unit) == 1;
  using Value = std::conditional_t<kUnicode, LXUChar, LXWChar>;

  static Reader read(const Codepage& cp, const Unit* p, size_t units, LXShiftState state = LX_SHIFT_SINGLE) {
    if constexpr (kUnicode)
      return {p, p + units};
    else if constexpr (kShift)
      return {cp, p, p + units, state};
    else
      return {cp, p, p + units};
  }
  static Writer write(const Codepage& cp, Unit* p, size_t units, LXShiftState state = LX_SHIFT_SINGLE) {
    if constexpr (kUnicode)
      return {p, end_of(p, units)};
    else if constexpr (kShift)
      return {cp, p, end_of(p, units), state};
    else
      return {cp, p, end_of(p, units)};
  }
};
using UnicodeTime = TimeText<UnicodeReader, UnicodeWriter>;
using CodeTime = TimeText<CodeReader, CodeWriter>;

/// Calls `body` with the kind of a byte text.
template <class Body>
auto with_time_bytes(const Codepage& cp, Form form, Body&& body) {
  if (form == Form::kEx && cp.shift_sensitive) return body(TimeText<ShiftReader, ClosedShiftWriter>{});
  if (cp.utf8) return body(TimeText<Utf8Reader, Utf8Writer>{});
  if (cp.single_byte) return body(TimeText<SingleByteReader, SingleByteWriter>{});
  return body(TimeText<MultiByteReader, MultiByteWriter>{});
}

/// Only packed codes and shift-stateful text tell codepage 930 from other EBCDIC.
template <class Text>
const TimeSymbols& time_symbols(const LXLocale& locale) {
  if (Text::kUnicode || keeps_ascii(locale)) return kAsciiTime;
  const bool katakana = !Text::kBytes || Text::kShift;
  return katakana && locale.codepage->disk.id == kKatakanaCodepage ? kKatakanaTime : kEbcdicTime;
}

/// The units that can be written before the output is full.
template <class Writer>
size_t units_left(const Writer& out) {
  return room(out.p, out.end);
}
inline size_t units_left(const ClosedShiftWriter& out) {
  return room(out.p, out.end) - (out.state == LX_SHIFT_DOUBLE && out.p != out.end ? 1 : 0);
}

/// Whether the character that was read can be a letter or digit: in the double-byte state none is.
template <class Reader>
bool read_single(const Reader&) {
  return true;
}
inline bool read_single(const ShiftReader& in) {
  return in.state != LX_SHIFT_DOUBLE;
}

/// Whether characters follow. A shift byte at the very end is none.
template <class Reader>
bool has_more(const Reader& in) {
  return in.p != in.end;
}
inline bool has_more(const ShiftReader& in) {
  return in.p != in.end && !(in.end - in.p == 1 && in.cp.is_shift(*in.p));
}

/// Copies the character that `in` has just read, bytes and all. `before`: where it stood.
template <class Text>
bool copy_char(const typename Text::Reader& in, const typename Text::Unit* before, typename Text::Value value,
               typename Text::Writer* out) {
  if constexpr (Text::Reader::kOneUnit) {
    return out->put(value);
  } else if constexpr (Text::kShift) {
    const size_t count = in.cp.width_in(in.state);
    return out->copy(in.p - count, count, in.state);
  } else {
    const size_t count = static_cast<size_t>(in.p - before);
    if (count > room(out->p, out->end)) return false;
    if (count == 1) {  // apart: most characters
      *out->p++ = *before;
      return true;
    }
    for (size_t i = 0; i < count; ++i) *out->p++ = before[i];
    return true;
  }
}

/// The bytes of a text that a caller gave, whose length counts bytes, or characters. Nothing behind the last
/// character is looked at.
template <class Text>
size_t given_bytes(const Codepage& cp, const uint8_t* text, LXShiftState state, int32_t length,
                   bool characters) {
  if (length < 0) return strlen(reinterpret_cast<const char*>(text));
  if (!characters || Text::Reader::kOneUnit) return static_cast<size_t>(length);
  const uint8_t* p = text;
  for (int32_t i = 0; i < length; ++i) {
    if constexpr (Text::kShift) {
      take_shift(cp, &p, &state);
      p += cp.width_in(state);
    } else {
      p += cp.length(*p);
    }
  }
  return static_cast<size_t>(p - text);
}

/// Names and nested formats are used as far as they fit before a null.
inline constexpr size_t kItemUnits = 31;

/// Writes a null-terminated 16-bit text, as far as it fits.
template <class Writer>
inline void write_time_unicode(const uint8_t* text, Writer* out) {
  Writer copy = *out;  // in registers
  LXUChar u = le16(text);
  if constexpr (sizeof(typename Writer::Unit) == 1 && !std::is_same_v<Writer, ClosedShiftWriter>) {
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

/// Writes an item of the locale, as far as it fits.
template <class Text, class Writer = typename Text::Writer>
void write_time_item(const LXLocale& locale, int32_t item, bool current, Writer* out) {
  TextKind kind{};
  const auto get = Text::kUnicode ? LXLocaleGetTextItemU : LXLocaleGetTextItem;
  const auto* text = static_cast<const uint8_t*>(get(&locale, item, current, &kind));
  if (kind == TextKind::kUnicode) {
    write_time_unicode(text, out);
  } else if constexpr (!Text::kUnicode) {
    const Codepage& cp = codepage_of(*locale.codepage);
    const size_t bytes = strlen(reinterpret_cast<const char*>(text));
    const auto fill = [&](auto in) {
      for (LXWChar code = 0; in.next(&code) && out->put(code);) {
      }
    };
    if constexpr (Text::kBytes)
      fill(Text::read(cp, text, bytes));
    else
      read_bytes(cp, Form::kEx, LX_SHIFT_SINGLE, text, bytes, fill);
  }
  close_text(*out);
}

template <class Text>
struct TimeItem {
  typename Text::Unit units[kItemUnits];
  size_t count;

  TimeItem(const LXLocale& locale, int32_t number, bool current) {
    auto out = Text::write(codepage_of(*locale.codepage), units, kItemUnits);
    write_time_item<Text>(locale, number, current, &out);
    count = static_cast<size_t>(out.p - units);
  }
  typename Text::Reader reader(const LXLocale& locale) const {
    return Text::read(codepage_of(*locale.codepage), units, count);
  }
};

/// The directive that the character just read names.
template <class Reader, class Value>
const TimeDirective& directive_at(const Reader& format, Value value, const TimeSymbols& symbols) {
  return symbols.directive(read_single(format) ? value : sizeof(symbols.directives));
}

/// Whether the character just read begins a directive.
template <class Reader, class Value>
bool is_percent(const Reader& format, Value value, const TimeSymbols& symbols) {
  return value == symbols.percent && read_single(format);
}

/// Reads what follows a "%": kNone or kFlag where that is no directive.
template <class Reader, class Value>
const TimeDirective& take_directive(Reader* format, const TimeSymbols& symbols, bool* flag, Value* value) {
  *flag = false;
  for (;;) {
    if (!format->next(value)) return kTimeDirectives[0];
    const TimeDirective& directive = directive_at(*format, *value, symbols);
    if (directive.action != TimeAction::kFlag || *flag) return directive;
    *flag = true;
  }
}

}  // namespace lx
