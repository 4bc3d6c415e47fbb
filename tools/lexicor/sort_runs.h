// Lines that are in order, in files: runs of an input that memory does not hold, and inputs that are merged.
#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "arena.h"
#include "input.h"
#include "line_order.h"
#include "line_sort.h"
#include "rows.h"
#include "text_lines.h"

namespace lexicor_cli {

/// A file without a name, which is gone when the program ends, however it does.
class TemporaryFile {
 public:
  /// `directory` empty: that of TMPDIR, else /tmp. Throws a Failure.
  explicit TemporaryFile(const std::string& directory);
  ~TemporaryFile();
  TemporaryFile(const TemporaryFile&) = delete;
  TemporaryFile& operator=(const TemporaryFile&) = delete;

  void write(const char* data, size_t bytes);
  /// Reads on from the beginning; 0 at the end.
  size_t read(char* buffer, size_t bytes);

 private:
  [[noreturn]] void fail() const;

  int fd_;
  std::string directory_;
  int64_t read_ = 0;
};

/// Lines that come in order, one at a time.
class OrderedLines {
 public:
  OrderedLines() = default;
  virtual ~OrderedLines() = default;
  OrderedLines(const OrderedLines&) = delete;
  OrderedLines& operator=(const OrderedLines&) = delete;

  /// The next line, which stays until the next call; null: there is none.
  virtual const Line* next() = 0;
};

/// A run of lines in a temporary file.
class SortedRun : public OrderedLines {
 public:
  /// Reading takes so much memory at least.
  SortedRun(const std::string& directory, size_t buffer_bytes)
      : file_(directory), buffer_bytes_(buffer_bytes) {}

  void add(const Line& line);
  /// Writes what has been added, and frees its memory. Reading begins.
  void flush();
  const Line* next() override;

 private:
  bool fill(size_t wanted);

  TemporaryFile file_;
  const size_t buffer_bytes_;
  std::vector<char> buffer_;
  size_t at_ = 0, filled_ = 0;
  Line line_{};
};

/// The lines of an input that is in order.
class InputLines : public OrderedLines {
 public:
  InputLines(const LineOrder& order, const std::string& name, bool one_of_several, bool null_ended,
             size_t buffer_bytes)
      : input_({name}, one_of_several),
        reader_(order.codepage(), input_, null_ended, buffer_bytes, order.line_test()) {}

  const Line* next() override;

 private:
  Input input_;
  LineReader reader_;
  Arena texts_;
  Rows<Line> lines_;
  size_t at_ = 0;
  bool more_ = true;
};

/// Merges lines that come in order. Of equal ones those of an earlier source come first.
class LineMerge {
 public:
  LineMerge(const LineOrder& order, const std::vector<OrderedLines*>& sources);

  /// Hands all lines to `take(line, entry)`, an entry having the key, or the text that is compared, of its line.
  template <class Take>
  void each(Take take) {
    while (!heap_.empty()) {
      const Head& head = *heap_[0];
      take(*head.line, head.entry);
      advance();
    }
  }

 private:
  struct Head {
    Head(const LineOrder& order, OrderedLines* given, uint32_t number)
        : source(given), maker(order), line(nullptr), source_number(number) {}

    OrderedLines* source;
    KeyMaker maker;
    Arena key;
    const Line* line;
    uint32_t source_number;
    KeyEntry entry;
  };

  bool read(Head* head);
  bool before(const Head& a, const Head& b) const;
  void advance();
  void sift(size_t at);

  const LineOrder& order_;
  std::vector<std::unique_ptr<Head>> heads_;
  std::vector<Head*> heap_;  // the first one of all on top
};

/// Sources of lines, one behind the other in the input, and so few that all may be open: more are merged into runs.
class MergeSources {
 public:
  /// `memory`: of merging, in bytes.
  MergeSources(const LineOrder& order, uint64_t memory, std::string temporary_directory);

  bool empty() const { return sources_.empty(); }
  /// A run that is still to be written and added.
  std::unique_ptr<SortedRun> new_run() const;
  /// Adds a source behind the others. An input is opened when it is merged.
  void add(std::unique_ptr<OrderedLines> lines);
  /// All lines. The sources stay here.
  LineMerge merge() const { return merge_from(0); }

 private:
  struct Source {
    std::unique_ptr<OrderedLines> lines;
    int mergings;  // from which its lines come
  };

  LineMerge merge_from(size_t first) const;
  void merge_last();

  const LineOrder& order_;
  const std::string temporary_directory_;
  const size_t most_;
  const size_t buffer_bytes_;
  std::vector<Source> sources_;  // the more mergings, the earlier
};

}  // namespace lexicor_cli
