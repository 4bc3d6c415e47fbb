/* Lexicor: comparison of strings by code value. */
#ifndef LX_COMPARE_H
#define LX_COMPARE_H

#include "lx/base.h"

#ifdef __cplusplus
extern "C" {
#endif

/* Options of comparison and collation. */
#define LX_IGNORE_BLANKS 0x00200000u     /* blanks at the end do not count */
#define LX_CASE_INSENSITIVE 0x80000040u  /* letter case does not count */
#define LX_WIDTH_INSENSITIVE 0x80000041u /* full-width and half-width forms are equal; case counts */

/* Compares two strings by the values of their characters: below 0, 0 or above 0, a difference of bytes, of
 * characters' lengths or of the strings' lengths. Lengths count bytes, with LX_CHARACTERS characters; below 0:
 * null-terminated. A character that the length cuts does not count. Bits 0x80000000, 0x40 and 0x1 of `options`
 * in any other combination than LX_WIDTH_INSENSITIVE mean LX_CASE_INSENSITIVE. 0 with last error
 * LX_E_INVALID (another bit) or LX_E_MEMORY. */
LX_API int32_t LXStrcmp(LXLocale* locale, const char* text1, int32_t length1, const char* text2,
                        int32_t length2, uint32_t options);
/* As LXStrcmp for a shift-sensitive codepage, with the state that each text begins in. */
LX_API int32_t LXStrcmpEx(LXLocale* locale, const char* text1, LXShiftState state1, int32_t length1,
                          const char* text2, LXShiftState state2, int32_t length2, uint32_t options);
/* As LXStrcmp; packed codes, lengths count codes. Of the folding options only LX_CASE_INSENSITIVE is known. */
LX_API int32_t LXWcscmp(LXLocale* locale, const LXWChar* text1, int32_t length1, const LXWChar* text2,
                        int32_t length2, uint32_t options);
/* As LXStrcmp; 16-bit Unicode, lengths count units. With folding the result is +1 or -1, or a difference of
 * lengths; a difference of bytes where the language has special upper-case mappings. The blank that is ignored
 * is not U+0020: see the description of kept behaviour. */
LX_API int32_t LXStrcmpU(LXLocale* locale, const LXUChar* text1, int32_t length1, const LXUChar* text2,
                         int32_t length2, uint32_t options);

#ifdef __cplusplus
}
#endif
#endif
