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
 * Those that take a locale leave 0 as its last error; without a locale they return 0 (or the pointer
 * they were given). The Ex forms are for shift-sensitive codepages; with any other codepage they do
 * what the plain form does, and an out state receives the state given. */

/* The packed code of the character at `text`. Ex: a shift byte at `text` is skipped and sets the
 * state first. */
LX_API LXWChar LXGetChar(LXLocale* locale, const char* text);
LX_API LXWChar LXGetCharEx(LXLocale* locale, const char* text, LXShiftState state);

/* Stores a character, up to 4 bytes; Ex: a Shift-Out or Shift-In byte first when the state asks for
 * it, so up to 5 bytes. LXPutChar returns 0. */
LX_API int32_t LXPutChar(LXLocale* locale, char* text, LXWChar code);
LX_API void LXPutCharEx(LXLocale* locale, char* text, LXShiftState state, LXWChar code);

/* The start of the character after the one at `text`. Ex: shift bytes before and behind the character
 * are passed too; `unused` is not used. In these walks a null `new_state` is left out. */
LX_API char* LXNextChar(LXLocale* locale, const char* text);
LX_API char* LXNextCharEx(LXLocale* locale, const char* text, LXShiftState state, LXShiftState* new_state,
                          int32_t unused);

/* The start of the character before `current`, in a string that begins at `start`. Ex: looks at the
 * byte before `current` only, and never goes before `start`. */
LX_API char* LXPrevChar(LXLocale* locale, const char* start, const char* current);
LX_API char* LXPrevCharEx(LXLocale* locale, const char* start, const char* current, LXShiftState state,
                          LXShiftState* new_state);

/* The number of whole characters in `bytes` bytes (below 0: null-terminated); a character cut by the
 * end and shift bytes are not counted. */
LX_API int32_t LXNumChars(LXLocale* locale, const char* text, int32_t bytes);
LX_API int32_t LXNumCharsEx(LXLocale* locale, const char* text, LXShiftState state, int32_t bytes);

/* `text` moved over the whole characters of its first `length` bytes; with LX_CHARACTERS `length`
 * counts characters. */
LX_API char* LXMoveStringPointer(LXLocale* locale, const char* text, int32_t length, int32_t flags);
LX_API char* LXMoveStringPointerEx(LXLocale* locale, const char* text, LXShiftState state, int32_t length,
                                   LXShiftState* new_state, int32_t flags);

/* How many bytes of the character at `text` stand before a null byte, at most the character's length;
 * fewer means that it is cut short. */
LX_API int32_t LXValidChar(LXLocale* locale, const char* text);
LX_API int32_t LXValidCharEx(LXLocale* locale, const char* text, LXShiftState state);

/* The length in bytes of the character at `text` (by its first byte; Ex: by the state, after the shift
 * byte that may stand at `text`), and of a packed code. */
LX_API int32_t LXByteLength(LXLocale* locale, const char* text);
LX_API int32_t LXByteLengthW(LXLocale* locale, LXWChar code);
LX_API int32_t LXByteLengthEx(LXLocale* locale, const char* text, LXShiftState state);
LX_API int32_t LXStrByteLength(LXWChar code);

/* Swaps the two bytes of every 16-bit unit of `bytes` bytes in place; an odd last byte stays. */
LX_API void LXStrBigEndian(char* buffer, int32_t bytes);

/* Sets a shift state to the start of a text. */
LX_API void LXInitState(LXLocale* locale, LXShiftState* state);

/* One field of a character's type word: `selector` is LX_CTYPE1 to LX_CTYPE3. Any other selector gives
 * the classification and leaves 2 as the locale's last error. */
LX_API uint32_t LXGetCharType(LXLocale* locale, const char* text, uint32_t selector);
LX_API uint32_t LXGetCharTypeW(LXLocale* locale, LXWChar code, uint32_t selector);
LX_API uint32_t LXGetCharTypeU(LXLocale* locale, LXUChar unicode, uint32_t selector);
LX_API uint32_t LXGetCharTypeEx(LXLocale* locale, const char* text, LXShiftState state, uint32_t selector);

/* The functions below take a codepage object that is loaded. When the library is not initialised they touch
 * nothing and return null, 0, or 0xFFFD as a Unicode value. */

/* A multibyte character's type record: 8 bytes, little-endian: type word, case delta. Null in a
 * codepage without multibyte characters. */
LX_API const uint8_t* LXGetMbCtype(const LXObject* codepage, const char* text);
LX_API const uint8_t* LXGetMbCtypeW(const LXObject* codepage, LXWChar code);

/* Packs the character at `text`: its length comes from its first byte, or (S) from the state. */
LX_API LXWChar LXMbToW(const LXObject* codepage, const char* text);
LX_API LXWChar LXMbToWS(const LXObject* codepage, const char* text, LXShiftState state);

/* Stores a packed code's bytes (1 to 4) and returns their number; a zero byte behind the first one is
 * left out. */
LX_API int32_t LXWToMb(char* text, LXWChar code);

/* The Unicode value of a multibyte character of two or more bytes; 0xFFFD when it has none. */
LX_API LXUChar LXCpMbToUnicode(const LXObject* codepage, const char* text);
LX_API LXUChar LXCpMbToUnicodeW(const LXObject* codepage, LXWChar code);

/* The character of a Unicode value, or the codepage's substitution byte: stored (1 to 4 bytes, the
 * number is returned), or packed. */
LX_API int32_t LXCpUnicodeToChar(const LXObject* codepage, LXUChar unicode, char* text);
LX_API LXWChar LXCpUnicodeToCharW(const LXObject* codepage, LXUChar unicode);

/* The bytes that `chars` characters take, with the shift bytes before, between and right behind them;
 * no end is checked. And the whole characters in `bytes` bytes (below 0: null-terminated). */
LX_API int32_t LXCpStrCharToByteLen(const LXObject* codepage, const char* text, LXShiftState state,
                                    int32_t chars);
LX_API int32_t LXCpStrByteToCharLen(const LXObject* codepage, const char* text, LXShiftState state,
                                    int32_t bytes);

/* A language's special mapping of one character, or of a pair: selector 44 upper case, 45 lower case.
 * Returns the number of results written, 0 when there is no mapping. */
LX_API int32_t LXLangGetSpecial(const LXObject* language, LXUChar first, LXUChar second, LXUChar* result1,
                                LXUChar* result2, int32_t selector);

/* Turns a version-1 codepage payload into a new version-2 block, and its multibyte-to-Unicode section
 * into a new section (null for a single-byte codepage). Lengths in bytes. Both blocks come from the
 * allocation hook and belong to the caller. Null when memory is exhausted or the payload is not one. */
LX_API void* LXCpV1toV2(const void* payload, int32_t payload_bytes, const void* section, int32_t section_bytes,
                        void** new_section);

#ifdef __cplusplus
}
#endif
#endif
