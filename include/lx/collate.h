/* Lexicor: collation by the weights of a locale's sort, and sort keys. */
#ifndef LX_COLLATE_H
#define LX_COLLATE_H

#include "lx/base.h"
#include "lx/compare.h"

#ifdef __cplusplus
extern "C" {
#endif

/* The weights of one collation element: primary, secondary, tertiary, and the special weight of characters that
 * count only where all else is equal. 0: no weight on that level. */
typedef struct LXWeights {
  uint16_t primary;
  uint8_t secondary;
  uint8_t tertiary;
  uint16_t special;
} LXWeights;

/* Bits of a character's class: whether its weight of a level is appended to those before it. A clear bit
 * inserts it ahead of the run of such weights, which reverses their order. */
enum { LX_APPEND_SPECIAL = 1, LX_APPEND_TERTIARY = 2, LX_APPEND_SECONDARY = 4, LX_APPEND_PRIMARY = 8 };

/* The weight sets of a 16-bit Unicode value in a loaded sort object: 0 (it is ignored), 1 (in `first`) or 2 (an
 * expansion, in both), and its class, which is written unless 0 is returned. */
LX_API int32_t LXSortGetWeights(const LXObject* sort, LXUChar unicode, LXWeights* first, LXWeights* second,
                                uint8_t* char_class);
/* The weights of a pair that sorts as one element: 1, or 0 when it is none. */
LX_API int32_t LXSortGetCombination(const LXObject* sort, LXUChar first, LXUChar second, LXWeights* weights,
                                    uint8_t* char_class);

/* Compares two strings by the locale's sort: below 0, 0 or above 0. Lengths count bytes, with LX_CHARACTERS
 * characters; below 0: null-terminated. `options` are those of LXStrcmp; with any, sort keys of those options
 * are compared, and LX_WIDTH_INSENSITIVE also ignores trailing blanks. In binary order the result is that of
 * LXStrcmp. 0 with last error 2 (options) or 20. */
LX_API int32_t LXStrcoll(LXLocale* locale, const char* text1, int32_t length1, const char* text2,
                         int32_t length2, uint32_t options);
/* As LXStrcoll for a shift-sensitive codepage, with the state that each text begins in. */
LX_API int32_t LXStrcollEx(LXLocale* locale, const char* text1, LXShiftState state1, int32_t length1,
                           const char* text2, LXShiftState state2, int32_t length2, uint32_t options);
/* As LXStrcoll; packed codes, lengths count codes. Trailing blanks are ignored with LX_IGNORE_BLANKS. */
LX_API int32_t LXWcscoll(LXLocale* locale, const LXWChar* text1, int32_t length1, const LXWChar* text2,
                         int32_t length2, uint32_t options);
/* As LXStrcoll; 16-bit Unicode, lengths count units. Trailing blanks are ignored with LX_IGNORE_BLANKS. */
LX_API int32_t LXStrcollU(LXLocale* locale, const LXUChar* text1, int32_t length1, const LXUChar* text2,
                          int32_t length2, uint32_t options);

/* Writes the sort key of a string to `output` of `size` bytes: keys compared as bytes, the shorter first where
 * one begins the other, order as LXStrcoll does. Lengths as for LXStrcoll; `options` 0, LX_CASE_INSENSITIVE or
 * LX_WIDTH_INSENSITIVE, and LX_CHARACTERS. Returns the bytes of the whole key; when they do not fit `size`
 * the output is not a key. An empty text has a key of 3 bytes (0 when `size` is 0). -1 with last error 2
 * (options) or 20. In binary order the key is the text, with options folded. */
LX_API int32_t LXStrxfrm(LXLocale* locale, uint8_t* output, int32_t size, const char* text, int32_t length,
                         uint32_t options);
LX_API int32_t LXStrxfrmEx(LXLocale* locale, uint8_t* output, int32_t size, const char* text,
                           LXShiftState state, int32_t length, uint32_t options);
LX_API int32_t LXWcsxfrm(LXLocale* locale, uint8_t* output, int32_t size, const LXWChar* text, int32_t length,
                         uint32_t options);
/* As LXStrxfrm, but letters are folded to upper case. */
LX_API int32_t LXStrxfrmU(LXLocale* locale, uint8_t* output, int32_t size, const LXUChar* text, int32_t length,
                          uint32_t options);
/* The key of `count` 16-bit Unicode values under the locale's sort object: its bytes, written when they fit, or
 * -1 without memory or in binary order. */
LX_API int32_t LXStrGenSortKey(LXLocale* locale, uint8_t* output, int32_t size, const LXUChar* text,
                               int32_t count);

#ifdef __cplusplus
}
#endif
#endif
