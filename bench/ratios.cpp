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

/// How many times our time a peer takes: below 1 it is faster.
struct Ratio {
  const char* peer;
  double times;
  bool behind() const { return peer != kMemcpy && peer != kWrapped && times < 1; }
};

struct Line {
  double ns;  // of all pieces
  std::vector<Ratio> ratios;
  bool behind() const {
    return std::any_of(ratios.begin(), ratios.end(), [](const Ratio& ratio) { return ratio.behind(); });
  }
};

Line measure(const Row& row) {
  Minimums minimums;
  benchmark::RunSpecifiedBenchmarks(&minimums, "^" + row.name + ":");
  Line line{minimums.ns(row, kOurs), {}};
  for (const Peer& peer : row.peers)
    if (peer.name != kOurs) line.ratios.push_back({peer.name, minimums.ns(row, peer.name) / line.ns});
  return line;
}

}  // namespace

void print_ratios(const std::vector<Row>& rows, std::FILE* out) {
  std::fprintf(out, "%-34s %9s %9s  times as long\n", "row", "ns/char", "ns/call");
  int behind = 0;
  for (const Row& row : rows) {
    const Line line = measure(row);
    behind += line.behind();
    std::fprintf(out, "%-34s %9.3f %9.0f", row.name.c_str(), line.ns / static_cast<double>(row.input->chars),
                 line.ns / static_cast<double>(row.input->ends.size()));
    for (const Ratio& ratio : line.ratios) std::fprintf(out, "  %s %.2f", ratio.peer, ratio.times);
    std::fprintf(out, "%s\n", line.behind() ? "  behind" : "");
    std::fflush(out);
  }
  std::fprintf(out, "%zu rows, %d behind\n", rows.size(), behind);
}

}  // namespace bench
