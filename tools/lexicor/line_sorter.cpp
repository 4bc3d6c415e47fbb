// Blocks of lines are read and their keys made by all threads; a full memory is sorted and becomes a run.
#include "line_sorter.h"

#include <unistd.h>

#include <algorithm>
#include <fstream>
#include <limits>
#include <utility>

#include "threads.h"

namespace lexicor_cli {

namespace {

constexpr uint64_t kMebibyte = 1024 * 1024;
constexpr size_t kMostBlock = 2 * kMebibyte, kLeastBlock = 64;
constexpr size_t kWorthThreads = 2048;  // keys

/// Sorts so that lines of which none is before the other keep their places. Merging ends also with an order that
/// contradicts itself, as the comparison of texts with shift states can give.
template <class Before>
void merge_sort(Rows<KeyEntry>* entries, Before before) {
  const size_t count = entries->size();
  std::vector<KeyEntry> merged(count);
  for (size_t run = 1; run < count; run *= 2) {
    for (size_t at = 0; at < count; at += 2 * run) {
      KeyEntry* const begin = entries->begin() + at;
      KeyEntry* const middle = begin + std::min(run, count - at);
      KeyEntry* const end = begin + std::min(2 * run, count - at);
      if (middle == end || !before(*middle, middle[-1]))
        std::copy(begin, end, &merged[at]);
      else
        std::merge(begin, middle, middle, end, &merged[at], before);
    }
    std::copy(merged.begin(), merged.end(), entries->begin());
  }
}

/// What the system allows this group of processes, in bytes.
uint64_t group_memory() {
  std::ifstream file("/sys/fs/cgroup/memory.max");
  uint64_t bytes = 0;
  return file >> bytes ? bytes : std::numeric_limits<uint64_t>::max();
}

}  // namespace

uint64_t usual_sort_memory() {
  const auto pages = static_cast<uint64_t>(std::max(0L, sysconf(_SC_PHYS_PAGES)));
  const auto page = static_cast<uint64_t>(sysconf(_SC_PAGESIZE));
  const uint64_t memory = std::min(pages * page, group_memory());
  // Of an address space of 32 bits no more than a part is free in one piece.
  constexpr uint64_t kMost = sizeof(void*) == 4 ? 512 * kMebibyte : std::numeric_limits<uint64_t>::max();
  return std::clamp(memory / 2, 16 * kMebibyte, kMost);
}

LineSorter::LineSorter(const LineOrder& order, uint64_t memory, std::string temporary_directory)
    : order_(order), memory_(memory), runs_(order, memory, std::move(temporary_directory)) {
  for (size_t i = 0; i < thread_count(); ++i) {
    makers_.push_back(std::make_unique<KeyMaker>(order));
    keys_.push_back(std::make_unique<Arena>());
  }
}

size_t LineSorter::block_bytes() const {
  return static_cast<size_t>(std::clamp<uint64_t>(memory_ / 16, kLeastBlock, kMostBlock));
}

bool LineSorter::take(LineReader& reader) {
  const size_t first = lines_.size();
  const bool more = reader.read(&texts_, &lines_);
  make_entries(first);
  uint64_t held = texts_.bytes() + lines_.bytes() + entries_.bytes();
  for (const auto& keys : keys_) held += keys->bytes();
  constexpr size_t kMostLines = std::numeric_limits<int32_t>::max();
  if (held >= memory_ || lines_.size() >= kMostLines) spill();
  return more;
}

/// Makes the entries of the lines from `first` on.
void LineSorter::make_entries(size_t first) {
  const size_t count = lines_.size() - first;
  entries_.add(count);
  const size_t parts = order_.by_text() || count < kWorthThreads ? 1 : makers_.size();
  in_threads(parts, [&](size_t part) {
    for (size_t i = first + count * part / parts; i < first + count * (part + 1) / parts; ++i)
      entries_[i] = KeyEntry(makers_[part]->make(lines_[i], keys_[part].get()), static_cast<uint32_t>(i));
  });
}

void LineSorter::sort() {
  if (order_.by_key()) {
    sort_entries(entries_.begin(), entries_.size(), order_.descending());
    return;
  }
  merge_sort(&entries_,
             [&](const KeyEntry& a, const KeyEntry& b) { return order_.compare(a.view(), b.view()) < 0; });
}

void LineSorter::spill() {
  if (lines_.size() == 0) return;
  sort();
  std::unique_ptr<SortedRun> run = runs_.new_run();
  for (const KeyEntry& entry : entries_) run->add(lines_[entry.line]);
  run->flush();
  runs_.add(std::move(run));
  texts_.clear();
  lines_.clear();
  entries_.clear();
  for (const auto& keys : keys_) keys->clear();
}

void LineSorter::write(LineWriter& writer, const std::function<void(uint64_t)>& wrote) {
  if (runs_.empty()) {
    sort();
    // Lines stand anywhere in memory: it is told early what comes.
    constexpr size_t kSoon = 8, kLater = 2 * kSoon;
    for (size_t i = 0; i < entries_.size(); ++i) {
      if (i + kLater < entries_.size()) __builtin_prefetch(&lines_[entries_[i + kLater].line]);
      if (i + kSoon < entries_.size()) __builtin_prefetch(lines_[entries_[i + kSoon].line].text);
      const Line& line = lines_[entries_[i].line];
      writer.write(line, entries_[i].view());
      wrote(line.bytes);
    }
    return;
  }
  spill();
  runs_.merge().each([&](const Line& line, const KeyEntry& entry) {
    writer.write(line, entry.view());
    wrote(line.bytes);
  });
}

}  // namespace lexicor_cli
