// Comparison of two strings by code value, in all forms, optionally without letter case, width or trailing
// blanks. Where a unit is a character, one loop compares; byte texts whose characters have lengths are walked,
// with and without shift states, by the same two functions. The results are real differences: of bytes, of
// characters' lengths, or of what the texts are long.
#include <string.h>

#include "codepage/lxtext.h"
#include "codepage/lxunicode.h"
#include "core/lxcall.h"
#include "core/lxmemory.h"
#include "locale/lxlocale.h"

namespace {

using lx::bytes_of;
using lx::Call;
using lx::Codepage;
using lx::codepage_of;
using lx::Form;
using lx::kMaxCharBytes;
using lx::MultiByteCursor;
using lx::ShiftCursor;

RAS1_Unit unit = RAS1_UNIT("lxcompare");

enum class Fold { kExact, kCase, kWidth };

struct Options {
  Fold fold;
  bool ignore_blanks;
  bool characters;
};

/// False for a bit, or with `case_only` a combination, that is not known.
bool parse_options(uint32_t given, bool case_only, Options* options) {
  const uint32_t fold = given & LX_WIDTH_INSENSITIVE;
  if ((given & ~(LX_WIDTH_INSENSITIVE | LX_IGNORE_BLANKS | uint32_t{LX_CHARACTERS})) != 0) return false;
  if (case_only && fold != 0 && fold != LX_CASE_INSENSITIVE) return false;
  options->fold = fold == 0 ? Fold::kExact : fold == LX_WIDTH_INSENSITIVE ? Fold::kWidth : Fold::kCase;
  options->ignore_blanks = (given & LX_IGNORE_BLANKS) != 0;
  options->characters = (given & LX_CHARACTERS) != 0;
  return true;
}

template <class Unit>
struct Text {
  const Unit* p;
  size_t units;
};
struct ByteText : Text<uint8_t> {
  LXShiftState state;
};

/// The difference where it fits, else the farthest value of its sign.
int32_t difference(int64_t a, int64_t b) {
  const int64_t d = a - b;
  return static_cast<int32_t>(d > INT32_MAX ? INT32_MAX : d < INT32_MIN ? INT32_MIN : d);
}
template <class Unit>
int32_t length_difference(const Text<Unit>& a, const Text<Unit>& b) {
  return difference(static_cast<int64_t>(a.units), static_cast<int64_t>(b.units));
}

template <class Unit>
void dump(const Text<Unit>& a, const Text<Unit>& b) {
  if ((lx::trace_level(unit) & RAS1_LEVEL_DETAIL) == 0) return;
  RAS1_Dump(&unit, __LINE__, a.p, a.units * sizeof(Unit), "String1");
  RAS1_Dump(&unit, __LINE__, b.p, b.units * sizeof(Unit), "String2");
}

const uint8_t* lower_table(const Codepage& cp) {
  return cp.payload + lx::format::codepage::kLower;
}

template <class Unit>
bool same_block(const Unit* a, const Unit* b) {
  return memcmp(a, b, lx::kBlock * sizeof(Unit)) == 0;
}

/// Whether the units of a block are equal but for the case of ASCII letters.
template <class Unit>
bool same_but_case(const Unit* a, const Unit* b) {
  Unit other = 0;
  for (size_t i = 0; i < lx::kBlock; ++i) {
    const Unit letter = static_cast<Unit>((a[i] | 0x20) - 'a');
    const Unit case_bit = letter < 26 ? 0x20 : 0;
    other = static_cast<Unit>(other | ((a[i] ^ b[i]) & ~case_bit));
  }
  return other == 0;
}

/// Whether a table of single bytes has the case of ASCII letters; not asked for short texts.
bool has_ascii_case(const uint8_t* lower, size_t units) {
  if (units < 4 * lx::kBlock) return false;
  bool has = true;
  for (unsigned c = 'A'; c <= 'Z'; ++c) has &= lower[c] == (c | 0x20) && lower[c | 0x20] == (c | 0x20);
  return has;
}

// What a unit counts as, and when a block need not be looked at unit by unit. kTable: as cheap as asking first
// whether two units are equal. kSign: the result is +1 or -1.

struct Exact {
  static constexpr bool kTable = true;
  static constexpr bool kSign = false;
  template <class Unit>
  bool same(const Unit* a, const Unit* b) const {
    return same_block(a, b);
  }
  template <class Unit>
  Unit operator()(Unit u) const {
    return u;
  }
};

struct ByteCase {
  static constexpr bool kTable = true;
  static constexpr bool kSign = false;
  const uint8_t* table;
  bool ascii;
  bool same(const uint8_t* a, const uint8_t* b) const { return ascii ? same_but_case(a, b) : same_block(a, b); }
  uint8_t operator()(uint8_t byte) const { return table[byte]; }
};

struct CodeCase {
  static constexpr bool kTable = false;
  static constexpr bool kSign = false;
  const LXObject& codepage;
  const uint8_t* table;
  bool same(const LXWChar* a, const LXWChar* b) const { return same_block(a, b); }
  LXWChar operator()(LXWChar code) const {
    return code <= 0xFF ? table[code] : LXCpMbCaseConvW(&codepage, code, LX_C1_UPPER);
  }
};

struct UnicodeFold {
  static constexpr bool kTable = false;
  static constexpr bool kSign = true;
  bool upper;  // else half width
  bool same(const LXUChar* a, const LXUChar* b) const { return upper ? same_but_case(a, b) : same_block(a, b); }
  LXUChar operator()(LXUChar u) const { return upper ? lx::unicode_upper(u) : lx::unicode_full_to_half(u); }
};

/// Compares unit by unit, then the lengths.
template <class Unit, class Folding>
int32_t compare_units(const Text<Unit>& a, const Text<Unit>& b, const Folding& fold) {
  constexpr size_t kEqualUnits = 256 / sizeof(Unit);
  const size_t n = lx::least(a.units, b.units);
  size_t i = 0;
  while (n - i >= kEqualUnits && memcmp(a.p + i, b.p + i, kEqualUnits * sizeof(Unit)) == 0) i += kEqualUnits;
  while (i < n) {
    const size_t stop = i + lx::least(n - i, lx::kBlock);
    if (stop - i == lx::kBlock && fold.same(a.p + i, b.p + i)) i = stop;
    for (; i < stop; ++i) {
      if (!Folding::kTable && a.p[i] == b.p[i]) continue;
      const Unit x = fold(a.p[i]);
      const Unit y = fold(b.p[i]);
      if (x == y) continue;
      return Folding::kSign ? (x < y ? -1 : 1) : difference(x, y);
    }
  }
  return length_difference(a, b);
}

// Walks over byte texts whose characters have lengths. They stand on the readers' places, but do not read:
// shift bytes count, and so does the length of a character that the end cuts.

size_t length_at(const MultiByteCursor& in) {
  return in.cp.length(*in.p);
}
size_t length_at(const ShiftCursor& in) {
  return in.cp.width_in(in.state);
}
bool pass_shift(MultiByteCursor*) {
  return false;
}
bool pass_shift(ShiftCursor* in) {
  return in->p != in->end && lx::take_shift(in->cp, &in->p, &in->state);
}
template <class Cursor>
size_t left(const Cursor& in) {
  return lx::room(in.p, in.end);
}
template <class Cursor>
int32_t left_difference(const Cursor& a, const Cursor& b) {
  return difference(a.end - a.p, b.end - b.p);
}

/// Two characters of the same length, which are there as a whole.
bool same_bytes(const uint8_t* a, const uint8_t* b, size_t length) {
  size_t i = 0;
  while (i < length && a[i] == b[i]) ++i;
  return i == length;
}

/// A folded character, zeros behind it.
struct Char {
  uint8_t bytes[kMaxCharBytes];
  size_t length;
};

/// Where two characters differ first; kMaxCharBytes: nowhere.
size_t first_difference(const Char& x, const Char& y) {
  size_t i = 0;
  while (i < kMaxCharBytes && x.bytes[i] == y.bytes[i]) ++i;
  return i;
}

/// A character of several bytes in lower case.
template <class Cursor>
Char lower(const LXObject& codepage, const Cursor& in, size_t length) {
  constexpr auto kConvert = Cursor::kShifts ? LXCpMbCaseConvS : LXCpMbCaseConv;
  Char c{{}, length};
  kConvert(&codepage, reinterpret_cast<const char*>(in.p), reinterpret_cast<char*>(c.bytes), LX_C1_UPPER);
  return c;
}

/// Passes over blocks of ASCII that stand at both places and are the same, where room for any character is left
/// behind them. One that is not is not looked at again before `*from`.
template <class Same>
void pass_blocks(MultiByteCursor* a, MultiByteCursor* b, const Same& same, const uint8_t** from) {
  constexpr unsigned kAscii = 0x80;
  if (a->cp.same_below < kAscii || a->p < *from) return;
  while (lx::least(left(*a), left(*b)) >= lx::kBlock + kMaxCharBytes && lx::is_same_block(a->p, kAscii) &&
         same(a->p, b->p)) {
    a->p += lx::kBlock;
    b->p += lx::kBlock;
  }
  *from = a->p + lx::least(left(*a), lx::kBlock);
}
template <class Same>
void pass_blocks(ShiftCursor*, ShiftCursor*, const Same&, const uint8_t**) {}

/// The result for two characters whose folded forms differ in these bytes.
int32_t case_difference(const MultiByteCursor&, const MultiByteCursor&, uint8_t x, uint8_t y) {
  return x - y;
}
/// Callers rely on the order that this gives: bytes count as signed, and a text whose double-byte characters
/// end first is less. Both texts are in the same state here.
int32_t case_difference(const ShiftCursor& a, const ShiftCursor& b, uint8_t x, uint8_t y) {
  if (a.state == LX_SHIFT_DOUBLE && a.cp.is_shift(*a.p)) return -1;
  if (a.state == LX_SHIFT_DOUBLE && b.cp.is_shift(*b.p)) return 1;
  return static_cast<int8_t>(x) - static_cast<int8_t>(y);
}

/// Characters of different lengths, or cut ones, end the comparison: two cut ones of the same length are equal.
template <class Cursor>
int32_t compare_case(const LXObject& codepage, Cursor a, Cursor b) {
  const ByteCase fold{lower_table(a.cp), has_ascii_case(lower_table(a.cp), lx::least(left(a), left(b)))};
  const auto same = [&](const uint8_t* x, const uint8_t* y) { return fold.same(x, y); };
  const uint8_t* from = a.p;
  while (a.p != a.end && b.p != b.end) {
    pass_blocks(&a, &b, same, &from);
    if (*a.p == *b.p && pass_shift(&a)) {
      pass_shift(&b);
      continue;
    }
    const size_t length = length_at(a);
    if (length != length_at(b) || length > left(a) || length > left(b))
      return difference(static_cast<int64_t>(length), static_cast<int64_t>(length_at(b)));
    if (length == 1) {
      if (fold(*a.p) != fold(*b.p)) return case_difference(a, b, fold(*a.p), fold(*b.p));
    } else if (!same_bytes(a.p, b.p, length)) {
      const Char x = lower(codepage, a, length);
      const Char y = lower(codepage, b, length);
      const size_t at = first_difference(x, y);
      if (at != kMaxCharBytes) return case_difference(a, b, x.bytes[at], y.bytes[at]);
    }
    a.p += length;
    b.p += length;
  }
  return left_difference(a, b);
}

/// A character in its half-width form, or as it is: as much of it as is there.
Char half_width(const LXObject& codepage, const uint8_t* p, size_t length, size_t there) {
  const uint32_t half = length > there ? 0 : LXCpFullToHalfW(&codepage, lx::pack(p, length));
  Char c{{}, length};
  if (half == 0) {
    memcpy(c.bytes, p, lx::least(length, there));
  } else {
    const uint32_t stored = lx::without_zero_bytes(half);
    c.length = lx::code_bytes(stored);
    lx::store_code(c.bytes, stored, c.length);
  }
  return c;
}

/// Compares the characters at both places, which differ: true when that decides, with the result.
bool width_differs(const LXObject& codepage, const MultiByteCursor& a, const MultiByteCursor& b,
                   int32_t* result) {
  const Char x = half_width(codepage, a.p, length_at(a), left(a));
  const Char y = half_width(codepage, b.p, length_at(b), left(b));
  const size_t x_length = a.cp.length(x.bytes[0]);
  const size_t y_length = b.cp.length(y.bytes[0]);
  const size_t at = first_difference(x, y);
  // Callers rely on the order of these tests: a form that is longer than what is left ends the comparison.
  if (x_length != y_length || x_length > lx::least(left(a), left(b)))
    *result = difference(static_cast<int64_t>(x_length), static_cast<int64_t>(y_length));
  else if (at != kMaxCharBytes)
    *result = x.bytes[at] - y.bytes[at];
  else
    return false;
  return true;
}
bool width_differs(const LXObject& codepage, const ShiftCursor& a, const ShiftCursor& b, int32_t* result) {
  const size_t a_length = length_at(a);
  const size_t b_length = length_at(b);
  // A cut character is not entered: what is left decides.
  if (a_length > left(a) || b_length > left(b)) {
    *result = left_difference(a, b);
    return true;
  }
  const auto folded = [&](const ShiftCursor& in, size_t length) {
    return in.state == LX_SHIFT_DOUBLE ? half_width(codepage, in.p, length, length) : Char{{*in.p}, 1};
  };
  const Char x = folded(a, a_length);
  const Char y = folded(b, b_length);
  const size_t at = first_difference(x, y);
  if (x.length == y.length && at == kMaxCharBytes) return false;
  LX_TRACE(unit, RAS1_LEVEL_DETAIL, "Strings are unequal: len1 = %d, len2 = %d", static_cast<int>(x.length),
           static_cast<int>(y.length));
  if (x.length != y.length) {
    *result = difference(static_cast<int64_t>(x.length), static_cast<int64_t>(y.length));
  } else {
    dump(Text<uint8_t>{x.bytes, x.length}, Text<uint8_t>{y.bytes, y.length});
    *result = x.bytes[at] - y.bytes[at];
  }
  return true;
}

/// In the end what is left of the texts is compared, without shift bytes that stand there.
template <class Cursor>
int32_t compare_width(const LXObject& codepage, Cursor a, Cursor b) {
  const uint8_t* from = a.p;
  for (;;) {
    pass_blocks(&a, &b, same_block<uint8_t>, &from);
    while (pass_shift(&a)) continue;
    while (pass_shift(&b)) continue;
    if (a.p == a.end || b.p == b.end) return left_difference(a, b);
    // Where there is room for every form, equal characters need not be mapped.
    const size_t length = length_at(a);
    const bool same =
        lx::least(left(a), left(b)) >= a.cp.width && length == length_at(b) && same_bytes(a.p, b.p, length);
    int32_t result = 0;
    if (!same && width_differs(codepage, a, b, &result)) return result;
    a.p += length;
    b.p += length_at(b);
  }
}

// Comparison of the texts in upper case, where the language has special mappings.

bool has_special_upper(const LXLocale& locale) {
  return lx::specials_of(*locale.language, true).count != 0;
}

/// Room for a text in upper case, in units. Packed codes and Unicode do not grow: what more a special mapping
/// gives is cut, and callers rely on the order that this makes.
template <class Unit>
int32_t upper_units(const Text<Unit>& text) {
  return static_cast<int32_t>(text.units);
}
int32_t upper_units(const ByteText& text) {
  constexpr uint64_t kGrowth = 8;
  const uint64_t bytes = kGrowth * text.units;
  return bytes < INT32_MAX ? static_cast<int32_t>(bytes) : INT32_MAX;
}

/// Room for a copy of the input behind the output: mapping begins in the single-byte state, so that a text in
/// the double-byte state is given with a Shift-Out in front.
template <class Unit>
size_t copy_units(const Text<Unit>&) {
  return 0;
}
size_t copy_units(const ByteText& text) {
  return text.state == LX_SHIFT_DOUBLE ? 1 + text.units : 0;
}

/// The text in upper case, in big-endian order: its bytes order as its values do, as far as these have 16 bits.
template <class Unit>
Text<Unit> upper(LXLocale* locale, Form, const Text<Unit>& text, Unit* out) {
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
Text<uint8_t> upper(LXLocale* locale, Form form, const ByteText& text, uint8_t* out) {
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

template <class Unit, class AnyText>
int32_t compare_mapped(Call& call, Form form, const AnyText& a, const AnyText& b) {
  // Functions that map and swap count in 32 bits, bytes too.
  constexpr size_t kMostUnits = INT32_MAX / sizeof(Unit) - 1;
  if (a.units > kMostUnits || b.units > kMostUnits) return call.fail(LX_E_MEMORY, 0);
  const auto bytes_for = [](const AnyText& text) {
    return (static_cast<size_t>(upper_units(text)) + copy_units(text)) * sizeof(Unit);
  };
  const lx::WorkBuffer a_buffer(bytes_for(a));
  const lx::WorkBuffer b_buffer(bytes_for(b));
  if (!a_buffer || !b_buffer) return call.fail(LX_E_MEMORY, 0);
  const Text<Unit> x = upper(call.locale(), form, a, a_buffer.as<Unit>());
  const Text<Unit> y = upper(call.locale(), form, b, b_buffer.as<Unit>());
  const size_t bytes = lx::least(x.units, y.units) * sizeof(Unit);
  const int32_t result = compare_units(Text<uint8_t>{reinterpret_cast<const uint8_t*>(x.p), bytes},
                                       Text<uint8_t>{reinterpret_cast<const uint8_t*>(y.p), bytes}, Exact{});
  return call.exit(result != 0 ? result : length_difference(x, y));
}

// Byte texts.

/// How much of a shift-stateful text ends on a character, shift bytes behind the last one included.
size_t adjust_length(const Codepage& cp, const uint8_t* text, LXShiftState state, size_t length) {
  const uint8_t* p = text;
  const uint8_t* const end = text + length;
  while (p < end) {
    if (lx::take_shift(cp, &p, &state) && p == end) break;
    if (cp.width_in(state) > end - p) break;
    p += cp.width_in(state);
  }
  return static_cast<size_t>(p - text);
}

/// The whole characters of a text by lead-byte lengths, in bytes; blocks of ASCII are passed over.
size_t whole_bytes(const Codepage& cp, const uint8_t* text, size_t length) {
  if (cp.single_byte) return length;
  size_t i = 0;
  constexpr unsigned kAscii = 0x80;
  if (cp.same_below >= kAscii)
    while (length - i >= lx::kBlock && lx::is_same_block(text + i, kAscii)) i += lx::kBlock;
  const size_t rest = length - i;
  return i + lx::whole_chars(cp, Form::kPlain, text + i, LX_SHIFT_SINGLE, rest, rest).units;
}

ByteText byte_text(const Codepage& cp, Form form, const char* given, LXShiftState given_state, int32_t length,
                   bool characters) {
  const uint8_t* const p = bytes_of(given);
  const bool shift = form == Form::kEx;
  const LXShiftState state = shift && given_state != LX_SHIFT_SINGLE ? LX_SHIFT_DOUBLE : LX_SHIFT_SINGLE;
  if (length < 0) return {{p, strlen(given)}, state};
  size_t bytes = static_cast<size_t>(length);
  if (characters) bytes = lx::bytes_of_chars(cp, p, state, length);
  if (!shift) return {{p, whole_bytes(cp, p, bytes)}, state};
  return {{p, characters ? bytes : adjust_length(cp, p, state, bytes)}, state};
}

/// The length of a text without its trailing blanks, as truncating a copy of it tells.
size_t without_blanks(LXLocale* locale, Form form, const ByteText& text, char* copy, uint32_t flags) {
  if (text.units == 0) return 0;
  memcpy(copy, text.p, text.units);
  copy[text.units] = '\0';
  const int32_t size = static_cast<int32_t>(text.units + 1);
  const int32_t kept = form == Form::kEx ? LXTruncateStringEx(locale, copy, text.state, size, flags)
                                         : LXTruncateString(locale, copy, size, flags);
  return static_cast<size_t>(kept - 1);
}

/// Without memory for the copy, or where its size cannot be told, blanks count.
void ignore_blanks(LXLocale* locale, Form form, Fold fold, ByteText* a, ByteText* b) {
  const size_t most = a->units > b->units ? a->units : b->units;
  if (most >= INT32_MAX) return;
  const lx::WorkBuffer copy(most + 1);
  if (!copy) return;
  const uint32_t flags = LX_DROP_BLANKS | (fold == Fold::kWidth ? LX_WIDTH_INSENSITIVE : 0);
  a->units = without_blanks(locale, form, *a, copy.as<char>(), flags);
  b->units = without_blanks(locale, form, *b, copy.as<char>(), flags);
}

void take_first_shift(const Codepage& cp, ByteText* text) {
  if (text->units != 0 && lx::take_shift(cp, &text->p, &text->state)) --text->units;
}

int32_t compare_bytes(LXLocale* given, Form form, const char* text1, LXShiftState state1, int32_t length1,
                      const char* text2, LXShiftState state2, int32_t length2, uint32_t given_options) {
  Call call(unit, given);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, 0);
  if (form == Form::kEx) LX_TRACE(unit, RAS1_LEVEL_INPUT, "Options = %08x", given_options);
  Options options;
  if (!parse_options(given_options, false, &options)) return call.fail(LX_E_INVALID, 0);
  const Codepage& cp = codepage_of(call.codepage());
  if (!cp.shift_sensitive) form = Form::kPlain;
  ByteText a = byte_text(cp, form, text1, state1, length1, options.characters);
  ByteText b = byte_text(cp, form, text2, state2, length2, options.characters);
  if (options.ignore_blanks) ignore_blanks(call.locale(), form, options.fold, &a, &b);
  if (form == Form::kEx) {
    take_first_shift(cp, &a);
    take_first_shift(cp, &b);
    LX_TRACE(unit, RAS1_LEVEL_DETAIL, "len1 = %d, str1state = %d, len2 = %d, str2state = %d",
             static_cast<int>(a.units), static_cast<int>(a.state), static_cast<int>(b.units),
             static_cast<int>(b.state));
  }
  dump(a, b);
  if (a.units == 0 || b.units == 0) return call.exit(length_difference(a, b));
  if (options.fold == Fold::kCase && has_special_upper(*call.locale()))
    return compare_mapped<uint8_t>(call, form, a, b);
  const bool single = form == Form::kPlain && cp.single_byte;
  if (options.fold == Fold::kExact || (single && options.fold == Fold::kWidth))
    return call.exit(compare_units(a, b, Exact{}));
  if (single)
    return call.exit(compare_units(
        a, b, ByteCase{lower_table(cp), has_ascii_case(lower_table(cp), lx::least(a.units, b.units))}));
  const auto walked = [&](auto x, auto y) {
    return call.exit(options.fold == Fold::kCase ? compare_case(call.codepage(), x, y)
                                                 : compare_width(call.codepage(), x, y));
  };
  if (form == Form::kEx)
    return walked(ShiftCursor{cp, a.p, a.p + a.units, a.state}, ShiftCursor{cp, b.p, b.p + b.units, b.state});
  return walked(MultiByteCursor{cp, a.p, a.p + a.units}, MultiByteCursor{cp, b.p, b.p + b.units});
}

// Texts whose units are characters.

template <class Unit>
void drop_trailing(Text<Unit>* text, Unit blank) {
  while (text->units != 0 && text->p[text->units - 1] == blank) --text->units;
}

/// What the forms have of their own.
struct CodeRules {
  using Unit = LXWChar;
  static constexpr bool kTraced = false;
  static constexpr bool kCaseOnly = true;

  static void ignore_blanks(const LXLocale& locale, Text<Unit>* a, Text<Unit>* b) {
    const Unit blank = lx::keeps_ascii(locale) ? 0x20 : 0x40;
    drop_trailing(a, blank);
    drop_trailing(b, blank);
  }
  static CodeCase folding(const LXLocale& locale, Fold) {
    const LXObject& codepage = *locale.codepage;
    return {codepage, lower_table(codepage_of(codepage))};
  }
};
struct UnicodeRules {
  using Unit = LXUChar;
  static constexpr bool kTraced = true;
  static constexpr bool kCaseOnly = false;

  /// Callers rely on both: the blank is two bytes as they are stored, whatever the byte order, and the second
  /// text keeps its blanks where nothing is left of the first.
  static void ignore_blanks(const LXLocale&, Text<Unit>* a, Text<Unit>* b) {
    constexpr uint8_t kStored[sizeof(Unit)] = {0x00, 0x20};
    Unit blank;
    memcpy(&blank, kStored, sizeof(blank));
    drop_trailing(a, blank);
    if (a->units != 0) drop_trailing(b, blank);
  }
  static UnicodeFold folding(const LXLocale&, Fold fold) { return {fold == Fold::kCase}; }
};

template <class Unit>
Text<Unit> unit_text(const Unit* p, int32_t length) {
  return {p, length < 0 ? lx::units_before_null(p) : static_cast<size_t>(length)};
}

template <class Rules, class Unit = typename Rules::Unit>
int32_t compare_text(LXLocale* given, const Unit* text1, int32_t length1, const Unit* text2, int32_t length2,
                     uint32_t given_options) {
  Call call(unit, given);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, 0);
  if (Rules::kTraced) LX_TRACE(unit, RAS1_LEVEL_INPUT, "options = %08x", given_options);
  Options options;
  if (!parse_options(given_options, Rules::kCaseOnly, &options)) return call.fail(LX_E_INVALID, 0);
  const LXLocale& locale = *call.locale();
  Text<Unit> a = unit_text(text1, length1);
  Text<Unit> b = unit_text(text2, length2);
  if (options.ignore_blanks) Rules::ignore_blanks(locale, &a, &b);
  if (Rules::kTraced) dump(a, b);
  if (a.units == 0 || b.units == 0) return call.exit(length_difference(a, b));
  if (options.fold == Fold::kExact) return call.exit(compare_units(a, b, Exact{}));
  if (options.fold == Fold::kCase && has_special_upper(locale))
    return compare_mapped<Unit>(call, Form::kPlain, a, b);
  return call.exit(compare_units(a, b, Rules::folding(locale, options.fold)));
}

}  // namespace

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
