// Derived data of a codepage: its tries and pages laid flat when it is loaded, so that a character costs two
// table loads.
#include <string.h>

#include "codepage/lxwidth.h"
#include "core/lxmemory.h"

using namespace lx;

namespace {

namespace fmt = format::codepage;

constexpr uint32_t kRow = 256;
constexpr size_t kRowsBehind = 2;  // those of the trie: one without values, one of single bytes

/// The nodes of the multibyte-to-Unicode trie that can be reached, in the order in which they are found.
class ReachableNodes {
 public:
  explicit ReachableNodes(Bytes trie)
      : trie_(trie),
        known_(trie.size / fmt::UnicodeNode::kBytes),
        block_(static_cast<uint16_t*>(known_ != 0 ? hook_allocate_zeroed(2 * known_ * sizeof(uint16_t))
                                                  : nullptr)) {
    if (!block_) return;
    add(0);
    for (size_t i = 0; i < count_; ++i) add_children(node(i));
  }

  bool out_of_memory() const { return known_ != 0 && !block_; }
  size_t count() const { return count_; }
  fmt::UnicodeNode node(size_t i) const {
    return fmt::UnicodeNode::read(trie_.data + order()[i] * fmt::UnicodeNode::kBytes);
  }
  /// The place in the order of the node with this index in the file.
  uint16_t place(size_t index) const { return static_cast<uint16_t>(block_.get()[index] - 1); }

 private:
  uint16_t* order() const { return block_.get() + known_; }
  void add(size_t index) {
    if (block_.get()[index] != 0) return;
    order()[count_++] = static_cast<uint16_t>(index);
    block_.get()[index] = static_cast<uint16_t>(count_);
  }
  void add_children(const fmt::UnicodeNode& node) {
    if (node.leaf != 0) return;
    for (unsigned byte = node.lowest; byte <= node.highest; ++byte) add(node.next(byte));
  }

  Bytes trie_;
  size_t known_;             // nodes that the section has room for
  HookPtr<uint16_t> block_;  // place + 1 by index, then indexes by place
  size_t count_ = 0;
};

constexpr size_t kReadBehind = sizeof(uint16_t);  // codes of 16 bits are also loaded in pairs

/// Where the arrays stand in the block: behind the record, 32-bit codes first.
struct Layout {
  size_t codes;
  size_t rows;
  size_t first;
  size_t halves;
  size_t cases;
  size_t case_bytes;
  size_t leaf;
  size_t bytes;

