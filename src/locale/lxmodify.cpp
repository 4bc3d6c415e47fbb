// The values that a locale has of its own: filled from its territory, refilled when it moves to another
// territory, converted when it moves to another codepage. What the caller has set is never overwritten.
#include <cstring>

#include "codepage/lxtransfer.h"
#include "core/lxcall.h"
#include "core/lxmemory.h"
#include "locale/lxlocale.h"

using namespace lx;

namespace {

RAS1_Unit unit = RAS1_UNIT("lxmodify");

namespace territory = format::territory;

constexpr size_t kCurrencyText = 1;

/// The 16-bit units of a text with its null.
size_t units_of(const uint8_t* text) {
  PayloadCursor in{text, nullptr};
  size_t units = 1;
  for (LXUChar u = 0; in.next(&u);) ++units;
  return units;
}

/// Frees the codepage texts of one record that another does not use.
void LXLocaleFreeOldText(const LXLocale& kept, LXLocale& dropped) {
  for (size_t i = 0; i < kTexts; ++i)
    if (dropped.texts[i] != kept.texts[i]) hook_free(dropped.texts[i]);
}

/// Converts a text from one codepage to another, shift bytes and null included: the bytes written.
size_t LXLocaleCnvText(const Codepage& from, const Codepage& to, const char* text, char* output) {
  return with_cursor(from, Form::kEx, LX_SHIFT_SINGLE, bytes_of(text), strlen(text), [&](auto in) {
    return with_sink(to, Form::kEx, LX_SHIFT_SINGLE, bytes_of(output), no_end<uint8_t>(), [&](auto out) {
      transfer<LXUChar>(in, out, SIZE_MAX);
      out.put(LXUChar{0});
      return static_cast<size_t>(out.p - bytes_of(output));
    });
  });
}

void fill_numbers(LXLocale* locale, const LXObject& land) {
  const auto free_to_fill = [&](ItemKind kind, size_t i) {
    return (locale->changed & changed_bit(kind, i)) == 0;
  };
  for (size_t i = 0; i < kNumbers; ++i)
    if (free_to_fill(ItemKind::kNumber, i)) locale->numbers[i] = payload_word(land, territory::kNumbers + i);
  const unsigned flags = payload_word(land, territory::kFlags) >> 1;
  for (size_t i = 0; i < kFlags; ++i)
    if (free_to_fill(ItemKind::kFlag, i))
      locale->flags = static_cast<uint16_t>((locale->flags & ~(1u << i)) | (flags & 1u << i));
  for (size_t i = 0; i < kSignPositions; ++i)
    if (free_to_fill(ItemKind::kSignPosition, i))
      locale->sign_positions[i] = payload_of(land)[2 * territory::kSignPositions + i];
}

/// A separator without a single byte in the codepage keeps the byte that it had.
void fill_separators(LXLocale* locale, const LXObject& land) {
  const Codepage& cp = codepage_of(*locale->codepage);
  for (size_t i = 0; i < kSeparators; ++i) {
    if ((locale->changed & changed_bit(ItemKind::kSeparator, i)) != 0) continue;
    const LXUChar u = payload_word(land, territory::kSeparators + i);
    locale->separators_unicode[i] = u;
    const uint32_t code = unicode_to_code(cp, u);
    if (code <= 0xFF) locale->separators[i] = static_cast<uint8_t>(code);
  }
}

/// Gives the locale one text of its territory in both forms; false without memory.
bool fill_text(LXLocale* locale, const uint8_t* text, size_t i) {
  const Codepage& cp = codepage_of(*locale->codepage);
  const size_t units = units_of(text);
  const size_t bytes = most_text_bytes(cp, units);
  HookPtr<char> narrow(static_cast<char*>(hook_allocate(bytes)));
  if (!narrow)
    LX_TRACE(unit, RAS1_LEVEL_ERRORS, "Unable to allocate %d bytes, (%d * %d)", static_cast<int>(bytes),
             static_cast<int>(units), static_cast<int>(bytes / units));
  HookPtr<LXUChar> wide(narrow ? static_cast<LXUChar*>(hook_allocate(sizeof(LXUChar) * units)) : nullptr);
  if (narrow && !wide)
    LX_TRACE(unit, RAS1_LEVEL_ERRORS, "Unable to allocate %d bytes, (%d * %d)",
             static_cast<int>(sizeof(LXUChar) * units), static_cast<int>(units),
             static_cast<int>(sizeof(LXUChar)));
  if (!wide) return false;
  store_text(cp, text, bytes_of(narrow.get()));
  memcpy(wide.get(), text, sizeof(LXUChar) * units);
  locale->texts[i] = narrow.detach();
  locale->texts_unicode[i] = wide.detach();
  if (i == kCurrencyText)
    LX_TRACE(unit, RAS1_LEVEL_DETAIL, "Setting currency for locale %p to %p", static_cast<void*>(locale),
             static_cast<void*>(locale->texts[i]));
  return true;
}

/// Moves the locale's own values from the old codepage to the one that the record names already.
int32_t convert_values(LXLocale* locale, const Codepage& from, const LXLocale& saved) {
  const Codepage& to = codepage_of(*locale->codepage);
  for (uint8_t& separator : locale->separators) {
    const uint32_t code = unicode_to_code(to, from.unicode[separator]);
    if (code > 0xFF) return LX_E_SEPARATOR;
    separator = static_cast<uint8_t>(code);
  }
  for (size_t i = 0; i < kTexts; ++i) {
    const char* old = saved.texts[i];
    char* large = static_cast<char*>(hook_allocate(most_text_bytes(to, strlen(old) + 1)));
    if (large == nullptr) return LX_E_MEMORY;
    locale->texts[i] = large;
    const size_t bytes = LXLocaleCnvText(from, to, old, large);
    // Without memory for the exact copy the larger block stays.
    char* exact = static_cast<char*>(hook_allocate(bytes));
    if (exact == nullptr) continue;
    memcpy(exact, large, bytes);
    locale->texts[i] = exact;
    hook_free(large);
  }
  return LX_OK;
}

/// The frame of the functions that give a locale another object, which must be a loaded one of its type.
int32_t change_object(LXLocale* given, LXObject* object, int32_t type,
                      int32_t (*change)(LXLocale*, LXObject*)) {
  Call call(unit, given);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, LX_E_NOT_INITIALIZED);
  if (object == nullptr || object->disk.type != type || object->section[0] == nullptr)
    return call.fail(LX_E_NOT_FOUND, LX_E_NOT_FOUND);
  const int32_t code = change(call.locale(), object);
  return call.end(code, code);
}

}  // namespace

