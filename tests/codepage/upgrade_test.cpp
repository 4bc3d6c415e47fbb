// Version-1 codepages: what is upgraded is what was, through the door and through loading a file, and damage is
// refused.
#include <gtest/gtest.h>

#include "codepage/lxcodepage.h"
#include "core/lxformat.h"
#include "support/damage.h"
#include "support/tiny_codepages.h"

namespace lx::test {
namespace {

namespace fmt = format::codepage;
using S = std::vector<ByteString>;

constexpr uint16_t kId = 9100;

/// The sections with the range of all bytes in every node and the values at a multiple of four, as an upgrade
/// leaves them. The upgrade sets no shift bytes.
S full_ranges(S sections) {
  sections.resize(format::kMaxSections);
  ByteString& payload = sections[0];
  put_le16(&payload[fmt::kShiftOut], 0);
  if (payload[fmt::kWidth] == 1) return sections;
  const size_t values = le16(&payload[fmt::kUnicodeValues]);
  for (size_t at = 0; at < values; at += fmt::UnicodeNode::kBytes) {
    auto node = fmt::UnicodeNode::read(&sections[1][at]);
    node.lowest = 0x00;
    node.highest = 0xFF;
    node.write(&sections[1][at]);
  }
  sections[1].insert(sections[1].begin() + static_cast<long>(values), values % 4, 0);
  put_le16(&payload[fmt::kUnicodeValues], static_cast<uint16_t>(values + values % 4));
  return sections;
}

/// Every first byte leads to one leaf, so that the range of all bytes leads nowhere else.
S multibyte() {
  CodepageBuilder builder(kId, "OLD", 2);
  builder.ascii().lead(0x82, 0x82, 2).map(0x8200, 0x3000, 0x100);
  return version1_codepage(full_ranges(builder.build().file.sections));
}
TinyCodepage file_of(const S& sections) {
  TinyCodepage made{};
  made.file = {kId, "OLD", sections, 1};
  return made;
}

ByteString take(TinyLibrary* library, void* block, size_t bytes) {
  const auto* data = static_cast<const uint8_t*>(block);
  ByteString copy(data, data + (block != nullptr ? bytes : 0));
  if (block != nullptr) Hooks::release(&library->hooks(), block);
  return copy;
}
/// The new sections 0 and 1, so many bytes of them; empty when there is none.
S upgrade(TinyLibrary* library, const S& old, size_t payload_bytes, size_t trie_bytes) {
  const ByteString payload(old[0]), trie(old[1]);
  void* section = &section;  // must be set
  void* fresh = LXCpV1toV2(payload.data(), static_cast<int32_t>(payload.size()), trie.data(),
                           static_cast<int32_t>(trie.size()), &section);
  return {take(library, fresh, payload_bytes), take(library, section, trie_bytes)};
}

TEST(Upgrade, GivesBackEveryCodepage) {
  TinyLibrary library({tiny_single()});
  std::vector<S> codepages;
  for (const TinyCodepage& cp : tiny_codepages()) codepages.push_back(cp.file.sections);
  codepages.push_back(tiny_shift_jis().file.sections);
  put_le16(&codepages.back()[0][fmt::kPairs], 0);  // an offset of 0 stays 0
  for (const S& sections : codepages) {
    SCOPED_TRACE(&sections - codepages.data());
    if (sections[0][fmt::kWidth] > 1 && sections[1].empty()) continue;  // UTF-8
    const S expected = full_ranges(sections);
    const S made = upgrade(&library, version1_codepage(expected), expected[0].size(), expected[1].size());
    EXPECT_EQ(made[0], expected[0]);
    EXPECT_EQ(made[1], expected[1]);
  }
}

TEST(Upgrade, OfASingleByteCodepageNothingElseIsTaken) {
  TinyLibrary library({tiny_single()});
  const S expected = full_ranges(tiny_single().file.sections);
  for (const uint8_t width : {uint8_t{0}, uint8_t{1}}) {
    S old = version1_codepage(expected);
    old[0][fmt::kWidth] = width;
    change_sections(&old, "0:full_width-4 = 0x1234 0x1234 0x1234 0x1234 0x1234; 0:size = size0+1");
    S made = upgrade(&library, old, fmt::kFixedBytes, 0);
    EXPECT_EQ(made[0][fmt::kWidth], width);
    made[0][fmt::kWidth] = 1;
    EXPECT_EQ(made[0], expected[0]);
    EXPECT_TRUE(made[1].empty());
  }
}

/// Through the door, and as files. Fields stand four bytes further in front.
TEST(Upgrade, Damaged) {
  const char* const damages[][2] = {
      {"no whole fixed part", "0:size = fixed-5"},
      {"no payload to speak of", "0:size = 5"},
      {"values behind the section", "1:size = @old.unicode_values-1"},
      {"an offset that cannot be moved", "0:type_trie-4 = 0xFFFD"},
      {"values that cannot be moved", "1:size = 50000; 0:unicode_values-4 = 45000"},
  };
  for (const auto& [what, changes] : damages) {
    SCOPED_TRACE(what);
    S old = multibyte();
    change_sections(&old, changes);
    TinyLibrary library({file_of(old)});
    EXPECT_EQ(upgrade(&library, old, 0, 0), S(2));
    int32_t rc = -1;
    EXPECT_EQ(LXGetObjFromID(nullptr, LX_CODEPAGE, kId, LX_FIND_AND_LOAD, &rc), nullptr);
    EXPECT_EQ(rc, LX_E_CORRUPT);
    EXPECT_TRUE(library.close());
  }
}

TEST(Upgrade, AtLoad) {
  TinyLibrary library({file_of(multibyte())});
  int32_t rc = -1;
  const LXObject* const object = LXGetObjFromID(nullptr, LX_CODEPAGE, kId, LX_FIND_AND_LOAD, &rc);
  ASSERT_NE(object, nullptr);
  EXPECT_EQ(object->disk.flags, kObjectOwned0 | kObjectOwned0 << 1) << "the payload is its own, and the trie";
  EXPECT_EQ(LXCpUnicodeToCharW(object, 0x2603), '?');
  EXPECT_EQ(LXCpMbToUnicode(object, "\x82\x42"), 0x3042);
  EXPECT_EQ(LXCpUnicodeToCharW(object, 0x3042), 0x8242u);
  EXPECT_TRUE(library.close());
}

}  // namespace
}  // namespace lx::test
