// What loading refuses, what it must not refuse, and that after it has accepted a codepage no function leaves
// the sections or reads beyond a character, whatever the bytes, and all find what the tables of the file say:
// the flat tables that loading derives are compared with those, walked as they are laid down.
#include <gtest/gtest.h>

#include <cstring>
#include <functional>
#include <random>

#include "core/lxbytes.h"
#include "core/lxformat.h"
#include "core/lxobjtypes.h"
#include "support/tiny_codepages.h"

namespace {

namespace fmt = lx::format::codepage;
using lx::le16;
using lx::put_le16;
using lx::test::ByteString;
using lx::test::CodepageObject;
using lx::test::tiny_euc;
using lx::test::tiny_four;
using lx::test::tiny_shift;
using lx::test::tiny_shift_jis;
using lx::test::tiny_single;
using lx::test::tiny_utf8;
using lx::test::TinyCodepage;
using lx::test::TinyLibrary;

using S = std::vector<ByteString>;  // sections

uint8_t* payload(S& s) {
  return s[0].data();
}
uint16_t word(S& s, size_t offset) {
  return le16(payload(s) + offset);
}
void set_word(S& s, size_t offset, size_t value) {
  put_le16(payload(s) + offset, static_cast<uint16_t>(value));
}
uint8_t* page(S& s, size_t n) {
  return payload(s) + fmt::kPages + n * fmt::PageEntry::kBytes;
}
uint8_t* node(S& s, size_t n) {
  return s[1].data() + n * fmt::UnicodeNode::kBytes;
}
uint8_t* type_node(S& s, size_t n) {
  return payload(s) + word(s, fmt::kTypeTrie) + n * fmt::TypeNode::kBytes;
}
/// The trie node that a first byte leads to.
uint8_t* child(S& s, uint8_t byte) {
  return node(s, static_cast<size_t>(le16(node(s, 0) + 4)) + (node(s, 0)[1] & byte));
}
void set_page(S& s, uint8_t n, int kind, int mask, int lowest, int highest, size_t low, size_t high) {
  uint8_t* p = page(s, n);
  for (int byte : {kind, mask, lowest, highest}) *p++ = static_cast<uint8_t>(byte);
  put_le16(p, static_cast<uint16_t>(low));
  put_le16(p + 2, static_cast<uint16_t>(high));
}

/// Gives every value of a page the code in one more element of the low array: a byte, or a word.
void set_code(S& s, uint8_t n, int kind, uint16_t code) {
  s[2].resize((s[2].size() + 1) / 2 * 2);
  const size_t element = s[2].size() / (kind == fmt::kKindByte ? 1 : 2);
  s[2].insert(s[2].end(), {static_cast<uint8_t>(code), static_cast<uint8_t>(code >> 8)});
  set_page(s, n, kind, 0, 0, 0xFF, element, 0);
}

/// The look-ups of a codepage over its sections.
struct RawCodepage {
  uint16_t id;
  std::vector<ByteString> sections;

  const uint8_t* payload() const { return sections[0].data(); }

  uint16_t unicode(const uint8_t* p) const {
    if (id == fmt::kUtf8Id) {
      if (p[0] > 0xDF) return static_cast<uint16_t>((p[0] & 0x0F) << 12 | (p[1] & 0x3F) << 6 | (p[2] & 0x3F));
      return static_cast<uint16_t>((p[0] & 0x1F) << 6 | (p[1] & 0x3F));
    }
    const uint8_t* trie = sections[1].data();
    for (const uint8_t* node = trie;; ++p) {
      if (*p < node[2] || *p > node[3]) return 0xFFFD;
      const size_t next = static_cast<size_t>(le16(node + 4)) + (node[1] & *p);
      if (node[0] != 0) return le16(trie + le16(payload() + 4374) + 2 * next);
      node = trie + 6 * next;
    }
  }

