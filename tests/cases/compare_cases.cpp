// The families of compare.txt and collate.txt.
#include "cases/case_runner.h"
#include "core/lxrecords.h"

namespace lx::test {

namespace {

template <class R, class Door>
void compare(R& r, const Door& door, bool by_weight) {
  const auto a = r.input(), b = r.input("", 0, "length2");
  const int32_t result = door(r.l, a.data(), a.length, b.data(), b.length, r.flags);
  r.number(by_weight && r.l->sort != nullptr ? (result > 0) - (result < 0) : result);
}

}  // namespace

Families compare_families() {
  return {{"compare", in_four_forms([](auto& r) { compare(r, r.form.cmp, false); })},
          {"collate", in_four_forms([](auto& r) { compare(r, r.form.coll, true); })},
          // The bytes of a key, "refused", and that nothing is written into a buffer that is too small.
          {"key", in_four_forms([](auto& r) {
             const auto text = r.input();
             const std::string word = r.expected().word();
             std::string expected;
             for (size_t at = 0; word != "refused" && at < word.size(); at += 3)
               expected += static_cast<char>(std::stoi(word.substr(at, 2), nullptr, 16));
             const int32_t bytes = word == "refused" ? -1 : count_of(expected);
             for (int32_t size = 0; size <= bytes + 2; ++size) {
               alignas(4) uint8_t buffer[256];
               std::fill(std::begin(buffer), std::end(buffer), uint8_t{0x5A});
               const int32_t result = r.form.xfrm(r.l, buffer, size, text.data(), text.length, r.flags);
               EXPECT_EQ(result, size == 0 && text.text->values.empty() ? 0 : bytes);
               const std::string written(buffer, buffer + std::max(bytes, 0));
               if (size >= bytes && bytes > 0) {
                 EXPECT_EQ(testing::PrintToString(written), testing::PrintToString(expected));
               }
               EXPECT_EQ(std::count(buffer + std::max(size, 0), std::end(buffer), 0x5A), 256 - size)
                   << "size " << size;
             }
           })},
          // The weights of a character, or of a pair, and their class.
          {"weights", {nullptr, nullptr, nullptr, [](auto& r) {
                         const Units text = r.given().text().units();
                         LXWeights w[2] = {};
                         uint8_t char_class = 0;
                         const int32_t sets =
                             text.size() > 1
                                 ? LXSortGetCombination(r.l->sort, text[0], text[1], &w->primary, &w->secondary,
                                                        &w->tertiary, &w->special, &char_class)
                                 : LXSortGetWeights(r.l->sort, text[0], &w->primary, &w->secondary,
                                                    &w->tertiary, &w->special, &w[1].primary, &w[1].secondary,
                                                    &w[1].tertiary, &w[1].special, &char_class);
                         r.l->last_error = LX_OK;  // which these do not touch
                         r.number(sets);
                         for (int32_t i = 0; i < sets; ++i)
                           for (const int weight :
                                {w[i].primary, uint16_t{w[i].secondary}, uint16_t{w[i].tertiary}, w[i].special})
                             r.number(weight);
                         if (sets > 0) r.number(char_class);
                       }}}};
}

}  // namespace lx::test
