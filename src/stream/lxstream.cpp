// Character streams: opening and closing, characters read, put back and written, and the bytes that a stream
// keeps for its callback.
#include "stream/lxstream.h"

#include <cstring>

#include "core/lxcall.h"
#include "core/lxmemory.h"

using namespace lx;

namespace {

RAS1_Unit unit = RAS1_UNIT("lxstream");

constexpr size_t kUnitBytes = sizeof(LXUChar);

void drop_front(LXStream& s, size_t bytes) {
  s.count = static_cast<uint16_t>(s.count - bytes);
  memmove(s.buffer, s.buffer + bytes, s.count);
}

uint8_t state_after(const Codepage& cp, uint8_t shift_byte) {
  return shift_byte == cp.shift_out ? LX_SHIFT_DOUBLE : LX_SHIFT_SINGLE;
}
int32_t call_back(const LXStream& s, uint8_t* p, size_t bytes) {
  return s.transfer(s.user, reinterpret_cast<char*>(p), static_cast<int32_t>(bytes));
}

// Reading.

void take_front(LXStream& s, size_t bytes, StreamChar* c) {
  *c = {};
  c->length = bytes;
  memcpy(c->bytes, s.buffer, bytes);
  drop_front(s, bytes);
}

/// Reads until `bytes` bytes are buffered.
int32_t fill(LXStream& s, size_t bytes) {
  while (s.count < bytes) {
    const int32_t wanted = static_cast<int32_t>(bytes - s.count);
    const int32_t got = call_back(s, s.buffer + s.count, static_cast<size_t>(wanted));
    if (got > wanted || got < -1) return LX_E_STREAM_COUNT;
    if (got <= 0 && s.count == 0) return kInputEnd;
    if (got <= 0) return got == 0 ? LX_E_STREAM_HALF : LX_E_STREAM_READ;
    s.count = static_cast<uint16_t>(s.count + got);
  }
  return LX_OK;
}

/// What a callback means that did not give the bytes of a unit; one byte is kept.
int32_t short_unit(LXStream& s, int32_t got) {
  if (s.count == 1) return static_cast<uint16_t>(got) < 0xFFFF ? LX_E_STREAM_HALF : LX_E_STREAM_READ;
  if (got == -1) return kInputEnd;
  if (got == 0) return kNoInput;
  if (got != 1) return LX_E_STREAM_COUNT;
  s.count = 1;
  return LX_E_STREAM_HALF;
}

/// Forgets what was put back; the state is that behind it.
void drop_buffer(const Codepage& cp, LXStream& s) {
  for (size_t i = 0; cp.shift_sensitive && i < s.count;) {
    if (cp.is_shift(s.buffer[i]))
      s.shift_state = state_after(cp, s.buffer[i++]);
    else
      i += cp.width_in(s.shift_state);
  }
  s.count = 0;
}

// Writing.

struct Offer {
  size_t taken;
  bool failed;  // else the callback took nothing, again and again
};

/// Offers bytes until all are taken or the callback stops taking them.
Offer offer(const LXStream& s, uint8_t* p, size_t bytes) {
  size_t taken = 0;
  for (int refusals = 0; taken < bytes && refusals < LX_STREAM_OFFERS;) {
    const int32_t n = call_back(s, p + taken, bytes - taken);
    if (n < 0 || static_cast<size_t>(n) > bytes - taken) return {taken, true};
    refusals = n == 0 ? refusals + 1 : 0;
    taken += static_cast<size_t>(n);
  }
  return {taken, false};
}

/// Offers the kept bytes; the rest moves to the front.
Offer offer_kept(LXStream& s) {
  const Offer done = offer(s, s.buffer, s.count);
  drop_front(s, done.taken);
  return done;
}

int32_t flush(LXStream& s) {
  const Offer done = offer_kept(s);
  if (!done.failed) return s.count == 0 ? LX_OK : LX_E_STREAM_KEPT;
  s.count = 0;
  return LX_E_STREAM_FLUSH;
}

int32_t write_char(const Codepage& cp, LXStream& s, const StreamChar& c) {
  const size_t shift = c.shifts && c.state != s.shift_state ? 1 : 0;
  const size_t bytes = shift + c.length;
  uint8_t text[1 + kMaxCharBytes] = {shift_byte(cp, c.state)};
  memcpy(text + shift, c.bytes, c.length);
  size_t taken = 0;
  offer_kept(s);
  if (s.count == 0) {
    // The shift byte has a call of its own.
    taken = offer(s, text, shift).taken;
    if (taken == shift) taken += offer(s, text + shift, c.length).taken;
  }
  const size_t left = bytes - taken;
  if (left > LX_STREAM_BUFFER - size_t{s.count}) return LX_E_SIZE;
  memcpy(s.buffer + s.count, text + taken, left);
  s.count = static_cast<uint16_t>(s.count + left);
  if (c.shifts) s.shift_state = static_cast<uint8_t>(c.state);
  return left == 0 ? LX_OK : LX_E_STREAM_KEPT;
}

/// What a write stream still owes its callback at the end.
int32_t finish(const Codepage& cp, LXStream& s) {
  if (flush(s) != LX_OK) return LX_E_STREAM_FLUSH;
  uint8_t shift_in = cp.shift_in;
  const bool open = cp.shift_sensitive && s.shift_state == LX_SHIFT_DOUBLE;
  return open && offer(s, &shift_in, 1).taken != 1 ? LX_E_STREAM_FLUSH : LX_OK;
}

// Characters as the four forms give them.

StreamChar plain_char(const Codepage& cp, const uint8_t* text) {
  StreamChar c{};
  c.length = cp.length(*text);
  memcpy(c.bytes, text, c.length);
  return c;
}

StreamChar shift_char(const Codepage& cp, const uint8_t* text, bool double_byte) {
  if (!cp.shift_sensitive) return plain_char(cp, text);
  StreamChar c{};
  c.shifts = true;
  c.state = double_byte ? LX_SHIFT_DOUBLE : LX_SHIFT_SINGLE;
  c.length = cp.width_in(c.state);
  memcpy(c.bytes, text, c.length);
  return c;
}

StreamChar code_char(const Codepage& cp, LXWChar code) {
  const uint32_t stored = without_zero_bytes(code);
  const size_t count = code_bytes(stored);
  uint8_t text[kMaxCharBytes] = {};
  store_code(text, stored, count);
  return shift_char(cp, text, count > 1);
}

StreamChar unit_char(LXUChar u) {
  StreamChar c{};
  c.length = kUnitBytes;
  memcpy(c.bytes, &u, kUnitBytes);
  return c;
}

/// The frame of the functions that write a character or put it back: `move` gives their code.
template <class Make>
int32_t move_char(LXStream* stream, LXLocale* given, StreamDirection direction,
                  int32_t (*move)(const Codepage&, LXStream&, const StreamChar&), Make make) {
  Call call(unit, given);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, 0);
  if (stream->direction != direction) return call.fail(LX_E_STREAM_DIRECTION, 0);
  const Codepage& cp = codepage_of(call.codepage());
  const int32_t code = move(cp, *stream, make(cp));
  return call.end(code, code == LX_OK ? 1 : 0);
}

