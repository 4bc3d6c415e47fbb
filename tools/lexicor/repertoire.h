// The characters that a codepage has: which 16-bit Unicode values come back from it as they were.
#pragma once

#include <lx.h>

#include <bitset>
#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "character_values.h"
#include "codepage.h"
#include "loss.h"

namespace lexicor_cli {

class Repertoire {
 public:
  explicit Repertoire(const Codepage& codepage);

  bool has(LXUChar unicode) const {
    learn_page(unicode / kPage);
    return !lost_[unicode];
  }
  bool has_all(const LXUChar* units, size_t count) const;
  /// How a value that the codepage has not is lost.
  LossKind kind_of_loss(LXUChar unicode) const;
  /// What is lost of a value that the codepage has not, in words.
  std::string describe_loss(LXUChar unicode) const;
  /// Makes has_all() say no to a value, so that texts with it are looked at.
  void watch(LXUChar unicode);

 private:
  static constexpr uint32_t kValues = 0x10000, kPage = 0x100, kAscii = 0x80;

  struct Unmapper {
    void operator()(uint8_t* values) const;
  };

  /// What a value is when it is written and read back; U+FFFD when the codepage lacks it.
  LXUChar back(LXUChar unicode) const;
  void learn_page(uint32_t page) const;
  void learn_values(uint32_t page) const;
  bool is_lost(LXUChar unicode) const;
  LXUChar value_of(LXWChar code) const;

  const Codepage& codepage_;
  const Substitution substitution_;
  const std::vector<LXUChar> single_;
  // Pages of values are looked at when the first of them is met.
  mutable std::bitset<kValues / kPage> learned_;
  mutable std::bitset<kValues> lost_;
  std::bitset<kValues> asked_;  // that are watched on request
  // 1 for values that has_all() passes over: of learned pages those that are neither lost nor watched. Pages of memory
  // that no value of a text is in are not touched.
  const std::unique_ptr<uint8_t[], Unmapper> clear_;
};

/// That a codepage lacks a character.
std::string lacks_text(uint32_t code_point, const std::string& codepage);

}  // namespace lexicor_cli
