// Line ends in strings: the four forms against one model, and the order in which they are stored.
#include "stream/line_texts.h"

namespace lx::test {
namespace {

class LineEnds : public CaseTest {
 protected:
  /// Looks for line ends in the text, in a block of its exact size and with `behind` after it: by its length in
  /// units and in characters and, without a null in it and nothing behind, null-terminated.
  template <class F>
  void check(const TinyCodepage& cp, const Units& text, const Units& behind, uint32_t kinds) {
    LXLocale* locale = library.locale(cp);
    const FoundEol model = find_eol(line_ends(cp), text, 0, kinds != 0 ? kinds : LX_EOL_LF);
    const Encoded<F> before(cp, text.substr(0, model.past)), whole(cp, text);
    auto units = whole.units;
    const bool terminated = behind.empty() && std::count(units.begin(), units.end(), 0) == 0;
    const auto rest = Encoded<F>(cp, behind).units;
    units.insert(units.end(), rest.begin(), rest.end());
    // A count of characters looks at the byte behind the last one.
    if (terminated || rest.empty()) units.push_back(terminated ? 0 : 0x41);
    units.shrink_to_fit();
    for (const auto& [length, flag] :
         {std::pair(whole.size(), 0u), {count_of(text), LX_CHARACTERS}, {-1, 0u}}) {
      if (length < 0 && !terminated) continue;
      SCOPED_TRACE(length);
      uint32_t kind = 1;
      int32_t eol_length = -1;
      const auto* end = F::get_eol(locale, units.data(), length, &kind, &eol_length, kinds | flag);
      EXPECT_EQ(LXGetError(locale), LX_OK);
      EXPECT_EQ(kind, model.kind);
      EXPECT_EQ(eol_length, model.length);
      EXPECT_EQ(end, model.kind == LX_EOL_NONE ? nullptr : units.data() + before.size());
    }
  }
};

TEST_F(LineEnds, FoundAlikeInAllForms) {
  for (const TinyCodepage& cp : case_codepages()) {
    SCOPED_TRACE(cp.file.name);
    for (int round = 0; round < 300; ++round) {
      const Units text = random_text(cp, random, 9), behind = random_text(cp, random, 1 + round % 3);
      const uint32_t kinds = (random() % 16) << 8;
      SCOPED_TRACE(kinds);
      forms_of(cp, [&](const auto& form) { check<std::decay_t<decltype(form)>>(cp, text, behind, kinds); });
    }
  }
}

/// The order is fixed and line feeds add up; two together are no line end that anybody wants, and stay.
TEST_F(LineEnds, Stored) {
  const std::pair<uint32_t, std::string> rows[] = {
      // flags, indexes of the line ends
      {0, "0"},       {0x1000, "0"},  {0x100, "0"},   {0x200, "10"}, {0x400, "2"},     {0x800, "3"},
      {0x1200, "10"}, {0x1100, "00"}, {0x300, "010"}, {0xC00, "32"}, {0x1F00, "32010"}};
  for (const TinyCodepage& cp : case_codepages())
    for (const auto& [flags, order] : rows) {
      SCOPED_TRACE(cp.file.name + " " + std::to_string(flags));
      Units text;
      for (char index : order) text += line_ends(cp)[static_cast<size_t>(index - '0')];
      in_all_forms([&, flags = flags](const auto& form) {
        using F = std::decay_t<decltype(form)>;
        const auto expected = Encoded<F>(cp, text).units;
        std::vector<typename F::Unit> out(expected.size());
        EXPECT_EQ(F::put_eol(library.locale(cp), out.data(), flags), out.data() + out.size());
        EXPECT_EQ(out, expected);
      });
    }
}

}  // namespace
}  // namespace lx::test
