// Validation of a codepage when it is loaded: afterwards every look-up, for whatever bytes or Unicode value,
// stays inside its section, no walk reads beyond the character it stands on, and what the library writes in the
// codepage reads back as the characters that were written, the null at its end included. Nothing else is
// refused.
#include "codepage/lxcodepage.h"
#include "core/lxmemory.h"
#include "core/lxobjtypes.h"

namespace {

namespace fmt = lx::format::codepage;

constexpr unsigned kAnyByte = 256;

// What the library writes by number: the null, blanks, digits, signs and parentheses.
constexpr uint8_t kWrittenAscii[] = {0x00, 0x20, 0x28, 0x29, 0x2B, 0x2D, 0x30, 0x31,
                                     0x32, 0x33, 0x34, 0x35, 0x36, 0x37, 0x38, 0x39};
constexpr uint8_t kWrittenEbcdic[] = {0x00, 0x40, 0x4D, 0x5D, 0x4E, 0x60, 0xF0, 0xF1,
                                      0xF2, 0xF3, 0xF4, 0xF5, 0xF6, 0xF7, 0xF8, 0xF9};

/// One trie of a codepage.
template <class NodeType>
struct Trie {
  using Node = NodeType;
  lx::Bytes nodes;    // from the root to the end of the section
  lx::Bytes entries;  // what leaves index
  size_t entry_bytes;

  bool has_node(size_t index) const { return nodes.holds(index * Node::kBytes, Node::kBytes); }
  Node node(size_t index) const { return Node::read(nodes.data + index * Node::kBytes); }
};

/// Measures how many bytes a walk from each node takes.
template <class Trie>
class TrieCheck {
  using Node = typename Trie::Node;

 public:
  explicit TrieCheck(const Trie& trie) : trie_(trie), known_(trie.nodes.size / Node::kBytes) {
    if (known_ != 0) heights_ = static_cast<uint8_t*>(lx::hook_allocate_zeroed(known_));
  }
  ~TrieCheck() { lx::hook_free(heights_); }
  TrieCheck(const TrieCheck&) = delete;
  TrieCheck& operator=(const TrieCheck&) = delete;

  bool out_of_memory() const { return known_ != 0 && heights_ == nullptr; }

  /// The most bytes that a walk from the root takes when it begins with `byte`; 0 when one leaves the section
  /// or takes more than `limit`.
  size_t walk_bytes(unsigned byte, size_t limit) {
    if (!trie_.has_node(0)) return 0;
    const Node root = trie_.node(0);
    if (byte < root.lowest || byte > root.highest) return 1;
    if (root.leaf != 0) return entry_exists(root, byte) ? 1 : 0;
    if (limit < 2) return 0;
    const size_t rest = height(root.next(byte), limit - 1);
    return rest == 0 || rest + 1 > limit ? 0 : rest + 1;
  }

 private:
  bool entry_exists(const Node& node, unsigned byte) const {
    return trie_.entries.holds(node.next(byte) * trie_.entry_bytes, trie_.entry_bytes);
  }

  /// As walk_bytes, from any node. Heights are kept, so each node is looked at once.
  size_t height(size_t index, size_t limit) {
    if (limit == 0 || !trie_.has_node(index)) return 0;
    if (heights_[index] != 0) return heights_[index];
    const Node node = trie_.node(index);
    size_t tallest = 1;
    for (unsigned byte = node.lowest; byte <= node.highest; ++byte) {
      if (node.leaf != 0) {
        if (!entry_exists(node, byte)) return 0;
        continue;
      }
      const size_t rest = height(node.next(byte), limit - 1);
      if (rest == 0) return 0;
      if (rest + 1 > tallest) tallest = rest + 1;
    }
    // A node whose range is empty maps nothing and costs the byte that is compared.
    heights_[index] = static_cast<uint8_t>(tallest);
    return tallest;
  }

  const Trie& trie_;
  size_t known_;
  uint8_t* heights_ = nullptr;  // by node; 0: not measured
};

class Validator {
 public:
  Validator(uint16_t id, const lx::Sections& sections)
      : sections_(sections), payload_(sections.section[0]), utf8_(id == fmt::kUtf8Id) {}

  int32_t run() {
    if (!payload_.holds(0, fmt::kFixedBytes)) return LX_E_CORRUPT;
    width_ = payload_.data[fmt::kWidth];
    shift_ = (word(fmt::kFlags) & fmt::kFlagShift) != 0 && width_ > 1;  // else no state differs
    if (!lengths_fit() || !width_tables_fit() || !written_bytes_fit()) return LX_E_CORRUPT;
    if (utf8_ ? !formula_fits() : !pages_fit() || !codes_fit()) return LX_E_CORRUPT;
    if (width_ == 1) return LX_OK;
    const int32_t rc = check_trie(type_trie());
    if (rc != LX_OK || utf8_) return rc;
    return check_trie(unicode_trie());
  }

 private:
  size_t word(size_t offset) const { return lx::le16(payload_.data + offset); }
  uint8_t length(unsigned byte) const { return payload_.data[fmt::kLengths + byte]; }
  bool is_shift(unsigned byte) const {
    return shift_ && (byte == payload_.data[fmt::kShiftOut] || byte == payload_.data[fmt::kShiftIn]);
  }