  Layout(size_t code_rows, bool wide, size_t nodes, size_t half_slots, size_t case_numbers, bool utf8)
      : codes(sizeof(Codepage)),
        rows(codes + code_rows * kRow * (wide ? sizeof(uint32_t) : sizeof(uint16_t))),
        first(rows + (nodes != 0 ? nodes + kRowsBehind : 0) * kRow * sizeof(uint16_t)),
        halves(first + (nodes != 0 ? kRow * sizeof(uint32_t) : 0)),
        cases(halves + half_slots * sizeof(uint16_t)),
        case_bytes(cases + case_numbers * sizeof(uint16_t)),
        leaf(case_bytes + (utf8 ? 2 * case_numbers : 0)),
        bytes(leaf + nodes + kReadBehind) {}
};

void fill_scalars(Codepage* cp, uint16_t id, const Sections& sections) {
  const uint8_t* payload = sections.section[0].data;
  cp->payload = payload;
  cp->pages = {payload, sections.section[2].data, sections.section[3].data};
  cp->width = payload[fmt::kWidth];
  cp->substitution = payload[fmt::kSubstitution];
  cp->shift_out = payload[fmt::kShiftOut];
  cp->shift_in = payload[fmt::kShiftIn];
  cp->single_byte = cp->width == 1;
  cp->shift_sensitive = cp->width > 1 && (le16(payload + fmt::kFlags) & fmt::kFlagShift) != 0;
  cp->utf8 = id == fmt::kUtf8Id;
  for (size_t b = 0; b < kRow; ++b) cp->unicode[b] = le16(payload + fmt::kUnicode + 2 * b);
}

void fill_rows(const ReachableNodes& nodes, Bytes trie, const uint8_t* payload, uint16_t* rows, uint8_t* leaf) {
  const uint8_t* values = trie.data + le16(payload + fmt::kUnicodeValues);
  for (size_t i = 0; i < nodes.count(); ++i) {
    const fmt::UnicodeNode node = nodes.node(i);
    leaf[i] = node.leaf != 0;
    uint16_t* row = rows + i * kRow;
    for (size_t b = 0; b < kRow; ++b) row[b] = leaf[i] != 0 ? kNoUnicode : 0;
    for (unsigned b = node.lowest; b <= node.highest; ++b) {
      const size_t index = node.next(b);
      row[b] = leaf[i] != 0 ? le16(values + 2 * index) : nodes.place(index);
    }
  }
}

template <class Code>
void fill_codes(const Codepage& cp, Code* codes) {
  for (size_t low = 0; low < kRow; ++low) codes[low] = cp.substitution;  // row 0: a page that maps nothing
  for (size_t page = 0; page < kRow; ++page) {
    if (cp.page_start[page] == 0) continue;
    Code* row = codes + cp.page_start[page];
    const fmt::PageEntry entry = cp.pages.entry(page);
    for (unsigned low = 0; low < kRow; ++low) {
      const bool maps = entry.maps(low);
      const uint32_t code = maps ? entry.code(low, cp.pages.low_array, cp.pages.high_array) : cp.substitution;
      row[low] = static_cast<Code>(without_zero_bytes(code));
    }
  }
}

uint16_t same_below(const Codepage& cp) {
  if (cp.shift_sensitive) return 0;
  unsigned below = 0;
  for (; below < (cp.utf8 ? 0x80u : 0x100u); ++below) {
    const uint8_t b = static_cast<uint8_t>(below);
    if (cp.unicode[b] != b || (!cp.single_byte && cp.length(b) != 1)) break;
    if (!cp.utf8 && row_code(cp, b) != b) break;
  }
  return static_cast<uint16_t>(below & 0x180);
}

LeadRanges lead_ranges(const Codepage& cp) {
  LeadRanges leads{};
  size_t twos = 0, threes = 0;
  for (unsigned b = 0; b < kRow; ++b) {
    const uint8_t length = cp.length(static_cast<uint8_t>(b));
    if (length == 1) continue;
    if (length > 3) return leads;
    if (b != 0 && cp.length(static_cast<uint8_t>(b - 1)) == length) {
      ++(length == 2 ? leads.two[twos - 1] : leads.three).others;
      continue;
    }
    if (length == 2 ? twos++ == 2 : threes++ == 1) return leads;
    (length == 2 ? leads.two[twos - 1] : leads.three).first = static_cast<uint8_t>(b);
  }
  if (twos == 1) leads.two[1] = leads.two[0];
  leads.has_three = threes != 0;
  leads.above_ascii = leads.two[0].first >= kAscii && leads.two[1].first >= kAscii &&
                      (threes == 0 || leads.three.first >= kAscii);
  leads.known = twos != 0;
  return leads;
}

bool has_two_level_rows(const Codepage& cp, size_t nodes) {
  if (nodes == 0 || cp.leaf[0] != 0) return false;
  for (size_t i = 1; i < nodes; ++i)
    if (cp.leaf[i] == 0) return false;
  return true;
}

/// The rows behind those of the nodes, and by first byte where to look.
PairRows pair_rows(const Codepage& cp, size_t nodes, uint16_t* rows, uint32_t* first) {
  uint16_t* const none = rows + nodes * kRow;
  uint16_t* const single = none + kRow;
  for (size_t b = 0; b < kRow; ++b) none[b] = kNoUnicode;
  memcpy(single, cp.unicode, sizeof(cp.unicode));
  for (uint32_t b = 0; b < kRow; ++b) {
    const size_t node = rows[b];
    const uint8_t length = cp.length(static_cast<uint8_t>(b));
    if (length == 1)
      first[b] = static_cast<uint32_t>(single - rows + b) << 8;
    else if (length == 2 && node != 0 && cp.leaf[node] == 0)
      return {};
    else
      first[b] = static_cast<uint32_t>(node != 0 ? node * kRow : nodes * kRow) << 8 | 0xFF;
  }
  return {first, rows, cp.leads, cp.same_below >= kAscii};
}

bool has_plain_utf8(const Codepage& cp) {
  if (!cp.utf8 || cp.same_below < kAscii) return false;
  for (unsigned b = kAscii; b < kRow; ++b)
    if (cp.length(static_cast<uint8_t>(b)) != (b < 0xC2 || b >= 0xF0 ? 1 : b < 0xE0 ? 2 : 3)) return false;
  return true;
}

bool has_plain_case(const Codepage& cp) {
  for (unsigned b = 0; b < kRow; ++b) {
    const unsigned upper = b - 'a' < 26 ? b ^ 0x20 : b, lower = b - 'A' < 26 ? b ^ 0x20 : b;
    if (cp.payload[fmt::kUpper + b] != upper || cp.payload[fmt::kLower + b] != lower) return false;
  }
  return true;
}

bool has_plain_digits(const Codepage& cp) {
  for (int i = 0; i < 10; ++i)
    if (((cp.type(static_cast<uint8_t>(0x30 + i)) | cp.type(static_cast<uint8_t>(0xF0 + i))) & LX_C1_SPACE) !=
        0)
      return false;
  return true;
}

/// The type trie of a multibyte codepage, searched for characters that have another case.
class TypeTrie {
 public:
  explicit TypeTrie(const uint8_t* payload)
      : nodes_(payload + le16(payload + fmt::kTypeTrie)),
        records_(payload + le16(payload + fmt::kTypeRecords)) {}

