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

constexpr uint32_t kOther = 0xFFFFFFFF;  // no code

bool is_control(uint32_t u) {
  return u < 0x20 || (u >= 0x7F && u <= 0x9F);
}

/// A codepage object as the library has it when it is loaded, beside its source.
class Comparison {
 public:
  Comparison(const CodepageSource& source, const CompiledObject& compiled, uint16_t id)
      : source_(source),
        compiled_(compiled),
        object_(read_object(compiled.bytes, "object")),
        loaded_(id, object_.sections) {
    std::set<std::tuple<uint32_t, uint32_t, int>> gone;
    for (const LeftOut& entry : compiled.left_out)
      gone.insert({entry.mapping.unicode, entry.mapping.code, entry.mapping.precision});
    for (const Mapping& m : source.mappings) {
      if (gone.count({m.unicode, m.code, m.precision}) != 0) continue;
      if (m.precision != 1 && m.unicode != lx::kNoUnicode) to_[m.code] = m.unicode;
      if (m.precision != 3) from_[m.unicode] = m.code;
    }
    for (uint32_t u = 0; source.utf8 && u < 0x10000; ++u) {
      const uint32_t two = (0xC0 | u >> 6) << 8 | 0x80 | (u & 0x3F);
      const uint32_t three = (0xE0 | u >> 12) << 16 | (0x80 | (u >> 6 & 0x3F)) << 8 | 0x80 | (u & 0x3F);
      from_[u] = u < 0x80 ? u : u < 0x800 ? two : three;
      to_[from_[u]] = u;
    }
  }

  void run() {
    check_single_bytes();
    check_from_unicode();
    if (source_.width > 1) {
      for (size_t field : {cp::kFullWidth, cp::kPairs, cp::kTypeTrie, cp::kTypeRecords})
        EXPECT_EQ(u16(field) % 4, 0U);
      check_characters();
      check_other_sequences();
      return;
    }
    for (size_t field = cp::kFullWidth; field < cp::kFixedBytes; field += 2) EXPECT_EQ(u16(field), 0U);
    EXPECT_EQ(payload().size(), cp::kFixedBytes);
    EXPECT_TRUE(object_.sections[1].empty());
  }

  cp::PageEntry page(size_t n) const {
    return record_at<cp::PageEntry>(payload(), cp::kPages + n * cp::PageEntry::kBytes);
  }

 private:
  const ByteVector& payload() const { return object_.sections[0]; }
  uint8_t u8(size_t field) const { return payload()[field]; }
  uint32_t u16(size_t field) const { return lx::le16(&payload()[field]); }
  bool shift() const { return source_.kind == CodepageClass::kShiftStateful; }

  uint32_t value(uint32_t code) const { return to_.count(code) ? to_.at(code) : lx::kNoUnicode; }
  /// The code that maps to the value and back, when it is longer or not longer than a byte.
  uint32_t round_trip(uint32_t u, bool longer) const {
    const auto found = from_.find(u);
    if (found == from_.end() || (value(found->second) != u && !source_.utf8)) return kOther;
    return (found->second > 0xFF) == longer ? found->second : kOther;
  }
  /// The full-width form of a code, or 0.
  uint32_t full_width(uint32_t code) const {
    const uint32_t u = value(code), full = lx::unicode_half_to_full(static_cast<uint16_t>(u));
    if (u == lx::kNoUnicode || full == u || (code > 0xFF && round_trip(u, true) != code)) return 0;
    const uint32_t full_code = round_trip(full, true);
    return full_code == kOther ? 0 : full_code;
  }
  /// What is added to a longer code for its other case.
  uint32_t case_delta(uint32_t code, uint16_t u) const {
    const uint32_t type = lx::unicode_type(u);
    const uint16_t other = (type & LX_C1_UPPER) != 0   ? lx::unicode_lower(u)
                           : (type & LX_C1_LOWER) != 0 ? lx::unicode_upper(u)
                                                       : u;
    const uint32_t other_code = other == u ? kOther : round_trip(other, true);
    return other_code == kOther ? 0 : other_code - code;
  }

  void check_single_bytes() const {
    for (uint32_t byte = 0; byte < 256; ++byte) {
      const auto u = static_cast<uint16_t>(value(byte));
      const auto other = [&](uint16_t other_u) {
        const uint32_t code = u == lx::kNoUnicode || other_u == u ? kOther : round_trip(other_u, false);
        return code == kOther ? byte : code;
      };
      ASSERT_EQ(u8(cp::kLengths + byte), source_.leads[byte]) << byte;
      ASSERT_EQ(u16(cp::kUnicode + 2 * byte), u) << byte;
      ASSERT_EQ(u8(cp::kUpper + byte), other(lx::unicode_upper(u))) << byte;
      ASSERT_EQ(u8(cp::kLower + byte), other(lx::unicode_lower(u))) << byte;
      ASSERT_EQ(lx::codepage_of(*loaded_.object()).type(static_cast<uint8_t>(byte)),
                u == lx::kNoUnicode ? 0 : lx::unicode_type(u));
      ASSERT_EQ(lx::WidthTables(lx::codepage_of(*loaded_.object())).full_of_byte(byte), full_width(byte))
          << byte;
    }
  }

