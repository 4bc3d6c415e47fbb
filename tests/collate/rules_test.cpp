// Collation rules over the shipped root: tests/collate/rules.txt has rules, and the order of words or the fault that
// comes of them. A case begins with "==" and a title; "> " begins words, written as in rules, with relations between
// neighbours: the first level on which their keys differ, <<<< for punctuation. "! " begins a fault; other lines are
// rules. [import NAME] finds the case with this title, or a shipped sort.
#include <gtest/gtest.h>

#include <fstream>
#include <sstream>

#include "core/lxformat.h"
#include "files.h"
#include "lx.h"
#include "sort_pack.h"
#include "sort_rules.h"
#include "sort_sources.h"
#include "support/library.h"
#include "support/object_files.h"
#include "ucm.h"

namespace lexicor_data {
namespace {

struct Case {
  std::string title, rules;
  std::vector<std::string> orders;
  std::string fault;
};

std::vector<Case> read_cases() {
  std::ifstream in(LEXICOR_DATA_DIR "/../tests/collate/rules.txt");
  std::vector<Case> cases;
  for (std::string line; std::getline(in, line);) {
    if (line.rfind("== ", 0) == 0)
      cases.push_back({line.substr(3), "", {}, ""});
    else if (cases.empty())
      continue;
    else if (line.rfind("> ", 0) == 0)
      cases.back().orders.push_back(line.substr(2));
    else if (line.rfind("! ", 0) == 0)
      cases.back().fault = line.substr(2);
    else
      cases.back().rules += line + '\n';
  }
  return cases;
}

/// The levels of the key of a word.
std::vector<std::string> levels_of(LXLocale* locale, const std::string& word) {
  std::u16string text;
  for (const SortRule& rule : read_rules("&x=" + word, "word")) text = rule.text;
  std::string key(256, '\0');
  key.resize(static_cast<size_t>(LXStrxfrmU(locale, reinterpret_cast<uint8_t*>(key.data()), 256,
                                            reinterpret_cast<const LXUChar*>(text.data()),
                                            static_cast<int32_t>(text.size()), 0)));
  size_t at = 0;
  while (key.at(at) != '\0') at += 2;
  const size_t second = key.find('\0', at + 1), third = key.find('\0', second + 1);
  return {key.substr(0, at), key.substr(at + 1, second - at - 1), key.substr(second + 1, third - second - 1),
          key.substr(third + 1)};
}

void expect_order(LXLocale* locale, const std::string& order, const std::string& title) {
  constexpr const char* kRelations[] = {"<", "<<", "<<<", "<<<<"};
  std::istringstream words(order);
  std::string left, relation, right;
  for (words >> left; words >> relation >> right; left = right) {
    const auto a = levels_of(locale, left), b = levels_of(locale, right);
    size_t level = 0;
    while (level < a.size() && a[level] == b[level]) ++level;
    const std::string found =
        level == a.size() ? "=" : std::string(a[level] < b[level] ? "" : "not ") + kRelations[level];
    EXPECT_EQ(found, relation) << title << ": " << left << ' ' << right;
  }
}

TEST(Rules, OrderWordsAndSayWhatIsWrong) {
  const std::vector<Case> cases = read_cases();
  ASSERT_GT(cases.size(), 60U);
  SortSources shipped(LEXICOR_DATA_DIR "/sorts");
  const FindRules find = [&](const std::string& name) -> RuleFile {
    for (const Case& entry : cases)
      if (entry.title == name) return {name, entry.rules};
    return shipped.find(name);
  };
  const auto utf8 = read_object(read_file(LEXICOR_LOCALE_DIR "/cp_57352.nls"), "UTF-8").sections;
  for (const Case& entry : cases) {
    std::string fault;
    SortNotes notes;
    SortSource sort;
    try {
      sort = build_sort(shipped.root(), {"rules", entry.rules}, find, notes);
    } catch (const SourceError& error) {
      fault = error.what();
    }
    EXPECT_EQ(fault.substr(0, entry.fault.size()), entry.fault) << entry.title << ": " << fault;
    EXPECT_EQ(fault.empty(), entry.fault.empty()) << entry.title << ": " << fault;
    if (!fault.empty() || entry.orders.empty()) continue;
    const lx::test::ScratchDirectory directory;
    directory.write_locale({{lx::format::codepage::kUtf8Id, "UTF-8", utf8}},
                           {{{1, LX_SORT, "Own"}, pack_sort(sort, entry.title)}});
    const lx::test::Library library(directory.path());
    const lx::test::LocalePtr locale(LXGetLocale("English.UTF-8@Own", 0, nullptr));
    ASSERT_TRUE(locale) << entry.title;
    for (const std::string& order : entry.orders) expect_order(locale.get(), order, entry.title);
  }
}

}  // namespace
}  // namespace lexicor_data
