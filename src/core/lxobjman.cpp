// The object manager: reads the control file of a locale directory into an entry table and finds entries by
// type and name or identifier. Loading is lxobjload's work.
#include "core/lxobjman.h"

#include <stdio.h>
#include <string.h>

#include "core/lxalias.h"
#include "core/lxbytes.h"
#include "core/lxfile.h"
#include "core/lxformat.h"
#include "core/lxmemory.h"
#include "core/lxtrace.h"

using namespace lx;

namespace {

RAS1_Unit unit = RAS1_UNIT("lxobjman");

constexpr const char kDefaultDirectory[] = "/Tessarin/locale";
constexpr const char kDirectoryVariable[] = "LX_LOCALEDIR";
constexpr const char kBinarySort[] = "BINARY";
constexpr size_t kBinarySortBytes = sizeof(kBinarySort) - 1;
constexpr size_t kControlNameBytes = sizeof(LXObjManager::directory);
constexpr size_t kControlTailBytes = 13;  // "/control.nls" and the null
constexpr size_t kDataTailBytes = 14;     // "/cp_00001.nls" and the null

/// Tries the control file of one directory. `*rc`: 0, an open error, or 1003 when the name does not fit.
LXFile* try_control(LXObjManager* manager, const char* directory, char* name, int32_t* rc) {
  if (LXGetControlFileName(directory, name, kControlNameBytes) == nullptr) {
    *rc = LX_E_FILE_IO;
    return nullptr;
  }
  LXFile* file = open_for_reading(name, rc);
  if (file != nullptr) strcpy(manager->directory, directory);
  return file;
}

/// Whether the search for a control file goes on after this code.
bool search_goes_on(int32_t rc) {
  return rc != LX_E_FILE_IO && rc != LX_E_MEMORY;
}

/// Opens the first control file there is: the given directory's, that of LX_LOCALEDIR, the default one.
LXFile* find_control(LXObjManager* manager, const char* directory, int32_t* rc) {
  char name[kControlNameBytes];
  *rc = LX_E_FILE_IO;
  if (directory != nullptr) {
    LXFile* file = try_control(manager, directory, name, rc);
    if (file != nullptr) return file;
    if (*rc == LX_E_FILE_IO) {
      LX_TRACE(unit, RAS1_LEVEL_ERRORS, "Unable to construct control file name in directory %s", directory);
      LX_TRACE(unit, RAS1_LEVEL_ERRORS, "control size = %d", static_cast<int>(kControlNameBytes));
    } else {
      LX_TRACE(unit, RAS1_LEVEL_ERRORS, "Unable to open %s, err = %d", name, *rc);
    }
    if (!search_goes_on(*rc)) return nullptr;
  }
  char from_environment[sizeof(LXObjManager::directory)];
  const int32_t found = LXGetDataLocation(from_environment, sizeof(from_environment), 0);
  if (found == 0) {
    *rc = LX_E_FILE_IO;
    return nullptr;
  }
  if (found > 0) {
    LXFile* file = try_control(manager, from_environment, name, rc);
    if (file != nullptr || !search_goes_on(*rc)) return file;
  }
  return try_control(manager, kDefaultDirectory, name, rc);
}

/// Reads the records of an open control file into a new block. `*bytes` receives its size; null with a code, or
/// with code 0 when the table is empty.
uint8_t* read_records(LXFile* file, size_t* bytes, int32_t* rc) {
  HookPtr<uint8_t> block(static_cast<uint8_t*>(LXLoadFile(file, 0, format::kHeaderBytes, rc)));
  if (!block) return nullptr;
  const format::Header header = format::Header::read(block.get());
  if (header.magic != format::kMagic) {
    LX_TRACE(unit, RAS1_LEVEL_ERRORS, "Control file header is corrupted");
    *rc = LX_E_CORRUPT;
    return nullptr;
  }
  const int size = header.section[0].bytes;
  const int32_t offset = static_cast<int32_t>(header.section[0].offset);
  *bytes = static_cast<size_t>(size);
  if (size == 0) return nullptr;
  HookPtr<uint8_t> records(static_cast<uint8_t*>(hook_allocate(static_cast<size_t>(size))));
  if (!records) {
    LX_TRACE(unit, RAS1_LEVEL_ERRORS, "Unable to allocate %d bytes for control data", size);
    *rc = LX_E_MEMORY;
    return nullptr;
  }
  if (LXSeekFile(file, offset, LX_FROM_START) != 0) {
    LX_TRACE(unit, RAS1_LEVEL_ERRORS, "Seek to offset %d failed for file %p", offset, static_cast<void*>(file));
    *rc = LX_E_FILE_IO;
    return nullptr;
  }
  if (LXReadFile(file, records.get(), size, rc) != size) {
    if (*rc == LX_OK) *rc = LX_E_FILE_IO;
    LX_TRACE(unit, RAS1_LEVEL_ERRORS, "Read of %d bytes from file %p failed with error %d", size,
             static_cast<void*>(file), *rc);
    return nullptr;
  }
  return records.detach();
}

/// Fills the entry table and the type ranges. Types without entries get the index of the next type that has
/// some. A record of an unknown type stands in a range of another one, where look-ups by name pass it over.
void fill_entries(LXObjManager* manager, const uint8_t* records) {
  LX_TRACE(unit, RAS1_LEVEL_DETAIL, "LXObjDisk size = %d", static_cast<int>(format::ControlRecord::kBytes));
  size_t next_type = 0;
  for (uint16_t i = 0; i < manager->count; ++i) {
    const auto record = format::ControlRecord::read(records + i * format::ControlRecord::kBytes);
    LXObjDisk* disk = &manager->entries[i].disk;
    disk->id = record.id;
    disk->type = record.type;
    memcpy(disk->name, record.name, sizeof(disk->name));
    disk->name[sizeof(disk->name) - 1] = '\0';
    LX_TRACE(unit, RAS1_LEVEL_DETAIL, "Entry = %d, Object Type = %d, Object Id = %d, Object Name = %s", i,
             disk->type, disk->id, disk->name);
    while (next_type <= disk->type && next_type < format::kTypes) manager->first[next_type++] = i;
  }
  while (next_type < format::kTypes) manager->first[next_type++] = manager->count;
}

/// Reads the control file and the aliases into the manager.
int32_t read_directory(LXObjManager* manager, const char* directory) {
  int32_t rc = LX_OK;
  LXFile* file = find_control(manager, directory, &rc);
  if (file == nullptr) {
    LX_TRACE(unit, RAS1_LEVEL_ERRORS, "Unable to open control file");
    return rc;
  }
  FileCloser closer(file);
  size_t bytes = 0;
  HookPtr<uint8_t> records(read_records(file, &bytes, &rc));
  if (rc != LX_OK) return rc;
  const size_t count = bytes / format::ControlRecord::kBytes;
  const size_t table_bytes = (count != 0 ? count : 1) * sizeof(LXObject);
  manager->entries = static_cast<LXObject*>(hook_allocate_zeroed(table_bytes));
  if (manager->entries == nullptr) {
    LX_TRACE(unit, RAS1_LEVEL_ERRORS, "Unable to allocate %d bytes for control data",
             static_cast<int>(table_bytes));
    return LX_E_MEMORY;
  }
  manager->count = static_cast<uint16_t>(count);
  fill_entries(manager, records.get());
  if (!LXBuildAliasList(manager))
    LX_TRACE(unit, RAS1_LEVEL_ERRORS, "Alias list build failed. No aliases supported");
  return LX_OK;
}

/// The half-open range of a type's entries; empty for an unknown type.
struct Range {
  uint16_t begin;
  uint16_t end;
};
Range range_of(const LXObjManager* manager, int32_t type) {
  if (type < 0 || static_cast<size_t>(type) >= format::kTypes) return {0, 0};
  const size_t t = static_cast<size_t>(type);
  return {manager->first[t], t + 1 < format::kTypes ? manager->first[t + 1] : manager->count};
}

/// The name's length may or may not count its terminator.
bool name_matches(const LXObjDisk& disk, const char* name, int32_t length) {
  const int32_t bytes = static_cast<int32_t>(strlen(disk.name));
  if (bytes != length && bytes != length - 1) return false;
  return LXmemicmp(disk.name, name, static_cast<size_t>(length)) == 0;
}

bool is_binary_sort(int32_t type, const char* name, int32_t length) {
  const int32_t bytes = static_cast<int32_t>(kBinarySortBytes);
  return type == LX_SORT && (length == bytes || length == bytes + 1) &&
         LXmemicmp(kBinarySort, name, static_cast<size_t>(length)) == 0;
}

/// In a control file that is not grouped by type a range holds entries of other types too; they do not match.
LXObject* find_by_name(const LXObjManager* manager, int32_t type, const char* name, int32_t length) {
  const Range range = range_of(manager, type);
  for (uint16_t i = range.begin; i < range.end; ++i)
    if (manager->entries[i].disk.type == type && name_matches(manager->entries[i].disk, name, length))
      return &manager->entries[i];
  return nullptr;
}

/// Binary search. For a type without entries the entry examined is the one before its range, or the first of
/// the table, and it is returned when its identifier matches: callers that rely on the type check it.
LXObject* find_by_id(const LXObjManager* manager, int32_t type, uint16_t id) {
  if (manager->count == 0) return nullptr;
  const Range range = range_of(manager, type);
  unsigned low = range.begin;
  unsigned high = range.end != 0 ? range.end - 1u : 0;
  while (low < high) {
    const unsigned mid = (low + high) / 2;
    if (id <= manager->entries[mid].disk.id)
      high = mid;
    else
      low = mid + 1;
  }
  LXObject* entry = &manager->entries[high];
  return entry->disk.id == id ? entry : nullptr;
}

/// What a look-up hands out: the entry found, loaded unless it is only to be found.
LXObject* deliver(LXObjManager* manager, LXObject* entry, int32_t mode, int32_t* rc) {
  *rc = entry != nullptr ? LX_OK : LX_E_NOT_FOUND;
  if (entry == nullptr || mode == LX_FIND_ONLY) return entry;
  if (__atomic_load_n(&entry->section[0], __ATOMIC_ACQUIRE) != nullptr) return entry;
  return LXLoadObj(manager, entry, rc);
}

/// Releases a manager's memory: 0, or 1 when a free hook failed.
int32_t free_manager(LXObjManager* manager) {
  const bool entries_freed = hook_free(manager->entries);
  const bool manager_freed = hook_free(manager);
  return entries_freed && manager_freed ? LX_OK : 1;
}

}  // namespace

