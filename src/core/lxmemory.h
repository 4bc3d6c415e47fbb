// Memory: every block of the library comes from the caller's allocation hook and goes back to the free hook.
#pragma once

#include "core/lxrecords.h"

namespace lx {

inline void* hook_allocate(size_t bytes) {
  return globals.allocate(globals.area->context, bytes);
}

/// A zero-filled block, or null.
void* hook_allocate_zeroed(size_t bytes);

/// Frees a block (null is ignored). False when the free hook reports failure.
inline bool hook_free(void* block) {
  return block == nullptr || globals.release(globals.area->context, block) != 0;
}

/// Owns one block. Where a failing free hook must be reported, detach the block and free it.
template <class T>
class HookPtr {
 public:
  explicit HookPtr(T* block = nullptr) : block_(block) {}
  ~HookPtr() { hook_free(block_); }
  HookPtr(const HookPtr&) = delete;
  HookPtr& operator=(const HookPtr&) = delete;

  explicit operator bool() const { return block_ != nullptr; }
  T* get() const { return block_; }
  T* operator->() const { return block_; }

  /// Gives the block up to the caller.
  T* detach() {
    T* block = block_;
    block_ = nullptr;
    return block;
  }

 private:
  T* block_;
};

/// Work space of one call: 256 bytes on the stack, a block from the hook beyond that.
class WorkBuffer {
 public:
  explicit WorkBuffer(size_t bytes)
      : block_(bytes > sizeof(local_) ? hook_allocate(bytes) : nullptr),
        data_(bytes > sizeof(local_) ? block_.get() : local_) {}

  explicit operator bool() const { return data_ != nullptr; }
  template <class T>
  T* as() const {
    return static_cast<T*>(data_);
  }

 private:
  alignas(8) unsigned char local_[256];
  HookPtr<void> block_;
  void* data_;
};

}  // namespace lx
