// Search for a substring: exactly, or by the locale's sort where case or width does not count.
#include <cstring>

#include "collate/lxfoldedpart.h"
#include "core/lxmemory.h"
#include "text/lxfold.h"
#include "text/lxsearch.h"

using namespace lx;

namespace {

RAS1_Unit unit = RAS1_UNIT("lxstrstr");

// A candidate, from its first character to behind its last one, and the substring are compared by LXStrcoll and
// its forms, as a trace shows it. A shift byte behind the last character belongs to either.

template <class Cursor>
int32_t collate(LXLocale* locale, const Walk<Cursor>& at, const Cursor& behind, const Cursor& part,
                int32_t part_bytes, uint32_t options) {
  return LXStrcoll(locale, chars_of(at.start), static_cast<int32_t>(behind.p - at.start), chars_of(part.p),
                   part_bytes, options);
}
int32_t collate(LXLocale* locale, const Walk<ShiftCursor>& at, ShiftCursor behind, const ShiftCursor& part,
                int32_t part_bytes, uint32_t options) {
  behind.pass_shift();
  return LXStrcollEx(locale, chars_of(at.start), at.in.state, static_cast<int32_t>(behind.p - at.start),
                     chars_of(part.p), part.state, part_bytes, options);
}
int32_t collate(LXLocale* locale, const Walk<CodeCursor>& at, const CodeCursor& behind, const CodeCursor& part,
                int32_t part_codes, uint32_t options) {
  return LXWcscoll(locale, at.start, static_cast<int32_t>(behind.p - at.start), part.p, part_codes, options);
}
int32_t collate(LXLocale* locale, const Walk<UnicodeCursor>& at, const UnicodeCursor& behind,
                const UnicodeCursor& part, int32_t part_units, uint32_t options) {
  return LXStrcollU(locale, at.start, static_cast<int32_t>(behind.p - at.start), part.p, part_units, options);
}

/// A part that is looked for in time that grows with the lengths of both texts, by the algorithm of Knuth, Morris
/// and Pratt: behind so many characters that agree and one that does not, the next place to try is known.
template <class Cursor>
class PartSearch {
 public:
  explicit PartSearch(const Cursor& part)
      : count_(count_of(part)), block_(count_ <= SIZE_MAX / sizeof(Char) ? count_ * sizeof(Char) : SIZE_MAX) {
    Char* const chars = block_.template as<Char>();
    size_t n = 0, border = 0;
    for (Walk at(part); chars != nullptr && at.next(); ++n) {
      if (n != 0) border = agreeing(at, border);
      chars[n] = {at.value, static_cast<uint32_t>(at.units()), border};
    }
  }
  /// False without memory.
  explicit operator bool() const { return static_cast<bool>(block_); }

  Place<Cursor> find(const Cursor& text) const {
    Walk at(text);
    size_t read = 0, agree = 0;
    for (Walk ahead(text); ahead.next();) {
      agree = agreeing(ahead, agree);
      if (++read >= count_) at.next();
      if (agree == count_) return {at.start, at.in};
    }
    return {nullptr, text};
  }

 private:
  struct Char {
    typename Cursor::Value value;
    uint32_t units;
    size_t border;  // as many characters at the beginning are those up to here, this one included
  };

  static size_t count_of(const Cursor& part) {
    Cursor in(part);
    return pass_all(&in);
  }
  /// How many characters of the part agree when so many did before this one.
  size_t agreeing(const Walk<Cursor>& at, size_t agree) const {
    const Char* const chars = block_.template as<Char>();
    for (;; agree = chars[agree - 1].border) {
      if (chars[agree].value == at.value && chars[agree].units == at.units()) return agree + 1;
      if (agree == 0) return 0;
    }
  }

