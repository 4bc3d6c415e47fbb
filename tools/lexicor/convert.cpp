// lexicor convert: converts a text from one codepage to another, as a stream.
#include <lx.h>

#include <algorithm>
#include <iostream>
#include <memory>
#include <optional>

#include "arguments.h"
#include "catalogue.h"
#include "codepage.h"
#include "command.h"
#include "input.h"
#include "loss.h"
#include "output.h"
#include "pieces.h"
#include "session.h"

namespace lexicor_cli {

namespace {

// LXConvertBuffer wants at least this much room a call.
constexpr int32_t kLeastRoomBytes = 8;
// More than the longest character and a shift byte.
constexpr size_t kTailBytes = 8;

struct ConvertOptions {
  std::string from, to, output = "-";
  bool strict = false;
  std::vector<std::string> files;
};

/// The streaming conversion between two codepages, with its output.
class Converter {
 public:
  Converter(const Codepage& source, const Codepage& target, Output& output)
      : source_(source),
        target_(target),
        output_(output),
        conversion_(LXOpenConversion(target.locale(), source.locale()), LXCloseConversion),
        buffer_(Pieces::kBytes * 4) {
    if (conversion_ == nullptr)
      throw Failure(kDataError, "no conversion: " + describe_code(LXGetError(target.locale())));
  }

  /// Converts the next bytes of the input. The last few go one by one, so that the place where a cut character
  /// begins is known: it is where the library last had nothing pending.
  void take(const char* data, size_t bytes) {
    const size_t tail = std::min(bytes, kTailBytes);
    step(data, bytes - tail);
    for (const char* p = data + (bytes - tail); p != data + bytes; ++p) step(p, 1);
  }

  /// Ends the text: false when the input ended inside a character, at boundary().
  bool finish() {
    flush();
    if (boundary_ != offset_) return false;
    if (!target_.shift_sensitive()) return true;
    // A blank more, in the single-byte state of the source, brings out the Shift-In that may be due. The blank
    // itself, the last byte, is not part of the text.
    char blank[8] = {};
    LXPutCharEx(source_.locale(), blank, LX_SHIFT_DOUBLE, LXCpUnicodeToCharW(source_.object(), ' '));
    step(blank, source_.shift_sensitive() ? 2 : 1);
    --used_;
    flush();
    return true;
  }

  uint64_t boundary() const { return boundary_; }

 private:
  void step(const char* data, size_t bytes) {
    if (bytes == 0) return;
    auto left = static_cast<int32_t>(bytes);
    int32_t code;
    do {
      if (room() < kLeastRoomBytes) flush();
      char* out = buffer_.data() + used_;
      int32_t out_left = room();
      code = LXConvertBuffer(conversion_.get(), &out, &out_left, &data, &left);
      used_ = static_cast<size_t>(out - buffer_.data());
      if (code == LX_E_OUTPUT_FULL) flush();
    } while (code == LX_E_OUTPUT_FULL);
    if (code != LX_OK && code != LX_E_INPUT_CUT)
      throw Failure(kDataError, "the conversion failed: " + describe_code(code));
    offset_ += bytes;
    if (code == LX_OK) boundary_ = offset_;
  }

  int32_t room() const { return static_cast<int32_t>(buffer_.size() - used_); }

  void flush() {
    output_.write(buffer_.data(), used_);
    used_ = 0;
  }

  const Codepage& source_;
  const Codepage& target_;
  Output& output_;
  std::unique_ptr<LXConversion, int32_t (*)(LXConversion*)> conversion_;
  std::vector<char> buffer_;
  size_t used_ = 0;
  uint64_t offset_ = 0;    // input bytes taken
  uint64_t boundary_ = 0;  // input bytes up to the last whole character
};

/// Reports what was lost; true when nothing was.
bool report_losses(const LossFinder& losses, const Input& input, const ConvertOptions& options) {
  const uint64_t count = losses.count();
  if (count == 0) return true;
  std::cerr << "lexicor: " << count << (count == 1 ? " character" : " characters") << " lost from "
            << options.from << " to " << options.to << '\n';
  for (const Loss& loss : losses.first())
    std::cerr << "  " << input.locate(loss.offset) << ": " << loss.message << '\n';
  if (count > losses.first().size()) std::cerr << "  and " << count - losses.first().size() << " more\n";
  return false;
}

int convert(const ConvertOptions& options, const CommonOptions& common) {
  const Session session(common);
  const Catalogue catalogue = read_catalogue();
  const Codepage source(session, catalogue, options.from);
  const Codepage target(session, catalogue, options.to);
  Input input(options.files);
  Pieces pieces(input);
  Output output(options.output);
  Converter converter(source, target, output);
  std::optional<LossFinder> losses;
  if (options.strict) losses.emplace(source, target);
  pieces.each(!output.is_terminal(), [&](const char* data, size_t got) {
    for (size_t done = 0, bytes; done < got; done += bytes) {
      bytes = source.call_bytes(data + done, got - done);
      converter.take(data + done, bytes);
      if (losses) losses->take(data + done, bytes);
    }
  });
  const bool whole = converter.finish();
  if (losses && whole) losses->finish();
  const bool kept = !losses || report_losses(*losses, input, options);
  if (!whole) throw input.cut_at(converter.boundary());
  if (!kept) return kDataError;
  output.commit();
  return kDone;
}

}  // namespace

Run declare_convert(Arguments& command, const CommonOptions& common) {
  const auto options = std::make_shared<ConvertOptions>();
  command.add_option("--from", options->from, "codepage of the input: a name, an identifier or an alias")
      .required()
      .type_name("CP");
  command.add_option("--to", options->to, "codepage of the output").required().type_name("CP");
  command.add_flag(
      "--strict", options->strict,
      "report every character that is lost; when there is one, exit with 1 and leave OUT as it was");
  command.add_option("-o,--output", options->output, "output file, replaced when it is complete")
      .type_name("OUT");
  command.add_option("FILE", options->files, "input files, taken as one text; - is standard input")
      .type_name("");
  command.footer(
      "A character that the output codepage lacks becomes its substitution character. Text in a "
      "shift-sensitive\n"
      "codepage ends in the single-byte state.\n"
      "\n"
      "Examples:\n"
      "  lexicor convert --from MS932 --to UTF-8 -o letter.utf8 letter.sjis\n"
      "  lexicor convert --from 930 --to utf8 < host.txt\n"
      "  lexicor convert --from utf-8 --to IBM1141 --strict -o out.bin part1.txt part2.txt");
  return [options, &common] { return convert(*options, common); };
}

}  // namespace lexicor_cli
