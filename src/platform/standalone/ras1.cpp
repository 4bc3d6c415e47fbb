// The standalone trace: levels and sink come from the environment (LX_TRACE, LX_TRACE_FILE), and each event is
// one line of text, written with one write(2) so that the lines of threads and processes do not mix. Nothing
// here allocates memory, and nothing is opened before there is a line to write.
#include "platform/ras1.h"

#include <errno.h>
#include <fcntl.h>
#include <pthread.h>
#include <stdarg.h>
#include <stdio.h>
#include <string.h>
#include <time.h>
#include <unistd.h>

#include "platform/bss1.h"

namespace {

constexpr size_t kLineBytes = 2048;  // with the newline; below PIPE_BUF, so that pipes keep lines whole too
constexpr size_t kNameBytes = 32;    // of a unit's name in LX_TRACE, with the terminator
constexpr size_t kPathBytes = 4096;
constexpr size_t kMaxEntries = 64;
constexpr size_t kDumpRowBytes = 16;

struct Entry {
  char unit[kNameBytes];
  uint32_t level;
};

// The configuration and the sink, guarded by the mutex; it is also held while a line is written, so that the
// sink is not closed under a writer.
pthread_mutex_t mutex = PTHREAD_MUTEX_INITIALIZER;
bool configured;
Entry entries[kMaxEntries];
size_t entry_count;
char path[kPathBytes];
int sink = -1;  // open descriptor, or -1 when the first line has yet to open it

class Held {
 public:
  // A thread that is cancelled in write(2) would leave the mutex locked.
  Held() : saved_errno_(errno) {
    pthread_setcancelstate(PTHREAD_CANCEL_DISABLE, &cancel_state_);
    pthread_mutex_lock(&mutex);
  }
  ~Held() {
    pthread_mutex_unlock(&mutex);
    pthread_setcancelstate(cancel_state_, nullptr);
    errno = saved_errno_;
  }
  Held(const Held&) = delete;
  Held& operator=(const Held&) = delete;

 private:
  int saved_errno_;
  int cancel_state_;
};

void write_whole(int descriptor, const char* text, size_t bytes) {
  while (write(descriptor, text, bytes) < 0 && errno == EINTR) {
  }
}

/// Appends pieces of text to a line of fixed size; what does not fit is cut and marked with "...".
class Line {
 public:
  void put(char c) {
    if (length_ < kTextBytes)
      text_[length_++] = c;
    else
      cut_ = true;
  }
  void put(const char* text) {
    while (*text != '\0') put(*text++);
  }
  /// Text that came from outside: control characters are spelled out, so that it stays on its line.
  void put_escaped(const char* text, size_t bytes) {
    for (size_t i = 0; i < bytes; ++i) {
      const unsigned char c = static_cast<unsigned char>(text[i]);
      if (c == '\n') {
        put("\\n");
      } else if (c < 0x20 || c == 0x7F) {
        put("\\x");
        put_hex(c, 2);
      } else {
        put(text[i]);
      }
    }
  }
  void put_escaped(const char* text) { put_escaped(text, strlen(text)); }
  void put_decimal(uint64_t value, int digits = 1) { put_number(value, 10, digits, "0123456789"); }
  void put_hex(uint64_t value, int digits = 1) { put_number(value, 16, digits, "0123456789abcdef"); }

  /// Drops what was put since the line had `length` bytes.
  void truncate(size_t length) {
    length_ = length;
    cut_ = false;
  }
  size_t length() const { return length_; }

  void write_to(int descriptor) {
    size_t end = length_;
    if (cut_) end = static_cast<size_t>(stpcpy(text_ + end, "...") - text_);
    text_[end++] = '\n';
    write_whole(descriptor, text_, end);
  }

 private:
  static constexpr size_t kTextBytes = kLineBytes - sizeof("...\n");

  void put_number(uint64_t value, unsigned base, int digits, const char* set) {
    char reversed[20];
    int count = 0;
    do {
      reversed[count++] = set[value % base];
      value /= base;
    } while (value != 0);
    while (digits-- > count) put('0');
    while (count > 0) put(reversed[--count]);
  }

