// Any bytes as a file of a locale directory, as the first of them says: refused, or every function is safe with
// it.
#include <cstdlib>
#include <iterator>

#include "support/object_files.h"
#include "support/use_codepage.h"

namespace {

constexpr const char* kFiles[] = {"la_00001.nls", "te_00840.nls", "so_00001.nls",
                                  "control.nls",  "alias.txt",    "cp_00819.nls"};
constexpr int32_t kUnits = 0x10000;

/// Every character, with its neighbours in pairs.
void use_characters(LXLocale* locale) {
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

void use_items(LXLocale* locale) {
  char text[128];
  LXUChar units[64];
  for (int32_t item = 1; item <= LX_ITEM_LOCALE_STRING; ++item)
    for (int32_t flags : {0, int32_t{LX_TERRITORY_VALUES}}) {
      LXGetLocaleNumInfo(locale, item, flags);
      LXGetLocaleTextInfo(locale, item, text, sizeof(text), flags);
      LXGetLocaleTextInfoU(locale, item, units, 64, flags);
    }
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
  using namespace lx::test;
  static const ScratchDirectory directory;
  if (size == 0) return 0;
  directory.write_locale({{367, "US-ASCII", ascii_codepage()}, {819, "Fuzz", ascii_codepage()}});
  directory.write("control.nls", control_file({{1, LX_LANGUAGE, "English"},
                                               {840, LX_TERRITORY, "UnitedStates"},
                                               {367, LX_CODEPAGE, "US-ASCII"},
                                               {819, LX_CODEPAGE, "Fuzz"},
                                               {1, LX_SORT, "Default"}}));
  for (const char* other : {"so_00001.nls", "alias.txt"}) directory.write(other, {});
  directory.write(kFiles[data[0] % std::size(kFiles)], {data + 1, data + size});
  LXInit(directory.path().c_str(), nullptr, nullptr, nullptr, 0);
  for (const char* name : {"", "English_UnitedStates.US-ASCII@BINARY", "English", "English.Fuzz@Default"}) {
    LXLocale* const locale = LXGetLocale(name, LX_FALLBACK, nullptr);
    if (locale != nullptr) look_up(locale, 7), use_text(locale, 1), use_characters(locale), use_items(locale);
    LXReleaseLocale(locale);
  }
  int32_t rc = LX_OK;
  for (int32_t type = LX_LANGUAGE; type <= LX_SORT; ++type)
    for (int32_t id = 0; id <= 0xFFFF; id += 257)
      LXGetObjFromID(nullptr, type, static_cast<uint16_t>(id), LX_FIND_AND_LOAD, &rc);
  LXGetCodepageFromAlias(nullptr, "utf8");
  LXTerm();
  return 0;
}
