// The content of a catalog: its header, its sets and its messages, in memory or in the file. Nothing outside
// the file is read, and no work or memory is larger than the file.
#include "catalog/lxmsgcat.h"
#include "codepage/lxtext.h"
#include "core/lxbytes.h"
#include "locale/lxlocale.h"

using namespace lx;

namespace {

namespace fmt = format::catalog;

// Index entries are read as many at a time as a work buffer on the stack holds.
constexpr size_t kEntriesAtATime = 256 / fmt::kEntryBytes;

/// Whether `bytes` bytes at `offset` lie in a space of `space` bytes.
constexpr bool holds(uint32_t space, uint64_t offset, uint64_t bytes) {
  return offset <= space && bytes <= space - offset;
}

bool read_at(const LXCatalog& catalog, uint32_t offset, void* to, size_t bytes) {
  if (!holds(catalog.file_bytes, offset, bytes)) return false;
  if (catalog.image != nullptr) {
    memcpy(to, catalog.image + offset, bytes);
    return true;
  }
  if (LXSeekFile(catalog.file, static_cast<int32_t>(offset), LX_FROM_START) != 0) return false;
  int32_t rc = LX_OK;
  return LXReadFile(catalog.file, to, static_cast<int32_t>(bytes), &rc) == static_cast<int32_t>(bytes);
}

/// Reads and checks the header, and gets the locale of the texts. A number of sets that the file cannot hold is
/// refused: it bounds the walk along the chain.
int32_t read_header(LXCatalog* catalog) {
  uint8_t bytes[fmt::kHeaderBytes];
  if (!read_at(*catalog, 0, bytes, sizeof(bytes))) return LX_E_CATALOG;
  const fmt::Header header = fmt::Header::read(bytes);
  if (header.magic != fmt::kMagic || header.version != fmt::kVersion ||
      header.byte_order != LXMcGetByteOrder() || header.sets == 0 ||
      !holds(catalog->file_bytes, fmt::kHeaderBytes, uint64_t{header.sets} * fmt::kSetBytes) ||
      memchr(header.locale, 0, sizeof(header.locale)) == nullptr)
    return LX_E_CATALOG;
  catalog->locale = LXGetLocale(header.locale, 0, nullptr);
  if (catalog->locale == nullptr) return LX_E_CATALOG;
  catalog->set_count = header.sets;
  catalog->first_set = header.first_set;
  return LX_OK;
}

bool read_set(const LXCatalog& catalog, uint32_t offset, SetRecord* record) {
  uint8_t bytes[fmt::kSetBytes];
  if (!read_at(catalog, offset, bytes, sizeof(bytes))) return false;
  *record = SetRecord::read(bytes);
  return true;
}

/// Looks for a number among `count` ascending ones, first where it stands when all numbers from 1 on are there.
/// `count` when it is not there.
template <class NumberAt>
uint32_t find_number(NumberAt number_at, uint32_t count, uint32_t wanted) {
  const bool dense = wanted - 1 < count;
  uint32_t low = 0;
  uint32_t high = dense ? wanted : count;
  uint32_t at = dense ? wanted - 1 : count / 2;
  while (low < high) {
    const uint32_t number = number_at(at);
    if (number == wanted) return at;
    const bool above = number > wanted;
    if (above) {
      high = at;
    } else {
      low = at + 1;
      // As many places on as the numbers differ, at most.
      if (high - low > wanted - number) high = low + (wanted - number);
    }
    const uint32_t step = high - low == 1 ? 1 : (high - low) / 2;
    at = above ? at - step : at + step;
  }
  return count;
}

/// Loads all sets: as many as the header counts.
int32_t load_sets(LXCatalog* catalog) {
  catalog->sets = static_cast<SetRecord*>(hook_allocate(catalog->set_count * sizeof(SetRecord)));
  if (catalog->sets == nullptr) return LX_E_MEMORY;
  uint32_t offset = catalog->first_set;
  for (uint32_t i = 0; i < catalog->set_count; ++i) {
    if ((i != 0 && offset == 0) || !LXMcLoadSet(*catalog, offset, &catalog->sets[i])) return LX_E_CATALOG;
    offset = catalog->sets[i].next;
  }
  return LX_OK;
}

/// Reads the file into memory and closes it.
int32_t load(LXCatalog* catalog) {
  int32_t rc = LX_OK;
  catalog->image =
      static_cast<uint8_t*>(LXLoadFile(catalog->file, 0, static_cast<int32_t>(catalog->file_bytes), &rc));
  LXCloseFile(catalog->file, 0);
  catalog->file = nullptr;
  if (catalog->image == nullptr) return rc == LX_E_MEMORY ? LX_E_MEMORY : LX_E_CATALOG;
  rc = read_header(catalog);
  return rc == LX_OK ? load_sets(catalog) : rc;
}

/// Reads index entries in order until one has the number: 0, 71 or 72.
int32_t read_entry(const LXCatalog& catalog, const SetRecord& set, uint32_t number, fmt::IndexEntry* entry) {
  uint32_t offset = set.index;
  for (size_t left = set.messages; left != 0;) {
    if (offset > catalog.file_bytes) return LX_E_CATALOG;
    uint8_t entries[kEntriesAtATime * fmt::kEntryBytes];
    const size_t count = least(left, kEntriesAtATime, (catalog.file_bytes - offset) / fmt::kEntryBytes);
    const size_t bytes = count * fmt::kEntryBytes;
    if (count == 0 || !read_at(catalog, offset, entries, bytes)) return LX_E_CATALOG;
    for (size_t at = 0; at != bytes; at += fmt::kEntryBytes) {
      *entry = fmt::IndexEntry::read(entries + at);
      if (entry->number == number) return LX_OK;
    }
    left -= count;
    offset += static_cast<uint32_t>(bytes);
  }
  return LX_E_MESSAGE;
}

/// The text of an index entry, which must lie in the set's texts.
int32_t get_text(const LXCatalog& catalog, const SetRecord& set, const fmt::IndexEntry& entry,
                 MessageText* message) {
  if (!holds(catalog.file_bytes, set.texts, set.text_bytes) ||
      !holds(set.text_bytes, entry.text, entry.text_bytes))
    return LX_E_CATALOG;
  const uint32_t offset = set.texts + entry.text;
  if (catalog.image != nullptr) {
    message->text = reinterpret_cast<const char*>(catalog.image) + offset;
  } else {
    message->copy = static_cast<char*>(hook_allocate(size_t{entry.text_bytes} + 1));
    if (message->copy == nullptr || !read_at(catalog, offset, message->copy, entry.text_bytes))
      return LX_E_CATALOG;
    message->text = message->copy;
  }
  message->bytes = static_cast<int32_t>(strnlen(message->text, entry.text_bytes));
  return LX_OK;
}

}  // namespace

