/* Lexicor: one locale for the process and one for each thread, and translation between codepages by number.
 *
 * These functions initialise the library on their first use; nobody need call LXInit. The process begins with
 * the user's locale as its default, and each thread with a locale of its own, made of the user's locale too. */
#ifndef NLS1_H
#define NLS1_H

#include "lx.h"

#ifdef __cplusplus
extern "C" {
#endif

/* A language and a territory in one argument: the language's identifier in the low 16 bits, the territory's in
 * the high 16 bits, each 0 when it is not given. The value is split by signed division: the high half of a
 * negative value comes out one too high when the low half is not 0. */
#define NLS1_LANGUAGE_TERRITORY(language, territory) \
  ((int32_t)((uint32_t)(uint16_t)(territory) << 16 | (uint16_t)(language)))

/* Flags beside LX_USER_LOCALE and LX_FALLBACK. */
#define NLS1_THREAD 0x40000000
#define NLS1_PROCESS ((int32_t)-0x7FFFFFFF - 1) /* bit 0x80000000 */

/* What NLS1_GetLocale says when the process could not be initialised; elsewhere that is LX_E_NOT_INITIALIZED. */
enum { NLS1_E_PROCESS = 1 };

/* Creates a locale from identifiers (0: not given); the caller releases it with LXReleaseLocale. `flags` are
 * those of LXGetLocale. Null with `*rc` (may be null) NLS1_E_PROCESS, LX_E_NO_CODEPAGE,
 * LX_E_NO_LANGUAGE or LX_E_NO_TERRITORY (unknown identifier), or as for LXGetLocale. */
LX_API LXLocale* NLS1_GetLocale(int32_t language_territory, int32_t codepage, int32_t flags, int32_t* rc);

/* Sets the process's default locale from identifiers. With NLS1_THREAD it is the thread's locale that is asked
 * for, and the result is LX_E_INVALID: the flag is passed on to LXGetLocale, which does not know it. Use
 * NLS1_SetLocaleFromNative to set a thread's locale. Other flags are ignored. Returns LX_OK,
 * LX_E_NOT_INITIALIZED, or as for NLS1_GetLocale. */
LX_API int32_t NLS1_SetLocale(int32_t language_territory, int32_t codepage, int32_t flags);

/* Sets the thread's locale (NLS1_THREAD) and the process's default (NLS1_PROCESS) from an operating-system
 * name. The name that is built for the process begins with the territory: it is found only where a language has
 * that name, or with LX_FALLBACK, which gives English. Returns LX_OK, LX_E_NOT_INITIALIZED, LX_E_MEMORY, or as
 * for LXConvertNativeLocale. */
LX_API int32_t NLS1_SetLocaleFromNative(const char* native_name, int32_t flags);

/* Sets the operating system's locale for a category of setlocale from identifiers. Returns LX_OK,
 * LX_E_NOT_INITIALIZED, LX_E_NO_NATIVE (no such locale), or as for NLS1_GetLocale. */
LX_API int32_t NLS1_SetNativeLocale(int32_t language_territory, int32_t codepage, int32_t category,
                                    int32_t flags);

/* As NLS1_SetNativeLocale from a locale (null: the default). Returns LX_OK, LX_E_NOT_INITIALIZED or
 * LX_E_NO_NATIVE. */
LX_API int32_t NLS1_SetNativeFromLocale(LXLocale* locale, int32_t category, int32_t flags);

/* LXConvertNativeLocale, which see; `*rc` (may be null) can also be LX_E_NOT_INITIALIZED. A null name is the
 * empty one. */
LX_API LXLocale* NLS1_ConvertNativeLocale(const char* native_name, int32_t flags, int32_t* rc);

/* The identifier of the language of a null-terminated name (any case), or 0 with `*rc` (may be null)
 * LX_E_NOT_INITIALIZED or LX_E_NOT_FOUND. */
LX_API int32_t NLS1_GetLanguageId(const char* name, int32_t* rc);
/* As NLS1_GetLanguageId for a territory. */
LX_API int32_t NLS1_GetTerritoryId(const char* name, int32_t* rc);
/* As NLS1_GetLanguageId for a codepage, whose name may be an alias. */
LX_API int32_t NLS1_GetCodepageId(const char* name, int32_t* rc);
/* As NLS1_GetLanguageId for a sort. BINARY gives 0 with `*rc` LX_OK. */
LX_API int32_t NLS1_GetSortId(const char* name, int32_t* rc);

/* Writes the name of the language of an identifier, or of a language and a territory in one value, with its
 * null to `buffer` of `size` bytes. Returns LX_OK, LX_E_NOT_INITIALIZED, LX_E_NOT_FOUND (no such object) or
 * LX_E_SIZE (the name and its null do not fit; nothing is written). */
LX_API int32_t NLS1_GetLanguageName(int32_t id, char* buffer, int32_t size);
/* As NLS1_GetLanguageName for the territory, also of a language and a territory in one value. */
LX_API int32_t NLS1_GetTerritoryName(int32_t id, char* buffer, int32_t size);
/* As NLS1_GetLanguageName for a codepage's identifier. */
LX_API int32_t NLS1_GetCodepageName(int32_t id, char* buffer, int32_t size);
/* As NLS1_GetLanguageName for a sort's identifier; 0, binary order, gives LX_OK and an empty name. */
LX_API int32_t NLS1_GetSortName(int32_t id, char* buffer, int32_t size);

/* LXGetLocaleNumInfo (lx/item.h), except that LX_ITEM_DEFAULT_CODEPAGE is the identifier of the language's
 * default codepage. `source` is the flags argument there. */
LX_API int32_t NLS1_GetLocaleNumInfo(LXLocale* locale, int32_t item, int32_t source);
/* LXSetLocaleNumInfo (lx/item.h). */
LX_API int32_t NLS1_SetLocaleNumInfo(LXLocale* locale, int32_t item, int32_t value);
/* LXGetLocaleTextInfo (lx/item.h). */
LX_API int32_t NLS1_GetLocaleTextInfo(LXLocale* locale, int32_t item, char* buffer, int32_t size,
                                      int32_t flags);
/* LXGetLocaleTextInfoW (lx/item.h). */
LX_API int32_t NLS1_GetLocaleTextInfoW(LXLocale* locale, int32_t item, LXWChar* buffer, int32_t size,
                                       int32_t flags);
/* LXGetLocaleTextInfoU (lx/item.h). */
LX_API int32_t NLS1_GetLocaleTextInfoU(LXLocale* locale, int32_t item, LXUChar* buffer, int32_t size,
                                       int32_t flags);
/* LXGetLocaleTextInfoEx (lx/item.h). */
LX_API int32_t NLS1_GetLocaleTextInfoEx(LXLocale* locale, int32_t item, char* buffer, LXShiftState state,
                                        int32_t size, int32_t flags);
/* LXSetLocaleTextInfo (lx/item.h). */
LX_API int32_t NLS1_SetLocaleTextInfo(LXLocale* locale, int32_t item, const char* text, int32_t length,
                                      int32_t flags);
/* LXSetLocaleTextInfoW (lx/item.h). */
LX_API int32_t NLS1_SetLocaleTextInfoW(LXLocale* locale, int32_t item, const LXWChar* text, int32_t length,
                                       int32_t flags);
/* LXSetLocaleTextInfoU (lx/item.h). */
LX_API int32_t NLS1_SetLocaleTextInfoU(LXLocale* locale, int32_t item, const LXUChar* text, int32_t length,
                                       int32_t flags);
/* LXSetLocaleTextInfoEx (lx/item.h). */
LX_API int32_t NLS1_SetLocaleTextInfoEx(LXLocale* locale, int32_t item, const char* text, LXShiftState state,
                                        int32_t length, int32_t flags);

/* Translation between codepages. */

/* The number of UTF-16, which is no object of the locale directory: an array of LXUChar in this machine's byte
 * order, one character a unit. */
#define NLS1_UTF16 1200

/* Flags of NLS1_TranslateString beside LX_TERMINATE and LX_CHARACTERS. */
#define NLS1_PAD 0x00400000         /* fill the rest of the output with blanks */
#define NLS1_DROP_BLANKS 0x00800000 /* blanks at the end of the input that do not fit are no error */

/* Translates a string from one codepage to another, both named by their identifiers or NLS1_UTF16, through
 * Unicode, in the single-byte state of a shift-sensitive codepage from the start.
 *
 *  output_size   of `output`, in bytes, also for UTF-16; with LX_CHARACTERS in characters, and the buffer must
 *                have room for their bytes, the shift bytes and a null. 0 and below: nothing is written.
 *  input_length  of `input`, in bytes, also for UTF-16; with LX_CHARACTERS in characters. Below 0:
 *                null-terminated (a null unit in UTF-16). A count of characters of a shift-sensitive codepage
 *                takes in the shift byte behind the last one: the byte there is looked at.
 *  consumed      may be null. The input bytes translated, with NLS1_DROP_BLANKS also those of the blanks that
 *                were dropped; with LX_CHARACTERS what the result is.
 *  flags         0 or a sum of
 *                  LX_TERMINATE      the output ends with a null (a null unit in UTF-16), for which room is
 *                                    kept, and which counts;
 *                  LX_CHARACTERS     input length, output size, `consumed` and result count characters;
 *                  NLS1_PAD          the output is filled up with blanks of the target, which count;
 *                  NLS1_DROP_BLANKS  when the output is full and only single-byte blanks are left of the
 *                                    input, it counts as translated.
 *  rc            may be null. LX_OK; LX_E_INVALID other flags; LX_E_NO_CODEPAGE the codepage's file is not
 *                there, or built-in data stand in for it; LX_E_NOT_FOUND no such codepage; LX_E_SIZE input is
 *                left over: it does not fit, or ends inside a character, or the output of UTF-16 has a size of
 *                1; or why a codepage could not be loaded, or LX_E_NOT_INITIALIZED.
 *
 * Returns the bytes written (characters with LX_CHARACTERS), or -1 with nothing written when a codepage cannot
 * be had, the flags are invalid, or the output of UTF-16 has a size of 1. With LX_E_SIZE what fits is written,
 * never half a character.
 *
 * Without LX_TERMINATE a null-terminated input still gives a null that counts, when all of it was translated
 * and there is room. An empty input of length 0 gives 0 and no padding; with LX_TERMINATE one null byte, also
 * in UTF-16. Output in a shift-sensitive codepage ends in the single-byte state: when it is full in the other
 * one, the last character is taken back for the shift byte, and still counts as consumed: give one byte more
 * than the text needs. The two buffers may not overlap; one of UTF-16 is aligned as LXUChar is. */
LX_API int32_t NLS1_TranslateString(int32_t target_codepage, int32_t source_codepage, void* output,
                                    int32_t output_size, const void* input, int32_t input_length,
                                    int32_t* consumed, int32_t flags, uint32_t* rc);

/* Initialises the process, when nothing has. */
LX_API void NLS1_PrivateFunction_GetProcessLocale(void);

/* The calling thread's locale, or null when it could not be made. It belongs to the thread's services: do not
 * release it. */
LX_API LXLocale* NLS1_PrivateFunction_GetThreadLocale(void);

#ifdef __cplusplus
}
#endif
#endif
