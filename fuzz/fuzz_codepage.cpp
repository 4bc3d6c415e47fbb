// Any bytes as the data file of a codepage: refused, or every function is safe with it.
#include <cstdlib>

#include "support/object_files.h"

namespace {

/// Every pair of bytes and every Unicode value, through the forms.
void exercise(LXLocale* locale) {
  static LXUChar units[0x10000];
  static char bytes[0x10000 * 5 + 8];
  for (unsigned first = 0; first < 0x100; ++first) {
    char text[256 * 4];
    for (unsigned i = 0; i < 256; ++i) {
      text[4 * i] = static_cast<char>(first);
      text[4 * i + 1] = static_cast<char>(i);
      text[4 * i + 2] = static_cast<char>(i + first);
      text[4 * i + 3] = static_cast<char>(i ^ first);
    }
    LXStringToUnicode(units, 0x10000, locale, text, sizeof(text), 0);
    LXStringToUnicodeEx(units, 0x10000, locale, text, LX_SHIFT_DOUBLE, sizeof(text), 0);
    LXNumChars(locale, text, sizeof(text));
    LXNumCharsEx(locale, text, LX_SHIFT_DOUBLE, sizeof(text));
    for (unsigned i = 0; i < 200; ++i) {
      LXGetCharType(locale, text + i, LX_CTYPE1);
      LXGetCharTypeEx(locale, text + i, LX_SHIFT_DOUBLE, LX_CTYPE2);
      LXGetCharTypeW(locale, first << 24 | i << 16 | i << 8 | first, LX_CTYPE3);
    }
  }
  for (unsigned u = 0; u < 0x10000; ++u) units[u] = static_cast<LXUChar>(u);
  LXUnicodeToString(locale, bytes, sizeof(bytes), units, 0x10000, LX_TERMINATE);
  LXUnicodeToStringEx(locale, bytes, LX_SHIFT_SINGLE, sizeof(bytes), units, 0x10000, LX_TERMINATE);
  static LXWChar codes[0x10000];
  LXUnicodeToStringW(locale, codes, 0x10000, units, 0x10000, 0);
  LXStringToUnicodeW(units, 0x10000, locale, codes, 0x10000, 0);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  static const lx::test::ScratchDirectory directory;
  directory.write_locale({{819, "Fuzz", {{}}}});
  directory.write("cp_00819.nls", {data, data + size});
  if (LXInit(directory.path().c_str(), nullptr, nullptr, nullptr, 0) != LX_OK) abort();
  int32_t rc = LX_OK;
  LXLocale* locale = LXGetLocale("English_UnitedStates.Fuzz", 0, &rc);
  if (locale == nullptr) abort();  // the built-in codepage takes the place of one that is refused
  exercise(locale);
  LXReleaseLocale(locale);
  if (LXTerm() != LX_OK) abort();
  return 0;
}
