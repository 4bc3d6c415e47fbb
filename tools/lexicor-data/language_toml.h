// A language's source in TOML, and its payload.
//
//   abbreviation = "EN"
//   name = "English"
//   default = { territory = "UnitedStates", codepage = "UTF-8", sort = "Binary" }
//   days = ["Sunday", ...]            short_days = ["Sun", ...]         7 each, Sunday first
//   months = ["January", ...]         short_months = ["Jan", ...]       12 or 13 each
//   morning = "AM"                    afternoon = "PM"
//   special_upper = [{ from = "ß", to = "SS" }]                         optional, as is special_lower
//
// The defaults are names of control.txt; a number is taken as an identifier. "Binary" is order without an
// object.
#pragma once

#include <iosfwd>
#include <string>

#include "object_file.h"
#include "source_model.h"

namespace lexicor_data {

LanguageSource read_language(std::istream& in, const std::string& file_name, const Control& control);

/// Writes the canonical text. Without a control file, or for identifiers that it does not hold, the defaults
/// are numbers.
void write_language(std::ostream& out, const LanguageSource& language, const Control* control);

/// The payload; throws SourceError when the texts do not fit it.
ByteVector pack_language(const LanguageSource& language, const std::string& file_name);

/// Reads a payload whose structure is sound.
LanguageSource unpack_language(const ByteVector& payload);

}  // namespace lexicor_data
