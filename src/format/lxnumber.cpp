// Numbers and currency amounts as text. One algorithm in four forms: a number is made in units of the form, and
// a writer of the form takes it, together with the texts that stand around an amount.
#include <cstring>

#include "core/lxcall.h"
#include "format/lxnumbertext.h"

using namespace lx;

namespace {

namespace territory = format::territory;

RAS1_Unit unit = RAS1_UNIT("lxnumber");

/// Where a text goes. `state` is the one it begins in, for the Ex forms.
template <Form kForm>
struct Output {
  FormUnit<kForm>* buffer;
  int32_t size;
  uint32_t flags;
  LXShiftState state = LX_SHIFT_SINGLE;

  bool current() const { return (flags & LX_TERRITORY_VALUES) == 0; }
  bool by_chars() const { return sizeof(*buffer) == 1 && (flags & LX_CHARACTERS) != 0; }
  size_t nulls() const { return (flags & LX_TERMINATE) != 0 ? 1 : 0; }
};

/// Writes single-unit characters: how many fit.
template <class Sink>
size_t put_units(Sink& out, const typename Sink::Unit* units, size_t count) {
  size_t n = 0;
  if constexpr (Sink::kShifts) {
    while (n < count && out.put(LXWChar{units[n]})) ++n;
  } else {
    n = least(count, room(out.p, out.end));
    auto* const to = out.p;
    for (size_t i = 0; i < n; ++i) to[i] = units[i];
    out.p = to + n;
  }
  return n;
}

/// False when the number did not fit.
template <class Sink, class Unit>
bool put_number(Sink& out, const NumberText<Unit>& number) {
  if (!Sink::kShifts && number.units() <= room(out.p, out.end)) {
    number.store(out.p);
    out.p += number.units();
  } else {
    Unit units[NumberText<Unit>::kMostUnits];
    number.store(units);
    if (put_units(out, units, number.units()) < number.units()) return false;
  }
  if (number.zeros() == 0) return true;
  constexpr size_t kRun = 16;
  Unit zeros[kRun];
  for (Unit& zero : zeros) zero = number.zero();
  for (size_t left = number.zeros(); left != 0;) {
    const size_t n = least(left, kRun);
    if (put_units(out, zeros, n) < n) return false;
    left -= n;
  }
  return true;
}

struct Written {
  size_t units;
  bool all;
};

/// Writes the text that `write(out)` makes into `room` units; it is false for a text that does not fit.
template <Form kForm, class Write>
Written write_text(const Codepage& cp, FormUnit<kForm>* p, size_t room, LXShiftState state,
                   const Write& write) {
  return with_kind<FormUnit<kForm>, ClosedShiftSink>(cp, kForm, [&](auto kind) {
    auto out = kind.sink(cp, p, end_of(p, room), state);
    const bool all = write(out);
    close_text(out);
    return Written{static_cast<size_t>(out.p - p), all};
  });
}

template <Form kForm>
int32_t finish(Call& call, const Output<kForm>& to, size_t units, size_t count, bool all) {
  if (to.nulls() != 0) to.buffer[units] = 0;
  return call.end(all ? LX_OK : LX_E_SIZE, static_cast<int32_t>(count + to.nulls()));
}

/// Copies a number, whose units are characters, to a buffer of at least one unit.
template <Form kForm>
int32_t write_number(Call& call, const Output<kForm>& to, const NumberText<FormUnit<kForm>>& number) {
  const Codepage& cp = codepage_of(call.codepage());
  const size_t most = static_cast<size_t>(to.size) - to.nulls();
  if ((kForm != Form::kEx || !cp.shift_sensitive) && number.zeros() == 0 && number.units() <= most) {
    number.store(to.buffer);
    return finish(call, to, number.units(), number.units(), true);
  }
  const bool shifts = kForm == Form::kEx && cp.shift_sensitive && to.state == LX_SHIFT_DOUBLE;
  const size_t shift_bytes = shifts && to.by_chars() && most != 0 ? 1 : 0;  // a Shift-In, which does not count
  const Written written = write_text<kForm>(cp, to.buffer, most + shift_bytes, to.state,
                                            [&](auto& out) { return put_number(out, number); });
  return finish(call, to, written.units, written.units - shift_bytes, written.all);
}

/// The frame of a writing function: `make(call)` is run when there is a buffer to write to.
template <Form kForm, class Make>
int32_t with_output(LXLocale* given, const Output<kForm>& to, uint32_t allowed_flags, Make make) {
  Call call(unit, given);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, -1);
  if ((to.flags & ~(allowed_flags | LX_TERRITORY_VALUES | LX_TERMINATE | LX_CHARACTERS)) != 0)
    return call.fail(LX_E_INVALID, -1);
  if (to.size <= 0) return call.fail(LX_E_SIZE, 0);
  return make(call, *call.locale());
}