namespace lx {

LXObjManager* create_manager(const char* directory, uint32_t options, int32_t* rc) {
  Events events(unit);
  if (directory != nullptr)
    LX_TRACE(unit, RAS1_LEVEL_INPUT, "directory = %s.", directory);
  else
    LX_TRACE(unit, RAS1_LEVEL_INPUT, "No directory specified");
  LX_TRACE(unit, RAS1_LEVEL_INPUT, "options = %d", static_cast<int>(options));
  LXObjManager* const none = nullptr;
  LXObjManager* manager = static_cast<LXObjManager*>(hook_allocate_zeroed(sizeof(LXObjManager)));
  if (manager == nullptr) {
    LX_TRACE(unit, RAS1_LEVEL_ERRORS, "Unable to allocate %d bytes for object manager",
             static_cast<int>(sizeof(LXObjManager)));
    *rc = LX_E_MEMORY;
    return events.exit(none);
  }
  manager->no_fallback = options == LX_NO_DEFAULTS;
  *rc = read_directory(manager, directory);
  if (*rc == LX_OK) return events.exit(manager);
  if (*rc != LX_E_MEMORY && manager->no_fallback == 0 && !LXLoadDefaults(manager)) *rc = LX_E_MEMORY;
  if (*rc == LX_E_MEMORY) {
    free_manager(manager);
    return events.exit(none);
  }
  return events.exit(manager);
}

LXObject* object_by_id(int32_t type, uint16_t id, int32_t* rc) {
  LXObject* entry = LXGetObjFromID(nullptr, type, id, LX_FIND_ONLY, rc);
  if (entry == nullptr) return nullptr;
  return deliver(globals.area->manager, entry->disk.type == type ? entry : nullptr, LX_FIND_AND_LOAD, rc);
}

}  // namespace lx

