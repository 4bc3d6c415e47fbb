// Any bytes as control file, alias file, language and territory: the first byte of the input says which.
#include "lx.h"
#include "scratch.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  static const fuzz::Scratch scratch;
  static const char* const names[] = {"control.nls", "alias.txt", "la_00001.nls", "te_00840.nls"};
  if (size == 0) return 0;
  scratch.write(names[data[0] % 4], data + 1, size - 1);
  LXInit(scratch.path().c_str(), nullptr, nullptr, nullptr, 0);
  for (const char* name : {"", "English_UnitedStates.US-ASCII@BINARY", "English"}) {
    LXLocale* locale = LXGetLocale(name, LX_FALLBACK, nullptr);
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
