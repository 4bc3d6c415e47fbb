// Runs the case files: each case in every form and codepage that has its characters, with lengths and with
// nulls.
#include <gtest/gtest.h>

#include <filesystem>

#include "cases/case_runner.h"
#include "platform/ras1.h"
#include "platform/recording_ras1.h"
#include "support/library.h"

namespace lx::test {

uint32_t case_flags(const CaseWords& words) {
  static const std::pair<const char*, uint32_t> kFlags[] = {
      {"chars", LX_CHARACTERS},      {"terminate", LX_TERMINATE},           {"territory", LX_TERRITORY_VALUES},
      {"case", LX_CASE_INSENSITIVE}, {"width", LX_WIDTH_INSENSITIVE},       {"blanks", LX_IGNORE_BLANKS},
      {"drop", LX_DROP_BLANKS},      {"drop-full", LX_DROP_FULL_BLANKS},    {"national", LX_NATIONAL_DIGITS},
      {"monetary", LX_MONETARY},     {"international", LX_INTERNATIONAL},   {"unsigned", LX_UNSIGNED},
      {"full", LX_MAP_FULL_WIDTH},   {"half", LX_MAP_HALF_WIDTH},           {"copy", LX_MAP_COPY},
      {"lower", LX_MAP_LOWER},       {"lower-simple", LX_MAP_LOWER_SIMPLE}, {"digits", LX_MAP_DIGITS},
      {"upper", LX_MAP_UPPER},       {"upper-simple", LX_MAP_UPPER_SIMPLE}};
  uint32_t flags = static_cast<uint32_t>(words.number("flags", 0));
  for (const auto& [word, flag] : kFlags)
    if (words.has(word)) flags |= flag;
  return flags;
}

namespace {

const Families& families() {
  static const Families all = [] {
    Families made = string_families();
    for (Families more : {compare_families(), convert_families(), walk_families(), format_families(),
                          stream_families(), item_families()})
      made.merge(more);
    return made;
  }();
  return all;
}

std::vector<std::string> case_files() {
  std::vector<std::string> paths;
  for (const auto& entry : std::filesystem::directory_iterator(LEXICOR_CASES_DIR))
    if (entry.path().extension() == ".txt") paths.push_back(entry.path().string());
  std::sort(paths.begin(), paths.end());
  return paths;
}

/// The locale that a case asks for, with the values that it sets.
class CaseLocale {
 public:
  CaseLocale(CaseLibrary& library, const Case& c, const TinyCodepage& cp) {
    std::string language = "English", sort;
    std::vector<const CaseWords::Word*> values;
    for (const CaseWords& with : c.with)
      for (const CaseWords::Word& w : with.all)
        if (w.name == "language" || w.name == "sort")
          (w.name == "sort" ? sort : language) = w.value;
        else
          values.push_back(&w);
    const bool changed = !values.empty() || c.family == "items";  // which sets them
    locale_ = changed ? library.new_locale(cp, language, sort) : library.locale(cp, language, sort);
    if (changed) own_.reset(locale_);
    for (const CaseWords::Word* w : values) set(*w);
  }
  LXLocale* get() const { return locale_; }

 private:
  void set(const CaseWords::Word& w) {
    static const std::map<std::string, int32_t> kItems{{"decimal", LX_ITEM_DECIMAL},
                                                       {"thousands", LX_ITEM_THOUSANDS},
                                                       {"grouping", LX_ITEM_GROUPING},
                                                       {"digits", LX_ITEM_DIGITS},
                                                       {"monetary-decimal", LX_ITEM_MONETARY_DECIMAL},
                                                       {"monetary-thousands", LX_ITEM_MONETARY_THOUSANDS},
                                                       {"currency", LX_ITEM_CURRENCY},
                                                       {"currency-grouping", LX_ITEM_MONETARY_GROUPING},
                                                       {"currency-digits", LX_ITEM_CURRENCY_DIGITS},
                                                       {"positive-sign", LX_ITEM_POSITIVE_SIGN},
                                                       {"negative-sign", LX_ITEM_NEGATIVE_SIGN},
                                                       {"positive-space", LX_ITEM_POSITIVE_SPACE},
                                                       {"positive-precedes", LX_ITEM_POSITIVE_PRECEDES},
                                                       {"positive-position", LX_ITEM_POSITIVE_POSITION},
                                                       {"negative-space", LX_ITEM_NEGATIVE_SPACE},
                                                       {"negative-precedes", LX_ITEM_NEGATIVE_PRECEDES},
                                                       {"negative-position", LX_ITEM_NEGATIVE_POSITION},
                                                       {"time-format", LX_ITEM_TIME_FORMAT},
                                                       {"short-date", LX_ITEM_SHORT_DATE_FORMAT},
                                                       {"long-date", LX_ITEM_LONG_DATE_FORMAT}};
    const auto found = kItems.find(w.name);
    if (found == kItems.end()) throw CaseError("no value of a locale: " + w.name);
    const Units text = w.text.units();
    const int32_t set = w.quoted ? LXSetLocaleTextInfoU(locale_, found->second, text.c_str(), -1, 0)
                                 : LXSetLocaleNumInfo(locale_, found->second, std::stoi(w.value));
    EXPECT_EQ(set, 1) << w.name;
  }
  LXLocale* locale_;
  LocalePtr own_;
};

class Cases : public testing::TestWithParam<std::string> {
 protected:
  void TearDown() override { EXPECT_TRUE(library_.close()); }

