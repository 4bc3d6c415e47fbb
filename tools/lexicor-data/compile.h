// From sources to objects and back: one object at a time, and a whole directory.
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
  TypeRows type_rows = TypeRows::kExact;  ///< how a codepage's type rows are packed
  SortNotes sort_notes;                   ///< what a sort's rules say that it does not hold
};

/// Compiles the source of the object that `control` lists as `name`. `sorts` gives a sort in rules its root.
CompiledObject compile_object(std::istream& in, const std::string& file_name, const ObjectName& name,
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

struct CompileOptions {
  bool verbose = false;     ///< list what is left out, and the sizes of sections
  std::string report_file;  ///< where to list what is left out; empty: nowhere
};

/// Compiles a source directory. Nothing is written before everything is compiled; objects of an earlier run
/// that are not listed any more are removed. Notes go to `log`.
void compile_directory(const std::string& source, const std::string& out, const CompileOptions& options,
                       std::ostream& log);

/// The list of a source directory.
Control read_source_control(const std::string& directory);

}  // namespace lexicor_data
