// The string family: searching, spans and tokens, by whole characters. Each algorithm is one template over the
// readers of a text; the doors at the end say what kind of text they take.
#include <cstring>

#include "core/lxcall.h"
#include "text/lxwalk.h"

namespace {

using lx::bytes_of;
using lx::ByteText;
using lx::Call;
using lx::Codepage;
using lx::codepage_of;
using lx::Form;
using lx::put_state;
using lx::state_at;
using lx::Text;
using lx::Walk;

RAS1_Unit unit = RAS1_UNIT("lxstring");

/// The frame of a function that looks into one text for what another one holds: `body` is given the call and
/// both readers.
template <class Result, class Unit, class Body>
Result search(LXLocale* given, Form form, const Text<Unit>& text, const Text<Unit>& other, uint32_t flags,
              uint32_t allowed_flags, Result none, Body body) {
  Call call(unit, given);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, none);
  if ((flags & ~allowed_flags) != 0) return call.fail(LX_E_INVALID, none);
  const Codepage& cp = codepage_of(call.codepage());
  const bool characters = (flags & LX_CHARACTERS) != 0;
  const size_t units = lx::units_of(cp, text, characters);
  const size_t other_units = lx::units_of(cp, other, characters);
  return lx::with_cursor(cp, form, text, units, [&](const auto& in) {
    return body(call, in, lx::like(in, other.p, other_units, other.state));
  });
}

template <class Unit>
Unit* writable(const Unit* p) {
  return const_cast<Unit*>(p);
}
char* chars_of(const uint8_t* p) {
  return reinterpret_cast<char*>(const_cast<uint8_t*>(p));
}

/// A character in a text.
template <class Cursor>
struct Place {
  const typename Cursor::Unit* p;  // null: none
  Cursor in;                       // in its state
};

// Characters, and sets of them.

/// Leaves `at` at the character, or at the end.
template <class Cursor>
bool find_code(Walk<Cursor>* at, LXWChar code, size_t units) {
  while (at->next())
    if (at->value == code && at->units() == units) return true;
  return false;
}
bool find_code(Walk<lx::SingleByteCursor>* at, LXWChar code, size_t units) {
  const size_t bytes = lx::room(at->in.p, at->in.end);
  const void* found = bytes != 0 && units == 1 ? memchr(at->in.p, static_cast<int>(code), bytes) : nullptr;
  at->start = static_cast<const uint8_t*>(found);
  return found != nullptr;
}

template <class Unit>
Unit* find_character(LXLocale* given, Form form, const Text<Unit>& text, LXWChar character, LXShiftState* state,
                     uint32_t flags) {
  const LXWChar code = sizeof(Unit) == 1 ? lx::without_zero_bytes(character) : character;
  const size_t code_units = sizeof(Unit) == 1 ? lx::code_bytes(code) : 1;
  Unit* const none = nullptr;
  return search(given, form, text, {text.p, 0}, flags, LX_CHARACTERS, none,
                [&](Call& call, const auto& in, const auto&) {
                  Walk at(in);
                  const bool found = find_code(&at, code, code_units);
                  if (!found && (code != 0 || text.length >= 0)) return call.exit(none);
                  put_state(state, state_at(at.in, text.state));
                  return call.exit(writable(found ? at.start : in.end));
                });
}

/// The characters of a text: those of one unit below 256 as bits, the others where they stand.
template <class Cursor>
class CharacterSet {
 public:
  explicit CharacterSet(const Cursor& text) : text_(text) {
    for (Walk<Cursor> at(text); at.next();) {
      if (is_bit(at))
        bits_[at.value / 32] |= 1u << at.value % 32;
      else
        others_ = true;
    }
  }
  bool holds(const Walk<Cursor>& character) const {
    if (is_bit(character)) return (bits_[character.value / 32] >> character.value % 32 & 1) != 0;
    if (!others_) return false;
    for (Walk<Cursor> at(text_); at.next();)
      if (at.same_as(character)) return true;
    return false;
  }

 private:
  static bool is_bit(const Walk<Cursor>& c) { return c.value < 0x100 && c.units() == 1; }
  Cursor text_;
  uint32_t bits_[8] = {};
  bool others_ = false;
};

/// Takes a shift byte that ends the text.
bool take_last_shift(lx::ShiftCursor* in) {
  return in->end - in->p == 1 && lx::take_shift(in->cp, &in->p, &in->state);
}

/// The characters that a text begins with, `wanted` or not in a set.
template <class Cursor>
struct Span {
  Cursor behind;
  size_t chars;
};

