// The process interface: initialises the library once in the process, keeps the process's default locale and
// one locale for each thread, and answers by identifier and name. Also hands locales to the operating system.
#include <locale.h>
#include <string.h>

#include "core/lxbytes.h"
#include "core/lxcall.h"
#include "core/lxformat.h"
#include "core/lxlock.h"
#include "core/lxobjman.h"
#include "nls1.h"
#include "platform/bss1.h"

using namespace lx;

namespace {

RAS1_Unit unit = RAS1_UNIT("qrlnls1");

constexpr char kDirectoryVariable[] = "NLS1_LOCALEDIR";
constexpr int32_t kLocaleFlags = LX_USER_LOCALE | LX_FALLBACK;
constexpr int32_t kNativeFlags = LX_TERRITORY_VALUES | LX_FALLBACK;
constexpr int32_t kIdsPerHalf = 65536;  // a combined value is territory * 65536 + language
constexpr int32_t kNoProcess = 1;       // code of NLS1_GetLocale alone; the others give 11

constexpr size_t kNameBytes = sizeof(LXObjDisk::name);
constexpr size_t kItemBytes = 32;        // of a part of the name that is made from a native name
constexpr size_t kNativeNameBytes = 32;  // more than LXConvertLocale writes

// ---- The blocks of the process and of its threads

struct ProcessSlot {
  int32_t result;  // of the initialisation
};

struct ThreadSlot {
  LXLocale* locale;  // or null
};

// 0 before the initialisation of the process and after its end, 1 when the library can be used, -1 when it
// could not be initialised.
int32_t process_state;

void InitProcess(void* block) {
  Events events(unit);
  const char* directory = BSS1_GetEnv(kDirectoryVariable);
  if (directory == nullptr)
    LX_TRACE(unit, RAS1_LEVEL_PROCESS, "Unable to determine location of locale definitions\n");
  int32_t rc = LXInit(directory, nullptr, nullptr, nullptr, 0);
  const bool usable = rc == LX_OK || rc == LX_W_DEFAULTS;
  if (usable) {
    rc = LXSetLocale(nullptr, kLocaleFlags);
    if (rc != LX_OK) LX_TRACE(unit, RAS1_LEVEL_PROCESS, "Unable to set global locale, rc = %d", rc);
  } else {
    LX_TRACE(unit, RAS1_LEVEL_PROCESS, "Unable to initialize Lexicor, rc = %d", rc);
  }
  __atomic_store_n(&process_state, usable ? 1 : -1, __ATOMIC_RELEASE);
  static_cast<ProcessSlot*>(block)->result = rc;
}

void TermProcess(void*) {
  Events events(unit);
  // One that failed has nothing to undo: a later LXInit is the program's own.
  if (__atomic_exchange_n(&process_state, 0, __ATOMIC_ACQ_REL) >= 1) LXTerm();
}

BSS1_ProcessBlock process_block = BSS1_PROCESS_BLOCK(InitProcess, TermProcess, sizeof(ProcessSlot));

/// Initialises the process when nobody has. Whether the library can be used: not after the process's end
/// either, nor after a program's own last LXTerm.
bool process_ready() {
  return BSS1_ResolveProcess(&process_block) != nullptr &&
         __atomic_load_n(&process_state, __ATOMIC_ACQUIRE) >= 1 && initialized();
}

void InitThread(void* block) {
  Events events(unit);
  if (!process_ready()) return;
  int32_t rc = LX_OK;
  LXLocale* locale = LXGetLocale(nullptr, kLocaleFlags, &rc);
  if (locale == nullptr) LX_TRACE(unit, RAS1_LEVEL_PROCESS, "Unable to set thread locale, rc = %d", rc);
  static_cast<ThreadSlot*>(block)->locale = locale;
}

void TermThread(void* block) {
  Events events(unit);
  LXReleaseLocale(static_cast<ThreadSlot*>(block)->locale);  // touches nothing after the last LXTerm
}

constexpr BSS1_ThreadBlock kThreadBlock = BSS1_THREAD_BLOCK(InitThread, TermThread, sizeof(ThreadSlot));

ThreadSlot* thread_slot() {
  return static_cast<ThreadSlot*>(BSS1_ResolveThread(&kThreadBlock));
}

/// Gives the thread a locale in place of its previous one; releases it when there is no slot.
int32_t replace_thread_locale(LXLocale* locale) {
  ThreadSlot* slot = thread_slot();
  LXReleaseLocale(slot != nullptr ? slot->locale : locale);
  if (slot == nullptr) return LX_E_MEMORY;
  slot->locale = locale;
  return LX_OK;
}

// ---- Objects by identifier and name

/// What a look-up gave, if it is of the type asked for.
const LXObjDisk* of_type(const LXObject* object, int32_t type, int32_t* rc) {
  if (object == nullptr) return nullptr;
  if (object->disk.type == type) return &object->disk;
  *rc = LX_E_NOT_FOUND;
  return nullptr;
}

const LXObjDisk* find(int32_t type, int32_t id, int32_t* rc) {
  *rc = LX_E_NOT_FOUND;
  if (id < 0 || id > UINT16_MAX) return nullptr;
  return of_type(LXGetObjFromID(nullptr, type, static_cast<uint16_t>(id), LX_FIND_ONLY, rc), type, rc);
}

const LXObjDisk* find(int32_t type, const char* name, int32_t* rc) {
  if (name == nullptr) name = "";
  const int32_t bytes = static_cast<int32_t>(strnlen(name, INT32_MAX));
  return of_type(LXGetObjFromName(nullptr, type, name, bytes, LX_FIND_ONLY, rc), type, rc);
}

/// The identifiers of a combined value: remainder and quotient of a signed division, 16 bits of each.
int32_t language_of(int32_t language_territory) {
  return static_cast<uint16_t>(language_territory % kIdsPerHalf);
}
int32_t territory_of(int32_t language_territory) {
  return static_cast<uint16_t>(language_territory / kIdsPerHalf);
}

int32_t get_object_id(int32_t type, const char* name, int32_t* rc) {
  int32_t code = LX_E_NOT_INITIALIZED;
  const LXObjDisk* object = process_ready() ? find(type, name, &code) : nullptr;
  if (rc != nullptr) *rc = code;
  return object != nullptr ? object->id : 0;
}

int32_t get_object_name(int32_t type, int32_t id, char* buffer, int32_t size) {
  if (!process_ready()) return LX_E_NOT_INITIALIZED;
  int32_t rc = LX_OK;
  const LXObjDisk* object = find(type, id, &rc);
  if (object == nullptr) {
    // Binary order is no object, and no failure either: its name is empty.
    if (rc == LX_OK && size > 0) buffer[0] = '\0';
    return rc;
  }
  const int32_t bytes = static_cast<int32_t>(strlen(object->name));
  if (bytes >= size) {
    LX_TRACE(unit, RAS1_LEVEL_ERRORS, "Object name length (%d) for %s exceeds output buffer length (%d)", bytes,
             object->name, size);
    return LX_E_SIZE;
  }
  strcpy(buffer, object->name);
  return LX_OK;
}

/// The name of a locale, put together from identifiers.
class LocaleName {
 public:
  const char* text() const { return text_; }

