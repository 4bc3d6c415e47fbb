// lexicor convert: converts a text from one codepage to another, piece by piece.
#include <lx.h>

#include <charconv>
#include <iostream>
#include <limits>
#include <memory>
#include <optional>

#include "arguments.h"
#include "codepage.h"
#include "command.h"
#include "input.h"
#include "loss.h"
#include "output.h"
#include "pieces.h"
#include "recoder.h"
#include "records.h"
#include "report.h"
#include "session.h"
#include "wide_text.h"

namespace lexicor_cli {

namespace {

constexpr char kKeep[] = "keep", kAdd[] = "add", kDrop[] = "drop";
constexpr char kUtf8Mark[] = "\xEF\xBB\xBF";

struct ConvertOptions {
  std::string from, to, output = "-";
  std::string marks = kKeep;
  std::string records;  // empty: the input is a text
  bool cut = false;
  bool strict = false, lossy = false, json = false;
  std::vector<std::string> files;

  OnLoss on_loss() const { return strict ? OnLoss::kStop : lossy && !json ? OnLoss::kIgnore : OnLoss::kReport; }
};

/// The codepage of the input or the output. UTF-16 and UTF-32 are read and written as UTF-8 has them.
struct TextSide {
  TextSide(const Session& session, const std::string& given)
      : wide(wide_encoding(given)), codepage(session, wide ? "UTF-8" : given) {}

  std::string name() const { return wide ? wide->name() : codepage.name(); }
  bool marked() const { return wide && wide->order == WideEncoding::Order::kMarked; }

