// Damaged files: truncations, and bytes changed; and objects whose sections are changed at named places.
#pragma once

#include <cstddef>
#include <string>
#include <vector>

#include "support/object_files.h"
#include "support/slowness.h"

namespace lx::test {

/// Calls `use` with each damaged form of a file's bytes: every `step`th truncation, and byte
/// changed.
template <class Bytes, class Use>
void for_each_damage(const Bytes& whole, Use use, size_t step = 1) {
  step *= kSlowness;
  for (size_t size = 0; size < whole.size(); size += step)
    use(Bytes(whole.begin(), whole.begin() + static_cast<std::ptrdiff_t>(size)));
  Bytes bytes = whole;
  for (size_t at = 0; at < bytes.size(); at += step) {
    auto& byte = bytes[at];
    const auto sound = byte;
    for (const int value : {0x00, 0x01, 0x80, 0xFF, sound ^ 1}) {
      byte = static_cast<typename Bytes::value_type>(value);
      use(bytes);
    }
    byte = sound;
  }
}

/// Changes the sections of an object: "SECTION:OFFSET = VALUE ...", or "SECTION:size = SIZE"; more changes stand
/// behind ";". A value of two hexadecimal digits is a byte, "OFFSET:COUNT" copies bytes of the section, and all else
/// is a word. Offsets, sizes and words are numbers and names with + - * / between them, which are done from left to
/// right, before anything is changed: the fields of a codepage's payload; "@FIELD", its value; "size0" to "size3";
/// "low.XX", the place of page XX in section 2; "unode" and "tnode", the root of the tries to Unicode and of types, and
/// "unode.XX", the node that byte XX leads to.
void change_sections(std::vector<ByteString>* sections, const std::string& changes);

}  // namespace lx::test
