// Integers and doubles read from text. A classifier gives one digit, sign, separator or run of white space
// after the other, from any kind of text; both parsers are loops over its classes.
#include <cmath>

#include "codepage/lxunicode.h"
#include "core/lxcall.h"
#include "format/lxnumber.h"

namespace {

using lx::bytes_of;
using lx::Call;
using lx::Codepage;
using lx::codepage_of;
using lx::DigitValues;
using lx::FixedChars;
using lx::Form;
using lx::kNoClass;
using lx::NumberForm;
using lx::NumberUnit;

RAS1_Unit unit = RAS1_UNIT("lxnumberread");

constexpr int32_t kClassD = 13;
constexpr int32_t kClassE = 14;
constexpr int32_t kClassX = 33;
constexpr int32_t kIntegerDigits = 3, kFractionDigits = 5, kExponentMarker = 6;  // states of the double parser

// Characters are packed codes, or in the U forms Unicode values.
template <NumberForm kForm>
using Char = std::conditional_t<kForm == NumberForm::kUnicode, LXUChar, LXWChar>;

/// A sign, as one of the texts that hold one, or as `first` alone.
struct Sign {
  uint32_t first = 0;  // its first character; 0: no sign, which never matches
  const uint8_t* bytes = nullptr;
  const uint8_t* unicode = nullptr;  // 16-bit, at any address
  const LXWChar* codes = nullptr;
};

/// Calls `body` with a reader of a sign and a value that it reads.
template <NumberForm kForm, class Body>
auto read_sign(const Codepage& cp, const Sign& sign, Body&& body) {
  if constexpr (kForm != NumberForm::kUnicode) {
    if (sign.bytes != nullptr) {
      const size_t bytes = lx::text_units(reinterpret_cast<const char*>(sign.bytes), -1);
      return lx::read_bytes(cp, lx::kTextForm<kForm>, LX_SHIFT_SINGLE, sign.bytes, bytes,
                            [&](auto in) { return body(in, LXWChar{}); });
    }
    if (sign.codes != nullptr)
      return body(lx::CodeReader{cp, sign.codes, sign.codes + lx::text_units(sign.codes, -1)}, LXWChar{});
  }
  return body(lx::PayloadReader{sign.unicode, nullptr}, LXUChar{});
}

/// A character of a sign as one of the text.
template <NumberForm kForm, class Value>
Char<kForm> sign_char(const Codepage& cp, Value value) {
  if constexpr (sizeof(Char<kForm>) != sizeof(Value))
    return lx::unicode_to_code(cp, value);
  else
    return value;
}

template <NumberForm kForm>
Sign with_first(const Codepage& cp, Sign sign) {
  sign.first = read_sign<kForm>(cp, sign, [&](auto in, auto value) {
    return in.next(&value) ? uint32_t{sign_char<kForm>(cp, value)} : 0u;
  });
  return sign;
}

template <NumberForm kForm>
Sign item_sign(const LXLocale& locale, bool current, int32_t item) {
  lx::TextKind kind{};
  const auto get = kForm == NumberForm::kUnicode ? LXLocaleGetTextItemU : LXLocaleGetTextItem;
  const auto* text = static_cast<const uint8_t*>(get(&locale, item, current, &kind));
  Sign sign;
  (kind == lx::TextKind::kUnicode ? sign.unicode : sign.bytes) = text;
  return with_first<kForm>(codepage_of(*locale.codepage), sign);
}

uint16_t digit_of(uint16_t u) {
  return (lx::unicode_type(u) & LX_C1_DIGIT) != 0 ? lx::unicode_digit(u) : 0;
}

/// What the characters of a text mean.
template <NumberForm kForm>
struct Classifier {
  const Codepage& cp;
  const DigitValues& digits;
  bool national;
  uint32_t thousands;  // 0: never matched
  uint32_t decimal;
  Sign positive, negative;

  /// Digits are nothing else: no white space, no separator, and no sign begins with one.
  const bool plain_digits = (kForm == NumberForm::kUnicode || cp.plain_digits) && !national &&
                            !is_digit(thousands) && !is_digit(decimal) && !is_digit(positive.first) &&
                            !is_digit(negative.first);

