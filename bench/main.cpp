// lexicor_bench: the library beside its peers on real texts, in one table.
//
//   lexicor_bench [--rows=PART_OF_NAME]... [--markdown] [--turns=N] [--locale=DIRECTORY] [--texts=DIRECTORY]
#include <gnu/libc-version.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <fstream>

#include "families.h"
#include "icu.h"
#include "lx.h"

namespace {

struct Options {
  std::string locale_directory = LEXICOR_BENCH_LOCALE_DIR;
  std::string text_directory = LEXICOR_BENCH_TEXT_DIR;
  bench::TableOptions table;
};

/// Whether `argument` is this option; its value goes to `value`.
bool takes(const char* argument, const char* option, std::string* value) {
  const size_t bytes = strlen(option);
  if (strncmp(argument, option, bytes) != 0) return false;
  *value = argument + bytes;
  return true;
}

/// What the figures depend on, in a line.
void print_machine() {
  std::ifstream file("/proc/cpuinfo");
  std::string line, processor = "unknown processor";
  while (std::getline(file, line))
    if (line.compare(0, 10, "model name") == 0) processor = line.substr(line.find(':') + 2);
  std::printf("%s, GCC %s, glibc %s%s, %d-bit.\n\n", processor.c_str(), __VERSION__, gnu_get_libc_version(),
              bench::icu::versions().c_str(), static_cast<int>(8 * sizeof(void*)));
}

bool read_options(int argc, char** argv, Options* options) {
  for (int i = 1; i < argc; ++i) {
    std::string value;
    if (takes(argv[i], "--rows=", &value))
      options->table.rows.push_back(value);
    else if (takes(argv[i], "--turns=", &value))
      options->table.turns = std::max(1, std::atoi(value.c_str()));
    else if (strcmp(argv[i], "--markdown") == 0)
      options->table.markdown = true;
    else if (!takes(argv[i], "--locale=", &options->locale_directory) &&
             !takes(argv[i], "--texts=", &options->text_directory))
      return std::fprintf(stderr, "lexicor_bench: %s is no option\n", argv[i]), false;
  }
  return true;
}

}  // namespace

int main(int argc, char** argv) {
  Options options;
  if (!read_options(argc, argv, &options)) return 2;
  setenv("LOCPATH", LEXICOR_BENCH_GLIBC_DIR, 0);
  if (options.table.markdown) print_machine();
  bench::Table table(options.table);
  bench::add_first_use_rows(&table, options.locale_directory);
  if (LXInit(options.locale_directory.c_str(), nullptr, nullptr, nullptr, 0) != LX_OK) {
    std::fprintf(stderr, "no locale directory: %s\n", options.locale_directory.c_str());
    return EXIT_FAILURE;
  }
  bench::Texts texts(options.text_directory);
  bench::add_conversion_rows(&table, &texts);
  bench::add_walking_rows(&table, &texts);
  bench::add_mapping_rows(&table, &texts);
  bench::add_collation_rows(&table, &texts);
  bench::add_message_rows(&table, &texts);
  bench::add_formatting_rows(&table);
  bench::add_growth_rows(&table);
  bench::add_process_rows(&table, &texts);
  table.print_sum();
  LXTerm();
  return EXIT_SUCCESS;
}
