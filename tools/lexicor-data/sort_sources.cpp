#include "sort_sources.h"

#include <filesystem>
#include <sstream>

#include "files.h"
#include "ucm.h"

namespace lexicor_data {

RuleFile read_rules(const std::string& file) {
  return {file, read_text(file)};
}

const SortRoot& SortSources::root() {
  std::call_once(root_read_, [&] {
    std::istringstream in = open_source(root_file());
    root_.emplace(read_root(in, root_file()));
  });
  return *root_;
}

RuleFile SortSources::find(const std::string& name) const {
  const std::string file = directory_ + '/' + name + kRulesExtension;
  std::error_code error;
  return std::filesystem::exists(file, error) ? read_rules(file) : RuleFile{};
}

SortSource SortSources::build(const RuleFile& rules, SortNotes& notes, std::vector<std::string>* used) {
  if (used != nullptr) used->push_back(root_file());
  const auto find_used = [&](const std::string& name) {
    RuleFile found = find(name);
    if (used != nullptr && !found.file_name.empty()) used->push_back(found.file_name);
    return found;
  };
  return build_sort(root(), rules, find_used, notes);
}

}  // namespace lexicor_data
