// Conversion of whole strings: between two codepages, to and from packed codes, to and from Unicode. One flow
// for all of them over a cursor and a sink; the doors below say what they read and write.
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

/// Which flags a conversion knows, and what it returns for others when LX_CHARACTERS is among them.
struct Rules {
  int32_t flags;
  int32_t invalid_in_characters;
};
template <class In, class Out>
constexpr bool kUnicode = std::is_same_v<In, LXUChar> || std::is_same_v<Out, LXUChar>;
/// Between bytes and packed codes, which are of the same codepage.
template <class In, class Out>
constexpr bool kPacked = !kUnicode<In, Out> && sizeof(In) != sizeof(Out);
template <class In, class Out>
constexpr Rules kRules{kPacked<In, Out> ? LX_CHARACTERS : LX_TERMINATE | LX_CHARACTERS,
                       kPacked<In, Out> || kUnicode<In, Out> ? -1 : 0};

/// A caller's buffer, and the shift state that its text begins in.
template <class Unit>
struct Buffer {
  Unit* p;
  int32_t size;
  LXShiftState state = LX_SHIFT_SINGLE;
};
Buffer<uint8_t> buffer_of(char* p, int32_t size, LXShiftState state = LX_SHIFT_SINGLE) {
  return {bytes_of(p), size, state};
}

// Short texts are converted at once, where all that they may become fits.

/// The units of a text that is short, and of which nothing else is asked for than a null behind it; else 0.
template <class Unit>
size_t short_units(const Text<Unit>& text, int32_t flags) {
  if ((flags & ~LX_TERMINATE) != 0) return 0;
  const size_t units =
      text.length < 0 ? units_before_null(text.p, kRunSlack + 1) : static_cast<size_t>(text.length);
  return units <= kRunSlack ? units : 0;
}

/// Whether there are characters of several bytes that are not UTF-8.
bool has_pairs(const Codepage& cp) {
  return !cp.single_byte && !cp.utf8;
}

/// The values of a text: how many, or 0 when it holds what is read otherwise.
template <Form kForm>
size_t read_short(const Codepage& cp, const uint8_t* p, size_t bytes, LXUChar* values, RunRule rule) {
  return with_cursor(cp, kForm, LX_SHIFT_SINGLE, p, bytes, [&](auto in) {
    size_t count = in.read_run(values, bytes, rule);
    if constexpr (decltype(in)::kShifts)
      for (LXUChar u = 0; in.next(&u);) values[count++] = u;
    return in.p == in.end ? count : 0;
  });
}

/// Writes them, and returns to the single-byte state where the text is to be closed: how many bytes, or 0 when there may
/// be no room.
template <Form kForm>
size_t write_short(const Codepage& cp, uint8_t* p, size_t size, bool closed, const LXUChar* values,
                   size_t count) {
  return with_kind<uint8_t>(cp, kForm, [&](auto kind) -> size_t {
    auto out = kind.sink(cp, p, p + size, LX_SHIFT_SINGLE);
    constexpr bool kShifts = decltype(out)::kShifts;
    if (count > (size - kShifts) / out.most_units()) return 0;
    out.put_run(values, count);
    if constexpr (kShifts)
      if (closed && out.state == LX_SHIFT_DOUBLE) {
        if (out.p[-1] == cp.shift_out) return 0;  // close_state() has its way with it
        *out.p++ = out.take_shift_byte();
      }
    return room(p, out.p);
  });
}

