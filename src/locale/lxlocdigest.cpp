// The digests of a locale's objects: by them a program sees whether the data that it made something with, such as the
// sort keys of an index, are still the same.
#include <string.h>

#include "core/lxcall.h"
#include "core/lxdigest.h"

using namespace lx;

namespace {

RAS1_Unit unit = RAS1_UNIT("lxlocdigest");

constexpr int32_t kDigestBytes = LX_DIGEST_BYTES;
static_assert(kDigestBytes == Sha256::kBytes, "the public size");

/// The object of a type, null for binary order; false: there is no such type.
bool object_of_type(const LXLocale* locale, int32_t type, const LXObject** object) {
  switch (type) {
    case LX_LANGUAGE:
      *object = locale->language;
      return true;
    case LX_TERRITORY:
      *object = locale->territory;
      return true;
    case LX_CODEPAGE:
      *object = locale->codepage;
      return true;
    case LX_SORT:
      *object = locale->sort;
      return true;
    default:
      return false;
  }
}

}  // namespace

extern "C" {

int32_t LXGetLocaleDigest(LXLocale* given, int32_t type, uint8_t* buffer, int32_t size) {
  Call call{unit, given};
  if (!call) return call.exit(0);
  const LXObject* object = nullptr;
  if (!object_of_type(call.locale(), type, &object)) return call.fail(LX_E_INVALID, 0);
  if (size < kDigestBytes) return call.fail(LX_E_SIZE, 0);
  if (object == nullptr) {
    memset(buffer, 0, kDigestBytes);
    return call.exit(kDigestBytes);
  }
  Bytes sections[format::kMaxSections];
  for (size_t i = 0; i < format::kMaxSections; ++i)
    sections[i] = {object->section[i], object->section_bytes[i]};
  digest_of(sections, buffer);
  return call.exit(kDigestBytes);
}

}  // extern "C"
