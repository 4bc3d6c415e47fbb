// Translation of strings between two codepages that are named by number: conversion as between two locales,
// with what fields of a fixed size need beside it (padding, blanks that may be lost, a closed shift state).
#include "codepage/lxtransfer.h"
#include "core/lxtrace.h"
#include "nls1.h"

using namespace lx;

namespace {

RAS1_Unit unit = RAS1_UNIT("qrlnsts");

constexpr LXUChar kBlank = ' ';
constexpr int32_t kFlags = LX_TERMINATE | LX_CHARACTERS | NLS1_PAD | NLS1_DROP_BLANKS;

/// Whether built-in data took the place of the object's own, which could not be loaded.
bool is_stand_in(const LXObject& object) {
  return (object.disk.flags & kObjectBuiltIn) != 0 && globals.area->manager->directory[0] != '\0';
}

/// The single byte of a codepage's blank; -1 when the blank is longer.
int32_t blank_byte(const Codepage& cp) {
  const uint32_t code = unicode_to_code(cp, kBlank);
  return code <= 0xFF ? static_cast<int32_t>(code) : -1;
}

/// The source or the target.
struct Side {
  int32_t number;
  const Codepage* cp = nullptr;  // null: UTF-16

  /// A single-byte codepage has no shift states, whatever its flags say.
  Form form() const { return cp->single_byte ? Form::kPlain : Form::kEx; }

  /// Gets the codepage from the object manager: 0, or why it cannot be had.
  int32_t fetch(const char* title) {
    if (number == NLS1_UTF16) return LX_OK;
    int32_t rc = LX_E_NOT_FOUND;
    if (number >= 0 && number <= UINT16_MAX) {
      const LXObject* object = object_by_id(LX_CODEPAGE, static_cast<uint16_t>(number), &rc);
      if (rc == LX_OK && is_stand_in(*object)) rc = LX_E_NO_CODEPAGE;
      if (rc == LX_OK) cp = &codepage_of(*object);
    }
    if (rc == LX_OK)
      trace_kind(title);
    else
      LX_TRACE(unit, RAS1_LEVEL_ERRORS, "Unable to locate codepage %d", number);
    return rc == LX_E_FILE_NOT_FOUND ? LX_E_NO_CODEPAGE : rc;
  }

 private:
  /// The message has the two shift bytes the wrong way round, as those who read traces know it.
  void trace_kind(const char* title) const {
    if (cp->single_byte)
      LX_TRACE(unit, RAS1_LEVEL_DETAIL, "%s codepage %d is single byte", title, number);
    else if (cp->shift_sensitive)
      LX_TRACE(unit, RAS1_LEVEL_DETAIL, "%s codepage %d is shift sensitive, Shift-In=%02X, Shift-Out=%02x",
               title, number, cp->shift_out, cp->shift_in);
    else
      LX_TRACE(unit, RAS1_LEVEL_DETAIL, "%s codepage %d is not shift sensitive", title, number);
  }
};

/// A translation that has something to translate.
struct Request {
  Side source, target;
  void* output;
  const void* input;
  size_t bytes;  // of the input
  size_t size;   // of the output without the terminator's place: characters, or units of the target
  bool characters, terminate, pad, drop_blanks, null_terminated;

