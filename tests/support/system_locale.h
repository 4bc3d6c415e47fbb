// A system runtime for tests: while one of these lives, setlocale and localeconv answer from it, and every call
// is noted. The machine that runs the tests need have no locales.
#pragma once

#include <clocale>
#include <map>
#include <string>
#include <vector>

namespace lx::test {

class SystemLocale {
 public:
  SystemLocale();
  ~SystemLocale();
  SystemLocale(const SystemLocale&) = delete;
  SystemLocale& operator=(const SystemLocale&) = delete;

  std::string current = "C";
  std::string environment = "C";       // what setlocale(LC_ALL, "") adopts; empty: it is refused
  std::map<std::string, lconv> known;  // further names that can be set, with their conventions
  std::vector<std::string> set;        // the names set, in order
  unsigned queries = 0;

  /// Conventions in which nothing is available.
  static lconv nothing();
};

}  // namespace lx::test
