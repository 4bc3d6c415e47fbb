// The four forms of the functions that work on text, one beside the other, for tests that run one case through
// all of them; texts to and from the units of a form; and what numbers, amounts and times become.
#pragma once

#include <algorithm>
#include <cstdio>
#include <ctime>
#include <memory>
#include <string>
#include <tuple>
#include <utility>
#include <vector>

#include "lx.h"

namespace lx::test {

template <class Unit>
using Text = std::basic_string<Unit>;
using Units = Text<LXUChar>;

/// The shift states that functions of the Ex form are called with, of a text, a second text and an output, and
/// those that they give back: behind what was returned, and of a token.
struct ShiftStates {
  LXShiftState text = 0, second = 0, output = 0, result = 0, token = 0;
};
inline ShiftStates states;

/// The functions of a form under one name each. `STR` and `S` are what stands before and behind the name of a
/// string function, `FORM` what stands behind the name of any other; `CHAR` is a single character as an
/// argument.
#define LX_TEST_FORM(NAME, UNIT, CHAR, STR, S, FORM)             \
  using Unit = UNIT;                                             \
  using Char = CHAR;                                             \
  static constexpr const char* name = NAME;                      \
  static constexpr auto cat = STR##cat##S;                       \
  static constexpr auto chr = STR##chr##S;                       \
  static constexpr auto cpy = STR##cpy##S;                       \
  static constexpr auto cspn = STR##cspn##S;                     \
  static constexpr auto spn = STR##spn##S;                       \
  static constexpr auto str = STR##str##S;                       \
  static constexpr auto tok = STR##tok##S;                       \
  static constexpr auto cmp = STR##cmp##S;                       \
  static constexpr auto coll = STR##coll##S;                     \
  static constexpr auto xfrm = STR##xfrm##S;                     \
  static constexpr auto next_weight = LXStrGetNextWeight##FORM;  \
  static constexpr auto map = LXMapString##FORM;                 \
  static constexpr auto grouping_size = LXStrGroupingSize##FORM; \
  static constexpr auto digit = LXStrGetDigit##FORM;             \
  static constexpr auto write_long = LXLongToString##FORM;       \
  static constexpr auto write_double = LXDoubleToString##FORM;   \
  static constexpr auto write_amount = LXCurrencyToString##FORM; \
  static constexpr auto read_long = LXStringToLong##FORM;        \
  static constexpr auto read_double = LXStringToDouble##FORM;    \
  static constexpr auto write_time = LXTimeToString##FORM;       \
  static constexpr auto read_time = LXStringToTime##FORM;        \
  static constexpr auto set_item = LXSetLocaleTextInfo##FORM;    \
  static constexpr auto get_item = LXGetLocaleTextInfo##FORM;    \
  static constexpr auto read_string = LXReadString##FORM;        \
  static constexpr auto get_eol = LXGetEol##FORM;                \
  static constexpr auto put_eol = LXPutEol##FORM

struct Plain {
  LX_TEST_FORM("plain", char, LXWChar, LXStr, , );
  static constexpr auto encode = LXUnicodeToString;
  static constexpr auto decode = LXStringToUnicode;
  static constexpr auto convert = LXConvertString;
  static constexpr auto truncate = LXTruncateString;
  static constexpr auto count = LXNumChars;
  static constexpr auto move = LXMoveStringPointer;
  static constexpr auto next = LXNextChar;
  static constexpr auto previous = LXPrevChar;
  static constexpr auto code = LXGetChar;
  static constexpr auto length = LXByteLength;
  static constexpr auto valid = LXValidChar;
  static constexpr auto put = LXPutChar;
  static constexpr auto to_codes = LXMbToWide;
  static constexpr auto from_codes = LXWideToMb;
};

struct Wide {
  LX_TEST_FORM("W", LXWChar, LXWChar, LXWcs, , W);
  static constexpr auto encode = LXUnicodeToStringW;
  static constexpr auto decode = LXStringToUnicodeW;
  static constexpr auto convert = LXConvertStringW;
};

struct Unicode {
  LX_TEST_FORM("U", LXUChar, LXUChar, LXStr, U, U);
  static int32_t encode(LXLocale*, LXUChar* to, int32_t, const LXUChar* from, int32_t n, int32_t) {
    return std::copy_n(from, n, to), n;
  }
  static int32_t decode(LXUChar* to, int32_t, LXLocale*, const LXUChar* from, int32_t n, int32_t) {
    return std::copy_n(from, n, to), n;
  }
};
#undef LX_TEST_FORM

/// What stands where among the arguments of a door of the Ex form: one of the plain form's; of `states` the state of
/// the text, of a second text or of the output, or where the state behind the result or a token goes; or no flags.
struct ExPlaces {
  enum Place { A, T, S, O, R, K, Z };
};

/// A door of the Ex form that is called as the plain one.
template <auto kDoor, ExPlaces::Place... kPlaces>
class ExDoor : ExPlaces {
 public:
  template <class... Given>
  auto operator()(Given... given) const {
    return call(std::tuple(given...), std::make_index_sequence<sizeof...(kPlaces)>());
  }

