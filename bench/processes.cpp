// The command line beside the programs that do the same. A program's time is the processor time that the system
// took down for it; the time that passed stands in the note.
#include <fcntl.h>
#include <spawn.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <limits>
#include <random>

#include "codepages.h"
#include "families.h"

namespace bench {
namespace {

constexpr size_t kFileBytes = 200000000;
constexpr size_t kSampleBytes = 1000000;  // what the programs' outputs are compared on
constexpr size_t kLines = 1000000;
constexpr int kTurns = 3, kStarts = 100;

class TemporaryDirectory {
 public:
  TemporaryDirectory() {
    std::string path = std::filesystem::temp_directory_path() / "lexicor_bench.XXXXXX";
    if (mkdtemp(path.data()) != nullptr) path_ = path;
  }
  ~TemporaryDirectory() {
    std::error_code ignored;
    std::filesystem::remove_all(path_, ignored);
  }
  std::string file(const char* name) const { return path_ + "/" + name; }

 private:
  std::string path_;
};

/// A program that reads the file of its last argument and writes to its standard output.
struct Command {
  const char* name;
  std::vector<std::string> arguments;
  std::string environment;  // LC_ALL
  bool is_rival = true;
};

struct Times {
  double processor_ns = std::numeric_limits<double>::max(), ns = processor_ns;
};

/// What a run took; the largest times when it failed.
Times run(const Command& command, const std::string& input, const std::string& output) {
  std::vector<char*> arguments;
  for (const std::string& argument : command.arguments)
    arguments.push_back(const_cast<char*>(argument.c_str()));
  arguments.insert(arguments.end(), {const_cast<char*>(input.c_str()), nullptr});
  const std::string all = "LC_ALL=" + command.environment,
                    locales = std::string("LOCPATH=") + std::getenv("LOCPATH"),
                    path = std::string("PATH=") + std::getenv("PATH");
  char* const environment[] = {const_cast<char*>(all.c_str()), const_cast<char*>(locales.c_str()),
                               const_cast<char*>(path.c_str()), nullptr};
  posix_spawn_file_actions_t files;
  posix_spawn_file_actions_init(&files);
  posix_spawn_file_actions_addopen(&files, STDOUT_FILENO, output.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0600);
  const auto start = std::chrono::steady_clock::now();
  pid_t child = 0;
  const int failed = posix_spawnp(&child, arguments[0], &files, nullptr, arguments.data(), environment);
  posix_spawn_file_actions_destroy(&files);
  int status = 0;
  rusage usage{};
  if (failed != 0 || wait4(child, &status, 0, &usage) != child || status != 0) return {};
  const auto ns_of = [](const timeval& time) {
    return static_cast<double>(time.tv_sec) * 1e9 + static_cast<double>(time.tv_usec) * 1e3;
  };
  const std::chrono::duration<double, std::nano> passed = std::chrono::steady_clock::now() - start;
  return {ns_of(usage.ru_utime) + ns_of(usage.ru_stime), passed.count()};
}

std::string contents(const std::string& path) {
  std::ifstream file(path, std::ios::binary);
  return {std::istreambuf_iterator<char>(file), {}};
}

class ProcessRows {
 public:
  explicit ProcessRows(Table* table) : table_(*table) {}

  /// A row on a text of `bytes` bytes that repeats `text`, which ends a line.
  void add(const std::string& name, const std::string& text, size_t bytes, const std::vector<Command>& commands,
           Same same = Same::kBytes, int turns = kTurns) {
    if (!table_.wants(name)) return;
    const std::vector<Command> present =
        check(name, text.substr(0, text.rfind('\n', kSampleBytes) + 1), commands, same);
    const size_t written = write(text, bytes);
    std::vector<Times> least(present.size());
    for (int turn = 0; turn < turns; ++turn)
      for (size_t i = 0; i < present.size(); ++i) {
        const Times times = run(present[i], input_, "/dev/null");
        least[i] = {std::min(least[i].processor_ns, times.processor_ns), std::min(least[i].ns, times.ns)};
      }
    print(name, present, least, written);
  }

 private:
  /// The programs that are there; they give the same for a sample.
  std::vector<Command> check(const std::string& name, const std::string& sample,
                             const std::vector<Command>& commands, Same same) {
    std::ofstream(input_, std::ios::binary) << sample;
    std::vector<Command> present;
    std::string expected;
    for (const Command& command : commands) {
      if (run(command, input_, output_).ns == Times().ns) {
        std::fprintf(stderr, "%s: %s fails, or is not there, and is left out\n", name.c_str(), command.name);
        continue;
      }
      const std::string output = contents(output_);
      if (present.empty()) expected = output;
      if (same == Same::kBytes && output != expected) {
        std::fprintf(stderr, "%s: %s gives something else\n", name.c_str(), command.name);
        std::exit(1);
      }
      present.push_back(command);
    }
    return present;
  }

  size_t write(const std::string& text, size_t bytes) {
    std::ofstream file(input_, std::ios::binary | std::ios::trunc);
    size_t written = 0;
    do {
      file << text;
      written += text.size();
    } while (written < bytes);
    return std::max<size_t>(written, 1);
  }

