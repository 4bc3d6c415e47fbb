// A sort as collation works with it: weights laid flat when the object is loaded, and the walk over a text that
// gives one collation element after the other. All of it trusts the tables, which were validated then.
#pragma once

#include "codepage/lxtext.h"
#include "core/lxbytes.h"
#include "core/lxformat.h"
#include "core/lxobjman.h"
#include "core/lxobjtypes.h"

namespace lx {

/// What a character weighs, in one word:
///
///   bits   0..15    primary   16..23 secondary   24..31 tertiary   32..47 special
///         48..49    the number of weight sets, 0 to 2
///         50        some pair begins with the character
///         51        it stands alone, in no pair, with one set and a primary
///         52..55    its class
///         56        it has one set, and a primary
///         57        some pair ends with the character
///
/// Of two sets the expansion table holds both; the special weight is then the number of the record.
class Element {
 public:
  Element() = default;
  Element(const LXWeights& w, unsigned sets, unsigned char_class)
      : bits_(w.primary | uint64_t{w.secondary} << 16 | uint64_t{w.tertiary} << 24 | uint64_t{w.special} << 32 |
              uint64_t{sets} << 48 | uint64_t{char_class & 0xF} << 52) {}

  uint32_t primary() const { return static_cast<uint16_t>(bits_); }
  uint32_t secondary() const { return static_cast<uint8_t>(bits_ >> 16); }
  uint32_t tertiary() const { return static_cast<uint8_t>(bits_ >> 24); }
  uint32_t special() const { return static_cast<uint16_t>(bits_ >> 32); }
  LXWeights weights() const {
    return {static_cast<uint16_t>(primary()), static_cast<uint8_t>(secondary()),
            static_cast<uint8_t>(tertiary()), static_cast<uint16_t>(special())};
  }
  unsigned sets() const { return bits_ >> 48 & 3; }  // 0: the character is ignored
  bool starts_pair() const { return has(kStartsPair); }
  bool ends_pair() const { return has(kEndsPair); }
  unsigned char_class() const { return bits_ >> 52 & 0xF; }  // LX_APPEND_ bits
  bool appends(unsigned bit) const { return (char_class() & bit) != 0; }

  /// The special weight behind its position, by which it counts first; 0 for none.
  uint32_t placed_special(uint16_t position) const {
    return special() != 0 ? uint32_t{position} << 16 | special() : 0;
  }

  /// Known of characters with a table; false of others.
  bool stands_alone() const { return has(kStandsAlone); }
  bool has_own_primary() const { return has(kOwnPrimary); }

  void set_starts_pair() { bits_ |= uint64_t{1} << kStartsPair; }
  void set_ends_pair() { bits_ |= uint64_t{1} << kEndsPair; }
  void note_own_primary() { bits_ |= uint64_t{sets() == 1 && primary() != 0} << kOwnPrimary; }
  void set_stands_alone() { bits_ |= uint64_t{1} << kStandsAlone; }

 private:
  friend class ElementSummary;
  enum : unsigned { kStartsPair = 50, kStandsAlone = 51, kClass = 52, kOwnPrimary = 56, kEndsPair = 57 };
  bool has(unsigned bit) const { return (bits_ & uint64_t{1} << bit) != 0; }
  uint64_t bits_ = 0;
};

/// What the elements of a text have in common, told without a branch for any of them.
class ElementSummary {
 public:
  void add(const Element& element) {
    all_ &= element.bits_;
    some_ |= element.bits_;
    pairs_ |= before_ << (Element::kEndsPair - Element::kStartsPair) & element.bits_;
    before_ = element.bits_;
  }
  /// Each has a primary of its own and no special weight.
  bool plain() const {
    return (all_ >> Element::kOwnPrimary & 1) != 0 && static_cast<uint16_t>(some_ >> 32) == 0;
  }
  /// Whether one that begins some pair stands before one that ends some.
  bool may_have_pair() const { return (pairs_ >> Element::kEndsPair & 1) != 0; }
  unsigned all_append() const { return all_ >> Element::kClass & 0xF; }
  unsigned some_append() const { return some_ >> Element::kClass & 0xF; }

 private:
  uint64_t all_ = UINT64_MAX, some_ = 0, pairs_ = 0, before_ = 0;
};

/// Two characters that sort as one element.
struct Pair {
  uint32_t characters;  // the first one in the upper half
  Element element;
};

/// Derived data of a sort object, one block with the pairs and elements behind it.
struct Sort {
  const uint8_t* payload;
  const uint8_t* expansions;
  const Pair* pairs;  // in ascending order, each once
  size_t pair_count;
  uint32_t second_bits[8];  // by low byte, the characters that stand second in a pair
  uint8_t default_secondary;
  uint8_t default_tertiary;
  bool appends_primaries;  // no character inserts its primary ahead of others
  bool appends_all;        // ... nor any other weight
  struct Page {
    const Element* elements;  // 256; null: computed from the fields below
    uint8_t flags;
    uint8_t char_class;
    uint16_t base;
  } pages[256];

  [[gnu::always_inline]] Element element(LXUChar u) const {
    const Page& page = pages[u >> 8];
    if (page.elements != nullptr) return page.elements[u & 0xFF];
    return computed(page, u);
  }

  /// With all that is known of characters with a table.
  [[gnu::always_inline]] Element noted_element(LXUChar u) const {
    const Page& page = pages[u >> 8];
    if (page.elements != nullptr) return page.elements[u & 0xFF];
    Element element = computed(page, u);
    element.note_own_primary();
    return element;
  }

