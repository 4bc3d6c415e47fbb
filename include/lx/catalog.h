/* Lexicor: message catalogs. */
#ifndef LX_CATALOG_H
#define LX_CATALOG_H

#include "lx/base.h"

#ifdef __cplusplus
extern "C" {
#endif

/* Flags of LXOpenCatalog; only all bits of one of them have its effect. LX_CATALOG_LOAD holds all bits of the
 * other one. */
#define LX_CATALOG_LOAD 0x80000061u       /* read the whole catalog into memory and close the file */
#define LX_CATALOG_ONE_LOCALE 0x80000060u /* expand templates for the given locale only */

/* The longest path that is looked for, in bytes with its null. */
enum { LX_CATALOG_PATH_BYTES = 4096 };

/* Finds and opens a catalog. `directory` (may be null), the value of the environment variable LX_NLSPATH (used
 * when it has at most 27 bytes) and `name` make a list of path templates, divided by ';'. In each
 *   %N  stands for the name,             %l  for LX_ITEM_LANGUAGE_ABBREVIATION of the locale,
 *   %L  for %l, '_' and %t,              %t  for LX_ITEM_TERRITORY_ABBREVIATION,
 *   %%  for one percent sign; '%' and any other character, ';' too, stand for themselves.
 * The first path that can be opened is the catalog: a template "/dir" is the file /dir, not one in it. What is
 * empty, or longer than LX_CATALOG_PATH_BYTES, is passed over. When nothing opens, the list is gone through
 * once more with the locale that LXGetLocale gives for an empty name with LX_FALLBACK.
 *
 * The bytes of the list are the path as they stand, and the characters of the syntax are ASCII bytes, whatever
 * the codepage; only %l, %t and %L bring in bytes of the locale's codepage. In EBCDIC they are no names that a
 * directory has: open the catalog with a locale of the same language and territory in an ASCII codepage, and
 * convert its messages.
 *
 * Messages come in the codepage of `locale`, which must outlive the catalog; with null, of the locale that is
 * the default when a message is fetched. Without LX_CATALOG_LOAD the file stays open, and its content is looked
 * at when messages are fetched.
 *
 * Both texts are null-terminated. Returns the catalog, to be closed with LXCloseCatalog, or null with last
 * error LX_E_INVALID (no name, other flags), LX_E_CATALOG (not found, too large, with LX_CATALOG_LOAD damaged,
 * or no memory to look for it or to make the locale of its texts), LX_E_MEMORY (none to keep it) or
 * LX_E_NOT_INITIALIZED. */
LX_API LXCatalog* LXOpenCatalog(LXLocale* locale, const char* directory, const char* name, uint32_t flags);
/* As LXOpenCatalog; the texts are null-terminated packed codes. Null with last error LX_E_CATALOG too when they
 * cannot be turned into bytes of the locale. */
LX_API LXCatalog* LXOpenCatalogW(LXLocale* locale, const LXWChar* directory, const LXWChar* name,
                                 uint32_t flags);
/* As LXOpenCatalogW; the texts are null-terminated 16-bit Unicode. The bytes that they become are the list:
 * what is ASCII in Unicode is EBCDIC in an EBCDIC locale, where LXOpenCatalogU hence finds no path that
 * LXOpenCatalog is given in ASCII. */
LX_API LXCatalog* LXOpenCatalogU(LXLocale* locale, const LXUChar* directory, const LXUChar* name,
                                 uint32_t flags);

/* Writes message `number` of `set`, or `default_text` (may be null) where the catalog has no such message, to
 * `output` of `size` bytes, cut at a whole character and null-terminated. A default text is null-terminated and
 * in the locale's codepage; it may stand in `output`. With a `size` below 1 one null is written all the same and
 * the result is LX_OK. Returns LX_OK, also for a message that was cut; LX_E_MESSAGE (no such message, no default
 * text; the output is empty), LX_E_CATALOG (the catalog cannot be read or is damaged, or memory is exhausted;
 * the output is empty), or LX_E_CATALOG_NULL (null catalog) or LX_E_NOT_INITIALIZED with nothing written. */
LX_API int32_t LXGetMessage(LXCatalog* catalog, uint32_t set, uint32_t number, char* output, int32_t size,
                            const char* default_text);
/* As LXGetMessage; `size` counts packed codes. The text goes through the locale's codepage, the default text,
 * of packed codes, too. */
LX_API int32_t LXGetMessageW(LXCatalog* catalog, uint32_t set, uint32_t number, LXWChar* output, int32_t size,
                             const LXWChar* default_text);
/* As LXGetMessageW; 16-bit Unicode, `size` counts units. */
LX_API int32_t LXGetMessageU(LXCatalog* catalog, uint32_t set, uint32_t number, LXUChar* output, int32_t size,
                             const LXUChar* default_text);

/* Closes a catalog; its locale may have been released before. Returns LX_OK, LX_E_CATALOG_NULL for null, or
 * LX_E_NOT_INITIALIZED, and then it is not touched. A free hook that fails is not reported. */
LX_API int32_t LXCloseCatalog(LXCatalog* catalog);

/* A block of `bytes` bytes from the allocation hook, to be freed with LXMcFree; null when the hook has none,
 * and before LXInit. */
LX_API void* LXMcMalloc(size_t bytes);

/* Hands a block to the free hook. Returns 1 when that succeeded, also for null, which is not handed to it; 0
 * when it failed, and before LXInit. */
LX_API int32_t LXMcFree(void* block);

/* A new block of `bytes` bytes that begins with the content of `block` (of `old_bytes` bytes; may be null), as
 * much as it holds; `block` is freed. Null, and `block` stays, when memory is exhausted, and before LXInit. */
LX_API void* LXMcRealloc(void* block, size_t old_bytes, size_t bytes);

/* Fills `bytes` bytes of a block with zeros. */
LX_API void LXMcSetZero(void* block, size_t bytes);

/* Copies `bytes` bytes between two blocks that do not overlap. */
LX_API void LXMcMemcpy(void* to, const void* from, size_t bytes);

/* The byte-order code of this machine, as a catalog bears it: 1 big-endian, 2 any other. */
LX_API uint32_t LXMcGetByteOrder(void);

#ifdef __cplusplus
}
#endif
#endif
