// The table of ratios.
#pragma once

#include <cstdio>
#include <vector>

#include "rows.h"

namespace bench {

/// Measures the rows and prints the table; the last line counts the rows in which ICU or iconv is faster.
void print_ratios(const std::vector<Row>& rows, std::FILE* out);

}  // namespace bench