template <class Make>
int32_t write(LXStream* stream, LXLocale* given, Make make) {
  return move_char(stream, given, kWriteStream, write_char, make);
}
template <class Make>
int32_t unget(LXStream* stream, LXLocale* given, Make make) {
  return move_char(stream, given, kReadStream, push_back, make);
}

}  // namespace

namespace lx {

int32_t read_char(const Codepage& cp, LXStream& s, StreamChar* c) {
  int32_t code = fill(s, 1);
  for (; code == LX_OK && cp.shift_sensitive && cp.is_shift(s.buffer[0]); code = fill(s, 1)) {
    s.shift_state = state_after(cp, s.buffer[0]);
    drop_front(s, 1);
  }
  if (code != LX_OK) return code;
  const size_t bytes = cp.shift_sensitive ? cp.width_in(s.shift_state) : cp.length(s.buffer[0]);
  code = fill(s, bytes);
  if (code != LX_OK) return code;
  take_front(s, bytes, c);
  c->shifts = cp.shift_sensitive;
  c->state = s.shift_state;
  return LX_OK;
}

int32_t read_unit(LXStream& s, StreamChar* c) {
  if (s.count < kUnitBytes) {
    const size_t wanted = kUnitBytes - s.count;
    const int32_t got = call_back(s, s.buffer + s.count, wanted);
    if (got != static_cast<int32_t>(wanted)) return short_unit(s, got);
    s.count = kUnitBytes;
  }
  take_front(s, kUnitBytes, c);
  return LX_OK;
}

int32_t push_back(const Codepage& cp, LXStream& s, const StreamChar& c) {
  const size_t shift = c.shifts && c.state != s.shift_state ? 1 : 0;
  const size_t bytes = c.length + shift;
  if (bytes > LX_STREAM_BUFFER - size_t{s.count}) return LX_E_SIZE;
  memmove(s.buffer + bytes, s.buffer, s.count);
  s.count = static_cast<uint16_t>(s.count + bytes);
  memcpy(s.buffer, c.bytes, c.length);
  if (shift == 0) return LX_OK;
  s.buffer[c.length] = shift_byte(cp, s.shift_state);
  s.shift_state = static_cast<uint8_t>(c.state);
  return LX_OK;
}

}  // namespace lx