  /// LX_OK, or the code of the first part that there is no object for.
  int32_t build(int32_t language_territory, int32_t codepage) {
    const struct {
      const char* mark;
      int32_t type, id, code;
      const char* title;
    } parts[] = {{"", LX_LANGUAGE, language_of(language_territory), LX_E_NO_LANGUAGE, "Language"},
                 {"_", LX_TERRITORY, territory_of(language_territory), LX_E_NO_TERRITORY, "Territory"},
                 {".", LX_CODEPAGE, codepage, LX_E_NO_CODEPAGE, "Codepage"}};
    for (const auto& part : parts) {
      if (append(part.mark, part.type, part.id)) continue;
      LX_TRACE(unit, RAS1_LEVEL_DETAIL, "Invalid %s %d", part.title, part.id);
      return part.code;
    }
    return LX_OK;
  }

 private:
  /// False when there is no such object; 0 is not given.
  bool append(const char* mark, int32_t type, int32_t id) {
    if (id == 0) return true;
    int32_t rc = LX_OK;
    const LXObjDisk* object = find(type, id, &rc);
    if (object == nullptr) return false;
    strcat(strcat(text_, mark), object->name);
    return true;
  }

  char text_[3 * kNameBytes] = "";  // the terminators' places take the marks
};

LXLocale* create_locale(int32_t language_territory, int32_t codepage, int32_t flags, int32_t* rc) {
  LocaleName name;
  *rc = name.build(language_territory, codepage);
  return *rc == LX_OK ? LXGetLocale(name.text(), flags, rc) : nullptr;
}

LXLocale* convert_native(const char* native_name, int32_t flags, int32_t* rc) {
  if (native_name == nullptr) native_name = "";
  LXLocale* locale = LXConvertNativeLocale(native_name, flags, rc);
  if (locale == nullptr)
    LX_TRACE(unit, RAS1_LEVEL_ERRORS, "LXConvertNativeLocale failed for %s with rc %d", native_name, *rc);
  return locale;
}

/// Installs the process's default by the names of a locale's objects. The territory is copied over the
/// language, not appended: callers know the process's locale by the name that comes of it.
int32_t install_by_names_of(LXLocale* locale, int32_t flags) {
  char language[kItemBytes] = "", territory[kItemBytes] = "", codepage[kItemBytes] = "", sort[kItemBytes] = "";
  LXGetLocaleTextInfo(locale, LX_ITEM_LANGUAGE, language, kItemBytes, 0);
  LXGetLocaleTextInfo(locale, LX_ITEM_TERRITORY, territory, kItemBytes, 0);
  LXGetLocaleTextInfo(locale, LX_ITEM_CODEPAGE, codepage, kItemBytes, 0);
  LXGetLocaleTextInfo(locale, LX_ITEM_SORT, sort, kItemBytes, 0);
  char name[4 * kItemBytes];
  strcpy(name, language);
  strcat(name, "_");
  strcpy(name, territory);
  strcat(name, ".");
  strcat(name, codepage);
  strcat(name, "@");
  strcat(name, sort);
  return LXSetLocale(name, flags & kLocaleFlags);
}

int32_t set_native(LXLocale* locale, int32_t category, int32_t flags) {
  char name[kNativeNameBytes];
  if (LXConvertLocale(locale, name, flags) == 0) {
    LX_TRACE(unit, RAS1_LEVEL_ERRORS, "NLS1_ConvertLocale failed with rc = %d", LXGetError(locale));
    return LX_E_NO_NATIVE;
  }
  const GlobalLock lock;  // not while the library has another locale set, which it would put back over this
  if (setlocale(category, name) != nullptr) return LX_OK;
  LX_TRACE(unit, RAS1_LEVEL_ERRORS, "setlocale failed to setlocale to %s", name);
  return LX_E_NO_NATIVE;
}

}  // namespace