  /// The node of the second byte of characters of two bytes; false where they end elsewhere.
  bool pair_node(uint8_t first_byte, fmt::TypeNode* node) const {
    const fmt::TypeNode root = fmt::TypeNode::read(nodes_);
    if (root.leaf != 0) return false;
    *node = fmt::TypeNode::read(nodes_ + fmt::TypeNode::kBytes * root.next(first_byte));
    return node->leaf != 0;
  }
  fmt::TypeRecord record(const fmt::TypeNode& leaf, unsigned byte) const {
    return fmt::TypeRecord::read(records_ + fmt::TypeRecord::kBytes * leaf.next(byte));
  }

  bool has_case(uint8_t first_byte) const {
    const fmt::TypeNode root = fmt::TypeNode::read(nodes_);
    return root.leaf != 0 || has_case_under(root.next(first_byte));
  }

 private:
  // No deeper than a character has bytes.
  bool has_case_under(size_t index) const {
    constexpr uint32_t kCase = LX_C1_UPPER | LX_C1_LOWER;
    const fmt::TypeNode node = fmt::TypeNode::read(nodes_ + fmt::TypeNode::kBytes * index);
    for (unsigned byte = 0; byte <= node.mask; ++byte) {
      if ((byte & ~unsigned{node.mask}) != 0) continue;
      const size_t next = node.next(byte);
      const uint8_t* record = records_ + fmt::TypeRecord::kBytes * next;
      if (node.leaf != 0 ? (fmt::TypeRecord::read(record).type & kCase) != 0 : has_case_under(next))
        return true;
    }
    return false;
  }

  const uint8_t* nodes_;
  const uint8_t* records_;
};

/// Finds which first bytes begin characters that have another case, and gives rows of PairCase to those of two bytes: how
/// many deltas the rows take.
size_t find_case(Codepage* cp) {
  if (cp->single_byte) return 0;
  const TypeTrie types(cp->payload);
  size_t rows = 0;
  unsigned mask = 0;
  for (unsigned b = 0; b < kRow; ++b) {
    const auto first = static_cast<uint8_t>(b);
    const uint8_t length = cp->length(first);
    if (length < 2) continue;
    fmt::TypeNode node;
    if (!types.has_case(first)) {
      cp->caseless[b] = length;
    } else if (length == 2 && rows < UINT8_MAX && types.pair_node(first, &node)) {
      cp->pair_case_rows[b] = static_cast<uint8_t>(++rows);
      mask |= node.mask;
    }
  }
  // All bits below the highest one that counts, so that a row has as many deltas as these have values.
  uint8_t bits = 0;
  while (mask >> bits != 0) ++bits;
  for (PairCase& pairs : cp->pair_case) pairs.bits = bits;
  return 2 * rows << bits;
}

/// The lower case first. The codepage has its place already; rows of bytes are filled for UTF-8.
void fill_pair_case(Codepage* cp, int16_t* deltas, PairCaseRow* row) {
  const TypeTrie types(cp->payload);
  for (PairCase& pairs : cp->pair_case) {
    pairs.deltas = deltas;
    pairs.row = cp->pair_case_rows;
    const bool as_bytes = cp->utf8 && size_t{1} << pairs.bits == sizeof(row->first);
    if (as_bytes) pairs.bytes = row;
    const uint32_t mask = &pairs == cp->pair_case ? LX_C1_UPPER : LX_C1_LOWER;
    for (unsigned first = 0; first < kRow; ++first) {
      fmt::TypeNode node;
      if (cp->pair_case_rows[first] == 0 || !types.pair_node(static_cast<uint8_t>(first), &node)) continue;
      for (unsigned second = 0; second >> pairs.bits == 0; ++second) {
        const fmt::TypeRecord type = types.record(node, second);
        const auto delta = static_cast<int32_t>((type.type & mask) != 0 ? type.case_delta : 0);
        *deltas++ = delta > INT16_MIN && delta <= INT16_MAX ? static_cast<int16_t>(delta) : PairCase::kFar;
        if (!as_bytes) continue;
        const uint32_t code = (first << 8 | 0x80 | second) + static_cast<uint32_t>(delta);
        row->first[second] = code - 0x100 < 0xFF00 ? static_cast<uint8_t>(code >> 8) : 0;
        row->second[second] = static_cast<uint8_t>(code);
      }
      if (as_bytes) ++row;
    }
  }
}

}  // namespace

