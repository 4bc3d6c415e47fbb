// Whether a language or territory makes sense to the functions that use it, beyond what its form requires.
// Objects that do not still compile: the library reads any value. Both functions throw a SourceError at the
// first fault.
#pragma once

#include <iosfwd>
#include <string>

namespace lexicor_data {

/// The formatting functions read a format into 32 bytes, its terminator among them.
inline constexpr size_t kMaxFormatBytes = 31;

/// The bytes that a text takes in the library's UTF-8, unit by unit.
size_t utf8_bytes(const std::u16string& text);

/// Names that are missing, codes that are none, and special mappings that no look-up reaches.
void check_language_sense(std::istream& in, const std::string& file_name);

/// Separators that are no single byte everywhere, equal ones, group sizes, codes, and formats that the
/// formatting functions would refuse or cut.
void check_territory_sense(std::istream& in, const std::string& file_name);

}  // namespace lexicor_data
