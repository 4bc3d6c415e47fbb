// Every codepage of data/, and small ones that reach the corners: what an object's tables say against what its
// source says, by look-ups of the test's own.
#include <gtest/gtest.h>

#include <bitset>
#include <fstream>
#include <functional>
#include <map>
#include <set>
#include <sstream>

#include "codepage/lxunicode.h"
#include "codepage_tables.h"
#include "compile.h"
#include "ucm.h"

namespace lexicor_data {
namespace {

constexpr uint16_t kUtf8Id = 57352;

/// The mappings that an object should hold, in both directions.
struct Expected {
  CodepageSource source;
  std::map<uint32_t, uint32_t> to, from;

  Expected(const CodepageSource& table, const std::vector<LeftOut>& left_out) : source(table) {
    std::set<std::tuple<uint32_t, uint32_t, int>> gone;
    for (const LeftOut& entry : left_out) {
      gone.insert({entry.mapping.unicode, entry.mapping.code, entry.mapping.precision});
    }
    for (const Mapping& m : table.mappings) {
      if (gone.count({m.unicode, m.code, m.precision}) != 0) continue;
      if (m.precision != 1 && m.unicode != 0xFFFD) to[m.code] = m.unicode;
      if (m.precision != 3) from[m.unicode] = m.code;
    }
    for (uint32_t u = 0; table.utf8 && u < 0x10000; ++u) add_utf8(u);
  }

  uint32_t value(uint32_t code) const { return to.count(code) ? to.at(code) : 0xFFFD; }
  /// The code that maps to the value and back, when it is longer or not longer than a byte; else 0xFFFFFFFF.
  uint32_t round_trip(uint32_t u, bool longer) const {
    const auto found = from.find(u);
    if (found == from.end() || (value(found->second) != u && !source.utf8)) return 0xFFFFFFFF;
    return (found->second > 0xFF) == longer ? found->second : 0xFFFFFFFF;
  }
  uint32_t full_width(uint32_t u) const {
    const uint32_t full = lx::unicode_half_to_full(static_cast<uint16_t>(u));
    const uint32_t code = u == 0xFFFD || full == u ? 0xFFFFFFFF : round_trip(full, true);
    return code == 0xFFFFFFFF ? 0 : code;
  }
  bool shift() const { return source.kind == CodepageClass::kShiftStateful; }
  size_t bytes_after(uint8_t first) const { return shift() ? source.width : source.leads[first]; }

