// The types of objects. This file stands above the rooms: it alone knows all that have one.
#include "core/lxobjtypes.h"

#include "codepage/lxcodepage.h"
#include "collate/lxsort.h"
#include "locale/lxlocale.h"

namespace lx {

static_assert(LX_LANGUAGE == 0 && LX_TERRITORY == 1 && LX_CODEPAGE == 2 && LX_SORT == 3, "the table's order");

const ObjectType* const kObjectTypes[format::kTypes] = {&kLanguageType, &kTerritoryType, &kCodepageType,
                                                        &kSortType};

}  // namespace lx
