// Collation: two strings compared by the weights of a sort. While every primary weight is appended the first
// primaries that differ decide, and nothing is stored. Only texts with equal primaries, and those with an
// inserted one, are compared level by level. With options, keys are compared.
#include <cstring>

#include "collate/lxkey.h"
#include "core/lxcall.h"
#include "locale/lxlocale.h"

namespace {

using lx::bytes_of;
using lx::Call;
using lx::Codepage;
using lx::codepage_of;
using lx::Element;
using lx::Fold;
using lx::Form;
using lx::Level;
using lx::Levels;
using lx::Sort;

RAS1_Unit unit = RAS1_UNIT("lxcoll");

constexpr uint32_t kBlanksOption = 0x1;  // part of LX_WIDTH_INSENSITIVE
constexpr uint32_t kTruncation = 0x00800000u | LX_WIDTH_INSENSITIVE;

/// One text while primaries decide.
template <class Cursor>
struct Side {
  lx::Elements<Cursor> elements;
  Element element;
  Element second;
  bool pending = false;  // the second set of an expansion
  bool needs = true;     // an element

  Side(const Sort& sort, const Cursor& text) : elements(sort, text) {}

  bool used_up() const { return !pending && elements.at_end(); }
  int32_t primary() const { return static_cast<int32_t>(element.primary()); }
  bool inserts() const { return primary() != 0 && (element.char_class() & LX_APPEND_PRIMARY) == 0; }
  void take(const Sort& sort) {
    if (pending) {
      element = second;
      pending = false;
      return;
    }
    element = elements.next();
    pending = element.sets() == 2;
    if (!pending) return;
    second = sort.second_set(element);
    element = sort.first_set(element);
  }
  /// Whether a primary is left.
  bool has_primary_left(const Sort& sort) {
    while (!used_up()) {
      take(sort);
      if (primary() != 0) return true;
    }
    return false;
  }
};

/// Compares primaries in the order of the texts: the difference, or 0 with `*inserted` when the levels must be
/// compared, all of them or those behind the primaries.
template <class Cursor>
int32_t compare_directly(const Sort& sort, const Cursor& text1, const Cursor& text2, bool* inserted) {
  Side<Cursor> a(sort, text1);
  Side<Cursor> b(sort, text2);
  *inserted = false;
  while (!(a.needs && a.used_up()) && !(b.needs && b.used_up())) {
    if (a.needs) a.take(sort);
    if (b.needs) b.take(sort);
    *inserted = (a.needs && a.inserts()) || (b.needs && b.inserts());
    if (*inserted) return 0;
    const int32_t primary1 = a.primary();
    const int32_t primary2 = b.primary();
    if (primary1 != 0 && primary2 != 0) {
      if (primary1 != primary2) return primary1 - primary2;
    } else if (primary1 != 0 && b.used_up()) {
      return 1;
    } else if (primary2 != 0 && a.used_up()) {
      return -1;
    }
    // A side holds its primary while the other one passes what it ignores.
    a.needs = primary1 == 0 || primary2 != 0;
    b.needs = primary2 == 0 || primary1 != 0;
  }
  if (b.used_up() && a.has_primary_left(sort)) return 1;
  if (a.used_up() && b.has_primary_left(sort)) return -1;
  return 0;
}

/// The longer of two levels with an equal beginning is the greater.
int32_t compare_bytes(const Level<uint8_t>& a, const Level<uint8_t>& b) {
  const int32_t difference = memcmp(a.begin, b.begin, lx::least(a.count(), b.count()));
  return difference != 0 ? difference : (a.count() > b.count()) - (a.count() < b.count());
}

/// Here it is not: primaries of different number with an equal beginning do not decide.
int32_t compare_primaries(const Level<uint16_t>& a, const Level<uint16_t>& b) {
  const size_t n = lx::least(a.count(), b.count());
  for (size_t i = 0; i < n; ++i)
    if (a.begin[i] != b.begin[i]) return a.begin[i] - b.begin[i];
  return 0;
}

int32_t compare_specials(const Level<lx::PlacedSpecial>& a, const Level<lx::PlacedSpecial>& b) {
  const size_t n = lx::least(a.count(), b.count());
  for (size_t i = 0; i < n; ++i) {
    if (a.begin[i].position != b.begin[i].position) return a.begin[i].position - b.begin[i].position;
    if (a.begin[i].weight != b.begin[i].weight) return a.begin[i].weight - b.begin[i].weight;
  }
  return (a.count() > b.count()) - (a.count() < b.count());
}

/// Whether the levels of both texts have room; `chars` characters each at most.
struct LevelSpace {
  lx::WorkBuffer first;
  lx::WorkBuffer second;

