// Keys of several fields stand one behind the other, so that the bytes of the whole still tell the order: in each a null
// byte is followed by a one, and two null bytes end it; where a field is reversed, its bytes are.
#include "line_order.h"

#include <algorithm>
#include <cstring>
#include <limits>
#include <utility>

namespace lexicor_cli {

LineOrder::LineOrder(Collation& collation, const FieldFinder& finder, const SortFieldDefaults& defaults,
                     std::vector<SortField> fields)
    : collation_(collation), finder_(finder), fields_(std::move(fields)) {
  if (fields_.empty()) {
    SortField line;
    line.skips_first_blanks = defaults.skip_blanks;
    line.ignore_case = defaults.ignore_case;
    line.reverse = defaults.reverse;
    fields_.push_back(line);
    whole_ = !defaults.skip_blanks;
  }
  for (const SortField& field : fields_) {
    if (!collation_.binary() || field.ignore_case) by_text_ = false;
    if (collation_.binary() && field.ignore_case) by_key_ &= FoldedBytes(collation_.codepage()).possible();
  }
  if (fields_.size() > 1) by_text_ = false;
  most_part_ = most_part();
  if (!by_key_) return;
  descending_ = fields_.size() == 1 && fields_[0].reverse;
}

/// Room for a key is told in 31 bits; the keys of all fields share it.
size_t LineOrder::most_part() const {
  if (by_text_) return std::numeric_limits<int32_t>::max();
  const bool folded = collation_.binary() && by_key_;
  return (folded ? FoldedBytes::kMostText : Collation::kMostText) / fields_.size();
}

bool LineOrder::orders_parts(std::string_view line) const {
  std::string room;
  return !whole_ && std::all_of(fields_.begin(), fields_.end(), [&](const SortField& field) {
    return finder_.find(line, field, &room).size() <= most_part_;
  });
}

int32_t LineOrder::compare(std::string_view key1, std::string_view key2) const {
  if (!by_key_) return compare_texts(key1, key2);
  const int32_t result = key1.compare(key2);
  return descending_ ? -result : result;
}

int32_t LineOrder::compare_texts(std::string_view text1, std::string_view text2) const {
  std::string room1, room2;
  for (const SortField& field : fields_) {
    const std::string_view part1 = whole_ ? text1 : finder_.find(text1, field, &room1);
    const std::string_view part2 = whole_ ? text2 : finder_.find(text2, field, &room2);
    // Where the comparison contradicts itself, it is not the same from both sides.
    const int32_t result = field.reverse ? collation_.compare(part2, part1, options_of(field))
                                         : collation_.compare(part1, part2, options_of(field));
    if (result != 0) return result;
  }
  return 0;
}

KeyMaker::KeyMaker(const LineOrder& order) : order_(order), codepage_(order.collation_.codepage()) {
  const auto folds = [](const SortField& field) { return field.ignore_case; };
  if (order.by_key() && order.collation_.binary() &&
      std::any_of(order.fields_.begin(), order.fields_.end(), folds))
    folded_ = std::make_unique<FoldedBytes>(codepage_);
}

std::string_view KeyMaker::make(const Line& line, Arena* keys) {
  std::string_view text = line.counted();
  // Shift bytes that change nothing do not count; most lines have none, or one that ends them.
  const size_t bytes = bytes_before_idle_shift(codepage_, text);
  text = bytes + 1 >= text.size() ? text.substr(0, bytes) : keep(without_idle_shifts(codepage_, text), keys);
  if (!order_.by_key()) return text;
  if (order_.fields_.size() == 1) return part(text, order_.fields_[0], keys);
  line_.clear();
  for (const SortField& field : order_.fields_) {
    parts_.clear();
    const size_t begin = line_.size();
    for (const char c : part(text, field, &parts_)) {
      line_ += c;
      if (c == 0) line_ += '\1';
    }
    line_.append(2, '\0');
    if (!field.reverse) continue;
    for (size_t i = begin; i < line_.size(); ++i) line_[i] = static_cast<char>(~line_[i]);
  }
  return keep(line_, keys);
}

/// The key of a field.
std::string_view KeyMaker::part(std::string_view text, const SortField& field, Arena* keys) {
  std::string_view found = order_.whole_ ? text : order_.finder_.find(text, field, &room_);
  const uint32_t options = order_.options_of(field);
  if (!order_.collation_.binary()) {
    char* const room = keys->room(Collation::key_room(found));
    const size_t bytes = order_.collation_.write_key(found, options, room);
    keys->take(bytes);
    return {room, bytes};
  }
  if (field.ignore_case) {
    char* const room = keys->room(FoldedBytes::key_room(found));
    const size_t bytes = folded_->write_key(found, room);
    keys->take(bytes);
    return {room, bytes};
  }
  // A shift byte that a text begins with does not count.
  const bool own = found.data() == room_.data();
  if (!found.empty() && codepage_.is_shift(found[0])) found.remove_prefix(1);
  return own ? keep(found, keys) : found;
}

std::string_view KeyMaker::keep(std::string_view text, Arena* keys) {
  char* const room = keys->room(text.size());
  std::copy(text.begin(), text.end(), room);
  keys->take(text.size());
  return {room, text.size()};
}

}  // namespace lexicor_cli
