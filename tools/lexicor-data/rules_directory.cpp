// The directory is the user's alone. It holds links to the base's objects, the sort, and a control file that lists it.
#include "rules_directory.h"

#include <stdlib.h>

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <set>

#include "control_source.h"
#include "core/lxformat.h"
#include "files.h"
#include "object_file.h"
#include "sort_pack.h"
#include "sort_sources.h"
#include "ucm.h"

namespace lexicor_data {
namespace {

namespace fs = std::filesystem;
namespace format = lx::format;

constexpr char kSortName[] = "Rules";

/// Lists a further sort, under a name and an identifier that are free.
ObjectName add_sort(Control& control) {
  std::set<uint16_t> ids;
  std::set<std::string> names;
  for (const ObjectName& object : control.objects) {
    if (object.type != ObjectType::kSort) continue;
    ids.insert(object.id);
    names.insert(object.name);
  }
  ObjectName sort;
  sort.type = ObjectType::kSort;
  sort.name = kSortName;
  for (int number = 2; names.count(sort.name) != 0; ++number) sort.name = kSortName + std::to_string(number);
  for (sort.id = UINT16_MAX; ids.count(sort.id) != 0;) --sort.id;
  control.objects.push_back(sort);
  return sort;
}

void write_section(const std::string& file, ByteVector section) {
  ObjectFile object;
  object.sections = {std::move(section)};
  write_file(file, write_object(object));
}

}  // namespace

RulesDirectory::RulesDirectory(const std::string& base, const std::string& rules_file) {
  SortSources sources(base + '/' + kSortDirectory);
  SortNotes notes;
  const ByteVector payload = pack_sort(sources.build(read_rules(rules_file), notes), rules_file);
  const std::string control_file = base + '/' + format::kControlFile;
  Control control =
      unpack_control(read_object(read_file(control_file), control_file).sections[0], control_file);
  sort_id_ = add_sort(control).id;

  std::string path = (fs::temp_directory_path() / "lexicor-XXXXXX").string();
  if (mkdtemp(path.data()) == nullptr) throw SourceError(path, 0, 0, std::strerror(errno));
  path_ = path;
  try {
    for (const auto& entry : fs::directory_iterator(base)) {
      const fs::path file = entry.path().filename();
      if (file != format::kControlFile) fs::create_symlink(fs::absolute(entry.path()), fs::path(path_) / file);
    }
    char object[32];
    std::snprintf(object, sizeof object, "/%s_%05u%s",
                  format::kTypePrefix[static_cast<size_t>(ObjectType::kSort)], static_cast<unsigned>(sort_id_),
                  format::kDataExtension);
    write_section(path_ + object, payload);
    write_section(path_ + '/' + format::kControlFile, pack_control(control));
  } catch (...) {
    remove();
    throw;
  }
}

RulesDirectory::~RulesDirectory() {
  remove();
}

void RulesDirectory::remove() {
  std::error_code error;
  fs::remove_all(path_, error);
}

}  // namespace lexicor_data
