// Comparison of two strings by code value, in all forms, optionally without letter case, width or trailing
// blanks. Where a unit is a character, one loop compares; byte texts whose characters have lengths are walked.
// The results are real differences: of bytes, of characters' lengths, or of what the texts are long.
#include <string.h>

#include "core/lxcall.h"
#include "core/lxmemory.h"
#include "text/lxcomparechars.h"

using namespace lx;

namespace {

RAS1_Unit unit = RAS1_UNIT("lxcompare");

bool is_known(uint32_t options) {
  return (options & ~(LX_WIDTH_INSENSITIVE | LX_IGNORE_BLANKS | uint32_t{LX_CHARACTERS})) == 0;
}

template <class Unit>
int32_t length_difference(const CountedText<Unit>& a, const CountedText<Unit>& b) {
  return difference(static_cast<int64_t>(a.units), static_cast<int64_t>(b.units));
}

// What a unit counts as. kTable: as cheap to tell as whether two units are equal. kSign: the result is +1 or
// -1.

struct Exact {
  static constexpr bool kTable = true;
  static constexpr bool kSign = false;
  template <class Unit>
  Unit operator()(Unit u) const {
    return u;
  }
};

struct ByteCase {
  static constexpr bool kTable = true;
  static constexpr bool kSign = false;
  const uint8_t* table;
  uint8_t operator()(uint8_t byte) const { return table[byte]; }
};

struct CodeCase {
  static constexpr bool kTable = false;
  static constexpr bool kSign = false;
  const Codepage& cp;
  LXWChar operator()(LXWChar code) const { return small_letter(cp, code); }
};

struct UnicodeFold {
  static constexpr bool kTable = false;
  static constexpr bool kSign = true;
  const Codepage& cp;
  bool upper;  // else half width
  LXUChar operator()(LXUChar u) const { return upper ? capital(cp, u) : half_width(cp, u); }
};

/// Compares unit by unit, then the lengths. Behind a difference some units are folded without asking first how
/// many are the same: where one letter is in the other case, the next one often is.
template <class Unit, class Folding>
int32_t compare_units(const CountedText<Unit>& a, const CountedText<Unit>& b, const Folding& fold) {
  const size_t n = least(a.units, b.units);
  for (size_t i = 0;;) {
    i += equal_units(a.p + i, n - i, b.p + i, n - i);
    if (i == n) return length_difference(a, b);
    for (const size_t stop = i + least(n - i, kBlock); i < stop; ++i) {
      if (!Folding::kTable && a.p[i] == b.p[i]) continue;
      const Unit x = fold(a.p[i]);
      const Unit y = fold(b.p[i]);
      if (x != y) return Folding::kSign ? (x < y ? -1 : 1) : difference(x, y);
    }
  }
}

// Comparison of the texts in upper case, where the language has special mappings: by LXMapString and its forms,
// as a trace shows it.

bool has_special_upper(const LXLocale& locale) {
  return specials_of(*locale.language, true).count != 0;
}

/// Room for a text in upper case, in units. Packed codes and Unicode do not grow: what more a special mapping
/// gives is cut, and callers rely on the order that this makes.
template <class Unit>
int32_t upper_units(const CountedText<Unit>& text) {
  return static_cast<int32_t>(text.units);
}
int32_t upper_units(const CountedText<uint8_t>& text) {
  constexpr uint64_t kGrowth = 8;
  const uint64_t bytes = kGrowth * text.units;
  return bytes < INT32_MAX ? static_cast<int32_t>(bytes) : INT32_MAX;
}

/// Room for a copy of the input behind the output: mapping begins in the single-byte state, so that a text in
/// the double-byte state is given with a Shift-Out in front.
template <class Unit>
size_t copy_units(const CountedText<Unit>&) {
  return 0;
}
size_t copy_units(const CountedText<uint8_t>& text) {
  return text.state == LX_SHIFT_DOUBLE ? 1 + text.units : 0;
}

/// The text in upper case, in big-endian order: its bytes order as its values do, as far as these have 16 bits.
template <class Unit>
CountedText<Unit> upper(LXLocale* locale, Form, const CountedText<Unit>& text, Unit* out) {
  constexpr auto kMap = [] {
    if constexpr (sizeof(Unit) == sizeof(LXWChar))
      return LXMapStringW;
    else
      return LXMapStringU;
  }();
  const int32_t units =
      kMap(locale, out, upper_units(text), text.p, static_cast<int32_t>(text.units), LX_MAP_UPPER);
  LXStrBigEndian(reinterpret_cast<char*>(out), units * static_cast<int32_t>(sizeof(Unit)));
  return {out, static_cast<size_t>(units)};
}
CountedText<uint8_t> upper(LXLocale* locale, Form form, const CountedText<uint8_t>& text, uint8_t* out) {
  const int32_t size = upper_units(text);
  char* const mapped = reinterpret_cast<char*>(out);
  const char* input = reinterpret_cast<const char*>(text.p);
  const int32_t bytes = static_cast<int32_t>(text.units);
  if (text.state != LX_SHIFT_DOUBLE) {
    const auto map = form == Form::kEx ? LXMapStringEx : LXMapString;
    return {out, static_cast<size_t>(map(locale, mapped, size, input, bytes, LX_MAP_UPPER))};
  }
  char* const copy = mapped + size;
  copy[0] = static_cast<char>(codepage_of(*locale->codepage).shift_out);
  memcpy(copy + 1, input, text.units);
  const int32_t written = LXMapStringEx(locale, mapped, size, copy, bytes + 1, LX_MAP_UPPER);
  const bool shifted = written > 0 && mapped[0] == copy[0];
  return {out + shifted, static_cast<size_t>(written - shifted)};
}

template <class Unit>
int32_t compare_mapped(Call& call, Form form, const CountedText<Unit>& a, const CountedText<Unit>& b) {
  // Functions that map and swap count in 32 bits, bytes too.
  constexpr size_t kMostUnits = INT32_MAX / sizeof(Unit) - 1;
  if (a.units > kMostUnits || b.units > kMostUnits) return call.fail(LX_E_MEMORY, 0);
  const auto bytes_for = [](const CountedText<Unit>& text) {
    return (static_cast<size_t>(upper_units(text)) + copy_units(text)) * sizeof(Unit);
  };
  const WorkBuffer a_buffer(bytes_for(a));
  const WorkBuffer b_buffer(bytes_for(b));
  if (!a_buffer || !b_buffer) return call.fail(LX_E_MEMORY, 0);
  const CountedText<Unit> x = upper(call.locale(), form, a, a_buffer.as<Unit>());
  const CountedText<Unit> y = upper(call.locale(), form, b, b_buffer.as<Unit>());
  const size_t bytes = least(x.units, y.units) * sizeof(Unit);
  const int32_t result =
      compare_units(CountedText<uint8_t>{reinterpret_cast<const uint8_t*>(x.p), bytes},
                    CountedText<uint8_t>{reinterpret_cast<const uint8_t*>(y.p), bytes}, Exact{});
  return call.exit(result != 0 ? result : length_difference(x, y));
}

// Byte texts.

/// How much of a shift-stateful text ends on a character, shift bytes behind the last one included.
size_t adjust_length(const Codepage& cp, const uint8_t* text, LXShiftState state, size_t length) {
  const uint8_t* p = text;
  const uint8_t* const end = text + length;
  while (p < end) {
    if (take_shift(cp, &p, &state) && p == end) break;
    if (cp.width_in(state) > end - p) break;
    p += cp.width_in(state);
  }
  return static_cast<size_t>(p - text);
}

CountedText<uint8_t> byte_text(const Codepage& cp, Form form, const char* given, LXShiftState given_state,
                               int32_t length, bool characters) {
  const uint8_t* const p = bytes_of(given);
  const bool shift = form == Form::kEx;
  const LXShiftState state = shift && given_state != LX_SHIFT_SINGLE ? LX_SHIFT_DOUBLE : LX_SHIFT_SINGLE;
  if (length < 0) return {p, strlen(given), state};
  size_t bytes = static_cast<size_t>(length);
  if (characters) bytes = bytes_of_chars(cp, p, state, length);
  if (!shift) return {p, cp.single_byte ? bytes : whole_units(cp, p, bytes), state};
  return {p, characters ? bytes : adjust_length(cp, p, state, bytes), state};
}

void take_first_shift(const Codepage& cp, CountedText<uint8_t>* text) {
  if (text->units != 0 && take_shift(cp, &text->p, &text->state)) --text->units;
}

int32_t compare_bytes(LXLocale* given, Form form, const char* text1, LXShiftState state1, int32_t length1,
                      const char* text2, LXShiftState state2, int32_t length2, uint32_t options) {
  Call call(unit, given);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, 0);
  if (form == Form::kEx) LX_TRACE(unit, RAS1_LEVEL_INPUT, "Options = %08x", options);
  if (!is_known(options)) return call.fail(LX_E_INVALID, 0);
  const Codepage& cp = codepage_of(call.codepage());
  if (!cp.shift_sensitive) form = Form::kPlain;
  const bool characters = (options & LX_CHARACTERS) != 0;
  const Fold fold = fold_of(options);
  CountedText<uint8_t> a = byte_text(cp, form, text1, state1, length1, characters);
  CountedText<uint8_t> b = byte_text(cp, form, text2, state2, length2, characters);
  if ((options & LX_IGNORE_BLANKS) != 0)
    drop_blanks(call.locale(), form, &a, &b, fold == Fold::kWidth ? LX_DROP_FULL_BLANKS : LX_DROP_BLANKS,
                false);
  if (form == Form::kEx) {
    take_first_shift(cp, &a);
    take_first_shift(cp, &b);
    LX_TRACE(unit, RAS1_LEVEL_DETAIL, "len1 = %d, str1state = %d, len2 = %d, str2state = %d",
             static_cast<int>(a.units), static_cast<int>(a.state), static_cast<int>(b.units),
             static_cast<int>(b.state));
  }
  dump_texts(unit, a, b);
  if (a.units == 0 || b.units == 0) return call.exit(length_difference(a, b));
  if (fold == Fold::kCase && has_special_upper(*call.locale())) return compare_mapped(call, form, a, b);
  const bool single = form == Form::kPlain && cp.single_byte;
  if (fold == Fold::kNone || (single && fold == Fold::kWidth)) return call.exit(compare_units(a, b, Exact{}));
  if (single) return call.exit(compare_units(a, b, ByteCase{lower_table(cp)}));
  const auto walked = [&](auto x, auto y) {
    return call.exit(fold == Fold::kCase ? compare_case(x, y) : compare_width(unit, x, y));
  };
  if (form == Form::kEx)
    return walked(ShiftCursor{cp, a.p, a.p + a.units, a.state}, ShiftCursor{cp, b.p, b.p + b.units, b.state});
  return walked(MultiByteCursor{cp, a.p, a.p + a.units}, MultiByteCursor{cp, b.p, b.p + b.units});
}

