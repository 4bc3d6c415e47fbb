// What loading refuses, what it must not refuse, and that after it has accepted a codepage no function leaves
// the sections or reads beyond a character, whatever the bytes, and that what loading derives says what the
// tables of the file say.
#include <gtest/gtest.h>

#include <functional>
#include <random>

#include "codepage/lxcodepage.h"
#include "core/lxformat.h"
#include "support/conversion.h"
#include "support/tiny_codepages.h"
#include "support/use_codepage.h"

namespace lx::test {
namespace {

namespace fmt = format::codepage;
using S = std::vector<ByteString>;  // sections
using Edit = std::function<void(S&)>;

// ---- Changes of sections

Edit byte(size_t at, uint8_t value) {
  return [=](S& s) { s[0][at] = value; };
}
Edit length(uint8_t first_byte, uint8_t bytes) {
  return byte(fmt::kLengths + first_byte, bytes);
}
Edit word(size_t at, size_t value) {
  return [=](S& s) { put_le16(&s[0][at], static_cast<uint16_t>(value)); };
}
/// A place that lies so many bytes behind the end of a section.
Edit behind_end(size_t field, size_t section, ptrdiff_t bytes) {
  return [=](S& s) { word(field, s[section].size() + static_cast<size_t>(bytes))(s); };
}
Edit resize(size_t section, ptrdiff_t change) {
  return [=](S& s) { s[section].resize(s[section].size() + static_cast<size_t>(change)); };
}
Edit in_order(const std::vector<Edit>& edits) {
  return [=](S& s) {
    for (const Edit& edit : edits) edit(s);
  };
}

Edit page(size_t n, const fmt::PageEntry& entry) {
  return [=](S& s) { entry.write(&s[0][fmt::kPages + n * entry.kBytes]); };
}
/// A page whose first element stands in front of the end of an array by this many elements.
Edit page_at_end(size_t n, fmt::PageEntry entry, size_t low, size_t high) {
  return [=](S& s) {
    fmt::PageEntry placed = entry;
    if (low != 0) placed.low = static_cast<uint16_t>(s[2].size() / placed.low_bytes() - low);
    if (high != 0) placed.high = static_cast<uint16_t>(s[3].size() / placed.high_bytes() - high);
    page(n, placed)(s);
  };
}
/// Ten elements, of which the last one lies behind one array.
Edit last_behind(uint8_t kind, bool low) {
  return page_at_end(5, {kind, 0xFF, 0, 9, 0, 0}, low ? 9 : 0, low ? 0 : 9);
}
/// Gives every value of a page the code in one more element of the low array: a byte, or a word.
Edit code(size_t n, uint8_t kind, uint16_t code) {
  return [=](S& s) {
    s[2].resize((s[2].size() + 1) / 2 * 2);
    s[2].insert(s[2].end(), {static_cast<uint8_t>(code), static_cast<uint8_t>(code >> 8)});
    page_at_end(n, {kind, 0, 0, 0xFF, 0, 0}, kind == fmt::kKindByte ? 2 : 1, 0)(s);
  };
}

/// A trie: its nodes, and where the one stands that a first byte leads to.
template <class Node, size_t kSection, size_t kField>
struct Trie {
  static size_t root(const S& s) { return kField == 0 ? 0 : le16(&s[0][kField]); }
  static size_t child(const S& s, uint8_t first) {
    return root(s) + Node::read(&s[kSection][root(s)]).next(first) * Node::kBytes;
  }
  static Edit change(int first, const std::function<void(Node&)>& change) {  // first -1: the root
    return [=](S& s) {
      uint8_t* const at = &s[kSection][first < 0 ? root(s) : child(s, static_cast<uint8_t>(first))];
      Node node = Node::read(at);
      change(node);
      node.write(at);
    };
  }
  static Edit copy(uint8_t from, uint8_t to) {
    return [=](S& s) { Node::read(&s[kSection][child(s, from)]).write(&s[kSection][child(s, to)]); };
  }
};
using UnicodeTrie = Trie<fmt::UnicodeNode, 1, 0>;
using TypeTrie = Trie<fmt::TypeNode, 0, fmt::kTypeTrie>;

/// Makes the root lead every byte to the node at this place.
Edit only_child(size_t at) {
  return UnicodeTrie::change(-1, [=](auto& root) {
    root.mask = 0;
    root.base = static_cast<uint16_t>(at / root.kBytes);
  });
}
Edit only_child_of(uint8_t first) {
  return [=](S& s) { only_child(UnicodeTrie::child(s, first))(s); };
}

struct Change {
  const char* what;
  TinyCodepage (*codepage)();
  Edit apply;
};

/// The Unicode value of a sequence by the trie as it is laid down.
uint16_t walked(const S& s, const uint8_t* p) {
  for (size_t index = 0;; ++p) {
    const auto node = fmt::UnicodeNode::read(&s[1][index * fmt::UnicodeNode::kBytes]);
    if (*p < node.lowest || *p > node.highest) return kNoUnicode;
    index = node.next(*p);
    if (node.leaf != 0) return le16(&s[1][le16(&s[0][fmt::kUnicodeValues]) + 2 * index]);
  }
}

/// What loading derived says what the tables say: every value, or some of every page, and many sequences.
void compare(const S& s, const LXObject* object, std::mt19937* random, unsigned step) {
  for (uint32_t u = 0; u <= 0xFFFF; u += step < 100 ? 1 : 7) {
    uint8_t bytes[kMaxCharBytes];
    const int32_t count = LXCpUnicodeToChar(object, static_cast<uint16_t>(u), reinterpret_cast<char*>(bytes));
    const uint32_t code = without_zero_bytes(LXCpUnicodeToCharW(object, static_cast<uint16_t>(u)));
    ASSERT_EQ(pack(bytes, static_cast<size_t>(count)), code) << std::hex << u;
  }
  if (s[0][fmt::kWidth] == 1 || object->disk.id == fmt::kUtf8Id) return;
  for (uint32_t pair = 0; pair <= 0xFFFF; pair += 1 + static_cast<uint32_t>((*random)() % step)) {
    const uint32_t tail = static_cast<uint32_t>((*random)()) & ((*random)() % 8 == 0 ? 0x00FFu : 0xFFFFu);
    uint8_t bytes[kMaxCharBytes];
    store_code(bytes, pair << 16 | tail, sizeof(bytes));
    ASSERT_EQ(LXCpMbToUnicode(object, reinterpret_cast<const char*>(bytes)), walked(s, bytes))
        << std::hex << pair;
  }
}

/// Everything, and a stream.
void use_everything(LXLocale* locale, unsigned step) {
  look_up(locale, step);
  use_text(locale, step);
  std::string all;
  for (int b = 0; b < 512; ++b) all.push_back(static_cast<char>(b < 256 ? b : 511 - b));
  Conversion conversion(locale, locale);
  size_t at = 0;
  for (int steps = 0; steps < 5000 && at < all.size(); ++steps)
    at += conversion.call(all.substr(at, 5), 8).taken;
  EXPECT_EQ(at, all.size()) << "the stream stands still";
}

class Validate : public testing::Test {
 protected:
  void TearDown() override { EXPECT_TRUE(library_.close()); }

