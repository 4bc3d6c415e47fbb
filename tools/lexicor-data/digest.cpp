// The tools' forms of the library's digests.
#include "digest.h"

#include <algorithm>

#include "core/lxdigest.h"

namespace lexicor_data {

Digest digest_of_bytes(const ByteVector& bytes) {
  lx::Sha256 sha;
  sha.add(bytes.data(), bytes.size());
  Digest digest;
  sha.finish(digest.data());
  return digest;
}

Digest digest_of_sections(const std::vector<ByteVector>& sections) {
  lx::Bytes places[lx::format::kMaxSections];
  for (size_t i = 0; i < std::min(sections.size(), lx::format::kMaxSections); ++i)
    places[i] = {sections[i].data(), sections[i].size()};
  Digest digest;
  lx::digest_of(places, digest.data());
  return digest;
}

std::string digest_text(const Digest& digest) {
  constexpr char kDigits[] = "0123456789abcdef";
  std::string text;
  for (const uint8_t byte : digest) {
    text += kDigits[byte >> 4];
    text += kDigits[byte & 0xF];
  }
  return text;
}

}  // namespace lexicor_data
