// Any bytes as a message catalog: refused, or every message comes terminated, in both modes. Numbers to ask for
// are taken from the input.
#include <cstdlib>
#include <cstring>
#include <iterator>

#include "core/lxcatformat.h"
#include "support/object_files.h"

namespace {

constexpr size_t kMostNumbers = 16;

/// The words of the file that may be numbers of sets and messages, and some that mostly are none.
std::vector<uint32_t> numbers_in(const uint8_t* data, size_t size) {
  std::vector<uint32_t> numbers = {0, 1, 2, UINT32_MAX};
  for (size_t at = lx::format::catalog::kHeaderBytes; at + 4 <= size && numbers.size() < kMostNumbers; at += 4)
    numbers.push_back(lx::le32(data + at));
  return numbers;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  static const lx::test::ScratchDirectory directory;
  static const std::string path = directory.file("catalog");
  static const int32_t started = LXInit(directory.path().c_str(), nullptr, nullptr, nullptr, 0);
  static LXLocale* const locale = LXGetLocale("", 0, nullptr);
  if (started != LX_W_DEFAULTS || locale == nullptr) abort();
  directory.write("catalog", {data, data + size});
  const std::vector<uint32_t> numbers = numbers_in(data, size);
  for (const uint32_t mode : {0u, uint32_t{LX_CATALOG_LOAD}}) {
    LXCatalog* catalog = LXOpenCatalog(locale, nullptr, path.c_str(), mode);
    for (size_t i = 0; catalog != nullptr && i < numbers.size() * numbers.size(); ++i) {
      const uint32_t set = numbers[i / numbers.size()], number = numbers[i % numbers.size()];
      char text[64];
      LXUChar units[64];
      const int32_t code = LXGetMessage(catalog, set, number, text, sizeof(text), nullptr);
      if (code != LX_OK && code != LX_E_CATALOG && code != LX_E_MESSAGE) abort();
      if (memchr(text, 0, sizeof(text)) == nullptr) abort();
      if (LXGetMessageU(catalog, set, number, units, std::size(units), nullptr) != code) abort();
    }
    LXCloseCatalog(catalog);
  }
  return 0;
}
