// Times as text. One walk over the format for all kinds of text; nested formats are walked the same way, into
// the same buffer.
#include "core/lxcall.h"
#include "format/lxtimetext.h"

using namespace lx;

namespace {

RAS1_Unit unit = RAS1_UNIT("lxtime");

constexpr uint32_t kFlags = LX_TERRITORY_VALUES | LX_TERMINATE | LX_CHARACTERS;
constexpr size_t kWorkBytes = 512;  // worked on in character mode, at most
constexpr size_t kWorkBytesPerChar = 6;
constexpr size_t kMostDigits = 4;

/// The week of the year that the day is in, of weeks that begin on `first_weekday`.
uint32_t week_of(const LXTime& time, int first_weekday) {
  const int32_t weekday = (time.weekday + 7 - first_weekday) % 7;
  return static_cast<uint32_t>(time.day_of_year / 7 + (time.day_of_year % 7 >= weekday ? 1 : 0));
}

/// A field with what is added to it; of a year before 0 the magnitude.
uint32_t number_of(int32_t value, int32_t added) {
  const int64_t sum = int64_t{value} + added;
  return static_cast<uint32_t>(sum < 0 ? -sum : sum);
}

struct DigitPairs {
  uint8_t digits[100][2];
  constexpr DigitPairs() : digits() {
    for (unsigned i = 0; i < 100; ++i) {
      digits[i][0] = static_cast<uint8_t>(i / 10);
      digits[i][1] = static_cast<uint8_t>(i % 10);
    }
  }
};
constexpr DigitPairs kPairs;

template <class Text>
class TimeFormatter {
  using Unit = typename Text::Unit;
  using Value = typename Text::Value;
  using Cursor = typename Text::Cursor;
  using Sink = typename Text::Sink;

 public:
  TimeFormatter(const LXLocale& locale, const LXTime& time, bool current)
      : locale_(locale), time_(time), symbols_(time_symbols<Text>(locale)), current_(current) {}

  /// Writes as much as there is before a failure: the code.
  int32_t expand(const Cursor& format, Sink* out, int depth = 0) const {
    const int32_t code = walk(format, out, depth);
    close_text(*out);
    return code;
  }

 private:
  int32_t walk(const Cursor& text, Sink* out, int depth) const {
    const Sink start = *out;
    Cursor format(text);  // copies, as is what other functions move: these stay in registers
    Sink to = *out;
    Value value{};
    const TimeSymbols& symbols = symbols_;
    int32_t code = LX_OK;
    while (code == LX_OK && format.p != format.end) {
      const Unit* const before = format.p;
      if (!format.next(&value)) {
        if (format.p != format.end) code = LX_E_FORMAT;
        break;
      }
      if (!is_percent(format, value, symbols)) {
        if (!copy_char<Text>(format, before, value, &to)) code = LX_E_SIZE;
      } else if (units_left(to) == 0) {
        code = LX_E_SIZE;
      } else {
        bool flag = false;
        const TimeDirective& directive = take_directive(&format, symbols, &flag, &value);
        if (directive.field.member != nullptr) {
          code = write_field(directive, flag, &to);
        } else if (directive.action == TimeAction::kPercent) {
          to.put(value);
        } else {
          Sink moved = to;
          code = write_nested(directive, flag, start, &moved, depth);
          go_on_at(to, moved);
        }
      }
    }
    go_on_at(*out, to);
    return code;
  }

  int32_t write_field(const TimeDirective& directive, bool flag, Sink* out) const {
    if (!directive.field.in_range(time_)) return LX_E_NOT_FOUND;
    const int32_t value = time_.*directive.field.member;
    if (directive.items != 0)
      return write_item(directive.first_item + (directive.action == TimeAction::kMarker ? value / 12 : value),
                        out);
    uint32_t number = number_of(value, directive.write_added);
    if (directive.action == TimeAction::kHour12) {
      number = value % 12 == 0 ? 12 : static_cast<uint32_t>(value % 12);
    } else if (directive.action == TimeAction::kWeek) {
      if (!time_field::kDayOfYear.in_range(time_)) return LX_E_NOT_FOUND;
      number = week_of(time_, directive.write_added);
    }
    return write_number(number, directive.digits, flag, out);
  }