extern "C" {

LXObjManager* LXInitObjManager(const char* directory, uint32_t options, int32_t* rc) {
  *rc = LX_E_NOT_INITIALIZED;
  return initialized() ? create_manager(directory, options, rc) : nullptr;
}

int32_t LXTermObjManager(LXObjManager* manager) {
  Events events(unit);
  if (manager == nullptr || !initialized()) return events.exit(LX_E_INVALID);
  LXDestroyAliasList(manager);
  int32_t result = LX_OK;
  for (uint16_t i = 0; i < manager->count; ++i) {
    LXObject* entry = &manager->entries[i];
    if (entry->section[0] == nullptr || (entry->disk.flags & kObjectBuiltIn) != 0) continue;
    const int32_t rc = LXUnloadObj(manager, entry);
    if (result == LX_OK) result = rc;
  }
  const int32_t rc = free_manager(manager);
  return events.exit(result != LX_OK ? result : rc);
}

LXObject* LXGetObjFromName(LXObjManager* given, int32_t type, const char* name, int32_t length, int32_t mode,
                           int32_t* rc) {
  Events events(unit);
  LXObject* const none = nullptr;
  *rc = LX_E_NOT_INITIALIZED;
  LXObjManager* manager = manager_of(given);
  if (manager == nullptr) return events.exit(none);
  LX_TRACE(unit, RAS1_LEVEL_INPUT, "Searching for type %d, name %.*s", type, length, name);
  if (is_binary_sort(type, name, length)) {
    *rc = LX_OK;
    return events.exit(none);
  }
  return events.exit(deliver(manager, find_by_name(manager, type, name, length), mode, rc));
}

LXObject* LXGetObjFromNameW(LXObjManager* given, int32_t type, const LXWChar* name, int32_t length,
                            int32_t mode, int32_t* rc) {
  *rc = LX_E_NOT_INITIALIZED;
  if (!initialized()) return nullptr;
  // Names are single bytes: a name with a longer character, or too long for any record, is not found.
  char narrow[sizeof(LXObjDisk::name)];
  const int32_t size = sizeof(narrow);
  int32_t n = 0;
  while (n < length && n < size && name[n] <= 0xFF) {
    narrow[n] = static_cast<char>(name[n]);
    ++n;
  }
  if (n == length) return LXGetObjFromName(given, type, narrow, length, mode, rc);
  *rc = LX_E_NOT_FOUND;
  return nullptr;
}

LXObject* LXGetObjFromID(LXObjManager* given, int32_t type, uint16_t id, int32_t mode, int32_t* rc) {
  Events events(unit);
  LXObject* const none = nullptr;
  *rc = LX_E_NOT_INITIALIZED;
  LXObjManager* manager = manager_of(given);
  if (manager == nullptr) return events.exit(none);
  if (type == LX_SORT && id == 0) {
    *rc = LX_OK;
    return events.exit(none);
  }
  return events.exit(deliver(manager, find_by_id(manager, type, id), mode, rc));
}

char* LXGetControlFileName(const char* directory, char* buffer, int32_t size) {
  const size_t bytes = strlen(directory);
  if (size < 0 || bytes + kControlTailBytes > static_cast<size_t>(size)) return nullptr;
  snprintf(buffer, static_cast<size_t>(size), "%s/%s", directory, format::kControlFile);
  return buffer;
}

char* LXGetDataFileName(const char* directory, int32_t type, uint16_t id, char* buffer, int32_t size) {
  if (!initialized() || type < 0 || static_cast<size_t>(type) >= format::kTypes) return nullptr;
  const size_t needed = strlen(directory) + kDataTailBytes;
  if (size < 0 || needed > static_cast<size_t>(size)) {
    fprintf(stderr, "Buffer provided = %d, needed = %d\n", size, static_cast<int>(needed));
    return nullptr;
  }
  const GlobalArea* area = globals.area;
  snprintf(buffer, static_cast<size_t>(size), "%s%s%s%s%05d%s", directory, area->directory_separator,
           format::kTypePrefix[type], area->name_separator, id, format::kDataExtension);
  return buffer;
}

int32_t LXGetDataLocation(char* buffer, int32_t size, int32_t selector) {
  if (selector == 0) {
    const int32_t bytes = LXGetEnv(kDirectoryVariable, buffer, size);
    if (bytes == 0) return -1;
    return bytes <= size ? bytes : 0;
  }
  const int32_t bytes = sizeof(kDefaultDirectory);
  if (selector != 1 || size < bytes) return 0;
  memcpy(buffer, kDefaultDirectory, sizeof(kDefaultDirectory));
  return bytes;
}

}  // extern "C"
