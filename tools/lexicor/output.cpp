// Writing by file descriptor, so that every failure has its reason.
#include "output.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <atomic>
#include <cerrno>
#include <charconv>
#include <climits>
#include <csignal>
#include <cstdio>
#include <cstring>
#include <filesystem>

#include "command.h"

namespace lexicor_cli {

namespace {

/// A temporary file to remove when a signal ends the program.
struct Guarded {
  std::atomic<bool> used{false};
  char path[4096];
};

constexpr int kMostGuarded = 4;  // no program has more outputs open
Guarded g_guarded[kMostGuarded];

void remove_temporaries(int signal) {
  for (const Guarded& guarded : g_guarded) {
    if (guarded.used) unlink(guarded.path);
  }
  std::signal(signal, SIG_DFL);
  raise(signal);
}

/// The number of the guard, for release_temporary(); -1: there is none.
int guard_temporary(const std::string& path) {
  int number = 0;
  while (number < kMostGuarded && g_guarded[number].used) ++number;
  if (number == kMostGuarded || path.size() >= sizeof g_guarded[number].path) return -1;
  std::memcpy(g_guarded[number].path, path.c_str(), path.size() + 1);
  g_guarded[number].used = true;
  for (const int signal : {SIGINT, SIGTERM, SIGHUP, SIGQUIT}) {
    if (std::signal(signal, remove_temporaries) == SIG_IGN) std::signal(signal, SIG_IGN);
  }
  return number;
}

void release_temporary(int number) {
  if (number >= 0) g_guarded[number].used = false;
}

/// The mode of the file to be replaced, else that of a new file.
mode_t mode_of(const struct stat* existing) {
  if (existing != nullptr) return existing->st_mode & 07777;
  const mode_t mask = umask(0);
  umask(mask);
  return 0666 & ~mask;
}

/// Where a path leads, and whether a symbolic link leads on from there. All but the last name are resolved.
struct Step {
  std::filesystem::path directory;
  std::filesystem::path name;

  std::string path() const { return (directory / name).string(); }
};

Step step_to(const std::filesystem::path& path) {
  std::error_code error;
  const std::filesystem::path parent = path.has_parent_path() ? path.parent_path() : ".";
  const std::filesystem::path directory = std::filesystem::canonical(parent, error);
  return {error ? parent : directory, path.filename()};
}

/// The descriptor that a name in the directory of this process's open files stands for, else -1.
int descriptor_of(const Step& step) {
  std::error_code error;
  if (step.directory != std::filesystem::canonical("/proc/self/fd", error) || error) return -1;
  const std::string name = step.name.string();
  int descriptor = -1;
  const auto end = std::from_chars(name.data(), name.data() + name.size(), descriptor);
  return end.ec == std::errc() && end.ptr == name.data() + name.size() ? descriptor : -1;
}

/// Follows symbolic links to the file that they name, whether it exists or not, or to an open descriptor.
Step follow(const std::string& path) {
  constexpr int kMostLinks = 40;
  Step step = step_to(path);
  for (int links = 0; links < kMostLinks && descriptor_of(step) < 0; ++links) {
    std::error_code error;
    const std::filesystem::path next = std::filesystem::read_symlink(step.path(), error);
    if (error) break;
    step = step_to(step.directory / next);
  }
  return step;
}

/// The pattern of a temporary name in the same directory.
std::string temporary_beside(const Step& step) {
  constexpr char kPattern[] = ".XXXXXX";
  const std::string name = step.name.string();
  // Else the name leaves no room.
  const bool fits = name.size() + sizeof kPattern - 1 <= NAME_MAX;
  return (step.directory / ((fits ? name : g_program) + kPattern)).string();
}

}  // namespace

Output::Output(const std::string& path) : path_(path) {
  if (path.empty()) throw Failure(kUsageError, "the name of the output file is empty; - is standard output");
  if (path == "-") {
    path_ = "standard output";
    fd_ = STDOUT_FILENO;
    return;
  }
  const Step step = follow(path);
  target_ = step.path();
  const int descriptor = descriptor_of(step);
  if (descriptor >= 0) {
    fd_ = fcntl(descriptor, F_DUPFD_CLOEXEC, STDERR_FILENO + 1);
    if (fd_ < 0) fail();
    return;
  }
  struct stat status;
  const bool exists = stat(path.c_str(), &status) == 0;
  if (exists && !S_ISREG(status.st_mode)) {
    fd_ = open(path.c_str(), O_WRONLY | O_CLOEXEC);
    if (fd_ < 0) fail();
    return;
  }
  if (exists && access(path.c_str(), W_OK) != 0) fail();
  std::string name = temporary_beside(step);
  fd_ = mkostemp(name.data(), O_CLOEXEC);
  if (fd_ < 0) fail();
  temporary_ = name;
  guard_ = guard_temporary(temporary_);
  if (fchmod(fd_, mode_of(exists ? &status : nullptr)) != 0) {
    const int reason = errno;
    close(fd_);
    unlink(temporary_.c_str());
    release_temporary(guard_);
    errno = reason;
    fail();
  }
}

Output::~Output() {
  if (fd_ > STDERR_FILENO) close(fd_);
  if (!temporary_.empty()) unlink(temporary_.c_str());
  release_temporary(guard_);
}

void Output::write(const char* data, size_t bytes) {
  while (bytes > 0) {
    const ssize_t n = ::write(fd_, data, bytes);
    if (n < 0 && errno == EINTR) continue;
    if (n < 0 && errno == EPIPE) throw BrokenPipe();
    if (n < 0) fail();
    data += n;
    bytes -= static_cast<size_t>(n);
  }
}

void Output::commit() {
  if (fd_ <= STDERR_FILENO) return;
  const int closed = close(fd_);
  fd_ = -1;
  if (closed != 0) fail();
  if (temporary_.empty()) return;
  if (std::rename(temporary_.c_str(), target_.c_str()) != 0) fail();
  temporary_.clear();
}

bool Output::is_terminal() const {
  return isatty(fd_) != 0;
}

void Output::fail() const {
  const bool closed = errno == EBADF && fd_ <= STDERR_FILENO;
  throw Failure(kDataError, path_ + ": " + (closed ? "it is closed" : std::strerror(errno)));
}

}  // namespace lexicor_cli
