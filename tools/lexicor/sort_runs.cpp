// A run holds each line with its lengths. Keys are made again when lines come back: that costs less than writing and
// reading them.
#include "sort_runs.h"

#include <fcntl.h>
#include <sys/resource.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <utility>

namespace lexicor_cli {

namespace {

constexpr size_t kWriteBytes = 256 * 1024;
constexpr size_t kLeastBuffer = 4096, kMostBuffer = 1024 * 1024;

struct RunRecord {
  uint32_t bytes, end_bytes;
};

std::string temporary_directory(const std::string& named) {
  if (!named.empty()) return named;
  const char* const variable = std::getenv("TMPDIR");
  return variable != nullptr && *variable != '\0' ? variable : "/tmp";
}

/// How many sources are merged at a time: fewer where the system lets a process open few files.
size_t most_sources() {
  constexpr rlim_t kLeast = 2, kMost = 64;
  constexpr rlim_t kOtherFiles = 16;  // that may be open beside them
  rlimit files{};
  if (getrlimit(RLIMIT_NOFILE, &files) != 0) return kMost;
  return static_cast<size_t>(std::clamp(std::max(files.rlim_cur, kOtherFiles) - kOtherFiles, kLeast, kMost));
}

}  // namespace

TemporaryFile::TemporaryFile(const std::string& directory) : directory_(temporary_directory(directory)) {
  fd_ = open(directory_.c_str(), O_TMPFILE | O_RDWR | O_CLOEXEC | O_EXCL, 0600);
  if (fd_ >= 0) return;
  if (errno != EOPNOTSUPP && errno != EISDIR) fail();
  // A file system without files that have no names.
  std::string name = directory_ + "/lexicor.XXXXXX";
  fd_ = mkostemp(name.data(), O_CLOEXEC);
  if (fd_ < 0) fail();
  unlink(name.c_str());
}

TemporaryFile::~TemporaryFile() {
  close(fd_);
}

void TemporaryFile::write(const char* data, size_t bytes) {
  while (bytes > 0) {
    const ssize_t n = ::write(fd_, data, bytes);
    if (n < 0 && errno == EINTR) continue;
    if (n < 0) fail();
    data += n;
    bytes -= static_cast<size_t>(n);
  }
}

size_t TemporaryFile::read(char* buffer, size_t bytes) {
  for (;;) {
    const ssize_t n = pread(fd_, buffer, bytes, read_);
    if (n < 0 && errno == EINTR) continue;
    if (n < 0) fail();
    read_ += n;
    return static_cast<size_t>(n);
  }
}

void TemporaryFile::fail() const {
  throw Failure(kDataError, "a temporary file in " + directory_ + ": " + std::strerror(errno));
}

void SortedRun::add(const Line& line) {
  const RunRecord record{line.bytes, line.end_bytes};
  const auto* const bytes = reinterpret_cast<const char*>(&record);
  buffer_.insert(buffer_.end(), bytes, bytes + sizeof record);
  buffer_.insert(buffer_.end(), line.text, line.text + line.bytes);
  if (buffer_.size() < kWriteBytes) return;
  file_.write(buffer_.data(), buffer_.size());
  buffer_.clear();
}

void SortedRun::flush() {
  file_.write(buffer_.data(), buffer_.size());
  std::vector<char>().swap(buffer_);  // an assignment would keep its memory
}

const Line* SortedRun::next() {
  if (!fill(sizeof(RunRecord))) return nullptr;
  RunRecord record;
  std::memcpy(&record, buffer_.data() + at_, sizeof record);
  if (!fill(sizeof record + record.bytes)) throw Failure(kDataError, "a temporary file has lost its end");
  line_ = {buffer_.data() + at_ + sizeof record, record.bytes, record.end_bytes};
  at_ += sizeof record + record.bytes;
  return &line_;
}

/// Sees to it that so many bytes are there; false: the file has ended before.
bool SortedRun::fill(size_t wanted) {
  if (filled_ - at_ >= wanted) return true;
  std::copy(buffer_.begin() + static_cast<ptrdiff_t>(at_), buffer_.begin() + static_cast<ptrdiff_t>(filled_),
            buffer_.begin());
  filled_ -= at_;
  at_ = 0;
  if (buffer_.size() < wanted + Arena::kSlack) buffer_.resize(std::max(buffer_bytes_, wanted + Arena::kSlack));
  while (filled_ < wanted) {
    const size_t got = file_.read(buffer_.data() + filled_, buffer_.size() - Arena::kSlack - filled_);
    if (got == 0) return false;
    filled_ += got;
  }
  return true;
}

const Line* InputLines::next() {
  while (at_ == lines_.size()) {
    if (!more_) return nullptr;
    texts_.clear();
    lines_.clear();
    at_ = 0;
    more_ = reader_.read(&texts_, &lines_);
  }
  return &lines_[at_++];
}

LineMerge::LineMerge(const LineOrder& order, const std::vector<OrderedLines*>& sources) : order_(order) {
  for (OrderedLines* const source : sources) {
    heads_.push_back(std::make_unique<Head>(order, source, static_cast<uint32_t>(heads_.size())));
    if (read(heads_.back().get())) heap_.push_back(heads_.back().get());
  }
  for (size_t at = heap_.size() / 2; at-- > 0;) sift(at);
}

bool LineMerge::read(Head* head) {
  head->line = head->source->next();
  if (head->line == nullptr) return false;
  head->key.clear();
  head->entry = KeyEntry(head->maker.make(*head->line, &head->key), head->source_number);
  return true;
}

bool LineMerge::before(const Head& a, const Head& b) const {
  if (order_.by_key() && a.entry.head != b.entry.head)
    return (a.entry.head < b.entry.head) != order_.descending();
  const int32_t result = order_.compare(a.entry.view(), b.entry.view());
  return result != 0 ? result < 0 : a.source_number < b.source_number;
}

void LineMerge::advance() {
  if (!read(heap_[0])) {
    heap_[0] = heap_.back();
    heap_.pop_back();
  }
  if (!heap_.empty()) sift(0);
}

void LineMerge::sift(size_t at) {
  for (;;) {
    size_t first = at;
    for (size_t child = 2 * at + 1; child <= 2 * at + 2 && child < heap_.size(); ++child) {
      if (before(*heap_[child], *heap_[first])) first = child;
    }
    if (first == at) return;
    std::swap(heap_[at], heap_[first]);
    at = first;
  }
}

MergeSources::MergeSources(const LineOrder& order, uint64_t memory, std::string temporary_directory)
    : order_(order),
      temporary_directory_(std::move(temporary_directory)),
      most_(most_sources()),
      buffer_bytes_(static_cast<size_t>(std::clamp<uint64_t>(memory / 2 / most_, kLeastBuffer, kMostBuffer))) {}

std::unique_ptr<SortedRun> MergeSources::new_run() const {
  return std::make_unique<SortedRun>(temporary_directory_, buffer_bytes_);
}

void MergeSources::add(std::unique_ptr<OrderedLines> lines) {
  if (sources_.size() == most_) merge_last();
  sources_.push_back({std::move(lines), 0});
}

LineMerge MergeSources::merge_from(size_t first) const {
  std::vector<OrderedLines*> lines;
  for (size_t i = first; i < sources_.size(); ++i) lines.push_back(sources_[i].lines.get());
  return {order_, lines};
}

/// Merges the last sources, two at least, that come from as many mergings: what has been merged often is long.
void MergeSources::merge_last() {
  size_t first = sources_.size() - 2;
  const int mergings = sources_[first].mergings;
  while (first > 0 && sources_[first - 1].mergings == mergings) --first;
  std::unique_ptr<SortedRun> run = new_run();
  merge_from(first).each([&](const Line& line, const KeyEntry&) { run->add(line); });
  run->flush();
  sources_.resize(first);
  sources_.push_back({std::move(run), mergings + 1});
}

}  // namespace lexicor_cli
