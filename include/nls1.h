/* Lexicor: one locale for the process and one for each thread.
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

/* Creates a locale from identifiers (0: not given); the caller releases it with LXReleaseLocale. Null with
 * `*rc` (may be null) 1 (the process could not be initialised), 30, 31 or 34 (unknown identifier), or as for
 * LXGetLocale, which receives `flags`. */
LX_API LXLocale* NLS1_GetLocale(int32_t language_territory, int32_t codepage, int32_t flags, int32_t* rc);

/* Sets the process's default locale from identifiers. With NLS1_THREAD it is the thread's locale that is asked
 * for, and the result is 2: the flag is passed on to LXGetLocale, which does not know it. Use
 * NLS1_SetLocaleFromNative to set a thread's locale. Codes: 0, 11 (not initialised), or as for NLS1_GetLocale.
 */
LX_API int32_t NLS1_SetLocale(int32_t language_territory, int32_t codepage, int32_t flags);

/* Sets the thread's locale (NLS1_THREAD) and the process's default (NLS1_PROCESS) from an operating-system
 * name. The name that is built for the process begins with the territory: it is found only where a language has
 * that name, or with LX_FALLBACK, which gives English. Codes: 0, 11, or as for LXConvertNativeLocale. */
LX_API int32_t NLS1_SetLocaleFromNative(const char* native_name, int32_t flags);

/* Sets the operating system's locale for a category of setlocale: from identifiers, or from a locale (null: the
 * default). Codes: 0, 11 (not initialised), 32 (no such locale), or as for NLS1_GetLocale. */
LX_API int32_t NLS1_SetNativeLocale(int32_t language_territory, int32_t codepage, int32_t category,
                                    int32_t flags);
LX_API int32_t NLS1_SetNativeFromLocale(LXLocale* locale, int32_t category, int32_t flags);

/* LXConvertNativeLocale. */
LX_API LXLocale* NLS1_ConvertNativeLocale(const char* native_name, int32_t flags, int32_t* rc);

/* The identifier of the object of a name, or 0 with `*rc` (may be null) 11 or 37. A codepage's name may be an
 * alias. */
LX_API int32_t NLS1_GetLanguageId(const char* name, int32_t* rc);
LX_API int32_t NLS1_GetTerritoryId(const char* name, int32_t* rc);
LX_API int32_t NLS1_GetCodepageId(const char* name, int32_t* rc);
LX_API int32_t NLS1_GetSortId(const char* name, int32_t* rc);

/* Writes the name of the object of an identifier to `buffer` of `size` bytes. The first two also take a
 * language and a territory in one value. Codes: 0, 11, 37 (no such object), 40 (the name and its null do not
 * fit). */
LX_API int32_t NLS1_GetLanguageName(int32_t id, char* buffer, int32_t size);
LX_API int32_t NLS1_GetTerritoryName(int32_t id, char* buffer, int32_t size);
LX_API int32_t NLS1_GetCodepageName(int32_t id, char* buffer, int32_t size);
LX_API int32_t NLS1_GetSortName(int32_t id, char* buffer, int32_t size);

/* The functions of the same name in lx/item.h, except that item 14 is the identifier of the language's default
 * codepage. `source` is the flags argument there. */
LX_API int32_t NLS1_GetLocaleNumInfo(LXLocale* locale, int32_t item, int32_t source);
LX_API int32_t NLS1_SetLocaleNumInfo(LXLocale* locale, int32_t item, int32_t value);
LX_API int32_t NLS1_GetLocaleTextInfo(LXLocale* locale, int32_t item, char* buffer, int32_t size,
                                      int32_t flags);
LX_API int32_t NLS1_GetLocaleTextInfoW(LXLocale* locale, int32_t item, LXWChar* buffer, int32_t size,
                                       int32_t flags);
LX_API int32_t NLS1_GetLocaleTextInfoU(LXLocale* locale, int32_t item, LXUChar* buffer, int32_t size,
                                       int32_t flags);
LX_API int32_t NLS1_GetLocaleTextInfoEx(LXLocale* locale, int32_t item, char* buffer, LXShiftState state,
                                        int32_t size, int32_t flags);
LX_API int32_t NLS1_SetLocaleTextInfo(LXLocale* locale, int32_t item, const char* text, int32_t length,
                                      int32_t flags);
LX_API int32_t NLS1_SetLocaleTextInfoW(LXLocale* locale, int32_t item, const LXWChar* text, int32_t length,
                                       int32_t flags);
LX_API int32_t NLS1_SetLocaleTextInfoU(LXLocale* locale, int32_t item, const LXUChar* text, int32_t length,
                                       int32_t flags);
LX_API int32_t NLS1_SetLocaleTextInfoEx(LXLocale* locale, int32_t item, const char* text, LXShiftState state,
                                        int32_t length, int32_t flags);

/* Initialises the process. And the calling thread's locale, null when it could not be made; it belongs to the
 * thread's services: do not release it. */
LX_API void NLS1_PrivateFunction_GetProcessLocale(void);
LX_API LXLocale* NLS1_PrivateFunction_GetThreadLocale(void);

#ifdef __cplusplus
}
#endif
#endif
