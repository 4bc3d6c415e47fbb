// A codepage's source: a table in the .ucm form, read, checked and written. docs/codepage-sources.md describes the
// form.
#pragma once

#include <array>
#include <cstdint>
#include <iosfwd>
#include <string>
#include <vector>

#include "source_error.h"

namespace lexicor_data {

struct Mapping {
  uint32_t unicode = 0;   ///< a code point, above 0xFFFF too
  uint32_t code = 0;      ///< packed code: bytes in order, first most significant
  uint8_t bytes = 1;      ///< length of the character
  uint8_t precision = 0;  ///< 0 both ways, 1 from Unicode only, 3 to Unicode only
};

inline bool from_unicode(const Mapping& m) {
  return m.precision != 3;
}
inline bool to_unicode(const Mapping& m) {
  return m.precision != 1;
}
/// The order of a table: by code point, then precision, then code.
bool in_table_order(const Mapping& a, const Mapping& b);

enum class CodepageClass { kSingleByte, kMultiByte, kShiftStateful };

struct CodepageSource {
  std::string name;
  std::string source;  ///< where the facts come from, free text
  CodepageClass kind = CodepageClass::kSingleByte;
  uint8_t width = 1;
  uint8_t substitution = 0x3F;
  std::array<uint8_t, 4> line_ends{0x0A, 0x0D, 0x0A, 0x0A};
  bool ascii = true;
  bool utf8 = false;               ///< computed, no mappings
  std::array<uint8_t, 256> leads;  ///< length by first byte, all 1 unless MBCS
  std::vector<Mapping> mappings;   ///< in table order

  std::vector<std::string> bases;     ///< the files that it was read from beside its own
  std::vector<std::string> warnings;  ///< what was passed over, with its place

  CodepageSource() { leads.fill(1); }
};

inline constexpr uint8_t kShiftOut = 0x0E;
inline constexpr uint8_t kShiftIn = 0x0F;

/// Reads and checks a table: keys, ranges, lengths against leads, duplicates. A base is looked for beside
/// `file_name`. Throws SourceError.
CodepageSource read_ucm(std::istream& in, const std::string& file_name);
CodepageSource read_ucm_file(const std::string& path);

/// Writes the plain table, a line a mapping: read_ucm(write_ucm(x)) is x, and equal tables give equal bytes.
void write_ucm(std::ostream& out, const CodepageSource& source);

/// Writes the table as a short source: characters in a row as ranges and, with a base, only what differs from it.
void write_ucm_source(std::ostream& out, const CodepageSource& source, const CodepageSource* base);

}  // namespace lexicor_data
