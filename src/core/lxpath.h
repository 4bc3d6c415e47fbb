// Parts of a path, with buffers of the sizes that the split functions need.
#pragma once

namespace lx {

struct PathParts {
  char drive[4];
  char directory[256];
  char file[15];
  char extension[5];
};

}  // namespace lx
