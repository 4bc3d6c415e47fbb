// The frame of a function that takes a locale: null means the default locale, the entry and exit events, and
// the last error, which is stored in the locale exactly once, on every path. A function without a locale has
// the events alone (lxtrace.h), a per-character primitive the locale alone (codepage/lxprimitive.h).
#pragma once

#include "core/lxrecords.h"
#include "core/lxtrace.h"

namespace lx {

class Call : private Events {
 public:
  Call(RAS1_Unit& unit, LXLocale* given, int line = __builtin_LINE())
      : Events(unit, line), locale_(locale_of(given)) {}

  /// False when there is no locale to work in: the library is not initialised or has no default locale.
  explicit operator bool() const { return locale_ != nullptr; }

  LXLocale* locale() const { return locale_; }
  const LXObject& codepage() const { return *locale_->codepage; }

  /// Ends the call: it succeeded, it failed, or `code` says which.
  template <class T>
  T exit(T result, int line = __builtin_LINE()) {
    return end(LX_OK, result, line);
  }
  template <class T>
  T fail(int32_t code, T result, int line = __builtin_LINE()) {
    return end(code, result, line);
  }
  template <class T>
  T end(int32_t code, T result, int line = __builtin_LINE()) {
    if (locale_ != nullptr) set_last_error(*locale_, code);
    return Events::exit(result, line);
  }

 private:
  LXLocale* locale_;
};

}  // namespace lx
