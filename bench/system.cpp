#include "system.h"

#include <cstdio>

namespace bench {

SystemLocale open_system_locale(const char* name) {
  const locale_t locale = newlocale(LC_ALL_MASK, name, nullptr);
  if (locale != nullptr) return SystemLocale(locale, freelocale);
  std::fprintf(stderr, "glibc has no locale %s: it is left out there. scripts/bench makes it\n", name);
  return nullptr;
}

}  // namespace bench