template <Form kForm>
size_t convert_short(const Codepage&, LXUChar* to, size_t size, bool, const Codepage& in_cp,
                     const uint8_t* text, size_t bytes) {
  return size < bytes ? 0 : read_short<kForm>(in_cp, text, bytes, to, {});
}
template <Form kForm>
size_t convert_short(const Codepage& out_cp, uint8_t* to, size_t size, bool closed, const Codepage&,
                     const LXUChar* text, size_t units) {
  return write_short<kForm>(out_cp, to, size, closed, text, units);
}
template <Form kForm>
size_t convert_short(const Codepage& out_cp, uint8_t* to, size_t size, bool closed, const Codepage& in_cp,
                     const uint8_t* text, size_t bytes) {
  const bool pairs =
      (has_pairs(in_cp) || has_pairs(out_cp)) && !in_cp.shift_sensitive && !out_cp.shift_sensitive;
  if (bytes < (pairs ? vectors->pair_pivot_bytes : vectors->pivot_bytes)) return 0;
  const unsigned below = in_cp.same_below < out_cp.same_below ? in_cp.same_below : out_cp.same_below;
  if (below != 0 && bytes <= size && vectors->copy_same(to, text, bytes, below)) return bytes;
  if (in_cp.single_byte && out_cp.single_byte) {
    if (bytes > size) return 0;
    const SingleByteSink out{out_cp, to, to + bytes};
    for (size_t i = 0; i < bytes; ++i) to[i] = out.encode(in_cp.unicode[text[i]]);
    return bytes;
  }
  LXUChar values[2 * kRunSlack];
  return write_short<kForm>(out_cp, to, size, closed, values,
                            read_short<kForm>(in_cp, text, bytes, values, {0, kRunSlack}));
}

/// A text that is converted at once, and ended: the units written, or 0 where it is not.
template <Form kForm, class Out, class In>
[[gnu::always_inline]] inline size_t convert_at_once(const Codepage& out_cp, const Buffer<Out>& to,
                                                     const Codepage& in_cp, const Text<In>& text,
                                                     int32_t flags) {
  const size_t units = to.size > 0 ? short_units(text, flags) : 0;
  if (units == 0) return 0;
  const bool end = text.length < 0 || flags != 0;
  const size_t size = static_cast<size_t>(to.size) - end;
  const size_t written = convert_short<kForm>(out_cp, to.p, size, end, in_cp, text.p, units);
  if (written == 0) return 0;
  if (end) to.p[written] = 0;
  return written + end;
}

/// The same with shift states. Not inline: texts without them go on as if it were not there.
template <class Out, class In>
[[gnu::noinline]] size_t convert_shifts_at_once(const Codepage& out_cp, const Buffer<Out>& to,
                                                const Codepage& in_cp, const Text<In>& text, int32_t flags) {
  if (text.state != LX_SHIFT_SINGLE || to.state != LX_SHIFT_SINGLE || to.size < 2) return 0;
  return convert_at_once<Form::kEx>(out_cp, to, in_cp, text, flags);
}

/// Every conversion: from text of the source's codepage to text of the target's, which keeps the error.
template <class Out, class In>
int32_t convert_text(LXLocale* target, Buffer<Out> to, LXLocale* source, Text<In> text, int32_t flags,
                     Form form) {
  using Value = std::conditional_t<kPacked<In, Out>, LXWChar, LXUChar>;
  constexpr Rules kMine = kRules<In, Out>;
  Call call(unit, target);
  const LXLocale* const from = locale_of(source);
  if (!call || from == nullptr) return call.fail(LX_E_NOT_INITIALIZED, -1);
  if constexpr (sizeof(In) + sizeof(Out) <= sizeof(uint8_t) + sizeof(LXUChar)) {
    const Codepage& in_cp = codepage_of(*from->codepage);
    const Codepage& out_cp = codepage_of(call.codepage());
    const bool shifts = form == Form::kEx && (in_cp.shift_sensitive || out_cp.shift_sensitive);
    if (kManyRegisters && !shifts)
      if (const size_t written = convert_at_once<Form::kPlain>(out_cp, to, in_cp, text, flags))
        return call.exit(static_cast<int32_t>(written));
    if (kManyRegisters && shifts)
      if (const size_t written = convert_shifts_at_once(out_cp, to, in_cp, text, flags))
        return call.exit(static_cast<int32_t>(written));
  }
  Request request(to.size, text.p, text.length, flags, kMine.flags);
  if (!request.valid) return call.fail(LX_E_INVALID, request.characters ? kMine.invalid_in_characters : -1);
  if (request.nothing) return call.exit(0);
  const Codepage& in_cp = codepage_of(*from->codepage);
  const Codepage& out_cp = codepage_of(call.codepage());
  if constexpr (sizeof(In) == 1) request.count_bytes(in_cp, text.p, text.state);
  if constexpr (kPacked<In, Out>) request.take_terminator();
  // A size in characters says nothing about the end of bytes.
  const bool endless = sizeof(Out) == 1 && request.characters;
  Out* const end = endless ? no_end<Out>() : end_of(to.p, request.size);
  return call.exit(with_sink(out_cp, form, to.state, to.p, end, [&](const auto& writer) {
    return with_cursor(in_cp, form, text, request.length,
                       [&](auto reader) { return convert<Value>(reader, writer, request); });
  }));
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
  return convert_text(target, buffer_of(output, size), source, text_of(input, length), flags, Form::kPlain);
}