  /// Lengths are 1 to the width; where UTF-8 is computed, as long as the bytes that the formula reads.
  bool lengths_fit() const {
    if (width_ < 1 || width_ > lx::kMaxCharBytes) return false;
    for (unsigned byte = 0; byte < kAnyByte; ++byte) {
      if (length(byte) < 1 || length(byte) > width_) return false;
      if (utf8_ && length(byte) == 2 && byte > 0xDF) return false;
    }
    return true;
  }

  bool width_tables_fit() const {
    return payload_.holds(word(fmt::kFullWidth), fmt::kFullWidthBytes) &&
           payload_.holds(word(fmt::kPairs), word(fmt::kPairCount) * fmt::WidthPair::kBytes);
  }

  /// Whether a byte that the library writes as a character is one.
  bool single(unsigned byte) const { return length(byte) == 1 && !is_shift(byte); }
  bool all_single(const uint8_t* bytes, size_t count) const {
    for (size_t i = 0; i < count; ++i)
      if (!single(bytes[i])) return false;
    return true;
  }

  bool written_bytes_fit() const {
    const bool ascii = (word(fmt::kFlags) & fmt::kFlagAscii) != 0;
    return word(fmt::kUnicode) == 0 &&
           all_single(ascii ? kWrittenAscii : kWrittenEbcdic, sizeof(kWrittenAscii)) &&
           all_single(payload_.data + fmt::kLineEnds, fmt::kLineEndBytes) &&
           single(payload_.data[fmt::kSubstitution]);
  }

  /// Where UTF-8 is computed: what the formula writes has the lengths of the codepage, which has no states.
  bool formula_fits() const {
    if (shift_) return false;
    for (uint32_t u = 0; u <= UINT16_MAX; u += u < 0x800 ? 1 : 0x1000) {
      uint8_t bytes[lx::kMaxCharBytes];
      const size_t count = lx::utf8_bytes(static_cast<uint16_t>(u));
      lx::store_utf8(bytes, static_cast<uint16_t>(u), count);
      if (length(bytes[0]) != count) return false;
    }
    return true;
  }

  /// Codes are no longer than the width says, and U+0000 is the null.
  bool codes_fit() const {
    const lx::PageCodes pages{payload_.data, sections_.section[2].data, sections_.section[3].data};
    if (pages.code(0) != 0) return false;
    for (unsigned page = 0; page < kAnyByte; ++page) {
      const fmt::PageEntry entry = pages.entry(page);
      for (unsigned low = entry.lowest; low <= entry.highest; ++low) {
        const uint32_t code = lx::without_zero_bytes(pages.code(static_cast<uint16_t>(page << 8 | low)));
        if (lx::code_bytes(code) > width_) return false;
      }
    }
    return true;
  }

  bool pages_fit() const {
    for (size_t page = 0; page < kAnyByte; ++page)
      if (!page_fits(fmt::PageEntry::read(payload_.data + fmt::kPages + page * fmt::PageEntry::kBytes)))
        return false;
    return true;
  }

  bool page_fits(const fmt::PageEntry& page) const {
    const size_t low = page.low_bytes();
    const size_t high = page.high_bytes();
    for (unsigned byte = page.lowest; byte <= page.highest; ++byte) {
      const size_t index = byte & page.mask;
      if (low != 0 && !sections_.section[2].holds((page.low + index) * low, low)) return false;
      if (high != 0 && !sections_.section[3].holds((page.high + index) * high, high)) return false;
    }
    return true;
  }

  lx::Bytes rest_of(lx::Bytes section, size_t offset) const {
    return offset <= section.size ? lx::Bytes{section.data + offset, section.size - offset} : lx::Bytes{};
  }
  Trie<fmt::TypeNode> type_trie() const {
    return {rest_of(payload_, word(fmt::kTypeTrie)), rest_of(payload_, word(fmt::kTypeRecords)),
            fmt::TypeRecord::kBytes};
  }
  Trie<fmt::UnicodeNode> unicode_trie() const {
    return {sections_.section[1], rest_of(sections_.section[1], word(fmt::kUnicodeValues)), sizeof(uint16_t)};
  }

  /// A walk may take as many bytes as the character that begins with its first byte has. One-byte characters
  /// are walked in the double-byte state only, where they begin one of the width.
  template <class Node>
  int32_t check_trie(const Trie<Node>& trie) const {
    TrieCheck<Trie<Node>> check(trie);
    if (check.out_of_memory()) return LX_E_MEMORY;
    for (unsigned byte = 0; byte < kAnyByte; ++byte) {
      const size_t limit = length(byte) < 2 ? width_ : length(byte);
      if (check.walk_bytes(byte, limit) == 0) return LX_E_CORRUPT;
    }
    return LX_OK;
  }

  const lx::Sections& sections_;
  lx::Bytes payload_;
  bool utf8_;
  bool shift_ = false;
  uint8_t width_ = 0;
};

}  // namespace

namespace lx {

int32_t validate_codepage(uint16_t id, const Sections& sections) {
  return Validator(id, sections).run();
}

}  // namespace lx