  size_t count_;
  WorkBuffer block_;
};

/// Adds to `*compared` how many characters were compared.
template <class Cursor>
bool begins_with(const Cursor& text, const Cursor& part, size_t* compared) {
  Walk at(text);
  for (Walk wanted(part); wanted.next(); ++*compared)
    if (!at.next() || !at.same_as(wanted)) return false;
  return true;
}

/// Goes on before the next place where a part may begin that begins with `first`, or stays where that is not seen
/// sooner than by characters.
template <class Cursor>
void skip_others(Walk<Cursor>*, const Walk<Cursor>&) {}
void skip_others(Walk<UnicodeCursor>* at, const Walk<UnicodeCursor>& first) {
  const LXUChar* const second = first.in.p;
  if (second != first.in.end)
    at->in.p += units_before_pair(at->in.p, room(at->in.p, at->in.end), first.value, *second);
}

template <class Cursor>
Place<Cursor> find_exactly(const Cursor& text, const Cursor& part) {
  constexpr size_t kWorthIt = 1024;
  Walk first(part);
  if (!first.next()) return {text.p, text};
  size_t compared = 0;
  bool has_memory = true;
  for (Walk at(text); skip_others(&at, first), at.next();) {
    if (!at.same_as(first)) continue;
    if (begins_with(at.in, first.in, &compared)) return {at.start, at.in};
    // Where much agrees in vain, preparing the part pays.
    if (!has_memory || compared < kWorthIt + room(text.p, at.start)) continue;
    const PartSearch search(part);
    if (search) return search.find(text);
    has_memory = false;
  }
  return {nullptr, text};
}
Place<SingleByteCursor> find_exactly(const SingleByteCursor& text, const SingleByteCursor& part) {
  const void* found = memmem(text.p, room(text.p, text.end), part.p, room(part.p, part.end));
  return {static_cast<const uint8_t*>(found), text};
}

/// What is thought of a candidate before it is compared.
enum class Chance { kSome, kNone, kStop };

/// Candidates begin with the same character when it is folded. What that is, is kept for characters of one
/// byte: looking for a half-width form takes long. `chance(place, number, end)` is asked for those. `*code` receives
/// the error of a comparison that failed.
template <class Cursor, class ChanceOf>
Place<Cursor> try_candidates(LXLocale* locale, const Cursor& text, const Cursor& part, Fold fold,
                             uint32_t options, ChanceOf chance, int32_t* code) {
  Walk last(part);
  if (!last.next()) return {text.p, text};
  using Character = Folded<typename CharOf<typename Cursor::Unit>::Type>;
  const Character wanted(*locale, last.value, fold);
  // Fewer characters than the substring has are no candidate: one cursor runs ahead, to the last one of each.
  Walk ahead(text);
  while (last.next())
    if (!ahead.next()) return {nullptr, text};
  const auto part_units = static_cast<int32_t>(last.in.p - part.p);
  enum Answer : uint8_t { kUnknown, kNo, kYes } answers[0x100] = {};
  size_t number = 0;
  for (Walk at(text); ahead.next() && at.next(); ++number) {
    Answer answer = kUnknown;
    Answer& kept = at.value < 0x100 ? answers[at.value] : answer;
    if (kept == kUnknown) kept = Character(*locale, at.value, fold).same_as(wanted) ? kYes : kNo;
    if (kept == kNo) continue;
    const Chance it_has = chance(at.start, number, ahead.in.p);
    if (it_has == Chance::kStop) break;
    if (it_has == Chance::kNone) continue;
    const int32_t difference = collate(locale, at, ahead.in, part, part_units, options);
    *code = last_error_of(*locale);
    if (*code != LX_OK) break;
    if (difference == 0) return {at.start, at.in};
  }
  return {nullptr, text};
}

/// Tells when comparing has cost so much that preparing the part pays.
class Patience {
 public:
  explicit Patience(uint32_t options)
      : ends_(options == LX_CASE_INSENSITIVE && !collation_is_traced() && !comparison_is_traced()) {}

  bool is_over(size_t compared, size_t passed) {
    constexpr size_t kWorthIt = 1024;
    return ends_ && (spent_ += compared) >= kWorthIt + passed;
  }

