// Collation by weights: two texts are compared level by level, and on each level the first weights that differ
// decide. Where a sort appends all weights, a walk over the text gives those of a level one after the other;
// where it inserts some, they are laid out in buffers first. What both texts begin with is passed over before.
#pragma once

#include "collate/lxlevels.h"
#include "text/lxfold.h"
#include "text/lxwalk.h"

namespace lx {

/// Whether a trace shows what the functions of collation do.
bool collation_is_traced();

enum class WeightLevel { kPrimary, kSecondary, kTertiary, kSpecial };

/// What a weight set has on a level; 0: nothing.
template <WeightLevel kLevel>
uint32_t weight_of(const Element& set, uint16_t position) {
  if constexpr (kLevel == WeightLevel::kPrimary) return set.primary();
  if constexpr (kLevel == WeightLevel::kSecondary) return set.secondary();
  if constexpr (kLevel == WeightLevel::kTertiary) return set.tertiary();
  return set.placed_special(position);
}

// Sources of a text's weights: weights<level>() gives those of one level, next() one after the other, 0 at the
// end. kCountDecides: of two texts with the same beginning on a level the longer one is greater.

/// Walks the text for each level. Texts that are compared have the same weights before `rest`; special weights
/// are read from the start, because their positions count modulo 65,536.
template <class Cursor>
struct TextSource {
  const Sort& sort;
  const Cursor& text;
  const Cursor& rest;

  template <WeightLevel kLevel>
  struct Weights {
    static constexpr bool kCountDecides = true;
    WeightSets<Cursor> sets;

    [[gnu::always_inline]] uint32_t next() {
      while (!sets.at_end()) {
        const Element set = sets.next();
        if (const uint32_t weight = weight_of<kLevel>(set, sets.position())) return weight;
      }
      return 0;
    }
  };
  template <WeightLevel kLevel>
  Weights<kLevel> weights() const {
    return {{sort, kLevel == WeightLevel::kSpecial ? text : rest}};
  }
};

/// Reads the levels from buffers. How many primaries there are does not count where some are inserted: existing
/// results depend on it.
struct BufferSource {
  const Levels& levels;

  template <WeightLevel kLevel, class Weight>
  struct Weights {
    static constexpr bool kCountDecides = kLevel != WeightLevel::kPrimary;
    const Weight* p;
    const Weight* end;

