// What fuzz targets share: the bytes of a run read as numbers and texts, blocks of their exact size, in which the
// sanitizer sees what goes beyond them, and locales of the directory that the build made. A target is written once: the
// preset `fuzz` makes a libFuzzer program of it, the presets with tests replay the corpus through it.
#pragma once

#include <algorithm>
#include <cstdint>
#include <iterator>
#include <memory>
#include <string>

#include "support/forms.h"
#include "support/must.h"

namespace lx::fuzz {

using namespace lx::test;

/// The bytes of a run, from the first on; behind the last one all are zero.
class Input {
 public:
  Input(const uint8_t* data, size_t bytes) : at_(data), end_(data + bytes) {}

  const uint8_t* data() const { return at_; }
  size_t left() const { return static_cast<size_t>(end_ - at_); }
  uint8_t byte() { return at_ == end_ ? uint8_t{0} : *at_++; }
  bool flag() { return (byte() & 1) != 0; }
  /// Little-endian, of up to 8 bytes.
  uint64_t number(unsigned bytes) {
    uint64_t value = 0;
    for (unsigned i = 0; i < bytes; ++i) value |= uint64_t{byte()} << 8 * i;
    return value;
  }
  int32_t integer() { return static_cast<int32_t>(number(4)); }
  uint32_t below(uint32_t limit) { return static_cast<uint32_t>(number(limit > 0x100 ? 2 : 1)) % limit; }
  template <class T, size_t kCount>
  const T& one_of(const T (&list)[kCount]) {
    return list[below(kCount)];
  }
  std::string bytes(size_t most) {
    const size_t asked = below(static_cast<uint32_t>(most) + 1), count = std::min(asked, left());
    const std::string taken(reinterpret_cast<const char*>(at_), count);
    at_ += count;
    return taken;
  }
  std::string rest() { return {reinterpret_cast<const char*>(at_), left()}; }
  /// Unicode: ASCII as it stands, characters that make a difference, and any.
  Units units(uint32_t most) {
    Units text;
    for (uint32_t count = below(most + 1); count != 0 && left() != 0; --count) text.push_back(unit());
    if (text.size() > 1 && text.back() == 0x7F) {  // long and alike
      text.pop_back();
      const Units part = text;
      while (text.size() < 2000) text += part;
    }
    return text;
  }
  /// A text in the units of a form: of characters of the locale, or any.
  template <class F>
  Text<typename F::Unit> text(const F& form, LXLocale* l, uint32_t most) {
    if (flag()) return encode(form, l, units(most));
    Text<typename F::Unit> text;
    for (uint32_t count = below(most + 1); count != 0 && left() != 0; --count)
      text.push_back(static_cast<typename F::Unit>(
          number(sizeof(typename F::Unit) == 4 ? 1 + below(4) : sizeof(typename F::Unit))));
    return text;
  }

 private:
  LXUChar unit() {
    static constexpr LXUChar kUnits[] = {
        0xA0,   0xA3,   0xAD,   0xB2,   0xC4,   0xC6,   0xC9,   0xD7,   0xDF,   0xE4,   0xE5,   0xE9,   0xFF,
        0x10C,  0x130,  0x131,  0x149,  0x17F,  0x192,  0x1C4,  0x1F0,  0x300,  0x301,  0x308,  0x327,  0x345,
        0x390,  0x391,  0x3A3,  0x3C2,  0x401,  0x430,  0x5D0,  0x61C,  0x640,  0x660,  0xE01,  0xE40,  0x1100,
        0x1161, 0x11A8, 0x1E9E, 0x1F80, 0x2000, 0x2010, 0x203E, 0x20AC, 0x2116, 0x212B, 0x2160, 0x2190, 0x221E,
        0x2502, 0x3000, 0x3001, 0x3041, 0x3042, 0x304B, 0x304C, 0x3099, 0x309D, 0x30A2, 0x30AB, 0x30FC, 0x3131,
        0x4E00, 0x4E9C, 0x5186, 0x9FA5, 0xAC00, 0xD7A3, 0xD800, 0xE000, 0xF900, 0xFB01, 0xFEFF, 0xFF01, 0xFF10,
        0xFF21, 0xFF41, 0xFF61, 0xFF76, 0xFF9E, 0xFFE5, 0xFFE8, 0xFFFD, 0xFFFE, 0xFFFF};
    const uint8_t first = byte();
    if (first < 0x80) return first;
    return first - 0x80u < std::size(kUnits) ? kUnits[first - 0x80] : static_cast<LXUChar>(number(2));
  }

