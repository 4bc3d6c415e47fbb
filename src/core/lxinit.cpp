// Initialisation: the global area, its lock and reference count, the hooks, the environment and the last
// error.
#include <cstdlib>
#include <cstring>

#include "core/lxlock.h"
#include "core/lxmemory.h"
#include "core/lxobjman.h"
#include "core/lxtrace.h"

using namespace lx;

namespace {

RAS1_Unit unit = RAS1_UNIT("lxinit");

constexpr uint32_t kTableAlignment = 4;

void drop_area() {
  GlobalArea* area = globals.area;
  const LXFreeHook release = globals.release;
  globals = Globals{};
  release(area->context, area);
}

/// The new count of uses. Other threads read it without the lock.
uint32_t add_to_count(int32_t uses) {
  GlobalArea* area = globals.area;
  const uint32_t count = area->init_count + static_cast<uint32_t>(uses);
  __atomic_store_n(&area->init_count, count, __ATOMIC_RELAXED);
  return count;
}

/// Creates the area, or takes the one that a failed initialisation left, unless other hooks own that one.
bool create_area(LXAllocHook allocate, LXFreeHook release, void* context) {
  if (globals.area != nullptr) {
    if (globals.allocate == allocate && globals.release == release && globals.area->context == context)
      return true;
    drop_area();
  }
  LX_TRACE(unit, RAS1_LEVEL_DETAIL, "Creating global area");
  void* block = allocate(context, sizeof(GlobalArea));
  if (block == nullptr) {
    LX_TRACE(unit, RAS1_LEVEL_ERRORS, "Unable to allocate %d bytes for globals",
             static_cast<int>(sizeof(GlobalArea)));
    return false;
  }
  memset(block, 0, sizeof(GlobalArea));
  globals = Globals{static_cast<GlobalArea*>(block), allocate, release, nullptr, nullptr};
  globals.area->context = context;
  return true;
}

}  // namespace

namespace lx {

Globals globals;

void* hook_allocate_zeroed(size_t bytes) {
  void* block = hook_allocate(bytes);
  if (block != nullptr) memset(block, 0, bytes);
  return block;
}

}  // namespace lx

extern "C" {

void* LXDefAlloc(void*, size_t bytes) {
  return malloc(bytes);
}

int32_t LXDefFree(void*, void* block) {
  free(block);
  return 1;
}

int32_t LXInit(const char* directory, LXAllocHook allocate, LXFreeHook release, void* context,
               uint32_t options) {
  Events events(unit);
  if (initialized()) {
    GlobalLock lock;
    const uint32_t count = add_to_count(1);
    LX_TRACE(unit, RAS1_LEVEL_DETAIL, "Lexicor init count = %d", static_cast<int>(count));
    return events.exit(LX_OK);
  }
  if (allocate == nullptr) allocate = LXDefAlloc;
  if (release == nullptr) release = LXDefFree;
  if (!create_area(allocate, release, context)) return events.exit(LX_E_MEMORY);

  GlobalArea* area = globals.area;
  LX_TRACE(unit, RAS1_LEVEL_DETAIL, "Lexicor init count = %d", 0);
  BSS1_InitializeLock(&area->lock);
  int32_t result = LX_OK;
  {
    GlobalLock lock;
    memcpy(area->directory_separator, "/", 2);
    memcpy(area->name_separator, "_", 2);
    area->table_alignment = kTableAlignment;
    area->file_context = 1;
    int32_t rc = LX_OK;
    LXObjManager* manager = create_manager(directory, options, &rc);
    if (manager != nullptr) {
      if (rc != LX_OK) result = LX_W_DEFAULTS;
      area->manager = manager;
      add_to_count(1);
    } else {
      area->file_context = 0;
      result = LX_E_NOT_INITIALIZED;
    }
  }
  if (result == LX_E_NOT_INITIALIZED) BSS1_DestroyLock(&area->lock);
  return events.exit(result);
}

int32_t LXTerm(void) {
  Events events(unit);
  if (!initialized()) {
    if (globals.area != nullptr) drop_area();  // left by an initialisation that failed
    return events.exit(LX_E_NOT_INITIALIZED);
  }
  GlobalArea* area = globals.area;
  {
    GlobalLock lock;
    if (area->init_count > 1) {
      add_to_count(-1);
      return events.exit(LX_OK);
    }
  }
  // The count stays 1 while the default locale and the manager are released through the library itself.
  int32_t result = LX_OK;
  if (LXLocale* locale = globals.default_locale) {
    globals.default_locale = nullptr;
    result = globals.release_default(locale);
  }
  LXObjManager* manager = area->manager;
  area->manager = nullptr;
  const int32_t rc = LXTermObjManager(manager);
  if (result == LX_OK) result = rc;
  area->file_context = 0;
  add_to_count(-1);
  BSS1_DestroyLock(&area->lock);
  drop_area();
  return events.exit(result);
}

int32_t LXGetError(const LXLocale* locale) {
  const LXLocale* used = locale_of(const_cast<LXLocale*>(locale));
  return used != nullptr ? last_error_of(*used) : LX_E_NOT_INITIALIZED;
}

int32_t LXGetEnv(const char* name, char* buffer, int32_t size) {
  const char* value = BSS1_GetEnv(name);
  if (value == nullptr) return 0;
  const size_t bytes = strlen(value) + 1;
  if (size > 0 && bytes <= static_cast<size_t>(size)) memcpy(buffer, value, bytes);
  return static_cast<int32_t>(bytes);
}

}  // extern "C"
