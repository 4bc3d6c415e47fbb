// Finds the characters that a conversion loses: source characters without a Unicode value, and Unicode values
// that the target codepage lacks. A text that really contains U+FFFD or the substitution character loses
// nothing by it.
#pragma once

#include <lx.h>

#include <bitset>
#include <cstdint>
#include <string>
#include <vector>

#include "codepage.h"

namespace lexicor_cli {

struct Loss {
  uint64_t offset;      // of the character's first byte in the input
  std::string message;  // what it is and why it is lost
};

class LossFinder {
 public:
  LossFinder(const Codepage& source, const Codepage& target);

  /// Looks at the next bytes of the input. A character that they cut is looked at with the bytes that follow.
  void take(const char* data, size_t bytes);
  /// Looks at what take() has held back; call it when the input has ended on a whole character.
  void finish() { look_at(text_.size()); }

  uint64_t count() const { return count_; }
  /// The first of them, at most kReported.
  const std::vector<Loss>& first() const { return first_; }

  static constexpr size_t kReported = 10;

 private:
  enum class Kind { kNone, kNoUnicode, kNotInTarget };

  void find_lacking(const Codepage& target);
  void look_at(size_t bytes);
  void look_at_chars(const char* text, const char* end, LXShiftState state);
  Kind kind_of(LXWChar code, LXUChar unicode) const;
  std::string describe(const char* text, int32_t bytes, LXUChar unicode, Kind kind) const;
  void record(uint64_t offset, const std::string& message);
  bool is_own_encoding(const char* text, int32_t bytes, int32_t unit_count);

  const Codepage& source_;
  const Codepage& target_;
  std::bitset<0x10000> lacking_;  // Unicode values that the target lacks
  bool has_replacement_ = false;  // the source has a character for U+FFFD
  LXWChar replacement_ = 0;       // its packed code

  std::string text_;  // bytes not looked at: of a cut character, then those of this call
  LXShiftState state_ = LX_SHIFT_SINGLE;
  uint64_t offset_ = 0;  // of text_ in the input
  std::vector<LXUChar> units_;
  std::string encoded_;

  uint64_t count_ = 0;
  std::vector<Loss> first_;
};

}  // namespace lexicor_cli