  const uint8_t *at_, *end_;
};

/// A block of so many units, filled with what no text ends with.
template <class Unit>
class Block {
 public:
  explicit Block(size_t units) : units_(units), block_(new Unit[units]) {
    std::fill_n(block_.get(), units, static_cast<Unit>(0xA5A5A5A5));
  }
  explicit Block(const Text<Unit>& text) : Block(text.size()) {
    std::copy(text.begin(), text.end(), block_.get());
  }
  Unit* data() const { return block_.get(); }
  int32_t size() const { return static_cast<int32_t>(units_); }
  const Unit* end() const { return data() + units_; }
  /// Whether a place is in the text, its end included.
  bool has(const Unit* place) const { return place >= data() && place <= end(); }

 private:
  size_t units_;
  std::unique_ptr<Unit[]> block_;
};

/// What `put(to, size)` writes into a block of so many units.
template <class Unit, class Put>
Text<Unit> written(Put put, size_t room) {
  const Block<Unit> block(room);
  const int32_t units = put(block.data(), block.size());
  must(units <= block.size(), "no more is written than there is room");
  return Text<Unit>(block.data(), static_cast<size_t>(std::max(units, 0)));
}
/// The same where there is room in plenty, and exactly as much as is used.
template <class Unit, class Put>
Text<Unit> fitted(Put put, size_t plenty) {
  const Text<Unit> text = written<Unit>(put, plenty);
  must(written<Unit>(put, text.size()) == text, "what was used is enough");
  if (!text.empty()) written<Unit>(put, text.size() - 1);
  return text;
}

/// A locale of the directory, which is kept, and what a caller can ask of its codepage.
struct Place {
  LXLocale* locale;
  const LXObject* codepage;
  const LXObject* sort;  // null in binary order
  int32_t width;
  bool shift, ascii;

  /// The units that so many characters can take: bytes, a shift byte before each of them and one behind the last.
  template <class Unit>
  size_t units_of_chars(size_t chars) const {
    return sizeof(Unit) == 1 ? chars * static_cast<size_t>(width + shift) + shift : chars;
  }
};
const Place& place_in(const std::string& codepage, const std::string& sort = "BINARY",
                      const std::string& language = "English_UnitedStates");
/// As the input says.
const Place& place(Input& in);
/// The library runs on the directory of the build; places do that by themselves.
void open_directory();

/// Whether `text` says all of the units: no substitution, one character each.
template <class F>
bool faithful(const F& form, LXLocale* l, const Units& units, const Text<typename F::Unit>& text) {
  return decode(form, l, text) == units;
}

using Run = void (*)(Input&);
struct Target {
  Target(const char* name, Run run);
};

}  // namespace lx::fuzz

#ifdef LEXICOR_REPLAY
#define FUZZ_TARGET(NAME)                                          \
  static void fuzz_##NAME(lx::fuzz::Input& in);                    \
  static const lx::fuzz::Target target_##NAME(#NAME, fuzz_##NAME); \
  static void fuzz_##NAME(lx::fuzz::Input& in)
#else
#define FUZZ_TARGET(NAME)                                                    \
  static void fuzz_##NAME(lx::fuzz::Input& in);                              \
  extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t bytes) { \
    lx::fuzz::Input in(data, bytes);                                         \
    return fuzz_##NAME(in), 0;                                               \
  }                                                                          \
  static void fuzz_##NAME(lx::fuzz::Input& in)
#endif