  LevelSpace(size_t chars1, size_t chars2) : first(bytes_for(chars1)), second(bytes_for(chars2)) {}
  explicit operator bool() const { return first && second; }

 private:
  static size_t bytes_for(size_t chars) {
    return Levels::bytes_for(chars <= Levels::kMostChars ? chars : Levels::kMostChars);
  }
};

template <class Cursor>
int32_t compare_levels(const Sort& sort, const Cursor& text1, const Cursor& text2, bool primaries,
                       int32_t* code) {
  const size_t chars1 = lx::room(text1.p, text1.end);
  const size_t chars2 = lx::room(text2.p, text2.end);
  const LevelSpace space(chars1, chars2);
  *code = LX_E_MEMORY;
  if (!space || chars1 > Levels::kMostChars || chars2 > Levels::kMostChars) return 0;
  *code = LX_OK;
  const Levels a(sort, text1, chars1, space.first.as<uint8_t>());
  const Levels b(sort, text2, chars2, space.second.as<uint8_t>());
  if (primaries)
    if (const int32_t difference = compare_primaries(a.primaries, b.primaries)) return difference;
  if (const int32_t difference = compare_bytes(a.secondaries, b.secondaries)) return difference;
  if (const int32_t difference = compare_bytes(a.tertiaries, b.tertiaries)) return difference;
  return compare_specials(a.specials, b.specials);
}

/// Compares the weights of one level that are not 0, in the order of the texts: the shorter of two equal
/// beginnings is less. `weight_of(set, position)` is 0 for none.
template <class Cursor, class WeightOf>
int32_t compare_appended(const Sort& sort, const Cursor& text1, const Cursor& text2, WeightOf weight_of) {
  lx::WeightSets<Cursor> a(sort, text1);
  lx::WeightSets<Cursor> b(sort, text2);
  const auto next = [&](lx::WeightSets<Cursor>& sets) {
    Element set;
    while (sets.next(&set))
      if (const int64_t weight = weight_of(set, sets.position())) return weight;
    return int64_t{0};
  };
  for (;;) {
    const int64_t weight1 = next(a);
    const int64_t weight2 = next(b);
    if (weight1 == weight2 && weight1 != 0) continue;
    if (weight1 == 0 || weight2 == 0) return (weight1 != 0) - (weight2 != 0);
    const int64_t difference = weight1 - weight2;
    return static_cast<int32_t>(difference > INT32_MAX ? 1 : difference < -INT32_MAX ? -1 : difference);
  }
}

/// How many units two texts begin with alike.
template <class Unit>
[[gnu::always_inline]] inline size_t equal_units(const Unit* a, size_t units1, const Unit* b, size_t units2) {
  const size_t most = lx::least(units1, units2);
  if (most == 0 || a[0] != b[0]) return 0;  // most texts, and words of no foreseeable number cost more
  constexpr size_t kWord = sizeof(uint64_t) / sizeof(Unit);
  size_t n = 0;
  for (; most - n >= kWord; n += kWord) {
    const auto word = [n](const Unit* text) { return lx::le64(reinterpret_cast<const uint8_t*>(text + n)); };
    const uint64_t bits = word(a) ^ word(b);
    if (bits != 0) return n + static_cast<size_t>(__builtin_ctzll(bits)) / (8 * sizeof(Unit));
  }
  while (n < most && a[n] == b[n]) ++n;
  return n;
}

/// Whether a character begins at `n`, as far as the bytes before it tell: none of them can begin one that goes
/// on there.
bool surely_begins(const Codepage& cp, const uint8_t* text, size_t n) {
  for (size_t back = 1; back < lx::kMaxCharBytes && back <= n; ++back)
    if (cp.length(text[n - back]) > back) return false;
  return true;
}

/// Whether the ASCII character at `p` may be one element with what follows.
template <class Unit>
bool may_reach_on(const Sort& sort, const Unit* p, const Unit* end) {
  if (!sort.element(static_cast<LXUChar>(*p)).starts_pair() || ++p == end) return false;
  return *p >= lx::kAsciiUnits || sort.may_end_pair(static_cast<LXUChar>(*p));
}

/// The difference of two texts that begin with the same `same` units, when ASCII characters that decide follow
/// in both; else 0.
template <class Unit>
[[gnu::always_inline]] inline int32_t compare_ascii(const Codepage& cp, const Sort& sort, const Unit* text1,
                                                    size_t units1, const Unit* text2, size_t units2,
                                                    size_t same) {
  if (same == units1 || same == units2) return 0;
  if (text1[same] >= lx::kAsciiUnits || text2[same] >= lx::kAsciiUnits) return 0;
  if constexpr (sizeof(Unit) == 1)
    if (!surely_begins(cp, text1, same)) return 0;
  const int32_t primary1 = sort.deciding[text1[same]];
  const int32_t primary2 = sort.deciding[text2[same]];
  if (primary1 == 0 || primary2 == 0) return 0;
  const bool reach_on = sort.pair_count != 0 && (may_reach_on(sort, text1 + same, text1 + units1) ||
                                                 may_reach_on(sort, text2 + same, text2 + units2));
  return reach_on ? 0 : primary1 - primary2;
}

/// Compares the beginnings of two texts: their difference where that tells them apart, else 0. `*same` receives
/// how many units they begin with alike.
template <class Unit>
[[gnu::always_inline]] inline int32_t compare_beginnings(const Codepage& cp, const Sort& sort,
                                                         const Unit* text1, size_t units1, const Unit* text2,
                                                         size_t units2, size_t* same) {
  *same = equal_units(text1, units1, text2, units2);
  const bool ascii = sizeof(Unit) == sizeof(LXUChar) || cp.same_below >= lx::kAsciiUnits;
  return ascii ? compare_ascii(cp, sort, text1, units1, text2, units2, *same) : 0;
}

/// How many of the first `units` units are whole characters.
template <class Cursor>
size_t whole_units(const Cursor& in, size_t units) {
  if constexpr (Cursor::kOneUnit) {
    return units;
  } else {
    for (size_t n = units; n + lx::kMaxCharBytes > units && n > 0; --n)
      if (surely_begins(in.cp, in.p, n)) return n;
    size_t n = 0;
    for (size_t length = 0; n < units && (length = in.cp.length(in.p[n])) <= units - n;) n += length;
    return n;
  }
}

/// How many of the `same` units that both texts begin with stand before a place that no element reaches over.
template <class Cursor>
size_t equal_beginning(const Sort& sort, const Cursor& text1, const Cursor& text2, size_t same) {
  if (same == 0) return 0;
  const size_t whole = whole_units(text1, same);
  if (whole == 0 || sort.pair_count == 0) return whole;
  const size_t last = whole_units(text1, whole - 1);
  LXUChar u = 0;
  lx::like(text1, text1.p + last, whole - last, LX_SHIFT_SINGLE).next(&u);
  if (!sort.element(u).starts_pair()) return whole;
  const auto reaches_on = [&](const Cursor& text) {
    LXUChar next = 0;
    Element pair;
    return lx::like(text, text.p + whole, lx::room(text.p, text.end) - whole, LX_SHIFT_SINGLE).next(&next) &&
           sort.pair(u, next, &pair);
  };
  return reaches_on(text1) || reaches_on(text2) ? 0 : whole;
}

/// The keys of two texts of at most `chars1` and `chars2` characters, compared.
template <class Cursor>
int32_t compare_keys(const Sort& sort, const Cursor& text1, size_t chars1, const Cursor& text2, size_t chars2,
                     int32_t* code) {
  const LevelSpace space(chars1, chars2);
  *code = LX_E_MEMORY;
  if (!space || chars1 > Levels::kMostChars || chars2 > Levels::kMostChars) return 0;
  *code = LX_OK;
  uint8_t* const bytes1 = space.first.as<uint8_t>();
  uint8_t* const bytes2 = space.second.as<uint8_t>();
  const lx::Key key1(sort, text1, chars1, bytes1);
  const lx::Key key2(sort, text2, chars2, bytes2);
  const size_t size1 = key1.bytes();
  const size_t size2 = key2.bytes();
  key1.write(bytes1);
  key2.write(bytes2);
  const int32_t difference = memcmp(bytes1, bytes2, lx::least(size1, size2));
  return difference != 0 ? difference : (size1 > size2) - (size1 < size2);
}

/// Compares texts whose characters weigh one by one on the same levels: false where some do not.
template <class Cursor>
[[gnu::noinline]] bool compare_in_step(const Sort& sort, const Cursor& text1, const Cursor& text2,
                                       int32_t* difference) {
  int32_t secondary = 0;
  int32_t tertiary = 0;
  // Notes the first difference of a level; false where only one of the two weighs on it.
  const auto note = [](uint32_t weight1, uint32_t weight2, int32_t* first) {
    if (*first == 0) *first = static_cast<int32_t>(weight1) - static_cast<int32_t>(weight2);
    return weight1 == weight2 || (weight1 != 0 && weight2 != 0);
  };
  lx::Elements<Cursor> a(sort, text1);
  lx::Elements<Cursor> b(sort, text2);
  for (;;) {
    const bool more1 = !a.at_end();
    const bool more2 = !b.at_end();
    if (!more1 && !more2) break;
    const Element x = more1 ? a.next() : Element();
    const Element y = more2 ? b.next() : Element();
    if ((more1 && x.sets() != 1) || (more2 && y.sets() != 1)) return false;
    if (x.primary() != y.primary()) {
      *difference = more1 && more2 ? static_cast<int32_t>(x.primary()) - static_cast<int32_t>(y.primary())
                                   : more1 - more2;
      return !more1 || !more2 || (x.primary() != 0 && y.primary() != 0);
    }
    if (!more1 || !more2 || x.special() != y.special()) return false;
    if (x.special() != 0 && a.position() != b.position()) return false;
    if (!note(x.secondary(), y.secondary(), &secondary)) return false;
    if (!note(x.tertiary(), y.tertiary(), &tertiary)) return false;
  }
  *difference = secondary != 0 ? secondary : tertiary;
  return true;
}

/// Compares texts that begin alike: `rest1` and `rest2` are what follows.
template <class Cursor>
[[gnu::noinline]] int32_t compare_rest(const Sort& sort, const Cursor& text1, const Cursor& text2,
                                       const Cursor& rest1, const Cursor& rest2, int32_t* code) {
  if (rest1.p == rest1.end && rest2.p == rest2.end) return 0;
  const auto compare = [&](auto weight_of) { return compare_appended(sort, rest1, rest2, weight_of); };
  if (const int32_t difference = compare([](const Element& set, uint16_t) { return set.primary(); }))
    return difference;
  if (!sort.appends_all) return compare_levels(sort, text1, text2, false, code);
  if (const int32_t difference = compare([](const Element& set, uint16_t) { return set.secondary(); }))
    return difference;
  if (const int32_t difference = compare([](const Element& set, uint16_t) { return set.tertiary(); }))
    return difference;
  // From the start: positions count modulo 65,536.
  return compare_appended(sort, text1, text2, [](const Element& set, uint16_t position) {
    return set.special() != 0 ? int64_t{position} << 16 | set.special() : 0;
  });
}

template <class Cursor>
[[gnu::noinline]] int32_t compare_inserted(const Sort& sort, const Cursor& text1, const Cursor& text2,
                                           int32_t* code) {
  bool inserted = false;
  const int32_t difference = compare_directly(sort, text1, text2, &inserted);
  return difference != 0 ? difference : compare_levels(sort, text1, text2, inserted, code);
}

/// Compares by the weights alone. Most texts are told apart by the first character that differs. `same`: how
/// many units they begin with alike.
template <class Cursor>
int32_t compare_weights(const Sort& sort, const Cursor& text1, const Cursor& text2, size_t same,
                        int32_t* code) {
  if (!sort.appends_primaries) return compare_inserted(sort, text1, text2, code);
  const size_t equal = equal_beginning(sort, text1, text2, same);
  const auto rest = [equal](const Cursor& text) {
    LXShiftState state = LX_SHIFT_SINGLE;
    if constexpr (Cursor::kShifts) state = text.state;
    return lx::like(text, text.p + equal, lx::room(text.p, text.end) - equal, state);
  };
  const Element x = lx::Elements<Cursor>(sort, rest(text1)).next();
  const Element y = lx::Elements<Cursor>(sort, rest(text2)).next();
  const bool decided =
      x.sets() == 1 && y.sets() == 1 && x.primary() != 0 && y.primary() != 0 && x.primary() != y.primary();
  if (decided) return static_cast<int32_t>(x.primary()) - static_cast<int32_t>(y.primary());
  int32_t difference = 0;
  if (sort.appends_all && compare_in_step(sort, rest(text1), rest(text2), &difference)) return difference;
  return compare_rest(sort, text1, text2, rest(text1), rest(text2), code);
}

/// Compares two texts of one kind by the locale's sort, as `options` ask. `same`: of how many units it is known
/// that both begin with them.
template <class Cursor>
int32_t collate(const LXLocale& locale, const Cursor& text1, const Cursor& text2, uint32_t options, size_t same,
                int32_t* code) {
  const Sort& sort = lx::sort_of(*locale.sort);
  if (options == 0) return compare_weights(sort, text1, text2, same, code);
  Fold fold;
  if (!lx::fold_of(options, &fold)) {
    *code = LX_E_INVALID;
    return 0;
  }
  const lx::Folding folding(locale, fold);
  const auto chars = [&](const Cursor& text) { return folding.most_chars(lx::room(text.p, text.end)); };
  return compare_keys(sort, lx::FoldCursor<Cursor>{folding, text1}, chars(text1),
                      lx::FoldCursor<Cursor>{folding, text2}, chars(text2), code);
}

/// A byte text that a collation function was given.
struct ByteText {
  const char* text;
  LXShiftState state;
  size_t bytes;
};

int32_t truncate(LXLocale* locale, char* copy, const ByteText& text, Form form) {
  const auto size = static_cast<int32_t>(text.bytes + 1);
  return form == Form::kEx ? LXTruncateStringEx(locale, copy, text.state, size, kTruncation)
                           : LXTruncateString(locale, copy, size, kTruncation);
}

/// Takes the blanks at the end out of both lengths. Of the second text no more is looked at than the first one
/// has left: what follows does not count. Existing results depend on it. Without memory blanks count.
void drop_blanks(LXLocale* locale, ByteText* text1, ByteText* text2, Form form) {
  const size_t longer = text1->bytes > text2->bytes ? text1->bytes : text2->bytes;
  if (longer >= INT32_MAX) return;
  const lx::WorkBuffer copy(longer + 1);
  if (!copy) return;
  char* const buffer = copy.as<char>();
  const auto drop = [&](ByteText* text, size_t copied) {
    memcpy(buffer, text->text, copied);
    buffer[copied] = '\0';
    text->bytes = static_cast<size_t>(truncate(locale, buffer, *text, form)) - 1;
  };
  drop(text1, text1->bytes);
  drop(text2, lx::least(text1->bytes, text2->bytes));
}

/// Both byte forms. `in_binary(length1, length2, options)` compares by code value where the locale has no sort.
template <class InBinary>
[[gnu::noinline]] int32_t collate_bytes(Call* call, ByteText&& text1, int32_t length1, ByteText&& text2,
                                        int32_t length2, uint32_t options, Form form, InBinary in_binary) {
  LXLocale* locale = call->locale();
  const Codepage& cp = codepage_of(*locale->codepage);
  text1.bytes = lx::units_of(cp, lx::ByteText{bytes_of(text1.text), length1, text1.state},
                             (options & LX_CHARACTERS) != 0);
  text2.bytes = lx::units_of(cp, lx::ByteText{bytes_of(text2.text), length2, text2.state},
                             (options & LX_CHARACTERS) != 0);
  options &= ~uint32_t{LX_CHARACTERS};
  if (locale->sort == nullptr) {
    // Comparison has its own error code, and its own rule for null-terminated texts.
    const auto length_of = [](const ByteText& text, int32_t length) {
      return length < 0 ? length : static_cast<int32_t>(text.bytes);
    };
    const int32_t difference = in_binary(length_of(text1, length1), length_of(text2, length2), options);
    return call->fail(locale->last_error, difference);
  }
  if ((options & kBlanksOption) != 0) {
    drop_blanks(locale, &text1, &text2, form);
    options &= ~LX_IGNORE_BLANKS;
  }
  int32_t code = LX_OK;
  const int32_t difference =
      lx::with_cursor(cp, form, text1.state, bytes_of(text1.text), text1.bytes, [&](const auto& in) {
        return collate(*locale, in, lx::like(in, bytes_of(text2.text), text2.bytes, text2.state), options, 0,
                       &code);
      });
  return call->fail(code, difference);
}

/// The options that comparison by code value knows.
uint32_t binary_options(uint32_t options, bool knows_width) {
  const bool width = knows_width && (options & LX_WIDTH_INSENSITIVE) == LX_WIDTH_INSENSITIVE;
  return options & ((width ? LX_WIDTH_INSENSITIVE : LX_CASE_INSENSITIVE) | LX_IGNORE_BLANKS);
}

/// The units before the blanks at the end. `full_width` is the full-width blank, or the blank again.
template <class Unit>
size_t without_blanks(const Unit* text, size_t count, Unit blank, Unit full_width) {
  while (count > 0 && (text[count - 1] == blank || text[count - 1] == full_width)) --count;
  return count;
}

/// Both forms of one unit a character. `full_width(blank)` gives the full-width form of a blank; `reader(cp,
/// text, count)` the reader.
template <class Unit, class FullWidth, class MakeReader>
int32_t collate_units(Call* call, const Unit* text1, int32_t length1, const Unit* text2, int32_t length2,
                      uint32_t options, FullWidth full_width, MakeReader reader) {
  const LXLocale& locale = *call->locale();
  const Codepage& cp = codepage_of(*locale.codepage);
  size_t count1 = lx::text_units(text1, length1);
  size_t count2 = lx::text_units(text2, length2);
  if ((options & LX_IGNORE_BLANKS) != 0) {
    const Unit blank = lx::keeps_ascii(locale) ? 0x20 : 0x40;
    const bool width = (options & LX_WIDTH_INSENSITIVE) == LX_WIDTH_INSENSITIVE;
    const Unit full = width ? full_width(blank) : blank;
    count1 = without_blanks(text1, count1, blank, full);
    count2 = without_blanks(text2, count2, blank, full);
  }
  options &= ~(LX_IGNORE_BLANKS | LX_CHARACTERS);
  size_t same = 0;
  if (options == 0) {
    const Sort& sort = lx::sort_of(*locale.sort);
    const int32_t difference = compare_beginnings(cp, sort, text1, count1, text2, count2, &same);
    if (difference != 0) return call->exit(difference);
  }
  int32_t code = LX_OK;
  const int32_t difference =
      collate(locale, reader(cp, text1, count1), reader(cp, text2, count2), options, same, &code);
  return call->fail(code, difference);
}

}  // namespace

