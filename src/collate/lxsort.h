// A sort as collation works with it: weights laid flat when the object is loaded, and the walk over a text that
// gives one collation element after the other. All of it trusts the tables, which validate_sort() has checked.
#pragma once

#include "core/lxbytes.h"
#include "core/lxformat.h"
#include "core/lxobjman.h"

namespace lx {

/// What a character weighs. `sets`: how many weight sets it has; of two, the expansion table holds both.
struct Element {
  LXWeights weights;              // of two sets: `special` is the number of the expansion record
  unsigned char sets : 2;         // 0: the character is ignored
  unsigned char starts_pair : 1;  // some contraction begins with it
  unsigned char char_class : 4;   // LX_APPEND_ bits
};
static_assert(sizeof(Element) == 8, "one load an element");

/// Derived data of a sort object, one block with the elements behind it.
struct Sort {
  const uint8_t* payload;
  const uint8_t* contractions;
  const uint8_t* expansions;
  size_t contraction_count;
  uint8_t default_secondary;
  uint8_t default_tertiary;
  bool appends_primaries;  // no character inserts its primary ahead of others
  struct Page {
    const Element* elements;  // 256; null: computed from the fields below
    uint8_t flags;
    uint8_t char_class;
    uint16_t base;
  } pages[256];

  Element element(LXUChar u) const {
    const Page& page = pages[u >> 8];
    if (page.elements != nullptr) return page.elements[u & 0xFF];
    return computed(page, u);
  }

  static Element computed(const Page& page, LXUChar u) {
    Element element{};
    if ((page.flags & format::sort::kPageUncovered) != 0) return element;
    const auto weight = static_cast<uint16_t>(page.base + (u & 0xFF));
    if ((page.flags & format::sort::kPagePrimary) != 0)
      element.weights.primary = weight;
    else
      element.weights.special = weight;
    element.sets = 1;
    element.char_class = page.char_class & 0xF;
    return element;
  }

  /// Both sets of an element that has two.
  void expand(const Element& element, LXWeights* first, LXWeights* second) const {
    const uint8_t* record = expansions + format::sort::kExpansionBytes * element.weights.special + 2;
    *first = {le16(record), record[2], record[3], 0};
    *second = {le16(record + 4), record[6], record[7], 0};
  }

  /// The element of a pair: false when the pair is none.
  bool pair(LXUChar first, LXUChar second, Element* element) const;
};

/// The derived data of a loaded sort object.
inline const Sort& sort_of(const LXObject& object) {
  return *static_cast<const Sort*>(object.derived);
}

/// Whether a reader has come to the end of its text; a character that the end cuts is still before it.
template <class Reader>
bool exhausted(const Reader& in) {
  return in.p == in.end;
}

/// Forgets a character that the end cuts.
template <class Reader>
void drop_rest(Reader* in) {
  in->p = in->end;
}

/// Walks a text element by element. Pairs are matched from the left, two characters at a time.
template <class Reader>
class Elements {
 public:
  Elements(const Sort& sort, const Reader& in) : sort_(sort), in_(in) {}

  bool at_end() const { return !has_ahead_ && exhausted(in_); }

  /// The number of characters consumed, modulo 65,536.
  uint16_t position() const { return position_; }

  /// The next element; one without sets also stands for a character that the end of the text cuts.
  Element next() {
    LXUChar u = ahead_;
    if (!has_ahead_ && !in_.next(&u)) {
      drop_rest(&in_);
      return Element{};
    }
    has_ahead_ = false;
    ++position_;
    const Element element = sort_.element(u);
    if (!element.starts_pair || !in_.next(&ahead_)) return element;
    Element pair;
    if (sort_.pair(u, ahead_, &pair)) {
      ++position_;
      return pair;
    }
    has_ahead_ = true;
    return element;
  }

 private:
  const Sort& sort_;
  Reader in_;
  uint16_t position_ = 0;
  bool has_ahead_ = false;
  LXUChar ahead_ = 0;
};

}  // namespace lx