namespace lx {

void* derive_codepage(uint16_t id, const Sections& sections) {
  Codepage scalars{};
  fill_scalars(&scalars, id, sections);
  const bool has_trie = !scalars.utf8 && !scalars.single_byte;
  const Bytes trie = has_trie ? sections.section[1] : Bytes{};
  const ReachableNodes nodes(trie);
  if (nodes.out_of_memory()) return nullptr;
  uint32_t code_rows = 1;
  for (size_t page = 0; page < kRow; ++page)
    if (!scalars.utf8 && scalars.pages.maps(page)) scalars.page_start[page] = kRow * code_rows++;
  const bool wide = !scalars.utf8 && scalars.width > 2;
  const size_t half_slots = WidthTables(scalars).slots();
  const size_t case_numbers = find_case(&scalars);
  const Layout layout(code_rows, wide, nodes.count(), half_slots, case_numbers, scalars.utf8);

  uint8_t* block = static_cast<uint8_t*>(hook_allocate_zeroed(layout.bytes));
  if (block == nullptr) return nullptr;
  Codepage* cp = reinterpret_cast<Codepage*>(block);
  memcpy(cp, &scalars, sizeof(scalars));
  if (wide) {
    uint32_t* codes = reinterpret_cast<uint32_t*>(block + layout.codes);
    fill_codes(*cp, codes);
    cp->codes32 = codes;
  } else {
    uint16_t* codes = reinterpret_cast<uint16_t*>(block + layout.codes);
    fill_codes(*cp, codes);
    cp->codes16 = codes;
  }
  if (nodes.count() != 0) {
    uint16_t* rows = reinterpret_cast<uint16_t*>(block + layout.rows);
    fill_rows(nodes, trie, cp->payload, rows, block + layout.leaf);
    cp->rows = rows;
    cp->leaf = block + layout.leaf;
  }
  if (half_slots != 0) {
    uint16_t* halves = reinterpret_cast<uint16_t*>(block + layout.halves);
    cp->halves = halves;
    cp->halves_mask = half_slots - 1;
    WidthTables(*cp).fill(halves);
  }
  cp->two_level_rows = has_two_level_rows(*cp, nodes.count());
  cp->same_below = same_below(*cp);
  if (!cp->single_byte) cp->leads = lead_ranges(*cp);
  if (cp->leads.known && nodes.count() != 0 && cp->leaf[0] == 0)
    cp->pairs = pair_rows(*cp, nodes.count(), reinterpret_cast<uint16_t*>(block + layout.rows),
                          reinterpret_cast<uint32_t*>(block + layout.first));
  cp->plain_utf8 = has_plain_utf8(*cp);
  cp->plain_case = has_plain_case(*cp);
  cp->plain_digits = has_plain_digits(*cp);
  fill_pair_case(cp, reinterpret_cast<int16_t*>(block + layout.cases),
                 reinterpret_cast<PairCaseRow*>(block + layout.case_bytes));
  return block;
}

uint32_t PageCodes::code(uint16_t u) const {
  const fmt::PageEntry page = entry(u >> 8);
  const uint8_t low_byte = static_cast<uint8_t>(u);
  return page.maps(low_byte) ? page.code(low_byte, low_array, high_array) : payload[fmt::kSubstitution];
}

}  // namespace lx