  /// Callers rely on where nested formats go: the date of %c, and %x and %X, to the start of the buffer, and
  /// only the time of %c behind what is there.
  int32_t write_nested(const TimeDirective& directive, bool flag, const Sink& start, Sink* out,
                       int depth) const {
    const int32_t date = flag ? LX_ITEM_LONG_DATE_FORMAT : LX_ITEM_SHORT_DATE_FORMAT;
    switch (directive.action) {
      case TimeAction::kDate:
        return expand_item(date, start, out, depth);
      case TimeAction::kTime:
        return expand_item(LX_ITEM_TIME_FORMAT, start, out, depth);
      case TimeAction::kDateTime: {
        const int32_t code = expand_item(date, start, out, depth);
        if (code != LX_OK) return code;
        if (!out->put(Value{symbols_.space})) return LX_E_SIZE;
        return expand_item(LX_ITEM_TIME_FORMAT, *out, out, depth);
      }
      default:
        return LX_E_FORMAT;
    }
  }

  /// Expands a format of the locale at `place`, in as many units as `out` has left, and moves `out` on.
  int32_t expand_item(int32_t item, const Sink& place, Sink* out, int depth) const {
    if (units_left(*out) == 0) return LX_E_SIZE;
    if (depth == kMostNestedFormats) return LX_E_FORMAT;
    const TimeItem<Text> format(locale_, item, current_);
    Sink nested = place;
    nested.end = nested.p + room(out->p, out->end);
    const Unit* const begin = nested.p;
    const int32_t code = expand(format.cursor(locale_), &nested, depth + 1);
    nested.p = out->p + (nested.p - begin);
    go_on_at(*out, nested);
    return code;
  }

  int32_t write_item(int32_t item, Sink* out) const {
    Sink word = *out;
    int32_t code = LX_OK;
    if (!Cursor::kShifts && units_left(word) >= kItemUnits) {
      word.end = word.p + kItemUnits;
      write_time_name(locale_, item, &word);
    } else {
      code = write_item_cut(item, &word);
    }
    go_on_at(*out, word);
    return code;
  }
  int32_t write_item_cut(int32_t item, Sink* out) const {
    const TimeItem<Text> text(locale_, item, current_);
    Cursor in = text.cursor(locale_);
    const Unit* before = in.p;
    for (Value value{}; in.next(&value); before = in.p)
      if (!copy_char<Text>(in, before, value, out)) return LX_E_SIZE;
    return LX_OK;
  }

  /// The two digits of a number below 100, where there is room.
  static void put_pair(uint32_t number, uint8_t zero, Sink* out) {
    out->p[0] = static_cast<Unit>(zero + kPairs.digits[number][0]);
    out->p[1] = static_cast<Unit>(zero + kPairs.digits[number][1]);
    out->p += 2;
  }

  /// The last `most_digits` digits; `bare`: without leading zeros. A number that fills the output is 40, also
  /// when all of it is there.
  int32_t write_number(uint32_t number, uint32_t most_digits, bool bare, Sink* out) const {
    uint32_t count = most_digits;
    // In place where there is room; copying single units that have just been stored would stall.
    const bool fits = !Cursor::kShifts && units_left(*out) > kMostDigits;
    if (fits && !bare && number < 10000 && most_digits % 2 == 0) {  // as most are
      const uint32_t hundreds = number < 100 ? 0 : number / 100;
      const uint8_t zero = symbols_.zero;
      if (most_digits == 4) put_pair(hundreds, zero, out);
      put_pair(number - 100 * hundreds, zero, out);
      return LX_OK;
    }
    if (bare) {
      count = 1;
      for (uint32_t rest = number / 10; rest != 0 && count < most_digits; rest /= 10) ++count;
    }
    Unit cut[kMostDigits];
    Unit* const digits = fits ? out->p : cut;
    for (uint32_t i = count; i-- > 0; number /= 10) digits[i] = static_cast<Unit>(symbols_.zero + number % 10);
    if (fits) {
      out->p += count;
      return LX_OK;
    }
    for (uint32_t i = 0; i < count; ++i)
      if (!out->put(Value{cut[i]})) return LX_E_SIZE;
    return units_left(*out) == 0 ? LX_E_SIZE : LX_OK;
  }

