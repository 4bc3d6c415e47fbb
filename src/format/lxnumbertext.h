// The text of a number before it is copied into a buffer: digits of integers and doubles, grouped and with a
// fraction, in units of any form. Every unit is one character.
#pragma once

#include <cstring>

#include "format/lxnumber.h"

namespace lx {

inline constexpr size_t kMostDigits = 309;     // of the integer part of a double
inline constexpr size_t kPrintedFraction = 6;  // digits of a "%f" conversion

/// A number that is not negative, in decimal. Of most the integer part is a word, and the fraction millionths; else
/// there are ASCII digits: `fraction` is null where the number is not finite, and `integer` is then a word of letters.
struct Decimal {
  bool is_word;
  uint32_t word, millionths;
  const char* integer;
  size_t integer_digits;
  const char* fraction;
  char text[kMostDigits + 16];  // what the pointers point into

  void set(uint32_t value) {
    is_word = true;
    word = value;
    millionths = 0;
  }
  /// Makes the digits of a word and of millionths.
  void make_digits();
};

/// What "%f" gives for a value that is not negative.
void to_decimal(double value, Decimal* decimal);

inline constexpr uint32_t kEightDigits = 100000000;
inline constexpr uint64_t kEachByte = 0x0101010101010101;

/// The values of eight digits, one a byte, the first in the lowest: halves of halves, side by side.
inline uint64_t eight_digits(uint32_t value) {
  const uint64_t fours = value / 10000 | uint64_t{value % 10000} << 32;
  const uint64_t high_pairs = (fours * 10486 >> 20) & 0x7F0000007F;
  const uint64_t pairs = high_pairs + ((fours - 100 * high_pairs) << 16);
  const uint64_t tens = (pairs * 103 >> 10) & 0x000F000F000F000F;
  return tens + ((pairs - 10 * tens) << 8);
}

/// How many digits a value has; 0 has one.
inline size_t count_digits(uint32_t value) {
  static constexpr uint32_t kPowers[] = {0,      10,      100,      1000,      10000,
                                         100000, 1000000, 10000000, 100000000, 1000000000};
  const unsigned bits = 32u - static_cast<unsigned>(__builtin_clz(value | 1));
  const unsigned least = bits * 1233 >> 12;  // 1233 / 4096 is the logarithm of 2
  return least + (value >= kPowers[least]);
}

/// A text of a few units in two registers: no branch depends on how many there are, and no load waits for stores.
struct ShortText {
  uint64_t first;  // its first eight units, one a byte; the first in the lowest
  uint64_t last;   // its last eight
  size_t units = 0;

  /// The digits of an integer, in groups of three unless `separator` is 0.
  void put_integer(uint32_t value, uint8_t zero, uint8_t separator);
  /// At most six digits of a fraction, behind a separator unless it is 0.
  void put_fraction(uint32_t millionths, uint8_t zero, uint8_t separator, size_t digits);
  void put_before(uint8_t unit) {
    first = first << 8 | unit;
    ++units;
  }
};

inline void ShortText::put_integer(uint32_t value, uint8_t zero, uint8_t separator) {
  size_t count = count_digits(value);
  const uint64_t low = eight_digits(value % kEightDigits) + kEachByte * zero;
  const uint64_t ninth = value / kEightDigits % 10 + zero, tenth = value / kEightDigits / 10 + zero;
  uint64_t behind = low, before = tenth << 48 | ninth << 56;
  if (separator != 0) {  // as 1,234,567,890
    count += (count - 1) / 3;
    const uint64_t separators = separator | uint64_t{separator} << 32;
    behind = separators | (low >> 8 & 0xFFFFFF00) | (low & 0xFFFFFF0000000000);
    before = tenth << 24 | uint64_t{separator} << 32 | ninth << 40 | low << 48;
  }
  // What stands before the text goes.
  const size_t bits = 8 * (16 - count);
  first = bits >= 64 ? behind >> (bits - 64) : before >> bits | behind << (64 - bits);
  last = behind;
  units = count;
}

inline void ShortText::put_fraction(uint32_t millionths, uint8_t zero, uint8_t separator, size_t digits) {
  uint64_t text = eight_digits(millionths * 100) + kEachByte * zero;
  if (separator != 0) text = text << 8 | separator;
  units = digits + (separator != 0);
  first = text;
  last = units != 0 ? text << (64 - 8 * units) : 0;
}

/// Stores the lowest `kCount` bytes as units.
template <size_t kCount, class Unit>
[[gnu::always_inline]] inline void store_bytes(Unit* to, uint64_t bytes) {
  if constexpr (sizeof(Unit) == 1) {
    memcpy(to, &bytes, kCount);
  } else if constexpr (sizeof(Unit) == 2 && kCount <= 4) {  // four side by side
    uint64_t units = bytes & UINT32_MAX;
    units = (units | units << 16) & 0x0000FFFF0000FFFF;
    units = (units | units << 8) & 0x00FF00FF00FF00FF;
    memcpy(to, &units, kCount * sizeof(Unit));
  } else if constexpr (sizeof(Unit) == 2) {
    store_bytes<4>(to, bytes);
    store_bytes<kCount - 4>(to + 4, bytes >> 32);
  } else {
    for (size_t i = 0; i < kCount; ++i) to[i] = static_cast<uint8_t>(bytes >> 8 * i);
  }
}
template <class Unit>
[[gnu::always_inline]] inline void store_text(Unit* to, const ShortText& text) {
  Unit* const end = to + text.units;
  if (text.units >= 8) {
    store_bytes<8>(end - 8, text.last);
    store_bytes<8>(to, text.first);
  } else if (text.units >= 4) {
    store_bytes<4>(end - 4, text.last >> 32);
    store_bytes<4>(to, text.first);
  } else if (text.units >= 2) {
    store_bytes<2>(end - 2, text.last >> 48);
    store_bytes<2>(to, text.first);
  } else {
    store_bytes<1>(to, text.first);
  }
}

/// A minus sign, the integer part, a separator behind each of its digits at most, and the fraction: `zeros`
/// more digits follow the units, as many as a locale asks for.
template <class Unit>
class NumberText {
 public:
  explicit NumberText(const FixedChars& chars) : zero_(chars.zero), minus_(chars.minus) {}

