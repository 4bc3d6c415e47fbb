// Reading and writing of the common header and its sections. Sections stand in order, each at a multiple of
// four; an absent middle section has size 0 and the offset of the next one.
#include "object_file.h"

#include <algorithm>
#include <iterator>
#include <stdexcept>

#include "core/lxbytes.h"
#include "core/lxformat.h"
#include "source_error.h"

namespace lexicor_data {
namespace {

namespace format = lx::format;

void align4(ByteVector& bytes) {
  while (bytes.size() % 4 != 0) bytes.push_back(0);
}

bool is_line(const std::string& text) {
  return std::none_of(text.begin(), text.end(),
                      [](char c) { return static_cast<uint8_t>(c) < ' ' || c == 0x7F; });
}

/// What stands behind the sections, when it is a line of text.
std::string text_behind(const ByteVector& bytes, size_t end) {
  end = (end + 3) / 4 * 4;
  if (end >= bytes.size()) return "";
  const std::string text(bytes.begin() + static_cast<std::ptrdiff_t>(end), bytes.end());
  return is_line(text) ? text : "";
}

}  // namespace

ByteVector write_object(const ObjectFile& object) {
  if (object.sections.empty() || object.sections.size() > format::kMaxSections)
    throw std::logic_error("an object has 1 to 4 sections");
  ByteVector out(format::kHeaderBytes);
  format::Header header;
  header.format = object.version << format::Header::kVersionShift;
  header.sections = static_cast<uint16_t>(object.sections.size());
  header.maker = format::Header::kMaker;
  header.compiler = kCompilerVersion;
  const Digest digest = digest_of_sections(object.sections);
  std::copy(digest.begin(), digest.end(), header.digest);
  for (size_t i = 0; i < object.sections.size(); ++i) {
    const ByteVector& section = object.sections[i];
    if (section.size() > format::kMaxSectionBytes) throw std::logic_error("a section is too large");
    align4(out);
    header.section[i] = {static_cast<uint16_t>(section.size()), static_cast<uint32_t>(out.size())};
    out.insert(out.end(), section.begin(), section.end());
  }
  if (!object.made_from.empty() && is_line(object.made_from)) {
    align4(out);
    out.insert(out.end(), object.made_from.begin(), object.made_from.end());
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
  size_t end = 0;
  for (size_t i = 0; i < header.sections; ++i) {
    const format::Header::Section& place = header.section[i];
    if (!file.holds(place.offset, place.bytes)) fail("section " + std::to_string(i) + " lies outside the file");
    const uint8_t* begin = bytes.data() + place.offset;
    object.sections.emplace_back(begin, begin + place.bytes);
    end = std::max<size_t>(end, place.offset + place.bytes);
  }
  object.made_from = text_behind(bytes, end);
  if (header.maker != format::Header::kMaker) return object;
  object.compiler = header.compiler;
  std::copy(std::begin(header.digest), std::end(header.digest), object.digest.begin());
  return object;
}

}  // namespace lexicor_data
