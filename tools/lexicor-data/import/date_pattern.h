// Date and time patterns of CLDR, rewritten in the directives of the library's formats.
#pragma once

#include <string>

namespace lexicor_import {

/// h %#I, hh %I, H %#H, HH %H, m and mm %M, s and ss %S, a and B %p, E %a, EEEE %A, MMMM %B, MMM %b, MM %m,
/// M %#m, dd %d, d %#d, y %Y, yy %y, and the stand-alone forms c and L as E and M. The era goes with a blank
/// beside it; a "%" of the pattern is doubled. Throws std::runtime_error for fields that no directive shows.
std::u16string rewrite_pattern(const std::u16string& pattern);

}  // namespace lexicor_import
