/* Lexicor: initialisation, version, allocation hooks, environment and errors. */
#ifndef LX_INIT_H
#define LX_INIT_H

#include "lx/base.h"

#ifdef __cplusplus
extern "C" {
#endif

/* Allocation hooks. `context` is the pointer given to LXInit. The allocation hook returns a block of
 * `bytes` bytes aligned for any type, or null. The free hook returns non-zero on success and 0 on
 * failure. Hooks may be called from any thread that uses the library. */
typedef void* (*LXAllocHook)(void* context, size_t bytes);
typedef int32_t (*LXFreeHook)(void* context, void* block);

/* Option of LXInit: never use the built-in objects. */
#define LX_NO_DEFAULTS 0x80000001u

/* Initialises the library, or counts one more use of it. The first call reads the control file of the locale
 * directory: `directory`, else the one named by the environment variable LX_LOCALEDIR, else the compiled-in
 * default directory. Null hooks mean malloc and free. A further call ignores all arguments and returns LX_OK.
 * The first call must return before other threads call the library.
 *
 * Returns LX_OK; LX_W_DEFAULTS when no control file could be used and the built-in objects are in force (with
 * LX_NO_DEFAULTS: no objects at all); LX_E_NOT_INITIALIZED when the object manager could not be created;
 * LX_E_MEMORY when there is no memory for the library's global area. After the last two the library is not
 * initialised. */
LX_API int32_t LXInit(const char* directory, LXAllocHook allocate, LXFreeHook release, void* context,
                      uint32_t options);

/* Undoes one LXInit. The last one releases the default locale and every loaded object; locale and conversion
 * handles that callers still hold are dead from then on. Returns LX_OK, the first other code of a release that
 * failed (LX_E_FREE, or 1), or LX_E_NOT_INITIALIZED. */
LX_API int32_t LXTerm(void);

/* The code that the last call left in `locale` (null: the default locale); LX_E_NOT_INITIALIZED when there is
 * none. */
LX_API int32_t LXGetError(const LXLocale* locale);

/* What a return code means, in English: a null-terminated text of ASCII, never null, that begins with a small letter
 * and has no full stop, so that it can stand in a message. It belongs to the library and stays the same. A code of
 * which nothing is known has a text too. Needs no initialised library. */
LX_API const char* LXGetErrorText(int32_t code);

/* The version of the library that a program runs with, as LX_VERSION_NUMBER counts it: that of the headers which it
 * was compiled with is LX_VERSION_NUMBER itself. `text`, which may be null, receives the version as text, LX_VERSION,
 * which belongs to the library. Needs no initialised library. */
LX_API uint32_t LXVersion(const char** text);

/* The default allocation hook: malloc. `context` is not used. */
LX_API void* LXDefAlloc(void* context, size_t bytes);

/* The default free hook: free. `context` is not used. Returns 1. */
LX_API int32_t LXDefFree(void* context, void* block);

/* Reads an environment variable. Returns 0 when it is not set, else the bytes of its value with the terminating
 * null; the value is copied only when that is not greater than `size` (bytes). */
LX_API int32_t LXGetEnv(const char* name, char* buffer, int32_t size);

#ifdef __cplusplus
}
#endif
#endif