template <Form kForm>
int32_t long_to_text(LXLocale* given, int32_t value, const Output<kForm>& to) {
  return with_output(given, to, LX_UNSIGNED, [&](Call& call, const LXLocale& locale) {
    const bool negative = value < 0 && (to.flags & LX_UNSIGNED) == 0;
    Decimal decimal;
    decimal.set(negative ? 0u - static_cast<uint32_t>(value) : static_cast<uint32_t>(value));
    NumberText<FormUnit<kForm>> number(fixed_chars<kForm>(locale));
    number.put_integer(&decimal, separator_of<kForm>(locale, to.current(), kThousands),
                       GroupSizes<kForm>(locale, to.current(), kGrouping));
    if (negative) number.put_minus();
    return write_number(call, to, number);
  });
}

/// The conventions of plain numbers, and of amounts.
struct DoubleItems {
  NumberSeparator decimal, thousands;
  NumberGrouping grouping;
  NumberDigits fraction_digits;
};
constexpr DoubleItems kPlainItems{kDecimal, kThousands, kGrouping, kDigits};
constexpr DoubleItems kLocalItems{kMonetaryDecimal, kMonetaryThousands, kMonetaryGrouping, kCurrencyDigits};
constexpr DoubleItems kInternationalItems{kMonetaryDecimal, kMonetaryThousands, kMonetaryGrouping,
                                          kInternationalDigits};

/// The number without its sign.
template <Form kForm>
void put_magnitude(NumberText<FormUnit<kForm>>* number, double value, const LXLocale& locale, bool current,
                   const DoubleItems& items) {
  Decimal decimal;
  to_decimal(value < 0 ? -value : value == 0 ? 0.0 : value, &decimal);
  if (!decimal.is_word && decimal.fraction == nullptr) {
    const Codepage& cp = codepage_of(*locale.codepage);
    number->put_word(decimal, [&](char c) {
      const LXUChar u = static_cast<LXUChar>(c);
      return static_cast<FormUnit<kForm>>(kForm == Form::kUnicode ? u : unicode_to_code(cp, u));
    });
    return;
  }
  const uint16_t fraction_digits =
      current ? locale.numbers[items.fraction_digits]
              : payload_word(*locale.territory, territory::kNumbers + items.fraction_digits);
  number->put_integer(&decimal, separator_of<kForm>(locale, current, items.thousands),
                      GroupSizes<kForm>(locale, current, items.grouping));
  number->put_fraction(&decimal, separator_of<kForm>(locale, current, items.decimal), fraction_digits);
}

template <Form kForm>
int32_t double_to_text(LXLocale* given, double value, const Output<kForm>& to) {
  return with_output(given, to, 0, [&](Call& call, const LXLocale& locale) {
    NumberText<FormUnit<kForm>> number(fixed_chars<kForm>(locale));
    put_magnitude<kForm>(&number, value, locale, to.current(), kPlainItems);
    if (value < 0) number.put_minus();
    return write_number(call, to, number);
  });
}

/// What stands before and behind an amount: "$" the symbol, "-" the sign text, " " the space where there is
/// one.
struct Layout {
  const char* before;
  const char* behind;
};
/// By sign position, and by whether the symbol precedes.
constexpr Layout kLayouts[][2] = {
    {{"(", " $)"}, {"($ ", ")"}}, {{"-", " $"}, {"-$ ", ""}}, {{"", " $-"}, {"$ ", "-"}},
    {{"", " -$"}, {"-$ ", ""}},   {{"", " $-"}, {"$- ", ""}},
};

/// How an amount is laid out.
struct Placement {
  Layout layout;
  int32_t symbol, sign;  // items
  bool space;
};

Placement placement_of(const LXLocale& locale, bool current, bool negative, bool international) {
  const LXObject& land = *locale.territory;
  const unsigned flags = current ? locale.flags : payload_word(land, territory::kFlags) >> 1;
  const uint8_t* positions = current ? locale.sign_positions : payload_of(land) + 2 * territory::kSignPositions;
  const unsigned own = flags >> (negative ? 2 : 0);  // bit 0: the symbol precedes, bit 1: a space
  const size_t position = least(positions[negative ? 1 : 0], 4);
  return {kLayouts[position][own & 1], international ? LX_ITEM_INTERNATIONAL_CURRENCY : LX_ITEM_CURRENCY,
          negative ? LX_ITEM_NEGATIVE_SIGN : LX_ITEM_POSITIVE_SIGN, (own & 2) != 0};
}

