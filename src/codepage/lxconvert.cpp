// Conversion of whole strings: between two codepages, to and from packed codes, to and from Unicode. One flow
// for all of them over a reader and a writer; the doors below say what they read and write.
#include "codepage/lxtransfer.h"
#include "core/lxcall.h"

using namespace lx;

namespace {

RAS1_Unit unit = RAS1_UNIT("lxconvert");

/// What the size, length and flags arguments of a conversion ask for.
struct Request {
  bool valid;            // no undefined flag
  bool characters;       // LX_CHARACTERS
  bool terminate;        // LX_TERMINATE
  bool null_terminated;  // the length was negative
  bool nothing;          // length or size 0 and no terminator wanted: the result is 0
  size_t size;           // of the output, without the unit that LX_TERMINATE reserves
  size_t length;         // of the input in units

  template <class Unit>
  Request(int32_t size_given, const Unit* input, int32_t length_given, int32_t flags, int32_t allowed_flags)
      : valid((flags & ~allowed_flags) == 0),
        characters((flags & LX_CHARACTERS) != 0),
        terminate((flags & LX_TERMINATE) != 0),
        null_terminated(length_given < 0),
        nothing((length_given == 0 || size_given <= 0) && (!terminate || size_given <= 0)),
        size(size_given > 0 ? static_cast<size_t>(size_given) - (terminate ? 1 : 0) : 0),
        length(!valid || nothing ? 0 : text_units(input, length_given)) {}

  /// In character mode a length that was given counts characters: turns it into bytes.
  void count_bytes(const Codepage& cp, const uint8_t* input, LXShiftState state) {
    if (characters && !null_terminated) length = bytes_of_chars(cp, input, state, static_cast<int32_t>(length));
  }

