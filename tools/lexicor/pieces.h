// A text as a subcommand takes it in: piece by piece, with a progress bar.
#pragma once

#include <cstddef>
#include <memory>

#include "input.h"
#include "progress.h"

namespace lexicor_cli {

class Pieces {
 public:
  static constexpr size_t kBytes = 64 * 1024;

  /// Reads the first piece: when this stands before the output is opened, a missing input leaves no trace.
  explicit Pieces(Input& input)
      : input_(input), piece_(new char[kBytes]), got_(input.read(piece_.get(), kBytes)) {}

  /// Hands the pieces to `take(data, bytes)`.
  template <class Take>
  void each(bool show_progress, Take take) {
    Progress progress(input_.total_bytes(), show_progress);
    for (; got_ > 0; got_ = input_.read(piece_.get(), kBytes)) {
      take(piece_.get(), got_);
      progress.advance(got_);
    }
  }

 private:
  Input& input_;
  const std::unique_ptr<char[]> piece_;  // not filled: short texts take few pages
  size_t got_;
};

}  // namespace lexicor_cli
