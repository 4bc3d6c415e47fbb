// Setting locale items. Whatever fails, fails before the first value changes: blocks are allocated first, then
// installed. The forms differ in how their text becomes bytes of the codepage and a shift state to start in.
#include <cstring>

#include "codepage/lxtransfer.h"
#include "core/lxcall.h"
#include "core/lxmemory.h"
#include "core/lxobjman.h"
#include "locale/lxlocale.h"

using namespace lx;

namespace {

RAS1_Unit unit = RAS1_UNIT("lxsetitems");

constexpr size_t kMostNameBytes = 32;
constexpr int32_t kMostUnicodeUnits = 263;
constexpr size_t kListSeparator = 2;  // the separator that may be anything

/// What a text item is set to: bytes of the codepage from their first character on, and where the caller gave
/// Unicode, that.
struct NewText {
  const uint8_t* bytes;
  size_t count;
  LXShiftState state;
  const LXUChar* units;  // null: the Unicode form is derived from the bytes
  size_t unit_count;
};

/// Makes an object one of the locale's four; a null object is binary order.
int32_t install_object(LXLocale* locale, int32_t type, LXObject* object) {
  switch (type) {
    case LX_LANGUAGE:
      locale->language = object;
      return LX_OK;
    case LX_TERRITORY:
      return change_territory(locale, object);
    case LX_CODEPAGE:
      return object == locale->codepage ? LX_OK : change_codepage(locale, object);
    default:
      set_sort(locale, object);
      return LX_OK;
  }
}

int32_t set_object_by_id(LXLocale* locale, int32_t type, int32_t id) {
  if (id < 0 || id > UINT16_MAX) return LX_E_NOT_FOUND;
  int32_t rc = LX_OK;
  LXObject* object = object_by_id(type, static_cast<uint16_t>(id), &rc);
  if (object == nullptr && rc != LX_OK) return search_code(rc);
  return install_object(locale, type, object);
}

/// Turns a name in the codepage into invariant ASCII.
int32_t name_to_ascii(const Codepage& cp, const NewText& text, size_t count, char* name, size_t* length) {
  if (cp.shift_sensitive && memchr(text.bytes, cp.shift_out, count) != nullptr) return LX_E_NOT_FOUND;
  int32_t rc = LX_OK;
  const Codepage* common = common_codepage(&rc);
  if (common == nullptr) return search_code(rc);
  SingleByteSink out{*common, bytes_of(name), bytes_of(name) + kMostNameBytes};
  with_cursor(cp, Form::kPlain, LX_SHIFT_SINGLE, text.bytes, count,
              [&](auto in) { transfer<LXUChar>(in, out, SIZE_MAX); });
  *length = static_cast<size_t>(out.p - bytes_of(name));
  return LX_OK;
}

int32_t set_object_by_name(LXLocale* locale, int32_t type, const NewText& text) {
  const Codepage& cp = codepage_of(*locale->codepage);
  if (text.state != LX_SHIFT_SINGLE) return LX_E_NOT_FOUND;
  const size_t count = least(text.count, kMostNameBytes);
  char name[kMostNameBytes];
  size_t length = count;
  memcpy(name, text.bytes, count);
  if (!keeps_ascii(*locale))
    if (const int32_t code = name_to_ascii(cp, text, count, name, &length)) return code;
  int32_t rc = LX_OK;
  LXObject* object = LXGetObjFromName(nullptr, type, name, static_cast<int32_t>(length), LX_FIND_AND_LOAD, &rc);
  if (object == nullptr && rc != LX_OK) return search_code(rc);
  return install_object(locale, type, object);
}

int32_t set_separator(LXLocale* locale, size_t index, const NewText& text) {
  constexpr size_t kPartner[kSeparators] = {1, 0, kListSeparator, 4, 3};
  if (text.state != LX_SHIFT_SINGLE) return LX_E_NOT_FOUND;
  if (text.units != nullptr && text.unit_count != 1) return LX_E_NOT_FOUND;
  const uint8_t byte = text.count != 0 ? text.bytes[0] : uint8_t{0};
  if (index != kListSeparator) {
    const uint8_t zero = keeps_ascii(*locale) ? 0x30 : 0xF0;
    if (byte == 0 || (byte >= zero && byte <= zero + 9)) return LX_E_NOT_FOUND;
    if (byte == locale->separators[kPartner[index]]) return LX_E_NOT_FOUND;
  }
  locale->separators[index] = byte;
  locale->separators_unicode[index] =
      text.units != nullptr ? text.units[0] : codepage_of(*locale->codepage).unicode[byte];
  return LX_OK;
}

/// The block that a text of a locale goes to: the one it has where the new text is not longer than the stored
/// one, else a new one, which takes its place when it is installed.
template <class Unit>
class TextBlock {
 public:
  TextBlock(Unit** slot, size_t stored, size_t units)
      : slot_(slot),
        fresh_(units > stored ? static_cast<Unit*>(hook_allocate(sizeof(Unit) * (units + 1))) : nullptr),
        data_(units > stored ? fresh_.get() : *slot) {}

