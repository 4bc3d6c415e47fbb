// LEXICOR_TEST_VECTORS names the choice of loops that a test program runs with, in place of the best one.
#include <cstdio>
#include <cstdlib>
#include <cstring>

#include "codepage/lxvector.h"

namespace lx::test {
namespace {

const bool forced = [] {
  const char* const name = std::getenv("LEXICOR_TEST_VECTORS");
  if (name == nullptr) return false;
  const Vectors* choices[kMostVectors];
  for (size_t n = vectors_here(choices); n-- > 0;)
    if (std::strcmp(choices[n]->name, name) == 0) vectors = choices[n];
  if (std::strcmp(vectors->name, name) != 0) {
    std::fprintf(stderr, "this processor has no %s\n", name);
    std::exit(77);
  }
  return true;
}();

}  // namespace
}  // namespace lx::test
