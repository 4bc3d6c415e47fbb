// Long parts that nearly occur, without regard to case, in the shipped orders and languages: what a search finds is
// what it finds with a trace, which shows that each candidate is compared.
#include <gtest/gtest.h>

#include <random>

#include "platform/recording_ras1.h"
#include "support/library.h"
#include "support/slowness.h"

namespace lx::test {
namespace {

constexpr uint32_t kCaseless = LX_CASE_INSENSITIVE;
constexpr int32_t kRoom = 6000;

struct Alphabet {
  const char* locale;
  const char16_t* letters;
};
constexpr Alphabet kAlphabets[] = {{"German_Germany.UTF-8@Default", u"aAsS\u00DF\u1E9E\u00AD"},
                                   {"German_Germany.MS932@BINARY", u"sSa\uFF41\uFF21"},
                                   {"German_Germany.UTF-8@BINARY", u"sS\u00DF\u1E9E"},
                                   {"Danish_Denmark.UTF-8@Danish", u"aA\u00E5\u030A"},
                                   {"Turkish_Turkey.UTF-8@Turkish", u"iI\u0131\u0130h"},
                                   {"Turkish_Turkey.UTF-8@BINARY", u"iI\u0131\u0130"},
                                   {"Lithuanian_Lithuania.UTF-8@Lithuanian", u"iI\u0307\u0300j"},
                                   {"Czech.UTF-8@Czech", u"chCH\u010D"},
                                   {"English.IBM930@Default", u"aAB"},
                                   {"Japanese_Japan.MS932@Japanese", u"aA\uFF41\u3042\u30A2"}};

class Texts {
 public:
  explicit Texts(const char16_t* letters) : all_(letters) {}

  /// A text that repeats itself, and a part of it that differs in case and here and there.
  void make(std::u16string* text, std::u16string* part) {
    letters_.clear();
    for (size_t n = 2 + random_() % 3; n > 0; --n) letters_ += all_[random_() % all_.size()];
    *text = any(1 + random_() % 30);
    while (text->size() < 700) *text += text->substr(random_() % text->size() / 2);
    *part = text->substr(random_() % text->size(), random_() % 150) + any(1 + random_() % 2);
    for (char16_t& u : *part) {
      if (random_() % 40 == 0) u = any(1)[0];
      if (u < 0x80 && random_() % 3 == 0) u ^= 0x20;
    }
  }

 private:
  std::u16string any(size_t units) {
    std::u16string text;
    while (text.size() < units) text += letters_[random_() % letters_.size()];
    return text;
  }

  std::mt19937 random_;
  const std::u16string all_;
  std::u16string letters_;
};

TEST(LongSearch, FindsWhatTheComparisonOfEachCandidateFinds) {
  const Library library(LEXICOR_LOCALE_DIR);
  for (const Alphabet& alphabet : kAlphabets) {
    SCOPED_TRACE(alphabet.locale);
    const LocalePtr locale(LXGetLocale(alphabet.locale, 0, nullptr));
    ASSERT_NE(locale, nullptr);
    Texts texts(alphabet.letters);
    for (int round = 0; round < 32 / kSlowness; ++round) {
      std::u16string text, part;
      texts.make(&text, &part);
      const auto* const t = reinterpret_cast<const LXUChar*>(text.data());
      const auto* const p = reinterpret_cast<const LXUChar*>(part.data());
      const auto t_units = static_cast<int32_t>(text.size()), p_units = static_cast<int32_t>(part.size());
      char t_bytes[kRoom], p_bytes[kRoom];
      const int32_t t_length = LXUnicodeToString(locale.get(), t_bytes, kRoom, t, t_units, 0);
      const int32_t p_length = LXUnicodeToString(locale.get(), p_bytes, kRoom, p, p_units, 0);
      const void *in_units[2], *in_bytes[2];
      for (const bool traced : {false, true}) {
        RecordingTrace::set_level(traced ? RAS1_LEVEL_PROCESS : 0);
        in_units[traced] = LXStrstrU(locale.get(), t, t_units, p, p_units, kCaseless);
        in_bytes[traced] = LXStrstr(locale.get(), t_bytes, t_length, p_bytes, p_length, kCaseless);
      }
      RecordingTrace::set_level(0);
      RecordingTrace::take();
      ASSERT_EQ(in_units[0], in_units[1]) << round;
      ASSERT_EQ(in_bytes[0], in_bytes[1]) << round;
    }
  }
}

}  // namespace
}  // namespace lx::test
