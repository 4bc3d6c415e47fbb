// The X/Open message source format, as gencat reads it.
#pragma once

#include <string>
#include <vector>

#include "builder.h"
#include "encoding.h"
#include "problems.h"

namespace lexicor_gencat {

/// What the comments at the head of a source say of it ("$ codeset=UTF-8"); empty where they do not.
struct Declarations {
  std::string locale;      // of the texts in the catalog
  std::string codeset;     // of the source
  std::string byte_order;  // of the catalog
  int byte_order_line = 0;
};

/// Reads the comments in front of the first message. Without an encoding the source is taken as ASCII bytes.
Declarations read_declarations(const std::string& source, const Encoding* encoding);

/// Merges a source into the catalog. Its faults go to `problems`.
void read_message_source(const std::string& source, const std::string& file_name, const Recoder& recoder,
                         CatalogBuilder& builder, Problems& problems);

/// The text of a message as it stands in a source, escapes and quotes included; quote 0: none.
std::string read_message_text(const std::vector<Character>& line, size_t at, uint32_t quote,
                              const std::string& file_name, const Recoder& recoder, Problems& problems);

/// The control character that a letter behind a backslash stands for, and its letter; 0: none.
uint32_t escape_value(uint32_t letter);
char escape_letter(uint32_t value);

/// Reads up to three octal digits of a number that is at most 255, as a byte.
char read_octal(const std::vector<Character>& line, size_t& at);

}  // namespace lexicor_gencat
