// Collation and keys: of any two texts the keys order as the comparison does, both are the same in all forms where the
// codepage has the characters, and a key is made of the elements that the text has one by one.
#include <cstring>
#include <vector>

#include "fuzz.h"

namespace lx::fuzz::collate {
namespace {

int sign(int32_t difference) {
  return (difference > 0) - (difference < 0);
}

template <class F>
std::string key_of(const F& form, const Place& at, const Block<typename F::Unit>& text, uint32_t options) {
  states = {};
  const auto call = [&](const Block<uint8_t>& out) {
    return form.xfrm(at.locale, out.data(), out.size(), text.data(), text.size(), options);
  };
  const Block<uint8_t> small(3);
  const int32_t bytes = call(small);
  must(bytes >= 0, "a key is made");
  const Block<uint8_t> whole(static_cast<size_t>(bytes));
  must(text.size() == 0 || call(whole) == bytes, "a key has its length in any room");
  if (bytes > 3) call(Block<uint8_t>(static_cast<size_t>(bytes) - 1));
  const Block<uint8_t>& key = bytes <= 3 ? small : whole;
  return std::string(reinterpret_cast<const char*>(key.data()), static_cast<size_t>(bytes));
}

/// Special weights alone: the comparison looks at positions, which such a key has not.
bool special_alone(const std::string& key) {
  return key.compare(0, 3, "\0\0\0", 3) == 0;
}

template <class F>
void orders_alike(const F& form, const Place& at, const Block<typename F::Unit>& a,
                  const Block<typename F::Unit>& b) {
  constexpr bool kBytes = sizeof(typename F::Unit) == 1;
  LXLocale* const l = at.locale;
  for (const uint32_t options : {0u, LX_CASE_INSENSITIVE, LX_WIDTH_INSENSITIVE}) {
    states = {};
    // In byte texts no more of the second one counts than the first one is long.
    if (options == LX_WIDTH_INSENSITIVE && kBytes) {
      form.coll(l, a.data(), a.size(), b.data(), b.size(), options);
      continue;
    }
    const int32_t order = form.coll(l, a.data(), a.size(), b.data(), b.size(), options);
    if (at.sort == nullptr)
      must(form.cmp(l, a.data(), a.size(), b.data(), b.size(), options) == order ||
               (!kBytes && options == LX_WIDTH_INSENSITIVE),
           "binary order is comparison");
    // In binary order keys of units are as the machine stores them, and folding is not that of comparison.
    // Shift bytes, and a character that the end cuts, are in the key but not compared.
    if (at.sort == nullptr && (!kBytes || options != 0 || at.width > 1)) continue;
    must(sign(order) == -sign(form.coll(l, b.data(), b.size(), a.data(), a.size(), options)),
         "the other way round it is the other way");
    const std::string first = key_of(form, at, a, options), second = key_of(form, at, b, options);
    if (options == 0 && (special_alone(first) || special_alone(second))) continue;
    must(sign(order) == sign(first.compare(second)), "keys order as comparison does");
  }
}

struct Element {
  int32_t sets;
  LXWeights first, second;
  uint8_t char_class;
};

template <class F>
std::vector<Element> elements_of(const F& form, const Place& at, const Block<typename F::Unit>& text) {
  states = {};
  std::vector<Element> all;
  const typename F::Unit* p = text.data();
  int32_t left = text.size();
  uint16_t counter = 0;
  LXUChar look_ahead = LX_NO_LOOK_AHEAD;
  while (left > 0) {
    Element e{};
    e.sets = form.next_weight(at.locale, &p, &left, &counter, &e.first, &e.second, &e.char_class, &look_ahead);
    must(e.sets >= 0 && e.sets <= 2 && left >= 0, "an element has up to two sets");
    if (e.sets < 2) e.second = {};
    if (e.sets == 0) e.first = {}, e.char_class = 0;
    all.push_back(e);
  }
  return all;
}

/// As the sort object says.
std::vector<Element> elements_in(const LXObject* sort, const Units& text) {
  std::vector<Element> all;
  for (size_t i = 0; i < text.size(); ++i) {
    Element e{};
    LXWeights &a = e.first, &b = e.second;
    e.sets = i + 1 < text.size() ? LXSortGetCombination(sort, text[i], text[i + 1], &a.primary, &a.secondary,
                                                        &a.tertiary, &a.special, &e.char_class)
                                 : 0;
    if (e.sets == 1)
      ++i;
    else
      e.sets = LXSortGetWeights(sort, text[i], &a.primary, &a.secondary, &a.tertiary, &a.special, &b.primary,
                                &b.secondary, &b.tertiary, &b.special, &e.char_class);
    if (e.sets == 0) e.char_class = 0;
    all.push_back(e);
  }
  return all;
}

bool same(const LXWeights& a, const LXWeights& b) {
  return a.primary == b.primary && a.secondary == b.secondary && a.tertiary == b.tertiary &&
         a.special == b.special;
}
bool same_elements(const std::vector<Element>& a, const std::vector<Element>& b) {
  return std::equal(a.begin(), a.end(), b.begin(), b.end(), [](const Element& x, const Element& y) {
    return x.sets == y.sets && same(x.first, y.first) && same(x.second, y.second) &&
           x.char_class == y.char_class;
  });
}

/// The levels that elements make, placed one by one, are those of the key.
void key_of_elements(const std::string& key, const std::vector<Element>& elements) {
  std::vector<uint16_t> primaries(2 * elements.size() + 1), specials(4 * elements.size() + 1);
  std::vector<uint8_t> secondaries(2 * elements.size() + 1), tertiaries(2 * elements.size() + 1);
  uint16_t *p = primaries.data(), *p_end = p, *x = specials.data(), *x_end = x;
  uint8_t *s = secondaries.data(), *s_end = s, *t = tertiaries.data(), *t_end = t;
  for (const Element& e : elements)
    for (int32_t i = 0; i < e.sets; ++i) {
      const LXWeights& w = i == 0 ? e.first : e.second;
      LXStrInsertWeights(w.primary, &p, &p_end, w.secondary, &s, &s_end, w.tertiary, &t, &t_end, w.special, &x,
                         &x_end, 1, e.char_class);
    }
  std::string expected;
  for (const uint16_t* w = primaries.data(); w != p_end; ++w)
    expected += {static_cast<char>(*w >> 8), static_cast<char>(*w)};
  expected += '\0';
  must(key.compare(0, expected.size(), expected) == 0, "a key begins with the primary weights");
  size_t at = expected.size();
  const auto level = [&](const uint8_t* begin, const uint8_t* end) {
    const size_t stop = std::min(key.find('\0', at), key.size());
    const uint8_t *const written_end = begin + (stop - at), *const kept =
                                                                reinterpret_cast<const uint8_t*>(key.data()) +
                                                                at;
    must(written_end <= end && std::equal(begin, written_end, kept), "then come those of the next level");
    must(std::all_of(written_end, end, [&](uint8_t weight) { return weight == end[-1]; }),
         "less the default at the end");
    at = stop + 1;
  };
  level(secondaries.data(), s_end), level(tertiaries.data(), t_end);
}

void forms_agree(const Place& at, const Units& text) {
  const Block<LXUChar> units(text);
  const std::string key = key_of(kUnicode, at, units, 0);
  const std::vector<Element> elements = elements_in(at.sort, text);
  key_of_elements(key, elements);
  const auto generated = [&](uint8_t* out, int32_t size) {
    return LXStrGenSortKey(at.locale, out, size, units.data(), units.size());
  };
  const Block<uint8_t> out(std::max<size_t>(key.size(), 3));
  must(generated(out.data(), out.size()) == count_of(key) && memcmp(out.data(), key.data(), key.size()) == 0,
       "a key is made of units");
  std::string folded[2];
  in_all_forms([&](const auto& form) {
    using F = std::decay_t<decltype(form)>;
    const Block<typename F::Unit> said(encode(form, at.locale, text));
    if ((at.shift && std::is_same_v<F, Plain>) ||
        !faithful(form, at.locale, text, {said.data(), static_cast<size_t>(said.size())}))
      return;
    must(key_of(form, at, said, 0) == key, "a key is the same in all forms");
    must(same_elements(elements_of(form, at, said), elements), "so are its elements");
    // The U form folds to capitals, the others to small letters.
    for (const uint32_t options : {LX_CASE_INSENSITIVE, LX_WIDTH_INSENSITIVE}) {
      std::string& first = folded[options & 1];
      const std::string one = key_of(form, at, said, options);
      if (std::is_same_v<F, Unicode>) continue;
      if (first.empty()) first = one;
      must(one == first, "folded keys are the same");
    }
  });
}

}  // namespace

FUZZ_TARGET(collate) {
  const Place& at = place(in);
  const bool any = in.flag();
  const Units first = in.units(40), second = in.units(40);
  if (!any && at.sort != nullptr) forms_agree(at, first), forms_agree(at, second);
  in_all_forms([&](const auto& form) {
    const auto one = any ? in.text(form, at.locale, 40) : encode(form, at.locale, first);
    orders_alike(form, at, Block(one),
                 Block(any ? in.text(form, at.locale, 40) : encode(form, at.locale, second)));
  });
}

}  // namespace lx::fuzz::collate
