// Work that is parted among threads.
#pragma once

#include <algorithm>
#include <exception>
#include <system_error>
#include <thread>
#include <vector>

namespace lexicor_cli {

/// As many threads as are worth starting on this machine.
inline size_t thread_count() {
  constexpr unsigned kMost = 8;
  return std::clamp(std::thread::hardware_concurrency(), 1u, kMost);
}

/// Runs work(0) to work(count - 1), each in a thread, the last one in this thread, which waits for all. Throws what one
/// of them has thrown.
template <class Work>
void in_threads(size_t count, const Work& work) {
  std::vector<std::exception_ptr> errors(count);
  const auto guarded = [&](size_t part) {
    try {
      work(part);
    } catch (...) {
      errors[part] = std::current_exception();
    }
  };
  std::vector<std::thread> threads;
  size_t part = 0;
  try {
    for (; part + 1 < count; ++part) threads.emplace_back(guarded, part);
  } catch (const std::system_error&) {
    // No more threads are to be had: this one does the rest.
  }
  for (; part < count; ++part) guarded(part);
  for (std::thread& thread : threads) thread.join();
  for (const std::exception_ptr& error : errors) {
    if (error) std::rethrow_exception(error);
  }
}

}  // namespace lexicor_cli