template <class Cursor>
Span<Cursor> span(const Cursor& text, const CharacterSet<Cursor>& set, bool wanted) {
  Span<Cursor> taken{text, 0};
  for (Walk<Cursor> at(text); at.next() && !at.holds_null() && set.holds(at) == wanted; ++taken.chars)
    lx::go_on_at(taken.behind, at.in);
  if constexpr (Cursor::kShifts) {
    Cursor& in = taken.behind;
    if (!take_last_shift(&in) && in.p < in.end && taken.chars != 0 && *in.p == in.cp.shift_in)
      lx::take_shift(in.cp, &in.p, &in.state);
  }
  return taken;
}

template <class Unit>
int32_t span_of_set(LXLocale* given, Form form, const Text<Unit>& text, const Text<Unit>& set, bool wanted,
                    LXShiftState* state, uint32_t flags) {
  return search(given, form, text, set, flags, LX_CHARACTERS, int32_t{-1},
                [&](Call& call, const auto& in, const auto& characters) {
                  const auto taken = span(in, CharacterSet(characters), wanted);
                  put_state(state, state_at(taken.behind, text.state));
                  const bool count = sizeof(Unit) == 1 && (flags & LX_CHARACTERS) != 0;
                  return call.exit(
                      static_cast<int32_t>(count ? taken.chars : static_cast<size_t>(taken.behind.p - in.p)));
                });
}

// Tokens.

/// Overwrites the character that ends a token, with the shift byte before it; one that the end of the text cuts
/// as far as it goes. Moves to the characters that follow.
template <class Cursor>
void overwrite_delimiter(Cursor* in) {
  auto* const first = writable(in->p);
  Walk at(*in);
  const bool whole = at.next();
  lx::go_on_at(*in, at.in);
  if (!whole) in->p = in->end;
  for (auto* p = first; p < in->p; ++p) *p = 0;
  if constexpr (Cursor::kShifts) take_last_shift(in);
}

/// Where the token begins, or null; `*rest` is left at the text that follows it.
template <class Cursor>
Place<Cursor> take_token(Cursor* rest, const CharacterSet<Cursor>& set) {
  Cursor start(*rest);
  Span<Cursor> token = span(start, set, false);
  if (token.chars == 0 && token.behind.p < start.end) {
    lx::go_on_at(start, span(start, set, true).behind);
    lx::go_on_at(*rest, start);
    if (start.p == start.end) return {nullptr, start};
    lx::go_on_at(token.behind, span(start, set, false).behind);
  }
  lx::go_on_at(*rest, token.behind);
  if (rest->p < rest->end) overwrite_delimiter(rest);
  return {start.p, start};
}

template <class Unit>
int32_t length_of_rest(const Codepage& cp, const Text<Unit>& rest, size_t units, bool characters) {
  if constexpr (sizeof(Unit) == 1)
    if (characters) return lx::chars_counted(cp, rest.p, rest.state, units);  // as the next call takes them
  return static_cast<int32_t>(units);
}

/// `length` is that of the text, and receives that of the rest; so does `state`.
template <class Unit, class Char>
Unit* tokenize(LXLocale* given, Form form, Unit* text, LXShiftState* state, int32_t* length,
               const Text<Unit>& set, Char** next, LXShiftState* token_state, uint32_t flags) {
  Unit* const none = nullptr;
  const bool usable = lx::locale_of(given) != nullptr;
  if (usable) *next = nullptr;
  if (usable && text == nullptr) *length = 0;
  const Text<Unit> whole{text, usable ? *length : 0, usable ? *state : 0};
  return search(given, form, whole, set, flags, LX_CHARACTERS, none,
                [&](Call& call, const auto& in, const auto& characters) {
                  if (text == nullptr) return call.exit(none);
                  auto rest = in;
                  const auto token = take_token(&rest, CharacterSet(characters));
                  if (token.p != nullptr) put_state(token_state, state_at(token.in, whole.state));
                  const Text<Unit> left{rest.p, 0, state_at(rest, whole.state)};
                  *length = length_of_rest(codepage_of(call.codepage()), left, lx::room(rest.p, rest.end),
                                           (flags & LX_CHARACTERS) != 0);
                  *state = left.state;
                  if (rest.p < rest.end) *next = reinterpret_cast<Char*>(writable(rest.p));
                  return call.exit(writable(token.p));
                });
}

// Substrings.

enum class Fold { kNone, kCase, kWidth };

Fold fold_of(uint32_t options) {
  const uint32_t folding = options & LX_WIDTH_INSENSITIVE;
  if (folding == 0) return Fold::kNone;
  return folding == LX_WIDTH_INSENSITIVE ? Fold::kWidth : Fold::kCase;
}

