// Enumerates what look-ups would find: every Unicode value through its page and every path of the trie.
#include "codepage_unpack.h"

#include <algorithm>

#include "core/lxbytes.h"
#include "core/lxformat.h"

namespace lexicor_data {
namespace {

namespace cp = lx::format::codepage;

/// Enumerates the characters of a multibyte-to-Unicode section.
class TrieReader {
 public:
  TrieReader(CodepageModel& model, const ByteVector& section, size_t values)
      : model_(model), section_(section), values_(values) {}

  /// Adds the characters that begin with a byte and have `bytes` bytes.
  void read(unsigned first, unsigned bytes) { visit(0, 0, first, first, bytes); }

 private:
  /// `left` is the number of bytes still to read, the one at this node included; a leaf that stands earlier
  /// than the last byte has no character of its own.
  void visit(size_t index, uint32_t code, unsigned first, unsigned last, unsigned left) {
    if (++visits_ > kMaxVisits)
      throw SourceError(model_.header.name, 0, 0, "the Unicode trie has too many paths");
    const auto node = record_at<cp::UnicodeNode>(section_, index * cp::UnicodeNode::kBytes);
    last = std::min<unsigned>(last, node.highest);
    for (unsigned byte = std::max<unsigned>(first, node.lowest); byte <= last; ++byte) {
      const size_t next = node.next(byte);
      const uint32_t longer = code << 8 | byte;
      if (node.leaf == 0) {
        visit(next, longer, 0, 255, left - 1);
      } else if (left == 1) {
        const uint16_t unicode = lx::le16(&section_[values_ + 2 * next]);
        if (unicode != kNoValue) model_.to_unicode[longer] = unicode;
      }
    }
  }

  /// Far above what a codepage needs; nodes that share their children could have 256 to the power of 3.
  static constexpr size_t kMaxVisits = 100000;

  CodepageModel& model_;
  const ByteVector& section_;
  size_t values_;
  size_t visits_ = 0;
};

}  // namespace

CodepageModel unpack_codepage(const ObjectFile& object, const ObjectName& name) {
  const ByteVector& payload = object.sections[0];
  const uint16_t flags = lx::le16(&payload[cp::kFlags]);
  CodepageModel model;
  CodepageSource& header = model.header;
  header.name = name.name;
  header.width = payload[cp::kWidth];
  header.kind = (flags & cp::kFlagShift) != 0 ? CodepageClass::kShiftStateful
                : header.width > 1            ? CodepageClass::kMultiByte
                                              : CodepageClass::kSingleByte;
  header.substitution = payload[cp::kSubstitution];
  std::copy_n(&payload[cp::kLineEnds], header.line_ends.size(), header.line_ends.begin());
  header.ascii = (flags & cp::kFlagAscii) != 0;
  std::copy_n(&payload[cp::kLengths], header.leads.size(), header.leads.begin());
  header.utf8 = name.id == cp::kUtf8Id;
  if (header.utf8) {
    fill_utf8(model);
    return model;
  }

  for (unsigned byte = 0; byte < 256; ++byte) {
    const uint16_t unicode = lx::le16(&payload[cp::kUnicode + 2 * byte]);
    if (unicode != kNoValue) model.to_unicode[byte] = unicode;
  }
  if (model.is_multibyte()) {
    TrieReader trie(model, object.sections[1], lx::le16(&payload[cp::kUnicodeValues]));
    for (unsigned byte = 0; byte < 256; ++byte) {
      if (model.is_shift()) {
        trie.read(byte, header.width);
      } else if (header.leads[byte] > 1) {
        trie.read(byte, header.leads[byte]);
      }
    }
  }
  const auto array = [&](size_t section) {
    return section < object.sections.size() ? object.sections[section].data() : nullptr;
  };
  model.from_unicode.assign(0x10000, kNoCode);
  for (unsigned unicode = 0; unicode < 0x10000; ++unicode) {
    const auto page = record_at<cp::PageEntry>(payload, cp::kPages + cp::PageEntry::kBytes * (unicode >> 8));
    const unsigned byte = unicode & 0xFF;
    if (page.maps(byte)) model.from_unicode[unicode] = page.code(byte, array(2), array(3));
  }
  settle_substitution(model);
  return model;
}

}  // namespace lexicor_data
