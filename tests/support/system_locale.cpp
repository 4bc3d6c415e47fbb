#include "support/system_locale.h"

#include <dlfcn.h>

using lx::test::SystemLocale;

/// The function of this name that the system has.
template <class Function>
static Function* real(const char* name) {
  return reinterpret_cast<Function*>(dlsym(RTLD_NEXT, name));
}

extern "C" {

char* setlocale(int category, const char* name) noexcept {
  static std::string answer;
  SystemLocale* const system = SystemLocale::in_force;
  if (system == nullptr) return real<char*(int, const char*)>("setlocale")(category, name);
  if (name == nullptr) {
    ++system->queries;
    answer = system->current;
    return answer.data();
  }
  system->set.push_back(name);
  answer = *name != '\0' ? name : system->environment;
  const bool accepted = *name != '\0' ? answer == "C" || system->known.count(answer) != 0 : !answer.empty();
  if (!accepted) return nullptr;
  system->current = answer;
  return answer.data();
}

lconv* localeconv() noexcept {
  static lconv conventions;
  const SystemLocale* const system = SystemLocale::in_force;
  if (system == nullptr) return real<lconv*()>("localeconv")();
  const auto found = system->known.find(system->current);
  conventions = found != system->known.end() ? found->second : SystemLocale::nothing();
  return &conventions;
}

}  // extern "C"
