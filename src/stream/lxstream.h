// A character stream, and its characters as bytes: reading one, and putting one back. The buffer always begins
// at the next byte of the text; what is read goes through it, so that a character that stays incomplete is kept
// there.
#pragma once

#include <cstring>

#include "codepage/lxcodepage.h"
#include "core/lxrecords.h"

struct LXStream {
  LXTransfer transfer;
  void* user;
  uint8_t direction;    // lx::StreamDirection
  uint8_t shift_state;  // at the front of the text to read, or behind the text written
  uint8_t reserved;
  uint16_t count;  // bytes in the buffer
  uint8_t buffer[LX_STREAM_BUFFER];
};

namespace lx {

enum StreamDirection : uint8_t { kReadStream = 0, kWriteStream = 1 };

/// One character: bytes of the codepage, or the two of a 16-bit unit.
struct StreamChar {
  uint8_t bytes[kMaxCharBytes];
  size_t length;
  bool shifts;         // needs its shift state
  LXShiftState state;  // ... this one
};

/// What reading gives beside LX_OK and the error codes: the input has ended. By a callback that returned 0
/// where it was asked for a whole unit, which is an error to one reader of units.
inline constexpr int32_t kInputEnd = -1;
inline constexpr int32_t kNoInput = -2;

/// Reads the bytes of a character and the shift bytes before it.
int32_t read_char(const Codepage& cp, LXStream& stream, StreamChar* c);
/// Reads a 16-bit unit with one call of the callback at most.
int32_t read_unit(LXStream& stream, StreamChar* c);

/// LX_OK, or LX_E_SIZE when the buffer has no room.
int32_t push_back(const Codepage& cp, LXStream& stream, const StreamChar& c);

inline LXUChar unit_of(const StreamChar& c) {
  LXUChar u;
  memcpy(&u, c.bytes, sizeof(u));
  return u;
}

}  // namespace lx
