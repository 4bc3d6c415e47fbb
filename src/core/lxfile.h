// Files: what the other rooms use beyond the exported functions.
#pragma once

#include "core/lxrecords.h"

namespace lx {

/// Opens for reading through the global area's file context. A pipe, which would wait for a writer, is refused.
LXFile* open_for_reading(const char* path, int32_t* rc);

/// Closes a file when its scope ends.
class FileCloser {
 public:
  explicit FileCloser(LXFile* file) : file_(file) {}
  ~FileCloser() {
    if (file_ != nullptr) LXCloseFile(file_, 0);
  }
  FileCloser(const FileCloser&) = delete;
  FileCloser& operator=(const FileCloser&) = delete;

 private:
  LXFile* file_;
};

}  // namespace lx