 private:
  void add_utf8(uint32_t u) {
    const uint32_t code = u < 0x80 ? u
                          : u < 0x800
                              ? (0xC0 | u >> 6) << 8 | 0x80 | (u & 0x3F)
                              : (0xE0 | u >> 12) << 16 | (0x80 | (u >> 6 & 0x3F)) << 8 | 0x80 | (u & 0x3F);
    from[u] = code;
    to[code] = u;
  }
};

void check_header_and_single_bytes(const Expected& expected, const CodepageTables& tables) {
  const CodepageSource& source = expected.source;
  EXPECT_EQ(tables.u8(0), source.substitution);
  for (size_t i = 0; i < 4; ++i) EXPECT_EQ(tables.u8(1 + i), source.line_ends[i]);
  EXPECT_EQ(tables.u8(5), source.width);
  EXPECT_EQ(tables.u8(8), expected.shift() ? 0x0E : 0);
  EXPECT_EQ(tables.u8(9), expected.shift() ? 0x0F : 0);
  EXPECT_EQ(tables.u16(4364), (source.ascii ? 1U : 0U) | (expected.shift() ? 2U : 0U));
  for (uint32_t byte = 0; byte < 256; ++byte) {
    const auto value = static_cast<uint16_t>(expected.value(byte));
    const auto other = [&](uint16_t u) {
      const uint32_t code = value == 0xFFFD || u == value ? 0xFFFFFFFF : expected.round_trip(u, false);
      return code == 0xFFFFFFFF ? byte : code;
    };
    ASSERT_EQ(tables.u8(10 + byte), source.leads[byte]) << byte;
    ASSERT_EQ(tables.single(static_cast<uint8_t>(byte)), value) << byte;
    ASSERT_EQ(tables.u8(266 + byte), other(lx::unicode_upper(value))) << byte;
    ASSERT_EQ(tables.u8(522 + byte), other(lx::unicode_lower(value))) << byte;
    ASSERT_EQ(tables.u32(1292 + 4 * byte), value == 0xFFFD ? 0 : lx::unicode_type(value)) << byte;
  }
}

void check_from_unicode(const Expected& expected, const CodepageTables& tables) {
  if (expected.source.utf8) {
    for (size_t page = 2316; page < 4364; page += 8) ASSERT_EQ(tables.u32(page), 0x01020000U);
    return;
  }
  for (uint32_t u = 0; u < 0x10000; ++u) {
    const auto found = expected.from.find(u);
    ASSERT_EQ(tables.from_unicode(u),
              found == expected.from.end() ? expected.source.substitution : found->second)
        << std::hex << u;
  }
}

void check_width_tables(const Expected& expected, const CodepageTables& tables) {
  for (uint32_t byte = 0; byte < 256; ++byte) {
    ASSERT_EQ(tables.u32(tables.u16(4366) + 4 * byte), expected.full_width(expected.value(byte))) << byte;
  }
  std::vector<std::pair<uint32_t, uint32_t>> pairs, stored;
  for (const auto& [code, u] : expected.to) {
    if (expected.round_trip(u, true) != code) continue;
    if (expected.full_width(u) != 0) pairs.push_back({code, expected.full_width(u)});
  }
  for (uint32_t i = 0; i < tables.u16(6); ++i) {
    stored.push_back({tables.u32(tables.u16(4368) + 8 * i), tables.u32(tables.u16(4368) + 8 * i + 4)});
  }
  EXPECT_EQ(stored, pairs);
}

/// The case delta that a longer character should have.
uint32_t case_delta(const Expected& expected, uint32_t code, uint16_t u) {
  const uint32_t type = lx::unicode_type(u);
  const uint16_t other = (type & 2) != 0 ? lx::unicode_lower(u) : (type & 4) != 0 ? lx::unicode_upper(u) : u;
  const uint32_t other_code = other == u ? 0xFFFFFFFF : expected.round_trip(other, true);
  return other_code == 0xFFFFFFFF ? 0 : other_code - code;
}

/// All longer characters: the value, the type and the case of those that exist; 0xFFFD and type 0 for the rest.
void check_longer_characters(const Expected& expected, const CodepageTables& tables,
                             const CompiledObject& object) {
  std::bitset<256> trails;
  size_t retyped = 0;
  for (const auto& [code, u] : expected.to) {
    if (code <= 0xFF) continue;
    const size_t count = code > 0xFFFFFF ? 4 : code > 0xFFFF ? 3 : 2;
    const auto bytes = bytes_of_code(code, count);
    for (size_t i = 1; i < count; ++i) trails.set(bytes[i]);
    ASSERT_EQ(expected.source.utf8 ? u : tables.to_unicode(bytes.data()), u) << std::hex << code;
    const auto record = tables.type_of(bytes.data());
    if (object.type_rows == TypeRows::kLoose && record.type != 0x400 &&
        lx::unicode_type(static_cast<uint16_t>(u)) == 0x400) {
      ++retyped;
      continue;
    }
    ASSERT_EQ(record.type, lx::unicode_type(static_cast<uint16_t>(u))) << std::hex << code;
    ASSERT_EQ(record.delta, case_delta(expected, code, static_cast<uint16_t>(u))) << std::hex << code;
  }
  EXPECT_EQ(retyped, object.retyped_chars);

  // The rest: all two-byte sequences, and longer ones with every third byte, over any bytes at all.
  for (uint32_t prefix = 0; prefix < 0x10000; ++prefix) {
    const size_t count = expected.bytes_after(static_cast<uint8_t>(prefix >> 8));
    const uint32_t last = count > 2 ? 256 : 1;
    for (uint32_t third = 0; third < last; third += 3) {
      const uint8_t bytes[4] = {static_cast<uint8_t>(prefix >> 8), static_cast<uint8_t>(prefix),
                                static_cast<uint8_t>(third), 0xA1};
      const auto record = tables.type_of(bytes);
      ASSERT_LE(record.bytes, std::max<size_t>(count, 2)) << std::hex << prefix;
      if (count == 1 || expected.source.utf8) continue;
      uint32_t code = 0;
      bool all_trails = true;
      for (size_t i = 0; i < count; ++i) {
        code = code << 8 | bytes[i];
        all_trails = all_trails && (i == 0 || trails[bytes[i]]);
      }
      if (expected.to.count(code) != 0) continue;
      ASSERT_EQ(tables.to_unicode(bytes), 0xFFFDU) << std::hex << code;
      const bool exact = object.type_rows == TypeRows::kExact;
      const bool zero = exact || (object.type_rows == TypeRows::kShared && all_trails);
      ASSERT_TRUE(!zero || record.type == 0) << std::hex << code;
    }
  }
}

void check_object(const CodepageSource& source, const CompiledObject& object) {
  const CodepageTables tables(object.bytes);
  const Expected expected(source, object.left_out);
  check_header_and_single_bytes(expected, tables);
  check_from_unicode(expected, tables);
  if (source.width == 1) {
    for (size_t offset = 4366; offset < 4376; offset += 2) EXPECT_EQ(tables.u16(offset), 0U);
    EXPECT_EQ(tables.section(0).size(), 4376U);
    EXPECT_TRUE(tables.section(1).empty() && tables.section(3).empty());
    return;
  }
  for (size_t offset = 4366; offset < 4374; offset += 2) EXPECT_EQ(tables.u16(offset) % 4, 0U);
  check_width_tables(expected, tables);
  check_longer_characters(expected, tables, object);
}

Control control_of(const ObjectName& name) {
  Control control;
  control.objects.push_back(name);
  return control;
}

CompiledObject compile(const CodepageSource& source, uint16_t id = 1) {
  std::stringstream text;
  write_ucm(text, source);
  const ObjectName name{ObjectType::kCodepage, id, source.name, 0};
  return compile_object(text, "test.ucm", name, control_of(name));
}

/// The object that the dump of an object compiles to.
ByteVector compile_dump(const CompiledObject& object, const ObjectName& name) {
  const Control control = control_of(name);
  std::stringstream dump(dump_object(read_object(object.bytes, "object"), name, &control, "object"));
  const CompiledObject again = compile_object(dump, "dump", name, control);
  EXPECT_TRUE(again.left_out.empty());
  return again.bytes;
}

CodepageSource make_source(CodepageClass kind, uint8_t width) {
  CodepageSource source;
  source.name = "Test";
  source.kind = kind;
  source.width = width;
  for (uint32_t byte = 0x20; byte < 0x7F; ++byte) source.mappings.push_back({byte, byte, 1, 0});
  return source;
}

void add(CodepageSource& source, uint32_t unicode, uint32_t code, uint8_t precision = 0) {
  const uint8_t bytes = code > 0xFFFFFF ? 4 : code > 0xFFFF ? 3 : code > 0xFF ? 2 : 1;
  source.mappings.push_back({unicode, code, bytes, precision});
}

TEST(CodepageObject, EveryShippedCodepageSaysWhatItsSourceSays) {
  const std::string data = LEXICOR_DATA_DIR;
  const Control control = read_source_control(data);
  size_t checked = 0;
  for (const ObjectName& name : control.objects) {
    if (name.type != ObjectType::kCodepage) continue;
    SCOPED_TRACE(name.name);
    const std::string path = data + '/' + source_file_name(name);
    std::ifstream table(path, std::ios::binary), text(path, std::ios::binary);
    const CompiledObject object = compile_object(text, path, name, control);
    check_object(read_ucm(table, path), object);
    EXPECT_EQ(compile_dump(object, name), object.bytes);
    ++checked;
  }
  EXPECT_GT(checked, 100U);
}

// Page kinds 0 to 4, four-byte characters, and rows that end in the corners of the byte range.
TEST(CodepageObject, EveryPageKind) {
  CodepageSource euc = make_source(CodepageClass::kMultiByte, 4);
  euc.leads[0x8E] = 4, euc.leads[0x8F] = 3, euc.leads[0xA1] = euc.leads[0xFF] = 2;
  add(euc, 0x3000, 0xA1A1);
  add(euc, 0x30FF, 0xFFFF);
  add(euc, 0x4E00, 0x8FA1A1);
  add(euc, 0x4EFF, 0x8FFEFE);
  add(euc, 0x5000, 0x8EA2A1A1);
  add(euc, 0x50FE, 0x8EAFFEFE);
  add(euc, 0x0041 + 0xFEE0, 0xA1C1);
  add(euc, 0x0061 + 0xFEE0, 0xA1E1);
  const CompiledObject object = compile(euc);
  check_object(euc, object);
  const CodepageTables tables(object.bytes);
  auto kind = [&](size_t page) { return int{tables.u8(2316 + 8 * page)}; };
  EXPECT_EQ((std::vector<int>{kind(0), kind(0x30), kind(0x4E), kind(0x50)}), (std::vector<int>{0, 1, 2, 3}));
  EXPECT_EQ(compile_dump(object, {ObjectType::kCodepage, 1, "Test", 0}), object.bytes);

  // More two-byte characters than words fit: each page becomes two arrays of bytes.
  CodepageSource wide = make_source(CodepageClass::kMultiByte, 2);
  for (unsigned lead = 0x81; lead < 0xFF; ++lead) wide.leads[lead] = 2;
  for (uint32_t i = 0; i < 33; ++i) {
    for (uint32_t k = 0; k < 128; ++k)
      add(wide, (0x4E00 + 512 * i + 4 * k) & 0xFFFF, (0x81 + i) << 8 | (0x40 + k));
  }
  for (uint32_t page = 0x40; page < 0x7E; ++page) {
    add(wide, page << 8, 0xE000 | page), add(wide, page << 8 | 0xFF, 0xE100 | page);
  }
  std::map<uint32_t, Mapping> by_unicode;  // the two loops may meet
  for (const Mapping& m : wide.mappings) by_unicode[m.unicode] = m;
  wide.mappings.clear();
  for (const auto& [unicode, m] : by_unicode) wide.mappings.push_back(m);
  for (uint32_t page = 0x80; page < 0xF0; ++page) {
    for (uint32_t low : {0x01U, 0xFDU}) {
      if (by_unicode.count(page << 8 | low) == 0) add(wide, page << 8 | low, (0xE2 + (low >> 7)) << 8 | page);
    }
  }
  const CompiledObject split = compile(wide);
  check_object(wide, split);
  EXPECT_EQ(CodepageTables(split.bytes).u8(2316 + 8 * 0x4E), 4);
  EXPECT_TRUE(split.left_out.empty());
}

TEST(CodepageObject, ShiftStatefulLooksUpAnyTwoBytes) {
  CodepageSource source = make_source(CodepageClass::kShiftStateful, 2);
  source.ascii = false;
  add(source, 0x3000, 0x4040);
  add(source, 0x4E00, 0x4541, 0);
  add(source, 0x4E01, 0x4542, 3);  // to Unicode only
  add(source, 0x4E02, 0x4541, 1);  // from Unicode only
  const CompiledObject object = compile(source);
  check_object(source, object);
  EXPECT_EQ(compile_dump(object, {ObjectType::kCodepage, 1, "Test", 0}), object.bytes);
}

// The places where an object cannot say what a table says: U+FFFD, the substitution byte, 16 bits.
TEST(CodepageObject, CanonicalForm) {
  CodepageSource source = make_source(CodepageClass::kMultiByte, 2);
  source.leads[0xA1] = 2;
  add(source, 0xFFFD, 0xA1A1);     // becomes one-way
  add(source, 0x00A0, 0x3F, 1);    // as if unmapped
  add(source, 0x1F600, 0xA1A2);    // left out ...
  add(source, 0x263A, 0xA1A2, 1);  // ... with what leads to its code
  add(source, 0x4E00, 0xA1A3);
  const CompiledObject object = compile(source);
  EXPECT_EQ(object.left_out.size(), 2U);
  const CodepageTables tables(object.bytes);
  const uint8_t replacement[] = {0xA1, 0xA1};
  EXPECT_EQ(tables.type_of(replacement).type, 0U);
  EXPECT_EQ(tables.from_unicode(0xFFFD), 0xA1A1U);
  EXPECT_EQ(tables.from_unicode(0x00A0), 0x3FU);
  EXPECT_EQ(tables.from_unicode(0x263A), 0x3FU);
  EXPECT_EQ(compile_dump(object, {ObjectType::kCodepage, 1, "Test", 0}), object.bytes);
}

// UTF-8 has no table: the type trie follows the formula of the look-ups, whatever the trail bytes.
TEST(CodepageObject, Utf8TypesFollowTheFormula) {
  CodepageSource source;
  source.name = "UTF-8";
  source.kind = CodepageClass::kMultiByte;
  source.width = 3;
  source.utf8 = true;
  for (unsigned lead = 0xC2; lead < 0xF0; ++lead) source.leads[lead] = lead < 0xE0 ? 2 : 3;
  const CompiledObject object = compile(source, kUtf8Id);
  check_object(source, object);
  const CodepageTables tables(object.bytes);
  for (size_t n = 1; n < 4; ++n) EXPECT_TRUE(tables.section(n).empty());
  for (uint32_t b0 = 0; b0 < 256; ++b0) {
    for (uint32_t b1 = 0; b1 < 256; ++b1) {
      for (uint32_t b2 = 0; b2 < 256; b2 += 5) {
        const uint8_t bytes[3] = {static_cast<uint8_t>(b0), static_cast<uint8_t>(b1), static_cast<uint8_t>(b2)};
        uint32_t type = 0;
        if (source.leads[b0] == 2)
          type = lx::unicode_type(static_cast<uint16_t>((b0 & 0x1F) << 6 | (b1 & 0x3F)));
        if (source.leads[b0] == 3) {
          type = lx::unicode_type(static_cast<uint16_t>((b0 & 0x0F) << 12 | (b1 & 0x3F) << 6 | (b2 & 0x3F)));
        }
        ASSERT_EQ(tables.type_of(bytes).type, type) << b0 << ' ' << b1 << ' ' << b2;
      }
    }
  }
  EXPECT_EQ(compile_dump(object, {ObjectType::kCodepage, kUtf8Id, "UTF-8", 0}), object.bytes);
}

// A section that is too small loses private use first, then the loneliest characters, from both directions.
TEST(CodepageObject, WhatDoesNotFitIsDroppedAndListed) {
  CodepageSource source = make_source(CodepageClass::kMultiByte, 3);
  for (unsigned lead = 0xA1; lead < 0xC0; ++lead) source.leads[lead] = 3;
  auto code = [](uint32_t i) {
    return (0xA1 + i / 128 / 94) << 16 | (0xA1 + i / 128 % 94) << 8 | (0x80 + i % 128);
  };
  uint32_t row = 0;
  auto fill_rows = [&](uint32_t first, uint32_t rows) {
    for (uint32_t i = 0; i < rows * 128; ++i) add(source, first + i, code(row * 128 + i));
    row += rows;
  };
  fill_rows(0x4E00, 160);
  fill_rows(0xAC00, 80);
  fill_rows(0xE000, 4);
  for (uint32_t i = 0; i < 60; ++i) {  // two characters in a row of 128 cells
    add(source, 0x3400 + 2 * i, code(row * 128));
    add(source, 0x3401 + 2 * i, code(row * 128 + 127));
    ++row;
  }
  add(source, 0x3600, code(2), 1);              // leads to a character that stays
  add(source, 0x3500, code(row * 128 - 1), 1);  // leads to the character that goes first
  const CompiledObject object = compile(source);
  check_object(source, object);
  size_t private_use = 0, lonely = 0;
  for (const LeftOut& entry : object.left_out) {
    (entry.mapping.unicode >= 0xE000 ? private_use : lonely) += 1;
    EXPECT_TRUE(entry.mapping.unicode >= 0xE000 || entry.mapping.unicode < 0x3600) << entry.mapping.unicode;
  }
  EXPECT_EQ(private_use, 512U);
  EXPECT_GT(lonely, 0U);
  EXPECT_LT(lonely, 100U);
  EXPECT_EQ(compile_dump(object, {ObjectType::kCodepage, 1, "Test", 0}), object.bytes);
}

TEST(CodepageObject, RefusesWhatTheFormCannotHold) {
  CodepageSource zero = make_source(CodepageClass::kMultiByte, 3);
  zero.leads[0xA1] = 3;
  add(zero, 0x4E00, 0xA100A1);
  EXPECT_THROW(compile(zero), SourceError);
  CodepageSource plain = make_source(CodepageClass::kSingleByte, 1);
  EXPECT_THROW(compile(plain, kUtf8Id), SourceError);
}

}  // namespace
}  // namespace lexicor_data