  static constexpr size_t kBeforePoint = 2 * kMostDigits;
  static constexpr size_t kMostUnits = kBeforePoint + 1 + kPrintedFraction;

  size_t units() const { return integer_.units + fraction_.units + static_cast<size_t>(end_ - begin_); }
  size_t zeros() const { return zeros_; }
  Unit zero() const { return zero_; }

  /// Stores all units.
  void store(Unit* to) const {
    if (integer_.units != 0) {
      store_text(to, integer_);
      if (fraction_.units != 0) store_text(to + integer_.units, fraction_);
      to += integer_.units + fraction_.units;
    }
    for (const Unit* from = begin_; from != end_; ++from) *to++ = *from;
  }

  /// No separator stands before the most significant digit, and none is written when it is 0.
  template <class Groups>
  void put_integer(Decimal* decimal, Unit separator, Groups groups) {
    if (decimal->is_word && separator <= 0xFF && (separator == 0 || groups.all_threes()))
      return integer_.put_integer(decimal->word, zero_, static_cast<uint8_t>(separator));
    if (decimal->is_word) decimal->make_digits();
    // Values in locals: a unit that is a byte may stand anywhere, for all the compiler knows.
    const char* const first = decimal->integer;
    const char* from = first + decimal->integer_digits;
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
  void put_fraction(Decimal* decimal, Unit separator, size_t count) {
    const size_t taken = count <= kPrintedFraction ? count : kPrintedFraction - 1;
    if (count > kPrintedFraction) zeros_ = count - kPrintedFraction;
    if (integer_.units != 0 && separator <= 0xFF)
      return fraction_.put_fraction(decimal->millionths, zero_, static_cast<uint8_t>(separator), taken);
    if (decimal->is_word) decimal->make_digits();
    Unit* p = end_;
    if (separator != 0) *p++ = separator;
    const Unit from_ascii = ascii_to_unit();
    for (size_t i = 0; i < taken; ++i) *p++ = digit(decimal->fraction[i], from_ascii);
    end_ = p;
  }

  /// A number that is not finite.
  template <class Encode>
  void put_word(const Decimal& decimal, Encode encode) {
    for (size_t i = 0; i < decimal.integer_digits; ++i) *end_++ = encode(decimal.integer[i]);
  }

  void put_minus() {
    if (integer_.units != 0)
      integer_.put_before(minus_);
    else
      *--begin_ = minus_;
  }

 private:
  Unit ascii_to_unit() const { return static_cast<Unit>(zero_ - '0'); }
  static Unit digit(char ascii, Unit from_ascii) {
    return static_cast<Unit>(static_cast<Unit>(ascii) + from_ascii);
  }

  const uint8_t zero_, minus_;
  size_t zeros_ = 0;
  ShortText integer_, fraction_;  // these stand before the units, if they have any
  Unit units_[kMostUnits];
  Unit* begin_ = units_ + kBeforePoint;
  Unit* end_ = begin_;
};

}  // namespace lx
