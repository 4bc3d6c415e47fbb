// Streams: what is written through transfers of any pieces is the text, and what is read through them is what was
// written; where transfers fail nothing beyond a buffer is touched. Line ends that are put are found.
#include "fuzz.h"

namespace lx::fuzz::stream {
namespace {

/// What lies beyond a stream: it moves what it likes, and at times fails.
struct Peer {
  Input& in;
  std::string bytes;
  bool fails = false, whole = false;
  size_t at = 0;

  static int32_t read(void* user, char* buffer, int32_t wanted) {
    Peer& peer = *static_cast<Peer*>(user);
    const int32_t count = peer.answer(wanted);
    if (count <= 0 || count > wanted) return count;
    const size_t given = std::min(static_cast<size_t>(count), peer.bytes.size() - peer.at);
    std::copy_n(peer.bytes.begin() + static_cast<ptrdiff_t>(peer.at), given, buffer);
    peer.at += given;
    return given == 0 ? -1 : static_cast<int32_t>(given);
  }
  static int32_t write(void* user, char* buffer, int32_t offered) {
    Peer& peer = *static_cast<Peer*>(user);
    const int32_t count = peer.answer(offered);
    if (count > 0 && count <= offered) peer.bytes.append(buffer, static_cast<size_t>(count));
    return count;
  }

 private:
  /// How many bytes are moved; or nothing now, a failure, a count that cannot be.
  int32_t answer(int32_t most) {
    static constexpr int32_t kFailures[] = {0, -1, 1000};
    const size_t kind = fails ? in.below(16) : std::size(kFailures);
    if (kind < std::size(kFailures)) return kFailures[kind];
    return whole ? most : 1 + static_cast<int32_t>(in.below(static_cast<uint32_t>(most)));
  }
};

class Open {
 public:
  Open(LXLocale* l, LXTransfer transfer, Peer* peer, uint32_t mode)
      : locale_(l), stream_(LXOpenStream(l, transfer, peer, mode)) {
    must(stream_ != nullptr, "a stream is opened");
  }
  ~Open() { LXCloseStream(stream_, locale_); }
  Open(const Open&) = delete;
  Open& operator=(const Open&) = delete;
  operator LXStream*() const { return stream_; }

