// Line ends in strings: the four forms against one model, and the order in which they are stored.
#include <gtest/gtest.h>

#include "stream/stream_texts.h"

namespace {

using namespace lx::test;

class LineEnds : public testing::Test {
 protected:
  void TearDown() override { EXPECT_TRUE(library_.close()); }

  /// One text, in a block of its exact size, by its length and, without a null in it, null-terminated.
  template <class Form>
  void check(const TinyCodepage& cp, const Text& text, uint32_t kinds) {
    LXLocale* locale = library_.locale(cp);
    const FoundEol model = find_eol(cp, text, 0, kinds != 0 ? kinds : LX_EOL_LF);
    auto before = Form::encode(cp, Text(text.begin(), text.begin() + static_cast<long>(model.past)));
    auto units = Form::encode(cp, text);
    const bool has_null = std::find(units.begin(), units.end(), 0) != units.end();
    for (bool null_terminated : {false, true}) {
      if (null_terminated && has_null) continue;
      if (null_terminated) units.push_back(0);
      units.shrink_to_fit();
      uint32_t kind = 1;
      int32_t eol_length = -1;
      const int32_t length = null_terminated ? -1 : static_cast<int32_t>(units.size());
      const auto* end = Form::get_eol(locale, units.data(), length, &kind, &eol_length, kinds);
      EXPECT_EQ(LXGetError(locale), LX_OK);
      EXPECT_EQ(kind, model.kind);
      EXPECT_EQ(eol_length, model.length);
      EXPECT_EQ(end, model.kind == LX_EOL_NONE ? nullptr : units.data() + before.size());
    }
  }

  const std::vector<TinyCodepage> codepages_ = line_codepages();
  TinyLibrary library_{codepages_};
  std::mt19937 random_{30};
};

TEST_F(LineEnds, FoundAlikeInAllForms) {
  for (const TinyCodepage& cp : codepages_) {
    SCOPED_TRACE(cp.file.name);
    for (int round = 0; round < 300; ++round) {
      const Text text = random_text(cp, random_, 9);
      const uint32_t kinds = (random_() % 16) << 8;
      SCOPED_TRACE(kinds);
      in_all_forms([&](auto form) {
        if (!cp.shift || !std::is_same_v<decltype(form), Plain>) check<decltype(form)>(cp, text, kinds);
      });
    }
  }
}

TEST_F(LineEnds, EdgesOfTheRange) {
  LXLocale* jis = library_.locale(codepages_[1]);
  struct Row {
    std::string text;
    int32_t length;
    uint32_t flags;
    int32_t past;  // -1: null
    uint32_t kind;
    int32_t eol_length, code;
  };
  const Row rows[] = {
      {"a\nb", 3, LX_EOL_CRLF, -1, LX_EOL_NONE, 0, LX_OK},
      {"a\nb", 3, 0x300, 2, LX_EOL_LF, 1, LX_OK},
      {"a\r\n", 2, 0x300, -1, LX_EOL_NONE, 0, LX_OK},  // the line feed is behind the range
      {"a\r\n", 3, 0x300, 3, LX_EOL_CRLF, 2, LX_OK},
      {"a\r\n", 3, 0, 3, LX_EOL_LF, 1, LX_OK},
      {std::string("\0\n", 2), 2, 0, 2, LX_EOL_LF, 1, LX_OK},
      {"\x82\n\n", 3, 0, 3, LX_EOL_LF, 1, LX_OK},  // the first one is half of a character
      {"\x82\xA0\n\n", 2, LX_CHARACTERS, 3, LX_EOL_LF, 1, LX_OK},
      {"\x82\xA0\n\n", 1, LX_CHARACTERS, -1, LX_EOL_NONE, 0, LX_OK},
      {"a\n", 2, 0x1100, -1, LX_EOL_INVALID, 0, LX_E_INVALID},
      {"a\n", 2, LX_DROP_RETURNS, -1, LX_EOL_INVALID, 0, LX_E_INVALID},
      {"", 0, 0, -1, LX_EOL_NONE, 0, LX_OK},
  };
  for (const Row& row : rows) {
    SCOPED_TRACE(&row - rows);
    const std::vector<char> text(row.text.begin(), row.text.end());
    uint32_t kind = 0;
    int32_t eol_length = -1;
    const char* end = LXGetEol(jis, text.data(), row.length, &kind, &eol_length, row.flags);
    EXPECT_EQ(end == nullptr ? -1 : end - text.data(), row.past);
    EXPECT_EQ(kind, row.kind);
    EXPECT_EQ(eol_length, row.eol_length);
    EXPECT_EQ(LXGetError(jis), row.code);
  }
}

/// The order is fixed and line feeds add up; two together are no line end that anybody wants, and stay.
TEST_F(LineEnds, Stored) {
  struct Row {
    uint32_t flags;
    std::string order;  // indexes of the line-end bytes
  };
  const Row rows[] = {{0, "0"},          {0x1000, "0"},   {0x100, "0"},        {0x200, "10"},  {0x400, "2"},
                      {0x800, "3"},      {0x1200, "10"},  {0x1100, "00"},      {0x300, "010"}, {0xC00, "32"},
                      {0x1F00, "32010"}, {0x4000, "bad"}, {0x80000200u, "bad"}};
  for (const TinyCodepage& cp : codepages_) {
    SCOPED_TRACE(cp.file.name);
    LXLocale* locale = library_.locale(cp);
    for (const Row& row : rows) {
      SCOPED_TRACE(row.flags);
      const bool bad = row.order == "bad";
      Text text;
      for (size_t i = 0; !bad && i < row.order.size(); ++i)
        for (const TinyCharacter& c : cp.characters)
          if (c.code == line_ends(cp)[row.order[i] - '0']) text.push_back(c);
      in_all_forms([&](auto form) {
        const auto expected = form.encode(cp, text);
        std::vector<typename decltype(form)::Unit> out(expected.size());
        EXPECT_EQ(form.put_eol(locale, out.data(), row.flags), bad ? nullptr : out.data() + out.size());
        EXPECT_EQ(out, expected);
        EXPECT_EQ(LXGetError(locale), bad ? LX_E_INVALID : LX_OK);
      });
    }
  }
}

}  // namespace
