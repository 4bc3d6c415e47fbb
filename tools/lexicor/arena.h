// Memory for texts that stay where they are until all of them are forgotten together.
#pragma once

#include <cstddef>
#include <memory>
#include <vector>

namespace lexicor_cli {

class Arena {
 public:
  /// Bytes behind any text that may be read, and mean nothing.
  static constexpr size_t kSlack = 8;

  Arena() = default;
  Arena(const Arena&) = delete;
  Arena& operator=(const Arena&) = delete;

  /// Room for so many bytes, which belong to the caller as far as take() says, and else to the next call.
  char* room(size_t bytes) {
    while (at_ < blocks_.size() && blocks_[at_].size - used_ < bytes) leave_block();
    if (at_ == blocks_.size()) add_block(bytes);
    return blocks_[at_].data.get() + used_;
  }
  /// Keeps the first bytes of the room.
  void take(size_t bytes) {
    used_ += bytes;
    kept_ += bytes;
  }
  /// Forgets what is kept, and keeps the memory.
  void clear() { at_ = used_ = kept_ = 0; }
  /// The bytes that are kept.
  size_t bytes() const { return kept_; }

 private:
  struct Freer {
    void operator()(char* data) const;
  };
  struct Block {
    std::unique_ptr<char, Freer> data;
    size_t size;
  };

  void leave_block();
  void add_block(size_t bytes);

  std::vector<Block> blocks_;
  size_t at_ = 0, used_ = 0;  // the block that is filled, and how far
  size_t kept_ = 0, held_ = 0;
};

}  // namespace lexicor_cli
