// The string family: characters, spans and tokens, by whole characters. Each algorithm is one template over the
// readers of a text; the doors at the end say what kind of text they take.
#include <cstring>

#include "text/lxsearch.h"

using namespace lx;

namespace {

RAS1_Unit unit = RAS1_UNIT("lxstring");

// Characters, and sets of them.

/// Leaves `at` at the character, or at the end.
template <class Cursor>
bool find_code(Walk<Cursor>* at, LXWChar code, size_t units) {
  while (at->next())
    if (at->value == code && at->units() == units) return true;
  return false;
}
bool find_code(Walk<SingleByteCursor>* at, LXWChar code, size_t units) {
  const size_t bytes = room(at->in.p, at->in.end);
  const void* found = bytes != 0 && units == 1 ? memchr(at->in.p, static_cast<int>(code), bytes) : nullptr;
  at->start = static_cast<const uint8_t*>(found);
  return found != nullptr;
}

template <class Unit>
Unit* find_character(LXLocale* given, Form form, const Text<Unit>& text, LXWChar character, LXShiftState* state,
                     uint32_t flags) {
  const LXWChar code = sizeof(Unit) == 1 ? without_zero_bytes(character) : character;
  const size_t code_units = sizeof(Unit) == 1 ? code_bytes(code) : 1;
  Unit* const none = nullptr;
  return search(unit, given, form, text, {text.p, 0}, flags, LX_CHARACTERS, none,
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
    go_on_at(taken.behind, at.in);
  if constexpr (Cursor::kShifts) {
    Cursor& in = taken.behind;
    if (!in.pass_last_shift() && in.p < in.end && taken.chars != 0 && *in.p == in.cp.shift_in) in.pass_shift();
  }
  return taken;
}

template <class Unit>
int32_t span_of_set(LXLocale* given, Form form, const Text<Unit>& text, const Text<Unit>& set, bool wanted,
                    LXShiftState* state, uint32_t flags) {
  return search(unit, given, form, text, set, flags, LX_CHARACTERS, int32_t{-1},
                [&](Call& call, const auto& in, const auto& characters) {
                  const auto taken = span(in, CharacterSet(characters), wanted);
                  put_state(state, state_at(taken.behind, text.state));
                  const bool count = sizeof(Unit) == 1 && (flags & LX_CHARACTERS) != 0;
                  return call.exit(
                      static_cast<int32_t>(count ? taken.chars : static_cast<size_t>(taken.behind.p - in.p)));
                });
}

// Tokens.

/// Passes the character that ends a token, with the shift byte before it; one that the end of the text cuts as
/// far as it goes.
template <class Cursor>
void pass_delimiter(Cursor* in) {
  Walk at(*in);
  const bool whole = at.next();
  go_on_at(*in, at.in);
  if (!whole) in->p = in->end;
}

/// The first token of a text.
template <class Cursor>
struct Token {
  Cursor start;
  Cursor rest;
  const typename Cursor::Unit *delimiter, *delimiter_end;  // the character that ends it, with its shift byte
  bool found;
};

template <class Cursor>
Token<Cursor> find_token(const Cursor& text, const CharacterSet<Cursor>& set) {
  Cursor start(text);
  Span<Cursor> token = span(start, set, false);
  if (token.chars == 0 && token.behind.p < start.end) {
    go_on_at(start, span(start, set, true).behind);
    if (start.p == start.end) return {start, start, start.p, start.p, false};
    go_on_at(token.behind, span(start, set, false).behind);
  }
  Cursor rest(token.behind);
  if (rest.p < rest.end) pass_delimiter(&rest);
  const auto* const delimiter_end = rest.p;
  if constexpr (Cursor::kShifts)
    if (delimiter_end != token.behind.p) rest.pass_last_shift();
  return {start, rest, token.behind.p, delimiter_end, true};
}

/// The length of what follows a token, as the next call takes it, of `part` of a text; -1 when the part does not
/// tell what the whole would.
template <class Unit, class Cursor>
int32_t length_of_rest(const Codepage& cp, const Text<Unit>& whole, const Text<Unit>& part, bool characters,
                       const Cursor& rest) {
  if constexpr (sizeof(Unit) == 1) {
    if (characters) {
      const LXShiftState state = state_at(rest, whole.state);
      if (part.length == whole.length) return chars_counted(cp, rest.p, state, room(rest.p, rest.end));
      const int32_t before = chars_before(cp, whole, {rest.p, 0, state}, rest.end);
      return before < 0 ? -1 : whole.length - before;
    }
  }
  return static_cast<int32_t>(room(rest.p, rest.end));
}

/// `length` is that of the text, and receives that of the rest; so does `state`. A length in characters says how
/// many are left without their being read: so no more is read than the token needs, in parts that grow.
template <class Unit, class Char>
Unit* tokenize(LXLocale* given, Form form, Unit* text, LXShiftState* state, int32_t* length,
               const Text<Unit>& set, Char** next, LXShiftState* token_state, uint32_t flags) {
  constexpr int32_t kFirstPart = 64;
  Unit* const none = nullptr;
  Call call(unit, given);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, none);
  *next = nullptr;
  if (text == nullptr) *length = 0;
  if ((flags & ~uint32_t{LX_CHARACTERS}) != 0) return call.fail(LX_E_INVALID, none);
  if (text == nullptr) return call.exit(none);
  const Codepage& cp = codepage_of(call.codepage());
  const bool characters = sizeof(Unit) == 1 && (flags & LX_CHARACTERS) != 0;
  const size_t set_units = units_of(cp, set, characters);
  const Text<Unit> whole{text, *length, *state};
  Text<Unit> part = whole;
  if (characters && whole.length > kFirstPart) part.length = kFirstPart;
  Unit* token = none;
  const auto take = [&](const auto& in) {
    const auto found = find_token(in, CharacterSet(like(in, set.p, set_units, set.state)));
    const int32_t left = length_of_rest(cp, whole, part, characters, found.rest);
    if (left < 0) return false;
    if (found.found) {
      token = writable(found.start.p);
      put_state(token_state, state_at(found.start, whole.state));
    }
    *length = left;
    *state = state_at(found.rest, whole.state);
    for (auto* p = writable(found.delimiter); p < found.delimiter_end; ++p) *p = 0;
    if (found.rest.p < in.end) *next = reinterpret_cast<Char*>(writable(found.rest.p));
    return true;
  };
  while (!with_cursor(cp, form, part, units_of(cp, part, characters), take))
    part.length = part.length < whole.length / 2 ? part.length * 2 : whole.length;
  return call.exit(token);
}

template <class Unit>
int32_t length_of(LXLocale* given, const Unit* text) {
  Call call(unit, given);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, 0);
  return call.exit(static_cast<int32_t>(units_before_null(text)));
}

}  // namespace

