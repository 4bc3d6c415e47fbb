// A territory's source in TOML, and its payload.
//
//   abbreviation = "USA"              name = "United States"
//   flag58 = true                     flag82 = true          flag83 = true          value84 = 0
//   [separators]  decimal, thousands, list, monetary_decimal, monetary_thousands    one character each
//   [digits]      number, currency, international                                   fraction digits
//   [grouping]    number, monetary                                                  "3;0"
//   [currency]    symbol, international
//   [signs]       positive, negative, positive_position, negative_position          positions 0 to 4
//   [placement]   symbol_before_positive, space_in_positive, symbol_before_negative, space_in_negative
//   [formats]     time, short_date, long_date
#pragma once

#include <iosfwd>
#include <string>

#include "object_file.h"
#include "source_model.h"

namespace lexicor_data {

TerritorySource read_territory(std::istream& in, const std::string& file_name);

/// Writes the canonical text.
void write_territory(std::ostream& out, const TerritorySource& territory);

/// The payload; throws SourceError when the texts do not fit it.
ByteVector pack_territory(const TerritorySource& territory, const std::string& file_name);

/// Reads a payload whose structure is sound.
TerritorySource unpack_territory(const ByteVector& payload);

}  // namespace lexicor_data
