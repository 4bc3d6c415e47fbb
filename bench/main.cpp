// lexicor_bench: conversion, case mapping, collation, numbers and times beside ICU, iconv, glibc and memcpy.
//
//   lexicor_bench [--locale=DIRECTORY] [--rows=PART_OF_NAME] [Google Benchmark's own options]
//   lexicor_bench --ratios ...   prints the table of ratios
//   lexicor_bench --first-use    time and memory to the first results of a process
#include <benchmark/benchmark.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <cstring>

#include "first_use.h"
#include "ratios.h"
#include "rows.h"

namespace {

struct Options {
  std::string locale_directory = LEXICOR_BENCH_LOCALE_DIR;
  std::string rows;
  bool ratios = false;
  bool first_use = false;
};

/// Takes our own options out of the arguments.
Options take_options(int* argc, char** argv) {
  Options options;
  int kept = 1;
  for (int i = 1; i < *argc; ++i) {
    const std::string argument = argv[i];
    if (argument == "--ratios")
      options.ratios = true;
    else if (argument == "--first-use")
      options.first_use = true;
    else if (argument.rfind("--locale=", 0) == 0)
      options.locale_directory = argument.substr(strlen("--locale="));
    else if (argument.rfind("--rows=", 0) == 0)
      options.rows = argument.substr(strlen("--rows="));
    else
      argv[kept++] = argv[i];
  }
  *argc = kept;
  return options;
}

/// What --ratios takes unless the arguments say otherwise: they stand first, later options win.
std::vector<char*> with_ratio_defaults(int argc, char** argv) {
  static char interleaving[] = "--benchmark_enable_random_interleaving=true";
  static char repetitions[] = "--benchmark_repetitions=5";
  static char min_time[] = "--benchmark_min_time=0.01";
  std::vector<char*> arguments = {argv[0], interleaving, repetitions, min_time};
  arguments.insert(arguments.end(), argv + 1, argv + argc);
  return arguments;
}

void register_peer(const bench::Row& row, const bench::Peer& peer, std::vector<char>* output) {
  const auto run = [&row, &peer, output](benchmark::State& state) {
    for ([[maybe_unused]] auto _ : state) benchmark::DoNotOptimize(peer.run(output->data()));
    const auto iterations = static_cast<int64_t>(state.iterations());
    state.SetBytesProcessed(iterations * static_cast<int64_t>(row.input->bytes.size()));
    state.SetItemsProcessed(iterations * static_cast<int64_t>(row.input->chars));
  };
  benchmark::RegisterBenchmark((row.name + ":" + peer.name).c_str(), run);
}

int run(const Options& options) {
  std::vector<std::unique_ptr<bench::Codepage>> codepages;
  for (const bench::CodepageName& name : bench::codepage_names())
    if (auto codepage = bench::Codepage::open(name)) codepages.push_back(std::move(codepage));
  if (codepages.empty() || !codepages.back()->is_utf8()) return EXIT_FAILURE;
  std::vector<bench::Row> rows = bench::make_rows(codepages, options.rows);
  bench::add_mapping_rows(&rows, options.rows);
  bench::add_collation_rows(&rows, options.rows);
  bench::add_formatting_rows(&rows, options.rows);
  size_t room = 0;
  for (const bench::Row& row : rows) room = std::max({room, row.output_room + 64, row.input->bytes.size()});
  std::vector<char> output(room);
  for (const bench::Row& row : rows)
    for (const bench::Peer& peer : row.peers) register_peer(row, peer, &output);
  if (options.ratios)
    bench::print_ratios(rows, stdout);
  else
    benchmark::RunSpecifiedBenchmarks();
  return EXIT_SUCCESS;
}

}  // namespace

int main(int argc, char** argv) {
  const Options options = take_options(&argc, argv);
  std::vector<char*> arguments =
      options.ratios ? with_ratio_defaults(argc, argv) : std::vector<char*>(argv, argv + argc);
  int count = static_cast<int>(arguments.size());
  arguments.push_back(nullptr);
  benchmark::Initialize(&count, arguments.data());
  if (benchmark::ReportUnrecognizedArguments(count, arguments.data())) return EXIT_FAILURE;
  if (options.first_use) {
    bench::print_first_use(options.locale_directory.c_str(), stdout);
    return EXIT_SUCCESS;
  }
  if (LXInit(options.locale_directory.c_str(), nullptr, nullptr, nullptr, 0) != LX_OK) {
    std::fprintf(stderr, "no locale directory: %s\n", options.locale_directory.c_str());
    return EXIT_FAILURE;
  }
  const int code = run(options);
  LXTerm();
  return code;
}
