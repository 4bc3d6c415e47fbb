// The decimal digits of integers and doubles. A double gets the digits of the C library's "%f", which most
// values are given by exact integer arithmetic; the C library itself converts very large and very small ones.
#include "format/lxnumbertext.h"

#include <cstdio>
#include <cstring>

using namespace lx;

namespace {

/// Stores eight digits, the leading zeros too.
void store_digits(char* to, uint32_t value) {
  const uint64_t ascii = eight_digits(value) + kEachByte * '0';
  memcpy(to, &ascii, sizeof(ascii));
}

/// The integer part is put before a place, and the fraction behind it.
void set_digits(Decimal* decimal, uint64_t integer, uint32_t millionths) {
  char* const point = decimal->text + 24;
  store_digits(point, millionths * 100);
  char* p = point;
  do {
    store_digits(p -= 8, static_cast<uint32_t>(integer % kEightDigits));
    integer /= kEightDigits;
  } while (integer != 0);
  while (*p == '0' && p != point - 1) ++p;
  decimal->is_word = false;
  decimal->integer = p;
  decimal->integer_digits = static_cast<size_t>(point - p);
  decimal->fraction = point;
}

void set_value(Decimal* decimal, uint64_t integer, uint32_t millionths) {
  if (integer > UINT32_MAX) return set_digits(decimal, integer, millionths);
  decimal->is_word = true;
  decimal->word = static_cast<uint32_t>(integer);
  decimal->millionths = millionths;
}

void set_letters(Decimal* decimal, const char* letters) {
  decimal->is_word = false;
  decimal->integer = letters;
  decimal->integer_digits = strlen(letters);
  decimal->fraction = nullptr;
}

/// What stands between the digits depends on the process's locale; the fraction is the last six.
void print_digits(double value, Decimal* decimal) {
  const int bytes = snprintf(decimal->text, sizeof(decimal->text), "%f", value);
  decimal->is_word = false;
  decimal->integer = decimal->text;
  decimal->integer_digits = strspn(decimal->text, "0123456789");
  decimal->fraction = decimal->text + static_cast<size_t>(bytes) - kPrintedFraction;
}

}  // namespace

namespace lx {

void Decimal::make_digits() {
  set_digits(this, word, millionths);
}

void to_decimal(double value, Decimal* decimal) {
  if (value != value) return set_letters(decimal, "nan");
  if (value > __DBL_MAX__) return set_letters(decimal, "inf");
  if (value == 0) return set_value(decimal, 0, 0);
  // value = mantissa * 2^exponent
  constexpr int kMantissaBits = 52;
  uint64_t bits;
  memcpy(&bits, &value, sizeof(bits));
  const int exponent = static_cast<int>(bits >> kMantissaBits) - 1075;
  const uint64_t mantissa = (bits & ((uint64_t{1} << kMantissaBits) - 1)) | uint64_t{1} << kMantissaBits;
  if (exponent > 10 || exponent < -64) return print_digits(value, decimal);
  if (exponent >= 0) return set_value(decimal, mantissa << exponent, 0);
  uint64_t integer = exponent == -64 ? 0 : mantissa >> -exponent;
  const uint64_t below = exponent == -64 ? mantissa : mantissa << (64 + exponent);  // the fraction in 2^-64
  // below * 10^6 = fraction * 2^64 + rest
  constexpr uint64_t kMillion = 1000000;
  constexpr uint64_t kHalf = uint64_t{1} << 63;
  const uint64_t low = (below & UINT32_MAX) * kMillion;
  const uint64_t high = (below >> 32) * kMillion + (low >> 32);
  uint32_t fraction = static_cast<uint32_t>(high >> 32);
  const uint64_t rest = high << 32 | (low & UINT32_MAX);
  if (rest > kHalf || (rest == kHalf && fraction % 2 != 0)) ++fraction;
  if (fraction == kMillion) {
    fraction = 0;
    ++integer;
  }
  set_value(decimal, integer, fraction);
}

}  // namespace lx
