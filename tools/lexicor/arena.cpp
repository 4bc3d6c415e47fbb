// Blocks grow with what is held. Large ones ask for large pages: sorting visits texts in no order, and finds few of
// them by small ones without a walk through the page tables.
#include "arena.h"

#include <sys/mman.h>

#include <algorithm>
#include <cstdlib>
#include <new>

namespace lexicor_cli {

namespace {

constexpr size_t kFirstBlock = 64 * 1024;
constexpr size_t kLargePage = 2 * 1024 * 1024;
constexpr size_t kLastBlock = 4 * kLargePage;

}  // namespace

void Arena::Freer::operator()(char* data) const {
  std::free(data);
}

/// Goes on to the next block. One that keeps nothing is given back: it was too small for a long text, and the texts
/// behind it may be longer yet.
void Arena::leave_block() {
  if (used_ != 0) {
    ++at_;
    used_ = 0;
  } else {
    held_ -= blocks_[at_].size + kSlack;
    blocks_.erase(blocks_.begin() + static_cast<std::ptrdiff_t>(at_));
  }
}

void Arena::add_block(size_t bytes) {
  size_t size = std::max(bytes, std::clamp(held_, kFirstBlock, kLastBlock)) + kSlack;
  const bool large = size >= kLargePage;
  if (large) size = (size + kLargePage - 1) & ~(kLargePage - 1);
  char* const data = static_cast<char*>(large ? std::aligned_alloc(kLargePage, size) : std::malloc(size));
  if (data == nullptr) throw std::bad_alloc();
  blocks_.push_back({std::unique_ptr<char, Freer>(data), size - kSlack});
  if (large) madvise(data, size, MADV_HUGEPAGE);
  held_ += size;
  used_ = 0;
}

}  // namespace lexicor_cli
