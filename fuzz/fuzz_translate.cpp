// Any bytes as a string to translate, between small codepages of every kind: an output of exactly its size, and
// a result that stays in it.
#include <cstdlib>
#include <cstring>
#include <iterator>
#include <memory>

#include "nls1.h"
#include "support/tiny_codepages.h"

namespace {

constexpr int32_t kFlags[] = {LX_TERMINATE, LX_CHARACTERS, NLS1_PAD, NLS1_DROP_BLANKS};
constexpr size_t kMostCharBytes = 5;  // with a shift byte

int32_t codepage(const std::vector<lx::test::TinyCodepage>& codepages, uint8_t byte) {
  const size_t i = byte % (codepages.size() + 1);
  return i < codepages.size() ? codepages[i].file.id : NLS1_UTF16;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t bytes) {
  static const std::vector<lx::test::TinyCodepage> codepages = lx::test::tiny_codepages();
  static const lx::test::TinyLibrary library(codepages);
  if (bytes < 4) return 0;
  const uint8_t to = data[0], from = data[1], flag_bits = data[2], size = data[3];
  bytes -= 4;
  int32_t flags = 0;
  for (size_t i = 0; i < std::size(kFlags); ++i) flags |= (flag_bits >> i & 1) != 0 ? kFlags[i] : 0;
  // A count of characters is trusted, so it comes from a null; two bytes of it are one of UTF-16.
  const bool by_chars = (flags & LX_CHARACTERS) != 0;
  const size_t null_bytes = by_chars ? 2 + bytes % 2 : 0;
  const std::unique_ptr<char[]> input(new char[bytes + null_bytes]());
  memcpy(input.get(), data + 4, bytes);
  const size_t room = size * (by_chars ? kMostCharBytes : 1) + (by_chars ? 1 : 0);
  const std::unique_ptr<char[]> output(new char[room]);
  int32_t consumed = 0;
  uint32_t rc = 0;
  const int32_t result =
      NLS1_TranslateString(codepage(codepages, to), codepage(codepages, from), output.get(), size, input.get(),
                           by_chars ? -1 : static_cast<int32_t>(bytes), &consumed, flags, &rc);
  if (result < 0 ? rc == LX_OK : result > size || (!by_chars && static_cast<size_t>(consumed) > bytes)) abort();
  return 0;
}