  char text_[kLineBytes];
  size_t length_ = 0;
  bool cut_ = false;
};

bool is_blank(char c) {
  return c == ' ' || c == '\t';
}

int hex_digit(char c) {
  if (c >= '0' && c <= '9') return c - '0';
  if (c >= 'a' && c <= 'f') return c - 'a' + 10;
  if (c >= 'A' && c <= 'F') return c - 'A' + 10;
  return -1;
}

/// Reads "unit=level" in [at, end) into a further entry. Returns null, or what is wrong.
const char* read_entry(const char* at, const char* end) {
  const char* equals = static_cast<const char*>(memchr(at, '=', static_cast<size_t>(end - at)));
  if (equals == nullptr) return "no \"=\" between unit and level";
  const char* name_end = equals;
  while (name_end > at && is_blank(name_end[-1])) --name_end;
  const size_t name_bytes = static_cast<size_t>(name_end - at);
  if (name_bytes == 0) return "no unit before \"=\"";
  if (name_bytes >= kNameBytes) return "the unit's name is too long";

  const char* digits = equals + 1;
  while (digits < end && is_blank(*digits)) ++digits;
  if (end - digits >= 2 && digits[0] == '0' && (digits[1] == 'x' || digits[1] == 'X')) digits += 2;
  if (digits == end) return "no level after \"=\"";
  uint32_t level = 0;
  for (; digits < end; ++digits) {
    const int digit = hex_digit(*digits);
    if (digit < 0) return "the level is not a hexadecimal number";
    if (level >> 28 != 0) return "the level has more than 32 bits";
    level = level << 4 | static_cast<uint32_t>(digit);
  }

  if (entry_count == kMaxEntries) return "too many entries";
  Entry& entry = entries[entry_count++];
  memcpy(entry.unit, at, name_bytes);
  entry.unit[name_bytes] = '\0';
  entry.level = level;
  return nullptr;
}

/// Fills the table from a list of entries between commas; each bad one is reported on standard error and
/// skipped.
void read_levels(const char* list) {
  entry_count = 0;
  const char* at = list;
  while (at != nullptr) {
    const char* comma = strchr(at, ',');
    const char* end = comma != nullptr ? comma : at + strlen(at);
    while (at < end && is_blank(*at)) ++at;
    while (end > at && is_blank(end[-1])) --end;
    if (at < end) {
      if (const char* problem = read_entry(at, end)) {
        Line line;
        line.put("LX_TRACE: column ");
        line.put_decimal(static_cast<uint64_t>(at - list) + 1);
        line.put(": ");
        line.put(problem);
        line.put("; ignored: \"");
        line.put_escaped(at, static_cast<size_t>(end - at));
        line.put('"');
        line.write_to(STDERR_FILENO);
      }
    }
    at = comma != nullptr ? comma + 1 : nullptr;
  }
}

void report_file(const char* name, const char* problem) {
  Line line;
  line.put("LX_TRACE_FILE: ");
  line.put(problem);
  line.put("; tracing to standard error instead of \"");
  line.put_escaped(name);
  line.put('"');
  line.write_to(STDERR_FILENO);
}

void configure(const char* levels, const char* file) {
  if (sink > STDERR_FILENO) close(sink);
  sink = -1;
  path[0] = '\0';
  if (file != nullptr) {
    if (strlen(file) < kPathBytes)
      strcpy(path, file);
    else
      report_file(file, "the path is too long");
  }
  read_levels(levels != nullptr ? levels : "");
  configured = true;
}

void configure_once() {
  if (!configured) configure(BSS1_GetEnv("LX_TRACE"), BSS1_GetEnv("LX_TRACE_FILE"));
}

/// The last entry that names the unit, or else the last one for all units.
uint32_t level_of(const char* unit) {
  uint32_t level = 0;
  bool named = false;
  for (size_t i = 0; i < entry_count; ++i) {
    if (strcmp(entries[i].unit, unit) == 0) {
      level = entries[i].level;
      named = true;
    } else if (!named && strcmp(entries[i].unit, "*") == 0) {
      level = entries[i].level;
    }
  }
  return level;
}

int open_sink() {
  configure_once();
  if (sink >= 0) return sink;
  if (path[0] == '\0' || strcmp(path, "stderr") == 0) return sink = STDERR_FILENO;
  if (strcmp(path, "stdout") == 0) return sink = STDOUT_FILENO;
  // For the owner only: a trace shows the texts that the program works on.
  // A pipe without a reader is refused in place of waiting for one.
  sink = open(path, O_WRONLY | O_APPEND | O_CREAT | O_CLOEXEC | O_NOCTTY | O_NONBLOCK, 0600);
  if (sink < 0) {
    report_file(path, strerrordesc_np(errno));
    sink = STDERR_FILENO;
  } else {
    fcntl(sink, F_SETFL, O_APPEND);
  }
  return sink;
}

/// "2026-01-02T03:04:05.123456Z", without the C library's calendar, which reads the time zone and allocates.
void put_time(Line& line) {
  timespec now;
  clock_gettime(CLOCK_REALTIME, &now);
  const uint64_t seconds = static_cast<uint64_t>(now.tv_sec);
  // Years that begin in March put the leap day last; 400 of them are 146,097 days. 719,468 days lie between
  // 0000-03-01 and 1970-01-01.
  const uint64_t days = seconds / 86400 + 719468;
  const uint64_t era = days / 146097;
  const uint64_t day_of_era = days % 146097;
  const uint64_t year_of_era =
      (day_of_era - day_of_era / 1460 + day_of_era / 36524 - day_of_era / 146096) / 365;
  const uint64_t day_of_year = day_of_era - (365 * year_of_era + year_of_era / 4 - year_of_era / 100);
  const uint64_t month = (5 * day_of_year + 2) / 153;  // 0 is March
  const uint64_t day = day_of_year - (153 * month + 2) / 5 + 1;
  line.put_decimal(era * 400 + year_of_era + (month >= 10 ? 1 : 0), 4);
  line.put('-');
  line.put_decimal(month < 10 ? month + 3 : month - 9, 2);
  line.put('-');
  line.put_decimal(day, 2);
  line.put('T');
  line.put_decimal(seconds % 86400 / 3600, 2);
  line.put(':');
  line.put_decimal(seconds % 3600 / 60, 2);
  line.put(':');
  line.put_decimal(seconds % 60, 2);
  line.put('.');
  line.put_decimal(static_cast<uint64_t>(now.tv_nsec) / 1000, 6);
  line.put('Z');
}

void put_head(Line& line, const RAS1_Unit& unit, int source_line) {
  put_time(line);
  line.put(' ');
  line.put_decimal(static_cast<uint64_t>(gettid()));
  line.put(' ');
  line.put(unit.name);
  line.put(':');
  line.put_decimal(static_cast<uint64_t>(source_line));
  line.put(' ');
}

/// "0010  48 65 6c 6c 6f ...  Hello", the offset in at least four digits.
void put_row(Line& line, const unsigned char* bytes, size_t offset, size_t count) {
  line.put_hex(offset, 4);
  line.put(' ');
  for (size_t i = 0; i < kDumpRowBytes; ++i) {
    line.put(' ');
    if (i < count)
      line.put_hex(bytes[offset + i], 2);
    else
      line.put("  ");
  }
  line.put("  ");
  for (size_t i = 0; i < count; ++i) {
    const unsigned char c = bytes[offset + i];
    line.put(c >= 0x20 && c < 0x7F ? static_cast<char>(c) : '.');
  }
}

}  // namespace

