// The locale that the user named, for functions that read and write values. Texts of the command line go to the
// library as 16-bit Unicode, which has a locale's separators and symbols whatever the codepage.
#pragma once

#include <lx.h>

#include <string>
#include <vector>

#include "codepage.h"
#include "command.h"
#include "session.h"

namespace lexicor_cli {

using Units = std::vector<LXUChar>;

class TextLocale {
 public:
  /// `name` empty: the user's locale. Throws a Failure that says what is not there.
  TextLocale(const Session& session, const std::string& name);

  LXLocale* locale() const { return utf8_.locale(); }
  /// A UTF-8 text. Throws a Failure that points at a character that 16-bit Unicode lacks.
  Units units(const std::string& text) const;
  /// The first units as UTF-8.
  std::string text(const Units& units, size_t count) const;

  /// What to throw when a text cannot be used: the message, and the text with a mark below the character
  /// number `at`.
  Failure pointing(ExitCode code, const std::string& message, const Units& text, size_t at) const;

 private:
  Codepage utf8_;  // with the language and the territory of the locale
};

}  // namespace lexicor_cli
