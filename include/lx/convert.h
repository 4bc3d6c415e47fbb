/* Lexicor: conversion between codepages and Unicode. */
#ifndef LX_CONVERT_H
#define LX_CONVERT_H

#include "lx/base.h"

#ifdef __cplusplus
extern "C" {
#endif

/* Opens a streaming conversion. Returns a handle, to be closed with LXCloseConversion, or null with LX_E_MEMORY
 * as the last error of the target locale. The two locales must outlive it. One thread at a time. */
LX_API LXConversion* LXOpenConversion(LXLocale* target, LXLocale* source);
/* Frees a conversion. Returns LX_OK, LX_E_FREE when the free hook fails, or LX_E_NOT_INITIALIZED. */
LX_API int32_t LXCloseConversion(LXConversion* conversion);

/* Converts from `*input` of `*input_left` bytes to `*output` of `*output_left` bytes; the four values are
 * advanced. A count below 0 is 0. Returns, and leaves as the target locale's last error,
 *   LX_OK             all input is consumed and nothing is pending;
 *   LX_E_OUTPUT_FULL  the output is full: call again with the rest of the input and fresh output;
 *   LX_E_INPUT_CUT    the input ended inside a character, whose bytes are kept: call again with more input;
 * or LX_E_NOT_INITIALIZED with nothing touched. The target's double-byte state is left open at the end.
 *
 * Give at least 8 bytes of output room a call: pending bytes are then taken at once. Of pending bytes that are
 * taken in several pieces, those that stay do not all move up, so that a character of three or more bytes that
 * is handed out one byte at a time comes out damaged. */
LX_API int32_t LXConvertBuffer(LXConversion* conversion, char** output, int32_t* output_left,
                               const char** input, int32_t* input_left);

/* The largest number of target bytes that one source character can become: size an output buffer as input bytes
 * times this, and 2 more for a Shift-In and a null. 1 between locales of one codepage, where damaged text and
 * characters beyond U+FFFF grow all the same, and when the library is not initialised. */
LX_API int32_t LXConversionRatio(LXLocale* target, LXLocale* source);

/* Whole strings. Common to the functions below:
 *  flags   0; LX_TERMINATE (a null is stored and counted, one unit of `size` is kept for it);
 *          LX_CHARACTERS (input length, output size and result count characters; the buffer must
 *          have room for their bytes).
 *  length  below 0: null-terminated. Without LX_TERMINATE a null is then stored and counted when all
 *          input was converted and there is room.
 *  result  what was written; -1 with last error LX_E_INVALID for other flags, with LX_CHARACTERS 0 where that
 *          is said; -1 when the library is not initialised.
 * A character that does not fit, or is cut by the end of the input, is not converted: conversion stops
 * before it. A length or size of 0 gives 0; with LX_TERMINATE and a size above 0 a null is stored. */

/* Bytes to bytes; size and length count bytes (characters with LX_CHARACTERS). The error is stored in the
 * target locale. Invalid flags with LX_CHARACTERS: 0. */
LX_API int32_t LXConvertString(LXLocale* target, char* output, int32_t size, LXLocale* source,
                               const char* input, int32_t length, int32_t flags);
/* As LXConvertString for shift-sensitive codepages on either side: both start in the states given. When a null
 * is stored in the double-byte state, a Shift-In goes before it (a character is taken back where there is no
 * room); without a null the state is left open. Shift bytes count as bytes, not as characters. */
LX_API int32_t LXConvertStringEx(LXLocale* target, char* output, LXShiftState target_state, int32_t size,
                                 LXLocale* source, const char* input, LXShiftState source_state, int32_t length,
                                 int32_t flags);
/* As LXConvertString; packed codes, size, length and result count codes. */
LX_API int32_t LXConvertStringW(LXLocale* target, LXWChar* output, int32_t size, LXLocale* source,
                                const LXWChar* input, int32_t length, int32_t flags);

/* Bytes to packed codes of one locale. Flags 0 or LX_CHARACTERS only, else -1 with last error LX_E_INVALID. A
 * length counts bytes, with LX_CHARACTERS characters; below 0: null-terminated, and the null is converted too.
 * Size and result count codes. */
LX_API int32_t LXMbToWide(LXLocale* locale, LXWChar* output, int32_t size, const char* input, int32_t length,
                          int32_t flags);
/* As LXMbToWide for a shift-sensitive codepage; the text begins in `state`. */
LX_API int32_t LXMbToWideEx(LXLocale* locale, LXWChar* output, int32_t size, const char* input,
                            LXShiftState state, int32_t length, int32_t flags);
/* Packed codes to bytes of one locale. Flags as for LXMbToWide. The length counts codes; below 0:
 * null-terminated, and the null is converted too. Size and result count bytes, with LX_CHARACTERS
 * characters. */
LX_API int32_t LXWideToMb(LXLocale* locale, char* output, int32_t size, const LXWChar* input, int32_t length,
                          int32_t flags);
/* As LXWideToMb for a shift-sensitive codepage; the output begins in `state`, shift bytes are written where
 * they are due, and the state is left open at the end. */
LX_API int32_t LXWideToMbEx(LXLocale* locale, char* output, LXShiftState state, int32_t size,
                            const LXWChar* input, int32_t length, int32_t flags);

/* Bytes to 16-bit Unicode; size and result count units. The length counts bytes, with LX_CHARACTERS, which
 * concerns nothing else, characters. */
LX_API int32_t LXStringToUnicode(LXUChar* output, int32_t size, LXLocale* locale, const char* input,
                                 int32_t length, int32_t flags);
/* As LXStringToUnicode; the input is packed codes, the length counts codes. LX_CHARACTERS changes nothing. */
LX_API int32_t LXStringToUnicodeW(LXUChar* output, int32_t size, LXLocale* locale, const LXWChar* input,
                                  int32_t length, int32_t flags);
/* As LXStringToUnicode for a shift-sensitive codepage; the input begins in `state`. */
LX_API int32_t LXStringToUnicodeEx(LXUChar* output, int32_t size, LXLocale* locale, const char* input,
                                   LXShiftState state, int32_t length, int32_t flags);

/* 16-bit Unicode to bytes; the length counts units. Size and result count bytes, with LX_CHARACTERS
 * characters. */
LX_API int32_t LXUnicodeToString(LXLocale* locale, char* output, int32_t size, const LXUChar* input,
                                 int32_t length, int32_t flags);
/* As LXUnicodeToString; the output is packed codes, size and result count codes. */
LX_API int32_t LXUnicodeToStringW(LXLocale* locale, LXWChar* output, int32_t size, const LXUChar* input,
                                  int32_t length, int32_t flags);
/* As LXUnicodeToString for a shift-sensitive codepage; the output begins in `state`, and ends as that of
 * LXConvertStringEx does. */
LX_API int32_t LXUnicodeToStringEx(LXLocale* locale, char* output, LXShiftState state, int32_t size,
                                   const LXUChar* input, int32_t length, int32_t flags);

/* Bytes of a loaded codepage object to 16-bit Unicode, without an output size: the caller gives room for one
 * unit a byte. `length` counts bytes; below 0: null-terminated. Walks shift bytes from the single-byte state
 * and stops at a null, which is not stored. Returns the units written, or -1 for an empty null-terminated input
 * and when the library is not initialised. */
LX_API int32_t LXCpStrToUnicode(const LXObject* codepage, const char* input, int32_t length, LXUChar* output);

/* 16-bit Unicode to bytes of a loaded codepage object, from `state` on, without an output size: the caller
 * gives room for the codepage's width, plus a shift byte, in bytes a unit. `length` counts units; below 0:
 * null-terminated. Shift bytes are written between characters, nothing more at the end, and no null. Returns
 * the bytes written; 0 when the library is not initialised. */
LX_API int32_t LXCpUnicodeToStr(const LXObject* codepage, const LXUChar* input, LXShiftState state,
                                int32_t length, char* output);

/* Bytes of the common codepage, the object with identifier 367, to 16-bit Unicode, byte by byte up to a null or
 * `length` bytes (below 0: null-terminated). A terminating null is always stored: the caller gives room for one
 * unit more. Returns the bytes consumed; -1 when there is no such codepage or the input is empty. */
LX_API int32_t LXComStrToUnicode(const char* input, int32_t length, LXUChar* output);

/* 16-bit Unicode to bytes of the common codepage, unit by unit up to a null or `length` units (below 0:
 * null-terminated). A terminating null is always stored: the caller gives room for one byte more than units.
 * Returns the units consumed; -1 when there is no such codepage or the input is empty. */
LX_API int32_t LXComUnicodeToStr(const LXUChar* input, int32_t length, char* output);

#ifdef __cplusplus
}
#endif
#endif
