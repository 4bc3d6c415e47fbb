// Streaming conversion: any split of the input and of the output gives the bytes of the whole; what the ratio
// is. The steps one by one are cases.
#include <gtest/gtest.h>

#include <random>

#include "support/conversion.h"
#include "support/tiny_codepages.h"

namespace lx::test {
namespace {

constexpr int32_t kLeastRoom = 8;  // an output of at least this size never loses a byte

std::string printed(const std::string& bytes) {
  return testing::PrintToString(bytes);
}

/// Converts a piece of input, with as many outputs as it takes; `room` gives the size of each.
template <class Room>
std::string convert(Conversion& conversion, const std::string& input, Room room, int32_t* code) {
  std::string output;
  size_t at = 0;
  for (int calls = 0; calls < 10000; ++calls) {
    const Conversion::Step step = conversion.call(input.substr(at), room());
    output += step.output;
    at += step.taken;
    *code = step.code;
    if (step.code != LX_E_OUTPUT_FULL) break;
  }
  EXPECT_EQ(at, input.size()) << "0 and 53 mean that all input is taken";
  return output;
}

class Stream : public testing::Test {
 protected:
  void TearDown() override { EXPECT_TRUE(library_.close()); }

  LXLocale* locale(const TinyCodepage& cp) { return library_.locale(cp); }

  TinyLibrary library_;
  const std::vector<TinyCodepage> codepages_ = tiny_codepages();
};

/// Texts of each source that are long enough to be split, and have runs of ASCII among the rest.
std::vector<uint16_t> random_text(const TinyCodepage& cp, std::mt19937* random) {
  std::vector<uint16_t> text;
  for (size_t i = 0; i < 24; ++i) {
    const bool ascii_run = (*random)() % 4 == 0;
    if (ascii_run)
      for (size_t n = (*random)() % 20; n > 0; --n) text.push_back(cp.find('a') != nullptr ? 'a' : 'A');
    text.push_back(cp.characters[(*random)() % cp.characters.size()].unicode);
  }
  return text;
}

TEST_F(Stream, AnySplitGivesTheWhole) {
  std::mt19937 random(3);
  for (const TinyCodepage& from : codepages_) {
    for (const TinyCodepage& to : codepages_) {
      SCOPED_TRACE(from.file.name + " to " + to.file.name);
      const auto text = random_text(from, &random);
      const std::string input = from.encode(text);
      const std::string expected = to.encode(text);
      const auto roomy = [] { return 4000; };
      int32_t code = -1;
      {
        Conversion whole(locale(to), locale(from));
        EXPECT_EQ(printed(convert(whole, input, roomy, &code)), printed(expected));
        EXPECT_EQ(code, LX_OK);
      }
      for (size_t at = 0; at <= input.size(); ++at) {
        Conversion split(locale(to), locale(from));
        std::string output = convert(split, input.substr(0, at), roomy, &code);
        EXPECT_TRUE(code == LX_OK || code == LX_E_INPUT_CUT);
        output += convert(split, input.substr(at), roomy, &code);
        EXPECT_EQ(code, LX_OK);
        ASSERT_EQ(printed(output), printed(expected)) << at;
      }
      for (int round = 0; round < 30; ++round) {
        Conversion pieces(locale(to), locale(from));
        std::string output;
        const auto room = [&] { return kLeastRoom + static_cast<int32_t>(random() % 6); };
        const size_t longest = 1 + random() % 12;
        for (size_t at = 0; at < input.size();) {
          const size_t n = std::min<size_t>(1 + random() % longest, input.size() - at);
          output += convert(pieces, input.substr(at, n), room, &code);
          at += n;
        }
        EXPECT_EQ(code, LX_OK);
        ASSERT_EQ(printed(output), printed(expected));
      }
    }
  }
}

TEST_F(Stream, Ratio) {
  const auto expect = [&](const TinyCodepage& to, const TinyCodepage& from, int32_t ratio) {
    LXGetCharTypeU(locale(to), 'A', 0);
    EXPECT_EQ(LXConversionRatio(locale(to), locale(from)), ratio) << to.file.name;
    EXPECT_EQ(LXGetError(locale(to)), LX_OK);
  };
  const TinyCodepage single = tiny_single(), sjis = tiny_shift_jis();
  for (const TinyCodepage& same : codepages_) expect(same, same, 1);
  expect(single, sjis, 1);
  expect(sjis, single, 2);
  expect(tiny_four(), sjis, 4);
  expect(tiny_utf8(), single, 3);
  expect(tiny_shift(), sjis, 3);
}

TEST_F(Stream, ClosingReportsAFailingFree) {
  LXConversion* const conversion = LXOpenConversion(locale(tiny_euc()), locale(tiny_single()));
  ASSERT_NE(conversion, nullptr);
  library_.hooks().fail_frees(true);
  EXPECT_EQ(LXCloseConversion(conversion), LX_E_FREE);
  library_.hooks().fail_frees(false);
}

}  // namespace
}  // namespace lx::test