/// What a character becomes where case or width does not count.
template <class Value>
struct Folded {
  Value values[2];
  int32_t count;
  bool same_as(const Folded& other) const {
    return count == other.count &&
           memcmp(values, other.values, sizeof(Value) * static_cast<size_t>(count)) == 0;
  }
};
Folded<LXWChar> folded(LXLocale* locale, LXWChar code, Fold fold) {
  Folded<LXWChar> to{{code, 0}, 1};
  if (fold == Fold::kCase) {
    to.count = LXMapStringW(locale, to.values, 2, &code, 1, LX_MAP_UPPER);
  } else if (const LXWChar half = LXCpFullToHalfW(locale->codepage, code)) {
    to.values[0] = half;
  }
  return to;
}
Folded<LXUChar> folded(LXLocale* locale, LXUChar u, Fold fold) {
  Folded<LXUChar> to{{u, 0}, 1};
  if (fold == Fold::kCase)
    to.count = LXMapStringU(locale, to.values, 2, &u, 1, LX_MAP_UPPER);
  else
    to.values[0] = LXUnicodeToF2H(locale, u);
  return to;
}

/// A candidate, whose characters end at `end`, and the substring by the locale's sort.
template <class Cursor>
int32_t collate(LXLocale* locale, const Walk<Cursor>& at, const typename Cursor::Unit* end, const Cursor& part,
                size_t part_units, uint32_t options) {
  const auto length = static_cast<int32_t>(end - at.start);
  const auto part_length = static_cast<int32_t>(part_units);
  if constexpr (Cursor::kShifts)
    return LXStrcollEx(locale, chars_of(at.start), at.in.state, length, chars_of(part.p), part.state,
                       part_length, options);
  else if constexpr (std::is_same_v<Cursor, lx::CodeCursor>)
    return LXWcscoll(locale, at.start, length, part.p, part_length, options);
  else if constexpr (Cursor::kUnicode)
    return LXStrcollU(locale, at.start, length, part.p, part_length, options);
  else
    return LXStrcoll(locale, chars_of(at.start), length, chars_of(part.p), part_length, options);
}

template <class Cursor>
bool begins_with(const Cursor& text, const Cursor& part) {
  Walk at(text);
  for (Walk wanted(part); wanted.next();)
    if (!at.next() || !at.same_as(wanted)) return false;
  return true;
}

template <class Cursor>
Place<Cursor> find_exactly(const Cursor& text, const Cursor& part) {
  Walk first(part);
  if (!first.next()) return {text.p, text};
  for (Walk at(text); at.next();)
    if (at.same_as(first) && begins_with(at.in, first.in)) return {at.start, at.in};
  return {nullptr, text};
}
Place<lx::SingleByteCursor> find_exactly(const lx::SingleByteCursor& text, const lx::SingleByteCursor& part) {
  const void* found = memmem(text.p, lx::room(text.p, text.end), part.p, lx::room(part.p, part.end));
  return {static_cast<const uint8_t*>(found), text};
}

/// `*code` receives the error of a comparison that failed.
template <class Cursor>
Place<Cursor> find_folded(LXLocale* locale, const Cursor& text, const Cursor& part, Fold fold, uint32_t options,
                          int32_t* code) {
  Walk last(part);
  if (!last.next()) return {text.p, text};
  const auto wanted = folded(locale, last.value, fold);
  // Fewer characters than the substring has are no candidate: one cursor runs ahead, to the last one of each.
  Walk ahead(text);
  while (last.next())
    if (!ahead.next()) return {nullptr, text};
  const size_t part_units = lx::room(part.p, last.in.p);
  enum Answer : uint8_t { kUnknown, kNo, kYes } answers[0x100] = {};
  for (Walk at(text); ahead.next() && at.next();) {
    Answer answer = kUnknown;
    Answer& kept = at.value < 0x100 ? answers[at.value] : answer;
    if (kept == kUnknown) kept = folded(locale, at.value, fold).same_as(wanted) ? kYes : kNo;
    if (kept == kNo) continue;
    const int32_t difference = collate(locale, at, ahead.in.p, part, part_units, options);
    *code = locale->last_error;
    if (*code != LX_OK) break;
    if (difference == 0) return {at.start, at.in};
  }
  return {nullptr, text};
}

