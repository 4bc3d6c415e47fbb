// Rewrites the line ends of a text that comes in pieces.
#pragma once

#include <lx.h>

#include <array>
#include <cstdint>
#include <string>
#include <string_view>

#include "codepage.h"
#include "output.h"

namespace lexicor_cli {

/// What stands between two line ends is moved as it is, except that shift bytes that change nothing are left out.
class LineEndRewriter {
 public:
  /// `find`: kinds of line ends, of LX_EOL_ALL; `eol`: the kind to write.
  LineEndRewriter(const Codepage& codepage, uint32_t find, uint32_t eol, Output& output);

  /// Rewrites the next bytes of a text that is well-formed.
  void take(const char* data, size_t bytes);
  /// Ends the text, in the single-byte state.
  void finish();

  /// How many line ends of a kind were found, and how many of all were others than are written.
  uint64_t found(uint32_t kind) const;
  uint64_t rewritten() const { return rewritten_; }

 private:
  static constexpr size_t kMostStops = 4;

  bool is_stop(char c) const { return stops_table_[static_cast<uint8_t>(c)]; }
  const char* find_stop(const char* at, const char* end) const;
  const char* stop(const char* run, const char* at, const char* end);
  void take_bytes(const char* at, const char* end);
  void take_chars(const char* at, const char* end);
  void end_line(const char* run, const char* at, uint32_t kind, std::string_view found);
  void put_state(LXShiftState state);
  void put(const char* begin, const char* end);
  uint32_t kind_of(char c) const;
  void flush();

  const Codepage& codepage_;
  const uint32_t find_;
  Output& output_;
  const std::string eol_;  // that is written
  const std::string pair_;
  const char carriage_return_, feed_, third_, fourth_;
  std::array<bool, 256> stops_table_{};
  std::array<char, kMostStops> stops_{};  // bytes at which a line end may begin, some of them twice
  bool by_bytes_;                         // no character has a stop in it
  std::string held_;                      // what the end of the pieces so far cuts: a character, or a pair
  LXShiftState state_ = LX_SHIFT_SINGLE, written_ = LX_SHIFT_SINGLE;
  std::array<uint64_t, 4> found_{};
  uint64_t rewritten_ = 0;
  std::string out_;
};

}  // namespace lexicor_cli
