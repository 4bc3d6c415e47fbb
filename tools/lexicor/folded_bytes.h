// Binary order without letter case, as the bytes of a key.
#pragma once

#include <lx.h>

#include <array>
#include <cstdint>
#include <string_view>

#include "codepage.h"

namespace lexicor_cli {

/// Keys whose order is that of the library's comparison in binary order without letter case. A thread has one.
class FoldedBytes {
  static constexpr size_t kMostGrowth = 8;

 public:
  /// The longest text that has a key, in bytes.
  static constexpr size_t kMostText = INT32_MAX / kMostGrowth;

  explicit FoldedBytes(const Codepage& codepage);

  /// Whether there are such keys. Where shift states count, the comparison follows no order of keys.
  bool possible() const { return possible_; }
  /// The room that the key of a text may need, in bytes.
  static size_t key_room(std::string_view text) { return kMostGrowth * text.size(); }
  /// Writes the key of a text; returns its bytes.
  size_t write_key(std::string_view text, char* room);

 private:
  static constexpr size_t kRemembered = 1024;  // characters, a power of two

  /// A character of several bytes, and what it is folded to.
  struct Char {
    uint32_t code;
    char folded[4];
    uint8_t bytes;  // 0: none
  };

  void learn_single_bytes();
  const Char& fold(const char* text, size_t bytes);

  const Codepage& codepage_;
  bool possible_ = false;
  bool upper_ = false;  // the language's special mappings to upper case count
  std::array<uint8_t, 256> single_{};
  std::array<Char, kRemembered> chars_{};
};

}  // namespace lexicor_cli
