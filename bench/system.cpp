#include "system.h"

#include <cstdio>
#include <map>
#include <string>

namespace bench {

SystemLocale open_system_locale(const char* name) {
  static std::map<std::string, SystemLocale> known;
  const auto [place, is_new] = known.try_emplace(name, nullptr);
  if (!is_new) return place->second;
  const locale_t locale = newlocale(LC_ALL_MASK, name, nullptr);
  if (locale != nullptr)
    place->second = SystemLocale(locale, freelocale);
  else
    std::fprintf(stderr, "glibc has no locale %s: it is left out there. scripts/bench makes it\n", name);
  return place->second;
}

}  // namespace bench
