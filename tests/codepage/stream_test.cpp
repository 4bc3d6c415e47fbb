// Streaming conversion: any split of the input and of the output gives the bytes of the whole, with the
// returned codes step by step; and what happens to pending output that is taken in pieces that are too small.
#include <gtest/gtest.h>

#include <optional>
#include <random>

#include "support/tiny_codepages.h"

namespace {

using lx::test::TinyCodepage;
using lx::test::TinyLibrary;

constexpr int32_t kLeastRoom = 8;  // an output of at least this size never loses a byte

std::string printed(const std::string& bytes) {
  return testing::PrintToString(bytes);
}

/// An open conversion that is called with exact buffers.
class Conversion {
 public:
  Conversion(LXLocale* target, LXLocale* source) : handle_(LXOpenConversion(target, source)), target_(target) {}
  ~Conversion() { EXPECT_EQ(LXCloseConversion(handle_), LX_OK); }
  Conversion(const Conversion&) = delete;
  Conversion& operator=(const Conversion&) = delete;

  struct Step {
    int32_t code;
    std::string output;
    size_t taken;  // of the input
  };
  Step call(const std::string& input, int32_t room) {
    std::vector<char> in(input.begin(), input.end());
    std::vector<char> out(static_cast<size_t>(room));
    in.reserve(1);  // never a null pointer
    out.reserve(1);
    const char* in_at = in.data();
    char* out_at = out.data();
    int32_t in_left = static_cast<int32_t>(in.size());
    int32_t out_left = room;
    const int32_t code = LXConvertBuffer(handle_, &out_at, &out_left, &in_at, &in_left);
    EXPECT_EQ(LXGetError(target_), code);
    EXPECT_EQ(out_at - out.data(), room - out_left) << "pointer and rest move together";
    EXPECT_EQ(in_at - in.data(), static_cast<ptrdiff_t>(in.size()) - in_left);
    return {code, std::string(out.data(), static_cast<size_t>(out_at - out.data())),
            in.size() - static_cast<size_t>(in_left)};
  }

  /// A whole piece of input, with as many outputs as it takes; `room` gives the size of each.
  template <class Room>
  std::string convert(const std::string& input, Room room, int32_t* code) {
    std::string output;
    size_t at = 0;
    for (int calls = 0; calls < 10000; ++calls) {
      const Step step = call(input.substr(at), room());
      output += step.output;
      at += step.taken;
      *code = step.code;
      if (step.code != LX_E_OUTPUT_FULL) break;
    }
    EXPECT_EQ(at, input.size()) << "0 and 53 mean that all input is taken";
    return output;
  }

 private:
  LXConversion* handle_;
  LXLocale* target_;
};

class Stream : public testing::Test {
 protected:
  void TearDown() override { EXPECT_TRUE(library_.close()); }

  LXLocale* locale(const TinyCodepage& cp) { return library_.locale(cp); }
  std::string in(const TinyCodepage& cp, const std::vector<uint16_t>& text) {
    if (cp.file.id != 57352) return cp.encode(text);
    std::string utf8;
    for (uint16_t u : text) {
      char bytes[3];
      const int32_t n = LXCpUnicodeToChar(library_.object(cp), u, bytes);
      utf8.append(bytes, static_cast<size_t>(n));
    }
    return utf8;
  }

  TinyLibrary library_;
  const std::vector<TinyCodepage> codepages_ = lx::test::tiny_codepages();
  const TinyCodepage single_ = lx::test::tiny_single(), sjis_ = lx::test::tiny_shift_jis(),
                     euc_ = lx::test::tiny_euc(), four_ = lx::test::tiny_four(),
                     shift_ = lx::test::tiny_shift(), utf8_ = lx::test::tiny_utf8();
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
      const std::string input = in(from, text);
      const std::string expected = in(to, text);
      const auto roomy = [] { return 4000; };
      int32_t code = -1;
      {
        Conversion whole(locale(to), locale(from));
        EXPECT_EQ(printed(whole.convert(input, roomy, &code)), printed(expected));
        EXPECT_EQ(code, LX_OK);
      }
      for (size_t at = 0; at <= input.size(); ++at) {
        Conversion split(locale(to), locale(from));
        std::string output = split.convert(input.substr(0, at), roomy, &code);
        EXPECT_TRUE(code == LX_OK || code == LX_E_INPUT_CUT);
        output += split.convert(input.substr(at), roomy, &code);
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
          output += pieces.convert(input.substr(at, n), room, &code);
          at += n;
        }
        EXPECT_EQ(code, LX_OK);
        ASSERT_EQ(printed(output), printed(expected));
      }
    }
  }
}

