// Whole-string conversions of shift-sensitive text: where shift bytes go, and how an output that ends in the
// double-byte state is closed, for every output size.
#include <gtest/gtest.h>

#include "support/tiny_codepages.h"

namespace {

using lx::test::TinyCodepage;
using lx::test::TinyLibrary;

using Units = std::vector<uint16_t>;

constexpr char kSo = '\x0E';
constexpr char kSi = '\x0F';
constexpr char kCanary = '\xA5';
const Units kKana{0x3041, 0x3042, 0x3043};  // 44 47, 44 48, 44 49

std::string printed(const std::string& bytes) {
  return testing::PrintToString(bytes);
}

class Shift : public testing::Test {
 protected:
  void TearDown() override { EXPECT_TRUE(library_.close()); }

  /// The output of both doors that close a state, from the same characters; they must agree.
  std::string convert(const Units& text, LXShiftState state, int32_t size, bool null_terminated, int32_t flags,
                      int32_t* result) {
    std::string input;
    for (uint16_t u : text) input += u == 'A' ? "A" : utf8_.encode({u});
    Units units = text;
    if (null_terminated) units.push_back(0);
    const std::vector<char> bytes(input.c_str(), input.c_str() + input.size() + null_terminated);
    int32_t length = static_cast<int32_t>((flags & LX_CHARACTERS) != 0 ? text.size() : input.size());
    int32_t count = static_cast<int32_t>(text.size());
    if (null_terminated) length = count = -1;
    std::string from_bytes(kRoom, kCanary), from_units(kRoom, kCanary);
    *result = LXConvertStringEx(shift_, from_bytes.data(), state, size, library_.locale(utf8_), bytes.data(), 0,
                                length, flags);
    EXPECT_EQ(LXUnicodeToStringEx(shift_, from_units.data(), state, size, units.data(), count, flags), *result);
    EXPECT_EQ(printed(from_units), printed(from_bytes));
    // What is taken back stays behind the null, inside the size; behind the size there is nothing.
    if ((flags & LX_CHARACTERS) == 0) {
      EXPECT_EQ(from_bytes.find_first_not_of(kCanary, static_cast<size_t>(size)), std::string::npos);
      return from_bytes.substr(0, static_cast<size_t>(*result));
    }
    return from_bytes.substr(0, from_bytes.find_last_not_of(kCanary) + 1);
  }

