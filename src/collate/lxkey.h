// Sort keys, and the folding of a text that options ask for, as collation shares them.
#pragma once

#include "collate/lxlevels.h"
#include "text/lxfold.h"

namespace lx {

/// What a character is folded to, and the special mappings that come first.
struct Folding {
  const Codepage& cp;
  Fold fold;
  Specials specials;  // none unless case is folded and the language has some

  Folding(const LXLocale& locale, Fold asked)
      : cp(codepage_of(*locale.codepage)),
        fold(asked),
        specials(asked == Fold::kCase ? specials_of(*locale.language, true) : Specials{nullptr, 0}) {}

  LXUChar folded(LXWChar code) const {
    if (fold == Fold::kCase) return unicode_of(cp, small_letter(cp, code));
    return unicode_of(cp, code <= 0xFF ? code : half_width(cp, code));
  }
  LXUChar folded(LXUChar u) const { return fold == Fold::kCase ? capital(cp, u) : half_width(cp, u); }

  /// How many characters a text of `units` units can have when it is folded.
  size_t most_chars(size_t units) const { return specials.count != 0 ? 2 * units : units; }
};

/// Reads a text folded: a special mapping of a character, or else of it and its successor, takes their place.
template <class In>
struct FoldCursor {
  using Unit = uint8_t;
  static constexpr bool kOneUnit = false;
  static constexpr bool kRuns = false;
  using Char = typename CharOf<typename In::Unit>::Type;

  const Folding& folding;
  In in;
  Char ahead = 0;
  LXUChar second = 0;
  bool has_ahead = false;
  bool has_second = false;

  bool next(LXUChar* u) {
    if (has_second) {
      has_second = false;
      *u = second;
      return true;
    }
    Char c = ahead;
    if (!has_ahead && !in.next(&c)) {
      in.p = in.end;
      return false;
    }
    has_ahead = false;
    if (folding.specials.count == 0 || !special(c, u)) *u = folding.folded(c);
    return true;
  }

 private:
  bool special(Char c, LXUChar* u) {
    const uint16_t value = unicode_of(folding.cp, c);
    int32_t results = folding.specials.find(value, 0, u, &second);
    if (results == 0) {
      has_ahead = in.next(&ahead);
      if (!has_ahead) return false;
      results = folding.specials.find(value, unicode_of(folding.cp, ahead), u, &second);
      if (results != 0) has_ahead = false;
    }
    has_second = results == 2;
    return results != 0;
  }
};

template <class In>
bool exhausted(const FoldCursor<In>& folded) {
  return !folded.has_second && !folded.has_ahead && exhausted(folded.in);
}
template <class In>
void drop_rest(FoldCursor<In>* folded) {
  drop_rest(&folded->in);
}

/// A key: the levels of a text in their space, and how long it will be.
class Key {
 public:
  template <class Cursor>
  Key(const Sort& sort, const Cursor& text, size_t most_chars, uint8_t* space)
      : levels_(sort, text, most_chars, space) {
    trim(sort);
  }

  size_t chars() const { return levels_.chars; }  // of the text
  size_t bytes() const;
  /// `output` may be the space of the levels, or stand before it.
  void write(uint8_t* output) const;

 private:
  void trim(const Sort& sort);

  Levels levels_;
  bool positions_ = true;  // whether the special level has them
};

}  // namespace lx
