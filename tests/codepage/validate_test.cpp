// What loading refuses, what it must not refuse, and that after it has accepted a codepage no function leaves
// the sections or reads beyond a character, whatever the bytes, and that what loading derives says what the
// tables of the file say.
#include <gtest/gtest.h>

#include <functional>
#include <random>

#include "codepage/lxcodepage.h"
#include "core/lxformat.h"
#include "platform/ras1.h"
#include "platform/recording_ras1.h"
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
/// Changes a record of a section.
template <class Record>
void edit(ByteString& section, size_t at, void (*change)(Record&)) {
  auto record = Record::read(&section[at]);
  change(record);
  record.write(&section[at]);
}
template <class Record>
void copy_record(ByteString& section, size_t from, size_t to) {
  Record::read(&section[from]).write(&section[to]);
}

void set_page(S& s, size_t n, const fmt::PageEntry& page) {
  page.write(payload(s) + fmt::kPages + n * page.kBytes);
}
/// A page whose first element stands in front of the end of an array by this many elements.
fmt::PageEntry at_end(const S& s, uint8_t kind, fmt::PageEntry page, size_t low, size_t high) {
  page.kind = kind;
  if (low != 0) page.low = static_cast<uint16_t>(s[2].size() / page.low_bytes() - low);
  if (high != 0) page.high = static_cast<uint16_t>(s[3].size() / page.high_bytes() - high);
  return page;
}
/// Ten elements, of which the last one lies behind one array.
void set_last(S& s, uint8_t kind, bool low) {
  set_page(s, 5, at_end(s, kind, {0, 0xFF, 0, 9, 0, 0}, low ? 9 : 0, low ? 0 : 9));
}
/// Gives every value of a page the code in one more element of the low array: a byte, or a word.
void set_code(S& s, uint8_t n, uint8_t kind, uint16_t code) {
  s[2].resize((s[2].size() + 1) / 2 * 2);
  s[2].insert(s[2].end(), {static_cast<uint8_t>(code), static_cast<uint8_t>(code >> 8)});
  set_page(s, n, at_end(s, kind, {0, 0, 0, 0xFF, 0, 0}, kind == fmt::kKindByte ? 2 : 1, 0));
}

/// Where the node that a first byte leads to stands in its section.
size_t child(S& s, uint8_t byte) {
  return fmt::UnicodeNode::read(s[1].data()).next(byte) * fmt::UnicodeNode::kBytes;
}
size_t type_child(S& s, uint8_t byte) {
  const size_t nodes = word(s, fmt::kTypeTrie);
  return nodes + fmt::TypeNode::read(payload(s) + nodes).next(byte) * fmt::TypeNode::kBytes;
}
/// Makes the root lead every byte to the node at this place.
void set_only_child(S& s, size_t at) {
  auto root = fmt::UnicodeNode::read(s[1].data());
  root.mask = 0;
  root.base = static_cast<uint16_t>(at / root.kBytes);
  root.write(s[1].data());
}

/// The Unicode value of a sequence by the trie as it is laid down.
uint16_t walked(S& s, const uint8_t* p) {
  for (size_t index = 0;; ++p) {
    const auto node = fmt::UnicodeNode::read(&s[1][index * fmt::UnicodeNode::kBytes]);
    if (*p < node.lowest || *p > node.highest) return 0xFFFD;
    index = node.next(*p);
    if (node.leaf != 0) return le16(&s[1][word(s, fmt::kUnicodeValues) + 2 * index]);
  }
}

