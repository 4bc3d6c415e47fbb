// Steps that do not need each other, on all processors.
#pragma once

#include <cstddef>
#include <functional>

namespace lexicor_data {

/// Runs step(0) to step(count - 1), in any order and at the same time. When steps throw, the exception of the first of
/// them is thrown again, behind the last step.
void for_each_parallel(size_t count, const std::function<void(size_t)>& step);

}  // namespace lexicor_data
