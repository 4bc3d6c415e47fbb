// The string family in all forms against models that work on characters: random texts, every cut of a length
// and every size of a buffer, in blocks of their exact sizes.
#include <gtest/gtest.h>

#include <algorithm>
#include <random>

#include "core/lxbytes.h"
#include "core/lxformat.h"
#include "core/lxrecords.h"
#include "platform/ras1.h"
#include "platform/recording_ras1.h"
#include "support/tiny_codepages.h"

namespace {

using lx::test::RecordingTrace;
using lx::test::TinyCodepage;
using lx::test::TinyLibrary;
using Units = std::u16string;

int32_t n32(size_t n) {
  return static_cast<int32_t>(n);
}

// The doors of the four forms under one name each.

template <class U, auto kCat, auto kChr, auto kCpy, auto kCspn, auto kSpn, auto kStr, auto kTok>
struct Doors {
  using Unit = U;
  static constexpr auto cat = kCat;
  static constexpr auto chr = kChr;
  static constexpr auto cpy = kCpy;
  static constexpr auto cspn = kCspn;
  static constexpr auto spn = kSpn;
  static constexpr auto str = kStr;
  static constexpr auto tok = kTok;
};
using Plain = Doors<char, LXStrcat, LXStrchr, LXStrcpy, LXStrcspn, LXStrspn, LXStrstr, LXStrtok>;
using Wide = Doors<LXWChar, LXWcscat, LXWcschr, LXWcscpy, LXWcscspn, LXWcsspn, LXWcsstr, LXWcstok>;
using Unicode = Doors<LXUChar, LXStrcatU, LXStrchrU, LXStrcpyU, LXStrcspnU, LXStrspnU, LXStrstrU, LXStrtokU>;
struct Ex {
  using Unit = char;
  static LXShiftState state, token_state;  // of what was returned
  static int32_t cat(LXLocale* in, char* b, int32_t size, const char* t, int32_t n, uint32_t flags) {
    return LXStrcatEx(in, b, 0, size, t, 0, n, flags);
  }
  static char* chr(LXLocale* in, const char* t, int32_t n, LXWChar c, uint32_t flags) {
    return LXStrchrEx(in, t, 0, n, c, &state, flags);
  }
  static int32_t cpy(LXLocale* in, char* b, int32_t size, const char* t, int32_t n, uint32_t flags) {
    return LXStrcpyEx(in, b, size, t, 0, n, &state, flags);
  }
  static char* tok(LXLocale* in, char* t, int32_t* n, const char* s, int32_t m, char** next, uint32_t flags) {
    return LXStrtokEx(in, t, &state, n, s, 0, m, next, &token_state, flags);
  }
  template <class Result, auto kDoor>
  static Result search(LXLocale* in, const char* t, int32_t n, const char* s, int32_t m, uint32_t flags) {
    return kDoor(in, t, 0, n, s, 0, m, &state, flags);
  }
  static constexpr auto cspn = search<int32_t, LXStrcspnEx>;
  static constexpr auto spn = search<int32_t, LXStrspnEx>;
  static constexpr auto str = search<char*, LXStrstrEx>;
};
LXShiftState Ex::state, Ex::token_state;

/// A text in a form, and where its characters stand.
template <class K>
struct Encoded {
  using Unit = typename K::Unit;
  std::vector<Unit> units;  // without a null
  std::vector<size_t> start, end;
  std::vector<LXWChar> codes;
  std::vector<size_t> shifts;  // places of Shift-In and Shift-Out bytes
  Unit shift_in;

