// In single-byte codepages and in UTF-8 bytes are looked at alone, many at a time; elsewhere a text is walked by
// characters. A line end that a piece may cut is held until the next one.
#include "line_ends.h"

#include <algorithm>
#include <cstddef>

#include "byte_vector.h"
#include "pieces.h"

namespace lexicor_cli {

namespace {

constexpr uint32_t kKinds[] = {LX_EOL_LF, LX_EOL_CRLF, LX_EOL_THIRD, LX_EOL_FOURTH};
constexpr size_t kMostEolBytes = 5;

size_t index_of(uint32_t kind) {
  return static_cast<size_t>(std::find(std::begin(kKinds), std::end(kKinds), kind) - std::begin(kKinds));
}

std::string eol_bytes(const Codepage& codepage, uint32_t kind) {
  char bytes[kMostEolBytes];
  return {bytes, LXPutEol(codepage.locale(), bytes, kind)};
}

}  // namespace

LineEndRewriter::LineEndRewriter(const Codepage& codepage, uint32_t find, uint32_t eol, Output& output)
    : codepage_(codepage),
      find_(find),
      output_(output),
      eol_(eol_bytes(codepage, eol)),
      pair_(eol_bytes(codepage, LX_EOL_CRLF)),
      carriage_return_(pair_[0]),
      feed_(pair_[1]),
      third_(eol_bytes(codepage, LX_EOL_THIRD)[0]),
      fourth_(eol_bytes(codepage, LX_EOL_FOURTH)[0]),
      by_bytes_(codepage.utf8() || codepage.single_byte()) {
  size_t count = 0;
  for (unsigned byte = 0; byte < stops_table_.size(); ++byte) {
    const char c = static_cast<char>(byte);
    stops_table_[byte] = kind_of(c) != LX_EOL_NONE || ((find & LX_EOL_CRLF) != 0 && c == carriage_return_);
    if (stops_table_[byte]) stops_[count++] = c;
  }
  std::fill(stops_.begin() + static_cast<ptrdiff_t>(count), stops_.end(), stops_[0]);
}

/// The kind of line end that a byte is alone.
uint32_t LineEndRewriter::kind_of(char c) const {
  if ((find_ & LX_EOL_LF) != 0 && c == feed_) return LX_EOL_LF;
  if ((find_ & LX_EOL_THIRD) != 0 && c == third_) return LX_EOL_THIRD;
  if ((find_ & LX_EOL_FOURTH) != 0 && c == fourth_) return LX_EOL_FOURTH;
  return LX_EOL_NONE;
}

uint64_t LineEndRewriter::found(uint32_t kind) const {
  return found_[index_of(kind)];
}

void LineEndRewriter::take(const char* data, size_t bytes) {
  if (held_.empty()) {
    by_bytes_ ? take_bytes(data, data + bytes) : take_chars(data, data + bytes);
  } else if (bytes != 0) {
    const std::string text = std::move(held_) + std::string(data, bytes);
    held_.clear();
    by_bytes_ ? take_bytes(text.data(), text.data() + text.size())
              : take_chars(text.data(), text.data() + text.size());
  }
  flush();
}

void LineEndRewriter::finish() {
  // A carriage return that nothing follows, but perhaps shift bytes.
  if (!held_.empty()) {
    const uint32_t kind = kind_of(held_[0]);
    const char* const begin = held_.data();
    if (kind != LX_EOL_NONE)
      end_line(begin, begin, kind, {begin, 1});
    else
      put(begin, begin + 1);
  }
  put_state(LX_SHIFT_SINGLE);
  flush();
}

const char* LineEndRewriter::find_stop(const char* at, const char* end) const {
  const auto filled = [](char c) { return ByteVector{} + static_cast<uint8_t>(c); };
  const ByteVector first = filled(stops_[0]), second = filled(stops_[1]), third = filled(stops_[2]),
                   fourth = filled(stops_[3]);
  while (static_cast<size_t>(end - at) >= sizeof first) {
    const ByteVector bytes = load_bytes(at);
    const auto found = (bytes == first) | (bytes == second) | (bytes == third) | (bytes == fourth);
    if (any(reinterpret_cast<ByteVector>(found))) break;
    at += sizeof first;
  }
  return std::find_if(at, end, [this](char c) { return is_stop(c); });
}

/// Looks at a stop behind a run that is still to be moved: ends the line there, or goes on. Returns where it goes on, or
/// null where the end of the piece may cut a pair.
const char* LineEndRewriter::stop(const char* run, const char* at, const char* end) {
  if ((find_ & LX_EOL_CRLF) != 0 && *at == carriage_return_) {
    LXShiftState state = state_;
    const char* next = at + 1;
    while (next != end && codepage_.is_shift(*next)) state = codepage_.state_after(*next++);
    if (next == end) return nullptr;
    if (state == LX_SHIFT_SINGLE && *next == feed_) {
      end_line(run, at, LX_EOL_CRLF, pair_);
      return next + 1;
    }
  }
  const uint32_t kind = kind_of(*at);
  if (kind == LX_EOL_NONE)
    put(run, at + 1);
  else
    end_line(run, at, kind, {at, 1});
  return at + 1;
}

void LineEndRewriter::end_line(const char* run, const char* at, uint32_t kind, std::string_view found) {
  put(run, at);
  out_ += eol_;
  ++found_[index_of(kind)];
  if (found != eol_) ++rewritten_;
}

void LineEndRewriter::take_bytes(const char* at, const char* end) {
  for (;;) {
    const char* const found = find_stop(at, end);
    const char* const next = found == end ? nullptr : stop(at, found, end);
    if (next == nullptr) {
      put(at, found);
      held_.assign(found, end);
      return;
    }
    at = next;
  }
}

void LineEndRewriter::take_chars(const char* at, const char* end) {
  const char* run = at;  // what is still to be moved
  while (at != end) {
    if (codepage_.is_shift(*at)) {
      put(run, at);
      state_ = codepage_.state_after(*at++);
      run = at;
      continue;
    }
    const auto bytes = codepage_.char_bytes(at, state_);
    if (bytes > end - at) break;
    if (run == at) put_state(state_);
    if (bytes != 1 || state_ != LX_SHIFT_SINGLE || !is_stop(*at)) {
      at += bytes;
      continue;
    }
    const char* const next = stop(run, at, end);
    if (next == nullptr) break;
    run = at = next;
  }
  put(run, at);
  held_.assign(at, end);
}

void LineEndRewriter::put_state(LXShiftState state) {
  if (state == written_) return;
  out_ += codepage_.shift_byte(state);
  written_ = state;
}

void LineEndRewriter::put(const char* begin, const char* end) {
  out_.append(begin, static_cast<size_t>(end - begin));
}

void LineEndRewriter::flush() {
  if (out_.empty()) return;
  output_.write(out_);
  out_.clear();
}

}  // namespace lexicor_cli
