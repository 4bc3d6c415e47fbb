/* Lexicor: the string family: concatenation, searching, copying, spans, tokens, truncation, by whole
 * characters.
 */
#ifndef LX_STRING_H
#define LX_STRING_H

#include "lx/base.h"
#include "lx/compare.h"

#ifdef __cplusplus
extern "C" {
#endif

/* Common to the functions of this header:
 *  lengths  bytes, with LX_CHARACTERS in `flags` characters; below 0: null-terminated. Sizes and results count
 *           the same. In the W forms all of them count codes, in the U forms 16-bit units.
 *  flags    0 or LX_CHARACTERS, and what a function lists; others leave LX_E_INVALID as the last error.
 *  Ex       for a shift-sensitive codepage: each text begins in the state given behind its pointer. Of the
 * shift bytes between two parts of a text, a Shift-In belongs to the part before it and a Shift-Out to the part
 * behind it. An out state may be null; it is written where the function returns a position. A character that
 * the end of its text cuts is neither copied nor found, and a part that is returned ends before it. A call
 * without an initialised library returns what it returns for invalid flags. */

/* Appends `length` bytes of `text` to the null-terminated string in `buffer` of `size` bytes, as many whole
 * characters as fit before a null, which is always stored. Returns the bytes that the string now takes with its
 * null: `size` or less; 0 with nothing done when there is no null in `size` bytes; -1 for invalid flags. With
 * LX_CHARACTERS `buffer` must have room for the bytes that `size` characters can take. */
LX_API int32_t LXStrcat(LXLocale* locale, char* buffer, int32_t size, const char* text, int32_t length,
                        uint32_t flags);
/* As LXStrcat. Shift bytes are written where they are due, and the string ends in the single-byte state, unless
 * it was in the other one before and leaves no room for a Shift-In. */
LX_API int32_t LXStrcatEx(LXLocale* locale, char* buffer, LXShiftState buffer_state, int32_t size,
                          const char* text, LXShiftState text_state, int32_t length, uint32_t flags);
/* As LXStrcat; packed codes, lengths and result count codes. */
LX_API int32_t LXWcscat(LXLocale* locale, LXWChar* buffer, int32_t size, const LXWChar* text, int32_t length,
                        uint32_t flags);
/* As LXStrcat; 16-bit Unicode, lengths and result count units. */
LX_API int32_t LXStrcatU(LXLocale* locale, LXUChar* buffer, int32_t size, const LXUChar* text, int32_t length,
                         uint32_t flags);

/* The first place of a character in a text, or null. `character` is its packed code; 0 finds the null that ends
 * a null-terminated text. */
LX_API char* LXStrchr(LXLocale* locale, const char* text, int32_t length, LXWChar character, uint32_t flags);
/* As LXStrchr. The place is behind the shift byte, and its state comes in `state`, which may be null. */
LX_API char* LXStrchrEx(LXLocale* locale, const char* text, LXShiftState text_state, int32_t length,
                        LXWChar character, LXShiftState* state, uint32_t flags);
/* As LXStrchr; packed codes, `length` counts codes. */
LX_API LXWChar* LXWcschr(LXLocale* locale, const LXWChar* text, int32_t length, LXWChar character,
                         uint32_t flags);
/* As LXStrchr; 16-bit Unicode, `length` counts units, and `character` is a 16-bit value. */
LX_API LXUChar* LXStrchrU(LXLocale* locale, const LXUChar* text, int32_t length, LXUChar character,
                          uint32_t flags);

/* Copies the whole characters of `text` that fit into `size` bytes. The null of a null-terminated text is
 * copied with it when it fits; no other one is stored. Returns the bytes copied; 0 when `length` is 0 or `size`
 * below 1; -1 for invalid flags. Source and destination may overlap. With LX_CHARACTERS `output` must have room
 * for the bytes that `size` characters can take. */
LX_API int32_t LXStrcpy(LXLocale* locale, char* output, int32_t size, const char* text, int32_t length,
                        uint32_t flags);
/* As LXStrcpy; the copy begins in the state of the text. `state` receives the one that it ends in. */
LX_API int32_t LXStrcpyEx(LXLocale* locale, char* output, int32_t size, const char* text,
                          LXShiftState text_state, int32_t length, LXShiftState* state, uint32_t flags);
/* As LXStrcpy; packed codes, lengths and result count codes. */
LX_API int32_t LXWcscpy(LXLocale* locale, LXWChar* output, int32_t size, const LXWChar* text, int32_t length,
                        uint32_t flags);
/* As LXStrcpy; 16-bit Unicode, lengths and result count units. */
LX_API int32_t LXStrcpyU(LXLocale* locale, LXUChar* output, int32_t size, const LXUChar* text, int32_t length,
                         uint32_t flags);

/* The codes before the zero that ends a string of packed codes: its characters. 0 without an initialised
 * library. LXNumChars (lx/codepage.h) counts those of a byte string. */
LX_API int32_t LXWcslen(LXLocale* locale, const LXWChar* text);

/* The 16-bit units before the null that ends a string. 0 without an initialised library. */
LX_API int32_t LXStrlenU(LXLocale* locale, const LXUChar* text);

/* How much of the beginning of a text consists of characters that are not in the set. A null ends the text,
 * also within its length, and so does a character with a null byte in it. Returns bytes, with LX_CHARACTERS
 * characters, or -1 for invalid flags. */
LX_API int32_t LXStrcspn(LXLocale* locale, const char* text, int32_t length, const char* set,
                         int32_t set_length, uint32_t flags);
/* As LXStrcspn; `state`, which may be null, receives the state behind those characters. */
LX_API int32_t LXStrcspnEx(LXLocale* locale, const char* text, LXShiftState text_state, int32_t length,
                           const char* set, LXShiftState set_state, int32_t set_length, LXShiftState* state,
                           uint32_t flags);
/* As LXStrcspn; packed codes, lengths and result count codes. */
LX_API int32_t LXWcscspn(LXLocale* locale, const LXWChar* text, int32_t length, const LXWChar* set,
                         int32_t set_length, uint32_t flags);
/* As LXStrcspn; 16-bit Unicode, lengths and result count units. */
LX_API int32_t LXStrcspnU(LXLocale* locale, const LXUChar* text, int32_t length, const LXUChar* set,
                          int32_t set_length, uint32_t flags);

/* As LXStrcspn, of characters that are in the set. */
LX_API int32_t LXStrspn(LXLocale* locale, const char* text, int32_t length, const char* set, int32_t set_length,
                        uint32_t flags);
/* As LXStrspn; `state`, which may be null, receives the state behind those characters. */
LX_API int32_t LXStrspnEx(LXLocale* locale, const char* text, LXShiftState text_state, int32_t length,
                          const char* set, LXShiftState set_state, int32_t set_length, LXShiftState* state,
                          uint32_t flags);
/* As LXStrspn; packed codes, lengths and result count codes. */
LX_API int32_t LXWcsspn(LXLocale* locale, const LXWChar* text, int32_t length, const LXWChar* set,
                        int32_t set_length, uint32_t flags);
/* As LXStrspn; 16-bit Unicode, lengths and result count units. */
LX_API int32_t LXStrspnU(LXLocale* locale, const LXUChar* text, int32_t length, const LXUChar* set,
                         int32_t set_length, uint32_t flags);

/* The first place of a substring in a text, or null; an empty substring stands at the start. `options` are
 * those of LXStrcmp but LX_IGNORE_BLANKS, and LX_CHARACTERS; with them as many characters as the substring has
 * are compared by LXStrcoll, from each one on that begins as the substring does; in a single-byte codepage as
 * many bytes by LXStrcmp, without regard to case only. A substring of more bytes than the text is not in it.
 * Null with last error LX_E_INVALID (options) or LX_E_MEMORY. */
LX_API char* LXStrstr(LXLocale* locale, const char* text, int32_t length, const char* part, int32_t part_length,
                      uint32_t options);
/* As LXStrstr. Characters are compared, not the shift bytes between them; the place is behind the shift byte,
 * and its state comes in `state`. */
LX_API char* LXStrstrEx(LXLocale* locale, const char* text, LXShiftState text_state, int32_t length,
                        const char* part, LXShiftState part_state, int32_t part_length, LXShiftState* state,
                        uint32_t options);
/* As LXStrstr; packed codes, lengths count codes. In a single-byte codepage too it compares by LXWcscoll. */
LX_API LXWChar* LXWcsstr(LXLocale* locale, const LXWChar* text, int32_t length, const LXWChar* part,
                         int32_t part_length, uint32_t options);
/* As LXStrstr; 16-bit Unicode, lengths count units. It compares by LXStrcollU. */
LX_API LXUChar* LXStrstrU(LXLocale* locale, const LXUChar* text, int32_t length, const LXUChar* part,
                          int32_t part_length, uint32_t options);

/* Takes the next token from a text: returns its start and ends it with nulls in place of the one character that
 * delimits it, of the characters of `set`. `*next` and `*length` receive the rest, to be passed back in; the
 * last token leaves null and 0, and is not ended where no delimiter stands. Null when nothing but delimiters is
 * left, or `text` is null, or for invalid flags; a text of length 0 is an empty token, such as a rest that is
 * half a character has with LX_CHARACTERS. Nothing is kept between calls. */
LX_API char* LXStrtok(LXLocale* locale, char* text, int32_t* length, const char* set, int32_t set_length,
                      char** next, uint32_t flags);
/* As LXStrtok; `*state` is that of the text, and receives that of the rest; `token_state` receives that of the
 * token. A Shift-Out before the delimiter is overwritten with it. A token that a double-byte delimiter ends in
 * the double-byte state has no Shift-In. */
LX_API char* LXStrtokEx(LXLocale* locale, char* text, LXShiftState* state, int32_t* length, const char* set,
                        LXShiftState set_state, int32_t set_length, char** next, LXShiftState* token_state,
                        uint32_t flags);
/* As LXStrtok; packed codes, lengths count codes. */
LX_API LXWChar* LXWcstok(LXLocale* locale, LXWChar* text, int32_t* length, const LXWChar* set,
                         int32_t set_length, LXWChar** next, uint32_t flags);
/* As LXStrtok; 16-bit Unicode, lengths count units. */
LX_API LXUChar* LXStrtokU(LXLocale* locale, LXUChar* text, int32_t* length, const LXUChar* set,
                          int32_t set_length, LXUChar** next, uint32_t flags);

/* Flags of truncation, beside LX_CHARACTERS. */
#define LX_DROP_BLANKS 0x00800000u                                  /* also drop the blanks at the end */
#define LX_DROP_FULL_BLANKS (LX_DROP_BLANKS | LX_WIDTH_INSENSITIVE) /* ... full-width blanks too */

/* Cuts the null-terminated string in `buffer` in place, at a whole character, so that it fits in `size` bytes
 * with its null; a size below 1 gives an empty string. Returns the bytes that it now takes with its null. Other
 * flags than these are ignored. With LX_CHARACTERS the null counts as a character. 0 without an initialised
 * library. In a multibyte codepage one single-byte character behind the blanks goes with them: see the
 * description of kept behaviour. */
LX_API int32_t LXTruncateString(LXLocale* locale, char* buffer, int32_t size, uint32_t flags);
/* As LXTruncateString. The string is cut behind a shift byte that fits, and its state is left open. */
LX_API int32_t LXTruncateStringEx(LXLocale* locale, char* buffer, LXShiftState state, int32_t size,
                                  uint32_t flags);

/* Ends a text: stores a Shift-In where a shift-sensitive codepage is in the double-byte state, and with
 * LX_TERMINATE a null. Returns the bytes stored (0 to 2), or -1 with last error LX_E_INVALID for other flags.
 */
LX_API int32_t LXTerminateStringEx(LXLocale* locale, char* output, LXShiftState state, uint32_t flags);

#ifdef __cplusplus
}
#endif
#endif
