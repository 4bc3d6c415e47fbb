// The families of string.txt.
#include "cases/case_runner.h"

namespace lx::test {

namespace {

/// A span: the units of so many characters, with the shift byte that ends them.
template <class R>
void expect_span(R& r, int32_t got, const CaseText& text) {
  const int64_t at = std::stol(r.expected().word());
  if (at < 0 || text.raw() || (r.flags & LX_CHARACTERS) != 0) {
    EXPECT_EQ(got, static_cast<int32_t>(at));
    return;
  }
  const Encoded<typename R::Form> whole(r.cp, text.units());
  EXPECT_EQ(
      got, static_cast<int32_t>(whole.behind(static_cast<size_t>(at), whole.units.size(), whole.units.size())));
}

template <class R, class Door>
void span(R& r, const Door& door) {
  const auto text = r.input(), set = r.input("", 0, "set-length");
  expect_span(r, door(r.l, text.data(), text.length, set.data(), set.length, r.flags), *text.text);
}
template <class R>
std::vector<typename R::Unit> terminated(R& r) {
  auto text = r.input().block;
  text.push_back(0);
  return text;
}

}  // namespace

Families string_families() {
  return {{"character", in_four_forms([](auto& r) {
             const auto text = r.input();
             r.place(r.form.chr(r.l, text.data(), text.length, r.character(), r.flags), text);
           })},
          {"span", in_four_forms([](auto& r) { span(r, r.form.spn); })},
          {"span-to", in_four_forms([](auto& r) { span(r, r.form.cspn); })},
          {"find", in_four_forms([](auto& r) {
             const auto text = r.input(), part = r.input("", 0, "part-length");
             r.place(r.form.str(r.l, text.data(), text.length, part.data(), part.length, r.flags), text);
           })},
          {"copy", in_four_forms([](auto& r) {
             const auto text = r.input("", states.text);
             int32_t result = 0;
             const int32_t room = r.given().number("size", 99);
             const auto out = r.output(room, &result, [&](auto* to, int32_t size) {
               return r.form.cpy(r.l, to, size, text.data(), text.length, r.flags);
             });
             states.output = states.text;
             r.expect_output(out, result, r.null && room == 99 && r.error == LX_OK);
           })},
          {"join", in_four_forms([](auto& r) {
             auto buffer = r.input().block;
             const auto text = r.input("", states.text);
             buffer.resize(buffer.size() - (r.null ? 1 : 0));
             buffer.push_back(0);
             const int32_t size = r.given().number("size", 99);
             buffer.resize(99);
             const int32_t result = r.form.cat(r.l, buffer.data(), size, text.data(), text.length, r.flags);
             const auto end = std::find(buffer.begin(), buffer.end(), 0);
             EXPECT_EQ(result, r.expected().number("returns", static_cast<int32_t>(end - buffer.begin()) + 1));
             r.text({buffer.begin(), end});
           })},
          {"tokens", in_four_forms([](auto& r) {
             auto text = r.input();
             const auto set = r.input();
             for (const Units& token :
                  tokens_of(r.form, r.cp, r.l, text.block, text.length, set.block, set.length, r.flags))
               EXPECT_EQ(shown(token), shown(r.expected().text().units()));
           })},
          {"truncate", in_bytes([](auto& r) {
             auto text = r.input().block;
             if (!r.null) text.push_back(0);
             const std::vector<char> before = text;
             const int32_t result = r.form.truncate(r.l, text.data(), r.given().number("size", 99), r.flags);
             auto expected = r.units(r.expected().text());
             EXPECT_EQ(result, r.expected().number("returns", count_of(expected) + 1));
             expected.push_back(0);
             expected.insert(expected.end(), before.begin() + count_of(expected), before.end());
             EXPECT_EQ(testing::PrintToString(text), testing::PrintToString(expected));
           })},
          {"terminate",
           {nullptr,
            [](auto& r) {
              int32_t result = 0;
              r.text(r.output(2, &result, [&](char* to, int32_t) {
                return LXTerminateStringEx(r.l, to, states.text, r.flags);
              }));
              r.number(result);
            },
            nullptr, nullptr}},
          {"length",
           {nullptr, nullptr, [](auto& r) { r.number(LXWcslen(r.l, terminated(r).data())); },
            [](auto& r) { r.number(LXStrlenU(r.l, terminated(r).data())); }}}};
}

}  // namespace lx::test
