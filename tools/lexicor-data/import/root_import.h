// The root of all sorts from ICU's root collator: the elements of every assigned 16-bit character outside the
// blocks with computed weights, and its contractions. Primary weights are numbered anew, densely; secondary and
// tertiary ones too, from the common ones of the Unicode Collation Algorithm on.
#pragma once

#include "sort_root.h"

namespace lexicor_import {

lexicor_data::SortRoot import_root();

}  // namespace lexicor_import
