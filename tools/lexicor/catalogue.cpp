// Reads the catalogue through the enumerating functions, and finds near names.
#include "catalogue.h"

#include <lx.h>
#include <strings.h>

#include <algorithm>

#include "near_names.h"

namespace lexicor_cli {

namespace {

int32_t add_object(void* user, int32_t type, const char* name) {
  int32_t code = LX_OK;
  const std::string text = name;
  LXObject* object =
      LXGetObjFromName(nullptr, type, name, static_cast<int32_t>(text.size()), LX_FIND_ONLY, &code);
  const unsigned id = object != nullptr ? reinterpret_cast<const LXObjDisk*>(object)->id : 0;
  static_cast<Catalogue*>(user)->objects.push_back({type, id, text});
  return 1;
}

int32_t add_alias(void* user, const char* codepage, const char* alias) {
  static_cast<Catalogue*>(user)->aliases.push_back({codepage, alias});
  return 1;
}

}  // namespace

std::vector<std::string> Catalogue::aliases_of(const std::string& codepage) const {
  std::vector<std::string> found;
  for (const CatalogueAlias& row : aliases) {
    if (same_name(row.codepage, codepage)) found.push_back(row.alias);
  }
  return found;
}

Catalogue read_catalogue() {
  Catalogue catalogue;
  LXEnumLocales(add_object, &catalogue);
  LXEnumAliases(nullptr, add_alias, &catalogue);
  return catalogue;
}

std::string first_name(int type) {
  struct Search {
    int type;
    std::string found;
  } search{type, ""};
  LXEnumLocales(
      [](void* user, int32_t object_type, const char* name) {
        Search& wanted = *static_cast<Search*>(user);
        if (object_type == wanted.type) wanted.found = name;
        return static_cast<int32_t>(wanted.found.empty());
      },
      &search);
  return search.found;
}

bool same_name(const std::string& a, const std::string& b) {
  return strcasecmp(a.c_str(), b.c_str()) == 0;
}

std::vector<std::string> nearest_codepages(const Catalogue& catalogue, const std::string& name, size_t limit) {
  struct Near {
    size_t distance;
    std::string text;
    std::string codepage;
  };
  std::vector<Near> found;
  const auto consider = [&](const std::string& text, const std::string& codepage) {
    const size_t distance = edit_distance(name, text);
    if (is_near(name, text, distance)) found.push_back({distance, text, codepage});
  };
  for (const CatalogueObject& object : catalogue.objects) {
    if (object.type == LX_CODEPAGE) consider(object.name, object.name);
  }
  for (const CatalogueAlias& row : catalogue.aliases) consider(row.alias, row.codepage);
  // Names stand before aliases, so that of equally near ones a name comes first.
  std::stable_sort(found.begin(), found.end(),
                   [](const Near& a, const Near& b) { return a.distance < b.distance; });
  std::vector<std::string> names, codepages;
  for (const Near& near : found) {
    if (names.size() == limit) break;
    if (std::find(codepages.begin(), codepages.end(), near.codepage) != codepages.end()) continue;
    codepages.push_back(near.codepage);
    names.push_back(near.text);
  }
  return names;
}

}  // namespace lexicor_cli
