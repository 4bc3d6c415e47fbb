/* Lexicor: locale handles. */
#ifndef LX_LOCALE_H
#define LX_LOCALE_H

#include "lx/base.h"

#ifdef __cplusplus
extern "C" {
#endif

/* Flags of LXGetLocale and LXSetLocale. */
enum {
  LX_USER_LOCALE = 0x2, /* ignore the name, take the user's locale */
  LX_FALLBACK = 0x4     /* a named object that is not found is replaced by a default */
};

/* Creates a locale by name: language, then optionally "_" and a territory, "." and a codepage, "@"
 * and a sort, each an object name in any case: English_UnitedStates.US-ASCII@BINARY. An empty
 * language is English; what is not named comes from the language's defaults. Returns the locale,
 * to be released with LXReleaseLocale, or null with `*rc` (may be null) 2, 11, 20, 30, 31, 32, 33
 * or 34. With LX_USER_LOCALE the name is that of LXGetUserLocale (32 when that fails); a locale that the
 * environment asked for also gets the system's conventions (LXMapNativeInfo). */
LX_API LXLocale* LXGetLocale(const char* name, int32_t flags, int32_t* rc);
/* As LXGetLocale; the name is null-terminated packed codes. */
LX_API LXLocale* LXGetLocaleW(const LXWChar* name, int32_t flags, int32_t* rc);
/* As LXGetLocale; the name is null-terminated 16-bit Unicode. */
LX_API LXLocale* LXGetLocaleU(const LXUChar* name, int32_t flags, int32_t* rc);

/* Releases a locale; a null handle is ignored. Returns 0, or 1 when a free hook failed or the library
 * is not initialised. Data objects stay loaded. */
LX_API int32_t LXReleaseLocale(LXLocale* locale);

/* Creates a locale as LXGetLocale and makes it the default that a null handle stands for; the
 * previous default is released. Returns 0, or the code of the failed creation. Takes no lock. */
LX_API int32_t LXSetLocale(const char* name, int32_t flags);
LX_API int32_t LXSetLocaleW(const LXWChar* name, int32_t flags);
LX_API int32_t LXSetLocaleU(const LXUChar* name, int32_t flags);

/* Writes the operating system's name of a locale, at most 11 bytes with its null, to `buffer`. The
 * only one known is "C": English, UnitedStates (840), US-ASCII (367), binary order. With LX_FALLBACK
 * the nearest name is written for any other locale. Returns 1, or 0 with last error 32 (no name) or
 * 2 (flags other than 0x1 and LX_FALLBACK). */
LX_API int32_t LXConvertLocale(LXLocale* locale, char* buffer, int32_t flags);

/* Calls `callback` for every object of the control file, languages first, then territories,
 * codepages and sorts, with its type and name, until it returns 0. Returns 0. */
typedef int32_t (*LXLocaleCallback)(void* user, int32_t type, const char* name);
typedef int32_t (*LXLocaleCallbackW)(void* user, int32_t type, const LXWChar* name);
typedef int32_t (*LXLocaleCallbackU)(void* user, int32_t type, const LXUChar* name);
LX_API int32_t LXEnumLocales(LXLocaleCallback callback, void* user);
LX_API int32_t LXEnumLocalesW(LXLocaleCallbackW callback, void* user);
LX_API int32_t LXEnumLocalesU(LXLocaleCallbackU callback, void* user);

#ifdef __cplusplus
}
#endif
#endif
