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

/* No character was read ahead of the next collation element. */
#define LX_NO_LOOK_AHEAD ((LXUChar)0xFFFF)

/* The weight sets of a 16-bit Unicode value in a loaded sort object: 0 (it is ignored), 1 or 2 (an expansion).
 * The first set is written unless 0 is returned, and so is its class; the second one only with 2. */
LX_API int32_t LXSortGetWeights(const LXObject* sort, LXUChar unicode, uint16_t* primary1, uint8_t* secondary1,
                                uint8_t* tertiary1, uint16_t* special1, uint16_t* primary2, uint8_t* secondary2,
                                uint8_t* tertiary2, uint16_t* special2, uint8_t* char_class);
/* The weights of a pair that sorts as one element: 1, or 0, with nothing written, when it is none. */
LX_API int32_t LXSortGetCombination(const LXObject* sort, LXUChar first, LXUChar second, uint16_t* primary,
                                    uint8_t* secondary, uint8_t* tertiary, uint16_t* special,
                                    uint8_t* char_class);

/* The weights of a text, one collation element a call. `*text` and `*remaining`, in bytes, not below 0, move
 * over what was read; start with `*counter` 0, which counts the characters consumed modulo 65,536 and so is the
 * position of a special weight, and with `*look_ahead` LX_NO_LOOK_AHEAD. A character that was read ahead,
 * because it might have made a pair, is kept there and counts 1 in `*remaining`: a text has ended when that is
 * 0. Returns the number of weight sets: 0 (an ignored character, or one that the end of the text cuts, which
 * ends the text; nothing is written), 1 (in `first`) or 2 (in both), with the class in `char_class`. 0 with
 * last error LX_E_INVALID in binary order, which has no weights: nothing moves. */
LX_API int32_t LXStrGetNextWeight(LXLocale* locale, const char** text, int32_t* remaining, uint16_t* counter,
                                  LXWeights* first, LXWeights* second, uint8_t* char_class,
                                  LXUChar* look_ahead);
/* As LXStrGetNextWeight in a shift-sensitive codepage: `*state` moves along. A shift byte that ends the text
 * goes with the character before it. */
LX_API int32_t LXStrGetNextWeightEx(LXLocale* locale, const char** text, LXShiftState* state,
                                    int32_t* remaining, uint16_t* counter, LXWeights* first, LXWeights* second,
                                    uint8_t* char_class, LXUChar* look_ahead);
/* As LXStrGetNextWeight; packed codes, `*remaining` counts codes. */
LX_API int32_t LXStrGetNextWeightW(LXLocale* locale, const LXWChar** text, int32_t* remaining,
                                   uint16_t* counter, LXWeights* first, LXWeights* second, uint8_t* char_class,
                                   LXUChar* look_ahead);
/* As LXStrGetNextWeight; 16-bit Unicode, `*remaining` counts units. */
LX_API int32_t LXStrGetNextWeightU(LXLocale* locale, const LXUChar** text, int32_t* remaining,
                                   uint16_t* counter, LXWeights* first, LXWeights* second, uint8_t* char_class,
                                   LXUChar* look_ahead);

/* Places a weight set into four levels that grow. A weight of 0 is none. Where the class has the level's bit
 * the weight is written at the end, which moves on, and the insert point moves to the new end; else the weights
 * from the insert point on make room for it there, and only the end moves. A special weight takes two places:
 * the position, then the weight. The caller sees that there is room. */
LX_API void LXStrInsertWeights(uint16_t primary, uint16_t** primary_insert, uint16_t** primary_end,
                               uint8_t secondary, uint8_t** secondary_insert, uint8_t** secondary_end,
                               uint8_t tertiary, uint8_t** tertiary_insert, uint8_t** tertiary_end,
                               uint16_t special, uint16_t** special_insert, uint16_t** special_end,
                               uint16_t position, uint8_t char_class);

/* Compares two strings by the locale's sort: below 0, 0 or above 0. Lengths count bytes, with LX_CHARACTERS
 * characters; below 0: null-terminated. `options` are those of LXStrcmp; with any, sort keys of those options
 * are compared, and LX_WIDTH_INSENSITIVE also ignores trailing blanks. In binary order the result is that of
 * LXStrcmp. 0 with last error LX_E_INVALID (options) or LX_E_MEMORY. */
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
 * one begins the other, order as LXStrcoll does. `length` counts bytes, with LX_CHARACTERS characters; below 0:
 * null-terminated. `options` are 0, LX_CASE_INSENSITIVE or LX_WIDTH_INSENSITIVE, and LX_CHARACTERS. Returns the
 * bytes of the whole key; when they do not fit `size` the output is not a key. An empty text has a key of 3
 * bytes (0 when `size` is 0). -1 with last error LX_E_INVALID (options) or LX_E_MEMORY. In binary order the key
 * is the text, with options folded: in the U and W forms units as the machine stores them, which are not in the
 * order of their bytes. */
LX_API int32_t LXStrxfrm(LXLocale* locale, uint8_t* output, int32_t size, const char* text, int32_t length,
                         uint32_t options);
/* As LXStrxfrm for a shift-sensitive codepage; the text begins in `state`. The key has no shift bytes but in
 * binary order without options, where it is the text as it stands. */
LX_API int32_t LXStrxfrmEx(LXLocale* locale, uint8_t* output, int32_t size, const char* text,
                           LXShiftState state, int32_t length, uint32_t options);
/* As LXStrxfrm; packed codes, `length` counts codes and `size` bytes. LX_CHARACTERS changes nothing. */
LX_API int32_t LXWcsxfrm(LXLocale* locale, uint8_t* output, int32_t size, const LXWChar* text, int32_t length,
                         uint32_t options);
/* As LXStrxfrm; 16-bit Unicode, `length` counts units and `size` bytes. Letters are folded to upper case.
 * LX_CHARACTERS changes nothing. */
LX_API int32_t LXStrxfrmU(LXLocale* locale, uint8_t* output, int32_t size, const LXUChar* text, int32_t length,
                          uint32_t options);
/* Writes the key of `count` 16-bit Unicode values under the locale's sort to `output` of `size` bytes, when it
 * fits. Returns the bytes of the whole key, or -1 with last error LX_E_INVALID (binary order, or a count below
 * 0) or LX_E_MEMORY. */
LX_API int32_t LXStrGenSortKey(LXLocale* locale, uint8_t* output, int32_t size, const LXUChar* text,
                               int32_t count);

#ifdef __cplusplus
}
#endif
#endif