/// What loading derived says what the tables say: every value, and many sequences.
void compare(S& s, const LXObject* object, std::mt19937* random, unsigned step) {
  for (uint32_t u = 0; u <= 0xFFFF; ++u) {
    uint8_t bytes[lx::kMaxCharBytes];
    const int32_t count = LXCpUnicodeToChar(object, static_cast<uint16_t>(u), reinterpret_cast<char*>(bytes));
    const uint32_t code = lx::without_zero_bytes(LXCpUnicodeToCharW(object, static_cast<uint16_t>(u)));
    ASSERT_EQ(lx::pack(bytes, static_cast<size_t>(count)), code) << std::hex << u;
  }
  if (payload(s)[fmt::kWidth] == 1 || object->disk.id == fmt::kUtf8Id) return;
  for (uint32_t pair = 0; pair <= 0xFFFF; pair += 1 + static_cast<uint32_t>((*random)() % step)) {
    const uint32_t tail = static_cast<uint32_t>((*random)()) & ((*random)() % 8 == 0 ? 0x00FFu : 0xFFFFu);
    uint8_t bytes[lx::kMaxCharBytes];
    lx::store_code(bytes, pair << 16 | tail, sizeof(bytes));
    ASSERT_EQ(LXCpMbToUnicode(object, reinterpret_cast<const char*>(bytes)), walked(s, bytes))
        << std::hex << pair;
  }
}

class Validate : public testing::Test {
 protected:
  void TearDown() override { EXPECT_TRUE(library_.close()); }