// Texts whose units are characters.

/// What the forms have of their own.
struct CodeRules {
  using Unit = LXWChar;
  static constexpr bool kTraced = false;

  static bool knows(uint32_t options) { return is_fold(options) && options != LX_WIDTH_INSENSITIVE; }
  static void drop_blanks(const LXLocale& locale, CountedText<Unit>* a, CountedText<Unit>* b) {
    const Unit blank = blank_of(locale);
    a->units = without_blanks(a->p, a->units, blank, blank);
    b->units = without_blanks(b->p, b->units, blank, blank);
  }
  static CodeCase folding(const Codepage& cp, Fold) { return {cp}; }
};
struct UnicodeRules {
  using Unit = LXUChar;
  static constexpr bool kTraced = true;

  static bool knows(uint32_t) { return true; }
  /// Callers rely on both: the blank is two bytes as they are stored, whatever the byte order, and the second
  /// text keeps its blanks where nothing is left of the first.
  static void drop_blanks(const LXLocale&, CountedText<Unit>* a, CountedText<Unit>* b) {
    constexpr uint8_t kStored[sizeof(Unit)] = {0x00, 0x20};
    Unit blank;
    memcpy(&blank, kStored, sizeof(blank));
    a->units = without_blanks(a->p, a->units, blank, blank);
    if (a->units != 0) b->units = without_blanks(b->p, b->units, blank, blank);
  }
  static UnicodeFold folding(const Codepage& cp, Fold fold) { return {cp, fold == Fold::kCase}; }
};

