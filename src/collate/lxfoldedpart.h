// A part that is looked for without regard to case, prepared: where it cannot stand is told in time that grows
// with the lengths of both texts, whatever they repeat.
#pragma once

#include "codepage/lxmapruns.h"
#include "collate/lxcollate.h"
#include "collate/lxkey.h"
#include "core/lxmemory.h"

namespace lx {

/// Of the places of a text, which are asked for in ascending order, those where the part may stand: in binary
/// order (`sort` is null), or by a sort that inserts no primaries. As many characters as are folded to those of
/// the part are found by the Z algorithm, which reads each once; behind the elements that they make the primaries
/// are compared, which mostly differ at once. Characters that may begin a special mapping of the language count as
/// they are: what becomes of them depends on what follows.
template <class Cursor>
class FoldedPart {
  using Unit = typename Cursor::Unit;

 public:
  FoldedPart(const Sort* sort, const LXObject& language, const Folding& folding, const Cursor& text,
             const Cursor& part)
      : sort_(sort),
        folding_(folding),
        specials_(language, true, true),
        text_(text),
        part_(part),
        part_end_(part.p),
        size_(chars_of(part)),
        block_(size_ <= SIZE_MAX / sizeof(Char) ? size_ * sizeof(Char) : SIZE_MAX),
        right_(text.p) {
    if (!block_) return;
    Char* const chars = block_.template as<Char>();
    size_t n = 0;
    for (Walk at(part); at.next(); ++n, part_end_ = at.in.p) {
      chars[n] = {counts_as(at.value), static_cast<uint32_t>(at.start - part.p), 0, 0};
      if ((chars[n].value & kSpecial) != 0) first_special_ = least(first_special_, n);
    }
    if (sort_ != nullptr) find_elements(chars);
    for (size_t left = 0, right = 1, i = 1; i < size_; ++i) {
      size_t same = i < right ? least(chars[i - left].same, right - i) : 0;
      if (i + same >= right) {
        while (i + same < size_ && is_char(chars[i + same].value, units_of(i + same), same)) ++same;
        left = i;
        right = i + same;
      }
      chars[i].same = static_cast<uint32_t>(same);
    }
  }
  /// False without memory.
  explicit operator bool() const { return static_cast<bool>(block_); }

  /// Whether the text from its character `number` at `place` to `end`, which has as many characters as the part,
  /// may be equal to it.
  bool may_stand(const Unit* place, size_t number, const Unit* end) {
    const size_t same = same_from(place, number);
    if (same == size_) return true;
    if (sort_ == nullptr) return specials_.any() && is_open(place, same);
    // An element that reaches over the first difference begins at the character before it at the earliest.
    const uint32_t units = at(at(same != 0 ? same - 1 : 0).element).units;
    return compare_primaries(*sort_, folded(text_, place + units, end),
                             folded(part_, part_.p + units, part_end_)) == 0;
  }

 private:
  static constexpr uint32_t kSpecial = 0x10000;

  struct Char {
    uint32_t value;    // that it counts as
    uint32_t units;    // before it in the part
    uint32_t same;     // as many characters from here on are those at the part's beginning
    uint32_t element;  // the last character up to this one with which an element begins
  };

  static size_t chars_of(const Cursor& part) {
    Cursor in(part);
    return pass_all(&in);
  }
  const Char& at(size_t i) const { return block_.template as<Char>()[i]; }
  size_t units_of(size_t i) const {
    return (i + 1 < size_ ? at(i + 1).units : room(part_.p, part_end_)) - at(i).units;
  }
  /// Folded as the comparison that follows does it: where special mappings count, that by code value maps to capitals.
  uint32_t counts_as(typename Cursor::Value value) const {
    const LXUChar u = unicode_of(folding_.cp, value);
    if (specials_.any() && specials_.may_begin(u)) return kSpecial | u;
    return sort_ == nullptr && specials_.any() ? unicode_of(folding_.cp, capital(folding_.cp, value))
                                               : folding_.folded(value);
  }
  /// Whether a character that counts as `value` and has so many units is that of the part.
  bool is_char(uint32_t value, size_t units, size_t i) const {
    return at(i).value == value && units_of(i) == units;
  }

  FoldCursor<Cursor> folded(const Cursor& text, const Unit* begin, const Unit* end) const {
    Cursor cut(text);
    cut.p = begin;
    cut.end = end;
    return {folding_, cut};
  }

  /// Whether texts mapped to capitals may be equal though at this character of the part they count as different.
  /// Behind a special mapping they may be: what it has grown by is cut from the end of some.
  bool is_open(const Unit* place, size_t i) const {
    if (i >= first_special_) return true;
    Cursor in(text_);
    in.p = place + at(i).units;
    Walk next(in);
    if (!next.next()) return true;
    const uint32_t value = counts_as(next.value);
    return value == at(i).value || (value & kSpecial) != 0;
  }

  /// Where special mappings may take part, an element begins for certain behind two characters without one of which
  /// the last begins no pair.
  void find_elements(Char* chars) const {
    if (specials_.any()) {
      for (size_t i = 1; i < size_; ++i) {
        const uint32_t before = chars[i - 1].value | (i > 1 ? chars[i - 2].value : 0);
        const bool begins =
            (before & kSpecial) == 0 && !sort_->element(static_cast<LXUChar>(chars[i - 1].value)).starts_pair();
        chars[i].element = begins ? static_cast<uint32_t>(i) : chars[i - 1].element;
      }
      return;
    }
    Elements<FoldCursor<Cursor>> elements(*sort_, folded(part_, part_.p, part_end_));
    for (size_t begin = 0, i = 0; i < size_; begin = i) {
      elements.next();
      for (const size_t end = least(elements.consumed(), size_); i < end; ++i)
        chars[i].element = static_cast<uint32_t>(begin);
    }
  }

  /// As many characters as are the same from a place on. From number `left_` on `agree_` characters, which end at
  /// `right_`, are known to be the part's: they are not read again.
  size_t same_from(const Unit* place, size_t number) {
    size_t same = 0;
    if (place < right_) {
      const size_t known = at(number - left_).same;
      const size_t left = left_ + agree_ - number;
      if (known < left) return known;
      same = left;
    } else {
      right_ = place;
    }
    for (; same < size_; ++same) {
      Cursor in(text_);
      in.p = right_;
      Walk next(in);
      if (!next.next() || !is_char(counts_as(next.value), next.units(), same)) break;
      right_ = next.in.p;
    }
    left_ = number;
    agree_ = same;
    return same;
  }

  const Sort* sort_;
  const Folding& folding_;
  const SpecialFilter specials_;
  const Cursor text_, part_;
  const Unit* part_end_;  // without a character that the end cuts
  size_t size_;
  WorkBuffer block_;
  size_t first_special_ = SIZE_MAX;
  const Unit* right_;
  size_t left_ = 0, agree_ = 0;
};

}  // namespace lx
