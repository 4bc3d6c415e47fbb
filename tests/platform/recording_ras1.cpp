// The recording trace behind the names of the base services.
#include "recording_ras1.h"

#include <cerrno>
#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <mutex>
#include <utility>

#include "platform/ras1.h"

namespace lx::test {
namespace {

std::mutex mutex;
uint32_t current_level;
std::vector<TraceRecord> records;

void add(TraceRecord::Kind kind, const RAS1_Unit& unit, int line, TraceRecord record) {
  record.kind = kind;
  record.unit = unit.name;
  record.line = line;
  std::lock_guard<std::mutex> held(mutex);
  records.push_back(std::move(record));
}

/// The library may look at errno after a trace call.
struct KeepErrno {
  const int saved = errno;
  ~KeepErrno() { errno = saved; }
};

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
  KeepErrno keep;
  std::lock_guard<std::mutex> held(mutex);
  __atomic_store_n(&unit->level, current_level, __ATOMIC_RELAXED);
  __atomic_store_n(&unit->seen, __atomic_load_n(&RAS1_ChangeCounter, __ATOMIC_RELAXED), __ATOMIC_RELEASE);
  return current_level;
}

void RAS1_Event(RAS1_Unit* unit, int line, int kind, intptr_t value) {
  KeepErrno keep;
  TraceRecord record{};
  if (kind == RAS1_EVENT_EXIT_VALUE) record.value = value;
  const auto recorded = kind == RAS1_EVENT_ENTRY        ? TraceRecord::kEntry
                        : kind == RAS1_EVENT_EXIT_VALUE ? TraceRecord::kExitValue
                                                        : TraceRecord::kExit;
  if (recorded == TraceRecord::kExit && kind != RAS1_EVENT_EXIT) abort();
  add(recorded, *unit, line, std::move(record));
}

void RAS1_Printf(RAS1_Unit* unit, int line, const char* format, ...) {
  KeepErrno keep;
  TraceRecord record{};
  char text[8192];
  va_list arguments;
  va_start(arguments, format);
  const int bytes = vsnprintf(text, sizeof(text), format, arguments);
  va_end(arguments);
  if (bytes < 0 || static_cast<size_t>(bytes) >= sizeof(text)) abort();
  record.text = text;
  add(TraceRecord::kMessage, *unit, line, std::move(record));
}

void RAS1_Dump(RAS1_Unit* unit, int line, const void* buffer, size_t bytes, const char* label) {
  KeepErrno keep;
  TraceRecord record{};
  record.text = label;
  const uint8_t* first = static_cast<const uint8_t*>(buffer);
  if (bytes > 0) record.bytes.assign(first, first + bytes);
  add(TraceRecord::kDump, *unit, line, std::move(record));
}

}  // extern "C"