  void check_from_unicode() const {
    for (size_t n = 0; source_.utf8 && n < 256; ++n) ASSERT_GT(page(n).lowest, page(n).highest);
    for (uint32_t u = 0; u < 0x10000; ++u) {
      const auto found = from_.find(u);
      ASSERT_EQ(LXCpUnicodeToCharW(loaded_.object(), static_cast<LXUChar>(u)),
                found == from_.end() ? source_.substitution : found->second)
          << std::hex << u;
      ASSERT_FALSE(!is_control(u) && found != from_.end() && is_control(value(found->second)))
          << "a graphic character becomes a control: " << std::hex << u;
    }
  }

  /// The value, the type, the case and the width of the longer characters.
  void check_characters() const {
    size_t retyped = 0;
    for (const auto& [code, u] : to_) {
      if (code <= 0xFF) continue;
      ASSERT_EQ(LXCpMbToUnicodeW(loaded_.object(), code), u) << std::hex << code;
      ASSERT_EQ(LXCpMbHalfToFullW(loaded_.object(), code), full_width(code)) << std::hex << code;
      const auto record = cp::TypeRecord::read(LXGetMbCtypeW(loaded_.object(), code));
      const uint32_t type = lx::unicode_type(static_cast<uint16_t>(u));
      if (compiled_.type_rows == TypeRows::kLoose && record.type != 0x400 && type == 0x400) {
        ++retyped;
        continue;
      }
      ASSERT_EQ(record.type, type) << std::hex << code;
      ASSERT_EQ(record.case_delta, case_delta(code, static_cast<uint16_t>(u))) << std::hex << code;
    }
    EXPECT_EQ(retyped, compiled_.retyped_chars);
  }

  /// All two-byte sequences, and longer ones with every third byte, over any bytes at all: what is no character
  /// has no value, and type 0 where the rows say so. UTF-8 follows the formula, whatever the trail bytes.
  void check_other_sequences() const {
    std::bitset<256> trails;
    for (const auto& [code, u] : to_)
      for (uint32_t rest = code; rest > 0xFF; rest >>= 8) trails.set(rest & 0xFF);
    for (uint32_t prefix = 0; prefix < 0x10000; ++prefix) {
      const size_t count = shift() ? source_.width : source_.leads[prefix >> 8];
      for (uint32_t third = 0; third < (count > 2 ? 256 : 1); third += 3) {
        const uint8_t bytes[4] = {static_cast<uint8_t>(prefix >> 8), static_cast<uint8_t>(prefix),
                                  static_cast<uint8_t>(third), 0xA1};
        const auto* const text = reinterpret_cast<const char*>(bytes);
        const auto record = cp::TypeRecord::read(LXGetMbCtype(loaded_.object(), text));
        const uint32_t code = lx::pack(bytes, count);
        if (source_.utf8) {
          const uint32_t u = count == 2 ? (prefix >> 8 & 0x1F) << 6 | (prefix & 0x3F)
                                        : (prefix >> 8 & 0x0F) << 12 | (prefix & 0x3F) << 6 | (third & 0x3F);
          ASSERT_EQ(record.type, count == 1 ? 0 : lx::unicode_type(static_cast<uint16_t>(u)))
              << std::hex << code;
        }
        if (count == 1 || source_.utf8 || to_.count(code) != 0) continue;
        bool all_trails = true;
        for (size_t i = 1; i < count; ++i) all_trails = all_trails && trails[bytes[i]];
        ASSERT_EQ(LXCpMbToUnicode(loaded_.object(), text), lx::kNoUnicode) << std::hex << code;
        const bool zero =
            compiled_.type_rows == TypeRows::kExact || (compiled_.type_rows == TypeRows::kShared && all_trails);
        ASSERT_TRUE(!zero || record.type == 0) << std::hex << code;
      }
    }
  }

  const CodepageSource& source_;
  const CompiledObject& compiled_;
  ObjectFile object_;
  lx::test::CodepageObject loaded_;
  std::map<uint32_t, uint32_t> to_, from_;  // the mappings that the object should hold
};

