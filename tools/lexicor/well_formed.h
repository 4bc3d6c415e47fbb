// The check of a text for subcommands that take well-formed text only.
#pragma once

#include <lx.h>

#include <string>

#include "codepage.h"
#include "input.h"
#include "malformed.h"
#include "place.h"

namespace lexicor_cli {

class WellFormed {
 public:
  /// `units_only`: characters that have no 16-bit Unicode value are refused too.
  WellFormed(const Codepage& codepage, const Input& input, bool units_only = false)
      : codepage_(codepage), input_(input), finder_(codepage, units_only), place_(codepage) {}

  /// Looks at the next bytes of the input, of one file. Throws a Failure that says what is malformed, and
  /// where.
  void take(const char* data, size_t bytes);
  /// Ends the text.
  void finish() { look(true); }

 private:
  void look(bool last);

  const Codepage& codepage_;
  const Input& input_;
  const MalformedFinder finder_;
  Place place_;
  std::string text_;  // a cut character, then what is looked at
  uint64_t offset_ = 0;
  LXShiftState state_ = LX_SHIFT_SINGLE;
};

}  // namespace lexicor_cli
