// The family and the line ends of a codepage, from its characters.
#include "codepage_defaults.h"

namespace lexicor_data {

std::optional<bool> ascii_family(const ByteOf& byte_of) {
  const auto zero = byte_of('0'), minus = byte_of('-');
  if (zero == '0' && minus == '-') return true;
  if (zero == 0xF0 && minus == 0x60) return false;
  return std::nullopt;
}

std::array<uint8_t, 4> usual_line_ends(bool ascii, const ByteOf& byte_of) {
  const uint8_t line_feed = byte_of(0x0A).value_or(ascii ? 0x0A : 0x25);
  const uint8_t carriage_return = byte_of(0x0D).value_or(0x0D);
  const uint8_t third = ascii ? line_feed : byte_of(0x85).value_or(line_feed);
  return {line_feed, carriage_return, third, line_feed};
}

}  // namespace lexicor_data
