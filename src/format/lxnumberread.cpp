// Integers and doubles read from text: two parsers, which are loops over the classes of its characters.
#include <cmath>

#include "core/lxcall.h"
#include "format/lxnumberclass.h"

using namespace lx;

namespace {

RAS1_Unit unit = RAS1_UNIT("lxnumberread");

/// A text to read, and the flags of its reading.
template <Form kForm>
struct Input {
  Text<FormUnit<kForm>> text;
  uint32_t flags;
};

template <Form kForm, class Body>
auto read(const Codepage& cp, const Input<kForm>& from, Body&& body) {
  const size_t units = units_of(cp, from.text, (from.flags & LX_CHARACTERS) != 0);
  return with_cursor(cp, kForm, from.text, units, body);
}

/// Where reading ended. A shift byte that ends the text does not remain of it.
template <class Cursor>
auto place_behind(Cursor in) {
  if constexpr (Cursor::kShifts) in.pass_last_shift();
  return in.p;
}

/// What a parser has read of the value.
class Magnitude {
 public:
  Magnitude(uint32_t base, bool is_unsigned)
      : base_(base), most_(is_unsigned ? UINT32_MAX : uint32_t{INT32_MAX}), unsigned_(is_unsigned) {}

  void add(uint32_t digit) {
    const uint64_t value = uint64_t{value_} * base_ + digit;
    overflow_ = overflow_ || value > most_;
    value_ = static_cast<uint32_t>(value);
  }
  int32_t result(bool negative) const {
    if (overflow_) return unsigned_ ? -1 : negative ? INT32_MIN : INT32_MAX;
    return static_cast<int32_t>(negative ? 0u - value_ : value_);
  }

 private:
  uint32_t base_;
  uint32_t most_;
  bool unsigned_;
  bool overflow_ = false;
  uint32_t value_ = 0;
};

/// Reads an integer; the cursor is left at what ended it.
template <class Cursor, class Classes>
int32_t read_long(Cursor& in, const Classes& classes, uint32_t base, bool is_unsigned) {
  Cursor item(in);  // where the last class began
  const auto take = [&] {
    go_on_at(item, in);
    return classes.take(&in);
  };
  const auto is_digit = [&](int32_t c) { return c >= 0 && static_cast<uint32_t>(c) < base; };

  int32_t c = take();
  if (c == LX_CLASS_SPACE) c = take();
  const bool negative = c == LX_CLASS_NEGATIVE;
  const bool refused = negative && is_unsigned;
  if ((negative || c == LX_CLASS_POSITIVE) && !refused) c = take();
  // In base 16 the character behind a leading 0 is the first digit, if it is not the x.
  bool prefix = false;
  if (c == 0 && (base == 0 || base == 16)) {
    c = take();
    if (base == 0) base = c == kClassX ? 16 : 8;
    prefix = c == kClassX;
  } else if (base == 0) {
    base = 10;
  }
  if (refused || (!prefix && !is_digit(c))) {
    go_on_at(in, item);
    return 0;
  }
  Magnitude magnitude(base, is_unsigned);
  if (!prefix) magnitude.add(static_cast<uint32_t>(c));
  for (;;) {
    classes.take_digits(&in, [&](uint32_t digit) {
      if (digit >= base) return false;
      magnitude.add(digit);
      return true;
    });
    c = take();
    if (is_digit(c))
      magnitude.add(static_cast<uint32_t>(c));
    else if (c != LX_CLASS_THOUSANDS)
      break;
  }
  go_on_at(in, item);
  return magnitude.result(negative);
}

constexpr double kPowers[] = {1e0,  1e1,  1e2,  1e3,  1e4,  1e5,  1e6,  1e7,  1e8,  1e9,  1e10, 1e11,
                              1e12, 1e13, 1e14, 1e15, 1e16, 1e17, 1e18, 1e19, 1e20, 1e21, 1e22};
constexpr double kInversePowers[] = {1e-0,  1e-1,  1e-2,  1e-3,  1e-4,  1e-5,  1e-6,  1e-7,
                                     1e-8,  1e-9,  1e-10, 1e-11, 1e-12, 1e-13, 1e-14, 1e-15,
                                     1e-16, 1e-17, 1e-18, 1e-19, 1e-20, 1e-21, 1e-22};

/// 10 to the power of `exponent`. Up to the 22nd they are as pow gives them everywhere. Beyond that the long
/// form of pow does, because pow itself differs in its last bit from one word size to the other.
inline double power_of_ten(int32_t exponent) {
  if (exponent >= 0 && exponent <= 22) return kPowers[exponent];
  if (exponent < 0 && exponent >= -22) return kInversePowers[-exponent];
  return static_cast<double>(powl(10.0L, static_cast<long double>(exponent)));
}

/// The states of the double parser, as callers of LXStrDoubleNextState keep them.
enum State : int32_t {
  kNoNumber = -1,
  kStart = 0,
  kSigned = 1,
  kDecimalFirst = 2,  // a decimal separator before any digit
  kIntegerDigits = 3,
  kBehindThousands = 4,
  kFractionDigits = 5,
  kExponentMarker = 6,
  kExponentSigned = 7,
  kExponentDigits = 8,
};

/// What the states of the double parser work on.
struct DoubleParts {
  double value = 0;
  int32_t mantissa_sign = 1;
  int32_t fraction_exponent = 0;
  int32_t exponent_sign = 1;
  int32_t exponent = 0;

