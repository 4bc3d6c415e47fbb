// The families of rows.
#pragma once

#include "table.h"
#include "texts.h"

namespace bench {

void add_conversion_rows(Table* table, Texts* texts);
void add_walking_rows(Table* table, Texts* texts);
void add_mapping_rows(Table* table, Texts* texts);
void add_collation_rows(Table* table, Texts* texts);
void add_formatting_rows(Table* table);

}  // namespace bench
