// The four forms of the functions that write and read numbers, amounts and times, one beside the other, for
// tests that run one case through all of them.
#pragma once

#include <algorithm>
#include <cstdio>
#include <ctime>
#include <string>
#include <utility>
#include <vector>

#include "lx.h"

namespace lx::test {

template <class Unit>
using Text = std::basic_string<Unit>;
using Units = Text<LXUChar>;

inline Units units(const std::string& ascii) {
  return Units(ascii.begin(), ascii.end());
}
/// The functions of a form; those with shift states begin in the single-byte state.
template <class U>
struct Form {
  using Unit = U;
  const char* name;
  int32_t (*encode)(LXLocale*, Unit*, int32_t, const LXUChar*, int32_t, int32_t);
  int32_t (*decode)(LXUChar*, int32_t, LXLocale*, const Unit*, int32_t, int32_t);
  int32_t (*write_long)(LXLocale*, int32_t, Unit*, int32_t, uint32_t);
  int32_t (*write_double)(LXLocale*, double, Unit*, int32_t, uint32_t);
  int32_t (*write_amount)(LXLocale*, double, Unit*, int32_t, uint32_t);
  int32_t (*read_long)(LXLocale*, const Unit*, int32_t, const Unit**, int32_t, uint32_t);
  double (*read_double)(LXLocale*, const Unit*, int32_t, const Unit**, uint32_t);
  int32_t (*write_time)(LXLocale*, const LXTime*, Unit*, int32_t, const Unit*, int32_t, uint32_t);
  int32_t (*read_time)(LXLocale*, LXTime*, const Unit*, int32_t, const Unit*, int32_t, uint32_t);
};
inline constexpr auto kCopy = [](auto* to, auto* from, int32_t n) { return std::copy_n(from, n, to), n; };
inline constexpr Form<char> kPlain{"plain",          LXUnicodeToString,  LXStringToUnicode, LXLongToString,
                                   LXDoubleToString, LXCurrencyToString, LXStringToLong,    LXStringToDouble,
                                   LXTimeToString,   LXStringToTime};
inline constexpr Form<LXWChar> kWide{"W",
                                     LXUnicodeToStringW,
                                     LXStringToUnicodeW,
                                     LXLongToStringW,
                                     LXDoubleToStringW,
                                     LXCurrencyToStringW,
                                     LXStringToLongW,
                                     LXStringToDoubleW,
                                     LXTimeToStringW,
                                     LXStringToTimeW};
inline constexpr Form<LXUChar> kUnicode{
    "U",
    [](LXLocale*, auto* to, int32_t, auto* from, int32_t n, int32_t) { return kCopy(to, from, n); },
    [](auto* to, int32_t, LXLocale*, auto* from, int32_t n, int32_t) { return kCopy(to, from, n); },
    LXLongToStringU,
    LXDoubleToStringU,
    LXCurrencyToStringU,
    LXStringToLongU,
    LXStringToDoubleU,
    LXTimeToStringU,
    LXStringToTimeU};
inline constexpr Form<char> kEx{
    "Ex",
    [](auto* l, auto* to, auto size, auto* p, auto n, auto f) {
      return LXUnicodeToStringEx(l, to, 0, size, p, n, f);
    },
    [](auto* to, auto size, auto* l, auto* p, auto n, auto f) {
      return LXStringToUnicodeEx(to, size, l, p, 0, n, f);
    },
    [](auto* l, auto value, auto* to, auto size, auto f) { return LXLongToStringEx(l, value, to, 0, size, f); },
    [](auto* l, auto value, auto* to, auto size, auto f) {
      return LXDoubleToStringEx(l, value, to, 0, size, f);
    },
    [](auto* l, auto value, auto* to, auto size, auto f) {
      return LXCurrencyToStringEx(l, value, to, 0, size, f);
    },
    [](auto* l, auto* p, auto n, auto** end, auto base, auto f) {
      return LXStringToLongEx(l, p, 0, n, end, base, f);
    },
    [](auto* l, auto* p, auto n, auto** end, auto f) { return LXStringToDoubleEx(l, p, 0, n, end, f); },
    [](auto* l, auto* time, auto* to, auto size, auto* format, auto n, auto f) {
      return LXTimeToStringEx(l, time, to, 0, size, format, 0, n, f);
    },
    [](auto* l, auto* time, auto* p, auto n, auto* format, auto m, auto f) {
      return LXStringToTimeEx(l, time, p, 0, n, format, 0, m, f);
    }};

template <class Unit>
int32_t count_of(const Text<Unit>& text) {
  return static_cast<int32_t>(text.size());
}
/// What `put(buffer, room)` writes.
template <class Unit, class Put>
Text<Unit> made(Put put) {
  Unit buffer[4000];
  return Text<Unit>(buffer, static_cast<size_t>(std::max(put(buffer, 4000), 0)));
}
template <class Unit>
Text<Unit> encode(const Form<Unit>& form, LXLocale* l, const Units& text) {
  return made<Unit>(
      [&](Unit* to, int32_t size) { return form.encode(l, to, size, text.data(), count_of(text), 0); });
}
template <class Unit>
Units decode(const Form<Unit>& form, LXLocale* l, const Text<Unit>& text) {
  return made<LXUChar>(
      [&](LXUChar* to, int32_t size) { return form.decode(to, size, l, text.data(), count_of(text), 0); });
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
  uint32_t flags;
  int32_t digits;
};
template <class Unit>
Text<Unit> write(const Form<Unit>& form, LXLocale* l, const Value& v) {
  return made<Unit>([&](Unit* to, int32_t size) {
    if (v.kind != Value::kLong)
      return (v.kind == Value::kAmount ? form.write_amount : form.write_double)(l, v.number, to, size, v.flags);
    return form.write_long(l, static_cast<int32_t>(static_cast<int64_t>(v.number)), to, size, v.flags);
  });
}
template <class Unit>
Text<Unit> write(const Form<Unit>& form, LXLocale* l, const LXTime& t, const Text<Unit>& format) {
  return made<Unit>([&](Unit* to, int32_t size) {
    return form.write_time(l, &t, to, size, format.data(), count_of(format), 0);
  });
}
/// The number and the place where it ends.
template <class Unit>
std::pair<double, ptrdiff_t> read(const Form<Unit>& form, LXLocale* l, const std::vector<Unit>& text, Value v) {
  const auto length = static_cast<int32_t>(text.size());
  const Unit* end = nullptr;
  if (v.kind == Value::kAmount) v.flags = (v.flags & LX_TERRITORY_VALUES) | LX_MONETARY;
  if (v.kind == Value::kLong) {
    const int32_t bits = form.read_long(l, text.data(), length, &end, 10, v.flags);
    v.number = (v.flags & LX_UNSIGNED) != 0 ? double(static_cast<uint32_t>(bits)) : double(bits);
  } else {
    v.number = form.read_double(l, text.data(), length, &end, v.flags);
  }
  return {v.number, end - text.data()};
}

inline LXTime fields_of(const tm& date) {
  return {date.tm_sec, date.tm_min,  date.tm_hour, date.tm_mday,
          date.tm_mon, date.tm_year, date.tm_wday, date.tm_yday};
}

}  // namespace lx::test
