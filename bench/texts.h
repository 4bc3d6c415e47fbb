// The texts that are converted. They are made of words, numbers and punctuation by a fixed generator, so that
// every run and every machine measures the same text.
#pragma once

#include <cstddef>
#include <functional>
#include <string>

namespace bench {

enum class Language { kGerman, kRussian, kJapanese, kChinese };

enum class Mixture {
  kNative,  // words of the language, with ASCII words and numbers between them
  kAscii,   // English letters only
  kSparse,  // ASCII with one character of the language in about 200
};

/// The bytes of a character in the codepage of a text; 0 for one that must not occur in it.
using CharBytes = std::function<size_t(char16_t)>;

/// A text of at least `bytes` bytes that ends with a full stop.
std::u16string make_text(Language language, Mixture mixture, const CharBytes& char_bytes, size_t bytes);

/// UTF-8 of 16-bit values: the bytes of one, and a text.
size_t utf8_bytes(char16_t c);
std::string to_utf8(const std::u16string& text);

}  // namespace bench
