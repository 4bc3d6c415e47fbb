// Loading: an entry's file becomes validated sections in memory, a version-1 codepage is converted on the way,
// and the built-in data stand in for a file that is missing or bad.
#include <string.h>

#include "core/lxfile.h"
#include "core/lxformat.h"
#include "core/lxlock.h"
#include "core/lxmemory.h"
#include "core/lxobjman.h"
#include "core/lxobjtypes.h"
#include "core/lxtrace.h"

using namespace lx;

namespace {

RAS1_Unit unit = RAS1_UNIT("lxobjload");

// The directory fills at most its field; a data file's name adds "/cp_00001.nls" and a null.
constexpr size_t kNameBytes = sizeof(LXObjManager::directory) + 16;

/// Null for a type that a control file may name but that there is none of.
const ObjectType* object_type(uint8_t type) {
  return type < format::kTypes ? kObjectTypes[type] : nullptr;
}

void keep_sizes(LXObject* entry, const Sections& sections) {
  for (size_t i = 0; i < format::kMaxSections; ++i)
    entry->section_bytes[i] = static_cast<uint32_t>(sections.section[i].size);
}

/// The sections of an object while it is loaded: freed unless they are handed to the entry.
class Loading {
 public:
  Loading() = default;
  ~Loading() {
    for (const Bytes& section : sections_.section) hook_free(const_cast<uint8_t*>(section.data));
  }
  Loading(const Loading&) = delete;
  Loading& operator=(const Loading&) = delete;

  /// Reads, converts and checks: 0 when the sections can be handed over.
  int32_t load(LXFile* file, const LXObjDisk& disk, const ObjectType& type) {
    uint32_t version = 0;
    int32_t rc = read(file, &version);
    if (rc == LX_OK && type.upgrade != nullptr && version == 1) rc = upgrade(type);
    if (rc != LX_OK) return rc;
    const Fault fault = type.validate(disk.id, sections_);
    if (fault.code == LX_E_CORRUPT)
      LX_TRACE(unit, RAS1_LEVEL_ERRORS, "Object %s is refused: %s (section %d, offset %d)", disk.name,
               fault.reason, static_cast<int>(fault.section), static_cast<int>(fault.offset));
    return fault.code;
  }

  /// Gives the sections to the entry. The payload pointer is stored last: it says that the entry is loaded.
  void hand_over(LXObject* entry, LXFile* file, void* derived) {
    entry->file = file;
    entry->derived = derived;
    entry->disk.flags = owned_;
    keep_sizes(entry, sections_);
    for (size_t i = format::kMaxSections; i-- > 1;) entry->section[i] = take(i);
    __atomic_store_n(&entry->section[0], take(0), __ATOMIC_RELEASE);
  }

  const Sections& sections() const { return sections_; }

 private:
  uint8_t* take(size_t i) {
    uint8_t* data = const_cast<uint8_t*>(sections_.section[i].data);
    sections_.section[i] = Bytes{};
    return data;
  }

  int32_t read(LXFile* file, uint32_t* version) {
    int32_t rc = LX_OK;
    HookPtr<uint8_t> block(static_cast<uint8_t*>(LXLoadFile(file, 0, format::kHeaderBytes, &rc)));
    if (!block) return rc;
    const format::Header header = format::Header::read(block.get());
    if (header.magic != format::kMagic) return LX_E_CORRUPT;
    *version = header.version();
    for (size_t i = 0; i == 0 || (i < header.sections && i < format::kMaxSections); ++i) {
      const format::Header::Section& place = header.section[i];
      sections_.section[i].data = static_cast<uint8_t*>(LXLoadFile(file, place.offset, place.bytes, &rc));
      if (rc != LX_OK) return rc;
      sections_.section[i].size = place.bytes;
    }
    return LX_OK;
  }

  int32_t upgrade(const ObjectType& type) {
    Sections upgraded;
    const int32_t rc = type.upgrade(sections_, &upgraded);
    if (rc != LX_OK) return rc;
    for (size_t i = 0; i < format::kMaxSections; ++i) {
      if (upgraded.section[i].data == sections_.section[i].data) continue;
      LXUnloadFile(take(i));
      sections_.section[i] = upgraded.section[i];
      owned_ = static_cast<uint8_t>(owned_ | kObjectOwned0 << i);
    }
    return LX_OK;
  }

