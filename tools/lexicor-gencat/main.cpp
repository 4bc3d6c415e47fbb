// lexicor-gencat: compiles message sources into a catalog, and turns a catalog back into a source.
// Exit codes: 0 done, 1 an error in the data or the files, 2 a wrong command line.
#include <lx.h>

#include <CLI/CLI.hpp>
#include <iostream>
#include <string>
#include <vector>

#include "gencat.h"
#include "lexicor/command.h"
#include "lexicor/program.h"
#include "lexicor/session.h"

namespace {

using namespace lexicor_gencat;
using lexicor_cli::Failure;
using lexicor_cli::kDataError;
using lexicor_cli::kDone;
using lexicor_cli::kUsageError;

constexpr char kFooter[] =
    "Examples:\n"
    "  lexicor-gencat app.cat app.msg\n"
    "  lexicor-gencat --locale Japanese_Japan.IBM930 --source-encoding UTF-8 app.cat app.msg\n"
    "  lexicor-gencat --locale German_Germany.MS1252 --byte-order big app.cat de.po\n"
    "  lexicor-gencat --dump app.cat";

struct Arguments {
  Options options;
  lexicor_cli::CommonOptions common;
  std::vector<std::string> files;
  std::string output;
  bool dump = false;
};

void declare(CLI::App& app, Arguments& arguments) {
  Options& options = arguments.options;
  app.set_version_flag("--version", "lexicor-gencat " LX_VERSION);
  app.footer(kFooter);
  app.add_option(
      "FILES", arguments.files,
      "CATFILE [MSGFILE...]: the catalog to write or to merge into, and its sources; \"-\" is standard "
      "output or input, and standard input is the source where none is named");
  app.add_option("-o,--output", arguments.output,
                 "the file to write; all FILES are then sources, or the catalog of --dump")
      ->type_name("FILE");
  app.add_option("--locale", options.locale, "locale whose codepage the texts of the catalog are in")
      ->type_name("NAME");
  app.add_option("--source-encoding,--from", options.source_encoding,
                 "codepage of the sources, or of the source that --dump writes")
      ->type_name("NAME");
  app.add_option("--byte-order", options.byte_order, "byte order of the machine that reads the catalog")
      ->check(CLI::IsMember({"little", "big", "native"}));
  app.add_option("-H,--header", options.header, "C header for the numbers of symbolic names")
      ->type_name("FILE");
  app.add_flag("--new", options.fresh, "replace an existing catalog instead of merging into it");
  app.add_flag("--po", options.po, "the sources are PO files, whatever their names");
  app.add_flag("--dump", arguments.dump, "print the source of a catalog");
  app.add_option("--locale-dir", arguments.common.locale_dir,
                 "locale directory; else LX_LOCALEDIR, else the one beside the program")
      ->type_name("DIR");
}

/// Tells the catalog from the sources.
void sort_files(Arguments& arguments) {
  std::vector<std::string>& files = arguments.files;
  Options& options = arguments.options;
  if (arguments.dump) {
    if (files.size() != 1) throw Failure(kUsageError, "--dump expects one CATFILE");
    for (const std::string* other : {&options.locale, &options.byte_order, &options.header}) {
      if (!other->empty()) throw Failure(kUsageError, "--dump goes with --source-encoding and --output only");
    }
    options.catalog = files[0];
    if (!arguments.output.empty()) options.output = arguments.output;
    return;
  }
  options.catalog = arguments.output;
  if (arguments.output.empty()) {
    if (files.empty())
      throw Failure(kUsageError, "expected CATFILE [MSGFILE...], or --output CATFILE [MSGFILE...]");
    options.catalog = files[0];
    files.erase(files.begin());
  }
  options.sources = files;
}

int run(int argc, char** argv) {
  CLI::App app("Compiles message sources into a catalog that Lexicor reads, and back.", "lexicor-gencat");
  Arguments arguments;
  declare(app, arguments);
  try {
    app.parse(argc, argv);
  } catch (const CLI::ParseError& error) {
    return lexicor_cli::answer_parse(app, error);
  }
  sort_files(arguments);
  const lexicor_cli::Session session(arguments.common);
  if (!arguments.dump) return compile(session, arguments.options, std::cerr) ? kDone : kDataError;
  dump(session, arguments.options);
  return kDone;
}

}  // namespace

int main(int argc, char** argv) {
  return lexicor_cli::run_program("lexicor-gencat", run, argc, argv);
}