  /// Takes the digits that stand next, as long as `use(digit)` wants them. All other items are left to take(),
  /// and digits too where they may be something else.
  template <class Reader, class Use>
  void take_digits(Reader* in, Use use) const {
    if (!plain_digits) return;
    const uint32_t zero = digits.zero;
    Reader at(*in);  // a copy, in registers
    Char<kForm> c{};
    for (Reader ahead(at); ahead.next(&c); lx::go_on_at(at, ahead)) {
      const uint32_t digit = c - zero;
      if (digit > 9 || !use(digit)) break;
    }
    lx::go_on_at(*in, at);
  }

  /// Takes one item of the text and gives its class; a character that is none is not taken.
  template <class Reader>
  int32_t take(Reader* in) const {
    Reader ahead(*in);
    Char<kForm> c{};
    if (!ahead.next(&c)) return kNoClass;
    if (plain_digits && is_digit(c)) {
      lx::go_on_at(*in, ahead);
      return static_cast<int32_t>(c - uint32_t{digits.zero});
    }
    Reader any(*in);  // a copy, so that `in` can stay in registers
    const int32_t found = take_any(&any);
    lx::go_on_at(*in, any);
    return found;
  }

 private:
  template <class Reader>
  [[gnu::noinline]] int32_t take_any(Reader* in) const {
    Reader ahead(*in);
    Char<kForm> c{};
    if (!ahead.next(&c)) return kNoClass;
    if (is_space(c)) {
      do lx::go_on_at(*in, ahead);
      while (ahead.next(&c) && is_space(c));
      return LX_CLASS_SPACE;
    }
    if (c == positive.first && c != 0 && take_sign(in, ahead, positive)) return LX_CLASS_POSITIVE;
    if (c == negative.first && c != 0 && take_sign(in, ahead, negative)) return LX_CLASS_NEGATIVE;
    if (national) c = ascii_digit(c);
    int32_t found = c <= 0xFF ? digits.of[c] : kNoClass;
    if (c == thousands && c != 0)
      found = LX_CLASS_THOUSANDS;
    else if (c == decimal && c != 0)
      found = LX_CLASS_DECIMAL;
    if (found >= 0) lx::go_on_at(*in, ahead);
    return found;
  }

  bool is_digit(uint32_t c) const { return c - digits.zero <= 9; }

  bool is_space(Char<kForm> c) const {
    if constexpr (kForm == NumberForm::kUnicode) return (lx::unicode_type(c) & LX_C1_SPACE) != 0;
    if (c <= 0xFF) return (cp.type(static_cast<uint8_t>(c)) & LX_C1_SPACE) != 0;
    const uint8_t* record = lx::type_record_of_code(cp, c);
    return record != nullptr && (lx::format::codepage::TypeRecord::read(record).type & LX_C1_SPACE) != 0;
  }

  Char<kForm> ascii_digit(Char<kForm> c) const {
    if constexpr (kForm == NumberForm::kUnicode) {
      const uint16_t digit = digit_of(c);
      return digit != 0 ? digit : c;
    } else {
      const uint16_t digit = digit_of(lx::code_to_unicode(cp, c));
      return digit != 0 ? lx::unicode_to_code(cp, digit) : c;
    }
  }

