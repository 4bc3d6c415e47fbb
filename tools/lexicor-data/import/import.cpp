// lexicor-import OUTDIR: writes the sources of the locale directory (languages, territories, codepages, sorts,
// their lines of control.txt, alias.txt) from what ICU and glibc know. A maintainer's program; the build needs
// only what it wrote. A second run with the same ICU and glibc changes nothing. It prints what it left out.
#include <algorithm>
#include <cstdio>
#include <exception>
#include <filesystem>
#include <fstream>
#include <map>
#include <sstream>
#include <stdexcept>

#include "alias_import.h"
#include "codepage_import.h"
#include "control_source.h"
#include "language_toml.h"
#include "locale_import.h"
#include "locale_table.h"
#include "root_import.h"
#include "sort_import.h"
#include "sort_sources.h"
#include "territory_toml.h"
#include "ucm.h"

namespace lexicor_import {
namespace {

namespace fs = std::filesystem;

constexpr Codepage kCodepages[] = {
#include "codepages.inc"
};

constexpr Sibling kSiblings[] = {
#include "siblings.inc"
};

using lexicor_data::Control;
using lexicor_data::ObjectType;

constexpr char kControlHead[] =
    "# The objects of the locale directory: type, identifier, name, by type and identifier. The sources are\n"
    "# languages/NAME.toml, territories/NAME.toml, codepages/NAME.ucm and sorts/NAME.rules. lexicor-import\n"
    "# writes all of them.\n";

/// Leaves a file alone that holds the text already.
void write_file(const fs::path& path, const std::string& text) {
  std::ifstream in(path, std::ios::binary);
  std::stringstream old;
  if (in && old << in.rdbuf() && old.str() == text) return;
  in.close();
  std::ofstream out(path, std::ios::binary);
  out << text;
  out.close();
  if (!out) throw std::runtime_error("cannot write " + path.string());
}

/// The objects that this program writes.
Control control_list(const fs::path& file, const std::vector<Codepage>& codepages) {
  std::ostringstream list;
  for (const Language& row : kLanguages) list << "language " << row.id << ' ' << row.name << '\n';
  for (const Territory& row : kTerritories) list << "territory " << row.id << ' ' << row.name << '\n';
  for (const Codepage& row : codepages) list << "codepage " << row.id << ' ' << row.name << '\n';
  for (const Sort& row : kSorts) list << "sort " << row.id << ' ' << row.name << '\n';
  std::istringstream in(list.str());
  return lexicor_data::read_control(in, file.string());
}

using Tables = std::map<std::string, lexicor_data::CodepageSource>;  // by name

/// The tables of all codepages; prints what they leave out.
Tables import_tables(const std::vector<Codepage>& codepages) {
  Tables tables;
  for (const Codepage& codepage : codepages) {
    Counts left_out;
    try {
      tables[codepage.name] = import_codepage(codepage, left_out);
    } catch (const std::exception& error) {
      throw std::runtime_error(std::string(codepage.name) + ": " + error.what());
    }
    for (const auto& [reason, count] : left_out)
      std::printf("%s: left out: %s %zu\n", codepage.name, reason.c_str(), count);
  }
  return tables;
}

std::string source_text(const Tables& tables, const Codepage& codepage) {
  const lexicor_data::CodepageSource* base = nullptr;
  for (const Sibling& sibling : kSiblings)
    if (std::string(sibling.name) == codepage.name) base = &tables.at(sibling.base);
  std::ostringstream out;
  lexicor_data::write_ucm_source(out, tables.at(codepage.name), base);
  return out.str();
}

void import_languages(const fs::path& directory, const Control& control) {
  fs::create_directories(directory / "languages");
  for (const Language& row : kLanguages) {
    std::ostringstream out;
    lexicor_data::write_language(out, import_language(row, control), &control);
    write_file(directory / "languages" / (std::string(row.name) + ".toml"),
               source_comment(row.locale) + out.str());
  }
}

void import_territories(const fs::path& directory) {
  fs::create_directories(directory / "territories");
  for (const Territory& row : kTerritories) {
    Notes notes;
    std::ostringstream out;
    try {
      lexicor_data::write_territory(out, import_territory(row, notes));
    } catch (const std::exception& error) {
      throw std::runtime_error(std::string(row.name) + ": " + error.what());
    }
    for (const std::string& note : notes) std::printf("%s: %s\n", row.name, note.c_str());
    write_file(directory / "territories" / (std::string(row.name) + ".toml"),
               territory_comment(row) + out.str());
  }
}

void import_sorts(const fs::path& directory) {
  fs::create_directories(directory / "sorts");
  const lexicor_data::SortRoot root = import_root();
  std::ostringstream text;
  lexicor_data::write_root(text, root);
  write_file(directory / "sorts" / lexicor_data::kRootFile, source_comment("root") + text.str());
  for (const Sort& row : kSorts) {
    Notes notes;
    std::string rules;
    try {
      rules = import_rules(row, root, notes);
    } catch (const std::exception& error) {
      throw std::runtime_error(std::string(row.name) + ": " + error.what());
    }
    for (const std::string& note : notes) std::printf("%s: %s\n", row.name, note.c_str());
    write_file(directory / "sorts" / (row.name + std::string(lexicor_data::kRulesExtension)),
               source_comment(row.locale) + rules);
  }
}

void run(const fs::path& directory) {
  const std::vector<Codepage> codepages = all_codepages();
  fs::create_directories(directory / "codepages");
  const Tables tables = import_tables(codepages);
  for (const Codepage& codepage : codepages) {
    write_file(directory / "codepages" / (std::string(codepage.name) + ".ucm"), source_text(tables, codepage));
  }
  std::ostringstream aliases;
  write_aliases(aliases, codepages);
  write_file(directory / "alias.txt", aliases.str());

  const Control control = control_list(directory / "control.txt", codepages);
  import_languages(directory, control);
  import_territories(directory);
  import_sorts(directory);
  std::ostringstream list;
  lexicor_data::write_control(list, control);
  write_file(directory / "control.txt", kControlHead + list.str());
  std::printf("%zu objects\n", control.objects.size());
}

}  // namespace

std::vector<Codepage> all_codepages() {
  std::vector<Codepage> list(std::begin(kCodepages), std::end(kCodepages));
  std::sort(list.begin(), list.end(), [](const Codepage& a, const Codepage& b) { return a.id < b.id; });
  const auto same_id = [](const Codepage& a, const Codepage& b) { return a.id == b.id; };
  const auto twice = std::adjacent_find(list.begin(), list.end(), same_id);
  if (twice != list.end())
    throw std::runtime_error("identifier of " + std::string(twice->name) + " is used twice");
  return list;
}

std::vector<std::string> words(const std::string& text) {
  std::istringstream in(text);
  std::vector<std::string> list;
  for (std::string word; in >> word;) list.push_back(word);
  return list;
}

}  // namespace lexicor_import

int main(int argc, char** argv) {
  if (argc != 2) {
    std::fprintf(stderr, "usage: lexicor-import OUTDIR\n");
    return 2;
  }
  try {
    lexicor_import::run(argv[1]);
  } catch (const std::exception& error) {
    std::fprintf(stderr, "lexicor-import: %s\n", error.what());
    return 1;
  }
  return 0;
}