extern "C" {

void NLS1_PrivateFunction_GetProcessLocale(void) {
  Events events(unit);
  BSS1_ResolveProcess(&process_block);
}

LXLocale* NLS1_PrivateFunction_GetThreadLocale(void) {
  Events events(unit);
  const ThreadSlot* slot = process_ready() ? thread_slot() : nullptr;
  return events.exit(slot != nullptr ? slot->locale : nullptr);
}

LXLocale* NLS1_GetLocale(int32_t language_territory, int32_t codepage, int32_t flags, int32_t* rc) {
  Events events(unit);
  int32_t code = kNoProcess;
  LXLocale* locale = process_ready() ? create_locale(language_territory, codepage, flags, &code) : nullptr;
  if (rc != nullptr) *rc = code;
  return events.exit(locale);
}

int32_t NLS1_SetLocale(int32_t language_territory, int32_t codepage, int32_t flags) {
  Events events(unit);
  if (!process_ready()) return events.exit(int32_t{LX_E_NOT_INITIALIZED});
  if ((flags & NLS1_THREAD) != 0) {
    // The creation is given the flags as they are, and refuses the thread's bit: callers rely on the thread's
    // locale staying what it is.
    int32_t rc = LX_OK;
    LXLocale* locale = create_locale(language_territory, codepage, flags, &rc);
    if (locale != nullptr) rc = replace_thread_locale(locale);
    if (rc != LX_OK || (flags & NLS1_PROCESS) == 0) return events.exit(rc);
  }
  LocaleName name;
  const int32_t rc = name.build(language_territory, codepage);
  return events.exit(rc != LX_OK ? rc : LXSetLocale(name.text(), flags & kLocaleFlags));
}

int32_t NLS1_SetLocaleFromNative(const char* native_name, int32_t flags) {
  Events events(unit);
  if (!process_ready()) return events.exit(int32_t{LX_E_NOT_INITIALIZED});
  int32_t rc = LX_OK;
  LXLocale* locale = convert_native(native_name, flags & kNativeFlags, &rc);
  if (locale == nullptr) return events.exit(rc);
  if ((flags & NLS1_PROCESS) != 0) rc = install_by_names_of(locale, flags);
  if ((flags & NLS1_THREAD) != 0) {
    const int32_t replaced = replace_thread_locale(locale);
    if (rc == LX_OK) rc = replaced;
  } else {
    LXReleaseLocale(locale);
  }
  return events.exit(rc);
}

int32_t NLS1_SetNativeLocale(int32_t language_territory, int32_t codepage, int32_t category, int32_t flags) {
  Events events(unit);
  if (!process_ready()) return events.exit(int32_t{LX_E_NOT_INITIALIZED});
  int32_t rc = LX_OK;
  LXLocale* locale = create_locale(language_territory, codepage, flags, &rc);
  if (locale == nullptr) return events.exit(rc);
  rc = set_native(locale, category, flags);
  LXReleaseLocale(locale);
  return events.exit(rc);
}

int32_t NLS1_SetNativeFromLocale(LXLocale* locale, int32_t category, int32_t flags) {
  Events events(unit);
  return events.exit(process_ready() ? set_native(locale, category, flags) : int32_t{LX_E_NOT_INITIALIZED});
}

LXLocale* NLS1_ConvertNativeLocale(const char* native_name, int32_t flags, int32_t* rc) {
  Events events(unit);
  int32_t code = LX_E_NOT_INITIALIZED;
  LXLocale* locale = process_ready() ? convert_native(native_name, flags, &code) : nullptr;
  if (rc != nullptr) *rc = code;
  return events.exit(locale);
}

int32_t NLS1_GetLanguageId(const char* name, int32_t* rc) {
  return Events(unit).exit(get_object_id(LX_LANGUAGE, name, rc));
}
int32_t NLS1_GetTerritoryId(const char* name, int32_t* rc) {
  return Events(unit).exit(get_object_id(LX_TERRITORY, name, rc));
}
int32_t NLS1_GetCodepageId(const char* name, int32_t* rc) {
  Events events(unit);
  const char* canonical = name != nullptr && process_ready() ? LXGetCodepageFromAlias(nullptr, name) : nullptr;
  return events.exit(get_object_id(LX_CODEPAGE, canonical != nullptr ? canonical : name, rc));
}
int32_t NLS1_GetSortId(const char* name, int32_t* rc) {
  return Events(unit).exit(get_object_id(LX_SORT, name, rc));
}

int32_t NLS1_GetLanguageName(int32_t id, char* buffer, int32_t size) {
  return Events(unit).exit(get_object_name(LX_LANGUAGE, id > UINT16_MAX ? language_of(id) : id, buffer, size));
}
int32_t NLS1_GetTerritoryName(int32_t id, char* buffer, int32_t size) {
  return Events(unit).exit(
      get_object_name(LX_TERRITORY, id > UINT16_MAX ? territory_of(id) : id, buffer, size));
}
int32_t NLS1_GetCodepageName(int32_t id, char* buffer, int32_t size) {
  return Events(unit).exit(get_object_name(LX_CODEPAGE, id, buffer, size));
}
int32_t NLS1_GetSortName(int32_t id, char* buffer, int32_t size) {
  return Events(unit).exit(get_object_name(LX_SORT, id, buffer, size));
}

int32_t NLS1_GetLocaleNumInfo(LXLocale* locale, int32_t item, int32_t source) {
  if (item != LX_ITEM_DEFAULT_CODEPAGE) return Events(unit).exit(LXGetLocaleNumInfo(locale, item, source));
  Call call(unit, locale);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, -1);
  const uint8_t* language = payload_of(*call.locale()->language);
  return call.exit(int32_t{le16(language + 2 * format::language::kDefaultCodepage)});
}
int32_t NLS1_SetLocaleNumInfo(LXLocale* locale, int32_t item, int32_t value) {
  return Events(unit).exit(LXSetLocaleNumInfo(locale, item, value));
}

