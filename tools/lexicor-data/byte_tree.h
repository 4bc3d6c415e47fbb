// The characters of a multibyte codepage as a tree over their bytes: what the two tries of an object are made
// from. A leaf consumes a character's last byte and leads to an item (a Unicode value or a type record).
#pragma once

#include <array>
#include <bitset>
#include <cstdint>
#include <functional>
#include <vector>

#include "codepage_model.h"

namespace lexicor_data {

struct ByteTree {
  static constexpr uint32_t kNone = 0xFFFFFFFF;

  struct Node {
    bool leaf = false;
    std::array<uint32_t, 256> next;  ///< child nodes, in a leaf items; kNone where there is nothing
    Node() { next.fill(kNone); }
  };

  std::vector<Node> nodes;  ///< node 0 is the root

  ByteTree() : nodes(1) {}
  void insert(uint32_t code, uint32_t item);

  /// The nodes by their distance from the root.
  std::vector<std::vector<uint32_t>> levels() const;
};

using ItemOf = std::function<uint32_t(uint32_t code, uint16_t unicode)>;

/// The longer characters with their item.
ByteTree make_tree(const CodepageModel& model, const ItemOf& item);

/// UTF-8 as look-ups compute it: every trail byte counts with its low six bits, and a three-byte form of a
/// value below U+0800 has the item of its proper form.
ByteTree make_utf8_tree(const CodepageModel& model, const ItemOf& item);

/// The bytes that stand behind the first one in any longer character of the codepage.
std::bitset<256> trail_bytes(const CodepageModel& model);

}  // namespace lexicor_data
