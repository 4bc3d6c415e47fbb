// Unicode's decompositions and kinds of characters through ICU, and the pairs that they do not know.
#include "same_sign.h"

#include <unicode/uchar.h>
#include <unicode/unorm2.h>
#include <unicode/utf16.h>

#include <algorithm>
#include <string>

#include "icu_text.h"

namespace lexicor_import {
namespace {

struct Pair {
  uint32_t first, second;
};

/// One sign of JIS X 0208, KS X 1001, CNS 11643, Big5 or an EBCDIC codepage, by the value that one maker's
/// table gives it and by that of another. No property of Unicode says so. Hyphen and soft hyphen, tilde and
/// small tilde, circled dot and fisheye (KS X 1001: A1A9, A2A6, A2C1) are other signs to a reader.
constexpr Pair kValuesOfOneSign[] = {
    {0x00AF, 0x203E}, {0x203E, 0xFFE3},                    // macron and overline
    {0x00B7, 0x30FB},                                      // the middle dot
    {0x2014, 0x2015},                                      // the long dash
    {0x2016, 0x2225},                                      // the double vertical line
    {0x2212, 0xFF0D},                                      // minus
    {0x223C, 0x301C}, {0x223C, 0xFF5E}, {0x301C, 0xFF5E},  // the wave
    {0x2223, 0xFF5C},                                      // the vertical line
};

/// Whether the character is its decomposition in another shape that readers see as another sign.
bool is_sign_of_its_own(uint32_t unicode) {
  switch (u_getIntPropertyValue(static_cast<UChar32>(unicode), UCHAR_DECOMPOSITION_TYPE)) {
    case U_DT_CIRCLE:
    case U_DT_FONT:
    case U_DT_FRACTION:
    case U_DT_SQUARE:
    case U_DT_SUB:
    case U_DT_SUPER:
    case U_DT_VERTICAL:
      return true;
    default:
      return false;
  }
}

std::u16string compatibility_form(uint32_t unicode) {
  UErrorCode error = U_ZERO_ERROR;
  const UNormalizer2* normalizer = unorm2_getNFKCInstance(&error);
  UChar units[2];
  int32_t count = 0;
  U16_APPEND_UNSAFE(units, count, static_cast<UChar32>(unicode));
  return icu_text("NFKC", [&](UChar* out, int32_t room, UErrorCode* status) {
    return unorm2_normalize(normalizer, units, count, out, room, status);
  });
}

bool stands_alone(uint32_t unicode) {
  const int8_t category = u_charType(static_cast<UChar32>(unicode));
  return category == U_CONTROL_CHAR || category == U_PRIVATE_USE_CHAR || is_sign_of_its_own(unicode);
}

}  // namespace

bool is_same_sign(uint32_t unicode, uint32_t read) {
  if (unicode == read) return true;
  if (stands_alone(unicode) || stands_alone(read)) return false;
  if (compatibility_form(unicode) == compatibility_form(read)) return true;
  return std::any_of(std::begin(kValuesOfOneSign), std::end(kValuesOfOneSign), [&](const Pair& pair) {
    return (pair.first == unicode && pair.second == read) || (pair.first == read && pair.second == unicode);
  });
}

}  // namespace lexicor_import