  static Element computed(const Page& page, LXUChar u) {
    if ((page.flags & format::sort::kPageUncovered) != 0) return Element();
    const auto weight = static_cast<uint16_t>(page.base + (u & 0xFF));
    const bool primary = (page.flags & format::sort::kPagePrimary) != 0;
    return Element(primary ? LXWeights{weight, 0, 0, 0} : LXWeights{0, 0, 0, weight}, 1, page.char_class);
  }

  /// The sets of an element that has two, each as an element of one.
  Element first_set(const Element& element) const { return set_of(element, 0); }
  Element second_set(const Element& element) const { return set_of(element, 1); }

  /// The element of a pair: false when the pair is none.
  bool pair(LXUChar first, LXUChar second, Element* element) const {
    return may_end_pair(second) && find_pair(first, second, element);
  }
  bool may_end_pair(LXUChar second) const {
    const unsigned low = second & 0xFF;
    return (second_bits[low / 32] >> low % 32 & 1) != 0;
  }
  bool find_pair(LXUChar first, LXUChar second, Element* element) const;

 private:
  Element set_of(const Element& element, size_t which) const {
    using format::sort::Expansion;
    const Expansion::Set set = Expansion::read(expansions + Expansion::kBytes * element.special()).sets[which];
    return Element(LXWeights{set.primary, set.secondary, set.tertiary, 0}, 1, element.char_class());
  }
};

extern const ObjectType kSortType;

/// The derived data of a loaded sort object.
inline const Sort& sort_of(const LXObject& object) {
  return *static_cast<const Sort*>(object.derived);
}

/// The weight sets of an element that has some, and how many they are.
inline int32_t weight_sets(const Sort& sort, const Element& element, LXWeights* first, LXWeights* second) {
  const bool two = element.sets() == 2;
  *first = two ? sort.first_set(element).weights() : element.weights();
  if (two) *second = sort.second_set(element).weights();
  return static_cast<int32_t>(element.sets());
}

/// Whether a reader has come to the end of its text; a character that the end cuts is still before it, a shift
/// byte that ends the text is not.
template <class Cursor>
bool exhausted(const Cursor& in) {
  return in.p == in.end;
}
inline bool exhausted(const ShiftCursor& in) {
  return in.p == in.end || (in.end - in.p == 1 && in.cp.is_shift(*in.p));
}

/// Forgets a character that the end cuts.
template <class Cursor>
void drop_rest(Cursor* in) {
  in->p = in->end;
}

inline constexpr LXUChar kNoAhead = LX_NO_LOOK_AHEAD;

/// When the character behind another one is read: where a pair may begin, or where the sort has pairs at all,
/// as callers see it who go from element to element by themselves.
enum class LookAhead { kNeeded, kAlways };

/// Walks a text element by element. Pairs are matched from the left, two characters at a time.
template <class Cursor, LookAhead kAhead = LookAhead::kNeeded>
class Elements {
 public:
  Elements(const Sort& sort, const Cursor& in) : sort_(sort), in_(in) {}
  /// Goes on behind `consumed` characters and the one that was read ahead, if one was.
  Elements(const Sort& sort, const Cursor& in, size_t consumed, LXUChar ahead)
      : sort_(sort), in_(in), consumed_(consumed), has_ahead_(ahead != kNoAhead), ahead_(ahead) {}

  bool at_end() const { return !has_ahead_ && exhausted(in_); }
  const Cursor& in() const { return in_; }
  LXUChar ahead() const { return has_ahead_ ? ahead_ : kNoAhead; }

  size_t consumed() const { return consumed_; }  // characters
  /// As special weights keep it: modulo 65,536.
  uint16_t position() const { return static_cast<uint16_t>(consumed_); }

  /// The next element; one without sets also stands for a character that the end of the text cuts.
  [[gnu::always_inline]] Element next() {
    LXUChar u = ahead_;
    if (!has_ahead_ && !in_.next(&u)) {
      drop_rest(&in_);
      return Element();
    }
    has_ahead_ = false;
    ++consumed_;
    const Element element = sort_.element(u);
    const bool looks = kAhead == LookAhead::kAlways ? sort_.pair_count != 0 : element.starts_pair();
    const Cursor before(in_);
    if (!looks || !in_.next(&ahead_)) return element;
    Element pair;
    if (sort_.pair(u, ahead_, &pair)) {
      ++consumed_;
      return pair;
    }
    has_ahead_ = true;
    if constexpr (kAhead == LookAhead::kAlways) {
      // What stands for no character cannot be handed out: it is read again.
      has_ahead_ = ahead_ != kNoAhead;
      if (!has_ahead_) go_on_at(in_, before);
    }
    return element;
  }

 private:
  const Sort& sort_;
  Cursor in_;
  size_t consumed_ = 0;
  bool has_ahead_ = false;
  LXUChar ahead_ = 0;
};

/// Walks the weight sets of a text, those of an expansion one after the other: elements of at most one set
/// each.
template <class Cursor>
class WeightSets {
 public:
  WeightSets(const Sort& sort, const Cursor& in) : sort_(sort), elements_(sort, in) {}

  bool at_end() const { return !pending_ && elements_.at_end(); }
  size_t consumed() const { return elements_.consumed(); }
  uint16_t position() const { return elements_.position(); }

  [[gnu::always_inline]] Element next() {
    if (pending_) {
      pending_ = false;
      return second_;
    }
    const Element element = elements_.next();
    if (element.sets() != 2) return element;
    pending_ = true;
    second_ = sort_.second_set(element);
    return sort_.first_set(element);
  }

 private:
  const Sort& sort_;
  Elements<Cursor> elements_;
  Element second_;
  bool pending_ = false;
};

}  // namespace lx
