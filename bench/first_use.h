// The time and memory that the first results of a process take.
#pragma once

#include <cstdio>

namespace bench {

/// Prints a line for each library: microseconds from nothing to a word converted, two compared and an amount written,
/// least and median of processes that do it once, and the private memory that they take for it.
void print_first_use(const char* locale_directory, std::FILE* out);

}  // namespace bench
