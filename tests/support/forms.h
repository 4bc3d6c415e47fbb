// The four forms of the functions that work on text, one beside the other, for tests that run one case through
// all of them; texts to and from the units of a form; and what numbers, amounts and times become.
#pragma once

#include <algorithm>
#include <cstdio>
#include <ctime>
#include <memory>
#include <string>
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

/// As the plain form, with the states of `states`.
struct Ex {
  using Unit = char;
  using Char = LXWChar;
  using In = LXLocale*;
  static constexpr const char* name = "Ex";
  static int32_t cat(In in, char* to, int32_t size, const char* t, int32_t n, uint32_t f) {
    return LXStrcatEx(in, to, states.output, size, t, states.text, n, f);
  }
  static char* chr(In in, const char* t, int32_t n, LXWChar c, uint32_t f) {
    return LXStrchrEx(in, t, states.text, n, c, &states.result, f);
  }
  static int32_t cpy(In in, char* to, int32_t size, const char* t, int32_t n, uint32_t f) {
    return LXStrcpyEx(in, to, size, t, states.text, n, &states.result, f);
  }
  template <class Result, auto kDoor>
  static Result search(In in, const char* t, int32_t n, const char* s, int32_t m, uint32_t f) {
    return kDoor(in, t, states.text, n, s, states.second, m, &states.result, f);
  }
  static constexpr auto cspn = search<int32_t, LXStrcspnEx>;
  static constexpr auto spn = search<int32_t, LXStrspnEx>;
  static constexpr auto str = search<char*, LXStrstrEx>;
  static char* tok(In in, char* t, int32_t* n, const char* s, int32_t m, char** next, uint32_t f) {
    return LXStrtokEx(in, t, &states.result, n, s, states.second, m, next, &states.token, f);
  }
  template <auto kDoor>
  static int32_t compare(In in, const char* a, int32_t n, const char* b, int32_t m, uint32_t f) {
    return kDoor(in, a, states.text, n, b, states.second, m, f);
  }
  static constexpr auto cmp = compare<LXStrcmpEx>;
  static constexpr auto coll = compare<LXStrcollEx>;
  static int32_t xfrm(In in, uint8_t* to, int32_t size, const char* t, int32_t n, uint32_t f) {
    return LXStrxfrmEx(in, to, size, t, states.text, n, f);
  }
  static int32_t next_weight(In in, const char** t, int32_t* n, uint16_t* counter, LXWeights* first,
                             LXWeights* second, uint8_t* char_class, LXUChar* ahead) {
    return LXStrGetNextWeightEx(in, t, &states.result, n, counter, first, second, char_class, ahead);
  }
  static constexpr auto map = LXMapStringEx;
  static int32_t encode(In in, char* to, int32_t size, const LXUChar* from, int32_t n, int32_t f) {
    return LXUnicodeToStringEx(in, to, states.output, size, from, n, f);
  }
  static int32_t decode(LXUChar* to, int32_t size, In in, const char* from, int32_t n, int32_t f) {
    return LXStringToUnicodeEx(to, size, in, from, states.text, n, f);
  }
  static int32_t convert(In to_l, char* to, int32_t size, In in, const char* from, int32_t n, int32_t f) {
    return LXConvertStringEx(to_l, to, states.output, size, in, from, states.text, n, f);
  }
  static constexpr auto grouping_size = LXStrGroupingSize;
  template <class Value, auto kDoor>
  static int32_t write(In in, Value value, char* to, int32_t size, uint32_t f) {
    return kDoor(in, value, to, states.output, size, f);
  }
  static constexpr auto write_long = write<int32_t, LXLongToStringEx>;
  static constexpr auto write_double = write<double, LXDoubleToStringEx>;
  static constexpr auto write_amount = write<double, LXCurrencyToStringEx>;
  static int32_t read_long(In in, const char* t, int32_t n, const char** end, int32_t base, uint32_t f) {
    return LXStringToLongEx(in, t, states.text, n, end, base, f);
  }
  static double read_double(In in, const char* t, int32_t n, const char** end, uint32_t f) {
    return LXStringToDoubleEx(in, t, states.text, n, end, f);
  }
  static int32_t write_time(In in, const LXTime* time, char* to, int32_t size, const char* by, int32_t m,
                            uint32_t f) {
    return LXTimeToStringEx(in, time, to, states.output, size, by, states.second, m, f);
  }
  static int32_t read_time(In in, LXTime* time, const char* t, int32_t n, const char* by, int32_t m,
                           uint32_t f) {
    return LXStringToTimeEx(in, time, t, states.text, n, by, states.second, m, f);
  }
  static int32_t set_item(In in, int32_t item, const char* t, int32_t n, int32_t f) {
    return LXSetLocaleTextInfoEx(in, item, t, states.text, n, f);
  }
  static int32_t get_item(In in, int32_t item, char* to, int32_t size, int32_t f) {
    return LXGetLocaleTextInfoEx(in, item, to, states.output, size, f);
  }
  static constexpr auto read_string = LXReadStringEx;
  static constexpr auto get_eol = LXGetEolEx;
  static constexpr auto put_eol = LXPutEolEx;
  static int32_t truncate(In in, char* t, int32_t size, uint32_t f) {
    return LXTruncateStringEx(in, t, states.text, size, f);
  }
  static int32_t count(In in, const char* t, int32_t n) { return LXNumCharsEx(in, t, states.text, n); }
  static char* move(In in, const char* t, int32_t n, int32_t f) {
    return LXMoveStringPointerEx(in, t, states.text, n, &states.result, f);
  }
  static char* next(In in, const char* t) { return LXNextCharEx(in, t, states.text, &states.result, 0); }
  static char* previous(In in, const char* start, const char* t) {
    return LXPrevCharEx(in, start, t, states.text, &states.result);
  }
  static LXWChar code(In in, const char* t) { return LXGetCharEx(in, t, states.text); }
  static int32_t length(In in, const char* t) { return LXByteLengthEx(in, t, states.text); }
  static int32_t valid(In in, const char* t) { return LXValidCharEx(in, t, states.text); }
  static int32_t put(In in, char* to, LXWChar c) { return LXPutCharEx(in, to, states.output, c), 0; }
  static int32_t to_codes(In in, LXWChar* to, int32_t size, const char* t, int32_t n, int32_t f) {
    return LXMbToWideEx(in, to, size, t, states.text, n, f);
  }
  static int32_t from_codes(In in, char* to, int32_t size, const LXWChar* t, int32_t n, int32_t f) {
    return LXWideToMbEx(in, to, states.output, size, t, n, f);
  }
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
  return made<LXUChar>(
      [&](LXUChar* to, int32_t size) { return LXGetLocaleTextInfoU(l, number, to, size, 0) - 1; });
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
