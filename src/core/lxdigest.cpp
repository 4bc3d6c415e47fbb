// SHA-256, block by block. It is asked for rarely, so that plain loops do.
#include "core/lxdigest.h"

#include <string.h>

namespace lx {

namespace {

constexpr uint32_t kRound[64] = {
    0x428a2f98, 0x71374491, 0xb5c0fbcf, 0xe9b5dba5, 0x3956c25b, 0x59f111f1, 0x923f82a4, 0xab1c5ed5,
    0xd807aa98, 0x12835b01, 0x243185be, 0x550c7dc3, 0x72be5d74, 0x80deb1fe, 0x9bdc06a7, 0xc19bf174,
    0xe49b69c1, 0xefbe4786, 0x0fc19dc6, 0x240ca1cc, 0x2de92c6f, 0x4a7484aa, 0x5cb0a9dc, 0x76f988da,
    0x983e5152, 0xa831c66d, 0xb00327c8, 0xbf597fc7, 0xc6e00bf3, 0xd5a79147, 0x06ca6351, 0x14292967,
    0x27b70a85, 0x2e1b2138, 0x4d2c6dfc, 0x53380d13, 0x650a7354, 0x766a0abb, 0x81c2c92e, 0x92722c85,
    0xa2bfe8a1, 0xa81a664b, 0xc24b8b70, 0xc76c51a3, 0xd192e819, 0xd6990624, 0xf40e3585, 0x106aa070,
    0x19a4c116, 0x1e376c08, 0x2748774c, 0x34b0bcb5, 0x391c0cb3, 0x4ed8aa4a, 0x5b9cca4f, 0x682e6ff3,
    0x748f82ee, 0x78a5636f, 0x84c87814, 0x8cc70208, 0x90befffa, 0xa4506ceb, 0xbef9a3f7, 0xc67178f2};

uint32_t rotate(uint32_t x, int n) {
  return x >> n | x << (32 - n);
}

uint32_t be32(const uint8_t* p) {
  return uint32_t{p[0]} << 24 | uint32_t{p[1]} << 16 | uint32_t{p[2]} << 8 | p[3];
}

void put_be32(uint8_t* p, uint32_t value) {
  for (int i = 0; i < 4; ++i) p[i] = static_cast<uint8_t>(value >> (24 - 8 * i));
}

}  // namespace

void Sha256::compress(const uint8_t* block) {
  uint32_t w[64];
  for (size_t i = 0; i < 16; ++i) w[i] = be32(block + 4 * i);
  for (size_t i = 16; i < 64; ++i) {
    const uint32_t s0 = rotate(w[i - 15], 7) ^ rotate(w[i - 15], 18) ^ w[i - 15] >> 3;
    const uint32_t s1 = rotate(w[i - 2], 17) ^ rotate(w[i - 2], 19) ^ w[i - 2] >> 10;
    w[i] = w[i - 16] + s0 + w[i - 7] + s1;
  }
  uint32_t a = state_[0], b = state_[1], c = state_[2], d = state_[3];
  uint32_t e = state_[4], f = state_[5], g = state_[6], h = state_[7];
  for (size_t i = 0; i < 64; ++i) {
    const uint32_t t1 =
        h + (rotate(e, 6) ^ rotate(e, 11) ^ rotate(e, 25)) + ((e & f) ^ (~e & g)) + kRound[i] + w[i];
    const uint32_t t2 = (rotate(a, 2) ^ rotate(a, 13) ^ rotate(a, 22)) + ((a & b) ^ (a & c) ^ (b & c));
    h = g, g = f, f = e, e = d + t1;
    d = c, c = b, b = a, a = t1 + t2;
  }
  const uint32_t result[8] = {a, b, c, d, e, f, g, h};
  for (int i = 0; i < 8; ++i) state_[i] += result[i];
}

void Sha256::add(const void* data, size_t bytes) {
  const uint8_t* p = static_cast<const uint8_t*>(data);
  while (bytes != 0) {
    const size_t begun = bytes_ % kBlockBytes;
    const size_t taken = bytes < kBlockBytes - begun ? bytes : kBlockBytes - begun;
    memcpy(block_ + begun, p, taken);
    bytes_ += taken;
    p += taken;
    bytes -= taken;
    if (begun + taken == kBlockBytes) compress(block_);
  }
}

void Sha256::finish(uint8_t* digest) {
  const uint64_t bits = bytes_ * 8;
  static constexpr uint8_t kPadding[kBlockBytes] = {0x80};
  const size_t begun = bytes_ % kBlockBytes;
  add(kPadding, (begun < kBlockBytes - 8 ? kBlockBytes - 8 : 2 * kBlockBytes - 8) - begun);
  uint8_t length[8];
  put_be32(length, static_cast<uint32_t>(bits >> 32));
  put_be32(length + 4, static_cast<uint32_t>(bits));
  add(length, sizeof(length));
  for (size_t i = 0; i < 8; ++i) put_be32(digest + 4 * i, state_[i]);
}

void digest_of(const Bytes (&sections)[format::kMaxSections], uint8_t* digest) {
  Sha256 sha;
  for (const Bytes& section : sections) {
    uint8_t length[4];
    put_le32(length, static_cast<uint32_t>(section.size));
    sha.add(length, sizeof(length));
    if (section.size != 0) sha.add(section.data, section.size);
  }
  sha.finish(digest);
}

}  // namespace lx
