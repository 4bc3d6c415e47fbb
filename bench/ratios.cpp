// Measures row by row: Google Benchmark runs the peers of a row in random order, some repetitions each, and the
// fastest repetition of each peer counts. On a shared machine the minimum is what can be compared.
#include "ratios.h"

#include <benchmark/benchmark.h>

#include <algorithm>
#include <map>

namespace bench {
namespace {

/// Keeps the shortest processor time of each benchmark, in nanoseconds an iteration.
class Minimums : public benchmark::BenchmarkReporter {
 public:
  bool ReportContext(const Context&) override { return true; }
  void ReportRuns(const std::vector<Run>& runs) override {
    for (const Run& run : runs) {
      if (run.run_type != Run::RT_Iteration) continue;
      const double ns = run.cpu_accumulated_time * 1e9 / static_cast<double>(run.iterations);
      const auto [place, is_new] = ns_.try_emplace(run.run_name.function_name, ns);
      if (!is_new) place->second = std::min(place->second, ns);
    }
  }
  double ns(const Row& row, const char* peer) const { return ns_.at(row.name + ":" + peer); }

 private:
  std::map<std::string, double> ns_;
};

/// `icu` and `iconv`: how many times our time they take, so that below 1 they are faster. `copies`: how many
/// times the time of memcpy we take.
struct Line {
  double ns_per_char, icu, iconv, copies;
  bool behind() const { return icu < 1 || iconv < 1; }
};

Line measure(const Row& row) {
  Minimums minimums;
  benchmark::RunSpecifiedBenchmarks(&minimums, "^" + row.name + ":");
  const double ours = minimums.ns(row, kOurs);
  return {ours / static_cast<double>(row.input->chars), minimums.ns(row, kIcu) / ours,
          minimums.ns(row, kIconv) / ours, ours / minimums.ns(row, kMemcpy)};
}

}  // namespace

void print_ratios(const std::vector<Row>& rows, std::FILE* out) {
  std::fprintf(out, "%-34s %9s %9s %8s %8s %8s\n", "row", "ns/char", "ns/call", "ICU", "iconv", "memcpy");
  int behind = 0;
  for (const Row& row : rows) {
    const Line line = measure(row);
    behind += line.behind();
    const double calls = static_cast<double>(row.input->ends.size());
    const double ns_per_call = line.ns_per_char * static_cast<double>(row.input->chars) / calls;
    std::fprintf(out, "%-34s %9.3f %9.0f %8.2f %8.2f %8.2f%s\n", row.name.c_str(), line.ns_per_char,
                 ns_per_call, line.icu, line.iconv, line.copies, line.behind() ? "  behind" : "");
    std::fflush(out);
  }
  std::fprintf(out, "%zu rows, %d behind\n", rows.size(), behind);
}

}  // namespace bench
