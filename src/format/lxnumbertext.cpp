// The decimal digits of integers and doubles. A double gets the digits of the C library's "%f", which most
// values are given by exact integer arithmetic; the C library itself converts very large and very small ones.
#include "format/lxnumbertext.h"

#include <cstdio>
#include <cstring>

using namespace lx;

namespace {

struct DigitPairs {
  char text[200];
  constexpr DigitPairs() : text() {
    for (int i = 0; i < 100; ++i) {
      text[2 * i] = static_cast<char>('0' + i / 10);
      text[2 * i + 1] = static_cast<char>('0' + i % 10);
    }
  }
};
constexpr DigitPairs kPairs;

/// Writes the digits of a value, 0 included, to the left of `p`: where they begin.
template <class Value>
char* put_digits(char* p, Value value) {
  for (; value >= 100; value /= 100) memcpy(p -= 2, kPairs.text + 2 * (value % 100), 2);
  if (value >= 10) return static_cast<char*>(memcpy(p - 2, kPairs.text + 2 * value, 2));
  *--p = static_cast<char>('0' + value);
  return p;
}

/// Where the digits of values that fit 64 bits meet: the integer part stands before, the fraction behind.
constexpr size_t kPoint = 24;

void set_digits(DecimalDigits* digits, uint64_t integer, uint32_t fraction) {
  char* const point = digits->text + kPoint;
  const char* begin =
      integer <= UINT32_MAX ? put_digits(point, static_cast<uint32_t>(integer)) : put_digits(point, integer);
  digits->integer = begin;
  digits->integer_digits = static_cast<size_t>(point - begin);
  char* p = point + kPrintedFraction;
  for (int pair = 0; pair < 3; ++pair, fraction /= 100) memcpy(p -= 2, kPairs.text + 2 * (fraction % 100), 2);
  digits->fraction = point;
}

void set_word(DecimalDigits* digits, const char* word) {
  digits->integer = word;
  digits->integer_digits = strlen(word);
  digits->fraction = nullptr;
}

/// What stands between the digits depends on the process's locale; the fraction is the last six.
void print_digits(double value, DecimalDigits* digits) {
  const int bytes = snprintf(digits->text, sizeof(digits->text), "%f", value);
  digits->integer = digits->text;
  digits->integer_digits = strspn(digits->text, "0123456789");
  digits->fraction = digits->text + static_cast<size_t>(bytes) - kPrintedFraction;
}

}  // namespace

namespace lx {

void integer_digits(uint32_t value, DecimalDigits* digits) {
  char* const end = digits->text + kPoint;
  digits->integer = put_digits(end, value);
  digits->integer_digits = static_cast<size_t>(end - digits->integer);
}

void double_digits(double value, DecimalDigits* digits) {
  if (value != value) return set_word(digits, "nan");
  if (value > __DBL_MAX__) return set_word(digits, "inf");
  if (value == 0) return set_digits(digits, 0, 0);
  // value = mantissa * 2^exponent
  constexpr int kMantissaBits = 52;
  uint64_t bits;
  memcpy(&bits, &value, sizeof(bits));
  const int exponent = static_cast<int>(bits >> kMantissaBits) - 1075;
  const uint64_t mantissa = (bits & ((uint64_t{1} << kMantissaBits) - 1)) | uint64_t{1} << kMantissaBits;
  if (exponent > 10 || exponent < -64) return print_digits(value, digits);
  if (exponent >= 0) return set_digits(digits, mantissa << exponent, 0);
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
  set_digits(digits, integer, fraction);
}

}  // namespace lx
