// Which code points are one sign to a reader: the question that a one-way mapping must answer with yes.
//
// A converter's fallbacks go further. They write pictures as the controls that a screen of DOS showed so
// (bullet as 07, the left arrow as 1B), letters as their base letters, digits of one script as those of
// another, and whatever came near. The text that is read back is then another text, and nobody was told.
#pragma once

#include <cstdint>

namespace lexicor_import {

/// Whether `unicode` may be written as a code that reads as `read`. They are one sign when they differ by
/// width, by the form of an Arabic letter, or as compatibility characters (Angstrom and A with ring, jamo and
/// conjoining jamo, a compatibility ideograph and its unified one, kinds of blanks), or when the national sets
/// have the sign once and makers' tables give it different values. Controls, private-use values, and signs
/// that are raised or in circles are one with nothing but themselves.
bool is_same_sign(uint32_t unicode, uint32_t read);

}  // namespace lexicor_import
