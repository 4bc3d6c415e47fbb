// Compiling and dumping of one object. That the packed tables of a codepage say what its source says is checked on the
// way.
#include "compile.h"

#include <cstdio>
#include <filesystem>
#include <iterator>
#include <ostream>
#include <sstream>

#include "codepage_pack.h"
#include "codepage_unpack.h"
#include "control_source.h"
#include "core/lxformat.h"
#include "language_toml.h"
#include "line_text.h"
#include "object_check.h"
#include "sort_pack.h"
#include "sort_sources.h"
#include "sort_text.h"
#include "territory_toml.h"

namespace lexicor_data {
namespace {

namespace format = lx::format;

struct SourcePlace {
  const char* directory;
  const char* extension;
};
constexpr SourcePlace kSourcePlaces[format::kTypes] = {{"languages", ".toml"},
                                                       {"territories", ".toml"},
                                                       {"codepages", ".ucm"},
                                                       {kSortDirectory, ".txt"}};  // or .rules

bool same_mappings(const CodepageSource& a, const CodepageSource& b) {
  if (a.mappings.size() != b.mappings.size()) return false;
  for (size_t i = 0; i < a.mappings.size(); ++i) {
    const Mapping &x = a.mappings[i], &y = b.mappings[i];
    if (x.unicode != y.unicode || x.code != y.code || x.precision != y.precision) return false;
  }
  return true;
}

ObjectFile pack_source(const CodepageSource& source, const ObjectName& name, const std::string& file_name,
                       CompiledObject& result) {
  result.warnings = source.warnings;
  result.bases = source.bases;
  if (source.name != name.name)
    result.warnings.push_back(file_name + ": the code set name is " + source.name + ", the object's " +
                              name.name);
  if (source.utf8 != (name.id == format::codepage::kUtf8Id)) {
    throw SourceError(file_name, 1, 1,
                      "UTF-8, and only UTF-8, has the identifier " + std::to_string(format::codepage::kUtf8Id));
  }
  for (uint32_t byte = 0; source.utf8 && byte < 256; ++byte) {
    const uint8_t length = byte >= 0xC2 && byte <= 0xDF ? 2 : byte >= 0xE0 && byte <= 0xEF ? 3 : 1;
    if (source.leads[byte] != length)
      throw SourceError(file_name, 1, 1, "the leads of UTF-8 are C2-DF:2 E0-EF:3");
  }
  CodepageModel model = to_model(source, file_name, result.left_out);
  if (model.value_of(0) != 0)
    throw SourceError(file_name, 0, 0, "<U0000> \\x00 |0 is missing: a text ends with the byte 00");
  PackedCodepage packed = pack_codepage(std::move(model), file_name, result.left_out);
  result.retyped_chars = packed.retyped_chars;
  result.type_rows = packed.type_rows;
  packed.object.made_from = source.source;
  check_object(packed.object, name, file_name);
  if (!same_mappings(to_source(packed.model), to_source(unpack_codepage(packed.object, name)))) {
    throw std::logic_error(file_name + ": the packed tables do not say what the source says");
  }
  return std::move(packed.object);
}

void write_codepage(std::ostream& out, const ObjectFile& object, const ObjectName& name) {
  CodepageSource source = to_source(unpack_codepage(object, name));
  source.source = object.made_from;
  write_ucm(out, source);
}

/// A sort in rules or in weights, as the file's name says.
SortSource read_sort_source(const std::string& text, const std::string& file_name, SortSources* sorts,
                            CompiledObject& result) {
  if (sorts != nullptr && std::filesystem::path(file_name).extension() == kRulesExtension)
    return sorts->build({file_name, text}, result.sort_notes, &result.bases);
  std::istringstream in(text);
  return read_sort(in, file_name);
}

/// The first line of a text source, when it is a comment: it says where the facts come from.
std::string first_comment(const std::string& text) {
  std::istringstream in(text);
  std::string line;
  int number = 0;
  if (!next_line(in, &line, &number) || line.empty() || line[0] != '#') return "";
  const size_t begin = line.find_first_not_of("# \t");
  return begin == std::string::npos ? "" : line.substr(begin, line.find_last_not_of(" \t") + 1 - begin);
}

}  // namespace

std::string object_file_name(const ObjectName& name) {
  char text[32];
  std::snprintf(text, sizeof text, "%s_%05u%s", format::kTypePrefix[static_cast<size_t>(name.type)],
                static_cast<unsigned>(name.id), format::kDataExtension);
  return text;
}

std::vector<std::string> source_folders() {
  std::vector<std::string> folders;
  for (const SourcePlace& place : kSourcePlaces) folders.push_back(place.directory);
  return folders;
}

std::string source_path(const std::string& directory, const ObjectName& name) {
  const std::string path = directory + '/' + source_file_name(name);
  if (name.type != ObjectType::kSort) return path;
  const std::string rules = sort_directory(directory) + '/' + name.name + kRulesExtension;
  const bool has_rules = std::filesystem::exists(rules), has_table = std::filesystem::exists(path);
  if (has_rules && has_table) throw SourceError(path, 0, 0, "the sort has rules as well, in " + rules);
  return has_table ? path : rules;
}

std::string source_file_name(const ObjectName& name) {
  const SourcePlace& place = kSourcePlaces[static_cast<size_t>(name.type)];
  return std::string(place.directory) + '/' + name.name + place.extension;
}

std::string sort_directory(const std::string& directory) {
  return directory + '/' + kSortDirectory;
}

CompiledObject compile_object(std::istream& stream, const std::string& file_name, const ObjectName& name,
                              const Control& control, SortSources* sorts) {
  const std::string text{std::istreambuf_iterator<char>(stream), std::istreambuf_iterator<char>()};
  std::istringstream in(text);
  CompiledObject result;
  ObjectFile object;
  switch (name.type) {
    case ObjectType::kLanguage:
      object.sections = {pack_language(read_language(in, file_name, control), file_name)};
      break;
    case ObjectType::kTerritory:
      object.sections = {pack_territory(read_territory(in, file_name), file_name)};
      break;
    case ObjectType::kCodepage:
      object = pack_source(read_ucm(in, file_name), name, file_name, result);
      break;
    case ObjectType::kSort:
      object.sections = {pack_sort(read_sort_source(text, file_name, sorts, result), file_name)};
      break;
  }
  if (name.type != ObjectType::kCodepage) {
    object.made_from = first_comment(text);
    check_object(object, name, file_name);
  }
  result.bytes = write_object(object);
  return result;
}

ByteVector compile_control(const Control& control, const std::string& file_name) {
  ObjectFile object;
  object.sections = {pack_control(control)};
  if (object.sections[0].size() > format::kMaxSectionBytes)
    throw SourceError(file_name, 0, 0, "there are more objects than a control file holds");
  return write_object(object);
}

std::string dump_object(const ObjectFile& object, const ObjectName& name, const Control* control,
                        const std::string& file_name) {
  check_object(object, name, file_name);
  std::ostringstream out;
  if (name.type != ObjectType::kCodepage && !object.made_from.empty()) out << "# " << object.made_from << '\n';
  switch (name.type) {
    case ObjectType::kLanguage:
      write_language(out, unpack_language(object.sections[0]), control);
      break;
    case ObjectType::kTerritory:
      write_territory(out, unpack_territory(object.sections[0]));
      break;
    case ObjectType::kCodepage:
      write_codepage(out, object, name);
      break;
    case ObjectType::kSort:
      write_sort(out, unpack_sort(object.sections[0]));
      break;
  }
  return out.str();
}

}  // namespace lexicor_data
