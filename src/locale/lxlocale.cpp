// Locale handles: created by name, shared by nobody, released by their owner. Also the default locale, the
// enumeration of what a locale can be made of, and the operating system's name of a locale.
#include "locale/lxlocale.h"

#include <string.h>

#include "codepage/lxlength.h"
#include "core/lxcall.h"
#include "core/lxmemory.h"
#include "core/lxobjman.h"

using namespace lx;

namespace {

RAS1_Unit unit = RAS1_UNIT("lxlocale");

constexpr char kDefaultLanguage[] = "English";
constexpr int32_t kCreateFlags = LX_USER_LOCALE | LX_FALLBACK;

/// A part of a locale name.
template <class Unit>
struct Part {
  const Unit* text = nullptr;
  int32_t length = 0;
  bool named = false;
};

template <class Unit>
struct LocaleName {
  Part<Unit> language, territory, codepage, sort;

  /// language, then optionally "_" territory, "." codepage, "@" sort, in this order. `units` bounds the name.
  LocaleName(const Unit* name, size_t units) : p_(name), end_(name + units) {
    language = take('_', '.', '@');
    language.named = language.length != 0;
    if (follows('_')) territory = take('.', '.', '@');
    if (follows('.')) codepage = take('@', '@', '@');
    if (follows('@')) sort = take('\0', '\0', '\0');
  }

 private:
  bool at_end() const { return p_ == end_ || *p_ == 0; }
  bool follows(char mark) {
    if (at_end() || *p_ != static_cast<Unit>(mark)) return false;
    ++p_;
    return true;
  }
  Part<Unit> take(char mark1, char mark2, char mark3) {
    Part<Unit> part;
    part.text = p_;
    part.named = true;
    while (!at_end() && *p_ != static_cast<Unit>(mark1) && *p_ != static_cast<Unit>(mark2) &&
           *p_ != static_cast<Unit>(mark3))
      ++p_;
    part.length = static_cast<int32_t>(p_ - part.text);
    return part;
  }

