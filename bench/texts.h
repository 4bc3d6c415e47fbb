// The texts that are measured: names and phrases, prose and words of real languages, from the files that
// scripts/bench makes.
#pragma once

#include <map>
#include <string>
#include <vector>

namespace bench {

/// The texts of one directory. Characters beyond U+FFFF are left out.
class Texts {
 public:
  explicit Texts(std::string directory) : directory_(std::move(directory)) {}

  /// The path of a file of the directory.
  std::string path(const std::string& name) const { return directory_ + "/" + name; }

  /// A long text by its label; empty, with a line on standard error, when its file is not there.
  ///   Russian           names and phrases, in random order
  ///   Russian-prose     the text of a guide
  ///   ASCII             English prose, its ASCII characters
  ///   sparse-Japanese   ASCII with one character of the language in 200
  const std::u16string& find(const std::string& label);

  /// The words of a language in random order, each once and those of letters alone: libraries part on
  /// punctuation. Empty as above.
  std::vector<std::u16string> words(const std::string& language);

 private:
  std::u16string make(const std::string& label);
  std::string read(const std::string& kind, const std::string& language);

  std::string directory_;
  std::map<std::string, std::u16string> known_;
};

/// Conversions of the texts themselves.
std::u16string to_utf16(const std::string& utf8);
std::string to_utf8(const std::u16string& text);
/// The bytes of 16-bit values as they stand in memory.
std::string utf16_bytes(const std::u16string& text);

}  // namespace bench
