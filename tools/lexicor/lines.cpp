// lexicor lines: rewrites the line ends of a text in a codepage.
#include <lx.h>

#include <iostream>
#include <map>
#include <memory>

#include "arguments.h"
#include "codepage.h"
#include "command.h"
#include "input.h"
#include "line_ends.h"
#include "notices.h"
#include "output.h"
#include "pieces.h"
#include "report.h"
#include "session.h"
#include "well_formed.h"

namespace lexicor_cli {

namespace {

const std::map<std::string, uint32_t> kLineEnds = {
    {"lf", LX_EOL_LF}, {"crlf", LX_EOL_CRLF}, {"nl", LX_EOL_THIRD}, {"other", LX_EOL_FOURTH}};

struct LinesOptions {
  std::string from, eol, output = "-";
  std::vector<std::string> find;  // empty: all kinds
  bool report = false, json = false;
  std::vector<std::string> files;
};

/// "lexicor: 3 line ends (2 crlf, 1 lf), 2 rewritten", or the same as JSON.
void report(const LineEndRewriter& rewriter, bool json) {
  uint64_t all = 0;
  std::string kinds;
  Json counts;
  for (const auto& [name, kind] : kLineEnds) {
    const uint64_t found = rewriter.found(kind);
    counts[name] = found;
    if (found == 0) continue;
    all += found;
    kinds += (kinds.empty() ? " (" : ", ") + std::to_string(found) + " " + name;
  }
  if (json) {
    std::cerr << json_text({{"line_ends", all}, {"kinds", counts}, {"rewritten", rewriter.rewritten()}});
    return;
  }
  notices() << "lexicor: " << all << (all == 1 ? " line end" : " line ends") << kinds
            << (kinds.empty() ? "" : ")") << ", " << rewriter.rewritten() << " rewritten\n";
}

int rewrite_lines(const LinesOptions& options, const CommonOptions& common) {
  const Session session(common);
  const Codepage codepage(session, options.from);
  uint32_t find = options.find.empty() ? LX_EOL_ALL : 0;
  for (const std::string& name : options.find) find |= kLineEnds.at(name);
  Input input(options.files);
  Pieces pieces(input);
  Output output(options.output);
  WellFormed check(codepage, input);
  LineEndRewriter rewriter(codepage, find, kLineEnds.at(options.eol), output);
  pieces.each(!output.is_terminal(), [&](const char* data, size_t bytes) {
    check.take(data, bytes);
    rewriter.take(data, bytes);
  });
  check.finish();
  rewriter.finish();
  output.commit();
  if (options.report || options.json) report(rewriter, options.json);
  return kDone;
}

}  // namespace

Run declare_lines(Arguments& command, const CommonOptions& common) {
  const auto options = std::make_shared<LinesOptions>();
  command.add_option("--from", options->from, "codepage of the text: a name, an identifier or an alias")
      .required()
      .type_name("CP");
  command
      .add_option(
          "--eol", options->eol,
          "line end to write: lf, crlf, nl (new line of EBCDIC), or other (a fourth one of the codepage)")
      .required()
      .type_name("KIND")
      .one_of(keys_of(kLineEnds));
  command.add_option("--find", options->find, "line ends to rewrite, separated by commas; else all four kinds")
      .type_name("KIND,...")
      .divided_by(',')
      .one_of(keys_of(kLineEnds));
  command.add_flag("--report", options->report, "say on standard error how many line ends there were");
  command.add_flag("--json", options->json, "say it as JSON");
  command.add_option("-o,--output", options->output, "output file, replaced when it is complete")
      .type_name("OUT");
  command.add_option("FILE", options->files, "input files, taken as one text; - is standard input")
      .not_empty()
      .type_name("");
  command.footer(
      "The bytes of a line end are the codepage's own. In most codepages nl and other are the line feed; in "
      "EBCDIC\n"
      "nl is 0x15. A carriage return alone is no line end. Nothing but line ends is changed, except that "
      "shift\n"
      "bytes that change nothing are left out. Malformed text is refused: its place is shown, OUT stays as it "
      "was, and\n"
      "the exit code is 1.\n"
      "\n"
      "Examples:\n"
      "  lexicor lines --from UTF-8 --eol lf -o letter.unix letter.txt\n"
      "  lexicor lines --from IBM939 --eol nl --find lf,crlf --report < host.txt > host.nl");
  return [options, &common] { return rewrite_lines(*options, common); };
}

}  // namespace lexicor_cli
