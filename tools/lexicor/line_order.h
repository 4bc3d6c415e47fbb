// What orders lines: their whole texts or fields of them, by the sort of a locale or by their bytes.
#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "arena.h"
#include "collation.h"
#include "folded_bytes.h"
#include "sort_fields.h"
#include "text_lines.h"

namespace lexicor_cli {

class LineOrder {
 public:
  /// Without fields the whole line counts, as `defaults` say.
  LineOrder(Collation& collation, const FieldFinder& finder, const SortFieldDefaults& defaults,
            std::vector<SortField> fields);

  const Codepage& codepage() const { return collation_.codepage(); }
  /// Tells of a line whether it is short enough to be ordered.
  std::function<bool(std::string_view)> line_test() const {
    return [this](std::string_view line) { return line.size() <= most_part_ || orders_parts(line); };
  }
  /// Whether the bytes of keys tell the order; else compare() alone tells it.
  bool by_key() const { return by_key_; }
  /// Whether keys are the texts of the lines, or parts of them.
  bool by_text() const { return by_text_; }
  /// Whether the greatest key comes first.
  bool descending() const { return descending_; }

  /// Compares what KeyMaker has made of two lines: below 0, 0 or above 0. For one thread.
  int32_t compare(std::string_view key1, std::string_view key2) const;

 private:
  friend class KeyMaker;

  size_t most_part() const;
  bool orders_parts(std::string_view line) const;
  int32_t compare_texts(std::string_view text1, std::string_view text2) const;
  uint32_t options_of(const SortField& field) const { return field.ignore_case ? LX_CASE_INSENSITIVE : 0; }

  Collation& collation_;
  const FieldFinder& finder_;
  std::vector<SortField> fields_;
  size_t most_part_;    // the longest part of a line that has a key, in bytes
  bool whole_ = false;  // the one field is the whole line
  bool by_key_ = true, by_text_ = true, descending_ = false;
};

/// Makes the keys of lines. A thread has one.
class KeyMaker {
 public:
  explicit KeyMaker(const LineOrder& order);

  /// The key of a line, or, where there are none, its text. It is in the line's text or in `keys`.
  std::string_view make(const Line& line, Arena* keys);

 private:
  std::string_view part(std::string_view text, const SortField& field, Arena* keys);
  static std::string_view keep(std::string_view text, Arena* keys);

  const LineOrder& order_;
  const Codepage& codepage_;
  std::unique_ptr<FoldedBytes> folded_;  // in binary order without letter case
  std::string room_, line_;
  Arena parts_;
};

}  // namespace lexicor_cli