  /// `ahead` stands behind the sign's first character.
  template <class Reader>
  bool take_sign(Reader* in, Reader& ahead, const Sign& sign) const {
    if (sign.bytes != nullptr || sign.unicode != nullptr || sign.codes != nullptr) {
      Reader whole(*in);
      Char<kForm> c{};
      const bool same = read_sign<kForm>(cp, sign, [&](auto text, auto wanted) {
        while (text.next(&wanted))
          if (!whole.next(&c) || c != sign_char<kForm>(cp, wanted)) return false;
        return true;
      });
      if (!same) return false;
      lx::go_on_at(ahead, whole);
    }
    lx::go_on_at(*in, ahead);
    return true;
  }
};

Sign single_sign(uint8_t c) {
  Sign sign;
  sign.first = c;
  return sign;
}

template <NumberForm kForm>
const DigitValues& digit_values(bool ascii) {
  return kForm == NumberForm::kUnicode || ascii ? lx::kAsciiDigits : lx::kEbcdicDigits;
}

/// What a locale's numbers are made of.
template <NumberForm kForm>
[[gnu::always_inline]] inline Classifier<kForm> classifier_of(const LXLocale& locale, uint32_t flags,
                                                              bool with_decimal) {
  const bool current = (flags & LX_TERRITORY_VALUES) == 0;
  const bool monetary = (flags & LX_MONETARY) != 0;
  const FixedChars& chars = lx::fixed_chars<kForm>(locale);
  return {codepage_of(*locale.codepage),
          digit_values<kForm>(lx::keeps_ascii(locale)),
          (flags & LX_NATIONAL_DIGITS) != 0,
          lx::separator_of<kForm>(locale, current, monetary ? lx::kMonetaryThousands : lx::kThousands),
          with_decimal
              ? lx::separator_of<kForm>(locale, current, monetary ? lx::kMonetaryDecimal : lx::kDecimal)
              : 0u,
          monetary ? item_sign<kForm>(locale, current, LX_ITEM_POSITIVE_SIGN) : single_sign(chars.plus),
          monetary ? item_sign<kForm>(locale, current, LX_ITEM_NEGATIVE_SIGN) : single_sign(chars.minus)};
}

/// A text to read. `state` is the one it begins in, for the Ex forms.
template <NumberForm kForm>
struct Input {
  const NumberUnit<kForm>* text;
  int32_t length;
  uint32_t flags;
  LXShiftState state = LX_SHIFT_SINGLE;
};

template <NumberForm kForm, class Body>
auto read(const Codepage& cp, const Input<kForm>& from, Body&& body) {
  if constexpr (kForm == NumberForm::kUnicode) {
    return body(lx::UnicodeReader{from.text, from.text + lx::text_units(from.text, from.length)});
  } else if constexpr (kForm == NumberForm::kCodes) {
    return body(lx::CodeReader{cp, from.text, from.text + lx::text_units(from.text, from.length)});
  } else {
    const char* text = reinterpret_cast<const char*>(from.text);
    const size_t bytes = lx::text_bytes(cp, text, from.state, from.length, from.flags);
    return lx::read_bytes(cp, lx::kTextForm<kForm>, from.state, from.text, bytes, body);
  }
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

/// Reads an integer; the reader is left at what ended it.
template <class Reader, class Classes>
int32_t read_long(Reader& in, const Classes& classes, uint32_t base, bool is_unsigned) {
  Reader item(in);  // where the last class began
  const auto take = [&] {
    lx::go_on_at(item, in);
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
    lx::go_on_at(in, item);
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
  lx::go_on_at(in, item);
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
    case 0:
      parts->value = digit;
      return kIntegerDigits;
    case 1:
    case kIntegerDigits:
    case 4:
      parts->value = parts->value * 10 + digit;
      return kIntegerDigits;
    case 2:
      parts->fraction_exponent = -1;
      parts->value = digit / 10.0;
      return kFractionDigits;
    case kFractionDigits:
      if (parts->fraction_exponent > -INT32_MAX) --parts->fraction_exponent;
      parts->value += digit * power_of_ten(parts->fraction_exponent);
      return kFractionDigits;
    case kExponentMarker:
    case 7:
      parts->exponent = digit;
      return 8;
    case 8: {
      constexpr int32_t kRoomForDigit = (INT32_MAX - 9) / 10;
      parts->exponent = parts->exponent > kRoomForDigit ? INT32_MAX : parts->exponent * 10 + digit;
      return 8;
    }
    default:
      return -1;
  }
}

int32_t after_sign(int32_t state, int32_t sign, DoubleParts* parts) {
  if (state != 0 && state != kExponentMarker) return -1;
  if (sign < 0) (state == 0 ? parts->mantissa_sign : parts->exponent_sign) = sign;
  return state == 0 ? 1 : 7;
}

int32_t next_state(int32_t state, int32_t c, DoubleParts* parts) {
  if (c >= 0 && c <= 9) return after_digit(state, c, parts);
  switch (c) {
    case LX_CLASS_POSITIVE:
      return after_sign(state, 1, parts);
    case LX_CLASS_NEGATIVE:
      return after_sign(state, -1, parts);
    case LX_CLASS_SPACE:
      return state == 0 ? 0 : -1;
    case LX_CLASS_THOUSANDS:
      return state == kIntegerDigits ? 4 : -1;
    case LX_CLASS_DECIMAL:
      if (state == kIntegerDigits) parts->fraction_exponent = 0;
      return state == 0 || state == 1 ? 2 : state == kIntegerDigits ? kFractionDigits : -1;
    case kClassD:
    case kClassE:
      return state == kFractionDigits ? kExponentMarker : -1;
    default:
      return -1;
  }
}

/// Reads a double; the reader is left at what ended it. The signs of an exponent are plain ones.
template <class Reader, class Classes>
double read_double(Reader& in, Classes& classes, const FixedChars& chars) {
  DoubleParts parts;
  Reader item(in);
  int32_t state = 0;
  for (;;) {
    if (state == kIntegerDigits || state == kFractionDigits) {  // which digits do not leave
      DoubleParts moved = parts;                                // a copy, in registers
      classes.take_digits(&in, [&](uint32_t digit) {
        return after_digit(state, static_cast<int32_t>(digit), &moved) == state;
      });
      parts = moved;
    }
    lx::go_on_at(item, in);
    state = next_state(state, classes.take(&in), &parts);
    if (state < 0) break;
    if (state == kExponentMarker) {
      classes.positive = single_sign(chars.plus);
      classes.negative = single_sign(chars.minus);
    }
  }
  lx::go_on_at(in, item);
  return parts.result();
}

/// The place of a reader as the caller's pointer.
template <class Unit, class Text>
void put_place(const Text** to, const Unit* place) {
  if (to != nullptr) *to = reinterpret_cast<const Text*>(place);
}

template <NumberForm kForm, class Text>
int32_t text_to_long(LXLocale* given, const Input<kForm>& from, const Text** end, int32_t base) {
  Call call(unit, given);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, 0);
  put_place(end, from.text);
  if (base < 0 || base == 1 || base > 36) return call.fail(LX_E_BASE, 0);
  constexpr uint32_t kAllowed =
      LX_TERRITORY_VALUES | LX_NATIONAL_DIGITS | LX_MONETARY | LX_UNSIGNED | LX_CHARACTERS;
  if ((from.flags & ~kAllowed) != 0) return call.fail(LX_E_INVALID, 0);
  const auto classes = classifier_of<kForm>(*call.locale(), from.flags, false);
  return call.exit(read(codepage_of(call.codepage()), from, [&](auto in) {
    const bool is_unsigned = (from.flags & LX_UNSIGNED) != 0;
    const int32_t value = read_long(in, classes, static_cast<uint32_t>(base), is_unsigned);
    put_place(end, in.p);
    return value;
  }));
}

template <NumberForm kForm, class Text>
double text_to_double(LXLocale* given, const Input<kForm>& from, const Text** end) {
  Call call(unit, given);
  double value = 0;
  const auto exit = [&](int32_t code) {
    call.fail(code, 0);
    return value;
  };
  if (!call) return exit(LX_E_NOT_INITIALIZED);
  put_place(end, from.text);
  constexpr uint32_t kAllowed = LX_TERRITORY_VALUES | LX_NATIONAL_DIGITS | LX_MONETARY | LX_CHARACTERS;
  if ((from.flags & ~kAllowed) != 0) return exit(LX_E_INVALID);
  auto classes = classifier_of<kForm>(*call.locale(), from.flags, true);
  read(codepage_of(call.codepage()), from, [&](auto in) {
    value = read_double(in, classes, lx::fixed_chars<kForm>(*call.locale()));
    put_place(end, in.p);
  });
  return exit(LX_OK);
}

/// A caller's separator: its first unit.
template <class Text>
uint32_t first_unit(const Text* text) {
  if (text == nullptr) return 0;
  return static_cast<std::make_unsigned_t<Text>>(*text);
}

template <NumberForm kForm, class Text>
Sign given_sign(const Codepage& cp, const Text* text) {
  Sign sign;
  if (text == nullptr || *text == 0) return sign;
  if constexpr (kForm == NumberForm::kUnicode)
    sign.unicode = reinterpret_cast<const uint8_t*>(text);
  else if constexpr (kForm == NumberForm::kCodes)
    sign.codes = text;
  else
    sign.bytes = bytes_of(text);
  return with_first<kForm>(cp, sign);
}

template <NumberForm kForm, class Text>
int32_t get_digit(LXLocale* given, const Input<kForm>& from, const Text** new_position, const Text* thousands,
                  const Text* decimal, const Text* positive, const Text* negative, bool ascii) {
  Call call(unit, given);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, kNoClass);
  put_place(new_position, from.text);
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

using PlainInput = Input<NumberForm::kPlain>;
using ExInput = Input<NumberForm::kEx>;
using CodeInput = Input<NumberForm::kCodes>;
using UnicodeInput = Input<NumberForm::kUnicode>;

}  // namespace

