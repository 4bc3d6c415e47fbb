// Numbers and currency amounts, written and read: all forms against one model and against each other, over
// random conventions and every size; the rules that somebody might repair; reading of whatever was written.
#include <gtest/gtest.h>

#include <algorithm>
#include <cfloat>
#include <cmath>
#include <cstdarg>
#include <cstdio>
#include <cstring>
#include <iterator>
#include <random>
#include <sstream>

#include "lx.h"
#include "support/tiny_codepages.h"

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

using Units = std::u16string;

constexpr char16_t kYen[] = u"\u5186";  // two or three bytes where the codepage has it

/// EBCDIC with the characters that numbers need, and a currency sign of two bytes.
TinyCodepage tiny_money() {
  CodepageBuilder builder(9010, "TINY-MONEY", 2);
  builder.shift(0x0E, 0x0F).substitution(0x6F).map(0x6F, '?').map(0x00, 0x00, 4).map(0x40, ' ').map(0x4B, '.');
  builder.map(0x4D, '(').map(0x4E, '+').map(0x5B, '$').map(0x5D, ')').map(0x5E, ';').map(0x60, '-');
  builder.map(0x6B, ',').map(0x7D, '\'').map(0xF0, '0', 10).map(0x81, 'a', 9).map(0x91, 'j', 9);
  builder.map(0xA2, 's', 8).map(0xC1, 'A', 9).map(0xD1, 'J', 9).map(0xE2, 'S', 8);
  return builder.map(0x4040, 0x3000).map(0x42F0, 0xFF10, 10).map(0x4541, kYen[0]).build();
}

Units units(const std::string& ascii) {
  return Units(ascii.begin(), ascii.end());
}
std::vector<std::string> words(const char* list) {
  std::istringstream in(list);
  return {std::istream_iterator<std::string>(in), {}};
}
template <class Text>
int32_t count_of(const Text& text) {
  return static_cast<int32_t>(text.size());
}
// Texts of every form, to and from Unicode.
template <class Unit>
using Text = std::basic_string<Unit>;
template <class Unit>
Text<Unit> encode(LXLocale* locale, const Units& units) {
  const auto* u = reinterpret_cast<const LXUChar*>(units.data());
  Text<Unit> text(units.size() * 6, Unit{0});
  int32_t count = count_of(units);
  if constexpr (sizeof(Unit) == 1)
    count = LXUnicodeToStringEx(locale, text.data(), 0, count_of(text), u, count, 0);
  else if constexpr (sizeof(Unit) == 4)
    count = LXUnicodeToStringW(locale, text.data(), count_of(text), u, count, 0);
  else
    text.assign(u, units.size());
  return text.substr(0, static_cast<size_t>(count));
}
template <class Unit>
Units decode(LXLocale* locale, const Text<Unit>& text, LXShiftState state = LX_SHIFT_SINGLE) {
  Units units(text.begin(), text.end());
  auto* const u = reinterpret_cast<LXUChar*>(units.data());
  int32_t count = count_of(text);
  if constexpr (sizeof(Unit) == 1)
    count = LXStringToUnicodeEx(u, count, locale, text.data(), state, count, 0);
  else if constexpr (sizeof(Unit) == 4)
    count = LXStringToUnicodeW(u, count, locale, text.data(), count, 0);
  return units.substr(0, static_cast<size_t>(count));
}

struct Value {
  enum Kind { kLong, kDouble, kCurrency } kind;
  double number;
  uint32_t flags = 0;
};

