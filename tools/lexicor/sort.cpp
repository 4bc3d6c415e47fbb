// lexicor sort: sorts the lines of a text by a locale's sort, merges sorted ones, or tells whether they are sorted.
#include <lx.h>

#include <charconv>
#include <iostream>
#include <limits>
#include <memory>
#include <optional>
#include <vector>

#include "arguments.h"
#include "collation.h"
#include "command.h"
#include "input.h"
#include "line_order.h"
#include "line_sorter.h"
#include "line_writer.h"
#include "output.h"
#include "pieces.h"
#include "progress.h"
#include "sort_runs.h"

namespace lexicor_cli {

namespace {

constexpr char kUniqueBytes[] = "bytes", kUniqueOrder[] = "order";

struct SortOptions {
  std::string locale;  // empty: the user's
  std::string rules;   // a file; empty: the locale's sort
  std::string codepage = "UTF-8";
  std::string output = "-";
  std::vector<std::string> keys;
  std::optional<std::string> separator;  // none: blanks
  bool ignore_case = false, ignore_blanks = false, reverse = false;
  std::string unique;  // kUniqueBytes or kUniqueOrder; empty: every line is written
  bool null_ended = false, stable = false;
  bool check = false, check_quietly = false, merge = false;
  std::string buffer_size;  // empty: a part of the memory
  std::string temporary_directory;
  std::vector<std::string> files;

  SortFieldDefaults defaults() const { return {ignore_blanks, ignore_case, reverse}; }
  Unique uniqueness() const {
    return unique == kUniqueBytes ? Unique::kBytes : unique == kUniqueOrder ? Unique::kOrder : Unique::kNone;
  }
  std::vector<SortField> fields() const {
    std::vector<SortField> fields;
    for (const std::string& key : keys) fields.push_back(parse_sort_field(key, defaults()));
    return fields;
  }
};

/// The bytes of a size: a number of kibibytes, or with b, K, M, G or T.
uint64_t memory_of(const std::string& size) {
  if (size.empty()) return usual_sort_memory();
  uint64_t value = 0;
  const char* const end = size.data() + size.size();
  const auto read = std::from_chars(size.data(), end, value);
  const std::string unit(read.ptr, end);
  const std::string units = "bKMGT";
  const size_t power = unit.empty() ? 1 : unit.size() == 1 ? units.find(unit) : std::string::npos;
  if (read.ec != std::errc() || power == std::string::npos ||
      value > std::numeric_limits<uint64_t>::max() >> 10 * power)
    throw Failure(kUsageError,
                  "--buffer-size takes a number of KiB, or a number with b, K, M, G or T, not '" + size + "'");
  return value << 10 * power;
}

/// The bar while lines are read, which is the first half of it, and written.
class SortBar {
 public:
  explicit SortBar(uint64_t text_bytes) : progress_(text_bytes, true, kWorthShowing) {}

  void advance(uint64_t bytes) {
    done_ += bytes;
    progress_.advance(done_ / 2 - shown_);
    shown_ = done_ / 2;
  }

 private:
  // Sorting takes longer than reading.
  static constexpr uint64_t kWorthShowing = 1024 * 1024;

  uint64_t done_ = 0, shown_ = 0;
  Progress progress_;
};

/// What a command line asks for, made ready.
struct SortJob {
  SortJob(const SortOptions& given, const CommonOptions& common)
      : options(given),
        fields(given.fields()),
        memory(memory_of(given.buffer_size)),
        session(common, given.rules),
        collation(session, given.locale, given.codepage),
        finder(collation.codepage(), given.separator),
        order(collation, finder, given.defaults(), fields) {}

