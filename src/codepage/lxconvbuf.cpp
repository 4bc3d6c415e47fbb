// Streaming conversion: a handle keeps the bytes of a character that an input buffer cut, those that an output
// buffer had no room for, and the shift states of both sides.
#include <string.h>

#include "codepage/lxtransfer.h"
#include "core/lxcall.h"
#include "core/lxmemory.h"

using namespace lx;

/// The handle. A pending character has up to 4 bytes, a pending output a shift byte before them.
struct LXConversion {
  LXLocale* source;
  uint8_t pending_in[5];
  uint8_t source_state;
  uint8_t pending_in_count;
  LXLocale* target;
  uint8_t pending_out[5];
  uint8_t target_state;
  uint8_t pending_out_count;
};
static_assert(sizeof(void*) != 4 || sizeof(LXConversion) == 24, "conversion handle");

namespace {

RAS1_Unit unit = RAS1_UNIT("lxconvbuf");

/// memcpy, also where there is nothing to copy and no place for it.
void copy(uint8_t* to, const uint8_t* from, size_t bytes) {
  if (bytes != 0) memcpy(to, from, bytes);
}

/// One call of LXConvertBuffer: the caller's four values and the handle.
class Stream {
 public:
  Stream(LXConversion* conversion, const uint8_t* in, size_t in_left, uint8_t* out, size_t out_left)
      : c_(conversion),
        in_cp_(codepage_of(*conversion->source->codepage)),
        out_cp_(codepage_of(*conversion->target->codepage)),
        in_(in),
        in_end_(in + in_left),
        out_(out),
        out_end_(out + out_left) {}

  int32_t run() {
    if (c_->pending_out_count != 0 && !flush_pending()) return LX_E_OUTPUT_FULL;
    bool held = false;
    LXUChar u = 0;
    if (c_->pending_in_count != 0) {
      if (!complete_pending(&u)) return LX_E_INPUT_CUT;
      held = true;
    } else if (in_ == in_end_) {
      return LX_OK;
    }
    return with_cursor(in_cp_, Form::kEx, c_->source_state, in_, left_in(), [&](auto reader) {
      return with_sink(out_cp_, Form::kEx, c_->target_state, out_, out_end_,
                       [&](auto writer) { return move(reader, writer, held, u); });
    });
  }

  const uint8_t* in() const { return in_; }
  size_t left_in() const { return static_cast<size_t>(in_end_ - in_); }
  uint8_t* out() const { return out_; }
  size_t left_out() const { return static_cast<size_t>(out_end_ - out_); }

 private:
  /// Hands out pending output; false when there is more. Of what stays, only as many bytes as stay less those
  /// just taken move to the front, so that pending output that is taken in several pieces comes out damaged.
  /// Callers that give at least 8 bytes of room take it at once.
  bool flush_pending() {
    if (left_out() == 0) return false;
    const size_t n = left_out() < c_->pending_out_count ? left_out() : c_->pending_out_count;
    copy(out_, c_->pending_out, n);
    out_ += n;
    c_->pending_out_count = static_cast<uint8_t>(c_->pending_out_count - n);
    if (c_->pending_out_count == 0) return true;
    if (c_->pending_out_count > n) memmove(c_->pending_out, c_->pending_out + n, c_->pending_out_count - n);
    return false;
  }

  /// A shift byte among them is the first byte of a character: no cursor walks them.
  size_t pending_length() const {
    return in_cp_.shift_sensitive ? in_cp_.width_in(c_->source_state) : in_cp_.length(c_->pending_in[0]);
  }

  /// Completes the character that the last input cut; false when this input does not either.
  bool complete_pending(LXUChar* u) {
    const size_t need = pending_length() - c_->pending_in_count;
    const size_t n = need < left_in() ? need : left_in();
    copy(c_->pending_in + c_->pending_in_count, in_, n);
    in_ += n;
    c_->pending_in_count = static_cast<uint8_t>(c_->pending_in_count + n);
    if (n < need) return false;
    *u = pending_length() == 1 ? in_cp_.unicode[c_->pending_in[0]] : multibyte_unicode(in_cp_, c_->pending_in);
    c_->pending_in_count = 0;
    return true;
  }

