// `lexicor-data check`: everything that can be wrong with a compiled directory or with a source directory.
#pragma once

#include <iosfwd>
#include <string>

#include "source_error.h"

namespace lexicor_data {

/// The faults of a compiled directory (one with control.nls); none: it is sound.
SourceErrors check_compiled_directory(const std::string& directory);

/// The faults of a source directory (one with control.txt). Sources that nothing is made of are named in `log`.
SourceErrors check_source_directory(const std::string& directory, std::ostream& log);

}  // namespace lexicor_data
