// What an object type must provide to the object manager. Declared here and implemented in the room that owns
// the type, so that core includes nothing above it.
#pragma once

#include "core/lxbytes.h"
#include "core/lxformat.h"
#include "core/lxrecords.h"

namespace lx {

/// The sections of one object while it is being loaded.
struct Sections {
  Bytes section[format::kMaxSections];
};

// Validation: whether every offset, count, index and text that a look-up can reach lies inside its section.
// Codes: 0; 2000 refused; 20 no memory for the check.
int32_t validate_language(Bytes payload);
int32_t validate_territory(Bytes payload);
int32_t validate_codepage(uint16_t id, const Sections& sections);
int32_t validate_sort(Bytes payload);

/// Turns a version-1 codepage into a version-2 one: new blocks for section 0 and, in a multibyte codepage, 1.
/// `upgraded` receives the new sections; a section that was not replaced stays as it was.
/// Codes: 0; 20; 2000 when the sections are not a version-1 codepage.
int32_t upgrade_codepage(const Sections& version1, Sections* upgraded);

/// Builds the derived data of a validated codepage in one block from the allocation hook. Null: no memory.
void* derive_codepage(uint16_t id, const Sections& sections);
void* derive_sort(Bytes payload);  // the same for a sort

/// The payloads that are compiled into the library, by type.
struct BuiltIn {
  const char* name;
  Sections sections;
  const void* derived;
};
extern const BuiltIn kBuiltInLanguage;
extern const BuiltIn kBuiltInTerritory;
extern const BuiltIn kBuiltInCodepage;

}  // namespace lx
