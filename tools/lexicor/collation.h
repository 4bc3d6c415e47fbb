// The order that the user named: a codepage with the language and the sort of a locale, and what the public
// functions tell about the order of texts in it.
#pragma once

#include <lx.h>

#include <cstdint>
#include <string>
#include <string_view>

#include "codepage.h"
#include "locale.h"
#include "session.h"

namespace lexicor_cli {

/// Texts begin in the single-byte state. `options` are those of LXStrcoll.
class Collation {
 public:
  /// `locale_name` empty: the user's locale. Throws a Failure that says what is not there.
  Collation(const Session& session, const std::string& locale_name, const std::string& codepage = "UTF-8");

  const Codepage& codepage() const { return codepage_; }
  /// Binary order has no weights.
  bool binary() const { return sort_ == nullptr; }

  /// Below 0, 0 or above 0.
  int32_t compare(std::string_view text1, std::string_view text2, uint32_t options) const;
  /// Appends the key of a text to `keys`.
  void append_key(std::string_view text, uint32_t options, std::string* keys);
  /// Throws a Failure when a text of the command line ends inside a character.
  void check_argument(const std::string& text) const;

 private:
  Collation(const Session& session, const LocalePtr& named, const std::string& codepage);

  Codepage codepage_;
  const LXObject* sort_ = nullptr;
  std::string room_;  // for a key
};

/// The result of a comparison, to stand between what was compared.
inline const char* sign_text(int32_t result) {
  return result < 0 ? " < " : result > 0 ? " > " : " = ";
}

}  // namespace lexicor_cli
