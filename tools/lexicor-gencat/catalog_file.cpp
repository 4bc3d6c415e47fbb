// Reading and writing of the file. Reading trusts nothing: every record lies inside the file, numbers ascend
// (so that a chain cannot loop), and no more texts come out than the file justifies.
#include "catalog_file.h"

#include <cstring>

#include "core/lxbytes.h"
#include "lexicor/command.h"
#include "lexicor/hex.h"

namespace lexicor_gencat {

using lexicor_cli::Failure;
using lexicor_cli::kDataError;

namespace {

namespace layout = lx::format::catalog;

// What the library opens.
constexpr uint64_t kMaxFileBytes = 0x7FFFFFFF;
// Texts may share bytes, in files that others wrote; so much larger than the file may they be together.
constexpr uint64_t kMaxSharing = 16;

uint32_t swapped(uint32_t v) {
  return v << 24 | (v & 0xFF00) << 8 | (v >> 8 & 0xFF00) | v >> 24;
}

class Packer {
 public:
  explicit Packer(const Catalog& catalog) : catalog_(catalog) {}

  std::string pack() {
    plan();
    write_header();
    uint32_t record = layout::kHeaderBytes;
    if (sets_ == 0) {
      // The index of a set must start inside the file; nothing is read from it.
      write_set(record, 1, 0, {0, record, record, 0});
      return std::move(out_);
    }
    Block block{0, first_index_, first_text_, 0};
    size_t left = sets_;
    for (const auto& [number, messages] : catalog_.sets) {
      if (messages.empty()) continue;
      --left;
      block.messages = static_cast<uint32_t>(messages.size());
      write_messages(block, messages);
      write_set(record, number, left == 0 ? 0 : record + static_cast<uint32_t>(layout::kSetBytes), block);
      record += layout::kSetBytes;
      block.index += block.messages * static_cast<uint32_t>(layout::kEntryBytes);
      block.texts += block.text_bytes;
    }
    return std::move(out_);
  }

 private:
  struct Block {
    uint32_t messages, index, texts, text_bytes;
  };

  void plan() {
    uint64_t entries = 0, text_bytes = 0;
    for (const auto& [number, messages] : catalog_.sets) {
      if (!messages.empty()) ++sets_;
      entries += messages.size();
      for (const auto& [message, text] : messages) text_bytes += text.size() + 1;
    }
    const uint64_t index = layout::kHeaderBytes + layout::kSetBytes * uint64_t{sets_ == 0 ? 1 : sets_};
    const uint64_t texts = index + layout::kEntryBytes * entries;
    if (texts + text_bytes > kMaxFileBytes)
      throw Failure(kDataError, "the catalog would have " + std::to_string(texts + text_bytes) +
                                    " bytes; it can have at most " + std::to_string(kMaxFileBytes));
    first_index_ = static_cast<uint32_t>(index);
    first_text_ = static_cast<uint32_t>(texts);
    out_.resize(static_cast<size_t>(texts + text_bytes));
  }

  void put(size_t at, uint32_t value) {
    const bool swap = catalog_.byte_order == ByteOrder::kBig;
    lx::put_le32(reinterpret_cast<uint8_t*>(&out_[at]), swap ? swapped(value) : value);
  }

  void write_header() {
    put(layout::kHeaderMagic, layout::kMagic);
    put(layout::kHeaderVersion, layout::kVersion);
    put(layout::kHeaderByteOrder, static_cast<uint32_t>(catalog_.byte_order));
    put(layout::kHeaderSets, sets_ == 0 ? 1 : sets_);
    put(layout::kHeaderFirstSet, layout::kHeaderBytes);
    std::memcpy(&out_[layout::kHeaderLocale], catalog_.locale.data(), catalog_.locale.size());
  }

  void write_set(uint32_t at, uint32_t number, uint32_t next, const Block& block) {
    put(at + layout::kSetNumber, number);
    put(at + layout::kSetNext, next);
    put(at + layout::kSetMessages, block.messages);
    put(at + layout::kSetIndex, block.index);
    put(at + layout::kSetTexts, block.texts);
    put(at + layout::kSetTextBytes, block.text_bytes);
  }

  void write_messages(Block& block, const std::map<uint32_t, std::string>& messages) {
    uint32_t entry = block.index;
    block.text_bytes = 0;
    for (const auto& [number, text] : messages) {
      const auto bytes = static_cast<uint32_t>(text.size() + 1);
      put(entry + layout::kEntryNumber, number);
      put(entry + layout::kEntryTextBytes, bytes);
      put(entry + layout::kEntryText, block.text_bytes);
      std::memcpy(&out_[block.texts + block.text_bytes], text.data(), text.size());
      block.text_bytes += bytes;
      entry += layout::kEntryBytes;
    }
  }

  const Catalog& catalog_;
  uint32_t sets_ = 0;
  uint32_t first_index_ = 0, first_text_ = 0;
  std::string out_;
};

class Unpacker {
 public:
  Unpacker(const std::string& bytes, const std::string& file_name)
      : file_{reinterpret_cast<const uint8_t*>(bytes.data()), bytes.size()},
        file_name_(file_name),
        text_budget_(kMaxSharing * bytes.size()),
        index_budget_(bytes.size()) {}

  Catalog unpack() {
    read_header();
    uint64_t record = get(layout::kHeaderFirstSet);
    uint32_t last = 0;
    for (uint32_t i = 0; i < sets_; ++i) {
      const std::string which = "the record of set " + std::to_string(i + 1) + " of " + std::to_string(sets_);
      need(record, layout::kSetBytes, which);
      const uint32_t number = get(record + layout::kSetNumber);
      check_ascending(record, "set", number, last);
      last = number;
      read_set(record, number);
      const uint32_t next = get(record + layout::kSetNext);
      const bool is_last = i + 1 == sets_;
      if (is_last != (next == 0))
        fail(record + layout::kSetNext,
             which + " has " + std::to_string(next) +
                 (is_last ? " as the next offset, expected 0: the header counts no more sets"
                          : " as the next offset: the header counts more sets"));
      record = next;
    }
    return std::move(catalog_);
  }