/// What the formatting and stream functions take for granted about a codepage's family.
void check_formatting_characters(const CodepageSource& source) {
  if (source.utf8) return;
  std::map<uint32_t, uint32_t> bytes;  // by code point
  for (const Mapping& mapping : source.mappings)
    if (mapping.precision != 3 && mapping.bytes == 1) bytes[mapping.unicode] = mapping.code;
  for (char c : std::string("+-,./: ABCDEFGHIJKLMNOPQRSTUVWXYZ"))
    EXPECT_EQ(bytes.count(static_cast<uint8_t>(c)), 1u) << c;
  for (uint32_t digit = 0; digit < 10; ++digit)
    EXPECT_EQ(bytes.at('0' + digit), (source.ascii ? 0x30 : 0xF0) + digit);
  EXPECT_EQ(bytes.at('-'), source.ascii ? 0x2Du : 0x60u);
  EXPECT_EQ(bytes.at('?'), source.substitution);
  EXPECT_EQ(source.line_ends[0], bytes.at('\n'));
  EXPECT_EQ(source.line_ends[1], bytes.at('\r'));
  EXPECT_EQ(source.line_ends[2], source.ascii ? 0x0Au : bytes.at(0x85));
  for (uint32_t control = 0; source.ascii && control < 0x20; ++control) EXPECT_EQ(bytes.at(control), control);
}

/// The object of a source. Its dump says what the source said of the codepage itself, and compiles to the same
/// object, which is a matter of course when it says the same of all characters.
CompiledObject compile(CodepageSource source, uint16_t id = 1) {
  source.source.clear();
  std::stringstream text;
  write_ucm(text, source);
  const ObjectName name{ObjectType::kCodepage, id, source.name, 0};
  const CompiledObject object = compile_object(text, "test.ucm", name, {});
  std::istringstream dump(dump_object(read_object(object.bytes, "object"), name, nullptr, "object"));
  const auto head = [](const std::string& ucm) { return ucm.substr(0, ucm.find("CHARMAP")); };
  EXPECT_EQ(head(dump.str()), head(text.str()));
  std::vector<LeftOut> beyond;
  std::ostringstream canonical;
  write_ucm(canonical, to_source(to_model(source, "test.ucm", beyond)));
  if (dump.str() == canonical.str()) return object;
  const CompiledObject again = compile_object(dump, "dump", name, {});
  EXPECT_TRUE(again.left_out.empty());
  EXPECT_EQ(again.bytes, object.bytes);
  return object;
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

    const CompiledObject object = compile(source, name.id);
    EXPECT_TRUE(object.bytes == read_file(LEXICOR_LOCALE_DIR "/" + object_file_name(name)));
    Comparison comparison(source, object, name.id);
    comparison.run();
    row_forms.insert(static_cast<int>(object.type_rows));
    for (size_t n = 0; n < 256; ++n) page_kinds.insert(comparison.page(n).kind);
  }
  EXPECT_EQ(files, listed);
  EXPECT_EQ(page_kinds, (std::set<int>{0, 1, 2, 3, 4}));  // so that every form has been seen
  EXPECT_EQ(row_forms.size(), 4U);
}

// A section that is too small loses private use first, then the loneliest characters, from both directions.
TEST_F(CodepageObject, WhatDoesNotFitIsDroppedAndListed) {
  CodepageSource source;
  source.name = "Test", source.kind = CodepageClass::kMultiByte, source.width = 3;
  const auto add = [&](uint32_t unicode, uint32_t code, uint8_t precision = 0) {
    source.mappings.push_back({unicode, code, code_bytes(code), precision});
  };
  for (uint32_t byte = 0; byte < 0x7F; ++byte) add(byte, byte);
  for (unsigned lead = 0xA1; lead < 0xC0; ++lead) source.leads[lead] = 3;
  auto code = [](uint32_t i) {
    return (0xA1 + i / 128 / 94) << 16 | (0xA1 + i / 128 % 94) << 8 | (0x80 + i % 128);
  };
  uint32_t row = 0;
  for (auto [first, rows] : {std::pair{0x4E00U, 160U}, {0xAC00U, 80U}, {0xE000U, 4U}}) {
    for (uint32_t i = 0; i < rows * 128; ++i) add(first + i, code(row * 128 + i));
    row += rows;
  }
  for (uint32_t i = 0; i < 60; ++i, ++row) {  // two characters in a row of 128 cells
    add(0x3400 + 2 * i, code(row * 128));
    add(0x3401 + 2 * i, code(row * 128 + 127));
  }
  add(0x3600, code(2), 1);              // leads to a character that stays
  add(0x3500, code(row * 128 - 1), 1);  // leads to the character that goes first
  const CompiledObject object = compile(source);
  Comparison(source, object, 1).run();
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
