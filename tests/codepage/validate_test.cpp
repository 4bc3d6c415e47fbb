// What loading refuses, what it must not refuse, and that after it has accepted a codepage no function leaves
// the sections or reads beyond a character, whatever the bytes.
#include <gtest/gtest.h>

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
using lx::test::TinyCodepage;
using lx::test::TinyLibrary;

using Sections = std::vector<ByteString>;

uint8_t* payload(Sections& s) {
  return s[0].data();
}
uint16_t word(Sections& s, size_t offset) {
  return le16(payload(s) + offset);
}
void set_word(Sections& s, size_t offset, size_t value) {
  put_le16(payload(s) + offset, static_cast<uint16_t>(value));
}
uint8_t* page(Sections& s, size_t n) {
  return payload(s) + fmt::kPages + n * fmt::kPageBytes;
}
uint8_t* node(Sections& s, size_t n) {
  return s[1].data() + n * fmt::kNodeBytes;
}
uint8_t* type_node(Sections& s, size_t n) {
  return payload(s) + word(s, fmt::kTypeTrie) + n * fmt::kTypeNodeBytes;
}
/// The trie node that a first byte leads to.
uint8_t* child(Sections& s, uint8_t byte) {
  return node(s, static_cast<size_t>(le16(node(s, 0) + 4)) + (node(s, 0)[1] & byte));
}
void set_page(Sections& s, uint8_t n, std::initializer_list<int> bytes, uint16_t low, uint16_t high) {
  uint8_t* p = page(s, n);
  for (int byte : bytes) *p++ = static_cast<uint8_t>(byte);
  put_le16(p, low);
  put_le16(p + 2, high);
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
        read_record(LXGetMbCtypeW(object, static_cast<LXWChar>(pair * 0x10003u)));
        seen += LXCpMbToUnicodeW(object, static_cast<LXWChar>(pair * 0x10003u));
      }
      seen += LXGetCharType(locale, p, LX_CTYPE1);
      seen += LXGetCharTypeW(locale, static_cast<LXWChar>(pair), LX_CTYPE1);
      seen += static_cast<uint32_t>(LXStringToUnicode(units.data(), 4, locale, p, bytes, 0));
      for (LXShiftState state : {LX_SHIFT_SINGLE, LX_SHIFT_DOUBLE})
        seen += static_cast<uint32_t>(LXStringToUnicodeEx(units.data(), 4, locale, p, state, bytes, 0));
      seen += static_cast<uint32_t>(LXCpStrToUnicode(object, p, bytes, units.data()));
      std::vector<char>& out = block;
      seen += static_cast<uint32_t>(LXCpUnicodeToChar(object, static_cast<LXUChar>(pair), out.data()));
      seen += LXCpUnicodeToCharW(object, static_cast<LXUChar>(pair));
    }
    EXPECT_NE(seen, 0u);
  }

  TinyLibrary library_{{lx::test::tiny_single()}};
};

struct Change {
  const char* name;
  TinyCodepage (*codepage)();
  std::function<void(Sections&)> apply;
};

