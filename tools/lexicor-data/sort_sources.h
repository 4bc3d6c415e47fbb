// The sources of sorts in a directory: the root, read once, and files of rules.
#pragma once

#include <optional>
#include <string>

#include "sort_builder.h"

namespace lexicor_data {

/// In a source directory, and in a compiled one, where programs find what rules of their users need.
inline constexpr char kSortDirectory[] = "sorts";
inline constexpr char kRootFile[] = "root.txt";
inline constexpr char kRulesExtension[] = ".rules";

class SortSources {
 public:
  /// `directory` holds root.txt and what [import] names.
  explicit SortSources(std::string directory) : directory_(std::move(directory)) {}

  const SortRoot& root();
  /// The rules of a name; without a file name when there are none.
  RuleFile find(const std::string& name) const;
  /// Builds the sort that rules make. Throws SourceError.
  SortSource build(const RuleFile& rules, SortNotes& notes);

 private:
  std::string directory_;
  std::optional<SortRoot> root_;
};

}  // namespace lexicor_data
