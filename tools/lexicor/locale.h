// A locale that the user named, by a core name, by an operating-system name, or not at all, and its items.
#pragma once

#include <lx.h>

#include <cstdint>
#include <memory>
#include <optional>
#include <string>

#include "command.h"

namespace lexicor_cli {

/// One of the four objects of a locale, as a locale name gives it.
struct LocalePart {
  int type;           // LX_LANGUAGE to LX_SORT
  const char* title;  // "language" to "sort"
  std::string name;   // empty: not named, hence a default
};

/// The four parts of a locale name, in the order of their types.
struct LocaleName {
  explicit LocaleName(const std::string& text);

  LocalePart parts[4];
};

/// Loads the object of a part: 0 (also when none is named), or why that is impossible.
int load_part(const LocalePart& part);

struct LocaleReleaser {
  void operator()(LXLocale* locale) const { LXReleaseLocale(locale); }
};
using LocalePtr = std::unique_ptr<LXLocale, LocaleReleaser>;

/// The locale of a core name. Throws a Failure that names the part that is not there or cannot be loaded.
LocalePtr open_locale(const std::string& name);
/// The locale of an operating-system name, with the system's conventions. Throws a Failure likewise.
LocalePtr open_native_locale(const std::string& native_name);
/// The locale of an option: of a core name, else of an operating-system name, or the user's where the name is
/// empty. Throws a Failure likewise; in the user's locale defaults take the place of what is not there, which
/// is said on standard error.
LocalePtr open_chosen_locale(const std::string& name);

/// The locale name that an operating-system name stands for, its codeset in any spelling that the system takes:
/// sv_SE.UTF-8 is sv_SE.utf8. Throws a Failure with the exit code `unknown` when it stands for none.
std::string map_native_name(const std::string& native_name, ExitCode unknown);

/// The core name that an option means: of an operating-system name what it stands for, else the name itself.
std::string core_name(const std::string& name);

/// The value of a number item.
std::optional<int32_t> number_item(LXLocale* locale, int32_t item);
/// The value of a text item in UTF-8; none where the directory lacks the object that it would name.
std::optional<std::string> text_item(LXLocale* locale, int32_t item);
/// The beginning of a locale's name, "German_Austria".
std::string language_territory(LXLocale* locale);

}  // namespace lexicor_cli
