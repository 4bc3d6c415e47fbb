#include "directory/directory_codepages.h"

#include <fstream>

#include "compile.h"

namespace lx::test {
const std::vector<ShippedCodepage>& shipped_codepages() {
  static const std::vector<ShippedCodepage> codepages = [] {
    std::vector<ShippedCodepage> all;
    for (const lexicor_data::ObjectName& object : lexicor_data::read_source_control(LEXICOR_DATA_DIR).objects)
      if (object.type == lexicor_data::ObjectType::kCodepage) {
        const std::string file = LEXICOR_DATA_DIR "/" + source_file_name(object);
        std::ifstream in(file);
        all.push_back({object.id, lexicor_data::read_ucm(in, file)});
      }
    return all;
  }();
  return codepages;
}

std::string text_of_code(const ShippedCodepage& codepage, uint32_t code, size_t bytes) {
  std::string text;
  for (size_t i = bytes; i-- > 0;) text += static_cast<char>(code >> 8 * i);
  if (!codepage.shift() || bytes == 1) return text;
  return static_cast<char>(lexicor_data::kShiftOut) + text + static_cast<char>(lexicor_data::kShiftIn);
}

}  // namespace lx::test
