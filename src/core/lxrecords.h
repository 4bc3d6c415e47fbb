// The plain records that every room reads: the global area, object manager and entries, the locale record.
// Declared here so that the rooms below the locale room need not include it. Their fields and the order of them
// are fixed: who looks into a process (a debugger, a dump, an allocation hook) finds each at its place, also
// those that nothing here reads (LXFile::mode, LXLocale::changed_unicode, kLocaleBinarySort).
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>

#include "lx.h"
#include "platform/bss1.h"

/// An open file. Writes to an existing file go to a temporary one until the file is closed.
struct LXFile {
  int32_t descriptor;
  uint8_t mode;        // LX_READ, LX_WRITE, LX_READ_WRITE
  uint8_t temporary;   // 1: a temporary file replaces the target on close
  uint8_t write_only;  // 1: mode is LX_WRITE
  char target[256];    // target name without its extension
  char extension[8];   // with its dot
};

/// One object of the control file. Loaded when `section[0]` is not null; that pointer is stored last, so that
/// a reader without the lock sees all or nothing.
struct LXObject {
  LXObjDisk disk;
  LXFile* file;
  uint8_t* section[4];  // 0: the payload
  void* derived;        // acceleration data that the object's room made at load; null when it makes none
  uint32_t section_bytes[4];
};

namespace lx {

/// Flags byte of an entry in memory.
enum ObjectFlag : uint8_t {
  kObjectBuiltIn = 0x01,  // sections are compiled in, never freed
  kObjectOwned0 = 0x02,   // section n was allocated, not loaded by LXLoadFile
};

/// Unicode texts that a locale no longer uses. Callers may, so that they stay until the locale is released.
struct ReplacedTexts {
  ReplacedTexts* next;
  LXUChar* texts[8];
};

struct AliasRecord {
  AliasRecord* next;
  char codepage[33];
  char alias[65];  // upper case
};

}  // namespace lx

struct LXObjManager {
  LXObject* entries;
  uint16_t first[4];  // first entry of each type: type t has first[t] up to, not with, first[t + 1]
  uint16_t count;     // ... and for the last type up to count
  uint8_t no_fallback;
  char directory[256];
  lx::AliasRecord* aliases;
};

/// A locale: four shared objects, and the caller's own copies of what may be changed.
struct LXLocale {
  LXObject* language;
  LXObject* territory;
  LXObject* codepage;
  LXObject* sort;             // null: binary order
  uint32_t changed;           // one bit an item that the caller has set
  uint16_t numbers[3];        // items 63, 69, 70
  uint16_t flags;             // bits 0-5: items 73-76, 82, 83; then LocaleFlag
  uint8_t sign_positions[2];  // items 77, 78
  uint8_t separators[5];      // items 59, 60, 61, 66, 67, one byte each in the codepage
  char* texts[8];             // items 62, 64, 68, 71, 72, 79, 80, 81, in the codepage
  uint16_t changed_unicode;   // which Unicode copies the caller has set
  LXUChar separators_unicode[5];
  LXUChar* texts_unicode[8];    // the texts
  int32_t last_error;           // last_error_of() and set_last_error()
  lx::ReplacedTexts* replaced;  // by changes of territory
};

namespace lx {

// Threads may work in one locale together, as long as none changes it: the last error is then that of any of them.
inline int32_t last_error_of(const LXLocale& locale) {
  return __atomic_load_n(&locale.last_error, __ATOMIC_RELAXED);
}
inline void set_last_error(LXLocale& locale, int32_t code) {
  __atomic_store_n(&locale.last_error, code, __ATOMIC_RELAXED);
}

/// A copy of the record to work in, whose last error no other thread writes.
inline LXLocale own_record(const LXLocale& locale) {
  LXLocale own;
  memcpy(&own, &locale, offsetof(LXLocale, last_error));
  own.last_error = LX_OK;
  own.replaced = locale.replaced;
  return own;
}

enum LocaleFlag : uint16_t {
  kLocaleSingleByte = 0x0040,
  kLocaleBinarySort = 0x0080,
  kLocaleShift = 0x0100,
};

/// The one global area: one block from the allocation hook of the first LXInit.
struct GlobalArea {
  void* context;        // handed to both hooks
  uint32_t init_count;  // written under the lock; every call reads it
  BSS1_Lock lock;
  int32_t file_context;  // 1 while initialised; first argument of every LXOpenFile
  LXObjManager* manager;
  uint32_t table_alignment;
  char directory_separator[2];
  char name_separator[2];
};

/// The process-wide values. `area` is null before the first LXInit and after the last LXTerm.
struct Globals {
  GlobalArea* area;
  LXAllocHook allocate;
  LXFreeHook release;
  LXLocale* default_locale;
  int32_t (*release_default)(LXLocale*);  // set with it: locales are released above, and LXTerm has to
};
extern Globals globals;

inline bool initialized() {
  const GlobalArea* area = globals.area;
  return area != nullptr && __atomic_load_n(&area->init_count, __ATOMIC_RELAXED) != 0;
}

/// Whether files may be opened: also by the initialisation itself.
inline bool files_usable() {
  return globals.area != nullptr && globals.area->file_context == 1;
}

/// The locale that a call works in: the one given, or the default; null when there is none or the library is
/// not initialised, in which case nothing of `given` may be touched.
inline LXLocale* locale_of(LXLocale* given) {
  if (__builtin_expect(!initialized(), 0)) return nullptr;
  return given != nullptr ? given : globals.default_locale;
}

/// The library's own object manager, or null.
inline LXObjManager* manager_of(LXObjManager* given) {
  if (!initialized()) return nullptr;
  return given != nullptr ? given : globals.area->manager;
}

// Record sizes that callers with their own hooks see on 32-bit machines.
static_assert(sizeof(LXObjDisk) == 38, "the control file's record");
static_assert(sizeof(void*) != 4 || sizeof(LXObjManager) == 276, "object manager");
static_assert(sizeof(void*) != 4 || sizeof(LXFile) == 272, "file handle");
static_assert(sizeof(void*) != 4 || sizeof(AliasRecord) == 104, "alias record");

}  // namespace lx
