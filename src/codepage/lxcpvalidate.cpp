// Validation of a codepage when it is loaded: afterwards every look-up, for whatever bytes or Unicode value,
// stays inside its section, no walk reads beyond the character it stands on, and what the library writes in the
// codepage reads back as the characters that were written, the null at its end included. Nothing else is
// refused.
#include "codepage/lxcodepage.h"
#include "core/lxmemory.h"

using namespace lx;

namespace {

namespace fmt = format::codepage;

constexpr unsigned kAnyByte = 256;

// What the library writes by number: the null, blanks, digits, signs and parentheses.
constexpr uint8_t kWrittenAscii[] = {0x00, 0x20, 0x28, 0x29, 0x2B, 0x2D, 0x30, 0x31,
                                     0x32, 0x33, 0x34, 0x35, 0x36, 0x37, 0x38, 0x39};
constexpr uint8_t kWrittenEbcdic[] = {0x00, 0x40, 0x4D, 0x5D, 0x4E, 0x60, 0xF0, 0xF1,
                                      0xF2, 0xF3, 0xF4, 0xF5, 0xF6, 0xF7, 0xF8, 0xF9};

/// One trie of a codepage, and what to say when it leads outside.
template <class NodeType>
struct Trie {
  using Node = NodeType;
  size_t section;
  size_t start;   // of the root in the section
  Bytes nodes;    // from there to the end of the section
  Bytes entries;  // what leaves index
  size_t entry_bytes;
  const char* no_node;
  const char* no_entry;
  const char* too_long;

  bool has_node(size_t index) const { return nodes.holds(index * Node::kBytes, Node::kBytes); }
  Node node(size_t index) const { return Node::read(nodes.data + index * Node::kBytes); }
  bool has_entry(size_t index) const { return entries.holds(index * entry_bytes, entry_bytes); }
};

/// Measures how many bytes a walk from each node takes.
template <class Trie>
class TrieCheck {
  using Node = typename Trie::Node;

 public:
  explicit TrieCheck(const Trie& trie) : trie_(trie), known_(trie.nodes.size / Node::kBytes) {
    if (known_ != 0) heights_ = static_cast<uint8_t*>(hook_allocate_zeroed(known_));
  }
  ~TrieCheck() { hook_free(heights_); }
  TrieCheck(const TrieCheck&) = delete;
  TrieCheck& operator=(const TrieCheck&) = delete;

  bool out_of_memory() const { return known_ != 0 && heights_ == nullptr; }

  /// Whether every walk from the root that begins with `byte` stays in the section and takes at most `limit`
  /// bytes; else fault() says why.
  bool check(unsigned byte, size_t limit) {
    if (!trie_.has_node(0)) return refuse(trie_.no_node, 0);
    const Node root = trie_.node(0);
    if (byte < root.lowest || byte > root.highest) return true;
    if (root.leaf != 0) return trie_.has_entry(root.next(byte)) || refuse(trie_.no_entry, 0);
    if (limit < 2) return refuse(trie_.too_long, 0);
    const size_t rest = height(root.next(byte), limit - 1, 0);
    return rest != 0 && (rest + 1 <= limit || refuse(trie_.too_long, 0));
  }
  const Fault& fault() const { return fault_; }

 private:
  bool refuse(const char* reason, size_t index) {
    fault_ = corrupt(reason, trie_.start + index * Node::kBytes, trie_.section);
    return false;
  }