  const SortOptions& options;
  const std::vector<SortField> fields;
  const uint64_t memory;
  RulesSession session;
  Collation collation;
  const FieldFinder finder;
  const LineOrder order;
};

void sort_lines(const SortJob& job) {
  Input input(job.options.files);
  LineSorter sorter(job.order, job.memory, job.options.temporary_directory);
  LineReader reader(job.collation.codepage(), input, job.options.null_ended, sorter.block_bytes(),
                    job.order.line_test());
  bool more = sorter.take(reader);
  // Once something is read: a missing input leaves no trace.
  Output output(job.options.output);
  LineWriter writer(output, job.order, job.options.uniqueness());
  auto bar = std::make_unique<SortBar>(input.total_bytes());
  bar->advance(reader.offset());
  while (more) {
    const uint64_t before = reader.offset();
    more = sorter.take(reader);
    bar->advance(reader.offset() - before);
  }
  if (output.is_terminal()) bar.reset();
  sorter.write(writer, [&](uint64_t bytes) {
    if (bar) bar->advance(bytes);
  });
  bar.reset();
  writer.flush();
  output.commit();
}

void merge_files(const SortJob& job) {
  std::vector<std::string> files = job.options.files;
  if (files.empty()) files.push_back("-");
  MergeSources sources(job.order, job.memory, job.options.temporary_directory);
  for (const std::string& file : files)
    sources.add(std::make_unique<InputLines>(job.order, file, files.size() > 1, job.options.null_ended,
                                             Pieces::kBytes));
  LineMerge merge = sources.merge();
  Output output(job.options.output);
  LineWriter writer(output, job.order, job.options.uniqueness());
  merge.each([&](const Line& line, const KeyEntry& entry) { writer.write(line, entry.view()); });
  writer.flush();
  output.commit();
}

/// Throws a Failure for the first line that is before the one in front of it, or that is no other one where lines are
/// to be unique.
int check_order(const SortJob& job) {
  const SortOptions& options = job.options;
  if (options.files.size() > 1)
    throw Failure(kUsageError, "-c looks at one file, not at " + std::to_string(options.files.size()));
  const std::string file = options.files.empty() ? "-" : options.files[0];
  InputLines lines(job.order, file, false, options.null_ended, Pieces::kBytes);
  const Unique unique = options.uniqueness();
  KeyMaker maker(job.order);
  Arena keys;
  std::string last_key, last_line;
  uint64_t number = 0;
  for (const Line* line; (line = lines.next()) != nullptr; keys.clear()) {
    const std::string_view key = maker.make(*line, &keys);
    const int32_t result = ++number == 1 ? -1 : job.order.compare(last_key, key);
    const bool again =
        result == 0 && (unique == Unique::kOrder || (unique == Unique::kBytes && line->whole() == last_line));
    if (result > 0 || again) {
      if (options.check_quietly) return kDataError;
      throw Failure(kDataError, (file == "-" ? "" : file + ", ") + "line " + std::to_string(number) +
                                    (again ? " is equal to line " : " is before line ") +
                                    std::to_string(number - 1) + " in the order");
    }
    last_key = key;
    last_line = line->whole();
  }
  return kDone;
}

int sort(const SortOptions& options, const CommonOptions& common) {
  const SortJob job(options, common);
  if (options.check || options.check_quietly) return check_order(job);
  if (options.merge)
    merge_files(job);
  else
    sort_lines(job);
  return kDone;
}

}  // namespace

Run declare_sort(Arguments& command, const CommonOptions& common) {
  const auto options = std::make_shared<SortOptions>();
  command.add_option("--locale", options->locale, "locale whose sort is used; else the user's locale")
      .type_name("LOCALE");
  add_rules_option(command, options->rules);
  command.add_option("--codepage", options->codepage, "codepage of the text; else UTF-8").type_name("CP");
  command
      .add_option(
          "-k,--key", options->keys,
          "order by what stands from a character of a field to a character of a field; several: one after the "
          "other")
      .type_name("FIELD[.CHAR][bfr][,FIELD[.CHAR][bfr]]")
      .one_at_a_time();
  command
      .add_option("-t,--field-separator", options->separator,
                  "the character between two fields; else a field begins with the blanks in front of it")
      .type_name("CHAR");
  command.add_flag("-f,--ignore-case,--case-insensitive", options->ignore_case, "letter case does not count");
  command.add_flag("-b,--ignore-leading-blanks", options->ignore_blanks,
                   "blanks in front of a line or a field do not count");
  command.add_flag("-r,--reverse", options->reverse, "last ones first; equal lines still keep their order");
  command.add_flag("-s,--stable", options->stable, "equal lines keep their order, which they always do");
  command.add_flag("-u{order},--unique", options->unique, {kUniqueBytes, kUniqueOrder},
                   "of lines that are the same bytes, or with =order or -u of those that the order calls "
                   "equal, write the first "
                   "only");
  command.add_flag("-z,--zero-terminated", options->null_ended, "lines end with a null character");
  const Arguments::Option check =
      command.add_flag("-c,--check", options->check, "tell whether the lines are sorted, and which one is not");
  const Arguments::Option quiet =
      command.add_flag("-C", options->check_quietly, "tell by the exit code alone whether the lines are sorted")
          .excludes(check);
  command.add_flag("-m,--merge", options->merge, "merge files that are sorted").excludes(check).excludes(quiet);
  command
      .add_option("-S,--buffer-size", options->buffer_size,
                  "memory for lines, in KiB or with b, K, M or G; else half of the machine's. What is more is "
                  "sorted in "
                  "temporary files")
      .type_name("SIZE");
  command
      .add_option("-T,--temporary-directory", options->temporary_directory,
                  "directory for temporary files; else TMPDIR, else /tmp")
      .not_empty()
      .type_name("DIR");
  command.add_option("-o,--output", options->output, "output file, replaced when it is complete")
      .type_name("OUT")
      .excludes(check)
      .excludes(quiet);
  command.add_option("FILE", options->files, "input files; - is standard input").not_empty().type_name("");
  command.footer(
      "A line ends with a line feed, or with a carriage return and one, which do not count. Lines that the "
      "order\n"
      "calls equal stay as they were one behind the other. A last line without an end gets that of the line "
      "before it.\n"
      "--unique alone counts line ends as bytes of the line. Fields and characters count from 1; b, f and r "
      "behind "
      "a\n"
      "place in -k are -b, -f and -r for that key.\n"
      "\n"
      "Examples:\n"
      "  lexicor sort --locale Swedish names.txt\n"
      "  lexicor sort --locale German -t ';' -k 2,2 -k 1,1r people.csv\n"
      "  lexicor sort --locale Japanese@Japanese --codepage MS932 --unique -o words.txt words.txt");
  return [options, &common] { return sort(*options, common); };
}

}  // namespace lexicor_cli
