// Characters of sort sources as text.
#include "sort_line.h"

namespace lexicor_data {

std::string utf8_text(const std::u16string& text) {
  std::string out;
  for (const char16_t unit : text) {
    if (unit < 0x80) {
      out += static_cast<char>(unit);
    } else if (unit < 0x800) {
      out += static_cast<char>(0xC0 | unit >> 6);
      out += static_cast<char>(0x80 | (unit & 0x3F));
    } else {
      out += static_cast<char>(0xE0 | unit >> 12);
      out += static_cast<char>(0x80 | (unit >> 6 & 0x3F));
      out += static_cast<char>(0x80 | (unit & 0x3F));
    }
  }
  return out;
}

std::string code_text(const std::u16string& text) {
  std::string out;
  for (const char16_t unit : text) out += (out.empty() ? "" : " ") + hex4(unit);
  return out;
}

std::string visible_text(char16_t unit) {
  const bool invisible = unit <= 0x20 || (unit >= 0x7F && unit <= 0xA0) || unit == 0xAD || unit == 0x61C ||
                         (unit >= 0x2000 && unit <= 0x200F) || (unit >= 0x2028 && unit <= 0x202F) ||
                         (unit >= 0x205F && unit <= 0x206F) || unit == 0x3000 || unit == 0xFEFF ||
                         unit >= 0xFFF0;
  return invisible ? "" : utf8_text({unit});
}

}  // namespace lexicor_data
