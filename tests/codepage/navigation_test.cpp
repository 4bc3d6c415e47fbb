// Walking, counting, packing and storing characters, in every kind of text: rules on random valid text, and
// tables of the edge cases.
#include <gtest/gtest.h>

#include <cstring>
#include <functional>
#include <random>

#include "core/lxbytes.h"
#include "core/lxformat.h"
#include "core/lxrecords.h"
#include "support/tiny_codepages.h"

namespace {

using lx::test::TinyCharacter;
using lx::test::TinyCodepage;
using lx::test::TinyLibrary;

constexpr LXShiftState kUntouched = 77;
constexpr uint32_t kNoSelector = 0x12345;

/// A text and where its tokens end: shift bytes and characters, in order.
struct Token {
  size_t begin, end;
  LXShiftState state_after;
  const TinyCharacter* character;  // null: a shift byte
};
struct Text {
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
Text random_text(const TinyCodepage& cp, std::mt19937* random, size_t chars, LXShiftState state) {
  Text text;
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
  void counts(const TinyCodepage& cp, const Text& text, LXShiftState initial) {
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
  for (const TinyCodepage& cp : lx::test::tiny_codepages()) {
    if (cp.shift) continue;
    SCOPED_TRACE(cp.file.name);
    LXLocale* locale = library_.locale(cp);
    const LXObject* object = library_.object(cp);
    for (int round = 0; round < 60; ++round) {
      const LXShiftState given = random() % 2;
      const Text text = random_text(cp, &random, random() % 12, given);
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
  const TinyCodepage cp = lx::test::tiny_shift();
  LXLocale* locale = library_.locale(cp);
  const LXObject* object = library_.object(cp);
  for (int round = 0; round < 400; ++round) {
    const LXShiftState initial = random() % 2;
    const Text text = random_text(cp, &random, random() % 10, initial);
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

TEST_F(Navigation, ShiftBytesInOddPlaces) {
  const TinyCodepage cp = lx::test::tiny_shift();
  LXLocale* locale = library_.locale(cp);
  struct Row {
    std::string text;
    LXShiftState state;
    int32_t chars;
    size_t moved;
    LXShiftState moved_state;
  };
  const Row rows[] = {
      {"\x0E\x42\xC1\x42\xC2\x0F\xC1", 0, 3, 7, 0},
      {"\xC1\x0E", 0, 1, 2, 1},      // a Shift-Out at the end is passed
      {"\xC1\x0E\x42", 0, 1, 2, 1},  // a cut character behind it is not
      {"\x0E\x0F\xC1", 0, 1, 3, 1},  // two in a row: the second one is half of a character
      {"\x0F\x0E\xC1", 1, 2, 3, 0},  // ... or a character of one byte
      {"\x0E\x42\xC1", 1, 1, 3, 1},  // a shift byte that changes nothing
      {"\xC1\xC2", 5, 2, 2, 5},      // any state but 1 is the single-byte state
  };
  for (const Row& row : rows) {
    const std::vector<char> text(row.text.begin(), row.text.end());
    SCOPED_TRACE(testing::PrintToString(row.text));
    const int32_t bytes = static_cast<int32_t>(text.size());
    EXPECT_EQ(LXNumCharsEx(locale, text.data(), row.state, bytes), row.chars);
    EXPECT_EQ(LXCpStrByteToCharLen(library_.object(cp), text.data(), row.state, bytes), row.chars);
    LXShiftState state = kUntouched;
    EXPECT_EQ(LXMoveStringPointerEx(locale, text.data(), row.state, bytes, &state, 0), text.data() + row.moved);
    EXPECT_EQ(state, row.moved_state);
  }
  LXLocale* sjis = library_.locale(lx::test::tiny_shift_jis());
  const char two[] = "a\x82\xA0";
  EXPECT_EQ(LXMoveStringPointer(sjis, two, 2, LX_CHARACTERS | 1), two + 3) << "other flags belong to others";
  EXPECT_EQ(LXCpStrCharToByteLen(library_.object(lx::test::tiny_shift_jis()), two, 0, -3), 0);
  // A shift byte just behind the range stays there.
  LXShiftState state = kUntouched;
  const char text[] = "\xC1\x0E\x42\xC1";
  EXPECT_EQ(LXMoveStringPointerEx(locale, text, 0, 1, &state, 0), text + 1);
  EXPECT_EQ(state, 0u);
}

TEST_F(Navigation, PreviousCharacterNeverPassesTheStart) {
  LXLocale* shift = library_.locale(lx::test::tiny_shift());
  struct Row {
    std::string text;
    size_t at;
    LXShiftState state;
    size_t found;
    LXShiftState found_state;
  };
  const Row rows[] = {
      {"\xC1\xC2", 2, 0, 1, 0},         {"\xC1\xC2", 0, 0, 0, 0},
      {"\x42\xC1", 0, 1, 0, 1},         {"\x42\xC1\x42\xC2", 1, 1, 0, 1},  // less than a character before it
      {"\x0F\xC1", 1, 0, 0, 1},                                            // only a shift byte before it
      {"\x42\x0F\xC1", 2, 0, 0, 1},     {"\x42\xC1\x0F", 3, 0, 0, 1},  // before a Shift-In it is double-byte
      {"\xC1\x0E\x42\xC1", 2, 1, 0, 0},                                // before a Shift-Out single-byte
      {"\x0E\x42\xC1", 1, 1, 0, 0},
  };
  for (const Row& row : rows) {
    SCOPED_TRACE(testing::PrintToString(row.text));
    LXShiftState state = kUntouched;
    const std::vector<char> text(row.text.begin(), row.text.end());
    EXPECT_EQ(LXPrevCharEx(shift, text.data(), text.data() + row.at, row.state, &state),
              text.data() + row.found);
    EXPECT_EQ(state, row.found_state);
  }
  // Without shift bytes the walk is from the start: in the middle of a character its start is found.
  LXLocale* sjis = library_.locale(lx::test::tiny_shift_jis());
  const char text[] = "a\x82\xA0z";
  const size_t before[] = {0, 0, 1, 1, 3};
  for (size_t at = 0; at < 5; ++at) EXPECT_EQ(LXPrevChar(sjis, text, text + at), text + before[at]) << at;
  LXLocale* single = library_.locale(lx::test::tiny_single());
  EXPECT_EQ(LXPrevChar(single, text + 1, text + 1), text) << "one byte, wherever the start is";
}

TEST_F(Navigation, ValidCharacterStopsAtANull) {
  struct Row {
    TinyCodepage cp;
    std::string text;
    LXShiftState state;
    int32_t plain, ex;
  };
  const Row rows[] = {
      {lx::test::tiny_single(), std::string("\0x", 2), 0, 0, 0},
      {lx::test::tiny_single(), "ab", 1, 1, 1},
      {lx::test::tiny_shift_jis(), std::string("\x82\0", 2), 0, 1, 1},
      {lx::test::tiny_euc(), std::string("\x8F\xB0\0", 3), 1, 2, 2},
      {lx::test::tiny_euc(), "\x8F\xB0\xA1z", 0, 3, 3},
      {lx::test::tiny_four(), std::string("\x90\x30\0\x30", 4), 0, 2, 2},
      {lx::test::tiny_shift(), std::string("\x42\0", 2), 1, 1, 1},
      {lx::test::tiny_shift(), "\x42\xC1", 1, 1, 2},
      {lx::test::tiny_shift(), "\x42\xC1", 2, 1, 2},  // here every state but 0 is the double-byte state
      {lx::test::tiny_shift(), "\x42\xC1", 0, 1, 1},
  };
  for (const Row& row : rows) {
    SCOPED_TRACE(row.cp.file.name + testing::PrintToString(row.text));
    const std::vector<char> text(row.text.begin(), row.text.end());
    EXPECT_EQ(LXValidChar(library_.locale(row.cp), text.data()), row.plain);
    EXPECT_EQ(LXValidCharEx(library_.locale(row.cp), text.data(), row.state), row.ex);
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
  LXLocale* locale = library_.locale(lx::test::tiny_single());
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

TEST_F(Navigation, PutInShiftStates) {
  struct Row {
    LXShiftState state;
    uint32_t code;
    std::string shift, stateless;
  };
  const Row rows[] = {
      {0, 0xC1, "\xC1", "\xC1"},
      {1, 0xC1, "\x0F\xC1", "\xC1"},
      {0, 0x42C1, "\x0E\x42\xC1", "\x42\xC1"},
      {1, 0x42C1, "\x42\xC1", "\x42\xC1"},
  };
  LXLocale* shift = library_.locale(lx::test::tiny_shift());
  LXLocale* sjis = library_.locale(lx::test::tiny_shift_jis());
  for (const Row& row : rows) {
    char out[4] = {}, plain[4] = {};
    LXPutCharEx(shift, out, row.state, row.code);
    EXPECT_EQ(std::string(out), row.shift);
    LXPutCharEx(sjis, plain, row.state, row.code);
    EXPECT_EQ(std::string(plain), row.stateless);
  }
  // A shift byte that is read sets the state whatever it was.
  EXPECT_EQ(LXGetCharEx(shift, "\x0E\x42\xC1", 1), 0x42C1u);
  EXPECT_EQ(LXGetCharEx(shift, "\x0F\xC1", 0), 0xC1u);
  EXPECT_EQ(LXByteLengthEx(shift, "\x0E", 0), 2);
  EXPECT_EQ(LXByteLengthEx(shift, "\x0F", 1), 1);
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

template <class Integer>
uintptr_t value(Integer number) {
  return static_cast<uintptr_t>(number);
}
template <class Char>
uintptr_t value(Char* p) {
  return reinterpret_cast<uintptr_t>(p);
}

/// Each function that takes a locale, on a text of two one-byte characters.
struct Door {
  std::function<uintptr_t(LXLocale*)> call;
  uintptr_t expected;
  uintptr_t without_library;
};
std::vector<Door> doors(char* text, LXShiftState* state) {
  const uintptr_t at = value(text);
  return {
      {[=](LXLocale* l) { return value(LXGetChar(l, text)); }, 'A', 0},
      {[=](LXLocale* l) { return value(LXGetCharEx(l, text, 0)); }, 'A', 0},
      {[=](LXLocale* l) { return value(LXNextChar(l, text)); }, at + 1, at},
      {[=](LXLocale* l) { return value(LXNextCharEx(l, text, 0, state, 0)); }, at + 1, at},
      {[=](LXLocale* l) { return value(LXPrevChar(l, text, text + 2)); }, at + 1, at + 2},
      {[=](LXLocale* l) { return value(LXPrevCharEx(l, text, text + 2, 0, state)); }, at + 1, at + 2},
      {[=](LXLocale* l) { return value(LXNumChars(l, text, 2)); }, 2, 0},
      {[=](LXLocale* l) { return value(LXNumCharsEx(l, text, 0, 2)); }, 2, 0},
      {[=](LXLocale* l) { return value(LXMoveStringPointer(l, text, 2, 0)); }, at + 2, at},
      {[=](LXLocale* l) { return value(LXMoveStringPointerEx(l, text, 0, 2, state, 0)); }, at + 2, at},
      {[=](LXLocale* l) { return value(LXValidChar(l, text)); }, 1, 0},
      {[=](LXLocale* l) { return value(LXValidCharEx(l, text, 0)); }, 1, 0},
      {[=](LXLocale* l) { return value(LXByteLength(l, text)); }, 1, 0},
      {[=](LXLocale* l) { return value(LXByteLengthW(l, 'A')); }, 1, 0},
      {[=](LXLocale* l) { return value(LXByteLengthEx(l, text, 0)); }, 1, 0},
      {[=](LXLocale* l) { return value(LXGetCharType(l, text, LX_CTYPE1)); }, 0x213, 0},
      {[=](LXLocale* l) { return value(LXGetCharTypeW(l, 'A', LX_CTYPE1)); }, 0x213, 0},
      {[=](LXLocale* l) { return value(LXGetCharTypeU(l, 'A', LX_CTYPE1)); }, 0x213, 0},
      {[=](LXLocale* l) { return value(LXGetCharTypeEx(l, text, 0, LX_CTYPE1)); }, 0x213, 0},
      {[=](LXLocale* l) { return value(LXPutChar(l, text, 'A')); }, 0, 0},
      {[=](LXLocale* l) { return LXPutCharEx(l, text, 0, 'A'), uintptr_t{0}; }, 0, 0},
      {[=](LXLocale* l) { return LXInitState(l, state), *state; }, 0, 0},
  };
}

TEST_F(Navigation, EveryDoorClearsTheErrorAndKnowsTheDefaultLocale) {
  char text[] = "AB";
  LXShiftState state = kUntouched;
  ASSERT_EQ(LXSetLocale("English_UnitedStates.TINY-SJIS", 0), 0);
  const auto all = doors(text, &state);
  for (LXLocale* locale : {library_.locale(lx::test::tiny_shift_jis()), static_cast<LXLocale*>(nullptr)}) {
    for (const Door& door : all) {
      SCOPED_TRACE(&door - all.data());
      LXGetCharTypeU(locale, 'A', kNoSelector);
      EXPECT_EQ(LXGetError(locale), LX_E_INVALID);
      EXPECT_EQ(door.call(locale), door.expected);
      EXPECT_EQ(LXGetError(locale), LX_OK);
    }
  }
  EXPECT_TRUE(library_.close());
  strcpy(text, "xB");
  state = LX_SHIFT_SINGLE;
  for (const Door& door : all) EXPECT_EQ(door.call(nullptr), door.without_library) << &door - all.data();
  EXPECT_STREQ(text, "xB") << "nothing is touched without the library";
}

TEST_F(Navigation, SpecialMappingsMatchExactlyInTheTableOfTheSelector) {
  using namespace lx::format::language;
  std::vector<uint8_t> payload(kHeaderBytes);
  const auto add = [&](size_t count_word, size_t table_word, const std::vector<uint16_t>& words) {
    lx::put_le16(payload.data() + 2 * count_word, static_cast<uint16_t>(words.size() / 4));
    lx::put_le16(payload.data() + 2 * table_word, static_cast<uint16_t>(payload.size()));
    for (uint16_t word : words) {
      payload.resize(payload.size() + 2);
      lx::put_le16(payload.data() + payload.size() - 2, word);
    }
  };
  add(kUpperSpecials, kUpperSpecialTable,
      {0xDF, 0, 'S', 'S', 'i', 0, 0x130, 0, 'i', 'j', 0x132, 0, 'i', 0, 'X', 0});
  add(kLowerSpecials, kLowerSpecialTable, {'I', 0, 0x131, 0});
  LXObject language{};
  language.section[0] = payload.data();
  struct Row {
    uint16_t first, second;
    int32_t selector, result;
    uint16_t result1, result2;
  };
  const Row rows[] = {
      {0xDF, 0, 44, 2, 'S', 'S'}, {'i', 0, 44, 1, 0x130, 0}, {'i', 'j', 44, 1, 0x132, 0},
      {'i', 'k', 44, 0, 7, 8},    {'I', 0, 44, 0, 7, 8},     {'I', 0, 45, 1, 0x131, 0},
      {0xDF, 0, 45, 0, 7, 8},
  };
  for (const Row& row : rows) {
    LXUChar result1 = 7, result2 = 8;
    EXPECT_EQ(LXLangGetSpecial(&language, row.first, row.second, &result1, &result2, row.selector), row.result);
    EXPECT_EQ(result1, row.result1);
    EXPECT_EQ(result2, row.result2);
  }
}

}  // namespace
