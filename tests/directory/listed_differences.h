// Differences that a test finds and a text file beside it lists: some words that say what differs where, then
// the reason; '#' comments. A difference that is not listed fails, and so does a line for which none is found.
//
// LEXICOR_WRITE_DIFFERENCES=FILE appends the lines that the test found, with examples in place of the reason.
#pragma once

#include <gtest/gtest.h>

#include <cstdlib>
#include <fstream>
#include <map>
#include <string>
#include <utility>

#include "support/slowness.h"

namespace lx::test {

class ListedDifferences {
 public:
  void add(const std::string& what, const std::string& where, const std::string& example) {
    auto& [count, examples] = found_[what + " " + where];
    if (++count < 6) examples += example + " ";
  }

  /// `file`: its name in the tests' folder. `words`: how many say what differs and where; `counted`: the number of
  /// differences is one more.
  void expect_listed(const std::string& file, int words = 2, bool counted = false) const {
    std::map<std::string, std::string> listed;
    std::ifstream in(LEXICOR_DATA_DIR "/../tests/directory/" + file);
    EXPECT_TRUE(in) << file;
    for (std::string line; std::getline(in, line);) {
      if (line.empty() || line[0] == '#') continue;
      size_t end = 0;
      for (int word = 0; word < words + counted && end != std::string::npos; ++word)
        end = line.find(' ', end + 1);
      ASSERT_NE(end, std::string::npos) << "no reason: " << line;
      EXPECT_TRUE(listed.emplace(line.substr(0, end), line.substr(end + 1)).second) << "listed twice: " << line;
    }
    const char* copy = getenv("LEXICOR_WRITE_DIFFERENCES");
    std::ofstream out(copy == nullptr ? "/dev/null" : copy, std::ios::app);
    for (const auto& [difference, found] : found_) {
      const std::string place = difference + (counted ? " " + std::to_string(found.first) : "");
      out << place << " " << found.second << '\n';
      EXPECT_EQ(listed.erase(place), 1U) << "not listed: " << place << ": " << found.second;
    }
    for (const auto& [place, reason] : listed)
      if (kSlowness == 1) ADD_FAILURE() << "listed and not found: " << place << ": " << reason;
  }

 private:
  std::map<std::string, std::pair<size_t, std::string>> found_;  // how often, and examples
};

}  // namespace lx::test
