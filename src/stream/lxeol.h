// The line ends of a codepage, as one kind of text has them.
#pragma once

#include <type_traits>

#include "codepage/lxcodepage.h"

namespace lx {

/// `Value` is a character: a byte, a packed code, or a 16-bit unit.
template <class Value>
struct LineEnds {
  Value line_feed, carriage_return, third, fourth;
  uint32_t kinds;  // enabled

  LineEnds(const Codepage& cp, uint32_t enabled)
      : line_feed(value(cp, 0)),
        carriage_return(value(cp, 1)),
        third(value(cp, 2)),
        fourth(value(cp, 3)),
        kinds(enabled) {}

  bool any(uint32_t wanted) const { return (kinds & wanted) != 0; }

  /// The kind of the line end that is this one character, or 0.
  uint32_t kind_of(Value v) const {
    if (any(LX_EOL_LF) && v == line_feed) return LX_EOL_LF;
    if (any(LX_EOL_THIRD) && v == third) return LX_EOL_THIRD;
    if (any(LX_EOL_FOURTH) && v == fourth) return LX_EOL_FOURTH;
    return 0;
  }

 private:
  static Value value(const Codepage& cp, size_t index) {
    const uint8_t byte = cp.payload[format::codepage::kLineEnds + index];
    if constexpr (std::is_same_v<Value, LXUChar>)
      return cp.unicode[byte];
    else
      return byte;
  }
};

}  // namespace lx
