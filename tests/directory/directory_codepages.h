// The codepages of the shipped directory, their sources and what the objects hold of them.
#pragma once

#include <fstream>
#include <string>
#include <vector>

#include "codepage_unpack.h"
#include "compile_directory.h"
#include "files.h"
#include "support/slowness.h"

namespace lx::test {

struct ShippedCodepage {
  lexicor_data::ObjectName name;
  lexicor_data::CodepageSource source;
  lexicor_data::ObjectFile object;
  lexicor_data::CodepageModel model;  // of the object

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
  using namespace lexicor_data;
  std::vector<ShippedCodepage> all;
  int count = 0;
  for (const ObjectName& name : read_source_control(LEXICOR_DATA_DIR).objects) {
    if (name.type != lexicor_data::ObjectType::kCodepage || count++ % kSlowness != 0) continue;
    const ObjectFile object =
        read_object(read_file(LEXICOR_LOCALE_DIR "/" + object_file_name(name)), name.name);
    all.push_back(
        {name, read_ucm_file(source_path(LEXICOR_DATA_DIR, name)), object, unpack_codepage(object, name)});
  }
  return all;
}

}  // namespace lx::test