 private:
  template <class Given, size_t... kAt>
  static auto call(const Given& given, std::index_sequence<kAt...>) {
    return kDoor(argument<kAt>(given)...);
  }
  template <size_t kAt, class Given>
  static auto argument(const Given& given) {
    constexpr Place place = place_of(kAt);
    if constexpr (place == A)
      return std::get<given_before(kAt)>(given);
    else if constexpr (place == R || place == K)
      return place == R ? &states.result : &states.token;
    else
      return place == T ? states.text : place == S ? states.second : place == O ? states.output : 0;
  }
  static constexpr Place place_of(size_t at) {
    constexpr Place places[] = {kPlaces...};
    return places[at];
  }
  static constexpr size_t given_before(size_t at) {
    size_t count = 0;
    for (size_t i = 0; i < at; ++i) count += place_of(i) == A;
    return count;
  }
};

struct Ex : ExPlaces {
  using Unit = char;
  using Char = LXWChar;
  static constexpr const char* name = "Ex";
  static constexpr ExDoor<LXStrcatEx, A, A, O, A, A, T, A, A> cat{};
  static constexpr ExDoor<LXStrchrEx, A, A, T, A, A, R, A> chr{};
  static constexpr ExDoor<LXStrcpyEx, A, A, A, A, T, A, R, A> cpy{};
  static constexpr ExDoor<LXStrcspnEx, A, A, T, A, A, S, A, R, A> cspn{};
  static constexpr ExDoor<LXStrspnEx, A, A, T, A, A, S, A, R, A> spn{};
  static constexpr ExDoor<LXStrstrEx, A, A, T, A, A, S, A, R, A> str{};
  static constexpr ExDoor<LXStrtokEx, A, A, R, A, A, S, A, A, K, A> tok{};
  static constexpr ExDoor<LXStrcmpEx, A, A, T, A, A, S, A, A> cmp{};
  static constexpr ExDoor<LXStrcollEx, A, A, T, A, A, S, A, A> coll{};
  static constexpr ExDoor<LXStrxfrmEx, A, A, A, A, T, A, A> xfrm{};
  static constexpr ExDoor<LXStrGetNextWeightEx, A, A, R, A, A, A, A, A, A> next_weight{};
  static constexpr auto map = LXMapStringEx;
  static constexpr ExDoor<LXUnicodeToStringEx, A, A, O, A, A, A, A> encode{};
  static constexpr ExDoor<LXStringToUnicodeEx, A, A, A, A, T, A, A> decode{};
  static constexpr ExDoor<LXConvertStringEx, A, A, O, A, A, A, T, A, A> convert{};
  static constexpr auto grouping_size = LXStrGroupingSize;
  static constexpr ExDoor<LXStrGetDigitEx, A, A, T, A, A, A, A, A, A, A, A> digit{};
  static constexpr ExDoor<LXLongToStringEx, A, A, A, O, A, A> write_long{};
  static constexpr ExDoor<LXDoubleToStringEx, A, A, A, O, A, A> write_double{};
  static constexpr ExDoor<LXCurrencyToStringEx, A, A, A, O, A, A> write_amount{};
  static constexpr ExDoor<LXStringToLongEx, A, A, T, A, A, A, A> read_long{};
  static constexpr ExDoor<LXStringToDoubleEx, A, A, T, A, A, A> read_double{};
  static constexpr ExDoor<LXTimeToStringEx, A, A, A, O, A, A, S, A, A> write_time{};
  static constexpr ExDoor<LXStringToTimeEx, A, A, A, T, A, A, S, A, A> read_time{};
  static constexpr ExDoor<LXSetLocaleTextInfoEx, A, A, A, T, A, A> set_item{};
  static constexpr ExDoor<LXGetLocaleTextInfoEx, A, A, A, O, A, A> get_item{};
  static constexpr auto read_string = LXReadStringEx;
  static constexpr auto get_eol = LXGetEolEx;
  static constexpr auto put_eol = LXPutEolEx;
  static constexpr ExDoor<LXTruncateStringEx, A, A, T, A, A> truncate{};
  static constexpr ExDoor<LXNumCharsEx, A, A, T, A> count{};
  static constexpr ExDoor<LXMoveStringPointerEx, A, A, T, A, R, A> move{};
  static constexpr ExDoor<LXNextCharEx, A, A, T, R, Z> next{};
  static constexpr ExDoor<LXPrevCharEx, A, A, A, T, R> previous{};
  static constexpr ExDoor<LXGetCharEx, A, A, T> code{};
  static constexpr ExDoor<LXByteLengthEx, A, A, T> length{};
  static constexpr ExDoor<LXValidCharEx, A, A, T> valid{};
  static constexpr ExDoor<LXPutCharEx, A, A, O, A> put{};
  static constexpr ExDoor<LXMbToWideEx, A, A, A, A, T, A, A> to_codes{};
  static constexpr ExDoor<LXWideToMbEx, A, A, O, A, A, A, A> from_codes{};
};

inline constexpr Plain kPlain;
inline constexpr Wide kWide;
inline constexpr Unicode kUnicode;
inline constexpr Ex kEx;

/// Calls `body` with each form.
template <class Body>
void in_all_forms(const Body& body) {
  body(kPlain), body(kEx), body(kWide), body(kUnicode);
}

template <class Container>
int32_t count_of(const Container& text) {
  return static_cast<int32_t>(text.size());
}

/// The characters of a text as a length in characters counts them: a shift byte on either side belongs to one, so that
/// of two side by side not the same are counted as by LXNumCharsEx.
inline int32_t length_in_chars(const LXObject* codepage, const void* text, LXShiftState state, int32_t bytes) {
  constexpr size_t kMost = 8;  // bytes that a character and its shift bytes have
  std::string padded((static_cast<size_t>(bytes) + 1) * kMost, 'x');
  std::copy_n(static_cast<const char*>(text), bytes, padded.begin());
  int32_t chars = 0;
  for (int32_t above = bytes + 1; above - chars > 1;) {
    const int32_t middle = chars + (above - chars) / 2;
    (LXCpStrCharToByteLen(codepage, padded.data(), state, middle) > bytes ? above : chars) = middle;
  }
  return chars;
}
inline Units units(const std::string& ascii) {
  return Units(ascii.begin(), ascii.end());
}
/// What `put(buffer, room)` writes.
template <class Unit, class Put>
Text<Unit> made(Put put, size_t room = 1000) {
  const std::unique_ptr<Unit[]> buffer(new Unit[room]);
  const int32_t units = put(buffer.get(), static_cast<int32_t>(room));
  return Text<Unit>(buffer.get(), static_cast<size_t>(std::max(units, 0)));
}
template <class F>
Text<typename F::Unit> encode(const F& form, LXLocale* l, const Units& text) {
  return made<typename F::Unit>(
      [&](auto* to, int32_t size) { return form.encode(l, to, size, text.data(), count_of(text), 0); },
      6 * text.size());
}
template <class F>
Units decode(const F& form, LXLocale* l, const Text<typename F::Unit>& text) {
  return made<LXUChar>(
      [&](LXUChar* to, int32_t size) { return form.decode(to, size, l, text.data(), count_of(text), 0); },
      text.size());
}
/// A text for a message.
inline std::string shown(const Units& text) {
  std::string out;
  for (LXUChar unit : text) {
    char escape[8];
    snprintf(escape, sizeof(escape), "<%x>", unsigned{unit});
    out += unit >= ' ' && unit < 0x7F ? std::string(1, static_cast<char>(unit)) : escape;
  }
  return out;
}

/// A text of a locale.
inline Units item(LXLocale* l, int32_t number) {
  constexpr size_t kMostUnits = 5000;
  return made<LXUChar>(
      [&](LXUChar* to, int32_t size) { return LXGetLocaleTextInfoU(l, number, to, size, 0) - 1; }, kMostUnits);
}

/// All that a caller can see of a locale.
inline std::string state_of(LXLocale* l) {
  std::string state;
  for (int32_t number = LX_ITEM_LANGUAGE_ID; number <= LX_ITEM_LOCALE_STRING; ++number) {
    char bytes[300] = "";
    LXGetLocaleTextInfo(l, number, bytes, sizeof(bytes), 0);
    state += std::to_string(LXGetLocaleNumInfo(l, number, 0)) + bytes + shown(item(l, number)) + '|';
  }
  return state;
}

/// What is written in all forms; `flags` go to both directions, LX_INTERNATIONAL to writing alone.
struct Value {
  enum Kind { kLong, kDouble, kAmount } kind;
  double number;
  uint32_t flags = 0;
  int32_t digits = 0;
};
/// Writes by the function of the value's kind.
template <class F>
int32_t write(const F& form, LXLocale* l, const Value& v, typename F::Unit* to, int32_t size, uint32_t flags) {
  if (v.kind == Value::kAmount) return form.write_amount(l, v.number, to, size, v.flags | flags);
  if (v.kind == Value::kDouble) return form.write_double(l, v.number, to, size, v.flags | flags);
  return form.write_long(l, static_cast<int32_t>(static_cast<int64_t>(v.number)), to, size, v.flags | flags);
}
template <class F>
Text<typename F::Unit> write(const F& form, LXLocale* l, const Value& v) {
  return made<typename F::Unit>([&](auto* to, int32_t size) { return write(form, l, v, to, size, 0); });
}
template <class F>
Text<typename F::Unit> write(const F& form, LXLocale* l, const LXTime& t,
                             const Text<typename F::Unit>& format) {
  return made<typename F::Unit>([&](auto* to, int32_t size) {
    return form.write_time(l, &t, to, size, format.data(), count_of(format), 0);
  });
}
/// The number and the place where it ends.
template <class F>
std::pair<double, ptrdiff_t> read(const F& form, LXLocale* l, const std::vector<typename F::Unit>& text,
                                  Value v, int32_t base = 10) {
  const typename F::Unit* end = nullptr;
  if (v.kind == Value::kAmount) v.flags = (v.flags & LX_TERRITORY_VALUES) | LX_MONETARY;
  if (v.kind == Value::kLong) {
    const int32_t bits = form.read_long(l, text.data(), count_of(text), &end, base, v.flags);
    v.number = (v.flags & LX_UNSIGNED) != 0 ? double(static_cast<uint32_t>(bits)) : double(bits);
  } else {
    v.number = form.read_double(l, text.data(), count_of(text), &end, v.flags);
  }
  return {v.number, end - text.data()};
}

inline LXTime fields_of(const tm& date) {
  return {date.tm_sec, date.tm_min,  date.tm_hour, date.tm_mday,
          date.tm_mon, date.tm_year, date.tm_wday, date.tm_yday};
}

}  // namespace lx::test
