// Damaged files: every truncation, and every byte changed.
#pragma once

#include <cstddef>

namespace lx::test {

/// Calls `use` with each damaged form of a file's bytes.
template <class Bytes, class Use>
void for_each_damage(const Bytes& whole, Use use) {
  for (size_t size = 0; size < whole.size(); ++size)
    use(Bytes(whole.begin(), whole.begin() + static_cast<std::ptrdiff_t>(size)));
  Bytes bytes = whole;
  for (auto& byte : bytes) {
    const auto sound = byte;
    for (const int value : {0x00, 0x01, 0x80, 0xFF, sound ^ 1}) {
      byte = static_cast<typename Bytes::value_type>(value);
      use(bytes);
    }
    byte = sound;
  }
}

}  // namespace lx::test
