// Message catalogs as callers use them: opened by name, asked for messages, closed. Each form goes through the
// bytes of the caller's codepage.
#include "catalog/lxmsgcat.h"

#include "codepage/lxtext.h"
#include "core/lxcall.h"

using namespace lx;

namespace {

RAS1_Unit unit = RAS1_UNIT("lxmsgcat");

constexpr uint32_t kOrderProbe = 0x00010203;

// Of any codepage, its shift byte included, and how many of them a size counts.
constexpr size_t kMostCharBytes = kMaxCharBytes + 1;
constexpr size_t kMostChars = INT32_MAX / kMostCharBytes - 1;

constexpr bool has_all(uint32_t flags, uint32_t bits) {
  return (flags & bits) == bits;
}

/// Room for the bytes of `chars` characters, a Shift-In and a null; no room for more than a size can count.
class ByteRoom {
 public:
  explicit ByteRoom(size_t chars)
      : bytes_(chars <= kMostChars ? (chars + 1) * kMostCharBytes : 0), room_(bytes_) {}
  explicit operator bool() const { return bytes_ != 0 && room_; }
  char* text() const { return room_.as<char>(); }
  int32_t size() const { return static_cast<int32_t>(bytes_); }

 private:
  size_t bytes_;
  WorkBuffer room_;
};

void to_bytes(LXLocale* locale, const LXWChar* text, const ByteRoom& room) {
  LXWideToMbEx(locale, room.text(), LX_SHIFT_SINGLE, room.size(), text, -1, 0);
}
void to_bytes(LXLocale* locale, const LXUChar* text, const ByteRoom& room) {
  LXUnicodeToStringEx(locale, room.text(), LX_SHIFT_SINGLE, room.size(), text, -1, LX_TERMINATE);
}

/// The bytes of a null-terminated argument; of null, null. False when they could not be made.
template <class Unit>
class Argument {
 public:
  Argument(LXLocale* locale, const Unit* text)
      : given_(text != nullptr), room_(given_ ? text_units(text, -1) : 0) {
    if (given_ && room_) to_bytes(locale, text, room_);
  }
  explicit operator bool() const { return static_cast<bool>(room_); }
  const char* bytes() const { return given_ ? room_.text() : nullptr; }

 private:
  bool given_;
  ByteRoom room_;
};
template <>
class Argument<char> {
 public:
  Argument(LXLocale*, const char* text) : text_(text) {}
  explicit operator bool() const { return true; }
  const char* bytes() const { return text_; }

 private:
  const char* text_;
};

template <class Unit>
LXCatalog* open_catalog(LXLocale* locale, const Unit* directory, const Unit* name, uint32_t flags) {
  LXCatalog* const none = nullptr;
  Call call(unit, locale);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, none);
  if ((flags & ~LX_CATALOG_LOAD) != 0 || name == nullptr || name[0] == 0) return call.fail(LX_E_INVALID, none);
  const Argument<Unit> directory_bytes(call.locale(), directory);
  const Argument<Unit> name_bytes(call.locale(), name);
  if (!directory_bytes || !name_bytes) return call.fail(LX_E_CATALOG, none);
  int32_t rc = LX_OK;
  LXFile* file = open_catalog_file(call.locale(), directory_bytes.bytes(), name_bytes.bytes(),
                                   has_all(flags, LX_CATALOG_ONE_LOCALE), &rc);
  if (file == nullptr) return call.fail(rc, none);
  LXCatalog* catalog = LXMcLoadCat(file, locale, flags, &rc);
  return call.end(rc, catalog);
}

// Writing a message, and a default text. `size` is above 0; the result is a code.

int32_t write_message(LXLocale* locale, LXLocale* from, const MessageText& message, char* output,
                      int32_t size) {
  LXConvertStringEx(locale, output, LX_SHIFT_SINGLE, size, from, message.text, LX_SHIFT_SINGLE, message.bytes,
                    LX_TERMINATE);
  return LX_OK;
}

/// As many characters of a text as can be ended; it may stand in the output.
int32_t write_default(LXLocale* locale, const char* text, char* output, int32_t size) {
  const Codepage& cp = codepage_of(*locale->codepage);
  const uint8_t* const p = bytes_of(text);
  const size_t given = strlen(text), room = static_cast<size_t>(size);
  size_t bytes = 0;
  LXShiftState state = LX_SHIFT_SINGLE;
  const auto cut = [&](size_t most) {
    bytes = whole_chars(cp, Form::kEx, p, LX_SHIFT_SINGLE, least(given, most), given).units;
    state = state_behind(cp, p, LX_SHIFT_SINGLE, bytes);
  };
  cut(room - 1);
  if (state == LX_SHIFT_DOUBLE && room - bytes < 2) cut(room - 2);  // a Shift-In stands before the null
  memmove(output, text, bytes);
  LXTerminateStringEx(locale, output + bytes, state, LX_TERMINATE);
  return LX_OK;
}

