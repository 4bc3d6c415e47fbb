// A text as a subcommand takes it in: piece by piece, with a progress bar.
#pragma once

#include <vector>

#include "input.h"
#include "progress.h"

namespace lexicor_cli {

class Pieces {
 public:
  static constexpr size_t kBytes = 64 * 1024;

  /// Reads the first piece: when this stands before the output is opened, a missing input leaves no trace.
  explicit Pieces(Input& input) : input_(input), piece_(kBytes), got_(input.read(piece_.data(), kBytes)) {}

  /// Hands the pieces to `take(data, bytes)`.
  template <class Take>
  void each(bool show_progress, Take take) {
    Progress progress(input_.total_bytes(), show_progress);
    for (; got_ > 0; got_ = input_.read(piece_.data(), kBytes)) {
      take(piece_.data(), got_);
      progress.advance(got_);
    }
  }

 private:
  Input& input_;
  std::vector<char> piece_;
  size_t got_;
};

}  // namespace lexicor_cli