  /// Makes the terminator of a text without a length one of its characters.
  void take_terminator() {
    if (null_terminated) ++length;
    null_terminated = false;
  }
};

/// Only byte output can be limited in characters: in the other forms a unit is one.
template <class Sink>
bool limits_characters(const Request& request) {
  return request.characters && sizeof(typename Sink::Unit) == 1;
}

/// Returns to the single-byte state before a null. A double-byte character is taken back when the Shift-In does
/// not fit, and a double-byte run that this leaves empty vanishes with its Shift-Out; with no room for both
/// bytes the null stands alone.
template <class Sink>
void close_state(Sink& out, const typename Sink::Unit* start, const Request& request) {
  if constexpr (Sink::kShifts) {
    if (out.state != LX_SHIFT_DOUBLE) return;
    constexpr size_t kClosing = 2;
    const size_t size = request.size + (request.terminate ? 1 : 0);
    const auto written = [&] { return room(start, out.p); };
    const auto closing_fits = [&] { return request.characters || written() + kClosing <= size; };
    if (!closing_fits() && written() >= out.cp.width) out.take_back();
    if (written() > 0 && out.p[-1] == out.cp.shift_out)
      --out.p;
    else if (closing_fits())
      *out.p++ = out.take_shift_byte();
  }
}

/// Converts, ends the output, and returns the units or characters written.
template <class Value, class Cursor, class Sink>
int32_t convert(Cursor in, Sink out, const Request& request) {
  typename Sink::Unit* const start = out.p;
  const bool by_chars = limits_characters<Sink>(request);
  const auto moved = transfer<Value>(in, out, by_chars ? request.size : SIZE_MAX);
  const size_t used = by_chars ? moved.chars : static_cast<size_t>(out.p - start);
  const bool all = moved.stop == Stop::kInputEnd;
  const bool end = request.terminate || (request.null_terminated && all && used < request.size);
  if (end) {
    close_state(out, start, request);
    *out.p++ = 0;
  }
  return static_cast<int32_t>(by_chars ? moved.chars + end : static_cast<size_t>(out.p - start));
}

/// The end of an output of `size` units; a size in characters says nothing about its bytes.
uint8_t* output_end(uint8_t* output, const Request& request) {
  return request.characters ? no_end<uint8_t>() : end_of(output, request.size);
}

/// Which flags a conversion knows, and what it returns for others when LX_CHARACTERS is among them.
struct Rules {
  int32_t flags;
  int32_t invalid_in_characters;
};
constexpr Rules kBetweenLocales = {LX_TERMINATE | LX_CHARACTERS, 0};
constexpr Rules kUnicode = {LX_TERMINATE | LX_CHARACTERS, -1};
constexpr Rules kPacked = {LX_CHARACTERS, -1};

/// What every conversion begins and ends with. `body` converts, given the codepage of the locale that keeps the
/// error and the request. `other` is the second locale, or null where it is missing.
template <class Unit, class Body>
int32_t carry_out(LXLocale* locale, const LXLocale* other, int32_t size, const Unit* input, int32_t length,
                  int32_t flags, const Rules& rules, Body body) {
  Call call(unit, locale);
  if (!call || other == nullptr) return call.fail(LX_E_NOT_INITIALIZED, -1);
  Request request(size, input, length, flags, rules.flags);
  if (!request.valid) return call.fail(LX_E_INVALID, request.characters ? rules.invalid_in_characters : -1);
  if (request.nothing) return call.exit(0);
  return call.exit(body(codepage_of(call.codepage()), request));
}

int32_t convert_bytes(LXLocale* target, char* output, LXShiftState target_state, int32_t size, LXLocale* source,
                      const char* input, LXShiftState source_state, int32_t length, int32_t flags, Form form) {
  const LXLocale* from = locale_of(source);
  return carry_out(
      target, from, size, bytes_of(input), length, flags, kBetweenLocales,
      [&](const Codepage& out_cp, Request& request) {
        const Codepage& in_cp = codepage_of(*from->codepage);
        request.count_bytes(in_cp, bytes_of(input), source_state);
        uint8_t* const out = bytes_of(output);
        return with_cursor(in_cp, form, source_state, bytes_of(input), request.length, [&](auto reader) {
          return with_sink(out_cp, form, target_state, out, output_end(out, request),
                           [&](auto writer) { return convert<LXUChar>(reader, writer, request); });
        });
      });
}

int32_t to_unicode(LXUChar* output, int32_t size, LXLocale* locale, const char* input, LXShiftState state,
                   int32_t length, int32_t flags, Form form) {
  return carry_out(locale, locale_of(locale), size, bytes_of(input), length, flags, kUnicode,
                   [&](const Codepage& cp, Request& request) {
                     request.count_bytes(cp, bytes_of(input), state);
                     const UnicodeSink writer{output, end_of(output, request.size)};
                     return with_cursor(cp, form, state, bytes_of(input), request.length,
                                        [&](auto reader) { return convert<LXUChar>(reader, writer, request); });
                   });
}

int32_t from_unicode(LXLocale* locale, char* output, LXShiftState state, int32_t size, const LXUChar* input,
                     int32_t length, int32_t flags, Form form) {
  return carry_out(locale, locale_of(locale), size, input, length, flags, kUnicode,
                   [&](const Codepage& cp, Request& request) {
                     const UnicodeCursor reader{input, input + request.length};
                     uint8_t* const out = bytes_of(output);
                     return with_sink(cp, form, state, out, output_end(out, request),
                                      [&](auto writer) { return convert<LXUChar>(reader, writer, request); });
                   });
}

/// Bytes to packed codes. The terminating null of a text without a length is a character of it.
int32_t to_wide(LXLocale* locale, LXWChar* output, int32_t size, const char* input, LXShiftState state,
                int32_t length, int32_t flags, Form form) {
  return carry_out(locale, locale_of(locale), size, bytes_of(input), length, flags, kPacked,
                   [&](const Codepage& cp, Request& request) {
                     request.count_bytes(cp, bytes_of(input), state);
                     request.take_terminator();
                     const CodeSink writer{cp, output, end_of(output, request.size)};
                     return with_cursor(cp, form, state, bytes_of(input), request.length,
                                        [&](auto reader) { return convert<LXWChar>(reader, writer, request); });
                   });
}

/// Packed codes to bytes; the zero that ends codes without a length is one of them.
int32_t from_wide(LXLocale* locale, char* output, LXShiftState state, int32_t size, const LXWChar* input,
                  int32_t length, int32_t flags, Form form) {
  return carry_out(locale, locale_of(locale), size, input, length, flags, kPacked,
                   [&](const Codepage& cp, Request& request) {
                     request.take_terminator();
                     const CodeCursor reader{cp, input, input + request.length};
                     uint8_t* const out = bytes_of(output);
                     return with_sink(cp, form, state, out, output_end(out, request),
                                      [&](auto writer) { return convert<LXWChar>(reader, writer, request); });
                   });
}

/// The object of the common codepage, or null.
const LXObject* common_codepage() {
  int32_t rc = LX_OK;
  return object_by_id(LX_CODEPAGE, format::codepage::kCommonId, &rc);
}

}  // namespace