  const Unit* p_;
  const Unit* end_;
};

LXObject* find(int32_t type, const Part<char>& part, int32_t* rc) {
  return LXGetObjFromName(nullptr, type, part.text, part.length, LX_FIND_AND_LOAD, rc);
}
LXObject* find(int32_t type, const Part<LXWChar>& part, int32_t* rc) {
  return LXGetObjFromNameW(nullptr, type, part.text, part.length, LX_FIND_AND_LOAD, rc);
}

/// A named object; one that is not named, or is missing where a fallback is asked for, is the language's
/// default.
template <class Unit>
LXObject* find_or_default(int32_t type, const Part<Unit>& part, const LXObject& language, size_t default_word,
                          int32_t flags, int32_t* rc) {
  if (part.named) {
    LXObject* object = find(type, part, rc);
    if (*rc != LX_E_NOT_FOUND || (flags & LX_FALLBACK) == 0) return object;
  }
  return object_by_id(type, le16(payload_of(language) + 2 * default_word), rc);
}

/// The result of a look-up as a code of locale creation: an object may come with a code when built-in data took
/// the place of its file, and a sort may be null for binary order.
int32_t lookup_code(const LXObject* object, int32_t rc, int32_t not_found) {
  if (object != nullptr || rc == LX_OK) return LX_OK;
  if (rc == LX_E_NOT_FOUND) return not_found;
  return rc == LX_E_MEMORY ? LX_E_MEMORY : LX_E_NOT_INITIALIZED;
}

/// Finds the four objects of a locale.
template <class Unit>
int32_t find_objects(LXLocale* locale, const LocaleName<Unit>& name, int32_t flags) {
  namespace words = format::language;
  int32_t rc = LX_E_NOT_FOUND;
  const auto check = [&rc](const LXObject* object, int32_t not_found, const char* title) {
    const int32_t code = lookup_code(object, rc, not_found);
    if (code != LX_OK) LX_TRACE(unit, RAS1_LEVEL_ERRORS, "Unable to locate %s, rc = %d", title, rc);
    return code;
  };
  const bool is_default = !name.language.named;
  if (!is_default) locale->language = find(LX_LANGUAGE, name.language, &rc);
  if (is_default || (rc == LX_E_NOT_FOUND && (flags & LX_FALLBACK) != 0)) {
    const Part<char> english{kDefaultLanguage, static_cast<int32_t>(strlen(kDefaultLanguage)), true};
    locale->language = find(LX_LANGUAGE, english, &rc);
  }
  if (const int32_t code = check(locale->language, LX_E_NO_LANGUAGE, "language")) return code;
  const auto find_other = [&](int32_t type, const Part<Unit>& part, size_t default_word) {
    return find_or_default(type, part, *locale->language, default_word, flags, &rc);
  };
  locale->territory = find_other(LX_TERRITORY, name.territory, words::kDefaultTerritory);
  if (const int32_t code = check(locale->territory, LX_E_NO_TERRITORY, "territory")) return code;
  locale->codepage = find_other(LX_CODEPAGE, name.codepage, words::kDefaultCodepage);
  if (const int32_t code = check(locale->codepage, LX_E_NO_CODEPAGE, "code page")) return code;
  locale->sort = find_other(LX_SORT, name.sort, words::kDefaultSort);
  return check(locale->sort, LX_E_NO_SORT, "sort");
}

/// Finds the objects of a locale and fills its values.
template <class Unit>
int32_t build(LXLocale* locale, const LocaleName<Unit>& name, int32_t flags) {
  if (const int32_t code = find_objects(locale, name, flags)) return code;
  set_codepage_flags(locale);
  set_sort(locale, locale->sort);
  const int32_t code = set_modifiable(locale);
  if (code != LX_OK) LX_TRACE(unit, RAS1_LEVEL_ERRORS, "Unable to set modifiable values, err = %d", code);
  return code;
}

/// Creates a locale; null with a code.
template <class Unit>
LXLocale* create(const Unit* name, size_t units, int32_t flags, int32_t* rc) {
  auto* locale = static_cast<LXLocale*>(hook_allocate_zeroed(sizeof(LXLocale)));
  *rc = LX_E_MEMORY;
  if (locale == nullptr) return nullptr;
  *rc = build(locale, LocaleName<Unit>(name, units), flags);
  if (*rc == LX_OK) return locale;
  free_locale(locale);
  return nullptr;
}

/// Creates the user's locale. One that the system's environment asks for has the system's conventions.
LXLocale* create_for_user(int32_t flags, int32_t* rc) {
  char name[kUserNameBytes];
  const UserLocale from = get_user_locale(name, sizeof(name));
  *rc = LX_E_NO_NATIVE;
  if (from == UserLocale::kFailed) return nullptr;
  LXLocale* locale = create(name, strnlen(name, sizeof(name)), flags, rc);
  if (locale == nullptr || from == UserLocale::kVariable) return locale;
  *rc = map_native_info("", locale);
  if (*rc == LX_OK) return locale;
  free_locale(locale);
  return nullptr;
}

LXLocale* create_from_bytes(const char* name, int32_t flags, int32_t* rc) {
  *rc = LX_E_NOT_INITIALIZED;
  if (!initialized()) return nullptr;
  *rc = LX_E_INVALID;
  if ((flags & ~kCreateFlags) != 0) return nullptr;
  if ((flags & LX_USER_LOCALE) != 0) return create_for_user(flags, rc);
  return create(name != nullptr ? name : "", name != nullptr ? strlen(name) : 0, flags, rc);
}

/// Creates a locale and installs it as the default in place of the previous one.
template <class Create>
int32_t install(Create create_locale) {
  Events events(unit);
  int32_t rc = LX_OK;
  LXLocale* locale = create_locale(&rc);
  if (locale == nullptr) return events.exit(rc);
  LXLocale* previous = globals.default_locale;
  globals.default_locale = locale;
  globals.release_default = LXReleaseLocale;
  if (previous != nullptr) LXReleaseLocale(previous);
  return events.exit(LX_OK);
}

/// Gives each object of the library's manager to `visit(entry)` until that returns 0.
template <class Visit>
int32_t enumerate(Visit visit) {
  Events events(unit);
  const LXObjManager* manager = manager_of(nullptr);
  if (manager == nullptr) return events.exit(LX_OK);
  for (uint16_t i = 0; i < manager->count; ++i)
    if (visit(manager->entries[i].disk) == 0) break;
  return events.exit(LX_OK);
}

/// The operating system's names of locales, the most specific search key first.
struct NativeName {
  uint16_t ids[4];  // language, territory, codepage, sort
  const char* name;
};
constexpr NativeName kNativeNames[] = {{{1, 840, 367, 0}, "C"}};
constexpr size_t kNativeKeys = 4;

/// Narrows the table step by step: the name of the most specific row reached, and how many keys it matches.
const char* nearest_native_name(const uint16_t ids[kNativeKeys], size_t* matched) {
  size_t row = 0;
  *matched = 0;
  for (size_t i = 0; i < sizeof(kNativeNames) / sizeof(kNativeNames[0]); ++i) {
    size_t keys = 0;
    while (keys < kNativeKeys && kNativeNames[i].ids[keys] == ids[keys]) ++keys;
    if (keys > *matched) {
      *matched = keys;
      row = i;
    }
  }
  return kNativeNames[row].name;
}

}  // namespace

