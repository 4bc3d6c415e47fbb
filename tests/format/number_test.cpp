// Doubles as they are written, against a model over random conventions; texts that are longer than the library's
// buffers; and what a caller who reads by hand asks of numbers.
#include <cfloat>
#include <cmath>
#include <cstdarg>
#include <cstdio>
#include <cstring>
#include <sstream>
#include <tuple>

#include "support/case_test.h"

namespace {
bool other_decimal_point = false;  // what a process's locale may make of "%f"
}

/// The C library's, or with a decimal point of two bytes.
extern "C" int snprintf(char* buffer, size_t size, const char* format, ...) noexcept {
  va_list arguments;
  va_start(arguments, format);
  const int bytes = vsnprintf(buffer, size, format, arguments);
  va_end(arguments);
  char* const point = other_decimal_point && strcmp(format, "%f") == 0 ? strchr(buffer, '.') : nullptr;
  if (point == nullptr) return bytes;
  memmove(point + 2, point + 1, strlen(point));
  memcpy(point, "\xD9\xAB", 2);
  return bytes + 1;
}

namespace lx::test {
namespace {

/// The model: separators are put into the digits one by one, as a grouping text says.
std::string grouped(std::string digits, const std::string& grouping, char separator) {
  std::istringstream sizes(grouping);
  bool repeats = false;
  size_t size = 0, place = digits.size();
  for (std::string next; repeats || std::getline(sizes, next, ';');) {
    const size_t given = std::strtoul(next.c_str(), nullptr, 10);
    repeats = repeats || given == 0;
    if (!repeats) size = given;
    if (size == 0 || size >= place) break;
    digits.insert(place -= size, 1, separator);
  }
  return digits;
}

struct Style {
  char decimal, thousands;
  std::string grouping;
  int digits;
};
void set_text(LXLocale* locale, int32_t item, const std::string& text) {
  ASSERT_EQ(LXSetLocaleTextInfo(locale, item, text.c_str(), -1, 0), 1);
}
void apply(LXLocale* locale, const Style& s) {
  set_text(locale, LX_ITEM_DECIMAL, "a");  // the two separators differ at any moment
  set_text(locale, LX_ITEM_THOUSANDS, {s.thousands});
  set_text(locale, LX_ITEM_DECIMAL, {s.decimal});
  set_text(locale, LX_ITEM_GROUPING, s.grouping);
  LXSetLocaleNumInfo(locale, LX_ITEM_DIGITS, s.digits);
}

/// The model of a double in a style.
Units model(double value, const Style& style) {
  const std::string sign = value < 0 ? "-" : "", number = std::to_string(std::fabs(value));
  if (!std::isfinite(value)) return units(sign + number);
  const size_t wanted = static_cast<size_t>(style.digits), point = number.find('.');
  const std::string six = number.substr(point + 1);
  const std::string fraction =
      wanted <= 6 ? six.substr(0, wanted) : six.substr(0, 5) + std::string(wanted - 6, '0');
  return units(sign + grouped(number.substr(0, point), style.grouping, style.thousands) + style.decimal +
               fraction);
}

class NumberTest : public CaseTest {
 protected:
  Style random_style() {
    static const std::vector<std::string> groupings{"3;0", "3",     "3;2;0", "0",   ";",
                                                    "1;1", "2;0;5", "1;0",   "4;3", "9999999999999;0"};
    static const char* const separators[] = {".,'", ",.'", "'.,", ".',", ",'.", "',."};
    const char* const two = any_of(separators);
    return {two[0], two[1], any_of(groupings), any(10)};
  }
  double random_double() {
    const auto bits = (uint64_t{random()} << 32) | random();
    double value;
    memcpy(&value, &bits, sizeof(value));  // any exponent, and what is not finite
    const auto integer = static_cast<double>(static_cast<int64_t>(bits) >> (bits % 60));
    const double choice[] = {value, integer / 128, integer / 100, std::ldexp(integer, -any(140))};
    return any_of(choice);  // the second: ties of the sixth digit
  }

