// SHA-256 (FIPS 180-4): the checksum that an object's header records of its source.
#pragma once

#include <array>
#include <cstdint>
#include <string_view>

namespace lexicor_data {

std::array<uint8_t, 32> sha256(std::string_view text);

}  // namespace lexicor_data