TEST_F(Validate, Refused) {
  using lx::test::tiny_euc;
  using lx::test::tiny_four;
  using lx::test::tiny_shift;
  using lx::test::tiny_shift_jis;
  using lx::test::tiny_single;
  using lx::test::tiny_utf8;
  const Change changes[] = {
      {"a short payload", tiny_single, [](Sections& s) { s[0].resize(fmt::kFixedBytes - 1); }},
      {"no payload", tiny_single, [](Sections& s) { s[0].clear(); }},
      {"width 0", tiny_single, [](Sections& s) { payload(s)[fmt::kWidth] = 0; }},
      {"width 5", tiny_four, [](Sections& s) { payload(s)[fmt::kWidth] = 5; }},
      {"length 0", tiny_shift_jis, [](Sections& s) { payload(s)[fmt::kLengths + 0x41] = 0; }},
      {"a length above the width", tiny_shift_jis, [](Sections& s) { payload(s)[fmt::kLengths + 0xFF] = 3; }},
      {"length 2 in a single-byte codepage", tiny_single, [](Sections& s) { payload(s)[fmt::kLengths] = 2; }},
      {"UTF-8: the formula reads 3 bytes", tiny_utf8,
       [](Sections& s) { payload(s)[fmt::kLengths + 0xE0] = 2; }},
      {"UTF-8 in a double-byte state: the formula reads 3 bytes", tiny_utf8,
       [](Sections& s) {
         payload(s)[fmt::kWidth] = 2;
         set_word(s, fmt::kFlags, fmt::kFlagShift);
         std::fill_n(payload(s) + fmt::kLengths, 256, uint8_t{1});
         const uint8_t all[] = {1, 0, 0, 0};
         std::copy_n(all, 4, type_node(s, 0));
       }},
      {"a full-width table behind the end", tiny_shift_jis,
       [](Sections& s) { set_word(s, fmt::kFullWidth, s[0].size() - fmt::kFullWidthBytes + 1); }},
      {"a pair table behind the end", tiny_shift_jis,
       [](Sections& s) {
         set_word(s, fmt::kPairCount, 3);
         set_word(s, fmt::kPairs, s[0].size() - 3 * fmt::kPairBytes + 1);
       }},
      {"a pair count behind the end", tiny_single,
       [](Sections& s) { set_word(s, fmt::kPairCount, fmt::kFixedBytes / 8 + 1); }},
      // Pages: the last element by one, of each kind.
      {"kind 0", tiny_single,
       [](Sections& s) {
         set_page(s, 5, {0, 0xFF, 0, 9}, static_cast<uint16_t>(s[2].size() - 9), 0);
       }},
      {"kind 1", tiny_shift_jis,
       [](Sections& s) {
         set_page(s, 5, {1, 0xFF, 0, 9}, static_cast<uint16_t>(s[2].size() / 2 - 9), 0);
       }},
      {"kind 2, low", tiny_euc,
       [](Sections& s) {
         set_page(s, 5, {2, 0xFF, 0, 9}, static_cast<uint16_t>(s[2].size() / 2 - 9), 0);
       }},
      {"kind 2, high", tiny_euc,
       [](Sections& s) {
         set_page(s, 5, {2, 0xFF, 0, 9}, 0, static_cast<uint16_t>(s[3].size() - 9));
       }},
      {"kind 3, high", tiny_four,
       [](Sections& s) {
         set_page(s, 5, {3, 0xFF, 0, 9}, 0, static_cast<uint16_t>(s[3].size() / 2 - 9));
       }},
      {"kind 4, low", tiny_four,
       [](Sections& s) {
         set_page(s, 5, {4, 0xFF, 0, 9}, static_cast<uint16_t>(s[2].size() - 9), 0);
       }},
      {"kind 4, high", tiny_four,
       [](Sections& s) {
         set_page(s, 5, {4, 0xFF, 0, 9}, 0, static_cast<uint16_t>(s[3].size() - 9));
       }},
      {"a mask that leaves the array", tiny_single,
       [](Sections& s) {
         set_page(s, 5, {0, 0xC0, 0xC0, 0xC0}, static_cast<uint16_t>(s[2].size() - 0xC0), 0);
       }},
      {"a high array that is not there", tiny_shift_jis,
       [](Sections& s) {
         set_page(s, 5, {4, 0, 0, 0}, 0, 0);
       }},
      // The trie towards Unicode.
      {"no trie", tiny_shift_jis, [](Sections& s) { s[1].clear(); }},
      {"half a root", tiny_shift_jis, [](Sections& s) { s[1].resize(fmt::kNodeBytes - 1); }},
      {"a child behind the end", tiny_shift_jis,
       [](Sections& s) { put_le16(node(s, 0) + 4, static_cast<uint16_t>(s[1].size() / 6)); }},
      {"the root is its own child", tiny_shift_jis,
       [](Sections& s) {
         node(s, 0)[1] = 0;
         put_le16(node(s, 0) + 4, 0);
       }},
      {"a child is its own child", tiny_four,
       [](Sections& s) {
         uint8_t* at = child(s, 0x90);
         at[1] = 0;
         put_le16(at + 4, static_cast<uint16_t>((at - s[1].data()) / 6));
       }},
      {"two bytes begin a walk of three", tiny_euc,
       [](Sections& s) { std::copy_n(child(s, 0x8F), fmt::kNodeBytes, child(s, 0xA4)); }},
      {"the length is shorter than the walk", tiny_euc,
       [](Sections& s) { payload(s)[fmt::kLengths + 0x8F] = 2; }},
      {"two bytes share the node of three", tiny_euc,
       [](Sections& s) {
         put_le16(node(s, 0) + 4, static_cast<uint16_t>((child(s, 0x8F) - s[1].data()) / 6));
         node(s, 0)[1] = 0;
         node(s, 0)[2] = 0;
       }},
      {"values behind the end, by one", tiny_shift_jis, [](Sections& s) { s[1].resize(s[1].size() - 1); }},
      {"values offset behind the end", tiny_shift_jis,
       [](Sections& s) { set_word(s, fmt::kUnicodeValues, s[1].size() + 1); }},
      // The type trie: every byte is looked up.
      {"type records behind the end, by one", tiny_shift_jis,
       [](Sections& s) { s[0].resize(s[0].size() - 1); }},
      {"type records offset behind the end", tiny_shift_jis,
       [](Sections& s) { set_word(s, fmt::kTypeRecords, s[0].size() + 1); }},
      {"type trie behind the end", tiny_shift_jis,
       [](Sections& s) { set_word(s, fmt::kTypeTrie, s[0].size() - 3); }},
      {"type trie: a loop", tiny_shift_jis, [](Sections& s) { put_le16(type_node(s, 0) + 2, 0); }},
      {"type trie: a walk too long", tiny_four,
       [](Sections& s) { std::copy_n(type_node(s, 1 + 0x90), 4, type_node(s, 1 + 0x81)); }},
      {"type trie in UTF-8", tiny_utf8, [](Sections& s) { put_le16(type_node(s, 0) + 2, 0xFFFF); }},
      {"type trie, double-byte state", tiny_shift,
       [](Sections& s) { std::fill_n(type_node(s, 1), 4, uint8_t{0}); }},
  };
  for (const Change& change : changes) {
    TinyCodepage cp = change.codepage();
    EXPECT_EQ(CodepageObject(cp.file.id, cp.file.sections).code(), LX_OK);
    change.apply(cp.file.sections);
    EXPECT_EQ(CodepageObject(cp.file.id, cp.file.sections).code(), LX_E_CORRUPT) << change.name;
  }
}

