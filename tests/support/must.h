// A rule that ends a fuzzer or a test when it does not hold.
#pragma once

#include <stdexcept>

namespace lx::test {

inline void must(bool holds, const char* rule) {
  if (!holds) throw std::logic_error(rule);
}

}  // namespace lx::test
