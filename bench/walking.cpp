// Characters counted and walked over, beside ICU's inlined macros, libunistring and glibc.
#include <wchar.h>

#include "codepages.h"
#include "families.h"
#include "icu.h"
#include "keep.h"
#include "system.h"

namespace bench {
namespace {

constexpr size_t kLongUnits = 300000;
constexpr size_t kShortChars = 8;

struct Subject {
  const char* encoding;
  const char* text;
  const char* system;  // glibc's locale of the encoding
};
constexpr Subject kSubjects[] = {
    {"UTF-8", "English", "en_US.UTF-8"},        {"UTF-8", "German", "en_US.UTF-8"},
    {"UTF-8", "Russian", "en_US.UTF-8"},        {"UTF-8", "Japanese", "en_US.UTF-8"},
    {"UTF-8", "Korean", "en_US.UTF-8"},         {"UTF-8", "Japanese-prose", "en_US.UTF-8"},
    {"MS932", "Japanese", "ja_JP.WINDOWS-31J"}, {"MS932", "Japanese-prose", "ja_JP.WINDOWS-31J"},
    {"MS936", "Chinese", "zh_CN.GBK"},          {"MS936", "Chinese-prose", "zh_CN.GBK"},
    {"JapanEUC", "Japanese", "ja_JP.EUC-JP"},
};

Work count_ours(const Input& input, const LocalePointer& locale) {
  return sum_of_pieces(input, [locale](const char* text, size_t bytes) {
    return count(LXNumChars(locale.get(), text, length(bytes)));
  });
}

/// The calling thread's locale is set once for all pieces.
template <class Step>
Work in_system_locale(const char* name, const Input& input, Step step) {
  const SystemLocale system = open_system_locale(name);
  if (system == nullptr) return nullptr;
  return [system, work = sum_of_pieces(input, step)](char* output) {
    const locale_t before = uselocale(system.get());
    const size_t sum = work(output);
    uselocale(before);
    return sum;
  };
}

Work count_glibc(const Input& input, const char* system) {
  return in_system_locale(system, input, [](const char* text, size_t bytes) {
    std::mbstate_t state{};
    return mbsnrtowcs(nullptr, &text, bytes, 0, &state);
  });
}

/// Each character's code is taken and the next one looked for, to the end of the text.
Work walk_ours(const Input& input, const LocalePointer& locale) {
  return sum_of_pieces(input, [locale](const char* text, size_t bytes) {
    size_t chars = 0;
    LXWChar codes = 0;
    for (const char* const end = text + bytes; text < end; text = LXNextChar(locale.get(), text)) {
      codes += LXGetChar(locale.get(), text);
      ++chars;
    }
    keep(codes);
    return chars;
  });
}

Work walk_glibc(const Input& input, const char* system) {
  return in_system_locale(system, input, [](const char* text, size_t bytes) {
    std::mbstate_t state{};
    size_t chars = 0;
    wint_t codes = 0;
    for (const char* const end = text + bytes; text < end; ++chars) {
      wchar_t c = 0;
      const size_t taken = mbrtowc(&c, text, static_cast<size_t>(end - text), &state);
      if (taken > static_cast<size_t>(end - text)) break;
      codes += static_cast<wint_t>(c);
      text += taken;
    }
    keep(codes);
    return chars;
  });
}

void add_subject(Table* table, Texts* texts, const Subject& subject) {
  const std::string stem = std::string(subject.encoding) + "/" + subject.text;
  if (!table->wants_some("count/" + stem) && !table->wants_some("walk/" + stem)) return;
  const Encoding& encoding = *find_encoding(subject.encoding);
  const auto codepage = Codepage::open(encoding);
  const LocalePointer locale = open_locale(std::string("English.") + subject.encoding);
  if (codepage == nullptr || locale == nullptr || texts->find(subject.text).empty()) return;
  const std::u16string text = agreed_text(texts->find(subject.text), {codepage.get()}, kLongUnits);
  for (const bool is_short : {false, true}) {
    const Input input = is_short ? cut_pieces(text, kShortChars, kManyPieces, *codepage)
                                 : cut_pieces(text, text.size(), 1, *codepage);
    const std::string name = stem + (is_short ? "/8" : "/long");
    table->add({"count/" + name,
                {{kOurs, count_ours(input, locale)},
                 {kIcu, icu::count_chars(input, encoding)},
                 {kUnistring, unistring::count_chars(input, encoding)},
                 {kGlibc, count_glibc(input, subject.system)}},
                input->chars,
                input->ends.size(),
                0,
                Same::kNumber});
    table->add({"walk/" + name,
                {{kOurs, walk_ours(input, locale)},
                 {kIcu, icu::walk(input, encoding)},
                 {kUnistring, unistring::walk(input, encoding)},
                 {kGlibc, walk_glibc(input, subject.system)}},
                input->chars,
                input->ends.size(),
                0,
                Same::kNumber});
  }
}

}  // namespace

void add_walking_rows(Table* table, Texts* texts) {
  for (const Subject& subject : kSubjects) add_subject(table, texts, subject);
}

}  // namespace bench
