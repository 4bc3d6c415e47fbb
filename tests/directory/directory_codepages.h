// The codepages of the shipped directory as their sources say, for tests that compare the library with them.
#pragma once

#include <string>
#include <vector>

#include "support/forms.h"
#include "ucm.h"

namespace lx::test {

struct ShippedCodepage {
  uint16_t id;
  lexicor_data::CodepageSource source;

  bool shift() const { return source.kind == lexicor_data::CodepageClass::kShiftStateful; }
};

/// All codepages of the control file in its order, read once.
const std::vector<ShippedCodepage>& shipped_codepages();

/// The bytes of one character as a whole text: between Shift-Out and Shift-In where it is a double-byte
/// character of a shift-stateful codepage.
std::string text_of_code(const ShippedCodepage& codepage, uint32_t code, size_t bytes);

/// A text from Unicode, and a whole one to it, with shift bytes where the codepage has them.
inline std::string from_unicode(LXLocale* l, const Units& text) {
  const auto encode_closed = [&](char* to, int32_t room) {
    return LXUnicodeToStringEx(l, to, LX_SHIFT_SINGLE, room, text.data(), count_of(text), LX_TERMINATE) - 1;
  };
  return made<char>(encode_closed, 5 * text.size() + 2);
}
inline Units to_unicode(LXLocale* l, const std::string& bytes) {
  return decode(kEx, l, bytes);
}

}  // namespace lx::test
