// The content of a catalog: its header, its sets and its messages, in memory or in the file. Nothing outside
// the file is read, and no work or memory is larger than the file.
#include "catalog/lxmsgcat.h"
#include "codepage/lxtext.h"
#include "core/lxbytes.h"
#include "locale/lxlocale.h"

namespace {

namespace format = lx::format::catalog;
using lx::catalog_word;

// Index entries are read as many at a time as a work buffer on the stack holds.
constexpr size_t kEntriesAtATime = 256 / format::kEntryBytes;

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
  uint8_t header[format::kHeaderBytes];
  if (!read_at(*catalog, 0, header, sizeof(header))) return LX_E_CATALOG;
  const uint32_t sets = catalog_word(header + format::kHeaderSets);
  const char* const name = reinterpret_cast<const char*>(header) + format::kHeaderLocale;
  if (catalog_word(header + format::kHeaderMagic) != format::kMagic ||
      catalog_word(header + format::kHeaderVersion) != format::kVersion ||
      catalog_word(header + format::kHeaderByteOrder) != LXMcGetByteOrder() || sets == 0 ||
      !holds(catalog->file_bytes, format::kHeaderBytes, uint64_t{sets} * format::kSetBytes) ||
      memchr(name, 0, format::kHeaderLocaleBytes) == nullptr)
    return LX_E_CATALOG;
  catalog->locale = LXGetLocale(name, 0, nullptr);
  if (catalog->locale == nullptr) return LX_E_CATALOG;
  catalog->set_count = sets;
  catalog->first_set = catalog_word(header + format::kHeaderFirstSet);
  return LX_OK;
}