int32_t NLS1_GetLocaleTextInfo(LXLocale* locale, int32_t item, char* buffer, int32_t size, int32_t flags) {
  return Events(unit).exit(LXGetLocaleTextInfo(locale, item, buffer, size, flags));
}
int32_t NLS1_GetLocaleTextInfoW(LXLocale* locale, int32_t item, LXWChar* buffer, int32_t size, int32_t flags) {
  return Events(unit).exit(LXGetLocaleTextInfoW(locale, item, buffer, size, flags));
}
int32_t NLS1_GetLocaleTextInfoU(LXLocale* locale, int32_t item, LXUChar* buffer, int32_t size, int32_t flags) {
  return Events(unit).exit(LXGetLocaleTextInfoU(locale, item, buffer, size, flags));
}
int32_t NLS1_GetLocaleTextInfoEx(LXLocale* locale, int32_t item, char* buffer, LXShiftState state, int32_t size,
                                 int32_t flags) {
  return Events(unit).exit(LXGetLocaleTextInfoEx(locale, item, buffer, state, size, flags));
}
int32_t NLS1_SetLocaleTextInfo(LXLocale* locale, int32_t item, const char* text, int32_t length,
                               int32_t flags) {
  return Events(unit).exit(LXSetLocaleTextInfo(locale, item, text, length, flags));
}
int32_t NLS1_SetLocaleTextInfoW(LXLocale* locale, int32_t item, const LXWChar* text, int32_t length,
                                int32_t flags) {
  return Events(unit).exit(LXSetLocaleTextInfoW(locale, item, text, length, flags));
}
int32_t NLS1_SetLocaleTextInfoU(LXLocale* locale, int32_t item, const LXUChar* text, int32_t length,
                                int32_t flags) {
  return Events(unit).exit(LXSetLocaleTextInfoU(locale, item, text, length, flags));
}
int32_t NLS1_SetLocaleTextInfoEx(LXLocale* locale, int32_t item, const char* text, LXShiftState state,
                                 int32_t length, int32_t flags) {
  return Events(unit).exit(LXSetLocaleTextInfoEx(locale, item, text, state, length, flags));
}

}  // extern "C"
