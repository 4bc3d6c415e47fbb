// What the object manager asks of an object type. Each room describes its types with one constant; the table of
// them is filled above the rooms, so that core includes and calls nothing above it.
#pragma once

#include "core/lxbytes.h"
#include "core/lxformat.h"
#include "core/lxrecords.h"

namespace lx {

/// The sections of one object while it is being loaded.
struct Sections {
  Bytes section[format::kMaxSections];
};

/// What a validator found: nothing, what is wrong and where, or no memory for the check.
struct Fault {
  int32_t code = LX_OK;  // LX_E_CORRUPT, LX_E_MEMORY
  const char* reason = nullptr;
  size_t section = 0;
  size_t offset = 0;  // in the section: of the field or record that is wrong

  explicit operator bool() const { return code != LX_OK; }
};
inline Fault corrupt(const char* reason, size_t offset, size_t section = 0) {
  return {LX_E_CORRUPT, reason, section, offset};
}

/// A payload that is compiled into the library.
struct BuiltIn {
  const char* name;
  Sections sections;
  const void* derived;
};

struct ObjectType {
  /// Whether every offset, count, index and text that a look-up can reach lies inside its section. Allocates no
  /// more than the sections have bytes, from the hook.
  Fault (*validate)(uint16_t id, const Sections& sections);

  /// Builds the derived data of validated sections in one block from the allocation hook; null: no memory. Null
  /// for a type without any.
  void* (*derive)(uint16_t id, const Sections& sections);

  /// Turns sections of version 1 into those of version 2: new blocks for section 0 and perhaps others; a
  /// section that was not replaced stays as it was. Codes: 0; 20; 2000 when they are not of version 1. Null for
  /// a type that has one version.
  int32_t (*upgrade)(const Sections& version1, Sections* upgraded);

  const BuiltIn* built_in;  // null: none
};

/// By type.
extern const ObjectType* const kObjectTypes[format::kTypes];

}  // namespace lx