void from_bytes(LXLocale* locale, const char* text, LXWChar* output, int32_t size) {
  const int32_t codes =
      LXMbToWideEx(locale, output, size - 1, text, LX_SHIFT_SINGLE, static_cast<int32_t>(strlen(text)), 0);
  output[codes] = 0;
}
void from_bytes(LXLocale* locale, const char* text, LXUChar* output, int32_t size) {
  LXStringToUnicodeEx(output, size, locale, text, LX_SHIFT_SINGLE, -1, LX_TERMINATE);
}

template <class Unit>
int32_t write_message(LXLocale* locale, LXLocale* from, const MessageText& message, Unit* output,
                      int32_t size) {
  // No more characters than the message has bytes, or the output has units.
  const ByteRoom room(least(static_cast<size_t>(message.bytes), static_cast<size_t>(size), kMostChars));
  if (!room) return LX_E_CATALOG;
  write_message(locale, from, message, room.text(), room.size());
  from_bytes(locale, room.text(), output, size);
  return LX_OK;
}

template <class Unit>
int32_t write_default(LXLocale* locale, const Unit* text, Unit* output, int32_t size) {
  const Argument<Unit> bytes(locale, text);
  output[0] = 0;
  if (!bytes) return LX_E_CATALOG;
  from_bytes(locale, bytes.bytes(), output, size);
  return LX_OK;
}

template <class Unit>
int32_t get_message(LXCatalog* catalog, uint32_t set, uint32_t number, Unit* output, int32_t size,
                    const Unit* default_text) {
  // A catalog that outlived the library is not touched.
  Call call(unit, catalog != nullptr && initialized() ? catalog->opener : nullptr);
  if (catalog == nullptr) return call.fail(LX_E_CATALOG_NULL, LX_E_CATALOG_NULL);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, LX_E_NOT_INITIALIZED);
  if (size <= 0) {
    output[0] = 0;
    return call.exit(LX_OK);
  }
  SetRecord room;
  const SetRecord* record = nullptr;
  MessageText message;
  int32_t code = MCGetSet(catalog, set, &room, &record);
  if (code == LX_OK) code = MCGetMsg(*catalog, *record, number, &message);
  if (code == LX_E_MESSAGE && default_text != nullptr) {
    code = write_default(call.locale(), default_text, output, size);
  } else {
    output[0] = 0;
    if (code == LX_OK) code = write_message(call.locale(), catalog->locale, message, output, size);
  }
  return call.end(code, code);
}

}  // namespace

extern "C" {

LXCatalog* LXOpenCatalog(LXLocale* locale, const char* directory, const char* name, uint32_t flags) {
  return open_catalog(locale, directory, name, flags);
}
LXCatalog* LXOpenCatalogW(LXLocale* locale, const LXWChar* directory, const LXWChar* name, uint32_t flags) {
  return open_catalog(locale, directory, name, flags);
}
LXCatalog* LXOpenCatalogU(LXLocale* locale, const LXUChar* directory, const LXUChar* name, uint32_t flags) {
  return open_catalog(locale, directory, name, flags);
}

int32_t LXGetMessage(LXCatalog* catalog, uint32_t set, uint32_t number, char* output, int32_t size,
                     const char* default_text) {
  return get_message(catalog, set, number, output, size, default_text);
}
int32_t LXGetMessageW(LXCatalog* catalog, uint32_t set, uint32_t number, LXWChar* output, int32_t size,
                      const LXWChar* default_text) {
  return get_message(catalog, set, number, output, size, default_text);
}
int32_t LXGetMessageU(LXCatalog* catalog, uint32_t set, uint32_t number, LXUChar* output, int32_t size,
                      const LXUChar* default_text) {
  return get_message(catalog, set, number, output, size, default_text);
}

int32_t LXCloseCatalog(LXCatalog* catalog) {
  if (catalog == nullptr) {
    Call call(unit, nullptr);
    return call.fail(LX_E_CATALOG_NULL, LX_E_CATALOG_NULL);
  }
  Events events(unit);
  if (!initialized()) return events.exit(LX_E_NOT_INITIALIZED);
  free_catalog(catalog);
  return events.exit(LX_OK);
}

void* LXMcMalloc(size_t bytes) {
  return initialized() ? hook_allocate(bytes) : nullptr;
}
int32_t LXMcFree(void* block) {
  return initialized() && hook_free(block) ? 1 : 0;
}
void* LXMcRealloc(void* block, size_t old_bytes, size_t bytes) {
  void* const larger = LXMcMalloc(bytes);
  if (larger == nullptr || block == nullptr) return larger;
  memcpy(larger, block, least(old_bytes, bytes));
  hook_free(block);
  return larger;
}
void LXMcSetZero(void* block, size_t bytes) {
  if (bytes != 0) memset(block, 0, bytes);
}
void LXMcMemcpy(void* to, const void* from, size_t bytes) {
  if (bytes != 0) memcpy(to, from, bytes);
}

uint32_t LXMcGetByteOrder(void) {
  static constexpr uint8_t kBigEndian[] = {0, 1, 2, 3};
  return memcmp(&kOrderProbe, kBigEndian, sizeof(kOrderProbe)) == 0 ? format::catalog::kBigEndian
                                                                    : format::catalog::kLittleEndian;
}

}  // extern "C"
