// Files over the operating system's descriptors: handles and buffers from the allocation hooks, failures mapped
// to return codes, and existing files replaced only when the new content is complete.
#include "core/lxfile.h"

#include <errno.h>
#include <fcntl.h>
#include <stdio.h>
#include <string.h>
#include <sys/stat.h>
#include <unistd.h>

#include "core/lxmemory.h"
#include "core/lxpath.h"
#include "core/lxtrace.h"

using namespace lx;

namespace {

RAS1_Unit unit = RAS1_UNIT("lxfile");

constexpr mode_t kPermission = 0644;
constexpr const char* kTemporarySuffix = "tmp";

// The longest name that a handle's target and extension, or target and suffix, make up.
constexpr size_t kFullNameBytes = sizeof(LXFile::target) + sizeof(LXFile::extension);

int32_t code_of_errno() {
  switch (errno) {
    case ENOENT:
      return LX_E_FILE_NOT_FOUND;
    case EACCES:
      return LX_E_FILE_ACCESS;
    default:
      return LX_E_OPEN;
  }
}

/// Prepares a handle to write beside an existing file: its target name and extension are kept, `temporary_name`
/// is where to write. False when the name is too long to be kept.
bool use_temporary(LXFile* file, const char* path, char* temporary_name) {
  PathParts parts;
  SplitPath(path, parts.drive, parts.directory, parts.file, parts.extension);
  const size_t bytes = strlen(parts.drive) + strlen(parts.directory) + strlen(parts.file);
  if (bytes >= sizeof(file->target)) {
    errno = ENAMETOOLONG;
    return false;
  }
  MakePath(file->target, parts.drive, parts.directory, parts.file, "");
  strcpy(file->extension, parts.extension);
  MakePath(temporary_name, file->target, "", "", kTemporarySuffix);
  LX_TRACE(unit, RAS1_LEVEL_DETAIL, "Using temp file %s", temporary_name);
  file->temporary = 1;
  return true;
}

/// Creates the file, or the temporary one that stands for it. Descriptor 0 counts as a failure and -1 does not:
/// a handle on descriptor -1 comes back, and its first use fails.
bool create_for_writing(LXFile* file, const char* path, bool no_temporary) {
  char temporary_name[kFullNameBytes];
  const char* name = path;
  if (!no_temporary && access(path, F_OK) == 0) {
    if (!use_temporary(file, path, temporary_name)) return false;
    name = temporary_name;
  }
  file->write_only = 1;
  file->descriptor = creat(name, kPermission);
  if (file->descriptor == 0) close(0);  // nobody else would
  return file->descriptor != 0;
}

/// Moves the temporary file over its target.
void replace_target(const LXFile* file, const char* temporary_name) {
  char final_name[kFullNameBytes];
  MakePath(final_name, file->target, "", "", file->extension);
  LX_TRACE(unit, RAS1_LEVEL_DETAIL, "Renaming %s to %s", temporary_name, final_name);
  if (access(final_name, W_OK) != 0 || rename(temporary_name, final_name) != 0)
    LX_TRACE(unit, RAS1_LEVEL_ERRORS, "Close failed, rc = %d", errno);
}

/// Reads until `bytes` bytes are there or the file ends. The number read, or -1.
ssize_t read_fully(int descriptor, void* buffer, size_t bytes) {
  size_t got = 0;
  while (got < bytes) {
    const ssize_t n = read(descriptor, static_cast<char*>(buffer) + got, bytes - got);
    if (n < 0 && errno == EINTR) continue;
    if (n < 0) return -1;
    if (n == 0) break;
    got += static_cast<size_t>(n);
  }
  return static_cast<ssize_t>(got);
}

}  // namespace

namespace lx {

LXFile* open_for_reading(const char* path, int32_t* rc) {
  struct stat status;
  if (stat(path, &status) == 0 && S_ISFIFO(status.st_mode)) {
    *rc = LX_E_OPEN;
    return nullptr;
  }
  return LXOpenFile(globals.area->file_context, path, LX_READ, 0, rc);
}

}  // namespace lx

