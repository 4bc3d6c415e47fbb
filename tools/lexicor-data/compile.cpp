// Compiling and dumping. An object records the checksum of what dump prints for it, so the compiler dumps each
// object that it has packed; that the dump says what was packed is checked on the way.
#include "compile.h"

#include <cstdio>
#include <filesystem>
#include <fstream>
#include <ostream>
#include <set>
#include <sstream>

#include "alias_source.h"
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
  if (source.name != name.name) {
    throw SourceError(file_name, 1, 1, "the code set name is " + source.name + ", not " + name.name);
  }
  if (source.utf8 != (name.id == format::codepage::kUtf8Id)) {
    throw SourceError(file_name, 1, 1,
                      "UTF-8, and only UTF-8, has the identifier " + std::to_string(format::codepage::kUtf8Id));
  }
  for (uint32_t byte = 0; source.utf8 && byte < 256; ++byte) {
    const uint8_t length = byte >= 0xC2 && byte <= 0xDF ? 2 : byte >= 0xE0 && byte <= 0xEF ? 3 : 1;
    if (source.leads[byte] != length)
      throw SourceError(file_name, 1, 1, "the leads of UTF-8 are C2-DF:2 E0-EF:3");
  }
  PackedCodepage packed =
      pack_codepage(to_model(source, file_name, result.left_out), file_name, result.left_out);
  result.retyped_chars = packed.retyped_chars;
  result.type_rows = packed.type_rows;
  check_object(packed.object, name, file_name);
  if (!same_mappings(to_source(packed.model), to_source(unpack_codepage(packed.object, name)))) {
    throw std::logic_error(file_name + ": the packed tables do not say what the source says");
  }
  return std::move(packed.object);
}

/// A sort in rules or in weights, as the file's name says.
SortSource read_sort_source(std::istream& in, const std::string& file_name, SortSources* sorts,
                            CompiledObject& result) {
  if (sorts == nullptr || std::filesystem::path(file_name).extension() != kRulesExtension)
    return read_sort(in, file_name);
  std::ostringstream text;
  text << in.rdbuf();
  return sorts->build({file_name, text.str()}, result.sort_notes);
}

ByteVector to_bytes(const std::string& text) {
  return ByteVector(text.begin(), text.end());
}

std::ifstream open_source(const std::string& path) {
  std::ifstream in(path, std::ios::binary);
  if (!in) throw SourceError(path, 0, 0, "cannot be opened");
  return in;
}

/// A text file as the library reads it, without a byte-order mark and with line feeds as line ends.
ByteVector plain_lines(const std::string& path) {
  std::ifstream in = open_source(path);
  std::string text, line;
  for (int number = 0; next_line(in, &line, &number);) text += line + '\n';
  return to_bytes(text);
}

void describe(std::ostream& out, const LeftOut& left_out) {
  char text[64];
  std::snprintf(text, sizeof text, "  <U%04X> %0*X |%d ", static_cast<unsigned>(left_out.mapping.unicode),
                2 * left_out.mapping.bytes, static_cast<unsigned>(left_out.mapping.code),
                left_out.mapping.precision);
  out << text << left_out.reason << '\n';
}

/// One line that counts by reason.
void count_left_out(std::ostream& log, const std::string& file_name, const std::vector<LeftOut>& left_out) {
  std::map<std::string, size_t> counts;
  for (const LeftOut& entry : left_out) ++counts[entry.reason];
  log << file_name << ": left out:";
  const char* separator = " ";
  for (const auto& [reason, count] : counts) {
    log << separator << count << ' ' << reason;
    separator = ", ";
  }
  log << '\n';
}

/// Removes objects of an earlier compilation that the list no longer has; files of another origin stay.
void remove_unlisted(const std::string& out, const Control& control, std::ostream& log) {
  std::set<std::string> listed{format::kControlFile};
  for (const ObjectName& name : control.objects) listed.insert(object_file_name(name));
  std::vector<std::filesystem::path> unlisted;
  for (const auto& entry : std::filesystem::directory_iterator(out)) {
    if (entry.path().extension() != format::kDataExtension || !entry.is_regular_file()) continue;
    if (listed.count(entry.path().filename().string()) == 0) unlisted.push_back(entry.path());
  }
  for (const std::filesystem::path& path : unlisted) {
    try {
      if (!is_own_origin(read_object(read_file(path.string()), path.string()).origin)) continue;
    } catch (const SourceError&) {
      continue;
    }
    std::filesystem::remove(path);
    log << path.string() << ": removed, it is not listed any more\n";
  }
}

/// The root and the rules of sorts go along: users' rules build on them.
void add_rules(const std::string& source, const Control& control,
               std::vector<std::pair<std::string, ByteVector>>& files) {
  const std::string directory = std::string(kSortDirectory) + '/';
  if (!std::filesystem::exists(source + '/' + directory + kRootFile)) return;
  files.emplace_back(directory + kRootFile, plain_lines(source + '/' + directory + kRootFile));
  for (const ObjectName& name : control.objects) {
    const std::string file = directory + name.name + kRulesExtension;
    if (name.type == ObjectType::kSort && std::filesystem::exists(source + '/' + file))
      files.emplace_back(file, plain_lines(source + '/' + file));
  }
}

}  // namespace

