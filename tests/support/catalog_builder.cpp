#include "support/catalog_builder.h"

#include <cstring>

#include "core/lxcatformat.h"

namespace lx::test {
namespace {

namespace fmt = format::catalog;

class Writer {
 public:
  explicit Writer(bool other_order) : other_order_(other_order) {}

  ByteString file;

  uint32_t size() const { return static_cast<uint32_t>(file.size()); }
  void word(uint32_t value) {
    file.resize(file.size() + sizeof(value));
    set(file.size() - sizeof(value), value);
  }
  void set(size_t offset, uint32_t value) {
    if (other_order_) value = __builtin_bswap32(value);
    put_catalog_word(&file, offset, value);
  }

 private:
  bool other_order_;
};

}  // namespace

void put_catalog_word(ByteString* file, size_t offset, uint32_t value) {
  memcpy(file->data() + offset, &value, sizeof(value));
}

ByteString catalog_file(const std::vector<CatalogSet>& sets, const std::string& locale, bool other_order) {
  const bool little = __BYTE_ORDER__ == __ORDER_LITTLE_ENDIAN__;
  Writer out(other_order);
  out.word(fmt::kMagic);
  out.word(fmt::kVersion);
  out.word(little != other_order ? fmt::kLittleEndian : fmt::kBigEndian);
  out.word(static_cast<uint32_t>(sets.size()));
  out.word(fmt::kHeaderBytes);
  out.file.insert(out.file.end(), locale.begin(), locale.end());
  out.file.resize(fmt::kHeaderBytes + sets.size() * fmt::kSetBytes);
  for (size_t i = 0; i < sets.size(); ++i) {
    const size_t record = fmt::kHeaderBytes + i * fmt::kSetBytes;
    const bool last = i + 1 == sets.size();
    out.set(record + fmt::kSetNumber, sets[i].number);
    out.set(record + fmt::kSetNext, last ? 0 : static_cast<uint32_t>(record + fmt::kSetBytes));
    out.set(record + fmt::kSetMessages, static_cast<uint32_t>(sets[i].messages.size()));
    out.set(record + fmt::kSetIndex, out.size());
    std::string texts;
    for (const auto& [number, text] : sets[i].messages) {
      out.word(number);
      out.word(static_cast<uint32_t>(text.size() + 1));
      out.word(static_cast<uint32_t>(texts.size()));
      texts.append(text.c_str(), text.size() + 1);
    }
    out.set(record + fmt::kSetTexts, out.size());
    out.set(record + fmt::kSetTextBytes, static_cast<uint32_t>(texts.size()));
    out.file.insert(out.file.end(), texts.begin(), texts.end());
  }
  return out.file;
}

}  // namespace lx::test
