// A text in the units of a form, made from the mappings of a small codepage and not by the library, with its
// substitution for what it has not, and where its characters and shift bytes stand.
#pragma once

#include <algorithm>
#include <string>
#include <type_traits>
#include <vector>

#include "codepage/lxcodepage.h"
#include "support/forms.h"
#include "support/tiny_codepages.h"

namespace lx::test {

template <class F>
struct Encoded {
  using Unit = typename F::Unit;
  std::vector<Unit> units;  // without a null; from the state given on, back in the single-byte state at the end
  std::vector<size_t> start, end;
  std::vector<LXWChar> codes;
  std::vector<size_t> shifts;  // places of Shift-In and Shift-Out bytes
  Unit shift_in;

  Encoded(const TinyCodepage& cp, const Units& text, LXShiftState state = 0)
      : shift_in(static_cast<Unit>(cp.shift_in)) {
    constexpr bool kBytes = sizeof(Unit) == 1;
    for (const LXUChar u : text) {
      const LXShiftState before = state;
      std::string bytes = cp.encode({u}, &state);
      if (state != before) {
        if (std::is_same_v<F, Ex>) add_shift(static_cast<Unit>(bytes[0]));
        bytes.erase(0, 1);
      }
      codes.push_back(std::is_same_v<F, Unicode> ? u : pack(bytes_of(bytes.data()), bytes.size()));
      start.push_back(units.size());
      if (kBytes)
        units.insert(units.end(), bytes.begin(), bytes.end());
      else
        units.push_back(static_cast<Unit>(codes.back()));
      end.push_back(units.size());
    }
    if (std::is_same_v<F, Ex> && cp.shift && state == LX_SHIFT_DOUBLE) add_shift(shift_in);
  }
  void add_shift(Unit byte) {
    shifts.push_back(units.size());
    units.push_back(byte);
  }
  size_t count() const { return end.size(); }
  int32_t size() const { return count_of(units); }
  /// Whole characters of the first `cut` units.
  size_t whole(size_t cut) const {
    return static_cast<size_t>(std::count_if(end.begin(), end.end(), [&](size_t e) { return e <= cut; }));
  }
  /// Behind `chars` characters of the first `cut` units, with a Shift-In and with any shift byte at the end.
  size_t behind(size_t chars, size_t cut, size_t text_end) const {
    const size_t at = chars == 0 ? 0 : end[chars - 1];
    const bool shift = at < cut && std::count(shifts.begin(), shifts.end(), at) != 0;
    return at + (shift && ((chars != 0 && units[at] == shift_in) || at + 1 == text_end));
  }
  /// The first units, in a block of their exact size, so that reading behind them is seen.
  std::vector<Unit> cut(size_t n) const {
    std::vector<Unit> block(units.begin(), units.begin() + static_cast<ptrdiff_t>(n));
    block.reserve(1);  // a null pointer is no text
    return block;
  }
  std::vector<Unit> terminated() const {
    std::vector<Unit> all(units);
    all.push_back(0);
    return all;
  }
};

}  // namespace lx::test
