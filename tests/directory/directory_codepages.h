// The codepages of the shipped directory as their sources say, for tests that compare the library with them.
#pragma once

#include <set>
#include <string>
#include <vector>

#include "ucm.h"

namespace lx::test {

struct ShippedCodepage {
  uint16_t id;
  lexicor_data::CodepageSource source;
  std::set<uint32_t> left_out;  ///< 16-bit Unicode values whose mappings the object has no room for

  bool shift() const { return source.kind == lexicor_data::CodepageClass::kShiftStateful; }
};

/// All codepages of the control file in its order, read once.
const std::vector<ShippedCodepage>& shipped_codepages();

/// The bytes of one character as a whole text: between Shift-Out and Shift-In where it is a double-byte
/// character of a shift-stateful codepage.
std::string text_of_code(const ShippedCodepage& codepage, uint32_t code, size_t bytes);

}  // namespace lx::test
