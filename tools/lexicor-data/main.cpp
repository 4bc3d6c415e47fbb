// lexicor-data: compiles the sources of a locale directory, dumps objects as sources, and checks directories.
// Exit codes: 0 done, 1 an error in the data, 2 a wrong command line.
#include <lx.h>

#include <csignal>
#include <cstdio>
#include <exception>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <optional>
#include <sstream>
#include <string>

#include "check.h"
#include "compile_directory.h"
#include "control_source.h"
#include "core/lxformat.h"
#include "files.h"
#include "lexicor/arguments.h"
#include "lexicor/command.h"
#include "lexicor/descriptors.h"
#include "lexicor/notices.h"
#include "lexicor/output.h"
#include "lexicor/report.h"
#include "object_check.h"
#include "sort_explain.h"
#include "sort_pack.h"
#include "sort_sources.h"
#include "subset.h"

namespace {

using namespace lexicor_data;
namespace fs = std::filesystem;

using lexicor_cli::kDataError;
using lexicor_cli::kDone;

Control read_control_file(const std::string& path) {
  return unpack_control(read_object(read_file(path), path).sections[0], path);
}

/// The type and identifier that an object's file name says; a SourceError when it says nothing.
ObjectName parse_object_file_name(const std::string& path) {
  const std::string file = fs::path(path).filename().string();
  for (size_t type = 0; type < lx::format::kTypes; ++type) {
    unsigned id = 0;
    int end = 0;
    const std::string pattern =
        std::string(lx::format::kTypePrefix[type]) + "_%5u" + lx::format::kDataExtension + "%n";
    if (std::sscanf(file.c_str(), pattern.c_str(), &id, &end) != 1 || static_cast<size_t>(end) != file.size())
      continue;
    if (id > 65535) continue;
    return {static_cast<ObjectType>(type), static_cast<uint16_t>(id), fs::path(path).stem().string(), 0};
  }
  throw SourceError(path, 0, 0, "the file name is not that of an object, such as cp_00819.nls");
}

/// Prints the source of an object, or of the control file. Names come from the given control file, else from
/// the one beside the object, else the file's own name stands for the object's.
void dump(const std::string& path, std::string control_file) {
  if (fs::path(path).filename() == lx::format::kControlFile) {
    write_control(std::cout, read_control_file(path));
    return;
  }
  ObjectName name = parse_object_file_name(path);
  const fs::path beside = fs::path(path).parent_path() / lx::format::kControlFile;
  if (control_file.empty() && fs::exists(beside)) control_file = beside.string();
  Control control;
  if (!control_file.empty()) {
    control = read_control_file(control_file);
    const ObjectName* listed = control.find(name.type, name.id);
    if (listed != nullptr) name = *listed;
  }
  const ObjectFile object = read_object(read_file(path), path);
  std::cout << dump_object(object, name, control_file.empty() ? nullptr : &control, path);
}

/// A sort from its object, its rules or its weights, as the file's name says.
SortSource read_any_sort(const std::string& path, std::optional<SortSources>& sources) {
  const fs::path extension = fs::path(path).extension();
  const ByteVector bytes = read_file(path);
  if (extension == lx::format::kDataExtension) {
    const ObjectFile object = read_object(bytes, path);
    const ObjectName name = parse_object_file_name(path);
    if (name.type != ObjectType::kSort) throw SourceError(path, 0, 0, "is no sort");
    check_object(object, name, path);
    return unpack_sort(object.sections[0]);
  }
  const std::string text(bytes.begin(), bytes.end());
  if (extension == kRulesExtension) {
    if (!sources) throw SourceError(path, 0, 0, std::string("there is no ") + kRootFile + " beside it");
    SortNotes notes;
    return sources->build({path, text}, notes);
  }
  std::istringstream in(text);
  return read_sort(in, path);
}

void explain_sort(const std::string& from, const std::string& to) {
  // The root lies beside rules, and in a directory of its own beside objects.
  std::optional<SortSources> sources;
  for (const std::string& path : {to, from}) {
    const fs::path directory = fs::absolute(path).parent_path();
    for (const fs::path& place : {directory, directory / kSortDirectory}) {
      if (!sources && fs::exists(place / kRootFile)) sources.emplace(place.string());
    }
  }
  const SortSource before = read_any_sort(from, sources), behind = read_any_sort(to, sources);
  explain_sorts(std::cout, before, behind, sources ? &sources->root() : nullptr);
}

/// As an array; a fault without a line or a column has none.
void write_json(const SourceErrors& faults) {
  using lexicor_cli::Json;
  Json list = Json::array();
  for (const SourceError& fault : faults.list()) {
    Json row = {{"file", fault.file}};
    if (fault.line > 0) row["line"] = fault.line;
    if (fault.line > 0 && fault.column > 0) row["column"] = fault.column;
    row["what"] = fault.fault;
    list.push_back(row);
  }
  std::cout << lexicor_cli::json_text(list);
}

int check(const std::string& directory, bool json) {
  const bool compiled = fs::exists(fs::path(directory) / lx::format::kControlFile);
  const bool source = fs::exists(fs::path(directory) / "control.txt");
  if (!compiled && !source) throw SourceError(directory, 0, 0, "holds neither control.nls nor control.txt");
  SourceErrors faults;
  if (compiled) faults = check_compiled_directory(directory);
  if (source) faults.add_all(check_source_directory(directory, lexicor_cli::notices()));
  if (json) {
    write_json(faults);
  } else {
    for (const SourceError& fault : faults.list()) std::cerr << fault.what() << '\n';
  }
  return faults.empty() ? kDone : kDataError;
}

/// A place in a source stands first, as compilers write it.
void say(const SourceError& errors) {
  for (const SourceError& error : errors.all())
    std::cerr << (error.line > 0 ? "" : "lexicor-data: ") << error.what() << '\n';
}

}  // namespace