  TinyLibrary library_{{tiny_single()}};
};

TEST_F(Validate, Refused) {
  const Change changes[] = {
      {"width 0", tiny_single, byte(fmt::kWidth, 0)},
      {"width 5", tiny_four, byte(fmt::kWidth, 5)},
      {"length 0", tiny_shift_jis, length(0x41, 0)},
      {"a length above the width", tiny_shift_jis, length(0xFF, 3)},
      {"length 2 in a single-byte codepage", tiny_single, length(0, 2)},
      {"UTF-8: 3 bytes are read", tiny_utf8, in_order({length(0xF5, 2), TypeTrie::copy(0xC3, 0xF5)})},
      {"UTF-8: 2 bytes are written", tiny_utf8, length(0xC3, 3)},
      {"UTF-8 with shift states", tiny_utf8,
       in_order({word(fmt::kFlags, fmt::kFlagAscii | fmt::kFlagShift), word(fmt::kShiftOut, 0x0F0E)})},
      // Texts end, and what is written reads back.
      {"U+0000 is no null", tiny_single, code(0, fmt::kKindByte, 'A')},
      {"a null is no U+0000", tiny_single, word(fmt::kUnicode, 'A')},
      {"a null begins a character", tiny_shift_jis, length(0, 2)},
      {"a code above the width", tiny_single, code(5, fmt::kKindWord, 0x8140)},
      {"a lead byte to substitute", tiny_shift_jis, byte(fmt::kSubstitution, 0x81)},
      {"a digit begins a character", tiny_shift_jis, length('7', 2)},
      {"a sign shifts", tiny_shift, byte(fmt::kShiftOut, 0x60)},
      {"a line end shifts", tiny_shift, byte(fmt::kLineEnds + 3, 0x0F)},
      {"a full-width table behind the end", tiny_shift_jis,
       behind_end(fmt::kFullWidth, 0, 1 - ptrdiff_t{fmt::kFullWidthBytes})},
      {"a pair table behind the end", tiny_shift_jis,
       in_order(
           {word(fmt::kPairCount, 3), behind_end(fmt::kPairs, 0, 1 - 3 * ptrdiff_t{fmt::WidthPair::kBytes})})},
      {"a pair count behind the end", tiny_single, word(fmt::kPairCount, fmt::kFixedBytes / 8 + 1)},
      // Pages: the last element by one, of each kind.
      {"kind 0", tiny_single, last_behind(0, true)},
      {"kind 1", tiny_shift_jis, last_behind(1, true)},
      {"kind 2, low", tiny_euc, last_behind(2, true)},
      {"kind 2, high", tiny_euc, last_behind(2, false)},
      {"kind 3, low", tiny_four, last_behind(3, true)},
      {"kind 3, high", tiny_four, last_behind(3, false)},
      {"kind 4, low", tiny_four, last_behind(4, true)},
      {"kind 4, high", tiny_four, last_behind(4, false)},
      {"a mask that leaves the array", tiny_single, page_at_end(5, {0, 0xC0, 0xC0, 0xC0, 0, 0}, 0xC0, 0)},
      {"a high array that is not there", tiny_shift_jis, page(5, {4, 0, 0, 0, 0, 0})},
      // The trie towards Unicode.
      {"no trie", tiny_shift_jis, [](S& s) { s[1].clear(); }},
      {"half a root", tiny_shift_jis, [](S& s) { s[1].resize(fmt::UnicodeNode::kBytes - 1); }},
      {"a child behind the end", tiny_shift_jis, [](S& s) { only_child(s[1].size())(s); }},
      {"the root is its own child", tiny_shift_jis, only_child(0)},
      {"a child is its own child", tiny_four,
       [](S& s) {
         const auto own = static_cast<uint16_t>(UnicodeTrie::child(s, 0x90) / fmt::UnicodeNode::kBytes);
         UnicodeTrie::change(0x90, [=](auto& node) { node = {0, 0, 0, 0xFF, own}; })(s);
       }},
      {"a walk of three from two", tiny_euc, UnicodeTrie::copy(0x8F, 0xA4)},
      {"a child that is found sound for a longer character", tiny_euc,
       in_order({only_child_of(0x8F), UnicodeTrie::change(-1, [](auto& root) { root.lowest = 0x8F; })})},
      {"a length below the walk", tiny_euc, length(0x8F, 2)},
      {"values behind the end, by one", tiny_shift_jis, resize(1, -1)},
      {"values behind the end", tiny_shift_jis, behind_end(fmt::kUnicodeValues, 1, 1)},
      // The type trie: every byte is looked up.
      {"type records behind the end", tiny_shift_jis, behind_end(fmt::kTypeRecords, 0, 1)},
      {"type records behind the end, by one", tiny_shift_jis, resize(0, -1)},
      {"type trie behind the end", tiny_shift_jis, behind_end(fmt::kTypeTrie, 0, -3)},
      {"type trie: a loop", tiny_shift_jis, TypeTrie::change(-1, [](auto& root) { root.base = 0; })},
      {"type trie: too long", tiny_four, TypeTrie::copy(0x90, 0x81)},
      {"type trie in UTF-8", tiny_utf8, TypeTrie::change(-1, [](auto& root) { root.base = 0xFFFF; })},
      {"type trie, double-byte", tiny_shift, TypeTrie::change(0x42, [](auto& node) { node = {}; })},
  };
  for (const Change& change : changes) {
    TinyCodepage cp = change.codepage();
    EXPECT_EQ(CodepageObject(cp.file.id, cp.file.sections).code(), LX_OK);
    change.apply(cp.file.sections);
    EXPECT_EQ(CodepageObject(cp.file.id, cp.file.sections).code(), LX_E_CORRUPT) << change.what;
  }
}

TEST_F(Validate, NotRefused) {
  std::mt19937 random(5);
  const Change changes[] = {
      {"unused kinds", tiny_single,
       in_order({page(5, {5, 0xFF, 0, 0xFF, 0xFFFF, 0xFFFF}), page(6, {0xFF, 0xFF, 0, 0xFF, 0xFFFF, 0xFFFF})})},
      {"empty pages of any offset", tiny_four,
       [](S& s) {
         for (uint8_t kind = 0; kind < 5; ++kind) page(kind + 9u, {kind, 0xFF, 9, 8, 0xFFFF, 0xFFFF})(s);
       }},
      {"codes with zero bytes, which are not stored", tiny_four,
       [](S& s) {
         s[3].resize((s[3].size() + 1) / 2 * 2 + 2);
         code(5, fmt::kKindWord, 0x8140)(s);
         page_at_end(5, {fmt::kKindWordWord, 0, 0, 0xFF, 0, 0}, 1, 1)(s);
       }},
      {"pages that share rows", tiny_shift_jis,
       [](S& s) {
         const size_t kana = fmt::kPages + 0x30 * fmt::PageEntry::kBytes;
         page(0x31, fmt::PageEntry::read(&s[0][kana]))(s);
       }},
      {"a mask that keeps a page inside", tiny_single, page_at_end(5, {0, 0x03, 0, 0xFF, 0, 0}, 4, 0)},
      {"the last element of each array", tiny_four,
       [](S& s) {
         s[2].push_back(0x40);
         s[3].push_back(0x81);
         page_at_end(6, {fmt::kKindByteByte, 0, 0, 0xFF, 0, 0}, 1, 1)(s);
       }},
      {"an empty node of any base", tiny_shift_jis,
       UnicodeTrie::change(0x82,
                           [](auto& node) {
                             node = {0, 0xFF, 9, 8, 0xFFFF};
                           })},
      {"an empty root", tiny_shift_jis,
       UnicodeTrie::change(-1, [](auto& root) { root.lowest = 0xFF, root.highest = 0; })},
      {"first bytes that share a child", tiny_shift_jis, only_child_of(0x82)},
      {"nodes that share values", tiny_shift_jis, UnicodeTrie::copy(0x82, 0x83)},
      {"a root that is a leaf", tiny_shift_jis,
       UnicodeTrie::change(-1,
                           [](auto& root) {
                             root = {7, 0x00, 0, 0xFF, 0};
                           })},
      {"a lead byte as a code", tiny_shift_jis, code(5, fmt::kKindByte, 0x81)},
      {"two bytes without a lead byte", tiny_shift_jis, code(5, fmt::kKindWord, 0x4141)},
      {"a shift byte as a code", tiny_shift, code(5, fmt::kKindByte, 0x0E)},
      {"a shift byte in front", tiny_shift, code(5, fmt::kKindWord, 0x0F41)},
      {"one byte to shift out and in", tiny_shift, byte(fmt::kShiftIn, 0x0E)},
      {"a longer walk from a single byte", tiny_euc, length(0x8F, 1)},
      {"a short walk", tiny_euc, UnicodeTrie::copy(0xA4, 0x8F)},
      {"bytes behind everything", tiny_shift_jis,
       in_order({resize(0, 1), resize(1, 1), resize(2, 1), resize(3, 1)})},
      {"UTF-8: tries and pages are not looked at", tiny_utf8,
       [](S& s) {
         s.resize(1);
         for (uint8_t n = 0; n < 5; ++n) page(n, {n, 0xFF, 0, 0xFF, 0xFFFF, 0xFFFF})(s);
         word(fmt::kUnicodeValues, 0xFFFF)(s);
       }},
      {"UTF-8: longer than the formula", tiny_utf8, length(0xC0, 3)},
      {"single-byte: no trie is looked at", tiny_single,
       in_order({word(fmt::kTypeTrie, 0xFFFF), word(fmt::kTypeRecords, 0xFFFF),
                 word(fmt::kUnicodeValues, 0xFFFF), [](S& s) { s[1] = {0, 0xFF, 0, 0xFF, 0xFF, 0xFF}; }})},
      {"flags of any value", tiny_shift_jis, word(fmt::kFlags, 0xFFFD)},
  };
  for (const Change& change : changes) {
    SCOPED_TRACE(change.what);
    TinyCodepage cp = change.codepage();
    change.apply(cp.file.sections);
    CodepageObject made(cp.file.id, cp.file.sections);
    ASSERT_EQ(made.code(), LX_OK);
    use_everything(made.locale(), 3);
    cp.file.sections.resize(format::kMaxSections);
    compare(cp.file.sections, made.object(), &random, 20);
  }
}

TEST_F(Validate, WholeAndEveryTruncation) {
  std::mt19937 random(4);
  for (const TinyCodepage& cp : tiny_codepages()) {
    SCOPED_TRACE(cp.file.name);
    CodepageObject whole(cp.file.id, cp.file.sections);
    ASSERT_EQ(whole.code(), LX_OK);
    use_everything(whole.locale(), 1);
    compare(cp.file.sections, whole.object(), &random, 1);
    for (size_t section = 0; section < cp.file.sections.size(); ++section) {
      const size_t size = cp.file.sections[section].size();
      for (size_t cut = size; cut-- > 0; cut -= cut > 64 && size - cut > 64 ? 61 : 0) {
        S sections = cp.file.sections;
        sections[section].resize(cut);
        CodepageObject made(cp.file.id, sections);
        EXPECT_TRUE(section != 0 || made.code() == LX_E_CORRUPT) << cut;
        if (made.code() == LX_OK) look_up(made.locale(), 997);
      }
    }
  }
}

/// Bytes changed at random where offsets, counts, masks and nodes stand: refused, or safe and walked alike.
TEST_F(Validate, RandomDamage) {
  std::mt19937 random(6);
  for (const TinyCodepage& cp : tiny_codepages()) {
    SCOPED_TRACE(cp.file.name);
    int accepted = 0, refused = 0;
    for (int round = 0; round < 400; ++round) {
      S sections = cp.file.sections;
      const size_t nodes = le16(&sections[0][fmt::kUnicodeValues]);
      for (size_t n = 1 + random() % 3; n > 0; --n) {
        ByteString& p = sections[0];
        const uint8_t value = static_cast<uint8_t>(random() % 3 == 0 ? random() % 4 : random());
        const size_t behind = p.size() > 5500 ? random() % (p.size() - fmt::kFixedBytes) : 0;
        const size_t places[] = {fmt::kWidth + random() % 5, fmt::kLengths + random() % 256,
                                 fmt::kPages + random() % 2048, fmt::kFlags + random() % 12,
                                 fmt::kFixedBytes - 1 + behind};
        const size_t place = random() % 6;
        if (place < 5)
          p[places[place]] = value;
        else if (nodes != 0)
          sections[1][random() % nodes] = value;
      }
      CodepageObject made(cp.file.id, sections);
      ASSERT_TRUE(made.code() == LX_OK || made.code() == LX_E_CORRUPT);
      ++(made.code() == LX_OK ? accepted : refused);
      if (made.code() != LX_OK) continue;
      use_everything(made.locale(), 251);
      compare(sections, made.object(), &random, 500);
      if (HasFatalFailure()) return;
    }
    EXPECT_GT(accepted, 0);
    EXPECT_GT(refused, 0);
  }
}

}  // namespace
}  // namespace lx::test
