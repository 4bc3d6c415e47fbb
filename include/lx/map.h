/* Lexicor: mapping of text to upper and lower case, to full and half width, to ASCII digits. */
#ifndef LX_MAP_H
#define LX_MAP_H

#include "lx/base.h"

#ifdef __cplusplus
extern "C" {
#endif

/* Modes of LXMapString and its forms. LX_CHARACTERS may be added to any of them. */
#define LX_MAP_FULL_WIDTH 0x80000021u
#define LX_MAP_HALF_WIDTH 0x80000022u
#define LX_MAP_COPY 0x80000023u
#define LX_MAP_LOWER 0x80000024u        /* the language's special mappings first */
#define LX_MAP_UPPER 0x80000025u        /* the same */
#define LX_MAP_LOWER_SIMPLE 0x80002024u /* without the language's special mappings */
#define LX_MAP_UPPER_SIMPLE 0x80002025u /* the same */
#define LX_MAP_DIGITS 16u               /* decimal digits of any script to ASCII digits */

/* Single 16-bit Unicode values. The locale changes no result; its last error becomes LX_OK. */

/* The lower case of a value, or the value itself where it has none. */
LX_API LXUChar LXUnicodeToLower(LXLocale* locale, LXUChar unicode);
/* The upper case of a value, or the value itself where it has none. */
LX_API LXUChar LXUnicodeToUpper(LXLocale* locale, LXUChar unicode);
/* The full-width form of a half-width value, or the value itself where it has none. */
LX_API LXUChar LXUnicodeToH2F(LXLocale* locale, LXUChar unicode);
/* The half-width form of a full-width value, or the value itself where it has none. */
LX_API LXUChar LXUnicodeToF2H(LXLocale* locale, LXUChar unicode);

/* The other case of a packed code of two or more bytes of a loaded codepage, when its classification has a bit
 * of `mask`: LX_C1_UPPER to lower it, LX_C1_LOWER to raise it; else, and when the library is not initialised,
 * the code as it is. */
LX_API LXWChar LXCpMbCaseConvW(const LXObject* codepage, LXWChar code, uint32_t mask);

/* As LXCpMbCaseConvW for the multibyte character at `text`, whose length comes from its first byte. Stores it
 * at `output`, which may be `text`, and returns its bytes, at most 4; 0 when the library is not initialised. */
LX_API int32_t LXCpMbCaseConv(const LXObject* codepage, const char* text, char* output, uint32_t mask);

/* As LXCpMbCaseConv for a character of the codepage's width in the double-byte state. */
LX_API int32_t LXCpMbCaseConvS(const LXObject* codepage, const char* text, char* output, uint32_t mask);

/* The full-width form of a half-width packed code of two or more bytes of a loaded codepage. 0: none. */
LX_API LXWChar LXCpMbHalfToFullW(const LXObject* codepage, LXWChar code);

/* The half-width form of a full-width packed code of a loaded codepage. 0: none. */
LX_API LXWChar LXCpFullToHalfW(const LXObject* codepage, LXWChar code);

/* Maps `length` bytes of `input` (with LX_CHARACTERS characters; below 0: null-terminated, the null included)
 * into `output` of `size` bytes (characters), up to the first character that does not fit; a character without
 * a mapping is copied. A text may grow: sharp s becomes two letters. Returns the bytes (characters) written, or
 * -1 with last error LX_E_INVALID for a mode that is not listed above. With LX_CHARACTERS no more than 512
 * bytes are mapped. */
LX_API int32_t LXMapString(LXLocale* locale, char* output, int32_t size, const char* input, int32_t length,
                           uint32_t mode);
/* As LXMapString; packed codes, lengths and result count codes. */
LX_API int32_t LXMapStringW(LXLocale* locale, LXWChar* output, int32_t size, const LXWChar* input,
                            int32_t length, uint32_t mode);
/* As LXMapString; 16-bit Unicode, lengths and result count units. Mode 0 copies too. */
LX_API int32_t LXMapStringU(LXLocale* locale, LXUChar* output, int32_t size, const LXUChar* input,
                            int32_t length, uint32_t mode);
/* As LXMapString for a shift-sensitive codepage; input and output begin in the single-byte state, and shift
 * bytes are passed through. */
LX_API int32_t LXMapStringEx(LXLocale* locale, char* output, int32_t size, const char* input, int32_t length,
                             uint32_t mode);

#ifdef __cplusplus
}
#endif
#endif
