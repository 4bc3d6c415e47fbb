// Reads a codepage object back into the model that it was packed from.
#pragma once

#include <string>

#include "codepage_model.h"
#include "object_file.h"

namespace lexicor_data {

/// Unpacks an object whose structure is sound. An object has no name in it: `name` becomes the model's.
CodepageModel unpack_codepage(const ObjectFile& object, const std::string& name);

}  // namespace lexicor_data
