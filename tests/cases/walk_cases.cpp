// The families of walk.txt.
#include "cases/case_runner.h"
#include "core/lxrecords.h"

namespace lx::test {

Families walk_families() {
  return {{"count", in_bytes([](auto& r) {
             const auto text = r.input("", states.text);
             const int32_t chars = r.form.count(r.l, text.data(), text.length);
             EXPECT_EQ(LXCpStrByteToCharLen(r.l->codepage, text.data(), states.text, text.length), chars);
             r.number(chars);
           })},
          {"move", in_bytes([](auto& r) {
             const auto text = r.input("", states.text);
             states.result = 77;
             r.place(r.form.move(r.l, text.data(), text.length, static_cast<int32_t>(r.flags)), text);
           })},
          {"next", in_bytes([](auto& r) {
             const auto text = r.input("", states.text);
             r.place(r.form.next(r.l, text.data()), text);
           })},
          {"previous", in_bytes([](auto& r) {
             const auto text = r.input("", states.text);
             r.place(r.form.previous(r.l, text.data(), text.data() + r.given().number("at", 0)), text);
           })},
          {"code", in_bytes([](auto& r) {
             const auto text = r.input("", states.text);
             const CaseText& expected = r.expected().text();
             EXPECT_EQ(r.form.code(r.l, text.data()), Encoded<Wide>(r.cp, expected.units()).codes.at(0));
             EXPECT_EQ(r.form.length(r.l, text.data()), count_of(expected.bytes(r.cp)));
           })},
          {"valid", in_bytes([](auto& r) {
             const auto text = r.input("", states.text);
             r.number(r.form.valid(r.l, text.data()));
           })},
          {"put", in_bytes([](auto& r) {
             std::vector<char> out(9, 'z');
             r.form.put(r.l, out.data(), r.character());
             const auto expected = r.units(r.expected().text());
             EXPECT_EQ(out[expected.size()], 'z');
             out.resize(expected.size());
             EXPECT_EQ(testing::PrintToString(out), testing::PrintToString(expected));
           })},
          // A packed code: its length, zero bytes counted, and what is stored of it.
          {"packed",
           {[](auto& r) {
              const auto code = static_cast<LXWChar>(std::stoul(r.given().word(), nullptr, 16));
              const std::string bytes = r.expected().text().bytes(r.cp);
              std::vector<char> stored(bytes.size()), put(bytes.size());  // exact
              r.number(LXStrByteLength(code));
              EXPECT_EQ(LXWToMb(stored.data(), code), count_of(bytes));
              EXPECT_EQ(LXPutChar(r.l, put.data(), code), 0);
              EXPECT_EQ(std::string(stored.begin(), stored.end()), bytes);
              EXPECT_EQ(put, stored);
            },
            nullptr, nullptr, nullptr}}};
}

}  // namespace lx::test
