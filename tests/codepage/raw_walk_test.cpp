// The flat tables that loading derives against the tables of the file, walked as they are laid down: every
// value and two-byte sequence, and many longer ones, in the tiny codepages and in random ones that use any mask
// and range.
#include <gtest/gtest.h>

#include <random>

#include "core/lxbytes.h"
#include "core/lxformat.h"
#include "support/tiny_codepages.h"

namespace {

using lx::le16;
using lx::put_le16;
using lx::test::ByteString;
using lx::test::CodepageObject;
using lx::test::TinyCodepage;
using lx::test::TinyLibrary;

constexpr uint16_t kUtf8 = 57352;
constexpr uint16_t kRandomId = 9200;

/// The look-ups of a codepage over its sections.
struct RawCodepage {
  uint16_t id;
  std::vector<ByteString> sections;

  const uint8_t* payload() const { return sections[0].data(); }

  uint16_t unicode(const uint8_t* p) const {
    if (id == kUtf8) {
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
    if (id == kUtf8) {
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

  static std::vector<uint8_t> unpacked(uint32_t code) {
    std::vector<uint8_t> bytes;
    if (code > 0xFFFFFF) bytes.push_back(static_cast<uint8_t>(code >> 24));
    if ((code >> 16 & 0xFF) != 0) bytes.push_back(static_cast<uint8_t>(code >> 16));
    if ((code >> 8 & 0xFF) != 0) bytes.push_back(static_cast<uint8_t>(code >> 8));
    bytes.push_back(static_cast<uint8_t>(code));
    return bytes;
  }
};

void compare_from_unicode(const RawCodepage& raw, const LXObject* object) {
  for (uint32_t u = 0; u <= 0xFFFF; ++u) {
    const uint16_t unit = static_cast<uint16_t>(u);
    const uint32_t code = raw.code(unit);
    ASSERT_EQ(LXCpUnicodeToCharW(object, unit), code) << std::hex << u;
    char bytes[5] = {1, 1, 1, 1, 1};
    const auto expected = RawCodepage::unpacked(code);
    ASSERT_EQ(LXCpUnicodeToChar(object, unit, bytes), static_cast<int32_t>(expected.size())) << std::hex << u;
    ASSERT_TRUE(std::equal(expected.begin(), expected.end(), reinterpret_cast<uint8_t*>(bytes)))
        << std::hex << u;
    ASSERT_EQ(bytes[expected.size()], 1) << std::hex << u;
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
  std::vector<uint8_t> unpacked = RawCodepage::unpacked(code);
  unpacked.resize(4);
  ASSERT_EQ(LXCpMbToUnicodeW(object, code), raw.unicode(unpacked.data())) << std::hex << code;
  ASSERT_EQ(LXGetMbCtypeW(object, code) - object->section[0],
            static_cast<ptrdiff_t>(raw.record(unpacked.data())));
}

void compare(const RawCodepage& raw, std::mt19937* random) {
  CodepageObject made(raw.id, raw.sections);
  ASSERT_EQ(made.code(), LX_OK);
  compare_from_unicode(raw, made.object());
  if (raw.payload()[5] == 1) return;
  const unsigned tails = raw.payload()[5] > 2 ? 4 : 1;
  for (unsigned pair = 0; pair <= 0xFFFF; ++pair) {
    for (unsigned i = 0; i < tails; ++i) {
      const auto tail = (*random)() & ((*random)() % 8 == 0 ? 0x00FFu : 0xFFFFu);
      const uint8_t bytes[4] = {static_cast<uint8_t>(pair >> 8), static_cast<uint8_t>(pair),
                                static_cast<uint8_t>(tail), static_cast<uint8_t>(tail >> 8)};
      compare_sequence(raw, made.object(), bytes);
      if (testing::Test::HasFatalFailure()) return;
    }
  }
}

/// Makes codepages that are valid and otherwise as odd as the layout allows.
class RandomCodepage {
 public:
  explicit RandomCodepage(std::mt19937* random) : random_(*random) {}

  RawCodepage make() {
    namespace fmt = lx::format::codepage;
    ByteString payload(fmt::kFixedBytes);
    for (uint8_t& byte : payload) byte = byte_below(256);
    width_ = static_cast<uint8_t>(2 + below(3));
    shift_ = below(4) == 0;
    payload[fmt::kWidth] = width_;
    put_le16(payload.data() + fmt::kPairCount, 0);
    put_le16(payload.data() + fmt::kFlags, shift_ ? fmt::kFlagShift : 0);
    put_le16(payload.data() + fmt::kFullWidth, 0);
    put_le16(payload.data() + fmt::kPairs, 0);
    for (size_t b = 0; b < 256; ++b) {
      lengths_[b] = static_cast<uint8_t>(shift_ ? 1 : 1 + below(width_));
      payload[fmt::kLengths + b] = lengths_[b];
      page(payload.data() + fmt::kPages + b * fmt::kPageBytes);
    }
    const ByteString type_nodes = nodes(fmt::kTypeNodeBytes);
    put_le16(payload.data() + fmt::kTypeTrie, fmt::kFixedBytes);
    put_le16(payload.data() + fmt::kTypeRecords, static_cast<uint16_t>(fmt::kFixedBytes + type_nodes.size()));
    payload.insert(payload.end(), type_nodes.begin(), type_nodes.end());
    const ByteString records = random_bytes(kEntries * fmt::kTypeRecordBytes);
    payload.insert(payload.end(), records.begin(), records.end());
    ByteString trie = nodes(fmt::kNodeBytes);
    put_le16(payload.data() + fmt::kUnicodeValues, static_cast<uint16_t>(trie.size()));
    const ByteString values = random_bytes(2 * kEntries);
    trie.insert(trie.end(), values.begin(), values.end());
    return {kRandomId, {payload, trie, random_bytes(kArrayBytes), random_bytes(kArrayBytes)}};
  }

 private:
  static constexpr unsigned kEntries = 400;  // values, and type records
  static constexpr unsigned kGroup = 64;     // nodes of one height
  static constexpr unsigned kArrayBytes = 1500;

  unsigned below(unsigned limit) { return static_cast<unsigned>(random_() % limit); }
  uint8_t byte_below(unsigned limit) { return static_cast<uint8_t>(below(limit)); }
  ByteString random_bytes(size_t count) {
    ByteString bytes(count);
    for (uint8_t& byte : bytes) byte = below(6) == 0 ? 0 : byte_below(256);
    return bytes;
  }

  void page(uint8_t* entry) {
    entry[0] = byte_below(7);
    entry[1] = below(3) == 0 ? 0xFF : byte_below(256);
    const bool bytes_in_low = entry[0] == 0 || entry[0] == 4;
    const bool bytes_in_high = entry[0] == 2 || entry[0] == 4;
    put_le16(entry + 4, static_cast<uint16_t>(below(kArrayBytes / (bytes_in_low ? 1 : 2) - 255)));
    put_le16(entry + 6, static_cast<uint16_t>(below(kArrayBytes / (bytes_in_high ? 1 : 2) - 255)));
  }

  /// A node whose walks take at most `height` bytes: a leaf, or one that leads to lower groups.
  void node(uint8_t* entry, size_t node_bytes, unsigned height) {
    const unsigned group = below(height);  // 0: a leaf
    entry[0] = group == 0 ? static_cast<uint8_t>(1 + below(255)) : 0;
    entry[1] = byte_below(group == 0 ? 256 : kGroup);
    if (node_bytes == 6) {
      entry[2] = byte_below(256);
      entry[3] = byte_below(256);  // half of the ranges are empty or small
      if (below(2) == 0 && entry[2] > entry[3]) std::swap(entry[2], entry[3]);
    }
    const unsigned base =
        group == 0 ? below(kEntries - entry[1]) : 257 + (group - 1) * kGroup + below(kGroup - entry[1]);
    put_le16(entry + node_bytes - 2, static_cast<uint16_t>(base));
  }

  /// The root, its 256 children, and a group of nodes for each height below the width.
  ByteString nodes(size_t node_bytes) {
    ByteString made((257 + (width_ - 1u) * kGroup) * node_bytes);
    const uint8_t root[6] = {0, 0xFF, 0, 0xFF, 1, 0};
    const uint8_t type_root[4] = {0, 0xFF, 1, 0};
    std::copy_n(node_bytes == 6 ? root : type_root, node_bytes, made.begin());
    for (size_t b = 0; b < 256; ++b) {
      const unsigned walk = shift_ || lengths_[b] < 2 ? width_ : lengths_[b];
      node(made.data() + (1 + b) * node_bytes, node_bytes, walk - 1);
    }
    for (unsigned height = 1; height < width_; ++height)
      for (size_t i = 0; i < kGroup; ++i)
        node(made.data() + (257 + (height - 1) * kGroup + i) * node_bytes, node_bytes, height);
    return made;
  }

  std::mt19937& random_;
  uint8_t width_ = 0;
  bool shift_ = false;
  uint8_t lengths_[256] = {};
};

TEST(RawWalk, TinyCodepages) {
  TinyLibrary library({lx::test::tiny_single()});
  std::mt19937 random(4);
  for (const TinyCodepage& cp : lx::test::tiny_codepages()) {
    SCOPED_TRACE(cp.file.name);
    compare({cp.file.id, cp.file.sections}, &random);
    // The mappings that it was built from are all there.
    CodepageObject made(cp.file.id, cp.file.sections);
    for (const auto& c : cp.characters) {
      EXPECT_EQ(LXCpUnicodeToCharW(made.object(), c.unicode), c.code);
      if (c.bytes.size() > 1) {
        EXPECT_EQ(LXCpMbToUnicodeW(made.object(), c.code), c.unicode);
      }
    }
  }
}

TEST(RawWalk, RandomCodepages) {
  TinyLibrary library({lx::test::tiny_single()});
  std::mt19937 random(5);
  for (int i = 0; i < 12; ++i) {
    SCOPED_TRACE(i);
    compare(RandomCodepage(&random).make(), &random);
    if (HasFatalFailure()) return;
  }
}

}  // namespace
