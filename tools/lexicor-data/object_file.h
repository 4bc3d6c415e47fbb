// The container that every file of a locale directory shares: the common header, up to four sections, and behind them
// what they were made from. Loaders read neither that nor the header's identity: the version of the compiler's output
// and the digest of the sections.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "digest.h"

namespace lexicor_data {

/// The version of what this compiler writes. It counts up whenever the same source gives other bytes.
inline constexpr uint16_t kCompilerVersion = 2;

struct ObjectFile {
  std::vector<ByteVector> sections;  ///< 1 to 4
  uint32_t version = 2;              ///< the format version of the header
  std::string made_from;             ///< one line about the source; one with control characters is not written
  uint16_t compiler = 0;             ///< the version of the compiler's output; 0: not this compiler's
  Digest digest{};                   ///< as the header records it
};

/// The bytes of the file, with its identity. Every section holds at most kMaxSectionBytes.
ByteVector write_object(const ObjectFile& object);

/// Reads the container; a bad header or a section outside the file is a SourceError.
ObjectFile read_object(const ByteVector& bytes, const std::string& file_name);

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