  const LXLocale& locale_;
  const LXTime& time_;
  const TimeSymbols& symbols_;
  const bool current_;
};

/// The code of what needs no locale: the flags and the size.
int32_t refusal(uint32_t flags, int32_t size) {
  return (flags & ~kFlags) != 0 ? LX_E_INVALID : size < 1 ? LX_E_SIZE : LX_OK;
}

/// Writes to `units` units and a null where one is asked for: the units written without the null.
template <class Kind, class Unit = typename Kind::Unit>
size_t write_time(const LXLocale& locale, const LXTime& time, Unit* buffer, size_t units,
                  const typename Kind::Cursor& format, LXShiftState state, uint32_t flags, int32_t* code) {
  const bool null = (flags & LX_TERMINATE) != 0;
  auto out = Kind::sink(codepage_of(*locale.codepage), buffer, end_of(buffer, units - null), state);
  if (format.p != format.end)
    *code = TimeFormatter<Kind>(locale, time, (flags & LX_TERRITORY_VALUES) == 0).expand(format, &out);
  if (null) *out.p = 0;
  return static_cast<size_t>(out.p - buffer);
}

template <class Unit>
int32_t format_time(LXLocale* given, const LXTime* time, Unit* buffer, LXShiftState state, int32_t size,
                    const Text<Unit>& format, uint32_t flags, Form form) {
  Call call(unit, given);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, -1);
  int32_t code = refusal(flags, size);
  if (code != LX_OK) return call.fail(code, code == LX_E_INVALID ? -1 : 0);
  const LXLocale& locale = *call.locale();
  const Codepage& cp = codepage_of(*locale.codepage);
  const bool characters = sizeof(Unit) == 1 && (flags & LX_CHARACTERS) != 0;
  const size_t null = (flags & LX_TERMINATE) != 0 ? 1 : 0;
  const size_t most = static_cast<size_t>(size);
  const size_t written = with_kind<Unit, ClosedShiftSink>(cp, form, [&](auto kind) {
    using Kind = decltype(kind);
    const auto in = given_text<Kind>(cp, format, characters);
    if constexpr (sizeof(Unit) == 1) {
      if (characters) {
        uint8_t work[kWorkBytes] = {};  // cleared, since nested formats may leave places unwritten
        const size_t room = least(least(most, kWorkBytes) * kWorkBytesPerChar, kWorkBytes);
        const size_t filled = write_time<Kind>(locale, *time, work, room, in, state, flags, &code);
        const Part copied = copy_chars(cp, form, state, work, filled, most - null, buffer);
        if (null != 0) buffer[copied.units] = 0;
        return copied.chars;
      }
    }
    return write_time<Kind>(locale, *time, buffer, most, in, state, flags, &code);
  });
  return call.end(code, static_cast<int32_t>(written + null));
}

}  // namespace

extern "C" {

int32_t LXTimeToString(LXLocale* locale, const LXTime* time, char* buffer, int32_t size, const char* format,
                       int32_t format_length, uint32_t flags) {
  return format_time(locale, time, bytes_of(buffer), LX_SHIFT_SINGLE, size, text_of(format, format_length),
                     flags, Form::kPlain);
}

int32_t LXTimeToStringW(LXLocale* locale, const LXTime* time, LXWChar* buffer, int32_t size,
                        const LXWChar* format, int32_t format_length, uint32_t flags) {
  return format_time(locale, time, buffer, LX_SHIFT_SINGLE, size, text_of(format, format_length), flags,
                     Form::kWide);
}

int32_t LXTimeToStringU(LXLocale* locale, const LXTime* time, LXUChar* buffer, int32_t size,
                        const LXUChar* format, int32_t format_length, uint32_t flags) {
  return format_time(locale, time, buffer, LX_SHIFT_SINGLE, size, text_of(format, format_length), flags,
                     Form::kUnicode);
}

int32_t LXTimeToStringEx(LXLocale* locale, const LXTime* time, char* buffer, LXShiftState state, int32_t size,
                         const char* format, LXShiftState format_state, int32_t format_length, uint32_t flags) {
  return format_time(locale, time, bytes_of(buffer), state, size, text_of(format, format_length, format_state),
                     flags, Form::kEx);
}

}  // extern "C"
