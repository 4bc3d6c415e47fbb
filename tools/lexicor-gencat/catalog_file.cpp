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

class Packer {
 public:
  explicit Packer(const Catalog& catalog)
      : catalog_(catalog), swapped_(catalog.byte_order != native_byte_order()) {}

  std::string pack() {
    plan();
    write_header();
    uint32_t at = layout::kHeaderBytes;
    if (sets_ == 0) {
      // The index of a set must start inside the file; nothing is read from it.
      layout::SetRecord{1, 0, 0, at, at, 0}.write(place(at), swapped_);
      return std::move(out_);
    }
    layout::SetRecord set{0, 0, 0, first_index_, first_text_, 0};
    size_t left = sets_;
    for (const auto& [number, messages] : catalog_.sets) {
      if (messages.empty()) continue;
      const uint32_t next = at + static_cast<uint32_t>(layout::kSetBytes);
      set.number = number;
      set.next = --left == 0 ? 0 : next;
      set.messages = static_cast<uint32_t>(messages.size());
      write_messages(set, messages);
      set.write(place(at), swapped_);
      at = next;
      set.index += set.messages * static_cast<uint32_t>(layout::kEntryBytes);
      set.texts += set.text_bytes;
    }
    return std::move(out_);
  }

 private:
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

  uint8_t* place(size_t at) { return reinterpret_cast<uint8_t*>(&out_[at]); }

  void write_header() {
    layout::Header header;
    header.byte_order = static_cast<uint32_t>(catalog_.byte_order);
    header.sets = sets_ == 0 ? 1 : sets_;
    header.first_set = layout::kHeaderBytes;
    catalog_.locale.copy(header.locale, sizeof(header.locale));
    header.write(place(0), swapped_);
  }

  /// Writes the entries and texts of a set, whose bytes they count.
  void write_messages(layout::SetRecord& set, const std::map<uint32_t, std::string>& messages) {
    uint32_t entry = set.index;
    set.text_bytes = 0;
    for (const auto& [number, text] : messages) {
      const auto bytes = static_cast<uint32_t>(text.size() + 1);
      layout::IndexEntry{number, bytes, set.text_bytes}.write(place(entry), swapped_);
      std::memcpy(&out_[set.texts + set.text_bytes], text.data(), text.size());
      set.text_bytes += bytes;
      entry += layout::kEntryBytes;
    }
  }

  const Catalog& catalog_;
  const bool swapped_;
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
    const layout::Header header = read_header();
    uint64_t at = header.first_set;
    uint32_t last = 0;
    for (uint32_t i = 0; i < header.sets; ++i) {
      const std::string which =
          "the record of set " + std::to_string(i + 1) + " of " + std::to_string(header.sets);
      need(at, layout::kSetBytes, which);
      const auto set = layout::SetRecord::read(file_.data + at, swapped_);
      check_ascending(at, "set", set.number, last);
      last = set.number;
      read_set(set);
      const bool is_last = i + 1 == header.sets;
      if (is_last != (set.next == 0))
        fail(at + layout::kSetNext,
             which + " has " + std::to_string(set.next) +
                 (is_last ? " as the next offset, expected 0: the header counts no more sets"
                          : " as the next offset: the header counts more sets"));
      at = set.next;
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

  void expect(uint64_t offset, const char* what, uint32_t found, uint32_t expected) const {
    if (found != expected)
      fail(offset, std::string(what) + " is " + lexicor_cli::hex_text(found, 8) + ", expected " +
                       lexicor_cli::hex_text(expected, 8));
  }

  layout::Header read_header() {
    need(0, layout::kHeaderBytes, "the header");
    swapped_ = layout::get_word(file_.data + layout::kHeaderMagic, true) == layout::kMagic;
    catalog_.byte_order = native_byte_order();
    if (swapped_)
      catalog_.byte_order = catalog_.byte_order == ByteOrder::kBig ? ByteOrder::kLittle : ByteOrder::kBig;
    const auto header = layout::Header::read(file_.data, swapped_);
    expect(layout::kHeaderMagic, "the magic number", header.magic, layout::kMagic);
    expect(layout::kHeaderVersion, "the format version", header.version, layout::kVersion);
    expect(layout::kHeaderByteOrder, "the byte-order code", header.byte_order,
           static_cast<uint32_t>(catalog_.byte_order));
    if (header.sets == 0) fail(layout::kHeaderSets, "the number of sets is 0, expected at least 1");
    const size_t name_bytes = strnlen(header.locale, sizeof(header.locale));
    if (name_bytes == sizeof(header.locale))
      fail(layout::kHeaderLocale, "the locale's name has no null in its 132 bytes");
    catalog_.locale.assign(header.locale, name_bytes);
    return header;
  }

  void read_set(const layout::SetRecord& set) {
    const std::string which = " of set " + std::to_string(set.number);
    const uint64_t index_bytes = uint64_t{set.messages} * layout::kEntryBytes;
    need(set.index, index_bytes, "the index" + which);
    need(set.texts, set.text_bytes, "the text block" + which);
    if (index_bytes > index_budget_) fail(set.index, "the index" + which + " lies over other indexes");
    index_budget_ -= index_bytes;
    if (set.messages == 0) return;
    std::map<uint32_t, std::string>& messages = catalog_.sets[set.number];
    uint32_t last = 0;
    for (uint64_t at = set.index; at != set.index + index_bytes; at += layout::kEntryBytes) {
      const auto entry = layout::IndexEntry::read(file_.data + at, swapped_);
      check_ascending(at, "message", entry.number, last);
      last = entry.number;
      messages.emplace_hint(messages.end(), entry.number,
                            read_text(at, entry, set, std::to_string(entry.number) + which));
    }
  }

  std::string read_text(uint64_t at, const layout::IndexEntry& entry, const layout::SetRecord& set,
                        const std::string& which) {
    const uint32_t bytes = entry.text_bytes;
    if (entry.text > set.text_bytes || bytes > set.text_bytes - entry.text)
      fail(at, "the text of message " + which + " (" + std::to_string(bytes) + " bytes at " +
                   std::to_string(entry.text) + ") passes the end of its block of " +
                   std::to_string(set.text_bytes) + " bytes");
    const uint64_t offset = uint64_t{set.texts} + entry.text;
    const char* const text = reinterpret_cast<const char*>(file_.data) + offset;
    if (bytes == 0 || text[bytes - 1] != 0)
      fail(offset, "the text of message " + which + " does not end with a null byte");
    if (bytes > text_budget_) fail(at, "the texts lie over each other more often than a catalog has use for");
    text_budget_ -= bytes;
    return {text, bytes - 1};
  }

  lx::Bytes file_;
  const std::string& file_name_;
  uint64_t text_budget_, index_budget_;
  bool swapped_ = false;
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
