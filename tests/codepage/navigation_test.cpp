// Walking, counting, packing and storing characters, in every kind of text: rules on random valid text, and
// packed codes.
#include <gtest/gtest.h>

#include <random>

#include "support/tiny_codepages.h"

namespace lx::test {
namespace {

constexpr LXShiftState kUntouched = 77;

/// A text and where its tokens end: shift bytes and characters, in order.
struct Token {
  size_t begin, end;
  LXShiftState state_after;
  const TinyCharacter* character;  // null: a shift byte
};
struct Walk {
  std::vector<char> bytes;  // with a null behind the last token
  std::vector<Token> tokens;

  size_t size() const { return bytes.size() - 1; }
  const char* begin() const { return bytes.data(); }
  /// Whole characters, the last token's end and the state there, in the first `bytes` bytes.
  int32_t chars_in(size_t count) const {
    int32_t n = 0;
    for (const Token& t : tokens) n += t.character != nullptr && t.end <= count;
    return n;
  }
  Token last_in(size_t count, LXShiftState initial) const {
    Token last{0, 0, initial, nullptr};
    for (const Token& t : tokens)
      if (t.end <= count) last = t;
    return last;
  }
};

/// Random characters but the null, with shift bytes between them where needed, and here and there where not.
Walk random_text(const TinyCodepage& cp, std::mt19937* random, size_t chars, LXShiftState state) {
  Walk text;
  std::string bytes;
  const auto add_shift = [&] {
    state = state == LX_SHIFT_SINGLE ? LX_SHIFT_DOUBLE : LX_SHIFT_SINGLE;
    text.tokens.push_back({bytes.size(), bytes.size() + 1, state, nullptr});
    bytes.push_back(state == LX_SHIFT_DOUBLE ? cp.shift_out : cp.shift_in);
  };
  for (size_t i = 0; i < chars; ++i) {
    const TinyCharacter* c = nullptr;
    do c = &cp.characters[(*random)() % cp.characters.size()];
    while (c->unicode == 0);
    if (cp.shift && (c->bytes.size() > 1) != (state == LX_SHIFT_DOUBLE)) add_shift();
    text.tokens.push_back({bytes.size(), bytes.size() + c->bytes.size(), state, c});
    bytes += c->bytes;
  }
  if (cp.shift && state == LX_SHIFT_DOUBLE && (*random)() % 2 == 0) add_shift();
  text.bytes.assign(bytes.c_str(), bytes.c_str() + bytes.size() + 1);
  return text;
}

class Navigation : public testing::Test {
 protected:
  void TearDown() override { EXPECT_TRUE(library_.close()); }

