// What locales need is found by their names in the control file; the objects are copied as they are.
#include "subset.h"

#include <algorithm>
#include <filesystem>
#include <iomanip>
#include <iterator>
#include <ostream>

#include "alias_source.h"
#include "compile_directory.h"
#include "control_source.h"
#include "core/lxbytes.h"
#include "core/lxformat.h"
#include "files.h"
#include "lexicor/near_names.h"
#include "lexicor/report.h"
#include "line_text.h"

namespace lexicor_data {
namespace {

namespace fs = std::filesystem;
namespace format = lx::format;

constexpr ObjectType kTypes[] = {ObjectType::kLanguage, ObjectType::kTerritory, ObjectType::kCodepage,
                                 ObjectType::kSort};

/// The parts of a locale's name by type: "Swedish_Sweden.UTF-8@Default"; empty ones are not named.
std::vector<std::string> parts_of(const std::string& locale) {
  std::vector<std::string> parts;
  size_t begin = 0;
  for (const char* mark : {"_.@", ".@", "@", ""}) {
    const char* const own[] = {"", "_", ".", "@"};
    const std::string introduced = own[parts.size()];
    const bool is_there = introduced.empty() || (begin < locale.size() && locale[begin] == introduced[0]);
    if (!is_there) {
      parts.emplace_back();
      continue;
    }
    begin += introduced.size();
    const size_t end = std::min(*mark == 0 ? locale.size() : locale.find_first_of(mark, begin), locale.size());
    parts.push_back(locale.substr(begin, end - begin));
    begin = end;
  }
  return parts;
}

class Subset {
 public:
  explicit Subset(const std::string& directory) : directory_(directory) {
    const std::string control_file = in_directory(format::kControlFile);
    control_ = unpack_control(read_object(read_file(control_file), control_file).sections[0], control_file);
    if (fs::exists(in_directory(kManifestFile)))
      manifest_ = read_manifest(read_file(in_directory(kManifestFile)), in_directory(kManifestFile));
    std::istringstream in(alias_text());
    aliases_ = read_aliases(in, in_directory(format::kAliasFile), control_);
    const ObjectName* common = control_.find(ObjectType::kCodepage, format::codepage::kCommonId);
    if (common != nullptr) keep(*common);
  }

  void add_locale(const std::string& name) {
    const std::vector<std::string> parts = parts_of(name);
    const ObjectName& language = find(ObjectType::kLanguage, parts[0].empty() ? "English" : parts[0]);
    keep(language);
    const std::string file = in_directory(object_file_name(language));
    const ObjectFile object = read_object(read_file(file), file);
    for (const ObjectType type : kTypes) {
      if (type == ObjectType::kLanguage) continue;
      keep_default(object.sections[0], type, file);
      const std::string& part = parts[static_cast<size_t>(type)];
      if (!part.empty() && !is_binary(type, part)) keep(find(type, part));
    }
  }

  void add_codepage(const std::string& name) { keep(find(ObjectType::kCodepage, name)); }

  void write(const std::string& out, bool json, std::ostream& table, std::ostream& log) {
    std::sort(kept_.objects.begin(), kept_.objects.end(), [](const ObjectName& a, const ObjectName& b) {
      return a.type != b.type ? a.type < b.type : a.id < b.id;
    });
    Manifest manifest;
    manifest.compiler = manifest_.compiler;
    std::vector<std::pair<std::string, ByteVector>> files;
    for (const ObjectName& name : kept_.objects) {
      files.emplace_back(object_file_name(name), read_file(in_directory(object_file_name(name))));
      const ManifestObject* entry = manifest_.find(name);
      manifest.objects.push_back(entry != nullptr ? *entry : describe_object(name, files.back().second));
    }
    files.emplace_back(format::kAliasFile, cut_aliases());
    write_directory(out, files, manifest, compile_control(kept_, in_directory(format::kControlFile)));
    remove_unlisted(out, kept_, log);
    if (json)
      write_json(table, manifest);
    else
      write_table(table, manifest);
  }

 private:
  std::string in_directory(const std::string& file) const { return directory_ + '/' + file; }

  static bool is_binary(ObjectType type, const std::string& name) {
    return type == ObjectType::kSort && lexicor_cli::edit_distance(name, "Binary") == 0;
  }

