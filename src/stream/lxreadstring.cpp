// Reading strings and lines from a stream. Characters are read one by one; what ends a string and cannot be
// stored goes back into the stream.
#include <cstring>

#include "codepage/lxtext.h"
#include "core/lxcall.h"
#include "stream/lxeol.h"
#include "stream/lxstream.h"

using namespace lx;

namespace {

RAS1_Unit unit = RAS1_UNIT("lxreadstring");

constexpr uint32_t kFlags = LX_EOL_ALL | LX_DROP_RETURNS | LX_TERMINATE | LX_CHARACTERS;
constexpr int32_t kAtEnd = -1;
constexpr int32_t kFailed = -2;

/// The characters of a stream, as packed codes or as 16-bit units.
template <class Value>
struct Source {
  const Codepage& cp;
  LXStream& stream;
  StreamChar held{};  // the character read last
  Value value = 0;

  int32_t next() {
    if constexpr (sizeof(Value) == sizeof(LXUChar)) {
      const int32_t code = read_unit(stream, &held);
      if (code == LX_OK) value = unit_of(held);
      return code;
    } else {
      const int32_t code = read_char(cp, stream, &held);
      if (code == LX_OK) value = pack(held.bytes, held.length);
      return code;
    }
  }
  /// Whether it can be a line-end character.
  bool one_unit() const { return sizeof(Value) == sizeof(LXUChar) || held.length == 1; }
  /// There is room: it was taken out of the buffer, or read when that was empty.
  void put_back(const StreamChar& c) { push_back(cp, stream, c); }
};

template <class Sink>
class Line {
 public:
  using Value = std::conditional_t<std::is_same_v<Sink, UnicodeSink>, LXUChar, LXWChar>;

  Line(const Codepage& cp, LXStream& stream, const Sink& out, size_t most_chars, uint32_t flags)
      : in_{cp, stream},
        out_(out),
        most_chars_(most_chars),
        ends_(cp, flags & LX_EOL_ALL),
        drop_returns_((flags & LX_DROP_RETURNS) != 0) {}

  /// Reads it. LX_OK when it is full or its line ended, else what ended the reading.
  int32_t read() {
    while (has_room()) {
      const int32_t code = in_.next();
      if (code != LX_OK) return code;
      const uint32_t kind = in_.one_unit() ? ends_.kind_of(in_.value) : 0;
      if (is_return() && (drop_returns_ || ends_.any(LX_EOL_CRLF))) {
        if (!fits(in_.value)) return put_back(in_.held);
        const Step step = read_behind_return(in_.held, kind);
        if (step.ended) return step.code;
        continue;
      }
      if (!put(in_.value)) return put_back(in_.held);
      if (kind != 0) return LX_OK;
    }
    return LX_OK;
  }

  size_t chars() const { return chars_; }
  /// Where the text ends, in the single-byte state.
  typename Sink::Unit* close() {
    close_text(out_);
    return out_.p;
  }

 private:
  struct Step {
    bool ended;
    int32_t code;
  };

  bool has_room() const { return chars_ < most_chars_ && out_.p != out_.end; }
  bool is_return() const { return in_.one_unit() && in_.value == ends_.carriage_return; }
  bool put(Value value) {
    if (!has_room() || !out_.put(value)) return false;
    ++chars_;
    return true;
  }
  /// Whether there is room: they are written to a place aside.
  template <class... Values>
  bool fits(Values... values) const {
    typename Sink::Unit aside[8];  // two line ends, or a character with its shift bytes
    Sink probe(out_);
    probe.p = aside;
    probe.end = aside + least(room(out_.p, out_.end), sizeof(aside) / sizeof(*aside));
    return (probe.put(values) && ...);
  }
  bool pair_fits() const {
    return drop_returns_ || (most_chars_ - chars_ > 1 && fits(ends_.carriage_return, ends_.line_feed));
  }
  int32_t put_back(const StreamChar& c) {
    in_.put_back(c);
    return LX_OK;
  }

