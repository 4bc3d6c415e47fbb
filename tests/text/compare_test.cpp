// Comparison by code value: random pairs of similar texts in every codepage against a model on Unicode values,
// with every length that cuts; tables of exact results; what is kept; memory that fails; the trace.
#include <gtest/gtest.h>

#include <algorithm>
#include <random>

#include "codepage/lxcodepage.h"
#include "codepage/lxunicode.h"
#include "platform/ras1.h"
#include "platform/recording_ras1.h"
#include "support/tiny_codepages.h"

namespace {

using lx::test::ByteString;
using lx::test::RecordingTrace;
using lx::test::TinyCharacter;
using lx::test::TinyCodepage;
using lx::test::TraceRecord;
namespace fmt = lx::format::codepage;

using Units = std::vector<uint16_t>;
constexpr uint32_t kCase = LX_CASE_INSENSITIVE, kWidth = LX_WIDTH_INSENSITIVE, kBlanks = LX_IGNORE_BLANKS;

/// Fills the table of full-width forms of single bytes by the Unicode rule, and gives "!" a "half-width" form
/// of two bytes.
TinyCodepage with_widths(TinyCodepage cp) {
  ByteString& payload = cp.file.sections[0];
  for (const TinyCharacter& c : cp.characters) {
    const TinyCharacter* full = cp.find(lx::unicode_half_to_full(c.unicode));
    if (c.code <= 0xFF && full != nullptr && full->code != c.code)
      lx::put_le32(payload.data() + lx::le16(payload.data() + fmt::kFullWidth) + 4 * c.code, full->code);
  }
  lx::put_le16(payload.data() + fmt::kPairs, static_cast<uint16_t>(payload.size()));
  lx::put_le16(payload.data() + fmt::kPairCount, 1);
  payload.resize(payload.size() + fmt::WidthPair::kBytes);
  lx::put_le32(payload.data() + payload.size() - 8, 0x8141);
  lx::put_le32(payload.data() + payload.size() - 4, '!');
  return cp;
}

int sign(int32_t value) {
  return (value > 0) - (value < 0);
}
std::string encoded(const TinyCodepage& cp, const Units& text, size_t from, size_t to) {
  return cp.encode({text.begin() + static_cast<long>(from), text.begin() + static_cast<long>(to)});
}

class Compare : public testing::Test {
 protected:
  void TearDown() override {
    RecordingTrace::set_level(0);
    if (english_ != nullptr)
      for (const TinyCodepage* cp : {&single_, &four_, &shift_}) library_.locale(*cp)->language = english_;
    EXPECT_TRUE(library_.close());
  }

  /// From here on the languages map sharp s to SS.
  void use_special() {
    namespace words = lx::format::language;
    english_ = library_.locale(single_)->language;
    german_ = *english_;
    payload_.assign(english_->section[0], english_->section[0] + 578);
    for (const char byte : {'\xDF', '\0', '\0', '\0', 'S', '\0', 'S', '\0'})
      payload_.push_back(static_cast<uint8_t>(byte));
    lx::put_le16(payload_.data() + 2 * words::kUpperSpecials, 1);
    lx::put_le16(payload_.data() + 2 * words::kUpperSpecialTable, 578);
    german_.section[0] = payload_.data();
    for (const TinyCodepage* cp : {&single_, &four_, &shift_}) library_.locale(*cp)->language = &german_;
  }

  static void set_case_delta(LXLocale* locale, uint32_t code, uint32_t delta) {
    auto* record = const_cast<uint8_t*>(LXGetMbCtypeW(locale->codepage, code));
    fmt::TypeRecord{fmt::TypeRecord::read(record).type, delta}.write(record);
  }
  /// A locale whose characters of several bytes have small letters.
  LXLocale* locale(const TinyCodepage& cp) {
    LXLocale* const in = library_.locale(cp);
    for (const TinyCharacter& c : cp.characters) {
      if (c.code <= 0xFF) continue;
      const TinyCharacter* lower = cp.find(lx::unicode_lower(c.unicode));
      set_case_delta(in, c.code, lower != nullptr ? lower->code - c.code : 0);
    }
    return in;
  }
  /// A text over few characters, so that two are often equal up to case and width.
  uint16_t random_char(const TinyCodepage& cp) {
    constexpr uint16_t kOften[] = {'a', 'A', 'z', 'Z', '@', '`', 0xFF21, 0xE0, 0xC0, 0x3041, 0xFF71, 0x30A2};
    const uint16_t u = kOften[random_() % std::size(kOften)];
    return cp.find(u) != nullptr ? u : random_() % 2 == 0 ? 'a' : 'A';
  }

