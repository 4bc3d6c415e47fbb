// The recording trace behind the names of the base services.
#include "recording_ras1.h"

#include <cerrno>
#include <cstdarg>
#include <cstdio>
#include <cstdlib>

namespace {

using Trace = lx::test::RecordingTrace;
using Record = lx::test::TraceRecord;

/// The library may look at errno after a trace call.
void add(Record record) {
  const int saved = errno;
  std::lock_guard<std::mutex> held(Trace::mutex);
  Trace::records.push_back(std::move(record));
  errno = saved;
}

}  // namespace

extern "C" {

uint32_t RAS1_ChangeCounter = 1;

uint32_t RAS1_Sync(RAS1_Unit* unit) {
  std::lock_guard<std::mutex> held(Trace::mutex);
  __atomic_store_n(&unit->level, Trace::level, __ATOMIC_RELAXED);
  __atomic_store_n(&unit->seen, __atomic_load_n(&RAS1_ChangeCounter, __ATOMIC_RELAXED), __ATOMIC_RELEASE);
  return Trace::level;
}

void RAS1_Event(RAS1_Unit* unit, int line, int kind, intptr_t value) {
  add({static_cast<Record::Kind>(kind), unit->name, line, value, "", {}});
}

void RAS1_Printf(RAS1_Unit* unit, int line, const char* format, ...) {
  char text[8192];
  va_list arguments;
  va_start(arguments, format);
  const int bytes = vsnprintf(text, sizeof(text), format, arguments);
  va_end(arguments);
  if (bytes < 0 || static_cast<size_t>(bytes) >= sizeof(text)) abort();
  add({Record::kMessage, unit->name, line, 0, text, {}});
}

void RAS1_Dump(RAS1_Unit* unit, int line, const void* buffer, size_t bytes, const char* label) {
  const uint8_t* first = static_cast<const uint8_t*>(buffer);
  const std::vector<uint8_t> copy(first, bytes > 0 ? first + bytes : first);
  add({Record::kDump, unit->name, line, 0, label, copy});
}

}  // extern "C"