std::string object_file_name(const ObjectName& name) {
  char text[32];
  std::snprintf(text, sizeof text, "%s_%05u%s", format::kTypePrefix[static_cast<size_t>(name.type)],
                static_cast<unsigned>(name.id), format::kDataExtension);
  return text;
}

std::string source_file_name(const ObjectName& name) {
  const SourcePlace& place = kSourcePlaces[static_cast<size_t>(name.type)];
  return std::string(place.directory) + '/' + name.name + place.extension;
}

std::string sort_directory(const std::string& directory) {
  return directory + '/' + kSortDirectory;
}

std::string source_path(const std::string& directory, const ObjectName& name) {
  const std::string path = directory + '/' + source_file_name(name);
  if (name.type != ObjectType::kSort) return path;
  const std::string rules = sort_directory(directory) + '/' + name.name + kRulesExtension;
  const bool has_rules = std::filesystem::exists(rules), has_table = std::filesystem::exists(path);
  if (has_rules && has_table) throw SourceError(path, 0, 0, "the sort has rules as well, in " + rules);
  return has_table ? path : rules;
}

CompiledObject compile_object(std::istream& in, const std::string& file_name, const ObjectName& name,
                              const Control& control, SortSources* sorts) {
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
      object.sections = {pack_sort(read_sort_source(in, file_name, sorts, result), file_name)};
      break;
  }
  object.origin = origin_of(dump_object(object, name, &control, file_name));
  result.bytes = write_object(object);
  return result;
}

ByteVector compile_control(const Control& control, const std::string& file_name) {
  std::ostringstream text;
  write_control(text, control);
  ObjectFile object;
  object.sections = {pack_control(control)};
  if (object.sections[0].size() > format::kMaxSectionBytes) {
    throw SourceError(file_name, 0, 0, "there are more objects than a control file holds");
  }
  object.origin = origin_of(text.str());
  return write_object(object);
}

std::string dump_object(const ObjectFile& object, const ObjectName& name, const Control* control,
                        const std::string& file_name) {
  check_object(object, name, file_name);
  std::ostringstream out;
  switch (name.type) {
    case ObjectType::kLanguage:
      write_language(out, unpack_language(object.sections[0]), control);
      break;
    case ObjectType::kTerritory:
      write_territory(out, unpack_territory(object.sections[0]));
      break;
    case ObjectType::kCodepage:
      write_ucm(out, to_source(unpack_codepage(object, name)));
      break;
    case ObjectType::kSort:
      write_sort(out, unpack_sort(object.sections[0]));
      break;
  }
  return out.str();
}

Control read_source_control(const std::string& directory) {
  const std::string file_name = directory + "/control.txt";
  std::ifstream in = open_source(file_name);
  return read_control(in, file_name);
}

void compile_directory(const std::string& source, const std::string& out, const CompileOptions& options,
                       std::ostream& log) {
  const Control control = read_source_control(source);
  const std::string alias_file = source + '/' + format::kAliasFile;
  {
    std::ifstream aliases = open_source(alias_file);
    check_aliases(aliases, alias_file, control);
  }
  std::vector<std::pair<std::string, ByteVector>> files;
  std::ostringstream report;
  SortSources sorts(sort_directory(source));
  for (const ObjectName& name : control.objects) {
    const std::string file_name = source_path(source, name);
    std::ifstream in = open_source(file_name);
    CompiledObject object = compile_object(in, file_name, name, control, &sorts);
    if (options.verbose) {
      log << object_file_name(name) << ' ' << name.name << ':';
      for (const ByteVector& section : read_object(object.bytes, file_name).sections)
        log << ' ' << section.size();
      log << '\n';
    }
    if (object.retyped_chars != 0) {
      log << file_name << ": " << object.retyped_chars
          << " characters of unassigned type have the type of their row\n";
    }
    if (!object.left_out.empty()) {
      count_left_out(log, file_name, object.left_out);
      count_left_out(report, source_file_name(name), object.left_out);
      for (const LeftOut& entry : object.left_out) {
        describe(report, entry);
        if (options.verbose) describe(log, entry);
      }
    }
    for (const std::string& note : object.sort_notes) {
      report << file_name.substr(source.size() + 1) << ": " << note << '\n';
      if (options.verbose) log << file_name << ": " << note << '\n';
    }
    files.emplace_back(object_file_name(name), std::move(object.bytes));
  }
  files.emplace_back(format::kAliasFile, plain_lines(alias_file));
  add_rules(source, control, files);
  // The control file comes last: until then a reader does not see the new objects.
  files.emplace_back(format::kControlFile, compile_control(control, source + "/control.txt"));

  std::error_code error;
  for (const auto& [name, bytes] : files) {
    std::filesystem::create_directories(std::filesystem::path(out + '/' + name).parent_path(), error);
    write_file(out + '/' + name, bytes);
  }
  remove_unlisted(out, control, log);
  if (!options.report_file.empty()) write_file(options.report_file, to_bytes(report.str()));
}

}  // namespace lexicor_data
