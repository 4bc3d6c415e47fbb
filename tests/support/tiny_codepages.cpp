#include "support/tiny_codepages.h"

#include <algorithm>
#include <stdexcept>
#include <utility>

#include "codepage/lxcodepage.h"
#include "codepage/lxunicode.h"
#include "core/lxbytes.h"
#include "core/lxformat.h"
#include "core/lxmemory.h"
#include "core/lxobjtypes.h"

namespace lx::test {
namespace {

namespace fmt = format::codepage;

constexpr unsigned kBytes = 256;
constexpr uint16_t kUnmapped = 0xFFFD;

std::string code_text(uint32_t code) {
  std::string bytes;
  for (int shift = 24; shift >= 0; shift -= 8)
    if (shift == 0 || code >> shift != 0) bytes.push_back(static_cast<char>(code >> shift));
  return bytes;
}

/// The fewest low bits that tell the bytes of a range apart.
uint8_t mask_of(uint8_t lowest, uint8_t highest) {
  unsigned mask = 0;
  while ((lowest & ~mask) != (highest & ~mask)) mask = mask << 1 | 1;
  return static_cast<uint8_t>(mask);
}

uint16_t checked16(size_t value) {
  if (value > UINT16_MAX) throw std::length_error("a tiny codepage does not fit");
  return static_cast<uint16_t>(value);
}

void append16(ByteString* to, uint16_t value) {
  to->resize(to->size() + 2);
  put_le16(to->data() + to->size() - 2, value);
}

void append32(ByteString* to, uint32_t value) {
  to->resize(to->size() + 4);
  put_le32(to->data() + to->size() - 4, value);
}

/// Room for a row of an array: its first element stands at `lowest & mask` behind the offset.
struct Row {
  uint16_t offset;
  size_t first;
};
Row add_row(ByteString* array, size_t element_bytes, uint8_t lowest, uint8_t highest, uint8_t mask) {
  const size_t skipped = lowest & mask;
  size_t first = (array->size() + element_bytes - 1) / element_bytes;
  first = std::max(first, skipped);
  array->resize((first + highest - lowest + 1u) * element_bytes);
  return {checked16(first - skipped), first};
}

}  // namespace

CodepageBuilder::CodepageBuilder(uint16_t id, std::string name, uint8_t width)
    : id_(id), name_(std::move(name)), width_(width), lengths_(kBytes, 1) {}

CodepageBuilder& CodepageBuilder::lead(uint8_t first, uint8_t last, uint8_t length) {
  for (unsigned b = first; b <= last; ++b) lengths_[b] = length;
  return *this;
}

CodepageBuilder& CodepageBuilder::map(uint32_t code, uint16_t unicode, unsigned count) {
  for (unsigned i = 0; i < count; ++i) {
    to_unicode_[code + i] = static_cast<uint16_t>(unicode + i);
    to_code_[static_cast<uint16_t>(unicode + i)] = code + i;
  }
  return *this;
}

CodepageBuilder::Node CodepageBuilder::tree() const {
  Node root;
  for (const auto& [code, unicode] : to_unicode_) {
    if (code <= 0xFF) continue;
    Node* node = &root;
    for (char byte : code_text(code)) node = &node->next[static_cast<uint8_t>(byte)];
    node->has_value = true;
    node->unicode = unicode;
  }
  return root;
}

void CodepageBuilder::add_payload_tables(ByteString* payload) const {
  uint8_t* p = payload->data();
  const uint8_t fixed[] = {substitution_, 0x0A, 0x0D, 0x0A, 0x0A, width_, 0, 0, shift_out_, shift_in_};
  std::copy(std::begin(fixed), std::end(fixed), p);
  for (unsigned b = 0; b < kBytes; ++b) {
    const auto found = to_unicode_.find(b);
    const uint16_t u = found != to_unicode_.end() ? found->second : kUnmapped;
    p[fmt::kLengths + b] = lengths_[b];
    const auto other_case = [&](uint16_t other) {
      const auto code = to_code_.find(other);
      return static_cast<uint8_t>(code != to_code_.end() && code->second <= 0xFF ? code->second : b);
    };
    p[fmt::kUpper + b] = other_case(unicode_upper(u));
    p[fmt::kLower + b] = other_case(unicode_lower(u));
    put_le16(p + fmt::kUnicode + 2 * b, u);
    put_le32(p + fmt::kTypes + 4 * b, u != kUnmapped ? unicode_type(u) : 0);
  }
  put_le16(p + fmt::kFlags, shift_ ? fmt::kFlagShift : fmt::kFlagAscii);
}

/// Type nodes have no byte range: every byte needs a node of the right height, so those without a character
/// share one row of record 0. Node 0 is the root, 1 to 256 its children, then the grandchildren.
void CodepageBuilder::add_type_trie(ByteString* payload, const Node& root) const {
  struct TypeNode {
    bool leaf;
    uint8_t mask;
    uint16_t base;
  };
  std::vector<TypeNode> nodes{{false, 0xFF, 1}};
  nodes.resize(1 + kBytes, {true, 0, 0});
  std::vector<std::pair<uint32_t, uint32_t>> records{{kTypeUnassigned, 0}};
  const auto fill = [&](const auto& self, size_t place, const Node& node) -> void {
    if (node.next.begin()->second.has_value) {
      const size_t first = records.size();
      records.resize(first + kBytes, records[0]);
      for (const auto& [byte, leaf] : node.next) {
        // The case delta tells the records apart as well.
        records[first + byte] = {unicode_type(leaf.unicode), leaf.unicode};
      }
      nodes[place] = {true, 0xFF, checked16(first)};
      return;
    }
    const size_t first = nodes.size();
    nodes.resize(first + kBytes, {true, 0, 0});
    nodes[place] = {false, 0xFF, checked16(first)};
    for (const auto& [byte, child] : node.next) self(self, first + byte, child);
  };
  for (const auto& [byte, child] : root.next) fill(fill, 1u + byte, child);

  put_le16(payload->data() + fmt::kTypeTrie, checked16(payload->size()));
  for (const TypeNode& node : nodes) {
    payload->push_back(node.leaf ? 1 : 0);
    payload->push_back(node.mask);
    append16(payload, node.base);
  }
  put_le16(payload->data() + fmt::kTypeRecords, checked16(payload->size()));
  for (const auto& [type, delta] : records) {
    append32(payload, type);
    append32(payload, delta);
  }
  checked16(payload->size());
}

ByteString CodepageBuilder::unicode_trie(ByteString* payload, const Node& root) const {
  constexpr uint8_t kEmptyLeaf[fmt::UnicodeNode::kBytes] = {1, 0, 2, 1, 0, 0};
  ByteString nodes(fmt::UnicodeNode::kBytes);
  ByteString values;
  const auto fill = [&](const auto& self, size_t place, const Node& node) -> void {
    uint8_t entry[fmt::UnicodeNode::kBytes];
    std::copy(std::begin(kEmptyLeaf), std::end(kEmptyLeaf), entry);
    if (!node.next.empty()) {
      const uint8_t lowest = node.next.begin()->first;
      const uint8_t highest = node.next.rbegin()->first;
      const uint8_t mask = mask_of(lowest, highest);
      const bool leaf = node.next.begin()->second.has_value;
      const size_t before = leaf ? values.size() / 2 : nodes.size() / fmt::UnicodeNode::kBytes;
      const Row row =
          add_row(leaf ? &values : &nodes, leaf ? 2 : fmt::UnicodeNode::kBytes, lowest, highest, mask);
      const size_t after = leaf ? values.size() / 2 : nodes.size() / fmt::UnicodeNode::kBytes;
      for (size_t i = before; i < after; ++i) {
        if (leaf)
          put_le16(values.data() + 2 * i, kUnmapped);
        else
          std::copy(std::begin(kEmptyLeaf), std::end(kEmptyLeaf), nodes.begin() + static_cast<long>(i * 6));
      }
      for (const auto& [byte, child] : node.next) {
        const size_t index = row.first + byte - lowest;
        if (leaf)
          put_le16(values.data() + 2 * index, child.unicode);
        else
          self(self, index, child);
      }
      entry[0] = leaf ? 1 : 0;
      entry[1] = mask;
      entry[2] = lowest;
      entry[3] = highest;
      put_le16(entry + 4, row.offset);
    }
    std::copy(std::begin(entry), std::end(entry),
              nodes.begin() + static_cast<long>(place * fmt::UnicodeNode::kBytes));
  };
  fill(fill, 0, root);
  put_le16(payload->data() + fmt::kUnicodeValues, checked16(nodes.size()));
  nodes.insert(nodes.end(), values.begin(), values.end());
  return nodes;
}

void CodepageBuilder::add_pages(ByteString* payload, ByteString* low, ByteString* high) const {
  for (unsigned page = 0; page < kBytes; ++page) {
    uint8_t* entry = payload->data() + fmt::kPages + page * fmt::PageEntry::kBytes;
    const auto begin = to_code_.lower_bound(static_cast<uint16_t>(page << 8));
    const auto end = to_code_.upper_bound(static_cast<uint16_t>(page << 8 | 0xFF));
    if (begin == end) {
      entry[2] = 2;
      entry[3] = 1;
      continue;
    }
    uint32_t largest = 0;
    for (auto it = begin; it != end; ++it) largest = std::max(largest, it->second);
    const uint8_t kind = largest > 0xFFFFFF ? fmt::kKindWordWord
                         : largest > 0xFFFF ? fmt::kKindByteWord
                         : largest <= 0xFF  ? fmt::kKindByte
                         : two_arrays_      ? fmt::kKindByteByte
                                            : fmt::kKindWord;
    const size_t low_bytes = kind == fmt::kKindByte || kind == fmt::kKindByteByte ? 1 : 2;
    const size_t high_bytes = kind == fmt::kKindWordWord                         ? 2
                              : kind == fmt::kKindByte || kind == fmt::kKindWord ? 0
                                                                                 : 1;
    const uint8_t lowest = static_cast<uint8_t>(begin->first);
    const uint8_t highest = static_cast<uint8_t>(std::prev(end)->first);
    const uint8_t mask = mask_of(lowest, highest);
    const Row low_row = add_row(low, low_bytes, lowest, highest, mask);
    const Row high_row = high_bytes != 0 ? add_row(high, high_bytes, lowest, highest, mask) : Row{0, 0};
    for (unsigned b = lowest; b <= highest; ++b) {
      const auto found = to_code_.find(static_cast<uint16_t>(page << 8 | b));
      const uint32_t code = found != to_code_.end() ? found->second : substitution_;
      const size_t low_place = (low_row.first + b - lowest) * low_bytes;
      (*low)[low_place] = static_cast<uint8_t>(code);
      if (low_bytes == 2) (*low)[low_place + 1] = static_cast<uint8_t>(code >> 8);
      const size_t high_place = (high_row.first + b - lowest) * high_bytes;
      const uint32_t above = kind == fmt::kKindByteByte ? code >> 8 : code >> 16;
      if (high_bytes != 0) (*high)[high_place] = static_cast<uint8_t>(above);
      if (high_bytes == 2) (*high)[high_place + 1] = static_cast<uint8_t>(above >> 8);
    }
    entry[0] = kind;
    entry[1] = mask;
    entry[2] = lowest;
    entry[3] = highest;
    put_le16(entry + 4, low_row.offset);
    put_le16(entry + 6, high_row.offset);
  }
}

TinyCodepage CodepageBuilder::build() const {
  ByteString payload(fmt::kFixedBytes), trie, low, high;
  add_payload_tables(&payload);
  if (width_ > 1) {
    put_le16(payload.data() + fmt::kFullWidth, static_cast<uint16_t>(payload.size()));
    payload.resize(payload.size() + fmt::kFullWidthBytes);
    put_le16(payload.data() + fmt::kPairs, static_cast<uint16_t>(payload.size()));
    const Node root = tree();
    add_type_trie(&payload, root);
    trie = unicode_trie(&payload, root);
  }
  add_pages(&payload, &low, &high);
  TinyCodepage made{{id_, name_, {payload, trie, low, high}},
                    width_,
                    shift_,
                    static_cast<char>(shift_out_),
                    static_cast<char>(shift_in_),
                    substitution_,
                    lengths_,
                    {}};
  for (const auto& [code, unicode] : to_unicode_)
    if (to_code_.at(unicode) == code) made.characters.push_back({code_text(code), code, unicode});
  return made;
}

const TinyCharacter* TinyCodepage::find(uint16_t unicode) const {
  for (const TinyCharacter& c : characters)
    if (c.unicode == unicode) return &c;
  return nullptr;
}

std::string TinyCodepage::encode(const std::vector<uint16_t>& text, LXShiftState* state) const {
  std::string bytes;
  LXShiftState own = LX_SHIFT_SINGLE;
  LXShiftState& now = state != nullptr ? *state : own;
  for (uint16_t u : text) {
    const TinyCharacter* c = find(u);
    const std::string one = c != nullptr ? c->bytes : std::string(1, static_cast<char>(substitution));
    const LXShiftState needed = one.size() > 1 ? LX_SHIFT_DOUBLE : LX_SHIFT_SINGLE;
    if (shift && needed != now) bytes.push_back(needed == LX_SHIFT_DOUBLE ? shift_out : shift_in);
    if (shift) now = needed;
    bytes += one;
  }
  return bytes;
}

TinyCodepage tiny_single() {
  return CodepageBuilder(9001, "TINY-SINGLE", 1)
      .ascii()
      .map(0xA0, 0xA0, 4)
      .map(0xA5, 0xA5, 91)
      .map(0xA4, 0x20AC)
      .build();
}

TinyCodepage tiny_shift_jis() {
  return CodepageBuilder(9002, "TINY-SJIS", 2)
      .lead(0x81, 0x9F, 2)
      .lead(0xE0, 0xFC, 2)
      .ascii()
      .map(0xA1, 0xFF61, 63)
      .map(0x8140, 0x3000)
      .map(0x8260, 0xFF21, 26)
      .map(0x829F, 0x3041, 83)
      .map(0x8340, 0x30A1, 63)
      .map(0x889F, 0x4E9C)
      .map(0xE0FC, 0x4EF0)
      .build();
}

TinyCodepage tiny_euc() {
  return CodepageBuilder(9003, "TINY-EUC", 3)
      .lead(0x8E, 0x8E, 2)
      .lead(0x8F, 0x8F, 3)
      .lead(0xA1, 0xFE, 2)
      .map(0x00, 0x00, 0x5C)
      .map(0x5C, 0xA5)
      .map(0x5D, 0x5D, 0x23)
      .map(0x8EA1, 0xFF61, 63)
      .map(0xA4A1, 0x3041, 83)
      .map(0xB0A1, 0x4E9C)
      .map(0x8FB0A1, 0x4E02)
      .map(0x8FB0A2, 0x4E04, 2)
      .map(0x8FEDE3, 0x9FA5)
      .build();
}

TinyCodepage tiny_four() {
  return CodepageBuilder(9004, "TINY-FOUR", 4)
      .lead(0x81, 0x84, 2)
      .lead(0x90, 0x91, 4)
      .ascii()
      .map(0x8140, 0x4E02, 63)
      .map(0x84FE, 0x4E90)
      .map(0x90308130, 0x0100, 10)
      .map(0x90318130, 0x010A, 10)
      .map(0x91398139, 0x01FF)
      .two_arrays()
      .build();
}

TinyCodepage tiny_shift() {
  return CodepageBuilder(9005, "TINY-SHIFT", 2)
      .shift(0x0E, 0x0F)
      .substitution(0x6F)
      .map(0x00, 0x00, 4)
      .map(0x25, 0x0A)
      .map(0x40, 0x20)
      .map(0x6F, '?')
      .map(0x81, 'a', 9)
      .map(0x91, 'j', 9)
      .map(0xC1, 'A', 9)
      .map(0xD1, 'J', 9)
      .map(0xF0, '0', 10)
      .map(0x4040, 0x3000)
      .map(0x42C1, 0xFF21, 9)
      .map(0x4447, 0x3041, 83)
      .map(0x4541, 0x4E9C, 3)
      .build();
}

TinyCodepage tiny_utf8() {
  CodepageBuilder builder(fmt::kUtf8Id, "TINY-UTF8", 3);
  builder.ascii().lead(0xC0, 0xDF, 2).lead(0xE0, 0xFF, 3);
  // The mappings serve the type trie and the tests; conversion does not look at them.
  builder.map(0xC3A0, 0xE0, 0x20).map(0xC480, 0x100, 0x40).map(0xE38181, 0x3041, 63);
  builder.map(0xE4BA80, 0x4E80, 64);
  return builder.build();
}

std::vector<TinyCodepage> tiny_codepages() {
  return {tiny_single(),
          tiny_shift_jis(),
          tiny_euc(),
          tiny_four(),
          tiny_shift(),
          tiny_utf8(),
          CodepageBuilder(fmt::kCommonId, "US-ASCII", 1).ascii().build()};
}

TinyLibrary::TinyLibrary(const std::vector<TinyCodepage>& codepages) {
  std::vector<ScratchDirectory::Codepage> files;
  for (const TinyCodepage& codepage : codepages) files.push_back(codepage.file);
  // The control file lists identifiers in ascending order.
  std::sort(files.begin(), files.end(), [](const auto& a, const auto& b) { return a.id < b.id; });
  directory_.write_locale(files);
  if (LXInit(directory_.path().c_str(), Hooks::allocate, Hooks::release, &hooks_, LX_NO_DEFAULTS) != LX_OK)
    throw std::runtime_error("LXInit failed");
  open_ = true;
}

bool TinyLibrary::close() {
  if (!open_) return true;
  open_ = false;
  bool good = true;
  for (const auto& [name, locale] : locales_) good &= LXReleaseLocale(locale) == LX_OK;
  good &= LXTerm() == LX_OK;
  return good && hooks_.live_blocks() == 0 && hooks_.wrong_frees() == 0;
}

LXLocale* TinyLibrary::locale(const TinyCodepage& codepage) {
  LXLocale*& kept = locales_[codepage.file.name];
  int32_t rc = LX_OK;
  if (kept == nullptr) kept = LXGetLocale(("English_UnitedStates." + codepage.file.name).c_str(), 0, &rc);
  if (kept == nullptr) {
    locales_.erase(codepage.file.name);
    throw std::runtime_error("no locale of " + codepage.file.name + ": " + std::to_string(rc));
  }
  return kept;
}

const LXObject* TinyLibrary::object(uint16_t id, int32_t* rc) {
  return LXGetObjFromID(nullptr, LX_CODEPAGE, id, LX_FIND_AND_LOAD, rc);
}

const LXObject* TinyLibrary::object(const TinyCodepage& codepage) {
  int32_t rc = LX_OK;
  const LXObject* found = object(codepage.file.id, &rc);
  if (found == nullptr)
    throw std::runtime_error("no object of " + codepage.file.name + ": " + std::to_string(rc));
  return found;
}

CodepageObject::CodepageObject(uint16_t id, const std::vector<ByteString>& sections) : sections_(sections) {
  sections_.resize(format::kMaxSections);
  Sections exact;
  for (size_t i = 0; i < sections_.size(); ++i) {
    sections_[i].shrink_to_fit();
    exact.section[i] = {sections_[i].data(), sections_[i].size()};
    object_.section[i] = sections_[i].data();
  }
  object_.disk.id = id;
  object_.disk.type = LX_CODEPAGE;
  locale_.codepage = &object_;
  code_ = kCodepageType.validate(id, exact).code;
  if (code_ != LX_OK) return;
  object_.derived = derive_codepage(id, exact);
  if (object_.derived == nullptr) throw std::runtime_error("no memory for a codepage");
  const lx::Codepage& cp = codepage_of(object_);
  locale_.flags =
      static_cast<uint16_t>((cp.single_byte ? kLocaleSingleByte : 0) | (cp.shift_sensitive ? kLocaleShift : 0));
}

CodepageObject::~CodepageObject() {
  hook_free(object_.derived);
}

}  // namespace lx::test