  LXLocale* ascii = library.locale(case_codepage("SINGLE"));
};

TEST_F(NumberTest, LongTexts) {
  std::string out(70000, '\0');
  LXSetLocaleNumInfo(ascii, LX_ITEM_DIGITS, 65535);
  EXPECT_EQ(LXDoubleToString(ascii, -DBL_MAX, out.data(), count_of(out), 0), 1 + 309 + 102 + 1 + 65534);
  LXSetLocaleNumInfo(ascii, LX_ITEM_CURRENCY_DIGITS, 600);
  EXPECT_EQ(LXCurrencyToString(ascii, 1.5, out.data(), 1000, LX_CHARACTERS), 512);
  EXPECT_EQ(LXGetError(ascii), LX_E_SIZE);
}

TEST_F(NumberTest, DigitsAreThoseOfThePrintfConversion) {
  Style style;
  for (int i = 0; i < 40000; ++i) {
    if (i % 1000 == 0) apply(ascii, style = random_style());
    const double value = random_double();
    const Units expected = std::isnan(value) ? units("nan") : model(value, style);
    other_decimal_point = i % 2 != 0;
    const auto text = lx::test::write(kPlain, ascii, {Value::kDouble, value});
    other_decimal_point = false;
    ASSERT_EQ(units(text), expected) << value;
  }
}

TEST_F(NumberTest, TwoBytesInTheDoubleByteStateAreACharacter) {
  LXLocale* const shift = library.locale(case_codepage("SHIFT"));
  EXPECT_EQ(LXStringToLongEx(shift, "\xF1\xF2", LX_SHIFT_SINGLE, 2, nullptr, 10, 0), 12);
  EXPECT_EQ(LXStringToLongEx(shift, "\xF1\xF2", LX_SHIFT_DOUBLE, 2, nullptr, 10, 0), 0);
  EXPECT_EQ(LXStringToLongEx(shift, "\x00\xF2", LX_SHIFT_DOUBLE, 2, nullptr, 10, 0), 0);
  // Nothing follows the Shift-In: the text ends behind it.
  const char* const closed = "\x42\xF1\x0F";
  const char* end = nullptr;
  EXPECT_EQ(LXStringToLongEx(shift, closed, LX_SHIFT_DOUBLE, 3, &end, 10, LX_NATIONAL_DIGITS), 1);
  EXPECT_EQ(end, closed + 3);
  EXPECT_EQ(LXStringToDoubleEx(shift, closed, LX_SHIFT_DOUBLE, -1, &end, LX_NATIONAL_DIGITS), 1);
  EXPECT_EQ(end, closed + 3);
}

TEST_F(NumberTest, NullPointersMatchNothing) {
  EXPECT_EQ(LXStrGetDigit(ascii, "+", 1, nullptr, nullptr, nullptr, nullptr, nullptr, 1, 0), -1);
  int32_t remaining = 5;
  EXPECT_EQ(LXStrGroupingSize(ascii, nullptr, &remaining, nullptr), -1);
  EXPECT_EQ(LXStrGroupingSize(ascii, "", &remaining, nullptr), -1);
}

TEST_F(NumberTest, OnlyTheListedStepsOfADoubleAreTaken) {
  int steps = 0;
  for (int32_t step = 0; step < 12 * 50; ++step) {
    double value = 2;
    int32_t parts[] = {1, -1, 1, 2};
    steps +=
        LXStrDoubleNextState(step / 50 - 1, step % 50 - 2, &value, parts, parts + 1, parts + 2, parts + 3) >= 0;
  }
  EXPECT_EQ(steps, 9 * 10 + 4 + 1 + 2 + 2 + 2);
  double value = 0;
  int32_t state = 0, mantissa_sign = 1, fraction = 0, exponent_sign = 1, exponent = 0;
  for (int32_t c :
       {int32_t{LX_CLASS_NEGATIVE}, 1, int32_t{LX_CLASS_DECIMAL}, 5, 14, int32_t{LX_CLASS_NEGATIVE}, 0, 7})
    state = LXStrDoubleNextState(state, c, &value, &mantissa_sign, &fraction, &exponent_sign, &exponent);
  EXPECT_EQ(std::tie(state, value, mantissa_sign, fraction, exponent_sign, exponent),
            std::make_tuple(8, 1.5, -1, -1, -1, 7));
}

}  // namespace
}  // namespace lx::test