TEST_F(Validate, NotRefused) {
  using lx::test::tiny_euc;
  using lx::test::tiny_four;
  using lx::test::tiny_shift_jis;
  using lx::test::tiny_single;
  using lx::test::tiny_utf8;
  const Change changes[] = {
      {"unused kinds", tiny_single,
       [](Sections& s) {
         set_page(s, 5, {5, 0xFF, 0, 0xFF}, 0xFFFF, 0xFFFF);
         set_page(s, 6, {0xFF, 0xFF, 0, 0xFF}, 0xFFFF, 0xFFFF);
       }},
      {"empty pages of any offset", tiny_four,
       [](Sections& s) {
         for (uint8_t kind = 0; kind < 5; ++kind) set_page(s, kind + 9, {kind, 0xFF, 9, 8}, 0xFFFF, 0xFFFF);
       }},
      {"pages that share rows", tiny_shift_jis,
       [](Sections& s) { std::copy_n(page(s, 0x30), 8, page(s, 0x31)); }},
      {"a mask that keeps a page inside", tiny_single,
       [](Sections& s) {
         set_page(s, 5, {0, 0x03, 0, 0xFF}, static_cast<uint16_t>(s[2].size() - 4), 0);
       }},
      {"the last element of each array", tiny_four,
       [](Sections& s) {
         set_page(s, 5, {3, 0x00, 0, 0xFF}, static_cast<uint16_t>(s[2].size() / 2 - 1),
                  static_cast<uint16_t>(s[3].size() / 2 - 1));
         set_page(s, 6, {4, 0x00, 0, 0xFF}, static_cast<uint16_t>(s[2].size() - 1),
                  static_cast<uint16_t>(s[3].size() - 1));
       }},
      {"an empty node of any base", tiny_shift_jis,
       [](Sections& s) {
         const uint8_t empty[] = {0, 0xFF, 9, 8, 0xFF, 0xFF};
         std::copy_n(empty, 6, child(s, 0x82));
       }},
      {"an empty root", tiny_shift_jis, [](Sections& s) { node(s, 0)[2] = 0xFF, node(s, 0)[3] = 0; }},
      {"first bytes that share a child", tiny_shift_jis,
       [](Sections& s) {
         put_le16(node(s, 0) + 4, static_cast<uint16_t>((child(s, 0x82) - s[1].data()) / 6));
         node(s, 0)[1] = 0;
       }},
      {"nodes that share values", tiny_shift_jis,
       [](Sections& s) { std::copy_n(child(s, 0x82), fmt::kNodeBytes, child(s, 0x83)); }},
      {"a root that is a leaf", tiny_shift_jis,
       [](Sections& s) {
         const uint8_t leaf[] = {7, 0x00, 0, 0xFF, 0, 0};
         std::copy_n(leaf, 6, node(s, 0));
       }},
      {"a walk shorter than the character", tiny_euc,
       [](Sections& s) { std::copy_n(child(s, 0xA4), fmt::kNodeBytes, child(s, 0x8F)); }},
      {"a longer walk from a byte that is a character by itself", tiny_euc,
       [](Sections& s) { payload(s)[fmt::kLengths + 0x8F] = 1; }},
      {"bytes behind everything", tiny_shift_jis,
       [](Sections& s) {
         for (ByteString& section : s) section.push_back(0xEE);
       }},
      {"UTF-8: tries and pages are not looked at", tiny_utf8,
       [](Sections& s) {
         s.resize(1);
         for (uint8_t n = 0; n < 5; ++n) set_page(s, n, {n, 0xFF, 0, 0xFF}, 0xFFFF, 0xFFFF);
         set_word(s, fmt::kUnicodeValues, 0xFFFF);
       }},
      {"UTF-8: longer lengths than the formula needs", tiny_utf8,
       [](Sections& s) { payload(s)[fmt::kLengths + 0xC0] = 3; }},
      {"single-byte: no trie is looked at", tiny_single,
       [](Sections& s) {
         for (size_t offset : {fmt::kTypeTrie, fmt::kTypeRecords, fmt::kUnicodeValues})
           set_word(s, offset, 0xFFFF);
         s[1] = {0, 0xFF, 0, 0xFF, 0xFF, 0xFF};
       }},
      {"flags of any value", tiny_shift_jis, [](Sections& s) { set_word(s, fmt::kFlags, 0xFFFD); }},
  };
  for (const Change& change : changes) {
    SCOPED_TRACE(change.name);
    TinyCodepage cp = change.codepage();
    change.apply(cp.file.sections);
    CodepageObject made(cp.file.id, cp.file.sections);
    ASSERT_EQ(made.code(), LX_OK);
    sweep(&made);
  }
}

