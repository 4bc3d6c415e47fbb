#include "support/catalog_builder.h"

namespace lx::test {

namespace fmt = format::catalog;

void put_catalog_word(ByteString* file, size_t offset, uint32_t value) {
  fmt::put_word(file->data() + offset, value);
}

ByteString catalog_file(const std::vector<CatalogSet>& sets, const std::string& locale, bool other_order) {
  const bool little = __BYTE_ORDER__ == __ORDER_LITTLE_ENDIAN__;
  ByteString file(fmt::kHeaderBytes + sets.size() * fmt::kSetBytes);
  fmt::Header header;
  header.byte_order = little != other_order ? fmt::kLittleEndian : fmt::kBigEndian;
  header.sets = static_cast<uint32_t>(sets.size());
  header.first_set = fmt::kHeaderBytes;
  locale.copy(header.locale, sizeof(header.locale));
  header.write(file.data(), other_order);
  size_t at = fmt::kHeaderBytes;
  for (const CatalogSet& set : sets) {
    fmt::SetRecord record{set.number, 0, static_cast<uint32_t>(set.messages.size())};
    if (&set != &sets.back()) record.next = static_cast<uint32_t>(at + fmt::kSetBytes);
    record.index = static_cast<uint32_t>(file.size());
    for (const auto& [number, text] : set.messages) {
      const fmt::IndexEntry entry{number, static_cast<uint32_t>(text.size() + 1), record.text_bytes};
      file.resize(file.size() + fmt::kEntryBytes);
      entry.write(&file[file.size() - fmt::kEntryBytes], other_order);
      record.text_bytes += entry.text_bytes;
    }
    record.texts = static_cast<uint32_t>(file.size());
    for (const auto& [number, text] : set.messages)
      file.insert(file.end(), text.c_str(), text.c_str() + text.size() + 1);
    record.write(&file[at], other_order);
    at += fmt::kSetBytes;
  }
  return file;
}

}  // namespace lx::test
