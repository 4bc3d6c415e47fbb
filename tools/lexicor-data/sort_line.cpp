// Characters of sort sources as text.
#include "sort_line.h"

namespace lexicor_data {

std::string code_points_text(const std::u16string& text) {
  std::string out;
  for (const char16_t unit : text) out += (out.empty() ? "" : " ") + hex4(unit);
  return out;
}

std::string visible_text(char16_t unit) {
  const bool invisible = unit <= 0x20 || (unit >= 0x7F && unit <= 0xA0) || unit == 0xAD || unit == 0x61C ||
                         (unit >= 0x2000 && unit <= 0x200F) || (unit >= 0x2028 && unit <= 0x202F) ||
                         (unit >= 0x205F && unit <= 0x206F) || unit == 0x3000 || unit == 0xFEFF ||
                         unit >= 0xFFF0;
  return invisible ? "" : utf8_text({&unit, 1});
}

}  // namespace lexicor_data
