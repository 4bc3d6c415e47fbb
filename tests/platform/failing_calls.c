/* Loaded in front of a program (LD_PRELOAD): makes one of its calls of the operating system fail. Calls count that work
 * on files below FAULT_ROOT, standard output among them where it is one.
 *   FAULT_AT     the call that fails, or with FAULT_ON set the first one that does; 0: none
 *   FAULT_ERRNO  the error; 0: reads and writes move one byte, and other calls work
 *   FAULT_REPORT a file that gets the number of calls, and of descriptors that are still open at the end */
#define _GNU_SOURCE
#include <dlfcn.h>
#include <errno.h>
#include <fcntl.h>
#include <limits.h>
#include <stdarg.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <sys/uio.h>
#include <unistd.h>

static const char *root, *report;
static int at, from_then_on, error, calls;

__attribute__((constructor)) static void begin(void) {
  const char* number = getenv("FAULT_AT");
  root = getenv("FAULT_ROOT");
  report = getenv("FAULT_REPORT");
  at = number != NULL ? atoi(number) : 0;
  number = getenv("FAULT_ERRNO");
  error = number != NULL ? atoi(number) : 0;
  from_then_on = getenv("FAULT_ON") != NULL;
}

static int is_below_root(const char* path) {
  char full[PATH_MAX];
  if (root == NULL || path == NULL) return 0;
  if (path[0] != '/') {
    if (syscall(SYS_getcwd, full, sizeof(full)) < 0) return 0;
    path = full;
  }
  return strncmp(path, root, strlen(root)) == 0;
}
static int is_watched(int descriptor) {
  char name[32], path[PATH_MAX];
  const int saved = errno;
  snprintf(name, sizeof(name), "/proc/self/fd/%d", descriptor);
  const long bytes = syscall(SYS_readlink, name, path, sizeof(path) - 1);
  errno = saved;
  if (bytes <= 0) return 0;
  path[bytes] = 0;
  return path[0] == '/' && is_below_root(path);
}
/* Whether this call fails. */
static int hit(int counts) {
  if (!counts) return 0;
  ++calls;
  if (at == 0 || (from_then_on ? calls < at : calls != at)) return 0;
  errno = error;
  return 1;
}
static int fails(int counts) {
  return hit(counts) && error != 0;
}

__attribute__((destructor)) static void end(void) {
  char text[64];
  int open_ones = 0;
  if (report == NULL) return;
  for (int descriptor = 3; descriptor < 64; ++descriptor) open_ones += is_watched(descriptor);
  const int to = (int)syscall(SYS_openat, AT_FDCWD, report, O_WRONLY | O_CREAT | O_TRUNC, 0600);
  syscall(SYS_write, to, text, snprintf(text, sizeof(text), "%d %d\n", calls, open_ones));
  syscall(SYS_close, to);
}

#define REAL(NAME) ((__typeof__(&NAME))dlsym(RTLD_NEXT, #NAME))
#define CALL(RESULT, NAME, FAILED, COUNTS, PARAMETERS, ARGUMENTS) \
  RESULT NAME PARAMETERS {                                        \
    return fails(COUNTS) ? FAILED : REAL(NAME) ARGUMENTS;         \
  }

CALL(int, creat, -1, is_below_root(path), (const char* path, mode_t mode), (path, mode))
CALL(int, creat64, -1, is_below_root(path), (const char* path, mode_t mode), (path, mode))
CALL(int, fstat, -1, is_watched(fd), (int fd, struct stat* status), (fd, status))
CALL(int, fstat64, -1, is_watched(fd), (int fd, struct stat64* status), (fd, status))
CALL(off_t, lseek, -1, is_watched(fd), (int fd, off_t offset, int whence), (fd, offset, whence))
CALL(off64_t, lseek64, -1, is_watched(fd), (int fd, off64_t offset, int whence), (fd, offset, whence))
CALL(int, mkostemp, -1, is_below_root(name), (char* name, int flags), (name, flags))
CALL(int, mkostemp64, -1, is_below_root(name), (char* name, int flags), (name, flags))
CALL(int, fchmod, -1, is_watched(fd), (int fd, mode_t mode), (fd, mode))
CALL(int, rename, -1, is_below_root(to), (const char* from, const char* to), (from, to))
CALL(int, unlink, -1, is_below_root(path), (const char* path), (path))
CALL(FILE*, fopen, NULL, is_below_root(path), (const char* path, const char* mode), (path, mode))
CALL(FILE*, fopen64, NULL, is_below_root(path), (const char* path, const char* mode), (path, mode))

#define OPEN(NAME)                                                          \
  int NAME(const char* path, int flags, ...) {                              \
    va_list arguments;                                                      \
    va_start(arguments, flags);                                             \
    const mode_t mode = (flags & O_CREAT) ? va_arg(arguments, mode_t) : 0;  \
    va_end(arguments);                                                      \
    return fails(is_below_root(path)) ? -1 : REAL(NAME)(path, flags, mode); \
  }
OPEN(open)
OPEN(open64)

/* A descriptor is gone when closing it fails. */
int close(int fd) {
  const int counts = is_watched(fd), closed = (int)syscall(SYS_close, fd);
  return fails(counts) ? -1 : closed;
}
int fclose(FILE* file) {
  const int counts = is_watched(fileno(file)), closed = REAL(fclose)(file);
  return fails(counts) ? EOF : closed;
}
ssize_t read(int fd, void* buffer, size_t bytes) {
  if (!hit(is_watched(fd))) return syscall(SYS_read, fd, buffer, bytes);
  return error != 0 ? -1 : syscall(SYS_read, fd, buffer, bytes != 0 ? 1 : 0);
}
ssize_t write(int fd, const void* buffer, size_t bytes) {
  if (!hit(is_watched(fd))) return syscall(SYS_write, fd, buffer, bytes);
  return error != 0 ? -1 : syscall(SYS_write, fd, buffer, bytes != 0 ? 1 : 0);
}
ssize_t writev(int fd, const struct iovec* pieces, int count) {
  if (!hit(is_watched(fd))) return syscall(SYS_writev, fd, pieces, count);
  return error != 0 ? -1 : syscall(SYS_write, fd, pieces[0].iov_base, pieces[0].iov_len != 0 ? 1 : 0);
}
