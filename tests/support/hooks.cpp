#include "support/hooks.h"

#include <cstdlib>

namespace lx::test {

void Hooks::fail_at(size_t call, bool from_then_on) {
  fail_at_ = call;
  from_then_on_ = from_then_on;
  calls_ = 0;
  failed_ = false;
  largest_ = 0;
}

void* Hooks::allocate(void* context, size_t bytes) {
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

int32_t Hooks::release(void* context, void* block) {
  Hooks& self = *static_cast<Hooks*>(context);
  const std::lock_guard<std::mutex> lock(self.mutex_);
  if (self.live_.erase(block) == 0) {
    ++self.wrong_frees_;
    return 0;
  }
  free(block);
  return self.fail_frees_ ? 0 : 1;
}

}  // namespace lx::test
