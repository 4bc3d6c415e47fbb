// Runs of units that are characters go in loops; what is a pair, or no character, is looked at by itself.
#include "wide_text.h"

#include <cctype>
#include <cstring>

#include "hex.h"
#include "near_names.h"
#include "utf8_text.h"

namespace lexicor_cli {

namespace {

constexpr uint32_t kMark = 0xFEFF, kLastCodePoint = 0x10FFFF;

constexpr bool is_high_half(uint32_t unit) {
  return unit >= 0xD800 && unit < 0xDC00;
}
constexpr bool is_low_half(uint32_t unit) {
  return unit >= 0xDC00 && unit < 0xE000;
}
constexpr bool is_half(uint32_t unit) {
  return unit >= 0xD800 && unit < 0xE000;
}

constexpr uint16_t swapped(uint16_t unit) {
  return __builtin_bswap16(unit);
}
constexpr uint32_t swapped(uint32_t unit) {
  return __builtin_bswap32(unit);
}
constexpr bool is_swapped(bool little) {
  return little != (__BYTE_ORDER__ == __ORDER_LITTLE_ENDIAN__);
}

/// Stores a code point as UTF-8; returns past it.
char* put_utf8(char* out, uint32_t value) {
  const auto trail = [&](int shift) { return static_cast<char>(0x80 | (value >> shift & 0x3F)); };
  if (value < 0x80) {
    *out++ = static_cast<char>(value);
  } else if (value < 0x800) {
    *out++ = static_cast<char>(0xC0 | value >> 6);
    *out++ = trail(0);
  } else if (value < 0x10000) {
    *out++ = static_cast<char>(0xE0 | value >> 12);
    *out++ = trail(6);
    *out++ = trail(0);
  } else {
    *out++ = static_cast<char>(0xF0 | value >> 18);
    *out++ = trail(12);
    *out++ = trail(6);
    *out++ = trail(0);
  }
  return out;
}

/// Stores the code points of units up to the first one that is none alone as UTF-8; returns the bytes that were read.
template <class Unit>
size_t put_plain(const char* p, size_t bytes, bool swap, char** out) {
  size_t at = 0;
  for (; bytes - at >= sizeof(Unit); at += sizeof(Unit)) {
    Unit unit;
    std::memcpy(&unit, p + at, sizeof unit);
    if (swap) unit = swapped(unit);
    if (is_half(unit) || unit > kLastCodePoint) break;
    *out = put_utf8(*out, unit);
  }
  return at;
}

/// Stores the units of whole characters in UTF-8; returns past them.
template <class Unit>
char* put_units(const char* p, const char* end, bool swap, char* out) {
  const auto put = [&](uint32_t value) {
    auto unit = static_cast<Unit>(value);
    if (swap) unit = swapped(unit);
    std::memcpy(out, &unit, sizeof unit);
    out += sizeof unit;
  };
  const auto bits = [&](int i) { return static_cast<uint32_t>(p[i] & 0x3F); };
  while (p < end) {
    const auto lead = static_cast<uint8_t>(*p);
    const size_t length = lead < 0x80 ? 1 : lead < 0xE0 ? 2 : lead < 0xF0 ? 3 : 4;
    if (length > static_cast<size_t>(end - p)) break;
    const uint32_t value = length == 1   ? lead
                           : length == 2 ? (lead & 0x1Fu) << 6 | bits(1)
                           : length == 3 ? (lead & 0x0Fu) << 12 | bits(1) << 6 | bits(2)
                                         : (lead & 0x07u) << 18 | bits(1) << 12 | bits(2) << 6 | bits(3);
    p += length;
    if (sizeof(Unit) == 2 && value >= 0x10000) {
      put(0xD800 + ((value - 0x10000) >> 10));
      put(0xDC00 + (value & 0x3FF));
    } else {
      put(value);
    }
  }
  return out;
}

}  // namespace

std::string WideEncoding::name() const {
  return (unit_bytes == 2 ? std::string("UTF-16") : std::string("UTF-32")) + (order == Order::kBig      ? "BE"
                                                                              : order == Order::kLittle ? "LE"
                                                                                                        : "");
}

std::optional<WideEncoding> wide_encoding(const std::string& name) {
  std::string plain;
  for (const char c : name) {
    if (std::isalnum(static_cast<unsigned char>(c)) != 0) plain += lower_ascii(c);
  }
  using Order = WideEncoding::Order;
  Order order = Order::kMarked;
  const std::string end = plain.size() > 2 ? plain.substr(plain.size() - 2) : "";
  if (end == "le" || end == "be") {
    order = end == "le" ? Order::kLittle : Order::kBig;
    plain.resize(plain.size() - 2);
  }
  if (plain == "utf16" || plain == "ucs2") return WideEncoding{2, order};
  if (plain == "utf32" || plain == "ucs4") return WideEncoding{4, order};
  return std::nullopt;
}

WideReader::WideReader(const WideEncoding& encoding, const Input& input, Recoder& recoder, bool keeps_marks)
    : encoding_(encoding),
      input_(input),
      recoder_(recoder),
      keeps_marks_(keeps_marks),
      little_(encoding.order == WideEncoding::Order::kLittle) {}

void WideReader::take(const char* data, size_t bytes) {
  const bool begins = input_.begins_file(offset_);
  const size_t before = cut_.size();
  offset_ += bytes;
  cut_.append(data, bytes);
  size_t at = 0;
  if (begins) {
    // What the file before has begun has its place there.
    at = take_until(0, before);
    flush();
    if (at >= before) recoder_.begin_units();
    begins_ |= at == before;
  }
  cut_.erase(0, take_until(at, cut_.size()));
  flush();
}

/// Takes the characters of the text that begin from `at` to `end`, but for one that is cut; returns where it went on to.
size_t WideReader::take_until(size_t at, size_t end) {
  while (at < end) {
    if (!begins_) at += take_plain(cut_.data() + at, end - at);
    const size_t taken = at < end ? take_next(cut_.data() + at, cut_.size() - at) : 0;
    if (taken == 0) break;
    at += taken;
  }
  return at;
}

/// Takes the mark that a file begins with, or a character; 0: it is cut.
size_t WideReader::take_next(const char* p, size_t bytes) {
  if (bytes < encoding_.unit_bytes) return 0;
  const size_t mark = begins_ ? take_mark(p) : 0;
  begins_ = false;
  return mark != 0 ? mark : take_char(p, bytes);
}

/// Takes characters that are one unit each.
size_t WideReader::take_plain(const char* p, size_t bytes) {
  constexpr size_t kMostBytes = 4;
  const size_t before = text_.size();
  text_.resize(before + bytes / encoding_.unit_bytes * kMostBytes);
  char* out = text_.data() + before;
  const size_t taken = encoding_.unit_bytes == 2 ? put_plain<uint16_t>(p, bytes, is_swapped(little_), &out)
                                                 : put_plain<uint32_t>(p, bytes, is_swapped(little_), &out);
  text_.resize(static_cast<size_t>(out - text_.data()));
  return taken;
}

void WideReader::finish() {
  if (!cut_.empty())
    refuse(cut_.data(), static_cast<uint32_t>(cut_.size()), "the text ends inside a character");
  cut_.clear();
}

uint32_t WideReader::unit_at(const char* p, bool little) const {
  uint32_t unit = 0;
  for (uint32_t i = 0; i < encoding_.unit_bytes; ++i)
    unit = unit << 8 | static_cast<uint8_t>(p[little ? encoding_.unit_bytes - 1 - i : i]);
  return unit;
}

/// Looks for a mark where a file begins, and goes by its order from there on; returns the bytes of a mark that is no text.
size_t WideReader::take_mark(const char* p) {
  if (encoding_.order == WideEncoding::Order::kMarked) {
    for (const bool little : {false, true}) {
      if (unit_at(p, little) == kMark) little_ = little;
    }
  }
  if (unit_at(p) != kMark || keeps_marks_) return 0;
  recoder_.skip(encoding_.unit_bytes);
  return encoding_.unit_bytes;
}

/// Takes the character at `p`; 0: it is cut.
size_t WideReader::take_char(const char* p, size_t bytes) {
  const uint32_t unit_bytes = encoding_.unit_bytes;
  const uint32_t unit = unit_at(p);
  if (unit_bytes == 2 && is_high_half(unit)) {
    if (bytes < 2 * unit_bytes) return 0;
    const uint32_t low = unit_at(p + unit_bytes);
    if (is_low_half(low)) {
      append_utf8(text_, 0x10000 + ((unit & 0x3FF) << 10 | (low & 0x3FF)));
      return 2 * unit_bytes;
    }
  }
  if (is_high_half(unit) || is_low_half(unit))
    refuse(p, unit_bytes, "half of a surrogate pair");
  else if (unit > kLastCodePoint)
    refuse(p, unit_bytes, "beyond U+10FFFF");
  else
    append_utf8(text_, unit);
  return unit_bytes;
}

void WideReader::refuse(const char* p, uint32_t bytes, const char* reason) {
  flush();
  recoder_.take_malformed(bytes, (bytes == 1 ? "byte " : "bytes ") + hex_bytes({p, bytes}) +
                                     (bytes == 1 ? " is not " : " are not ") + encoding_.name() + ": " +
                                     reason);
}

void WideReader::flush() {
  if (!text_.empty()) recoder_.take(text_.data(), text_.size());
  text_.clear();
}

void WideWriter::write(const char* data, size_t bytes) {
  if (out_.size() < bytes * unit_bytes_) out_.resize(bytes * unit_bytes_);
  char* const end = unit_bytes_ == 2
                        ? put_units<uint16_t>(data, data + bytes, is_swapped(little_), out_.data())
                        : put_units<uint32_t>(data, data + bytes, is_swapped(little_), out_.data());
  output_.write(out_.data(), static_cast<size_t>(end - out_.data()));
}

}  // namespace lexicor_cli