extern "C" {

LXFile* LXOpenFile(int32_t, const char* path, int32_t mode, int32_t no_temporary, int32_t* rc) {
  Events events(unit);
  *rc = LX_E_NOT_INITIALIZED;
  if (!files_usable()) return events.exit(static_cast<LXFile*>(nullptr));
  LX_TRACE(unit, RAS1_LEVEL_INPUT, "Opening file %s", path);
  *rc = LX_E_MEMORY;
  HookPtr<LXFile> file(static_cast<LXFile*>(hook_allocate_zeroed(sizeof(LXFile))));
  if (!file) return events.exit(static_cast<LXFile*>(nullptr));
  file->mode = static_cast<uint8_t>(mode);

  bool open_ok = false;
  errno = 0;
  if (mode == LX_WRITE) {
    open_ok = create_for_writing(file.get(), path, no_temporary != 0);
  } else if (mode == LX_READ || mode == LX_READ_WRITE) {
    file->descriptor = open(path, (mode == LX_READ ? O_RDONLY : O_RDWR) | O_CLOEXEC);
    open_ok = file->descriptor != -1;
  }
  *rc = open_ok ? LX_OK : code_of_errno();
  return events.exit(open_ok ? file.detach() : nullptr);
}

int32_t LXCloseFile(LXFile* file, int32_t discard) {
  Events events(unit);
  if (file == nullptr || !files_usable()) return events.exit(LX_E_INVALID);
  int32_t result = close(file->descriptor);
  if (file->temporary != 0) {
    char temporary_name[kFullNameBytes];
    MakePath(temporary_name, file->target, "", "", kTemporarySuffix);
    if (discard == 1)
      unlink(temporary_name);
    else
      replace_target(file, temporary_name);
  }
  if (!hook_free(file) && result == 0) result = LX_E_FREE;
  return events.exit(result);
}

int32_t LXReadFile(LXFile* file, void* buffer, int32_t bytes, int32_t* rc) {
  *rc = LX_E_FILE_MODE;
  if (file->write_only != 0) return 0;
  const ssize_t got = bytes > 0 ? read_fully(file->descriptor, buffer, static_cast<size_t>(bytes)) : 0;
  *rc = got < 0 ? LX_E_FILE_IO : LX_OK;
  return got < 0 ? 0 : static_cast<int32_t>(got);
}

int32_t LXSeekFile(LXFile* file, int32_t offset, int32_t origin) {
  const int whence = origin == LX_FROM_HERE ? SEEK_CUR : origin == LX_FROM_END ? SEEK_END : SEEK_SET;
  return lseek(file->descriptor, offset, whence) == -1 ? 1 : 0;
}

void* LXLoadFile(LXFile* file, uint32_t offset, int32_t bytes, int32_t* rc) {
  Events events(unit);
  void* const none = nullptr;
  *rc = LX_E_NOT_INITIALIZED;
  if (!files_usable()) return events.exit(none);
  *rc = LX_OK;
  if (bytes == 0) return events.exit(none);
  *rc = LX_E_FILE_MODE;
  if (file->write_only != 0) return events.exit(none);
  *rc = LX_E_FILE_IO;
  if (bytes < 0) return events.exit(none);
  HookPtr<void> block(hook_allocate(static_cast<size_t>(bytes)));
  if (!block) {
    *rc = LX_E_MEMORY;
    return events.exit(none);
  }
  if (lseek(file->descriptor, static_cast<off_t>(offset), SEEK_SET) == -1) return events.exit(none);
  if (read_fully(file->descriptor, block.get(), static_cast<size_t>(bytes)) != bytes) return events.exit(none);
  *rc = LX_OK;
  return events.exit(block.detach());
}

int32_t LXUnloadFile(void* block) {
  if (files_usable()) hook_free(block);
  return LX_OK;
}

int32_t LXFileSize(LXFile* file) {
  struct stat status;
  if (fstat(file->descriptor, &status) != 0 || status.st_size > INT32_MAX) return -1;
  return static_cast<int32_t>(status.st_size);
}

}  // extern "C"