extern "C" {

char* LXStrchr(LXLocale* locale, const char* text, int32_t length, LXWChar character, uint32_t flags) {
  const ByteText in = text_of(text, length);
  return chars_of(find_character(locale, Form::kPlain, in, character, nullptr, flags));
}
char* LXStrchrEx(LXLocale* locale, const char* text, LXShiftState text_state, int32_t length, LXWChar character,
                 LXShiftState* state, uint32_t flags) {
  const ByteText in = text_of(text, length, text_state);
  return chars_of(find_character(locale, Form::kEx, in, character, state, flags));
}
LXWChar* LXWcschr(LXLocale* locale, const LXWChar* text, int32_t length, LXWChar character, uint32_t flags) {
  return find_character(locale, Form::kPlain, text_of(text, length), character, nullptr, flags);
}
LXUChar* LXStrchrU(LXLocale* locale, const LXUChar* text, int32_t length, LXUChar character, uint32_t flags) {
  return find_character(locale, Form::kPlain, text_of(text, length), character, nullptr, flags);
}

int32_t LXWcslen(LXLocale* locale, const LXWChar* text) {
  return length_of(locale, text);
}
int32_t LXStrlenU(LXLocale* locale, const LXUChar* text) {
  return length_of(locale, text);
}

int32_t LXStrcspn(LXLocale* locale, const char* text, int32_t length, const char* set, int32_t set_length,
                  uint32_t flags) {
  return span_of_set(locale, Form::kPlain, text_of(text, length), text_of(set, set_length), false, nullptr,
                     flags);
}
int32_t LXStrcspnEx(LXLocale* locale, const char* text, LXShiftState text_state, int32_t length,
                    const char* set, LXShiftState set_state, int32_t set_length, LXShiftState* state,
                    uint32_t flags) {
  return span_of_set(locale, Form::kEx, text_of(text, length, text_state), text_of(set, set_length, set_state),
                     false, state, flags);
}
int32_t LXWcscspn(LXLocale* locale, const LXWChar* text, int32_t length, const LXWChar* set, int32_t set_length,
                  uint32_t flags) {
  return span_of_set(locale, Form::kPlain, text_of(text, length), text_of(set, set_length), false, nullptr,
                     flags);
}
int32_t LXStrcspnU(LXLocale* locale, const LXUChar* text, int32_t length, const LXUChar* set,
                   int32_t set_length, uint32_t flags) {
  return span_of_set(locale, Form::kPlain, text_of(text, length), text_of(set, set_length), false, nullptr,
                     flags);
}
int32_t LXStrspn(LXLocale* locale, const char* text, int32_t length, const char* set, int32_t set_length,
                 uint32_t flags) {
  return span_of_set(locale, Form::kPlain, text_of(text, length), text_of(set, set_length), true, nullptr,
                     flags);
}
int32_t LXStrspnEx(LXLocale* locale, const char* text, LXShiftState text_state, int32_t length, const char* set,
                   LXShiftState set_state, int32_t set_length, LXShiftState* state, uint32_t flags) {
  return span_of_set(locale, Form::kEx, text_of(text, length, text_state), text_of(set, set_length, set_state),
                     true, state, flags);
}
int32_t LXWcsspn(LXLocale* locale, const LXWChar* text, int32_t length, const LXWChar* set, int32_t set_length,
                 uint32_t flags) {
  return span_of_set(locale, Form::kPlain, text_of(text, length), text_of(set, set_length), true, nullptr,
                     flags);
}
int32_t LXStrspnU(LXLocale* locale, const LXUChar* text, int32_t length, const LXUChar* set, int32_t set_length,
                  uint32_t flags) {
  return span_of_set(locale, Form::kPlain, text_of(text, length), text_of(set, set_length), true, nullptr,
                     flags);
}

char* LXStrtok(LXLocale* locale, char* text, int32_t* length, const char* set, int32_t set_length, char** next,
               uint32_t flags) {
  LXShiftState state = LX_SHIFT_SINGLE;
  return chars_of(tokenize(locale, Form::kPlain, bytes_of(text), &state, length, text_of(set, set_length), next,
                           nullptr, flags));
}
char* LXStrtokEx(LXLocale* locale, char* text, LXShiftState* state, int32_t* length, const char* set,
                 LXShiftState set_state, int32_t set_length, char** next, LXShiftState* token_state,
                 uint32_t flags) {
  return chars_of(tokenize(locale, Form::kEx, bytes_of(text), state, length,
                           text_of(set, set_length, set_state), next, token_state, flags));
}
LXWChar* LXWcstok(LXLocale* locale, LXWChar* text, int32_t* length, const LXWChar* set, int32_t set_length,
                  LXWChar** next, uint32_t flags) {
  LXShiftState state = LX_SHIFT_SINGLE;
  return tokenize(locale, Form::kPlain, text, &state, length, text_of(set, set_length), next, nullptr, flags);
}
LXUChar* LXStrtokU(LXLocale* locale, LXUChar* text, int32_t* length, const LXUChar* set, int32_t set_length,
                   LXUChar** next, uint32_t flags) {
  LXShiftState state = LX_SHIFT_SINGLE;
  return tokenize(locale, Form::kPlain, text, &state, length, text_of(set, set_length), next, nullptr, flags);
}

}  // extern "C"
