// The container that every file of a locale directory shares: the common header and up to four sections. The
// header's unread bytes record, as ASCII, the compiler's version and the start of the SHA-256 of the object's
// canonical source, that is, of what `lexicor-data dump` prints for it.
#pragma once

#include <array>
#include <cstdint>
#include <string>
#include <vector>

namespace lexicor_data {

using ByteVector = std::vector<uint8_t>;

struct ObjectFile {
  std::vector<ByteVector> sections;  ///< 1 to 4
  uint32_t version = 2;              ///< the format version of the header
  std::string origin;                ///< the unread bytes up to the first null
};

/// "lexicor-data 1 " and the first eight bytes of the checksum of a canonical source, in hexadecimal.
std::string origin_of(const std::string& canonical_source);

/// Whether an origin was written by origin_of, for whatever source.
bool is_own_origin(const std::string& origin);

/// The bytes of the file. Every section holds at most kMaxSectionBytes.
ByteVector write_object(const ObjectFile& object);

/// Reads the container; a bad header or a section outside the file is a SourceError.
ObjectFile read_object(const ByteVector& bytes, const std::string& file_name);

ByteVector read_file(const std::string& path);

/// Writes under a temporary name and renames, so that an interrupted run leaves no half file.
void write_file(const std::string& path, const ByteVector& bytes);

/// A record of the format behind the others, and the one at an offset.
template <class Record>
void append_record(ByteVector& out, const Record& record) {
  out.resize(out.size() + Record::kBytes);
  record.write(&out[out.size() - Record::kBytes]);
}
template <class Record>
Record record_at(const ByteVector& bytes, size_t offset) {
  return Record::read(&bytes[offset]);
}

inline void append_le16(ByteVector& out, uint16_t v) {
  out.push_back(static_cast<uint8_t>(v));
  out.push_back(static_cast<uint8_t>(v >> 8));
}
inline void append_le32(ByteVector& out, uint32_t v) {
  append_le16(out, static_cast<uint16_t>(v));
  append_le16(out, static_cast<uint16_t>(v >> 16));
}

}  // namespace lexicor_data