  const ObjectName& find(ObjectType type, const std::string& name) const {
    const ObjectName* object = control_.find(type, name);
    if (object == nullptr && type == ObjectType::kCodepage) {
      const auto alias = aliases_.find(alias_key(name));
      if (alias != aliases_.end()) object = control_.find(type, alias->second);
    }
    if (object != nullptr) return *object;
    std::vector<std::string> names;
    for (const ObjectName& other : control_.objects)
      if (other.type == type) names.push_back(other.name);
    throw SourceError(in_directory(format::kControlFile), 0, 0,
                      std::string("no ") + kTypeNames[static_cast<size_t>(type)] + " has the name " + name +
                          lexicor_cli::did_you_mean(lexicor_cli::nearest_name(name, names)));
  }

  void keep_default(const ByteVector& payload, ObjectType type, const std::string& file) {
    constexpr size_t kWords[] = {0, format::language::kDefaultTerritory, format::language::kDefaultCodepage,
                                 format::language::kDefaultSort};
    const size_t word = kWords[static_cast<size_t>(type)];
    if (payload.size() < format::language::kHeaderBytes) throw SourceError(file, 0, 0, "is no language");
    const uint16_t id = lx::le16(&payload[2 * word]);
    if (type == ObjectType::kSort && id == 0) return;
    const ObjectName* object = control_.find(type, id);
    if (object != nullptr) keep(*object);
  }

  void keep(const ObjectName& object) {
    if (kept_.find(object.type, object.id) == nullptr) kept_.objects.push_back(object);
  }

  /// Empty where the directory has none.
  std::string alias_text() const {
    const std::string file = in_directory(format::kAliasFile);
    return fs::exists(file) ? read_text(file) : "";
  }

  /// The lines of codepages that are kept, and comments.
  ByteVector cut_aliases() const {
    std::istringstream in(alias_text());
    std::string line, text;
    bool is_kept = false;
    for (int number = 0; next_line(in, &line, &number);) {
      const bool is_comment = !line.empty() && line[0] == '#';
      if (!is_comment && !line.empty() && line[0] != ' ')
        is_kept = kept_.find(ObjectType::kCodepage, line.substr(0, line.find_first_of(" \t"))) != nullptr;
      if (is_comment || is_kept) text += line + '\n';
    }
    return ByteVector(text.begin(), text.end());
  }

  void write_table(std::ostream& out, const Manifest& manifest) const {
    constexpr int kBytesChars = 9, kTypeChars = 9;
    size_t total = 0;
    for (const ManifestObject& object : manifest.objects) {
      out << std::setw(kBytesChars) << object.bytes << "  " << std::left << std::setw(kTypeChars)
          << kTypeNames[static_cast<size_t>(object.name.type)] << std::right << "  " << object.file << "  "
          << object.name.name << '\n';
      total += object.bytes;
    }
    out << std::setw(kBytesChars) << total << "  in " << manifest.objects.size() << " of "
        << control_.objects.size() << " objects, which have " << all_bytes() << '\n';
  }

  void write_json(std::ostream& out, const Manifest& manifest) const {
    lexicor_cli::Json objects = lexicor_cli::Json::array();
    for (const ManifestObject& object : manifest.objects)
      objects.push_back({{"type", kTypeNames[static_cast<size_t>(object.name.type)]},
                         {"name", object.name.name},
                         {"file", object.file},
                         {"bytes", object.bytes}});
    out << lexicor_cli::json_text(
        {{"objects", objects}, {"of", {{"objects", control_.objects.size()}, {"bytes", all_bytes()}}}});
  }

  /// Of the directory that is cut.
  uintmax_t all_bytes() const {
    uintmax_t all = 0;
    for (const ObjectName& name : control_.objects) all += fs::file_size(in_directory(object_file_name(name)));
    return all;
  }

  const std::string directory_;
  Control control_, kept_;
  Manifest manifest_;
  Aliases aliases_;
};

}  // namespace

void make_subset(const std::string& directory, const std::string& out, const SubsetRequest& request,
                 std::ostream& table, std::ostream& log) {
  std::error_code error;
  if (fs::equivalent(directory, out, error))
    throw SourceError(out, 0, 0, "the subset cannot take the place of the directory it is made from");
  Subset subset(directory);
  SourceErrors errors;
  for (const std::string& name : request.locales) errors.attempt([&] { subset.add_locale(name); });
  for (const std::string& name : request.codepages) errors.attempt([&] { subset.add_codepage(name); });
  errors.throw_if_any();
  subset.write(out, request.json, table, log);
}

}  // namespace lexicor_data
