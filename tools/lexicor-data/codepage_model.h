// A codepage as its object can hold it: for each 16-bit Unicode value its packed code, and for each packed code
// its Unicode value. Both the compiler (from a table) and the dumper (from an object) fill this model, and the
// canonical source is what it says. It differs from a table as read in these points:
//   - characters above U+FFFF are left out, and listed, with what maps to their codes;
//   - U+FFFD stands for "no value": a code is never mapped to it (from it, one way);
//   - the substitution byte stands for "no code": a value is mapped to it only when it maps back.
#pragma once

#include <array>
#include <cstdint>
#include <map>
#include <string>
#include <vector>

#include "ucm.h"

namespace lexicor_data {

inline constexpr uint32_t kNoCode = 0xFFFFFFFF;
inline constexpr uint16_t kNoValue = 0xFFFD;

inline constexpr uint8_t code_bytes(uint32_t code) {
  return code > 0xFFFFFF ? 4 : code > 0xFFFF ? 3 : code > 0xFF ? 2 : 1;
}

struct CodepageModel {
  CodepageSource header;                    ///< the keys; its mappings are empty
  std::vector<uint32_t> from_unicode;       ///< 65,536 packed codes, kNoCode where there is none
  std::map<uint32_t, uint16_t> to_unicode;  ///< by packed code, one-byte characters too; never kNoValue

  bool is_multibyte() const { return header.width > 1; }
  bool is_shift() const { return header.kind == CodepageClass::kShiftStateful; }
  uint8_t substitution() const { return header.substitution; }

  uint16_t value_of(uint32_t code) const;
  /// The code that maps to the value and back, or kNoCode.
  uint32_t round_trip(uint16_t unicode) const;
};

/// A character that the object does not hold, and why.
struct LeftOut {
  Mapping mapping;
  const char* reason;
};

/// The rule of the substitution byte, over directions as they were read: it stands for "no code" except for the
/// value that it maps to, when that has no other code.
void settle_substitution(CodepageModel& model);

/// Both directions of UTF-8, surrogates like any other value.
void fill_utf8(CodepageModel& model);

/// Builds the model; contradictory mappings and codes with zero bytes are a SourceError. Characters above
/// U+FFFF are appended to `left_out`.
CodepageModel to_model(const CodepageSource& source, const std::string& file_name,
                       std::vector<LeftOut>& left_out);

/// The canonical table: to_model(to_source(m)) is m. The algorithmic codepage has no mappings.
CodepageSource to_source(const CodepageModel& model);

}  // namespace lexicor_data
