// Differences that a test finds and a text file beside it lists: some words that say what differs where, then
// the reason; '#' comments. A difference that is not listed fails, and so does a line for which none is found.
//
// LEXICOR_WRITE_DIFFERENCES=FILE appends the lines that the test found, with an example in place of the reason.
#pragma once

#include <gtest/gtest.h>

#include <cstdlib>
#include <fstream>
#include <map>
#include <string>

namespace lx::test {

class ListedDifferences {
 public:
  /// `words`: how many say what differs and where.
  explicit ListedDifferences(int words = 2) : words_(words) {}

  /// `example` of the first one of a kind is kept.
  void add(const std::string& place, const std::string& example) { found_.emplace(place, example); }
  void add(const std::string& what, const std::string& where, const std::string& example) {
    add(what + " " + where, example);
  }

  /// `file`: its name in the tests' folder.
  void expect_listed(const std::string& file) const {
    std::map<std::string, std::string> listed;
    std::ifstream in(LEXICOR_DATA_DIR "/../tests/directory/" + file);
    EXPECT_TRUE(in) << file;
    for (std::string line; std::getline(in, line);) {
      if (line.empty() || line[0] == '#') continue;
      size_t end = 0;
      for (int word = 0; word < words_ && end != std::string::npos; ++word) end = line.find(' ', end + 1);
      ASSERT_NE(end, std::string::npos) << "no reason: " << line;
      EXPECT_TRUE(listed.emplace(line.substr(0, end), line.substr(end + 1)).second) << "listed twice: " << line;
    }
    const char* copy = getenv("LEXICOR_WRITE_DIFFERENCES");
    std::ofstream out(copy == nullptr ? "/dev/null" : copy, std::ios::app);
    for (const auto& [place, example] : found_) {
      out << place << " " << example << '\n';
      EXPECT_EQ(listed.erase(place), 1U) << "not listed: " << place << ": " << example;
    }
    for (const auto& [place, reason] : listed)
      ADD_FAILURE() << "listed and not found: " << place << ": " << reason;
  }

 private:
  int words_;
  std::map<std::string, std::string> found_;
};

}  // namespace lx::test