TEST_F(Validate, WholeCodepagesAreSafe) {
  for (const TinyCodepage& cp : lx::test::tiny_codepages()) {
    CodepageObject made(cp.file.id, cp.file.sections);
    ASSERT_EQ(made.code(), LX_OK) << cp.file.name;
    sweep(&made);
  }
}

TEST_F(Validate, EveryTruncation) {
  for (const TinyCodepage& cp : lx::test::tiny_codepages()) {
    SCOPED_TRACE(cp.file.name);
    for (size_t section = 0; section < cp.file.sections.size(); ++section) {
      const size_t size = cp.file.sections[section].size();
      for (size_t cut = size; cut-- > 0; cut -= cut > 64 && size - cut > 64 ? 61 : 0) {
        Sections sections = cp.file.sections;
        sections[section].resize(cut);
        CodepageObject made(cp.file.id, sections);
        EXPECT_TRUE(section != 0 || made.code() == LX_E_CORRUPT) << cut;
        if (made.code() == LX_OK) sweep(&made, 997);
      }
    }
  }
}

/// Bytes changed at random where offsets, counts, masks and nodes stand: refused, or safe.
TEST_F(Validate, RandomDamage) {
  std::mt19937 random(6);
  for (const TinyCodepage& cp : lx::test::tiny_codepages()) {
    SCOPED_TRACE(cp.file.name);
    int accepted = 0, refused = 0;
    for (int round = 0; round < 400; ++round) {
      Sections sections = cp.file.sections;
      const size_t nodes = word(sections, fmt::kUnicodeValues);
      for (size_t n = 1 + random() % 3; n > 0; --n) {
        ByteString& p = sections[0];
        const uint8_t value = static_cast<uint8_t>(random() % 3 == 0 ? random() % 4 : random());
        switch (random() % 6) {
          case 0:
            p[fmt::kWidth + random() % 5] = value;
            break;
          case 1:
            p[fmt::kLengths + random() % 256] = value;
            break;
          case 2:
            p[fmt::kPages + random() % 2048] = value;
            break;
          case 3:
            p[fmt::kFlags + random() % 12] = value;
            break;
          case 4:
            p[fmt::kFixedBytes - 1 + (p.size() > 5500 ? random() % (p.size() - fmt::kFixedBytes) : 0)] = value;
            break;
          default:
            if (nodes != 0) sections[1][random() % nodes] = value;
        }
      }
      CodepageObject made(cp.file.id, sections);
      ASSERT_TRUE(made.code() == LX_OK || made.code() == LX_E_CORRUPT);
      ++(made.code() == LX_OK ? accepted : refused);
      if (made.code() == LX_OK) sweep(&made, 251);
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