/// In a single-byte codepage without regard to case: at every place.
Place<lx::SingleByteCursor> find_by_comparison(LXLocale* locale, const lx::SingleByteCursor& text,
                                               const lx::SingleByteCursor& part, int32_t* code) {
  const auto bytes = static_cast<int32_t>(part.end - part.p);
  for (const uint8_t* p = text.p; text.end - p >= bytes; ++p) {
    const int32_t difference =
        LXStrcmp(locale, chars_of(p), bytes, chars_of(part.p), bytes, LX_CASE_INSENSITIVE);
    *code = locale->last_error;
    if (*code != LX_OK) break;
    if (difference == 0) return {p, text};
  }
  return {nullptr, text};
}

template <class Cursor>
Place<Cursor> find_part(LXLocale* locale, const Cursor& text, const Cursor& part, uint32_t options,
                        int32_t* code) {
  if (part.p == part.end) return {text.p, text};
  // Between shift bytes characters count: bytes do not tell which text is longer.
  if (!Cursor::kShifts && part.end - part.p > text.end - text.p) return {nullptr, text};
  const Fold fold = fold_of(options);
  if (fold == Fold::kNone) return find_exactly(text, part);
  if constexpr (std::is_same_v<Cursor, lx::SingleByteCursor>)
    return fold == Fold::kCase ? find_by_comparison(locale, text, part, code) : find_exactly(text, part);
  else
    return find_folded(locale, text, part, fold, options & LX_WIDTH_INSENSITIVE, code);
}

template <class Unit>
Unit* find_substring(LXLocale* given, Form form, const Text<Unit>& text, const Text<Unit>& part,
                     LXShiftState* state, uint32_t options) {
  Unit* const none = nullptr;
  return search(given, form, text, part, options, LX_WIDTH_INSENSITIVE | LX_CHARACTERS, none,
                [&](Call& call, const auto& in, const auto& wanted) {
                  int32_t code = LX_OK;
                  const auto place = find_part(call.locale(), in, wanted, options, &code);
                  if (place.p != nullptr) put_state(state, state_at(place.in, text.state));
                  return call.fail(code, writable(place.p));
                });
}

template <class Unit>
int32_t length_of(LXLocale* given, const Unit* text) {
  Call call(unit, given);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, 0);
  return call.exit(static_cast<int32_t>(lx::units_before_null(text)));
}

}  // namespace

