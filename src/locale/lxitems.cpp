// Locale items: the table that says where each value stands, and the functions that read one. A text is read by
// one flow in four forms: what the source is (16-bit Unicode, text of the codepage, name of invariant
// characters) chooses the reader, the form the writer.
#include <cstdio>
#include <cstring>

#include "codepage/lxtransfer.h"
#include "core/lxcall.h"
#include "core/lxobjman.h"
#include "locale/lxlocale.h"

using namespace lx;

namespace {

RAS1_Unit unit = RAS1_UNIT("lxitems");

namespace language = format::language;
namespace territory = format::territory;

constexpr int32_t kItems = LX_ITEM_LOCALE_STRING + 1;

/// Items that follow one another in number and in index.
struct ItemRange {
  uint8_t first, last;
  ItemKind kind;
  uint8_t index;  // of the first
};
constexpr ItemRange kRanges[] = {
    {1, 1, ItemKind::kObjectId, LX_LANGUAGE},
    {2, 2, ItemKind::kObjectName, LX_LANGUAGE},
    {3, 4, ItemKind::kLanguageText, language::kFirstText},
    {5, 5, ItemKind::kObjectId, LX_TERRITORY},
    {6, 6, ItemKind::kObjectName, LX_TERRITORY},
    {7, 8, ItemKind::kTerritoryText, territory::kFirstText},
    {9, 9, ItemKind::kObjectId, LX_CODEPAGE},
    {10, 10, ItemKind::kObjectName, LX_CODEPAGE},
    {11, 11, ItemKind::kObjectId, LX_SORT},
    {12, 12, ItemKind::kObjectName, LX_SORT},
    {13, 15, ItemKind::kDefaultName, language::kDefaultTerritory},
    {16, 57, ItemKind::kLanguageText, language::kFirstDay},
    {58, 58, ItemKind::kTerritoryFlag, 0},
    {59, 61, ItemKind::kSeparator, 0},
    {62, 62, ItemKind::kText, 0},
    {63, 63, ItemKind::kNumber, 0},
    {64, 64, ItemKind::kText, 1},
    {65, 65, ItemKind::kTerritoryText, territory::kInternationalCurrency},
    {66, 67, ItemKind::kSeparator, 3},
    {68, 68, ItemKind::kText, 2},
    {69, 70, ItemKind::kNumber, 1},
    {71, 72, ItemKind::kText, 3},
    {73, 76, ItemKind::kFlag, 0},
    {77, 78, ItemKind::kSignPosition, 0},
    {79, 81, ItemKind::kText, 5},
    {82, 83, ItemKind::kFlag, 4},
    {84, 84, ItemKind::kValue84, 0},
    {85, 85, ItemKind::kCodepageWidth, 0},
    {86, 86, ItemKind::kCodepageAscii, 0},
    {87, 87, ItemKind::kCodepageShift, 0},
    {88, 88, ItemKind::kLocaleString, 0},
};

struct ItemTable {
  Item item[kItems] = {};

