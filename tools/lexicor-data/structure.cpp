// Structural checks of the four kinds of objects.
#include "structure.h"

#include <vector>

#include "core/lxbytes.h"
#include "core/lxformat.h"
#include "ucm.h"

namespace lexicor_data {
namespace {

namespace format = lx::format;
namespace cp = lx::format::codepage;

[[noreturn]] void fail(const std::string& file_name, const std::string& what) {
  throw SourceError(file_name, 0, 0, what);
}

lx::Bytes view(const ByteVector& bytes) {
  return {bytes.data(), bytes.size()};
}

lx::Bytes tail(const ByteVector& bytes, size_t offset) {
  if (offset > bytes.size()) return {};
  return {bytes.data() + offset, bytes.size() - offset};
}

size_t word(const ByteVector& bytes, size_t index) {
  return lx::le16(&bytes[2 * index]);
}

/// Whether a null-terminated 16-bit text begins at the offset.
bool holds_text(const ByteVector& payload, size_t offset) {
  for (size_t at = offset; at + 2 <= payload.size(); at += 2) {
    if (lx::le16(&payload[at]) == 0) return true;
  }
  return false;
}

/// Texts end inside the payload and stand in the order of their words.
void check_texts(const ByteVector& payload, size_t header_bytes, size_t first, size_t last,
                 const std::string& file_name) {
  if (payload.size() < header_bytes) fail(file_name, "the payload is shorter than its header");
  for (size_t i = first; i <= last; ++i) {
    const std::string name = "the text of word " + std::to_string(i);
    if (word(payload, i) < header_bytes) fail(file_name, name + " begins inside the header");
    if (!holds_text(payload, word(payload, i))) fail(file_name, name + " does not end inside the payload");
    if (i > first && word(payload, i) < word(payload, i - 1))
      fail(file_name, name + " stands before the one before");
  }
}

/// A trie of a codepage: a walk from its root for each first byte.
class TrieWalk {
 public:
  TrieWalk(lx::Bytes nodes, size_t node_bytes, lx::Bytes items, size_t item_bytes, const std::string& what,
           const std::string& file_name)
      : nodes_(nodes),
        node_bytes_(node_bytes),
        items_(items),
        item_bytes_(item_bytes),
        what_(what),
        file_name_(file_name),
        depth_(nodes.size / node_bytes + 1) {}

  /// Checks all walks that begin with `first` and take at most `limit` bytes.
  void check(unsigned first, unsigned limit) { visit(0, first, first, limit); }

 private:
  [[noreturn]] void bad(const std::string& what) const { fail(file_name_, "the " + what_ + " trie " + what); }

  /// Visits the node for the bytes from..to, with `left` bytes to go; nodes below the root are visited once for
  /// each greatest depth.
  void visit(size_t index, unsigned from, unsigned to, unsigned left) {
    if (left == 0) bad("has a walk that is longer than its character");
    if (!nodes_.holds(index * node_bytes_, node_bytes_)) bad("leads to a node outside its section");
    const uint8_t* node = nodes_.data + index * node_bytes_;
    if (node_bytes_ == cp::UnicodeNode::kBytes) {
      from = from < node[2] ? node[2] : from;
      to = to > node[3] ? node[3] : to;
    }
    for (unsigned byte = from; byte <= to; ++byte) {
      const size_t next = lx::le16(node + node_bytes_ - 2) + (byte & node[1]);
      if (node[0] != 0) {
        if (!items_.holds(next * item_bytes_, item_bytes_)) bad("leads to an entry outside its section");
      } else if (next >= depth_.size()) {
        bad("leads to a node outside its section");
      } else if (depth_[next] == 0 || depth_[next] > left - 1) {
        visit(next, 0, 255, left - 1);
        depth_[next] = static_cast<uint8_t>(left - 1);
      }
    }
  }

