/* Lexicor: the operating system's names of locales, and what they mean here. */
#ifndef LX_NATIVE_H
#define LX_NATIVE_H

#include "lx/base.h"

#ifdef __cplusplus
extern "C" {
#endif

/* The functions of this header call the system's setlocale for the length of the call and restore what was set;
 * LXMapNativeLocale and LXEnumNativeLocales do not. They must not run while other threads depend on that
 * setting. With LX_LANG set, LXGetUserLocale does not touch it either. */

/* Writes the name of the user's locale to `buffer` of `size` bytes: the value of LX_LANG (not terminated when
 * it fills the buffer), or the locale that the environment asks for, mapped by LXMapNativeLocale. Returns 1 for
 * LX_LANG, 2 for the environment, 0 when the system's current locale could not be kept; nothing is then
 * written. `size` must be at least 8. */
LX_API int32_t LXGetUserLocale(char* buffer, int32_t size);

/* Writes the locale name for an operating-system name (exact, letter case included), cut to `size` bytes with
 * its null: language_territory.codepage@sort, or "Unknown" (8 bytes, whatever the size). A composite name, as
 * setlocale gives for mixed categories, takes the codepage of LC_CTYPE, the territory of LC_NUMERIC, the
 * language of LC_TIME and the sort of LC_COLLATE, each "Unknown" on its own. Returns `buffer`. */
LX_API char* LXMapNativeLocale(const char* native_name, char* buffer, int32_t size);

/* Copies the operating system's numeric and monetary conventions of a native locale (empty or null: the current
 * one) into `locale`: fraction digits, sign and symbol places, groupings and, where the codepages agree,
 * separators, currency symbol and signs. Changes nothing when the system does not know the name. The last error
 * becomes LX_OK or LX_E_MEMORY. */
LX_API void LXMapNativeInfo(const char* native_name, LXLocale* locale);

/* Creates a locale from an operating-system name, with the system's conventions as LXMapNativeInfo copies them.
 * Flags: LX_FALLBACK as for LXGetLocale, and 0x1, which changes nothing. Returns the locale, to be released
 * with LXReleaseLocale, or null with `*rc` (may be null) LX_E_INVALID (flags) or as for LXGetLocale; an unknown
 * name gives LX_E_NO_LANGUAGE. */
LX_API LXLocale* LXConvertNativeLocale(const char* native_name, int32_t flags, int32_t* rc);

/* Gets an operating-system name and the locale name that it maps to; 0 ends the enumeration. */
typedef int32_t (*LXNativeCallback)(void* user, const char* native_name, const char* locale_name);
/* Calls `callback` for every operating-system name known, in the order of the search, until it returns 0.
 * Returns LX_OK. */
LX_API int32_t LXEnumNativeLocales(LXNativeCallback callback, void* user);

#ifdef __cplusplus
}
#endif
#endif
