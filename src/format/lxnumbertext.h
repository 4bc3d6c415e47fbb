// The text of a number before it is copied into a buffer: digits of integers and doubles, grouped and with a
// fraction, in units of any form. Every unit is one character.
#pragma once

#include "format/lxnumber.h"

namespace lx {

inline constexpr size_t kMostDigits = 309;     // of the integer part of a double
inline constexpr size_t kPrintedFraction = 6;  // digits of a "%f" conversion

/// The ASCII digits of a number. `fraction` is null where the number is not finite; `integer` is then a word.
struct DecimalDigits {
  const char* integer;
  size_t integer_digits;
  const char* fraction;
  char text[kMostDigits + 16];  // what the pointers point into
};

/// The digits of an integer, and those that "%f" gives for a value that is not negative.
void integer_digits(uint32_t value, DecimalDigits* digits);
void double_digits(double value, DecimalDigits* digits);

/// A minus sign, the integer part, a separator behind each of its digits at most, and the fraction: `zeros`
/// more digits follow the units, as many as a locale asks for.
template <class Unit>
class NumberText {
 public:
  explicit NumberText(const FixedChars& chars) : zero_(chars.zero), minus_(chars.minus) {}

  const Unit* begin() const { return begin_; }
  size_t units() const { return static_cast<size_t>(end_ - begin_); }
  size_t zeros() const { return zeros_; }
  Unit zero() const { return zero_; }

  /// No separator stands before the most significant digit, and none is written when it is 0.
  template <class Groups>
  void put_integer(const DecimalDigits& digits, Unit separator, Groups groups) {
    // Values in locals: a unit that is a byte may stand anywhere, for all the compiler knows.
    const char* const first = digits.integer;
    const char* from = first + digits.integer_digits;
    const Unit from_ascii = ascii_to_unit();
    Unit* p = begin_;
    if (separator != 0) {
      for (;;) {
        const size_t size = groups.next();
        if (size == 0 || size >= static_cast<size_t>(from - first)) break;
        for (const char* const end = from - size; from != end;) *--p = digit(*--from, from_ascii);
        *--p = separator;
      }
    }
    while (from != first) *--p = digit(*--from, from_ascii);
    begin_ = p;
  }

  /// `count` fraction digits are asked for. Beyond six the fraction is the first five of them and `count` - 6
  /// zeros: callers know the widths that come of it.
  void put_fraction(const char* fraction, Unit separator, size_t count) {
    Unit* p = end_;
    if (separator != 0) *p++ = separator;
    const size_t taken = count <= kPrintedFraction ? count : kPrintedFraction - 1;
    const Unit from_ascii = ascii_to_unit();
    for (size_t i = 0; i < taken; ++i) *p++ = digit(fraction[i], from_ascii);
    end_ = p;
    if (count > kPrintedFraction) zeros_ = count - kPrintedFraction;
  }

  /// A number that is not finite.
  template <class Encode>
  void put_word(const DecimalDigits& digits, Encode encode) {
    for (size_t i = 0; i < digits.integer_digits; ++i) *end_++ = encode(digits.integer[i]);
  }

  void put_minus() { *--begin_ = minus_; }

 private:
  Unit ascii_to_unit() const { return static_cast<Unit>(zero_ - '0'); }
  static Unit digit(char ascii, Unit from_ascii) {
    return static_cast<Unit>(static_cast<Unit>(ascii) + from_ascii);
  }

  static constexpr size_t kBeforePoint = 2 * kMostDigits;
  const Unit zero_;
  const Unit minus_;
  size_t zeros_ = 0;
  Unit units_[kBeforePoint + 1 + kPrintedFraction];
  Unit* begin_ = units_ + kBeforePoint;
  Unit* end_ = begin_;
};

}  // namespace lx