  /// Calls everything that looks up characters with every pair of bytes, at the very end of a block.
  static void sweep(CodepageObject* made, unsigned step = 1) {
    const LXObject* object = made->object();
    LXLocale* locale = made->locale();
    const lx::Codepage& cp = lx::codepage_of(*object);
    const uint8_t width = object->section[0][fmt::kWidth];
    std::vector<char> block(4);
    std::vector<LXUChar> units(4);
    uint32_t seen = 0;
    for (unsigned pair = 0; pair <= 0xFFFF; pair += step) {
      const uint8_t first = static_cast<uint8_t>(pair >> 8);
      const size_t walk = cp.length(first) < 2 ? width : cp.length(first);
      char* p = block.data() + 4 - walk;
      for (size_t i = 0; i < walk; ++i) p[i] = static_cast<char>(i == 0 ? first : pair * (2 * i - 1));
      const int32_t bytes = static_cast<int32_t>(walk);
      if (width > 1) {
        const auto record = fmt::TypeRecord::read(LXGetMbCtype(object, p));
        seen += LXCpMbToUnicode(object, p) + record.type + record.case_delta;
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
      {"UTF-8: 3 bytes are read", tiny_utf8,
       [](S& s) {
         payload(s)[fmt::kLengths + 0xF5] = 2;
         copy_record<fmt::TypeNode>(s[0], type_child(s, 0xC3), type_child(s, 0xF5));
       }},
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
      {"kind 0", tiny_single, [](S& s) { set_last(s, 0, true); }},
      {"kind 1", tiny_shift_jis, [](S& s) { set_last(s, 1, true); }},
      {"kind 2, low", tiny_euc, [](S& s) { set_last(s, 2, true); }},
      {"kind 2, high", tiny_euc, [](S& s) { set_last(s, 2, false); }},
      {"kind 3, low", tiny_four, [](S& s) { set_last(s, 3, true); }},
      {"kind 3, high", tiny_four, [](S& s) { set_last(s, 3, false); }},
      {"kind 4, low", tiny_four, [](S& s) { set_last(s, 4, true); }},
      {"kind 4, high", tiny_four, [](S& s) { set_last(s, 4, false); }},
      {"a mask that leaves the array", tiny_single,
       [](S& s) {
         set_page(s, 5, at_end(s, 0, {0, 0xC0, 0xC0, 0xC0, 0, 0}, 0xC0, 0));
       }},
      {"a high array that is not there", tiny_shift_jis,
       [](S& s) {
         set_page(s, 5, {4, 0, 0, 0, 0, 0});
       }},
      // The trie towards Unicode.
      {"no trie", tiny_shift_jis, [](S& s) { s[1].clear(); }},
      {"half a root", tiny_shift_jis, [](S& s) { s[1].resize(fmt::UnicodeNode::kBytes - 1); }},
      {"a child behind the end", tiny_shift_jis, [](S& s) { set_only_child(s, s[1].size()); }},
      {"the root is its own child", tiny_shift_jis, [](S& s) { set_only_child(s, 0); }},
      {"a child is its own child", tiny_four,
       [](S& s) {
         const size_t at = child(s, 0x90);
         fmt::UnicodeNode{0, 0, 0, 0xFF, static_cast<uint16_t>(at / fmt::UnicodeNode::kBytes)}.write(&s[1][at]);
       }},
      {"a walk of three from two", tiny_euc,
       [](S& s) { copy_record<fmt::UnicodeNode>(s[1], child(s, 0x8F), child(s, 0xA4)); }},
      {"a child that is found sound for a longer character", tiny_euc,
       [](S& s) {
         set_only_child(s, child(s, 0x8F));
         edit<fmt::UnicodeNode>(s[1], 0, [](auto& node) { node.lowest = 0x8F; });
       }},
      {"a length below the walk", tiny_euc, [](S& s) { payload(s)[fmt::kLengths + 0x8F] = 2; }},
      {"values behind the end, by one", tiny_shift_jis, [](S& s) { s[1].resize(s[1].size() - 1); }},
      {"values behind the end", tiny_shift_jis,
       [](S& s) { set_word(s, fmt::kUnicodeValues, s[1].size() + 1); }},
      // The type trie: every byte is looked up.
      {"type records behind the end", tiny_shift_jis,
       [](S& s) { set_word(s, fmt::kTypeRecords, s[0].size() + 1); }},
      {"type records behind the end, by one", tiny_shift_jis, [](S& s) { s[0].resize(s[0].size() - 1); }},
      {"type trie behind the end", tiny_shift_jis, [](S& s) { set_word(s, fmt::kTypeTrie, s[0].size() - 3); }},
      {"type trie: a loop", tiny_shift_jis,
       [](S& s) { edit<fmt::TypeNode>(s[0], word(s, fmt::kTypeTrie), [](auto& node) { node.base = 0; }); }},
      {"type trie: too long", tiny_four,
       [](S& s) { copy_record<fmt::TypeNode>(s[0], type_child(s, 0x90), type_child(s, 0x81)); }},
      {"type trie in UTF-8", tiny_utf8,
       [](S& s) {
         edit<fmt::TypeNode>(s[0], word(s, fmt::kTypeTrie), [](auto& node) { node.base = 0xFFFF; });
       }},
      {"type trie, double-byte", tiny_shift, [](S& s) { fmt::TypeNode().write(&s[0][type_child(s, 0x42)]); }},
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
         set_page(s, 5, {5, 0xFF, 0, 0xFF, 0xFFFF, 0xFFFF});
         set_page(s, 6, {0xFF, 0xFF, 0, 0xFF, 0xFFFF, 0xFFFF});
       }},
      {"empty pages of any offset", tiny_four,
       [](S& s) {
         for (uint8_t kind = 0; kind < 5; ++kind) set_page(s, kind + 9u, {kind, 0xFF, 9, 8, 0xFFFF, 0xFFFF});
       }},
      {"codes with zero bytes, which are not stored", tiny_four,
       [](S& s) {
         s[3].resize((s[3].size() + 1) / 2 * 2 + 2);
         set_code(s, 5, 1, 0x8140);
         set_page(s, 5, at_end(s, 3, {0, 0, 0, 0xFF, 0, 0}, 1, 1));
       }},
      {"pages that share rows", tiny_shift_jis,
       [](S& s) {
         copy_record<fmt::PageEntry>(s[0], fmt::kPages + 0x30 * fmt::PageEntry::kBytes,
                                     fmt::kPages + 0x31 * fmt::PageEntry::kBytes);
       }},
      {"a mask that keeps a page inside", tiny_single,
       [](S& s) {
         set_page(s, 5, at_end(s, 0, {0, 0x03, 0, 0xFF, 0, 0}, 4, 0));
       }},
      {"the last element of each array", tiny_four,
       [](S& s) {
         s[2].push_back(0x40);
         s[3].push_back(0x81);
         set_page(s, 6, at_end(s, 4, {0, 0x00, 0, 0xFF, 0, 0}, 1, 1));
       }},
      {"an empty node of any base", tiny_shift_jis,
       [](S& s) {
         fmt::UnicodeNode{0, 0xFF, 9, 8, 0xFFFF}.write(&s[1][child(s, 0x82)]);
       }},
      {"an empty root", tiny_shift_jis,
       [](S& s) { edit<fmt::UnicodeNode>(s[1], 0, [](auto& node) { node.lowest = 0xFF, node.highest = 0; }); }},
      {"first bytes that share a child", tiny_shift_jis, [](S& s) { set_only_child(s, child(s, 0x82)); }},
      {"nodes that share values", tiny_shift_jis,
       [](S& s) { copy_record<fmt::UnicodeNode>(s[1], child(s, 0x82), child(s, 0x83)); }},
      {"a root that is a leaf", tiny_shift_jis,
       [](S& s) {
         fmt::UnicodeNode{7, 0x00, 0, 0xFF, 0}.write(s[1].data());
       }},
      {"a lead byte as a code", tiny_shift_jis, [](S& s) { set_code(s, 5, fmt::kKindByte, 0x81); }},
      {"two bytes without a lead byte", tiny_shift_jis, [](S& s) { set_code(s, 5, fmt::kKindWord, 0x4141); }},
      {"a shift byte as a code", tiny_shift, [](S& s) { set_code(s, 5, fmt::kKindByte, 0x0E); }},
      {"a shift byte in front", tiny_shift, [](S& s) { set_code(s, 5, fmt::kKindWord, 0x0F41); }},
      {"one byte to shift out and in", tiny_shift, [](S& s) { payload(s)[fmt::kShiftIn] = 0x0E; }},
      {"a longer walk from a single byte", tiny_euc, [](S& s) { payload(s)[fmt::kLengths + 0x8F] = 1; }},
      {"a short walk", tiny_euc,
       [](S& s) { copy_record<fmt::UnicodeNode>(s[1], child(s, 0xA4), child(s, 0x8F)); }},
      {"bytes behind everything", tiny_shift_jis,
       [](S& s) {
         for (ByteString& section : s) section.push_back(0xEE);
       }},
      {"UTF-8: tries and pages are not looked at", tiny_utf8,
       [](S& s) {
         s.resize(1);
         for (uint8_t n = 0; n < 5; ++n) set_page(s, n, {n, 0xFF, 0, 0xFF, 0xFFFF, 0xFFFF});
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
    cp.file.sections.resize(4);
    compare(cp.file.sections, made.object(), &random, 20);
  }
}

TEST_F(Validate, WholeAndEveryTruncation) {
  std::mt19937 random(4);
  for (const TinyCodepage& cp : lx::test::tiny_codepages()) {
    SCOPED_TRACE(cp.file.name);
    CodepageObject whole(cp.file.id, cp.file.sections);
    ASSERT_EQ(whole.code(), LX_OK);
    sweep(&whole);
    S sections = cp.file.sections;
    compare(sections, whole.object(), &random, 1);
    // The mappings that it was built from are all there.
    for (const auto& c : cp.characters) {
      EXPECT_EQ(LXCpUnicodeToCharW(whole.object(), c.unicode), c.code);
      EXPECT_EQ(lx::code_to_unicode(lx::codepage_of(*whole.object()), c.code), c.unicode);
    }
    for (size_t section = 0; section < cp.file.sections.size(); ++section) {
      const size_t size = cp.file.sections[section].size();
      for (size_t cut = size; cut-- > 0; cut -= cut > 64 && size - cut > 64 ? 61 : 0) {
        sections = cp.file.sections;
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
      compare(sections, made.object(), &random, 500);
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
  lx::test::RecordingTrace::set_level(RAS1_LEVEL_ERRORS);
  EXPECT_EQ(library.object(bad.file.id, &rc), nullptr);
  EXPECT_EQ(rc, LX_E_CORRUPT);
  lx::test::RecordingTrace::set_level(0);
  const auto trace = lx::test::RecordingTrace::take();
  ASSERT_EQ(trace.size(), 1u);
  EXPECT_EQ(
      trace[0].text.rfind("Object TINY-SJIS is refused: the Unicode trie leads to a value outside its section "
                          "(section 1, offset ",
                          0),
      0u)
      << trace[0].text;
  EXPECT_NE(library.object(lx::test::tiny_single()), nullptr);
  EXPECT_TRUE(library.close());
}

}  // namespace