extern "C" {

LXStream* LXOpenStream(LXLocale* locale, LXTransfer transfer, void* user, uint32_t mode) {
  Call call(unit, locale);
  LXStream* const none = nullptr;
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, none);
  if (mode != LX_STREAM_READ && mode != LX_STREAM_WRITE) return call.fail(LX_E_INVALID, none);
  if (transfer == nullptr) return call.fail(LX_E_INVALID, none);
  auto* stream = static_cast<LXStream*>(hook_allocate_zeroed(sizeof(LXStream)));
  if (stream == nullptr) return call.fail(LX_E_MEMORY, none);
  stream->transfer = transfer;
  stream->user = user;
  stream->direction = mode == LX_STREAM_WRITE ? kWriteStream : kReadStream;
  return call.exit(stream);
}

int32_t LXCloseStream(LXStream* stream, LXLocale* locale) {
  Call call(unit, locale);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, 0);
  int32_t code = LX_OK;
  if (stream->direction == kWriteStream) code = finish(codepage_of(call.codepage()), *stream);
  if (!hook_free(stream) && code == LX_OK) code = LX_E_FREE;
  return call.end(code, code == LX_OK ? 1 : 0);
}

int32_t LXFlushStream(LXStream* stream, LXLocale* locale) {
  Call call(unit, locale);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, 0);
  int32_t code = LX_OK;
  if (stream->direction == kWriteStream)
    code = flush(*stream);
  else
    drop_buffer(codepage_of(call.codepage()), *stream);
  return call.end(code, code == LX_OK ? 1 : 0);
}

LXUChar LXReadCharU(LXStream* stream, LXLocale* locale) {
  constexpr LXUChar kNone = LX_STREAM_NO_UNIT;
  Call call(unit, locale);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, kNone);
  if (stream->direction != kReadStream) return call.fail(LX_E_STREAM_DIRECTION, kNone);
  StreamChar c;
  const int32_t code = read_unit(*stream, &c);
  if (code == LX_OK) return call.exit(unit_of(c));
  if (code == kInputEnd) return call.exit(kNone);
  return call.fail(code == kNoInput ? LX_E_STREAM_COUNT : code, kNone);
}

LXWChar LXReadCharW(LXStream* stream, LXLocale* locale) {
  Call call(unit, locale);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, LX_STREAM_FAILURE);
  if (stream->direction != kReadStream) return call.fail(LX_E_STREAM_DIRECTION, LX_STREAM_FAILURE);
  StreamChar c;
  const int32_t code = read_char(codepage_of(call.codepage()), *stream, &c);
  if (code == LX_OK) return call.exit(LXWChar{pack(c.bytes, c.length)});
  if (code == kInputEnd) return call.exit(LX_STREAM_END);
  return call.fail(code, LX_STREAM_FAILURE);
}

int32_t LXUngetChar(LXStream* stream, LXLocale* locale, const char* character) {
  return unget(stream, locale, [&](const Codepage& cp) { return plain_char(cp, bytes_of(character)); });
}
int32_t LXUngetCharU(LXStream* stream, LXLocale* locale, LXUChar u) {
  return unget(stream, locale, [&](const Codepage&) { return unit_char(u); });
}
int32_t LXUngetCharW(LXStream* stream, LXLocale* locale, LXWChar code) {
  return unget(stream, locale, [&](const Codepage& cp) { return code_char(cp, code); });
}
int32_t LXUngetCharEx(LXStream* stream, LXLocale* locale, const char* character, LXShiftState state) {
  return unget(stream, locale, [&](const Codepage& cp) {
    return shift_char(cp, bytes_of(character), state != LX_SHIFT_SINGLE);
  });
}

int32_t LXWriteChar(LXStream* stream, LXLocale* locale, const char* character) {
  return write(stream, locale, [&](const Codepage& cp) { return plain_char(cp, bytes_of(character)); });
}
int32_t LXWriteCharU(LXStream* stream, LXLocale* locale, LXUChar u) {
  return write(stream, locale, [&](const Codepage&) { return unit_char(u); });
}
int32_t LXWriteCharW(LXStream* stream, LXLocale* locale, LXWChar code, int32_t) {
  return write(stream, locale, [&](const Codepage& cp) { return code_char(cp, code); });
}
int32_t LXWriteCharEx(LXStream* stream, LXLocale* locale, const char* character, int32_t double_byte, int32_t) {
  return write(stream, locale,
               [&](const Codepage& cp) { return shift_char(cp, bytes_of(character), double_byte != 0); });
}

}  // extern "C"
