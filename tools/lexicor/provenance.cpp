// The manifest is a file beside the objects: docs/locale-directory.md describes it.
#include "provenance.h"

#include <lx.h>

#include <fstream>

#include "catalogue.h"
#include "session.h"

namespace lexicor_cli {

namespace {

constexpr const char* kTypeNames[] = {"language", "territory", "codepage", "sort"};  // by type
constexpr size_t kDigits = 2 * LX_DIGEST_BYTES;

}  // namespace

Provenance::Provenance() {
  std::ifstream in(locale_directory() + "/manifest.json", std::ios::binary);
  if (in) manifest_ = Json::parse(in, nullptr, false);
}

Json Provenance::field_of(int type, const std::string& name, const char* field) const {
  if (!manifest_.is_object() || !manifest_.contains("objects")) return Json();
  for (const Json& object : manifest_["objects"]) {
    if (!object.is_object() || !object.contains("name") || !object["name"].is_string()) continue;
    if (object.value("type", "") != kTypeNames[type] || !same_name(object["name"].get<std::string>(), name))
      continue;
    return object.contains(field) ? object[field] : Json();
  }
  return Json();
}

Json Provenance::digest_of(int type, const std::string& name) const {
  if (type == LX_SORT && same_name(name, "BINARY")) return std::string(kDigits, '0');
  return field_of(type, name, "digest");
}

Json Provenance::source_of(int type, const std::string& name) const {
  return field_of(type, name, "made_from");
}

Json Provenance::compiler() const {
  return manifest_.is_object() && manifest_.contains("compiler") ? manifest_["compiler"] : Json();
}

}  // namespace lexicor_cli
