// Any bytes as the alias file: every alias that is listed is found, in any case.
#include <cctype>

#include "files.h"

namespace lx::fuzz::alias {
namespace {

int32_t look_up(void* manager, const char* codepage, const char* alias) {
  std::string name = alias;
  must(*codepage != 0 && !name.empty(), "an alias has a codepage");
  must(LXGetCodepageFromAlias(static_cast<LXObjManager*>(manager), alias) != nullptr, "an alias is found");
  for (char& c : name) c = static_cast<char>(toupper(static_cast<uint8_t>(c)));
  must(LXGetCodepageFromAlias(static_cast<LXObjManager*>(manager), name.c_str()) != nullptr, "in any case");
  return 1;
}

}  // namespace

FUZZ_TARGET(alias) {
  const FileLibrary library("alias.txt", in);
  must(LXEnumAliases(nullptr, look_up, nullptr) == LX_OK, "aliases are listed");
  int32_t rc = LX_OK;
  LXObjManager* const manager = LXInitObjManager(library.directory().c_str(), 0, &rc);
  must(LXEnumAliases(manager, look_up, manager) == LX_OK, "those of a manager too");
  LXTermObjManager(manager);
  for (const char* const name : {"Fuzz", "utf8", "", "-"}) {
    LXGetCodepageFromAlias(nullptr, name);
    LXReleaseLocale(LXGetLocale((std::string("English.") + name).c_str(), LX_FALLBACK, nullptr));
  }
}

}  // namespace lx::fuzz::alias
