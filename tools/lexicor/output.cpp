// Writing by file descriptor, so that every failure has its reason.
#include "output.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <cstring>

#include "command.h"

namespace lexicor_cli {

namespace {

// The temporary file to remove when a signal ends the program; empty when there is none.
char g_temporary[4096];

void remove_temporary(int signal) {
  if (g_temporary[0] != 0) unlink(g_temporary);
  std::signal(signal, SIG_DFL);
  raise(signal);
}

void guard_temporary(const std::string& path) {
  if (path.size() >= sizeof g_temporary) return;
  std::memcpy(g_temporary, path.c_str(), path.size() + 1);
  for (const int signal : {SIGINT, SIGTERM, SIGHUP}) {
    if (std::signal(signal, remove_temporary) == SIG_IGN) std::signal(signal, SIG_IGN);
  }
}

/// The mode of the file to be replaced, else that of a new file.
mode_t mode_of(const struct stat* existing) {
  if (existing != nullptr) return existing->st_mode & 07777;
  const mode_t mask = umask(0);
  umask(mask);
  return 0666 & ~mask;
}

std::string real_path(const std::string& path) {
  char* resolved = realpath(path.c_str(), nullptr);
  if (resolved == nullptr) return path;
  std::string result = resolved;
  std::free(resolved);
  return result;
}

}  // namespace

Output::Output(const std::string& path) : path_(path) {
  if (path.empty() || path == "-") {
    path_ = "standard output";
    fd_ = STDOUT_FILENO;
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
  target_ = exists ? real_path(path) : path;
  std::string name = target_ + ".XXXXXX";
  fd_ = mkostemp(name.data(), O_CLOEXEC);
  if (fd_ < 0) fail();
  temporary_ = name;
  guard_temporary(temporary_);
  if (fchmod(fd_, mode_of(exists ? &status : nullptr)) != 0) {
    const int reason = errno;
    unlink(temporary_.c_str());
    errno = reason;
    fail();
  }
}

Output::~Output() {
  if (fd_ > STDERR_FILENO) close(fd_);
  if (!temporary_.empty()) unlink(temporary_.c_str());
  g_temporary[0] = 0;
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
  throw Failure(kDataError, path_ + ": " + std::strerror(errno));
}

}  // namespace lexicor_cli
