// Building and ordering of the byte tree.
#include "byte_tree.h"

namespace lexicor_data {

void ByteTree::insert(uint32_t code, uint32_t item) {
  uint32_t node = 0;
  for (int shift = 8 * (code_bytes(code) - 1); shift > 0; shift -= 8) {
    const uint8_t byte = static_cast<uint8_t>(code >> shift);
    if (nodes[node].next[byte] == kNone) {
      nodes[node].next[byte] = static_cast<uint32_t>(nodes.size());
      nodes.emplace_back();
    }
    node = nodes[node].next[byte];
  }
  nodes[node].leaf = true;
  nodes[node].next[code & 0xFF] = item;
}

std::vector<std::vector<uint32_t>> ByteTree::levels() const {
  std::vector<std::vector<uint32_t>> levels{{0}};
  std::vector<bool> seen(nodes.size());
  while (!levels.back().empty()) {
    std::vector<uint32_t> below;
    for (uint32_t node : levels.back()) {
      if (nodes[node].leaf) continue;
      for (uint32_t child : nodes[node].next) {
        if (child == kNone || seen[child]) continue;
        seen[child] = true;
        below.push_back(child);
      }
    }
    levels.push_back(std::move(below));
  }
  levels.pop_back();
  return levels;
}

ByteTree make_tree(const CodepageModel& model, const ItemOf& item) {
  ByteTree tree;
  for (const auto [code, unicode] : model.to_unicode) {
    if (code > 0xFF) tree.insert(code, item(code, unicode));
  }
  return tree;
}

ByteTree make_utf8_tree(const CodepageModel& model, const ItemOf& item) {
  ByteTree tree;
  // A leaf for each block of 64 values.
  std::vector<uint32_t> leaves(0x10000 / 64);
  for (uint32_t block = 0; block < leaves.size(); ++block) {
    leaves[block] = static_cast<uint32_t>(tree.nodes.size());
    ByteTree::Node leaf;
    leaf.leaf = true;
    for (uint32_t byte = 0; byte < 256; ++byte) {
      const auto unicode = static_cast<uint16_t>(block << 6 | (byte & 0x3F));
      leaf.next[byte] = item(model.from_unicode[unicode], unicode);
    }
    tree.nodes.push_back(leaf);
  }
  for (uint32_t lead = 0; lead < 256; ++lead) {
    if (model.header.leads[lead] == 2) tree.nodes[0].next[lead] = leaves[lead & 0x1F];
    if (model.header.leads[lead] != 3) continue;
    tree.nodes[0].next[lead] = static_cast<uint32_t>(tree.nodes.size());
    ByteTree::Node inner;
    for (uint32_t byte = 0; byte < 256; ++byte) inner.next[byte] = leaves[(lead & 0x0F) << 6 | (byte & 0x3F)];
    tree.nodes.push_back(inner);
  }
  return tree;
}

std::bitset<256> trail_bytes(const CodepageModel& model) {
  std::bitset<256> trails;
  for (const auto [code, unicode] : model.to_unicode) {
    for (uint32_t rest = code, bytes = code_bytes(code); bytes > 1; --bytes, rest >>= 8)
      trails.set(rest & 0xFF);
  }
  return trails;
}

}  // namespace lexicor_data
