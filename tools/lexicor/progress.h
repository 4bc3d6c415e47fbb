// A progress bar on standard error, for long work that somebody watches.
#pragma once

#include <cstdint>

namespace lexicor_cli {

class Progress {
 public:
  static constexpr uint64_t kWorthShowing = 8 * 1024 * 1024;

  /// Shows nothing unless standard error is a terminal and `total` is above `worth_showing`.
  Progress(uint64_t total, bool allowed, uint64_t worth_showing = kWorthShowing);
  /// Takes the bar off the screen.
  ~Progress();
  Progress(const Progress&) = delete;
  Progress& operator=(const Progress&) = delete;

  void advance(uint64_t bytes);

 private:
  void draw() const;

  uint64_t total_;
  uint64_t done_ = 0;
  int shown_percent_ = -1;
  bool visible_;
};

}  // namespace lexicor_cli
