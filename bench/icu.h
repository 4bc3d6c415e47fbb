// What ICU and libunistring do beside the library. In a build without them all of it is empty.
#pragma once

#include "codepages.h"
#include "table.h"

namespace bench::icu {

/// Whether ICU writes a character as these bytes, and reads them as this character; true without ICU.
bool reads_and_writes(const Encoding& encoding, const std::string& bytes, char16_t c);

/// Conversion of every piece, with converters that stay open: with a pivot between two codepages.
Work convert(const Input& input, const Encoding& from, const Encoding& to);
/// The functions for UTF-8 and UTF-16 alone.
Work convert_utf(const Input& input, const Encoding& from, const Encoding& to);
/// Upper or lower case of every piece by the rules of a language: text of a codepage goes through UTF-16.
Work map(const Input& input, const Encoding& encoding, const char* language, bool is_upper);

}  // namespace bench::icu

namespace bench::unistring {

/// u8_to_u16 and u16_to_u8.
Work convert(const Input& input, const Encoding& from, const Encoding& to);
/// u8_toupper, u16_tolower and so on.
Work map(const Input& input, const Encoding& encoding, const char* language, bool is_upper);

}  // namespace bench::unistring
