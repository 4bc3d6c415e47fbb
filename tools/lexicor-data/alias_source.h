// alias.txt: the other names of codepages. A line that begins in column 1 names a codepage object and then its
// aliases; a line that begins with a blank goes on with the same codepage; a line that begins with # is a
// comment. The file is shipped as it is.
#pragma once

#include <istream>
#include <map>
#include <string>

#include "source_model.h"

namespace lexicor_data {

using Aliases = std::map<std::string, std::string>;  ///< codepages by alias_key()

/// The form in which aliases are compared.
std::string alias_key(const std::string& alias);

/// Reads the aliases as the library does and checks that it would read the whole file and that every codepage exists.
/// Throws SourceError.
Aliases read_aliases(std::istream& in, const std::string& file_name, const Control& control);

}  // namespace lexicor_data