 private:
  bool ends_;
  size_t spent_ = 0;
};

/// Searches by `try_from(text, chance)`, and where comparing takes long with the part prepared from there on.
template <class Cursor, class TryFrom>
Place<Cursor> search_patiently(const LXLocale& locale, const Cursor& text, const Cursor& part, const Sort* sort,
                               uint32_t options, TryFrom try_from) {
  using Unit = typename Cursor::Unit;
  Patience patience(options);
  const Unit* stopped = nullptr;
  const auto place = try_from(text, [&](const Unit* candidate, size_t, const Unit* end) {
    if (!patience.is_over(room(candidate, end), room(text.p, candidate))) return Chance::kSome;
    stopped = candidate;
    return Chance::kStop;
  });
  if (stopped == nullptr) return place;
  const Folding folding(locale, Fold::kCase);
  Cursor rest(text);
  rest.p = stopped;
  FoldedPart<Cursor> prepared(sort, *locale.language, folding, rest, part);
  return try_from(rest, [&](const Unit* candidate, size_t number, const Unit* end) {
    return !prepared || prepared.may_stand(candidate, number, end) ? Chance::kSome : Chance::kNone;
  });
}

template <class Cursor>
Place<Cursor> find_folded(LXLocale* locale, const Cursor& text, const Cursor& part, Fold fold, uint32_t options,
                          int32_t* code) {
  const auto try_from = [&](const Cursor& in, auto chance) {
    return try_candidates(locale, in, part, fold, options, chance, code);
  };
  const Sort* const sort = locale->sort != nullptr ? &sort_of(*locale->sort) : nullptr;
  if constexpr (!Cursor::kShifts)
    if (sort == nullptr || sort->appends_primaries)
      return search_patiently(*locale, text, part, sort, options, try_from);
  return try_from(text, [](auto...) { return Chance::kSome; });
}

/// In a single-byte codepage without regard to case: at every place, by LXStrcmp, as a trace shows it.
Place<SingleByteCursor> find_folded(LXLocale* locale, const SingleByteCursor& text,
                                    const SingleByteCursor& part, Fold fold, uint32_t, int32_t* code) {
  if (fold == Fold::kWidth) return find_exactly(text, part);  // it has one width
  const auto bytes = static_cast<int32_t>(part.end - part.p);
  const uint8_t* const lower = lower_table(codepage_of(*locale->codepage));
  const auto try_from = [&](const SingleByteCursor& in, auto chance) -> Place<SingleByteCursor> {
    for (const uint8_t* p = in.p; in.end - p >= bytes; ++p) {
      const Chance it_has = lower[*p] == lower[*part.p] ? chance(p, room(in.p, p), p + bytes) : Chance::kSome;
      if (it_has == Chance::kStop) break;
      if (it_has == Chance::kNone) continue;
      const int32_t difference =
          LXStrcmp(locale, chars_of(p), bytes, chars_of(part.p), bytes, LX_CASE_INSENSITIVE);
      *code = last_error_of(*locale);
      if (*code != LX_OK) break;
      if (difference == 0) return {p, text};
    }
    return {nullptr, text};
  };
  return search_patiently(*locale, text, part, nullptr, LX_CASE_INSENSITIVE, try_from);
}

template <class Cursor>
Place<Cursor> find_part(LXLocale* locale, const Cursor& text, const Cursor& part, uint32_t options,
                        int32_t* code) {
  if (part.p == part.end) return {text.p, text};
  // Between shift bytes characters count: bytes do not tell which text is longer.
  if (!Cursor::kShifts && part.end - part.p > text.end - text.p) return {nullptr, text};
  const Fold fold = fold_of(options);
  if (fold == Fold::kNone) return find_exactly(text, part);
  LXLocale own = own_record(*locale);
  return find_folded(&own, text, part, fold, options & LX_WIDTH_INSENSITIVE, code);
}

template <class Unit>
Unit* find_substring(LXLocale* given, Form form, const Text<Unit>& text, const Text<Unit>& part,
                     LXShiftState* state, uint32_t options) {
  Unit* const none = nullptr;
  return search(unit, given, form, text, part, options, LX_WIDTH_INSENSITIVE | LX_CHARACTERS, none,
                [&](Call& call, const auto& in, const auto& wanted) {
                  int32_t code = LX_OK;
                  const auto place = find_part(call.locale(), in, wanted, options, &code);
                  if (place.p != nullptr) put_state(state, state_at(place.in, text.state));
                  return call.fail(code, writable(place.p));
                });
}

}  // namespace

extern "C" {

char* LXStrstr(LXLocale* locale, const char* text, int32_t length, const char* part, int32_t part_length,
               uint32_t options) {
  return chars_of(find_substring(locale, Form::kPlain, text_of(text, length), text_of(part, part_length),
                                 nullptr, options));
}
char* LXStrstrEx(LXLocale* locale, const char* text, LXShiftState text_state, int32_t length, const char* part,
                 LXShiftState part_state, int32_t part_length, LXShiftState* state, uint32_t options) {
  return chars_of(find_substring(locale, Form::kEx, text_of(text, length, text_state),
                                 text_of(part, part_length, part_state), state, options));
}
LXWChar* LXWcsstr(LXLocale* locale, const LXWChar* text, int32_t length, const LXWChar* part,
                  int32_t part_length, uint32_t options) {
  return find_substring(locale, Form::kPlain, text_of(text, length), text_of(part, part_length), nullptr,
                        options);
}
LXUChar* LXStrstrU(LXLocale* locale, const LXUChar* text, int32_t length, const LXUChar* part,
                   int32_t part_length, uint32_t options) {
  return find_substring(locale, Form::kPlain, text_of(text, length), text_of(part, part_length), nullptr,
                        options);
}

}  // extern "C"
