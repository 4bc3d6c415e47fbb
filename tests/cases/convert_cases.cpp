// The families of convert.txt and map.txt.
#include "cases/case_runner.h"
#include "core/lxrecords.h"
#include "support/conversion.h"

namespace lx::test {

namespace {

/// Unicode to bytes; the Ex form from the bytes of UTF-8 too.
template <class R>
void encode_text(R& r) {
  const CaseText& text = r.given().text();
  const int32_t size = r.given().number("size", 40);
  Units units = text.units();
  const int32_t length = r.null ? -1 : count_of(units);
  int32_t result = 0;
  auto out = r.output(size, &result, [&](auto* to, int32_t room) {
    return R::Form::encode(r.l, to, room, units.c_str(), length, static_cast<int32_t>(r.flags));
  });
  if constexpr (std::is_same_v<typename R::Form, Ex>) {
    const TinyCodepage& utf8 = case_codepage("UTF8");
    const std::string bytes = utf8.encode({units.begin(), units.end()});
    const bool chars = (r.flags & LX_CHARACTERS) != 0;
    int32_t again = 0;
    const auto converted = r.output(size, &again, [&](auto* to, int32_t room) {
      return R::Form::convert(r.l, to, room, r.library.locale(utf8), bytes.c_str(),
                              r.null  ? -1
                              : chars ? length
                                      : count_of(bytes),
                              static_cast<int32_t>(r.flags));
    });
    EXPECT_EQ(again, result);
    EXPECT_EQ(testing::PrintToString(converted), testing::PrintToString(out));
  }
  r.expect_output(out, result);
}

/// Bytes to Unicode, also by the codepage object, which may end at "by-object", and without and with a null.
template <class R>
void decode_text(R& r) {
  const auto text = r.input("", states.text);
  Units expected = r.expected().text().units();
  const bool cut = r.expected().has("cut");
  const int32_t count = r.expected().number("by-object", r.null && expected.empty() ? -1 : count_of(expected));
  if (r.cp.shift == std::is_same_v<typename R::Form, Ex> && states.text == 0 && !(r.null && cut)) {
    std::vector<LXUChar> by_object(
        static_cast<size_t>(std::max(count, 0)));  // of its exact size: no null is stored
    EXPECT_EQ(LXCpStrToUnicode(r.l->codepage, text.data(), text.length, by_object.data()), count);
    EXPECT_EQ(shown(Units(by_object.begin(), by_object.end())), shown(expected.substr(0, by_object.size())));
  }
  if (text.length < 0 && !cut) expected.push_back(0);
  std::vector<LXUChar> out(99, 0xA5A5);
  const int32_t stored = R::Form::decode(out.data(), 98, r.l, text.data(), text.length, 0);
  EXPECT_EQ(shown(Units(out.data(), static_cast<size_t>(stored))), shown(expected));
  EXPECT_EQ(out[static_cast<size_t>(stored)], 0xA5A5);
}

}  // namespace

Families convert_families() {
  return {
      {"encode", in_bytes([](auto& r) { encode_text(r); })},
      {"decode", in_bytes([](auto& r) { decode_text(r); })},
      // Bytes to packed codes, at every size.
      {"to-codes", in_bytes([](auto& r) {
         const auto text = r.input("", states.text);
         auto codes = Encoded<Wide>(r.cp, r.expected().text().units()).units;
         if (r.expected().has("null") && r.null) codes.push_back(0);
         for (int32_t size = 0; size <= count_of(codes) + 1; ++size) {
           std::vector<LXWChar> out(codes.size() + 2, 7), expected(codes);
           expected.resize(static_cast<size_t>(std::min(size, count_of(codes))));
           const int32_t fit = count_of(expected);
           expected.resize(out.size(), 7);
           EXPECT_EQ(
               r.form.to_codes(r.l, out.data(), size, text.data(), text.length, static_cast<int32_t>(r.flags)),
               fit);
           EXPECT_EQ(out, expected);
         }
       })},
      {"from-codes", in_bytes([](auto& r) {
         auto codes = Encoded<Wide>(r.cp, r.given().text().units()).units;
         const int32_t length = r.null ? -1 : count_of(codes);
         if (r.null) codes.push_back(0);
         int32_t result = 0;
         const auto out = r.output(r.given().number("size", 40), &result, [&](auto* to, int32_t size) {
           return r.form.from_codes(r.l, to, size, codes.data(), length, static_cast<int32_t>(r.flags));
         });
         r.expect_output(out, result);
       })},
      // By the codepage object, which closes nothing.
      {"encode-by-object",
       {nullptr,
        [](auto& r) {
          const Units units = r.given().text().units();
          std::vector<char> out(99, r.kCanary);
          const int32_t result = LXCpUnicodeToStr(r.l->codepage, units.c_str(), states.output,
                                                  r.null ? -1 : count_of(units), out.data());
          EXPECT_EQ(out[static_cast<size_t>(result)], r.kCanary);
          out.resize(static_cast<size_t>(result));
          r.expect_output(out, result);
        },
        nullptr, nullptr}},
      // A conversion step by step: input and room; output, code and what is taken.
      {"stream",
       {nullptr,
        [](auto& r) {
          const TinyCodepage &from = case_codepage(r.given().word()), &to = case_codepage(r.given().word());
          Conversion conversion(r.library.locale(to), r.library.locale(from));
          while (r.given().has_text()) {
            const std::string input = r.given().text().bytes(from);
            const Conversion::Step step = conversion.call(input, std::stoi(r.given().word()));
            EXPECT_EQ(testing::PrintToString(step.output),
                      testing::PrintToString(r.expected().text().bytes(to)));
            EXPECT_EQ(std::to_string(step.code), r.expected().word());
            EXPECT_EQ(std::to_string(step.taken), r.expected().word());
          }
        },
        nullptr, nullptr}},
      {"ratio",
       {nullptr,
        [](auto& r) {
          const TinyCodepage &from = case_codepage(r.given().word()), &to = case_codepage(r.given().word());
          LXLocale* const target = r.library.locale(to);
          LXGetCharTypeU(target, 'A', 0);  // stores another code
          r.number(LXConversionRatio(target, r.library.locale(from)));
          EXPECT_EQ(LXGetError(target), LX_OK);
        },
        nullptr, nullptr}},
      // The entry of a character or pair in the table of a selector. What is not found leaves the results as they were.
      {"special",
       {nullptr, nullptr, nullptr,
        [](auto& r) {
          const Units text = r.given().text().units();
          LXUChar result[2] = {'x', 0};
          r.number(LXLangGetSpecial(r.l->language, text[0], text.size() > 1 ? text[1] : LXUChar{0}, result,
                                    result + 1, r.given().number("selector", 0)));
          r.text({result, result + (result[1] != 0 ? 2 : 1)});
        }}},
      {"map", in_four_forms([](auto& r) {
         const auto text = r.input();
         int32_t result = 0;
         const auto out = r.output(r.given().number("size", 99), &result, [&](auto* to, int32_t size) {
           return r.form.map(r.l, to, size, text.data(), text.length, r.flags);
         });
         r.expect_output(out, result, r.expected().has("whole") && text.length < 0);
       })}};
}

}  // namespace lx::test
