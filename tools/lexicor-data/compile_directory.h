// From a source directory to a locale directory.
#pragma once

#include <functional>
#include <iosfwd>
#include <string>

#include "compile.h"
#include "manifest.h"

namespace lexicor_data {

struct CompileOptions {
  bool verbose = false;     ///< list what is left out, and the sizes of sections
  bool all = false;         ///< compile unchanged sources too
  std::string report_file;  ///< where to list what is left out; empty: nowhere
};

/// Compiles a source directory. Every source is tried before the first error is thrown, with all others, and nothing
/// is written then. What an earlier run made of the same sources is taken as it is. Objects of an earlier run that
/// are not listed any more are removed. Notes go to `log`.
void compile_directory(const std::string& source, const std::string& out, const CompileOptions& options,
                       std::ostream& log);

/// The list of a source directory.
Control read_source_control(const std::string& directory);

/// Says which files of the source folders `is_used` does not know; it is asked for their paths in the directory.
void say_unused(const std::string& directory, std::ostream& log,
                const std::function<bool(const std::string&)>& is_used);

/// Removes objects of this compiler that the list does not have; files of another origin stay.
void remove_unlisted(const std::string& out, const Control& control, std::ostream& log);

/// Writes the objects and the other files of a locale directory: the control file last, since until then a reader
/// does not see the new objects. A file that holds the same bytes already stays as it is, but for the last two.
void write_directory(const std::string& out, const std::vector<std::pair<std::string, ByteVector>>& files,
                     const Manifest& manifest, const ByteVector& control);

}  // namespace lexicor_data
