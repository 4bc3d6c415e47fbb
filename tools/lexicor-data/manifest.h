// manifest.json, which a compiled directory holds beside its objects: what each was made from, with digests by which
// files are verified, data are known again, and unchanged sources are not compiled again.
#pragma once

#include <map>
#include <string>
#include <vector>

#include "object_file.h"
#include "source_model.h"

namespace lexicor_data {

inline constexpr char kManifestFile[] = "manifest.json";

struct ManifestObject {
  ObjectName name;
  std::string file;                            ///< "cp_00819.nls"
  size_t bytes = 0;                            ///< of the file
  std::string sha256;                          ///< of the file, in hexadecimal
  std::string digest;                          ///< of the sections
  std::string made_from;                       ///< as the object says it
  std::map<std::string, std::string> sources;  ///< the SHA-256 of each, by its path in the source directory
  std::vector<std::string> notes;              ///< what the compiler had to say of it, beginning with the path
};

struct Manifest {
  uint16_t compiler = kCompilerVersion;
  std::map<std::string, std::string> files;  ///< the SHA-256 of every other file
  std::vector<ManifestObject> objects;       ///< in the order of the control file

  const ManifestObject* find(const ObjectName& name) const;
};

/// What the manifest says of an object's file, but for its sources and notes.
ManifestObject describe_object(const ObjectName& name, const ByteVector& file);

/// One line an object; equal manifests give equal bytes.
ByteVector write_manifest(const Manifest& manifest);

/// Throws a SourceError when the text is no manifest.
Manifest read_manifest(const ByteVector& text, const std::string& file_name);

}  // namespace lexicor_data
