// Times: written by any format in exactly the room that they take, read by any format from any text, and alike in all
// forms where the codepage has the characters.
#include <cstring>

#include "fuzz.h"

namespace lx::fuzz::time {
namespace {

/// Formats that expand others are written from the start of the buffer; names and they are cut by units.
bool expands(const Units& format) {
  for (size_t i = 0; i + 1 < format.size(); ++i)
    if (format[i] == '%' &&
        units("xXcaAbBp").find(format[i + (format[i + 1] == '#' && i + 2 < format.size() ? 2 : 1)]) !=
            Units::npos)
      return true;
  return false;
}

LXTime moment(Input& in) {
  LXTime t{};
  for (int32_t* const field :
       {&t.seconds, &t.minutes, &t.hours, &t.day, &t.month, &t.year, &t.weekday, &t.day_of_year})
    *field = in.flag() ? in.byte() : in.integer();
  return t;
}
LXTime sound(LXTime t) {
  const auto within = [](int32_t* value, int32_t limit) { *value = (*value % limit + limit) % limit; };
  within(&t.seconds, 60), within(&t.minutes, 60), within(&t.hours, 24), within(&t.day, 32),
      within(&t.month, 12);
  within(&t.year, 200), within(&t.weekday, 7), within(&t.day_of_year, 366);
  return t;
}

template <class F>
Text<typename F::Unit> text_of(const F& form, LXLocale* l, const LXTime& t,
                               const Text<typename F::Unit>& format) {
  states = {};
  const Block<typename F::Unit> block(format);
  return fitted<typename F::Unit>(
      [&](auto* to, int32_t size) { return form.write_time(l, &t, to, size, block.data(), block.size(), 0u); },
      40 * format.size() + 1);
}

struct Read {
  LXTime time;
  int32_t code, chars;
};
template <class F>
Read read_back(const F& form, LXLocale* l, const Text<typename F::Unit>& text,
               const Text<typename F::Unit>& format) {
  states = {};
  const Block<typename F::Unit> given(text), by(format);
  Read read{{1, 2, 3, 4, 5, 6, 0, 8}, 0, 0};
  const int32_t units = form.read_time(l, &read.time, given.data(), given.size(), by.data(), by.size(), 0u);
  must(units >= -1 && units <= given.size(), "what is read is in the text");
  read.code = LXGetError(l);
  read.chars = units < 0 ? -1 : count_of(decode(form, l, text.substr(0, static_cast<size_t>(units))));
  return read;
}

void agree(Input& in, const Place& at, const LXTime& t) {
  LXLocale* const l = at.locale;
  const Units format = in.units(30), other = in.units(30);
  if (expands(format) || format.find(LXUChar{0}) != Units::npos) return;
  const Units text = text_of(kUnicode, l, t, format);
  const int32_t code = LXGetError(l);
  const Read own = read_back(kUnicode, l, text, format), read = read_back(kUnicode, l, other, format);
  in_all_forms([&](const auto& form) {
    using F = std::decay_t<decltype(form)>;
    // An EBCDIC codepage may have the letters of formats elsewhere: bytes are looked for where most have them.
    if ((at.shift && std::is_same_v<F, Plain>) || (!at.ascii && std::is_same_v<typename F::Unit, char>)) return;
    const auto said = encode(form, l, format), said_other = encode(form, l, other);
    if (!faithful(form, l, format, said)) return;
    const auto out = text_of(form, l, t, said);
    must(LXGetError(l) == code, "a format is good in all forms");
    must(decode(form, l, out) == text, "a time is written alike in all forms");
    const Read same = read_back(form, l, out, said);
    must(same.code == own.code && same.chars == own.chars && memcmp(&same.time, &own.time, sizeof(LXTime)) == 0,
         "what was written is read alike");
    // A text that is shorter in bytes than a character of the format ends before it, whatever it holds.
    if (!faithful(form, l, other, said_other) || said.size() != format.size()) return;
    const Read any = read_back(form, l, said_other, said);
    must(any.code == read.code && any.chars == read.chars && memcmp(&any.time, &read.time, sizeof(LXTime)) == 0,
         "any text is read alike");
  });
}

template <class F>
void call_any(Input& in, const F& form, const Place& at, const LXTime& t) {
  using Unit = typename F::Unit;
  constexpr bool kBytes = sizeof(Unit) == 1;
  LXLocale* const l = at.locale;
  const uint32_t flags =
      in.one_of({0u, uint32_t{LX_TERMINATE}, uint32_t{LX_CHARACTERS}, uint32_t{LX_TERRITORY_VALUES}, 2u});
  const bool chars = kBytes && (flags & LX_CHARACTERS) != 0;
  states = {};
  const Text<Unit> format = in.text(form, l, 30), text = in.text(form, l, 40);
  const Block<Unit> by(format), given(text);
  const auto length = [&](const Block<Unit>& block) {
    // Counted without a shift byte behind the last character, so that nothing is read behind it.
    if constexpr (kBytes)
      if (chars) return form.count(l, block.data(), block.size());
    return block.size();
  };
  const auto size = static_cast<int32_t>(in.below(80));
  const Block<Unit> out(static_cast<size_t>(size) * (chars ? 6 : 1));
  must(form.write_time(l, &t, out.data(), size, by.data(), length(by), flags) <= size,
       "a result fits its size");
  LXTime read = t;
  form.read_time(l, &read, given.data(), length(given), by.data(), length(by), flags & ~uint32_t{LX_TERMINATE});
}

}  // namespace

FUZZ_TARGET(time) {
  const Place& at = place(in);
  const bool any = in.flag();
  const LXTime t = moment(in);
  if (any) return in_all_forms([&](const auto& form) { call_any(in, form, at, t); });
  agree(in, at, sound(t));
}

}  // namespace lx::fuzz::time
