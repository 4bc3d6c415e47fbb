// lexicor list: the objects and aliases of the locale directory, as tables or as JSON.
#include <lx.h>

#include <algorithm>
#include <memory>
#include <nlohmann/json.hpp>
#include <sstream>

#include "catalogue.h"
#include "command.h"
#include "output.h"
#include "session.h"

namespace lexicor_cli {

namespace {

using Json = nlohmann::ordered_json;

constexpr size_t kLineChars = 100;
constexpr char kAliases[] = "aliases";

/// The kinds of objects, in the order of the tables.
constexpr struct {
  const char* title;
  int type;
} kKinds[] = {
    {"codepages", LX_CODEPAGE}, {"languages", LX_LANGUAGE}, {"territories", LX_TERRITORY}, {"sorts", LX_SORT}};

struct ListOptions {
  std::string what;  // empty: everything
  bool json = false;
};

/// The objects of a type. Binary order is a sort that has no object: it is listed with its identifier 0.
std::vector<CatalogueObject> objects_of(const Catalogue& catalogue, int type) {
  std::vector<CatalogueObject> found;
  if (type == LX_SORT) found.push_back({LX_SORT, 0, "BINARY"});
  for (const CatalogueObject& object : catalogue.objects) {
    if (object.type == type) found.push_back(object);
  }
  return found;
}

std::string padded(const std::string& text, size_t chars, bool to_the_right) {
  const std::string fill(text.size() < chars ? chars - text.size() : 0, ' ');
  return to_the_right ? fill + text : text + fill;
}

/// Words behind a column that ends at `indent`, broken before the line is full.
void write_wrapped(std::ostream& out, const std::vector<std::string>& words, size_t indent) {
  size_t column = indent;
  for (const std::string& word : words) {
    if (column > indent && column + 1 + word.size() > kLineChars) {
      out << '\n' << std::string(indent, ' ');
      column = indent;
    }
    if (column > indent) {
      out << ' ';
      ++column;
    }
    out << word;
    column += word.size();
  }
}

void write_objects(std::ostream& out, const Catalogue& catalogue, int type) {
  const std::vector<CatalogueObject> objects = objects_of(catalogue, type);
  constexpr size_t kIdChars = 5;
  size_t name_chars = 0;
  for (const CatalogueObject& object : objects) name_chars = std::max(name_chars, object.name.size());
  for (const CatalogueObject& object : objects) {
    const std::vector<std::string> aliases =
        type == LX_CODEPAGE ? catalogue.aliases_of(object.name) : std::vector<std::string>();
    out << padded(std::to_string(object.id), kIdChars, true) << "  ";
    if (aliases.empty()) {
      out << object.name << '\n';
      continue;
    }
    out << padded(object.name, name_chars, false) << "  ";
    write_wrapped(out, aliases, kIdChars + 2 + name_chars + 2);
    out << '\n';
  }
}

void write_aliases(std::ostream& out, const Catalogue& catalogue) {
  size_t chars = 0;
  for (const CatalogueAlias& row : catalogue.aliases) chars = std::max(chars, row.alias.size());
  for (const CatalogueAlias& row : catalogue.aliases)
    out << padded(row.alias, chars, false) << "  " << row.codepage << '\n';
}

Json json_objects(const Catalogue& catalogue, int type) {
  Json rows = Json::array();
  for (const CatalogueObject& object : objects_of(catalogue, type)) {
    Json row = {{"id", object.id}, {"name", object.name}};
    if (type == LX_CODEPAGE) row["aliases"] = catalogue.aliases_of(object.name);
    rows.push_back(row);
  }
  return rows;
}

Json json_aliases(const Catalogue& catalogue) {
  Json rows = Json::array();
  for (const CatalogueAlias& row : catalogue.aliases)
    rows.push_back({{"alias", row.alias}, {"codepage", row.codepage}});
  return rows;
}

std::string list_text(const ListOptions& options, const Catalogue& catalogue) {
  std::ostringstream out;
  Json json = Json::object();
  const bool all = options.what.empty();
  const auto heading = [&](const std::string& title) {
    if (all) out << (out.tellp() > 0 ? "\n" : "") << title << '\n';
  };
  for (const auto& kind : kKinds) {
    if (!all && options.what != kind.title) continue;
    if (options.json) {
      json[kind.title] = json_objects(catalogue, kind.type);
    } else {
      heading(kind.title);
      write_objects(out, catalogue, kind.type);
    }
  }
  if (options.json) {
    // In the whole list the aliases stand with their codepages.
    if (options.what == kAliases) json[kAliases] = json_aliases(catalogue);
    return json.dump(2, ' ', false, Json::error_handler_t::replace) + "\n";
  }
  if (options.what == kAliases) write_aliases(out, catalogue);
  return out.str();
}

int list(const ListOptions& options, const CommonOptions& common) {
  const Session session(common);
  Output output;
  output.write(list_text(options, read_catalogue()));
  return kDone;
}

}  // namespace

Run declare_list(CLI::App& command, const CommonOptions& common) {
  const auto options = std::make_shared<ListOptions>();
  command
      .add_option("WHAT", options->what,
                  "codepages, languages, territories, sorts or aliases; all when left out")
      ->type_name("")
      ->check(CLI::IsMember({"codepages", "languages", "territories", "sorts", "aliases"}));
  command.add_flag("--json", options->json, "print JSON");
  command.footer(
      "Each line has the identifier, the name and, of a codepage, its aliases.\n"
      "\n"
      "Examples:\n"
      "  lexicor list codepages\n"
      "  lexicor list sorts --json");
  return [options, &common] { return list(*options, common); };
}

}  // namespace lexicor_cli
