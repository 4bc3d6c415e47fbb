// What looks up, walks and converts the characters of a codepage, called with bytes, codes and values of all kinds:
// once loading has accepted a codepage, none of it may leave the object's sections or read beyond a character.
#pragma once

#include <algorithm>
#include <string>
#include <vector>

#include "codepage/lxcodepage.h"
#include "locale/lxlocale.h"
#include "support/must.h"

namespace lx::test {

/// Looks up every `step`th pair of bytes, where it begins a character at the very end of a block, and such codes.
inline void look_up(LXLocale* locale, unsigned step) {
  const LXObject* const object = locale->codepage;
  const Codepage& cp = codepage_of(*object);
  std::vector<char> block(kMaxCharBytes), other(kMaxCharBytes);
  std::vector<char> followed(2 * kMaxCharBytes);  // a shift byte has its character behind it
  std::vector<LXUChar> units(kMaxCharBytes);
  for (unsigned pair = 0; pair <= 0xFFFF; pair += step) {
    const uint8_t first = static_cast<uint8_t>(pair >> 8);
    const size_t walk = cp.length(first) < 2 ? cp.width : cp.length(first);
    const int32_t bytes = static_cast<int32_t>(walk);
    char* const p = block.data() + kMaxCharBytes - walk;
    for (size_t i = 0; i < walk; ++i) p[i] = static_cast<char>(i == 0 ? first : pair * (2 * i - 1));
    std::copy(p, p + walk, followed.begin());
    LXGetCharType(locale, p, LX_CTYPE1);
    for (LXWChar code : {pair, LXWChar{first} << 24 | pair << 8 | first})
      LXGetCharTypeW(locale, code, LX_CTYPE3);
    LXStringToUnicode(units.data(), kMaxCharBytes, locale, p, bytes, 0);
    for (LXShiftState state : {LX_SHIFT_SINGLE, LX_SHIFT_DOUBLE}) {
      LXGetCharTypeEx(locale, followed.data(), state, LX_CTYPE2);
      LXStringToUnicodeEx(units.data(), kMaxCharBytes, locale, p, state, bytes, 0);
    }
    LXCpStrToUnicode(object, p, bytes, units.data());
    if (cp.width == 1) continue;
    LXCpMbToUnicode(object, p);
    LXCpMbCaseConv(object, p, other.data(), LX_C1_LOWER);
  }
}

/// Walks and converts a text of all bytes that ends anywhere, and the text of every `step`th Unicode value, in every
/// form.
inline void use_text(LXLocale* locale, unsigned step) {
  std::string all;
  for (int b = 0; b < 512; ++b) all.push_back(static_cast<char>(b < 256 ? b : 511 - b));
  std::vector<LXUChar> unicode(1100), values;
  std::vector<LXWChar> codes(0x10000);
  std::vector<char> out(0x10000 * (kMaxCharBytes + 1) + 1);
  const int32_t room = static_cast<int32_t>(out.size());
  for (size_t cut = 0; cut < kMaxCharBytes; ++cut) {
    const std::vector<char> text(all.begin(), all.end() - static_cast<ptrdiff_t>(cut));  // of its exact size
    const char *const data = text.data(), *const end = data + text.size();
    const int32_t bytes = static_cast<int32_t>(text.size());
    LXShiftState end_state = LX_SHIFT_SINGLE;
    must(LXMoveStringPointer(locale, data, bytes, 0) <= end, "a walk ends in the text");
    const int32_t units = LXStringToUnicode(unicode.data(), 1100, locale, data, bytes, 0);
    must(units >= 0 && units <= bytes, "a character has a byte");
    const int32_t wide = LXMbToWide(locale, codes.data(), 1100, data, bytes, 0);
    must(wide == LXNumChars(locale, data, bytes), "a code is a character");
    must(LXWideToMb(locale, out.data(), room, codes.data(), wide, 0) >= 0, "codes become bytes");
    for (LXShiftState state : {LX_SHIFT_SINGLE, LX_SHIFT_DOUBLE}) {
      must(LXMoveStringPointerEx(locale, data, state, bytes, &end_state, 0) <= end, "a walk ends in the text");
      must(LXMbToWideEx(locale, codes.data(), 1100, data, state, bytes, 0) >= 0, "bytes become codes");
      must(LXConvertStringEx(locale, out.data(), state, 300, locale, data, state, bytes, LX_TERMINATE) >= 0,
           "a text is converted");
    }
  }
  for (unsigned u = 0; u <= 0xFFFF; u += step) values.push_back(static_cast<LXUChar>(u));
  const int32_t count = static_cast<int32_t>(values.size());
  must(LXUnicodeToString(locale, out.data(), room, values.data(), count, 0) >= 0, "values become bytes");
  for (LXShiftState state : {LX_SHIFT_SINGLE, LX_SHIFT_DOUBLE})
    must(LXUnicodeToStringEx(locale, out.data(), state, room, values.data(), count, LX_TERMINATE) >= 0,
         "values become bytes");
  must(LXUnicodeToStringW(locale, codes.data(), count, values.data(), count, 0) == count,
       "values become codes");
  must(LXStringToUnicodeW(values.data(), count, locale, codes.data(), count, 0) == count,
       "codes become values");
}

}  // namespace lx::test
