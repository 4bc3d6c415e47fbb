/* Lexicor: characters of a codepage: walking, counting, packing, types, Unicode values. */
#ifndef LX_CODEPAGE_H
#define LX_CODEPAGE_H

#include "lx/base.h"

#ifdef __cplusplus
extern "C" {
#endif

/* Selectors of the character types, and the bits of each. */
#define LX_CTYPE1 0x80000010u /* classification */
#define LX_CTYPE2 0x80000011u /* bidirectional category */
#define LX_CTYPE3 0x80000012u /* text properties */

enum {
  LX_C1_ALPHA = 0x001,
  LX_C1_UPPER = 0x002,
  LX_C1_LOWER = 0x004,
  LX_C1_DIGIT = 0x008,
  LX_C1_XDIGIT = 0x010,
  LX_C1_PUNCT = 0x020,
  LX_C1_SPACE = 0x040,
  LX_C1_BLANK = 0x080,
  LX_C1_CNTRL = 0x100,
  LX_C1_ASCII = 0x200
};
enum {
  LX_C2_NONE = 0x001,
  LX_C2_LEFT_TO_RIGHT = 0x002,
  LX_C2_RIGHT_TO_LEFT = 0x004,
  LX_C2_EUROPEAN_NUMBER = 0x008,
  LX_C2_EUROPEAN_SEPARATOR = 0x010,
  LX_C2_EUROPEAN_TERMINATOR = 0x020,
  LX_C2_ARABIC_NUMBER = 0x040,
  LX_C2_COMMON_SEPARATOR = 0x080,
  LX_C2_BLOCK_SEPARATOR = 0x100,
  LX_C2_SEGMENT_SEPARATOR = 0x200,
  LX_C2_WHITE_SPACE = 0x400,
  LX_C2_OTHER_NEUTRAL = 0x800
};
enum {
  LX_C3_NON_SPACING = 0x001,
  LX_C3_DIACRITIC = 0x002,
  LX_C3_VOWEL_MARK = 0x004,
  LX_C3_SYMBOL = 0x008,
  LX_C3_KATAKANA = 0x010,
  LX_C3_HIRAGANA = 0x020,
  LX_C3_HALF_WIDTH = 0x040,
  LX_C3_FULL_WIDTH = 0x080,
  LX_C3_IDEOGRAPH = 0x100,
  LX_C3_KASHIDA = 0x200
};

/* The identifier of UTF-8, whose conversion is computed. */
enum { LX_CODEPAGE_UTF8 = 57352 };

/* The functions of this header trust their pointers: text must be there, and whole characters must
 * be whole unless a function is said to stop before a cut one. A null locale is the default locale.
 * Those that take a locale leave LX_OK as its last error; without a locale they return 0 (or the pointer
 * they were given). The Ex forms are for shift-sensitive codepages; with any other codepage they do
 * what the plain form does, and an out state receives the state given. */

/* The packed code of the character at `text`; its length comes from its first byte. */
LX_API LXWChar LXGetChar(LXLocale* locale, const char* text);

/* As LXGetChar for the character that begins in `state`; a shift byte at `text` is passed and sets the state
 * first. */
LX_API LXWChar LXGetCharEx(LXLocale* locale, const char* text, LXShiftState state);

/* Stores a character, 1 to 4 bytes, and no null. Returns 0. */
LX_API int32_t LXPutChar(LXLocale* locale, char* text, LXWChar code);

/* As LXPutChar, behind a Shift-Out or Shift-In byte when `state` asks for it, so up to 5 bytes. A code above
 * 0xFF is double-byte. */
LX_API void LXPutCharEx(LXLocale* locale, char* text, LXShiftState state, LXWChar code);

/* The start of the character after the one at `text`, or of what follows the last one. */
LX_API char* LXNextChar(LXLocale* locale, const char* text);

/* As LXNextChar; a shift byte before the character at `text` and one behind it are passed too. `new_state`,
 * which may be null, receives the state there. `unused` is not used. */
LX_API char* LXNextCharEx(LXLocale* locale, const char* text, LXShiftState state, LXShiftState* new_state,
                          int32_t unused);

/* The start of the character before `current`, in a string that begins at `start`. In a multibyte codepage the
 * string is walked from there; in a single-byte one the result is `current` - 1, also at `start`. */
LX_API char* LXPrevChar(LXLocale* locale, const char* start, const char* current);

/* As LXPrevChar; `state` is that at `current`. Looks at the byte before `current` only, for a shift byte, and
 * never goes before `start`. `new_state`, which may be null, receives the state of the character. */
LX_API char* LXPrevCharEx(LXLocale* locale, const char* start, const char* current, LXShiftState state,
                          LXShiftState* new_state);

/* The number of whole characters in `bytes` bytes (below 0: null-terminated, without the null); one that the
 * end cuts is not counted. */
LX_API int32_t LXNumChars(LXLocale* locale, const char* text, int32_t bytes);

/* As LXNumChars; the text begins in `state`, and a shift byte before a character is not counted. */
LX_API int32_t LXNumCharsEx(LXLocale* locale, const char* text, LXShiftState state, int32_t bytes);

/* `text` moved over the whole characters of its first `length` bytes; with LX_CHARACTERS `length` counts
 * characters, and no end is looked for. `text` itself for a length of 0 or less. Other flags are ignored. */
LX_API char* LXMoveStringPointer(LXLocale* locale, const char* text, int32_t length, int32_t flags);

/* As LXMoveStringPointer; the text begins in `state`. `new_state`, which may be null, receives the state at the
 * place; in a shift-sensitive codepage it is not written for a length of 0 or less. */
LX_API char* LXMoveStringPointerEx(LXLocale* locale, const char* text, LXShiftState state, int32_t length,
                                   LXShiftState* new_state, int32_t flags);

/* How many bytes of the character at `text` stand before a null byte, at most the character's length by its
 * first byte; fewer means that it is cut short. */
LX_API int32_t LXValidChar(LXLocale* locale, const char* text);

/* As LXValidChar; the character's length is that of a character in `state`. */
LX_API int32_t LXValidCharEx(LXLocale* locale, const char* text, LXShiftState state);

/* The length in bytes of the character at `text`, by its first byte. */
LX_API int32_t LXByteLength(LXLocale* locale, const char* text);

/* The length in bytes of a packed code, 1 to 4. */
LX_API int32_t LXByteLengthW(LXLocale* locale, LXWChar code);

/* As LXByteLength by `state`, after the shift byte that may stand at `text` and is not counted. */
LX_API int32_t LXByteLengthEx(LXLocale* locale, const char* text, LXShiftState state);

/* As LXByteLengthW, without a locale: also when the library is not initialised. */
LX_API int32_t LXStrByteLength(LXWChar code);

/* Swaps the two bytes of every 16-bit unit of `bytes` bytes in place; an odd last byte stays. */
LX_API void LXStrBigEndian(char* buffer, int32_t bytes);

/* Sets a shift state to the start of a text. */
LX_API void LXInitState(LXLocale* locale, LXShiftState* state);

/* One field of the type word of the character at `text`: bits of LX_C1_..., LX_C2_... or LX_C3_... for the
 * selector LX_CTYPE1, LX_CTYPE2 or LX_CTYPE3. Any other selector gives the classification and leaves
 * LX_E_INVALID as the locale's last error. */
LX_API uint32_t LXGetCharType(LXLocale* locale, const char* text, uint32_t selector);

/* As LXGetCharType for a packed code. */
LX_API uint32_t LXGetCharTypeW(LXLocale* locale, LXWChar code, uint32_t selector);

/* As LXGetCharType for a 16-bit Unicode value, whatever the codepage. */
LX_API uint32_t LXGetCharTypeU(LXLocale* locale, LXUChar unicode, uint32_t selector);

/* As LXGetCharType for the character that begins in `state`; a shift byte at `text` is passed and sets the
 * state first. */
LX_API uint32_t LXGetCharTypeEx(LXLocale* locale, const char* text, LXShiftState state, uint32_t selector);

/* The functions below take a codepage object that is loaded. When the library is not initialised they touch
 * nothing and return null, 0, or 0xFFFD as a Unicode value; LXWToMb needs neither. */

/* The type record of the multibyte character at `text`: 8 bytes, little-endian: type word, case delta. It
 * belongs to the codepage. Null in a codepage without multibyte characters. */
LX_API const uint8_t* LXGetMbCtype(const LXObject* codepage, const char* text);

/* As LXGetMbCtype for a packed code of two or more bytes. */
LX_API const uint8_t* LXGetMbCtypeW(const LXObject* codepage, LXWChar code);

/* Packs the character at `text`: its length comes from its first byte. */
LX_API LXWChar LXMbToW(const LXObject* codepage, const char* text);

/* As LXMbToW; the length comes from `state`. A shift byte is a character like any other. */
LX_API LXWChar LXMbToWS(const LXObject* codepage, const char* text, LXShiftState state);

/* Stores a packed code's bytes (1 to 4) and returns their number; a zero byte behind the first one is
 * left out. */
LX_API int32_t LXWToMb(char* text, LXWChar code);

/* The Unicode value of the multibyte character at `text`, of two or more bytes; 0xFFFD when it has none. */
LX_API LXUChar LXCpMbToUnicode(const LXObject* codepage, const char* text);

/* As LXCpMbToUnicode for a packed code of two or more bytes. */
LX_API LXUChar LXCpMbToUnicodeW(const LXObject* codepage, LXWChar code);

/* Stores the character of a Unicode value, or the codepage's substitution byte, without shift bytes and without
 * a null. Returns the bytes stored, 1 to 4. */
LX_API int32_t LXCpUnicodeToChar(const LXObject* codepage, LXUChar unicode, char* text);

/* The packed code of the character of a Unicode value, or the codepage's substitution byte. */
LX_API LXWChar LXCpUnicodeToCharW(const LXObject* codepage, LXUChar unicode);

/* The bytes that `chars` characters take from `state` on, with the shift bytes before, between and right behind
 * them; no end is checked. */
LX_API int32_t LXCpStrCharToByteLen(const LXObject* codepage, const char* text, LXShiftState state,
                                    int32_t chars);

/* The whole characters in `bytes` bytes (below 0: null-terminated) from `state` on. */
LX_API int32_t LXCpStrByteToCharLen(const LXObject* codepage, const char* text, LXShiftState state,
                                    int32_t bytes);

/* A loaded language's special mapping of the character `first`, or of the pair `first` and `second` (0: one
 * character): selector 44 upper case, any other lower case. Returns the number of results, 0 when there is no
 * mapping and nothing is written. With 1, `result2` receives 0. */
LX_API int32_t LXLangGetSpecial(const LXObject* language, LXUChar first, LXUChar second, LXUChar* result1,
                                LXUChar* result2, int32_t selector);

/* Turns a version-1 codepage payload into a new version-2 block, and its multibyte-to-Unicode section into a
 * new section, which `*new_section` receives (null for a single-byte codepage). Lengths in bytes. Both blocks
 * come from the allocation hook and belong to the caller, who frees them with LXMcFree. Null, and null in
 * `*new_section`, when memory is exhausted or the payload is not one. */
LX_API void* LXCpV1toV2(const void* payload, int32_t payload_bytes, const void* section, int32_t section_bytes,
                        void** new_section);

#ifdef __cplusplus
}
#endif
#endif
