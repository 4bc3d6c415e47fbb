// lexicor-gencat: compiles message sources into a catalog, and turns a catalog back into a source.
// Exit codes: 0 done, 1 an error in the data or the files, 2 a wrong command line.
#include <lx.h>

#include <iostream>
#include <string>
#include <vector>

#include "gencat.h"
#include "lexicor/arguments.h"
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
    "  lexicor-gencat --locale Japanese_Japan.IBM930 --source-encoding UTF-8 host.cat app.msg\n"
    "  lexicor-gencat --locale German_Germany.MS1252 --byte-order big de.cat de.po\n"
    "  lexicor-gencat --dump app.cat";

struct Asked {
  Options options;
  lexicor_cli::CommonOptions common;
  std::vector<std::string> files;
  std::string output;
  bool dump = false;
};

void declare(lexicor_cli::Arguments arguments, Asked& asked) {
  Options& options = asked.options;
  arguments.footer(kFooter);
  arguments
      .add_option("FILES", asked.files,
                  "CATFILE [MSGFILE...]: the catalog to write or to merge into, and its sources; \"-\" is "
                  "standard output or input, and standard input is the source where none is named")
      .not_empty();
  arguments
      .add_option("-o,--output", asked.output,
                  "the file to write; all FILES are then sources, or the catalog of --dump")
      .not_empty()
      .type_name("FILE");
  arguments.add_option("--locale", options.locale, "locale whose codepage the texts of the catalog are in")
      .type_name("LOCALE");
  arguments
      .add_option("--source-encoding,--from", options.source_encoding,
                  "codepage of the sources, or of the source that --dump writes")
      .type_name("CP");
  arguments.add_option("--byte-order", options.byte_order, "byte order of the machine that reads the catalog")
      .one_of({"little", "big", "native"});
  arguments.add_option("-H,--header", options.header, "C header for the numbers of symbolic names")
      .not_empty()
      .type_name("FILE");
  arguments.add_flag("--new", options.fresh, "replace an existing catalog instead of merging into it");
  arguments.add_flag("--po", options.po, "the sources are PO files, whatever their names");
  arguments.add_flag("--dump", asked.dump, "print the source of a catalog");
  arguments
      .add_option("--locale-dir", asked.common.locale_dir,
                  "locale directory; else LX_LOCALEDIR, else the one beside the program")
      .type_name("DIR");
}

/// Tells the catalog from the sources.
void sort_files(Asked& asked) {
  std::vector<std::string>& files = asked.files;
  Options& options = asked.options;
  if (asked.dump) {
    if (files.size() != 1) throw Failure(kUsageError, "--dump expects one CATFILE");
    for (const std::string* other : {&options.locale, &options.byte_order, &options.header}) {
      if (!other->empty()) throw Failure(kUsageError, "--dump goes with --source-encoding and --output only");
    }
    options.catalog = files[0];
    if (!asked.output.empty()) options.output = asked.output;
    return;
  }
  options.catalog = asked.output;
  if (asked.output.empty()) {
    if (files.empty())
      throw Failure(kUsageError, "expected CATFILE [MSGFILE...], or --output CATFILE [MSGFILE...]");
    options.catalog = files[0];
    files.erase(files.begin());
  }
  options.sources = files;
}

int run(int argc, char** argv) {
  lexicor_cli::CommandLine line(
      "lexicor-gencat", "Compiles message sources into a catalog that Lexicor reads, and back.", LX_VERSION);
  Asked asked;
  declare(line.arguments(), asked);
  if (!line.parse(argc, argv)) return kDone;
  sort_files(asked);
  const lexicor_cli::Session session(asked.common);
  if (!asked.dump) return compile(session, asked.options, std::cerr) ? kDone : kDataError;
  dump(session, asked.options);
  return kDone;
}

}  // namespace

int main(int argc, char** argv) {
  return lexicor_cli::run_program("lexicor-gencat", run, argc, argv);
}