  /// A carriage return was read that fits, and that ends a line itself when it has a kind: what follows
  /// decides. A pair that does not fit stays in the stream, so that it is found when the next string is read;
  /// where it stands alone, the carriage return is stored, so that there is a next one.
  Step read_behind_return(const StreamChar carriage_return, uint32_t kind) {
    const int32_t code = in_.next();
    if (code > LX_OK) {
      in_.put_back(carriage_return);
      return {true, code};
    }
    const bool pair = code == LX_OK && in_.one_unit() && in_.value == ends_.line_feed;
    const bool whole = pair && pair_fits();
    if (code == LX_OK && !whole) in_.put_back(in_.held);
    if (pair && !whole && chars_ != 0) return {true, put_back(carriage_return)};
    if (!whole || !drop_returns_) put(ends_.carriage_return);
    if (!whole) return {code != LX_OK || kind != 0, code};
    put(ends_.line_feed);
    return {kind != 0 || ends_.any(LX_EOL_CRLF) || ends_.kind_of(ends_.line_feed) != 0, LX_OK};
  }

  Source<Value> in_;
  Sink out_;
  size_t most_chars_;
  LineEnds<Value> ends_;
  bool drop_returns_;
  size_t chars_ = 0;
};

/// Calls `body` with the form's sink. Packed codes are stored as they are, so that all codepages without shift
/// states have the same one.
template <class Unit, class Body>
int32_t with_line_sink(const Codepage& cp, Form form, Unit* p, Unit* end, Body body) {
  if constexpr (sizeof(Unit) == 1)
    if (form != Form::kEx || !cp.shift_sensitive) return body(MultiByteSink{cp, p, end});
  return with_kind<Unit, ClosedShiftSink>(cp, form, [&](auto kind) { return body(kind.sink(cp, p, end)); });
}

template <class Unit>
int32_t read_string(LXStream* stream, LXLocale* given, Form form, Unit* output, int32_t size, uint32_t flags) {
  Call call(unit, given);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, kFailed);
  if (stream->direction != kReadStream) return call.fail(LX_E_STREAM_DIRECTION, kFailed);
  if ((flags & ~kFlags) != 0) return call.fail(LX_E_INVALID, kFailed);
  const Codepage& cp = codepage_of(call.codepage());
  const bool by_chars = sizeof(Unit) == 1 && (flags & LX_CHARACTERS) != 0;
  const size_t given_room = size > 0 ? static_cast<size_t>(size) : 0;
  const size_t nulls = (flags & LX_TERMINATE) != 0 && given_room != 0 ? 1 : 0;
  const size_t most = given_room - nulls;
  Unit* const end = by_chars ? no_end<Unit>() : end_of(output, most);
  return with_line_sink(cp, form, output, end, [&](const auto& out) {
    Line line(cp, *stream, out, most, flags);
    const int32_t code = line.read();
    if (line.chars() == 0 && code != LX_OK) return code > LX_OK ? call.fail(code, kFailed) : call.exit(kAtEnd);
    Unit* const behind = line.close();
    if (nulls != 0) *behind = 0;
    const size_t count = by_chars ? line.chars() : room(output, behind);
    return call.end(code > LX_OK ? code : LX_OK, static_cast<int32_t>(count + nulls));
  });
}

}  // namespace

extern "C" {

int32_t LXReadString(LXStream* stream, LXLocale* locale, char* output, int32_t size, uint32_t flags) {
  return read_string(stream, locale, Form::kPlain, bytes_of(output), size, flags);
}
int32_t LXReadStringEx(LXStream* stream, LXLocale* locale, char* output, int32_t size, uint32_t flags) {
  return read_string(stream, locale, Form::kEx, bytes_of(output), size, flags);
}
int32_t LXReadStringW(LXStream* stream, LXLocale* locale, LXWChar* output, int32_t size, uint32_t flags) {
  return read_string(stream, locale, Form::kPlain, output, size, flags);
}
int32_t LXReadStringU(LXStream* stream, LXLocale* locale, LXUChar* output, int32_t size, uint32_t flags) {
  return read_string(stream, locale, Form::kPlain, output, size, flags);
}

}  // extern "C"
