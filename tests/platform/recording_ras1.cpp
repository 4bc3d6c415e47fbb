// The recording trace behind the names of the base services.
#include "recording_ras1.h"

#include <cerrno>
#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <mutex>
#include <utility>

namespace lx::test {
namespace {

std::mutex mutex;
uint32_t current_level;
std::vector<TraceRecord> records;

/// The library may look at errno after a trace call.
void add(TraceRecord record) {
  const int saved = errno;
  std::lock_guard<std::mutex> held(mutex);
  records.push_back(std::move(record));
  errno = saved;
}

}  // namespace

void RecordingTrace::set_level(uint32_t level) {
  std::lock_guard<std::mutex> held(mutex);
  current_level = level;
  __atomic_fetch_add(&RAS1_ChangeCounter, 1, __ATOMIC_RELAXED);
}

std::vector<TraceRecord> RecordingTrace::take() {
  std::lock_guard<std::mutex> held(mutex);
  return std::exchange(records, {});
}

}  // namespace lx::test

using namespace lx::test;

extern "C" {

uint32_t RAS1_ChangeCounter = 1;

uint32_t RAS1_Sync(RAS1_Unit* unit) {
  std::lock_guard<std::mutex> held(mutex);
  __atomic_store_n(&unit->level, current_level, __ATOMIC_RELAXED);
  __atomic_store_n(&unit->seen, __atomic_load_n(&RAS1_ChangeCounter, __ATOMIC_RELAXED), __ATOMIC_RELEASE);
  return current_level;
}

void RAS1_Event(RAS1_Unit* unit, int line, int kind, intptr_t value) {
  add({static_cast<TraceRecord::Kind>(kind), unit->name, line, value, "", {}});
}

void RAS1_Printf(RAS1_Unit* unit, int line, const char* format, ...) {
  char text[8192];
  va_list arguments;
  va_start(arguments, format);
  const int bytes = vsnprintf(text, sizeof(text), format, arguments);
  va_end(arguments);
  if (bytes < 0 || static_cast<size_t>(bytes) >= sizeof(text)) abort();
  add({TraceRecord::kMessage, unit->name, line, 0, text, {}});
}

void RAS1_Dump(RAS1_Unit* unit, int line, const void* buffer, size_t bytes, const char* label) {
  const uint8_t* first = static_cast<const uint8_t*>(buffer);
  const std::vector<uint8_t> copy(first, bytes > 0 ? first + bytes : first);
  add({TraceRecord::kDump, unit->name, line, 0, label, copy});
}

}  // extern "C"
