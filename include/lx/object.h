/* Lexicor: data objects and codepage aliases of a locale directory. */
#ifndef LX_OBJECT_H
#define LX_OBJECT_H

#include "lx/base.h"

#ifdef __cplusplus
extern "C" {
#endif

/* One record of the control file, 38 bytes. Every LXObject begins with one, so a
 * `const LXObject *` may be read as a `const LXObjDisk *`. */
typedef struct LXObjDisk {
  uint16_t id;   /* object identifier */
  uint8_t type;  /* LX_LANGUAGE to LX_SORT */
  uint8_t flags; /* private to the library */
  char name[34]; /* null-terminated; compared without regard to case */
} LXObjDisk;

/* Mode of the look-ups: return the entry without loading its data. Any other value loads it. */
enum { LX_FIND_AND_LOAD = 0, LX_FIND_ONLY = 1 };

/* In all functions of this header a null `manager` means the library's own, created by LXInit.
 * `rc` may not be null. Objects belong to their manager. */

/* Finds an object by type and name. `length` counts the name's bytes, with or without a terminator.
 * Returns the object and code 0, or null and a code: 37 not found, or why its file could not be
 * loaded. When the file could not be loaded but the built-in data of the type took its place, the
 * object is returned and the code says why. A sort named BINARY (any case) gives null and code 0. */
LX_API LXObject* LXGetObjFromName(LXObjManager* manager, int32_t type, const char* name, int32_t length,
                                  int32_t mode, int32_t* rc);

/* As LXGetObjFromName, with a name of packed codes; `length` counts codes. */
LX_API LXObject* LXGetObjFromNameW(LXObjManager* manager, int32_t type, const LXWChar* name, int32_t length,
                                   int32_t mode, int32_t* rc);

/* Finds an object by type and identifier; results as for LXGetObjFromName. Sort identifier 0 gives
 * null and code 0. For a type without entries the neighbouring entry is examined and returned when
 * its identifier happens to match: check the type of what comes back. */
LX_API LXObject* LXGetObjFromID(LXObjManager* manager, int32_t type, uint16_t id, int32_t mode, int32_t* rc);

/* The object name of the codepage that is known as `alias` (any case), or null. */
LX_API const char* LXGetCodepageFromAlias(LXObjManager* manager, const char* alias);

/* Calls `callback` for every alias in file order with the codepage's object name and the alias, until
 * it returns 0. Returns 0, or 11 when the library is not initialised. */
typedef int32_t (*LXAliasCallback)(void* user, const char* codepage, const char* alias);
LX_API int32_t LXEnumAliases(LXObjManager* manager, LXAliasCallback callback, void* user);

/* Creates and destroys a manager of its own for a directory. LXInit does this for the library's
 * manager; options and codes are those of LXInit, except that `rc` receives the reason itself when
 * no control file could be used. Null with code 20 when memory is exhausted, with 11 when the library
 * is not initialised. */
LX_API LXObjManager* LXInitObjManager(const char* directory, uint32_t options, int32_t* rc);
LX_API int32_t LXTermObjManager(LXObjManager* manager);

/* The name of the control file of `directory`, and of an object's data file, written to `buffer` of
 * `size` bytes. Returns `buffer`, or null when the name does not fit: the control file needs the
 * directory's bytes plus 13, a data file the directory's bytes plus 14. */
LX_API char* LXGetControlFileName(const char* directory, char* buffer, int32_t size);
LX_API char* LXGetDataFileName(const char* directory, int32_t type, uint16_t id, char* buffer, int32_t size);

/* A place to look for the locale directory. Selector 0: the environment variable LX_LOCALEDIR;
 * returns the bytes of its value with the terminator, -1 when not set, 0 when it does not fit.
 * Selector 1: the compiled-in default directory; returns 17, or 0 when `size` is below 17. */
LX_API int32_t LXGetDataLocation(char* buffer, int32_t size, int32_t selector);

#ifdef __cplusplus
}
#endif
#endif
