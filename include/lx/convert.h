/* Lexicor: conversion between codepages and Unicode. */
#ifndef LX_CONVERT_H
#define LX_CONVERT_H

#include "lx/base.h"

#ifdef __cplusplus
extern "C" {
#endif

/* Nothing fails to convert: a character without a Unicode value becomes U+FFFD, and a Unicode value
 * that the target codepage lacks becomes its substitution byte.
 *
 * Streaming. LXOpenConversion returns a handle, to be closed with LXCloseConversion, or null (last
 * error of the target locale 20). The two locales must outlive it. One thread at a time. */
LX_API LXConversion* LXOpenConversion(LXLocale* target, LXLocale* source);
/* Returns 0, or 21 when the free hook fails. */
LX_API int32_t LXCloseConversion(LXConversion* conversion);

/* Converts from `*input` to `*output`; the four values are advanced, lengths are bytes. Returns
 *   0   all input is consumed and nothing is pending;
 *   52  the output is full and bytes are pending: call again with the same input and fresh output;
 *   53  the input ended inside a character, whose bytes are kept: call again with more input.
 * The target's double-byte state is left open at the end.
 *
 * Give at least 8 bytes of output room a call: pending bytes are then taken at once. Of pending bytes that
 * are taken in several pieces, those that stay do not all move up, so that a character of three or more
 * bytes that is handed out one byte at a time comes out damaged. */
LX_API int32_t LXConvertBuffer(LXConversion* conversion, char** output, int32_t* output_left,
                               const char** input, int32_t* input_left);

/* The largest number of target bytes that one source character can become: size an output buffer as
 * input bytes times this. */
LX_API int32_t LXConversionRatio(LXLocale* target, LXLocale* source);

/* Whole strings. Common to the functions below:
 *  flags   0; LX_TERMINATE (a null is stored and counted, one unit of `size` is kept for it);
 *          LX_CHARACTERS (input length, output size and result count characters; the buffer must
 *          have room for their bytes).
 *  length  below 0: null-terminated. Without LX_TERMINATE a null is then stored and counted when all
 *          input was converted and there is room.
 *  result  what was written; -1 for other flags (last error 2), in LX_CHARACTERS mode 0 where marked.
 * A character that does not fit, or is cut by the end of the input, is not converted: conversion stops
 * before it. A length or size of 0 gives 0; with LX_TERMINATE and a size above 0 a null is stored. */

/* Bytes to bytes. The error is stored in the target locale. Invalid flags in character mode: 0. */
LX_API int32_t LXConvertString(LXLocale* target, char* output, int32_t size, LXLocale* source,
                               const char* input, int32_t length, int32_t flags);
/* The same for shift-sensitive codepages on either side: both start in the states given. When a null
 * is stored in the double-byte state, a Shift-In goes before it (a character is taken back where
 * there is no room); without a null the state is left open. Shift bytes count as bytes, not as
 * characters. */
LX_API int32_t LXConvertStringEx(LXLocale* target, char* output, LXShiftState target_state, int32_t size,
                                 LXLocale* source, const char* input, LXShiftState source_state, int32_t length,
                                 int32_t flags);
/* The same for arrays of packed codes; size, length and result count codes. */
LX_API int32_t LXConvertStringW(LXLocale* target, LXWChar* output, int32_t size, LXLocale* source,
                                const LXWChar* input, int32_t length, int32_t flags);

/* Bytes to packed codes and back. Flags 0 or LX_CHARACTERS only, else -1 with last error 2. A negative
 * length converts the terminating null too. Size and result count codes in the first two functions;
 * bytes (characters with LX_CHARACTERS) in the last two. The Ex forms start in `state`; writing leaves
 * the state open at the end. */
LX_API int32_t LXMbToWide(LXLocale* locale, LXWChar* output, int32_t size, const char* input, int32_t length,
                          int32_t flags);
LX_API int32_t LXMbToWideEx(LXLocale* locale, LXWChar* output, int32_t size, const char* input,
                            LXShiftState state, int32_t length, int32_t flags);
LX_API int32_t LXWideToMb(LXLocale* locale, char* output, int32_t size, const LXWChar* input, int32_t length,
                          int32_t flags);
LX_API int32_t LXWideToMbEx(LXLocale* locale, char* output, LXShiftState state, int32_t size,
                            const LXWChar* input, int32_t length, int32_t flags);

/* To 16-bit Unicode; size and result count units. LX_CHARACTERS concerns the input length only. */
LX_API int32_t LXStringToUnicode(LXUChar* output, int32_t size, LXLocale* locale, const char* input,
                                 int32_t length, int32_t flags);
LX_API int32_t LXStringToUnicodeW(LXUChar* output, int32_t size, LXLocale* locale, const LXWChar* input,
                                  int32_t length, int32_t flags);
LX_API int32_t LXStringToUnicodeEx(LXUChar* output, int32_t size, LXLocale* locale, const char* input,
                                   LXShiftState state, int32_t length, int32_t flags);

/* From 16-bit Unicode; the length counts units. Ex ends as LXConvertStringEx does. */
LX_API int32_t LXUnicodeToString(LXLocale* locale, char* output, int32_t size, const LXUChar* input,
                                 int32_t length, int32_t flags);
LX_API int32_t LXUnicodeToStringW(LXLocale* locale, LXWChar* output, int32_t size, const LXUChar* input,
                                  int32_t length, int32_t flags);
LX_API int32_t LXUnicodeToStringEx(LXLocale* locale, char* output, LXShiftState state, int32_t size,
                                   const LXUChar* input, int32_t length, int32_t flags);

/* By codepage object, without an output size: the caller gives room for one unit a byte, or for the
 * codepage's width (plus a shift byte) in bytes a unit.
 * LXCpStrToUnicode walks shift bytes from the single-byte state, stops at a null, returns the units
 * written and -1 for an empty null-terminated input. LXCpUnicodeToStr writes shift bytes between
 * characters, nothing more at the end, and returns the bytes written. Neither stores a null. */
LX_API int32_t LXCpStrToUnicode(const LXObject* codepage, const char* input, int32_t length, LXUChar* output);
LX_API int32_t LXCpUnicodeToStr(const LXObject* codepage, const LXUChar* input, LXShiftState state,
                                int32_t length, char* output);

/* Through the common codepage, the object with identifier 367, unit by unit up to a null or the
 * length; a terminating null is always stored. Return the input units consumed; -1 when there is no
 * such codepage or the input is empty. */
LX_API int32_t LXComStrToUnicode(const char* input, int32_t length, LXUChar* output);
LX_API int32_t LXComUnicodeToStr(const LXUChar* input, int32_t length, char* output);

#ifdef __cplusplus
}
#endif
#endif