int main(int argc, char** argv) {
  lexicor_cli::open_closed_descriptors();
  lexicor_cli::CommandLine line("lexicor-data", "Compiles, dumps and checks Lexicor locale data.", LX_VERSION);
  std::string source, out, file, control_file, directory;
  CompileOptions options;
  SubsetRequest subset;
  bool json = false;

  auto compile_command = line.add_subcommand("compile", "Compile a source directory into a locale directory");
  compile_command.add_option("SRC", source, "the directory with control.txt").required().not_empty();
  compile_command.add_option("OUT", out, "the locale directory").required().not_empty();
  compile_command.add_flag("--verbose", options.verbose, "list section sizes and each character left out");
  compile_command.add_option("--report", options.report_file, "a file for the list of characters left out")
      .not_empty();
  compile_command.add_flag("--all", options.all, "compile sources too that are unchanged since the last run");
  compile_command.footer(
      "Every error of every source is said, and then nothing is written. Objects whose sources are those of "
      "the last\n"
      "run into OUT stay as they are; with --all, --verbose or --report all are compiled.");

  auto dump_command = line.add_subcommand("dump", "Print the source of an object or of a control file");
  dump_command.add_option("FILE", file, "an object, such as cp_00819.nls, or control.nls")
      .required()
      .not_empty();
  dump_command.add_option("--control", control_file, "the control file that names objects").not_empty();

  auto check_command = line.add_subcommand("check", "Check a compiled or a source directory");
  check_command.add_option("DIR", directory, "the directory").required().not_empty();
  check_command.add_flag("--json", json, "print what is wrong as JSON");

  auto subset_command = line.add_subcommand("subset", "Copy what some locales and codepages need");
  subset_command.add_option("DIR", directory, "a compiled directory").required().not_empty();
  subset_command.add_option("OUT", out, "the smaller directory").required().not_empty();
  subset_command.add_option("--locale", subset.locales, "LANGUAGE[_TERRITORY][.CODEPAGE][@SORT] ...")
      .type_name("LOCALE");
  subset_command.add_option("--codepage", subset.codepages, "codepages beside those of the locales ...")
      .type_name("CP");
  subset_command.add_flag("--json", subset.json, "print the table as JSON");
  subset_command.footer(
      "Objects keep their bytes. The defaults of each language and US-ASCII belong to what a locale needs.\n"
      "\n"
      "Example:\n"
      "  lexicor-data subset locale small --locale Swedish_Sweden German.Latin1 --codepage IBM930 sjis");
  std::string from, to;
  auto explain_command =
      line.add_subcommand("explain-sort", "Show in rules where a sort differs from another one");
  explain_command
      .add_option("FROM", from,
                  "a sort: so_NNNNN.nls, NAME.txt, or NAME.rules where either lies beside root.txt")
      .required()
      .not_empty();
  explain_command.add_option("TO", to, "the sort that it is compared with").required().not_empty();

  int status = kDone;
  try {
    if (!line.parse(argc, argv)) return kDone;
    if (compile_command.given()) compile_directory(source, out, options, lexicor_cli::notices());
    if (dump_command.given()) dump(file, control_file);
    if (explain_command.given()) explain_sort(from, to);
    if (check_command.given()) status = check(directory, json);
    if (subset_command.given()) make_subset(directory, out, subset, std::cout, lexicor_cli::notices());
    std::cout.flush();
    if (!std::cout) throw SourceError("standard output", 0, 0, "cannot be written");
  } catch (const SourceError& error) {
    say(error);
    return kDataError;
  } catch (const lexicor_cli::Failure& failure) {
    std::cerr << "lexicor-data: " << failure.what() << '\n';
    return failure.code();
  } catch (const lexicor_cli::BrokenPipe&) {  // where SIGPIPE was ignored from the start
    return 128 + SIGPIPE;
  } catch (const fs::filesystem_error& error) {
    say({error.path1().string(), 0, 0, error.code().message()});
    return kDataError;
  } catch (const std::exception& error) {
    std::cerr << "lexicor-data: " << error.what() << '\n';
    return kDataError;
  }
  return status;
}
