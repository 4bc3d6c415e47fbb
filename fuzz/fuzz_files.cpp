// Any bytes as a file of a locale directory or as a message catalog, as the first of them says: refused, or every
// function is safe with it.
#include <cstring>
#include <iterator>

#include "core/lxcatformat.h"
#include "support/object_files.h"
#include "support/use_codepage.h"

namespace {

constexpr const char* kFiles[] = {"la_00001.nls", "te_00840.nls", "so_00001.nls", "control.nls",
                                  "alias.txt",    "cp_00819.nls", "catalog"};
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

/// Every message comes terminated, in both modes. The numbers to ask for are words of the file, and some that mostly
/// are none.
void use_catalog(LXLocale* locale, const std::string& path, const uint8_t* data, size_t size) {
  std::vector<uint32_t> numbers = {0, 1, 2, UINT32_MAX};
  for (size_t at = lx::format::catalog::kHeaderBytes; at + 4 <= size && numbers.size() < 16; at += 4)
    numbers.push_back(lx::le32(data + at));
  for (const uint32_t mode : {0u, uint32_t{LX_CATALOG_LOAD}}) {
    LXCatalog* catalog = LXOpenCatalog(locale, nullptr, path.c_str(), mode);
    for (size_t i = 0; catalog != nullptr && i < numbers.size() * numbers.size(); ++i) {
      const uint32_t set = numbers[i / numbers.size()], number = numbers[i % numbers.size()];
      char text[64];
      LXUChar units[64];
      const int32_t code = LXGetMessage(catalog, set, number, text, sizeof(text), nullptr);
      lx::test::must(code == LX_OK || code == LX_E_CATALOG || code == LX_E_MESSAGE,
                     "a message is there or not");
      lx::test::must(memchr(text, 0, sizeof(text)) != nullptr, "a message ends");
      lx::test::must(LXGetMessageU(catalog, set, number, units, 64, nullptr) == code, "forms agree");
    }
    LXCloseCatalog(catalog);
  }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  using namespace lx::test;
  static const ScratchDirectory directory;
  if (size == 0) return 0;
  directory.write_locale({{367, "US-ASCII", ascii_codepage()}, {819, "Fuzz", ascii_codepage()}},
                         {{{1, LX_SORT, "Default"}, {}}});
  directory.write("alias.txt", {});
  const std::string file = kFiles[data[0] % std::size(kFiles)];
  directory.write(file, {data + 1, data + size});
  LXInit(directory.path().c_str(), nullptr, nullptr, nullptr, 0);
  for (const char* name : {"", "English_UnitedStates.US-ASCII@BINARY", "English"})
    LXReleaseLocale(LXGetLocale(name, LX_FALLBACK, nullptr));
  LXLocale* const locale = LXGetLocale("English.Fuzz@Default", LX_FALLBACK, nullptr);
  if (file == "catalog")
    use_catalog(locale, directory.file(file), data + 1, size - 1);
  else if (locale != nullptr && file == "cp_00819.nls")
    look_up(locale, 7), use_text(locale, 1);
  else if (locale != nullptr)
    use_characters(locale), use_items(locale);
  LXReleaseLocale(locale);
  int32_t rc = LX_OK;
  for (int32_t type = LX_LANGUAGE; type <= LX_SORT; ++type)
    for (int32_t id = 0; id <= 0xFFFF; id += 257)
      LXGetObjFromID(nullptr, type, static_cast<uint16_t>(id), LX_FIND_AND_LOAD, &rc);
  LXGetCodepageFromAlias(nullptr, "utf8");
  LXTerm();
  return 0;
}
