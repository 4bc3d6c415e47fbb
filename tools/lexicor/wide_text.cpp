// Units are made of bytes, so that the byte order of the machine does not count.
#include "wide_text.h"

#include <cctype>

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
  if (input_.begins_file(offset_)) {
    finish();
    begins_ = true;
    recoder_.begin_units();
  }
  offset_ += bytes;
  cut_.append(data, bytes);
  size_t at = begins_ ? take_mark(cut_.data(), cut_.size()) : 0;
  while (!begins_) {
    const size_t taken = take_char(cut_.data() + at, cut_.size() - at);
    if (taken == 0) break;
    at += taken;
  }
  cut_.erase(0, at);
  flush();
}

void WideReader::finish() {
  begins_ = false;
  if (!cut_.empty())
    refuse(cut_.data(), static_cast<uint32_t>(cut_.size()), "the text ends inside a character");
  cut_.clear();
}

uint32_t WideReader::unit_at(const char* p) const {
  uint32_t unit = 0;
  for (uint32_t i = 0; i < encoding_.unit_bytes; ++i)
    unit = unit << 8 | static_cast<uint8_t>(p[little_ ? encoding_.unit_bytes - 1 - i : i]);
  return unit;
}

/// Looks for a mark where a file begins, as soon as there is a unit; returns the bytes of the mark.
size_t WideReader::take_mark(const char* data, size_t bytes) {
  if (bytes < encoding_.unit_bytes) return 0;
  begins_ = false;
  if (encoding_.order == WideEncoding::Order::kMarked) {
    little_ = true;
    little_ = unit_at(data) == kMark;
  }
  if (unit_at(data) != kMark || keeps_marks_) return 0;
  recoder_.skip(encoding_.unit_bytes);
  return encoding_.unit_bytes;
}

/// Takes the character at `p`; 0: it is cut.
size_t WideReader::take_char(const char* p, size_t bytes) {
  const uint32_t unit_bytes = encoding_.unit_bytes;
  if (bytes < unit_bytes) return 0;
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

void WideWriter::put(uint32_t unit) {
  for (uint32_t i = 0; i < unit_bytes_; ++i)
    out_ += static_cast<char>(unit >> 8 * (little_ ? i : unit_bytes_ - 1 - i));
}

void WideWriter::write(const char* data, size_t bytes) {
  const char* const end = data + bytes;
  while (data != end) {
    const auto lead = static_cast<uint8_t>(*data++);
    uint32_t value = lead < 0x80   ? lead
                     : lead < 0xE0 ? lead & 0x1Fu
                     : lead < 0xF0 ? lead & 0x0Fu
                                   : lead & 0x07u;
    while (lead >= 0x80 && data != end && (*data & 0xC0) == 0x80)
      value = value << 6 | (static_cast<uint8_t>(*data++) & 0x3Fu);
    if (unit_bytes_ == 2 && value >= 0x10000) {
      put(0xD800 + ((value - 0x10000) >> 10));
      put(0xDC00 + (value & 0x3FF));
    } else {
      put(value);
    }
  }
  output_.write(out_);
  out_.clear();
}

}  // namespace lexicor_cli
