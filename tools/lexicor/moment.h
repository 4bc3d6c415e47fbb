// A moment in ISO 8601, as the command line has it, and in the words of a locale.
#pragma once

#include <lx.h>

#include <string>

#include "text_locale.h"

namespace lexicor_cli {

/// The format without which times are written and read.
constexpr char kDefaultFormat[] = "%x %X";

/// A moment in the form YYYY-MM-DD[THH:MM[:SS]], by the format. Throws a Failure that points at what is wrong.
std::string format_moment(const TextLocale& locale, const std::string& iso, const std::string& format);

/// The moment that a text names, in ISO 8601: the date, the time, or both. Throws a Failure likewise.
std::string parse_moment(const TextLocale& locale, const std::string& text, const std::string& format);

}  // namespace lexicor_cli
