// Line ends in strings: the four forms against one model, and the order in which they are stored.
#include <gtest/gtest.h>

#include "stream/stream_texts.h"

namespace {

using namespace lx::test;

class LineEnds : public testing::Test {
 protected:
  void TearDown() override { EXPECT_TRUE(library_.close()); }

  /// Looks for line ends in the text, in a block of its exact size and with `behind` after it: by its length in
  /// units and in characters and, without a null in it and nothing behind, null-terminated.
  template <class Form>
  void check(const TinyCodepage& cp, const Text& text, const Text& behind, uint32_t kinds) {
    if (cp.shift && std::is_same_v<Form, Plain>) return;
    LXLocale* locale = library_.locale(cp);
    const FoundEol model = find_eol(cp, text, 0, kinds != 0 ? kinds : LX_EOL_LF);
    const auto before = Form::encode(cp, Text(text.begin(), text.begin() + static_cast<long>(model.past)));
    auto units = Form::encode(cp, text);
    const auto in_units = static_cast<int32_t>(units.size()), in_chars = static_cast<int32_t>(text.size());
    const bool terminated = behind.empty() && std::count(units.begin(), units.end(), 0) == 0;
    const auto rest = Form::encode(cp, behind);
    units.insert(units.end(), rest.begin(), rest.end());
    // A count of characters looks at the byte behind the last one.
    if (terminated || rest.empty()) units.push_back(terminated ? 0 : 0x41);
    units.shrink_to_fit();
    const std::pair<int32_t, uint32_t> lengths[] = {{in_units, 0}, {in_chars, LX_CHARACTERS}, {-1, 0}};
    for (const auto& [length, flag] : lengths) {
      if (length < 0 && !terminated) continue;
      SCOPED_TRACE(length);
      uint32_t kind = 1;
      int32_t eol_length = -1;
      const auto* end = Form::get_eol(locale, units.data(), length, &kind, &eol_length, kinds | flag);
      EXPECT_EQ(LXGetError(locale), LX_OK);
      EXPECT_EQ(kind, model.kind);
      EXPECT_EQ(eol_length, model.length);
      EXPECT_EQ(end, model.kind == LX_EOL_NONE ? nullptr : units.data() + before.size());
    }
    for (uint32_t unknown : {0x1000u, uint32_t{LX_DROP_RETURNS}}) {
      uint32_t kind = 0;
      int32_t eol_length = -1;
      EXPECT_EQ(Form::get_eol(locale, units.data(), in_units, &kind, &eol_length, kinds | unknown), nullptr);
      EXPECT_EQ(LXGetError(locale), LX_E_INVALID);
      EXPECT_EQ(kind, uint32_t{LX_EOL_INVALID});
      EXPECT_EQ(eol_length, 0);
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
      const Text text = random_text(cp, random_, 9), behind = random_text(cp, random_, 1 + round % 3);
      const uint32_t kinds = (random_() % 16) << 8;
      SCOPED_TRACE(kinds);
      in_all_forms([&](auto form) { check<decltype(form)>(cp, text, behind, kinds); });
    }
  }
}

/// The order is fixed and line feeds add up; two together are no line end that anybody wants, and stay.
TEST_F(LineEnds, Stored) {
  const std::pair<uint32_t, std::string> rows[] = {
      // flags, indexes of the line-end bytes
      {0, "0"},          {0x1000, "0"},   {0x100, "0"},        {0x200, "10"},  {0x400, "2"},
      {0x800, "3"},      {0x1200, "10"},  {0x1100, "00"},      {0x300, "010"}, {0xC00, "32"},
      {0x1F00, "32010"}, {0x4000, "bad"}, {0x80000200u, "bad"}};
  for (const TinyCodepage& cp : codepages_) {
    SCOPED_TRACE(cp.file.name);
    LXLocale* locale = library_.locale(cp);
    for (const auto& [flags, order] : rows) {
      SCOPED_TRACE(flags);
      const bool bad = order == "bad";
      Text text;
      for (size_t i = 0; !bad && i < order.size(); ++i)
        for (const TinyCharacter& c : cp.characters)
          if (c.code == line_ends(cp)[order[i] - '0']) text.push_back(c);
      in_all_forms([&, flags = flags](auto form) {
        const auto expected = form.encode(cp, text);
        std::vector<typename decltype(form)::Unit> out(expected.size());
        EXPECT_EQ(form.put_eol(locale, out.data(), flags), bad ? nullptr : out.data() + out.size());
        EXPECT_EQ(out, expected);
        EXPECT_EQ(LXGetError(locale), bad ? LX_E_INVALID : LX_OK);
      });
    }
  }
}

}  // namespace
