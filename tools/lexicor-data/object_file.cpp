// Reading and writing of the common header and its sections. Sections stand in order, each at a multiple of
// four; an absent middle section has size 0 and the offset of the next one.
#include "object_file.h"

#include <cstdio>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <stdexcept>

#include "core/lxbytes.h"
#include "core/lxformat.h"
#include "sha256.h"
#include "ucm.h"

namespace lexicor_data {
namespace {

namespace format = lx::format;

constexpr char kOriginPrefix[] = "lexicor-data 1 ";
constexpr size_t kOriginDigestBytes = 8;

}  // namespace

std::string origin_of(const std::string& canonical_source) {
  const auto digest = sha256(canonical_source);
  std::string origin = kOriginPrefix;
  for (size_t i = 0; i < kOriginDigestBytes; ++i) {
    char hex[3];
    std::snprintf(hex, sizeof hex, "%02x", digest[i]);
    origin += hex;
  }
  return origin;
}

bool is_own_origin(const std::string& origin) {
  return origin.compare(0, std::strlen(kOriginPrefix), kOriginPrefix) == 0;
}

ByteVector write_object(const ObjectFile& object) {
  if (object.sections.empty() || object.sections.size() > format::kMaxSections ||
      object.origin.size() > sizeof(format::Header::origin)) {
    throw std::logic_error("an object has 1 to 4 sections and a short origin");
  }
  ByteVector out(format::kHeaderBytes);
  format::Header header;
  header.format = object.version << format::Header::kVersionShift;
  header.sections = static_cast<uint16_t>(object.sections.size());
  object.origin.copy(header.origin, sizeof(header.origin));
  for (size_t i = 0; i < object.sections.size(); ++i) {
    const ByteVector& section = object.sections[i];
    if (section.size() > format::kMaxSectionBytes) throw std::logic_error("a section is too large");
    while (out.size() % 4 != 0) out.push_back(0);
    header.section[i] = {static_cast<uint16_t>(section.size()), static_cast<uint32_t>(out.size())};
    out.insert(out.end(), section.begin(), section.end());
  }
  header.write(out.data());
  return out;
}

ObjectFile read_object(const ByteVector& bytes, const std::string& file_name) {
  auto fail = [&](const std::string& what) { throw SourceError(file_name, 0, 0, what); };
  if (bytes.empty()) fail("the file is empty");
  if (bytes.size() < format::kHeaderBytes) fail("shorter than the 76-byte header");
  const format::Header header = format::Header::read(bytes.data());
  if (header.magic != format::kMagic) fail("the magic number is wrong");
  ObjectFile object;
  object.version = header.version();
  if (header.sections < 1 || header.sections > format::kMaxSections) fail("the section count is not 1 to 4");
  const lx::Bytes file{bytes.data(), bytes.size()};
  for (size_t i = 0; i < header.sections; ++i) {
    const format::Header::Section& place = header.section[i];
    if (!file.holds(place.offset, place.bytes)) fail("section " + std::to_string(i) + " lies outside the file");
    const uint8_t* begin = bytes.data() + place.offset;
    object.sections.emplace_back(begin, begin + place.bytes);
  }
  object.origin.assign(header.origin, strnlen(header.origin, sizeof(header.origin)));
  return object;
}

ByteVector read_file(const std::string& path) {
  std::ifstream in(path, std::ios::binary);
  if (!in) throw SourceError(path, 0, 0, "cannot be opened");
  ByteVector bytes{std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>()};
  if (in.bad()) throw SourceError(path, 0, 0, "cannot be read");
  return bytes;
}

void write_file(const std::string& path, const ByteVector& bytes) {
  const std::string temporary = path + ".tmp";
  std::error_code error;
  {
    std::ofstream out(temporary, std::ios::binary | std::ios::trunc);
    out.write(reinterpret_cast<const char*>(bytes.data()), static_cast<std::streamsize>(bytes.size()));
    out.close();
    if (!out) {
      std::filesystem::remove(temporary, error);
      throw SourceError(path, 0, 0, "cannot be written");
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
