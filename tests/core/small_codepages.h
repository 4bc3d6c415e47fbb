// The smallest files with every table that a multibyte codepage has, for tests that go through a file byte by
// byte: a double-byte codepage and a shift-stateful one. Eight double-byte characters stand for U+3040 to
// U+3047, everything else is US-ASCII.
#pragma once

#include "core/lxformat.h"
#include "support/object_files.h"

namespace lx::test {

/// Appends to a section.
class SectionWriter {
 public:
  explicit SectionWriter(ByteString& bytes) : bytes_(bytes) {}

  size_t size() const { return bytes_.size(); }
  template <class Record>
  void add(const Record& record) {
    bytes_.resize(bytes_.size() + Record::kBytes);
    record.write(&bytes_[bytes_.size() - Record::kBytes]);
  }
  void word(unsigned value) {
    bytes_.insert(bytes_.end(), {static_cast<uint8_t>(value), static_cast<uint8_t>(value >> 8)});
  }
  void dword(uint32_t value) { word(value), word(value >> 16); }
  void node(bool leaf, unsigned mask, unsigned lowest, unsigned highest, unsigned base) {
    add(format::codepage::UnicodeNode{leaf, static_cast<uint8_t>(mask), static_cast<uint8_t>(lowest),
                                      static_cast<uint8_t>(highest), static_cast<uint16_t>(base)});
  }
  void type_node(bool leaf, unsigned mask, unsigned base) {
    add(format::codepage::TypeNode{leaf, static_cast<uint8_t>(mask), static_cast<uint16_t>(base)});
  }

 private:
  ByteString& bytes_;
};

/// Characters have the first bytes `lead` and `lead` + 1, whose last two bits are 1 and 2, and the second bytes
/// 0x40 to 0x43. The type trie has one record for all of them.
inline std::vector<ByteString> small_double_byte_codepage(uint8_t lead = 0x81) {
  namespace cp = lx::format::codepage;
  constexpr unsigned kFirstUnicode = 0x3040, kChars = 8;
  std::vector<ByteString> sections = ascii_codepage();
  ByteString& payload = sections[0];
  payload[cp::kWidth] = 2;
  payload[cp::kLengths + lead] = payload[cp::kLengths + lead + 1u] = 2;
  SectionWriter variable(payload), trie(sections[1]), low(sections[2]);
  const auto offset_here = [&](size_t field, const SectionWriter& section) {
    put_le16(&payload[field], static_cast<uint16_t>(section.size()));
  };
  offset_here(cp::kFullWidth, variable);
  for (unsigned b = 0; b < 256; ++b) variable.dword(b);
  payload[cp::kPairCount] = 1;
  offset_here(cp::kPairs, variable);
  variable.add(cp::WidthPair{lead << 8 | 0x40u, lead << 8 | 0x41u});
  offset_here(cp::kTypeTrie, variable);
  variable.type_node(false, 0x00, 1);
  variable.type_node(true, 0x00, 0);
  offset_here(cp::kTypeRecords, variable);
  variable.add(cp::TypeRecord{0x40000001, 0});

  trie.node(false, 0x03, lead, lead + 1u, 0);
  trie.node(true, 0x03, 0x40, 0x43, 0);
  trie.node(true, 0x03, 0x40, 0x43, 4);
  offset_here(cp::kUnicodeValues, trie);
  for (unsigned i = 0; i < kChars; ++i) trie.word(kFirstUnicode + i);

  // Page 0 keeps its bytes; the page of the double-byte characters gets words behind them.
  sections[2].resize((low.size() + 1) / 2 * 2);
  constexpr uint8_t kFirst = kFirstUnicode & 0xFF;
  const cp::PageEntry page{
      cp::kKindWord, 0x07, kFirst, kFirst + kChars - 1, static_cast<uint16_t>(low.size() / 2), 0};
  page.write(&payload[cp::kPages + (kFirstUnicode >> 8) * page.kBytes]);
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

inline std::vector<ByteString> version1_ascii_codepage() {
  return version1_codepage(ascii_codepage());
}

}  // namespace lx::test