  uint32_t code(uint16_t u) const {
    if (id == fmt::kUtf8Id) {
      const uint32_t last = 0x80 | (u & 0x3F);
      if (u < 0x80) return u;
      if (u < 0x800) return (0xC0u | u >> 6) << 8 | last;
      return (0xE0u | u >> 12) << 16 | (0x80u | (u >> 6 & 0x3F)) << 8 | last;
    }
    const uint8_t* entry = payload() + 2316 + 8 * (u >> 8);
    const uint8_t low = static_cast<uint8_t>(u);
    if (low < entry[2] || low > entry[3]) return payload()[0];
    const size_t l = static_cast<size_t>(le16(entry + 4)) + (low & entry[1]);
    const size_t h = static_cast<size_t>(le16(entry + 6)) + (low & entry[1]);
    const uint8_t* lows = sections[2].data();
    const uint8_t* highs = sections[3].data();
    switch (entry[0]) {
      case 0:
        return lows[l];
      case 1:
        return le16(lows + 2 * l);
      case 2:
        return static_cast<uint32_t>(highs[h]) << 16 | le16(lows + 2 * l);
      case 3:
        return static_cast<uint32_t>(le16(highs + 2 * h)) << 16 | le16(lows + 2 * l);
      case 4:
        return highs[h] * 256u + lows[l];
      default:
        return 0;
    }
  }

  /// The place of the type record in the payload.
  size_t record(const uint8_t* p) const {
    const uint8_t* root = payload() + le16(payload() + 4370);
    const uint8_t* node = root;
    for (; node[0] == 0; ++p) node = root + 4 * (le16(node + 2) + (node[1] & *p));
    return le16(payload() + 4372) + 8u * (le16(node + 2) + (node[1] & *p));
  }

  struct Unpacked {
    uint8_t bytes[4] = {};
    size_t count = 0;
    void add(uint32_t byte) { bytes[count++] = static_cast<uint8_t>(byte); }
  };
  static Unpacked unpacked(uint32_t code) {
    Unpacked made;
    if (code > 0xFFFFFF) made.add(code >> 24);
    if ((code >> 16 & 0xFF) != 0) made.add(code >> 16);
    if ((code >> 8 & 0xFF) != 0) made.add(code >> 8);
    made.add(code);
    return made;
  }
};

void compare_from_unicode(const RawCodepage& raw, const LXObject* object) {
  for (uint32_t u = 0; u <= 0xFFFF; ++u) {
    const uint16_t unit = static_cast<uint16_t>(u);
    const uint32_t code = raw.code(unit);
    char bytes[5] = {1, 1, 1, 1, 1};
    const RawCodepage::Unpacked expected = RawCodepage::unpacked(code);
    const bool same = LXCpUnicodeToCharW(object, unit) == code &&
                      LXCpUnicodeToChar(object, unit, bytes) == static_cast<int32_t>(expected.count) &&
                      memcmp(expected.bytes, bytes, expected.count) == 0 && bytes[expected.count] == 1;
    ASSERT_TRUE(same) << std::hex << u;
  }
}

void compare_sequence(const RawCodepage& raw, const LXObject* object, const uint8_t (&bytes)[4]) {
  const char* text = reinterpret_cast<const char*>(bytes);
  ASSERT_EQ(LXCpMbToUnicode(object, text), raw.unicode(bytes)) << testing::PrintToString(bytes);
  const size_t record = raw.record(bytes);
  ASSERT_EQ(LXGetMbCtype(object, text) - object->section[0], static_cast<ptrdiff_t>(record));
  const size_t length = 1 + bytes[3] % 4u;
  uint32_t code = 0;
  for (size_t i = 0; i < length; ++i) code = code << 8 | bytes[i];
  const RawCodepage::Unpacked unpacked = RawCodepage::unpacked(code);
  ASSERT_EQ(LXCpMbToUnicodeW(object, code), raw.unicode(unpacked.bytes)) << std::hex << code;
  ASSERT_EQ(LXGetMbCtypeW(object, code) - object->section[0],
            static_cast<ptrdiff_t>(raw.record(unpacked.bytes)));
}

/// Every value and two-byte sequence, and many longer ones; `step` leaves out some.
void compare(const RawCodepage& raw, std::mt19937* random, unsigned step = 1) {
  CodepageObject made(raw.id, raw.sections);
  ASSERT_EQ(made.code(), LX_OK);
  compare_from_unicode(raw, made.object());
  if (raw.payload()[5] == 1) return;
  const unsigned tails = raw.payload()[5] > 2 ? 4 : 1;
  for (unsigned pair = 0; pair <= 0xFFFF; pair += 1 + static_cast<unsigned>((*random)() % step)) {
    for (unsigned i = 0; i < tails; ++i) {
      const auto tail = (*random)() & ((*random)() % 8 == 0 ? 0x00FFu : 0xFFFFu);
      const uint8_t bytes[4] = {static_cast<uint8_t>(pair >> 8), static_cast<uint8_t>(pair),
                                static_cast<uint8_t>(tail), static_cast<uint8_t>(tail >> 8)};
      compare_sequence(raw, made.object(), bytes);
      if (testing::Test::HasFatalFailure()) return;
    }
  }
}

class Validate : public testing::Test {
 protected:
  void TearDown() override { EXPECT_TRUE(library_.close()); }

