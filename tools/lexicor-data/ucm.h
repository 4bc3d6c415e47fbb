// A codepage's source: a table in the .ucm form, read, checked and written.
//
// The form is the field's own (header keys in angle brackets, then CHARMAP ... END CHARMAP with a line
// `<U0041> \x41 |0` a mapping), with these keys:
//
//   <code_set_name>        the object's name, in quotes
//   <uconv_class>          "SBCS", "MBCS" or "EBCDIC_STATEFUL"
//   <mb_cur_max>           the longest character in bytes; in EBCDIC_STATEFUL that of the double-byte state
//   <subchar>              the substitution byte, \xHH
//   <lexicor:line_ends>    four bytes: line feed, carriage return, two further line ends
//   <lexicor:ascii>        yes: digit zero is 0x30 and minus is 0x2D; no: EBCDIC
//   <lexicor:leads>        MBCS: ranges of first bytes of longer characters with their length,
//                          `81-9F:2 E0-FC:2 8F:3`; a byte not named begins a one-byte character
//   <lexicor:algorithm>    "UTF-8": the mapping is computed and no CHARMAP follows
//   <lexicor:source>       where the facts were taken from
//
// EBCDIC_STATEFUL: Shift-Out is 0x0E and Shift-In 0x0F; one-byte mappings belong to the single-byte state,
// longer ones to the double-byte state. Precision |0 maps both ways, |1 only from Unicode, |3 only to Unicode.
#pragma once

#include <array>
#include <cstdint>
#include <iosfwd>
#include <stdexcept>
#include <string>
#include <vector>

namespace lexicor_data {

/// An error in a source: what, in which file, and where in it (1-based; 0: not known).
struct SourceError : std::runtime_error {
  SourceError(std::string file_name, int line_number, int column_number, const std::string& what);
  std::string file;
  int line;
  int column;
};

struct Mapping {
  uint32_t unicode = 0;   ///< a code point, above 0xFFFF too
  uint32_t code = 0;      ///< packed code: bytes in order, first most significant
  uint8_t bytes = 1;      ///< length of the character
  uint8_t precision = 0;  ///< 0 both ways, 1 from Unicode only, 3 to Unicode only
};

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
  std::vector<Mapping> mappings;   ///< sorted by (unicode, precision, code)

  CodepageSource() { leads.fill(1); }
};

inline constexpr uint8_t kShiftOut = 0x0E;
inline constexpr uint8_t kShiftIn = 0x0F;

/// Reads and checks a table: keys, ranges, lengths against leads, duplicates. Throws SourceError.
CodepageSource read_ucm(std::istream& in, const std::string& file_name);

/// Writes the canonical text: read_ucm(write_ucm(x)) is x, and equal tables give equal bytes.
void write_ucm(std::ostream& out, const CodepageSource& source);

}  // namespace lexicor_data
