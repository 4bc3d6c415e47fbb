// A catalog as a source: what --dump prints. Compiling it gives the catalog again.
#pragma once

#include <string>

#include "catalog_file.h"
#include "encoding.h"

namespace lexicor_gencat {

/// `own` is the codepage of the catalog's texts, `source` that of the source to write. Comments at the head
/// say the locale, the source's codeset and the byte order. What the source's codepage cannot say stands as
/// octal escapes.
std::string write_source(const Catalog& catalog, const Encoding& own, const Encoding& source);

}  // namespace lexicor_gencat
