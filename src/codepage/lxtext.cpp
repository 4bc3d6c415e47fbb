// Counts of characters and bytes, and how much of a text fits.
#include "codepage/lxtext.h"

namespace lx {
namespace {

constexpr size_t kMostBytesAround = 8;  // more than a character and its shift bytes take

/// Passes at most `most` characters as LX_CHARACTERS counts them, with the shift bytes on both sides; none at the
/// end and before a character that it cuts. How many there were.
template <class Cursor>
size_t pass_counted(Cursor* in, size_t most) {
  if constexpr (Cursor::kShifts) {
    size_t chars = 0;
    for (Cursor ahead(*in); chars < most && ahead.pass(); ++chars) {
      ahead.pass_shift();
      go_on_at(*in, ahead);
    }
    return chars;
  } else {
    return pass_chars(in, most);
  }
}

}  // namespace

size_t bytes_of_chars(const Codepage& cp, const uint8_t* text, LXShiftState state, int32_t chars, size_t most) {
  const uint8_t* const end = most == SIZE_MAX ? no_end<const uint8_t>() : text + most;
  return with_kind<uint8_t>(cp, Form::kEx, [&](auto kind) {
    auto in = decltype(kind)::Cursor::over(cp, text, end, state);
    pass_counted(&in, chars > 0 ? static_cast<size_t>(chars) : 0);
    return room(text, in.p);
  });
}

int32_t chars_counted(const Codepage& cp, const uint8_t* text, LXShiftState state, size_t bytes) {
  return with_cursor(cp, Form::kEx, state, text, bytes,
                     [](auto in) { return static_cast<int32_t>(pass_counted(&in, SIZE_MAX)); });
}

int32_t chars_before(const Codepage& cp, const ByteText& text, const ByteText& rest, const uint8_t* end) {
  if (room(rest.p, end) <= kMostBytesAround) return -1;
  return with_kind<uint8_t>(cp, Form::kEx, [&](auto kind) {
    auto in = decltype(kind)::Cursor::over(cp, text.p, end, text.state);
    int32_t chars = 0;
    if constexpr (!decltype(in)::kShifts) {
      in.end = rest.p;
      chars = static_cast<int32_t>(pass_chars(&in, SIZE_MAX));
    } else {
      auto other = like(in, rest.p, room(rest.p, end), rest.state);
      // Shift bytes side by side may be told apart in other ways from here than from there: until both agree.
      while (in.p != other.p || in.state != other.state) {
        const bool first = in.p <= other.p;
        if (pass_counted(first ? &in : &other, 1) == 0) return -1;
        chars += first ? 1 : -1;
      }
    }
    return chars;
  });
}

int32_t chars_in_bytes(const Codepage& cp, const uint8_t* text, LXShiftState state, size_t bytes) {
  return with_cursor(cp, Form::kEx, state, text, bytes,
                     [](auto in) { return static_cast<int32_t>(pass_all(&in)); });
}

Part whole_chars(const Codepage& cp, Form form, const uint8_t* text, LXShiftState state, size_t bytes,
                 size_t text_bytes) {
  return with_cursor(cp, form, state, text, bytes, [&](auto in) {
    size_t chars = 0;
    if constexpr (!decltype(in)::kShifts) chars = pass_all(&in);
    for (auto ahead(in); ahead.pass(); go_on_at(in, ahead)) ++chars;  // a shift byte before no character stays
    if constexpr (decltype(in)::kShifts)
      if (in.p < in.end && cp.is_shift(*in.p) && (*in.p == cp.shift_in || in.p + 1 == text + text_bytes))
        ++in.p;
    return Part{room(text, in.p), chars};
  });
}

LXShiftState state_behind(const Codepage& cp, const uint8_t* text, LXShiftState state, size_t bytes) {
  if (!cp.shift_sensitive) return state;
  ShiftCursor in{cp, text, text + bytes, state};
  pass_all(&in);
  return in.state;
}

Part copy_chars(const Codepage& cp, Form form, LXShiftState state, const uint8_t* text, size_t bytes,
                size_t chars, uint8_t* out) {
  return with_cursor(cp, form, state, text, bytes, [&](auto in) {
    const size_t n = pass_chars(&in, chars);
    size_t copied = room(text, in.p);
    memcpy(out, text, copied);
    if (state_at(in, LX_SHIFT_SINGLE) == LX_SHIFT_DOUBLE && copied != 0) out[copied++] = cp.shift_in;
    return Part{copied, n};
  });
}

Part part_that_fits(const Codepage& cp, Form form, const ByteText& text, int32_t size, bool characters) {
  if (size < 1 || text.length == 0) return {0, 0};
  const size_t given = text_units_with_null(text.p, text.length);
  const size_t wanted = static_cast<size_t>(size);
  if (!characters) return whole_chars(cp, form, text.p, text.state, least(given, wanted), given);
  const bool to_null = text.length < 0;
  const size_t there = to_null ? static_cast<size_t>(chars_in_bytes(cp, text.p, text.state, given)) : given;
  const size_t chars = least(there, wanted);
  // Two shift bytes side by side may be counted as a character; the null still ends the text.
  const size_t most = to_null ? given : SIZE_MAX;
  return {bytes_of_chars(cp, text.p, text.state, static_cast<int32_t>(chars), most), chars};
}

}  // namespace lx