extern "C" {

uint32_t RAS1_ChangeCounter = 1;

uint32_t RAS1_Sync(RAS1_Unit* unit) {
  Held held;
  configure_once();
  const uint32_t level = level_of(unit->name);
  __atomic_store_n(&unit->level, level, __ATOMIC_RELAXED);
  // After the level, so that a reader who sees the unit fresh sees its level too.
  __atomic_store_n(&unit->seen, __atomic_load_n(&RAS1_ChangeCounter, __ATOMIC_RELAXED), __ATOMIC_RELEASE);
  return level;
}

void RAS1_Event(RAS1_Unit* unit, int source_line, int kind, intptr_t value) {
  Held held;
  Line line;
  put_head(line, *unit, source_line);
  line.put(kind == RAS1_EVENT_ENTRY ? "entry" : "exit");
  if (kind == RAS1_EVENT_EXIT_VALUE) {
    line.put(" 0x");
    line.put_hex(static_cast<uintptr_t>(value));
  }
  line.write_to(open_sink());
}

void RAS1_Printf(RAS1_Unit* unit, int source_line, const char* format, ...) {
  const int saved_errno = errno;
  char message[kLineBytes];
  va_list arguments;
  va_start(arguments, format);
  const int needed = vsnprintf(message, sizeof(message), format, arguments);
  va_end(arguments);
  errno = saved_errno;

  Held held;
  Line line;
  put_head(line, *unit, source_line);
  if (needed < 0) {
    line.put("cannot format: ");
    line.put_escaped(format);
  } else {
    // A message that fills the buffer does not fit on the line with its head, so the line marks the cut.
    size_t bytes = static_cast<size_t>(needed);
    if (bytes >= sizeof(message)) bytes = sizeof(message) - 1;
    if (bytes > 0 && message[bytes - 1] == '\n') --bytes;
    line.put_escaped(message, bytes);
  }
  line.write_to(open_sink());
}

void RAS1_Dump(RAS1_Unit* unit, int source_line, const void* buffer, size_t bytes, const char* label) {
  Held held;
  const int descriptor = open_sink();
  Line line;
  put_head(line, *unit, source_line);
  const size_t head_length = line.length();
  line.put_escaped(label);
  line.put(": ");
  if (buffer == nullptr) {
    line.put("null, ");
    bytes = 0;
  }
  line.put_decimal(bytes);
  line.put(bytes == 1 ? " byte" : " bytes");
  line.write_to(descriptor);
  for (size_t offset = 0; offset < bytes; offset += kDumpRowBytes) {
    const size_t left = bytes - offset;
    line.truncate(head_length);
    put_row(line, static_cast<const unsigned char*>(buffer), offset,
            left < kDumpRowBytes ? left : kDumpRowBytes);
    line.write_to(descriptor);
  }
}

void RAS1_Configure(const char* levels, const char* file) {
  Held held;
  configure(levels, file);
  __atomic_fetch_add(&RAS1_ChangeCounter, 1, __ATOMIC_RELAXED);
}

}  // extern "C"
