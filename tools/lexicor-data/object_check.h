// Whether an object is one that the tools can work with: sound for the library, and laid out as the compiler
// does it.
#pragma once

#include <string>

#include "object_file.h"
#include "source_model.h"

namespace lexicor_data {

/// The validators take their memory from the library: it is initialised while there is one of these. Threads that check
/// objects need one around them all.
class ValidatorInUse {
 public:
  ValidatorInUse();
  ~ValidatorInUse();
  ValidatorInUse(const ValidatorInUse&) = delete;
  ValidatorInUse& operator=(const ValidatorInUse&) = delete;
};

/// Throws a SourceError that names the file: with what the library's validator finds wrong, in which section
/// and at which offset, or else with what loads but what the compiler never writes, such as tables out of
/// order.
void check_object(const ObjectFile& object, const ObjectName& name, const std::string& file_name);

}  // namespace lexicor_data
