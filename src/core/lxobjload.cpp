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

namespace {

namespace format = lx::format;

RAS1_Unit unit = RAS1_UNIT("lxobjload");

// The directory fills at most its field; a data file's name adds "/cp_00001.nls" and a null.
constexpr size_t kNameBytes = sizeof(LXObjManager::directory) + 16;

const lx::BuiltIn* built_in(uint8_t type) {
  switch (type) {
    case LX_LANGUAGE:
      return &lx::kBuiltInLanguage;
    case LX_TERRITORY:
      return &lx::kBuiltInTerritory;
    case LX_CODEPAGE:
      return &lx::kBuiltInCodepage;
    default:
      return nullptr;
  }
}

/// The sections of an object while it is loaded: freed unless they are handed to the entry.
class Loading {
 public:
  Loading() = default;
  ~Loading() {
    for (const lx::Bytes& section : sections_.section) lx::hook_free(const_cast<uint8_t*>(section.data));
  }
  Loading(const Loading&) = delete;
  Loading& operator=(const Loading&) = delete;

  /// Reads, converts and checks: 0 when the sections can be handed over.
  int32_t load(LXFile* file, const LXObjDisk& disk) {
    uint32_t version = 0;
    int32_t rc = read(file, &version);
    if (rc == LX_OK && disk.type == LX_CODEPAGE && version == 1) rc = upgrade();
    if (rc == LX_OK) rc = validate(disk);
    return rc;
  }

  /// Gives the sections to the entry. The payload pointer is stored last: it says that the entry is loaded.
  void hand_over(LXObject* entry, LXFile* file, void* derived) {
    entry->file = file;
    entry->derived = derived;
    entry->disk.flags = owned_;
    for (size_t i = format::kMaxSections; i-- > 1;) entry->section[i] = take(i);
    __atomic_store_n(&entry->section[0], take(0), __ATOMIC_RELEASE);
  }

  const lx::Sections& sections() const { return sections_; }

 private:
  uint8_t* take(size_t i) {
    uint8_t* data = const_cast<uint8_t*>(sections_.section[i].data);
    sections_.section[i] = lx::Bytes{};
    return data;
  }

  int32_t read(LXFile* file, uint32_t* version) {
    int32_t rc = LX_OK;
    lx::HookPtr<uint8_t> block(static_cast<uint8_t*>(LXLoadFile(file, 0, format::kHeaderBytes, &rc)));
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

  int32_t upgrade() {
    lx::Sections upgraded;
    const int32_t rc = lx::upgrade_codepage(sections_, &upgraded);
    if (rc != LX_OK) return rc;
    for (size_t i = 0; i < format::kMaxSections; ++i) {
      if (upgraded.section[i].data == sections_.section[i].data) continue;
      LXUnloadFile(take(i));
      sections_.section[i] = upgraded.section[i];
      owned_ = static_cast<uint8_t>(owned_ | lx::kObjectOwned0 << i);
    }
    return LX_OK;
  }

  int32_t validate(const LXObjDisk& disk) const {
    switch (disk.type) {
      case LX_LANGUAGE:
        return lx::validate_language(sections_.section[0]);
      case LX_TERRITORY:
        return lx::validate_territory(sections_.section[0]);
      case LX_CODEPAGE:
        return lx::validate_codepage(disk.id, sections_);
      default:
        return lx::validate_sort(sections_.section[0]);
    }
  }

  lx::Sections sections_;
  uint8_t owned_ = 0;
};

/// Builds the acceleration data of the types that have any; false without memory.
bool derive(const LXObjDisk& disk, const lx::Sections& sections, void** derived) {
  if (disk.type == LX_CODEPAGE) *derived = lx::derive_codepage(disk.id, sections);
  if (disk.type == LX_SORT) *derived = lx::derive_sort(sections.section[0]);
  return *derived != nullptr || disk.type == LX_LANGUAGE || disk.type == LX_TERRITORY;
}

/// Loads an entry from its file; the entry stays as it was on failure.
int32_t load_from_file(const LXObjManager* manager, LXObject* entry) {
  char name[kNameBytes];
  if (LXGetDataFileName(manager->directory, entry->disk.type, entry->disk.id, name, sizeof(name)) == nullptr)
    return LX_E_FILE_IO;
  int32_t rc = LX_OK;
  LXFile* file = lx::open_for_reading(name, &rc);
  if (file == nullptr) return rc;
  Loading loading;
  void* derived = nullptr;
  rc = loading.load(file, entry->disk);
  if (rc == LX_OK && !derive(entry->disk, loading.sections(), &derived)) rc = LX_E_MEMORY;
  if (rc == LX_OK)
    loading.hand_over(entry, file, derived);
  else
    LXCloseFile(file, 0);
  return rc;
}

}  // namespace

LXObject* LXLoadObj(LXObjManager* manager, LXObject* entry, int32_t* rc) {
  lx::Events events(unit);
  lx::GlobalLock lock;
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
  lx::Events events(unit);
  int32_t result = LX_OK;
  for (size_t i = format::kMaxSections; i-- > 0;) {
    uint8_t* section = entry->section[i];
    entry->section[i] = nullptr;
    if ((entry->disk.flags & lx::kObjectBuiltIn) != 0) continue;
    if ((entry->disk.flags & lx::kObjectOwned0 << i) == 0)
      LXUnloadFile(section);
    else if (!lx::hook_free(section))
      result = LX_E_FREE;
  }
  if ((entry->disk.flags & lx::kObjectBuiltIn) == 0) lx::hook_free(entry->derived);
  entry->derived = nullptr;
  if (entry->file != nullptr) LXCloseFile(entry->file, 0);
  entry->file = nullptr;
  return events.exit(result);
}

LXObject* LXLoadDefaultObj(LXObjManager*, LXObject* entry) {
  const lx::BuiltIn* data = built_in(entry->disk.type);
  if (data == nullptr) return nullptr;
  // Flagged as built-in, the compiled-in data are never freed and never written.
  entry->disk.flags = lx::kObjectBuiltIn;
  entry->derived = const_cast<void*>(data->derived);
  for (size_t i = format::kMaxSections; i-- > 1;)
    entry->section[i] = const_cast<uint8_t*>(data->sections.section[i].data);
  __atomic_store_n(&entry->section[0], const_cast<uint8_t*>(data->sections.section[0].data), __ATOMIC_RELEASE);
  return entry;
}

bool LXLoadDefaults(LXObjManager* manager) {
  constexpr uint8_t kBuiltInTypes[] = {LX_LANGUAGE, LX_TERRITORY, LX_CODEPAGE};
  constexpr uint16_t kCount = sizeof(kBuiltInTypes);
  manager->entries = static_cast<LXObject*>(lx::hook_allocate_zeroed(kCount * sizeof(LXObject)));
  if (manager->entries == nullptr) return false;
  for (uint16_t i = 0; i < kCount; ++i) {
    LXObject* entry = &manager->entries[i];
    entry->disk.id = 1;
    entry->disk.type = kBuiltInTypes[i];
    strcpy(entry->disk.name, built_in(entry->disk.type)->name);
    LXLoadDefaultObj(manager, entry);
    manager->first[i] = i;
  }
  manager->first[LX_SORT] = kCount;
  manager->count = kCount;
  manager->no_fallback = 1;
  manager->directory[0] = '\0';
  return true;
}