  void print(const std::string& name, const std::vector<Command>& commands, const std::vector<Times>& times,
             size_t bytes) {
    if (commands.empty() || commands.front().name != kOurs) return;
    std::vector<Measured> measured;
    std::string note = "passed ms:";
    for (size_t i = 0; i < commands.size(); ++i) {
      measured.push_back({commands[i].name, times[i].processor_ns, commands[i].is_rival});
      char text[64];
      std::snprintf(text, sizeof(text), "%s %s %.1f", i == 0 ? "" : ",", commands[i].name, times[i].ns / 1e6);
      note += text;
    }
    table_.print(name, measured, bytes, 1, note);
  }

  Table& table_;
  TemporaryDirectory directory_;
  const std::string input_ = directory_.file("input"), output_ = directory_.file("output");
};

struct Conversion {
  const char *text, *from, *to;
};
constexpr Conversion kConversions[] = {
    {"German", "UTF-8", "IBM1141"}, {"German-prose", "UTF-8", "IBM1141"},
    {"Japanese", "UTF-8", "MS932"}, {"Japanese-prose", "UTF-8", "MS932"},
    {"Russian", "UTF-8", "MS1251"}, {"Russian-prose", "UTF-8", "MS1251"},
    {"Korean", "UTF-8", "MS949"},   {"Japanese", "MS932", "UTF-8"},
};

Command lexicor(const std::vector<std::string>& arguments) {
  Command command{kOurs, {LEXICOR_BENCH_PROGRAM, "--locale-dir", LEXICOR_BENCH_LOCALE_DIR}, "C"};
  command.arguments.insert(command.arguments.end(), arguments.begin(), arguments.end());
  return command;
}

void add_conversions(ProcessRows* rows, const Table& table, Texts* texts) {
  for (const Conversion& conversion : kConversions) {
    const Encoding &from = *find_encoding(conversion.from), &to = *find_encoding(conversion.to);
    const std::string name =
        std::string("process/convert/") + from.label + "/" + to.label + "/" + conversion.text;
    if (!table.wants(name)) continue;
    const auto source = Codepage::open(from), target = Codepage::open(to);
    if (source == nullptr || target == nullptr || texts->find(conversion.text).empty()) continue;
    std::u16string text = agreed_text(texts->find(conversion.text), {source.get(), target.get()});
    if (text.find(u'\n') == std::u16string::npos) std::replace(text.begin(), text.end(), u',', u'\n');
    text += u'\n';
    rows->add(name, source->encode(text), kFileBytes,
              {lexicor({"convert", "--strict", "--from", from.label, "--to", to.label}),
               {kIconv, {"iconv", "-f", from.iconv, "-t", to.iconv}, "C"},
               {"uconv", {"uconv", "-f", from.icu, "-t", to.icu}, "C"}});
  }
}

/// Words in random order, a line each.
std::string lines_of(Texts* texts) {
  std::vector<std::u16string> words = texts->words("German");
  std::mt19937 random(1);
  std::string lines;
  for (size_t i = 0; i < kLines && !words.empty(); ++i) lines += to_utf8(words[random() % words.size()]) + '\n';
  return lines;
}

void add_sorts(ProcessRows* rows, const Table& table, Texts* texts) {
  if (!table.wants_some("process/sort/")) return;
  const std::string lines = lines_of(texts);
  if (lines.empty()) return;
  rows->add("process/sort/binary", lines, lines.size(),
            {lexicor({"sort", "--locale", "German.UTF-8@BINARY"}), {"sort", {"sort"}, "C"}});
  rows->add("process/sort/German", lines, lines.size(),
            {lexicor({"sort", "--locale", "German.UTF-8"}), {"sort", {"sort"}, "de_DE.UTF-8"}});
  // What is equal without case stands in another order in each.
  rows->add("process/sort/case-insensitive", lines, lines.size(),
            {lexicor({"sort", "--locale", "German.UTF-8", "--case-insensitive"}),
             {"sort", {"sort", "-f"}, "de_DE.UTF-8"}},
            Same::kNothing);
  rows->add("process/sort/binary-case-insensitive", lines, lines.size(),
            {lexicor({"sort", "--locale", "German.UTF-8@BINARY", "--case-insensitive"}),
             {"sort", {"sort", "-f"}, "C"}},
            Same::kNothing);
}

}  // namespace

void add_process_rows(Table* table, Texts* texts) {
  if (!table->wants_some("process/")) return;
  ProcessRows rows(table);
  add_conversions(&rows, *table, texts);
  add_sorts(&rows, *table, texts);
  const std::string prose = table->wants("process/lines") ? to_utf8(texts->find("German-prose") + u'\n') : "";
  if (!prose.empty())
    rows.add("process/lines", prose, kFileBytes,
             {lexicor({"lines", "--from", "UTF-8", "--eol", "crlf"}), {"sed", {"sed", "s/$/\r/"}, "C"}});
  rows.add("process/start", "x\n", 0,
           {lexicor({"convert", "--from", "UTF-8", "--to", "MS932"}),
            {kIconv, {"iconv", "-f", "UTF-8", "-t", "CP932"}, "C"}},
           Same::kBytes, kStarts);
}

}  // namespace bench