/// Looks for a number in an array of records of `stride` bytes that begin with ascending numbers, first where
/// it stands when all numbers from 1 on are there. Null when it is not there.
const uint8_t* find_number(const uint8_t* records, uint32_t count, size_t stride, uint32_t wanted) {
  const bool dense = wanted - 1 < count;
  uint32_t low = 0;
  uint32_t high = dense ? wanted : count;
  uint32_t at = dense ? wanted - 1 : count / 2;
  while (low < high) {
    const uint8_t* const record = records + at * stride;
    const uint32_t number = catalog_word(record);
    if (number == wanted) return record;
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
  return nullptr;
}
static_assert(format::kSetNumber == 0 && format::kEntryNumber == 0, "find_number() reads records' first words");

/// Loads all sets: as many as the header counts.
int32_t load_sets(LXCatalog* catalog) {
  catalog->sets = static_cast<uint8_t*>(lx::hook_allocate(catalog->set_count * format::kSetBytes));
  if (catalog->sets == nullptr) return LX_E_MEMORY;
  uint32_t offset = catalog->first_set;
  for (uint32_t i = 0; i < catalog->set_count; ++i) {
    uint8_t* const record = catalog->sets + i * format::kSetBytes;
    if ((i != 0 && offset == 0) || !LXMcLoadSet(*catalog, offset, record)) return LX_E_CATALOG;
    offset = catalog_word(record + format::kSetNext);
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
int32_t read_entry(const LXCatalog& catalog, const uint8_t* record, uint32_t number, uint8_t* entry) {
  uint32_t offset = catalog_word(record + format::kSetIndex);
  for (size_t left = catalog_word(record + format::kSetMessages); left != 0;) {
    if (offset > catalog.file_bytes) return LX_E_CATALOG;
    uint8_t entries[kEntriesAtATime * format::kEntryBytes];
    const size_t count = lx::least(left, kEntriesAtATime, (catalog.file_bytes - offset) / format::kEntryBytes);
    const size_t bytes = count * format::kEntryBytes;
    if (count == 0 || !read_at(catalog, offset, entries, bytes)) return LX_E_CATALOG;
    for (size_t at = 0; at != bytes; at += format::kEntryBytes) {
      if (catalog_word(entries + at) != number) continue;
      memcpy(entry, entries + at, format::kEntryBytes);
      return LX_OK;
    }
    left -= count;
    offset += static_cast<uint32_t>(bytes);
  }
  return LX_E_MESSAGE;
}

/// The text of an index entry, which must lie in the set's texts.
int32_t get_text(const LXCatalog& catalog, const uint8_t* record, const uint8_t* entry,
                 lx::MessageText* message) {
  const uint32_t texts = catalog_word(record + format::kSetTexts);
  const uint32_t all_bytes = catalog_word(record + format::kSetTextBytes);
  const uint32_t offset = catalog_word(entry + format::kEntryText);
  const uint32_t bytes = catalog_word(entry + format::kEntryTextBytes);
  if (!holds(catalog.file_bytes, texts, all_bytes) || !holds(all_bytes, offset, bytes)) return LX_E_CATALOG;
  if (catalog.image != nullptr) {
    message->text = reinterpret_cast<const char*>(catalog.image) + texts + offset;
  } else {
    message->copy = static_cast<char*>(lx::hook_allocate(size_t{bytes} + 1));
    if (message->copy == nullptr || !read_at(catalog, texts + offset, message->copy, bytes))
      return LX_E_CATALOG;
    message->text = message->copy;
  }
  message->bytes = static_cast<int32_t>(strnlen(message->text, bytes));
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
  auto* catalog =
      static_cast<LXCatalog*>(file_bytes < 0 ? nullptr : lx::hook_allocate_zeroed(sizeof(LXCatalog)));
  if (catalog == nullptr) {
    LXCloseFile(file, 0);
    return nullptr;
  }
  catalog->file = file;
  catalog->file_bytes = static_cast<uint32_t>(file_bytes);
  catalog->opener = opener;
  *rc = (flags & LX_CATALOG_LOAD) == LX_CATALOG_LOAD ? load(catalog) : LX_OK;
  if (*rc == LX_OK) return catalog;
  lx::free_catalog(catalog);
  return nullptr;
}

bool LXMcLoadSet(const LXCatalog& catalog, uint32_t offset, uint8_t* record) {
  if (!read_at(catalog, offset, record, format::kSetBytes)) return false;
  const uint32_t index = catalog_word(record + format::kSetIndex);
  const uint64_t index_bytes = uint64_t{catalog_word(record + format::kSetMessages)} * format::kEntryBytes;
  // The first entry must be there even where the set has no messages.
  return holds(catalog.file_bytes, index, format::kEntryBytes) &&
         holds(catalog.file_bytes, index, index_bytes) &&
         holds(catalog.file_bytes, catalog_word(record + format::kSetTexts),
               catalog_word(record + format::kSetTextBytes));
}

int32_t MCGetSet(LXCatalog* catalog, uint32_t number, uint8_t* record) {
  if (catalog->sets != nullptr) {
    const uint8_t* found = find_number(catalog->sets, catalog->set_count, format::kSetBytes, number);
    if (found == nullptr) return LX_E_MESSAGE;
    memcpy(record, found, format::kSetBytes);
    return LX_OK;
  }
  if (catalog->locale == nullptr) {
    if (const int32_t code = read_header(catalog)) return code;
  }
  uint32_t offset = catalog->first_set;
  for (uint32_t i = 0; i < catalog->set_count; ++i) {
    if (!read_at(*catalog, offset, record, format::kSetBytes)) return LX_E_CATALOG;
    if (catalog_word(record + format::kSetNumber) == number) return LX_OK;
    offset = catalog_word(record + format::kSetNext);
    if (offset == 0) return LX_E_MESSAGE;
  }
  return LX_E_MESSAGE;
}

int32_t MCGetMsg(const LXCatalog& catalog, const uint8_t* record, uint32_t number, lx::MessageText* message) {
  uint8_t read[format::kEntryBytes];
  const uint8_t* entry = read;
  if (catalog.image != nullptr) {
    entry = find_number(catalog.image + catalog_word(record + format::kSetIndex),
                        catalog_word(record + format::kSetMessages), format::kEntryBytes, number);
    if (entry == nullptr) return LX_E_MESSAGE;
  } else if (const int32_t code = read_entry(catalog, record, number, read)) {
    return code;
  }
  return get_text(catalog, record, entry, message);
}
