// Tells the well-formed text of a codepage from bytes that make no character of it. The library converts any
// bytes, so that a cut or foreign character takes its neighbours along; text is looked at here before.
#pragma once

#include <lx.h>

#include <bitset>
#include <string>
#include <vector>

#include "codepage.h"

namespace lexicor_cli {

/// The beginning of a text: whole characters, and what stands behind them.
struct Stretch {
  enum class End {
    kText,       // nothing, or a character that the text cuts and more text may complete
    kMalformed,  // bytes that make no character
    kLongUtf8    // a UTF-8 character beyond U+FFFF
  };

  size_t good_bytes = 0;
  size_t end_bytes = 0;  // of what stands behind them
  End end = End::kText;
};

class MalformedFinder {
 public:
  /// `long_utf8_ends`: whether a UTF-8 character beyond U+FFFF, which the library does not know, ends a
  /// stretch.
  explicit MalformedFinder(const Codepage& codepage, bool long_utf8_ends = false);

  /// Looks at a text that begins in `state` at a character. `last`: no more text follows, so that a character
  /// that is cut is malformed. Of a shift-sensitive codepage as much is looked at as the library takes at once.
  Stretch next(const char* text, size_t bytes, LXShiftState state, bool last) const;

  /// What is wrong with the malformed bytes at `text`, of a text that ends at `end`.
  std::string describe(const char* text, size_t malformed_bytes, const char* end, LXShiftState state) const;

 private:
  Stretch next_utf8(const char* text, size_t bytes, bool last) const;
  Stretch walk(const char* text, size_t bytes, LXShiftState state, bool last) const;
  size_t malformed_bytes(const char* text, size_t bytes, size_t char_bytes, LXShiftState state) const;
  bool has_values(const char* text, size_t bytes, LXShiftState state) const;
  void learn_bytes() const;

  const Codepage& codepage_;
  const bool long_utf8_ends_;
  // The bytes that some double-byte character begins and ends with. Learned when the first bytes are met that
  // have no value.
  mutable bool learned_ = false;
  mutable std::bitset<256> first_bytes_, trail_bytes_;
  mutable std::vector<LXUChar> units_;
};

}  // namespace lexicor_cli
