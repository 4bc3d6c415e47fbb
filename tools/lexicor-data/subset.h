// `lexicor-data subset`: a locale directory cut to what some locales need.
#pragma once

#include <iosfwd>
#include <string>
#include <vector>

namespace lexicor_data {

struct SubsetRequest {
  std::vector<std::string> locales;    ///< LANGUAGE[_TERRITORY][.CODEPAGE][@SORT]
  std::vector<std::string> codepages;  ///< names or aliases
  bool json = false;                   ///< the table
};

/// Copies the objects that the request needs from a compiled directory, with aliases, a control file and a manifest of
/// their own: those that it names, the defaults of the languages, and US-ASCII, in which the library itself writes.
/// A table of sizes goes to `table`, notes go to `log`.
void make_subset(const std::string& directory, const std::string& out, const SubsetRequest& request,
                 std::ostream& table, std::ostream& log);

}  // namespace lexicor_data