  double result() const { return mantissa_sign * value * power_of_ten(exponent_sign * exponent); }
};

[[gnu::always_inline]] inline int32_t after_digit(int32_t state, int32_t digit, DoubleParts* parts) {
  switch (state) {
    case kStart:
      parts->value = digit;
      return kIntegerDigits;
    case kSigned:
    case kIntegerDigits:
    case kBehindThousands:
      parts->value = parts->value * 10 + digit;
      return kIntegerDigits;
    case kDecimalFirst:
      parts->fraction_exponent = -1;
      parts->value = digit / 10.0;
      return kFractionDigits;
    case kFractionDigits:
      if (parts->fraction_exponent > -INT32_MAX) --parts->fraction_exponent;
      parts->value += digit * power_of_ten(parts->fraction_exponent);
      return kFractionDigits;
    case kExponentMarker:
    case kExponentSigned:
      parts->exponent = digit;
      return kExponentDigits;
    case kExponentDigits: {
      constexpr int32_t kRoomForDigit = (INT32_MAX - 9) / 10;
      parts->exponent = parts->exponent > kRoomForDigit ? INT32_MAX : parts->exponent * 10 + digit;
      return kExponentDigits;
    }
    default:
      return kNoNumber;
  }
}

int32_t after_sign(int32_t state, int32_t sign, DoubleParts* parts) {
  if (state != kStart && state != kExponentMarker) return kNoNumber;
  if (sign < 0) (state == kStart ? parts->mantissa_sign : parts->exponent_sign) = sign;
  return state == kStart ? kSigned : kExponentSigned;
}

/// Inline, as is after_digit(): it is called for each character that is not among digits.
[[gnu::always_inline]] inline int32_t next_state(int32_t state, int32_t c, DoubleParts* parts) {
  if (c >= 0 && c <= 9) return after_digit(state, c, parts);
  switch (c) {
    case LX_CLASS_POSITIVE:
      return after_sign(state, 1, parts);
    case LX_CLASS_NEGATIVE:
      return after_sign(state, -1, parts);
    case LX_CLASS_SPACE:
      return state == kStart ? kStart : kNoNumber;
    case LX_CLASS_THOUSANDS:
      return state == kIntegerDigits ? kBehindThousands : kNoNumber;
    case LX_CLASS_DECIMAL:
      if (state == kIntegerDigits) parts->fraction_exponent = 0;
      if (state == kStart || state == kSigned) return kDecimalFirst;
      return state == kIntegerDigits ? kFractionDigits : kNoNumber;
    case kClassD:
    case kClassE:
      return state == kFractionDigits ? kExponentMarker : kNoNumber;
    default:
      return kNoNumber;
  }
}

/// Reads a double; the cursor is left at what ended it. The signs of an exponent are plain ones.
template <class Cursor, class Classes>
double read_double(Cursor& in, Classes& classes, const FixedChars& chars) {
  DoubleParts parts;
  Cursor item(in);
  int32_t state = kStart;
  for (;;) {
    if (state == kIntegerDigits || state == kFractionDigits) {  // which digits do not leave
      DoubleParts moved = parts;                                // a copy, in registers
      classes.take_digits(&in, [&](uint32_t digit) {
        return after_digit(state, static_cast<int32_t>(digit), &moved) == state;
      });
      parts = moved;
    }
    go_on_at(item, in);
    state = next_state(state, classes.take(&in), &parts);
    if (state < 0) break;
    if (state == kExponentMarker) {
      classes.positive = single_sign(chars.plus);
      classes.negative = single_sign(chars.minus);
    }
  }
  go_on_at(in, item);
  return parts.result();
}

/// Reads a text that is nothing but decimal digits, so few that none is too many, with perhaps a minus before them:
/// the units, or 0 when it is anything else.
template <Form kForm>
size_t read_plain_long(const LXLocale& locale, const Text<FormUnit<kForm>>& text, int32_t* value) {
  constexpr size_t kMost = 9;
  const Codepage& cp = codepage_of(*locale.codepage);
  const FixedChars& chars = fixed_chars<kForm>(locale);
  const auto digit_of = [&](uint32_t c) { return c - chars.zero; };
  if (kForm != Form::kUnicode && (!cp.plain_digits || (cp.type(chars.minus) & LX_C1_SPACE) != 0)) return 0;
  if (kForm == Form::kEx && text.state != LX_SHIFT_SINGLE) return 0;
  if (digit_of(separator_of<kForm>(locale, true, kThousands)) <= 9) return 0;
  // Digits are read and their end is looked for in one loop: how many there are is what nothing foresees.
  const size_t most = text.length < 0 ? kMost + 1 : static_cast<size_t>(text.length);
  if (most - 1 > kMost) return 0;
  const size_t sign = text.p[0] == chars.minus;
  uint32_t sum = 0;
  size_t units = sign;
  for (; units < most; ++units) {
    const uint32_t digit = digit_of(text.p[units]);
    if (digit > 9) break;
    sum = sum * 10 + digit;
  }
  const bool ended = text.length < 0 ? text.p[units] == 0 : units == most;
  if (!ended || units - sign - 1 >= kMost) return 0;
  *value = static_cast<int32_t>(sign != 0 ? 0u - sum : sum);
  return units;
}

/// The place of a reader as the caller's pointer.
template <class Unit, class Text>
void put_place(const Text** to, const Unit* place) {
  if (to != nullptr) *to = reinterpret_cast<const Text*>(place);
}

template <Form kForm, class Text>
int32_t text_to_long(LXLocale* given, const Input<kForm>& from, const Text** end, int32_t base) {
  Call call(unit, given);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, 0);
  put_place(end, from.text.p);
  if (base < 0 || base == 1 || base > 36) return call.fail(LX_E_BASE, 0);
  constexpr uint32_t kAllowed =
      LX_TERRITORY_VALUES | LX_NATIONAL_DIGITS | LX_MONETARY | LX_UNSIGNED | LX_CHARACTERS;
  if ((from.flags & ~kAllowed) != 0) return call.fail(LX_E_INVALID, 0);
  if (from.flags == 0 && base == 10) {
    int32_t value = 0;
    if (const size_t units = read_plain_long<kForm>(*call.locale(), from.text, &value)) {
      put_place(end, from.text.p + units);
      return call.exit(value);
    }
  }
  const auto classes = classifier_of<kForm>(*call.locale(), from.flags, false);
  return call.exit(read(codepage_of(call.codepage()), from, [&](auto in) {
    const bool is_unsigned = (from.flags & LX_UNSIGNED) != 0;
    const int32_t value = read_long(in, classes, static_cast<uint32_t>(base), is_unsigned);
    put_place(end, place_behind(in));
    return value;
  }));
}

