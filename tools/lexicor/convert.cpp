// lexicor convert: converts a text from one codepage to another, piece by piece.
#include <lx.h>

#include <memory>

#include "arguments.h"
#include "codepage.h"
#include "command.h"
#include "input.h"
#include "loss.h"
#include "output.h"
#include "pieces.h"
#include "recoder.h"
#include "session.h"

namespace lexicor_cli {

namespace {

struct ConvertOptions {
  std::string from, to, output = "-";
  bool strict = false, lossy = false;
  std::vector<std::string> files;
};

int convert(const ConvertOptions& options, const CommonOptions& common) {
  const Session session(common);
  const Codepage source(session, options.from);
  const Codepage target(session, options.to);
  Input input(options.files);
  Pieces pieces(input);
  Output output(options.output);
  Losses losses(source.name(), target.name(),
                options.strict  ? OnLoss::kStop
                : options.lossy ? OnLoss::kIgnore
                                : OnLoss::kReport);
  Recoder recoder(source, target, input, &output, losses);
  pieces.each(!output.is_terminal(), [&](const char* data, size_t bytes) { recoder.take(data, bytes); });
  recoder.finish();
  output.commit();
  losses.throw_any();
  return kDone;
}

}  // namespace

Run declare_convert(Arguments& command, const CommonOptions& common) {
  const auto options = std::make_shared<ConvertOptions>();
  command.add_option("--from", options->from, "codepage of the input: a name, an identifier or an alias")
      .required()
      .type_name("CP");
  command.add_option("--to", options->to, "codepage of the output").required().type_name("CP");
  const Arguments::Option strict =
      command.add_flag("--strict", options->strict, "stop at the first loss and leave OUT as it was");
  command.add_flag("--lossy", options->lossy, "say nothing of losses, and exit with 0").excludes(strict);
  command.add_option("-o,--output", options->output, "output file, replaced when it is complete")
      .type_name("OUT");
  command.add_option("FILE", options->files, "input files, taken as one text; - is standard input")
      .type_name("");
  command.footer(
      "Nothing is lost silently: malformed input, and every character that would not come back when OUT is "
      "converted\n"
      "back, is counted, the first ones are shown with line, column and byte, and the exit code is 1. OUT is "
      "complete\n"
      "all the same, with U+FFFD or the codepage's substitution character for what is lost. A signature of "
      "UTF-8 (a\n"
      "byte-order mark) at the start of a file is dropped where the output codepage lacks U+FEFF; it is no "
      "text. Text in\n"
      "a shift-sensitive codepage ends in the single-byte state.\n"
      "\n"
      "Examples:\n"
      "  lexicor convert --from MS932 --to UTF-8 -o letter.utf8 letter.sjis\n"
      "  lexicor convert --from 930 --to utf8 < host.txt\n"
      "  lexicor convert --from utf-8 --to IBM1141 --strict -o out.bin part1.txt part2.txt");
  return [options, &common] { return convert(*options, common); };
}

}  // namespace lexicor_cli
