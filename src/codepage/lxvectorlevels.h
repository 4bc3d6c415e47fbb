// What the levels of vector code share: the loops of the base, which a level takes over where it has none that is
// better, and the structure of a block of UTF-8.
#pragma once

#include "codepage/lxblock.h"
#include "codepage/lxcodepage.h"
#include "codepage/lxlength.h"

namespace lx {

namespace base {

PassedRun pass(const LeadRanges& leads, const uint8_t* p, const uint8_t* end, size_t most);
ReadRun read_utf8(const uint8_t* q, const uint8_t* end, uint16_t* values, size_t most, RunRule rule);
ReadRun read_pairs(const PairRows& pairs, const uint8_t* q, const uint8_t* end, uint16_t* values, size_t most,
                   RunRule rule);
bool copy_same(uint8_t* to, const uint8_t* from, size_t count, unsigned below);
void look_up(const uint16_t table[256], const uint8_t* p, size_t count, uint16_t* values, RunRule);
void translate(const uint8_t table[256], const uint8_t* p, size_t count, uint8_t* to);
uint8_t* write_utf8(uint8_t* p, const uint16_t* values, size_t count);
uint8_t* write_pairs(const PairCodes& codes, uint8_t* p, const uint16_t* values, size_t count);
uint8_t* write_wide(const WideCodes& codes, uint8_t* p, const uint16_t* values, size_t count);
uint8_t* write_bytes(const PairCodes& codes, uint8_t* p, const uint16_t* values, size_t count);

}  // namespace base

inline constexpr size_t kBasePivotBytes =
    sizeof(size_t) == 8 ? 16 : 48;  // calls cost more where registers are few
inline constexpr size_t kBasePairPivotBytes = 48;
inline constexpr size_t kBaseLeastPassed = CharBlock::kBytes;

/// Which bytes of a block of multibyte text begin characters, one bit a byte. No character waits for the length of the
/// one before.
template <class Mask>
struct CharStarts {
  Mask two, three;  // ... of so many bytes
  Mask starts;      // ... of any
  bool known;       // false where one of three bytes is followed by what could begin another one

  /// Of the bytes `inside`, those of a range can begin characters of two bytes or of three; `trails` belong to the
  /// character before the block.
  CharStarts(Mask can_two, Mask can_three, bool has_three, Mask inside, Mask trails)
      : two(can_two & inside), three(can_three & inside) {
    if (has_three) {
      // Where no byte that can begin a character continues one, what the block leaves does not wait for `trails`.
      const Mask any = two | three, behind = trails | any << 1 | three << 2;
      starts = inside & ~behind;
      known = (any & behind) == 0;
      if (__builtin_expect(known, 1)) return;
    }
    inside &= ~trails;
    two &= inside;
    three &= inside;
    known = three == 0;
    // A byte that can begin a character continues one behind a byte that does: in a series every other one.
    constexpr Mask kOdd = static_cast<Mask>(~Mask{0}) / 3 * 2;
    const Mask ends = ((two << 1 | kOdd) - two) ^ kOdd;
    starts = inside & ~(ends ^ two);
    two &= starts;
  }
  /// The first bytes of the next block that belong to the last character of this one.
  Mask trails() const { return (two | three) >> (kBits - 1) | three >> (kBits - 2); }

  static constexpr unsigned kBits = 8 * sizeof(Mask);
};

#if defined(__SSE2__)

extern const Vectors kSse4Vectors;
extern const Vectors kAvx512Vectors;
bool has_sse4();
bool has_avx512();

/// What stands in a block of UTF-8 that begins with a character, one bit a byte.
template <class Mask>
struct Utf8Marks {
  Mask leads;   // bytes that begin a character
  Mask trails;  // ... that continue one
  Mask three;   // ... that begin one of three bytes
  Mask others;  // ... that begin what is not read here

  /// The bytes of the well-formed characters at the start of a block of `bytes` bytes.
  unsigned usable(Mask longer, unsigned bytes) const {
    const Mask expected = static_cast<Mask>(longer << 1 | three << 2);
    const Mask odd = static_cast<Mask>((expected ^ trails) | others) & low_bits(bytes);
    if (__builtin_expect(odd == 0, 1)) {
      const Mask last = static_cast<Mask>(Mask{1} << (bytes - 1));
      const Mask cut = static_cast<Mask>((longer & last) | (three & last >> 1));
      return cut == 0 ? bytes : lowest(cut);
    }
    const unsigned at = lowest(odd);
    return (expected >> at & 1) == 0 ? at : highest(leads & low_bits(at));
  }
  static constexpr unsigned kBits = 8 * sizeof(Mask);
  static Mask low_bits(unsigned count) {
    return count == kBits ? static_cast<Mask>(~Mask{0}) : static_cast<Mask>((Mask{1} << count) - 1);
  }
  static unsigned lowest(Mask mask) { return static_cast<unsigned>(__builtin_ctzll(mask)); }
  static unsigned highest(Mask mask) { return 63u - static_cast<unsigned>(__builtin_clzll(mask)); }
};

#endif

}  // namespace lx
