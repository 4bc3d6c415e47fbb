// Trace, as every source module uses it: one unit a module, its level refreshed when the process-wide change
// counter moved, messages tested before their arguments are evaluated, entry and exit events.
#pragma once

#include <cstdint>

#include "platform/ras1.h"

namespace lx {

/// The unit's current level.
inline uint32_t trace_level(RAS1_Unit& unit) {
  const uint32_t changes = __atomic_load_n(&RAS1_ChangeCounter, __ATOMIC_RELAXED);
  if (__builtin_expect(__atomic_load_n(&unit.seen, __ATOMIC_RELAXED) != changes, 0)) return RAS1_Sync(&unit);
  return __atomic_load_n(&unit.level, __ATOMIC_RELAXED);
}

// A macro, so that the arguments are evaluated only when the message is wanted, and the line is the caller's.
#define LX_TRACE(unit, bit, ...)                                     \
  do {                                                               \
    if (__builtin_expect((::lx::trace_level(unit) & (bit)) != 0, 0)) \
      RAS1_Printf(&(unit), __LINE__, __VA_ARGS__);                   \
  } while (0)

/// Entry and exit events of one call: kind 0 now; kind 1 with a value by exit(), else kind 2 at the end.
class Events {
 public:
  explicit Events(RAS1_Unit& unit, int line = __builtin_LINE())
      : unit_(unit), line_(line), open_((trace_level(unit) & RAS1_LEVEL_EVENTS) != 0) {
    if (__builtin_expect(open_, 0)) RAS1_Event(&unit_, line_, RAS1_EVENT_ENTRY, 0);
  }
  ~Events() {
    if (__builtin_expect(open_, 0)) RAS1_Event(&unit_, line_, RAS1_EVENT_EXIT, 0);
  }
  Events(const Events&) = delete;
  Events& operator=(const Events&) = delete;

  template <class T>
  T exit(T result, int line = __builtin_LINE()) {
    if (__builtin_expect(open_, 0)) RAS1_Event(&unit_, line, RAS1_EVENT_EXIT_VALUE, value_of(result));
    open_ = false;
    return result;
  }

 private:
  template <class T>
  static intptr_t value_of(T* p) {
    return reinterpret_cast<intptr_t>(p);
  }
  template <class T>
  static intptr_t value_of(T v) {
    return static_cast<intptr_t>(v);
  }

  RAS1_Unit& unit_;
  int line_;
  bool open_;
};

}  // namespace lx