  Encoded(const TinyCodepage& cp, const Units& text) : shift_in(static_cast<Unit>(cp.shift_in)) {
    LXShiftState state = 0;
    for (const char16_t u : text) {
      const lx::test::TinyCharacter& c = *cp.find(u);
      const std::string bytes = cp.encode({u}, &state);
      codes.push_back(std::is_same_v<Unit, LXUChar> ? u : c.code);
      if (sizeof(Unit) == 1 && bytes.size() > c.bytes.size()) add_shift(static_cast<Unit>(bytes[0]));
      start.push_back(units.size());
      if (sizeof(Unit) == 1)
        units.insert(units.end(), c.bytes.begin(), c.bytes.end());
      else
        units.push_back(static_cast<Unit>(codes.back()));
      end.push_back(units.size());
    }
    if (sizeof(Unit) == 1 && state == LX_SHIFT_DOUBLE) add_shift(shift_in);
  }
  void add_shift(Unit byte) {
    shifts.push_back(units.size());
    units.push_back(byte);
  }
  size_t count() const { return end.size(); }
  int32_t size() const { return n32(units.size()); }
  size_t whole(size_t cut) const {
    return static_cast<size_t>(std::count_if(end.begin(), end.end(), [&](size_t e) { return e <= cut; }));
  }
  /// Behind `chars` characters of the first `cut` units, with a Shift-In and with any shift byte at the end.
  size_t behind(size_t chars, size_t cut, size_t text_end) const {
    const size_t at = chars == 0 ? 0 : end[chars - 1];
    const bool shift = at < cut && std::count(shifts.begin(), shifts.end(), at) != 0;
    return at + (shift && ((chars != 0 && units[at] == shift_in) || at + 1 == text_end));
  }
  /// In a block of its exact size, or with a null.
  std::vector<Unit> cut(size_t n) const { return {units.begin(), units.begin() + static_cast<ptrdiff_t>(n)}; }
  std::vector<Unit> terminated() const {
    std::vector<Unit> all(units);
    all.push_back(0);
    return all;
  }
};

/// Gives a single-byte character of a loaded codepage a full-width form.
void set_full_width(LXLocale* in, uint32_t byte, uint32_t code) {
  uint8_t* const payload = in->codepage->section[0];
  lx::put_le32(payload + lx::le16(payload + lx::format::codepage::kFullWidth) + 4 * byte, code);
}

class Strings : public testing::Test {
 protected:
  void TearDown() override { EXPECT_TRUE(library_.close()); }

  static Units alphabet(const TinyCodepage& cp) {
    Units found;
    for (const char16_t u : Units(u"abA\x3041\x3042\x4E02\x4E03\x100\x101\x10A\x3A9\xE0\xE9"))
      if (cp.find(u) != nullptr && found.size() < 6) found.push_back(u);
    return found;
  }
  Units random(const Units& letters, size_t most) {
    Units text(random_() % (most + 1), 0);
    for (char16_t& u : text) u = letters[random_() % letters.size()];
    return text;
  }

  /// Calls `check(kind, codepage, locale)` for every form of every codepage that it has.
  template <class Check>
  void for_all(const Check& check) {
    for (const TinyCodepage& cp : lx::test::tiny_codepages()) {
      LXLocale* const in = library_.locale(cp);
      for (int n = 0; n < 60 && !HasFailure(); ++n) {
        SCOPED_TRACE(cp.file.name);
        if (!cp.shift) check(Plain(), cp, in);
        check(Ex(), cp, in);
        check(Wide(), cp, in);
        check(Unicode(), cp, in);
      }
    }
  }

