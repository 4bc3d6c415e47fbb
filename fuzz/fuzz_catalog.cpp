// Any bytes as a message catalog: loaded or read from the file, in all forms a message is the same, or not there.
#include <cstring>
#include <vector>

#include "files.h"

namespace lx::fuzz::catalog {
namespace {

/// Words of the file as numbers to ask for, and some that mostly are none.
std::vector<uint32_t> numbers_in(Input in) {
  std::vector<uint32_t> numbers = {0, 1, 2, UINT32_MAX};
  constexpr size_t kHeaderBytes = 152;
  for (size_t i = 0; i < kHeaderBytes; ++i) in.byte();
  while (in.left() >= 4 && numbers.size() < 9) numbers.push_back(static_cast<uint32_t>(in.number(4)));
  return numbers;
}

template <class Unit, class Get>
int32_t message(Get get, Text<Unit>* text) {
  const Block<Unit> out(64);
  const int32_t code = get(out.data(), out.size());
  const Unit* const end = std::find<const Unit*>(out.data(), out.end(), Unit{0});
  must(end != out.end(), "a message ends");
  *text = Text<Unit>(out.data(), static_cast<size_t>(end - out.data()));
  return code;
}

void use(LXCatalog* catalog, LXLocale* l, const std::vector<uint32_t>& numbers) {
  for (size_t i = 0; i < numbers.size() * numbers.size(); ++i) {
    const uint32_t set = numbers[i / numbers.size()], number = numbers[i % numbers.size()];
    Text<char> bytes;
    Text<LXWChar> codes;
    Units units;
    const int32_t code = message<char>(
        [&](char* to, int32_t size) { return LXGetMessage(catalog, set, number, to, size, nullptr); }, &bytes);
    const int32_t wide = message<LXWChar>(
        [&](LXWChar* to, int32_t size) { return LXGetMessageW(catalog, set, number, to, size, nullptr); },
        &codes);
    const int32_t unicode = message<LXUChar>(
        [&](LXUChar* to, int32_t size) { return LXGetMessageU(catalog, set, number, to, size, nullptr); },
        &units);
    must(code == LX_OK || code == LX_E_CATALOG || code == LX_E_MESSAGE, "a message is there or not");
    must(wide == code && unicode == code, "in all forms");
    must(decode(kPlain, l, bytes) == units && decode(kWide, l, codes) == units, "it says the same");
    const char* const other = "other";
    if (code == LX_E_MESSAGE)
      must(message<char>(
               [&](char* to, int32_t size) { return LXGetMessage(catalog, set, number, to, size, other); },
               &bytes) == LX_OK &&
               bytes == other,
           "a default text stands in");
  }
}

}  // namespace

FUZZ_TARGET(catalog) {
  const FileLibrary library("catalog", in);
  LXLocale* const l = library.locale();
  const std::vector<uint32_t> numbers = numbers_in(in);
  const std::string path = library.path("catalog");
  const Units name = units(path);
  const Text<LXWChar> codes(path.begin(), path.end());
  LXCatalog* const opened[] = {LXOpenCatalog(l, nullptr, path.c_str(), 0),
                               LXOpenCatalog(l, nullptr, path.c_str(), LX_CATALOG_LOAD),
                               LXOpenCatalogW(l, nullptr, codes.c_str(), LX_CATALOG_LOAD),
                               LXOpenCatalogU(l, nullptr, name.c_str(), LX_CATALOG_ONE_LOCALE)};
  must(opened[0] != nullptr && opened[3] != nullptr, "a file that is there is opened");
  must((opened[1] == nullptr) == (opened[2] == nullptr), "loaded in all forms or in none");
  for (LXCatalog* const catalog : opened) {
    if (catalog != nullptr) use(catalog, l, numbers);
    LXCloseCatalog(catalog);
  }
}

}  // namespace lx::fuzz::catalog
