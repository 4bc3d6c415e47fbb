// Checks of whole directories. A fault in one file does not hide those of the others.
#include "check.h"

#include <cstdio>
#include <filesystem>
#include <fstream>
#include <functional>

#include "alias_source.h"
#include "codepage_unpack.h"
#include "compile.h"
#include "control_source.h"
#include "core/lxbytes.h"
#include "core/lxformat.h"
#include "line_text.h"
#include "sense.h"
#include "sort_check.h"
#include "sort_pack.h"

namespace lexicor_data {
namespace {

namespace format = lx::format;

/// Collects the messages of what a step throws.
class Faults {
 public:
  bool attempt(const std::function<void()>& step) {
    try {
      step();
      return true;
    } catch (const SourceError& error) {
      messages.emplace_back(error.what());
      return false;
    }
  }
  std::vector<std::string> messages;
};

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

void check_file(const std::string& path, const ObjectName& name, const Control& control) {
  const ObjectFile object = read_object(read_file(path), path);
  const std::string dumped = dump_object(object, name, &control, path);
  if (name.type == ObjectType::kSort) check_sort(unpack_sort(object.sections[0]), path);
  if (name.type == ObjectType::kLanguage) check_defaults(object.sections[0], control, path);
  if (name.type == ObjectType::kCodepage) check_codes(unpack_codepage(object, name), path);
  if (is_own_origin(object.origin) && object.origin != origin_of(dumped)) {
    throw SourceError(path, 0, 0, "the checksum in the header is not that of the content");
  }
}

std::ifstream open(const std::string& path) {
  std::ifstream in(path, std::ios::binary);
  if (!in) throw SourceError(path, 0, 0, "cannot be opened");
  return in;
}

}  // namespace

std::vector<std::string> check_compiled_directory(const std::string& directory) {
  Faults faults;
  const std::string control_file = directory + '/' + format::kControlFile;
  Control control;
  const bool has_control = faults.attempt([&] {
    const ObjectFile object = read_object(read_file(control_file), control_file);
    control = unpack_control(object.sections[0], control_file);
    if (compile_control(control, control_file) != read_file(control_file) && is_own_origin(object.origin)) {
      throw SourceError(control_file, 0, 0, "the checksum in the header is not that of the content");
    }
  });
  if (!has_control) return faults.messages;

  for (const ObjectName& name : control.objects) {
    faults.attempt([&] { check_file(directory + '/' + object_file_name(name), name, control); });
  }
  const std::string alias_file = directory + '/' + format::kAliasFile;
  faults.attempt([&] {
    std::ifstream in = open(alias_file);
    if (in.peek() == static_cast<unsigned char>(kByteOrderMark[0]))
      throw SourceError(alias_file, 1, 1, "begins with a byte-order mark, which the library takes for a name");
    check_aliases(in, alias_file, control);
  });
  // Objects that nobody lists are left from an earlier directory.
  faults.attempt([&] {
    for (const auto& entry : std::filesystem::directory_iterator(directory)) {
      const std::string file = entry.path().filename().string();
      if (entry.path().extension() != format::kDataExtension || file == format::kControlFile) continue;
      bool listed = false;
      for (const ObjectName& name : control.objects) listed = listed || object_file_name(name) == file;
      if (!listed) throw SourceError(entry.path().string(), 0, 0, "is not in the control file");
    }
  });
  return faults.messages;
}

std::vector<std::string> check_source_directory(const std::string& directory) {
  Faults faults;
  Control control;
  if (!faults.attempt([&] { control = read_source_control(directory); })) return faults.messages;
  SortSources sorts(sort_directory(directory));
  for (const ObjectName& name : control.objects) {
    faults.attempt([&] {
      const std::string path = source_path(directory, name);
      std::ifstream in = open(path);
      compile_object(in, path, name, control, &sorts);
      in = open(path);
      if (name.type == ObjectType::kLanguage) check_language_sense(in, path);
      if (name.type == ObjectType::kTerritory) check_territory_sense(in, path);
    });
  }
  const std::string alias_file = directory + '/' + format::kAliasFile;
  faults.attempt([&] {
    std::ifstream in = open(alias_file);
    check_aliases(in, alias_file, control);
  });
  return faults.messages;
}

}  // namespace lexicor_data