 private:
  [[noreturn]] void fail(uint64_t offset, const std::string& what) const {
    throw Failure(kDataError, file_name_ + ": offset " + std::to_string(offset) + ": " + what);
  }

  void need(uint64_t offset, uint64_t count, const std::string& what) const {
    if (offset > file_.size || count > file_.size - offset)
      fail(offset, what + " has " + std::to_string(count) + " bytes here and passes the end of the file, " +
                       std::to_string(file_.size));
  }

  void check_ascending(uint64_t offset, const char* what, uint32_t number, uint32_t last) const {
    if (number <= last)
      fail(offset, std::string(what) + " " + std::to_string(number) + " stands behind " + std::to_string(last) +
                       "; expected ascending numbers from 1");
  }

  uint32_t get(uint64_t offset) const {
    const uint32_t value = lx::le32(file_.data + offset);
    return catalog_.byte_order == ByteOrder::kBig ? swapped(value) : value;
  }

  void expect(uint64_t offset, const char* what, uint32_t expected) const {
    const uint32_t found = get(offset);
    if (found != expected)
      fail(offset, std::string(what) + " is " + lexicor_cli::hex_text(found, 8) + ", expected " +
                       lexicor_cli::hex_text(expected, 8));
  }

  void read_header() {
    need(0, layout::kHeaderBytes, "the header");
    catalog_.byte_order = ByteOrder::kLittle;
    if (get(layout::kHeaderMagic) == swapped(layout::kMagic)) catalog_.byte_order = ByteOrder::kBig;
    expect(layout::kHeaderMagic, "the magic number", layout::kMagic);
    expect(layout::kHeaderVersion, "the format version", layout::kVersion);
    expect(layout::kHeaderByteOrder, "the byte-order code", static_cast<uint32_t>(catalog_.byte_order));
    sets_ = get(layout::kHeaderSets);
    if (sets_ == 0) fail(layout::kHeaderSets, "the number of sets is 0, expected at least 1");
    const char* name = reinterpret_cast<const char*>(file_.data) + layout::kHeaderLocale;
    const void* end = std::memchr(name, 0, layout::kHeaderLocaleBytes);
    if (end == nullptr) fail(layout::kHeaderLocale, "the locale's name has no null in its 132 bytes");
    catalog_.locale = name;
  }

  void read_set(uint64_t record, uint32_t number) {
    const std::string which = " of set " + std::to_string(number);
    const uint32_t count = get(record + layout::kSetMessages);
    const uint64_t index = get(record + layout::kSetIndex);
    const uint64_t index_bytes = uint64_t{count} * layout::kEntryBytes;
    need(index, index_bytes, "the index" + which);
    const uint64_t texts = get(record + layout::kSetTexts);
    const uint32_t text_bytes = get(record + layout::kSetTextBytes);
    need(texts, text_bytes, "the text block" + which);
    if (index_bytes > index_budget_) fail(index, "the index" + which + " lies over other indexes");
    index_budget_ -= index_bytes;
    if (count == 0) return;
    std::map<uint32_t, std::string>& messages = catalog_.sets[number];
    uint32_t last = 0;
    for (uint64_t entry = index; entry != index + index_bytes; entry += layout::kEntryBytes) {
      const uint32_t message = get(entry + layout::kEntryNumber);
      check_ascending(entry, "message", message, last);
      last = message;
      messages.emplace_hint(messages.end(), message,
                            read_text(entry, texts, text_bytes, std::to_string(message) + which));
    }
  }

  std::string read_text(uint64_t entry, uint64_t texts, uint32_t block_bytes, const std::string& which) {
    const uint32_t bytes = get(entry + layout::kEntryTextBytes);
    const uint32_t offset = get(entry + layout::kEntryText);
    if (offset > block_bytes || bytes > block_bytes - offset)
      fail(entry, "the text of message " + which + " (" + std::to_string(bytes) + " bytes at " +
                      std::to_string(offset) + ") passes the end of its block of " +
                      std::to_string(block_bytes) + " bytes");
    const char* const text = reinterpret_cast<const char*>(file_.data) + texts + offset;
    if (bytes == 0 || text[bytes - 1] != 0)
      fail(texts + offset, "the text of message " + which + " does not end with a null byte");
    if (bytes > text_budget_)
      fail(entry, "the texts lie over each other more often than a catalog has use for");
    text_budget_ -= bytes;
    return {text, bytes - 1};
  }

  lx::Bytes file_;
  const std::string& file_name_;
  uint64_t text_budget_, index_budget_;
  uint32_t sets_ = 0;
  Catalog catalog_;
};

}  // namespace

ByteOrder native_byte_order() {
  const uint32_t probe = 0x00010203;
  uint8_t first;
  std::memcpy(&first, &probe, 1);
  return first == 0 ? ByteOrder::kBig : ByteOrder::kLittle;
}

std::string pack_catalog(const Catalog& catalog) {
  if (catalog.locale.size() >= layout::kHeaderLocaleBytes)
    throw Failure(kDataError, "the locale's name '" + catalog.locale + "' has " +
                                  std::to_string(catalog.locale.size()) + " bytes; a catalog holds at most " +
                                  std::to_string(layout::kHeaderLocaleBytes - 1));
  return Packer(catalog).pack();
}

Catalog unpack_catalog(const std::string& bytes, const std::string& file_name) {
  return Unpacker(bytes, file_name).unpack();
}

}  // namespace lexicor_gencat
