// Text in UTF-16 and UTF-32, in both byte orders: read as UTF-8, which has the same characters, and written from it.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "input.h"
#include "output.h"
#include "recoder.h"

namespace lexicor_cli {

struct WideEncoding {
  enum class Order { kBig, kLittle, kMarked };

  uint32_t unit_bytes;  // 2 or 4
  Order order;          // kMarked: as the last mark says that a file begins with, else big

  /// "UTF-16", "UTF-32LE".
  std::string name() const;
};

/// The encoding of a name in any spelling: "utf16", "UTF-32LE", "UCS-2"; none for other names.
std::optional<WideEncoding> wide_encoding(const std::string& name);

/// Hands a text to a Recoder, whose source is UTF-8.
class WideReader {
 public:
  /// `keeps_marks`: whether the mark that a file begins with goes on as U+FEFF.
  WideReader(const WideEncoding& encoding, const Input& input, Recoder& recoder, bool keeps_marks);

  /// Takes the next bytes of the input, of one file.
  void take(const char* data, size_t bytes);
  /// Ends the text.
  void finish();

 private:
  uint32_t unit_at(const char* p, bool little) const;
  uint32_t unit_at(const char* p) const { return unit_at(p, little_); }
  size_t take_until(size_t at, size_t end);
  size_t take_next(const char* p, size_t bytes);
  size_t take_mark(const char* p);
  size_t take_plain(const char* p, size_t bytes);
  size_t take_char(const char* p, size_t bytes);
  void refuse(const char* p, uint32_t bytes, const char* reason);
  void flush();

  const WideEncoding encoding_;
  const Input& input_;
  Recoder& recoder_;
  const bool keeps_marks_;
  bool little_;
  bool begins_ = false;  // a file begins, with a mark perhaps
  uint64_t offset_ = 0;
  std::string cut_;   // the beginning of a character
  std::string text_;  // UTF-8 for the recoder
};

/// Writes UTF-8, which comes by whole characters.
class WideWriter : public Sink {
 public:
  WideWriter(const WideEncoding& encoding, Sink& output)
      : unit_bytes_(encoding.unit_bytes),
        little_(encoding.order == WideEncoding::Order::kLittle),
        output_(output) {}

  using Sink::write;
  void write(const char* data, size_t bytes) override;

 private:
  const uint32_t unit_bytes_;
  const bool little_;
  Sink& output_;
  std::vector<char> out_;  // room
};

}  // namespace lexicor_cli
