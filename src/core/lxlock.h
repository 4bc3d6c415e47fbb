// The one global lock: it guards the initialisation count and every object load.
#pragma once

#include "core/lxrecords.h"

namespace lx {

class GlobalLock {
 public:
  GlobalLock() { BSS1_GetLock(&globals.area->lock); }
  ~GlobalLock() { BSS1_ReleaseLock(&globals.area->lock); }
  GlobalLock(const GlobalLock&) = delete;
  GlobalLock& operator=(const GlobalLock&) = delete;
};

}  // namespace lx