namespace lx {

void free_catalog(LXCatalog* catalog) {
  hook_free(catalog->sets);
  LXUnloadFile(catalog->image);
  if (catalog->file != nullptr) LXCloseFile(catalog->file, 0);
  if (catalog->locale != nullptr) free_locale(catalog->locale);
  hook_free(catalog);
}

}  // namespace lx

LXCatalog* LXMcLoadCat(LXFile* file, LXLocale* opener, uint32_t flags, int32_t* rc) {
  const int32_t file_bytes = LXFileSize(file);
  *rc = file_bytes < 0 ? LX_E_CATALOG : LX_E_MEMORY;
  auto* catalog = static_cast<LXCatalog*>(file_bytes < 0 ? nullptr : hook_allocate_zeroed(sizeof(LXCatalog)));
  if (catalog == nullptr) {
    LXCloseFile(file, 0);
    return nullptr;
  }
  catalog->file = file;
  catalog->file_bytes = static_cast<uint32_t>(file_bytes);
  catalog->opener = opener;
  *rc = (flags & LX_CATALOG_LOAD) == LX_CATALOG_LOAD ? load(catalog) : LX_OK;
  if (*rc == LX_OK) return catalog;
  free_catalog(catalog);
  return nullptr;
}

bool LXMcLoadSet(const LXCatalog& catalog, uint32_t offset, SetRecord* record) {
  if (!read_set(catalog, offset, record)) return false;
  // The first entry must be there even where the set has no messages.
  return holds(catalog.file_bytes, record->index, fmt::kEntryBytes) &&
         holds(catalog.file_bytes, record->index, uint64_t{record->messages} * fmt::kEntryBytes) &&
         holds(catalog.file_bytes, record->texts, record->text_bytes);
}

int32_t MCGetSet(LXCatalog* catalog, uint32_t number, SetRecord* room, const SetRecord** record) {
  if (catalog->sets != nullptr) {
    const SetRecord* sets = catalog->sets;
    const uint32_t at = find_number([&](uint32_t i) { return sets[i].number; }, catalog->set_count, number);
    if (at == catalog->set_count) return LX_E_MESSAGE;
    *record = &sets[at];
    return LX_OK;
  }
  if (catalog->locale == nullptr) {
    if (const int32_t code = read_header(catalog)) return code;
  }
  *record = room;
  uint32_t offset = catalog->first_set;
  for (uint32_t i = 0; i < catalog->set_count; ++i) {
    if (!read_set(*catalog, offset, room)) return LX_E_CATALOG;
    if (room->number == number) return LX_OK;
    offset = room->next;
    if (offset == 0) return LX_E_MESSAGE;
  }
  return LX_E_MESSAGE;
}

int32_t MCGetMsg(const LXCatalog& catalog, const SetRecord& set, uint32_t number, MessageText* message) {
  fmt::IndexEntry entry;
  if (catalog.image != nullptr) {
    const uint8_t* index = catalog.image + set.index;
    const auto entry_at = [&](uint32_t i) { return fmt::IndexEntry::read(index + i * fmt::kEntryBytes); };
    const uint32_t at = find_number([&](uint32_t i) { return entry_at(i).number; }, set.messages, number);
    if (at == set.messages) return LX_E_MESSAGE;
    entry = entry_at(at);
  } else if (const int32_t code = read_entry(catalog, set, number, &entry)) {
    return code;
  }
  return get_text(catalog, set, entry, message);
}
