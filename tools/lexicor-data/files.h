// Whole files, read and written. What the system refuses is a SourceError with its reason.
#pragma once

#include <sstream>
#include <string>

#include "digest.h"

namespace lexicor_data {

ByteVector read_file(const std::string& path);
std::string read_text(const std::string& path);

/// For the readers of sources, which go through lines.
std::istringstream open_source(const std::string& path);

/// Writes under a temporary name and renames, so that an interrupted run leaves no half file.
void write_file(const std::string& path, const ByteVector& bytes);

}  // namespace lexicor_data