  Unit* data() const { return data_; }  // null: no memory
  void install() {
    if (!fresh_) return;
    hook_free(*slot_);
    *slot_ = fresh_.detach();
  }

 private:
  Unit** slot_;
  HookPtr<Unit> fresh_;
  Unit* data_;
};

int32_t set_string(LXLocale* locale, size_t index, const NewText& text) {
  const Codepage& cp = codepage_of(*locale->codepage);
  const auto read = [&](auto body) {
    return with_cursor(cp, Form::kEx, text.state, text.bytes, text.count, body);
  };
  // As of a text that goes on: a Shift-Out at the end would change what is written behind it.
  const Part whole = whole_chars(cp, Form::kEx, text.bytes, text.state, text.count, text.count + 1);
  const size_t count = whole.units;
  // Stored, so that the text reads back in this state.
  const size_t shift = text.state == LX_SHIFT_DOUBLE && whole.chars != 0 ? 1 : 0;
  const size_t units = text.units != nullptr ? text.unit_count : whole.chars;

  const size_t stored = strlen(locale->texts[index]);
  const size_t stored_units = units_up_to(locale->texts_unicode[index], -1);
  TextBlock<char> narrow(&locale->texts[index], stored, shift + count);
  if (narrow.data() == nullptr) return LX_E_MEMORY;
  TextBlock<LXUChar> wide(&locale->texts_unicode[index], stored_units, units);
  if (wide.data() == nullptr) return LX_E_MEMORY;

  UnicodeSink out{wide.data(), wide.data() + units};
  if (text.units != nullptr)
    memcpy(out.p, text.units, sizeof(LXUChar) * units);
  else
    read([&](auto in) { return transfer<LXUChar>(in, out, SIZE_MAX).chars; });
  wide.data()[units] = 0;
  uint8_t* const bytes = bytes_of(narrow.data());
  if (shift != 0) bytes[0] = cp.shift_out;
  memcpy(bytes + shift, text.bytes, count);
  bytes[shift + count] = 0;
  narrow.install();
  wide.install();
  return LX_OK;
}

int32_t set_text(LXLocale* locale, int32_t number, const NewText& text) {
  const Item item = item_of(number);
  if (item.kind == ItemKind::kObjectName) return set_object_by_name(locale, item.index, text);
  int32_t code = LX_E_ITEM;
  if (item.kind == ItemKind::kSeparator) code = set_separator(locale, item.index, text);
  if (item.kind == ItemKind::kText) code = set_string(locale, item.index, text);
  if (code != LX_OK) return code;
  locale->changed |= changed_bit(item.kind, item.index);
  if (text.units != nullptr)
    locale->changed_unicode =
        static_cast<uint16_t>(locale->changed_unicode | changed_unicode_bit(item.kind, item.index));
  return LX_OK;
}

/// The bytes of a codepage text before its null; `length` counts bytes, or characters, or is below 0.
size_t bytes_before_null(const Codepage& cp, const char* text, LXShiftState state, int32_t length,
                         int32_t flags) {
  if (length < 0) return strlen(text);
  const size_t bytes = (flags & LX_CHARACTERS) != 0 ? bytes_of_chars(cp, bytes_of(text), state, length)
                                                    : static_cast<size_t>(length);
  return strnlen(text, bytes);
}

/// Sets an item of a codepage that is not shift-sensitive.
int32_t set_plain(LXLocale* locale, int32_t item, const NewText& text, int32_t length) {
  LX_TRACE(unit, RAS1_LEVEL_INPUT, "type = %d, buffer size = %d, data = %.*s", item, length,
           static_cast<int>(text.count), reinterpret_cast<const char*>(text.bytes));
  return set_text(locale, item, text);
}

/// Sets an item of a shift-sensitive codepage: a shift byte at the start decides the state.
int32_t set_shifted(LXLocale* locale, int32_t item, NewText text) {
  const Codepage& cp = codepage_of(*locale->codepage);
  if (text.count != 0 && cp.is_shift(text.bytes[0])) {
    const uint8_t* p = text.bytes;
    take_shift(cp, &p, &text.state);
    text.bytes = p;
    if (--text.count == 0) return LX_OK;
  }
  return set_text(locale, item, text);
}

int32_t set_in_form(LXLocale* locale, int32_t item, const NewText& text) {
  const bool shifted = codepage_of(*locale->codepage).shift_sensitive;
  return shifted ? set_shifted(locale, item, text)
                 : set_plain(locale, item, text, static_cast<int32_t>(text.count));
}

/// The frame of all forms: `set(locale)` returns a code.
template <class Set>
int32_t set_item(LXLocale* given, int32_t length, int32_t flags, Set set) {
  Call call(unit, given);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, 0);
  if ((flags & ~LX_CHARACTERS) != 0) return call.fail(LX_E_INVALID, 0);
  const int32_t code = length == 0 ? LX_OK : set(call.locale());
  return call.end(code, code == LX_OK ? 1 : 0);
}

