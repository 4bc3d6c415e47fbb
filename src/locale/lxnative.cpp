// The operating system's locale: the user's, found from the environment, and the numeric and monetary
// conventions that the system has for one. Both set the system's locale for a moment and put back what was set;
// the global lock keeps threads of the library from putting back what another one set.
#include <climits>
#include <clocale>
#include <cstdio>
#include <cstring>

#include "core/lxcall.h"
#include "core/lxlock.h"
#include "core/lxmemory.h"
#include "locale/lxlocale.h"

using namespace lx;

namespace {

RAS1_Unit unit = RAS1_UNIT("lxnative");

constexpr char kUserVariable[] = "LX_LANG";
constexpr size_t kMostSavedBytes = 1024;

/// Keeps the name of the system's locale and sets it again at the end. The global lock is held in between: no
/// object may be loaded.
class SystemLocale {
 public:
  SystemLocale() {
    const char* name = setlocale(LC_ALL, nullptr);
    if (name == nullptr) name = "";
    bytes_ = strlen(name);
    saved_ = bytes_ < kMostSavedBytes;
    if (saved_)
      memcpy(name_, name, bytes_ + 1);
    else
      LX_TRACE(unit, RAS1_LEVEL_ERRORS, "Unable to save current locale to restore. len %d > %d '%s'",
               static_cast<int>(bytes_), static_cast<int>(kMostSavedBytes), name);
  }
  ~SystemLocale() {
    if (!saved_ || bytes_ == 0) return;
    setlocale(LC_ALL, name_);
    LX_TRACE(unit, RAS1_LEVEL_DETAIL, "Restored locale: [%d/%d] %s", static_cast<int>(bytes_),
             static_cast<int>(kMostSavedBytes), name_);
  }
  SystemLocale(const SystemLocale&) = delete;
  SystemLocale& operator=(const SystemLocale&) = delete;

  /// False when the name is too long to be kept: the system's locale must then be left alone.
  bool saved() const { return saved_; }

 private:
  GlobalLock lock_;
  bool saved_;
  size_t bytes_;
  char name_[kMostSavedBytes];
};

/// A variable that has a value, or null.
const char* variable(const char* name) {
  const char* value = BSS1_GetEnv(name);
  return value != nullptr && *value != '\0' ? value : nullptr;
}

/// The name of the locale that the environment asks for, which becomes the system's.
const char* adopt_environment() {
  if (const char* name = setlocale(LC_ALL, "")) return name;
  if (const char* name = variable("LC_ALL")) return name;
  if (const char* name = variable("LANG")) return name;
  return "C";
}

/// A value of localeconv(); false where the system has none.
bool known(char value) {
  return value != CHAR_MAX;
}

void copy_numbers(LXLocale* locale, const lconv& system) {
  const char digits[] = {system.frac_digits, system.int_frac_digits};
  for (size_t i = 0; i < sizeof(digits); ++i)
    if (known(digits[i])) locale->numbers[1 + i] = static_cast<uint8_t>(digits[i]);
  const char flags[] = {system.p_cs_precedes, system.p_sep_by_space, system.n_cs_precedes,
                        system.n_sep_by_space};
  for (size_t i = 0; i < sizeof(flags); ++i) {
    if (!known(flags[i])) continue;
    const unsigned bit = 1u << i;
    locale->flags = static_cast<uint16_t>(flags[i] != 0 ? locale->flags | bit : locale->flags & ~bit);
  }
  const char positions[] = {system.p_sign_posn, system.n_sign_posn};
  for (size_t i = 0; i < sizeof(positions); ++i)
    if (known(positions[i])) locale->sign_positions[i] = static_cast<uint8_t>(positions[i]);
}

/// Group sizes in decimal, each with a ';', and a final 0: "3;3;0". An empty grouping says nothing.
int32_t copy_grouping(LXLocale* locale, int32_t item, const char* sizes) {
  constexpr size_t kMostSizeBytes = 4;
  constexpr int kAllOnes = 0xFF;  // CHAR_MAX where char is unsigned
  if (*sizes == '\0') return LX_OK;
  char text[kUserNameBytes];
  size_t bytes = 0;
  for (; bytes + kMostSizeBytes < sizeof(text); ++sizes) {
    const int size = static_cast<unsigned char>(*sizes);
    if (size == 0 || size == CHAR_MAX || size == kAllOnes) break;
    bytes += static_cast<size_t>(snprintf(text + bytes, sizeof(text) - bytes, "%d;", size));
  }
  text[bytes++] = '0';
  if (!keeps_ascii(*locale))
    for (size_t i = 0; i < bytes; ++i)
      text[i] =
          static_cast<char>(unicode_to_code(codepage_of(*locale->codepage), static_cast<uint8_t>(text[i])));
  return set_item_text(locale, item, text, bytes);
}

/// Whether a system locale's text is in the codepage of a locale, by what its name maps to.
bool same_codepage(const char* native_name, const LXLocale& locale) {
  char mapped[kUserNameBytes];
  LXMapNativeLocale(native_name, mapped, sizeof(mapped));
  char* end = strchr(mapped, '@');
  if (end == nullptr) return false;
  *end = '\0';
  const char* dot = strrchr(mapped, '.');
  const char* name = name_of(locale.codepage);
  return dot != nullptr && strlen(dot + 1) == strlen(name) && LXmemicmp(dot + 1, name, strlen(name)) == 0;
}

int32_t copy_texts(LXLocale* locale, const lconv& system) {
  const struct {
    size_t index;
    const char* text;
  } separators[] = {{0, system.decimal_point},
                    {1, system.thousands_sep},
                    {3, system.mon_decimal_point},
                    {4, system.mon_thousands_sep}};
  for (const auto& separator : separators) {
    if (strlen(separator.text) != 1) continue;
    const auto byte = static_cast<uint8_t>(*separator.text);
    locale->separators[separator.index] = byte;
    locale->separators_unicode[separator.index] = codepage_of(*locale->codepage).unicode[byte];
  }
  const struct {
    int32_t item;
    const char* text;
  } texts[] = {{LX_ITEM_CURRENCY, system.currency_symbol},
               {LX_ITEM_POSITIVE_SIGN, system.positive_sign},
               {LX_ITEM_NEGATIVE_SIGN, system.negative_sign}};
  for (const auto& text : texts) {
    if (*text.text == '\0') continue;
    if (const int32_t code = set_item_text(locale, text.item, text.text, strlen(text.text))) return code;
  }
  return LX_OK;
}

}  // namespace

