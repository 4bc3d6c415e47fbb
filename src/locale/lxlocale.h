// What the locale room shows: the table of items, the texts of items, and the operations behind the functions
// that change a locale.
#pragma once

#include "codepage/lxcodepage.h"
#include "core/lxobjman.h"
#include "core/lxobjtypes.h"
#include "core/lxrecords.h"

namespace lx {

extern const ObjectType kLanguageType;
extern const ObjectType kTerritoryType;
extern const BuiltIn kBuiltInLanguage;
extern const BuiltIn kBuiltInTerritory;

/// Where an item's value stands. The comment says what an item's index counts.
enum class ItemKind : uint8_t {
  kNone,
  // Numbers.
  kObjectId,       // object type
  kNumber,         // LXLocale::numbers
  kFlag,           // bit of LXLocale::flags; the territory's flags have it one bit higher
  kSignPosition,   // LXLocale::sign_positions
  kTerritoryFlag,  // bit of the territory's flags
  kValue84,
  kCodepageWidth,
  kCodepageAscii,
  kCodepageShift,
  // Texts.
  kObjectName,     // object type
  kDefaultName,    // word of the language payload that holds the identifier
  kLanguageText,   // word of the language payload that holds the offset
  kTerritoryText,  // word of the territory payload that holds the offset
  kSeparator,      // LXLocale::separators; the territory's word
  kText,           // LXLocale::texts; kTextWords has the territory's word
  kLocaleString,
};

struct Item {
  ItemKind kind;
  uint8_t index;
};

/// The item of a number, kNone for a number that is no item.
Item item_of(int32_t number);

inline constexpr size_t kNumbers = 3;
inline constexpr size_t kFlags = 6;
inline constexpr size_t kSignPositions = 2;
inline constexpr size_t kSeparators = 5;
inline constexpr size_t kTexts = 8;
inline constexpr uint8_t kTextWords[kTexts] = {13, 15, 14, 17, 18, 19, 20, 21};

/// The bit of LXLocale::changed for a value that a locale has of its own; 0 for any other item.
constexpr uint32_t changed_bit(ItemKind kind, size_t index) {
  switch (kind) {
    case ItemKind::kNumber:
      return 0x1u << index;
    case ItemKind::kFlag:
      return 0x8u << index;
    case ItemKind::kSignPosition:
      return 0x200u << index;
    case ItemKind::kSeparator:
      return 0x800u << index;
    case ItemKind::kText:
      return 0x10000u << index;
    default:
      return 0;
  }
}

/// The bit of LXLocale::changed_unicode for a separator or a text.
constexpr uint16_t changed_unicode_bit(ItemKind kind, size_t index) {
  return static_cast<uint16_t>((kind == ItemKind::kSeparator ? 0x1u : 0x20u) << index);
}

/// A locale's objects by their type.
inline constexpr LXObject* LXLocale::*kLocaleObjects[format::kTypes] = {
    &LXLocale::language, &LXLocale::territory, &LXLocale::codepage, &LXLocale::sort};

inline const char* name_of(const LXObject* sort_or_other) {
  return sort_or_other != nullptr ? sort_or_other->disk.name : "Binary";
}

inline uint16_t payload_word(const LXObject& object, size_t word) {
  return le16(payload_of(object) + 2 * word);
}
/// Whether the locale's codepage keeps invariant ASCII characters at their ASCII byte values.
inline bool keeps_ascii(const LXLocale& locale) {
  const uint16_t flags = le16(payload_of(*locale.codepage) + format::codepage::kFlags);
  return (flags & format::codepage::kFlagAscii) != 0;
}
/// The text whose offset a word holds.
inline const uint8_t* payload_text(const LXObject& object, size_t word) {
  return payload_of(object) + payload_word(object, word);
}

/// Reads a null-terminated 16-bit text of a payload, which may stand at any address; also a locale's copy of
/// one.
struct PayloadCursor {
  using Unit = uint8_t;
  static constexpr bool kOneUnit = false, kShifts = false, kUnicode = false, kRuns = false;
  const uint8_t* p;
  const uint8_t* end;  // no end but the null: p - 1, which is never reached

  bool next(LXUChar* u) {
    if (p == end || le16(p) == 0) return false;
    *u = le16(p);
    p += sizeof(*u);
    return true;
  }
};

enum class TextKind { kUnicode = 1, kCodepage = 2, kName = 3 };

/// Codes of the objects' search as codes of a set function: out of memory, or refused.
inline int32_t search_code(int32_t rc) {
  return rc == LX_E_MEMORY ? LX_E_MEMORY : LX_E_NOT_FOUND;
}

/// The common codepage, loaded; null with a code.
const Codepage* common_codepage(int32_t* rc);

/// The room that a locale string can take, in bytes.
inline constexpr size_t kLocaleStringBytes = format::kTypes * sizeof(format::ControlRecord::name);

/// Fills the values that the caller has not set from the territory, changes the territory or the codepage:
/// 0, 20 or 36; a change that fails leaves the locale as it was.
int32_t set_modifiable(LXLocale* locale);
int32_t change_territory(LXLocale* locale, LXObject* territory);
int32_t change_codepage(LXLocale* locale, LXObject* codepage);

/// The locale flags that the codepage decides.
void set_codepage_flags(LXLocale* locale);
inline void set_sort(LXLocale* locale, LXObject* sort) {
  locale->sort = sort;
  locale->flags = static_cast<uint16_t>(sort != nullptr ? locale->flags & ~kLocaleBinarySort
                                                        : locale->flags | kLocaleBinarySort);
}

/// How many bytes a converted text of `units` characters and its null can take in a codepage.
size_t most_text_bytes(const Codepage& cp, size_t units);

/// Converts a null-terminated 16-bit text, its null included, with the shift bytes that are due.
void store_text(const Codepage& cp, const uint8_t* text, uint8_t* out);

/// Sets a string or a name from `bytes` bytes of the locale's codepage: 0 or the code of the failure.
int32_t set_item_text(LXLocale* locale, int32_t item, const char* text, size_t bytes);

/// Frees what a locale owns, and the locale: false when the free hook failed for any block.
bool free_locale(LXLocale* locale);

/// The system's numeric and monetary conventions of its locale `native_name`, copied into a locale: what
/// LXMapNativeInfo does, without a call frame. 0 or 20.
int32_t map_native_info(const char* native_name, LXLocale* locale);

/// What LXGetUserLocale does.
enum class UserLocale { kFailed = 0, kVariable = 1, kSystem = 2 };
UserLocale get_user_locale(char* buffer, size_t size);

/// Room for the name of the user's locale, and for what an operating-system name maps to, in bytes.
inline constexpr size_t kUserNameBytes = 132;

}  // namespace lx

/// The text of an item: null for a number that is no text item, or whose object does not exist. `current`: the
/// locale's own value where it has one, in the codepage, or with U in Unicode. A separator is one unit without
/// a null behind it.
const void* LXLocaleGetTextItem(const LXLocale* locale, int32_t item, bool current, lx::TextKind* kind);
const void* LXLocaleGetTextItemU(const LXLocale* locale, int32_t item, bool current, lx::TextKind* kind);

/// language_territory.codepage@sort, written to kLocaleStringBytes bytes.
char* LXLocaleGetLocaleString(const LXLocale* locale, char* buffer);
