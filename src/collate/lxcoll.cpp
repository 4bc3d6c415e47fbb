// Collation functions: what their options mean in each form, and how a text is given. The rule stands in
// lxcollate.h; with options, keys are compared.
#include <cstring>

#include "collate/lxcollate.h"
#include "collate/lxkey.h"
#include "core/lxcall.h"

using namespace lx;

namespace {

RAS1_Unit unit = RAS1_UNIT("lxcoll");

/// What the options mean in each form. What is left of them must be a whole fold.
///
///            refused always         drop blanks with     of full width too     reach binary order
///   plain    -                      a bit of width       always                all
///   Ex       -                      a bit of width       always                case or width, blanks
///   W        -                      LX_IGNORE_BLANKS     beside width          case, blanks
///   U        all but folds, blanks  LX_IGNORE_BLANKS     beside width          case or width, blanks
struct Rules {
  uint32_t refused;
  uint32_t blanks;
  uint32_t binary;  // without the whole of LX_WIDTH_INSENSITIVE
  uint32_t binary_width;
};
constexpr uint32_t kBlanksOfBytes = 0x1;
constexpr uint32_t kFolds = LX_WIDTH_INSENSITIVE | LX_IGNORE_BLANKS;
constexpr uint32_t kCase = LX_CASE_INSENSITIVE | LX_IGNORE_BLANKS;
constexpr Rules kPlainRules = {0, kBlanksOfBytes, ~uint32_t{LX_CHARACTERS}, ~uint32_t{LX_CHARACTERS}};
constexpr Rules kExRules = {0, kBlanksOfBytes, kCase, kFolds};
constexpr Rules kCodeRules = {0, LX_IGNORE_BLANKS, kCase, kCase};
constexpr Rules kUnicodeRules = {~kFolds, LX_IGNORE_BLANKS, kCase, kFolds};

// In binary order the result is that of comparison by code value, called as a trace shows it. It has its own
// error code, and its own rule for null-terminated texts.

int32_t compare_binary(LXLocale* locale, Form form, const Text<uint8_t>& a, const Text<uint8_t>& b,
                       uint32_t options) {
  const auto* const p = reinterpret_cast<const char*>(a.p);
  const auto* const q = reinterpret_cast<const char*>(b.p);
  return form == Form::kEx ? LXStrcmpEx(locale, p, a.state, a.length, q, b.state, b.length, options)
                           : LXStrcmp(locale, p, a.length, q, b.length, options);
}
int32_t compare_binary(LXLocale* locale, Form, const Text<LXWChar>& a, const Text<LXWChar>& b,
                       uint32_t options) {
  return LXWcscmp(locale, a.p, a.length, b.p, b.length, options);
}
int32_t compare_binary(LXLocale* locale, Form, const Text<LXUChar>& a, const Text<LXUChar>& b,
                       uint32_t options) {
  return LXStrcmpU(locale, a.p, a.length, b.p, b.length, options);
}

void ignore_blanks(LXLocale* locale, Form form, CountedText<uint8_t>* a, CountedText<uint8_t>* b, bool) {
  drop_blanks(locale, form, a, b, LX_DROP_FULL_BLANKS, true);
}
template <class Unit>
void ignore_blanks(LXLocale* locale, Form, CountedText<Unit>* a, CountedText<Unit>* b, bool width) {
  const Unit blank = blank_of(*locale);
  Unit full = blank;
  if (width) find_full_width_blank(*locale, &full);
  a->units = without_blanks(a->p, a->units, blank, full);
  b->units = without_blanks(b->p, b->units, blank, full);
}

/// Compares the keys of two texts of at most `chars1` and `chars2` characters.
template <class Cursor>
int32_t compare_keys(const Sort& sort, const Cursor& text1, size_t chars1, const Cursor& text2, size_t chars2,
                     int32_t* code) {
  const LevelSpace space(chars1, chars2);
  *code = space ? LX_OK : LX_E_MEMORY;
  if (!space) return 0;
  uint8_t* const bytes1 = space.first.as<uint8_t>();
  uint8_t* const bytes2 = space.second.as<uint8_t>();
  const Key key1(sort, text1, chars1, bytes1);
  const Key key2(sort, text2, chars2, bytes2);
  const size_t size1 = key1.bytes();
  const size_t size2 = key2.bytes();
  key1.write(bytes1);
  key2.write(bytes2);
  const int32_t difference = memcmp(bytes1, bytes2, least(size1, size2));
  return difference != 0 ? difference : (size1 > size2) - (size1 < size2);
}

/// Compares texts that begin with the same `same` units, which are whole elements.
template <class Unit>
[[gnu::noinline]] int32_t compare_behind(const LXLocale& locale, Form form, Text<Unit> text1, size_t units1,
                                         Text<Unit> text2, size_t units2, size_t same, int32_t* code) {
  const auto rest = [same](const auto& text) {
    return like(text, text.p + same, room(text.p, text.end) - same, state_at(text, LX_SHIFT_SINGLE));
  };
  return with_cursor(codepage_of(*locale.codepage), form, text1, units1, [&](const auto& in) {
    const auto other = like(in, text2.p, units2, text2.state);
    return compare_rest(sort_of(*locale.sort), in, other, rest(in), rest(other), code);
  });
}

/// The shortcut, then the rule. Shift bytes do not tell their state at a place inside a text.
template <class Unit>
[[gnu::always_inline]] inline int32_t compare_weights(const LXLocale& locale, Form form,
                                                      const Text<Unit>& text1, size_t units1,
                                                      const Text<Unit>& text2, size_t units2, int32_t* code) {
  const Sort& sort = sort_of(*locale.sort);
  size_t same = 0;
  if (sort.appends_primaries && form == Form::kPlain) {
    const Beginnings beginnings =
        compare_beginnings(codepage_of(*locale.codepage), sort, text1.p, units1, text2.p, units2);
    if (beginnings.result != 0) return beginnings.result;
    same = beginnings.same;
    if (same != 0 && same == units1 && same == units2) return 0;
  }
  return compare_behind(locale, form, text1, units1, text2, units2, same, code);
}

template <class Unit>
[[gnu::noinline]] int32_t compare_folded(const LXLocale& locale, Form form, const CountedText<Unit>& a,
                                         const CountedText<Unit>& b, Fold fold, int32_t* code) {
  const Folding folding(locale, fold);
  return with_cursor(
      codepage_of(*locale.codepage), form, Text<Unit>{a.p, 0, a.state}, a.units, [&](const auto& in) {
        using Folded = FoldCursor<std::decay_t<decltype(in)>>;
        const Sort& sort = sort_of(*locale.sort);
        const Folded text1{folding, in};
        const Folded text2{folding, like(in, b.p, b.units, b.state)};
        const int32_t result = sort.appends_primaries ? compare_primaries(sort, text1, text2) : 0;
        if (result != 0) return result;
        return compare_keys(sort, text1, folding.most_chars(a.units), text2, folding.most_chars(b.units), code);
      });
}

/// Compares as options ask, or in binary order. `*code` receives what becomes the last error.
template <class Unit>
[[gnu::noinline]] int32_t compare_with_options(LXLocale* locale, Form form, Text<Unit> text1, Text<Unit> text2,
                                               uint32_t options, const Rules& rules, int32_t* code) {
  *code = LX_E_INVALID;
  if ((options & rules.refused) != 0) return 0;
  const Codepage& cp = codepage_of(*locale->codepage);
  const bool characters = (options & LX_CHARACTERS) != 0;
  const bool width = fold_of(options) == Fold::kWidth;
  CountedText<Unit> a{text1.p, units_of(cp, text1, characters), text1.state};
  CountedText<Unit> b{text2.p, units_of(cp, text2, characters), text2.state};
  if (locale->sort == nullptr) {
    options &= width ? rules.binary_width : rules.binary;
    if (text1.length >= 0) text1.length = static_cast<int32_t>(a.units);
    if (text2.length >= 0) text2.length = static_cast<int32_t>(b.units);
    LXLocale own = own_record(*locale);
    const int32_t result = compare_binary(&own, form, text1, text2, options);
    *code = last_error_of(own);
    return result;
  }
  options &= ~uint32_t{LX_CHARACTERS};
  if ((options & rules.blanks) != 0) {
    ignore_blanks(locale, form, &a, &b, width);
    options &= ~LX_IGNORE_BLANKS;
  }
  if (!is_fold(options)) return 0;
  *code = LX_OK;
  if (options == 0) return compare_weights(*locale, form, text1, a.units, text2, b.units, code);
  return compare_folded(*locale, form, a, b, fold_of(options), code);
}

template <class Unit>
[[gnu::always_inline]] inline int32_t collate(LXLocale* given, Form form, const Text<Unit>& text1,
                                              const Text<Unit>& text2, uint32_t options, const Rules& rules) {
  Call call(unit, given);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, 0);
  int32_t code = LX_OK;
  int32_t result = 0;
  if (options == 0 && call.locale()->sort != nullptr)
    result = compare_weights(*call.locale(), form, text1, text_units(text1.p, text1.length), text2,
                             text_units(text2.p, text2.length), &code);
  else
    result = compare_with_options(call.locale(), form, text1, text2, options, rules, &code);
  return call.fail(code, result);
}

}  // namespace

