// Differences that a test finds and a text file beside it lists: "what where reason", '#' comments. A
// difference that is not listed fails, and so does a line for which none is found.
//
// LEXICOR_WRITE_DIFFERENCES=FILE appends the lines that the test found, with an example in place of the reason.
#pragma once

#include <gtest/gtest.h>

#include <cstdlib>
#include <fstream>
#include <map>
#include <sstream>
#include <string>

namespace lx::test {

class ListedDifferences {
 public:
  /// `example` of the first one of a kind is kept.
  void add(const std::string& what, const std::string& where, const std::string& example) {
    found_.emplace(what + " " + where, example);
  }

  /// `file`: its name in the tests' folder.
  void expect_listed(const std::string& file) const {
    std::map<std::string, std::string> listed;
    std::ifstream in(LEXICOR_DATA_DIR "/../tests/directory/" + file);
    EXPECT_TRUE(in) << file;
    for (std::string line, what, where, reason; std::getline(in, line);) {
      std::istringstream words(line);
      if (line.empty() || line[0] == '#') continue;
      words >> what >> where >> std::ws;
      EXPECT_TRUE(std::getline(words, reason)) << "no reason: " << line;
      EXPECT_TRUE(listed.emplace(what + " " + where, reason).second) << "listed twice: " << line;
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
  std::map<std::string, std::string> found_;
};

}  // namespace lx::test
