// The families of rows.
#pragma once

#include "table.h"
#include "texts.h"

namespace bench {

/// To be called before LXInit.
void add_first_use_rows(Table* table, const std::string& locale_directory);

void add_conversion_rows(Table* table, Texts* texts);
void add_walking_rows(Table* table, Texts* texts);
void add_mapping_rows(Table* table, Texts* texts);
void add_collation_rows(Table* table, Texts* texts);
void add_message_rows(Table* table, Texts* texts);
void add_formatting_rows(Table* table);
void add_growth_rows(Table* table);
void add_process_rows(Table* table, Texts* texts);

}  // namespace bench
