// What a conversion loses: the kinds of losses, their count, the places and the words of the messages.
#pragma once

#include <array>
#include <cstdint>
#include <string>
#include <vector>

#include "command.h"
#include "input.h"

namespace lexicor_cli {

/// Why a character does not come back when the output is converted back.
enum class LossKind {
  kMalformed,   // bytes that make no character of the source
  kUnassigned,  // a code of the source without a character
  kLacking,     // a character that the target lacks
  kChanged      // a character that comes back as another one, or in other bytes
};

enum class OnLoss { kReport, kStop, kIgnore };

/// A loss with its place.
struct Loss {
  LossKind kind;
  InputPlace where;
  std::string what;

  std::string text() const { return where.text() + ": " + what; }
};

/// Thrown at the first loss where that ends the work.
class FirstLoss : public Failure {
 public:
  using Failure::Failure;
};

class Losses {
 public:
  /// The names are those of the codepages.
  Losses(const std::string& source, const std::string& target, OnLoss on_loss)
      : source_(source), target_(target), on_loss_(on_loss) {}

  bool ignored() const { return on_loss_ == OnLoss::kIgnore; }
  /// Whether the places of losses are still wanted: of the first ones only.
  bool places_wanted() const { return !ignored() && first_.size() < kReported; }

  /// Records a loss: where it is, and what. Throws a FirstLoss when that ends the work.
  void record(LossKind kind, const InputPlace& where, const std::string& what);
  /// Records losses whose places are not wanted.
  void count(LossKind kind, uint64_t count) {
    if (!ignored()) counts_[static_cast<size_t>(kind)] += count;
  }

  uint64_t total() const;
  uint64_t of_kind(LossKind kind) const { return counts_[static_cast<size_t>(kind)]; }
  /// The first ones.
  const std::vector<Loss>& first() const { return first_; }
  /// Throws the report when there is anything to report.
  void throw_any() const;
  /// The message: the losses of each kind, and the first ones with their places.
  std::string report() const;

 private:
  static constexpr size_t kKinds = 4;
  static constexpr size_t kReported = 10;

  const std::string source_, target_;
  const OnLoss on_loss_;
  std::array<uint64_t, kKinds> counts_{};
  std::vector<Loss> first_;
};

}  // namespace lexicor_cli
