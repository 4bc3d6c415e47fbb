#include "files.h"

#include <cerrno>
#include <cstring>
#include <filesystem>
#include <fstream>

#include "source_error.h"

namespace lexicor_data {
namespace {

constexpr size_t kMostBytes = size_t{1} << 30;  // a device may have no end

template <class Bytes>
Bytes read(const std::string& path) {
  std::ifstream in(path, std::ios::binary);
  Bytes bytes;
  for (char block[1 << 16]; in.read(block, sizeof block), in.gcount() > 0;) {
    if (bytes.size() >= kMostBytes) throw SourceError(path, 0, 0, "is larger than 1 GB");
    bytes.insert(bytes.end(), block, block + in.gcount());
  }
  // The end of a file fails too; a directory opens, and is bad when it is read.
  if (!in.eof()) throw SourceError(path, 0, 0, std::strerror(errno));
  return bytes;
}

}  // namespace

ByteVector read_file(const std::string& path) {
  return read<ByteVector>(path);
}
std::string read_text(const std::string& path) {
  return read<std::string>(path);
}

std::istringstream open_source(const std::string& path) {
  return std::istringstream(read_text(path));
}

void write_file(const std::string& path, const ByteVector& bytes) {
  const std::string temporary = path + ".tmp";
  std::error_code error;
  {
    std::ofstream out(temporary, std::ios::binary | std::ios::trunc);
    out.write(reinterpret_cast<const char*>(bytes.data()), static_cast<std::streamsize>(bytes.size()));
    out.close();
    if (!out) {
      const std::string reason = std::strerror(errno);
      std::filesystem::remove(temporary, error);
      throw SourceError(path, 0, 0, "cannot be written: " + reason);
    }
  }
  std::filesystem::rename(temporary, path, error);
  if (error) {
    std::error_code ignored;
    std::filesystem::remove(temporary, ignored);
    throw SourceError(path, 0, 0, "cannot be written: " + error.message());
  }
}

}  // namespace lexicor_data
