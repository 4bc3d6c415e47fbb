// lexicor translate: translates a string from one codepage to another by the process layer, as a program does
// with the fields of its records: an output size, padding, blanks that may be lost.
#include <nls1.h>

#include <algorithm>
#include <cstring>
#include <limits>
#include <memory>

#include "arguments.h"
#include "catalogue.h"
#include "codepage.h"
#include "command.h"
#include "input.h"
#include "loss.h"
#include "output.h"
#include "pieces.h"
#include "recoder.h"
#include "repertoire.h"
#include "session.h"
#include "text_lines.h"
#include "well_formed.h"

namespace lexicor_cli {

namespace {

constexpr size_t kMostTranslated = std::numeric_limits<int32_t>::max();
// A byte becomes at most one character of four bytes, with a shift byte before it; the text gets one at its
// end.
constexpr size_t kGrowth = 5;
constexpr size_t kClosingBytes = 1;

struct TranslateOptions {
  std::string from, to, output = "-";
  int32_t size = 0;  // 0: as much as the text needs
  bool pad = false, trim = false, lossy = false;
  std::vector<std::string> files;
};

/// The source or the target: a codepage, or 16-bit Unicode.
class Side {
 public:
  Side(const Session& session, const std::string& name)
      : utf16_(name == std::to_string(NLS1_UTF16) || same_name(name, kUtf16Name)),
        codepage_(session, utf16_ ? "UTF-8" : name) {}

  bool utf16() const { return utf16_; }
  std::string name() const { return utf16_ ? kUtf16Name : codepage_.name(); }
  /// The number that the process layer knows it by.
  int32_t number() const { return utf16_ ? NLS1_UTF16 : static_cast<int32_t>(codepage_.id()); }
  /// The codepage; of 16-bit Unicode UTF-8, which has the same characters.
  const Codepage& codepage() const { return codepage_; }

 private:
  static constexpr char kUtf16Name[] = "UTF-16";