int32_t LXConvertStringEx(LXLocale* target, char* output, LXShiftState target_state, int32_t size,
                          LXLocale* source, const char* input, LXShiftState source_state, int32_t length,
                          int32_t flags) {
  return convert_text(target, buffer_of(output, size, target_state), source,
                      text_of(input, length, source_state), flags, Form::kEx);
}

int32_t LXConvertStringW(LXLocale* target, LXWChar* output, int32_t size, LXLocale* source,
                         const LXWChar* input, int32_t length, int32_t flags) {
  return convert_text(target, Buffer<LXWChar>{output, size}, source, text_of(input, length), flags,
                      Form::kWide);
}

int32_t LXMbToWide(LXLocale* locale, LXWChar* output, int32_t size, const char* input, int32_t length,
                   int32_t flags) {
  return convert_text(locale, Buffer<LXWChar>{output, size}, locale, text_of(input, length), flags,
                      Form::kPlain);
}

int32_t LXMbToWideEx(LXLocale* locale, LXWChar* output, int32_t size, const char* input, LXShiftState state,
                     int32_t length, int32_t flags) {
  return convert_text(locale, Buffer<LXWChar>{output, size}, locale, text_of(input, length, state), flags,
                      Form::kEx);
}

int32_t LXWideToMb(LXLocale* locale, char* output, int32_t size, const LXWChar* input, int32_t length,
                   int32_t flags) {
  return convert_text(locale, buffer_of(output, size), locale, text_of(input, length), flags, Form::kPlain);
}

int32_t LXWideToMbEx(LXLocale* locale, char* output, LXShiftState state, int32_t size, const LXWChar* input,
                     int32_t length, int32_t flags) {
  return convert_text(locale, buffer_of(output, size, state), locale, text_of(input, length), flags, Form::kEx);
}

int32_t LXStringToUnicode(LXUChar* output, int32_t size, LXLocale* locale, const char* input, int32_t length,
                          int32_t flags) {
  return convert_text(locale, Buffer<LXUChar>{output, size}, locale, text_of(input, length), flags,
                      Form::kPlain);
}

int32_t LXStringToUnicodeEx(LXUChar* output, int32_t size, LXLocale* locale, const char* input,
                            LXShiftState state, int32_t length, int32_t flags) {
  return convert_text(locale, Buffer<LXUChar>{output, size}, locale, text_of(input, length, state), flags,
                      Form::kEx);
}

int32_t LXStringToUnicodeW(LXUChar* output, int32_t size, LXLocale* locale, const LXWChar* input,
                           int32_t length, int32_t flags) {
  return convert_text(locale, Buffer<LXUChar>{output, size}, locale, text_of(input, length), flags,
                      Form::kWide);
}

int32_t LXUnicodeToString(LXLocale* locale, char* output, int32_t size, const LXUChar* input, int32_t length,
                          int32_t flags) {
  return convert_text(locale, buffer_of(output, size), locale, text_of(input, length), flags, Form::kPlain);
}

int32_t LXUnicodeToStringEx(LXLocale* locale, char* output, LXShiftState state, int32_t size,
                            const LXUChar* input, int32_t length, int32_t flags) {
  return convert_text(locale, buffer_of(output, size, state), locale, text_of(input, length), flags, Form::kEx);
}

int32_t LXUnicodeToStringW(LXLocale* locale, LXWChar* output, int32_t size, const LXUChar* input,
                           int32_t length, int32_t flags) {
  return convert_text(locale, Buffer<LXWChar>{output, size}, locale, text_of(input, length), flags,
                      Form::kWide);
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
