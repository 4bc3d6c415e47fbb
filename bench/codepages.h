// The codepages that are measured, each with its converters of all three libraries, opened once.
#pragma once

#include <iconv.h>
#include <unicode/ucnv.h>

#include <memory>
#include <string>
#include <vector>

#include "lx.h"
#include "texts.h"

namespace bench {

struct CodepageName {
  const char* label;
  uint16_t id;
  const char* object;  // null: found by the identifier
  const char* icu;
  const char* iconv;
  bool stateful;
  std::vector<Language> languages;
};

/// The names, in the order of the rows.
const std::vector<CodepageName>& codepage_names();

class Codepage {
 public:
  /// Null, with a line on standard error, when one of the libraries does not have the codepage.
  static std::unique_ptr<Codepage> open(const CodepageName& name);
  ~Codepage();
  Codepage(const Codepage&) = delete;
  Codepage& operator=(const Codepage&) = delete;

  const CodepageName& name() const { return name_; }
  bool is_utf8() const;
  LXLocale* locale() const { return locale_; }
  UConverter* icu() const { return icu_; }
  iconv_t to_utf16() const { return to_utf16_; }
  iconv_t from_utf16() const { return from_utf16_; }
  iconv_t to_utf8() const { return to_utf8_; }
  iconv_t from_utf8() const { return from_utf8_; }

  /// A whole text in this codepage. It starts and ends in the single-byte state.
  std::string encode(const std::u16string& text) const;

  /// The bytes of a character, without shift bytes; 0 when the libraries do not agree on it both ways.
  size_t agreed_bytes(char16_t c) const;

 private:
  explicit Codepage(const CodepageName& name) : name_(name) {}
  bool open_all();

  const CodepageName& name_;
  LXLocale* locale_ = nullptr;
  UConverter* icu_ = nullptr;
  iconv_t to_utf16_, from_utf16_, to_utf8_, from_utf8_;
};

/// Converts all of a text with a descriptor that is reset before; false when it refuses a character.
bool run_iconv(iconv_t descriptor, const char* input, size_t input_bytes, char** output, size_t* room);

}  // namespace bench
