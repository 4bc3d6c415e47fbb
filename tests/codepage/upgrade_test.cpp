// Version-1 codepages: the upgraded payload and trie byte by byte, through the door and through loading a file,
// with damaged ones and without memory.
#include <gtest/gtest.h>

#include <algorithm>

#include "codepage/lxcodepage.h"
#include "support/tiny_codepages.h"

namespace {

using lx::le16;
using lx::put_le16;
using lx::put_le32;
using lx::test::ByteString;
using lx::test::TinyCodepage;
using lx::test::TinyLibrary;

constexpr size_t kFixed1 = 4372;
constexpr size_t kFixed2 = 4376;
constexpr uint16_t kId = 9100;

void append(ByteString* to, std::initializer_list<unsigned> bytes) {
  for (unsigned byte : bytes) to->push_back(static_cast<uint8_t>(byte));
}

/// A version-1 payload: every table is filled with bytes that tell their places, but what the loader checks.
ByteString fixed_part(uint8_t width) {
  ByteString p(kFixed1);
  for (size_t i = 0; i < p.size(); ++i) p[i] = static_cast<uint8_t>(i * 7 + i / 256);
  p[5] = width;
  p[6] = p[7] = 0;
  for (size_t b = 0; b < 256; ++b) {
    p[8 + b] = width == 2 && b == 0x82 ? 2 : 1;
    put_le16(p.data() + 776 + 2 * b, static_cast<uint16_t>(b < 0x80 ? b : 0xFFFD));
    const uint8_t page[8] = {
        0, 0x7F, static_cast<uint8_t>(b == 0 ? 0 : 2), static_cast<uint8_t>(b == 0 ? 0x7F : 1), 0, 0, 0, 0};
    std::copy(std::begin(page), std::end(page), p.begin() + 2312 + static_cast<long>(8 * b));
  }
  if (width == 2) {
    const uint8_t page[8] = {4, 0xFF, 0x30, 0xFF, 128, 0, 0, 0};
    std::copy(std::begin(page), std::end(page), p.begin() + 2312 + 8 * 0x30);
  }
  put_le16(p.data() + 4360, 1);
  for (size_t place = 4362; place < kFixed1; place += 2) put_le16(p.data() + place, 0);
  return p;
}

/// A trie of version 1: the root leads 0x82 to a leaf of 256 entries, and every other byte to entry 0.
void append_trie(ByteString* to, uint16_t first_entry) {
  append(to, {0, 0xFF, 1, 0});
  for (unsigned b = 0; b < 256; ++b)
    append(to, {1, b == 0x82 ? 0xFFu : 0u, b == 0x82 ? first_entry & 0xFFu : 0u,
                b == 0x82 ? first_entry >> 8u : 0u});
}

struct VersionOne {
  ByteString payload, trie, low, high;
  TinyCodepage file() const {
    TinyCodepage made{};
    made.file = {kId, "OLD", {payload, trie, low, high}, 1};
    return made;
  }
};

VersionOne single_byte() {
  VersionOne made;
  made.payload = fixed_part(1);
  for (unsigned b = 0; b < 0x80; ++b) made.low.push_back(static_cast<uint8_t>(b));
  return made;
}

/// 0x82 and a second byte b: U+3000 + b. With a full-width table, one width pair, types and records.
VersionOne multibyte() {
  VersionOne made = single_byte();
  made.payload = fixed_part(2);
  ByteString& p = made.payload;
  put_le16(p.data() + 6, 1);
  put_le16(p.data() + 4362, static_cast<uint16_t>(p.size()));
  for (unsigned b = 0; b < 256; ++b) append(&p, {b, 0x82, 0, 0});
  put_le16(p.data() + 4364, static_cast<uint16_t>(p.size()));
  append(&p, {0xB1, 0, 0, 0, 0x41, 0x82, 0, 0});
  put_le16(p.data() + 4366, static_cast<uint16_t>(p.size()));
  append_trie(&p, 1);
  put_le16(p.data() + 4368, static_cast<uint16_t>(p.size()));
  for (unsigned i = 0; i <= 256; ++i) append(&p, {i & 0xFF, i >> 8, 0x55, 0xAA, i & 0xFF, i >> 8, 0, 0});

  append_trie(&made.trie, 1);
  put_le16(p.data() + 4370, static_cast<uint16_t>(made.trie.size()));
  append(&made.trie, {0xFD, 0xFF});
  for (unsigned b = 0; b < 256; ++b) append(&made.trie, {b, 0x30});
  for (unsigned b = 0x30; b <= 0xFF; ++b) made.low.resize(128 + b + 1, 0);
  made.high.assign(256, 0x82);
  for (unsigned b = 0x30; b <= 0xFF; ++b) made.low[128 + b] = static_cast<uint8_t>(b);
  return made;
}

/// The version-2 payload that a version-1 payload becomes.
ByteString upgraded_payload(const ByteString& old) {
  const bool single = old[5] < 2;
  ByteString p(kFixed2);
  const auto copy = [&](size_t from, size_t to, size_t bytes) {
    std::copy_n(old.begin() + static_cast<long>(from), bytes, p.begin() + static_cast<long>(to));
  };
  copy(0, 0, 8);
  copy(8, 10, 256 + 256 + 256 + 512);  // lengths to Unicode values: in one piece
  copy(1288, 1292, 1024 + 2048);       // types and pages
  copy(4360, 4364, 2);
  if (single) return p;
  for (size_t i = 0; i < 4; ++i) {
    const uint16_t offset = le16(old.data() + 4362 + 2 * i);
    put_le16(p.data() + 4366 + 2 * i, static_cast<uint16_t>(offset != 0 ? offset + 4 : 0));
  }
  const size_t nodes = le16(old.data() + 4370) / 4;
  put_le16(p.data() + 4374, static_cast<uint16_t>((6 * nodes + 3) / 4 * 4));
  p.insert(p.end(), old.begin() + kFixed1, old.end());
  return p;
}

ByteString upgraded_trie(const ByteString& old, size_t values) {
  ByteString fresh;
  for (size_t at = 0; at < values / 4 * 4; at += 4)
    append(&fresh, {old[at], old[at + 1], 0x00, 0xFF, old[at + 2], old[at + 3]});
  while (fresh.size() % 4 != 0) fresh.push_back(0);
  fresh.insert(fresh.end(), old.begin() + static_cast<long>(values), old.end());
  return fresh;
}

class Upgrade : public testing::Test {
 protected:
  void TearDown() override { EXPECT_TRUE(library_.close()); }

