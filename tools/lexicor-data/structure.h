// The structure of an object, as far as look-ups rely on it: every offset, count, trie node, index and text
// that one can reach lies inside its section. Each function throws a SourceError that names the file.
#pragma once

#include <string>

#include "object_file.h"
#include "source_model.h"

namespace lexicor_data {

/// The format version and the sections of any object.
void check_container(const ObjectFile& object, ObjectType type, const std::string& file_name);

void check_language_structure(const ByteVector& payload, const std::string& file_name);
void check_territory_structure(const ByteVector& payload, const std::string& file_name);

/// UTF-8 is the multibyte codepage without a multibyte-to-Unicode section.
bool is_utf8_object(const ObjectFile& object);
void check_codepage_structure(const ObjectFile& object, const std::string& file_name);

/// Bounds, and that the tables are in ascending order without an expansion that is missing.
void check_sort_structure(const ObjectFile& object, const std::string& file_name);

}  // namespace lexicor_data
