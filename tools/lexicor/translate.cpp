// lexicor translate: translates a string from one codepage to another by the process layer, as a program does
// with the fields of its records: an output size, padding, blanks that may be lost.
#include <nls1.h>

#include <algorithm>
#include <limits>
#include <memory>

#include "arguments.h"
#include "catalogue.h"
#include "codepage.h"
#include "command.h"
#include "input.h"
#include "output.h"
#include "pieces.h"
#include "session.h"

namespace lexicor_cli {

namespace {

constexpr size_t kMostBytes = std::numeric_limits<int32_t>::max();
// A byte becomes at most one character of four bytes, with a shift byte before it; the text gets one at its
// end.
constexpr size_t kGrowth = 5;
constexpr size_t kClosingBytes = 1;

struct TranslateOptions {
  std::string from, to, output = "-";
  int32_t size = 0;  // 0: as much as the text needs
  bool pad = false, trim = false;
  std::vector<std::string> files;
};

/// The number that the process layer knows a codepage by.
int32_t codepage_number(const Session& session, const Catalogue& catalogue, const std::string& name) {
  if (name == std::to_string(NLS1_UTF16) || same_name(name, "UTF-16")) return NLS1_UTF16;
  return static_cast<int32_t>(Codepage(session, catalogue, name).id());
}

/// The whole input, which is one string for the library.
std::vector<char> read_whole(Pieces& pieces, bool show_progress) {
  std::vector<char> text;
  pieces.each(show_progress, [&](const char* data, size_t bytes) {
    if (bytes > kMostBytes - text.size())
      throw Failure(kDataError, "the input is longer than " + std::to_string(kMostBytes) +
                                    " bytes; 'lexicor convert' takes any length");
    text.insert(text.end(), data, data + bytes);
  });
  return text;
}

int translate(const TranslateOptions& options, const CommonOptions& common) {
  const Session session(common);
  const Catalogue catalogue = read_catalogue();
  const int32_t source = codepage_number(session, catalogue, options.from);
  const int32_t target = codepage_number(session, catalogue, options.to);
  Input input(options.files);
  Pieces pieces(input);
  Output output(options.output);
  const std::vector<char> text = read_whole(pieces, !output.is_terminal());
  const auto needed =
      static_cast<size_t>(std::min<uint64_t>(kMostBytes, uint64_t{text.size()} * kGrowth + kClosingBytes));
  const size_t size = options.size > 0 ? static_cast<size_t>(options.size) : needed;
  const std::unique_ptr<char[]> buffer(new char[size]);  // not filled: what is not used takes no memory
  int32_t consumed = 0;
  uint32_t code = LX_OK;
  const int32_t written = NLS1_TranslateString(
      target, source, buffer.get(), static_cast<int32_t>(size), text.data(), static_cast<int32_t>(text.size()),
      &consumed, (options.pad ? NLS1_PAD : 0) | (options.trim ? NLS1_DROP_BLANKS : 0), &code);
  if (code != LX_OK && code != LX_E_SIZE)
    throw Failure(kDataError, "the translation failed: " + describe_code(static_cast<int>(code)));
  const auto rest = static_cast<uint64_t>(consumed);
  if (code == LX_E_SIZE && options.size == 0 && needed < kMostBytes) throw input.cut_at(rest);
  if (written > 0) output.write(buffer.get(), static_cast<size_t>(written));
  output.commit();
  if (code == LX_OK) return kDone;
  throw Failure(kDataError, "the input is left over from " + input.locate(rest) +
                                " on: it does not fit in a size of " + std::to_string(size) +
                                ", or ends inside a character");
}

}  // namespace

Run declare_translate(Arguments& command, const CommonOptions& common) {
  const auto options = std::make_shared<TranslateOptions>();
  command
      .add_option("--from", options->from,
                  "codepage of the input: a name, an identifier or an alias; 1200 or UTF-16 is UTF-16")
      .required()
      .type_name("CP");
  command.add_option("--to", options->to, "codepage of the output").required().type_name("CP");
  const Arguments::Option size =
      command
          .add_option("--size", options->size,
                      "size of the output; what does not fit is left out, and exits with 1")
          .type_name("BYTES")
          .at_least(1);
  command.add_flag("--pad", options->pad, "fill the output up to the size with blanks").needs(size);
  command.add_flag("--trim", options->trim, "blanks at the end of the input that do not fit are no error")
      .needs(size);
  command.add_option("-o,--output", options->output, "output file, replaced when it is complete")
      .type_name("OUT");
  command.add_option("FILE", options->files, "input files, taken as one string; - is standard input")
      .type_name("");
  command.footer(
      "The input is one string of up to 2 GB, line ends and all; 'lexicor convert' takes text of any length. "
      "UTF-16 has\n"
      "the byte order of this machine and no mark of it. Output in a shift-sensitive codepage ends in the "
      "single-byte\n"
      "state; a full output loses its last double-byte character for that.\n"
      "\n"
      "Examples:\n"
      "  lexicor translate --from UTF-8 --to IBM930 -o field.host field.utf8\n"
      "  lexicor translate --from 1252 --to 1141 --size 30 --pad --trim < name.txt");
  return [options, &common] { return translate(*options, common); };
}

}  // namespace lexicor_cli