 private:
  LXLocale* locale_;
  LXStream* stream_;
};

/// The bytes of a text with the Shift-In that ends it.
std::string closed(LXLocale* l, const Units& text) {
  states = {};
  std::string bytes = made<char>(
      [&](char* to, int32_t size) {
        return LXUnicodeToStringEx(l, to, 0, size, text.data(), count_of(text), LX_TERMINATE);
      },
      text.size() * 6 + 8);
  return bytes.pop_back(), bytes;
}

std::string write_all(Input& in, const Place& at, const Units& text) {
  LXLocale* const l = at.locale;
  Peer peer{in, {}, false, in.flag()};
  const Text<LXWChar> codes = encode(kWide, l, text);
  {
    const Open out(l, Peer::write, &peer, LX_STREAM_WRITE);
    for (const LXWChar code : codes) {
      char bytes[8];
      LXWToMb(bytes, code);
      const uint32_t way = in.below(3);
      must(way == 0               ? LXWriteCharW(out, l, code, 0)
           : way == 1 || at.shift ? LXWriteCharEx(out, l, bytes, code > 0xFF, 0)
                                  : LXWriteChar(out, l, bytes),
           "a character is written");
    }
    must(LXFlushStream(out, l) == 1, "nothing is left");
  }
  return peer.bytes;
}

template <class F>
Units read_strings(Input& in, const F& form, const Place& at, const std::string& bytes) {
  using Unit = typename F::Unit;
  LXLocale* const l = at.locale;
  Peer peer{in, bytes, false, sizeof(Unit) == 2};  // a unit wants both bytes
  const Open from(l, Peer::read, &peer, LX_STREAM_READ);
  const uint32_t ends = in.below(16) * LX_EOL_LF;
  Units all;
  for (;;) {
    const auto size = static_cast<int32_t>(8 + in.below(30));
    const Block<Unit> out(static_cast<size_t>(size));
    const int32_t got = form.read_string(from, l, out.data(), size, ends);
    if (got == -1) return all;
    must(got > 0 && got <= size, "a string is read");
    all += decode(form, l, Text<Unit>(out.data(), static_cast<size_t>(got)));
  }
}

void all_ways(Input& in, const Place& at, const Units& text) {
  LXLocale* const l = at.locale;
  const std::string bytes = closed(l, text);
  must(write_all(in, at, text) == bytes, "what is written is the text");
  Peer peer{in, bytes};
  const Text<LXWChar> codes = encode(kWide, l, text);
  const Open from(l, Peer::read, &peer, LX_STREAM_READ);
  for (const LXWChar code : codes) {
    must(LXReadCharW(from, l) == code, "what is read was written");
    char stored[8];
    LXWToMb(stored, code);
    const LXShiftState state = code > 0xFF ? LX_SHIFT_DOUBLE : LX_SHIFT_SINGLE;
    must((in.flag() ? LXUngetCharW(from, l, code) : LXUngetCharEx(from, l, stored, state)) == 1,
         "it is put back");
    must(LXReadCharW(from, l) == code, "and read again");
  }
  must(LXReadCharW(from, l) == LX_STREAM_END, "the end is the end");
  must(read_strings(in, kWide, at, bytes) == text, "strings of codes are the text");
  must(read_strings(in, kEx, at, bytes) == text, "strings of bytes too");
  if (!at.shift) must(read_strings(in, kPlain, at, bytes) == text, "and without a shift state");
  std::string units;
  Peer sink{in, {}};
  {
    const Open out(l, Peer::write, &sink, LX_STREAM_WRITE);
    for (const LXUChar unit : text) must(LXWriteCharU(out, l, unit) == 1, "a unit is written");
  }
  must(read_strings(in, kUnicode, at, sink.bytes) == text, "units are what they were");
}

void any_calls(Input& in, const Place& at) {
  LXLocale* const l = at.locale;
  Peer peer{in, in.bytes(60), true};
  const bool reads = in.flag();
  const Open stream(l, reads ? Peer::read : Peer::write, &peer, reads ? LX_STREAM_READ : LX_STREAM_WRITE);
  while (in.left() != 0) {
    const auto code = static_cast<LXWChar>(in.number(1 + in.below(4)));
    char text[8] = {};
    LXPutChar(l, text, code);
    const auto size = in.below(12);
    uint32_t flags = in.below(32) * LX_EOL_LF / 2;
    flags |= in.one_of({0u, uint32_t{LX_TERMINATE}, uint32_t{LX_DROP_RETURNS}});
    switch (in.below(14)) {
      case 0:
        LXReadCharU(stream, l);
        break;
      case 1:
        LXReadCharW(stream, l);
        break;
      case 2:
        LXUngetChar(stream, l, text);
        break;
      case 3:
        LXUngetCharU(stream, l, static_cast<LXUChar>(code));
        break;
      case 4:
        LXUngetCharW(stream, l, code);
        break;
      case 5:
        LXUngetCharEx(stream, l, text, in.below(2));
        break;
      case 6:
        LXWriteChar(stream, l, text);
        break;
      case 7:
        LXWriteCharU(stream, l, static_cast<LXUChar>(code));
        break;
      case 8:
        LXWriteCharW(stream, l, code, 0);
        break;
      case 9:
        LXWriteCharEx(stream, l, text, static_cast<int32_t>(in.below(2)), 0);
        break;
      case 10:
        LXFlushStream(stream, l);
        break;
      default:
        in_all_forms([&](const auto& form) {
          using Unit = typename std::decay_t<decltype(form)>::Unit;
          const Block<Unit> out(size);
          must(form.read_string(stream, l, out.data(), out.size(), flags) <= out.size(), "a string fits");
        });
    }
  }
}

void line_ends(Input& in, const Place& at) {
  LXLocale* const l = at.locale;
  const uint32_t put = in.below(32) * LX_EOL_LF, find = in.below(16) * LX_EOL_LF;
  in_all_forms([&](const auto& form) {
    using F = std::decay_t<decltype(form)>;
    using Unit = typename F::Unit;
    const Block<Unit> end(5);
    const Unit* const behind = form.put_eol(l, end.data(), put);
    must(behind != nullptr && end.has(behind) && behind > end.data(), "a line end is put");
    const Text<Unit> ending(end.data(), static_cast<size_t>(behind - end.data()));
    uint32_t kind = 0;
    int32_t length = 0;
    const Block<Unit> alone(ending);
    must(form.get_eol(l, alone.data(), alone.size(), &kind, &length, LX_EOL_ALL) != nullptr, "it is found");
    states = {};
    const Block<Unit> text(in.text(form, l, 30) + ending);
    const Unit* const place = form.get_eol(l, text.data(), text.size(), &kind, &length, find);
    must((place == nullptr) == (kind == LX_EOL_NONE), "a place has a kind");
    must(place == nullptr || (text.has(place) && length >= 1 && length <= place - text.data()), "and a length");
  });
}

}  // namespace

FUZZ_TARGET(stream) {
  const Place& at = place(in);
  const uint32_t kind = in.below(3);
  if (kind == 1) return any_calls(in, at);
  if (kind == 2) return line_ends(in, at);
  const Units text = in.units(40);
  states = {};
  // A character that reads as the end, and shift bytes as characters, are none here.
  if (faithful(kEx, at.locale, text, encode(kEx, at.locale, text))) all_ways(in, at, text);
}

}  // namespace lx::fuzz::stream
