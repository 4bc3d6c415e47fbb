// Reads a codepage object back into the model that it was packed from.
#pragma once

#include "codepage_model.h"
#include "object_file.h"
#include "source_model.h"

namespace lexicor_data {

/// Unpacks a sound object. It has neither name nor identifier in it: the name becomes the model's, and the
/// identifier tells UTF-8.
CodepageModel unpack_codepage(const ObjectFile& object, const ObjectName& name);

}  // namespace lexicor_data
