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

/* Opens `path`. `context` is not used. In mode LX_WRITE an existing file is not touched until it is closed:
 * writes go to a temporary file beside it, named by its drive, directory and file name parts (see SplitPath)
 * followed by "tmp"; `no_temporary` other than 0 writes the file itself. Returns the handle, to be closed with
 * LXCloseFile, and LX_OK in `*rc`, or null with `*rc` LX_E_MEMORY, LX_E_FILE_NOT_FOUND, LX_E_FILE_ACCESS,
 * LX_E_OPEN (any other reason) or LX_E_NOT_INITIALIZED. */
LX_API LXFile* LXOpenFile(int32_t context, const char* path, int32_t mode, int32_t no_temporary, int32_t* rc);

/* Closes the file and frees the handle. A temporary file replaces its target, or is removed when `discard` is
 * 1. Returns LX_OK, -1 when closing failed, LX_E_FREE when the free hook failed, or LX_E_INVALID (null, or the
 * library is not initialised); a target that could not be replaced stays as it was and is reported in the trace
 * only. */
LX_API int32_t LXCloseFile(LXFile* file, int32_t discard);

/* Reads up to `bytes` bytes into `buffer`. Returns the number read, 0 at the end of the file, for a count of 0
 * or less and on failure; `*rc` is LX_OK, LX_E_FILE_MODE (opened for writing) or LX_E_FILE_IO (read error). */
LX_API int32_t LXReadFile(LXFile* file, void* buffer, int32_t bytes, int32_t* rc);

/* Moves the file position to `offset` bytes from an origin. Returns 0, or 1 on failure. Other origins count as
 * LX_FROM_START. */
LX_API int32_t LXSeekFile(LXFile* file, int32_t offset, int32_t origin);

/* Reads exactly `bytes` bytes at `offset` into a new block. Returns the block, to be handed to LXUnloadFile, or
 * null with `*rc` LX_E_MEMORY, LX_E_FILE_MODE, LX_E_FILE_IO (also for fewer bytes than asked for, and a count
 * below 0) or LX_E_NOT_INITIALIZED; a count of 0 gives null and LX_OK. */
LX_API void* LXLoadFile(LXFile* file, uint32_t offset, int32_t bytes, int32_t* rc);

/* Frees a block of LXLoadFile (null is ignored). Returns LX_OK, whatever the free hook does. */
LX_API int32_t LXUnloadFile(void* block);

/* The size of the file in bytes, or -1. A size above 2^31 - 1 gives -1 too. */
LX_API int32_t LXFileSize(LXFile* file);

/* Parts of a path. Each function writes a null-terminated part of a null-terminated path, and returns its
 * length in bytes without the null; a part that is not there is empty. */

/* The drive: up to and with a ':' within the first three bytes. Writes at most 4 bytes. */
LX_API int32_t SplitDrive(const char* path, char* drive);

/* The directory: what follows the drive up to and with the last '/', and a last component that is "." or "..".
 * Empty when above 255 bytes. Writes at most 256 bytes. */
LX_API int32_t SplitDir(const char* path, char* directory);

/* The file name: the last component up to its last '.'. Empty when above 14 bytes, and for "." and "..". Writes
 * at most 15 bytes. */
LX_API int32_t SplitFile(const char* path, char* file);

/* The extension: from the last '.' of the whole path on, a dot in a directory included. Empty when above 4
 * bytes. Writes at most 5 bytes. */
LX_API int32_t SplitExtent(const char* path, char* extension);

/* Writes all four parts, as the functions above do. */
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
