// The sources of sorts in a directory: the root, read once, and files of rules.
#pragma once

#include <mutex>
#include <optional>
#include <string>
#include <vector>

#include "sort_builder.h"

namespace lexicor_data {

/// In a source directory, and in a compiled one, where programs find what rules of their users need.
inline constexpr char kSortDirectory[] = "sorts";
inline constexpr char kRootFile[] = "root.txt";
inline constexpr char kRulesExtension[] = ".rules";

/// Reads a file of rules. Throws SourceError with the system's reason.
RuleFile read_rules(const std::string& file);

/// Several threads may use it.
class SortSources {
 public:
  /// `directory` holds root.txt and what [import] names.
  explicit SortSources(std::string directory) : directory_(std::move(directory)) {}

  const SortRoot& root();
  /// The rules of a name; without a file name when there are none. Throws SourceError.
  RuleFile find(const std::string& name) const;
  /// Builds the sort that rules make. `used` receives the files that it is made of beside its own. Throws SourceError.
  SortSource build(const RuleFile& rules, SortNotes& notes, std::vector<std::string>* used = nullptr);

 private:
  std::string root_file() const { return directory_ + '/' + kRootFile; }

  std::string directory_;
  std::once_flag root_read_;
  std::optional<SortRoot> root_;
};

}  // namespace lexicor_data
