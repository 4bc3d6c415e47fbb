// Times, over random formats, records and texts: all forms write and read the same characters in every kind of
// codepage, and read what they have written.
#include <cstring>

#include "core/lxrecords.h"
#include "support/case_test.h"

namespace lx::test {
namespace {

/// ASCII; a char beyond it stands for kana.
Units kana_units(const std::string& text) {
  Units out;
  for (char c : text) out.push_back(static_cast<LXUChar>(c < 0 ? 0x3041 + (c & 0x3F) : c));
  return out;
}

template <class F>
Written<F> formatted(const F& form, LXLocale* in, const LXTime& time, const Units& format_text) {
  const auto format = encode(form, in, format_text);
  return written(form, in, 2000, 0, [&](auto* to, int32_t room) {
    return form.write_time(in, &time, to, room, format.data(), count_of(format), 0);
  });
}

struct Result {
  int32_t code, count;
  LXTime time;
};
template <class F>
Result parsed(const F& form, LXLocale* in, const Units& text, const Units& format, const LXTime& before) {
  const auto t = encode(form, in, text), by = encode(form, in, format);
  const std::vector<typename F::Unit> block(t.begin(), t.end());  // of its exact size
  Result out{0, 0, before};
  out.count =
      form.read_time(in, &out.time, block.data(), count_of(text), by.data(), count_of(format), LX_CHARACTERS);
  out.code = LXGetError(in);
  return out;
}

class TimeTest : public CaseTest {
 protected:
  LXTime random_time() {
    LXTime time{any(60), any(60), any(24), any(32), any(12), any(100), any(7), any(366)};
    if (any(8) == 0) time.hours = 24;
    return time;
  }
  /// Directives, letters, kana, mistakes; nested formats at the start only, where forms agree on their place.
  std::string random_format() {
    static const char kLetters[] = "aAbBdHIjmMpSUwWyYaAbBdHIjmMpSwyY%";
    std::string format = any(4) == 0 ? std::string(any(2) == 0 ? "%" : "%#") + "cxX"[any(3)] : "";
    for (int n = any(6); n > 0; --n) {
      const int what = any(12);
      if (what < 7)
        format += std::string(what < 5 ? "%" : "%#") + kLetters[any(sizeof(kLetters) - 1)];
      else
        format += static_cast<char>(what < 9 ? 'd' + any(16) : what < 11 ? 0x80 + any(63) : '%');
    }
    return format;
  }
};

TEST_F(TimeTest, FormsWriteAndReadTheSame) {
  int read_back = 0;
  for (int round = 0; round < 4000; ++round) {
    const TinyCodepage& cp = case_codepages()[below(case_codepages().size() - 1)];
    if (cp.find(0x3041) == nullptr) continue;
    LXLocale* const in = library.locale(cp, "Kana");  // names that begin with kana
    const std::string format_text = random_format();
    const Units format = kana_units(format_text);
    const LXTime time = random_time();
    const auto original = formatted(kUnicode, in, time, format);
    // A character that the end cuts is read differently where characters are bytes: no text ends in one.
    Units text = original.text;
    text.insert(text.end(), 4, 'z');
    const bool changed = below(2) == 0;
    if (changed) text[below(text.size() - 3)] = any_of(Units{'7', '%', 0x3052, 'a'});
    const Result whole = parsed(kUnicode, in, text, format, time);
    SCOPED_TRACE(round);
    forms_of(cp, [&](const auto& form) {
      ASSERT_EQ(formatted(form, in, time, format).text, original.text);
      const Result out = parsed(form, in, text, format, time);
      ASSERT_EQ(memcmp(&out, &whole, sizeof(out)), 0);
    });
    if (changed || original.code != 0 || whole.code != 0 ||
        format_text.find_first_of("#I") != std::string::npos)
      continue;
    ASSERT_EQ(whole.count, count_of(original.text));
    ASSERT_EQ(formatted(kUnicode, in, whole.time, format).text, original.text);
    ++read_back;
  }
  EXPECT_GT(read_back, 200);
}

}  // namespace
}  // namespace lx::test
