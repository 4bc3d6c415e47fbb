// What a codepage is taken for where its source does not say it: its family and its line ends follow from the bytes
// of a few characters.
#pragma once

#include <array>
#include <cstdint>
#include <functional>
#include <optional>

namespace lexicor_data {

/// The one byte that a code point is written as, if it is.
using ByteOf = std::function<std::optional<uint8_t>(uint32_t unicode)>;

/// True: the digit zero is 30 and the minus 2D; false: they are those of EBCDIC; nothing: neither.
std::optional<bool> ascii_family(const ByteOf& byte_of);

/// Line feed, carriage return, and the third and fourth one: line feeds, but in EBCDIC the third is the next-line
/// control, which its text files are made of. Usual bytes stand for characters that the codepage does not have.
std::array<uint8_t, 4> usual_line_ends(bool ascii, const ByteOf& byte_of);

}  // namespace lexicor_data
