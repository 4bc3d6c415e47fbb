// Numbers and currency amounts, written and read: all forms against one model and against each other, over
// random conventions and every size; reading of whatever was written.
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

std::vector<std::string> words(const char* list) {
  std::istringstream in(list);
  return {std::istream_iterator<std::string>(in), {}};
}
/// A number into a buffer of `size` units, from a state on; it leaves the single-byte state.
template <class F>
Written<F> write_into(const F& form, LXLocale* l, const Value& v, int32_t size, uint32_t flags = 0,
                      LXShiftState state = 0) {
  states.output = states.text = state;
  const auto made =
      written(form, l, size, flags, [&](auto* to, int32_t room) { return write(form, l, v, to, room, flags); });
  states.output = 0;
  if (sizeof(typename F::Unit) == 1 && !made.units.empty() && made.units.size() < 3000) {
    EXPECT_EQ(decode(form, l, made.units + encode(form, l, units("1"))), made.text + units("1"));
  }
  states = {};
  return made;
}

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

/// Conventions that every codepage has characters for.
struct Style {
  char decimal, thousands;
  std::string grouping;
  int digits;
  Units symbol, plus, minus;
  int precedes, space, position;
};
void set_text(LXLocale* locale, int32_t item, const Units& text) {
  ASSERT_EQ(LXSetLocaleTextInfoU(locale, item, text.c_str(), -1, 0), 1);
}
void apply(LXLocale* locale, const Style& s) {
  for (int32_t decimal : {LX_ITEM_DECIMAL, LX_ITEM_MONETARY_DECIMAL}) {
    set_text(locale, decimal, Units{'a'});  // the two separators differ at any moment
    set_text(locale, decimal + 1, Units{LXUChar(s.thousands)});
    set_text(locale, decimal, Units{LXUChar(s.decimal)});
  }
  for (int32_t item : {LX_ITEM_GROUPING, LX_ITEM_MONETARY_GROUPING}) set_text(locale, item, units(s.grouping));
  set_text(locale, LX_ITEM_CURRENCY, s.symbol);
  set_text(locale, LX_ITEM_POSITIVE_SIGN, s.plus);
  set_text(locale, LX_ITEM_NEGATIVE_SIGN, s.minus);
  for (int i = 0; i < 2; ++i) {  // for positive and negative amounts
    LXSetLocaleNumInfo(locale, i == 0 ? LX_ITEM_DIGITS : LX_ITEM_CURRENCY_DIGITS, s.digits);
    LXSetLocaleNumInfo(locale, LX_ITEM_POSITIVE_PRECEDES + 2 * i, s.precedes);
    LXSetLocaleNumInfo(locale, LX_ITEM_POSITIVE_SPACE + 2 * i, s.space);
    LXSetLocaleNumInfo(locale, LX_ITEM_POSITIVE_POSITION + i, s.position);
  }
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
    static const auto groupings = words("3;0 3 3;2;0 0 ; 1;1 2;0;5 1;0 4;3 9999999999999;0");
    static const auto separators = words(".,' ,.' '., .', ,'. ',.");
    // The sign of two or three bytes stands where the codepage has it.
    static const std::vector<Units> texts{units("$"), {},           units("-"),
                                          {0x5186},   units("USD"), {0x5186, 0x5186, 'k'}};
    const std::string two = any_of(separators);
    return {two[0], two[1], any_of(groupings), any(10), any_of(texts), any_of(texts), any_of(texts), any(2),
            any(2), any(5)};
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
  LXSetLocaleNumInfo(ascii, LX_ITEM_DIGITS, 65535);
  EXPECT_EQ(write_into(kPlain, ascii, {Value::kDouble, -DBL_MAX}, 70000).result, 1 + 309 + 102 + 1 + 65534);
  LXSetLocaleNumInfo(ascii, LX_ITEM_CURRENCY_DIGITS, 600);
  const auto longest = write_into(kPlain, ascii, {Value::kAmount, 1.5}, 1000, LX_CHARACTERS);
  EXPECT_EQ(longest.result, 512);
  EXPECT_EQ(longest.code, LX_E_SIZE);
  const auto only_null = write_into(kUnicode, ascii, {Value::kLong, 5}, 1, LX_TERMINATE | LX_CHARACTERS);
  EXPECT_EQ(only_null.result, 1);
  EXPECT_EQ(only_null.code, LX_E_SIZE);
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

TEST_F(NumberTest, AllFormsWriteAndReadTheSameCharacters) {
  for (int i = 0; i < 300; ++i) {
    const Style style = random_style();
    for (const TinyCodepage& cp : case_codepages()) apply(library.locale(cp), style);
    const auto kind = static_cast<Value::Kind>(any(3));
    const bool money = kind == Value::kAmount;
    const uint32_t values = any(4) == 0 ? LX_TERRITORY_VALUES : 0;
    const double last_digit = std::pow(10, -(values != 0 ? 2 : std::min(style.digits, 5)));
    const Value value{kind, kind == Value::kLong ? double(int32_t(random())) : random_double(), values};
    const Units whole = write(kUnicode, ascii, value);
    const int32_t size = 1 + any(count_of(whole) + 9);
    const uint32_t flags = any(2) == 0 ? 0 : LX_TERMINATE;
    const size_t room = static_cast<size_t>(size) - (flags != 0 ? 1 : 0);
    const Units part = whole.substr(0, room);
    const auto check = [&](LXLocale* l, const auto& form, bool shift) {
      using F = std::decay_t<decltype(form)>;
      if (decode(kWide, l, encode(kWide, l, whole)) != whole) return;  // not in the codepage
      for (LXShiftState state = 0; state <= (std::is_same_v<F, Ex> && shift ? 1 : 0); ++state) {
        EXPECT_EQ(write_into(form, l, value, 4000, 0, state).text, whole);
        if (!money && std::isfinite(value.number)) {
          const auto text = encode(form, l, whole);
          const auto [back, end] = read(form, l, {text.begin(), text.end()}, value);
          EXPECT_EQ(end, count_of(text));
          EXPECT_NEAR(back, value.number, last_digit + std::fabs(value.number) * 1e-14);
        }
        // Whole characters, as many as fit with their shift bytes.
        const auto made = write_into(form, l, value, size, flags, state);
        const Units fitted = sizeof(typename F::Unit) == 1 ? whole.substr(0, made.text.size()) : part;
        EXPECT_EQ(made.text, fitted);
        EXPECT_EQ(made.code, fitted == whole ? LX_OK : LX_E_SIZE);
        EXPECT_EQ(made.result, count_of(made.units) + (flags != 0 ? 1 : 0));
        EXPECT_TRUE(fitted == whole || room - made.units.size() < 4);
        const auto chars = write_into(form, l, value, size, flags | LX_CHARACTERS, state);
        if (!money || whole.size() < 14) {
          EXPECT_EQ(chars.text, money && size < 2 ? whole.substr(0, room) : part);
          EXPECT_EQ(chars.result, count_of(part) + (flags != 0 ? 1 : 0));
        }
      }
    };
    for (const TinyCodepage& cp : case_codepages())
      forms_of(cp, [&](const auto& form) { check(library.locale(cp), form, cp.shift); });
  }
}

/// "|" stands where the character ends, "_" for a space.
TEST_F(NumberTest, ClassesOfCharacters) {
  const auto get = [](LXLocale* l, const std::string& given, int family, uint32_t mode = 0) {
    const std::vector<char> text(given.begin(), given.end());
    const char* end = text.data();
    const int32_t value =
        LXStrGetDigit(l, text.data(), count_of(text), &end, ",x", ".", "pos", "-", family, mode);
    return std::pair(value, end - text.data());
  };
  for (std::string word : words("9|=9 z|=35 Z|=35 pos|1=40 p|o=25 -|=41 ,|=42 .|=43 ___|7=44 |!=-1 |=-1")) {
    std::replace(word.begin(), word.end(), '_', ' ');
    const size_t end = word.find('|'), equal = word.find('=');
    const auto got = get(ascii, word.substr(0, end) + word.substr(end + 1, equal - end - 1), 1);
    EXPECT_EQ(got, std::pair(std::stoi(word.substr(equal + 1)), static_cast<ptrdiff_t>(end))) << word;
  }
  for (const auto& [text, value] : {std::pair("\xF7", 7), {"\xE9", 35}, {"\xA9", 35}, {"\xD1", 19}, {"1", -1}})
    EXPECT_EQ(get(ascii, text, 0).first, value);
  EXPECT_EQ(get(ascii, "1", 1, 8).first, -1);
  for (const char* text : {"\x82", "\x82\x60"})  // half a character, and one of two bytes
    EXPECT_EQ(get(library.locale(case_codepage("SJIS")), text, 1).first, -1);
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
