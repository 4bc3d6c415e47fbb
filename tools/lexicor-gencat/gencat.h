// The two things that the program does: compiling sources into a catalog, and turning a catalog into a source.
#pragma once

#include <iosfwd>
#include <string>
#include <vector>

#include "lexicor/catalogue.h"
#include "lexicor/session.h"

namespace lexicor_gencat {

/// What sources are in where nothing says it.
inline constexpr char kDefaultCodepage[] = "UTF-8";
inline constexpr char kDefaultLanguage[] = "English_UnitedStates";

struct Options {
  std::string catalog;               ///< the file to write, or to dump; "-": standard output or input
  std::vector<std::string> sources;  ///< none, or "-": standard input
  std::string output = "-";          ///< of a dump
  std::string locale;                ///< empty: the existing catalog's, or what the sources declare
  std::string source_encoding;       ///< a codepage; empty: what a source declares, or the locale's
  std::string byte_order;            ///< "little", "big" or "native"; empty: as for the locale
  std::string header;                ///< the file for the numbers of symbolic names; empty: none
  bool fresh = false;                ///< an existing catalog is replaced, not merged with
  bool po = false;                   ///< all sources are PO files
};

/// Compiles the sources, and writes nothing unless all of them are free of errors. Messages about the sources
/// go to `log`; returns whether there was no error. Throws a Failure for anything else.
bool compile(const lexicor_cli::Session& session, const Options& options, std::ostream& log);

void dump(const lexicor_cli::Session& session, const Options& options);

}  // namespace lexicor_gencat
