// lexicor list: the objects and aliases of the locale directory and the operating system's locales, as tables
// or as JSON.
#include <lx.h>

#include <algorithm>
#include <memory>
#include <sstream>
#include <utility>

#include "arguments.h"
#include "catalogue.h"
#include "command.h"
#include "output.h"
#include "provenance.h"
#include "report.h"
#include "session.h"

namespace lexicor_cli {

namespace {

constexpr size_t kLineChars = 100;

/// The kinds of objects, in the order of the tables.
constexpr struct {
  const char* title;
  int type;
} kObjectKinds[] = {
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
    out << padded(std::to_string(object.id), kIdChars, Align::kRight) << "  ";
    if (aliases.empty()) {
      out << object.name << '\n';
      continue;
    }
    out << padded(object.name, name_chars) << "  ";
    write_wrapped(out, aliases, kIdChars + 2 + name_chars + 2);
    out << '\n';
  }
}

Json json_objects(const Catalogue& catalogue, const Provenance& provenance, int type) {
  Json rows = Json::array();
  for (const CatalogueObject& object : objects_of(catalogue, type)) {
    Json row = {{"id", object.id},
                {"name", object.name},
                {"digest", provenance.digest_of(type, object.name)},
                {"made_from", provenance.source_of(type, object.name)}};
    if (type == LX_CODEPAGE) row["aliases"] = catalogue.aliases_of(object.name);
    rows.push_back(row);
  }
  return rows;
}

using NameRows = std::vector<std::pair<std::string, std::string>>;

/// A list of names and what each stands for.
struct NameTable {
  const char* title;
  const char* name;  // of the two columns, in JSON
  const char* meaning;
  NameRows (*read)(const Catalogue& catalogue);
};

NameRows alias_rows(const Catalogue& catalogue) {
  NameRows rows;
  for (const CatalogueAlias& row : catalogue.aliases) rows.emplace_back(row.alias, row.codepage);
  return rows;
}

NameRows native_rows(const Catalogue&) {
  NameRows rows;
  LXEnumNativeLocales(
      [](void* user, const char* native, const char* locale) {
        static_cast<NameRows*>(user)->emplace_back(native, locale);
        return int32_t{1};
      },
      &rows);
  return rows;
}

constexpr NameTable kNameTables[] = {{"aliases", "alias", "codepage", alias_rows},
                                     {"locales", "native", "locale", native_rows}};

void write_names(std::ostream& out, const NameRows& rows) {
  size_t chars = 0;
  for (const auto& [name, meaning] : rows) chars = std::max(chars, name.size());
  for (const auto& [name, meaning] : rows) out << padded(name, chars) << "  " << meaning << '\n';
}

Json json_names(const NameTable& table, const NameRows& rows) {
  Json json = Json::array();
  for (const auto& [name, meaning] : rows) json.push_back({{table.name, name}, {table.meaning, meaning}});
  return json;
}

std::string list_text(const ListOptions& options, const Catalogue& catalogue) {
  const Provenance provenance;
  std::ostringstream out;
  Json json = Json::object();
  const bool all = options.what.empty();
  const auto heading = [&](const std::string& title) {
    if (all) out << (out.tellp() > 0 ? "\n" : "") << title << '\n';
  };
  for (const auto& kind : kObjectKinds) {
    if (!all && options.what != kind.title) continue;
    if (options.json) {
      json[kind.title] = json_objects(catalogue, provenance, kind.type);
    } else {
      heading(kind.title);
      write_objects(out, catalogue, kind.type);
    }
  }
  // The whole list is that of the directory: its aliases stand with their codepages.
  for (const NameTable& table : kNameTables) {
    if (options.what != table.title) continue;
    if (options.json)
      json[table.title] = json_names(table, table.read(catalogue));
    else
      write_names(out, table.read(catalogue));
  }
  if (options.json) return json_text(json);
  return out.str();
}

int list(const ListOptions& options, const CommonOptions& common) {
  const Session session(common);
  Output output;
  output.write(list_text(options, read_catalogue()));
  return kDone;
}

}  // namespace

Run declare_list(Arguments& command, const CommonOptions& common) {
  const auto options = std::make_shared<ListOptions>();
  command
      .add_option("WHAT", options->what,
                  "codepages, languages, territories, sorts, aliases or locales; all objects when left out")
      .type_name("")
      .one_of({"codepages", "languages", "territories", "sorts", "aliases", "locales"});
  command.add_flag("--json", options->json, "print JSON");
  command.footer(
      "Each line has the identifier, the name and, of a codepage, its aliases. Locales are the operating "
      "system's\n"
      "names, with the locale that each stands for. JSON has the digest of each object's data too, and what "
      "they\n"
      "were made from.\n"
      "\n"
      "Examples:\n"
      "  lexicor list codepages\n"
      "  lexicor list sorts --json");
  return [options, &common] { return list(*options, common); };
}

}  // namespace lexicor_cli
