// Threads that take the next step until none is left.
#include "parallel.h"

#include <algorithm>
#include <atomic>
#include <exception>
#include <thread>
#include <vector>

namespace lexicor_data {

void for_each_parallel(size_t count, const std::function<void(size_t)>& step) {
  std::vector<std::exception_ptr> thrown(count);
  std::atomic<size_t> next{0};
  const auto work = [&] {
    for (size_t i = next++; i < count; i = next++) {
      try {
        step(i);
      } catch (...) {
        thrown[i] = std::current_exception();
      }
    }
  };
  std::vector<std::thread> helpers;
  const size_t processors = std::max(1u, std::thread::hardware_concurrency());
  while (helpers.size() + 1 < std::min(processors, count)) helpers.emplace_back(work);
  work();
  for (std::thread& helper : helpers) helper.join();
  for (const std::exception_ptr& exception : thrown)
    if (exception) std::rethrow_exception(exception);
}

}  // namespace lexicor_data
