// Packs a sort into its payload and reads it back. The weight rows of pages share records where they agree.
#pragma once

#include <string>

#include "object_file.h"
#include "sort_text.h"

namespace lexicor_data {

/// The payload; throws SourceError when it takes more than 65,535 bytes, with the sizes of its parts.
ByteVector pack_sort(const SortSource& sort, const std::string& file_name);

/// Reads a payload whose structure is sound.
SortSource unpack_sort(const ByteVector& payload);

}  // namespace lexicor_data
