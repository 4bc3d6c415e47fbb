// Damaged files: truncations, and bytes changed.
#pragma once

#include <cstddef>

namespace lx::test {

/// Calls `use` with each damaged form of a file's bytes: every `step`th truncation, and byte changed.
template <class Bytes, class Use>
void for_each_damage(const Bytes& whole, Use use, size_t step = 1) {
  for (size_t size = 0; size < whole.size(); size += step)
    use(Bytes(whole.begin(), whole.begin() + static_cast<std::ptrdiff_t>(size)));
  Bytes bytes = whole;
  for (size_t at = 0; at < bytes.size(); at += step) {
    auto& byte = bytes[at];
    const auto sound = byte;
    for (const int value : {0x00, 0x01, 0x80, 0xFF, sound ^ 1}) {
      byte = static_cast<typename Bytes::value_type>(value);
      use(bytes);
    }
    byte = sound;
  }
}

}  // namespace lx::test
