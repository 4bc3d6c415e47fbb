// Message catalogs: an open catalog, how sets and messages are found in it, and where its file is looked for.
#pragma once

#include <cstring>

#include "core/lxcatformat.h"
#include "core/lxmemory.h"

/// Loaded: `image` and `sets` are there and no file. File mode: `file` is open, and the header is read and
/// checked when the first message is asked for.
struct LXCatalog {
  uint8_t* image;  // the whole file
  lx::format::catalog::SetRecord* sets;
  uint32_t file_bytes;  // when it was opened
  uint32_t set_count;
  uint32_t first_set;  // offset
  LXLocale* opener;    // null: the default locale of the time
  LXLocale* locale;    // of the texts; null: the header has not been read
  LXFile* file;
};

namespace lx {

using SetRecord = format::catalog::SetRecord;

/// A message in the codepage of the catalog's locale: in the image, or a copy of its own.
struct MessageText {
  MessageText() = default;
  ~MessageText() { hook_free(copy); }
  MessageText(const MessageText&) = delete;
  MessageText& operator=(const MessageText&) = delete;

  const char* text = nullptr;
  int32_t bytes = 0;  // before the null, or all of a text without one
  char* copy = nullptr;
};

/// Goes through the search list. Null with 20 or 71.
LXFile* open_catalog_file(LXLocale* locale, const char* directory, const char* name, bool one_locale,
                          int32_t* rc);

void free_catalog(LXCatalog* catalog);

}  // namespace lx

/// Makes a catalog of an open file, which belongs to it then; on failure the file is closed. Null with 20
/// or 71.
LXCatalog* LXMcLoadCat(LXFile* file, LXLocale* opener, uint32_t flags, int32_t* rc);

/// Reads the set record at an offset of a loaded catalog. False when it, its index or its texts do not lie in
/// the file.
bool LXMcLoadSet(const LXCatalog& catalog, uint32_t offset, lx::SetRecord* record);

/// Finds a set, which is read to `room` or is loaded; finds a message of a set: 0, 71, or 72 when there is none.
int32_t MCGetSet(LXCatalog* catalog, uint32_t number, lx::SetRecord* room, const lx::SetRecord** record);
int32_t MCGetMsg(const LXCatalog& catalog, const lx::SetRecord& record, uint32_t number,
                 lx::MessageText* message);