  struct Upgraded {
    bool made, has_trie;
    size_t bytes;  // allocated when it was made
    ByteString payload, trie;
  };
  Upgraded upgrade(const ByteString& payload, const ByteString& trie, size_t payload_bytes, size_t trie_bytes) {
    const std::vector<uint8_t> exact_payload(payload), exact_trie(trie);
    void* section = &section;  // must be set
    void* fresh = LXCpV1toV2(exact_payload.data(), static_cast<int32_t>(payload.size()), exact_trie.data(),
                             static_cast<int32_t>(trie.size()), &section);
    Upgraded result{fresh != nullptr, section != nullptr, library_.hooks().live_bytes(), {}, {}};
    const auto take = [&](void* block, size_t bytes) {
      const auto* data = static_cast<const uint8_t*>(block);
      ByteString copy(data, data + (block != nullptr ? bytes : 0));
      if (block != nullptr) lx::test::Hooks::release(&library_.hooks(), block);
      return copy;
    };
    result.payload = take(fresh, payload_bytes);
    result.trie = take(section, trie_bytes);
    return result;
  }
  TinyLibrary library_{{lx::test::tiny_single()}};
};

TEST_F(Upgrade, SingleByte) {
  for (uint8_t width : {uint8_t{0}, uint8_t{1}}) {
    VersionOne old = single_byte();
    old.payload[5] = width;
    for (size_t place = 4362; place < kFixed1; place += 2) put_le16(old.payload.data() + place, 0x1234);
    const ByteString expected = upgraded_payload(old.payload);
    old.payload.push_back(0x77);  // what follows the fixed part is not taken over
    const size_t before = library_.hooks().live_bytes();
    const Upgraded made = upgrade(old.payload, {}, kFixed2, 0);
    EXPECT_TRUE(made.made && !made.has_trie);
    EXPECT_EQ(made.bytes - before, kFixed2);
    EXPECT_EQ(made.payload, expected);
  }
}

TEST_F(Upgrade, Multibyte) {
  VersionOne old = multibyte();
  for (bool without_pairs : {false, true}) {
    if (without_pairs) put_le16(old.payload.data() + 4364, 0);  // an offset of 0 stays 0
    const size_t values = le16(old.payload.data() + 4370);
    const ByteString payload = upgraded_payload(old.payload);
    const ByteString trie = upgraded_trie(old.trie, values);
    EXPECT_EQ(le16(payload.data() + 4374), 1544) << "257 nodes of 6 bytes, and 2 bytes to the alignment";
    const Upgraded made = upgrade(old.payload, old.trie, payload.size(), trie.size());
    ASSERT_TRUE(made.made && made.has_trie);
    EXPECT_EQ(made.payload, payload);
    EXPECT_EQ(made.trie, trie);
  }
}

struct Damage {
  const char* name;
  void (*apply)(VersionOne*);
};
constexpr Damage kDamages[] = {
    {"no whole fixed part", [](VersionOne* v) { v->payload.resize(kFixed1 - 1); }},
    {"no payload to speak of", [](VersionOne* v) { v->payload.resize(5); }},
    {"values behind the section", [](VersionOne* v) { v->trie.resize(le16(v->payload.data() + 4370) - 1u); }},
    {"an offset that cannot be moved", [](VersionOne* v) { put_le16(v->payload.data() + 4366, 0xFFFD); }},
    {"values that cannot be moved",
     [](VersionOne* v) {
       v->trie.resize(50000);
       put_le16(v->payload.data() + 4370, 45000);
     }},
};

/// Through the door, and as files.
TEST_F(Upgrade, Damaged) {
  const size_t blocks = library_.hooks().live_blocks();
  std::vector<TinyCodepage> files;
  for (const Damage& damage : kDamages) {
    SCOPED_TRACE(damage.name);
    VersionOne old = multibyte();
    damage.apply(&old);
    const Upgraded made = upgrade(old.payload, old.trie, 0, 0);
    EXPECT_FALSE(made.made || made.has_trie);
    EXPECT_EQ(library_.hooks().live_blocks(), blocks);
    files.push_back(old.file());
  }
  EXPECT_TRUE(library_.close());
  for (const TinyCodepage& file : files) {
    TinyLibrary library({file});
    int32_t rc = -1;
    EXPECT_EQ(library.object(kId, &rc), nullptr);
    EXPECT_EQ(rc, LX_E_CORRUPT);
    EXPECT_TRUE(library.close());
  }
}

/// Every allocation of a load failing in turn: code 20, nothing lost, and the next load succeeds.
TEST(UpgradeAtLoad, WithoutMemory) {
  for (const VersionOne& old : {single_byte(), multibyte()}) {
    TinyLibrary library({old.file()});
    const size_t blocks = library.hooks().live_blocks();
    size_t call = 1;
    for (;; ++call) {
      library.hooks().fail_at(call);
      int32_t rc = -1;
      const LXObject* object = library.object(kId, &rc);
      if (!library.hooks().failed()) {
        ASSERT_NE(object, nullptr);
        EXPECT_EQ(LXCpUnicodeToCharW(object, 'A'), 0x41u);
        EXPECT_EQ(LXCpUnicodeToCharW(object, 0xE9), old.payload[0]);
        // The payload is its own, and the trie.
        EXPECT_EQ(object->disk.flags, lx::kObjectOwned0 | (old.trie.empty() ? 0 : lx::kObjectOwned0 << 1));
        if (old.trie.empty()) break;
        EXPECT_EQ(LXCpMbToUnicode(object, "\x82\x42"), 0x3042);
        EXPECT_EQ(LXCpMbToUnicode(object, "\x81\x42"), 0xFFFD);
        EXPECT_EQ(LXCpUnicodeToCharW(object, 0x3042), 0x8242u);
        EXPECT_EQ(lx::le32(LXGetMbCtype(object, "\x82\x42")), 0xAA550043u);
        break;
      }
      EXPECT_EQ(object, nullptr) << call;
      EXPECT_EQ(rc, LX_E_MEMORY) << call;
      EXPECT_EQ(library.hooks().live_blocks(), blocks) << call;
      ASSERT_LT(call, 100u);
    }
    EXPECT_GT(call, 5u);
    EXPECT_TRUE(library.close());
  }
}

}  // namespace