namespace lx {

size_t most_text_bytes(const Codepage& cp, size_t units) {
  return units * (size_t{cp.width} + cp.shift_sensitive);
}

void store_text(const Codepage& cp, const uint8_t* text, uint8_t* output) {
  with_sink(cp, Form::kEx, LX_SHIFT_SINGLE, output, no_end<uint8_t>(), [&](auto out) {
    PayloadCursor in{text, nullptr};
    transfer<LXUChar>(in, out, SIZE_MAX);
    out.put(LXUChar{0});
  });
}

void set_codepage_flags(LXLocale* locale) {
  const Codepage& cp = codepage_of(*locale->codepage);
  unsigned flags = locale->flags & ~(kLocaleSingleByte | kLocaleShift);
  if (cp.single_byte) flags |= kLocaleSingleByte;
  if (cp.shift_sensitive) flags |= kLocaleShift;
  locale->flags = static_cast<uint16_t>(flags);
}

int32_t set_modifiable(LXLocale* locale) {
  const LXObject& land = *locale->territory;
  fill_numbers(locale, land);
  fill_separators(locale, land);
  for (size_t i = 0; i < kTexts; ++i) {
    if ((locale->changed & changed_bit(ItemKind::kText, i)) != 0) continue;
    if (!fill_text(locale, payload_text(land, kTextWords[i]), i)) return LX_E_MEMORY;
  }
  return LX_OK;
}

int32_t change_territory(LXLocale* locale, LXObject* land) {
  HookPtr<ReplacedTexts> replaced(static_cast<ReplacedTexts*>(hook_allocate_zeroed(sizeof(ReplacedTexts))));
  if (!replaced) return LX_E_MEMORY;
  LXLocale saved = *locale;
  locale->territory = land;
  const int32_t code = set_modifiable(locale);
  if (code == LX_OK) {
    // The replaced Unicode texts are not freed; callers rely on their staying where they are.
    LXLocaleFreeOldText(*locale, saved);
    for (size_t i = 0; i < kTexts; ++i)
      if (locale->texts_unicode[i] != saved.texts_unicode[i]) replaced->texts[i] = saved.texts_unicode[i];
    replaced->next = locale->replaced;
    locale->replaced = replaced.detach();
    return LX_OK;
  }
  LXLocaleFreeOldText(saved, *locale);
  for (size_t i = 0; i < kTexts; ++i)
    if (locale->texts_unicode[i] != saved.texts_unicode[i]) hook_free(locale->texts_unicode[i]);
  *locale = saved;
  return code;
}

int32_t change_codepage(LXLocale* locale, LXObject* codepage) {
  LXLocale saved = *locale;
  locale->codepage = codepage;
  set_codepage_flags(locale);
  const int32_t code = convert_values(locale, codepage_of(*saved.codepage), saved);
  if (code == LX_OK) {
    LXLocaleFreeOldText(*locale, saved);
    return LX_OK;
  }
  LXLocaleFreeOldText(saved, *locale);
  *locale = saved;
  return code;
}

}  // namespace lx

extern "C" {

int32_t LXLocaleSetModifiable(LXLocale* given) {
  const LXLocale* locale = locale_of(given);
  return change_object(given, locale != nullptr ? locale->territory : nullptr, LX_TERRITORY, change_territory);
}

int32_t LXLocaleChangeTerritory(LXLocale* given, LXObject* land) {
  return change_object(given, land, LX_TERRITORY, change_territory);
}

int32_t LXLocaleChangeCodePage(LXLocale* given, LXObject* codepage) {
  return change_object(given, codepage, LX_CODEPAGE, change_codepage);
}

}  // extern "C"