  static std::string folded(const TinyCodepage& cp, uint16_t u, uint32_t options) {
    const uint16_t other = options == kCase                    ? lx::unicode_lower(u)
                           : options == kWidth && cp.width > 1 ? lx::unicode_full_to_half(u)
                                                               : u;
    return cp.find(cp.find(other) != nullptr ? other : u)->bytes;
  }
  static int32_t model(const TinyCodepage& cp, const Units& a, const Units& b, uint32_t options) {
    const size_t n = std::min(a.size(), b.size());
    for (size_t i = 0; i < n; ++i) {
      const std::string x = folded(cp, a[i], options), y = folded(cp, b[i], options);
      if (options != 0 && x.size() != y.size()) return static_cast<int32_t>(x.size() - y.size());
      for (size_t k = 0; k < x.size() && k < y.size(); ++k)
        if (x[k] != y[k]) return static_cast<uint8_t>(x[k]) - static_cast<uint8_t>(y[k]);
    }
    const size_t from = options == kWidth && cp.width > 1 && n != 0 ? n : 0;
    return static_cast<int32_t>(encoded(cp, a, from, a.size()).size() - encoded(cp, b, from, b.size()).size());
  }

  const TinyCodepage single_ = lx::test::tiny_single(), sjis_ = with_widths(lx::test::tiny_shift_jis()),
                     four_ = lx::test::tiny_four(), shift_ = with_widths(lx::test::tiny_shift()),
                     utf8_ = with_widths(lx::test::tiny_utf8());
  lx::test::TinyLibrary library_{{single_, sjis_, four_, shift_, utf8_}};
  std::mt19937 random_{1};
  LXObject* english_ = nullptr;
  LXObject german_{};
  ByteString payload_;
};

TEST_F(Compare, AllFormsFollowTheModel) {
  for (const TinyCodepage* tiny : {&single_, &sjis_, &utf8_, &shift_})
    for (unsigned n = 0; n < 3000 && !HasFailure(); ++n) {
      const TinyCodepage& cp = *tiny;
      LXLocale* const in = locale(cp);
      const uint32_t options = n % 3 == 0 ? 0 : n % 3 == 1 ? kCase : kWidth;
      Units a(random_() % 400 % (n % 5 == 0 ? 400 : 20)), b;
      for (uint16_t& u : a) u = random_char(cp);
      for (uint16_t u : a) b.push_back(random_() % 64 == 0 ? random_char(cp) : u);
      for (uint16_t& u : b)
        if (const uint16_t other = random_char(cp); folded(cp, u, options) == folded(cp, other, options))
          u = other;
      if (random_() % 3 == 0) b.resize(random_() % (b.size() + 1));
      const std::string x = cp.encode(a), y = cp.encode(b);
      SCOPED_TRACE(cp.file.name + testing::PrintToString(a) + testing::PrintToString(b) +
                   std::to_string(options));
      const int32_t y_bytes = static_cast<int32_t>(y.size());
      // The first text ends anywhere, in a block of exactly its size. Whether a shift byte or the caller tells
      // the state makes no difference.
      const size_t cut = random_() % 2 == 0 ? x.size() : random_() % (x.size() + 1);
      const bool started = cp.shift && cut != 0 && x[0] == cp.shift_out;
      const std::vector<char> block(x.begin() + started, x.begin() + static_cast<long>(cut));
      const int32_t bytes = static_cast<int32_t>(block.size());
      while (encoded(cp, a, 0, a.size()).size() > cut) a.pop_back();
      const int32_t expected = model(cp, a, b, options);
      if (cp.shift) {
        const int32_t result = LXStrcmpEx(in, block.data(), started, bytes, y.c_str(), 0, -1, options);
        EXPECT_EQ(result, LXStrcmpEx(in, x.data(), 0, bytes + started, y.data(), 0, y_bytes, options));
        // Shift bytes count by bytes and by case, and case has an order of its own.
        if (options == kWidth) {
          EXPECT_EQ(sign(result), sign(expected));
        } else if (options == kCase && result != 0 && cut == x.size()) {
          EXPECT_NE(expected, 0);
        }
        continue;
      }
      EXPECT_EQ(LXStrcmp(in, block.data(), bytes, y.c_str(), -1, options), expected);
      EXPECT_EQ(LXStrcmpEx(in, block.data(), 1, bytes, y.data(), 1, y_bytes, options), expected);
      EXPECT_EQ(LXStrcmp(in, y.data(), static_cast<int32_t>(b.size()), x.data(), static_cast<int32_t>(a.size()),
                         options | LX_CHARACTERS),
                -expected);
      std::vector<LXWChar> p, q;
      Units f, g;
      const auto map = [&](const Units& text, std::vector<LXWChar>* codes, Units* mapped) {
        for (uint16_t u : text) {
          codes->push_back(cp.find(u)->code);
          mapped->push_back(options == kWidth  ? lx::unicode_full_to_half(u)
                            : options == kCase ? lx::unicode_upper(u)
                                               : u);
        }
      };
      map(a, &p, &f);
      map(b, &q, &g);
      const int32_t codes = static_cast<int32_t>(a.size());
      q.push_back(0), b.push_back(0);
      EXPECT_EQ(sign(LXStrcmpU(in, a.data(), codes, b.data(), -1, options)), f < g ? -1 : f > g);
      if (options != kWidth) {
        EXPECT_EQ(LXWcscmp(in, p.data(), codes, q.data(), -1, options) == 0, f == g);
      }
    }
}

struct Row {
  const TinyCodepage* cp;
  const char* text1;
  int32_t length1;
  const char* text2;
  int32_t length2;
  uint32_t options;
  int32_t expected;
  LXShiftState state1 = 0, state2 = 0;
};

TEST_F(Compare, ExactResults) {
  const TinyCodepage *single = &single_, *sjis = &sjis_, *shift = &shift_;
  const Row rows[] = {
      {single, "", -1, "", 0, kCase, 0},
      {single, "abc", -1, "abcd", 4, kWidth, -1},
      {single, "ab  ", 4, "ab", 2, kBlanks, 0},
      {single, "ab  ", 4, "AB", 2, kBlanks | LX_CHARACTERS | kCase, 0},
      {single, "a", 1, "A", 1, 0x80000001, 0},
      {single, "a", 1, "A", 1, 1, 0},
      {single, "_", 1, "a", 1, kCase, '_' - 'a'},  // small letters
      {sjis, "\x82\x60", 2, "a", 1, kWidth, 'A' - 'a'},
      {sjis, "a\x81\x40 ", 4, "a", 1, kWidth | kBlanks, 0},
      {sjis, "\x82\x60z", 1, "\x82\x60z", 2, LX_CHARACTERS, -1},
      // Kept: what truncation does; cut characters, and forms longer than what is left, end the comparison.
      {sjis, "ab  c", 5, "ab", 2, kBlanks, 0},
      {single, "ab\0c", 4, "ab", 2, kBlanks, 0},
      {sjis, "a\x82", -1, "a\x83", -1, kCase, 0},
      {sjis, "!", 1, "\x88\x9F", 2, kWidth, 0},
      {sjis, "aaaaaaaaaaaaaaa!", 16, "aaaaaaaaaaaaaaa!b", 17, kWidth, 0},
      {sjis, "!a", 2, "\x88\x9F", 2, kWidth, 0x81 - 0x88},
      {shift, "\x0E\x42\xC1\x42", 4, "\x42\xC1", 2, 0, 0, 0, 1},
      {shift, "\x0E\x42\xC1\x0F", -1, "\x0E\x42\xC1\x0F\x81", -1, kWidth, -1},
      {shift, "\x0E\x42\xC1\x40\x40\x0F", -1, "\xC1", -1, kWidth | kBlanks, 0},
      {shift, "\x81\x40\x40", 2, "\x81", 1, kBlanks | LX_CHARACTERS, 0},
      {shift, "\x0E\x44\x47\x42\xC1", 5, "\x44\x47\x44\x47", 4, kCase, 0, 0, 1},  // "small A" is 0x4447 here
      {shift, "\x42\xC1", 2, "\xC1", 1, kCase, 1, 1, 0},
      // Kept: signed bytes; who leaves the double-byte state first is less, but not where the text ends.
      {shift, "\x81", 1, "\x25", 1, kCase, -0x7F - 0x25},
      {shift, "\x0E\x42\xC1\x0F\x81", 5, "\x0E\x42\xC1\x42\xC2", 5, kCase, -1},
      {shift, "\x0E\x42\xC1\x42\xC2", 5, "\x0E\x42\xC1\x0F\x81", 5, kCase, 1},
      {shift, "\x81\x81", 2, "\x81\x0E", 2, kCase, -0x7F - 0x0E},
      {shift, "\x0E\x42\xC1\x0F", 4, "\x0E\x42\xC1\x42\xC2", 5, kCase, 0},
  };
  for (const Row& row : rows) {
    LXLocale* const in = locale(*row.cp);
    if (row.cp == shift) set_case_delta(in, 0x42C1, 0x4447 - 0x42C1);
    EXPECT_EQ(
        LXStrcmpEx(in, row.text1, row.state1, row.length1, row.text2, row.state2, row.length2, row.options),
        row.expected)
        << "row " << &row - rows;
    EXPECT_EQ(LXGetError(in), LX_OK);
  }
}

TEST_F(Compare, CodesAndUnits) {
  LXLocale* const in = locale(four_);
  const LXWChar far[] = {0x90308230, ' ', '@'}, near[] = {0x90318139}, big[] = {0xFFFFFFFF}, small[] = {1};
  EXPECT_EQ(LXWcscmp(in, far, 2, far, 1, kBlanks), 0);
  EXPECT_EQ(LXWcscmp(locale(shift_), far, 2, far, 1, kBlanks), 1);
  EXPECT_EQ(LXWcscmp(in, far, 1, near, 1, 0), 0x90308230 - 0x90318139);
  EXPECT_EQ(LXWcscmp(in, big, 1, small, 1, 0), INT32_MAX);
  // Kept: U+2000 is the blank, and stays behind the second text where nothing is left of the first.
  const LXUChar a[] = {'a', 0x2000, 0x2000}, b[] = {'B', ' '}, full[] = {0xFF21};
  EXPECT_EQ(LXStrcmpU(in, a, 3, a, 1, kBlanks), 0);
  EXPECT_EQ(LXStrcmpU(in, a, 1, a, 3, kBlanks | LX_CHARACTERS), 0);
  EXPECT_EQ(LXStrcmpU(in, a + 1, 1, a + 1, 2, kBlanks), -2);
  EXPECT_EQ(LXStrcmpU(in, b, 2, b, 1, kBlanks), 1);
  EXPECT_EQ(LXStrcmpU(in, a, 1, b, 1, 0), 'a' - 'B');
  EXPECT_EQ(LXStrcmpU(in, a, 1, b, 1, kCase), -1);
  EXPECT_EQ(LXStrcmpU(in, a, 1, full, 1, kWidth), 1);
  // Kept: mapped codes order by their low 16 bits first; what a special mapping adds to codes and units is cut.
  const LXWChar sharp[] = {0xDF}, double_s[] = {'s', 's'};
  const LXUChar sharp_u[] = {0xDF}, double_s_u[] = {'s', 's'};
  use_special();
  EXPECT_GT(LXWcscmp(in, far, 1, near, 1, kCase), 0);
  EXPECT_EQ(LXWcscmp(locale(single_), sharp, 1, double_s, 2, kCase), -1);
  EXPECT_EQ(LXStrcmpU(in, sharp_u, 1, double_s_u, 2, kCase), -1);
  EXPECT_EQ(LXStrcmp(locale(single_), "a\xDF", 2, "ASs", 3, kCase), 0);
  EXPECT_EQ(LXStrcmp(locale(single_), "_", 1, "a", 1, kCase), '_' - 'A');  // capital letters
  EXPECT_EQ(LXStrcmpEx(locale(shift_), "\x42\xC1", 1, 2, "\xC1", 0, 1, kCase), 0x42 - 0xC1);
  EXPECT_EQ(LXStrcmpEx(locale(shift_), "\x42\xC1", 1, 2, "\x0E\x42\xC1\x0F", 0, 3, kCase), 0);
}

TEST_F(Compare, RefusedOptionsAndMemory) {
  LXLocale* const in = locale(single_);
  const LXWChar w = 'a';
  const LXUChar u = 'a';
  for (uint32_t options : {2u, 0x100u, 0x8u, 0x00800000u, 0x80000141u}) {
    EXPECT_EQ(LXStrcmp(in, "a", 1, "b", 1, options), 0);
    EXPECT_EQ(LXGetError(in), LX_E_INVALID) << options;
    EXPECT_EQ(LXStrcmpU(in, &u, 1, nullptr, 0, options), 0);
    EXPECT_EQ(LXGetError(in), LX_E_INVALID) << options;
  }
  for (uint32_t options : {1u, 0x40u, 0x41u, 0x80000000u, 0x80000001u, kWidth, 2u}) {
    EXPECT_EQ(LXWcscmp(in, &w, 1, nullptr, 0, options), 0);
    EXPECT_EQ(LXGetError(in), LX_E_INVALID) << options;
  }
  const std::string text(300, 'x'), blank = text + " ";
  lx::test::Hooks& hooks = library_.hooks();
  hooks.fail_at(1);
  EXPECT_EQ(LXStrcmp(in, blank.c_str(), -1, text.c_str(), -1, kBlanks), 1);  // the blank counts
  EXPECT_EQ(LXGetError(in), LX_OK);
  use_special();
  for (size_t failing : {1u, 2u, 3u}) {
    hooks.fail_at(failing);
    EXPECT_EQ(LXStrcmp(in, blank.c_str(), -1, text.c_str(), -1, kCase), failing == 3 ? 1 : 0);
    EXPECT_EQ(LXGetError(in), failing == 3 ? LX_OK : LX_E_MEMORY);
  }
}

TEST_F(Compare, WithoutALibraryNothingIsTouched) {
  EXPECT_TRUE(library_.close());
  EXPECT_EQ(LXStrcmp(nullptr, nullptr, 1, nullptr, 2, 0), 0);
  EXPECT_EQ(LXStrcmpU(nullptr, nullptr, 1, nullptr, 2, 0), 0);
}

TEST_F(Compare, Trace) {
  const auto said = [](const auto& call) {
    RecordingTrace::set_level(RAS1_LEVEL_EVENTS | RAS1_LEVEL_DETAIL | RAS1_LEVEL_INPUT);
    call();
    RecordingTrace::set_level(0);
    std::string all;
    for (const TraceRecord& r : RecordingTrace::take())
      all += r.kind == TraceRecord::kExitValue ? "=" + std::to_string(r.value)
                                               : r.text + std::string(r.bytes.begin(), r.bytes.end()) + "|";
    return all;
  };
  LXLocale* const in = locale(shift_);
  EXPECT_EQ(said([&] { LXStrcmp(in, "a", 1, "b", 1, 0); }), "|String1a|String2b|=-1");
  const char start[] = "|Options = 80000041|len1 = 2, str1state = 1, len2 = 1, str2state = 0|";
  EXPECT_EQ(said([&] { LXStrcmpEx(in, "\x0E\x44\x47", 0, 3, "\x81", 0, 1, kWidth); }),
            std::string(start) + "String1\x44\x47|String2\x81|Strings are unequal: len1 = 2, len2 = 1|=1");
  EXPECT_EQ(said([&] { LXStrcmpEx(in, "\x42\xC1", 1, 2, "\x81", 0, 1, kWidth); }),
            std::string(start) +
                "String1\x42\xC1|String2\x81|Strings are unequal: len1 = 1, len2 = 1|String1\xC1|"
                "String2\x81|=64");
  const LXUChar u = 0x4241;
  EXPECT_EQ(said([&] { LXStrcmpU(in, &u, 1, &u, 0, kCase); }), "|options = 80000040|String1AB|String2|=1");
}

}  // namespace
