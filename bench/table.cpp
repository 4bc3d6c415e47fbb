// Peers take turns, in which each does its work for some milliseconds, and the shortest turn of each counts: on
// a shared machine the minimum is what can be compared.
#include "table.h"

#include <time.h>

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <cstring>

namespace bench {
namespace {

constexpr double kSteep = 1.7;  // below it the caches are seen: a byte of a long text takes longer

double processor_ns() {
  timespec now{};
  clock_gettime(CLOCK_PROCESS_CPUTIME_ID, &now);
  return static_cast<double>(now.tv_sec) * 1e9 + static_cast<double>(now.tv_nsec);
}

volatile size_t sink;  // keeps the results alive

/// The time of a pass, in one turn of `passes`.
double take_turn(const Work& work, char* output, size_t passes) {
  const double start = processor_ns();
  for (size_t i = 0; i < passes; ++i) sink = work(output);
  return (processor_ns() - start) / static_cast<double>(passes);
}

std::vector<Measured> measure(const Row& row, const TableOptions& options) {
  std::vector<char> output(row.room);
  std::vector<Measured> measured;
  std::vector<size_t> passes;
  std::vector<const Work*> works;
  for (const Peer& peer : row.peers) {
    if (!peer.work) continue;
    const double ns = take_turn(peer.work, output.data(), 1);
    measured.push_back({peer.name, ns, peer.is_rival});
    passes.push_back(1 + static_cast<size_t>(options.turn_milliseconds * 1e6 / ns));
    works.push_back(&peer.work);
  }
  for (int turn = 0; turn < options.turns; ++turn)
    for (size_t i = 0; i < works.size(); ++i)
      measured[i].ns = std::min(measured[i].ns, take_turn(*works[i], output.data(), passes[i]));
  return measured;
}

/// A figure with three digits that count.
std::string figure(double value) {
  char text[32];
  const int digits = value == 0 ? 0 : std::clamp(2 - static_cast<int>(std::floor(std::log10(value))), 0, 3);
  std::snprintf(text, sizeof(text), "%.*f", digits, value);
  return text;
}

bool contains(const std::string& text, const std::string& part) {
  return text.find(part) != std::string::npos;
}

}  // namespace

const Peer* differing(const std::vector<Peer>& peers, size_t room, Same same) {
  std::vector<char> expected(room), output(room);
  const size_t size = peers.front().work(expected.data());
  if (size == 0) return &peers.front();
  for (const Peer& peer : peers) {
    if (!peer.work || !peer.is_rival) continue;
    std::fill(output.begin(), output.end(), '\0');
    const size_t given = peer.work(output.data());
    if (same == Same::kNothing) continue;
    if (given != size) return &peer;
    if (same == Same::kBytes && memcmp(expected.data(), output.data(), size) != 0) return &peer;
  }
  return nullptr;
}

bool Table::wants(const std::string& name) const {
  const auto in_name = [&](const std::string& part) { return contains(name, part); };
  return options_.rows.empty() || std::any_of(options_.rows.begin(), options_.rows.end(), in_name);
}

bool Table::wants_some(const std::string& beginning) const {
  const auto may_be = [&](const std::string& part) {
    return contains(beginning, part) || part.compare(0, beginning.size(), beginning) == 0 ||
           !contains(part, "/") || part[0] == '/';
  };
  return options_.rows.empty() || std::any_of(options_.rows.begin(), options_.rows.end(), may_be);
}

void Table::add(const Row& row) {
  const auto is_other = [](const Peer& peer) { return peer.name != kOurs && peer.is_rival && peer.work; };
  if (!wants(row.name) || std::none_of(row.peers.begin(), row.peers.end(), is_other)) return;
  if (const Peer* const peer = differing(row.peers, row.room, row.same)) {
    std::fprintf(stderr, "%s: %s gives something else\n", row.name.c_str(), peer->name);
    std::exit(1);
  }
  print(row.name, measure(row, options_), row.chars, row.calls);
}

void Table::print_head() {
  if (options_.markdown)
    std::printf(
        "| Row | ns a character | ns a call | fastest peer takes | goal | | others |\n"
        "|---|---|---|---|---|---|---|\n");
  else
    std::printf("%-44s %9s %9s  %-20s %5s\n", "row", "ns/char", "ns/call", "fastest peer takes", "goal");
  has_head_ = true;
}

void Table::print(const std::string& name, const std::vector<Measured>& peers, size_t chars, size_t calls,
                  const std::string& note) {
  const double ours = peers.front().ns;
  const Measured* fastest = nullptr;
  for (size_t i = 1; i < peers.size(); ++i)
    if (peers[i].is_rival && (fastest == nullptr || peers[i].ns < fastest->ns)) fastest = &peers[i];
  std::string others;
  for (size_t i = 1; i < peers.size(); ++i)
    if (&peers[i] != fastest)
      others += (others.empty() ? "" : ", ") + figure(peers[i].ns / ours) + " " + peers[i].peer;
  if (!note.empty()) others += (others.empty() ? "" : "; ") + note;
  const double times = fastest == nullptr ? 0 : fastest->ns / ours, goal = goal_of(name);
  const bool is_behind = fastest != nullptr && times < 1, is_missed = fastest != nullptr && times < goal;
  behind_ += is_behind, missed_ += is_missed;
  const std::string peer = fastest == nullptr ? "" : figure(times) + " " + fastest->peer;
  const std::string wanted = goal == 0 || fastest == nullptr ? "" : figure(goal);
  const char* const shortfall = is_missed ? "below goal" : "";
  print_cells(name, ours, chars, calls, peer, wanted, is_behind ? "behind" : shortfall, others);
}

void Table::print_cells(const std::string& name, double ns, size_t chars, size_t calls, const std::string& peer,
                        const std::string& goal, const std::string& mark, const std::string& others) {
  if (!has_head_) print_head();
  ++rows_;
  const std::string per_char = figure(ns / static_cast<double>(chars)),
                    per_call = figure(ns / static_cast<double>(calls));
  std::printf(
      options_.markdown ? "| %s | %s | %s | %s | %s | %s | %s |\n" : "%-44s %9s %9s  %-20s %5s  %-10s  %s\n",
      name.c_str(), per_char.c_str(), per_call.c_str(), peer.c_str(), goal.c_str(), mark.c_str(),
      others.c_str());
  std::fflush(stdout);
}

double Table::least_ns(const Work& work) const {
  return measure({"", {{kOurs, work}}, 0, 0, 0}, options_).front().ns;
}

void Table::print_growth(const std::string& name, double ns, size_t chars, double exponent) {
  const bool is_steep = exponent > kSteep;
  steep_ += is_steep;
  char note[64];
  std::snprintf(note, sizeof(note), "%zu characters to the power of %.2f", chars, exponent);
  print_cells(name, ns, chars, 1, "", "", is_steep ? "steep" : "", note);
}

void Table::print_sum() const {
  std::printf("%s%d rows, %d behind a peer, %d below their goal, %d steep\n", options_.markdown ? "\n" : "",
              rows_, behind_, missed_, steep_);
}

}  // namespace bench