  Sections sections_;
  uint8_t owned_ = 0;
};

/// Loads an entry from its file; the entry stays as it was on failure.
int32_t load_from_file(const LXObjManager* manager, LXObject* entry) {
  char name[kNameBytes];
  const ObjectType* type = object_type(entry->disk.type);
  if (type == nullptr ||
      LXGetDataFileName(manager->directory, entry->disk.type, entry->disk.id, name, sizeof(name)) == nullptr)
    return LX_E_FILE_IO;
  int32_t rc = LX_OK;
  LXFile* file = open_for_reading(name, &rc);
  if (file == nullptr) return rc;
  Loading loading;
  void* derived = nullptr;
  rc = loading.load(file, entry->disk, *type);
  if (rc == LX_OK && type->derive != nullptr) {
    derived = type->derive(entry->disk.id, loading.sections());
    if (derived == nullptr) rc = LX_E_MEMORY;
  }
  if (rc == LX_OK)
    loading.hand_over(entry, file, derived);
  else
    LXCloseFile(file, 0);
  return rc;
}

}  // namespace

LXObject* LXLoadObj(LXObjManager* manager, LXObject* entry, int32_t* rc) {
  Events events(unit);
  GlobalLock lock;
  *rc = LX_OK;
  if (entry->section[0] != nullptr) return events.exit(entry);
  *rc = load_from_file(manager, entry);
  if (*rc == LX_OK) return events.exit(entry);
  // Built-in data stand in for a file that is missing or bad, not for a moment without memory.
  LXObject* loaded = nullptr;
  if (*rc != LX_E_MEMORY && manager->no_fallback == 0) loaded = LXLoadDefaultObj(manager, entry);
  return events.exit(loaded);
}

int32_t LXUnloadObj(LXObjManager*, LXObject* entry) {
  Events events(unit);
  int32_t result = LX_OK;
  for (size_t i = format::kMaxSections; i-- > 0;) {
    uint8_t* section = entry->section[i];
    entry->section[i] = nullptr;
    if ((entry->disk.flags & kObjectBuiltIn) != 0) continue;
    if ((entry->disk.flags & kObjectOwned0 << i) == 0)
      LXUnloadFile(section);
    else if (!hook_free(section))
      result = LX_E_FREE;
  }
  if ((entry->disk.flags & kObjectBuiltIn) == 0) hook_free(entry->derived);
  entry->derived = nullptr;
  if (entry->file != nullptr) LXCloseFile(entry->file, 0);
  entry->file = nullptr;
  return events.exit(result);
}

LXObject* LXLoadDefaultObj(LXObjManager*, LXObject* entry) {
  const ObjectType* type = object_type(entry->disk.type);
  const BuiltIn* data = type != nullptr ? type->built_in : nullptr;
  if (data == nullptr) return nullptr;
  // Flagged as built-in, the compiled-in data are never freed and never written.
  entry->disk.flags = kObjectBuiltIn;
  entry->derived = const_cast<void*>(data->derived);
  keep_sizes(entry, data->sections);
  for (size_t i = format::kMaxSections; i-- > 1;)
    entry->section[i] = const_cast<uint8_t*>(data->sections.section[i].data);
  __atomic_store_n(&entry->section[0], const_cast<uint8_t*>(data->sections.section[0].data), __ATOMIC_RELEASE);
  return entry;
}

bool LXLoadDefaults(LXObjManager* manager) {
  uint16_t count = 0;
  for (const ObjectType* type : kObjectTypes)
    count = static_cast<uint16_t>(count + (type->built_in != nullptr));
  manager->entries = static_cast<LXObject*>(hook_allocate_zeroed(count * sizeof(LXObject)));
  if (manager->entries == nullptr) return false;
  manager->count = 0;
  for (uint8_t type = 0; type < format::kTypes; ++type) {
    manager->first[type] = manager->count;
    const BuiltIn* data = kObjectTypes[type]->built_in;
    if (data == nullptr) continue;
    LXObject* entry = &manager->entries[manager->count++];
    entry->disk.id = 1;
    entry->disk.type = type;
    strcpy(entry->disk.name, data->name);
    LXLoadDefaultObj(manager, entry);
  }
  manager->no_fallback = 1;
  manager->directory[0] = '\0';
  return true;
}
