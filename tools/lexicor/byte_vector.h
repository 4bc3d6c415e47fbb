// Sixteen bytes that are worked on together, by the compiler's vectors.
#pragma once

#include <cstdint>
#include <cstring>

namespace lexicor_cli {

using ByteVector = uint8_t __attribute__((vector_size(16)));

inline ByteVector load_bytes(const void* bytes) {
  ByteVector vector;
  std::memcpy(&vector, bytes, sizeof vector);
  return vector;
}

/// Whether a byte is not 0.
inline bool any(const ByteVector& vector) {
  uint64_t words[2];
  static_assert(sizeof words == sizeof vector);
  std::memcpy(words, &vector, sizeof words);
  return (words[0] | words[1]) != 0;
}

}  // namespace lexicor_cli
