// Message catalogs built in memory, for this machine's byte order or the other one.
#pragma once

#include <cstdint>
#include <string>
#include <utility>
#include <vector>

#include "core/lxcatformat.h"
#include "support/object_files.h"

namespace lx::test {

struct CatalogSet {
  uint32_t number;
  std::vector<std::pair<uint32_t, std::string>> messages;  // each gets its null
};

/// Header, set records, then the index and the texts of each set.
ByteString catalog_file(const std::vector<CatalogSet>& sets, const std::string& locale = "",
                        bool other_order = false);

/// Changes one integer of a catalog for this machine.
void put_catalog_word(ByteString* file, size_t offset, uint32_t value);

}  // namespace lx::test
