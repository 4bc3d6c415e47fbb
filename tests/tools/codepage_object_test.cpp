// Every codepage of data/, and small ones that reach the corners: what an object's tables say against what its
// source says, by the library's look-ups.
#include <gtest/gtest.h>

#include <bitset>
#include <filesystem>
#include <fstream>
#include <map>
#include <set>
#include <sstream>

#include "codepage/lxunicode.h"
#include "codepage/lxwidth.h"
#include "compile.h"
#include "object_file.h"
#include "support/tiny_codepages.h"
#include "ucm.h"

namespace lexicor_data {
namespace {

namespace cp = lx::format::codepage;

/// A codepage object as the library reads it: loaded, and by the fields of its payload.
class CodepageTables {
 public:
  CodepageTables(const ByteVector& file, uint16_t id)
      : object_(read_object(file, "object")), made_(id, object_.sections) {
    object_.sections.resize(lx::format::kMaxSections);
  }

  const ByteVector& section(size_t n) const { return object_.sections[n]; }
  uint8_t u8(size_t field) const { return section(0)[field]; }
  uint32_t u16(size_t field) const { return lx::le16(&section(0)[field]); }
  uint32_t u32(size_t field) const { return lx::le32(&section(0)[field]); }
  cp::PageEntry page(size_t n) const {
    return cp::PageEntry::read(&section(0)[cp::kPages + n * cp::PageEntry::kBytes]);
  }

  uint32_t to_unicode(const uint8_t* p) const { return LXCpMbToUnicode(made_.object(), text(p)); }
  uint32_t from_unicode(uint32_t u) const {
    return LXCpUnicodeToCharW(made_.object(), static_cast<LXUChar>(u));
  }
  cp::TypeRecord type_of(const uint8_t* p) const {
    return cp::TypeRecord::read(LXGetMbCtype(made_.object(), text(p)));
  }
  lx::WidthTables widths() const { return lx::WidthTables(lx::codepage_of(*made_.object())); }

 private:
  static const char* text(const uint8_t* p) { return reinterpret_cast<const char*>(p); }

