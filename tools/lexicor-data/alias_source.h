// alias.txt: the other names of codepages. A line that begins in column 1 names a codepage object and then its
// aliases; a line that begins with a blank goes on with the same codepage; a line that begins with # is a
// comment. The file is shipped as it is.
#pragma once

#include <istream>
#include <string>

#include "source_model.h"

namespace lexicor_data {

/// Checks that the library would read the whole file and that every codepage exists. Throws SourceError.
void check_aliases(std::istream& in, const std::string& file_name, const Control& control);

}  // namespace lexicor_data