  size_t used(size_t units, size_t chars) const { return characters ? chars : units; }
};

struct Outcome {
  int32_t result;
  int32_t consumed;
  uint32_t code;
};

Outcome failed(int32_t code) {
  return {-1, 0, static_cast<uint32_t>(code)};
}

// ---- The input

/// The bytes of the characters that were moved: what was read and did not fit stays in the input, with its
/// Shift-Out, so that the rest of the input is a text of its own.
template <class Cursor>
size_t bytes_moved(const Cursor& in, const typename Cursor::Unit* start, Stop stop, size_t bytes) {
  const size_t read = static_cast<size_t>(in.p - start);
  if (stop == Stop::kInputEnd) return read * sizeof(*start);
  const size_t held = stop == Stop::kInputCut ? 0 : 1;
  if constexpr (Cursor::kOneUnit)
    return (read - held) * sizeof(*start);
  else
    return whole_chars(in.cp, Cursor::kShifts ? Form::kEx : Form::kPlain, start, LX_SHIFT_SINGLE, read - held,
                       bytes)
        .units;
}

/// Whether all bytes from `at` on are single-byte characters that are blanks.
template <class Cursor>
bool only_blanks(const Cursor& in, const typename Cursor::Unit* start, size_t at, size_t bytes) {
  using Unit = typename Cursor::Unit;
  if (state_at(in, LX_SHIFT_SINGLE) != LX_SHIFT_SINGLE) return false;
  int32_t blank = kBlank;
  if constexpr (!Cursor::kUnicode) {
    blank = blank_byte(in.cp);
    if (!Cursor::kShifts && in.cp.length(static_cast<uint8_t>(blank)) != 1) return false;
  }
  while (bytes - at >= sizeof(Unit) && start[at / sizeof(Unit)] == blank) at += sizeof(Unit);
  return at == bytes;
}

// ---- The end of the output

/// Returns to the single-byte state. In a full output the last character makes room; it stays consumed, and
/// the code says nothing of it.
template <class Sink>
void close_state(Sink& out, const typename Sink::Unit* start, const Request& request, size_t* chars) {
  if constexpr (Sink::kShifts) {
    if (out.state != LX_SHIFT_DOUBLE) return;
    const size_t bytes = room(start, out.p);
    if (request.used(bytes, *chars) >= request.size) {
      if (bytes < out.cp.width) return;  // codes shorter than the width: nothing can go
      out.take_back();
      --*chars;
    }
    *out.p++ = out.take_shift_byte();
  }
}

uint8_t pad_unit(const uint8_t*, const Side& target) {
  const int32_t blank = blank_byte(*target.cp);
  return blank >= 0 ? static_cast<uint8_t>(blank) : target.cp->substitution;
}
LXUChar pad_unit(const LXUChar*, const Side&) {
  return kBlank;
}

template <class Sink>
void pad(Sink& out, const typename Sink::Unit* start, const Request& request, size_t* chars) {
  const size_t used = request.used(static_cast<size_t>(out.p - start), *chars);
  if (used >= request.size) return;
  const size_t blanks = request.size - used;
  const auto blank = pad_unit(start, request.target);
  auto* const to = out.p;  // a store of a byte may change any member
  for (size_t i = 0; i < blanks; ++i) to[i] = blank;
  out.p += blanks;
  *chars += blanks;
}

// ---- The translation

template <class Cursor, class Sink>
Outcome translate(Cursor in, Sink out, const Request& request) {
  const auto* const from = in.p;
  auto* const to = out.p;
  const auto moved = transfer<LXUChar>(in, out, request.characters ? request.size : SIZE_MAX);
  size_t chars = moved.chars;
  size_t consumed = bytes_moved(in, from, moved.stop, request.bytes);
  if (request.drop_blanks && only_blanks(in, from, consumed, request.bytes)) consumed = request.bytes;
  const bool whole = consumed == request.bytes;
  close_state(out, to, request, &chars);
  if (request.pad) pad(out, to, request, &chars);
  const size_t used = request.used(static_cast<size_t>(out.p - to), chars);
  if (request.terminate || (request.null_terminated && whole && used < request.size)) {
    *out.p++ = 0;
    ++chars;
  }
  const size_t written = static_cast<size_t>(out.p - to) * sizeof(*to);
  return {static_cast<int32_t>(request.characters ? chars : written),
          static_cast<int32_t>(request.characters ? chars : consumed),
          static_cast<uint32_t>(whole ? LX_OK : LX_E_SIZE)};
}

template <class Body>
Outcome read_source(const Request& request, Body body) {
  const Side& source = request.source;
  if (source.cp != nullptr)
    return with_cursor(*source.cp, source.form(), LX_SHIFT_SINGLE, static_cast<const uint8_t*>(request.input),
                       request.bytes, body);
  const LXUChar* const units = static_cast<const LXUChar*>(request.input);
  return body(UnicodeCursor{units, units + request.bytes / sizeof(LXUChar)});
}

/// A size in characters says nothing about the end of the output.
template <class Body>
Outcome write_target(const Request& request, Body body) {
  const Side& target = request.target;
  if (target.cp == nullptr) {
    LXUChar* const units = static_cast<LXUChar*>(request.output);
    return body(UnicodeSink{units, request.characters ? no_end<LXUChar>() : end_of(units, request.size)});
  }
  uint8_t* const bytes = static_cast<uint8_t*>(request.output);
  return with_sink(*target.cp, target.form(), LX_SHIFT_SINGLE, bytes,
                   request.characters ? no_end<uint8_t>() : end_of(bytes, request.size), body);
}

void trace_path(const Side& source, const Side& target) {
  if (source.cp == nullptr || target.cp == nullptr || target.cp->single_byte) return;
  const char* path;
  if (target.cp->shift_sensitive)
    path = source.cp->single_byte ? "Process SingleByte Input, Extended Multi-byte output "
                                  : "Process multi-byte Input, Extended Multi-byte output ";
  else
    path = source.cp->single_byte ? "Process SingleByte Input, Multi-byte output "
                                  : "Process Multi-Byte Input, Multi-byte output ";
  LX_TRACE(unit, RAS1_LEVEL_FLOW, "%s", path);
}

size_t input_bytes(const Side& source, const void* input, int32_t length, int32_t flags) {
  const bool characters = (flags & LX_CHARACTERS) != 0;
  size_t bytes;
  if (source.cp == nullptr)
    bytes = length < 0 || characters ? text_units(static_cast<const LXUChar*>(input), length) * sizeof(LXUChar)
                                     : static_cast<size_t>(length);
  else if (characters && !source.cp->single_byte)
    bytes = units_of(*source.cp, ByteText{static_cast<const uint8_t*>(input), length}, true);
  else
    bytes = text_units(static_cast<const char*>(input), length);
  if (length < 0) LX_TRACE(unit, RAS1_LEVEL_DETAIL, "Source length = %d", static_cast<int32_t>(bytes));
  return bytes;
}

/// The output's units, or its characters, without the terminator's place.
size_t output_size(const Side& target, int32_t size, int32_t flags) {
  const bool units = target.cp == nullptr && (flags & LX_CHARACTERS) == 0;
  const size_t all = static_cast<size_t>(size) / (units ? sizeof(LXUChar) : 1);
  return all - ((flags & LX_TERMINATE) != 0 ? 1 : 0);
}

/// Nothing to translate: the null is one byte, whatever the target is, and there is no padding.
Outcome end_empty(void* output, int32_t size, int32_t flags) {
  if ((flags & LX_TERMINATE) == 0 || size <= 0) return {0, 0, LX_OK};
  *static_cast<char*>(output) = 0;
  return {1, (flags & LX_CHARACTERS) != 0 ? 1 : 0, LX_OK};
}

Outcome translate_string(Side source, Side target, void* output, int32_t size, const void* input,
                         int32_t length, int32_t flags) {
  const int32_t no_source = source.fetch("Source");
  const int32_t no_target = target.fetch("Target");
  if (no_source != LX_OK || no_target != LX_OK) return failed(no_source != LX_OK ? no_source : no_target);
  if ((flags & ~kFlags) != 0) return failed(LX_E_INVALID);
  if (length == 0 || size <= 0) return end_empty(output, size, flags);
  if (target.cp == nullptr && size < 2) return failed(LX_E_SIZE);
  const Request request{source,
                        target,
                        output,
                        input,
                        input_bytes(source, input, length, flags),
                        output_size(target, size, flags),
                        (flags & LX_CHARACTERS) != 0,
                        (flags & LX_TERMINATE) != 0,
                        (flags & NLS1_PAD) != 0,
                        (flags & NLS1_DROP_BLANKS) != 0,
                        length < 0};
  trace_path(source, target);
  return read_source(request, [&](auto reader) {
    return write_target(request, [&](auto writer) { return translate(reader, writer, request); });
  });
}

}  // namespace

extern "C" {

int32_t NLS1_TranslateString(int32_t target_codepage, int32_t source_codepage, void* output,
                             int32_t output_size, const void* input, int32_t input_length, int32_t* consumed,
                             int32_t flags, uint32_t* rc) {
  Events events(unit);
  NLS1_PrivateFunction_GetThreadLocale();  // initialises the process; the locale has no influence
  const Outcome outcome =
      translate_string({source_codepage}, {target_codepage}, output, output_size, input, input_length, flags);
  if (consumed != nullptr) *consumed = outcome.consumed;
  if (rc != nullptr) *rc = outcome.code;
  return events.exit(outcome.result);
}

}  // extern "C"