extern "C" {

char* LXStrchr(LXLocale* locale, const char* text, int32_t length, LXWChar character, uint32_t flags) {
  const ByteText in{bytes_of(text), length};
  return chars_of(find_character(locale, Form::kPlain, in, character, nullptr, flags));
}
char* LXStrchrEx(LXLocale* locale, const char* text, LXShiftState text_state, int32_t length, LXWChar character,
                 LXShiftState* state, uint32_t flags) {
  const ByteText in{bytes_of(text), length, text_state};
  return chars_of(find_character(locale, Form::kEx, in, character, state, flags));
}
LXWChar* LXWcschr(LXLocale* locale, const LXWChar* text, int32_t length, LXWChar character, uint32_t flags) {
  return find_character(locale, Form::kPlain, Text<LXWChar>{text, length}, character, nullptr, flags);
}
LXUChar* LXStrchrU(LXLocale* locale, const LXUChar* text, int32_t length, LXUChar character, uint32_t flags) {
  return find_character(locale, Form::kPlain, Text<LXUChar>{text, length}, character, nullptr, flags);
}

int32_t LXWcslen(LXLocale* locale, const LXWChar* text) {
  return length_of(locale, text);
}
int32_t LXStrlenU(LXLocale* locale, const LXUChar* text) {
  return length_of(locale, text);
}

int32_t LXStrcspn(LXLocale* locale, const char* text, int32_t length, const char* set, int32_t set_length,
                  uint32_t flags) {
  return span_of_set(locale, Form::kPlain, ByteText{bytes_of(text), length}, {bytes_of(set), set_length}, false,
                     nullptr, flags);
}
int32_t LXStrcspnEx(LXLocale* locale, const char* text, LXShiftState text_state, int32_t length,
                    const char* set, LXShiftState set_state, int32_t set_length, LXShiftState* state,
                    uint32_t flags) {
  return span_of_set(locale, Form::kEx, ByteText{bytes_of(text), length, text_state},
                     {bytes_of(set), set_length, set_state}, false, state, flags);
}
int32_t LXWcscspn(LXLocale* locale, const LXWChar* text, int32_t length, const LXWChar* set, int32_t set_length,
                  uint32_t flags) {
  return span_of_set(locale, Form::kPlain, Text<LXWChar>{text, length}, {set, set_length}, false, nullptr,
                     flags);
}
int32_t LXStrcspnU(LXLocale* locale, const LXUChar* text, int32_t length, const LXUChar* set,
                   int32_t set_length, uint32_t flags) {
  return span_of_set(locale, Form::kPlain, Text<LXUChar>{text, length}, {set, set_length}, false, nullptr,
                     flags);
}
int32_t LXStrspn(LXLocale* locale, const char* text, int32_t length, const char* set, int32_t set_length,
                 uint32_t flags) {
  return span_of_set(locale, Form::kPlain, ByteText{bytes_of(text), length}, {bytes_of(set), set_length}, true,
                     nullptr, flags);
}
int32_t LXStrspnEx(LXLocale* locale, const char* text, LXShiftState text_state, int32_t length, const char* set,
                   LXShiftState set_state, int32_t set_length, LXShiftState* state, uint32_t flags) {
  return span_of_set(locale, Form::kEx, ByteText{bytes_of(text), length, text_state},
                     {bytes_of(set), set_length, set_state}, true, state, flags);
}
int32_t LXWcsspn(LXLocale* locale, const LXWChar* text, int32_t length, const LXWChar* set, int32_t set_length,
                 uint32_t flags) {
  return span_of_set(locale, Form::kPlain, Text<LXWChar>{text, length}, {set, set_length}, true, nullptr,
                     flags);
}
int32_t LXStrspnU(LXLocale* locale, const LXUChar* text, int32_t length, const LXUChar* set, int32_t set_length,
                  uint32_t flags) {
  return span_of_set(locale, Form::kPlain, Text<LXUChar>{text, length}, {set, set_length}, true, nullptr,
                     flags);
}

char* LXStrstr(LXLocale* locale, const char* text, int32_t length, const char* part, int32_t part_length,
               uint32_t options) {
  return chars_of(find_substring(locale, Form::kPlain, ByteText{bytes_of(text), length},
                                 ByteText{bytes_of(part), part_length}, nullptr, options));
}
char* LXStrstrEx(LXLocale* locale, const char* text, LXShiftState text_state, int32_t length, const char* part,
                 LXShiftState part_state, int32_t part_length, LXShiftState* state, uint32_t options) {
  return chars_of(find_substring(locale, Form::kEx, ByteText{bytes_of(text), length, text_state},
                                 ByteText{bytes_of(part), part_length, part_state}, state, options));
}
LXWChar* LXWcsstr(LXLocale* locale, const LXWChar* text, int32_t length, const LXWChar* part,
                  int32_t part_length, uint32_t options) {
  return find_substring(locale, Form::kPlain, Text<LXWChar>{text, length}, Text<LXWChar>{part, part_length},
                        nullptr, options);
}
LXUChar* LXStrstrU(LXLocale* locale, const LXUChar* text, int32_t length, const LXUChar* part,
                   int32_t part_length, uint32_t options) {
  return find_substring(locale, Form::kPlain, Text<LXUChar>{text, length}, Text<LXUChar>{part, part_length},
                        nullptr, options);
}

char* LXStrtok(LXLocale* locale, char* text, int32_t* length, const char* set, int32_t set_length, char** next,
               uint32_t flags) {
  LXShiftState state = LX_SHIFT_SINGLE;
  return chars_of(tokenize(locale, Form::kPlain, bytes_of(text), &state, length,
                           ByteText{bytes_of(set), set_length}, next, nullptr, flags));
}
char* LXStrtokEx(LXLocale* locale, char* text, LXShiftState* state, int32_t* length, const char* set,
                 LXShiftState set_state, int32_t set_length, char** next, LXShiftState* token_state,
                 uint32_t flags) {
  return chars_of(tokenize(locale, Form::kEx, bytes_of(text), state, length,
                           ByteText{bytes_of(set), set_length, set_state}, next, token_state, flags));
}
LXWChar* LXWcstok(LXLocale* locale, LXWChar* text, int32_t* length, const LXWChar* set, int32_t set_length,
                  LXWChar** next, uint32_t flags) {
  LXShiftState state = LX_SHIFT_SINGLE;
  return tokenize(locale, Form::kPlain, text, &state, length, Text<LXWChar>{set, set_length}, next, nullptr,
                  flags);
}
LXUChar* LXStrtokU(LXLocale* locale, LXUChar* text, int32_t* length, const LXUChar* set, int32_t set_length,
                   LXUChar** next, uint32_t flags) {
  LXShiftState state = LX_SHIFT_SINGLE;
  return tokenize(locale, Form::kPlain, text, &state, length, Text<LXUChar>{set, set_length}, next, nullptr,
                  flags);
}

}  // extern "C"
