// Comparison by code value: random pairs of similar texts in every codepage against a model on Unicode values,
// with every length that cuts; memory that fails.
#include "codepage/lxunicode.h"
#include "support/case_test.h"
#include "support/slowness.h"

namespace lx::test {
namespace {

constexpr uint32_t kCase = LX_CASE_INSENSITIVE, kWidth = LX_WIDTH_INSENSITIVE;

std::string encoded(const TinyCodepage& cp, const Units& text, size_t from = 0) {
  return cp.encode({text.begin() + static_cast<ptrdiff_t>(from), text.end()});
}

class Compare : public CaseTest {
 protected:
  /// A character of few, so that two are often equal up to case and width.
  LXUChar random_char(const TinyCodepage& cp) {
    constexpr LXUChar kOften[] = {'a', 'A', 'z', 'Z', '_', '/', 0xFF21, 0xE0, 0xC0, 0x3041, 0xFF71, 0x30A2};
    const LXUChar u = any_of(kOften);
    return cp.find(u) != nullptr ? u : random() % 2 == 0 ? 'a' : 'A';
  }
  static const std::string& folded(const TinyCodepage& cp, LXUChar u, uint32_t options) {
    static std::map<std::tuple<const TinyCodepage*, LXUChar, uint32_t>, std::string> known;
    std::string& bytes = known[{&cp, u, options}];
    if (!bytes.empty()) return bytes;
    const LXUChar other = options == kCase                    ? unicode_lower(u)
                          : options == kWidth && cp.width > 1 ? unicode_full_to_half(u)
                                                              : u;
    return bytes = cp.find(cp.find(other) != nullptr ? other : u)->bytes;
  }
  static int32_t model(const TinyCodepage& cp, const Units& a, const Units& b, uint32_t options) {
    const size_t n = std::min(a.size(), b.size());
    for (size_t i = 0; i < n; ++i) {
      const std::string &x = folded(cp, a[i], options), &y = folded(cp, b[i], options);
      if (options != 0 && x.size() != y.size()) return count_of(x) - count_of(y);
      for (size_t k = 0; k < x.size() && k < y.size(); ++k)
        if (x[k] != y[k]) return static_cast<uint8_t>(x[k]) - static_cast<uint8_t>(y[k]);
    }
    const size_t from = options == kWidth && cp.width > 1 ? n : 0;
    return count_of(encoded(cp, a, from)) - count_of(encoded(cp, b, from));
  }
  /// A text and one that is like it.
  std::pair<Units, Units> random_pair(const TinyCodepage& cp, uint32_t options, size_t most) {
    Units a(below(most), 0), b;
    for (LXUChar& u : a) u = random_char(cp);
    for (LXUChar u : a) {
      const LXUChar other = random_char(cp);
      b.push_back(random() % 64 == 0 || folded(cp, u, options) == folded(cp, other, options) ? other : u);
    }
    if (random() % 3 == 0) b.resize(random() % (b.size() + 1));
    return {a, b};
  }
  /// Packed codes and Unicode.
  void in_units(const TinyCodepage& cp, const Units& a, const Units& b, uint32_t options) {
    LXLocale* const in = library.locale(cp);
    Units f = a, g = b;
    for (Units* text : {&f, &g})
      for (LXUChar& u : *text)
        u = options == kWidth ? unicode_full_to_half(u) : options == kCase ? unicode_upper(u) : u;
    const auto compared = [&](const auto& form) {
      using F = std::decay_t<decltype(form)>;
      return form.cmp(in, Encoded<F>(cp, a).units.data(), count_of(a), Encoded<F>(cp, b).terminated().data(),
                      -1, options);
    };
    EXPECT_EQ(sign(compared(kUnicode)), f < g ? -1 : f > g);
    if (options != kWidth) {
      EXPECT_EQ(compared(kWide) == 0, f == g);
    }
  }
};

TEST_F(Compare, AllFormsFollowTheModel) {
  for (const char* name : {"SINGLE", "SJIS", "UTF8", "SHIFT"})
    for (unsigned n = 0; n < 2400u / kSlowness && !HasFailure(); ++n) {
      const TinyCodepage& cp = case_codepage(name);
      LXLocale* const in = library.locale(cp);
      const uint32_t options = n % 3 == 0 ? 0 : n % 3 == 1 ? kCase : kWidth;
      auto [a, b] = random_pair(cp, options, n % 15 == 0 ? 300 : 20);
      const std::string x = encoded(cp, a), y = encoded(cp, b);
      SCOPED_TRACE(cp.file.name + " " + shown(a) + " " + shown(b) + " " + std::to_string(options));
      // The first text ends anywhere, in a block of exactly its size. Whether a shift byte or the caller tells
      // the state makes no difference.
      const size_t cut = random() % 2 == 0 ? x.size() : random() % (x.size() + 1);
      const bool started = cp.shift && cut != 0 && x[0] == cp.shift_out;
      const std::vector<char> block(x.begin() + started, x.begin() + static_cast<ptrdiff_t>(cut));
      const int32_t bytes = count_of(block);
      a.resize(Encoded<Ex>(cp, a).whole(cut));
      const int32_t expected = model(cp, a, b, options);
      if (cp.shift) {
        const int32_t result = LXStrcmpEx(in, block.data(), started, bytes, y.c_str(), 0, -1, options);
        EXPECT_EQ(result, LXStrcmpEx(in, x.data(), 0, bytes + started, y.data(), 0, count_of(y), options));
        // Shift bytes count by bytes and by case, and case has an order of its own.
        EXPECT_TRUE(options != kWidth || sign(result) == sign(expected));
        EXPECT_TRUE(options != kCase || result == 0 || cut != x.size() || expected != 0);
        continue;
      }
      EXPECT_EQ(LXStrcmp(in, block.data(), bytes, y.c_str(), -1, options), expected);
      EXPECT_EQ(LXStrcmpEx(in, block.data(), 1, bytes, y.data(), 1, count_of(y), options), expected);
      EXPECT_EQ(LXStrcmp(in, y.data(), count_of(b), x.data(), count_of(a), options | LX_CHARACTERS), -expected);
      in_units(cp, a, b, options);
    }
}

/// Two copies for special mappings, which are refused, and one for folding, without which the texts compare.
TEST_F(Compare, MemoryThatFails) {
  const std::string text(300, 'x'), blank = text + " ";
  LXLocale* const mapping = library.locale(case_codepage("SINGLE"), "Special");
  for (size_t failing : {1u, 2u, 3u}) {
    library.hooks().fail_at(failing);
    EXPECT_EQ(LXStrcmp(mapping, blank.c_str(), -1, text.c_str(), -1, kCase), failing == 3 ? 1 : 0);
    EXPECT_EQ(LXGetError(mapping), failing == 3 ? LX_OK : LX_E_MEMORY);
  }
}

}  // namespace
}  // namespace lx::test