/// What was written, without its null.
struct Made {
  Units text;
  size_t units;
  int32_t result, code;
};
/// Writes into a buffer of exactly `size` units, or with LX_CHARACTERS of the bytes that they can take.
template <class Unit, class Put>
Made make(LXLocale* locale, int32_t size, uint32_t flags, LXShiftState state, Put put) {
  const bool by_chars = sizeof(Unit) == 1 && (flags & LX_CHARACTERS) != 0;
  std::vector<Unit> buffer(static_cast<size_t>(size) * (by_chars ? 6 : 1), Unit{0x5A});
  const int32_t result = put(buffer.data(), size, flags);
  const int32_t code = LXGetError(locale);
  EXPECT_LE(result, size);
  size_t end = buffer.size();
  while (end > (by_chars ? 0 : static_cast<size_t>(result)) && buffer[end - 1] == 0x5A) --end;
  EXPECT_TRUE(by_chars || end <= static_cast<size_t>(result));
  const bool null = (flags & LX_TERMINATE) != 0 && end > 0 && buffer[end - 1] == 0;
  EXPECT_EQ(null, (flags & LX_TERMINATE) != 0);
  const Text<Unit> text(buffer.data(), end - (null ? 1 : 0));
  const Units decoded = decode(locale, text, state);
  if constexpr (sizeof(Unit) == 1) {  // the single-byte state at the end
    EXPECT_TRUE(text.empty() || decode(locale, text + encode<char>(locale, u"1"), state) == decoded + u"1");
  }
  return {decoded, text.size(), result, code};
}

enum Form { kPlain, kEx, kWide, kUnicode };

