// Writes sorted lines, and leaves out those that are not wanted a second time.
#pragma once

#include <string>
#include <string_view>
#include <unordered_set>

#include "line_order.h"
#include "output.h"
#include "text_lines.h"

namespace lexicor_cli {

/// Which lines are written once.
enum class Unique { kNone, kBytes, kOrder };

class LineWriter {
 public:
  LineWriter(Output& output, const LineOrder& order, Unique unique)
      : output_(output), order_(order), unique_(unique) {}

  /// Writes the next line, with its key.
  void write(const Line& line, std::string_view key) {
    if (unique_ != Unique::kNone && !is_new(line, key)) return;
    buffer_ += line.whole();
    if (buffer_.size() >= kBufferBytes) flush();
  }
  void flush() {
    output_.write(buffer_);
    buffer_.clear();
  }

 private:
  static constexpr size_t kBufferBytes = 256 * 1024;

  bool is_new(const Line& line, std::string_view key);

  Output& output_;
  const LineOrder& order_;
  const Unique unique_;
  std::string buffer_;
  std::string last_;  // the key of the line before
  bool has_last_ = false;
  std::unordered_set<std::string> written_;  // whole lines that the order calls equal to it
};

}  // namespace lexicor_cli
