// Any bytes as the control file: the objects that it lists are the same in all forms, are found by name, and load, or
// built-in ones stand in.
#include <vector>

#include "files.h"

namespace lx::fuzz::control {
namespace {

struct Listed {
  int32_t type;
  Units name;
};
template <class Unit>
int32_t list(void* user, int32_t type, const Unit* name) {
  Listed one{type, {}};
  for (; *name != 0; ++name)
    one.name.push_back(static_cast<LXUChar>(static_cast<std::make_unsigned_t<Unit>>(*name)));
  static_cast<std::vector<Listed>*>(user)->push_back(one);
  return 1;
}

void find(const Listed& listed) {
  const std::string name(listed.name.begin(), listed.name.end());
  const Text<LXWChar> codes(listed.name.begin(), listed.name.end());
  int32_t rc = LX_OK, rc_wide = LX_OK;
  const LXObject* const object =
      LXGetObjFromName(nullptr, listed.type, name.data(), count_of(name), LX_FIND_ONLY, &rc);
  must(LXGetObjFromNameW(nullptr, listed.type, codes.data(), count_of(codes), LX_FIND_ONLY, &rc_wide) ==
               object &&
           rc == rc_wide,
       "a name is found in all forms");
  if (object == nullptr) return;
  const auto* const disk = reinterpret_cast<const LXObjDisk*>(object);
  must(disk->type == listed.type && LXmemicmp(disk->name, name.c_str(), name.size() + 1) == 0,
       "it has that name");
  LXGetObjFromID(nullptr, listed.type, disk->id, LX_FIND_AND_LOAD, &rc);
}

}  // namespace

FUZZ_TARGET(control) {
  const FileLibrary library("control.nls", in);
  std::vector<Listed> plain, wide, units;
  LXEnumLocales(list<char>, &plain), LXEnumLocalesW(list<LXWChar>, &wide),
      LXEnumLocalesU(list<LXUChar>, &units);
  must(plain.size() == wide.size() && plain.size() == units.size(), "every form lists all objects");
  for (size_t i = 0; i < std::min<size_t>(plain.size(), 200); ++i) {
    const bool ascii =
        std::all_of(plain[i].name.begin(), plain[i].name.end(), [](LXUChar c) { return c < 0x80; });
    must(plain[i].type == wide[i].type && plain[i].type == units[i].type, "in one order");
    must(!ascii || plain[i].name == wide[i].name, "by their names");
    // Without codepage 367 names in Unicode are empty.
    must(!ascii || units[i].name.empty() || plain[i].name == units[i].name, "in Unicode too");
    find(plain[i]);
  }
  int32_t rc = LX_OK;
  LXObjManager* const manager = LXInitObjManager(library.directory().c_str(), LX_NO_DEFAULTS, &rc);
  must(manager != nullptr, "a manager of its own");
  for (int32_t type = LX_LANGUAGE; type <= LX_SORT; ++type)
    for (int32_t id = 0; id <= 0xFFFF; id += 257)
      LXGetObjFromID(manager, type, static_cast<uint16_t>(id), LX_FIND_AND_LOAD, &rc);
  must(LXTermObjManager(manager) == LX_OK, "it is given back");
  for (const char* const name : {"", "English_UnitedStates.US-ASCII@BINARY", "English"})
    LXReleaseLocale(LXGetLocale(name, LX_FALLBACK, nullptr));
}

}  // namespace lx::fuzz::control
