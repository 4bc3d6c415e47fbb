// Any bytes as the file of a language or of a territory, as the first of them says: refused, or every item, number, time
// and special mapping is safe with it.
#include "files.h"

FUZZ_TARGET(language) {
  using namespace lx::fuzz;
  const FileLibrary library(in.flag() ? "la_00001.nls" : "te_00840.nls", in);
  if (library.locale() == nullptr) return;
  use_items(library.locale());
  int32_t rc = LX_OK;
  const LXObject* const language = LXGetObjFromID(nullptr, LX_LANGUAGE, 1, LX_FIND_AND_LOAD, &rc);
  if (language == nullptr) return;
  for (uint32_t first = 0; first < 0x10000; first += first < 0x600 ? 1 : 17)
    for (const int32_t selector : {44, 45})
      for (const LXUChar second : {LXUChar{0}, LXUChar{0x307}}) {
        LXUChar result1 = 0, result2 = 0;
        const int32_t count =
            LXLangGetSpecial(language, static_cast<LXUChar>(first), second, &result1, &result2, selector);
        must(count >= 0 && count <= 2 && (count == 2) == (result2 != 0), "a mapping has up to two results");
      }
  for (const uint32_t mode : {LX_MAP_UPPER, LX_MAP_LOWER}) {
    const Units text{'S', 0xDF, 'i', 0x307, 'J', 0x3A3, ' ', 0x149};
    fitted<LXUChar>(
        [&](LXUChar* to, int32_t size) {
          return LXMapStringU(library.locale(), to, size, text.data(), count_of(text), mode);
        },
        60);
  }
}
