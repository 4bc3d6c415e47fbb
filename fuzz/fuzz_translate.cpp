// Any bytes as a string to translate, between small codepages of every kind: an output of exactly its size, a result
// that stays in it, and the text that conversion gives.
#include "fuzz.h"
#include "nls1.h"
#include "support/tiny_codepages.h"

namespace lx::fuzz::translate {
namespace {

constexpr int32_t kFlags[] = {LX_TERMINATE, LX_CHARACTERS, NLS1_PAD, NLS1_DROP_BLANKS};
constexpr size_t kMostCharBytes = 5;  // with a shift byte

/// Null: UTF-16, which is none.
const TinyCodepage* codepage(const std::vector<TinyCodepage>& codepages, uint8_t byte) {
  const size_t i = byte % (codepages.size() + 1);
  return i < codepages.size() ? &codepages[i] : nullptr;
}
int32_t id_of(const TinyCodepage* codepage) {
  return codepage != nullptr ? codepage->file.id : NLS1_UTF16;
}

void like_conversion(TinyLibrary& library, const TinyCodepage& to, const TinyCodepage& from,
                     const std::string& text) {
  const Block<char> input(text);
  const size_t plenty = text.size() * kMostCharBytes + 2;
  uint32_t rc = LX_OK;
  const auto translated = written<char>(
      [&](char* out, int32_t size) {
        return NLS1_TranslateString(id_of(&to), id_of(&from), out, size, input.data(), input.size(), nullptr,
                                    LX_TERMINATE, &rc);
      },
      plenty);
  const auto converted = written<char>(
      [&](char* out, int32_t size) {
        return LXConvertStringEx(library.locale(to), out, 0, size, library.locale(from), input.data(), 0,
                                 input.size(), LX_TERMINATE);
      },
      plenty);
  must(rc == LX_OK || rc == LX_E_SIZE, "a text is translated, or ends inside a character");
  must(translated == converted, "as it is converted");
}

}  // namespace

FUZZ_TARGET(translate) {
  static const std::vector<TinyCodepage> codepages = tiny_codepages();
  static TinyLibrary library(codepages);
  const TinyCodepage* const to = codepage(codepages, in.byte());
  const TinyCodepage* const from = codepage(codepages, in.byte());
  const uint8_t flag_bits = in.byte(), size = in.byte();
  const std::string text = in.rest();
  int32_t flags = 0;
  for (size_t i = 0; i < std::size(kFlags); ++i) flags |= (flag_bits >> i & 1) != 0 ? kFlags[i] : 0;
  if ((flag_bits & 0x80) != 0 && to != nullptr && from != nullptr)
    return like_conversion(library, *to, *from, text);
  // A count of characters is trusted, so it comes from a null; two bytes of it are one of UTF-16.
  const bool by_chars = (flags & LX_CHARACTERS) != 0;
  const Block<char> input(by_chars ? text + std::string(2 + text.size() % 2, '\0') : text);
  const Block<char> output(size * (by_chars ? kMostCharBytes : 1) + (by_chars ? 1 : 0));
  int32_t consumed = 0;
  uint32_t rc = 0;
  const int32_t result = NLS1_TranslateString(id_of(to), id_of(from), output.data(), size, input.data(),
                                              by_chars ? -1 : input.size(), &consumed, flags, &rc);
  must(result >= 0 ? result <= size : rc != LX_OK, "a result fits its size, or there is a code");
  must(result < 0 || by_chars || consumed <= input.size(), "what is consumed was given");
}

}  // namespace lx::fuzz::translate