extern "C" {

int32_t LXStrcoll(LXLocale* locale, const char* text1, int32_t length1, const char* text2, int32_t length2,
                  uint32_t options) {
  Call call(unit, locale);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, 0);
  if (options == 0 && call.locale()->sort != nullptr) {  // most calls, at once
    const Sort& sort = lx::sort_of(*call.locale()->sort);
    const Codepage& cp = codepage_of(call.codepage());
    const uint8_t* const p1 = bytes_of(text1);
    const uint8_t* const p2 = bytes_of(text2);
    const size_t bytes1 = lx::text_units(text1, length1);
    const size_t bytes2 = lx::text_units(text2, length2);
    size_t same = 0;
    int32_t code = LX_OK;
    int32_t difference = compare_beginnings(cp, sort, p1, bytes1, p2, bytes2, &same);
    if (difference == 0)
      difference = lx::with_cursor(cp, Form::kPlain, LX_SHIFT_SINGLE, p1, bytes1, [&](const auto& in) {
        return compare_weights(sort, in, lx::like(in, p2, bytes2, LX_SHIFT_SINGLE), same, &code);
      });
    return call.fail(code, difference);
  }
  return collate_bytes(&call, {text1, LX_SHIFT_SINGLE, 0}, length1, {text2, LX_SHIFT_SINGLE, 0}, length2,
                       options, Form::kPlain, [=](int32_t bytes1, int32_t bytes2, uint32_t left) {
                         return LXStrcmp(locale, text1, bytes1, text2, bytes2, left);
                       });
}