template <class Rules, class Unit = typename Rules::Unit>
int32_t compare_text(LXLocale* given, const Unit* text1, int32_t length1, const Unit* text2, int32_t length2,
                     uint32_t options) {
  Call call(unit, given);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, 0);
  if (Rules::kTraced) LX_TRACE(unit, RAS1_LEVEL_INPUT, "options = %08x", options);
  if (!is_known(options) || !Rules::knows(options & LX_WIDTH_INSENSITIVE)) return call.fail(LX_E_INVALID, 0);
  const LXLocale& locale = *call.locale();
  const Fold fold = fold_of(options);
  CountedText<Unit> a{text1, text_units(text1, length1)};
  CountedText<Unit> b{text2, text_units(text2, length2)};
  if ((options & LX_IGNORE_BLANKS) != 0) Rules::drop_blanks(locale, &a, &b);
  if (Rules::kTraced) dump_texts(unit, a, b);
  if (a.units == 0 || b.units == 0) return call.exit(length_difference(a, b));
  if (fold == Fold::kNone) return call.exit(compare_units(a, b, Exact{}));
  if (fold == Fold::kCase && has_special_upper(locale)) return compare_mapped(call, Form::kPlain, a, b);
  return call.exit(compare_units(a, b, Rules::folding(codepage_of(call.codepage()), fold)));
}

}  // namespace

bool lx::comparison_is_traced() {
  return trace_level(unit) != 0;
}

extern "C" {

int32_t LXStrcmp(LXLocale* locale, const char* text1, int32_t length1, const char* text2, int32_t length2,
                 uint32_t options) {
  return compare_bytes(locale, Form::kPlain, text1, LX_SHIFT_SINGLE, length1, text2, LX_SHIFT_SINGLE, length2,
                       options);
}

int32_t LXStrcmpEx(LXLocale* locale, const char* text1, LXShiftState state1, int32_t length1, const char* text2,
                   LXShiftState state2, int32_t length2, uint32_t options) {
  return compare_bytes(locale, Form::kEx, text1, state1, length1, text2, state2, length2, options);
}

int32_t LXWcscmp(LXLocale* locale, const LXWChar* text1, int32_t length1, const LXWChar* text2, int32_t length2,
                 uint32_t options) {
  return compare_text<CodeRules>(locale, text1, length1, text2, length2, options);
}

int32_t LXStrcmpU(LXLocale* locale, const LXUChar* text1, int32_t length1, const LXUChar* text2,
                  int32_t length2, uint32_t options) {
  return compare_text<UnicodeRules>(locale, text1, length1, text2, length2, options);
}

}  // extern "C"