  template <class Cursor, class Sink>
  int32_t move(Cursor in, Sink out, bool held, LXUChar u) {
    int32_t result = LX_OK;
    if (held && !out.put(u)) {
      result = spill(out, u);
    } else {
      const auto moved = transfer<LXUChar>(in, out, SIZE_MAX);
      if (moved.stop == Stop::kOutputFull) result = spill(out, moved.held);
      if (moved.stop == Stop::kInputCut) result = keep_input(in);
    }
    in_ = in.p;
    out_ = out.p;
    c_->source_state = static_cast<uint8_t>(state_at(in, c_->source_state));
    c_->target_state = static_cast<uint8_t>(state_at(out, c_->target_state));
    return result;
  }

  /// Keeps the first bytes of a character that the input cuts.
  template <class Cursor>
  int32_t keep_input(Cursor& in) {
    const size_t n = room(in.p, in.end);
    copy(c_->pending_in, in.p, n);
    c_->pending_in_count = static_cast<uint8_t>(n);
    in.p += n;
    return LX_E_INPUT_CUT;
  }

  /// Writes what fits of a character that does not fit, and keeps the rest. The target state is switched now:
  /// the pending bytes belong to the new one.
  template <class Sink>
  int32_t spill(Sink& out, LXUChar u) {
    uint8_t bytes[1 + kMaxCharBytes];
    Sink whole = Sink::over(out_cp_, bytes, bytes + sizeof(bytes), state_at(out, LX_SHIFT_SINGLE));
    whole.put(u);
    const size_t count = room(bytes, whole.p);
    const size_t fitting = room(out.p, out.end);
    copy(out.p, bytes, fitting);
    copy(c_->pending_out, bytes + fitting, count - fitting);
    c_->pending_out_count = static_cast<uint8_t>(count - fitting);
    whole.p = out.end;
    go_on_at(out, whole);
    return LX_E_OUTPUT_FULL;
  }

  LXConversion* c_;
  const Codepage& in_cp_;
  const Codepage& out_cp_;
  const uint8_t* in_;
  const uint8_t* in_end_;
  uint8_t* out_;
  uint8_t* out_end_;
};

size_t length_left(int32_t left) {
  return left > 0 ? static_cast<size_t>(left) : 0;
}

}  // namespace

extern "C" {

LXConversion* LXOpenConversion(LXLocale* target, LXLocale* source) {
  Call call(unit, target);
  LXConversion* const none = nullptr;
  LXLocale* from = locale_of(source);
  if (!call || from == nullptr) return call.fail(LX_E_NOT_INITIALIZED, none);
  auto* conversion = static_cast<LXConversion*>(hook_allocate_zeroed(sizeof(LXConversion)));
  if (conversion == nullptr) return call.fail(LX_E_MEMORY, none);
  conversion->source = from;
  conversion->target = call.locale();
  return call.exit(conversion);
}

int32_t LXCloseConversion(LXConversion* conversion) {
  Events events(unit);
  if (!initialized()) return events.exit(LX_E_NOT_INITIALIZED);
  return events.exit(hook_free(conversion) ? LX_OK : LX_E_FREE);
}

int32_t LXConvertBuffer(LXConversion* conversion, char** output, int32_t* output_left, const char** input,
                        int32_t* input_left) {
  Call call(unit, initialized() ? conversion->target : nullptr);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, LX_E_NOT_INITIALIZED);
  Stream stream(conversion, bytes_of(*input), length_left(*input_left), bytes_of(*output),
                length_left(*output_left));
  const int32_t result = stream.run();
  *input = reinterpret_cast<const char*>(stream.in());
  *input_left = static_cast<int32_t>(stream.left_in());
  *output = reinterpret_cast<char*>(stream.out());
  *output_left = static_cast<int32_t>(stream.left_out());
  return call.end(result, result);
}

int32_t LXConversionRatio(LXLocale* target, LXLocale* source) {
  Call call(unit, target);
  const LXLocale* from = locale_of(source);
  if (!call || from == nullptr) return call.fail(LX_E_NOT_INITIALIZED, 1);
  if (call.codepage().disk.id == from->codepage->disk.id) return call.exit(1);
  const Codepage& cp = codepage_of(call.codepage());
  return call.exit(static_cast<int32_t>(cp.width + (cp.shift_sensitive ? 1 : 0)));
}

}  // extern "C"