/// A call, of a new conversion where one is named.
struct Call {
  const TinyCodepage *to, *from;
  std::string input;
  int32_t room, code;
  std::string output;
  size_t taken;
};

TEST_F(Stream, CodesStepByStep) {
  const TinyCodepage *sjis = &sjis_, *euc = &euc_, *four = &four_, *shift = &shift_, *utf8 = &utf8_,
                     *no = nullptr;
  const Call calls[] = {
      // nothing
      {euc, sjis, "", 0, 0, "", 0},
      {no, no, "", 5, 0, "", 0},
      // no room, then some
      {euc, sjis, "\x82\xA0", 0, 52, "", 2},
      {no, no, "", 0, 52, "", 0},
      {no, no, "", 2, 0, "\xA4\xA2", 0},
      // the output splits a character, and more input comes
      {euc, sjis, "\x82\xA0", 1, 52, "\xA4", 2},
      {no, no, "z", 9, 0, "\xA2z", 1},
      // the input splits a character
      {euc, sjis, "a\x82", 9, 53, "a", 2},
      {no, no, "", 9, 53, "", 0},
      {no, no, "\xA0z", 9, 0, "\xA4\xA2z", 2},
      // byte by byte
      {sjis, euc, "\x8F", 9, 53, "", 1},
      {no, no, "\xB0", 9, 53, "", 1},
      {no, no, "\xA1", 9, 0, "?", 1},
      // four bytes
      {utf8, four, "\x90\x30\x81", 9, 53, "", 3},
      {no, no, "\x31", 9, 0, "\xC4\x81", 1},
      // exactly full at the end, and before it
      {euc, sjis, "ab", 2, 0, "ab", 2},
      {no, no, "abc", 2, 52, "ab", 3},
      {no, no, "", 1, 0, "c", 0},
      // cut and full
      {euc, sjis, "ab\x82", 2, 53, "ab", 3},
      {no, no, "\xA0", 0, 52, "", 1},
      {no, no, "", 2, 0, "\xA4\xA2", 0},
      // a completed character does not fit
      {euc, sjis, "\x82", 1, 53, "", 1},
      {no, no, "\xA0z", 1, 52, "\xA4", 1},
      {no, no, "z", 9, 0, "\xA2z", 1},
      // a state is kept between calls
      {utf8, shift, "\xC1\x0E", 9, 0, "A", 2},
      {no, no, "\x44\x47", 9, 0, "\xE3\x81\x81", 2},
      {no, no, "\x0F", 9, 0, "", 1},
      {no, no, "\xC2", 9, 0, "B", 1},
      // a character cut in the double-byte state
      {utf8, shift, "\x0E\x44", 9, 53, "", 2},
      {no, no, "\x47\x0F\xC2", 9, 0,
       "\xE3\x81\x81"
       "B",
       3},
      // two shift bytes in a row are half a character
      {utf8, shift, "\x0E\x0F\xC1\x44\x47", 9, 0, "\xEF\xBF\xBD\xE3\x81\x81", 5},
      // a shift byte is looked for where a call begins
      {utf8, shift, "\x0E", 9, 0, "", 1},
      {no, no, "\x0F\xC1", 9, 0, "A", 2},
      // the target state is kept between calls
      {shift, utf8, "A\xE3\x81\x81", 9, 0, "\xC1\x0E\x44\x47", 4},
      {no, no, "\xE3\x81\x82", 9, 0, "\x44\x48", 3},
      {no, no, "A", 9, 0, "\x0F\xC1", 1},
      // the shift byte fits, its character does not
      {shift, utf8, "A\xE3\x81\x81", 2, 52, "\xC1\x0E", 4},
      {no, no, "A", 9, 0, "\x44\x47\x0F\xC1", 1},
      // no room for the shift byte
      {shift, utf8, "A\xE3\x81\x81", 1, 52, "\xC1", 4},
      {no, no, "\xE3\x81\x82", 9, 0, "\x0E\x44\x47\x44\x48", 3},
      // no room for the Shift-In
      {shift, utf8, "\xE3\x81\x81z", 3, 52, "\x0E\x44\x47", 4},
      {no, no, "", 9, 0, "\x0F\x6F", 0},
  };
  std::optional<Conversion> conversion;
  for (const Call& call : calls) {
    SCOPED_TRACE("call " + std::to_string(&call - calls));
    if (call.to != nullptr) conversion.emplace(locale(*call.to), locale(*call.from));
    const auto step = conversion->call(call.input, call.room);
    EXPECT_EQ(step.code, call.code);
    EXPECT_EQ(printed(step.output), printed(call.output));
    EXPECT_EQ(step.taken, call.taken);
  }
}

