// What a character means in a number: a digit, a sign, a separator, white space. A classifier takes one after
// the other from any kind of text.
#pragma once

#include "codepage/lxunicode.h"
#include "format/lxnumber.h"

namespace lx {

inline constexpr int32_t kClassD = 13;
inline constexpr int32_t kClassE = 14;
inline constexpr int32_t kClassX = 33;

// Characters are packed codes, or in the U forms Unicode values.
template <Form kForm>
using Char = std::conditional_t<kForm == Form::kUnicode, LXUChar, LXWChar>;

/// A sign, as one of the texts that hold one, or as `first` alone.
struct Sign {
  uint32_t first = 0;  // its first character; 0: no sign, which never matches
  const uint8_t* bytes = nullptr;
  const uint8_t* unicode = nullptr;  // 16-bit, at any address
  const LXWChar* codes = nullptr;
};

/// Calls `body` with a reader of a sign and a value that it reads.
template <Form kForm, class Body>
auto read_sign(const Codepage& cp, const Sign& sign, Body&& body) {
  if constexpr (kForm != Form::kUnicode) {
    if (sign.bytes != nullptr) {
      const size_t bytes = units_before_null(sign.bytes);
      return with_cursor(cp, kTextForm<kForm>, LX_SHIFT_SINGLE, sign.bytes, bytes,
                         [&](auto in) { return body(in, LXWChar{}); });
    }
    if (sign.codes != nullptr)
      return body(CodeCursor{cp, sign.codes, sign.codes + units_before_null(sign.codes)}, LXWChar{});
  }
  return body(PayloadCursor{sign.unicode, nullptr}, LXUChar{});
}

/// A character of a sign as one of the text.
template <Form kForm, class Value>
Char<kForm> sign_char(const Codepage& cp, Value value) {
  if constexpr (sizeof(Char<kForm>) != sizeof(Value))
    return unicode_to_code(cp, value);
  else
    return value;
}

/// Shift-stateful text in the plain form is read byte by byte, a sign's character of two bytes too.
template <Form kForm>
bool read_by_bytes(const Codepage& cp) {
  return kForm == Form::kPlain && cp.shift_sensitive;
}

template <Form kForm>
Sign with_first(const Codepage& cp, Sign sign) {
  sign.first = read_sign<kForm>(cp, sign, [&](auto in, auto value) {
    return in.next(&value) ? uint32_t{sign_char<kForm>(cp, value)} : 0u;
  });
  if (sign.first > 0xFF && read_by_bytes<kForm>(cp)) sign.first >>= 8;
  return sign;
}

template <Form kForm>
Sign item_sign(const LXLocale& locale, bool current, int32_t item) {
  TextKind kind{};
  const auto get = kForm == Form::kUnicode ? LXLocaleGetTextItemU : LXLocaleGetTextItem;
  const auto* text = static_cast<const uint8_t*>(get(&locale, item, current, &kind));
  Sign sign;
  (kind == TextKind::kUnicode ? sign.unicode : sign.bytes) = text;
  return with_first<kForm>(codepage_of(*locale.codepage), sign);
}

/// What the characters of a text mean.
template <Form kForm>
struct Classifier {
  const Codepage& cp;
  const DigitValues& digits;
  bool national;
  uint32_t thousands;  // 0: never matched
  uint32_t decimal;
  Sign positive, negative;

  /// Digits are nothing else: no white space, no separator, and no sign begins with one.
  const bool plain_digits = (kForm == Form::kUnicode || cp.plain_digits) && !national && !is_digit(thousands) &&
                            !is_digit(decimal) && !is_digit(positive.first) && !is_digit(negative.first);

  /// Takes the digits that stand next, as long as `use(digit)` wants them. All other items are left to take(),
  /// and digits too where they may be something else.
  template <class Cursor, class Use>
  void take_digits(Cursor* in, Use use) const {
    if (!plain_digits) return;
    const uint32_t zero = digits.zero;
    Cursor at(*in);  // a copy, in registers
    Char<kForm> c{};
    for (Cursor ahead(at); next(&ahead, &c); go_on_at(at, ahead)) {
      const uint32_t digit = c - zero;
      if (digit > 9 || !use(digit)) break;
    }
    go_on_at(*in, at);
  }

  /// Takes one item of the text and gives its class; a character that is none is not taken.
  template <class Cursor>
  int32_t take(Cursor* in) const {
    Cursor ahead(*in);
    Char<kForm> c{};
    if (!next(&ahead, &c)) return kNoClass;
    if (plain_digits && is_digit(c)) {
      go_on_at(*in, ahead);
      return static_cast<int32_t>(c - uint32_t{digits.zero});
    }
    return take_any(in);
  }

