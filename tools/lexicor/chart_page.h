// A codepage as people look at it: pages of 256 codes that differ in their last byte, and what each one is.
#pragma once

#include <lx.h>

#include <array>
#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

#include "codepage.h"

namespace lexicor_cli {

struct ChartCell {
  enum class Kind { kNone, kCharacter, kLead, kShift } kind = Kind::kNone;
  LXWChar code = 0;
  LXUChar unicode = 0;      // of a character
  std::string sign = "·";   // what stands for it where it is looked at, in UTF-8
  uint32_t properties = 0;  // LX_C1_...
  uint32_t text = 0;        // LX_C3_...
  bool differs = false;     // as a character, from the same code in the codepage that this one is compared with
  std::string other;        // which there is "U+00A4 ¤", or "none"

  /// Columns of a terminal.
  int columns() const { return (text & (LX_C3_FULL_WIDTH | LX_C3_IDEOGRAPH)) != 0 ? 2 : 1; }
  /// "U+0041 ALPHA UPPER XDIGIT ASCII".
  std::string description() const;
  /// One letter for what it is: U upper case, L lower case, A another letter, D digit, P punctuation, S space, C control,
  /// O another character.
  char letter() const;
};

struct ChartPage {
  LXWChar lead = 0;  // the bytes before the last one
  std::array<ChartCell, 256> cells;
  size_t differences = 0;

  /// "Bytes 45 xx", "Single bytes".
  std::string title() const;
};

/// All pages that have characters, by their leading bytes. `other` may be null.
std::vector<ChartPage> chart_pages(const Codepage& codepage, const Codepage* other);

}  // namespace lexicor_cli
