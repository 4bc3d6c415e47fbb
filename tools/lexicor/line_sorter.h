// Sorts the lines of an input in memory of a given size; what is more goes to temporary files.
#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "arena.h"
#include "line_order.h"
#include "line_sort.h"
#include "line_writer.h"
#include "rows.h"
#include "sort_runs.h"
#include "text_lines.h"

namespace lexicor_cli {

class LineSorter {
 public:
  /// `memory`: of texts and keys and what is kept of each line, in bytes.
  LineSorter(const LineOrder& order, uint64_t memory, std::string temporary_directory);

  /// A good size for the blocks of a reader.
  size_t block_bytes() const;
  /// Takes the next lines of a reader, true as long as there are more.
  bool take(LineReader& reader);
  /// Writes all lines in order; `wrote(bytes)` is told of each.
  void write(LineWriter& writer, const std::function<void(uint64_t)>& wrote);

 private:
  void make_entries(size_t first);
  void sort();
  void spill();

  const LineOrder& order_;
  const uint64_t memory_;
  Arena texts_;
  Rows<Line> lines_;
  Rows<KeyEntry> entries_;
  // Of each thread.
  std::vector<std::unique_ptr<KeyMaker>> makers_;
  std::vector<std::unique_ptr<Arena>> keys_;
  MergeSources runs_;
};

/// The memory that sorting takes when nothing else is said: a part of what the machine has, in bytes.
uint64_t usual_sort_memory();

}  // namespace lexicor_cli
