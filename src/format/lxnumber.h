// What the writing and the reading of numbers share: the fixed characters of the two families of codepages, the
// conventions of a locale as a form sees them, and grouping texts.
#pragma once

#include "codepage/lxtext.h"
#include "locale/lxlocale.h"

namespace lx {

/// How a form walks text of the codepage. Packed codes come from text with its shift bytes.
template <Form kForm>
inline constexpr Form kTextForm = kForm == Form::kPlain ? Form::kPlain : Form::kEx;

/// The characters that the functions themselves write and know.
struct FixedChars {
  uint8_t zero, plus, minus, open, close, space, group_separator;
};
inline constexpr FixedChars kAsciiChars{0x30, 0x2B, 0x2D, 0x28, 0x29, 0x20, 0x3B};
inline constexpr FixedChars kEbcdicChars{0xF0, 0x4E, 0x60, 0x4D, 0x5D, 0x40, 0x5E};

template <Form kForm>
const FixedChars& fixed_chars(const LXLocale& locale) {
  return kForm == Form::kUnicode || keeps_ascii(locale) ? kAsciiChars : kEbcdicChars;
}

inline constexpr int32_t kNoClass = -1;  // of a character in a number

/// The base-36 values of the digits and letters of a family of codepages.
struct DigitValues {
  int8_t of[256];
  uint8_t zero;  // the others stand behind it
  constexpr explicit DigitValues(bool ascii) : of(), zero(ascii ? kAsciiChars.zero : kEbcdicChars.zero) {
    for (int8_t& value : of) value = kNoClass;
    const auto set = [this](unsigned first, unsigned value, unsigned count) {
      for (unsigned i = 0; i < count; ++i) of[first + i] = static_cast<int8_t>(value + i);
    };
    set(zero, 0, 10);
    if (ascii) {
      set(0x41, 10, 26);
      set(0x61, 10, 26);
      return;
    }
    constexpr unsigned kLetters[] = {0x80, 0xC0};
    for (unsigned letters : kLetters) {  // three runs of letters with gaps between them
      set(letters + 0x01, 10, 9);
      set(letters + 0x11, 19, 9);
      set(letters + 0x22, 28, 8);
    }
  }
};
inline constexpr DigitValues kAsciiDigits(true);
inline constexpr DigitValues kEbcdicDigits(false);

/// Where the items stand in the locale record and, in the same order, in the territory.
enum NumberSeparator : size_t { kDecimal = 0, kThousands = 1, kMonetaryDecimal = 3, kMonetaryThousands = 4 };
enum NumberGrouping : size_t { kGrouping = 0, kMonetaryGrouping = 2 };
enum NumberDigits : size_t { kDigits = 0, kCurrencyDigits = 1, kInternationalDigits = 2 };

/// A separator; 0 for none, which in bytes is also one that does not take a single byte.
template <Form kForm>
FormUnit<kForm> separator_of(const LXLocale& locale, bool current, NumberSeparator index) {
  const size_t word = format::territory::kSeparators + index;
  if constexpr (kForm == Form::kUnicode) {
    return current ? locale.separators_unicode[index] : payload_word(*locale.territory, word);
  } else {
    const Codepage& cp = codepage_of(*locale.codepage);
    if (current) {
      const uint8_t byte = locale.separators[index];
      const bool shifts = kTextForm<kForm> == Form::kEx && cp.shift_sensitive;
      return (shifts ? !cp.is_shift(byte) : cp.length(byte) == 1) ? byte : uint8_t{0};
    }
    const LXUChar u = payload_word(*locale.territory, word);
    const uint32_t code = u != 0 ? unicode_to_code(cp, u) : 0;
    return static_cast<FormUnit<kForm>>(kForm == Form::kWide || code <= 0xFF ? code : 0);
  }
}

/// One group size at the start of a grouping text of `remaining` units: -1 for none. `units` receives how many
/// digits it takes. A size beyond 31 bits is as good as the largest one.
template <class At>
int32_t group_size(At unit_at, int32_t remaining, const FixedChars& chars, int32_t* units) {
  if (remaining <= 0 || unit_at(0) == 0) return -1;
  constexpr int32_t kRoomForDigit = (INT32_MAX - 9) / 10;
  int32_t size = 0;
  int32_t n = 0;
  for (; n < remaining; ++n) {
    const uint32_t unit = unit_at(n);
    if (unit == 0 || unit == chars.group_separator) break;
    const uint32_t digit = unit - chars.zero;
    if (digit > 9) return -1;
    size = size > kRoomForDigit ? INT32_MAX : size * 10 + static_cast<int32_t>(digit);
  }
  *units = n;
  return size;
}

/// The group sizes of a locale's grouping text, from the decimal point leftward.
template <Form kForm>
class GroupSizes {
 public:
  GroupSizes(const LXLocale& locale, bool current, NumberGrouping index)
      : cp_(codepage_of(*locale.codepage)),
        chars_(fixed_chars<kForm>(locale)),
        text_(bytes_of(locale.texts[index])),
        unicode_(nullptr) {
    if (!current)
      unicode_ = payload_text(*locale.territory, kTextWords[index]);
    else if (kForm == Form::kUnicode)
      unicode_ = reinterpret_cast<const uint8_t*>(locale.texts_unicode[index]);
  }

  /// Whether every group has three digits, in the way that most locales say it: a size that is repeated.
  bool all_threes() const {
    return unit_at(0) == chars_.zero + 3u && unit_at(1) == chars_.group_separator &&
           unit_at(2) == chars_.zero && unit_at(3) == 0;
  }

  /// The size of the next group; 0: all digits that are left stand together.
  size_t next() {
    if (repeats_) return last_;
    int32_t units = 0;
    const int32_t size =
        group_size([&](int32_t i) { return unit_at(at_ + static_cast<size_t>(i)); }, INT32_MAX, chars_, &units);
    at_ += static_cast<size_t>(units);
    if (size <= 0) {
      repeats_ = true;
      if (size < 0) last_ = 0;
      return last_;
    }
    if (unit_at(at_) != 0) ++at_;
    last_ = static_cast<size_t>(size);
    return last_;
  }

 private:
  uint32_t unit_at(size_t i) const {
    if (unicode_ == nullptr) return text_[i];
    const LXUChar u = le16(unicode_ + 2 * i);
    return kForm == Form::kUnicode || u == 0 ? u : unicode_to_code(cp_, u);
  }

  const Codepage& cp_;
  const FixedChars& chars_;
  const uint8_t* text_;     // in the codepage
  const uint8_t* unicode_;  // 16-bit, instead of it
  size_t at_ = 0;           // units read
  size_t last_ = 0;
  bool repeats_ = false;
};

}  // namespace lx
