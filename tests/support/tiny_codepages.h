// Small codepages packed in memory, one of every kind of text, and a library that runs on a directory of them.
#pragma once

#include <cstdint>
#include <map>
#include <string>
#include <vector>

#include "codepage_model.h"
#include "core/lxrecords.h"
#include "support/hooks.h"
#include "support/object_files.h"

namespace lx::test {

struct TinyCharacter {
  std::string bytes;
  uint32_t code;  // packed
  uint16_t unicode;
};

/// A codepage and what a test may expect of it.
struct TinyCodepage {
  ScratchDirectory::Codepage file;
  uint8_t width;
  bool shift;  // shift-sensitive, with `shift_out` and `shift_in`
  char shift_out, shift_in;
  uint8_t substitution;
  std::vector<TinyCharacter> characters;  // mapped both ways, by packed code

  /// The bytes of a text; in a shift-sensitive codepage with the shift bytes that it needs from `*state` on,
  /// which is left as the text leaves it. UTF-8 is computed; elsewhere the substitution byte stands for what is
  /// not mapped.
  std::string encode(const std::vector<uint16_t>& text, LXShiftState* state = nullptr) const;
  const TinyCharacter* find(uint16_t unicode) const;
};

/// Packs a codepage from its mappings as the locale-data compiler does.
class CodepageBuilder {
 public:
  CodepageBuilder(uint16_t id, std::string name, uint8_t width);
  /// Bytes that begin characters of `length` bytes.
  CodepageBuilder& lead(uint8_t first, uint8_t last, uint8_t length) {
    for (unsigned b = first; b <= last; ++b) model_.header.leads[b] = length;
    return *this;
  }
  /// `count` characters from this packed code and this Unicode value on, both ways.
  CodepageBuilder& map(uint32_t code, uint16_t unicode, unsigned count = 1) {
    for (unsigned i = 0; i < count; ++i) {
      model_.to_unicode[code + i] = static_cast<uint16_t>(unicode + i);
      model_.from_unicode[unicode + i] = code + i;
    }
    return *this;
  }
  CodepageBuilder& ascii() { return map(0, 0, 0x80); }
  /// The characters of a text, from this code on.
  CodepageBuilder& text(uint32_t code, const char* ascii) {
    for (; *ascii != 0; ++ascii) map(code++, static_cast<uint16_t>(*ascii));
    return *this;
  }
  CodepageBuilder& shift(uint8_t out, uint8_t in) {
    shift_out_ = out, shift_in_ = in;
    model_.header.kind = lexicor_data::CodepageClass::kShiftStateful;
    model_.header.ascii = false;
    return *this;
  }
  CodepageBuilder& substitution(uint8_t byte) { return model_.header.substitution = byte, *this; }
  TinyCodepage build() const;

 private:
  uint16_t id_;
  uint8_t shift_out_ = 0, shift_in_ = 0;
  lexicor_data::CodepageModel model_;
};

/// ASCII and U+00A0 to U+00FF, with the euro sign in place of U+00A4.
TinyCodepage tiny_single();
/// One and two bytes; second bytes that are ASCII letters; single-byte katakana, and width tables.
TinyCodepage tiny_shift_jis();
/// One to three bytes; 0x5C is the yen sign, so that ASCII is not copied as it is.
TinyCodepage tiny_euc();
/// One, two and four bytes.
TinyCodepage tiny_four();
/// EBCDIC with two-byte characters between 0x0E and 0x0F.
TinyCodepage tiny_shift();
/// UTF-8, computed; one to three bytes.
TinyCodepage tiny_utf8();
/// All of these, and US-ASCII with the identifier 367.
std::vector<TinyCodepage> tiny_codepages();

/// Two of which a test may make more: one and two bytes, and EBCDIC with small letters where 930 has them, or
/// where all others do.
TinyCodepage shift_jis(uint16_t id, const char* name);
TinyCodepage ebcdic(uint16_t id, const char* name, bool katakana);

/// The library on a scratch directory with English, UnitedStates, these codepages, and other objects. Bad files
/// are refused, not replaced by the built-in objects.
class TinyLibrary {
 public:
  explicit TinyLibrary(const std::vector<TinyCodepage>& codepages = tiny_codepages(),
                       const std::vector<ScratchDirectory::Object>& others = {});
  ~TinyLibrary() { close(); }
  TinyLibrary(const TinyLibrary&) = delete;
  TinyLibrary& operator=(const TinyLibrary&) = delete;

  /// Releases everything: whether each block came back, once.
  bool close();
  Hooks& hooks() { return hooks_; }

  /// A locale that is kept to the end, with English or another language and binary order or a sort; throws when
  /// there is none.
  LXLocale* locale(const TinyCodepage& codepage, const std::string& language = "English",
                   const std::string& sort = "");
  /// A locale to change; the caller releases it.
  LXLocale* new_locale(const TinyCodepage& codepage, const std::string& language = "English",
                       const std::string& sort = "");

 private:
  ScratchDirectory directory_;
  Hooks hooks_;
  std::map<std::string, LXLocale*> locales_;
  bool open_ = false;
};

/// A codepage object and a locale of it without a file: the sections in blocks of their exact sizes, validated
/// and derived as loading does. The library must be initialised.
class CodepageObject {
 public:
  CodepageObject(uint16_t id, const std::vector<ByteString>& sections);
  ~CodepageObject();
  CodepageObject(const CodepageObject&) = delete;
  CodepageObject& operator=(const CodepageObject&) = delete;

  int32_t code() const { return fault_.code; }  // of the validation; there is no object unless it is 0
  std::string reason() const { return fault_ ? fault_.reason : ""; }
  const LXObject* object() const { return &object_; }
  LXLocale* locale() { return &locale_; }

 private:
  std::vector<ByteString> sections_;
  LXObject object_{};
  LXLocale locale_{};
  Fault fault_;
};

}  // namespace lx::test
