// US-ASCII in the old form of codepages.
#pragma once

#include <vector>

#include "support/object_files.h"

namespace lx::test {

inline std::vector<ByteString> version1_ascii_codepage() {
  return version1_codepage(ascii_codepage());
}

}  // namespace lx::test
