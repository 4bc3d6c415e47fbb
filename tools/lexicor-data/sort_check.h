// What a sort must agree with beyond its layout, so that its keys order text as comparison does.
#pragma once

#include <string>

#include "sort_text.h"

namespace lexicor_data {

/// Throws a SourceError with the place of the first fault: the default weights are the lowest in use, primaries
/// are 0x0200 or more, and no two elements differ only in that one has a default weight where the other has
/// none, which a key does not show.
void check_sort(const SortSource& sort, const std::string& file_name);

}  // namespace lexicor_data
