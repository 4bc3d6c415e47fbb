// Builds both tries bottom-up: the leaves' rows are packed first, then the rows of nodes, deepest first,
// because equal rows of nodes can only be told when their children have their places.
#include "trie_builder.h"

#include <bitset>
#include <optional>
#include <set>
#include <tuple>
#include <unordered_map>

#include "byte_tree.h"
#include "codepage/lxunicode.h"
#include "core/lxformat.h"
#include "row_packer.h"

namespace lexicor_data {
namespace {

namespace cp = lx::format::codepage;

/// A node of either trie; the type trie's has no range.
struct TrieNode : cp::UnicodeNode {
  auto key() const { return std::tie(leaf, mask, lowest, highest, base); }
  bool operator==(const TrieNode& other) const { return key() == other.key(); }
  bool operator!=(const TrieNode& other) const { return key() != other.key(); }
  bool operator<(const TrieNode& other) const { return key() < other.key(); }
};

constexpr uint8_t kRootMark = 2;  ///< a leaf flag that no row holds: keeps the root's place free

constexpr TrieNode kNothing{1, 0, 2, 1, 0};   ///< the Unicode trie's node that maps nothing
constexpr TrieNode kTypeless{1, 0, 0, 0, 0};  ///< the type trie's leaf to record 0, the type word 0

using NodePacker = RowPacker<TrieNode>;
using RecordPacker = RowPacker<uint32_t>;  ///< of record numbers

/// Packs the rows of inner nodes level by level. `request_of(node)` gives the row of a node whose children all
/// have their places, with the mask and range of the node in `result[node]`.
template <typename RequestOf>
std::vector<TrieNode> pack_nodes(const ByteTree& tree, std::vector<TrieNode>& result, const TrieNode& filler,
                                 RequestOf request_of) {
  NodePacker packer(filler, {TrieNode{kRootMark, 0, 0, 0, 0}});
  const auto levels = tree.levels();
  for (auto level = levels.rbegin(); level != levels.rend(); ++level) {
    std::vector<NodePacker::Request> requests;
    std::vector<uint32_t> inner;
    for (uint32_t node : *level) {
      if (tree.nodes[node].leaf) continue;
      inner.push_back(node);
      requests.push_back(request_of(node));
    }
    const auto positions = packer.place(requests);
    for (size_t i = 0; i < inner.size(); ++i) {
      result[inner[i]].base = static_cast<uint16_t>(positions[i] - requests[i].first_index);
    }
  }
  std::vector<TrieNode> nodes = packer.pool();
  nodes[0] = result[0];
  return nodes;
}

// -- bytes to Unicode values --------------------------------------------------------------------------------

/// The node of a tree node over its range of bytes, and the row's elements `of(byte)` over it.
template <typename Element, typename Of>
typename RowPacker<Element>::Request ranged_row(const ByteTree::Node& node, TrieNode& result, Of of) {
  unsigned lowest = 0, highest = 255;
  while (node.next[lowest] == ByteTree::kNone) ++lowest;
  while (node.next[highest] == ByteTree::kNone) --highest;
  result.leaf = node.leaf;
  result.lowest = static_cast<uint8_t>(lowest);
  result.highest = static_cast<uint8_t>(highest);
  result.mask = mask_for_range(result.lowest, result.highest);
  typename RowPacker<Element>::Request request;
  request.first_index = result.lowest & result.mask;
  for (unsigned byte = lowest; byte <= highest; ++byte) request.row.push_back(of(node.next[byte]));
  return request;
}

// -- bytes to type records ----------------------------------------------------------------------------------

using Bytes256 = std::bitset<256>;

/// A row over all 256 bytes, cut down to a mask.
template <typename Element>
struct MaskedRow {
  uint8_t mask = 0;
  std::vector<std::optional<Element>> slots;  ///< mask + 1; nothing where no byte that counts leads to
};

/// The shortest row that gives every byte that counts its element.
template <typename Element, typename Of>
MaskedRow<Element> mask_row(const Bytes256& counts, Of of) {
  for (unsigned size = 1;; size *= 2) {
    MaskedRow<Element> row;
    row.mask = static_cast<uint8_t>(size - 1);
    row.slots.resize(size);
    bool agrees = true;
    for (unsigned byte = 0; byte < 256 && agrees; ++byte) {
      if (!counts[byte]) continue;
      auto& slot = row.slots[byte & row.mask];
      const Element element = of(byte);
      agrees = !slot || *slot == element;
      slot = element;
    }
    if (agrees) return row;
  }
}

/// The bytes of a leaf that lead to an item that `has_say`.
template <typename HasSay>
Bytes256 bytes_with(const ByteTree::Node& leaf, HasSay has_say) {
  Bytes256 bytes;
  for (unsigned byte = 0; byte < 256; ++byte) {
    bytes[byte] = leaf.next[byte] != ByteTree::kNone && has_say(leaf.next[byte]);
  }
  return bytes;
}

/// Whether some bytes of a leaf all lead to one item.
bool is_uniform(const ByteTree::Node& leaf, const Bytes256& bytes) {
  std::set<uint32_t> items;
  for (unsigned byte = 0; byte < 256; ++byte) {
    if (bytes[byte]) items.insert(leaf.next[byte]);
  }
  return items.size() == 1;
}

/// The distinct type records, numbered; record 0 is that of "no character".
class TypeRecords {
 public:
  explicit TypeRecords(const CodepageModel& model) : model_(model) { number(0, 0); }

