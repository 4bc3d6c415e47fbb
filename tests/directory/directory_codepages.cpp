#include "directory/directory_codepages.h"

#include <fstream>

#include "codepage_pack.h"
#include "compile.h"

namespace lx::test {
namespace {

ShippedCodepage read_codepage(uint16_t id, const std::string& name) {
  const std::string file = std::string(LEXICOR_DATA_DIR) + "/codepages/" + name + ".ucm";
  std::ifstream in(file);
  ShippedCodepage codepage{id, lexicor_data::read_ucm(in, file), {}};
  if (codepage.source.utf8) return codepage;
  std::vector<lexicor_data::LeftOut> left_out;
  lexicor_data::pack_codepage(lexicor_data::to_model(codepage.source, file, left_out), file, left_out);
  for (const lexicor_data::LeftOut& character : left_out)
    if (character.mapping.unicode <= 0xFFFF) codepage.left_out.insert(character.mapping.unicode);
  return codepage;
}

}  // namespace

const std::vector<ShippedCodepage>& shipped_codepages() {
  static const std::vector<ShippedCodepage> codepages = [] {
    std::vector<ShippedCodepage> all;
    for (const lexicor_data::ObjectName& object : lexicor_data::read_source_control(LEXICOR_DATA_DIR).objects)
      if (object.type == lexicor_data::ObjectType::kCodepage)
        all.push_back(read_codepage(object.id, object.name));
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