  static constexpr size_t kRoom = 40;
  TinyLibrary library_;
  TinyCodepage utf8_ = lx::test::tiny_utf8();
  TinyCodepage cp_ = lx::test::tiny_shift();
  LXLocale* shift_ = library_.locale(cp_);
};

/// "A", three double-byte characters, "A": SO, 44 47, ..., SI are bytes 1 to 8.
TEST_F(Shift, ClosingAtEverySize) {
  Units text{'A'};
  text.insert(text.end(), kKana.begin(), kKana.end());
  const std::string null(1, '\0');
  const std::string a = "\xC1";
  const std::string so(1, kSo), si(1, kSi);
  const std::string k1 = "\x44\x47", k2 = "\x44\x48", k3 = "\x44\x49";
  struct Row {
    int32_t size;
    std::string terminated;  // LX_TERMINATE
    std::string plain;       // no flags, length given
    std::string by_null;     // no flags, null-terminated
  };
  const Row rows[] = {
      {0, "", "", ""},
      {1, null, a, a},
      {2, a + null, a, a},
      {3, a + null, a, a},
      {4, a + null, a + so + k1, a + so + k1},
      // The first character fits before the null, but not with its Shift-In: it goes, and its Shift-Out with
      // it.
      {5, a + null, a + so + k1, a + so + k1},
      {6, a + so + k1 + si + null, a + so + k1 + k2, a + so + k1 + k2},
      {7, a + so + k1 + si + null, a + so + k1 + k2, a + so + k1 + k2},
      {8, a + so + k1 + k2 + si + null, a + so + k1 + k2 + k3, a + so + k1 + k2 + k3},
      {9, a + so + k1 + k2 + si + null, a + so + k1 + k2 + k3, a + so + k1 + k2 + si + null},
      {10, a + so + k1 + k2 + k3 + si + null, a + so + k1 + k2 + k3, a + so + k1 + k2 + k3 + si + null},
      {11, a + so + k1 + k2 + k3 + si + null, a + so + k1 + k2 + k3, a + so + k1 + k2 + k3 + si + null},
  };
  for (const Row& row : rows) {
    SCOPED_TRACE(row.size);
    int32_t result = 0;
    EXPECT_EQ(printed(convert(text, 0, row.size, false, LX_TERMINATE, &result)), printed(row.terminated));
    EXPECT_EQ(result, static_cast<int32_t>(row.terminated.size()));
    EXPECT_EQ(printed(convert(text, 0, row.size, true, LX_TERMINATE, &result)), printed(row.terminated));
    EXPECT_EQ(result, static_cast<int32_t>(row.terminated.size()));
    EXPECT_EQ(printed(convert(text, 0, row.size, false, 0, &result)), printed(row.plain));
    EXPECT_EQ(result, static_cast<int32_t>(row.plain.size()));
    EXPECT_EQ(printed(convert(text, 0, row.size, true, 0, &result)), printed(row.by_null));
    EXPECT_EQ(result, static_cast<int32_t>(row.by_null.size()));
  }
}

/// In the double-byte state from the start, or with nothing converted.
TEST_F(Shift, ClosingAnOpenState) {
  const std::string null(1, '\0');
  const std::string closed = std::string(1, kSi) + null;
  const std::string k1 = "\x44\x47";
  struct Row {
    Units text;
    LXShiftState state;
    int32_t size, flags;
    bool null_terminated;
    std::string bytes;
    int32_t result;
  };
  const Units none;
  const Units one{0x3041};
  const Units a{'A'};
  const int32_t kTerm = LX_TERMINATE;
  const int32_t kChars = LX_CHARACTERS;
  const Row rows[] = {
      {none, 1, 0, kTerm, false, "", 0},
      {none, 1, 1, kTerm, false, null, 1},
      {none, 1, 2, kTerm, false, closed, 2},
      {none, 0, 2, kTerm, false, null, 1},
      {none, 1, 5, 0, false, "", 0},
      {none, 1, 1, 0, true, null, 1},
      {none, 1, 2, 0, true, closed, 2},
      {none, 1, 1, kTerm | kChars, false, closed, 1},  // a shift byte is no character
      {one, 1, 1, kTerm, false, null, 1},
      {one, 1, 2, kTerm, false, closed, 2},
      {one, 1, 3, kTerm, false, closed, 2},  // taken back
      {one, 1, 4, kTerm, false, k1 + closed, 4},
      {one, 1, 3, 0, true, closed, 2},
      {one, 1, 4, 0, true, k1 + closed, 4},
      {one, 1, 2, 0, true, k1, 2},
      {one, 0, 3, 0, true, "\x0E" + k1, 3},
      {one, 0, 4, 0, true, null, 1},  // taken back with its Shift-Out
      {one, 0, 4, kTerm, false, null, 1},
      {one, 0, 5, kTerm, false, "\x0E" + k1 + closed, 5},
      {a, 1, 1, 0, false, "", 0},
      {a, 1, 2, 0, false, "\x0F\xC1", 2},
      {a, 1, 2, kTerm, false, closed, 2},
      {a, 1, 3, kTerm, false, std::string("\x0F\xC1\0", 3), 3},
  };
  for (const Row& row : rows) {
    SCOPED_TRACE(std::to_string(&row - rows));
    int32_t result = -2;
    EXPECT_EQ(printed(convert(row.text, row.state, row.size, row.null_terminated, row.flags, &result)),
              printed(row.bytes));
    EXPECT_EQ(result, row.result);
  }
}

/// Room for characters is room for their shift bytes, and nothing is taken back.
TEST_F(Shift, SizesInCharacters) {
  Units text{'A', 0x3041, 0x3042};
  const std::string parts[] = {"", "\xC1", "\xC1\x0E\x44\x47", "\xC1\x0E\x44\x47\x44\x48"};
  for (int32_t size = 1; size <= 5; ++size) {
    SCOPED_TRACE(size);
    int32_t result = 0;
    const size_t fit = static_cast<size_t>(size < 3 ? size : 3);
    EXPECT_EQ(printed(convert(text, 0, size, false, LX_CHARACTERS, &result)), printed(parts[fit]));
    EXPECT_EQ(result, static_cast<int32_t>(fit));
    const size_t before_null = static_cast<size_t>(size - 1 < 3 ? size - 1 : 3);
    const std::string end = before_null > 1 ? std::string("\x0F\0", 2) : std::string(1, '\0');
    EXPECT_EQ(printed(convert(text, 0, size, false, LX_CHARACTERS | LX_TERMINATE, &result)),
              printed(parts[before_null] + end));
    EXPECT_EQ(result, static_cast<int32_t>(before_null) + 1);
    const bool room_for_null = size > 3;
    EXPECT_EQ(printed(convert(text, 0, size, true, LX_CHARACTERS, &result)),
              printed(parts[fit] + (room_for_null ? end : "")));
    EXPECT_EQ(result, static_cast<int32_t>(fit) + room_for_null);
  }
}

/// The source side: shift bytes set the state and are no characters.
TEST_F(Shift, ReadingShiftSensitiveText) {
  struct Row {
    std::string text;
    LXShiftState state;
    Units units;
    bool cut;
  };
  const Row rows[] = {
      {"\xC1\x0E\x44\x47\x44\x48\x0F\xC2", 0, {'A', 0x3041, 0x3042, 'B'}, false},
      {"\x44\x47\x0F\xC2", 1, {0x3041, 'B'}, false},
      {"\xC1\x0E", 0, {'A'}, false},  // a shift byte at the end ends the text
      {"\xC1\x0E\x44", 0, {'A'}, true},
      // The second of two is half of a character.
      {"\xC1\x0E\x0F\xC1\x44\x47", 0, {'A', 0xFFFD, 0x3041}, false},
      {"\x0F\xC1", 0, {'A'}, false},
      {"\x0E\x42\x42\x0F", 0, {0xFFFD}, false},
  };
  for (const Row& row : rows) {
    SCOPED_TRACE(printed(row.text));
    for (bool null : {false, true}) {
      const std::vector<char> text(row.text.c_str(), row.text.c_str() + row.text.size() + null);
      const int32_t length = null ? -1 : static_cast<int32_t>(row.text.size());
      Units units(12, 0xA5A5);
      const bool ended = null && !row.cut;
      const int32_t n = LXStringToUnicodeEx(units.data(), 12, shift_, text.data(), row.state, length, 0);
      EXPECT_EQ(n, static_cast<int32_t>(row.units.size() + ended));
      Units expected = row.units;
      if (ended) expected.push_back(0);
      expected.resize(12, 0xA5A5);
      EXPECT_EQ(units, expected);
    }
    Units by_object(12);
    if (row.state != 0) continue;
    EXPECT_EQ(LXCpStrToUnicode(library_.object(cp_), row.text.data(), static_cast<int32_t>(row.text.size()),
                               by_object.data()),
              static_cast<int32_t>(row.units.size()));
    by_object.resize(row.units.size());
    EXPECT_EQ(by_object, row.units);
  }
}

TEST_F(Shift, PackedCodes) {
  const std::string text = "\xC1\x0E\x44\x47\x44\x48\x0F\xC2";
  const std::vector<LXWChar> codes{0xC1, 0x4447, 0x4448, 0xC2};
  for (int32_t size = 0; size <= 6; ++size) {
    const size_t fit = static_cast<size_t>(size < 4 ? size : 4);
    for (int32_t flags : {0, static_cast<int32_t>(LX_CHARACTERS)}) {
      std::vector<LXWChar> out(8, 7);
      const int32_t length = flags != 0 ? 4 : static_cast<int32_t>(text.size());
      EXPECT_EQ(LXMbToWideEx(shift_, out.data(), size, text.data(), 0, length, flags),
                static_cast<int32_t>(fit));
      std::vector<LXWChar> expected(codes.begin(), codes.begin() + static_cast<long>(fit));
      expected.resize(8, 7);
      EXPECT_EQ(out, expected);
    }
  }
  // A null in the single-byte state is converted; in the double-byte state it ends the text.
  std::vector<LXWChar> out(8, 7);
  EXPECT_EQ(LXMbToWideEx(shift_, out.data(), 8, text.c_str(), 0, -1, 0), 5);
  EXPECT_EQ(out[4], 0u);
  EXPECT_EQ(LXMbToWideEx(shift_, out.data(), 8, "\x44\x47", 1, -1, 0), 1);
  EXPECT_EQ(LXMbToWideEx(shift_, out.data(), 8, "", 1, -1, 0), 0);

  const size_t ends[] = {0, 1, 1, 1, 4, 4, 6, 6, 8, 8};  // whole characters with their shift bytes
  for (int32_t size = 0; size < 10; ++size) {
    std::string bytes(12, kCanary);
    const std::string expected = text.substr(0, ends[size]);
    EXPECT_EQ(LXWideToMbEx(shift_, bytes.data(), 0, size, codes.data(), 4, 0),
              static_cast<int32_t>(expected.size()));
    EXPECT_EQ(printed(bytes), printed(expected + std::string(12 - expected.size(), kCanary)));
  }
  std::string bytes(12, kCanary);
  EXPECT_EQ(LXWideToMbEx(shift_, bytes.data(), 1, 12, codes.data() + 1, 2, 0), 4) << "left open at the end";
  EXPECT_EQ(bytes.substr(0, 5), std::string("\x44\x47\x44\x48") + kCanary);
  EXPECT_EQ(LXWideToMbEx(shift_, bytes.data(), 1, 3, codes.data(), 3, LX_CHARACTERS), 3);
  EXPECT_EQ(bytes.substr(0, 8), std::string("\x0F\xC1\x0E\x44\x47\x44\x48") + kCanary);
  const LXWChar ended[] = {0x4447, 0};
  EXPECT_EQ(LXWideToMbEx(shift_, bytes.data(), 0, 12, ended, -1, 0), 5)
      << "the zero is a single-byte character";
  EXPECT_EQ(bytes.substr(0, 5), std::string("\x0E\x44\x47\x0F\0", 5));
}

TEST_F(Shift, ByCodepageObjectNothingIsClosed) {
  const LXUChar units[] = {'A', 0x3041, 0x3042, 'B', 0x3043, 0};
  const LXObject* object = library_.object(cp_);
  std::string out(16, kCanary);
  EXPECT_EQ(LXCpUnicodeToStr(object, units, 0, -1, out.data()), 11);
  EXPECT_EQ(printed(out.substr(0, 12)),
            printed(std::string("\xC1\x0E\x44\x47\x44\x48\x0F\xC2\x0E\x44\x49\xA5")));
  EXPECT_EQ(LXCpUnicodeToStr(object, units, 1, 1, out.data()), 2);
  EXPECT_EQ(out.substr(0, 2), "\x0F\xC1");
  EXPECT_EQ(LXCpUnicodeToStr(object, units + 1, 1, 1, out.data()), 2);
  EXPECT_EQ(out.substr(0, 2), "\x44\x47");
}

/// The plain forms know no shift bytes: every byte is a character, and codes are stored as they are.
TEST_F(Shift, PlainFormsDoNotShift) {
  LXUChar units[4] = {};
  EXPECT_EQ(LXStringToUnicode(units, 4, shift_, "\x0E\xC1\x0F", 3, 0), 3);
  EXPECT_EQ(units[0], 0xFFFD);
  EXPECT_EQ(units[1], 'A');
  char out[8] = {};
  const LXUChar text[] = {0x3041, 'A'};
  EXPECT_EQ(LXUnicodeToString(shift_, out, 8, text, 2, 0), 3);
  EXPECT_STREQ(out, "\x44\x47\xC1");
}

}  // namespace
