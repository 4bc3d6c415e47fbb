// The smallest files with every table that a multibyte codepage has, for tests that go through a file byte by
// byte: a double-byte codepage and a shift-stateful one. Eight double-byte characters stand for U+3040 to
// U+3047, everything else is US-ASCII.
#pragma once

#include <cstdint>
#include <vector>

#include "core/lxbytes.h"
#include "core/lxformat.h"
#include "support/object_files.h"

namespace lx::test {

/// Appends little-endian values to a section.
class SectionWriter {
 public:
  explicit SectionWriter(ByteString& bytes) : bytes_(bytes) {}

  size_t size() const { return bytes_.size(); }
  void byte(unsigned value) { bytes_.push_back(static_cast<uint8_t>(value)); }
  void word(unsigned value) {
    byte(value & 0xFF);
    byte(value >> 8);
  }
  void dword(uint32_t value) {
    word(value & 0xFFFF);
    word(value >> 16);
  }
  /// A node of the multibyte-to-Unicode trie, and one of the type trie.
  void node(bool leaf, unsigned mask, unsigned lowest, unsigned highest, unsigned base) {
    for (unsigned value : {unsigned{leaf}, mask, lowest, highest}) byte(value);
    word(base);
  }
  void type_node(bool leaf, unsigned mask, unsigned base) {
    byte(leaf);
    byte(mask);
    word(base);
  }

 private:
  ByteString& bytes_;
};

/// Characters have the first bytes `lead` and `lead` + 1, whose last two bits are 1 and 2, and the second bytes
/// 0x40 to 0x43. The type trie has one record for all of them.
inline std::vector<ByteString> small_double_byte_codepage(uint8_t lead = 0x81) {
  namespace cp = lx::format::codepage;
  constexpr unsigned kFirstUnicode = 0x3040;
  constexpr unsigned kChars = 8;
  std::vector<ByteString> sections = ascii_codepage();
  ByteString& payload = sections[0];
  payload[cp::kWidth] = 2;
  payload[cp::kLengths + lead] = payload[cp::kLengths + lead + 1u] = 2;
  SectionWriter variable(payload);
  const auto offset_here = [&](size_t place) {
    put_le16(payload.data() + place, static_cast<uint16_t>(payload.size()));
  };
  offset_here(cp::kFullWidth);
  for (unsigned b = 0; b < 256; ++b) variable.dword(b);
  put_le16(payload.data() + cp::kPairCount, 1);
  offset_here(cp::kPairs);
  variable.dword(static_cast<uint32_t>(lead << 8 | 0x40));
  variable.dword(static_cast<uint32_t>(lead << 8 | 0x41));
  offset_here(cp::kTypeTrie);
  variable.type_node(false, 0x00, 1);
  variable.type_node(true, 0x00, 0);
  offset_here(cp::kTypeRecords);
  variable.dword(0x40000001);
  variable.dword(0);

  SectionWriter trie(sections[1]);
  trie.node(false, 0x03, lead, lead + 1u, 0);
  trie.node(true, 0x03, 0x40, 0x43, 0);
  trie.node(true, 0x03, 0x40, 0x43, 4);
  put_le16(payload.data() + cp::kUnicodeValues, static_cast<uint16_t>(trie.size()));
  for (unsigned i = 0; i < kChars; ++i) trie.word(kFirstUnicode + i);

  // Page 0 keeps its bytes; the page of the double-byte characters gets words behind them.
  SectionWriter low(sections[2]);
  if (low.size() % 2 != 0) low.byte(0);
  uint8_t* page = payload.data() + cp::kPages + (kFirstUnicode >> 8) * cp::PageEntry::kBytes;
  page[0] = cp::kKindWord;
  page[1] = 0x07;
  page[2] = kFirstUnicode & 0xFF;
  page[3] = (kFirstUnicode & 0xFF) + kChars - 1;
  put_le16(page + 4, static_cast<uint16_t>(low.size() / 2));
  for (unsigned i = 0; i < kChars; ++i) low.word((lead + i / 4) << 8 | (0x40 + i % 4));
  return sections;
}

/// First bytes 0x41 and 0x42 after Shift-Out 0x0E, until Shift-In 0x0F.
inline std::vector<ByteString> small_shift_codepage() {
  namespace cp = lx::format::codepage;
  std::vector<ByteString> sections = small_double_byte_codepage(0x41);
  ByteString& payload = sections[0];
  for (unsigned b = 0; b < 256; ++b) payload[cp::kLengths + b] = 1;
  payload[cp::kShiftOut] = 0x0E;
  payload[cp::kShiftIn] = 0x0F;
  put_le16(payload.data() + cp::kFlags, cp::kFlagAscii | cp::kFlagShift);
  return sections;
}

/// ascii_codepage() in the form of version 1, which lacks the shift bytes and two unused ones.
inline std::vector<ByteString> version1_ascii_codepage() {
  namespace cp = lx::format::codepage;
  std::vector<ByteString> sections = ascii_codepage();
  ByteString& payload = sections[0];
  payload.erase(payload.begin() + cp::kTypes - 2, payload.begin() + cp::kTypes);
  payload.erase(payload.begin() + cp::kShiftOut, payload.begin() + cp::kLengths);
  return sections;
}

}  // namespace lx::test