namespace lx {

UserLocale get_user_locale(char* buffer, size_t size) {
  if (const char* name = BSS1_GetEnv(kUserVariable)) {
    strncpy(buffer, name, size);
    return UserLocale::kVariable;
  }
  {
    const SystemLocale saved;
    if (!saved.saved()) return UserLocale::kFailed;
    LXMapNativeLocale(adopt_environment(), buffer, static_cast<int32_t>(size));
  }
  LX_TRACE(unit, RAS1_LEVEL_DETAIL, "User locale: %s", buffer);
  return UserLocale::kSystem;
}

int32_t map_native_info(const char* native_name, LXLocale* locale) {
  const SystemLocale saved;
  if (!saved.saved()) return LX_OK;
  const char* name = setlocale(LC_ALL, native_name);
  if (name == nullptr) return LX_OK;
  if (*native_name != '\0') name = native_name;
  const bool same = same_codepage(name, *locale);
  const lconv& system = *localeconv();
  copy_numbers(locale, system);
  int32_t code = copy_grouping(locale, LX_ITEM_GROUPING, system.grouping);
  if (code == LX_OK) code = copy_grouping(locale, LX_ITEM_MONETARY_GROUPING, system.mon_grouping);
  if (code == LX_OK && same) code = copy_texts(locale, system);
  return code;
}

}  // namespace lx

extern "C" {

int32_t LXGetUserLocale(char* buffer, int32_t size) {
  Events events(unit);
  if (!initialized() || size <= 0) return events.exit(0);
  return events.exit(static_cast<int32_t>(get_user_locale(buffer, static_cast<size_t>(size))));
}

void LXMapNativeInfo(const char* native_name, LXLocale* given) {
  Call call(unit, given);
  if (!call) return;
  call.fail(map_native_info(native_name != nullptr ? native_name : "", call.locale()), 0);
}

LXLocale* LXConvertNativeLocale(const char* native_name, int32_t flags, int32_t* rc) {
  Events events(unit);
  LXLocale* locale = nullptr;
  int32_t code = LX_E_INVALID;
  if ((flags & ~(LX_TERRITORY_VALUES | LX_FALLBACK)) == 0) {
    char name[kUserNameBytes];
    LXMapNativeLocale(native_name, name, sizeof(name));
    locale = LXGetLocale(name, flags & LX_FALLBACK, &code);
  }
  if (locale != nullptr) LXMapNativeInfo(native_name, locale);
  if (rc != nullptr) *rc = code;
  return events.exit(locale);
}

}  // extern "C"