  constexpr ItemTable() {
    for (const ItemRange& range : kRanges)
      for (int number = range.first; number <= range.last; ++number)
        item[number] = {range.kind, static_cast<uint8_t>(range.index + number - range.first)};
  }
};
constexpr ItemTable kTable;

static_assert(__BYTE_ORDER__ == __ORDER_LITTLE_ENDIAN__,
              "a locale's Unicode texts are read like those of a payload");

/// The name of the object that a language names as a default, or null when the directory has none.
const char* default_name(const LXObject& language, size_t word) {
  constexpr int32_t kTypes[] = {LX_TERRITORY, LX_CODEPAGE, LX_SORT};
  const int32_t type = kTypes[word];
  const uint16_t id = payload_word(language, word);
  if (type == LX_SORT && id == 0) return name_of(nullptr);
  int32_t rc = LX_OK;
  const LXObject* object = LXGetObjFromID(nullptr, type, id, LX_FIND_ONLY, &rc);
  return object != nullptr && object->disk.type == type ? object->disk.name : nullptr;
}

/// The value of a number item; false for any other item.
bool number_of(const LXLocale& locale, int32_t number, bool current, int32_t* value) {
  const Item item = item_of(number);
  const LXObject& land = *locale.territory;
  switch (item.kind) {
    case ItemKind::kObjectId: {
      const LXObject* object = locale.*kLocaleObjects[item.index];
      *value = object != nullptr ? object->disk.id : 0;
      return true;
    }
    case ItemKind::kNumber:
      *value = current ? locale.numbers[item.index] : payload_word(land, territory::kNumbers + item.index);
      return true;
    case ItemKind::kFlag:
      *value =
          (current ? locale.flags >> item.index : payload_word(land, territory::kFlags) >> (item.index + 1)) &
          1;
      return true;
    case ItemKind::kSignPosition:
      *value = current ? locale.sign_positions[item.index]
                       : payload_of(land)[2 * territory::kSignPositions + item.index];
      return true;
    case ItemKind::kTerritoryFlag:
      *value = payload_word(land, territory::kFlags) >> item.index & 1;
      return true;
    case ItemKind::kValue84:
      *value = payload_word(land, territory::kValue84);
      return true;
    case ItemKind::kCodepageWidth:
      *value = codepage_of(*locale.codepage).width;
      return true;
    case ItemKind::kCodepageAscii:
      *value = keeps_ascii(locale);
      return true;
    case ItemKind::kCodepageShift:
      *value = (locale.flags & kLocaleShift) != 0;
      return true;
    default:
      return false;
  }
}

/// The text of an item where one is found, and how far it reaches.
struct ItemText {
  TextKind kind;
  const uint8_t* text;  // null: none
  size_t bytes;         // of a codepage text or name
  bool one_unit;
};

ItemText find_text(const LXLocale& locale, int32_t number, bool current, bool unicode, char* locale_string) {
  if (number == LX_ITEM_LOCALE_STRING) {
    LXLocaleGetLocaleString(&locale, locale_string);
    return {TextKind::kName, bytes_of(locale_string), strlen(locale_string), false};
  }
  ItemText found{};
  found.one_unit = item_of(number).kind == ItemKind::kSeparator;
  const auto get = unicode ? LXLocaleGetTextItemU : LXLocaleGetTextItem;
  found.text = static_cast<const uint8_t*>(get(&locale, number, current, &found.kind));
  if (found.text == nullptr || found.kind == TextKind::kUnicode) return found;
  const char* text = reinterpret_cast<const char*>(found.text);
  found.bytes = found.one_unit ? strnlen(text, 1) : strlen(text);
  return found;
}

/// Calls `body` with a reader of the text. `direct`: whether packed codes of the codepage are wanted where the
/// text has them, else Unicode. False when the common codepage, which knows the names, cannot be had.
template <bool kDirect, class Body>
bool read_text(const LXLocale& locale, const ItemText& from, Form form, int32_t* rc, Body&& body) {
  using Value = std::conditional_t<kDirect, LXWChar, LXUChar>;
  const Codepage& cp = codepage_of(*locale.codepage);
  if (from.kind == TextKind::kUnicode) {
    const uint8_t* const end = from.one_unit ? from.text + 2 : nullptr;
    body(PayloadCursor{from.text, end}, LXUChar{});
    return true;
  }
  if (from.kind == TextKind::kCodepage) {
    with_cursor(cp, form, LX_SHIFT_SINGLE, from.text, from.bytes, [&](auto in) { body(in, Value{}); });
    return true;
  }
  if (keeps_ascii(locale)) {
    body(SingleByteCursor{cp, from.text, from.text + from.bytes}, Value{});
    return true;
  }
  const Codepage* common = common_codepage(rc);
  if (common == nullptr) return false;
  body(SingleByteCursor{*common, from.text, from.text + from.bytes}, LXUChar{});
  return true;
}

/// The frame of all four forms. `write(cp, end_units, body)` calls `body` with the form's writer.
template <bool kDirect, class Unit, class Write>
int32_t get_text(LXLocale* given, int32_t number, Unit* buffer, int32_t size, int32_t flags, Form form,
                 Write write) {
  Call call(unit, given);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, -1);
  if ((flags & ~(LX_TERRITORY_VALUES | LX_CHARACTERS)) != 0) return call.fail(LX_E_INVALID, -1);
  if (size <= 0) return call.exit(0);
  const LXLocale& locale = *call.locale();
  const bool current = (flags & LX_TERRITORY_VALUES) == 0;
  char locale_string[kLocaleStringBytes];
  const ItemText from = find_text(locale, number, current, !kDirect, locale_string);
  if (from.text == nullptr) return call.fail(LX_E_ITEM, -1);

  const bool by_chars = sizeof(Unit) == 1 && (flags & LX_CHARACTERS) != 0;
  const size_t most = static_cast<size_t>(from.one_unit && size > 2 ? 2 : size) - 1;  // without the null
  Unit* const end = by_chars ? no_end<Unit>() : end_of(buffer, most);
  int32_t written = 0;
  int32_t rc = LX_OK;
  const bool read = read_text<kDirect>(locale, from, form, &rc, [&](auto in, auto value) {
    write(codepage_of(*locale.codepage), end, [&](auto out) {
      const auto moved = transfer<decltype(value)>(in, out, by_chars ? most : SIZE_MAX);
      close_text(out);
      *out.p = 0;
      written = static_cast<int32_t>(by_chars ? moved.chars : static_cast<size_t>(out.p - buffer)) + 1;
    });
  });
  return read ? call.exit(written) : call.fail(search_code(rc), -1);
}

}  // namespace

