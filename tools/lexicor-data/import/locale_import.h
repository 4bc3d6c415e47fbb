// Languages and territories from ICU's locale data.
//
// Language: the names that dates are written with (the stand-alone forms where the full date uses those), the
// short ones, the day-period markers, the language's name for itself, and its special case mappings. The
// default codepage is UTF-8, which alone holds the texts of every language and territory.
//
// Territory: symbols of Latin digits with marks of direction left out, no-break spaces as spaces, U+2212 as "-"
// and U+2019 as "'"; two fraction digits for numbers, those of ISO 4217 for amounts with the code; the layout of
// currency amounts as ICU writes 1 and -1; the list separator is ";" where the decimal one is ",". Time is the
// medium style, the dates short and full; the next shorter style where a format would be too long.
#pragma once

#include <string>
#include <vector>

#include "locale_table.h"
#include "source_model.h"

namespace lexicor_import {

/// What a person should know about an imported object, a line each.
using Notes = std::vector<std::string>;

/// The first line of a file: where it came from.
std::string source_comment(const char* locale);

/// The same with the facts that CLDR does not know.
std::string territory_comment(const Territory& territory);

lexicor_data::LanguageSource import_language(const Language& language, const lexicor_data::Control& control);
lexicor_data::TerritorySource import_territory(const Territory& territory, Notes& notes);

/// The special mappings of a language: its own rules (Azerbaijani, Lithuanian, Turkish) and, of those that hold
/// everywhere, the ones whose character is among its letters, when the result has one or two 16-bit characters
/// and is not what the library maps to by itself. A character alone is looked up before a pair that begins with
/// it, so such pairs are left out. In Greek, capital sigma before a blank or a punctuation mark that ends a
/// word becomes final sigma.
std::vector<lexicor_data::SpecialMapping> special_mappings(const std::string& locale, bool upper);

}  // namespace lexicor_import