  lx::Bytes nodes_;
  size_t node_bytes_;
  lx::Bytes items_;
  size_t item_bytes_;
  std::string what_, file_name_;
  std::vector<uint8_t> depth_;  ///< by node: the fewest bytes left with which it was found sound; 0 not visited
};

void check_pages(const ObjectFile& object, const std::string& file_name) {
  static const ByteVector kNone;
  const ByteVector& payload = object.sections[0];
  const lx::Bytes low = view(object.sections.size() > 2 ? object.sections[2] : kNone);
  const lx::Bytes high = view(object.sections.size() > 3 ? object.sections[3] : kNone);
  for (unsigned number = 0; number < 256; ++number) {
    const uint8_t* page = &payload[cp::kPages + cp::PageEntry::kBytes * number];
    const uint8_t kind = page[0];
    if (kind > cp::kKindByteByte) continue;
    const size_t low_bytes = kind == cp::kKindByte || kind == cp::kKindByteByte ? 1 : 2;
    const size_t high_bytes = kind == cp::kKindWordWord                                ? 2
                              : kind == cp::kKindByteWord || kind == cp::kKindByteByte ? 1
                                                                                       : 0;
    for (unsigned byte = page[2]; byte <= page[3]; ++byte) {
      const size_t index = byte & page[1];
      if (!low.holds((lx::le16(page + 4) + index) * low_bytes, low_bytes) ||
          !high.holds((lx::le16(page + 6) + index) * high_bytes, high_bytes)) {
        fail(file_name, "page " + std::to_string(number) + " leads outside its array");
      }
    }
  }
}

}  // namespace

void check_container(const ObjectFile& object, ObjectType type, const std::string& file_name) {
  if (object.version != format::kFormatVersion) {
    fail(file_name, "the format version is " + std::to_string(object.version) + ", not 2");
  }
  if (type != ObjectType::kCodepage && object.sections.size() != 1) {
    fail(file_name, "there is more than one section");
  }
}

void check_language_structure(const ByteVector& payload, const std::string& file_name) {
  namespace lang = format::language;
  check_texts(payload, lang::kHeaderBytes, lang::kFirstText, lang::kLastText, file_name);
  const lx::Bytes bytes = view(payload);
  if (!bytes.holds(word(payload, lang::kUpperSpecialTable),
                   word(payload, lang::kUpperSpecials) * lang::SpecialMapping::kBytes) ||
      !bytes.holds(word(payload, lang::kLowerSpecialTable),
                   word(payload, lang::kLowerSpecials) * lang::SpecialMapping::kBytes)) {
    fail(file_name, "a table of special mappings lies outside the payload");
  }
}

void check_territory_structure(const ByteVector& payload, const std::string& file_name) {
  namespace terr = format::territory;
  check_texts(payload, terr::kHeaderBytes, terr::kFirstText, terr::kLastText, file_name);
  if (word(payload, terr::kPayloadBytes) != payload.size())
    fail(file_name, "word 22 is not the payload's size");
  const size_t positions = word(payload, terr::kSignPositions);
  if ((positions & 0xFF) > 4 || positions >> 8 > 4) fail(file_name, "a sign position is above 4");
}

bool is_utf8_object(const ObjectFile& object) {
  return object.sections[0].size() > cp::kWidth && object.sections[0][cp::kWidth] > 1 &&
         (object.sections.size() < 2 || object.sections[1].empty());
}

void check_codepage_structure(const ObjectFile& object, const std::string& file_name) {
  const ByteVector& payload = object.sections[0];
  if (payload.size() < cp::kFixedBytes) fail(file_name, "the payload is shorter than its fixed part");
  const uint8_t width = payload[cp::kWidth];
  if (width < 1 || width > 4) fail(file_name, "the width is not 1 to 4");
  const bool shift = (lx::le16(&payload[cp::kFlags]) & cp::kFlagShift) != 0;
  for (unsigned byte = 0; byte < 256; ++byte) {
    const uint8_t length = payload[cp::kLengths + byte];
    if (length < 1 || length > width || (shift && length != 1)) {
      fail(file_name, "the length of byte " + std::to_string(byte) + " is not 1 to the width");
    }
  }
  check_pages(object, file_name);
  if (width == 1) return;

  auto offset = [&](size_t field) { return size_t{lx::le16(&payload[field])}; };
  for (size_t field : {cp::kFullWidth, cp::kPairs, cp::kTypeTrie, cp::kTypeRecords}) {
    if (offset(field) < cp::kFixedBytes || offset(field) % 4 != 0) {
      fail(file_name, "an offset of the variable part is not a multiple of 4 behind the fixed part");
    }
  }
  if (!view(payload).holds(offset(cp::kFullWidth), cp::kFullWidthBytes)) {
    fail(file_name, "the full-width table lies outside the payload");
  }
  if (!view(payload).holds(offset(cp::kPairs), offset(cp::kPairCount) * cp::WidthPair::kBytes)) {
    fail(file_name, "the width pairs lie outside the payload");
  }
  for (size_t i = 1; i < offset(cp::kPairCount); ++i) {
    const uint8_t* pair = &payload[offset(cp::kPairs) + i * cp::WidthPair::kBytes];
    if (lx::le32(pair) <= lx::le32(pair - cp::WidthPair::kBytes))
      fail(file_name, "the width pairs are not sorted");
  }

  TrieWalk types(tail(payload, offset(cp::kTypeTrie)), cp::TypeNode::kBytes,
                 tail(payload, offset(cp::kTypeRecords)), cp::TypeRecord::kBytes, "type", file_name);
  for (unsigned byte = 0; byte < 256; ++byte) {
    const uint8_t length = payload[cp::kLengths + byte];
    types.check(byte, shift || length == 1 ? width : length);
  }
  if (is_utf8_object(object)) return;
  const ByteVector& trie = object.sections[1];
  TrieWalk values(view(trie), cp::UnicodeNode::kBytes, tail(trie, offset(cp::kUnicodeValues)), 2, "Unicode",
                  file_name);
  for (unsigned byte = 0; byte < 256; ++byte) {
    const uint8_t length = payload[cp::kLengths + byte];
    if (shift || length > 1) values.check(byte, shift ? width : length);
  }
}

void check_sort_structure(const ObjectFile& object, const std::string& file_name) {
  namespace sort = format::sort;
  const ByteVector& payload = object.sections[0];
  if (payload.size() < sort::kFixedBytes) fail(file_name, "the payload is shorter than its fixed part");
  auto value = [&](size_t field) { return size_t{lx::le16(&payload[field])}; };
  const lx::Bytes bytes = view(payload);
  auto check_table = [&](size_t field, size_t count, size_t record_bytes, const std::string& what) {
    if (count != 0 && (value(field) < sort::kFixedBytes || !bytes.holds(value(field), count * record_bytes)))
      fail(file_name, "the " + what + " lie outside the payload");
  };
  const size_t expansions = value(sort::kExpansionCount), contractions = value(sort::kContractionCount);
  check_table(sort::kExpansions, expansions, sort::Expansion::kBytes, "expansions");
  check_table(sort::kContractions, contractions, sort::Contraction::kBytes, "contractions");
  std::vector<bool> expands(0x10000);
  for (size_t i = 0; i < expansions; ++i) {
    const size_t at = value(sort::kExpansions) + i * sort::Expansion::kBytes;
    expands[value(at)] = true;
    if (i > 0 && value(at) <= value(at - sort::Expansion::kBytes))
      fail(file_name, "the expansions are not sorted");
  }
  for (size_t i = 1; i < contractions; ++i) {
    const size_t at = value(sort::kContractions) + i * sort::Contraction::kBytes,
                 before = at - sort::Contraction::kBytes;
    if (value(at) < value(before) || (value(at) == value(before) && value(at + 2) <= value(before + 2)))
      fail(file_name, "the contractions are not sorted");
  }
  for (unsigned number = 0; number < 256; ++number) {
    const size_t page = sort::kPages + number * sort::Page::kBytes;
    if ((payload[page] & (sort::kPageUncovered | sort::kPagePrimary | sort::kPageSpecial)) != 0) continue;
    check_table(sort::kWeights, value(page + 2) + 256, sort::WeightRecord::kBytes,
                "weights of page " + std::to_string(number));
    for (size_t low = 0; low < 256; ++low) {
      const size_t flags = value(sort::kWeights) + (value(page + 2) + low) * sort::WeightRecord::kBytes + 4;
      if ((value(flags) & sort::WeightRecord::kExpansion) != 0 && !expands[number << 8 | low])
        fail(file_name, "character " + std::to_string(number << 8 | low) + " has no expansion");
    }
  }
}

}  // namespace lexicor_data
