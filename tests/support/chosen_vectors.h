// Runs with one of the choices of loops that the processor has, in place of the best one.
#pragma once

#include "codepage/lxvector.h"

namespace lx::test {

class ChosenVectors {
 public:
  /// Each of them in turn.
  explicit ChosenVectors(size_t n) {
    const Vectors* choices[kMostVectors];
    const size_t count = vectors_here(choices);
    vectors = choices[n % count];
  }
  ChosenVectors(const ChosenVectors&) = delete;
  ~ChosenVectors() { vectors = used_; }

 private:
  const Vectors* const used_ = vectors;
};

}  // namespace lx::test
