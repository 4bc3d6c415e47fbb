// A locale directory in a temporary place, written anew for each input.
#pragma once

#include <unistd.h>

#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <string>

namespace fuzz {

class Scratch {
 public:
  Scratch() {
    char pattern[] = P_tmpdir "/lexicor-fuzz-XXXXXX";
    if (mkdtemp(pattern) == nullptr) abort();
    path_ = pattern;
  }
  const std::string& path() const { return path_; }

  void write(const std::string& name, const uint8_t* data, size_t bytes) const {
    FILE* file = fopen((path_ + "/" + name).c_str(), "wb");
    if (file == nullptr) abort();
    fwrite(data, 1, bytes, file);
    fclose(file);
  }

 private:
  std::string path_;
};

}  // namespace fuzz
