// The families of compare.txt and collate.txt.
#include "cases/case_runner.h"

namespace lx::test {

namespace {

template <class R>
void compare(R& r, bool by_weight) {
  const auto a = r.input(), b = r.input("", 0, "length2");
  const auto door = by_weight ? R::Form::coll : R::Form::cmp;
  r.number(door(r.l, a.data(), a.length, b.data(), b.length, r.flags));
}

}  // namespace

Families compare_families() {
  return {{"compare", in_four_forms([](auto& r) { compare(r, false); })},
          {"collate", in_four_forms([](auto& r) { compare(r, true); })}};
}

}  // namespace lx::test
