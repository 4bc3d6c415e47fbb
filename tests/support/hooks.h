// Allocation hooks for tests: they count, fail where they are told to, and know every block that is out.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <map>
#include <mutex>

namespace lx::test {

/// Give `Hooks::allocate`, `Hooks::release` and the object's address to LXInit.
class Hooks {
 public:
  /// The allocation that fails, 1 for the first one; 0: none. Every later one fails too when `from_then_on` is
  /// set.
  void fail_at(size_t call, bool from_then_on = false) {
    fail_at_ = call;
    from_then_on_ = from_then_on;
    calls_ = 0;
    failed_ = false;
    largest_ = 0;
  }
  /// Makes every free report failure; the block is given back all the same.
  void fail_frees(bool fail) { fail_frees_ = fail; }

  size_t calls() const { return calls_; }              // allocations asked for
  size_t live_blocks() const { return live_.size(); }  // not yet freed
  size_t wrong_frees() const { return wrong_frees_; }  // of blocks that were not out
  bool failed() const { return failed_; }              // whether an allocation was refused
  size_t largest() const { return largest_; }          // most bytes asked for at once since fail_at()

  static void* allocate(void* context, size_t bytes) {
    Hooks& self = *static_cast<Hooks*>(context);
    const std::lock_guard<std::mutex> lock(self.mutex_);
    ++self.calls_;
    if (bytes > self.largest_) self.largest_ = bytes;
    if (self.fail_at_ != 0 &&
        (self.calls_ == self.fail_at_ || (self.from_then_on_ && self.calls_ > self.fail_at_))) {
      self.failed_ = true;
      return nullptr;
    }
    void* block = malloc(bytes);
    self.live_[block] = bytes;
    return block;
  }
  static int32_t release(void* context, void* block) {
    Hooks& self = *static_cast<Hooks*>(context);
    const std::lock_guard<std::mutex> lock(self.mutex_);
    if (self.live_.erase(block) == 0) {
      ++self.wrong_frees_;
      return 0;
    }
    free(block);
    return self.fail_frees_ ? 0 : 1;
  }

 private:
  std::mutex mutex_;
  std::map<void*, size_t> live_;
  size_t calls_ = 0;
  size_t fail_at_ = 0;
  size_t wrong_frees_ = 0;
  size_t largest_ = 0;
  bool from_then_on_ = false;
  bool fail_frees_ = false;
  bool failed_ = false;
};

}  // namespace lx::test