Made write(LXLocale* locale, const Value& v, Form form, int32_t size, uint32_t flags = 0,
           LXShiftState state = 0) {
  const auto integer = static_cast<int32_t>(static_cast<int64_t>(v.kind == Value::kLong ? v.number : 0));
#define LX_TEST_DOOR(SUFFIX, ...)                                                                       \
  (v.kind == Value::kLong     ? LXLongToString##SUFFIX(locale, integer, __VA_ARGS__, n, f | v.flags)    \
   : v.kind == Value::kDouble ? LXDoubleToString##SUFFIX(locale, v.number, __VA_ARGS__, n, f | v.flags) \
                              : LXCurrencyToString##SUFFIX(locale, v.number, __VA_ARGS__, n, f | v.flags))
#define LX_TEST_MAKE(UNIT, SUFFIX, ...)  \
  make<UNIT>(locale, size, flags, state, \
             [&](UNIT* p, int32_t n, uint32_t f) { return LX_TEST_DOOR(SUFFIX, __VA_ARGS__); })
  return form == kPlain  ? LX_TEST_MAKE(char, , p)
         : form == kEx   ? LX_TEST_MAKE(char, Ex, p, state)
         : form == kWide ? LX_TEST_MAKE(LXWChar, W, p)
                         : LX_TEST_MAKE(LXUChar, U, p);
}

/// What was read, and the units before the end.
struct Read {
  double value;
  size_t end;
};
template <class Unit, class Parse>
Read parse(LXLocale* locale, const Text<Unit>& text, Parse parse_text) {
  const std::vector<Unit> exact(text.begin(), text.end());
  const Unit* end = exact.data();
  const double value = parse_text(exact.data(), count_of(exact), &end);
  return {value, decode(locale, text.substr(0, static_cast<size_t>(end - exact.data()))).size()};
}
/// Reads from a buffer of the exact size; an integer where there is a base.
Read read(LXLocale* locale, const Units& text, Form form, int32_t base, uint32_t flags) {
#define LX_TEST_PARSE(UNIT, SUFFIX, ...)                                                            \
  parse<UNIT>(locale, encode<UNIT>(locale, text), [&](const UNIT* p, int32_t n, const UNIT** end) { \
    return base >= 0 ? double(LXStringToLong##SUFFIX(locale, __VA_ARGS__, n, end, base, flags))     \
                     : LXStringToDouble##SUFFIX(locale, __VA_ARGS__, n, end, flags);                \
  })
  return form == kPlain  ? LX_TEST_PARSE(char, , p)
         : form == kEx   ? LX_TEST_PARSE(char, Ex, p, 0)
         : form == kWide ? LX_TEST_PARSE(LXWChar, W, p)
                         : LX_TEST_PARSE(LXUChar, U, p);
}
constexpr int32_t kReadDouble = -1;  // no base

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
  ASSERT_EQ(LXSetLocaleTextInfoU(locale, item, reinterpret_cast<const LXUChar*>(text.c_str()), -1, 0), 1);
}
void apply(LXLocale* locale, const Style& s) {
  for (int32_t decimal : {LX_ITEM_DECIMAL, LX_ITEM_MONETARY_DECIMAL}) {
    set_text(locale, decimal, u"a");  // the two separators differ at any moment
    set_text(locale, decimal + 1, units({s.thousands}));
    set_text(locale, decimal, units({s.decimal}));
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

class NumberTest : public ::testing::Test {
 protected:
  NumberTest() : library(codepages()), ascii(library.locale(tiny_single())) {}
  static std::vector<TinyCodepage> codepages() {
    return {tiny_single(), tiny_shift_jis(), tiny_four(),
            tiny_money(),  tiny_utf8(),      CodepageBuilder(367, "US-ASCII", 1).ascii().build()};
  }
  /// Calls `body` with a locale and a form of each codepage; the plain form does not write shift bytes.
  template <class Body>
  void everywhere(Body body) {
    for (const TinyCodepage& codepage : codepages())
      for (Form form : {kPlain, kEx, kWide, kUnicode}) {
        SCOPED_TRACE(codepage.file.name + " " + std::to_string(form));
        if (form != kPlain || !codepage.shift) body(library.locale(codepage), form);
      }
  }
  void apply_everywhere(const Style& style) {
    for (const TinyCodepage& codepage : codepages()) apply(library.locale(codepage), style);
  }
  Units plain(const Value& value) { return write(ascii, value, kPlain, 2000).text; }

  int any(int end) { return static_cast<int>(random() % static_cast<unsigned>(end)); }
  Style random_style() {
    static const auto groupings = words("3;0 3 3;2;0 0 ; 1;1 2;0;5 1;0 4;3 9999999999999;0");
    static const auto separators = words(".,' ,.' '., .', ,'. ',.");
    static const std::vector<Units> texts{u"$", u"", u"-", kYen, u"USD", Units(kYen) + kYen + u"k"};
    const auto pick = [&](const auto& list) { return list[random() % list.size()]; };
    const std::string two = pick(separators);
    return {two[0],      two[1],      pick(groupings), any(10), pick(texts),
            pick(texts), pick(texts), any(2),          any(2),  any(5)};
  }
  double random_double() {
    const auto bits = (uint64_t{random()} << 32) | random();
    double value;
    memcpy(&value, &bits, sizeof(value));  // any exponent, and what is not finite
    const auto integer = static_cast<double>(static_cast<int64_t>(bits) >> (bits % 60));
    const double choice[] = {value, integer / 128, integer / 100, std::ldexp(integer, -any(140))};
    return choice[any(4)];  // the second: ties of the sixth digit
  }

  TinyLibrary library;
  LXLocale* ascii;
  std::mt19937 random{2};
};

TEST_F(NumberTest, EdgesOfWriting) {
  const struct {
    Value::Kind kind;
    uint32_t flags;
    int digits;
    const char* grouping;
    const char* cases;  // value=text
  } groups[] = {
      {Value::kLong, 0, 2, "3;0", "-1234567=-1,234,567 0=0 -2147483648=-2,147,483,648 999=999"},
      {Value::kLong, LX_UNSIGNED, 2, "3;0", "-1234567=4,293,732,729"},
      {Value::kLong, 0, 2, "3", "1234567=1234,567"},
      {Value::kLong, 0, 2, "3;2;0", "123456789=12,34,56,789"},
      {Value::kLong, 0, 2, "3;x", "1234567=1234,567"},
      {Value::kLong, 0, 2, "x;3", "123456=123456"},
      {Value::kLong, 0, 2, "99999999999999999999999;1;0", "123456=123456"},
      {Value::kDouble, 0, 2, "3;0", "2.5=2.50 1.239=1.23 -0.0=0.00 -0.001=-0.00 0.9999996=1.00"},
      {Value::kDouble, 0, 2, "1;0", "-inf=-inf inf=inf -nan=nan"},
      {Value::kDouble, 0, 0, "3;0", "7=7. 1234=1,234. 0.5=0."},
      {Value::kDouble, 0, 8, "3;0", "1.1234567=1.1234500"},
      {Value::kDouble, 0, 7, "3;0", "1.1234567=1.123450"},
      {Value::kCurrency, 0, 2, "3;0", "-1234.5=($1,234.50) 1234.5=$1,234.50 -0.001=($0.00) nan=($nan)"},
      {Value::kCurrency, LX_INTERNATIONAL, 2, "3;0", "1234.5=USD1,234.50"},
  };
  Style style{'.', ',', "", 0, u"$", u"", u"-", 1, 0, 0};
  for (const auto& group : groups)
    for (const std::string& c : words(group.cases)) {
      const Value value{group.kind, std::strtod(c.c_str(), nullptr), group.flags};
      style.grouping = group.grouping;
      style.digits = group.digits;
      style.position = value.number >= 0 ? 3 : 0;
      apply(ascii, style);
      EXPECT_EQ(plain(value), units(c.substr(c.find('=') + 1)));
    }
  style.space = 1;
  style.symbol = u"";
  apply(ascii, style);
  EXPECT_EQ(plain({Value::kCurrency, -1}), u"- 1.00");
  EXPECT_EQ(plain({Value::kCurrency, -1, LX_TERRITORY_VALUES}), u"($1.00)");
  LXSetLocaleNumInfo(ascii, LX_ITEM_DIGITS, 65535);
  EXPECT_EQ(write(ascii, {Value::kDouble, -DBL_MAX}, kPlain, 70000).units, 1u + 309 + 102 + 1 + 65534);
}

TEST_F(NumberTest, FlagsAndSmallSizes) {
  const Made cut = write(ascii, {Value::kLong, -12345}, kPlain, 3);
  EXPECT_EQ(cut.text, u"-12");
  EXPECT_EQ(cut.code, LX_E_SIZE);
  for (const auto& [kind, allowed] :
       {std::pair(Value::kLong, 0x4089u), {Value::kDouble, 0x4009u}, {Value::kCurrency, 0x4049u}}) {
    for (uint32_t bit = 1; bit != 0; bit <<= 1) {
      const bool good = (allowed & bit) != 0;
      const Value value{kind, 5, bit};
      const Made nothing = write(ascii, value, kPlain, 0);
      EXPECT_EQ(nothing.result, good ? 0 : -1) << bit;
      EXPECT_EQ(nothing.code, good ? LX_E_SIZE : LX_E_INVALID) << bit;
    }
    const Made only_null = write(ascii, {kind, 5}, kUnicode, 1, LX_TERMINATE | LX_CHARACTERS);
    EXPECT_EQ(only_null.result, 1);
    EXPECT_EQ(only_null.code, LX_E_SIZE);
  }
  library.close();
  char untouched = 'u';
  EXPECT_EQ(LXLongToString(ascii, 5, &untouched, 1, 0), -1);
  EXPECT_EQ(LXStringToLong(ascii, "5", -1, nullptr, 10, 0), 0);
  EXPECT_EQ(untouched, 'u');
}

TEST_F(NumberTest, DigitsAreThoseOfThePrintfConversion) {
  Style style;
  for (int i = 0; i < 40000; ++i) {
    if (i % 1000 == 0) apply(ascii, style = random_style());
    const double value = random_double();
    const Units expected = std::isnan(value) ? u"nan" : model(value, style);
    other_decimal_point = i % 2 != 0;
    const Units text = plain({Value::kDouble, value});
    other_decimal_point = false;
    ASSERT_EQ(text, expected) << value;
  }
}

TEST_F(NumberTest, AllFormsWriteAndReadTheSameCharacters) {
  LXLocale* const shift = library.locale(tiny_money());
  for (int i = 0; i < 300; ++i) {
    const Style style = random_style();
    apply_everywhere(style);
    const auto kind = static_cast<Value::Kind>(any(3));
    const bool money = kind == Value::kCurrency;
    const uint32_t values = any(4) == 0 ? LX_TERRITORY_VALUES : 0;
    const double last_digit = std::pow(10, -(values != 0 ? 2 : std::min(style.digits, 5)));
    const Value value{kind, kind == Value::kLong ? double(int32_t(random())) : random_double(), values};
    const Units whole = write(ascii, value, kUnicode, 2000).text;
    const int32_t size = 1 + any(count_of(whole) + 9);
    const uint32_t flags = any(2) == 0 ? 0 : LX_TERMINATE;
    const size_t room = static_cast<size_t>(size) - (flags != 0 ? 1 : 0);
    const Units part = whole.substr(0, room);
    everywhere([&](LXLocale* locale, Form form) {
      if (form != kUnicode && decode(locale, encode<LXWChar>(locale, whole)) != whole)
        return;  // not in the codepage
      for (LXShiftState state = 0; state <= (form == kEx && locale == shift ? 1 : 0); ++state) {
        EXPECT_EQ(write(locale, value, form, 4000, 0, state).text, whole);
        if (!money && std::isfinite(value.number)) {
          const Read back = read(locale, whole, form, kind == Value::kLong ? 10 : kReadDouble, values);
          EXPECT_EQ(back.end, whole.size());
          EXPECT_NEAR(back.value, value.number, last_digit + std::fabs(value.number) * 1e-14);
        }
        // Whole characters, as many as fit with their shift bytes.
        const Made made = write(locale, value, form, size, flags, state);
        const Units fitted = form == kPlain || form == kEx ? whole.substr(0, made.text.size()) : part;
        EXPECT_EQ(made.text, fitted);
        EXPECT_EQ(made.code, fitted == whole ? LX_OK : LX_E_SIZE);
        EXPECT_EQ(static_cast<size_t>(made.result), made.units + (flags != 0 ? 1 : 0));
        EXPECT_TRUE(fitted == whole || room - made.units < 4);
        const Made chars = write(locale, value, form, size, flags | LX_CHARACTERS, state);
        if (!money || whole.size() < 14) {
          EXPECT_EQ(chars.text, money && size < 2 ? whole.substr(0, room) : part);
          EXPECT_EQ(chars.result, count_of(part) + (flags != 0 ? 1 : 0));
        }
      }
    });
  }
}

TEST_F(NumberTest, SignsAndSymbolsStandWhereTheItemsSay) {
  // By sign position, each: symbol behind, symbol before, and both with a space.
  const char* const texts[] = {"(1.5USD) (USD1.5) (1.5_USD) (USD_1.5)", "CR1.5USD CRUSD1.5 CR1.5_USD CRUSD_1.5",
                               "1.5USDCR USD1.5CR 1.5_USDCR USD_1.5CR", "1.5CRUSD CRUSD1.5 1.5_CRUSD CRUSD_1.5",
                               "1.5USDCR USDCR1.5 1.5_USDCR USDCR_1.5"};
  for (int position = 0; position < 5; ++position)
    for (int i = 0; i < 4; ++i) {
      apply_everywhere({'.', ',', "3;0", 1, u"USD", u"CR", u"CR", i % 2, i / 2, position});
      Units expected = units(words(texts[position])[static_cast<size_t>(i)]);
      std::replace(expected.begin(), expected.end(), u'_', u' ');
      everywhere([&](LXLocale* locale, Form form) {
        for (double value : {1.5, -1.5})
          EXPECT_EQ(write(locale, {Value::kCurrency, value}, form, 99).text, expected);
      });
    }
  LXSetLocaleNumInfo(ascii, LX_ITEM_NEGATIVE_PRECEDES, 0);
  EXPECT_EQ(plain({Value::kCurrency, -1.5}), u"1.5 USDCR");
  EXPECT_EQ(plain({Value::kCurrency, 1.5}), u"USDCR 1.5");
}

TEST_F(NumberTest, CurrencyByCharactersIsMadeInAWorkBufferAndCut) {
  apply_everywhere({'.', ',', "3;0", 2, Units(kYen) + kYen, u"", u"-", 1, 0, 1});
  const auto check = [&](const TinyCodepage& codepage, int32_t size, bool null, const Units& text, int32_t code,
                         size_t bytes) {
    const uint32_t flags = LX_CHARACTERS | (null ? LX_TERMINATE : 0);
    const Made made = write(library.locale(codepage), {Value::kCurrency, 1.5}, kEx, size, flags);
    EXPECT_EQ(made.text, text);
    EXPECT_EQ(made.units, bytes);
    EXPECT_EQ(made.result, count_of(text) + null);
    EXPECT_EQ(made.code, code) << size;
  };
  check(tiny_utf8(), 1, false, u"\u5186", LX_E_SIZE, 3);  // six bytes hold the two symbols
  check(tiny_utf8(), 2, false, u"\u5186\u5186", LX_OK, 6);
  check(tiny_utf8(), 4, true, u"\u5186\u51861", LX_OK, 7);
  check(tiny_utf8(), 50, false, u"\u5186\u51861.50", LX_OK, 10);
  check(tiny_utf8(), 1, true, u"", LX_E_SIZE, 0);
  check(tiny_money(), 1, false, u"\u5186", LX_E_SIZE, 4);  // with its Shift-In
  check(tiny_money(), 3, true, u"\u5186\u5186", LX_OK, 6);
  LXSetLocaleNumInfo(ascii, LX_ITEM_CURRENCY_DIGITS, 600);
  const Made longest = write(ascii, {Value::kCurrency, 1.5}, kPlain, 1000, LX_CHARACTERS);
  EXPECT_EQ(longest.result, 512);
  EXPECT_EQ(longest.code, LX_E_SIZE);
}

TEST_F(NumberTest, SeparatorsOfSeveralBytesAreLeftOutOfByteStrings) {
  LXLocale* const utf8 = library.locale(tiny_utf8());
  EXPECT_EQ(LXSetLocaleTextInfo(utf8, LX_ITEM_THOUSANDS, "\xC3\xA0", 2, 0), 1);  // half a character is kept
  EXPECT_EQ(write(utf8, {Value::kDouble, 1234.5}, kPlain, 99).text, u"1234.50");
  EXPECT_EQ(LXSetLocaleTextInfo(utf8, LX_ITEM_DECIMAL, "\xE3\x81\x81", 3, 0), 1);
  EXPECT_EQ(write(utf8, {Value::kDouble, 1234.5}, kPlain, 99).text, u"123450");
}

TEST_F(NumberTest, GroupingTextsAreReadOneSizeAtATime) {
  // Text, remaining; size, what then remains, the next place (-1: null, 77: as it was).
  for (const char* given :
       {"3;0 3 3 2 2", "3 1 3 0 -1", "12; 9 12 7 3", "3;0 0 -1 0 77", "3;0 1 3 0 -1", "3x 2 -1 2 77",
        ";4 2 0 2 1", "21474836470 11 2147483647 0 -1", "99999999999;1 13 2147483647 2 12"}) {
    const auto c = words(given);
    const auto check = [&](auto get, LXLocale* locale, const auto& text) {
      int32_t remaining = std::stoi(c[1]);
      const auto* const start = text.c_str();
      const auto* next = start + 77;
      EXPECT_EQ(get(locale, start, &remaining, &next), std::stoi(c[2])) << given;
      EXPECT_EQ(remaining, std::stoi(c[3])) << given;
      EXPECT_EQ(next, c[4] == "-1" ? nullptr : start + std::stoi(c[4])) << given;
    };
    for (LXLocale* locale : {ascii, library.locale(tiny_money())}) {
      check(LXStrGroupingSize, locale, encode<char>(locale, units(c[0])));
      check(LXStrGroupingSizeW, locale, encode<LXWChar>(locale, units(c[0])));
      check(LXStrGroupingSizeU, locale, encode<LXUChar>(locale, units(c[0])));
    }
  }
  int32_t remaining = 5;
  EXPECT_EQ(LXStrGroupingSize(ascii, nullptr, &remaining, nullptr), -1);
  EXPECT_EQ(LXStrGroupingSize(ascii, "", &remaining, nullptr), -1);
}

/// A case is a text, with "_" for a space and "|" where reading ends, "=" and the value.
struct Case {
  explicit Case(std::string c) {
    std::replace(c.begin(), c.end(), '_', ' ');
    end = c.find('|');
    text = units(c.substr(0, end) + c.substr(end + 1, c.rfind('=') - end - 1));
    value = std::strtod(c.c_str() + c.rfind('=') + 1, nullptr);
  }
  size_t end;
  Units text;
  double value;
};

TEST_F(NumberTest, EdgesOfReading) {
  const struct {
    int32_t base;
    uint32_t flags;
    const char* cases;
  } groups[] = {
      {0, 0, "0x1F|=31 017|=15 0x|=0 0|=0 0|8=0 -0X1f|g=-31 10|x=10"},
      {16, 0, "0X1|g=1 01f|=31 0|,1=0 0|z=0 1,F|=31"},
      {36, 0, "zZ|=1295"},
      {2, 0, "10|2=2"},
      {10, 0, "__-1,234,567|x=-1234567 5,,6,|=56 +5|=5 -|-5=0 -|_5=0 |,5=0 1|.5=1 |=0 -|=0 __|a=0 |$5=0"},
      {10, 0, "2147483648|=2147483647 -2147483648|=-2147483648 -2147483649|=-2147483648"},
      {10, 0, "99999999999,9|_=2147483647 42949672960|=2147483647"},
      {10, LX_UNSIGNED, "4294967295|=-1 4294967299|=-1 8589934592|=-1 |-5=0 3000000000|=-1294967296"},
      {10, LX_MONETARY, "|+5=0 -7|=-7 |(7)=0"},
      {kReadDouble, 0, "12.5E2|=1250 1|E5=1 1.E5|=100000 .5|=0.5 -.25|=-0.25 __+1,234.5d-1|_=123.45 1,|,2=1"},
      {kReadDouble, 0,
       "1,|.5=1 1.2|.3=1.2 .|E5=0 -|-1=0 1|_2=1 |=0 1.0E|=1 1.E4294967298|=inf 1.E-9999999999|=0"},
      {kReadDouble, 0, "1.E23|=1e23 1.E-104|=1e-104 1.E-307|=1e-307"},  // pow differs between the word sizes
      {kReadDouble, LX_MONETARY, "-12.50|=-12.5 1.5E+2|=150 |+1=0 |$1=0"},
  };
  for (const auto& group : groups)
    for (const std::string& word : words(group.cases)) {
      SCOPED_TRACE(word);
      const Case c(word);
      everywhere([&](LXLocale* locale, Form form) {
        const Read got = read(locale, c.text, form, group.base, group.flags);
        EXPECT_EQ(got.value, c.value);
        EXPECT_EQ(got.end, c.end);
      });
    }
  EXPECT_TRUE(std::isnan(LXStringToDouble(ascii, "0.E999", -1, nullptr, 0)));  // nothing times infinity
  EXPECT_TRUE(std::signbit(LXStringToDouble(ascii, "-0", -1, nullptr, 0)));
  EXPECT_EQ(LXStringToDouble(ascii, "7", -1, nullptr, LX_UNSIGNED), 0);
  EXPECT_EQ(LXGetError(ascii), LX_E_INVALID);
  for (const auto& [base, code] :
       {std::pair(-1, LX_E_BASE), {1, LX_E_BASE}, {37, LX_E_BASE}, {0, LX_E_INVALID}}) {
    EXPECT_EQ(LXStringToLong(ascii, "7", -1, nullptr, base, 0x40), 0);
    EXPECT_EQ(LXGetError(ascii), code);
  }
}

TEST_F(NumberTest, SignTextsNationalDigitsAndWhiteSpace) {
  for (LXLocale* locale : {library.locale(tiny_money()), library.locale(tiny_utf8())}) {
    set_text(locale, LX_ITEM_NEGATIVE_SIGN, Units(kYen) + u"k");
    for (Form form : {kEx, kWide, kUnicode}) {
      EXPECT_EQ(read(locale, Units(kYen) + u"k12.5E-1", form, kReadDouble, LX_MONETARY).value, -1.25);
      EXPECT_EQ(read(locale, Units(kYen) + u"12", form, 10, LX_MONETARY).end, 0u);
    }
    set_text(locale, LX_ITEM_POSITIVE_SIGN, u"1-");  // a digit that is not one in a run of digits
    for (Form form : {kEx, kWide, kUnicode})
      for (int32_t base : {10, kReadDouble}) EXPECT_EQ(read(locale, u"31-2", form, base, LX_MONETARY).end, 1u);
  }
  for (uint32_t flags : {0u, uint32_t{LX_NATIONAL_DIGITS}})
    for (const TinyCodepage& codepage : {tiny_money(), tiny_utf8()})
      for (Form form : {kEx, kWide, kUnicode}) {
        const Units text = codepage.shift ? u"\u3000\uFF11\uFF12,3\u3000" : u"\u0661\u0662,3";
        for (int32_t base : {10, kReadDouble})
          EXPECT_EQ(read(library.locale(codepage), text, form, base, flags).value, flags != 0 ? 123 : 0);
      }
  // White space goes before a separator that is white space, in what the library itself has written too.
  set_text(ascii, LX_ITEM_THOUSANDS, u"\u00A0");
  EXPECT_EQ(plain({Value::kLong, 1234}), u"1\u00A0234");
  EXPECT_EQ(read(ascii, u"1\u00A0234", kPlain, 10, 0).value, 1);
}

TEST_F(NumberTest, ClassesOfCharacters) {
  const auto get = [](LXLocale* locale, const std::string& text, int family, uint32_t mode = 0) {
    return parse<char>(locale, text, [&](const char* p, int32_t n, const char** end) {
      return LXStrGetDigit(locale, p, n, end, ",x", ".", "pos", "-", family, mode);
    });
  };
  for (const auto& word : words("9|=9 z|=35 Z|=35 pos|1=40 p|o=25 -|=41 ,|=42 .|=43 ___|7=44 |!=-1 |=-1")) {
    const Read got = get(ascii, encode<char>(ascii, Case(word).text), 1);
    EXPECT_EQ(got.value, Case(word).value) << word;
    EXPECT_EQ(got.end, Case(word).end) << word;
  }
  for (const auto& [text, value] : {std::pair("\xF7", 7), {"\xE9", 35}, {"\xA9", 35}, {"\xD1", 19}, {"1", -1}})
    EXPECT_EQ(get(ascii, text, 0).value, value);
  EXPECT_EQ(get(ascii, "1", 1, 8).value, -1);
  for (const char* text : {"\x82", "\x82\x60"})  // half a character, and one of two bytes
    EXPECT_EQ(get(library.locale(tiny_shift_jis()), text, 1).value, -1);
  EXPECT_EQ(LXStrGetDigit(ascii, "+", 1, nullptr, nullptr, nullptr, nullptr, nullptr, 1, 0), -1);
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
}

}  // namespace
}  // namespace lx::test
