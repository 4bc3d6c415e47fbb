#include "sort_order.h"

#include <algorithm>

namespace lexicor_data {

uint32_t WeightOrder::insert(const Gap& gap, size_t at) {
  const auto list = gaps_.try_emplace(gap).first;
  const auto weight = static_cast<uint32_t>(kFirstTailored + places_.size());
  list->second.insert(list->second.begin() + static_cast<std::ptrdiff_t>(at), weight);
  full_ = full_ || list->second.size() >= kAheadOfNext;
  places_.push_back({list});
  return weight;
}

size_t WeightOrder::position(uint32_t weight) const {
  const std::vector<uint32_t>& list = places_[weight - kFirstTailored].list->second;
  return static_cast<size_t>(std::find(list.begin(), list.end(), weight) - list.begin());
}

uint32_t WeightOrder::insert_after(const Context& context, uint32_t weight) {
  if (weight < kFirstTailored) return insert({context, weight}, 0);
  return insert(places_[weight - kFirstTailored].list->first, position(weight) + 1);
}

uint32_t WeightOrder::insert_before(const Context& context, uint32_t weight, uint32_t below) {
  if (weight >= kFirstTailored) return insert(places_[weight - kFirstTailored].list->first, position(weight));
  const auto list = gaps_.find({context, below});
  return insert({context, below}, list == gaps_.end() ? 0 : list->second.size());
}

uint32_t WeightOrder::anchor(uint32_t weight) const {
  return weight < kFirstTailored ? weight : places_[weight - kFirstTailored].list->first.second;
}

uint32_t WeightOrder::number(uint32_t weight) const {
  if (weight < kFirstTailored) return weight << kPositionBits;
  const auto& [context, anchor] = places_[weight - kFirstTailored].list->first;
  const auto behind = static_cast<uint32_t>(position(weight) + 1);
  return anchor << kPositionBits | (context.next_group ? kAheadOfNext : 0) | behind;
}

}  // namespace lexicor_data
