/* Lexicor: files opened through the allocation hooks, path parts and a case-blind comparison. */
#ifndef LX_FILE_H
#define LX_FILE_H

#include "lx/base.h"

#ifdef __cplusplus
extern "C" {
#endif

/* Open modes. */
enum { LX_READ = 0, LX_WRITE = 1, LX_READ_WRITE = 2 };

/* Origins of LXSeekFile. */
enum { LX_FROM_START = 10, LX_FROM_HERE = 11, LX_FROM_END = 12 };

/* Opens `path`. `context` is not used. In mode LX_WRITE an existing file is not touched until it is
 * closed: writes go to a temporary file beside it, named by its drive, directory and file name parts
 * (see SplitPath) followed by "tmp"; `no_temporary` other than 0 writes the file itself. Returns the
 * handle, or null with `*rc` 20, 1000, 1001 or 1. */
LX_API LXFile* LXOpenFile(int32_t context, const char* path, int32_t mode, int32_t no_temporary, int32_t* rc);

/* Closes the file and frees the handle. A temporary file replaces its target, or is removed when
 * `discard` is 1. Returns 0, -1 when closing failed, or 21 when the free hook failed; a target that could
 * not be replaced stays as it was and is reported in the trace only. */
LX_API int32_t LXCloseFile(LXFile* file, int32_t discard);

/* Reads up to `bytes` bytes into `buffer`. Returns the number read, 0 at the end of the file and on
 * failure; `*rc` is 0, 1002 (opened for writing) or 1003 (read error). */
LX_API int32_t LXReadFile(LXFile* file, void* buffer, int32_t bytes, int32_t* rc);

/* Moves the file position. Returns 0, or 1 on failure. Other origins count as LX_FROM_START. */
LX_API int32_t LXSeekFile(LXFile* file, int32_t offset, int32_t origin);

/* Reads exactly `bytes` bytes at `offset` into a new block. Returns the block, to be handed to
 * LXUnloadFile, or null with `*rc` 20, 1002 or 1003; a count of 0 gives null and code 0. */
LX_API void* LXLoadFile(LXFile* file, uint32_t offset, int32_t bytes, int32_t* rc);
LX_API int32_t LXUnloadFile(void* block);

/* The size of the file in bytes, or -1. A size above 2^31 - 1 gives -1 too. */
LX_API int32_t LXFileSize(LXFile* file);

/* Parts of a path; each function writes a null-terminated part and returns its length in bytes.
 *  drive      up to and with a ':' within the first three bytes       (buffer:   4 bytes)
 *  directory  up to and with the last '/', and a last component that
 *             is "." or ".."; empty when above 255 bytes              (buffer: 256 bytes)
 *  file       the last component up to its last '.'; empty when above
 *             14 bytes, and for "." and ".."                          (buffer:  15 bytes)
 *  extension  from the last '.' of the whole path, a dot in a directory
 *             included; empty when above 4 bytes                      (buffer:   5 bytes) */
LX_API int32_t SplitDrive(const char* path, char* drive);
LX_API int32_t SplitDir(const char* path, char* directory);
LX_API int32_t SplitFile(const char* path, char* file);
LX_API int32_t SplitExtent(const char* path, char* extension);
LX_API void SplitPath(const char* path, char* drive, char* directory, char* file, char* extension);

/* Joins the parts as they are into `path`, which must have room for all of them and a null. */
LX_API void MakePath(char* path, const char* drive, const char* directory, const char* file,
                     const char* extension);

/* Compares `bytes` bytes without regard to case (tolower): the difference of the first pair that
 * differs, or 0. */
LX_API int32_t LXmemicmp(const void* first, const void* second, size_t bytes);

#ifdef __cplusplus
}
#endif
#endif
