// SHA-256 digests of files and of objects; the algorithm is the library's.
#pragma once

#include <array>
#include <cstdint>
#include <string>
#include <vector>

namespace lexicor_data {

using ByteVector = std::vector<uint8_t>;
using Digest = std::array<uint8_t, 32>;

/// Of the bytes of a file.
Digest digest_of_bytes(const ByteVector& bytes);

/// Of an object's sections, as the library takes it (core/lxdigest.h).
Digest digest_of_sections(const std::vector<ByteVector>& sections);

/// In hexadecimal, 64 digits.
std::string digest_text(const Digest& digest);

}  // namespace lexicor_data
