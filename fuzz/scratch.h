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
  std::vector<uint8_t> file(format::kHeaderBytes + std::size(records) * format::kRecordBytes);
  lx::put_le32(file.data(), format::kMagic);
  lx::put_le16(file.data() + format::kHeaderSections, 1);
  lx::put_le16(file.data() + format::header_section_size(0),
               static_cast<uint16_t>(std::size(records) * format::kRecordBytes));
  lx::put_le32(file.data() + format::header_section_offset(0), format::kHeaderBytes);
  uint8_t* at = file.data() + format::kHeaderBytes;
  for (const auto& record : records) {
    lx::put_le16(at + format::kRecordId, record.id);
    at[format::kRecordType] = record.type;
    strcpy(reinterpret_cast<char*>(at) + format::kRecordName, record.name);
    at += format::kRecordBytes;
  }
  return file;
}

inline std::string file_name(int type) {
  return std::string(lx::format::kTypePrefix[type]) + "_00819.nls";
}

}  // namespace fuzz
