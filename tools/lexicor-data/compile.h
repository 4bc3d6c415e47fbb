// From sources to objects and back, one object at a time.
#pragma once

#include <iosfwd>
#include <string>
#include <vector>

#include "codepage_model.h"
#include "object_file.h"
#include "sort_sources.h"
#include "source_model.h"
#include "trie_builder.h"

namespace lexicor_data {

struct CompiledObject {
  ByteVector bytes;               ///< the file
  std::vector<LeftOut> left_out;  ///< a codepage's characters that it does not hold
  size_t retyped_chars = 0;       ///< a codepage's characters that have the type of their row, not their own
  std::vector<std::string> warnings;      ///< what was passed over in the source
  std::vector<std::string> bases;         ///< the files that it was made of beside its source
  TypeRows type_rows = TypeRows::kExact;  ///< how a codepage's type rows are packed
  SortNotes sort_notes;                   ///< what a sort's rules say that it does not hold
};

/// Compiles the source of the object that `control` lists as `name`. `sorts` gives a sort in rules its root; several
/// threads may share it.
CompiledObject compile_object(std::istream& stream, const std::string& file_name, const ObjectName& name,
                              const Control& control, SortSources* sorts = nullptr);

/// The control file.
ByteVector compile_control(const Control& control, const std::string& file_name);

/// Checks an object's structure and writes its canonical source. The name and the names of other objects are
/// taken from `control`, which may be null.
std::string dump_object(const ObjectFile& object, const ObjectName& name, const Control* control,
                        const std::string& file_name);

/// The file of an object in a compiled directory ("cp_00819.nls") and in a source directory
/// ("codepages/Latin1.ucm").
std::string object_file_name(const ObjectName& name);
std::string source_file_name(const ObjectName& name);

/// The path of an object's source: a sort has rules, or a table of weights.
std::string source_path(const std::string& directory, const ObjectName& name);
/// Where a source directory has the sources of sorts.
std::string sort_directory(const std::string& directory);

/// The folders of a source directory that hold sources of objects.
std::vector<std::string> source_folders();

}  // namespace lexicor_data