/// Pending bytes that are taken in more than one piece: of the m bytes that stay behind n that were taken, only
/// m - n move to the front. What comes out is damaged, and is required to be.
TEST_F(Stream, SmallOutputsDamagePendingBytes) {
  struct Case {
    const TinyCodepage& to;
    std::string input;
    std::vector<int32_t> rooms;
    std::string output;
  };
  const Case cases[] = {
      {euc_, "\xE3\x81\x81", {1, 1}, "\xA4\xA1"},              // one byte pending: whole
      {utf8_, "\xE3\x81\x82", {1, 2}, "\xE3\x81\x82"},         // taken at once: whole
      {utf8_, "\xE3\x81\x82", {1, 1, 1}, "\xE3\x81\x81"},      // 2 pending, 1 taken: none moves
      {four_, "\xC4\x81", {1, 1, 1, 1}, "\x90\x30\x81\x81"},   // 3, 1 taken: 1 of 2 moves
      {four_, "\xC4\x81", {0, 1, 9}, "\x90\x30\x81\x81"},      // 4, 1 taken: 2 of 3 move
      {four_, "\xC4\x81", {0, 2, 9}, "\x90\x30\x90\x30"},      // 4, 2 taken: none moves
      {four_, "\xC4\x81", {0, 3, 9}, "\x90\x30\x81\x90"},      // 4, 3 taken: none moves
      {shift_, "\xE3\x81\x81", {0, 1, 1, 1}, "\x0E\x44\x44"},  // the shift byte is one of 3
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.to.file.name + printed(c.output));
    Conversion conversion(locale(c.to), locale(utf8_));
    std::string output, rest = c.input;
    for (size_t i = 0; i < c.rooms.size(); ++i) {
      const auto step = conversion.call(rest, c.rooms[i]);
      rest.erase(0, step.taken);
      output += step.output;
      EXPECT_EQ(step.code, i + 1 < c.rooms.size() ? LX_E_OUTPUT_FULL : LX_OK) << i;
    }
    EXPECT_EQ(printed(output), printed(c.output));
  }
}

TEST_F(Stream, Ratio) {
  const auto expect = [&](const TinyCodepage& to, const TinyCodepage& from, int32_t ratio) {
    LXGetCharTypeU(locale(to), 'A', 0);
    EXPECT_EQ(LXConversionRatio(locale(to), locale(from)), ratio) << to.file.name;
    EXPECT_EQ(LXGetError(locale(to)), LX_OK);
  };
  for (const TinyCodepage& same : codepages_) expect(same, same, 1);
  expect(single_, sjis_, 1);
  expect(sjis_, single_, 2);
  expect(four_, sjis_, 4);
  expect(utf8_, single_, 3);
  expect(shift_, sjis_, 3);
}

TEST_F(Stream, OpeningAndClosing) {
  LXLocale* target = locale(sjis_);
  LXLocale* source = locale(euc_);
  const size_t blocks = library_.hooks().live_blocks();
  library_.hooks().fail_at(1);
  EXPECT_EQ(LXOpenConversion(target, source), nullptr);
  EXPECT_EQ(LXGetError(target), LX_E_MEMORY);
  EXPECT_EQ(LXGetError(source), LX_OK);
  library_.hooks().fail_at(0);
  LXConversion* conversion = LXOpenConversion(target, source);
  ASSERT_NE(conversion, nullptr);
  EXPECT_EQ(LXGetError(target), LX_OK);
  EXPECT_EQ(library_.hooks().live_blocks(), blocks + 1);
  library_.hooks().fail_frees(true);
  EXPECT_EQ(LXCloseConversion(conversion), LX_E_FREE);
  library_.hooks().fail_frees(false);
  EXPECT_EQ(library_.hooks().live_blocks(), blocks);

  // Null locales are the default one, as it was when the conversion was opened.
  EXPECT_EQ(LXOpenConversion(nullptr, source), nullptr) << "no default yet";
  ASSERT_EQ(LXSetLocale("English_UnitedStates.TINY-SJIS", 0), LX_OK);
  {
    Conversion to_default(nullptr, source);
    EXPECT_EQ(to_default.call("\xA4\xA2", 9).output, "\x82\xA0");
    Conversion from_default(source, nullptr);
    EXPECT_EQ(from_default.call("\x82\xA0", 9).output, "\xA4\xA2");
  }
  EXPECT_EQ(LXConversionRatio(nullptr, source), 2);
}

}  // namespace
