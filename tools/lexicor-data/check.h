// `lexicor-data check`: everything that can be wrong with a compiled directory or with a source directory.
#pragma once

#include <string>
#include <vector>

namespace lexicor_data {

/// The faults of a compiled directory (one with control.nls), as messages; none: it is sound.
std::vector<std::string> check_compiled_directory(const std::string& directory);

/// The faults of a source directory (one with control.txt). Every file is looked at, with its first fault.
std::vector<std::string> check_source_directory(const std::string& directory);

}  // namespace lexicor_data
