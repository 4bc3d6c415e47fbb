// glibc's own locales, which scripts/bench makes.
#pragma once

#include <locale.h>

#include <memory>
#include <type_traits>

namespace bench {

using SystemLocale = std::shared_ptr<std::remove_pointer_t<locale_t>>;

/// Opened once. Null, with a line on standard error, when the system does not have it.
SystemLocale open_system_locale(const char* name);

}  // namespace bench
