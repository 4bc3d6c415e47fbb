#include "sort_sources.h"

#include <filesystem>
#include <fstream>
#include <sstream>

#include "ucm.h"

namespace lexicor_data {

const SortRoot& SortSources::root() {
  if (!root_) {
    const std::string file = directory_ + '/' + kRootFile;
    std::ifstream in(file, std::ios::binary);
    if (!in) throw SourceError(file, 0, 0, "cannot be opened");
    root_.emplace(read_root(in, file));
  }
  return *root_;
}

RuleFile SortSources::find(const std::string& name) const {
  const std::string file = directory_ + '/' + name + kRulesExtension;
  std::ifstream in(file, std::ios::binary);
  std::ostringstream text;
  if (!in || !(text << in.rdbuf() || in.peek() == EOF)) return {};
  return {file, text.str()};
}

SortSource SortSources::build(const RuleFile& rules, SortNotes& notes) {
  return build_sort(
      root(), rules, [this](const std::string& name) { return find(name); }, notes);
}

}  // namespace lexicor_data
