// A system runtime for tests: while one of these lives, setlocale and localeconv answer from it, and every call
// is noted. The machine that runs the tests need have no locales.
#pragma once

#include <climits>
#include <clocale>
#include <cstring>
#include <map>
#include <string>
#include <vector>

namespace lx::test {

struct SystemLocale {
  static inline SystemLocale* in_force = nullptr;

  SystemLocale() { in_force = this; }
  ~SystemLocale() { in_force = nullptr; }

  std::string current = "C";
  std::string environment = "C";       // what setlocale(LC_ALL, "") adopts; empty: it is refused
  std::map<std::string, lconv> known;  // further names that can be set, with their conventions
  std::vector<std::string> set;        // the names set, in order
  unsigned queries = 0;

  /// Conventions in which nothing is available.
  static lconv nothing() {
    static char none[] = "";
    lconv conventions;
    memset(&conventions, CHAR_MAX, sizeof(conventions));
    for (char** text : {&conventions.decimal_point, &conventions.thousands_sep, &conventions.grouping,
                        &conventions.int_curr_symbol, &conventions.currency_symbol,
                        &conventions.mon_decimal_point, &conventions.mon_thousands_sep,
                        &conventions.mon_grouping, &conventions.positive_sign, &conventions.negative_sign})
      *text = none;
    return conventions;
  }
};

}  // namespace lx::test
