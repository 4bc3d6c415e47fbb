// The encodings between which texts are converted, as each library calls them.
#pragma once

#include <iconv.h>

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "lx.h"
#include "table.h"

namespace bench {

struct Encoding {
  const char* label;  // the library's own name
  const char* icu;
  const char* iconv;
  bool is_stateful;
};

/// Null when there is none of this label.
const Encoding* find_encoding(const char* label);
/// UTF-16 is no codepage of a locale.
bool is_utf16(const Encoding& encoding);
bool is_utf8(const Encoding& encoding);

using LocalePointer = std::shared_ptr<LXLocale>;
/// A locale of this name, or null with a line on standard error.
LocalePointer open_locale(const std::string& name);

/// An encoding with what the libraries need to turn text into it: the locale (not for UTF-16) and, to see on
/// which characters they agree, descriptors.
class Codepage {
 public:
  /// Null, with a line on standard error, when the library or iconv does not have it.
  static std::shared_ptr<const Codepage> open(const Encoding& encoding);
  ~Codepage();
  Codepage(const Codepage&) = delete;
  Codepage& operator=(const Codepage&) = delete;

  const Encoding& encoding() const { return encoding_; }
  LXLocale* locale() const { return locale_.get(); }

  /// A whole text in this encoding. It starts and ends in the single-byte state.
  std::string encode(const std::u16string& text) const;
  /// Whether all libraries write and read a character alike.
  bool is_agreed(char16_t c) const;

 private:
  explicit Codepage(const Encoding& encoding) : encoding_(encoding) {}

  const Encoding& encoding_;
  LocalePointer locale_;
  iconv_t to_utf16_ = nullptr, from_utf16_ = nullptr;
};

/// The characters of a text that are agreed in all the codepages, up to a number of them.
std::u16string agreed_text(const std::u16string& text, const std::vector<const Codepage*>& codepages,
                           size_t chars = SIZE_MAX);

/// The beginning of a text in pieces of `chars` characters, at most `pieces` of them.
Input cut_pieces(const std::u16string& text, size_t chars, size_t pieces, const Codepage& codepage);

/// Converts all of a text with a descriptor that is reset before. Gives the bytes written; 0 when it refuses a
/// character.
size_t run_iconv(iconv_t descriptor, const char* input, size_t input_bytes, char* output, size_t room);

}  // namespace bench
