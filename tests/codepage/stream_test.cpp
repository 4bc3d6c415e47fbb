// Streaming conversion: any split of the input and of the output gives the bytes of the whole. The
// steps one by one are cases.
#include "support/case_test.h"
#include "support/conversion.h"
#include "support/slowness.h"

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

class Stream : public CaseTest {
 protected:
  LXLocale* locale(const TinyCodepage& cp) { return library.locale(cp); }

  /// A text that is long enough to be split, and has runs of ASCII among the rest.
  Units random_text(const TinyCodepage& cp) {
    Units text;
    for (size_t i = 0; i < 24; ++i) {
      if (any(4) == 0) text.append(below(20), 'a');
      text.push_back(any_of(cp.characters).unicode);
    }
    return text;
  }
};

TEST_F(Stream, AnySplitGivesTheWhole) {
  for (const TinyCodepage& from : case_codepages()) {
    for (const TinyCodepage& to : case_codepages()) {
      SCOPED_TRACE(from.file.name + " to " + to.file.name);
      const Units text = random_text(from);
      const std::string input = from.encode({text.begin(), text.end()});
      const std::string expected = to.encode({text.begin(), text.end()});
      int32_t code = -1;
      for (int round = 0; round < 60 / kSlowness; ++round) {
        Conversion pieces(locale(to), locale(from));
        std::string output;
        const auto room = [&] { return kLeastRoom + static_cast<int32_t>(random() % 6); };
        const size_t longest = 1 + random() % (round % 2 == 0 ? 12 : input.size());
        for (size_t at = 0; at < input.size();) {
          const size_t n = std::min<size_t>(1 + random() % longest, input.size() - at);
          output += convert(pieces, input.substr(at, n), room, &code);
          EXPECT_TRUE(code == LX_OK || code == LX_E_INPUT_CUT);
          at += n;
        }
        EXPECT_EQ(code, LX_OK);
        ASSERT_EQ(printed(output), printed(expected));
      }
    }
  }
}

}  // namespace
}  // namespace lx::test
