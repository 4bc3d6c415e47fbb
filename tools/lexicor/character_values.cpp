// Probes a codepage through the public functions.
#include "character_values.h"

namespace lexicor_cli {

std::vector<LXUChar> single_byte_values(const Codepage& codepage) {
  std::vector<LXUChar> values(256, kReplacement);
  for (int byte = 0; byte < 256; ++byte) {
    const char text = static_cast<char>(byte);
    LXUChar unit;
    if (LXStringToUnicodeEx(&unit, 1, codepage.locale(), &text, LX_SHIFT_SINGLE, 1, 0) == 1)
      values[static_cast<size_t>(byte)] = unit;
  }
  return values;
}

Substitution::Substitution(const Codepage& codepage) : single_(single_byte_values(codepage)) {
  // Values that stand for no character: the first one that the codepage does not encode gives the byte away.
  constexpr LXUChar kProbes[] = {0xFFFF, 0xFFFE, 0xFDD0, 0xD800};
  for (const LXUChar probe : kProbes) {
    const LXWChar code = LXCpUnicodeToCharW(codepage.object(), probe);
    if (code > 0xFF || single_[code] == probe) continue;
    byte_ = code;
    known_ = true;
    break;
  }
}

bool Substitution::stands_for(LXUChar unicode, LXWChar code) const {
  if (code > 0xFF || single_[code] == unicode) return false;
  // A page of a codepage that maps nothing may give the null byte in place of the substitution byte.
  return code == 0 || (known_ && code == byte_);
}

uint32_t long_utf8_code_point(const char* text, const char* end) {
  if (static_cast<size_t>(end - text) < kLongUtf8Bytes || !is_long_utf8_lead(*text)) return 0;
  uint32_t code_point = static_cast<unsigned char>(*text) & 0x07u;
  for (size_t i = 1; i < kLongUtf8Bytes; ++i) {
    if (!is_utf8_trail(text[i])) return 0;
    code_point = code_point << 6 | (static_cast<unsigned char>(text[i]) & 0x3Fu);
  }
  return code_point >= 0x10000 && code_point <= 0x10FFFF ? code_point : 0;
}

}  // namespace lexicor_cli
