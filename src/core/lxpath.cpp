// Paths taken apart and joined, and the case-blind comparison of names.
#include "core/lxpath.h"

#include <ctype.h>
#include <string.h>

#include "core/lxtrace.h"
#include "lx.h"

using namespace lx;

namespace {

RAS1_Unit unit = RAS1_UNIT("lxpath");

constexpr size_t kDriveReach = 3;  // a ':' counts within this many bytes

size_t drive_bytes(const char* path) {
  for (size_t i = 0; i < kDriveReach && path[i] != '\0'; ++i)
    if (path[i] == ':') return i + 1;
  return 0;
}

/// The last component: what follows the last '/' after the drive.
const char* last_component(const char* path) {
  const char* rest = path + drive_bytes(path);
  const char* slash = strrchr(rest, '/');
  return slash != nullptr ? slash + 1 : rest;
}

bool is_dot_directory(const char* component) {
  return strcmp(component, ".") == 0 || strcmp(component, "..") == 0;
}

/// Stores a part that has room for `limit` bytes and a null; a longer one is empty.
int32_t store(char* out, const char* part, size_t bytes, size_t limit) {
  if (bytes > limit) bytes = 0;
  memcpy(out, part, bytes);
  out[bytes] = '\0';
  return static_cast<int32_t>(bytes);
}

}  // namespace

extern "C" {

int32_t SplitDrive(const char* path, char* drive) {
  return store(drive, path, drive_bytes(path), sizeof(PathParts::drive) - 1);
}

int32_t SplitDir(const char* path, char* directory) {
  const char* begin = path + drive_bytes(path);
  const char* end = last_component(path);
  if (is_dot_directory(end)) end += strlen(end);
  return store(directory, begin, static_cast<size_t>(end - begin), sizeof(PathParts::directory) - 1);
}

int32_t SplitFile(const char* path, char* file) {
  const char* name = last_component(path);
  if (is_dot_directory(name)) return store(file, name, 0, 0);
  const char* dot = strrchr(name, '.');
  const size_t bytes = dot != nullptr ? static_cast<size_t>(dot - name) : strlen(name);
  return store(file, name, bytes, sizeof(PathParts::file) - 1);
}

int32_t SplitExtent(const char* path, char* extension) {
  const char* dot = strrchr(path, '.');
  if (dot == nullptr) return store(extension, path, 0, 0);
  return store(extension, dot, strlen(dot), sizeof(PathParts::extension) - 1);
}

void SplitPath(const char* path, char* drive, char* directory, char* file, char* extension) {
  Events events(unit);
  drive[0] = directory[0] = file[0] = extension[0] = '\0';
  SplitDrive(path, drive);
  SplitDir(path, directory);
  SplitFile(path, file);
  SplitExtent(path, extension);
  LX_TRACE(unit, RAS1_LEVEL_DETAIL, "Original path: %s\n drive: %s\n directory: %s\n file: %s\n extent: %s",
           path, drive, directory, file, extension);
}

void MakePath(char* path, const char* drive, const char* directory, const char* file, const char* extension) {
  const char* const parts[] = {drive, directory, file, extension};
  for (const char* part : parts) {
    const size_t bytes = strlen(part);
    memcpy(path, part, bytes);
    path += bytes;
  }
  *path = '\0';
}

int32_t LXmemicmp(const void* first, const void* second, size_t bytes) {
  const unsigned char* a = static_cast<const unsigned char*>(first);
  const unsigned char* b = static_cast<const unsigned char*>(second);
  for (size_t i = 0; i < bytes; ++i) {
    if (a[i] == b[i]) continue;
    const int difference = tolower(a[i]) - tolower(b[i]);
    if (difference != 0) return difference;
  }
  return 0;
}

}  // extern "C"
