// A codepage's source from another system's converter.
//
// The mapping is enumerated both ways: from every sequence of bytes that the converter takes for one character,
// and from every code point up to U+10FFFF, fallbacks allowed. A pair found both ways has precision |0, one
// found only from Unicode |1, one found only to Unicode |3. Which bytes lead, and how long their characters
// are, is seen on what the converter calls cut.
//
// Left out, and counted: sequences of bytes that mean several code points, shift bytes, and codes whose length
// does not agree with their lead.
//
// Line ends: byte 1 is the code of line feed and byte 2 that of carriage return. In an ASCII-based codepage
// bytes 3 and 4 repeat the line feed, 0A 0D 0A 0A. In EBCDIC byte 3 is the code of the next-line control, which
// its text files are made of: 25 0D 15 25.
//
// The substitution is the question mark, 3F in ASCII-based codepages and 6F in EBCDIC, whatever the converter
// has: 1A ends a file for many readers.
//
// Controls: tables of the DOS family put U+001A, U+001C and U+007F at each other's bytes, after the controls of
// a terminal. In every ASCII-based source 00 to 1F and 7F stand for themselves, as in all other systems'
// tables, but where a national standard has letters there (the override "low-letters").
//
// Of the mappings from Unicode alone only those stay whose code reads as the same sign (same_sign.h); those of
// the overrides too.
//
// Overrides, by words: "HH..=XXXX" maps a code and a code point to each other; "HH=none" takes the byte's
// mappings out; "XXXX>HH.." maps a code point to a code, and "XXXX-XXXX>HH.." each to the next code; "HH-HH>HH"
// writes characters by their codes that begin with the last byte instead of those in the range; "assigned"
// reads codes as the characters that are written so instead of private-use values.
#pragma once

#include <map>
#include <string>

#include "converter.h"
#include "ucm.h"

namespace lexicor_import {

using Counts = std::map<std::string, size_t>;  ///< by reason

/// Imports one codepage. Throws std::runtime_error when the converter cannot be brought into the source's form.
lexicor_data::CodepageSource import_codepage(const Codepage& codepage, Counts& left_out);

}  // namespace lexicor_import
