// What a program says that is neither its result nor an error.
#pragma once

#include <iostream>

namespace lexicor_cli {

/// --quiet
inline bool g_quiet = false;

/// Standard error, or nowhere.
inline std::ostream& notices() {
  static std::ostream nowhere(nullptr);
  return g_quiet ? nowhere : std::cerr;
}

}  // namespace lexicor_cli