template <class Value, class Sink, class Cursor>
bool put_all(Sink& out, Cursor in) {
  Value value{};
  while (in.next(&value))
    if (!out.put(value)) return false;
  return true;
}

/// Copies the bytes of a text in the codepage of both, where all of its characters fit; false where they do not, and of
/// other text.
template <class Cursor, class Sink>
[[gnu::always_inline]] inline bool copy_fitting(const Cursor& in, Sink* out) {
  if constexpr (sizeof(typename Sink::Unit) == 1 && !Sink::kShifts) {
    Cursor whole = in;
    pass_all(&whole);
    const size_t bytes = room(in.p, whole.p);
    if (bytes > room(out->p, out->end)) return false;
    for (size_t i = 0; i < bytes; ++i) out->p[i] = in.p[i];
    out->p += bytes;
    return true;
  }
  return false;
}

/// Writes the text of an item.
template <Form kForm, class Sink>
bool put_item(Sink& out, const LXLocale& locale, int32_t item, bool current) {
  TextKind kind{};
  if constexpr (kForm == Form::kUnicode) {
    const void* text = LXLocaleGetTextItemU(&locale, item, current, &kind);
    return put_all<LXUChar>(out, PayloadCursor{static_cast<const uint8_t*>(text), nullptr});
  } else {
    const auto* text = static_cast<const uint8_t*>(LXLocaleGetTextItem(&locale, item, current, &kind));
    if (kind == TextKind::kUnicode) return put_all<LXUChar>(out, PayloadCursor{text, nullptr});
    return with_cursor(codepage_of(*locale.codepage), kTextForm<kForm>, LX_SHIFT_SINGLE, text,
                       strlen(reinterpret_cast<const char*>(text)),
                       [&](auto in) { return copy_fitting(in, &out) || put_all<LXWChar>(out, in); });
  }
}

template <Form kForm, class Sink>
bool put_pieces(Sink& out, const char* pieces, const LXLocale& locale, bool current,
                const Placement& placement) {
  using Char = std::conditional_t<kForm == Form::kUnicode, LXUChar, LXWChar>;
  const FixedChars& chars = fixed_chars<kForm>(locale);
  for (; *pieces != '\0'; ++pieces) {
    bool put = true;
    if (*pieces == '$')
      put = put_item<kForm>(out, locale, placement.symbol, current);
    else if (*pieces == '-')
      put = put_item<kForm>(out, locale, placement.sign, current);
    else if (*pieces == '(')
      put = out.put(Char{chars.open});
    else if (*pieces == ')')
      put = out.put(Char{chars.close});
    else if (placement.space)
      put = out.put(Char{chars.space});
    if (!put) return false;
  }
  return true;
}

template <Form kForm>
int32_t currency_to_text(LXLocale* given, double value, const Output<kForm>& to) {
  return with_output(given, to, LX_INTERNATIONAL, [&](Call& call, const LXLocale& locale) {
    const Codepage& cp = codepage_of(*locale.codepage);
    const bool current = to.current();
    const bool international = (to.flags & LX_INTERNATIONAL) != 0;
    const Placement placement = placement_of(locale, current, !(value >= 0), international);
    NumberText<FormUnit<kForm>> number(fixed_chars<kForm>(locale));
    put_magnitude<kForm>(&number, value, locale, current, international ? kInternationalItems : kLocalItems);
    const auto write = [&](FormUnit<kForm>* p, size_t room) {
      return write_text<kForm>(cp, p, room, to.state, [&](auto& out) {
        return put_pieces<kForm>(out, placement.layout.before, locale, current, placement) &&
               put_number(out, number) &&
               put_pieces<kForm>(out, placement.layout.behind, locale, current, placement);
      });
    };
    const size_t size = static_cast<size_t>(to.size);
    if constexpr (sizeof(FormUnit<kForm>) == 1) {
      if (to.by_chars()) {
        constexpr size_t kWorkBytes = 512;
        constexpr size_t kWorkBytesPerChar = 6;
        uint8_t work[kWorkBytes] = {};
        const size_t work_bytes = size < kWorkBytes / kWorkBytesPerChar ? size * kWorkBytesPerChar : kWorkBytes;
        const Written written = write(work, work_bytes - to.nulls());
        const Part copied = copy_chars(cp, kForm, to.state, work, written.units, size - to.nulls(), to.buffer);
        return finish(call, to, copied.units, copied.chars, written.all);
      }
    }
    const Written written = write(to.buffer, size - to.nulls());
    return finish(call, to, written.units, written.units, written.all);
  });
}

