// Where two sorts differ, said in rules for a reader: what moved, and what it follows in the second sort. They do not
// always make the second sort when they are compiled.
#pragma once

#include <iosfwd>

#include "sort_root.h"
#include "sort_text.h"

namespace lexicor_data {

/// Writes rules, nothing when the sorts order alike. Of what moved together, only its ends are shown when it is long.
/// With `root`, which may be null, what follows from other relations by canonical equivalence is left out.
void explain_sorts(std::ostream& out, const SortSource& from, const SortSource& to, const SortRoot* root);

}  // namespace lexicor_data