  uint32_t of(uint32_t code, uint16_t unicode) {
    const uint32_t type = lx::unicode_type(unicode);
    uint16_t other = unicode;
    if (type & LX_C1_UPPER) {
      other = lx::unicode_lower(unicode);
    } else if (type & LX_C1_LOWER) {
      other = lx::unicode_upper(unicode);
    }
    const uint32_t other_code = other == unicode ? kNoCode : model_.round_trip(other);
    // Between shift bytes a character keeps its width, and with it its state.
    const bool has_other = other_code != kNoCode && (other_code > 0xFF || !model_.is_shift());
    return number(type, has_other ? other_code - code : 0);
  }

  bool is_assigned(uint32_t number) const { return records_[number].type != lx::kTypeUnassigned; }

  void append_to(ByteVector& out, uint32_t number) const { append_record(out, records_[number]); }

 private:
  uint32_t number(uint32_t type, uint32_t delta) {
    const uint64_t key = static_cast<uint64_t>(type) << 32 | delta;
    const auto [entry, is_new] = numbers_.try_emplace(key, static_cast<uint32_t>(records_.size()));
    if (is_new) records_.push_back({type, delta});
    return entry->second;
  }

  const CodepageModel& model_;
  std::vector<cp::TypeRecord> records_;
  std::unordered_map<uint64_t, uint32_t> numbers_;
};

/// The bytes of a leaf whose records its row must keep.
Bytes256 counted_bytes(const ByteTree::Node& leaf, TypeRows rows, const Bytes256& trails,
                       const TypeRecords& types) {
  if (rows < TypeRows::kUniform) return trails;
  const Bytes256 assigned = bytes_with(leaf, [&](uint32_t item) { return types.is_assigned(item); });
  if (rows == TypeRows::kLoose && is_uniform(leaf, assigned)) return assigned;
  const Bytes256 all = bytes_with(leaf, [](uint32_t) { return true; });
  return is_uniform(leaf, all) ? all : trails;
}

/// The row of a leaf's records. Only the slots that count are stored; other rows stand around them.
RecordPacker::Request record_row(const ByteTree::Node& leaf, const Bytes256& counts, TrieNode& result) {
  const auto masked = mask_row<uint32_t>(
      counts, [&](unsigned byte) { return leaf.next[byte] == ByteTree::kNone ? 0 : leaf.next[byte]; });
  size_t first = 0, last = masked.mask;
  while (!masked.slots[first]) ++first;
  while (!masked.slots[last]) --last;
  RecordPacker::Request request;
  request.first_index = first;
  for (size_t i = first; i <= last; ++i) request.row.push_back(masked.slots[i].value_or(0));
  result = TrieNode{1, masked.mask, 0, 0, 0};
  return request;
}

}  // namespace

uint8_t mask_for_range(uint8_t lowest, uint8_t highest) {
  int bits = 0;
  while (lowest >> bits != highest >> bits) ++bits;
  return static_cast<uint8_t>((1 << bits) - 1);
}

UnicodeTrie build_unicode_trie(const CodepageModel& model) {
  const ByteTree tree = make_tree(model, [](uint32_t, uint16_t unicode) { return unicode; });
  std::vector<TrieNode> result(tree.nodes.size());

  using ValuePacker = RowPacker<uint16_t>;
  ValuePacker values(kNoValue);
  std::vector<ValuePacker::Request> requests;
  std::vector<uint32_t> leaves;
  for (uint32_t node = 0; node < tree.nodes.size(); ++node) {
    if (!tree.nodes[node].leaf) continue;
    leaves.push_back(node);
    requests.push_back(ranged_row<uint16_t>(tree.nodes[node], result[node], [](uint32_t item) {
      return item == ByteTree::kNone ? kNoValue : static_cast<uint16_t>(item);
    }));
  }
  const auto positions = values.place(requests);
  for (size_t i = 0; i < leaves.size(); ++i) {
    result[leaves[i]].base = static_cast<uint16_t>(positions[i] - requests[i].first_index);
  }

  const bool is_empty = tree.nodes.size() == 1;
  const auto nodes =
      is_empty ? std::vector<TrieNode>{kNothing} : pack_nodes(tree, result, kNothing, [&](uint32_t node) {
        return ranged_row<TrieNode>(tree.nodes[node], result[node], [&](uint32_t child) {
          return child == ByteTree::kNone ? kNothing : result[child];
        });
      });
  UnicodeTrie trie;
  for (const TrieNode& node : nodes) {
    append_record(trie.section, cp::UnicodeNode(node));
  }
  trie.values_offset = trie.section.size();
  for (uint16_t value : values.pool()) append_le16(trie.section, value);
  return trie;
}

TypeTrie build_type_trie(const CodepageModel& model, TypeRows rows) {
  TypeTrie trie;
  TypeRecords types(model);
  const auto item = [&](uint32_t code, uint16_t unicode) { return types.of(code, unicode); };
  const ByteTree tree = model.header.utf8 ? make_utf8_tree(model, item) : make_tree(model, item);
  const Bytes256 all = Bytes256().set();
  const Bytes256 trails = rows == TypeRows::kExact ? all : trail_bytes(model);
  std::vector<TrieNode> result(tree.nodes.size());

  RecordPacker records(0, {0});
  std::vector<RecordPacker::Request> requests;
  std::vector<uint32_t> leaves;
  for (uint32_t node = 0; node < tree.nodes.size(); ++node) {
    if (!tree.nodes[node].leaf) continue;
    const Bytes256 counts = counted_bytes(tree.nodes[node], rows, trails, types);
    const auto stray = bytes_with(tree.nodes[node], [](uint32_t) { return true; }) & ~counts;
    trie.retyped_chars += stray.count();
    leaves.push_back(node);
    requests.push_back(record_row(tree.nodes[node], counts, result[node]));
  }
  const auto positions = records.place(requests);
  for (size_t i = 0; i < leaves.size(); ++i) {
    TrieNode& node = result[leaves[i]];
    node.base = static_cast<uint16_t>(positions[i] - requests[i].first_index);
    records.reserve(size_t{node.base} + node.mask + 1);
  }

  const auto nodes = pack_nodes(tree, result, kTypeless, [&](uint32_t node) {
    const auto masked = mask_row<TrieNode>(node == 0 ? all : trails, [&](unsigned byte) {
      const uint32_t child = tree.nodes[node].next[byte];
      return child == ByteTree::kNone ? kTypeless : result[child];
    });
    result[node] = TrieNode{0, masked.mask, 0, 0, 0};
    NodePacker::Request request;
    for (const auto& slot : masked.slots) request.row.push_back(slot.value_or(kTypeless));
    return request;
  });

  for (const TrieNode& node : nodes) {
    append_record(trie.nodes, cp::TypeNode{node.leaf, node.mask, node.base});
  }
  for (uint32_t number : records.pool()) types.append_to(trie.records, number);
  return trie;
}

}  // namespace lexicor_data
