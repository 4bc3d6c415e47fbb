// An initialisation that fails: what links this calls LXInit through --wrap.
#pragma once

#include <cstdint>

namespace lx::test {

/// The code that LXInit fails with; 0: it goes on.
inline int32_t init_failure;

}  // namespace lx::test
