// The alias file: every name that a codepage is known by, each once.
#pragma once

#include <iosfwd>
#include <vector>

#include "codepage_table.h"

namespace lexicor_import {

/// Writes alias.txt. A name that several codepages claim goes to the first of: the one whose table entry lists
/// it, the one that ICU opens for it, the one of the lowest identifier whose converter has it in ICU's tables,
/// the one whose object name suggests it (IBM850: cp850; MS1252: windows-1252).
void write_aliases(std::ostream& out, const std::vector<Codepage>& codepages);

}  // namespace lexicor_import
