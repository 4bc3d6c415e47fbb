// control.txt, the list of a directory's objects, and its binary form, the control file's entry table.
//
//   # comment
//   language  1    English
//   codepage  819  Latin1
//
// A line names a type, an identifier (1 to 65535) and a name of at most 33 visible ASCII characters.
#pragma once

#include <iosfwd>
#include <string>

#include "object_file.h"
#include "source_model.h"

namespace lexicor_data {

/// Reads and checks the list; the lines may stand in any order. Throws SourceError.
Control read_control(std::istream& in, const std::string& file_name);

/// Writes the canonical text: objects in order, one a line.
void write_control(std::ostream& out, const Control& control);

ByteVector pack_control(const Control& control);

/// Reads an entry table and checks its order and names. Throws SourceError.
Control unpack_control(const ByteVector& section, const std::string& file_name);

}  // namespace lexicor_data
