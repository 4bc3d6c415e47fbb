// Times: over random formats, records, sizes and texts that all forms write and read the same characters, in
// every kind of codepage; and what stays in the buffer.
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

/// 4 July 2003, 14:05:09, a Friday.
constexpr LXTime kSample{9, 5, 14, 4, 6, 103, 5, 184};

/// Formats into `size` units, or characters.
template <class F>
Written<F> formatted(const F& form, LXLocale* in, const LXTime& time, const Units& format_text,
                     int32_t size = 2000, uint32_t flags = 0) {
  const bool chars = (flags & LX_CHARACTERS) != 0 && sizeof(typename F::Unit) == 1;
  const auto format = encode(form, in, format_text);
  const int32_t length = chars ? count_of(format_text) : count_of(format);
  return written(form, in, size, flags, [&](auto* to, int32_t room) {
    return form.write_time(in, &time, to, room, format.data(), length, flags);
  });
}

struct Result {
  int32_t code, count;
  LXTime time;
};
bool same(const Result& a, const Result& b) {
  return a.code == b.code && a.count == b.count && memcmp(&a.time, &b.time, sizeof(LXTime)) == 0;
}
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
  std::string random_format(int most) {
    static const char kLetters[] = "aAbBdHIjmMpSUwWyYaAbBdHIjmMpSwyY%";
    std::string format = any(4) == 0 ? std::string(any(2) == 0 ? "%" : "%#") + "cxX"[any(3)] : "";
    for (int n = any(most); n > 0; --n) {
      const int what = any(12);
      if (what < 7)
        format += std::string(what < 5 ? "%" : "%#") + kLetters[any(sizeof(kLetters) - 1)];
      else
        format += static_cast<char>(what < 9 ? 'd' + any(16) : what < 11 ? 0x80 + any(63) : '%');
    }
    return format;
  }
};

/// Nested formats go to the start of the buffer, whose work copy by characters is cleared.
TEST_F(TimeTest, NestedFormatsGoToTheStart) {
  LXLocale* const in = library.locale(case_codepage("SINGLE"));
  for (const auto& [format, text] : {std::pair("on %x.", "7/4/03~~~."),
                                     {"At %X!", "2:05:09 PM~~~!"},
                                     {"Week %W%c", "7/4/036~~~~~~ 2:05:09 PM"}})
    for (uint32_t flags : {0u, uint32_t{LX_CHARACTERS}}) {
      std::string buffer(40, '~'), expected = text;
      if (flags != 0) std::replace(expected.begin(), expected.end(), '~', '\0');
      const int32_t count = LXTimeToString(in, &kSample, buffer.data(), 40, format, -1, flags);
      EXPECT_EQ(buffer.substr(0, static_cast<size_t>(count)), expected);
    }
}

TEST_F(TimeTest, LongAndEqualNames) {
  LXTime sunday = kSample;
  sunday.weekday = 0;
  for (const TinyCodepage& cp : case_codepages()) {
    LXLocale* const in = library.locale(cp, "Long");
    forms_of(cp, [&](const auto& form) {
      // Three bytes for a kana at most, and shift bytes.
      const bool bytes = sizeof(typename std::decay_t<decltype(form)>::Unit) == 1 && cp.find(0x3041) != nullptr;
      const auto out = formatted(form, in, sunday, units("%A."));
      EXPECT_TRUE(bytes ? out.text.size() < 31 && out.result >= 28 : out.result == 32) << out.result;
      EXPECT_EQ(out.text.back(), '.');
      for (int32_t size = 1; size < 28; ++size)
        EXPECT_EQ(formatted(form, in, sunday, units("%A"), size).code, 40);
      EXPECT_EQ(parsed(form, in, units("9AM"), units("%I%p"), kSample).time.hours, 9)
          << "the first of equal names";
    });
  }
}

TEST_F(TimeTest, FormsWriteTheSame) {
  for (int round = 0; round < 3000; ++round) {
    const TinyCodepage& cp = case_codepages()[below(case_codepages().size() - 1)];
    LXLocale* const in = library.locale(cp, "Kana");  // names that begin with kana
    const LXTime time = random_time();
    const Units format = kana_units(random_format(8));
    const auto whole = formatted(kUnicode, in, time, format);
    SCOPED_TRACE(round);
    forms_of(cp, [&](const auto& form) {
      constexpr bool kBytes = sizeof(typename std::decay_t<decltype(form)>::Unit) == 1;
      // In the codepage's characters.
      const Units text = decode(form, in, encode(form, in, whole.text));
      const auto out = formatted(form, in, time, format);
      ASSERT_TRUE(out.text == text && out.code == whole.code);
      const int32_t size = any(24);
      const auto cut = formatted(form, in, time, format, size, below(2) == 0 ? 0 : LX_TERMINATE);
      ASSERT_EQ(cut.text, text.substr(0, cut.text.size())) << "whole characters";
      ASSERT_TRUE(cut.code == 40 || (cut.text == text && cut.code == whole.code));
      ASSERT_TRUE(cut.code != 40 || kBytes || cut.result == size);
      // By characters: as many as asked for, without a code, where the work buffer held everything.
      const auto chars = formatted(form, in, time, format, size, LX_CHARACTERS | LX_TERMINATE);
      const int32_t work = kBytes ? 6 * size : size;
      ASSERT_EQ(chars.text, text.substr(0, chars.text.size()));
      ASSERT_TRUE(chars.code != 40 || out.result + 4 > work);
      ASSERT_TRUE(chars.code == 40 || chars.result == std::min(size, count_of(text) + 1));
    });
  }
}

TEST_F(TimeTest, FormsReadTheSameAndWhatWasWritten) {
  int read_back = 0;
  for (int round = 0; round < 4000; ++round) {
    const TinyCodepage& cp = case_codepages()[below(case_codepages().size() - 1)];
    if (cp.find(0x3041) == nullptr) continue;
    LXLocale* const in = library.locale(cp, "Kana");  // names that begin with kana
    const std::string format_text = random_format(6);
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
      const Result out = parsed(form, in, text, format, time);
      ASSERT_TRUE(same(out, whole));
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