  static bool named(const Case& c, const std::string& mark) {
    return std::find(c.marks.begin(), c.marks.end(), mark) != c.marks.end();
  }
  /// Whether marks of a kind, codepages or forms, leave this one out.
  static bool excluded(const Case& c, const std::string& mark, bool codepage) {
    const auto of_kind = [&](const std::string& m) { return (m[0] == '@') == codepage; };
    return std::any_of(c.marks.begin(), c.marks.end(), of_kind) && !named(c, mark);
  }
  template <class Is>
  static bool any_word(const Case& c, Is is) {
    const auto& given = c.given.all;
    const auto& expected = c.expected.all;
    return std::any_of(given.begin(), given.end(), is) || std::any_of(expected.begin(), expected.end(), is);
  }
  static bool fits(const Case& c, const TinyCodepage& cp) {
    const std::string mark = "@" + cp.file.name;
    if (c.family == "stream") return named(c, mark);  // its texts are of the codepages that it names
    const auto lacks = [&](const CaseWords::Word& w) { return w.quoted && w.name != "says" && !w.text.in(cp); };
    return !any_word(c, lacks) && !excluded(c, mark, true) && (cp.file.name != "ODD" || named(c, mark));
  }
  static bool raw(const Case& c) {
    return any_word(c, [](const CaseWords::Word& w) { return w.text.raw(); });
  }

  template <class F>
  void run_in(const Case& c, const TinyCodepage& cp, void (*body)(CaseRun<F>&)) {
    // The plain form knows no shift bytes; the mark "unshifted" is for what it does with them.
    const bool unshifted = std::is_same_v<F, Plain> && cp.shift;
    if (body == nullptr || excluded(c, unshifted ? "unshifted" : F::name, false) ||
        (unshifted && !named(c, "unshifted")) || (raw(c) && sizeof(typename F::Unit) > 1))
      return;
    for (const bool null : {false, true}) {
      c.given.reset(), c.expected.reset();
      const bool one_way = c.given.number("length", -2) != -2 || c.given.has("by-length");
      if ((null && one_way) || (!null && c.given.has("by-null"))) continue;
      c.given.reset();
      SCOPED_TRACE(c.place + " " + F::name + " " + cp.file.name + (null ? " null-terminated" : ""));
      ++runs_;
      run(c, cp, null, body);
    }
  }
  template <class F>
  void run(const Case& c, const TinyCodepage& cp, bool null, void (*body)(CaseRun<F>&)) {
    states = {};
    states.text = static_cast<LXShiftState>(c.given.number("state", 0));
    states.second = static_cast<LXShiftState>(c.given.number("state2", 0));
    states.output = static_cast<LXShiftState>(c.given.number("output-state", 0));
    CaseLocale locale(library_, c, cp);
    CaseRun<F> r{c,
                 cp,
                 library_,
                 locale.get(),
                 null,
                 case_flags(c.given),
                 c.expected.number("error", LX_OK),
                 c.given.has("once")};
    const bool says = c.expected.has_text("says");
    const Units messages = says ? c.expected.text("says").units() : Units();
    const int32_t state = c.expected.number("state", kAnyState);
    RecordingTrace::take();
    if (says) RecordingTrace::set_level(RAS1_LEVEL_DETAIL | RAS1_LEVEL_INPUT);
    c.given.has("by-length"), c.given.has("by-null");
    body(r);
    RecordingTrace::set_level(0);
    EXPECT_EQ(LXGetError(r.l), r.error);
    if (std::is_same_v<F, Ex> && state != kAnyState) {
      EXPECT_EQ(static_cast<int32_t>(states.result), state);
    }
    if (says) {
      EXPECT_EQ(said(), std::string(messages.begin(), messages.end()));
    }
    EXPECT_EQ(c.given.unused() + c.expected.unused(), "") << "words that the family does not know";
  }
  static std::string said() {
    std::string all;
    for (const TraceRecord& r : RecordingTrace::take())
      all += (all.empty() ? "" : "|") + r.text + shown(Units(r.bytes.begin(), r.bytes.end()));
    return all;
  }

  static constexpr int32_t kAnyState = -1;
  CaseLibrary library_;
  int runs_ = 0;
};

TEST_P(Cases, InEveryFormAndCodepage) {
  const std::vector<Case> cases = read_cases(GetParam());
  EXPECT_FALSE(cases.empty());
  for (const Case& c : cases) {
    const auto found = families().find(c.family);
    if (found == families().end()) {
      ADD_FAILURE() << c.place << ": an unknown family: " << c.family;
      continue;
    }
    runs_ = 0;
    for (const TinyCodepage& cp : case_codepages()) {
      if (!fits(c, cp)) continue;
      try {
        run_in(c, cp, found->second.plain);
        run_in(c, cp, found->second.ex);
        run_in(c, cp, found->second.wide);
        run_in(c, cp, found->second.unicode);
      } catch (const CaseError& error) {
        ADD_FAILURE() << c.place << ": " << error.what();
      }
    }
    EXPECT_GT(runs_, 0) << c.place << ": no form and no codepage runs this case";
  }
}

INSTANTIATE_TEST_SUITE_P(Files, Cases, testing::ValuesIn(case_files()),
                         [](const auto& file) { return std::filesystem::path(file.param).stem().string(); });

}  // namespace
}  // namespace lx::test
