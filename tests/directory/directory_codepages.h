// The codepages of the shipped directory as their sources say, for tests that compare the library with them.
#pragma once

#include <fstream>
#include <sstream>
#include <string>
#include <vector>

#include "compile.h"
#include "support/forms.h"

namespace lx::test {

struct ShippedCodepage {
  lexicor_data::ObjectName name;
  std::string text;
  lexicor_data::CodepageSource source;

  bool shift() const { return source.kind == lexicor_data::CodepageClass::kShiftStateful; }

  /// The bytes of one character as a whole text: between Shift-Out and Shift-In where it is a double-byte character
  /// of a shift-stateful codepage.
  std::string text_of(uint32_t code) const {
    std::string bytes;
    for (size_t i = lexicor_data::code_bytes(code); i-- > 0;) bytes += static_cast<char>(code >> 8 * i);
    if (!shift() || code <= 0xFF) return bytes;
    return static_cast<char>(lexicor_data::kShiftOut) + bytes + static_cast<char>(lexicor_data::kShiftIn);
  }
};

/// All codepages of the control file in its order.
inline std::vector<ShippedCodepage> shipped_codepages() {
  std::vector<ShippedCodepage> all;
  for (const lexicor_data::ObjectName& object : lexicor_data::read_source_control(LEXICOR_DATA_DIR).objects) {
    if (object.type != lexicor_data::ObjectType::kCodepage) continue;
    std::stringstream text;
    text << std::ifstream(LEXICOR_DATA_DIR "/" + source_file_name(object), std::ios::binary).rdbuf();
    all.push_back({object, text.str(), lexicor_data::read_ucm(text, object.name)});
  }
  return all;
}

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