extern "C" {

int32_t LXConvertString(LXLocale* target, char* output, int32_t size, LXLocale* source, const char* input,
                        int32_t length, int32_t flags) {
  return convert_bytes(target, output, LX_SHIFT_SINGLE, size, source, input, LX_SHIFT_SINGLE, length, flags,
                       Form::kPlain);
}

int32_t LXConvertStringEx(LXLocale* target, char* output, LXShiftState target_state, int32_t size,
                          LXLocale* source, const char* input, LXShiftState source_state, int32_t length,
                          int32_t flags) {
  return convert_bytes(target, output, target_state, size, source, input, source_state, length, flags,
                       Form::kEx);
}

int32_t LXConvertStringW(LXLocale* target, LXWChar* output, int32_t size, LXLocale* source,
                         const LXWChar* input, int32_t length, int32_t flags) {
  const LXLocale* from = locale_of(source);
  return carry_out(
      target, from, size, input, length, flags, kBetweenLocales,
      [&](const Codepage& cp, const Request& request) {
        const CodeCursor reader{codepage_of(*from->codepage), input, input + request.length};
        return convert<LXUChar>(reader, CodeSink{cp, output, end_of(output, request.size)}, request);
      });
}

int32_t LXMbToWide(LXLocale* locale, LXWChar* output, int32_t size, const char* input, int32_t length,
                   int32_t flags) {
  return to_wide(locale, output, size, input, LX_SHIFT_SINGLE, length, flags, Form::kPlain);
}

int32_t LXMbToWideEx(LXLocale* locale, LXWChar* output, int32_t size, const char* input, LXShiftState state,
                     int32_t length, int32_t flags) {
  return to_wide(locale, output, size, input, state, length, flags, Form::kEx);
}

int32_t LXWideToMb(LXLocale* locale, char* output, int32_t size, const LXWChar* input, int32_t length,
                   int32_t flags) {
  return from_wide(locale, output, LX_SHIFT_SINGLE, size, input, length, flags, Form::kPlain);
}

int32_t LXWideToMbEx(LXLocale* locale, char* output, LXShiftState state, int32_t size, const LXWChar* input,
                     int32_t length, int32_t flags) {
  return from_wide(locale, output, state, size, input, length, flags, Form::kEx);
}

int32_t LXStringToUnicode(LXUChar* output, int32_t size, LXLocale* locale, const char* input, int32_t length,
                          int32_t flags) {
  return to_unicode(output, size, locale, input, LX_SHIFT_SINGLE, length, flags, Form::kPlain);
}

int32_t LXStringToUnicodeEx(LXUChar* output, int32_t size, LXLocale* locale, const char* input,
                            LXShiftState state, int32_t length, int32_t flags) {
  return to_unicode(output, size, locale, input, state, length, flags, Form::kEx);
}

int32_t LXStringToUnicodeW(LXUChar* output, int32_t size, LXLocale* locale, const LXWChar* input,
                           int32_t length, int32_t flags) {
  return carry_out(
      locale, locale_of(locale), size, input, length, flags, kUnicode,
      [&](const Codepage& cp, const Request& request) {
        const CodeCursor reader{cp, input, input + request.length};
        return convert<LXUChar>(reader, UnicodeSink{output, end_of(output, request.size)}, request);
      });
}

int32_t LXUnicodeToString(LXLocale* locale, char* output, int32_t size, const LXUChar* input, int32_t length,
                          int32_t flags) {
  return from_unicode(locale, output, LX_SHIFT_SINGLE, size, input, length, flags, Form::kPlain);
}

int32_t LXUnicodeToStringEx(LXLocale* locale, char* output, LXShiftState state, int32_t size,
                            const LXUChar* input, int32_t length, int32_t flags) {
  return from_unicode(locale, output, state, size, input, length, flags, Form::kEx);
}

int32_t LXUnicodeToStringW(LXLocale* locale, LXWChar* output, int32_t size, const LXUChar* input,
                           int32_t length, int32_t flags) {
  return carry_out(
      locale, locale_of(locale), size, input, length, flags, kUnicode,
      [&](const Codepage& cp, const Request& request) {
        const UnicodeCursor reader{input, input + request.length};
        return convert<LXUChar>(reader, CodeSink{cp, output, end_of(output, request.size)}, request);
      });
}

int32_t LXCpStrToUnicode(const LXObject* codepage, const char* input, int32_t length, LXUChar* output) {
  if (!initialized()) return -1;
  const size_t bytes = units_up_to(input, length);
  if (length < 0 && bytes == 0) return -1;
  return with_cursor(codepage_of(*codepage), Form::kEx, LX_SHIFT_SINGLE, bytes_of(input), bytes,
                     [&](auto reader) {
                       UnicodeSink writer{output, no_end<LXUChar>()};
                       transfer<LXUChar>(reader, writer, SIZE_MAX);
                       return static_cast<int32_t>(writer.p - output);
                     });
}

int32_t LXCpUnicodeToStr(const LXObject* codepage, const LXUChar* input, LXShiftState state, int32_t length,
                         char* output) {
  if (!initialized()) return 0;
  const size_t units = text_units(input, length);
  return with_sink(codepage_of(*codepage), Form::kEx, state, bytes_of(output), no_end<uint8_t>(),
                   [&](auto writer) {
                     UnicodeCursor reader{input, input + units};
                     transfer<LXUChar>(reader, writer, SIZE_MAX);
                     return static_cast<int32_t>(writer.p - bytes_of(output));
                   });
}

int32_t LXComStrToUnicode(const char* input, int32_t length, LXUChar* output) {
  const LXObject* common = common_codepage();
  const int32_t n = common != nullptr ? static_cast<int32_t>(units_up_to(input, length)) : 0;
  for (int32_t i = 0; i < n; ++i) output[i] = codepage_of(*common).unicode[bytes_of(input)[i]];
  output[n] = 0;
  return n != 0 ? n : -1;
}

int32_t LXComUnicodeToStr(const LXUChar* input, int32_t length, char* output) {
  const LXObject* common = common_codepage();
  const int32_t n = common != nullptr ? static_cast<int32_t>(units_up_to(input, length)) : 0;
  uint8_t* out = bytes_of(output);
  for (int32_t i = 0; i < n; ++i) out += store_unicode(codepage_of(*common), input[i], out);
  *out = 0;
  return n != 0 ? n : -1;
}

}  // extern "C"
