// The library over the locale directory that the build made, and locales of its codepages.
#pragma once

#include <memory>
#include <stdexcept>
#include <string>

#include "lx.h"

namespace lx::test {

/// Initialises the library for a scope; throws when that does not give code 0.
class Library {
 public:
  explicit Library(const std::string& directory) {
    if (LXInit(directory.c_str(), nullptr, nullptr, nullptr, LX_NO_DEFAULTS) != LX_OK)
      throw std::runtime_error("no locale directory at " + directory);
  }
  ~Library() { LXTerm(); }
  Library(const Library&) = delete;
  Library& operator=(const Library&) = delete;
};

struct LocaleReleaser {
  void operator()(LXLocale* locale) const { LXReleaseLocale(locale); }
};
using LocalePtr = std::unique_ptr<LXLocale, LocaleReleaser>;

/// A locale with this codepage, of language_territory; throws when there is none.
inline LocalePtr locale_with(const std::string& codepage, const std::string& of = "English_UnitedStates") {
  int32_t rc = LX_OK;
  LocalePtr locale(LXGetLocale((of + "." + codepage + "@BINARY").c_str(), 0, &rc));
  if (!locale) throw std::runtime_error("no locale " + of + "." + codepage + ": " + std::to_string(rc));
  return locale;
}

}  // namespace lx::test