 private:
  template <class Cursor>
  [[gnu::noinline]] int32_t take_any(Cursor* in) const {
    Cursor ahead(*in);
    Char<kForm> c{};
    if (!next(&ahead, &c)) return kNoClass;
    if (is_space(c)) {
      do go_on_at(*in, ahead);
      while (next(&ahead, &c) && is_space(c));
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
    if (found >= 0) go_on_at(*in, ahead);
    return found;
  }

  /// Takes the next character. One of two bytes whose first is null has the code of a character of one byte, and is
  /// none of a number.
  template <class Cursor>
  [[gnu::always_inline]] static bool next(Cursor* in, Char<kForm>* c) {
    if (!in->next(c)) return false;
    if constexpr (Cursor::kShifts) return *c > 0xFF || in->length() == 1;
    return true;
  }

  bool is_digit(uint32_t c) const { return c - digits.zero <= 9; }

  bool is_space(Char<kForm> c) const {
    if constexpr (kForm == Form::kUnicode) return (unicode_type(c) & LX_C1_SPACE) != 0;
    if (c <= 0xFF) return (cp.type(static_cast<uint8_t>(c)) & LX_C1_SPACE) != 0;
    const uint8_t* record = type_record_of_code(cp, c);
    return record != nullptr && (format::codepage::TypeRecord::read(record).type & LX_C1_SPACE) != 0;
  }

  Char<kForm> ascii_digit(Char<kForm> c) const {
    if constexpr (kForm == Form::kUnicode) {
      const uint16_t digit = digit_of(c);
      return digit != 0 ? digit : c;
    } else {
      const uint16_t digit = digit_of(code_to_unicode(cp, c));
      return digit != 0 ? unicode_to_code(cp, digit) : c;
    }
  }

  /// `ahead` stands behind the sign's first character.
  template <class Cursor>
  bool take_sign(Cursor* in, Cursor& ahead, const Sign& sign) const {
    if (sign.bytes != nullptr || sign.unicode != nullptr || sign.codes != nullptr) {
      Cursor whole(*in);
      const auto take_char = [&](uint32_t wanted) {
        Char<kForm> c{};
        return next(&whole, &c) && c == wanted;
      };
      const bool same = read_sign<kForm>(cp, sign, [&](auto text, auto value) {
        while (text.next(&value)) {
          uint32_t wanted = sign_char<kForm>(cp, value);
          if (wanted > 0xFF && read_by_bytes<kForm>(cp)) {
            if (!take_char(wanted >> 8)) return false;
            wanted &= 0xFF;
          }
          if (!take_char(wanted)) return false;
        }
        return true;
      });
      if (!same) return false;
      go_on_at(ahead, whole);
    }
    go_on_at(*in, ahead);
    return true;
  }
};

inline Sign single_sign(uint8_t c) {
  Sign sign;
  sign.first = c;
  return sign;
}

template <Form kForm>
const DigitValues& digit_values(bool ascii) {
  return kForm == Form::kUnicode || ascii ? kAsciiDigits : kEbcdicDigits;
}

/// What a locale's numbers are made of.
template <Form kForm>
[[gnu::always_inline]] inline Classifier<kForm> classifier_of(const LXLocale& locale, uint32_t flags,
                                                              bool with_decimal) {
  const bool current = (flags & LX_TERRITORY_VALUES) == 0;
  const bool monetary = (flags & LX_MONETARY) != 0;
  const FixedChars& chars = fixed_chars<kForm>(locale);
  return {codepage_of(*locale.codepage),
          digit_values<kForm>(keeps_ascii(locale)),
          (flags & LX_NATIONAL_DIGITS) != 0,
          separator_of<kForm>(locale, current, monetary ? kMonetaryThousands : kThousands),
          with_decimal ? separator_of<kForm>(locale, current, monetary ? kMonetaryDecimal : kDecimal) : 0u,
          monetary ? item_sign<kForm>(locale, current, LX_ITEM_POSITIVE_SIGN) : single_sign(chars.plus),
          monetary ? item_sign<kForm>(locale, current, LX_ITEM_NEGATIVE_SIGN) : single_sign(chars.minus)};
}

/// A caller's separator: its first unit.
template <class Text>
uint32_t first_unit(const Text* text) {
  if (text == nullptr) return 0;
  return static_cast<std::make_unsigned_t<Text>>(*text);
}

template <Form kForm, class Text>
Sign given_sign(const Codepage& cp, const Text* text) {
  Sign sign;
  if (text == nullptr || *text == 0) return sign;
  if constexpr (kForm == Form::kUnicode)
    sign.unicode = reinterpret_cast<const uint8_t*>(text);
  else if constexpr (kForm == Form::kWide)
    sign.codes = text;
  else
    sign.bytes = bytes_of(text);
  return with_first<kForm>(cp, sign);
}

}  // namespace lx
