// The object manager: what the rooms may ask of it beyond its exported functions.
#pragma once

#include "core/lxrecords.h"

namespace lx {

/// What LXInitObjManager does, for LXInit too, which is not yet initialised when it calls. Null with code 20
/// when memory is exhausted; otherwise the manager, with the reason in `*rc` when no control file could be
/// used.
LXObjManager* create_manager(const char* directory, uint32_t options, int32_t* rc);

/// Finds and loads an object of exactly this type in the library's own manager: what the search by identifier
/// returns of another type is not found (37).
LXObject* object_by_id(int32_t type, uint16_t id, int32_t* rc);

/// The payload of a loaded object.
inline const uint8_t* payload_of(const LXObject& object) {
  return object.section[0];
}

}  // namespace lx

/// Loads an entry under the global lock, or gives it the built-in data of its type when its file cannot be
/// used;
/// `*rc` then keeps the reason. Null when it stays unloaded.
LXObject* LXLoadObj(LXObjManager* manager, LXObject* entry, int32_t* rc);

/// Releases what an entry holds: 0, or 21 when the free hook failed.
int32_t LXUnloadObj(LXObjManager* manager, LXObject* entry);

/// Gives an entry the built-in payload of its type; null for a sort, which has none.
LXObject* LXLoadDefaultObj(LXObjManager* manager, LXObject* entry);

/// Makes the manager serve the three built-in objects; false without memory.
bool LXLoadDefaults(LXObjManager* manager);