bool lx::collation_is_traced() {
  return trace_level(unit) != 0;
}

extern "C" {

int32_t LXStrcoll(LXLocale* locale, const char* text1, int32_t length1, const char* text2, int32_t length2,
                  uint32_t options) {
  return collate(locale, Form::kPlain, text_of(text1, length1), text_of(text2, length2), options, kPlainRules);
}

int32_t LXStrcollEx(LXLocale* locale, const char* text1, LXShiftState state1, int32_t length1,
                    const char* text2, LXShiftState state2, int32_t length2, uint32_t options) {
  const LXLocale* used = locale_of(locale);
  if (used == nullptr || !codepage_of(*used->codepage).shift_sensitive)
    return LXStrcoll(locale, text1, length1, text2, length2, options);
  return collate(locale, Form::kEx, text_of(text1, length1, state1), text_of(text2, length2, state2), options,
                 kExRules);
}

int32_t LXWcscoll(LXLocale* locale, const LXWChar* text1, int32_t length1, const LXWChar* text2,
                  int32_t length2, uint32_t options) {
  return collate(locale, Form::kPlain, text_of(text1, length1), text_of(text2, length2), options, kCodeRules);
}

int32_t LXStrcollU(LXLocale* locale, const LXUChar* text1, int32_t length1, const LXUChar* text2,
                   int32_t length2, uint32_t options) {
  return collate(locale, Form::kPlain, text_of(text1, length1), text_of(text2, length2), options,
                 kUnicodeRules);
}

}  // extern "C"
