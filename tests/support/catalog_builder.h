// Message catalogs as the catalog compiler packs them.
#pragma once

#include <map>
#include <string>

#include "catalog_file.h"
#include "support/object_files.h"

namespace lx::test {

using CatalogSets = std::map<uint32_t, std::map<uint32_t, std::string>>;

inline ByteString catalog_file(const CatalogSets& sets, const std::string& locale = "") {
  const std::string file = lexicor_gencat::pack_catalog({locale, lexicor_gencat::native_byte_order(), sets});
  return ByteString(file.begin(), file.end());
}

}  // namespace lx::test