template <Form kForm, class Text>
int32_t first_group_size(LXLocale* given, const Text* text, int32_t* remaining, const Text** next) {
  Call call(unit, given);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, -1);
  if (text == nullptr) return call.exit(-1);
  using Unit = FormUnit<kForm>;
  const FixedChars& chars = fixed_chars<kForm>(*call.locale());
  const auto unit_at = [&](int32_t i) { return static_cast<Unit>(text[i]); };
  int32_t units = 0;
  const int32_t size = group_size(unit_at, *remaining, chars, &units);
  if (size < 0) return call.exit(-1);
  const bool more = units < *remaining && text[units] != 0;
  *remaining = more ? *remaining - units : 0;
  *next = more ? text + units + 1 : nullptr;
  return call.exit(size);
}

using PlainOutput = Output<Form::kPlain>;
using ExOutput = Output<Form::kEx>;
using CodeOutput = Output<Form::kWide>;
using UnicodeOutput = Output<Form::kUnicode>;

}  // namespace

extern "C" {

int32_t LXLongToString(LXLocale* locale, int32_t value, char* buffer, int32_t size, uint32_t flags) {
  return long_to_text(locale, value, PlainOutput{bytes_of(buffer), size, flags});
}

int32_t LXLongToStringEx(LXLocale* locale, int32_t value, char* buffer, LXShiftState state, int32_t size,
                         uint32_t flags) {
  return long_to_text(locale, value, ExOutput{bytes_of(buffer), size, flags, state});
}

int32_t LXLongToStringW(LXLocale* locale, int32_t value, LXWChar* buffer, int32_t size, uint32_t flags) {
  return long_to_text(locale, value, CodeOutput{buffer, size, flags});
}

int32_t LXLongToStringU(LXLocale* locale, int32_t value, LXUChar* buffer, int32_t size, uint32_t flags) {
  return long_to_text(locale, value, UnicodeOutput{buffer, size, flags});
}

int32_t LXDoubleToString(LXLocale* locale, double value, char* buffer, int32_t size, uint32_t flags) {
  return double_to_text(locale, value, PlainOutput{bytes_of(buffer), size, flags});
}

int32_t LXDoubleToStringEx(LXLocale* locale, double value, char* buffer, LXShiftState state, int32_t size,
                           uint32_t flags) {
  return double_to_text(locale, value, ExOutput{bytes_of(buffer), size, flags, state});
}

int32_t LXDoubleToStringW(LXLocale* locale, double value, LXWChar* buffer, int32_t size, uint32_t flags) {
  return double_to_text(locale, value, CodeOutput{buffer, size, flags});
}

int32_t LXDoubleToStringU(LXLocale* locale, double value, LXUChar* buffer, int32_t size, uint32_t flags) {
  return double_to_text(locale, value, UnicodeOutput{buffer, size, flags});
}

int32_t LXCurrencyToString(LXLocale* locale, double value, char* buffer, int32_t size, uint32_t flags) {
  return currency_to_text(locale, value, PlainOutput{bytes_of(buffer), size, flags});
}

int32_t LXCurrencyToStringEx(LXLocale* locale, double value, char* buffer, LXShiftState state, int32_t size,
                             uint32_t flags) {
  return currency_to_text(locale, value, ExOutput{bytes_of(buffer), size, flags, state});
}

int32_t LXCurrencyToStringW(LXLocale* locale, double value, LXWChar* buffer, int32_t size, uint32_t flags) {
  return currency_to_text(locale, value, CodeOutput{buffer, size, flags});
}

int32_t LXCurrencyToStringU(LXLocale* locale, double value, LXUChar* buffer, int32_t size, uint32_t flags) {
  return currency_to_text(locale, value, UnicodeOutput{buffer, size, flags});
}

int32_t LXStrGroupingSize(LXLocale* locale, const char* text, int32_t* remaining, const char** next) {
  return first_group_size<Form::kPlain>(locale, text, remaining, next);
}

int32_t LXStrGroupingSizeW(LXLocale* locale, const LXWChar* text, int32_t* remaining, const LXWChar** next) {
  return first_group_size<Form::kWide>(locale, text, remaining, next);
}

int32_t LXStrGroupingSizeU(LXLocale* locale, const LXUChar* text, int32_t* remaining, const LXUChar** next) {
  return first_group_size<Form::kUnicode>(locale, text, remaining, next);
}

}  // extern "C"