  TinyLibrary library_;
  std::mt19937 random_{1};
};

TEST_F(Strings, SearchesAndCopiesFollowTheModel) {
  for_all([&](auto kind, const TinyCodepage& cp, LXLocale* in) {
    using K = decltype(kind);
    using Unit = typename K::Unit;
    using Value = std::conditional_t<std::is_same_v<K, Unicode>, LXUChar, LXWChar>;
    const Units letters = alphabet(cp), text = random(letters, 8), set = random(letters, 3);
    const Units part = random_() % 2 != 0 ? text.substr(random_() % (text.size() + 1), 3) : random(letters, 2);
    const Encoded<K> whole(cp, text);
    const auto all = whole.terminated(), in_set = Encoded<K>(cp, set).terminated();
    const auto in_part = Encoded<K>(cp, part).units;
    SCOPED_TRACE(testing::PrintToString(all) + " set " + testing::PrintToString(in_set) + " part " +
                 testing::PrintToString(in_part));
    const auto first = [](const Units& seen, size_t at) { return std::min(at, seen.size()); };
    for (size_t cut = 0; cut <= whole.units.size(); ++cut) {
      const auto block = whole.cut(cut);
      const Units seen = text.substr(0, whole.whole(cut));
      const auto span = [&](size_t chars) { return n32(whole.behind(first(seen, chars), cut, cut)); };
      const auto place = [&](size_t at) {
        return at == Units::npos ? nullptr : block.data() + whole.start[at];
      };
      ASSERT_EQ(K::cspn(in, block.data(), n32(cut), in_set.data(), -1, 0), span(seen.find_first_of(set)));
      ASSERT_EQ(K::spn(in, block.data(), n32(cut), in_set.data(), -1, 0), span(seen.find_first_not_of(set)));
      for (const char16_t u : letters) {
        const LXWChar code = Encoded<K>(cp, {u}).codes[0];
        ASSERT_EQ(K::chr(in, block.data(), n32(cut), static_cast<Value>(code), 0), place(seen.find(u)));
        ASSERT_TRUE(!cp.shift || seen.find(u) == Units::npos || Ex::state == (code > 0xFF) || sizeof(Unit) > 1);
      }
      ASSERT_EQ(K::str(in, block.data(), n32(cut), in_part.data(), n32(in_part.size()), 0),
                part.empty() ? block.data() : place(seen.find(part)));
      // Copies into every size; the block ends where the size does.
      for (size_t size = 0; size <= cut + 1; ++size) {
        std::vector<Unit> out(size);
        const size_t fit = std::min(size, cut), taken = fit == 0 ? 0 : whole.behind(whole.whole(fit), fit, cut);
        ASSERT_EQ(K::cpy(in, out.data(), n32(size), block.data(), n32(cut), 0), n32(taken)) << size;
        ASSERT_TRUE(std::equal(block.begin(), block.begin() + n32(taken), out.begin()));
      }
    }
    // Null-terminated, and in characters.
    const int32_t chars = n32(text.size()), none = n32(first(text, text.find_first_of(set)));
    for (const int32_t length : {-1, chars})
      EXPECT_EQ(K::cspn(in, all.data(), length, in_set.data(), n32(set.size()), LX_CHARACTERS), none);
    EXPECT_EQ(K::chr(in, all.data(), -1, 0, 0), all.data() + whole.size());
    EXPECT_EQ(K::chr(in, all.data(), whole.size(), 0, 0), nullptr);
    std::vector<Unit> out(all.size() + 1, 'x');
    EXPECT_EQ(K::cpy(in, out.data(), n32(out.size()), all.data(), -1, 0), n32(all.size()));
    EXPECT_TRUE(std::equal(all.begin(), all.end(), out.begin()));
    EXPECT_EQ(K::cpy(in, out.data(), chars + 1, all.data(), -1, LX_CHARACTERS), chars + 1);
  });
}

TEST_F(Strings, ConcatenationKeepsTextsWhole) {
  for_all([&](auto kind, const TinyCodepage& cp, LXLocale* in) {
    using K = decltype(kind);
    using Unit = typename K::Unit;
    const Units letters = alphabet(cp), head = random(letters, 4), tail = random(letters, 5);
    const Encoded<K> first(cp, head), second(cp, tail);
    SCOPED_TRACE(testing::PrintToString(first.units) + " + " + testing::PrintToString(second.units));
    for (size_t cut = 0; cut <= second.units.size(); ++cut) {
      const auto block = second.cut(cut);
      for (int32_t size = first.size() + 1; size <= first.size() + second.size() + 2; ++size) {
        std::vector<Unit> buffer(first.terminated()), expected;
        buffer.resize(static_cast<size_t>(size), 'x');
        for (size_t k = 0; k <= second.whole(cut); ++k) {
          auto joined = Encoded<K>(cp, head + tail.substr(0, k)).terminated();
          if (n32(joined.size()) <= size) expected.swap(joined);
        }
        ASSERT_EQ(K::cat(in, buffer.data(), size, block.data(), n32(cut), 0), n32(expected.size())) << size;
        buffer.resize(expected.size());
        ASSERT_EQ(buffer, expected);
      }
    }
    std::vector<Unit> buffer = first.terminated();
    ASSERT_EQ(K::cat(in, buffer.data(), first.size(), second.units.data(), second.size(), 0), 0);
    ASSERT_EQ(K::cat(in, buffer.data(), n32(head.size()), second.units.data(), 0, LX_CHARACTERS), 0);
    ASSERT_EQ(buffer, first.terminated());
    buffer.resize(100);
    const int32_t chars = n32(head.size() + tail.size());
    const int32_t most = sizeof(Unit) == 1 ? chars + 1 : 100;
    EXPECT_EQ(K::cat(in, buffer.data(), most, second.terminated().data(), -1, LX_CHARACTERS), chars + 1);
  });
}

TEST_F(Strings, TokensComeOutWhole) {
  for_all([&](auto kind, const TinyCodepage& cp, LXLocale* in) {
    using K = decltype(kind);
    using Unit = typename K::Unit;
    const Units letters = alphabet(cp), text = random(letters, 9),
                set = letters.substr(random_() % letters.size(), 2);
    const Encoded<K> whole(cp, text);
    const auto delimiters = Encoded<K>(cp, set).terminated();
    for (int32_t cut = -2; cut <= whole.size(); ++cut) {
      // Null-terminated, in characters, and every length.
      const size_t n = cut < 0 ? whole.units.size() : static_cast<size_t>(cut);
      const size_t chars = whole.whole(n);
      auto block = cut < 0 ? whole.terminated() : whole.cut(n);
      block.reserve(1);  // null is no text
      std::vector<Units> expected;
      const bool tail = whole.behind(chars, n, n) < n;
      for (size_t at = 0; at < chars;) {
        const size_t end = std::min(text.find_first_of(set, at), chars);
        if (end != at) expected.push_back(text.substr(at, end - at));
        at = end + 1;
      }
      if (chars == 0 || (tail && set.find(text[chars - 1]) != Units::npos)) expected.push_back({});
      std::vector<Units> tokens;
      int32_t length = cut == -2 ? n32(text.size()) : cut;
      const uint32_t flags = cut == -2 ? LX_CHARACTERS : 0;
      Unit* next = nullptr;
      Ex::state = 0;
      for (Unit* at = block.data(); at != nullptr; at = next) {
        const Unit* const token = K::tok(in, at, &length, delimiters.data(), -1, &next, flags);
        ASSERT_EQ(next == nullptr, length == 0);
        if (token == nullptr) break;
        const Unit* const block_end = block.data() + block.size();
        const int32_t units = n32(static_cast<size_t>(std::find(token, block_end, Unit{0}) - token));
        LXUChar out[64];
        int32_t count = 0;
        if constexpr (std::is_same_v<K, Unicode>)
          count = LXStrcpyU(in, out, 64, token, units, 0);
        else if constexpr (std::is_same_v<K, Wide>)
          count = LXStringToUnicodeW(out, 64, in, token, units, 0);
        else
          count = LXStringToUnicodeEx(out, 64, in, token, cp.shift ? Ex::token_state : 0, units, 0);
        tokens.emplace_back(out, out + count);
      }
      ASSERT_EQ(tokens, expected) << testing::PrintToString(whole.units) << " set "
                                  << testing::PrintToString(delimiters) << " length " << cut;
    }
  });
}

TEST_F(Strings, TruncationFollowsTheModel) {
  for (const TinyCodepage& cp : lx::test::tiny_codepages()) {
    LXLocale* const in = library_.locale(cp);
    const auto code_of = [&](char16_t u) { return cp.find(u) != nullptr ? cp.find(u)->code : 0xFFFF; };
    const uint32_t blank = code_of(' '), full_blank = code_of(0x3000);
    Units letters = alphabet(cp).substr(0, 5);
    if (blank != 0xFFFF) letters += u"  ";
    if (full_blank != 0xFFFF) letters += u"\x3000\x3000", set_full_width(in, blank, full_blank);
    for (int n = 0; n < 600 && !HasFailure(); ++n) {
      const uint32_t flags[] = {0, LX_DROP_BLANKS, LX_DROP_FULL_BLANKS};
      const Encoded<Ex> text(cp, random(letters, 8));
      const auto is_blank = [&](size_t i) {
        return (n % 3 != 0 && text.codes[i] == blank) || (n % 3 == 2 && text.codes[i] == full_blank);
      };
      for (int32_t size = -1; size <= text.size() + 2; ++size) {
        const size_t room = std::min(static_cast<size_t>(std::max(size, 1) - 1), text.units.size());
        // The last place behind a character or a shift byte.
        size_t cut = 0, kept = text.whole(room);
        for (const size_t end : text.end) cut = end <= room ? std::max(cut, end) : cut;
        for (const size_t shift : text.shifts) cut = shift < room ? std::max(cut, shift + 1) : cut;
        // Kept as it is: one character at the end does not save the blanks before it, nor itself.
        const bool last = kept > 1 && text.codes[kept - 1] <= 0xFF && text.units.size() == text.end[kept - 1];
        if (cp.width > 1 && last && !is_blank(kept - 1) && is_blank(kept - 2)) --kept;
        while (kept > 0 && is_blank(kept - 1)) cut = text.start[--kept];
        for (const bool ex : {true, false}) {
          if (!ex && cp.shift) continue;
          std::vector<char> buffer = text.terminated(), expected = buffer;
          expected[cut] = 0;
          const int32_t result = ex ? LXTruncateStringEx(in, buffer.data(), 0, size, flags[n % 3])
                                    : LXTruncateString(in, buffer.data(), size, flags[n % 3]);
          ASSERT_EQ(result, n32(cut) + 1)
              << cp.file.name << testing::PrintToString(text.units) << " size " << size << " flags " << n % 3;
          ASSERT_EQ(buffer, expected);
        }
      }
      // In characters, the null one of them.
      for (int32_t size = 0; n % 3 == 0 && !cp.shift && size <= n32(text.count()) + 2; ++size) {
        std::vector<char> buffer = text.terminated();
        const int32_t left = std::max(1, std::min(size, n32(text.count()) + 1));
        ASSERT_EQ(LXTruncateString(in, buffer.data(), size, LX_CHARACTERS), left);
        ASSERT_EQ(LXNumChars(in, buffer.data(), -1), left - 1);
      }
    }
  }
}

TEST_F(Strings, KeptTruncation) {
  LXLocale* const sjis = library_.locale(lx::test::tiny_shift_jis());
  LXLocale* const shift = library_.locale(lx::test::tiny_shift());
  // The one-byte character at the end goes with the blanks before it.
  char text[] = "ab  c";
  EXPECT_EQ(LXTruncateString(sjis, text, 6, LX_DROP_BLANKS), 3);
  EXPECT_STREQ(text, "ab");
  // What fits stays, half a character too; undefined flags are ignored.
  char half[] = "a\x82";
  EXPECT_EQ(LXTruncateString(sjis, half, 9, 0x100), 3);
  EXPECT_STREQ(half, "a\x82");
  // A state is left open. The Shift-In made room for the null, which is no character in the double-byte state.
  std::string open = "\x0E\x44\x47\x44\x48\x0F";
  EXPECT_EQ(LXTruncateStringEx(shift, open.data(), 0, 2, LX_CHARACTERS), 2);
  EXPECT_STREQ(open.c_str(), "\x0E\x44\x47\x44\x48");
  // The Shift-Out behind the last character that fits makes room for it.
  std::string wide = "\x81\x82\x0E\x44\x47\x0F";
  EXPECT_EQ(LXTruncateStringEx(shift, wide.data(), 0, 2, LX_CHARACTERS), 3);
  EXPECT_STREQ(wide.c_str(), "\x81\x82");
  char out[] = "xyz";
  EXPECT_EQ(LXTerminateStringEx(shift, out, 1, LX_TERMINATE), 2);
  EXPECT_EQ(std::string(out, 4), std::string("\x0F\0z\0", 4));
  EXPECT_EQ(LXTerminateStringEx(sjis, out, 1, 0), 0);
  EXPECT_EQ(LXTerminateStringEx(shift, out, 1, 1), -1);
  EXPECT_EQ(LXGetError(shift), LX_E_INVALID);
  // No room to close the state: the string stays.
  char full[] = "\x0E\x44\x47";
  EXPECT_EQ(LXStrcatEx(shift, full, 0, 4, "\x81", 0, 1, 0), 4);
  EXPECT_STREQ(full, "\x0E\x44\x47");
}

TEST_F(Strings, TruncationMessages) {
  LXLocale* const sjis = library_.locale(lx::test::tiny_shift_jis());
  LXLocale* const shift = library_.locale(lx::test::tiny_shift());
  set_full_width(sjis, 0x20, 0x8140);
  set_full_width(shift, 0x40, 0x4040);
  const struct {
    LXLocale* in;
    std::string text;
    int32_t size;
    const char* messages;
  } cases[] = {
      {library_.locale(lx::test::tiny_single()), "ab  ", 9,
       "Single byte code page, string length = 4|Stripping blank at position 3|Stripping blank at position 2|"
       "Truncated string: ab|"},
      {sjis, "a b \x81\x40 cd", 8,
       "Blank encountered at 1|Blank position set to 1|Blank position reset|Blank encountered at 3|"
       "Blank position set to 3|Full width blank encountered at 4|Blank encountered at 6|index set to 3|"
       "Truncated string: a b|"},
      {shift, "\x81\x40\x82\x40\x0E\x40\x40\x0F", 20,
       "Blank encountered at 1|Setting blank position to 1|Resetting blank position|Blank encountered at 3|"
       "Setting blank position to 3|Full width blank encountered at 5|Setting index to 3|"
       "Truncated string: \x81\x40\x82|"},
      {shift, "\x0E\x40\x40", 4,
       "Full width blank encountered at 1|Blank position set to 1|Setting index to 1|Truncated string: \x0E|"},
  };
  for (const auto& test : cases) {
    std::string text = test.text, messages;
    RecordingTrace::take();
    RecordingTrace::set_level(RAS1_LEVEL_DETAIL | RAS1_LEVEL_INPUT);
    LXTruncateStringEx(test.in, text.data(), 0, test.size, LX_DROP_FULL_BLANKS);
    RecordingTrace::set_level(0);
    for (const auto& record : RecordingTrace::take()) messages += record.text + "|";
    EXPECT_EQ(messages, "Input length = " + std::to_string(test.size) + "|" + test.messages);
  }
}

TEST_F(Strings, SubstringsWithOptions) {
  const TinyCodepage single = lx::test::tiny_single(), sjis = lx::test::tiny_shift_jis();
  set_full_width(library_.locale(sjis), 'A', 0x8260);
  const struct {
    const TinyCodepage& cp;
    std::string text, part;
    uint32_t options;
    ptrdiff_t place;  // -1: none
  } cases[] = {
      {single, "xabAb", "Ab", 0, 3},
      {single, "xabAb", "Ab", LX_WIDTH_INSENSITIVE, 3},
      {single, "xxAb", "aB", LX_CASE_INSENSITIVE, 2},
      {single, "xabAb", "abx", LX_CASE_INSENSITIVE, -1},
      {single, "xabAb", "x", LX_IGNORE_BLANKS, -1},
      {sjis, "x\x82\x60\x62\x41\x62", "Ab", 0, 4},
      {sjis, "x\x82\x60\x62\x41\x62", "Ab", LX_WIDTH_INSENSITIVE, 1},
      {sjis, "x\x82\x60\x62\x41\x62", "aB", 0x80000001, 4},
      {sjis, "x\x82\x60\x62\x41\x62", "aBx", LX_CASE_INSENSITIVE, -1},
      {sjis, "\x82\x60", "", LX_CASE_INSENSITIVE, 0},
      {sjis, "A", "\x82\x60", LX_WIDTH_INSENSITIVE, -1},  // more bytes than the text has
      {lx::test::tiny_shift(), "\x0E\x44\x47\x0F\xC1\x82", "\x81\xC2", LX_CASE_INSENSITIVE, 4},
  };
  for (const auto& test : cases) {
    LXLocale* const in = library_.locale(test.cp);
    const char* const text = test.text.c_str();
    const char* const place = test.place < 0 ? nullptr : text + test.place;
    LXShiftState state = 0;
    EXPECT_EQ(LXStrstrEx(in, text, 0, n32(test.text.size()), test.part.c_str(), 0, -1, &state, test.options),
              place);
    EXPECT_EQ(LXGetError(in), test.options == LX_IGNORE_BLANKS ? LX_E_INVALID : LX_OK);
    if (!test.cp.shift) {
      EXPECT_EQ(LXStrstr(in, text, -1, test.part.c_str(), -1, test.options), place) << text;
    }
  }
  LXLocale* const in = library_.locale(lx::test::tiny_utf8());
  const LXUChar units[] = {'x', 0xFF21, 'b', 'a', 'B'}, part[] = {'A', 'b'};
  EXPECT_EQ(LXStrstrU(in, units, 5, part, 2, LX_CASE_INSENSITIVE), units + 3);
  EXPECT_EQ(LXStrstrU(in, units, 5, part, 2, LX_WIDTH_INSENSITIVE), units + 1);
  const LXWChar codes[] = {'x', 'a', 'B', 0}, code_part[] = {'A', 'b', 0};
  EXPECT_EQ(LXWcsstr(in, codes, -1, code_part, -1, LX_CASE_INSENSITIVE), codes + 1);
}

TEST_F(Strings, NullsAndRefusals) {
  LXLocale* const in = library_.locale(lx::test::tiny_shift_jis());
  const std::string text("a\0b\x82", 4);
  EXPECT_EQ(LXStrcspn(in, text.data(), 4, "b", 1, 0), 1);  // a null ends spans, not searches
  EXPECT_EQ(LXStrchr(in, text.data(), 4, 'b', 0), text.data() + 2);
  EXPECT_EQ(LXStrstr(in, text.data(), 4, "b\x82", -1, 0), text.data() + 2);  // the cut character is no part
  EXPECT_EQ(LXStrspn(in, "\x82\0a", 3, "\x82\0a", 3, 0), 0);
  LXLocale* const shift = library_.locale(lx::test::tiny_shift());
  EXPECT_EQ(LXStrspnEx(shift, "\x0F\x81", 0, 2, "\x82", 0, 1, nullptr, 0), 0);  // a shift byte is no span
  // Two texts joined, a Shift-In and a Shift-Out side by side: what is left is counted as it is taken.
  std::vector<char> joined{'\x81', '\x82', '\x0E', 0x44,   0x47, '\x0F', '\x0E',
                           0x44,   0x48,   '\x0F', '\x0E', 0x44, 0x49,   '\0'};
  int32_t chars = 5, tokens = 0;
  LXShiftState state = 0;
  for (char *rest = joined.data(), *at = nullptr; rest != nullptr && tokens < 9; ++tokens) {
    LXStrtokEx(shift, rest, &state, &chars, "\x82", 0, 1, &at, nullptr, LX_CHARACTERS);
    rest = at;
    const int32_t taken =
        at != nullptr ? LXCpStrCharToByteLen(library_.object(lx::test::tiny_shift()), at, state, chars) : 0;
    ASSERT_LE(taken, joined.data() + joined.size() - 1 - at);
  }
  EXPECT_EQ(tokens, 2);
  EXPECT_EQ(LXNextCharEx(shift, joined.data() + 2, 0, nullptr, 0), joined.data() + 6);
  char half[8] = "a\x82", copy[8] = "";
  EXPECT_EQ(LXStrcat(in, half, 8, "b", -1, 0), 3);  // the half character goes
  EXPECT_STREQ(half, "ab");
  const LXWChar codes[] = {1, 2, 0};
  const LXUChar units[] = {1, 2, 3, 0};
  EXPECT_EQ(LXWcslen(in, codes) + LXStrlenU(in, units), 5);
  int32_t length = 1;
  char* next = copy;
  EXPECT_EQ(LXStrtok(in, nullptr, &length, ",", 1, &next, 0), nullptr);
  EXPECT_EQ(length, 0);
  EXPECT_EQ(next, nullptr);
  for (const uint32_t flags : {0x40u, 0u}) {
    ASSERT_TRUE(flags != 0 || library_.close());
    LXLocale* const used = flags != 0 ? in : nullptr;
    length = 7;
    next = copy;
    EXPECT_EQ(LXStrcpy(used, copy, 8, "x", 1, flags), -1);
    EXPECT_EQ(LXStrcat(used, copy, 8, "x", 1, flags), -1);
    EXPECT_EQ(LXStrspn(used, "x", 1, "x", 1, flags), -1);
    EXPECT_EQ(LXStrchr(used, "x", 1, 'x', flags), nullptr);
    EXPECT_EQ(LXStrtok(used, copy, &length, "x", 1, &next, flags), nullptr);
    EXPECT_EQ(length, 7);
    EXPECT_EQ(next, flags != 0 ? nullptr : copy);
    EXPECT_STREQ(copy, "");
    ASSERT_TRUE(used == nullptr || LXGetError(used) == LX_E_INVALID);
  }
  EXPECT_EQ(LXTruncateString(nullptr, half, 1, 0), 0);
  EXPECT_STREQ(half, "ab");
}

}  // namespace
