// Keeps a result that nothing uses.
#pragma once

namespace bench {

/// The compiler computes the value as if it were used.
template <class Value>
void keep(Value value) {
  asm volatile("" : : "r"(value));
}

}  // namespace bench