int32_t LXStrcollEx(LXLocale* locale, const char* text1, LXShiftState state1, int32_t length1,
                    const char* text2, LXShiftState state2, int32_t length2, uint32_t options) {
  const LXLocale* used = lx::locale_of(locale);
  if (used == nullptr || !codepage_of(*used->codepage).shift_sensitive)
    return LXStrcoll(locale, text1, length1, text2, length2, options);
  Call call(unit, locale);
  return collate_bytes(&call, {text1, state1, 0}, length1, {text2, state2, 0}, length2, options, Form::kEx,
                       [&](int32_t bytes1, int32_t bytes2, uint32_t left) {
                         return LXStrcmpEx(locale, text1, state1, bytes1, text2, state2, bytes2,
                                           binary_options(left, true));
                       });
}

int32_t LXWcscoll(LXLocale* locale, const LXWChar* text1, int32_t length1, const LXWChar* text2,
                  int32_t length2, uint32_t options) {
  Call call(unit, locale);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, 0);
  if (call.locale()->sort == nullptr) {
    const int32_t difference = LXWcscmp(locale, text1, length1, text2, length2, binary_options(options, false));
    return call.fail(call.locale()->last_error, difference);
  }
  const auto full_width = [&](LXWChar blank) {
    LXMapStringW(locale, &blank, 1, &blank, 1, LX_MAP_FULL_WIDTH);
    return blank;
  };
  return collate_units(&call, text1, length1, text2, length2, options, full_width,
                       [](const Codepage& cp, const LXWChar* text, size_t count) {
                         return lx::CodeCursor{cp, text, text + count};
                       });
}

int32_t LXStrcollU(LXLocale* locale, const LXUChar* text1, int32_t length1, const LXUChar* text2,
                   int32_t length2, uint32_t options) {
  constexpr uint32_t kInvalidOptions = 0x7FDFFFBE;
  Call call(unit, locale);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, 0);
  if ((options & kInvalidOptions) != 0) return call.fail(LX_E_INVALID, 0);
  if (call.locale()->sort == nullptr) {
    const int32_t difference = LXStrcmpU(locale, text1, length1, text2, length2, binary_options(options, true));
    return call.fail(call.locale()->last_error, difference);
  }
  const auto full_width = [&](LXUChar blank) {
    LXMapStringU(locale, &blank, 1, &blank, 1, LX_MAP_FULL_WIDTH);
    return blank;
  };
  return collate_units(&call, text1, length1, text2, length2, options, full_width,
                       [](const Codepage&, const LXUChar* text, size_t count) {
                         return lx::UnicodeCursor{text, text + count};
                       });
}

}  // extern "C"