template <Form kForm, class Text>
double text_to_double(LXLocale* given, const Input<kForm>& from, const Text** end) {
  Call call(unit, given);
  double value = 0;
  const auto exit = [&](int32_t code) {
    call.end(code, 0);
    return value;
  };
  if (!call) return exit(LX_E_NOT_INITIALIZED);
  put_place(end, from.text.p);
  constexpr uint32_t kAllowed = LX_TERRITORY_VALUES | LX_NATIONAL_DIGITS | LX_MONETARY | LX_CHARACTERS;
  if ((from.flags & ~kAllowed) != 0) return exit(LX_E_INVALID);
  auto classes = classifier_of<kForm>(*call.locale(), from.flags, true);
  read(codepage_of(call.codepage()), from, [&](auto in) {
    value = read_double(in, classes, fixed_chars<kForm>(*call.locale()));
    put_place(end, place_behind(in));
  });
  return exit(LX_OK);
}

template <Form kForm, class Text>
int32_t get_digit(LXLocale* given, const Input<kForm>& from, const Text** new_position, const Text* thousands,
                  const Text* decimal, const Text* positive, const Text* negative, bool ascii) {
  Call call(unit, given);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, kNoClass);
  put_place(new_position, from.text.p);
  if (from.flags != 0 && from.flags != LX_NATIONAL_DIGITS) return call.fail(LX_E_INVALID, kNoClass);
  const Codepage& cp = codepage_of(call.codepage());
  const Classifier<kForm> classes{cp,
                                  digit_values<kForm>(ascii),
                                  from.flags != 0,
                                  first_unit(thousands),
                                  first_unit(decimal),
                                  given_sign<kForm>(cp, positive),
                                  given_sign<kForm>(cp, negative)};
  return call.exit(read(cp, from, [&](auto in) {
    const int32_t found = classes.take(&in);
    put_place(new_position, in.p);
    return found;
  }));
}

