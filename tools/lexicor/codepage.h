// A codepage that the user named, with a locale on it and what the public functions tell about its shift bytes.
#pragma once

#include <lx.h>

#include <array>
#include <cstdint>
#include <string>

#include "session.h"

namespace lexicor_cli {

class Codepage {
 public:
  /// `name` is an object name, a decimal identifier or an alias, in any letter case. Throws a Failure that
  /// names the nearest codepages when there is none, or that says why its file could not be loaded. Its locale
  /// has the given language and territory ("German_Austria"); empty: any will do.
  Codepage(const Session& session, const std::string& name, const std::string& language_territory = "");
  ~Codepage();
  Codepage(const Codepage&) = delete;
  Codepage& operator=(const Codepage&) = delete;

  LXLocale* locale() const { return locale_; }
  const LXObject* object() const { return object_; }
  const std::string& name() const { return name_; }
  unsigned id() const { return id_; }
  bool utf8() const { return id_ == LX_CODEPAGE_UTF8; }

  bool shift_sensitive() const { return shift_sensitive_; }
  /// Whether a byte is Shift-Out or Shift-In.
  bool is_shift(char byte) const { return shift_sensitive_ && (byte == shift_out_ || byte == shift_in_); }
  LXShiftState state_after(char shift_byte) const {
    return shift_byte == shift_out_ ? LX_SHIFT_DOUBLE : LX_SHIFT_SINGLE;
  }
  /// The shift byte that sets a state.
  char shift_byte(LXShiftState state) const { return state == LX_SHIFT_DOUBLE ? shift_out_ : shift_in_; }
  /// Bytes of a text that go to the library at once. A shift byte right behind another one counts as a
  /// character within a call; host texts have such pairs where two double-byte fields meet, so the call ends
  /// between them.
  size_t call_bytes(const char* text, size_t bytes) const;
  /// Bytes of the character at `text`, which is no shift byte.
  int32_t char_bytes(const char* text, LXShiftState state) const {
    if (shift_sensitive_) return state == LX_SHIFT_DOUBLE ? double_bytes_ : 1;
    return char_bytes_[static_cast<uint8_t>(*text)];
  }
  /// Whether every byte is a character.
  bool single_byte() const { return single_byte_; }
  /// The whole characters in the first `bytes` bytes of a text; `*end_state` is the state behind them.
  size_t whole_bytes(const char* text, size_t bytes, LXShiftState state, LXShiftState* end_state) const;

 private:
  void learn_shift_bytes();
  void learn_char_bytes();

  std::string name_;
  unsigned id_ = 0;
  const LXObject* object_ = nullptr;
  LXLocale* locale_ = nullptr;
  bool shift_sensitive_ = false;
  char shift_out_ = 0;
  char shift_in_ = 0;
  int32_t double_bytes_ = 1;               // of a character in the double-byte state
  std::array<uint8_t, 256> char_bytes_{};  // by the first byte, where there are no shift states
  bool single_byte_ = false;
};

}  // namespace lexicor_cli
