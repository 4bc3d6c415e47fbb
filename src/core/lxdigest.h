// Digests of objects: SHA-256 (FIPS 180-4), and what of an object it is taken of.
#pragma once

#include <stddef.h>
#include <stdint.h>

#include "core/lxbytes.h"
#include "core/lxformat.h"

namespace lx {

class Sha256 {
 public:
  static constexpr size_t kBytes = 32;

  void add(const void* data, size_t bytes);
  /// Writes the digest of what was added; nothing can be added any more.
  void finish(uint8_t* digest);

 private:
  static constexpr size_t kBlockBytes = 64;
  void compress(const uint8_t* block);

  uint32_t state_[8] = {0x6a09e667, 0xbb67ae85, 0x3c6ef372, 0xa54ff53a,
                        0x510e527f, 0x9b05688c, 0x1f83d9ab, 0x5be0cd19};
  uint64_t bytes_ = 0;
  uint8_t block_[kBlockBytes];
};

/// The digest of an object: of the lengths and the bytes of its four sections. A section that is not there has the
/// length 0. The header, and what stands behind the sections, have no part in it.
void digest_of(const Bytes (&sections)[format::kMaxSections], uint8_t* digest);

}  // namespace lx
