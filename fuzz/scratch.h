// A locale directory in a temporary place, written anew for each input, and its control file.
#pragma once

#include <unistd.h>

#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <iterator>
#include <string>
#include <vector>

#include "core/lxbytes.h"
#include "core/lxformat.h"
#include "lx.h"

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

inline constexpr uint16_t kId = 819;  // of the objects under test

/// A control file with one object of each type, all named Fuzz, and the built-in language and territory.
inline std::vector<uint8_t> control_file() {
  namespace format = lx::format;
  const struct {
    uint16_t id;
    uint8_t type;
    const char* name;
  } records[] = {{1, LX_LANGUAGE, "English"}, {kId, LX_LANGUAGE, "Fuzz"}, {1, LX_TERRITORY, "UnitedStates"},
                 {kId, LX_TERRITORY, "Fuzz"}, {kId, LX_CODEPAGE, "Fuzz"}, {kId, LX_SORT, "Fuzz"}};
  const size_t table_bytes = std::size(records) * format::ControlRecord::kBytes;
  std::vector<uint8_t> file(format::kHeaderBytes + table_bytes);
  format::Header header;
  header.sections = 1;
  header.section[0] = {static_cast<uint16_t>(table_bytes), format::kHeaderBytes};
  header.write(file.data());
  uint8_t* at = file.data() + format::kHeaderBytes;
  for (const auto& listed : records) {
    format::ControlRecord record{listed.id, listed.type};
    strcpy(record.name, listed.name);
    record.write(at);
    at += record.kBytes;
  }
  return file;
}

inline std::string file_name(int type) {
  return std::string(lx::format::kTypePrefix[type]) + "_00819.nls";
}

}  // namespace fuzz