namespace lx {

bool free_locale(LXLocale* locale) {
  bool freed = true;
  for (char* text : locale->texts) freed &= hook_free(text);
  for (LXUChar* text : locale->texts_unicode) freed &= hook_free(text);
  for (ReplacedTexts* replaced = locale->replaced; replaced != nullptr;) {
    for (LXUChar* text : replaced->texts) freed &= hook_free(text);
    ReplacedTexts* const next = replaced->next;
    freed &= hook_free(replaced);
    replaced = next;
  }
  freed &= hook_free(locale);
  return freed;
}

}  // namespace lx

extern "C" {

LXLocale* LXGetLocale(const char* name, int32_t flags, int32_t* rc) {
  Events events(unit);
  int32_t code = LX_OK;
  LXLocale* locale = create_from_bytes(name, flags, &code);
  if (rc != nullptr) *rc = code;
  return events.exit(locale);
}

LXLocale* LXGetLocaleW(const LXWChar* name, int32_t flags, int32_t* rc) {
  if ((flags & LX_USER_LOCALE) != 0 || name == nullptr) return LXGetLocale(nullptr, flags, rc);
  Events events(unit);
  int32_t code = initialized() ? LX_E_INVALID : LX_E_NOT_INITIALIZED;
  LXLocale* locale = nullptr;
  if (initialized() && (flags & ~kCreateFlags) == 0) {
    locale = create(name, units_before_null(name), flags, &code);
  }
  if (rc != nullptr) *rc = code;
  return events.exit(locale);
}

LXLocale* LXGetLocaleU(const LXUChar* name, int32_t flags, int32_t* rc) {
  Events events(unit);
  if (!initialized() || name == nullptr) return events.exit(LXGetLocale(nullptr, flags, rc));
  const size_t units = units_before_null(name);
  const WorkBuffer narrow(units * kMaxCharBytes + 1);
  if (!narrow) {
    if (rc != nullptr) *rc = LX_E_MEMORY;
    return events.exit(static_cast<LXLocale*>(nullptr));
  }
  LXComUnicodeToStr(name, -1, narrow.as<char>());
  return events.exit(LXGetLocale(narrow.as<char>(), flags, rc));
}

int32_t LXReleaseLocale(LXLocale* locale) {
  Events events(unit);
  if (!initialized()) return events.exit(1);
  if (locale == nullptr) return events.exit(LX_OK);
  return events.exit(free_locale(locale) ? LX_OK : 1);
}

int32_t LXSetLocale(const char* name, int32_t flags) {
  return install([&](int32_t* rc) { return LXGetLocale(name, flags, rc); });
}
int32_t LXSetLocaleW(const LXWChar* name, int32_t flags) {
  return install([&](int32_t* rc) { return LXGetLocaleW(name, flags, rc); });
}
int32_t LXSetLocaleU(const LXUChar* name, int32_t flags) {
  return install([&](int32_t* rc) { return LXGetLocaleU(name, flags, rc); });
}

int32_t LXConvertLocale(LXLocale* given, char* buffer, int32_t flags) {
  Call call(unit, given);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, 0);
  if ((flags & ~(LX_TERRITORY_VALUES | LX_FALLBACK)) != 0) return call.fail(LX_E_INVALID, 0);
  const LXLocale* locale = call.locale();
  const uint16_t ids[kNativeKeys] = {locale->language->disk.id, locale->territory->disk.id,
                                     locale->codepage->disk.id,
                                     locale->sort != nullptr ? locale->sort->disk.id : uint16_t{0}};
  size_t matched = 0;
  const char* name = nearest_native_name(ids, &matched);
  if (matched != kNativeKeys && (flags & LX_FALLBACK) == 0) return call.fail(LX_E_NO_NATIVE, 0);
  strcpy(buffer, name);
  return call.exit(1);
}

int32_t LXEnumLocales(LXLocaleCallback callback, void* user) {
  return enumerate([&](const LXObjDisk& disk) { return callback(user, disk.type, disk.name); });
}

int32_t LXEnumLocalesW(LXLocaleCallbackW callback, void* user) {
  return enumerate([&](const LXObjDisk& disk) {
    LXWChar name[sizeof(disk.name)];
    for (size_t i = 0; i < sizeof(disk.name); ++i) name[i] = static_cast<unsigned char>(disk.name[i]);
    return callback(user, disk.type, name);
  });
}

int32_t LXEnumLocalesU(LXLocaleCallbackU callback, void* user) {
  return enumerate([&](const LXObjDisk& disk) {
    LXUChar name[sizeof(disk.name)];
    LXComStrToUnicode(disk.name, -1, name);
    return callback(user, disk.type, name);
  });
}

}  // extern "C"
