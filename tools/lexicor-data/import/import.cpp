// lexicor-import OUTDIR: writes the codepage sources of the locale directory (codepages/*.ucm), the codepages'
// lines of control.txt and alias.txt from what ICU and glibc know. A maintainer's program; the build needs only
// what it wrote. A second run with the same ICU and glibc changes nothing. It prints what it left out.
#include <algorithm>
#include <cstdio>
#include <exception>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <stdexcept>

#include "alias_import.h"
#include "codepage_import.h"
#include "ucm.h"

namespace lexicor_import {
namespace {

namespace fs = std::filesystem;

constexpr Codepage kCodepages[] = {
#include "codepages.inc"
};

constexpr char kNewControl[] =
    "# The objects of the locale directory: type, identifier, name, by type and identifier. The sources are\n"
    "# languages/NAME.toml, territories/NAME.toml and codepages/NAME.ucm. lexicor-import writes the "
    "codepages.\n"
    "language 1 English\n"
    "territory 840 UnitedStates\n";

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

/// The control file's text with its codepage lines replaced; all others stay, sorts behind the codepages.
std::string control_text(const std::string& old, const std::vector<Codepage>& codepages) {
  std::string lines;
  for (const Codepage& codepage : codepages) {
    lines += "codepage " + std::to_string(codepage.id) + " " + codepage.name + "\n";
  }
  std::string before, after;
  std::istringstream in(old);
  for (std::string line; std::getline(in, line);) {
    const std::vector<std::string> parts = words(line);
    if (!parts.empty() && parts[0] == "codepage") continue;
    if (!after.empty() || (!parts.empty() && parts[0] == "sort")) {
      after += line + "\n";
    } else {
      before += line + "\n";
    }
  }
  return before + lines + after;
}

std::string import_text(const Codepage& codepage) {
  Counts left_out;
  std::ostringstream out;
  try {
    lexicor_data::write_ucm(out, import_codepage(codepage, left_out));
  } catch (const std::exception& error) {
    throw std::runtime_error(std::string(codepage.name) + ": " + error.what());
  }
  for (const auto& [reason, count] : left_out)
    std::printf("%s: left out: %s %zu\n", codepage.name, reason.c_str(), count);
  return out.str();
}

void run(const fs::path& directory) {
  const std::vector<Codepage> codepages = all_codepages();
  fs::create_directories(directory / "codepages");
  for (const Codepage& codepage : codepages) {
    write_file(directory / "codepages" / (std::string(codepage.name) + ".ucm"), import_text(codepage));
  }
  std::ostringstream aliases;
  write_aliases(aliases, codepages);
  write_file(directory / "alias.txt", aliases.str());

  std::ifstream in(directory / "control.txt", std::ios::binary);
  std::stringstream control;
  if (in) {
    control << in.rdbuf();
  } else {
    control << kNewControl;
  }
  in.close();
  write_file(directory / "control.txt", control_text(control.str(), codepages));
  std::printf("%zu codepages\n", codepages.size());
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
