// What the targets of a directory's files share: a small directory of which the input is one file, and everything that
// reads a locale made of it.
#pragma once

#include <string>

#include "fuzz.h"
#include "support/object_files.h"

namespace lx::fuzz {

/// The library on a directory with English, UnitedStates, US-ASCII, a codepage "Fuzz" (cp_00819.nls), a sort "Default"
/// (so_00001.nls), and "UTF-8" (cp_57352.nls), which is bad; one file holds what is left of the input.
class FileLibrary {
 public:
  FileLibrary(const std::string& file, const Input& content, const std::string& codepage = "Fuzz");
  ~FileLibrary();
  FileLibrary(const FileLibrary&) = delete;
  FileLibrary& operator=(const FileLibrary&) = delete;

  /// English with the codepage and the sort, or what there is; null where there is nothing.
  LXLocale* locale() const { return locale_; }
  /// The path of a file in the directory.
  std::string path(const std::string& file) const { return directory_.file(file); }
  const std::string& directory() const { return directory_.path(); }

 private:
  const ScratchDirectory& directory_;
  LXLocale* locale_ = nullptr;
};

/// Every item in every form, and numbers, amounts and times by them.
void use_items(LXLocale* locale);

}  // namespace lx::fuzz