  /// Whole characters of every beginning of a text, and their end.
  void counts(const TinyCodepage& cp, const Walk& text, LXShiftState initial) {
    LXLocale* locale = library_.locale(cp);
    const LXObject* object = library_.object(cp);
    for (size_t n = 0; n <= text.size() + 1; ++n) {
      const bool null = n > text.size();
      const size_t size = null ? text.size() : n;
      const int32_t bytes = null ? -1 : static_cast<int32_t>(n);
      const std::vector<char> cut(text.begin(), text.begin() + n);  // nothing behind the end may be read
      const int32_t chars = text.chars_in(size);
      const Token last = text.last_in(size, initial);
      EXPECT_EQ(LXNumCharsEx(locale, cut.data(), initial, bytes), chars);
      EXPECT_EQ(LXCpStrByteToCharLen(object, cut.data(), initial, bytes), chars);
      if (!cp.shift) {
        EXPECT_EQ(LXNumChars(locale, cut.data(), bytes), chars);
      }
      if (null) continue;
      LXShiftState state = kUntouched;
      EXPECT_EQ(LXMoveStringPointerEx(locale, cut.data(), initial, bytes, &state, 0), cut.data() + last.end);
      EXPECT_EQ(state, n == 0 && cp.shift ? kUntouched : last.state_after);
      if (!cp.shift) {
        EXPECT_EQ(LXMoveStringPointer(locale, cut.data(), bytes, 0), cut.data() + last.end);
      }
    }
  }
  TinyLibrary library_;
};

TEST_F(Navigation, StatelessTextInPlainAndExForms) {
  std::mt19937 random(1);
  for (const TinyCodepage& cp : tiny_codepages()) {
    if (cp.shift) continue;
    SCOPED_TRACE(cp.file.name);
    LXLocale* locale = library_.locale(cp);
    const LXObject* object = library_.object(cp);
    for (int round = 0; round < 60; ++round) {
      const LXShiftState given = random() % 2;
      const Walk text = random_text(cp, &random, random() % 12, given);
      const char* start = text.begin();
      LXShiftState state = kUntouched;
      int32_t index = 0;
      for (const Token& t : text.tokens) {
        const char* p = start + t.begin;
        const char* next = start + t.end;
        EXPECT_EQ(LXNextChar(locale, p), next);
        EXPECT_EQ(LXNextCharEx(locale, p, given, &state, 0), next);
        EXPECT_EQ(state, given);
        EXPECT_EQ(LXPrevChar(locale, start, next), p);
        EXPECT_EQ(LXPrevCharEx(locale, start, next, given, &state), p);
        EXPECT_EQ(LXGetChar(locale, p), t.character->code);
        EXPECT_EQ(LXGetCharEx(locale, p, given), t.character->code);
        EXPECT_EQ(LXMbToW(object, p), t.character->code);
        const int32_t length = static_cast<int32_t>(t.end - t.begin);
        EXPECT_EQ(LXByteLength(locale, p), length);
        EXPECT_EQ(LXByteLengthEx(locale, p, given), length);
        EXPECT_EQ(LXByteLengthW(locale, t.character->code), length);
        EXPECT_EQ(LXValidChar(locale, p), length);
        EXPECT_EQ(LXValidCharEx(locale, p, given), length);
        ++index;
        EXPECT_EQ(LXCpStrCharToByteLen(object, start, given, index), static_cast<int32_t>(t.end));
        EXPECT_EQ(LXMoveStringPointer(locale, start, index, LX_CHARACTERS), next);
        EXPECT_EQ(LXMoveStringPointerEx(locale, start, given, index, &state, LX_CHARACTERS), next);
      }
      counts(cp, text, given);
    }
  }
}

TEST_F(Navigation, ShiftSensitiveText) {
  std::mt19937 random(2);
  const TinyCodepage cp = tiny_shift();
  LXLocale* locale = library_.locale(cp);
  const LXObject* object = library_.object(cp);
  for (int round = 0; round < 400; ++round) {
    const LXShiftState initial = random() % 2;
    const Walk text = random_text(cp, &random, random() % 10, initial);
    const char* start = text.begin();
    int32_t count = 0;
    const char* p = start;
    LXShiftState state = initial;
    for (const Token& t : text.tokens) {
      if (t.character == nullptr) continue;
      const bool shift_behind = &t != &text.tokens.back() && (&t)[1].character == nullptr;
      const Token& last = shift_behind ? (&t)[1] : t;
      EXPECT_EQ(LXGetCharEx(locale, p, state), t.character->code);
      EXPECT_EQ(LXByteLengthEx(locale, p, state), static_cast<int32_t>(t.end - t.begin));
      EXPECT_EQ(LXMbToWS(object, start + t.begin, t.state_after), t.character->code);
      LXShiftState next_state = kUntouched;
      const char* next = LXNextCharEx(locale, p, state, &next_state, 0);
      EXPECT_EQ(next, start + last.end);
      EXPECT_EQ(next_state, last.state_after);
      LXShiftState prev_state = kUntouched;
      EXPECT_EQ(LXPrevCharEx(locale, start, next, next_state, &prev_state), start + t.begin);
      EXPECT_EQ(prev_state, t.state_after);
      ++count;
      EXPECT_EQ(LXCpStrCharToByteLen(object, start, initial, count), static_cast<int32_t>(last.end));
      EXPECT_EQ(LXMoveStringPointerEx(locale, start, initial, count, &state, LX_CHARACTERS), start + last.end);
      EXPECT_EQ(state, last.state_after);
      p = next;
    }
    counts(cp, text, initial);
  }
}

TEST_F(Navigation, PackedCodes) {
  struct Row {
    uint32_t code;
    std::string bytes;
    int32_t code_length;  // zero bytes counted
  };
  const Row rows[] = {
      {0x00, std::string("\0", 1), 1},
      {0x41, "A", 1},
      {0x82A0, "\x82\xA0", 2},
      {0x8200, std::string("\x82\0", 2), 2},
      {0x820041, "\x82\x41", 3},
      {0x8FB0A1, "\x8F\xB0\xA1", 3},
      {0x90308130, "\x90\x30\x81\x30", 4},
      {0x90000030, "\x90\x30", 4},
      {0x90300030, "\x90\x30\x30", 4},
      {0x90008100, std::string("\x90\x81\0", 3), 4},
  };
  LXLocale* locale = library_.locale(tiny_single());
  for (const Row& row : rows) {
    SCOPED_TRACE(row.code);
    EXPECT_EQ(LXStrByteLength(row.code), row.code_length);
    EXPECT_EQ(LXByteLengthW(locale, row.code), row.code_length);
    std::vector<char> stored(row.bytes.size());  // exact
    EXPECT_EQ(LXWToMb(stored.data(), row.code), static_cast<int32_t>(row.bytes.size()));
    EXPECT_EQ(std::string(stored.begin(), stored.end()), row.bytes);
    std::vector<char> put(row.bytes.size());
    EXPECT_EQ(LXPutChar(locale, put.data(), row.code), 0);
    EXPECT_EQ(put, stored);
  }
}

TEST_F(Navigation, SwapsWholeUnitsOnly) {
  for (int32_t bytes = -1; bytes <= 5; ++bytes) {
    std::vector<char> buffer{'a', 'b', 'c', 'd', 'e'};
    std::string expected = "abcde";
    for (int32_t i = 0; i + 2 <= bytes; i += 2)
      std::swap(expected[static_cast<size_t>(i)], expected[static_cast<size_t>(i) + 1]);
    LXStrBigEndian(buffer.data(), bytes);
    EXPECT_EQ(std::string(buffer.begin(), buffer.end()), expected) << bytes;
  }
}

}  // namespace
}  // namespace lx::test