/// Converts units to bytes of the locale's codepage and sets the item from them.
template <class Cursor, class Value>
int32_t set_converted(LXLocale* locale, int32_t item, Cursor in, size_t count, const LXUChar* units) {
  const Codepage& cp = codepage_of(*locale->codepage);
  if (count > INT32_MAX / (kMaxCharBytes + 1) - 1) return LX_E_MEMORY;
  const WorkBuffer narrow((count + 1) * (kMaxCharBytes + 1));
  if (!narrow) return LX_E_MEMORY;
  uint8_t* const start = narrow.as<uint8_t>();
  with_sink(cp, Form::kEx, LX_SHIFT_SINGLE, start, no_end<uint8_t>(), [&](auto out) {
    transfer<Value>(in, out, SIZE_MAX);
    out.put(Value{0});
  });
  return set_in_form(locale, item,
                     {start, strlen(narrow.as<char>()), LX_SHIFT_SINGLE, units, units != nullptr ? count : 0});
}

int32_t set_number(LXLocale* locale, int32_t number, int32_t value) {
  const Item item = item_of(number);
  switch (item.kind) {
    case ItemKind::kObjectId:
      return set_object_by_id(locale, item.index, value);
    case ItemKind::kNumber:
      locale->numbers[item.index] = static_cast<uint16_t>(value);
      break;
    case ItemKind::kFlag: {
      if (value != 0 && value != 1) return LX_E_NOT_FOUND;
      const unsigned bit = 1u << item.index;
      locale->flags = static_cast<uint16_t>(value != 0 ? locale->flags | bit : locale->flags & ~bit);
      break;
    }
    case ItemKind::kSignPosition:
      if (value < 0 || value > 4) return LX_E_NOT_FOUND;
      locale->sign_positions[item.index] = static_cast<uint8_t>(value);
      break;
    default:
      return LX_E_ITEM;
  }
  locale->changed |= changed_bit(item.kind, item.index);
  return LX_OK;
}

}  // namespace

namespace lx {

int32_t set_item_text(LXLocale* locale, int32_t item, const char* text, size_t bytes) {
  return set_text(locale, item, {bytes_of(text), strnlen(text, bytes), LX_SHIFT_SINGLE, nullptr, 0});
}

}  // namespace lx

extern "C" {

int32_t LXSetLocaleNumInfo(LXLocale* given, int32_t item, int32_t value) {
  Call call(unit, given);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, 0);
  const int32_t code = set_number(call.locale(), item, value);
  return call.end(code, code == LX_OK ? 1 : 0);
}

int32_t LXSetLocaleTextInfo(LXLocale* given, int32_t item, const char* text, int32_t length, int32_t flags) {
  return set_item(given, length, flags, [&](LXLocale* locale) {
    const Codepage& cp = codepage_of(*locale->codepage);
    return set_plain(locale, item,
                     {bytes_of(text), bytes_before_null(cp, text, LX_SHIFT_SINGLE, length, flags),
                      LX_SHIFT_SINGLE, nullptr, 0},
                     length);
  });
}

int32_t LXSetLocaleTextInfoW(LXLocale* given, int32_t item, const LXWChar* text, int32_t length,
                             int32_t flags) {
  return set_item(given, length, flags, [&](LXLocale* locale) {
    const size_t count = units_up_to(text, length);
    const CodeCursor in{codepage_of(*locale->codepage), text, text + count};
    return set_converted<CodeCursor, LXWChar>(locale, item, in, count, nullptr);
  });
}

int32_t LXSetLocaleTextInfoU(LXLocale* given, int32_t item, const LXUChar* text, int32_t length,
                             int32_t flags) {
  return set_item(given, length, flags, [&](LXLocale* locale) {
    const size_t count = units_up_to(text, length < 0 ? kMostUnicodeUnits + 1 : length);
    if (length > kMostUnicodeUnits || count > kMostUnicodeUnits) return int32_t{LX_E_NOT_FOUND};
    return set_converted<UnicodeCursor, LXUChar>(locale, item, {text, text + count}, count, text);
  });
}

int32_t LXSetLocaleTextInfoEx(LXLocale* given, int32_t item, const char* text, LXShiftState state,
                              int32_t length, int32_t flags) {
  const LXLocale* used = locale_of(given);
  if (used == nullptr || !codepage_of(*used->codepage).shift_sensitive)
    return LXSetLocaleTextInfo(given, item, text, length, flags);
  return set_item(given, length, flags, [&](LXLocale* locale) {
    const Codepage& cp = codepage_of(*locale->codepage);
    return set_shifted(locale, item,
                       {bytes_of(text), bytes_before_null(cp, text, state, length, flags), state, nullptr, 0});
  });
}

}  // extern "C"
