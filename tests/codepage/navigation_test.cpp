// Walking and counting characters in every kind of text: rules on random valid text.
#include "core/lxrecords.h"
#include "support/case_test.h"
#include "support/slowness.h"

namespace lx::test {
namespace {

constexpr LXShiftState kUntouched = 77;

class Navigation : public CaseTest {
 protected:
  /// Random characters but the null; in a shift-sensitive codepage from a state on, the last shift byte only
  /// now and then.
  Encoded<Ex> random_text(const TinyCodepage& cp, size_t chars, LXShiftState state) {
    Units text(chars, 0);
    for (LXUChar& u : text)
      while (u == 0) u = any_of(cp.characters).unicode;
    Encoded<Ex> made(cp, text, state);
    if (!made.shifts.empty() && made.shifts.back() + 1 == made.units.size() && random() % 2 == 0) {
      made.units.pop_back();
      made.shifts.pop_back();
    }
    return made;
  }
  /// The last place behind a character or shift byte of the first units, and the state there.
  static std::pair<size_t, LXShiftState> last_in(const Encoded<Ex>& text, size_t units, LXShiftState state) {
    size_t at = 0;
    for (const size_t end : text.end) at = end <= units ? std::max(at, end) : at;
    for (const size_t shift : text.shifts) {
      if (shift >= units) break;
      at = std::max(at, shift + 1);
      state = text.units[shift] == text.shift_in ? LX_SHIFT_SINGLE : LX_SHIFT_DOUBLE;
    }
    return {at, state};
  }

  /// Whole characters of every beginning of a text, and their end.
  void counts(const TinyCodepage& cp, const Encoded<Ex>& text, LXShiftState initial) {
    LXLocale* const in = library.locale(cp);
    for (size_t n = 0; n <= text.units.size() + 1; ++n) {
      const bool null = n > text.units.size();
      const int32_t bytes = null ? -1 : static_cast<int32_t>(n);
      const std::vector<char> cut =
          null ? text.terminated() : text.cut(n);  // nothing behind the end may be read
      const auto chars = static_cast<int32_t>(text.whole(n));
      EXPECT_EQ(LXNumCharsEx(in, cut.data(), initial, bytes), chars);
      EXPECT_EQ(LXCpStrByteToCharLen(in->codepage, cut.data(), initial, bytes), chars);
      EXPECT_EQ(cp.shift ? chars : LXNumChars(in, cut.data(), bytes), chars);
      if (null) continue;
      const auto [last, state_there] = last_in(text, n, initial);
      LXShiftState state = kUntouched;
      EXPECT_EQ(LXMoveStringPointerEx(in, cut.data(), initial, bytes, &state, 0), cut.data() + last);
      EXPECT_EQ(state, n == 0 && cp.shift ? kUntouched : state_there);
      EXPECT_EQ(cp.shift ? cut.data() + last : LXMoveStringPointer(in, cut.data(), bytes, 0),
                cut.data() + last);
    }
  }
};

TEST_F(Navigation, EveryCharacterForwardsAndBackwards) {
  for (const TinyCodepage& cp : case_codepages()) {
    SCOPED_TRACE(cp.file.name);
    LXLocale* const in = library.locale(cp);
    for (int round = 0; round < (cp.shift ? 400 : 60) / kSlowness; ++round) {
      const LXShiftState initial = random() % 2;
      const Encoded<Ex> text = random_text(cp, random() % 12, initial);
      const std::vector<char> bytes = text.terminated();
      const char *const start = bytes.data(), *p = start;
      LXShiftState state = initial;
      for (size_t i = 0; i < text.count(); ++i) {
        const char* const character = start + text.start[i];
        const auto width = static_cast<int32_t>(text.end[i] - text.start[i]),
                   count = static_cast<int32_t>(i + 1);
        const bool shift_behind = std::count(text.shifts.begin(), text.shifts.end(), text.end[i]) != 0;
        const char* const behind = start + text.end[i] + shift_behind;
        const LXShiftState own = cp.shift ? static_cast<LXShiftState>(width - 1) : initial;
        const LXShiftState state_behind = shift_behind ? 1 - own : own;
        EXPECT_EQ(LXGetCharEx(in, p, state), text.codes[i]);
        EXPECT_EQ(LXByteLengthEx(in, p, state), width);
        EXPECT_EQ(cp.shift ? LXMbToWS(in->codepage, character, own) : LXMbToW(in->codepage, character),
                  text.codes[i]);
        LXShiftState next_state = kUntouched, previous_state = kUntouched;
        EXPECT_EQ(LXNextCharEx(in, p, state, &next_state, 0), behind);
        EXPECT_EQ(next_state, state_behind);
        EXPECT_EQ(LXPrevCharEx(in, start, behind, next_state, &previous_state), character);
        EXPECT_EQ(previous_state, own);
        EXPECT_EQ(LXCpStrCharToByteLen(in->codepage, start, initial, count), behind - start);
        EXPECT_EQ(LXMoveStringPointerEx(in, start, initial, count, &state, LX_CHARACTERS), behind);
        EXPECT_EQ(state, state_behind);
        p = behind;
        if (cp.shift) continue;
        EXPECT_EQ(LXNextChar(in, character), behind);
        EXPECT_EQ(LXPrevChar(in, start, behind), character);
        EXPECT_EQ(LXGetChar(in, character), text.codes[i]);
        EXPECT_EQ(LXByteLength(in, character), width);
        EXPECT_EQ(LXByteLengthW(in, text.codes[i]), width);
        EXPECT_EQ(LXValidChar(in, character), width);
        EXPECT_EQ(LXValidCharEx(in, character, own), width);
        EXPECT_EQ(LXMoveStringPointer(in, start, count, LX_CHARACTERS), behind);
      }
      counts(cp, text, initial);
    }
  }
}

TEST_F(Navigation, LongTextsAreWalkedByTheLengthsOfTheirBytes) {
  for (const TinyCodepage& cp : case_codepages()) {
    SCOPED_TRACE(cp.file.name);
    LXLocale* const in = library.locale(cp);
    for (int round = 0; round < 400 / kSlowness && !cp.shift; ++round) {
      auto bytes = random_text(cp, random() % 300, LX_SHIFT_SINGLE).units;
      for (size_t faults = bytes.empty() ? 0 : random() % 4; faults > 0; --faults)
        bytes[random() % bytes.size()] = static_cast<uint8_t>(random());
      const std::vector<char> text(bytes.begin(), bytes.end());
      int32_t at = 0, chars = 0;
      for (const auto size = static_cast<int32_t>(text.size()); at < size; ++chars) {
        const int32_t length = LXByteLength(in, &text[static_cast<size_t>(at)]);
        if (length > size - at) break;
        at += length;
      }
      ASSERT_EQ(LXNumChars(in, text.data(), static_cast<int32_t>(text.size())), chars);
      ASSERT_EQ(LXMoveStringPointer(in, text.data(), chars, LX_CHARACTERS), text.data() + at);
    }
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