  bool utf16_;
  Codepage codepage_;
};

/// The whole input, which is one string for the library. Each piece is shown to `look(data, bytes)`.
template <class Look>
std::vector<char> read_whole(Pieces& pieces, bool show_progress, Look look) {
  std::vector<char> text;
  pieces.each(show_progress, [&](const char* data, size_t bytes) {
    if (bytes > kMostTranslated - text.size())
      throw Failure(kDataError, "the input is longer than " + std::to_string(kMostTranslated) +
                                    " bytes; 'lexicor convert' takes any length");
    look(data, bytes);
    text.insert(text.end(), data, data + bytes);
  });
  return text;
}

/// Reads the input, of which malformed text is refused, and finds what is lost of it.
std::vector<char> read_text(const Side& source, const Side& target, const Input& input, Pieces& pieces,
                            bool show_progress, Losses* losses) {
  WellFormed check(source.codepage(), input, true);
  Recoder recoder(source.codepage(), target.codepage(), input, nullptr, *losses);
  std::vector<char> text = read_whole(pieces, show_progress, [&](const char* data, size_t bytes) {
    check.take(data, bytes);
    recoder.take(data, bytes);
  });
  check.finish();
  recoder.finish();
  return text;
}

/// Reads 16-bit units, and finds what is lost of them. A half of a surrogate pair is no character.
std::vector<char> read_units(const Side& target, const Input& input, Pieces& pieces, bool show_progress,
                             Losses* losses) {
  std::vector<char> text = read_whole(pieces, show_progress, [](const char*, size_t) {});
  if (target.utf16()) return text;
  const Repertoire repertoire(target.codepage());
  for (size_t at = 0; at + sizeof(LXUChar) <= text.size(); at += sizeof(LXUChar)) {
    LXUChar unit;
    std::memcpy(&unit, text.data() + at, sizeof unit);
    if (!repertoire.has(unit))
      losses->record(repertoire.kind_of_loss(unit), input.place(at), repertoire.describe_loss(unit));
  }
  return text;
}

/// How many bytes of a text became the first `joined` bytes of it without idle shift bytes.
size_t bytes_before(const Codepage& codepage, std::string_view text, size_t joined) {
  size_t least = 0, most = text.size();
  while (least < most) {
    const size_t middle = least + (most - least) / 2;
    if (without_idle_shifts(codepage, text.substr(0, middle)).size() < joined)
      least = middle + 1;
    else
      most = middle;
  }
  return least;
}

/// The size that the output needs at most, up to what the library takes.
size_t needed_bytes(size_t text_bytes) {
  return static_cast<size_t>(
      std::min<uint64_t>(kMostTranslated, uint64_t{text_bytes} * kGrowth + kClosingBytes));
}

int translate(const TranslateOptions& options, const CommonOptions& common) {
  const Session session(common);
  const Side source(session, options.from);
  const Side target(session, options.to);
  Input input(options.files);
  Pieces pieces(input);
  Output output(options.output);
  Losses losses(source.name(), target.name(), options.lossy ? OnLoss::kIgnore : OnLoss::kReport);
  const bool show = !output.is_terminal();
  const std::vector<char> given = source.utf16() ? read_units(target, input, pieces, show, &losses)
                                                 : read_text(source, target, input, pieces, show, &losses);
  std::string_view text(given.data(), given.size());
  const bool idle = source.codepage().shift_sensitive() &&
                    source.codepage().call_bytes(text.data(), text.size()) < text.size();
  const std::string joined = idle ? without_idle_shifts(source.codepage(), text) : "";
  if (idle) text = joined;
  const size_t needed = needed_bytes(text.size());
  const size_t size = options.size > 0 ? static_cast<size_t>(options.size) : needed;
  const std::unique_ptr<char[]> buffer(new char[size]);  // not filled: what is not used takes no memory
  int32_t consumed = 0;
  uint32_t code = LX_OK;
  const int32_t written =
      NLS1_TranslateString(target.number(), source.number(), buffer.get(), static_cast<int32_t>(size),
                           text.data(), static_cast<int32_t>(text.size()), &consumed,
                           (options.pad ? NLS1_PAD : 0) | (options.trim ? NLS1_DROP_BLANKS : 0), &code);
  if (code != LX_OK && code != LX_E_SIZE)
    throw Failure(kDataError, "the translation failed: " + describe_code(static_cast<int>(code)));
  size_t rest = static_cast<size_t>(consumed);
  if (idle) rest = bytes_before(source.codepage(), {given.data(), given.size()}, rest);
  if (code == LX_E_SIZE && options.size == 0 && needed < kMostTranslated) throw input.cut_at(rest);
  if (written > 0) output.write(buffer.get(), static_cast<size_t>(written));
  output.commit();
  if (code == LX_OK) {
    losses.throw_any();
    return kDone;
  }
  throw Failure(kDataError, "the input is left over from " + input.locate(rest) +
                                " on: it does not fit in a size of " + std::to_string(size) +
                                ", or ends inside a character" +
                                (losses.total() == 0 ? "" : "\n" + losses.report()));
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
  command.add_flag("--lossy", options->lossy, "say nothing of lost characters, and exit with 0");
  command.add_option("-o,--output", options->output, "output file, replaced when it is complete")
      .type_name("OUT");
  command.add_option("FILE", options->files, "input files, taken as one string; - is standard input")
      .not_empty()
      .type_name("");
  command.footer(
      "The input is one string of up to 2 GB, line ends and all; 'lexicor convert' takes text of any length. "
      "UTF-16 has\n"
      "the byte order of this machine and no mark of it. Output in a shift-sensitive codepage ends in the "
      "single-byte\n"
      "state; a full output loses its last double-byte character for that. Lost characters are reported as "
      "'lexicor\n"
      "convert' does, and exit with 1. Malformed input and characters beyond U+FFFF are refused.\n"
      "\n"
      "Examples:\n"
      "  lexicor translate --from UTF-8 --to IBM930 -o field.host field.utf8\n"
      "  lexicor translate --from 1252 --to 1141 --size 30 --pad --trim < name.txt");
  return [options, &common] { return translate(*options, common); };
}

}  // namespace lexicor_cli
