// Entries are ordered by their heads; where heads are equal, by the next eight bytes, so that memory is visited once for
// each eight bytes that keys have in common, and by many keys at a time. Large ranges are parted by a pivot, and the parts
// are shared among threads.
#include "line_sort.h"

#include <algorithm>
#include <condition_variable>
#include <mutex>
#include <vector>

#include "threads.h"

namespace lexicor_cli {

namespace {

constexpr size_t kHead = sizeof(uint64_t);
constexpr size_t kFew = 12;            // are sorted by comparing whole keys
constexpr size_t kShared = 16 * 1024;  // a range that is worth a thread's while
constexpr size_t kWorthThreads = 4 * kShared;

/// Entries whose keys have the same first `depth` bytes; the heads are of the next ones.
struct Range {
  KeyEntry* begin;
  size_t count;
  size_t depth;
  int partings;  // from which it comes without a deeper head
};

/// The ranges that wait for a thread.
class Waiting {
 public:
  void push(const Range& range) {
    const std::lock_guard<std::mutex> lock(mutex_);
    ranges_.push_back(range);
    ++open_;
    changed_.notify_one();
  }
  /// False: all are done.
  bool pop(Range* range) {
    std::unique_lock<std::mutex> lock(mutex_);
    changed_.wait(lock, [&] { return !ranges_.empty() || open_ == 0; });
    if (ranges_.empty()) return false;
    *range = ranges_.back();
    ranges_.pop_back();
    return true;
  }
  /// Work on a range, also one that fails.
  class Turn {
   public:
    explicit Turn(Waiting& waiting) : waiting_(waiting) {}
    ~Turn() { waiting_.done(); }
    Turn(const Turn&) = delete;
    Turn& operator=(const Turn&) = delete;

   private:
    Waiting& waiting_;
  };

 private:
  void done() {
    const std::lock_guard<std::mutex> lock(mutex_);
    if (--open_ == 0) changed_.notify_all();
  }

  std::mutex mutex_;
  std::condition_variable changed_;
  std::vector<Range> ranges_;
  size_t open_ = 0;  // waiting or worked on
};

class EntrySorter {
 public:
  EntrySorter(Waiting& waiting, bool descending) : waiting_(waiting), descending_(descending) {}

  void sort(const Range& range) {
    own_.push_back(range);
    while (!own_.empty()) {
      const Range next = own_.back();
      own_.pop_back();
      step(next);
    }
  }

 private:
  /// Does a part of the work, and leaves the rest in ranges.
  void step(const Range& range) {
    // Pivots that part badly again and again are given up.
    constexpr int kMostPartings = 48;
    if (range.count < 2) return;
    if (range.count <= kFew) return sort_few(range);
    if (range.count >= kShared && range.partings < kMostPartings) return part(range);
    KeyEntry* const end = range.begin + range.count;
    const auto by_head = [](const KeyEntry& a, const KeyEntry& b) { return a.head < b.head; };
    const uint64_t first = range.begin->head;
    if (!std::all_of(range.begin, end, [&](const KeyEntry& e) { return e.head == first; }))
      std::sort(range.begin, end, by_head);
    for (KeyEntry* begin = range.begin; begin != end;) {
      KeyEntry* const behind =
          std::find_if(begin, end, [&](const KeyEntry& e) { return e.head != begin->head; });
      deepen({begin, static_cast<size_t>(behind - begin), range.depth, 0});
      begin = behind;
    }
  }

  void part(const Range& range) {
    const uint64_t pivot = middle(range);
    KeyEntry* const end = range.begin + range.count;
    KeyEntry* const equal = std::partition(range.begin, end, [&](const KeyEntry& e) { return e.head < pivot; });
    KeyEntry* const greater = std::partition(equal, end, [&](const KeyEntry& e) { return e.head == pivot; });
    add({greater, static_cast<size_t>(end - greater), range.depth, range.partings + 1});
    add({range.begin, static_cast<size_t>(equal - range.begin), range.depth, range.partings + 1});
    deepen({equal, static_cast<size_t>(greater - equal), range.depth, 0});
  }

  /// The median of heads that stand apart.
  static uint64_t middle(const Range& range) {
    constexpr size_t kSample = 31;
    uint64_t heads[kSample];
    for (size_t i = 0; i < kSample; ++i) heads[i] = range.begin[range.count / kSample * i].head;
    std::nth_element(heads, heads + kSample / 2, heads + kSample);
    return heads[kSample / 2];
  }

  /// Goes on with entries of equal heads. Keys that end there come first, the shorter ones before.
  void deepen(const Range& range) {
    if (range.count < 2) return;
    if (range.count <= kFew) return sort_few(range);
    const size_t depth = range.depth + kHead;
    KeyEntry* const end = range.begin + range.count;
    KeyEntry* const longer =
        std::partition(range.begin, end, [&](const KeyEntry& e) { return e.key_bytes <= depth; });
    std::sort(range.begin, longer, [&](const KeyEntry& a, const KeyEntry& b) {
      return a.key_bytes != b.key_bytes ? a.key_bytes < b.key_bytes : earlier(a, b);
    });
    for (KeyEntry* entry = longer; entry != end; ++entry) entry->load(depth);
    add({longer, static_cast<size_t>(end - longer), depth, 0});
  }

  void sort_few(const Range& range) const {
    for (size_t i = 1; i < range.count; ++i) {
      const KeyEntry entry = range.begin[i];
      size_t at = i;
      for (; at > 0 && before(entry, range.begin[at - 1], range.depth); --at)
        range.begin[at] = range.begin[at - 1];
      range.begin[at] = entry;
    }
  }

  bool before(const KeyEntry& a, const KeyEntry& b, size_t depth) const {
    if (a.head != b.head) return a.head < b.head;
    const int result = a.view().substr(depth).compare(b.view().substr(depth));
    return result != 0 ? result < 0 : earlier(a, b);
  }
  /// What is turned round in the end stands the other way round before.
  bool earlier(const KeyEntry& a, const KeyEntry& b) const {
    return descending_ ? a.line > b.line : a.line < b.line;
  }

  void add(const Range& range) {
    if (range.count >= kShared)
      waiting_.push(range);
    else
      own_.push_back(range);
  }

  Waiting& waiting_;
  const bool descending_;
  std::vector<Range> own_;
};

}  // namespace

void sort_entries(KeyEntry* entries, size_t count, bool descending) {
  Waiting waiting;
  waiting.push({entries, count, 0, 0});
  in_threads(count < kWorthThreads ? 1 : thread_count(), [&](size_t) {
    EntrySorter sorter(waiting, descending);
    for (Range range; waiting.pop(&range);) {
      const Waiting::Turn turn(waiting);
      sorter.sort(range);
    }
  });
  if (descending) std::reverse(entries, entries + count);
}

}  // namespace lexicor_cli
