// Checks of whole directories. A fault in one file does not hide those of the others.
#include "check.h"

#include <filesystem>
#include <functional>
#include <mutex>
#include <ostream>
#include <set>

#include "alias_source.h"
#include "codepage_unpack.h"
#include "compile_directory.h"
#include "control_source.h"
#include "core/lxbytes.h"
#include "core/lxformat.h"
#include "files.h"
#include "lexicor/hex.h"
#include "line_text.h"
#include "manifest.h"
#include "object_check.h"
#include "parallel.h"
#include "sense.h"
#include "sort_check.h"
#include "sort_pack.h"

namespace lexicor_data {
namespace {

namespace format = lx::format;

/// What each Unicode value becomes is a whole character of the codepage, as its length table sees it.
void check_codes(const CodepageModel& model, const std::string& file_name) {
  for (uint32_t unicode = 0; unicode < 0x10000; ++unicode) {
    const uint32_t code = model.from_unicode[unicode];
    if (code == kNoCode) continue;
    const uint8_t bytes = code_bytes(code);
    const uint8_t first = static_cast<uint8_t>(code >> 8 * (bytes - 1));
    const uint8_t length = model.is_shift() && bytes > 1 ? model.header.width : model.header.leads[first];
    if (bytes == length) continue;
    char text[64];
    std::snprintf(text, sizeof text, "U+%04X becomes %X, which is no whole character",
                  static_cast<unsigned>(unicode), static_cast<unsigned>(code));
    throw SourceError(file_name, 0, 0, text);
  }
}

void check_defaults(const ByteVector& payload, const Control& control, const std::string& file_name) {
  const struct {
    size_t word;
    ObjectType type;
  } defaults[] = {{format::language::kDefaultTerritory, ObjectType::kTerritory},
                  {format::language::kDefaultCodepage, ObjectType::kCodepage},
                  {format::language::kDefaultSort, ObjectType::kSort}};
  for (const auto& entry : defaults) {
    const uint16_t id = lx::le16(&payload[2 * entry.word]);
    if (entry.type == ObjectType::kSort && id == 0) continue;
    if (control.find(entry.type, id) == nullptr) {
      throw SourceError(file_name, 0, 0,
                        std::string("the default ") + kTypeNames[static_cast<size_t>(entry.type)] + " " +
                            std::to_string(id) + " is not in the control file");
    }
  }
}

/// The header of an object of this compiler records the digest of its sections.
void check_digest(const ObjectFile& object, const std::string& path) {
  if (object.compiler != 0 && object.digest != digest_of_sections(object.sections))
    throw SourceError(path, 0, 0, "the digest in the header is not that of the content");
}

void check_file(const std::string& path, const ObjectName& name, const Control& control) {
  const ObjectFile object = read_object(read_file(path), path);
  dump_object(object, name, &control, path);
  if (name.type == ObjectType::kSort) check_sort(unpack_sort(object.sections[0]), path);
  if (name.type == ObjectType::kLanguage) check_defaults(object.sections[0], control, path);
  if (name.type == ObjectType::kCodepage) check_codes(unpack_codepage(object, name), path);
  check_digest(object, path);
}

/// Whether every file is the one that the manifest describes. What is wrong already needs no second word.
void check_manifest(const std::string& directory, const Control& control, SourceErrors& errors) {
  const std::string path = directory + '/' + kManifestFile;
  const Manifest manifest = read_manifest(read_file(path), path);
  std::set<std::string> bad;
  for (const SourceError& error : errors.list()) bad.insert(error.file);
  const auto compare = [&](const std::string& file, const std::string& sha256) {
    const std::string full = directory + '/' + file;
    if (bad.count(full) != 0) return;
    errors.attempt([&] {
      if (digest_text(digest_of_bytes(read_file(full))) != sha256)
        throw SourceError(full, 0, 0, std::string("is not the file that ") + kManifestFile + " describes");
    });
  };
  for (const auto& [file, sha256] : manifest.files) compare(file, sha256);
  for (const ObjectName& name : control.objects) {
    const ManifestObject* entry = manifest.find(name);
    if (entry != nullptr)
      compare(object_file_name(name), entry->sha256);
    else
      errors.add(SourceError(path, 0, 0, "does not list " + object_file_name(name)));
  }
  for (const ManifestObject& object : manifest.objects)
    if (control.find(object.name.type, object.name.id) == nullptr)
      errors.add(SourceError(path, 0, 0, object.file + " is not in the control file"));
}

/// Runs a check of every object; its errors come in the order of the objects.
void check_all(const Control& control, SourceErrors& errors,
               const std::function<void(const ObjectName&)>& check) {
  std::vector<SourceErrors> found(control.objects.size());
  const ValidatorInUse validator;
  for_each_parallel(found.size(), [&](size_t i) { found[i].attempt([&] { check(control.objects[i]); }); });
  for (const SourceErrors& of_object : found) errors.add_all(of_object);
}

}  // namespace

SourceErrors check_compiled_directory(const std::string& directory) {
  SourceErrors errors;
  const std::string control_file = directory + '/' + format::kControlFile;
  Control control;
  bool is_own = false;
  const bool has_control = errors.attempt([&] {
    const ObjectFile object = read_object(read_file(control_file), control_file);
    control = unpack_control(object.sections[0], control_file);
    is_own = object.compiler != 0;
    check_digest(object, control_file);
  });
  if (!has_control) return errors;

  check_all(control, errors, [&](const ObjectName& name) {
    check_file(directory + '/' + object_file_name(name), name, control);
  });
  const std::string alias_file = directory + '/' + format::kAliasFile;
  errors.attempt([&] {
    std::istringstream in = open_source(alias_file);
    if (in.peek() == static_cast<unsigned char>(kByteOrderMark[0]))
      throw SourceError(alias_file, 1, 1, "begins with a byte-order mark, which the library takes for a name");
    read_aliases(in, alias_file, control);
  });
  // Objects that nobody lists are left from an earlier directory.
  for (const auto& entry : std::filesystem::directory_iterator(directory)) {
    const std::string file = entry.path().filename().string();
    if (entry.path().extension() != format::kDataExtension || file == format::kControlFile) continue;
    bool listed = false;
    for (const ObjectName& name : control.objects) listed = listed || object_file_name(name) == file;
    if (!listed) errors.add(SourceError(entry.path().string(), 0, 0, "is not in the control file"));
  }
  const bool has_manifest = std::filesystem::exists(directory + '/' + kManifestFile);
  if (is_own || has_manifest) errors.attempt([&] { check_manifest(directory, control, errors); });
  return errors;
}

SourceErrors check_source_directory(const std::string& directory, std::ostream& log) {
  SourceErrors errors;
  Control control;
  if (!errors.attempt([&] { control = read_source_control(directory); })) return errors;
  SortSources sorts(sort_directory(directory));
  std::set<std::string> used;
  std::mutex used_lock;
  check_all(control, errors, [&](const ObjectName& name) {
    const std::string path = source_path(directory, name);
    std::istringstream in = open_source(path);
    const CompiledObject object = compile_object(in, path, name, control, &sorts);
    {
      const std::lock_guard<std::mutex> guard(used_lock);
      used.insert(path);
      used.insert(object.bases.begin(), object.bases.end());
    }
    in = open_source(path);
    if (name.type == ObjectType::kLanguage) check_language_sense(in, path);
    if (name.type == ObjectType::kTerritory) check_territory_sense(in, path);
  });
  const std::string alias_file = directory + '/' + format::kAliasFile;
  errors.attempt([&] {
    std::istringstream in = open_source(alias_file);
    read_aliases(in, alias_file, control);
  });
  if (!errors.empty()) return errors;
  say_unused(directory, log, [&](const std::string& file) { return used.count(directory + '/' + file) != 0; });
  return errors;
}

}  // namespace lexicor_data
