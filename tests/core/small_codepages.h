// US-ASCII in the old form of codepages.
#pragma once

#include <vector>

#include "core/lxbytes.h"
#include "core/lxformat.h"
#include "support/object_files.h"

namespace lx::test {

/// ascii_codepage() in the form of version 1, which lacks the shift bytes and two unused ones.
inline std::vector<ByteString> version1_ascii_codepage() {
  namespace cp = lx::format::codepage;
  std::vector<ByteString> sections = ascii_codepage();
  ByteString& payload = sections[0];
  payload.erase(payload.begin() + cp::kTypes - 2, payload.begin() + cp::kTypes);
  payload.erase(payload.begin() + cp::kShiftOut, payload.begin() + cp::kLengths);
  return sections;
}

}  // namespace lx::test
