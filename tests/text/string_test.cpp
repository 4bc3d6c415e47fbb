// The string family in all forms against models that work on characters: random texts, every cut of a length
// and every size of a buffer, in blocks of their exact sizes.
#include "platform/recording_ras1.h"
#include "support/case_test.h"
#include "support/slowness.h"

namespace lx::test {
namespace {

int32_t n32(size_t n) {
  return static_cast<int32_t>(n);
}

class Strings : public CaseTest {
 protected:
  static Units alphabet(const TinyCodepage& cp) {
    Units found;
    for (const LXUChar u :
         Units{'a', 'b', 'A', 0x3041, 0x3042, 0x4E02, 0x4E03, 0x100, 0x101, 0x10A, 0xE0, 0xE9})
      if (cp.find(u) != nullptr && found.size() < 6) found.push_back(u);
    return found;
  }

  /// Calls `check(form, codepage, locale)` many times for every form of every codepage that it has.
  template <class Check>
  void for_all(const Check& check) {
    for (const TinyCodepage& cp : case_codepages())
      for (int n = 0; n < 60 && !HasFailure(); ++n)
        forms_of(cp, [&](const auto& form) { check(form, cp, library.locale(cp)); });
  }
};

TEST_F(Strings, SearchesAndCopiesFollowTheModel) {
  for_all([&](const auto& kind, const TinyCodepage& cp, LXLocale* in) {
    using K = std::decay_t<decltype(kind)>;
    using Unit = typename K::Unit;
    const Units letters = alphabet(cp), text = any_text(letters, 8), set = any_text(letters, 3);
    const Units part = random() % 2 != 0 ? text.substr(random() % (text.size() + 1), 3) : any_text(letters, 2);
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
      for (const LXUChar u : letters) {
        const LXWChar code = Encoded<K>(cp, {u}).codes[0];
        ASSERT_EQ(K::chr(in, block.data(), n32(cut), static_cast<typename K::Char>(code), 0),
                  place(seen.find(u)));
        ASSERT_TRUE(!cp.shift || seen.find(u) == Units::npos || states.result == (code > 0xFF) ||
                    sizeof(Unit) > 1);
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

/// Long texts of which nearly all agrees with the part, with memory for the search and without.
TEST_F(Strings, PartsOfLongTextsAreFound) {
  for_all([&](const auto& kind, const TinyCodepage& cp, LXLocale* in) {
    using K = std::decay_t<decltype(kind)>;
    if (random() % kSlowness != 0) return;
    const Units letters = alphabet(cp).substr(0, 2);
    Units text = any_text(letters, 20) + letters[0], part;
    while (text.size() < 2000) text += text.substr(random() % text.size() / 2);
    part = text.substr(random() % text.size(), random() % 80) + any_text(letters, 1);
    const Encoded<K> whole(cp, text), wanted(cp, part);
    const size_t at = text.find(part);
    library.hooks().fail_at(random() % 2);
    ASSERT_EQ(K::str(in, whole.units.data(), whole.size(), wanted.units.data(), wanted.size(), 0),
              part.empty()        ? whole.units.data()
              : at == Units::npos ? nullptr
                                  : whole.units.data() + whole.start[at]);
    library.hooks().fail_at(0);
    // Without regard to case: with a trace, that shows each of them, all candidates are compared.
    for (Units* const in_cases : {&text, &part})
      for (LXUChar& u : *in_cases)
        if (u == 'a' && random() % 3 == 0) u = 'A';
    const Encoded<K> cases(cp, text), cases_wanted(cp, part);
    const auto find = [&](uint32_t level) {
      RecordingTrace::set_level(level);
      return K::str(in, cases.units.data(), cases.size(), cases_wanted.units.data(), cases_wanted.size(),
                    LX_CASE_INSENSITIVE);
    };
    const auto found = find(RAS1_LEVEL_PROCESS);
    ASSERT_EQ(find(0), found);
  });
}

TEST_F(Strings, ConcatenationKeepsTextsWhole) {
  for_all([&](const auto& kind, const TinyCodepage& cp, LXLocale* in) {
    using K = std::decay_t<decltype(kind)>;
    using Unit = typename K::Unit;
    if (random() % kSlowness != 0) return;
    const Units letters = alphabet(cp), head = any_text(letters, 4), tail = any_text(letters, 5);
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
  for_all([&](const auto& kind, const TinyCodepage& cp, LXLocale* in) {
    using K = std::decay_t<decltype(kind)>;
    // Beside short texts some that are not read to their end at once, with tokens as long as the parts.
    const bool in_parts = random() % 8 == 0;
    const Units letters = alphabet(cp), set = letters.substr(random() % letters.size(), 2),
                text = Units(in_parts ? random() % 140 : 0, letters[0]) + any_text(letters, in_parts ? 200 : 9);
    const Encoded<K> whole(cp, text);
    const auto delimiters = Encoded<K>(cp, set).terminated();
    for (int32_t cut = -2; cut <= (in_parts ? -2 : whole.size()); ++cut) {
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
      const auto tokens = cut == -2
                              ? tokens_of(kind, cp, in, block, n32(text.size()), delimiters, -1, LX_CHARACTERS)
                              : tokens_of(kind, cp, in, block, cut, delimiters, -1, 0);
      ASSERT_EQ(tokens, expected) << testing::PrintToString(whole.units) << " set "
                                  << testing::PrintToString(delimiters) << " length " << cut;
    }
  });
}

/// Two texts joined, a Shift-In and a Shift-Out side by side: what is left is counted as it is taken.
TEST_F(Strings, TokensOfJoinedTexts) {
  LXLocale* const shift = library.locale(case_codepage("SHIFT"));
  std::string joined = "\x81\x82\x0E\x44\x47\x0F\x0E\x44\x48\x0F\x0E\x44\x49";
  int32_t chars = 5, tokens = 0;
  LXShiftState state = 0;
  for (char *rest = joined.data(), *at = nullptr; rest != nullptr && tokens < 9; rest = at, ++tokens) {
    LXStrtokEx(shift, rest, &state, &chars, "\x82", 0, 1, &at, nullptr, LX_CHARACTERS);
    if (at == nullptr) continue;
    ASSERT_LE(LXCpStrCharToByteLen(shift->codepage, at, state, chars), joined.data() + joined.size() - at);
  }
  EXPECT_EQ(tokens, 2);
  char* next = joined.data();
  EXPECT_EQ(LXStrtok(shift, nullptr, &chars, ",", 1, &next, 0), nullptr);
  EXPECT_EQ(chars, 0);
  EXPECT_EQ(next, nullptr);
}

}  // namespace
}  // namespace lx::test