    uint32_t next() { return p != end ? *p++ : 0; }
  };
  template <WeightLevel kLevel>
  auto weights() const {
    const auto in = [](const auto& level) {
      return Weights<kLevel, std::decay_t<decltype(*level.begin)>>{level.begin, level.end};
    };
    if constexpr (kLevel == WeightLevel::kPrimary) return in(levels.primaries);
    if constexpr (kLevel == WeightLevel::kSecondary) return in(levels.secondaries);
    if constexpr (kLevel == WeightLevel::kTertiary) return in(levels.tertiaries);
    if constexpr (kLevel == WeightLevel::kSpecial) return in(levels.specials);
  }
};

/// Compares one level: the first two weights that differ decide, or that one text has more of them.
template <WeightLevel kLevel, class Source>
int32_t compare_level(const Source& source1, const Source& source2) {
  auto a = source1.template weights<kLevel>();
  auto b = source2.template weights<kLevel>();
  for (;;) {
    const uint32_t x = a.next();
    const uint32_t y = b.next();
    if (x == y && x != 0) continue;
    if (x != 0 && y != 0) return difference(x, y);
    return a.kCountDecides ? (x != 0) - (y != 0) : 0;
  }
}

/// The rule: level by level. `primaries`: else these are known to be equal.
template <class Source>
int32_t compare_levels(const Source& a, const Source& b, bool primaries) {
  int32_t result = primaries ? compare_level<WeightLevel::kPrimary>(a, b) : 0;
  if (result == 0) result = compare_level<WeightLevel::kSecondary>(a, b);
  if (result == 0) result = compare_level<WeightLevel::kTertiary>(a, b);
  if (result == 0) result = compare_level<WeightLevel::kSpecial>(a, b);
  return result;
}

/// The first two primaries that differ, where no weight is inserted: they decide between keys as well. 0: else.
template <class Cursor>
int32_t compare_primaries(const Sort& sort, const Cursor& text1, const Cursor& text2) {
  auto a = TextSource<Cursor>{sort, text1, text1}.template weights<WeightLevel::kPrimary>();
  auto b = TextSource<Cursor>{sort, text2, text2}.template weights<WeightLevel::kPrimary>();
  for (;;) {
    const uint32_t x = a.next();
    const uint32_t y = b.next();
    if (x == 0 || y == 0) return 0;
    if (x != y) return difference(x, y);
  }
}

/// Compares primaries in the order of the texts until one is inserted ahead of others: then `*inserted` is set,
/// and nothing decided. Written apart, because it goes set by set on both sides: whether an inserted primary
/// behind the end of the other text decides depends on how far that side has come. Existing results need this.
template <class Cursor>
int32_t compare_until_inserted(const Sort& sort, const Cursor& text1, const Cursor& text2, bool* inserted) {
  WeightSets<Cursor> a(sort, text1);
  WeightSets<Cursor> b(sort, text2);
  uint32_t x = 0;
  uint32_t y = 0;
  const auto take = [inserted](WeightSets<Cursor>& sets) {
    const Element set = sets.next();
    if (set.primary() != 0 && !set.appends(LX_APPEND_PRIMARY)) *inserted = true;
    return set.primary();
  };
  const auto any_left = [](WeightSets<Cursor>& sets) {
    while (!sets.at_end())
      if (sets.next().primary() != 0) return true;
    return false;
  };
  while ((x != 0 || !a.at_end()) && (y != 0 || !b.at_end())) {
    if (x == 0) x = take(a);
    if (y == 0) y = take(b);
    if (*inserted) return 0;
    if (x == 0 || y == 0) continue;  // the side that has one holds it
    if (x != y) return difference(x, y);
    x = y = 0;
  }
  return (x != 0 || any_left(a)) - (y != 0 || any_left(b));
}

/// Compares texts whose weights are the same before `rest1` and `rest2`. `*code`: LX_OK, or LX_E_MEMORY.
template <class Cursor>
[[gnu::noinline]] int32_t compare_rest(const Sort& sort, const Cursor& text1, const Cursor& text2,
                                       const Cursor& rest1, const Cursor& rest2, int32_t* code) {
  const TextSource<Cursor> walk1{sort, text1, rest1};
  const TextSource<Cursor> walk2{sort, text2, rest2};
  if (sort.appends_all) return compare_levels(walk1, walk2, true);
  bool inserted = false;
  const int32_t result = sort.appends_primaries ? compare_level<WeightLevel::kPrimary>(walk1, walk2)
                                                : compare_until_inserted(sort, text1, text2, &inserted);
  if (result != 0) return result;
  const size_t chars1 = room(text1.p, text1.end);
  const size_t chars2 = room(text2.p, text2.end);
  const LevelSpace space(chars1, chars2);
  if (!space) *code = LX_E_MEMORY;
  if (!space) return 0;
  const Levels levels1(sort, text1, chars1, space.first.as<uint8_t>());
  const Levels levels2(sort, text2, chars2, space.second.as<uint8_t>());
  return compare_levels(BufferSource{levels1}, BufferSource{levels2}, inserted);
}

// The shortcut in front: what both texts begin with, and the first element behind it.
//
//   text 1   G e s p r ä c h s p a r t n e r
//   text 2   G e s p r ä c h s t h e m a
//            <--- the same --> ^ in both an element begins here
//
// Up to there the texts have the same elements, and so the same weights on every level. Mostly the elements
// that follow have primaries that differ, or soon others have; where a sort appends all primaries, that decides.

/// Takes the character at `*p` of a plain text; false at the end, and where the end cuts it. On places alone,
/// not by a reader: which kind of bytes they are is not asked before the shortcut has failed.
[[gnu::always_inline]] inline bool take_char(const Codepage& cp, const uint8_t** p, const uint8_t* end,
                                             LXUChar* u) {
  if (*p == end) return false;
  if (**p < cp.same_below) {  // apart: mostly no length needs to be looked up
    *u = *(*p)++;
    return true;
  }
  const size_t length = cp.length(**p);
  if (length > room(*p, end)) return false;
  *u = length == 1 ? cp.unicode[**p] : multibyte_unicode(cp, *p);
  *p += length;
  return true;
}
inline bool take_char(const Codepage& cp, const LXWChar** p, const LXWChar* end, LXUChar* u) {
  if (*p == end) return false;
  *u = code_to_unicode(cp, *(*p)++);
  return true;
}
inline bool take_char(const Codepage&, const LXUChar** p, const LXUChar* end, LXUChar* u) {
  if (*p == end) return false;
  *u = *(*p)++;
  return true;
}

/// The primary of the character at `*p` where it is an element by itself with one weight set; else 0.
template <class Unit>
[[gnu::always_inline]] inline uint32_t take_primary(const Codepage& cp, const Sort& sort, const Unit** p,
                                                    const Unit* end) {
  LXUChar u = 0;
  if (!take_char(cp, p, end, &u)) return 0;
  const Element element = sort.element(u);
  if (element.stands_alone()) return element.primary();
  if (sort.may_end_pair(u)) return 0;
  const Unit* next = *p;
  if (element.starts_pair() && take_char(cp, &next, end, &u) && sort.may_end_pair(u)) return 0;
  return element.sets() == 1 ? element.primary() : 0;
}

/// How many of the `whole` units that both texts begin with are the same elements in both.
template <class Unit>
size_t equal_elements(const Codepage& cp, const Sort& sort, const Unit* text1, const Unit* end1,
                      const Unit* text2, const Unit* end2, size_t whole) {
  if (whole == 0 || sort.pair_count == 0) return whole;
  const Unit* last = text1 + whole_units(cp, text1, whole - 1);
  LXUChar first = 0;
  if (!take_char(cp, &last, end1, &first) || !sort.element(first).starts_pair()) return whole;
  const auto reaches_over = [&](const Unit* p, const Unit* end) {
    LXUChar second = 0;
    Element pair;
    return take_char(cp, &p, end, &second) && sort.pair(first, second, &pair);
  };
  return reaches_over(text1 + whole, end1) || reaches_over(text2 + whole, end2) ? 0 : whole;
}

/// What the beginnings of two texts tell.
struct Beginnings {
  int32_t result;  // the difference, or 0
  size_t same;     // units that are the same elements in both
};
template <class Unit>
[[gnu::always_inline]] inline Beginnings compare_beginnings(const Codepage& cp, const Sort& sort,
                                                            const Unit* text1, size_t units1, const Unit* text2,
                                                            size_t units2) {
  const size_t same = whole_units(cp, text1, equal_units(text1, units1, text2, units2));
  const Unit* const end1 = text1 + units1;
  const Unit* const end2 = text2 + units2;
  // Primaries, as long as characters are elements by themselves; one that stands against the end decides too.
  const Unit *p = text1 + same, *q = text2 + same;
  for (;;) {
    const bool end_p = p == end1, end_q = q == end2;
    const uint32_t x = take_primary(cp, sort, &p, end1);
    const uint32_t y = take_primary(cp, sort, &q, end2);
    if (x == y && x != 0) continue;
    if (x != 0 && y != 0) return {difference(x, y), 0};
    if ((end_p && y != 0) || (end_q && x != 0)) return {end_p ? -1 : 1, 0};
    break;
  }
  return {0, equal_elements(cp, sort, text1, end1, text2, end2, same)};
}

}  // namespace lx
