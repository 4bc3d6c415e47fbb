// Codepage aliases: a text file of the locale directory, read once into a list in file order. A line that
// starts in column 1 names a codepage object and aliases of it; a line that starts with a blank goes on with
// the current codepage; '#' in column 1 begins a comment.
#include "core/lxalias.h"

#include <stdio.h>
#include <string.h>

#include "core/lxfile.h"
#include "core/lxformat.h"
#include "core/lxmemory.h"
#include "core/lxtrace.h"

using namespace lx;

namespace {

RAS1_Unit unit = RAS1_UNIT("lxalias");

constexpr size_t kMaxLineBytes = 32767;  // a longer line is read as several
constexpr size_t kMaxCodepageBytes = sizeof(AliasRecord::codepage) - 1;
constexpr size_t kMaxAliasBytes = sizeof(AliasRecord::alias) - 1;
constexpr size_t kNameBytes = sizeof(LXObjManager::directory) + 16;

bool is_separator(char c) {
  return c == ' ' || c == '\t' || c == '\n' || c == '\r' || c == '\0';
}

char upper_case(char c) {
  return c >= 'a' && c <= 'z' ? static_cast<char>(c - 'a' + 'A') : c;
}

/// A piece of the file's text.
struct Span {
  const char* begin = nullptr;
  const char* end = nullptr;

  size_t bytes() const { return static_cast<size_t>(end - begin); }
  int printable_bytes() const { return static_cast<int>(bytes()); }
};

/// Takes the next token off `line`; an empty one when there is none.
Span take_token(Span* line) {
  const char* p = line->begin;
  while (p < line->end && is_separator(*p)) ++p;
  Span token{p, p};
  while (token.end < line->end && !is_separator(*token.end)) ++token.end;
  line->begin = token.end;
  return token;
}

Span take_line(Span* text) {
  Span line{text->begin, text->begin};
  while (line.end < text->end && line.bytes() < kMaxLineBytes && *line.end != '\n') ++line.end;
  text->begin = line.end < text->end && *line.end == '\n' ? line.end + 1 : line.end;
  return line;
}

/// Appends records to the manager's list as the lines come.
class AliasReader {
 public:
  explicit AliasReader(LXObjManager* manager) : tail_(&manager->aliases) {}

  bool read(Span text) {
    while (text.begin < text.end)
      if (!read_line(take_line(&text))) return false;
    return true;
  }

 private:
  bool read_line(Span line) {
    if (line.bytes() == 0 || *line.begin == '#') return true;
    // Only a blank in column 1 continues; a tab there, say, comes before the name of a new codepage.
    if (*line.begin != ' ') {
      const Span name = take_token(&line);
      if (name.bytes() == 0) return true;
      if (!start_codepage(name)) return false;
    }
    for (Span alias = take_token(&line); alias.bytes() != 0; alias = take_token(&line)) {
      if (codepage_.bytes() == 0) {
        LX_TRACE(unit, RAS1_LEVEL_ERRORS, "Codepage name %.*s does not start in column 1",
                 alias.printable_bytes(), alias.begin);
        return false;
      }
      if (!add_alias(alias)) return false;
    }
    return true;
  }

  bool start_codepage(Span name) {
    if (name.bytes() > kMaxCodepageBytes) {
      LX_TRACE(unit, RAS1_LEVEL_ERRORS, "codepage name length (%d) for %.*s exceeds maximum of %d",
               name.printable_bytes(), name.printable_bytes(), name.begin, static_cast<int>(kMaxCodepageBytes));
      return false;
    }
    LX_TRACE(unit, RAS1_LEVEL_DETAIL, "Processing codepage '%.*s'", name.printable_bytes(), name.begin);
    codepage_ = name;
    return true;
  }

