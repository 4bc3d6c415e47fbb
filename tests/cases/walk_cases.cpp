// The families of walk.txt.
#include "cases/case_runner.h"
#include "core/lxrecords.h"

namespace lx::test {

namespace {

template <class R>
void count(R& r) {
  const auto text = r.input("", states.text);
  const int32_t chars = R::Form::count(r.l, text.data(), text.length);
  EXPECT_EQ(LXCpStrByteToCharLen(r.l->codepage, text.data(), states.text, text.length), chars);
  r.number(chars);
}
template <class R>
void move(R& r) {
  const auto text = r.input("", states.text);
  states.result = 77;
  r.place(R::Form::move(r.l, text.data(), text.length, static_cast<int32_t>(r.flags)), text);
}
template <class R>
void next(R& r) {
  const auto text = r.input("", states.text);
  r.place(R::Form::next(r.l, text.data()), text);
}
template <class R>
void previous(R& r) {
  const auto text = r.input("", states.text);
  r.place(R::Form::previous(r.l, text.data(), text.data() + r.given().number("at", 0)), text);
}
template <class R>
void character(R& r) {
  const auto text = r.input("", states.text);
  const CaseText& expected = r.expected().text();
  EXPECT_EQ(R::Form::code(r.l, text.data()), Encoded<Wide>(r.cp, expected.units()).codes.at(0));
  EXPECT_EQ(R::Form::length(r.l, text.data()), count_of(expected.bytes(r.cp)));
}
template <class R>
void valid(R& r) {
  const auto text = r.input("", states.text);
  r.number(R::Form::valid(r.l, text.data()));
}
template <class R>
void put(R& r) {
  std::vector<char> out(9, 'z');
  R::Form::put(r.l, out.data(), r.character());
  const auto expected = r.units(r.expected().text());
  EXPECT_EQ(out[expected.size()], 'z');
  out.resize(expected.size());
  EXPECT_EQ(testing::PrintToString(out), testing::PrintToString(expected));
}

/// A packed code: its length, zero bytes counted, and what is stored of it.
void packed(CaseRun<Plain>& r) {
  const auto code = static_cast<LXWChar>(std::stoul(r.given().word(), nullptr, 16));
  const std::string bytes = r.expected().text().bytes(r.cp);
  std::vector<char> stored(bytes.size()), put(bytes.size());  // exact
  r.number(LXStrByteLength(code));
  EXPECT_EQ(LXWToMb(stored.data(), code), count_of(bytes));
  EXPECT_EQ(LXPutChar(r.l, put.data(), code), 0);
  EXPECT_EQ(std::string(stored.begin(), stored.end()), bytes);
  EXPECT_EQ(put, stored);
}

}  // namespace

Families walk_families() {
  return {
      {"count", in_bytes([](auto& r) { count(r); })},    {"move", in_bytes([](auto& r) { move(r); })},
      {"next", in_bytes([](auto& r) { next(r); })},      {"previous", in_bytes([](auto& r) { previous(r); })},
      {"code", in_bytes([](auto& r) { character(r); })}, {"valid", in_bytes([](auto& r) { valid(r); })},
      {"put", in_bytes([](auto& r) { put(r); })},        {"packed", {packed, nullptr, nullptr, nullptr}}};
}

}  // namespace lx::test
