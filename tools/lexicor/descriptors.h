// The descriptors that a program begins with.
#pragma once

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>

namespace lexicor_cli {

/// Opens what is closed of the descriptors 0, 1 and 2, so that no file that is opened later takes their place.
/// Reading from the first and writing to the others stay errors. A program calls it before anything else.
inline void open_closed_descriptors() {
  for (const int descriptor : {STDIN_FILENO, STDOUT_FILENO, STDERR_FILENO}) {
    if (fcntl(descriptor, F_GETFD) >= 0 || errno != EBADF) continue;
    // The lowest free descriptor is the one that is opened.
    if (open("/dev/null", descriptor == STDIN_FILENO ? O_WRONLY : O_RDONLY) != descriptor) _exit(1);
  }
}

}  // namespace lexicor_cli