  /// Calls everything that looks up characters with every pair of bytes, at the very end of a block.
  static void sweep(CodepageObject* made, unsigned step = 1) {
    const LXObject* object = made->object();
    LXLocale* locale = made->locale();
    const uint8_t* lengths = object->section[0] + fmt::kLengths;
    const uint8_t width = object->section[0][fmt::kWidth];
    std::vector<char> block(4);
    std::vector<LXUChar> units(4);
    const uint8_t* payload = object->section[0];
    uint32_t seen = 0;
    const auto read_record = [&](const uint8_t* record) {
      if (record != nullptr) seen += lx::le32(record) + lx::le32(record + 4);
    };
    for (unsigned pair = 0; pair <= 0xFFFF; pair += step) {
      const uint8_t first = static_cast<uint8_t>(pair >> 8);
      const size_t walk = lengths[first] < 2 ? width : lengths[first];
      char* p = block.data() + 4 - walk;
      for (size_t i = 0; i < walk; ++i) p[i] = static_cast<char>(i == 0 ? first : pair * (2 * i - 1));
      const int32_t bytes = static_cast<int32_t>(walk);
      if (payload[fmt::kWidth] > 1) {
        seen += LXCpMbToUnicode(object, p);
        read_record(LXGetMbCtype(object, p));
      }
      seen += LXGetCharType(locale, p, LX_CTYPE1);
      seen += LXGetCharTypeW(locale, static_cast<LXWChar>(pair), LX_CTYPE1);
      seen += static_cast<uint32_t>(LXStringToUnicode(units.data(), 4, locale, p, bytes, 0));
      for (LXShiftState state : {LX_SHIFT_SINGLE, LX_SHIFT_DOUBLE})
        seen += static_cast<uint32_t>(LXStringToUnicodeEx(units.data(), 4, locale, p, state, bytes, 0));
      seen += static_cast<uint32_t>(LXCpStrToUnicode(object, p, bytes, units.data()));
    }
    EXPECT_NE(seen, 0u);
  }

