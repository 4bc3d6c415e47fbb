// State tables, in which the .ucm files of other systems say which bytes make a character.
#pragma once

#include <array>
#include <cstdint>
#include <vector>

#include "ucm_line.h"

namespace lexicor_data {

class UcmStates {
 public:
  /// Reads the value of one <icu:state>: `0-80, 8e:2, 90-9f.u, a1-fe:1`.
  void read(UcmLine& line);

  bool empty() const { return states_.empty(); }
  /// The length of the characters that begin with a byte: 0 when there are none, or of several lengths.
  uint8_t length(uint8_t first) const;

 private:
  static constexpr int kEnds = -1, kIllegal = -2;
  using State = std::array<int, 256>;  ///< the next state, kEnds or kIllegal

  void read_entry(UcmLine& line, State& state) const;
  /// Adds the lengths of the characters that a byte goes on, one bit each.
  void lengths(size_t state, unsigned byte, uint8_t length, unsigned& found) const;

  std::vector<State> states_;
};

}  // namespace lexicor_data
