// A message has a line for the whole and, indented, a line for each of the first losses.
#include "loss.h"

#include <numeric>

namespace lexicor_cli {

void Losses::record(LossKind kind, const InputPlace& where, const std::string& what) {
  if (ignored()) return;
  count(kind, 1);
  if (first_.size() < kReported) first_.push_back({kind, where, what});
  if (on_loss_ == OnLoss::kStop)
    throw FirstLoss(kDataError,
                    "stopped at the first loss from " + source_ + " to " + target_ + "\n  " + first_[0].text());
}

void Losses::throw_any() const {
  if (total() != 0) throw Failure(kDataError, report());
}

uint64_t Losses::total() const {
  return std::accumulate(counts_.begin(), counts_.end(), uint64_t{0});
}

std::string Losses::report() const {
  const std::array<std::string, kKinds> names = {"malformed", "unassigned in " + source_, "not in " + target_,
                                                 "changed"};
  std::string kinds;
  for (size_t i = 0; i < kKinds; ++i) {
    if (counts_[i] != 0) kinds += (kinds.empty() ? "" : ", ") + std::to_string(counts_[i]) + " " + names[i];
  }
  const uint64_t all = total();
  std::string text = std::to_string(all) + (all == 1 ? " character" : " characters") + " lost from " + source_ +
                     " to " + target_ + ": " + kinds;
  for (const Loss& loss : first_) text += "\n  " + loss.text();
  if (all > first_.size()) text += "\n  and " + std::to_string(all - first_.size()) + " more";
  return text;
}

}  // namespace lexicor_cli
