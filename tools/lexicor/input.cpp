// Reading by file descriptor, so that every failure has its reason and a terminal or a pipe reads as it comes.
#include "input.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <utility>

namespace lexicor_cli {

Input::Input(std::vector<std::string> names, bool one_of_several)
    : names_(std::move(names)), names_files_(one_of_several || names_.size() > 1) {
  if (names_.empty()) names_.push_back("-");
}

Input::~Input() {
  if (fd_ > STDERR_FILENO) close(fd_);
}

size_t Input::read(char* buffer, size_t bytes) {
  size_t got = 0;
  while (got < bytes) {
    if (fd_ < 0 && !open_next()) break;
    const ssize_t n = ::read(fd_, buffer + got, bytes - got);
    if (n < 0 && errno == EINTR) continue;
    if (n < 0) fail(next_file_ - 1);
    if (n == 0) {
      if (fd_ != STDIN_FILENO) close(fd_);
      fd_ = -1;
      if (got > 0) break;
    }
    got += static_cast<size_t>(n);
    offset_ += static_cast<uint64_t>(n);
  }
  return got;
}

bool Input::open_next() {
  if (next_file_ == names_.size()) return false;
  const std::string& name = names_[next_file_];
  fd_ = name == "-" ? STDIN_FILENO : open(name.c_str(), O_RDONLY | O_CLOEXEC);
  if (fd_ < 0) fail(next_file_);
  starts_.push_back({offset_, next_file_});
  ++next_file_;
  return true;
}

std::vector<uint64_t> Input::starts() const {
  std::vector<uint64_t> offsets;
  for (const Start& start : starts_) offsets.push_back(start.offset);
  return offsets;
}

uint64_t Input::total_bytes() const {
  uint64_t total = 0;
  for (const std::string& name : names_) {
    struct stat status;
    const int result = name == "-" ? fstat(STDIN_FILENO, &status) : stat(name.c_str(), &status);
    if (result != 0 || !S_ISREG(status.st_mode)) return 0;
    total += static_cast<uint64_t>(status.st_size);
  }
  return total;
}

bool Input::begins_file(uint64_t offset) const {
  const auto found = std::lower_bound(starts_.begin(), starts_.end(), offset,
                                      [](const Start& start, uint64_t at) { return start.offset < at; });
  return found != starts_.end() && found->offset == offset;
}

Input::Start Input::start_before(uint64_t offset) const {
  Start start{0, 0};
  for (const Start& candidate : starts_) {
    if (candidate.offset <= offset) start = candidate;
  }
  return start;
}

InputPlace Input::place(uint64_t offset) const {
  const Start start = start_before(offset);
  return {names_files_ ? title(start.file) : "", offset - start.offset};
}

std::string InputPlace::text() const {
  const std::string in_file = file.empty() ? "" : file + ", ";
  const std::string at_byte = "byte " + std::to_string(byte);
  if (line == 0) return in_file + at_byte;
  return in_file + line_name + " " + std::to_string(line) + ", column " + std::to_string(column) + " (" +
         at_byte + ")";
}

Failure Input::cut_at(uint64_t offset) const {
  return {kDataError, "the input ends inside the character that begins at " + locate(offset)};
}

void Input::fail(size_t file) const {
  const bool closed = errno == EBADF && names_[file] == "-";
  throw Failure(kDataError, title(file) + ": " + (closed ? "it is closed" : std::strerror(errno)));
}

std::string Input::title(size_t file) const {
  return names_[file] == "-" ? "standard input" : names_[file];
}

}  // namespace lexicor_cli