namespace lx {

Item item_of(int32_t number) {
  return number > 0 && number < kItems ? kTable.item[number] : Item{ItemKind::kNone, 0};
}

const Codepage* common_codepage(int32_t* rc) {
  const LXObject* common = object_by_id(LX_CODEPAGE, format::codepage::kCommonId, rc);
  return common != nullptr ? &codepage_of(*common) : nullptr;
}

}  // namespace lx

const void* LXLocaleGetTextItem(const LXLocale* locale, int32_t number, bool current, TextKind* kind) {
  const Item item = item_of(number);
  switch (item.kind) {
    case ItemKind::kObjectName:
      *kind = TextKind::kName;
      return name_of(locale->*kLocaleObjects[item.index]);
    case ItemKind::kDefaultName:
      *kind = TextKind::kName;
      return default_name(*locale->language, item.index);
    case ItemKind::kLanguageText:
      *kind = TextKind::kUnicode;
      return payload_text(*locale->language, item.index);
    case ItemKind::kTerritoryText:
      *kind = TextKind::kUnicode;
      return payload_text(*locale->territory, item.index);
    case ItemKind::kSeparator:
      *kind = current ? TextKind::kCodepage : TextKind::kUnicode;
      if (current) return &locale->separators[item.index];
      return payload_of(*locale->territory) + 2 * (territory::kSeparators + item.index);
    case ItemKind::kText:
      *kind = current ? TextKind::kCodepage : TextKind::kUnicode;
      if (current) return locale->texts[item.index];
      return payload_text(*locale->territory, kTextWords[item.index]);
    default:
      return nullptr;
  }
}

const void* LXLocaleGetTextItemU(const LXLocale* locale, int32_t number, bool current, TextKind* kind) {
  const Item item = item_of(number);
  const bool copied = item.kind == ItemKind::kSeparator || item.kind == ItemKind::kText;
  if (!copied || !current) return LXLocaleGetTextItem(locale, number, current, kind);
  *kind = TextKind::kUnicode;
  if (item.kind == ItemKind::kSeparator) return &locale->separators_unicode[item.index];
  return locale->texts_unicode[item.index];
}

char* LXLocaleGetLocaleString(const LXLocale* locale, char* buffer) {
  snprintf(buffer, kLocaleStringBytes, "%s_%s.%s@%s", name_of(locale->language), name_of(locale->territory),
           name_of(locale->codepage), name_of(locale->sort));
  return buffer;
}

extern "C" {

int32_t LXGetLocaleNumInfo(LXLocale* given, int32_t item, int32_t flags) {
  Call call(unit, given);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, -1);
  if ((flags & ~LX_TERRITORY_VALUES) != 0) return call.fail(LX_E_INVALID, -1);
  int32_t value = 0;
  if (!number_of(*call.locale(), item, (flags & LX_TERRITORY_VALUES) == 0, &value))
    return call.fail(LX_E_ITEM, -1);
  return call.exit(value);
}

int32_t LXGetLocaleTextInfo(LXLocale* locale, int32_t item, char* buffer, int32_t size, int32_t flags) {
  return get_text<true>(locale, item, bytes_of(buffer), size, flags, Form::kPlain,
                        [&](const Codepage& cp, uint8_t* end, auto body) {
                          with_sink(cp, Form::kPlain, LX_SHIFT_SINGLE, bytes_of(buffer), end, body);
                        });
}

int32_t LXGetLocaleTextInfoW(LXLocale* locale, int32_t item, LXWChar* buffer, int32_t size, int32_t flags) {
  return get_text<true>(locale, item, buffer, size, flags, Form::kEx,
                        [&](const Codepage& cp, LXWChar* end, auto body) {
                          body(CodeSink{cp, buffer, end});
                        });
}

int32_t LXGetLocaleTextInfoU(LXLocale* locale, int32_t item, LXUChar* buffer, int32_t size, int32_t flags) {
  return get_text<false>(locale, item, buffer, size, flags, Form::kEx,
                         [&](const Codepage&, LXUChar* end, auto body) {
                           body(UnicodeSink{buffer, end});
                         });
}

int32_t LXGetLocaleTextInfoEx(LXLocale* locale, int32_t item, char* buffer, LXShiftState state, int32_t size,
                              int32_t flags) {
  const LXLocale* used = locale_of(locale);
  if (used == nullptr || !codepage_of(*used->codepage).shift_sensitive)
    return LXGetLocaleTextInfo(locale, item, buffer, size, flags);
  return get_text<true>(locale, item, bytes_of(buffer), size, flags, Form::kEx,
                        [&](const Codepage& cp, uint8_t* end, auto body) {
                          body(ClosedShiftSink{cp, bytes_of(buffer), end, state});
                        });
}

}  // extern "C"
