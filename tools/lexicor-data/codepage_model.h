// A codepage as its object can hold it: for each 16-bit Unicode value its packed code, and for each packed code
// its Unicode value. Both the compiler (from a table) and the dumper (from an object) fill this model, and the
// canonical source is what it says. It differs from a table as read in these points:
//   - characters above U+FFFF are left out, and listed, with what maps to their codes;
//   - U+FFFD stands for "no value": a code is never mapped to it (from it, one way);
//   - the substitution byte stands for "no code": a value is mapped to it only when it maps back.
#pragma once

#include <array>
#include <cstdint>
#include <map>
#include <string>
#include <vector>

#include "ucm.h"

namespace lexicor_data {

inline constexpr uint32_t kNoCode = 0xFFFFFFFF;
inline constexpr uint16_t kNoValue = 0xFFFD;

inline constexpr uint8_t code_bytes(uint32_t code) {
  return code > 0xFFFFFF ? 4 : code > 0xFFFF ? 3 : code > 0xFF ? 2 : 1;
}

/// Unicode values by packed code, in blocks of the codes that differ in their last byte.
class ValuesByCode {
 public:
  /// kNoValue where there is none.
  uint16_t of(uint32_t code) const {
    const auto block = blocks_.find(code >> 8);
    return block == blocks_.end() ? kNoValue : block->second[code & 0xFF];
  }

  uint16_t& operator[](uint32_t code) {
    const auto [block, is_new] = blocks_.try_emplace(code >> 8);
    if (is_new) block->second.fill(kNoValue);
    return block->second[code & 0xFF];
  }

  /// Over the codes that have a value, in their order.
  class Iterator {
   public:
    std::pair<uint32_t, uint16_t> operator*() const { return {at_->first << 8 | byte_, at_->second[byte_]}; }
    bool operator!=(const Iterator& other) const { return at_ != other.at_ || byte_ != other.byte_; }
    Iterator& operator++() {
      step();
      return settled();
    }

   private:
    friend class ValuesByCode;
    using Block = std::map<uint32_t, std::array<uint16_t, 256>>::const_iterator;
    Iterator(Block at, Block end) : at_(at), end_(end) {}

    void step() {
      if (++byte_ == 256) ++at_, byte_ = 0;
    }
    Iterator& settled() {
      while (at_ != end_ && at_->second[byte_] == kNoValue) step();
      return *this;
    }

    Block at_, end_;
    uint32_t byte_ = 0;
  };

  Iterator begin() const { return Iterator(blocks_.begin(), blocks_.end()).settled(); }
  Iterator end() const { return Iterator(blocks_.end(), blocks_.end()); }

 private:
  std::map<uint32_t, std::array<uint16_t, 256>> blocks_;
};

struct CodepageModel {
  CodepageSource header;               ///< the keys; its mappings are empty
  std::vector<uint32_t> from_unicode;  ///< 65,536 packed codes, kNoCode where there is none
  ValuesByCode to_unicode;             ///< one-byte characters too

  bool is_multibyte() const { return header.width > 1; }
  bool is_shift() const { return header.kind == CodepageClass::kShiftStateful; }
  uint8_t substitution() const { return header.substitution; }

  uint16_t value_of(uint32_t code) const { return to_unicode.of(code); }
  /// The code that maps to the value and back, or kNoCode.
  uint32_t round_trip(uint16_t unicode) const;
};

/// A character that the object does not hold, and why.
struct LeftOut {
  Mapping mapping;
  const char* reason;
};

/// The rule of the substitution byte, over directions as they were read: it stands for "no code" except for the
/// value that it maps to, when that has no other code.
void settle_substitution(CodepageModel& model);

/// Both directions of UTF-8, surrogates like any other value.
void fill_utf8(CodepageModel& model);

/// Builds the model; contradictory mappings and codes with zero bytes are a SourceError. Characters above
/// U+FFFF are appended to `left_out`.
CodepageModel to_model(const CodepageSource& source, const std::string& file_name,
                       std::vector<LeftOut>& left_out);

/// The canonical table: to_model(to_source(m)) is m. The algorithmic codepage has no mappings.
CodepageSource to_source(const CodepageModel& model);

}  // namespace lexicor_data
