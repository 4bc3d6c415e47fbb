// The manifest as JSON: readable by every program, and by people because an object is a line.
#include "manifest.h"

#include <algorithm>
#include <nlohmann/json.hpp>

#include "compile.h"
#include "source_error.h"

namespace lexicor_data {
namespace {

using Json = nlohmann::ordered_json;

std::string line_of(const Json& json) {
  return json.dump(-1, ' ', false, Json::error_handler_t::replace);
}

Json json_object(const ManifestObject& object) {
  Json row = {{"file", object.file},      {"type", kTypeNames[static_cast<size_t>(object.name.type)]},
              {"id", object.name.id},     {"name", object.name.name},
              {"bytes", object.bytes},    {"sha256", object.sha256},
              {"digest", object.digest},  {"made_from", object.made_from},
              {"sources", object.sources}};
  if (!object.notes.empty()) row["notes"] = object.notes;
  return row;
}

ManifestObject object_of(const Json& row) {
  ManifestObject object;
  const auto type = std::find(std::begin(kTypeNames), std::end(kTypeNames), row.at("type").get<std::string>());
  if (type == std::end(kTypeNames)) throw std::out_of_range("unknown type");
  object.name.type = static_cast<ObjectType>(type - std::begin(kTypeNames));
  object.name.id = row.at("id").get<uint16_t>();
  object.name.name = row.at("name").get<std::string>();
  object.file = row.at("file").get<std::string>();
  object.bytes = row.at("bytes").get<size_t>();
  object.sha256 = row.at("sha256").get<std::string>();
  object.digest = row.at("digest").get<std::string>();
  object.made_from = row.at("made_from").get<std::string>();
  object.sources = row.at("sources").get<std::map<std::string, std::string>>();
  if (row.contains("notes")) object.notes = row.at("notes").get<std::vector<std::string>>();
  return object;
}

}  // namespace

const ManifestObject* Manifest::find(const ObjectName& name) const {
  const auto same = [&](const ManifestObject& object) {
    return object.name.type == name.type && object.name.id == name.id && object.name.name == name.name;
  };
  const auto found = std::find_if(objects.begin(), objects.end(), same);
  return found == objects.end() ? nullptr : &*found;
}

ManifestObject describe_object(const ObjectName& name, const ByteVector& file) {
  ManifestObject entry;
  entry.name = name;
  entry.file = object_file_name(name);
  entry.bytes = file.size();
  entry.sha256 = digest_text(digest_of_bytes(file));
  const ObjectFile object = read_object(file, entry.file);
  entry.digest = digest_text(digest_of_sections(object.sections));
  entry.made_from = object.made_from;
  return entry;
}

ByteVector write_manifest(const Manifest& manifest) {
  std::string text = "{\n \"compiler\": " + std::to_string(manifest.compiler) +
                     ",\n \"files\": " + line_of(manifest.files) + ",\n \"objects\": [";
  const char* separator = "\n  ";
  for (const ManifestObject& object : manifest.objects) {
    text += separator + line_of(json_object(object));
    separator = ",\n  ";
  }
  text += "\n ]\n}\n";
  return ByteVector(text.begin(), text.end());
}

Manifest read_manifest(const ByteVector& text, const std::string& file_name) {
  try {
    const Json json = Json::parse(text.begin(), text.end());
    Manifest manifest;
    manifest.compiler = json.at("compiler").get<uint16_t>();
    manifest.files = json.at("files").get<std::map<std::string, std::string>>();
    for (const Json& row : json.at("objects")) manifest.objects.push_back(object_of(row));
    return manifest;
  } catch (const std::exception& error) {
    throw SourceError(file_name, 0, 0, std::string("is no manifest: ") + error.what());
  }
}

}  // namespace lexicor_data
