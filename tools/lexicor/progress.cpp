// The bar is drawn again only when the percentage changes.
#include "progress.h"

#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <string>

#include "notices.h"

namespace lexicor_cli {

namespace {

constexpr int kBarChars = 40;

}  // namespace

Progress::Progress(uint64_t total, bool allowed, uint64_t worth_showing)
    : total_(total), visible_(allowed && !g_quiet && total > worth_showing && isatty(STDERR_FILENO) != 0) {}

Progress::~Progress() {
  if (visible_) std::fputs("\r\033[K", stderr);
}

void Progress::advance(uint64_t bytes) {
  done_ += bytes;
  if (!visible_) return;
  // A file that grows while it is read does not pass 100.
  const int percent = static_cast<int>(std::min<uint64_t>(100, done_ * 100 / total_));
  if (percent == shown_percent_) return;
  shown_percent_ = percent;
  draw();
}

void Progress::draw() const {
  const int filled = shown_percent_ * kBarChars / 100;
  const std::string bar =
      std::string(static_cast<size_t>(filled), '#') + std::string(static_cast<size_t>(kBarChars - filled), '.');
  constexpr double kMiB = 1024 * 1024;
  std::fprintf(stderr, "\r[%s] %3d %%  %.1f of %.1f MiB", bar.c_str(), shown_percent_,
               static_cast<double>(done_) / kMiB, static_cast<double>(total_) / kMiB);
}

}  // namespace lexicor_cli