  ObjectFile object_;
  lx::test::CodepageObject made_;
};

/// The bytes of a packed code, first byte first.
std::vector<uint8_t> bytes_of_code(uint32_t code, size_t count) {
  std::vector<uint8_t> bytes;
  while (count-- > 0) bytes.push_back(static_cast<uint8_t>(code >> 8 * count));
  return bytes;
}

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
    for (uint32_t u = 0; table.utf8 && u < 0x10000; ++u) {
      const uint32_t two = (0xC0 | u >> 6) << 8 | 0x80 | (u & 0x3F);
      const uint32_t three = (0xE0 | u >> 12) << 16 | (0x80 | (u >> 6 & 0x3F)) << 8 | 0x80 | (u & 0x3F);
      from[u] = u < 0x80 ? u : u < 0x800 ? two : three;
      to[from[u]] = u;
    }
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
};

void check_header_and_single_bytes(const Expected& expected, const CodepageTables& tables) {
  const CodepageSource& source = expected.source;
  EXPECT_EQ(tables.u8(cp::kSubstitution), source.substitution);
  for (size_t i = 0; i < 4; ++i) EXPECT_EQ(tables.u8(cp::kLineEnds + i), source.line_ends[i]);
  EXPECT_EQ(tables.u8(cp::kWidth), source.width);
  EXPECT_EQ(tables.u8(cp::kShiftOut), expected.shift() ? 0x0E : 0);
  EXPECT_EQ(tables.u8(cp::kShiftIn), expected.shift() ? 0x0F : 0);
  EXPECT_EQ(tables.u16(cp::kFlags), (source.ascii ? 1U : 0U) | (expected.shift() ? 2U : 0U));
  for (uint32_t byte = 0; byte < 256; ++byte) {
    const auto value = static_cast<uint16_t>(expected.value(byte));
    const auto other = [&](uint16_t u) {
      const uint32_t code = value == 0xFFFD || u == value ? 0xFFFFFFFF : expected.round_trip(u, false);
      return code == 0xFFFFFFFF ? byte : code;
    };
    ASSERT_EQ(tables.u8(cp::kLengths + byte), source.leads[byte]) << byte;
    ASSERT_EQ(tables.u16(cp::kUnicode + 2 * byte), value) << byte;
    ASSERT_EQ(tables.u8(cp::kUpper + byte), other(lx::unicode_upper(value))) << byte;
    ASSERT_EQ(tables.u8(cp::kLower + byte), other(lx::unicode_lower(value))) << byte;
    ASSERT_EQ(tables.u32(cp::kTypes + 4 * byte), value == 0xFFFD ? 0 : lx::unicode_type(value)) << byte;
  }
}

void check_from_unicode(const Expected& expected, const CodepageTables& tables) {
  if (expected.source.utf8) {
    for (size_t n = 0; n < 256; ++n) ASSERT_GT(tables.page(n).lowest, tables.page(n).highest);
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
  const lx::WidthTables widths = tables.widths();
  for (uint32_t byte = 0; byte < 256; ++byte)
    ASSERT_EQ(widths.full_of_byte(byte), expected.full_width(expected.value(byte))) << byte;
  std::vector<std::pair<uint32_t, uint32_t>> pairs, stored;
  for (const auto& [code, u] : expected.to) {
    const uint32_t full = expected.full_width(u);
    if (full != 0 && expected.round_trip(u, true) == code) pairs.push_back({code, full});
  }
  for (size_t i = 0; i < widths.pair_count; ++i) stored.push_back({widths.pair(i).half, widths.pair(i).full});
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
    ASSERT_EQ(record.case_delta, case_delta(expected, code, static_cast<uint16_t>(u))) << std::hex << code;
  }
  EXPECT_EQ(retyped, object.retyped_chars);

  // The rest: all two-byte sequences, and longer ones with every third byte, over any bytes at all.
  for (uint32_t prefix = 0; prefix < 0x10000; ++prefix) {
    const size_t count = expected.shift() ? expected.source.width : expected.source.leads[prefix >> 8];
    const uint32_t last = count > 2 ? 256 : 1;
    for (uint32_t third = 0; third < last; third += 3) {
      const uint8_t bytes[4] = {static_cast<uint8_t>(prefix >> 8), static_cast<uint8_t>(prefix),
                                static_cast<uint8_t>(third), 0xA1};
      const auto record = tables.type_of(bytes);
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

/// UTF-8 has no table: the type trie follows the formula of the look-ups, whatever the trail bytes.
void check_utf8_types(const CodepageSource& source, const CodepageTables& tables) {
  for (size_t n = 1; n < 4; ++n) EXPECT_TRUE(tables.section(n).empty());
  for (uint32_t i = 0; i < 1U << 24; i += 5) {
    const uint8_t b[3] = {static_cast<uint8_t>(i >> 16), static_cast<uint8_t>(i >> 8), static_cast<uint8_t>(i)};
    const uint32_t two = (b[0] & 0x1F) << 6 | (b[1] & 0x3F);
    const uint32_t three = (b[0] & 0x0F) << 12 | (b[1] & 0x3F) << 6 | (b[2] & 0x3F);
    const uint8_t length = source.leads[b[0]];
    const auto u = static_cast<uint16_t>(length == 2 ? two : three);
    ASSERT_EQ(tables.type_of(b).type, length == 1 ? 0 : lx::unicode_type(u)) << std::hex << i;
  }
}

/// What the formatting and stream functions take for granted about a codepage's family.
void check_formatting_characters(const CodepageSource& source) {
  if (source.utf8) return;
  std::map<uint32_t, uint32_t> bytes;  // by code point
  std::set<uint32_t> values;
  for (const Mapping& mapping : source.mappings) {
    if (mapping.precision != 3 && mapping.bytes == 1) bytes[mapping.unicode] = mapping.code;
    if (mapping.precision != 1) values.insert(mapping.code);
  }
  auto byte_of = [&](uint32_t unicode) { return bytes.count(unicode) != 0 ? bytes[unicode] : 0x100; };
  for (char c : std::string("+-,./: ABCDEFGHIJKLMNOPQRSTUVWXYZ"))
    EXPECT_NE(byte_of(static_cast<uint8_t>(c)), 0x100u) << c;
  for (uint32_t digit = 0; digit < 10; ++digit)
    EXPECT_EQ(byte_of('0' + digit), (source.ascii ? 0x30 : 0xF0) + digit);
  EXPECT_EQ(byte_of('-'), source.ascii ? 0x2Du : 0x60u);
  EXPECT_EQ(source.line_ends[0], byte_of('\n'));
  EXPECT_EQ(source.line_ends[1], byte_of('\r'));
  EXPECT_EQ(source.line_ends[2], source.ascii ? 0x0Au : byte_of(0x85));
  EXPECT_EQ(values.count(source.substitution), 1u);
  if (!source.ascii) return;
  for (uint32_t control = 0; control < 0x20; ++control) EXPECT_EQ(byte_of(control), control);
  EXPECT_EQ(byte_of(0x7F), 0x7Fu);
}

void check_codepage(const CodepageSource& source, const CompiledObject& object, uint16_t id) {
  const CodepageTables tables(object.bytes, id);
  const Expected expected(source, object.left_out);
  check_header_and_single_bytes(expected, tables);
  check_from_unicode(expected, tables);
  if (source.width == 1) {
    for (size_t field = cp::kFullWidth; field < cp::kFixedBytes; field += 2) EXPECT_EQ(tables.u16(field), 0U);
    EXPECT_TRUE(tables.section(0).size() == cp::kFixedBytes && tables.section(1).empty() &&
                tables.section(3).empty());
    return;
  }
  for (size_t field : {cp::kFullWidth, cp::kPairs, cp::kTypeTrie, cp::kTypeRecords})
    EXPECT_EQ(tables.u16(field) % 4, 0U);
  check_width_tables(expected, tables);
  check_longer_characters(expected, tables, object);
}

/// The dump of an object compiles to the same object.
void check_dump(const CompiledObject& object, const ObjectName& name) {
  Control control;
  control.objects.push_back(name);
  std::stringstream dump(dump_object(read_object(object.bytes, "object"), name, &control, "object"));
  const CompiledObject again = compile_object(dump, "dump", name, control);
  EXPECT_TRUE(again.left_out.empty());
  EXPECT_EQ(again.bytes, object.bytes);
}

CompiledObject compile(const CodepageSource& source, uint16_t id = 1) {
  std::stringstream text;
  write_ucm(text, source);
  const ObjectName name{ObjectType::kCodepage, id, source.name, 0};
  const CompiledObject object = compile_object(text, "test.ucm", name, {});
  check_dump(object, name);
  return object;
}

CodepageSource make_source(CodepageClass kind, uint8_t width) {
  CodepageSource source;
  source.name = "Test", source.kind = kind, source.width = width;
  for (uint32_t byte = 0; byte < 0x7F; ++byte) source.mappings.push_back({byte, byte, 1, 0});
  return source;
}

void add(CodepageSource& source, uint32_t unicode, uint32_t code, uint8_t precision = 0) {
  const uint8_t bytes = code > 0xFFFFFF ? 4 : code > 0xFFFF ? 3 : code > 0xFF ? 2 : 1;
  source.mappings.push_back({unicode, code, bytes, precision});
}

/// The library with memory for what is derived.
class CodepageObject : public testing::Test {
  lx::test::TinyLibrary library_{std::vector<lx::test::TinyCodepage>{}};
};

TEST_F(CodepageObject, EveryShippedCodepageSaysWhatItsSourceSays) {
  const std::string data = LEXICOR_DATA_DIR;
  const Control control = read_source_control(data);
  std::set<std::string> files, listed;
  for (const auto& entry : std::filesystem::directory_iterator(data + "/codepages"))
    files.insert("codepages/" + entry.path().filename().string());
  std::set<int> page_kinds, row_forms;
  for (const ObjectName& name : control.objects) {
    if (name.type != ObjectType::kCodepage) continue;
    SCOPED_TRACE(name.name);
    listed.insert(source_file_name(name));
    const std::string path = data + '/' + source_file_name(name);
    std::stringstream text, written;
    text << std::ifstream(path, std::ios::binary).rdbuf();
    const CodepageSource source = read_ucm(text, path);
    write_ucm(written, source);
    EXPECT_TRUE(written.str() == text.str()) << "not in the form that is written";
    check_formatting_characters(source);

    const CompiledObject object = compile_object(written, path, name, control);
    check_codepage(source, object, name.id);
    check_dump(object, name);
    row_forms.insert(static_cast<int>(object.type_rows));
    const CodepageTables tables(object.bytes, name.id);
    for (size_t n = 0; n < 256; ++n) page_kinds.insert(tables.page(n).kind);
    if (source.utf8) check_utf8_types(source, tables);
  }
  EXPECT_EQ(files, listed);
  EXPECT_EQ(page_kinds, (std::set<int>{0, 1, 2, 3, 4}));  // so that every form has been seen
  EXPECT_EQ(row_forms.size(), 4U);
}

// The places where an object cannot say what a table says: U+FFFD, the substitution byte, 16 bits, a
// zero byte, UTF-8 that is none.
TEST_F(CodepageObject, CanonicalForm) {
  CodepageSource source = make_source(CodepageClass::kMultiByte, 2);
  source.leads[0xA1] = 2;
  add(source, 0xFFFD, 0xA1A1);     // becomes one-way
  add(source, 0x00A0, 0x3F, 1);    // as if unmapped
  add(source, 0x1F600, 0xA1A2);    // left out ...
  add(source, 0x263A, 0xA1A2, 1);  // ... with what leads to its code
  add(source, 0x4E00, 0xA1A3);
  const CompiledObject object = compile(source);
  EXPECT_EQ(object.left_out.size(), 2U);
  const CodepageTables tables(object.bytes, 1);
  const uint8_t replacement[] = {0xA1, 0xA1};
  EXPECT_EQ(tables.type_of(replacement).type, 0U);
  EXPECT_EQ(tables.from_unicode(0xFFFD), 0xA1A1U);
  EXPECT_EQ(tables.from_unicode(0x00A0), 0x3FU);
  EXPECT_EQ(tables.from_unicode(0x263A), 0x3FU);

  CodepageSource zero = make_source(CodepageClass::kMultiByte, 3);
  zero.leads[0xA1] = 3;
  add(zero, 0x4E00, 0xA100A1);
  EXPECT_THROW(compile(zero), SourceError);
  EXPECT_THROW(compile(make_source(CodepageClass::kSingleByte, 1), cp::kUtf8Id), SourceError);
}

// A section that is too small loses private use first, then the loneliest characters, from both directions.
TEST_F(CodepageObject, WhatDoesNotFitIsDroppedAndListed) {
  CodepageSource source = make_source(CodepageClass::kMultiByte, 3);
  for (unsigned lead = 0xA1; lead < 0xC0; ++lead) source.leads[lead] = 3;
  auto code = [](uint32_t i) {
    return (0xA1 + i / 128 / 94) << 16 | (0xA1 + i / 128 % 94) << 8 | (0x80 + i % 128);
  };
  uint32_t row = 0;
  for (auto [first, rows] : {std::pair{0x4E00U, 160U}, {0xAC00U, 80U}, {0xE000U, 4U}}) {
    for (uint32_t i = 0; i < rows * 128; ++i) add(source, first + i, code(row * 128 + i));
    row += rows;
  }
  for (uint32_t i = 0; i < 60; ++i, ++row) {  // two characters in a row of 128 cells
    add(source, 0x3400 + 2 * i, code(row * 128));
    add(source, 0x3401 + 2 * i, code(row * 128 + 127));
  }
  add(source, 0x3600, code(2), 1);              // leads to a character that stays
  add(source, 0x3500, code(row * 128 - 1), 1);  // leads to the character that goes first
  const CompiledObject object = compile(source);
  check_codepage(source, object, 1);
  size_t private_use = 0, lonely = 0;
  for (const LeftOut& entry : object.left_out) {
    (entry.mapping.unicode >= 0xE000 ? private_use : lonely) += 1;
    EXPECT_TRUE(entry.mapping.unicode >= 0xE000 || entry.mapping.unicode < 0x3600) << entry.mapping.unicode;
  }
  EXPECT_EQ(private_use, 512U);
  EXPECT_TRUE(lonely > 0 && lonely < 100) << lonely;
}

}  // namespace
}  // namespace lexicor_data