using PlainInput = Input<Form::kPlain>;
using ExInput = Input<Form::kEx>;
using WideInput = Input<Form::kWide>;
using UnicodeInput = Input<Form::kUnicode>;

}  // namespace

extern "C" {

int32_t LXStringToLong(LXLocale* locale, const char* text, int32_t length, const char** end, int32_t base,
                       uint32_t flags) {
  return text_to_long(locale, PlainInput{{bytes_of(text), length}, flags}, end, base);
}

int32_t LXStringToLongEx(LXLocale* locale, const char* text, LXShiftState state, int32_t length,
                         const char** end, int32_t base, uint32_t flags) {
  return text_to_long(locale, ExInput{{bytes_of(text), length, state}, flags}, end, base);
}

int32_t LXStringToLongW(LXLocale* locale, const LXWChar* text, int32_t length, const LXWChar** end,
                        int32_t base, uint32_t flags) {
  return text_to_long(locale, WideInput{{text, length}, flags}, end, base);
}

int32_t LXStringToLongU(LXLocale* locale, const LXUChar* text, int32_t length, const LXUChar** end,
                        int32_t base, uint32_t flags) {
  return text_to_long(locale, UnicodeInput{{text, length}, flags}, end, base);
}

double LXStringToDouble(LXLocale* locale, const char* text, int32_t length, const char** end, uint32_t flags) {
  return text_to_double(locale, PlainInput{{bytes_of(text), length}, flags}, end);
}

double LXStringToDoubleEx(LXLocale* locale, const char* text, LXShiftState state, int32_t length,
                          const char** end, uint32_t flags) {
  return text_to_double(locale, ExInput{{bytes_of(text), length, state}, flags}, end);
}

double LXStringToDoubleW(LXLocale* locale, const LXWChar* text, int32_t length, const LXWChar** end,
                         uint32_t flags) {
  return text_to_double(locale, WideInput{{text, length}, flags}, end);
}

double LXStringToDoubleU(LXLocale* locale, const LXUChar* text, int32_t length, const LXUChar** end,
                         uint32_t flags) {
  return text_to_double(locale, UnicodeInput{{text, length}, flags}, end);
}

int32_t LXStrGetDigit(LXLocale* locale, const char* text, int32_t remaining, const char** new_position,
                      const char* thousands, const char* decimal, const char* positive, const char* negative,
                      int32_t ascii_compatible, uint32_t mode) {
  return get_digit(locale, PlainInput{{bytes_of(text), remaining}, mode}, new_position, thousands, decimal,
                   positive, negative, ascii_compatible != 0);
}

int32_t LXStrGetDigitEx(LXLocale* locale, const char* text, LXShiftState state, int32_t remaining,
                        const char** new_position, const char* thousands, const char* decimal,
                        const char* positive, const char* negative, int32_t ascii_compatible, uint32_t mode) {
  return get_digit(locale, ExInput{{bytes_of(text), remaining, state}, mode}, new_position, thousands, decimal,
                   positive, negative, ascii_compatible != 0);
}

int32_t LXStrGetDigitW(LXLocale* locale, const LXWChar* text, int32_t remaining, const LXWChar** new_position,
                       const LXWChar* thousands, const LXWChar* decimal, const LXWChar* positive,
                       const LXWChar* negative, int32_t ascii_compatible, uint32_t mode) {
  return get_digit(locale, WideInput{{text, remaining}, mode}, new_position, thousands, decimal, positive,
                   negative, ascii_compatible != 0);
}

int32_t LXStrGetDigitU(LXLocale* locale, const LXUChar* text, int32_t remaining, const LXUChar** new_position,
                       const LXUChar* thousands, const LXUChar* decimal, const LXUChar* positive,
                       const LXUChar* negative, int32_t ascii_compatible, uint32_t mode) {
  return get_digit(locale, UnicodeInput{{text, remaining}, mode}, new_position, thousands, decimal, positive,
                   negative, ascii_compatible != 0);
}

int32_t LXStrDoubleNextState(int32_t state, int32_t char_class, double* value, int32_t* mantissa_sign,
                             int32_t* fraction_exponent, int32_t* exponent_sign, int32_t* exponent) {
  DoubleParts parts{*value, *mantissa_sign, *fraction_exponent, *exponent_sign, *exponent};
  const int32_t next = next_state(state, char_class, &parts);
  *value = parts.value;
  *mantissa_sign = parts.mantissa_sign;
  *fraction_exponent = parts.fraction_exponent;
  *exponent_sign = parts.exponent_sign;
  *exponent = parts.exponent;
  return next;
}

}  // extern "C"
