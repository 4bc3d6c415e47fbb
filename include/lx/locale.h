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

/* Creates a locale by name: language, then optionally "_" and a territory, "." and a codepage, "@" and a sort,
 * each an object name in any case: English_UnitedStates.US-ASCII@BINARY. An empty language is English; what is
 * not named comes from the language's defaults. `name` is null-terminated; null is an empty one. Returns the
 * locale, to be released with LXReleaseLocale, or null with `*rc` (may be null) LX_E_INVALID (flags),
 * LX_E_NOT_INITIALIZED, LX_E_MEMORY, LX_E_NO_LANGUAGE, LX_E_NO_TERRITORY, LX_E_NO_CODEPAGE, LX_E_NO_SORT or
 * LX_E_NO_NATIVE. With LX_USER_LOCALE the name is that of LXGetUserLocale (LX_E_NO_NATIVE when that fails); a
 * locale that the environment asked for also gets the system's conventions (LXMapNativeInfo). */
LX_API LXLocale* LXGetLocale(const char* name, int32_t flags, int32_t* rc);
/* As LXGetLocale; the name is null-terminated packed codes. */
LX_API LXLocale* LXGetLocaleW(const LXWChar* name, int32_t flags, int32_t* rc);
/* As LXGetLocale; the name is null-terminated 16-bit Unicode. */
LX_API LXLocale* LXGetLocaleU(const LXUChar* name, int32_t flags, int32_t* rc);

/* Releases a locale; a null handle is ignored. Returns 0, or 1 when a free hook failed or the library is not
 * initialised. Data objects stay loaded. */
LX_API int32_t LXReleaseLocale(LXLocale* locale);

/* Creates a locale as LXGetLocale and makes it the default that a null handle stands for; the previous default
 * is released. Returns LX_OK, or the code of the failed creation. Takes no lock. */
LX_API int32_t LXSetLocale(const char* name, int32_t flags);

/* As LXSetLocale; the name is null-terminated packed codes. */
LX_API int32_t LXSetLocaleW(const LXWChar* name, int32_t flags);

/* As LXSetLocale; the name is null-terminated 16-bit Unicode. */
LX_API int32_t LXSetLocaleU(const LXUChar* name, int32_t flags);

/* Writes the operating system's name of a locale, at most 11 bytes with its null, to `buffer`. The only one
 * known is "C": English, UnitedStates (840), US-ASCII (367), binary order. With LX_FALLBACK the nearest name is
 * written for any other locale. Returns 1, or 0 with last error LX_E_NO_NATIVE (no name) or LX_E_INVALID (flags
 * other than 0x1 and LX_FALLBACK); nothing is then written. */
LX_API int32_t LXConvertLocale(LXLocale* locale, char* buffer, int32_t flags);

/* The bytes of a digest. */
#define LX_DIGEST_BYTES 32

/* Writes a digest of one of the locale's four objects to `buffer` of `size` bytes. `type` is LX_LANGUAGE,
 * LX_TERRITORY, LX_CODEPAGE or LX_SORT. Returns LX_DIGEST_BYTES, or 0, with nothing written, and last error
 * LX_E_INVALID (type) or LX_E_SIZE (`size` below LX_DIGEST_BYTES); 0 also when there is no locale.
 *
 * A digest is the SHA-256 of an object's data as they are in use: it is equal as long as the data are, in every
 * process and with every word size, whatever file they come from. A program that stores what it made with a locale,
 * such as sort keys in an index, stores the digests beside it (of keys: those of the sort and of the codepage) and
 * makes it anew when they differ. Built-in objects have digests like any other. Binary order, which has no data, has
 * 32 zero bytes. Values that a caller has set in a locale have no part in it. The data are read as a whole: call it
 * once, not for each text. */
LX_API int32_t LXGetLocaleDigest(LXLocale* locale, int32_t type, uint8_t* buffer, int32_t size);

/* Gets the type and the null-terminated name of an object, valid during the call; 0 ends the enumeration. */
typedef int32_t (*LXLocaleCallback)(void* user, int32_t type, const char* name);
/* As LXLocaleCallback; the name is packed codes. */
typedef int32_t (*LXLocaleCallbackW)(void* user, int32_t type, const LXWChar* name);
/* As LXLocaleCallback; the name is 16-bit Unicode. */
typedef int32_t (*LXLocaleCallbackU)(void* user, int32_t type, const LXUChar* name);
/* Calls `callback` for every object of the control file, languages first, then territories, codepages and
 * sorts, until it returns 0. Returns LX_OK, also when the library is not initialised. */
LX_API int32_t LXEnumLocales(LXLocaleCallback callback, void* user);
/* As LXEnumLocales, with names of packed codes. */
LX_API int32_t LXEnumLocalesW(LXLocaleCallbackW callback, void* user);
/* As LXEnumLocales, with names of 16-bit Unicode. */
LX_API int32_t LXEnumLocalesU(LXLocaleCallbackU callback, void* user);

#ifdef __cplusplus
}
#endif
#endif