extern "C" {

int32_t LXStringToLong(LXLocale* locale, const char* text, int32_t length, const char** end, int32_t base,
                       uint32_t flags) {
  return text_to_long(locale, PlainInput{bytes_of(text), length, flags}, end, base);
}

int32_t LXStringToLongEx(LXLocale* locale, const char* text, LXShiftState state, int32_t length,
                         const char** end, int32_t base, uint32_t flags) {
  return text_to_long(locale, ExInput{bytes_of(text), length, flags, state}, end, base);
}

int32_t LXStringToLongW(LXLocale* locale, const LXWChar* text, int32_t length, const LXWChar** end,
                        int32_t base, uint32_t flags) {
  return text_to_long(locale, CodeInput{text, length, flags}, end, base);
}

int32_t LXStringToLongU(LXLocale* locale, const LXUChar* text, int32_t length, const LXUChar** end,
                        int32_t base, uint32_t flags) {
  return text_to_long(locale, UnicodeInput{text, length, flags}, end, base);
}

double LXStringToDouble(LXLocale* locale, const char* text, int32_t length, const char** end, uint32_t flags) {
  return text_to_double(locale, PlainInput{bytes_of(text), length, flags}, end);
}

double LXStringToDoubleEx(LXLocale* locale, const char* text, LXShiftState state, int32_t length,
                          const char** end, uint32_t flags) {
  return text_to_double(locale, ExInput{bytes_of(text), length, flags, state}, end);
}

double LXStringToDoubleW(LXLocale* locale, const LXWChar* text, int32_t length, const LXWChar** end,
                         uint32_t flags) {
  return text_to_double(locale, CodeInput{text, length, flags}, end);
}

double LXStringToDoubleU(LXLocale* locale, const LXUChar* text, int32_t length, const LXUChar** end,
                         uint32_t flags) {
  return text_to_double(locale, UnicodeInput{text, length, flags}, end);
}

int32_t LXStrGetDigit(LXLocale* locale, const char* text, int32_t remaining, const char** new_position,
                      const char* thousands, const char* decimal, const char* positive, const char* negative,
                      int32_t ascii_compatible, uint32_t mode) {
  return get_digit(locale, PlainInput{bytes_of(text), remaining, mode}, new_position, thousands, decimal,
                   positive, negative, ascii_compatible != 0);
}

int32_t LXStrGetDigitEx(LXLocale* locale, const char* text, LXShiftState state, int32_t remaining,
                        const char** new_position, const char* thousands, const char* decimal,
                        const char* positive, const char* negative, int32_t ascii_compatible, uint32_t mode) {
  return get_digit(locale, ExInput{bytes_of(text), remaining, mode, state}, new_position, thousands, decimal,
                   positive, negative, ascii_compatible != 0);
}

int32_t LXStrGetDigitW(LXLocale* locale, const LXWChar* text, int32_t remaining, const LXWChar** new_position,
                       const LXWChar* thousands, const LXWChar* decimal, const LXWChar* positive,
                       const LXWChar* negative, int32_t ascii_compatible, uint32_t mode) {
  return get_digit(locale, CodeInput{text, remaining, mode}, new_position, thousands, decimal, positive,
                   negative, ascii_compatible != 0);
}

int32_t LXStrGetDigitU(LXLocale* locale, const LXUChar* text, int32_t remaining, const LXUChar** new_position,
                       const LXUChar* thousands, const LXUChar* decimal, const LXUChar* positive,
                       const LXUChar* negative, int32_t ascii_compatible, uint32_t mode) {
  return get_digit(locale, UnicodeInput{text, remaining, mode}, new_position, thousands, decimal, positive,
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
