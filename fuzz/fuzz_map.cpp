// Case and width: what the byte forms and packed codes become is the same where the codepage has the characters, and
// 16-bit Unicode becomes what its values do one by one.
#include "fuzz.h"

namespace lx::fuzz::map {
namespace {

constexpr uint32_t kModes[] = {LX_MAP_FULL_WIDTH,   LX_MAP_HALF_WIDTH, LX_MAP_COPY,
                               LX_MAP_LOWER,        LX_MAP_UPPER,      LX_MAP_LOWER_SIMPLE,
                               LX_MAP_UPPER_SIMPLE, LX_MAP_DIGITS,     0x80000026u};
constexpr size_t kGrowth = 10;  // a byte may become two characters, with shift bytes

template <class F>
Text<typename F::Unit> mapped(const F& form, LXLocale* l, const Text<typename F::Unit>& text, uint32_t mode) {
  const Block<typename F::Unit> given(text);
  return fitted<typename F::Unit>(
      [&](auto* to, int32_t size) { return form.map(l, to, size, given.data(), given.size(), mode); },
      kGrowth * text.size() + 1);
}

void value_by_value(const Place& at, const Units& text, uint32_t mode) {
  Units expected;
  for (const LXUChar unit : text) {
    LXUChar one = unit;
    if (mode == LX_MAP_FULL_WIDTH) one = LXUnicodeToH2F(at.locale, unit);
    if (mode == LX_MAP_HALF_WIDTH) one = LXUnicodeToF2H(at.locale, unit);
    if (mode == LX_MAP_LOWER_SIMPLE) one = LXUnicodeToLower(at.locale, unit);
    if (mode == LX_MAP_UPPER_SIMPLE) one = LXUnicodeToUpper(at.locale, unit);
    expected.push_back(one);
  }
  const Units got = mapped(kUnicode, at.locale, text, mode);
  if (mode == LX_MAP_DIGITS) {
    must(got.size() == text.size(), "digits keep their number");
    for (size_t i = 0; i < text.size(); ++i)
      must(got[i] == text[i] || (got[i] >= '0' && got[i] <= '9' &&
                                 (LXGetCharTypeU(at.locale, text[i], LX_CTYPE1) & LX_C1_DIGIT) != 0),
           "digits become digits");
  } else if (mode != LX_MAP_LOWER && mode != LX_MAP_UPPER && mode != 0x80000026u) {
    must(got == expected, "a text is mapped value by value");
  }
}

void forms_agree(const Place& at, const Units& text, uint32_t mode) {
  Units first;
  bool have = false;
  const auto with = [&](const auto& form) {
    const auto said = encode(form, at.locale, text);
    if (!faithful(form, at.locale, text, said)) return;
    const Units units = decode(form, at.locale, mapped(form, at.locale, said, mode));
    if (!have) first = units, have = true;
    must(units == first, "what a text becomes is the same in all forms");
  };
  if (!at.shift) with(kPlain);
  with(kEx), with(kWide);
}

/// With a count of characters, null-terminated, in any room.
template <class F>
void call_any(Input& in, const F& form, const Place& at, uint32_t mode) {
  LXLocale* const l = at.locale;
  using Unit = typename F::Unit;
  const bool chars = in.flag();
  const auto text = in.text(form, l, 120);
  const Block<Unit> given(text + Unit{0});
  int32_t length = in.flag() ? -1 : count_of(text);
  if (sizeof(Unit) == 1 && chars && length > 0) length = length_in_chars(at.codepage, given.data(), 0, length);
  const uint32_t size = in.below(200);
  const Block<Unit> out(chars ? at.units_of_chars<Unit>(size) : size);
  const int32_t limit = static_cast<int32_t>(size);
  must(form.map(l, out.data(), limit, given.data(), length, mode | (chars ? LX_CHARACTERS : 0)) <= limit,
       "a result fits its size");
}

}  // namespace

FUZZ_TARGET(map) {
  const Place& at = place(in);
  const uint32_t mode = in.one_of(kModes);
  if (in.flag()) return in_all_forms([&](const auto& form) { call_any(in, form, at, mode); });
  const Units text = in.units(60);
  value_by_value(at, text, mode);
  if (mode != LX_MAP_DIGITS) forms_agree(at, text, mode);
}

}  // namespace lx::fuzz::map
