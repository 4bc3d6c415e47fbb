// What the locale directory holds: its objects with their identifiers, and the aliases of its codepages.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace lexicor_cli {

struct CatalogueObject {
  int type;  // LX_LANGUAGE to LX_SORT
  unsigned id;
  std::string name;
};

struct CatalogueAlias {
  std::string codepage;  // object name
  std::string alias;
};

/// The objects in the order of the control file, and the aliases in the order of theirs.
struct Catalogue {
  std::vector<CatalogueObject> objects;
  std::vector<CatalogueAlias> aliases;

  std::vector<std::string> aliases_of(const std::string& codepage) const;
};

/// Reads the catalogue of the library in use.
Catalogue read_catalogue();
/// The name of its first object of a type, or an empty string.
std::string first_name(int type);

/// ASCII case-blind equality, as the library compares names.
bool same_name(const std::string& a, const std::string& b);

/// The names of codepages and aliases that a misspelt name is likely to mean: at most `limit`, nearest first.
std::vector<std::string> nearest_codepages(const Catalogue& catalogue, const std::string& name, size_t limit);

}  // namespace lexicor_cli
