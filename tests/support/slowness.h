// A build with sanitizers is ten times slower, and looks for other faults: it takes every kSlowness-th round of a
// model, byte to damage and object of the shipped directory. One for 32 bits, which differs in its types only, takes
// every second one.
#pragma once

namespace lx::test {

#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
constexpr int kSlowness = 8;
#elif !defined(__LP64__)
constexpr int kSlowness = 2;
#else
constexpr int kSlowness = 1;
#endif

}  // namespace lx::test
