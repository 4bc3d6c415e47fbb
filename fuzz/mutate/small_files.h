// A small file of every kind, and the directory that they stand in.
#pragma once

#include <string>
#include <vector>

#include "support/object_files.h"

namespace mutate {

using lx::test::ByteString;

/// What of a file a run looks at most.
enum class Use { kLocale, kCodepage, kSort, kCatalog };

struct SmallFile {
  std::string kind;  // as a report names it
  std::string name;  // in the directory
  ByteString bytes;
  std::string codepage;  // of the locale that uses it; empty: one after another
  Use use;
  bool big_endian = false;
  size_t step = 1;  // only every so many of its mutants are tried
};

/// The names of the locale's parts beside the codepage.
inline constexpr char kLanguageAndTerritory[] = "Special_Elsewhere";
inline constexpr char kSort[] = "Inserting";

/// The files that are changed, and the directory with all that they need.
class SmallFiles {
 public:
  SmallFiles();
  const std::vector<SmallFile>& all() const { return files_; }
  const std::vector<std::string>& codepages() const { return codepages_; }
  void write(const lx::test::ScratchDirectory& directory) const;

 private:
  std::vector<SmallFile> files_;
  std::vector<SmallFile> others_;  // not changed
  std::vector<std::string> codepages_;
};

}  // namespace mutate
