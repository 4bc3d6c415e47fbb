// PO files as sources of a catalog. What numbers their messages get is said in docs/message-catalogs.md.
#pragma once

#include <string>

#include "builder.h"
#include "encoding.h"
#include "problems.h"

namespace lexicor_gencat {

/// The charset that the header entry names; empty where it names none.
std::string po_charset(const std::string& source);

/// Merges a PO file into the catalog. Its faults go to `problems`.
void read_po_source(const std::string& source, const std::string& file_name, const Recoder& recoder,
                    CatalogBuilder& builder, Problems& problems);

}  // namespace lexicor_gencat