  TinyLibrary library_{{lx::test::tiny_single()}};
};

struct Change {
  const char* name;
  TinyCodepage (*codepage)();
  std::function<void(S&)> apply;
};

TEST_F(Validate, Refused) {
  const Change changes[] = {
      {"width 0", tiny_single, [](S& s) { payload(s)[fmt::kWidth] = 0; }},
      {"width 5", tiny_four, [](S& s) { payload(s)[fmt::kWidth] = 5; }},
      {"length 0", tiny_shift_jis, [](S& s) { payload(s)[fmt::kLengths + 0x41] = 0; }},
      {"a length above the width", tiny_shift_jis, [](S& s) { payload(s)[fmt::kLengths + 0xFF] = 3; }},
      {"length 2 in a single-byte codepage", tiny_single, [](S& s) { payload(s)[fmt::kLengths] = 2; }},
      {"UTF-8: 3 bytes are read", tiny_utf8, [](S& s) { payload(s)[fmt::kLengths + 0xE0] = 2; }},
      {"UTF-8: 2 bytes are written", tiny_utf8, [](S& s) { payload(s)[fmt::kLengths + 0xC3] = 3; }},
      {"UTF-8 with shift states", tiny_utf8,
       [](S& s) {
         set_word(s, fmt::kFlags, fmt::kFlagAscii | fmt::kFlagShift);
         set_word(s, fmt::kShiftOut, 0x0F0E);
       }},
      // Texts end, and what is written reads back.
      {"U+0000 is no null", tiny_single, [](S& s) { set_code(s, 0, fmt::kKindByte, 'A'); }},
      {"a null is no U+0000", tiny_single, [](S& s) { set_word(s, fmt::kUnicode, 'A'); }},
      {"a null begins a character", tiny_shift_jis, [](S& s) { payload(s)[fmt::kLengths] = 2; }},
      {"a code above the width", tiny_single, [](S& s) { set_code(s, 5, fmt::kKindWord, 0x8140); }},
      {"a lead byte to substitute", tiny_shift_jis, [](S& s) { payload(s)[fmt::kSubstitution] = 0x81; }},
      {"a digit begins a character", tiny_shift_jis, [](S& s) { payload(s)[fmt::kLengths + '7'] = 2; }},
      {"a sign shifts", tiny_shift, [](S& s) { payload(s)[fmt::kShiftOut] = 0x60; }},
      {"a line end shifts", tiny_shift, [](S& s) { payload(s)[fmt::kLineEnds + 3] = 0x0F; }},
      {"a full-width table behind the end", tiny_shift_jis,
       [](S& s) { set_word(s, fmt::kFullWidth, s[0].size() - fmt::kFullWidthBytes + 1); }},
      {"a pair table behind the end", tiny_shift_jis,
       [](S& s) {
         set_word(s, fmt::kPairCount, 3);
         set_word(s, fmt::kPairs, s[0].size() - 3 * fmt::WidthPair::kBytes + 1);
       }},
      {"a pair count behind the end", tiny_single,
       [](S& s) { set_word(s, fmt::kPairCount, fmt::kFixedBytes / 8 + 1); }},
      // Pages: the last element by one, of each kind.
      {"kind 0", tiny_single, [](S& s) { set_page(s, 5, 0, 0xFF, 0, 9, s[2].size() - 9, 0); }},
      {"kind 1", tiny_shift_jis, [](S& s) { set_page(s, 5, 1, 0xFF, 0, 9, s[2].size() / 2 - 9, 0); }},
      {"kind 2, low", tiny_euc, [](S& s) { set_page(s, 5, 2, 0xFF, 0, 9, s[2].size() / 2 - 9, 0); }},
      {"kind 2, high", tiny_euc, [](S& s) { set_page(s, 5, 2, 0xFF, 0, 9, 0, s[3].size() - 9); }},
      {"kind 3, high", tiny_four, [](S& s) { set_page(s, 5, 3, 0xFF, 0, 9, 0, s[3].size() / 2 - 9); }},
      {"kind 4, low", tiny_four, [](S& s) { set_page(s, 5, 4, 0xFF, 0, 9, s[2].size() - 9, 0); }},
      {"kind 4, high", tiny_four, [](S& s) { set_page(s, 5, 4, 0xFF, 0, 9, 0, s[3].size() - 9); }},
      {"a mask that leaves the array", tiny_single,
       [](S& s) { set_page(s, 5, 0, 0xC0, 0xC0, 0xC0, s[2].size() - 0xC0, 0); }},
      {"a high array that is not there", tiny_shift_jis, [](S& s) { set_page(s, 5, 4, 0, 0, 0, 0, 0); }},
      // The trie towards Unicode.
      {"no trie", tiny_shift_jis, [](S& s) { s[1].clear(); }},
      {"half a root", tiny_shift_jis, [](S& s) { s[1].resize(fmt::UnicodeNode::kBytes - 1); }},
      {"a child behind the end", tiny_shift_jis,
       [](S& s) { put_le16(node(s, 0) + 4, static_cast<uint16_t>(s[1].size() / 6)); }},
      {"the root is its own child", tiny_shift_jis,
       [](S& s) {
         node(s, 0)[1] = 0;
         put_le16(node(s, 0) + 4, 0);
       }},
      {"a child is its own child", tiny_four,
       [](S& s) {
         uint8_t* at = child(s, 0x90);
         at[1] = 0;
         put_le16(at + 4, static_cast<uint16_t>((at - s[1].data()) / 6));
       }},
      {"a walk of three from two", tiny_euc,
       [](S& s) { std::copy_n(child(s, 0x8F), fmt::UnicodeNode::kBytes, child(s, 0xA4)); }},
      {"a length below the walk", tiny_euc, [](S& s) { payload(s)[fmt::kLengths + 0x8F] = 2; }},
      {"values behind the end, by one", tiny_shift_jis, [](S& s) { s[1].resize(s[1].size() - 1); }},
      {"values behind the end", tiny_shift_jis,
       [](S& s) { set_word(s, fmt::kUnicodeValues, s[1].size() + 1); }},
      // The type trie: every byte is looked up.
      {"type records behind the end", tiny_shift_jis,
       [](S& s) { set_word(s, fmt::kTypeRecords, s[0].size() + 1); }},
      {"type trie behind the end", tiny_shift_jis, [](S& s) { set_word(s, fmt::kTypeTrie, s[0].size() - 3); }},
      {"type trie: a loop", tiny_shift_jis, [](S& s) { put_le16(type_node(s, 0) + 2, 0); }},
      {"type trie: too long", tiny_four,
       [](S& s) { std::copy_n(type_node(s, 1 + 0x90), 4, type_node(s, 1 + 0x81)); }},
      {"type trie in UTF-8", tiny_utf8, [](S& s) { put_le16(type_node(s, 0) + 2, 0xFFFF); }},
      {"type trie, double-byte", tiny_shift, [](S& s) { std::fill_n(type_node(s, 1), 4, uint8_t{0}); }},
  };
  for (const Change& change : changes) {
    TinyCodepage cp = change.codepage();
    EXPECT_EQ(CodepageObject(cp.file.id, cp.file.sections).code(), LX_OK);
    change.apply(cp.file.sections);
    EXPECT_EQ(CodepageObject(cp.file.id, cp.file.sections).code(), LX_E_CORRUPT) << change.name;
  }
}

TEST_F(Validate, NotRefused) {
  std::mt19937 random(5);
  const Change changes[] = {
      {"unused kinds", tiny_single,
       [](S& s) {
         set_page(s, 5, 5, 0xFF, 0, 0xFF, 0xFFFF, 0xFFFF);
         set_page(s, 6, 0xFF, 0xFF, 0, 0xFF, 0xFFFF, 0xFFFF);
       }},
      {"empty pages of any offset", tiny_four,
       [](S& s) {
         for (uint8_t kind = 0; kind < 5; ++kind) set_page(s, kind + 9, kind, 0xFF, 9, 8, 0xFFFF, 0xFFFF);
       }},
      {"codes with zero bytes, which are not stored", tiny_four,
       [](S& s) {
         set_code(s, 5, 3, 0x8140);
         s[3].resize((s[3].size() + 1) / 2 * 2 + 2);
         put_le16(page(s, 5) + 6, static_cast<uint16_t>(s[3].size() / 2 - 1));
       }},
      {"pages that share rows", tiny_shift_jis, [](S& s) { std::copy_n(page(s, 0x30), 8, page(s, 0x31)); }},
      {"a mask that keeps a page inside", tiny_single,
       [](S& s) { set_page(s, 5, 0, 0x03, 0, 0xFF, s[2].size() - 4, 0); }},
      {"the last element of each array", tiny_four,
       [](S& s) {
         s[2].push_back(0x40);
         s[3].push_back(0x81);
         set_page(s, 6, 4, 0x00, 0, 0xFF, s[2].size() - 1, s[3].size() - 1);
       }},
      {"an empty node of any base", tiny_shift_jis,
       [](S& s) {
         const uint8_t empty[] = {0, 0xFF, 9, 8, 0xFF, 0xFF};
         std::copy_n(empty, 6, child(s, 0x82));
       }},
      {"an empty root", tiny_shift_jis, [](S& s) { node(s, 0)[2] = 0xFF, node(s, 0)[3] = 0; }},
      {"first bytes that share a child", tiny_shift_jis,
       [](S& s) {
         put_le16(node(s, 0) + 4, static_cast<uint16_t>((child(s, 0x82) - s[1].data()) / 6));
         node(s, 0)[1] = 0;
       }},
      {"nodes that share values", tiny_shift_jis,
       [](S& s) { std::copy_n(child(s, 0x82), fmt::UnicodeNode::kBytes, child(s, 0x83)); }},
      {"a root that is a leaf", tiny_shift_jis,
       [](S& s) {
         const uint8_t leaf[] = {7, 0x00, 0, 0xFF, 0, 0};
         std::copy_n(leaf, 6, node(s, 0));
       }},
      {"a lead byte as a code", tiny_shift_jis, [](S& s) { set_code(s, 5, fmt::kKindByte, 0x81); }},
      {"two bytes without a lead byte", tiny_shift_jis, [](S& s) { set_code(s, 5, fmt::kKindWord, 0x4141); }},
      {"a shift byte as a code", tiny_shift, [](S& s) { set_code(s, 5, fmt::kKindByte, 0x0E); }},
      {"a shift byte in front", tiny_shift, [](S& s) { set_code(s, 5, fmt::kKindWord, 0x0F41); }},
      {"one byte to shift out and in", tiny_shift, [](S& s) { payload(s)[fmt::kShiftIn] = 0x0E; }},
      {"a longer walk from a single byte", tiny_euc, [](S& s) { payload(s)[fmt::kLengths + 0x8F] = 1; }},
      {"a short walk", tiny_euc,
       [](S& s) { std::copy_n(child(s, 0xA4), fmt::UnicodeNode::kBytes, child(s, 0x8F)); }},
      {"bytes behind everything", tiny_shift_jis,
       [](S& s) {
         for (ByteString& section : s) section.push_back(0xEE);
       }},
      {"UTF-8: tries and pages are not looked at", tiny_utf8,
       [](S& s) {
         s.resize(1);
         for (uint8_t n = 0; n < 5; ++n) set_page(s, n, n, 0xFF, 0, 0xFF, 0xFFFF, 0xFFFF);
         set_word(s, fmt::kUnicodeValues, 0xFFFF);
       }},
      {"UTF-8: longer than the formula", tiny_utf8, [](S& s) { payload(s)[fmt::kLengths + 0xC0] = 3; }},
      {"single-byte: no trie is looked at", tiny_single,
       [](S& s) {
         for (size_t offset : {fmt::kTypeTrie, fmt::kTypeRecords, fmt::kUnicodeValues})
           set_word(s, offset, 0xFFFF);
         s[1] = {0, 0xFF, 0, 0xFF, 0xFF, 0xFF};
       }},
      {"flags of any value", tiny_shift_jis, [](S& s) { set_word(s, fmt::kFlags, 0xFFFD); }},
  };
  for (const Change& change : changes) {
    SCOPED_TRACE(change.name);
    TinyCodepage cp = change.codepage();
    change.apply(cp.file.sections);
    CodepageObject made(cp.file.id, cp.file.sections);
    ASSERT_EQ(made.code(), LX_OK);
    sweep(&made);
    compare({cp.file.id, cp.file.sections}, &random, 20);
  }
}

TEST_F(Validate, WholeAndEveryTruncation) {
  std::mt19937 random(4);
  for (const TinyCodepage& cp : lx::test::tiny_codepages()) {
    SCOPED_TRACE(cp.file.name);
    CodepageObject whole(cp.file.id, cp.file.sections);
    ASSERT_EQ(whole.code(), LX_OK);
    sweep(&whole);
    // The mappings that it was built from are all there.
    compare({cp.file.id, cp.file.sections}, &random);
    for (const auto& c : cp.characters) {
      EXPECT_EQ(LXCpUnicodeToCharW(whole.object(), c.unicode), c.code);
      if (c.bytes.size() > 1) {
        EXPECT_EQ(LXCpMbToUnicodeW(whole.object(), c.code), c.unicode);
      }
    }
    for (size_t section = 0; section < cp.file.sections.size(); ++section) {
      const size_t size = cp.file.sections[section].size();
      for (size_t cut = size; cut-- > 0; cut -= cut > 64 && size - cut > 64 ? 61 : 0) {
        S sections = cp.file.sections;
        sections[section].resize(cut);
        CodepageObject made(cp.file.id, sections);
        EXPECT_TRUE(section != 0 || made.code() == LX_E_CORRUPT) << cut;
        if (made.code() == LX_OK) sweep(&made, 997);
      }
    }
  }
}

/// Bytes changed at random where offsets, counts, masks and nodes stand: refused, or safe and walked alike.
TEST_F(Validate, RandomDamage) {
  std::mt19937 random(6);
  for (const TinyCodepage& cp : lx::test::tiny_codepages()) {
    SCOPED_TRACE(cp.file.name);
    int accepted = 0, refused = 0;
    for (int round = 0; round < 400; ++round) {
      S sections = cp.file.sections;
      const size_t nodes = word(sections, fmt::kUnicodeValues);
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
      sweep(&made, 251);
      compare({cp.file.id, sections}, &random, 500);
      if (HasFatalFailure()) return;
    }
    EXPECT_GT(accepted, 0);
    EXPECT_GT(refused, 0);
  }
}

TEST(ValidateAtLoad, ARefusedFileIsNotLoaded) {
  TinyCodepage bad = lx::test::tiny_shift_jis();
  bad.file.sections[1].pop_back();
  TinyLibrary library({lx::test::tiny_single(), bad});
  int32_t rc = LX_OK;
  EXPECT_EQ(library.object(bad.file.id, &rc), nullptr);
  EXPECT_EQ(rc, LX_E_CORRUPT);
  EXPECT_NE(library.object(lx::test::tiny_single()), nullptr);
  EXPECT_TRUE(library.close());
}

}  // namespace
