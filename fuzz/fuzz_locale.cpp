// Any bytes as the data file of a language, a territory or a sort: refused, or every function is safe with it.
// The first byte says which.
#include <vector>

#include "lx.h"
#include "scratch.h"

namespace {

constexpr int kTypes[] = {LX_LANGUAGE, LX_TERRITORY, LX_SORT};
constexpr const char* kNames[] = {"Fuzz_UnitedStates.Fuzz@Binary", "English_Fuzz.Fuzz@Binary",
                                  "English_UnitedStates.Fuzz@Fuzz"};
constexpr int32_t kUnits = 0x10000;

void read_items(LXLocale* locale) {
  for (int32_t item = 1; item <= LX_ITEM_LOCALE_STRING; ++item) {
    char bytes[64];
    LXUChar units[64];
    for (int32_t flags : {0, int32_t{LX_TERRITORY_VALUES}}) {
      LXGetLocaleNumInfo(locale, item, flags);
      LXGetLocaleTextInfo(locale, item, bytes, sizeof(bytes), flags);
      LXGetLocaleTextInfoU(locale, item, units, 64, flags);
    }
  }
}

/// Every character, with its neighbours in pairs.
void use_text(LXLocale* locale) {
  static LXUChar units[kUnits], mapped[2 * kUnits];
  static uint8_t key[64];
  for (int32_t u = 0; u < kUnits; ++u) units[u] = static_cast<LXUChar>(u);
  for (uint32_t mode : {LX_MAP_UPPER, LX_MAP_LOWER})
    LXMapStringU(locale, mapped, 2 * kUnits, units, kUnits, mode);
  for (uint32_t options : {0u, LX_CASE_INSENSITIVE}) {
    LXStrxfrmU(locale, key, sizeof(key), units, kUnits, options);
    for (int32_t at = 0; at + 40 < kUnits; at += 64) {
      LXStrcollU(locale, units + at, 24, units + at + 16, 24, options);
      LXStrcollU(locale, units + at, 24, units + at, 20, options);
      LXStrxfrmU(locale, key, sizeof(key), units + at, 9, options);
    }
  }
}

void write_values(LXLocale* locale) {
  char text[128];
  LXLongToString(locale, -1234567890, text, sizeof(text), LX_TERMINATE);
  LXDoubleToString(locale, -1.5e300, text, sizeof(text), LX_TERMINATE);
  for (double value : {-1234567.891, 0.5}) LXCurrencyToString(locale, value, text, sizeof(text), LX_TERMINATE);
  const LXTime time{9, 5, 14, 21, 10, 126, 6, 324};
  for (const char* format : {"%x", "%#x", "%X", "%c", "%A %B %p"}) {
    const int32_t bytes = LXTimeToString(locale, &time, text, sizeof(text), format, -1, 0);
    LXTime read = time;
    if (bytes > 0) LXStringToTime(locale, &read, text, bytes, format, -1, 0);
  }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  static const fuzz::Scratch scratch;
  static const std::vector<uint8_t> control_file = fuzz::control_file();
  if (size == 0) return 0;
  const size_t which = data[0] % std::size(kTypes);
  scratch.write("control.nls", control_file.data(), control_file.size());
  scratch.write(fuzz::file_name(kTypes[which]), data + 1, size - 1);
  if (LXInit(scratch.path().c_str(), nullptr, nullptr, nullptr, 0) != LX_OK) abort();
  if (LXLocale* locale = LXGetLocale(kNames[which], LX_FALLBACK, nullptr)) {
    read_items(locale);
    use_text(locale);
    write_values(locale);
    LXReleaseLocale(locale);
  }
  if (LXTerm() != LX_OK) abort();
  return 0;
}
