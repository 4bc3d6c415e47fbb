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

/* Finds an object by type and name. `length` counts the name's bytes, with or without a terminator. Returns the
 * object and LX_OK in `*rc`, or null and a code: LX_E_NOT_FOUND, LX_E_NOT_INITIALIZED, or why its file could
 * not be loaded (LX_E_FILE_NOT_FOUND, LX_E_FILE_ACCESS, LX_E_FILE_IO, LX_E_OPEN, LX_E_CORRUPT, LX_E_MEMORY).
 * When the file could not be loaded but the built-in data of the type took its place, the object is returned
 * and the code says why. A sort named BINARY (any case) gives null and LX_OK. */
LX_API LXObject* LXGetObjFromName(LXObjManager* manager, int32_t type, const char* name, int32_t length,
                                  int32_t mode, int32_t* rc);

/* As LXGetObjFromName, with a name of packed codes; `length` counts codes. */
LX_API LXObject* LXGetObjFromNameW(LXObjManager* manager, int32_t type, const LXWChar* name, int32_t length,
                                   int32_t mode, int32_t* rc);

/* Finds an object by type and identifier; results as for LXGetObjFromName. Sort identifier 0 gives null and
 * LX_OK. For a type without entries the neighbouring entry is examined and returned when its identifier happens
 * to match: check the type of what comes back. */
LX_API LXObject* LXGetObjFromID(LXObjManager* manager, int32_t type, uint16_t id, int32_t mode, int32_t* rc);

/* The object name of the codepage that is known as `alias` (null-terminated, any case), or null. The name
 * belongs to the manager. */
LX_API const char* LXGetCodepageFromAlias(LXObjManager* manager, const char* alias);

/* Gets a codepage's object name and one of its aliases; 0 ends the enumeration. */
typedef int32_t (*LXAliasCallback)(void* user, const char* codepage, const char* alias);
/* Calls `callback` for every alias in file order, until it returns 0. Returns LX_OK, or
 * LX_E_NOT_INITIALIZED. */
LX_API int32_t LXEnumAliases(LXObjManager* manager, LXAliasCallback callback, void* user);

/* Creates a manager of its own for a directory, to be destroyed with LXTermObjManager. LXInit does this for the
 * library's manager; options are those of LXInit. `*rc` receives LX_OK, or why no control file could be used:
 * the manager then has the built-in objects, or with LX_NO_DEFAULTS none. Null with LX_E_MEMORY or
 * LX_E_NOT_INITIALIZED. */
LX_API LXObjManager* LXInitObjManager(const char* directory, uint32_t options, int32_t* rc);
/* Destroys a manager and unloads its objects. Returns LX_OK, LX_E_FREE or 1 when a free hook failed, or
 * LX_E_INVALID (null, which is not the library's own here, or the library is not initialised). */
LX_API int32_t LXTermObjManager(LXObjManager* manager);

/* Writes the name of the control file of `directory` with its null to `buffer` of `size` bytes. Returns
 * `buffer`, or null when the name does not fit: it needs the directory's bytes plus 13. */
LX_API char* LXGetControlFileName(const char* directory, char* buffer, int32_t size);

/* As LXGetControlFileName for an object's data file, which needs the directory's bytes plus 14. Null also for a
 * type that is none, and when the library is not initialised. That it does not fit is said on standard error. */
LX_API char* LXGetDataFileName(const char* directory, int32_t type, uint16_t id, char* buffer, int32_t size);

/* Writes a place to look for the locale directory, with its null, to `buffer` of `size` bytes. Selector 0: the
 * value of the environment variable LX_LOCALEDIR; returns its bytes with the null, -1 when not set, 0 when it
 * does not fit. Selector 1: the compiled-in default directory; returns 17, or 0 when `size` is below 17. */
LX_API int32_t LXGetDataLocation(char* buffer, int32_t size, int32_t selector);

#ifdef __cplusplus
}
#endif
#endif
