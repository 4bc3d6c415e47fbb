// Numbers and amounts: written alike in all forms and in exactly the room that they take, read back as they were, and of
// any text the same is read in all forms.
#include <cmath>
#include <cstring>

#include "fuzz.h"

namespace lx::fuzz::number {
namespace {

constexpr int32_t kSeparators[] = {LX_ITEM_DECIMAL, LX_ITEM_THOUSANDS, LX_ITEM_MONETARY_DECIMAL,
                                   LX_ITEM_MONETARY_THOUSANDS};
constexpr int32_t kTexts[] = {LX_ITEM_POSITIVE_SIGN, LX_ITEM_NEGATIVE_SIGN, LX_ITEM_CURRENCY,
                              LX_ITEM_INTERNATIONAL_CURRENCY};

Units byte_item(LXLocale* l, int32_t number) {
  const auto bytes =
      made<char>([&](char* to, int32_t size) { return LXGetLocaleTextInfoEx(l, number, to, 0, size, 0) - 1; });
  return decode(kEx, l, bytes);
}
/// Separators without a single byte are left out of byte strings, and texts say what the codepage has.
bool has_all(LXLocale* l) {
  const auto said = [&](int32_t number) { return byte_item(l, number) == item(l, number); };
  return std::all_of(std::begin(kSeparators), std::end(kSeparators), said) &&
         std::all_of(std::begin(kTexts), std::end(kTexts), said);
}

Value value(Input& in) {
  Value v{};
  v.kind = static_cast<Value::Kind>(in.below(3));
  const uint64_t bits = in.number(8);
  if (v.kind == Value::kLong)
    v.number = static_cast<double>(static_cast<int32_t>(bits));
  else if (in.flag())
    v.number = static_cast<double>(static_cast<int64_t>(bits)) / 1e6;
  else
    memcpy(&v.number, &bits, sizeof(bits));
  v.flags = in.flag() ? uint32_t{LX_TERRITORY_VALUES} : 0;
  if (v.kind == Value::kAmount && in.flag()) v.flags |= LX_INTERNATIONAL;
  if (v.kind == Value::kLong && in.flag()) v.flags |= LX_UNSIGNED;
  return v;
}

template <class F>
Text<typename F::Unit> text_of(const F& form, LXLocale* l, const Value& v) {
  states = {};
  return fitted<typename F::Unit>([&](auto* to, int32_t size) { return write(form, l, v, to, size, 0); }, 1000);
}

void write_and_read(const Place& at, const Value& v) {
  LXLocale* const l = at.locale;
  const auto bytes = text_of(kEx, l, v);
  const auto codes = text_of(kWide, l, v);
  const auto units = text_of(kUnicode, l, v);
  if (!at.shift) must(text_of(kPlain, l, v) == bytes, "without shift bytes the forms are one");
  if (v.flags & LX_TERRITORY_VALUES || !has_all(l)) return;
  must(decode(kWide, l, codes) == units, "codes say what units do");
  must(decode(kEx, l, bytes) == units, "so do bytes");
  const Units thousands = item(l, LX_ITEM_THOUSANDS);
  const bool spaced = !thousands.empty() && (LXGetCharTypeU(l, thousands[0], LX_CTYPE1) & LX_C1_SPACE) != 0;
  if (v.kind != Value::kLong || spaced) return;
  const double expected =
      (v.flags & LX_UNSIGNED) != 0 ? static_cast<uint32_t>(static_cast<int64_t>(v.number)) : v.number;
  in_all_forms([&](const auto& form) {
    using F = std::decay_t<decltype(form)>;
    const auto text = text_of(form, l, v);
    const auto got = read(form, l, std::vector<typename F::Unit>(text.begin(), text.end()), v);
    must(got.first == expected && got.second == count_of(text), "an integer comes back");
  });
}

bool same_number(double a, double b) {
  return a == b || (std::isnan(a) && std::isnan(b));
}

void read_any(Input& in, const Place& at) {
  static constexpr uint32_t kFlags[] = {0, LX_NATIONAL_DIGITS, LX_MONETARY, LX_TERRITORY_VALUES, LX_UNSIGNED};
  LXLocale* const l = at.locale;
  const uint32_t flags = in.one_of(kFlags);
  const auto base = static_cast<int32_t>(in.below(38));
  const bool whole = in.flag();
  const Units text = in.units(40);
  // In EBCDIC letters are looked for where most codepages have them: there are codepages that have others.
  const bool letters = !whole || base != 10;
  const bool compare = (at.ascii || !letters) && has_all(l) && flags != LX_TERRITORY_VALUES &&
                       text.find(LXUChar{0}) == Units::npos;
  double first = 0;
  int32_t first_end = -1;
  in_all_forms([&](const auto& form) {
    using F = std::decay_t<decltype(form)>;
    using Unit = typename F::Unit;
    const auto said = compare ? encode(form, l, text) : in.text(form, l, 40);
    const Block<Unit> block(said);
    const Unit* end = nullptr;
    states = {};
    const double number =
        whole ? form.read_long(l, block.data(), block.size(), &end, base, flags)
              : form.read_double(l, block.data(), block.size(), &end, flags & ~uint32_t{LX_UNSIGNED});
    must(block.has(end), "a number ends in the text");
    if (!compare || (at.shift && std::is_same_v<F, Plain>) || !faithful(form, l, text, said)) return;
    const int32_t chars = count_of(decode(form, l, said.substr(0, static_cast<size_t>(end - block.data()))));
    if (first_end < 0) first = number, first_end = chars;
    must(same_number(number, first), "a number is read alike in all forms");
    must(chars == first_end, "up to the same character");
  });
}

void parts(Input& in, const Place& at) {
  LXLocale* const l = at.locale;
  const bool ascii = in.flag();
  const uint32_t mode = in.one_of({0u, uint32_t{LX_NATIONAL_DIGITS}, 1u});
  in_all_forms([&](const auto& form) {
    using F = std::decay_t<decltype(form)>;
    using Unit = typename F::Unit;
    const Block<Unit> text(in.text(form, l, 8));
    const Unit thousands[] = {static_cast<Unit>(in.byte()), 0}, decimal[] = {static_cast<Unit>(in.byte()), 0};
    const Text<Unit> sign = in.text(form, l, 3);
    const Unit* next = text.data();
    states = {};
    const int32_t found = form.digit(l, text.data(), text.size(), &next, thousands, decimal, sign.c_str(),
                                     thousands, ascii, mode);
    must(found >= -1 && found <= LX_CLASS_SPACE && text.has(next), "a class has its place");
    const Text<Unit> grouping = in.text(form, l, 12);
    const Block<Unit> sizes(grouping);
    int32_t left = sizes.size();
    const Unit* at_size = sizes.data();
    while (left > 0 && at_size != nullptr) {
      const Unit* const from = at_size;
      if (form.grouping_size(l, from, &left, &at_size) < 0) break;
      must(at_size == nullptr || sizes.has(at_size), "a size ends in its text");
      if (at_size != nullptr) left = static_cast<int32_t>(sizes.end() - at_size);
    }
  });
  double number = 0;
  int32_t sign = 1, fraction = 0, exponent_sign = 1, exponent = 0;
  for (int32_t state = 0; state >= 0 && in.left() != 0;)
    state = LXStrDoubleNextState(state, static_cast<int32_t>(in.below(46)) - 1, &number, &sign, &fraction,
                                 &exponent_sign, &exponent);
}

/// By characters, and into any room.
template <class F>
void call_any(Input& in, const F& form, const Place& at, const Value& v) {
  const uint32_t flags =
      in.one_of({uint32_t{LX_TERMINATE}, uint32_t{LX_CHARACTERS}, uint32_t{LX_CHARACTERS | LX_TERMINATE}, 2u});
  const auto size = static_cast<int32_t>(in.below(40));
  const Block<typename F::Unit> out(static_cast<size_t>(size) * (sizeof(typename F::Unit) == 1 ? 6 : 1));
  states = {};
  if (at.shift) states.output = in.below(2);
  must(write(form, at.locale, v, out.data(), size, flags) <= size, "a result fits its size");
}

}  // namespace

FUZZ_TARGET(number) {
  const Place& at = place(in);
  const Value v = value(in);
  const uint32_t kind = in.below(4);
  if (kind == 0) write_and_read(at, v);
  if (kind == 1) read_any(in, at);
  if (kind == 2) parts(in, at);
  if (kind == 3) in_all_forms([&](const auto& form) { call_any(in, form, at, v); });
}

}  // namespace lx::fuzz::number