  bool add_alias(Span alias) {
    LX_TRACE(unit, RAS1_LEVEL_DETAIL, "Processing alias '%.*s'", alias.printable_bytes(), alias.begin);
    if (alias.bytes() > kMaxAliasBytes) {
      // The message names the limit of codepage names, as its readers know it.
      LX_TRACE(unit, RAS1_LEVEL_ERRORS, "Alias name length (%d) for %.*s exceeds maximum of %d",
               alias.printable_bytes(), alias.printable_bytes(), alias.begin,
               static_cast<int>(kMaxCodepageBytes));
      return false;
    }
    auto* record = static_cast<AliasRecord*>(hook_allocate_zeroed(sizeof(AliasRecord)));
    if (record == nullptr) {
      LX_TRACE(unit, RAS1_LEVEL_ERRORS, "Unable to allocate %d bytes for codepage %.*s, alias %.*s",
               static_cast<int>(sizeof(AliasRecord)), codepage_.printable_bytes(), codepage_.begin,
               alias.printable_bytes(), alias.begin);
      return false;
    }
    memcpy(record->codepage, codepage_.begin, codepage_.bytes());
    for (size_t i = 0; i < alias.bytes(); ++i) record->alias[i] = upper_case(alias.begin[i]);
    *tail_ = record;
    tail_ = &record->next;
    LX_TRACE(unit, RAS1_LEVEL_DETAIL, "Saved alias %s, length = %d", record->alias, alias.printable_bytes());
    return true;
  }

  AliasRecord** tail_;
  Span codepage_;
};

}  // namespace

char* LXGetAliasFileName(const char* directory, char* buffer, size_t size) {
  const size_t needed = strlen(directory) + strlen("/") + strlen(format::kAliasFile) + 1;
  if (needed > size) {
    fprintf(stderr, "Buffer provided = %d, needed = %d\n", static_cast<int>(size), static_cast<int>(needed));
    return nullptr;
  }
  snprintf(buffer, size, "%s%s%s", directory, globals.area->directory_separator, format::kAliasFile);
  return buffer;
}

bool LXBuildAliasList(LXObjManager* manager) {
  Events events(unit);
  char name[kNameBytes];
  if (LXGetAliasFileName(manager->directory, name, sizeof(name)) == nullptr) {
    LX_TRACE(unit, RAS1_LEVEL_ERRORS, "Unable to generate alias file name");
    return events.exit(false);
  }
  int32_t rc = LX_OK;
  LXFile* file = open_for_reading(name, &rc);
  if (file == nullptr) {
    LX_TRACE(unit, RAS1_LEVEL_ERRORS, "Open of %s failed, err = %d", name, rc);
    return events.exit(false);
  }
  FileCloser closer(file);
  const int32_t bytes = LXFileSize(file);
  HookPtr<char> text(static_cast<char*>(LXLoadFile(file, 0, bytes, &rc)));
  if (rc != LX_OK) return events.exit(false);
  return events.exit(AliasReader(manager).read(Span{text.get(), text.get() + bytes}));
}

void LXDestroyAliasList(LXObjManager* manager) {
  while (AliasRecord* record = manager->aliases) {
    manager->aliases = record->next;
    hook_free(record);
  }
}

extern "C" {

const char* LXGetCodepageFromAlias(LXObjManager* given, const char* alias) {
  Events events(unit);
  const char* const none = nullptr;
  const LXObjManager* manager = manager_of(given);
  if (manager == nullptr) return events.exit(none);
  LX_TRACE(unit, RAS1_LEVEL_INPUT, "Searching for %s.", alias);
  const size_t bytes = strlen(alias);
  for (const AliasRecord* record = manager->aliases; record != nullptr; record = record->next) {
    if (strlen(record->alias) != bytes || LXmemicmp(record->alias, alias, bytes) != 0) continue;
    LX_TRACE(unit, RAS1_LEVEL_NOTICES, "%s -> %s", alias, record->codepage);
    return events.exit(static_cast<const char*>(record->codepage));
  }
  return events.exit(none);
}

int32_t LXEnumAliases(LXObjManager* given, LXAliasCallback callback, void* user) {
  Events events(unit);
  const LXObjManager* manager = manager_of(given);
  if (manager == nullptr) return events.exit(LX_E_NOT_INITIALIZED);
  for (const AliasRecord* record = manager->aliases; record != nullptr; record = record->next)
    if (callback(user, record->codepage, record->alias) == 0) break;
  return events.exit(LX_OK);
}

}  // extern "C"