  /// The most bytes that a walk from a node takes; 0 when one leaves the section or cannot end within `limit`.
  /// Heights are kept, so each node is looked at once.
  size_t height(size_t index, size_t limit, size_t parent) {
    if (limit == 0) return refuse(trie_.too_long, parent);
    if (!trie_.has_node(index)) return refuse(trie_.no_node, parent);
    if (heights_[index] != 0) return heights_[index];
    const Node node = trie_.node(index);
    size_t tallest = 1;
    // Where the highest entry that a leaf can lead to exists, all do.
    if (node.leaf != 0 && trie_.has_entry(node.next(node.mask))) return heights_[index] = 1;
    for (unsigned byte = node.lowest; byte <= node.highest; ++byte) {
      if (node.leaf != 0) {
        if (!trie_.has_entry(node.next(byte))) return refuse(trie_.no_entry, index);
        continue;
      }
      const size_t rest = height(node.next(byte), limit - 1, index);
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
  Fault fault_;
};

class Validator {
 public:
  Validator(uint16_t id, const Sections& sections)
      : sections_(sections), payload_(sections.section[0]), utf8_(id == fmt::kUtf8Id) {}

  Fault run() {
    if (!payload_.holds(0, fmt::kFixedBytes)) return corrupt("the payload is shorter than its fixed part", 0);
    width_ = payload_.data[fmt::kWidth];
    shift_ = (word(fmt::kFlags) & fmt::kFlagShift) != 0 && width_ > 1;  // else no state differs
    if (const Fault fault = check_lengths()) return fault;
    if (const Fault fault = check_width_tables()) return fault;
    if (const Fault fault = check_written_bytes()) return fault;
    if (const Fault fault = utf8_ ? check_formula() : check_pages()) return fault;
    if (width_ == 1) return {};
    if (const Fault fault = check_trie(type_trie())) return fault;
    return utf8_ ? Fault{} : check_trie(unicode_trie());
  }

 private:
  size_t word(size_t offset) const { return le16(payload_.data + offset); }
  uint8_t length(unsigned byte) const { return payload_.data[fmt::kLengths + byte]; }
  bool is_shift(unsigned byte) const {
    return shift_ && (byte == payload_.data[fmt::kShiftOut] || byte == payload_.data[fmt::kShiftIn]);
  }

  /// Lengths are 1 to the width; where UTF-8 is computed, as long as the bytes that the formula reads.
  Fault check_lengths() const {
    if (width_ < 1 || width_ > kMaxCharBytes) return corrupt("the width is not 1 to 4", fmt::kWidth);
    for (unsigned byte = 0; byte < kAnyByte; ++byte) {
      if (length(byte) < 1 || length(byte) > width_)
        return corrupt("the length of a byte is not 1 to the width", fmt::kLengths + byte);
      if (utf8_ && length(byte) == 2 && byte > 0xDF)
        return corrupt("the length of a byte is 2 where UTF-8 reads 3 bytes", fmt::kLengths + byte);
    }
    return {};
  }

  Fault check_width_tables() const {
    if (!payload_.holds(word(fmt::kFullWidth), fmt::kFullWidthBytes))
      return corrupt("the full-width table lies outside the payload", fmt::kFullWidth);
    if (!payload_.holds(word(fmt::kPairs), word(fmt::kPairCount) * fmt::WidthPair::kBytes))
      return corrupt("the width pairs lie outside the payload", fmt::kPairs);
    return {};
  }

  /// Whether a byte that the library writes as a character is one.
  bool single(unsigned byte) const { return length(byte) == 1 && !is_shift(byte); }

  Fault check_written_bytes() const {
    if (word(fmt::kUnicode) != 0) return corrupt("the byte 00 is not U+0000", fmt::kUnicode);
    const bool ascii = (word(fmt::kFlags) & fmt::kFlagAscii) != 0;
    for (uint8_t byte : ascii ? kWrittenAscii : kWrittenEbcdic)
      if (!single(byte))
        return corrupt("a null, blank, digit or sign is no character of one byte", fmt::kLengths + byte);
    for (size_t i = 0; i < fmt::kLineEndBytes; ++i)
      if (!single(payload_.data[fmt::kLineEnds + i]))
        return corrupt("a line end is no character of one byte", fmt::kLineEnds + i);
    if (!single(payload_.data[fmt::kSubstitution]))
      return corrupt("the substitution is no character of one byte", fmt::kSubstitution);
    return {};
  }

  /// Where UTF-8 is computed: what the formula writes has the lengths of the codepage, which has no states.
  Fault check_formula() const {
    if (shift_) return corrupt("UTF-8 has shift states", fmt::kFlags);
    for (uint32_t u = 0; u <= UINT16_MAX; u += u < 0x800 ? 1 : 0x1000) {
      uint8_t bytes[kMaxCharBytes];
      const size_t count = utf8_bytes(static_cast<uint16_t>(u));
      store_utf8(bytes, static_cast<uint16_t>(u), count);
      if (length(bytes[0]) != count)
        return corrupt("the length of a byte is not what UTF-8 writes", fmt::kLengths + bytes[0]);
    }
    return {};
  }

  /// Pages stay in their arrays, codes are no longer than the width says, and U+0000 is the null.
  Fault check_pages() const {
    const PageCodes pages{payload_.data, sections_.section[2].data, sections_.section[3].data};
    for (size_t number = 0; number < kAnyByte; ++number) {
      const fmt::PageEntry page = pages.entry(number);
      const size_t place = fmt::kPages + number * fmt::PageEntry::kBytes;
      // Where the highest element exists, all do, and codes of as many bytes as the width need no look.
      if (holds_element(2, page.low + page.mask, page.low_bytes()) &&
          holds_element(3, page.high + page.mask, page.high_bytes()) &&
          page.low_bytes() + page.high_bytes() <= width_)
        continue;
      for (unsigned byte = page.lowest; byte <= page.highest; ++byte) {
        if (!holds_element(2, page.low + (byte & page.mask), page.low_bytes()))
          return corrupt("a page leads outside the low array", place);
        if (!holds_element(3, page.high + (byte & page.mask), page.high_bytes()))
          return corrupt("a page leads outside the high array", place);
        const uint32_t code = page.code(byte, pages.low_array, pages.high_array);
        if (code_bytes(without_zero_bytes(code)) > width_)
          return corrupt("a page has a code that is longer than the width", place);
      }
    }
    if (pages.code(0) != 0) return corrupt("U+0000 is not the byte 00", fmt::kPages);
    return {};
  }
  bool holds_element(size_t section, size_t index, size_t bytes) const {
    return bytes == 0 || sections_.section[section].holds(index * bytes, bytes);
  }

  Bytes rest_of(Bytes section, size_t offset) const {
    return offset <= section.size ? Bytes{section.data + offset, section.size - offset} : Bytes{};
  }
  Trie<fmt::TypeNode> type_trie() const {
    const size_t start = word(fmt::kTypeTrie);
    return {0,
            start,
            rest_of(payload_, start),
            rest_of(payload_, word(fmt::kTypeRecords)),
            fmt::TypeRecord::kBytes,
            "the type trie leads to a node outside the payload",
            "the type trie leads to a record outside the payload",
            "the type trie has a walk that is longer than its character"};
  }
  Trie<fmt::UnicodeNode> unicode_trie() const {
    const Bytes section = sections_.section[1];
    return {1,
            0,
            section,
            rest_of(section, word(fmt::kUnicodeValues)),
            sizeof(uint16_t),
            "the Unicode trie leads to a node outside its section",
            "the Unicode trie leads to a value outside its section",
            "the Unicode trie has a walk that is longer than its character"};
  }

  /// A walk may take as many bytes as the character that begins with its first byte has. One-byte characters
  /// are walked in the double-byte state only, where they begin one of the width.
  template <class Node>
  Fault check_trie(const Trie<Node>& trie) const {
    TrieCheck<Trie<Node>> check(trie);
    if (check.out_of_memory()) return {LX_E_MEMORY};
    for (unsigned byte = 0; byte < kAnyByte; ++byte) {
      const size_t limit = length(byte) < 2 ? width_ : length(byte);
      if (!check.check(byte, limit)) return check.fault();
    }
    return {};
  }

  const Sections& sections_;
  Bytes payload_;
  bool utf8_;
  bool shift_ = false;
  uint8_t width_ = 0;
};

Fault validate_codepage(uint16_t id, const Sections& sections) {
  return Validator(id, sections).run();
}

}  // namespace

namespace lx {

const ObjectType kCodepageType{validate_codepage, derive_codepage, upgrade_codepage, &kBuiltInCodepage};

}  // namespace lx
