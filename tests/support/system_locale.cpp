#include "support/system_locale.h"

#include <dlfcn.h>

#include <climits>
#include <cstring>

namespace lx::test {
namespace {

SystemLocale* in_force;

template <class Function>
Function* real(const char* name) {
  return reinterpret_cast<Function*>(dlsym(RTLD_NEXT, name));
}

char* answer(const std::string& text) {
  static std::string kept;
  kept = text;
  return kept.data();
}

char* set_locale(const char* name) {
  SystemLocale& system = *in_force;
  if (name == nullptr) {
    ++system.queries;
    return answer(system.current);
  }
  system.set.push_back(name);
  const std::string wanted = *name != '\0' ? name : system.environment;
  const bool accepted = *name != '\0' ? wanted == "C" || system.known.count(wanted) != 0 : !wanted.empty();
  if (!accepted) return nullptr;
  system.current = wanted;
  return answer(wanted);
}

}  // namespace

SystemLocale::SystemLocale() {
  in_force = this;
}
SystemLocale::~SystemLocale() {
  in_force = nullptr;
}

lconv SystemLocale::nothing() {
  static char none[] = "";
  lconv conventions;
  memset(&conventions, CHAR_MAX, sizeof(conventions));
  for (char** text : {&conventions.decimal_point, &conventions.thousands_sep, &conventions.grouping,
                      &conventions.int_curr_symbol, &conventions.currency_symbol,
                      &conventions.mon_decimal_point, &conventions.mon_thousands_sep, &conventions.mon_grouping,
                      &conventions.positive_sign, &conventions.negative_sign})
    *text = none;
  return conventions;
}

}  // namespace lx::test

extern "C" {

char* setlocale(int category, const char* name) noexcept {
  if (lx::test::in_force != nullptr) return lx::test::set_locale(name);
  return lx::test::real<char*(int, const char*)>("setlocale")(category, name);
}

lconv* localeconv() noexcept {
  static lconv conventions;
  if (lx::test::in_force == nullptr) return lx::test::real<lconv*()>("localeconv")();
  const auto& known = lx::test::in_force->known;
  const auto found = known.find(lx::test::in_force->current);
  conventions = found != known.end() ? found->second : lx::test::SystemLocale::nothing();
  return &conventions;
}

}  // extern "C"
