// A trace that keeps what it is told: linked in place of the standalone one, it lets a test read the events,
// messages and dumps that the library issued.
#pragma once

#include <cstdint>
#include <mutex>
#include <string>
#include <utility>
#include <vector>

#include "platform/ras1.h"

namespace lx::test {

struct TraceRecord {
  enum Kind {
    kEntry = RAS1_EVENT_ENTRY,
    kExitValue = RAS1_EVENT_EXIT_VALUE,
    kExit = RAS1_EVENT_EXIT,
    kMessage,
    kDump
  };

  Kind kind;
  std::string unit;
  int line;
  intptr_t value;              // kExitValue
  std::string text;            // kMessage: as formatted; kDump: the label
  std::vector<uint8_t> bytes;  // kDump
};

/// The one trace of the process; safe to use from every thread.
struct RecordingTrace {
  static inline std::mutex mutex;
  static inline uint32_t level = 0;
  static inline std::vector<TraceRecord> records;

  /// Sets the level of all units (sum of the RAS1_LEVEL bits; 0, as at the start: trace nothing).
  static void set_level(uint32_t new_level) {
    std::lock_guard<std::mutex> held(mutex);
    level = new_level;
    __atomic_fetch_add(&RAS1_ChangeCounter, 1, __ATOMIC_RELAXED);
  }
  /// Returns the records in the order in which they were made, and forgets them.
  static std::vector<TraceRecord> take() {
    std::lock_guard<std::mutex> held(mutex);
    return std::exchange(records, {});
  }
};

}  // namespace lx::test