  const std::optional<WideEncoding> wide;
  const Codepage codepage;
};

/// The lengths of records, in bytes.
struct RecordBytes {
  size_t from = 0, to = 0;
};

RecordBytes parse_records(const std::string& text) {
  RecordBytes bytes;
  if (text.empty()) return bytes;
  const char* const end = text.data() + text.size();
  const auto from = std::from_chars(text.data(), end, bytes.from);
  bytes.to = bytes.from;
  auto last = from;
  if (from.ptr != end && *from.ptr == ',') last = std::from_chars(from.ptr + 1, end, bytes.to);
  constexpr size_t kMost = std::numeric_limits<int32_t>::max() / 8;
  const auto fits = [](size_t length) { return length > 0 && length <= kMost; };
  if (from.ec != std::errc() || last.ec != std::errc() || last.ptr != end || !fits(bytes.from) ||
      !fits(bytes.to))
    throw Failure(
        kUsageError,
        "--records takes the bytes of a record, or those of input and output as 80,100, not '" + text + "'");
  return bytes;
}

/// Whether marks are dropped where files begin; writes the one that the output begins with.
bool settle_marks(const ConvertOptions& options, const TextSide& target, Sink& sink) {
  if (options.marks == kAdd && !target.codepage.utf8())
    throw Failure(kUsageError, "--bom=add is for output in UTF-8, UTF-16 or UTF-32, not in " + target.name());
  if (options.marks == kAdd || (options.marks == kKeep && target.marked()))
    sink.write(kUtf8Mark, sizeof kUtf8Mark - 1);
  return options.marks != kKeep || target.marked();
}

/// `cut`: how many records were cut; none where the input is a text.
Json json_of(const Losses& losses, const TextSide& source, const TextSide& target,
             const std::optional<uint64_t>& cut) {
  const std::pair<const char*, LossKind> kKinds[] = {{"malformed", LossKind::kMalformed},
                                                     {"unassigned", LossKind::kUnassigned},
                                                     {"lacking", LossKind::kLacking},
                                                     {"changed", LossKind::kChanged}};
  Json json = {{"from", source.name()}, {"to", target.name()}, {"lost", losses.total()}};
  for (const auto& [name, kind] : kKinds) json["kinds"][name] = losses.of_kind(kind);
  if (cut) json["cut"] = *cut;
  json["first"] = Json::array();
  for (const Loss& loss : losses.first()) {
    Json row;
    for (const auto& [name, kind] : kKinds) {
      if (kind == loss.kind) row["kind"] = name;
    }
    if (!loss.where.file.empty()) row["file"] = loss.where.file;
    row[loss.where.line_name] = loss.where.line;
    row["column"] = loss.where.column;
    row["byte"] = loss.where.byte;
    row["what"] = loss.what;
    json["first"].push_back(row);
  }
  return json;
}

void convert_text(const ConvertOptions& options, const TextSide& source, const TextSide& target,
                  Losses& losses) {
  Input input(options.files);
  Pieces pieces(input);
  Output output(options.output);
  std::optional<WideWriter> wide_writer;
  if (target.wide) wide_writer.emplace(*target.wide, output);
  Sink& sink = target.wide ? static_cast<Sink&>(*wide_writer) : output;
  RecoderRules rules;
  rules.drops_marks = settle_marks(options, target, sink);
  if (source.wide) rules.unit_bytes = source.wide->unit_bytes;
  Recoder recoder(source.codepage, target.codepage, input, &sink, losses, rules);
  const bool show = !output.is_terminal();
  if (source.wide) {
    WideReader reader(*source.wide, input, recoder, !rules.drops_marks && target.codepage.utf8());
    pieces.each(show, [&](const char* data, size_t bytes) { reader.take(data, bytes); });
    reader.finish();
  } else {
    pieces.each(show, [&](const char* data, size_t bytes) { recoder.take(data, bytes); });
  }
  recoder.finish();
  output.commit();
}

/// Counts the records that are cut.
void convert_records(const ConvertOptions& options, const RecordBytes& bytes, const TextSide& source,
                     const TextSide& target, Losses& losses, uint64_t* cut) {
  if (source.wide || target.wide)
    throw Failure(kUsageError, "--records is for codepages, not for " + (source.wide ? source : target).name());
  Input input(options.files);
  Pieces pieces(input);
  Output output(options.output);
  RecordSink sink(target.codepage, bytes.to, options.cut, output);
  RecoderRules rules;
  rules.records = true;
  Recoder recoder(source.codepage, target.codepage, input, &sink, losses, rules);
  RecordReader reader(bytes.from, recoder, sink);
  pieces.each(!output.is_terminal(), [&](const char* data, size_t size) { reader.take(data, size); });
  reader.finish();
  output.commit();
  *cut = sink.cut();
}

/// A message, and behind it what is lost.
std::string with_losses(const std::string& text, const Losses& losses) {
  return losses.total() == 0 ? text : text + "\n" + losses.report();
}

int convert(const ConvertOptions& options, const CommonOptions& common) {
  const RecordBytes records = parse_records(options.records);
  const Session session(common);
  const TextSide source(session, options.from);
  const TextSide target(session, options.to);
  Losses losses(source.name(), target.name(), options.on_loss());
  std::optional<uint64_t> cut;
  try {
    if (options.records.empty())
      convert_text(options, source, target, losses);
    else
      convert_records(options, records, source, target, losses, &cut.emplace());
  } catch (const FirstLoss&) {
    if (!options.json) throw;
  } catch (const Failure& failure) {
    throw Failure(failure.code(), with_losses(failure.what(), losses));
  }
  const bool keeps_all = losses.total() == 0 && cut.value_or(0) == 0;
  if (options.json) std::cerr << json_text(json_of(losses, source, target, cut));
  if (options.json || options.lossy) return keeps_all || options.lossy ? kDone : kDataError;
  if (cut.value_or(0) != 0)
    throw Failure(kDataError, with_losses(std::to_string(*cut) + (*cut == 1 ? " record" : " records") +
                                              " cut to " + std::to_string(records.to) + " bytes",
                                          losses));
  losses.throw_any();
  return kDone;
}

}  // namespace

Run declare_convert(Arguments& command, const CommonOptions& common) {
  const auto options = std::make_shared<ConvertOptions>();
  command
      .add_option("-f,--from", options->from,
                  "codepage of the input: a name, an identifier or an alias, or UTF-16, UTF-32, with LE or BE")
      .required()
      .type_name("CP");
  command.add_option("-t,--to", options->to, "codepage of the output").required().type_name("CP");
  const Arguments::Option strict =
      command.add_flag("--strict", options->strict, "stop at the first loss and leave OUT as it was");
  command.add_flag("--lossy", options->lossy, "say losses only where --json asks for them, and exit with 0")
      .excludes(strict);
  const Arguments::Option marks =
      command
          .add_option(
              "--bom", options->marks,
              "byte-order marks that files begin with: kept where the output has them, dropped, or one added")
          .type_name("WHAT")
          .one_of({kKeep, kAdd, kDrop});
  const Arguments::Option records =
      command
          .add_option("--records", options->records,
                      "the input is records of so many bytes, each a text; written with M bytes, else as many")
          .type_name("N[,M]")
          .excludes(marks);
  command.add_flag("--cut", options->cut, "cut records that do not fit, which else ends the work")
      .needs(records)
      .excludes(strict);
  command.add_flag("--json", options->json,
                   "say on standard error as JSON what is lost or cut, also where nothing is");
  command.add_option("-o,--output", options->output, "output file, replaced when it is complete")
      .type_name("OUT");
  command.add_option("FILE", options->files, "input files, taken as one text; - is standard input")
      .not_empty()
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
      "a shift-sensitive codepage ends in the single-byte state. UTF-16 and UTF-32 alone are read in the order "
      "of "
      "their\n"
      "mark, else big end first, and written so with a mark. A record begins and ends in the single-byte "
      "state, and "
      "is\n"
      "filled up with blanks; blanks at its end that do not fit are left out.\n"
      "\n"
      "Examples:\n"
      "  lexicor convert --from MS932 --to UTF-8 -o letter.utf8 letter.sjis\n"
      "  lexicor convert -f 930 -t utf8 < host.txt\n"
      "  lexicor convert -f UTF-16LE -t UTF-8 --bom=drop notes.txt\n"
      "  lexicor convert -f IBM939 -t UTF-8 --records 80,120 -o names.txt names.dat\n"
      "  lexicor convert --from utf-8 --to IBM1141 --strict -o out.bin part1.txt part2.txt");
  return [options, &common] { return convert(*options, common); };
}

}  // namespace lexicor_cli
