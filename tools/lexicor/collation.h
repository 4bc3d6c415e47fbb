// The order that the user named: a codepage with the language and the sort of a locale. Every subcommand that
// orders texts orders them by their keys: keys give one order of all texts, in which what is compared one by
// one and what is sorted by stored keys cannot disagree. The library's comparison in step is another order
// where a text has weights of the last level alone, or where weights are inserted.
#pragma once

#include <lx.h>

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include "codepage.h"
#include "locale.h"
#include "rules.h"

namespace lexicor_cli {

/// Texts begin in the single-byte state. `options` are those of LXStrxfrm.
class Collation {
 public:
  /// The longest text that is ordered, in bytes; in binary order without options any is.
  static const size_t kMostText;

  /// `locale_name` empty: the user's locale. The sort of rules stands instead of the locale's. Throws a Failure that
  /// says what is not there.
  Collation(RulesSession& session, const std::string& locale_name, const std::string& codepage = "UTF-8");

  const Codepage& codepage() const { return codepage_; }
  /// Binary order has no weights.
  bool binary() const { return sort_ == nullptr; }

  /// Whether keys give the order with these options. In binary order they would be the text over again, and
  /// folded they are in another order than the folded text.
  bool by_key(uint32_t options) const { return !binary() || options == LX_WIDTH_INSENSITIVE; }
  /// Below 0, 0 or above 0.
  int32_t compare(std::string_view text1, std::string_view text2, uint32_t options);
  /// Appends the key of a text to `keys`.
  void append_key(std::string_view text, uint32_t options, std::string* keys) const;
  /// The room that the key of a text may need, in bytes.
  static size_t key_room(std::string_view text);
  /// Writes the key of a text into such room; returns its bytes. Several threads may do so.
  size_t write_key(std::string_view text, uint32_t options, char* room) const;
  /// Throws a Failure when a text of the command line ends inside a character.
  void check_argument(const std::string& text) const;

 private:
  Collation(const Session& session, const LocalePtr& named, const std::string& codepage,
            std::optional<uint16_t> sort_id);

  /// The text that was compared last on one side, with its key: merging holds one side while the other moves
  /// on.
  struct Side {
    std::string text, key;
    std::optional<uint32_t> options;  // of the key; none: there is no key yet
  };

  const std::string& key_of(std::string_view text, uint32_t options, Side& side);

  Codepage codepage_;
  const LXObject* sort_ = nullptr;
  Side sides_[2];
};

/// The result of a comparison, to stand between what was compared.
inline const char* sign_text(int32_t result) {
  return result < 0 ? " < " : result > 0 ? " > " : " = ";
}

}  // namespace lexicor_cli
