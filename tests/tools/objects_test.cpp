// Objects beside their sources, where a transcript cannot show it: every codepage of data/ by the library's look-ups,
// and damage. tests/cases/cli says the rest, and tests/cases/faults what is wrong with sources.
#include <gtest/gtest.h>

#include <bitset>
#include <fstream>
#include <set>
#include <sstream>
#include <tuple>

#include "codepage/lxunicode.h"
#include "codepage/lxwidth.h"
#include "compile.h"
#include "core/lxobjtypes.h"
#include "support/tiny_codepages.h"

namespace lexicor_data {
namespace {

namespace cp = lx::format::codepage;

bool is_control(uint32_t u) {
  return u < 0x20 || (u >= 0x7F && u <= 0x9F);
}

/// A codepage object as the library has it when it is loaded, beside the characters that it should hold.
class Comparison {
 public:
  Comparison(const CodepageModel& model, const CompiledObject& compiled, uint16_t id)
      : model_(model),
        compiled_(compiled),
        file_(read_object(compiled.bytes, "object")),
        loaded_(id, file_.sections) {}

  void run() const {
    check_single_bytes();
    check_from_unicode();
    if (model_.is_multibyte()) {
      for (size_t field : {cp::kFullWidth, cp::kPairs, cp::kTypeTrie, cp::kTypeRecords})
        EXPECT_EQ(u16(field) % 4, 0U);
      check_characters();
      check_other_sequences();
      return;
    }
    for (size_t field = cp::kFullWidth; field < cp::kFixedBytes; field += 2) EXPECT_EQ(u16(field), 0U);
    EXPECT_EQ(payload().size(), cp::kFixedBytes);
    EXPECT_TRUE(file_.sections[1].empty());
  }

  cp::PageEntry page(size_t n) const {
    return record_at<cp::PageEntry>(payload(), cp::kPages + n * cp::PageEntry::kBytes);
  }

 private:
  const ByteVector& payload() const { return file_.sections[0]; }
  uint32_t u16(size_t field) const { return lx::le16(&payload()[field]); }

  /// The code of another form of a character, if it maps back and is longer than a byte or not; else the code itself.
  uint32_t form(uint32_t code, uint16_t other, bool longer) const {
    const uint16_t u = model_.value_of(code);
    const uint32_t other_code = u == kNoValue || other == u ? kNoCode : model_.round_trip(other);
    return other_code != kNoCode && (other_code > 0xFF) == longer ? other_code : code;
  }
  /// The full-width form of a code, or 0.
  uint32_t full_width(uint32_t code) const {
    const uint16_t u = model_.value_of(code);
    if (code > 0xFF && model_.round_trip(u) != code) return 0;
    const uint32_t full = form(code, lx::unicode_half_to_full(u), true);
    return full == code ? 0 : full;
  }

  void check_single_bytes() const {
    const lx::Codepage& codepage = lx::codepage_of(*loaded_.object());
    for (uint32_t byte = 0; byte < 256; ++byte) {
      const uint16_t u = model_.value_of(byte);
      ASSERT_EQ(payload()[cp::kLengths + byte], model_.header.leads[byte]) << byte;
      ASSERT_EQ(u16(cp::kUnicode + 2 * byte), u) << byte;
      ASSERT_EQ(payload()[cp::kUpper + byte], form(byte, lx::unicode_upper(u), false)) << byte;
      ASSERT_EQ(payload()[cp::kLower + byte], form(byte, lx::unicode_lower(u), false)) << byte;
      ASSERT_EQ(codepage.type(static_cast<uint8_t>(byte)), u == kNoValue ? 0 : lx::unicode_type(u)) << byte;
      ASSERT_EQ(lx::WidthTables(codepage).full_of_byte(byte), full_width(byte)) << byte;
    }
  }

  void check_from_unicode() const {
    for (size_t n = 0; model_.header.utf8 && n < 256; ++n) ASSERT_GT(page(n).lowest, page(n).highest);
    for (uint32_t u = 0; u < 0x10000; ++u) {
      const uint32_t code = model_.from_unicode[u];
      ASSERT_EQ(LXCpUnicodeToCharW(loaded_.object(), static_cast<LXUChar>(u)),
                code == kNoCode ? model_.substitution() : code)
          << std::hex << u;
      ASSERT_FALSE(!is_control(u) && code != kNoCode && is_control(model_.value_of(code)))
          << "a graphic character becomes a control: " << std::hex << u;
    }
  }

  /// The value, the type, the case and the width of the longer characters.
  void check_characters() const {
    size_t retyped = 0;
    for (const auto& [code, u] : model_.to_unicode) {
      if (code <= 0xFF) continue;
      ASSERT_EQ(LXCpMbToUnicodeW(loaded_.object(), code), u) << std::hex << code;
      ASSERT_EQ(LXCpMbHalfToFullW(loaded_.object(), code), full_width(code)) << std::hex << code;
      const auto record = cp::TypeRecord::read(LXGetMbCtypeW(loaded_.object(), code));
      const uint32_t type = lx::unicode_type(u);
      if (compiled_.type_rows == TypeRows::kLoose && record.type != 0x400 && type == 0x400) {
        ++retyped;
        continue;
      }
      const uint16_t other = (type & LX_C1_UPPER) != 0   ? lx::unicode_lower(u)
                             : (type & LX_C1_LOWER) != 0 ? lx::unicode_upper(u)
                                                         : u;
      ASSERT_EQ(record.type, type) << std::hex << code;
      ASSERT_EQ(record.case_delta, form(code, other, true) - code) << std::hex << code;
    }
    EXPECT_EQ(retyped, compiled_.retyped_chars);
  }

  /// All two-byte sequences, and longer ones with every third byte, over any bytes at all: what is no character
  /// has no value, and type 0 where the rows say so. UTF-8 follows the formula, whatever the trail bytes.
  void check_other_sequences() const {
    std::bitset<256> trails;
    for (const auto& [code, u] : model_.to_unicode)
      for (uint32_t rest = code; rest > 0xFF; rest >>= 8) trails.set(rest & 0xFF);
    for (uint32_t prefix = 0; prefix < 0x10000; ++prefix) {
      const size_t count = model_.is_shift() ? model_.header.width : model_.header.leads[prefix >> 8];
      for (uint32_t third = 0; count > 1 && third < (count > 2 ? 256 : 1); third += 3) {
        const uint8_t bytes[4] = {static_cast<uint8_t>(prefix >> 8), static_cast<uint8_t>(prefix),
                                  static_cast<uint8_t>(third), 0xA1};
        const auto* const text = reinterpret_cast<const char*>(bytes);
        const auto record = cp::TypeRecord::read(LXGetMbCtype(loaded_.object(), text));
        const uint32_t code = lx::pack(bytes, count);
        if (model_.header.utf8) {
          const uint32_t u = count == 2 ? (prefix >> 8 & 0x1F) << 6 | (prefix & 0x3F)
                                        : (prefix >> 8 & 0x0F) << 12 | (prefix & 0x3F) << 6 | (third & 0x3F);
          ASSERT_EQ(record.type, lx::unicode_type(static_cast<uint16_t>(u))) << std::hex << code;
        } else if (model_.value_of(code) == kNoValue) {
          bool all_trails = true;
          for (size_t i = 1; i < count; ++i) all_trails = all_trails && trails[bytes[i]];
          const bool zero = compiled_.type_rows == TypeRows::kExact ||
                            (compiled_.type_rows == TypeRows::kShared && all_trails);
          ASSERT_EQ(LXCpMbToUnicode(loaded_.object(), text), lx::kNoUnicode) << std::hex << code;
          ASSERT_TRUE(!zero || record.type == 0) << std::hex << code;
        }
      }
    }
  }

  const CodepageModel& model_;
  const CompiledObject& compiled_;
  ObjectFile file_;
  lx::test::CodepageObject loaded_;
};

/// What the formatting and stream functions take for granted about a codepage's family.
void check_formatting_characters(const CodepageModel& model) {
  const CodepageSource& header = model.header;
  const auto& code = model.from_unicode;
  if (header.utf8) return;
  for (char c : std::string("+-,./: ABCDEFGHIJKLMNOPQRSTUVWXYZ"))
    EXPECT_LE(code[static_cast<size_t>(c)], 0xFFU) << c;
  for (uint32_t digit = 0; digit < 10; ++digit)
    EXPECT_EQ(code['0' + digit], (header.ascii ? 0x30 : 0xF0) + digit);
  EXPECT_EQ(code['-'], header.ascii ? 0x2Du : 0x60u);
  EXPECT_EQ(code['?'], header.substitution);
  EXPECT_EQ(header.line_ends[0], code['\n']);
  EXPECT_EQ(header.line_ends[1], code['\r']);
  EXPECT_EQ(header.line_ends[2], header.ascii ? 0x0Au : code[0x85]);
  for (uint32_t control = 0; header.ascii && control < 0x20; ++control) EXPECT_EQ(code[control], control);
}

/// What a source says without the characters that were left out.
CodepageModel kept(CodepageSource source, const CompiledObject& object) {
  std::set<std::tuple<uint32_t, uint32_t, int>> gone;
  for (const auto& [m, reason] : object.left_out) gone.insert({m.unicode, m.code, m.precision});
  std::vector<Mapping> mappings;
  for (const Mapping& m : source.mappings)
    if (gone.count({m.unicode, m.code, m.precision}) == 0) mappings.push_back(m);
  source.mappings = mappings;
  std::vector<LeftOut> none;
  return to_model(source, "kept", none);
}

/// The library with memory for what is derived.
class Objects : public testing::Test {
  lx::test::TinyLibrary library_{std::vector<lx::test::TinyCodepage>{}};
};

// The dump of an object says what its source said, so that it compiles to the same object; of one that lacks
// characters too.
TEST_F(Objects, EveryShippedCodepageSaysWhatItsSourceSays) {
  const std::string data = LEXICOR_DATA_DIR;
  const Control control = read_source_control(data);
  std::set<int> page_kinds, row_forms;
  for (const ObjectName& name : control.objects) {
    if (name.type != ObjectType::kCodepage) continue;
    SCOPED_TRACE(name.name);
    const std::string path = data + '/' + source_file_name(name);
    std::stringstream text, written, canonical;
    text << std::ifstream(path, std::ios::binary).rdbuf();
    const CodepageSource source = read_ucm(text, path);
    write_ucm(written, source);
    EXPECT_TRUE(written.str() == text.str()) << "not in the form that is written";

    const CompiledObject object = compile_object(written, path, name, control);
    EXPECT_TRUE(object.bytes == read_file(LEXICOR_LOCALE_DIR "/" + object_file_name(name)));
    const CodepageModel model = kept(source, object);
    check_formatting_characters(model);
    write_ucm(canonical, to_source(model));
    std::istringstream dump(dump_object(read_object(object.bytes, "object"), name, nullptr, "object"));
    EXPECT_TRUE(dump.str() == canonical.str());
    EXPECT_TRUE(object.left_out.empty() || compile_object(dump, "dump", name, control).bytes == object.bytes);

    const Comparison comparison(model, object, name.id);
    comparison.run();
    row_forms.insert(static_cast<int>(object.type_rows));
    for (size_t n = 0; n < 256; ++n) page_kinds.insert(comparison.page(n).kind);
  }
  EXPECT_EQ(page_kinds, (std::set<int>{0, 1, 2, 3, 4}));  // so that every form has been seen
  EXPECT_EQ(row_forms.size(), 4U);
}

// Whatever a byte of an object becomes, checking and dumping end with a source or a SourceError, and the source
// of a sort is one that is read and written again.
TEST_F(Objects, AnyByteMayBeWrong) {
  std::istringstream sort(
      "@defaults 0001 0001\n@insert secondary ; 0041\n@specials 2700..27FF ; 0400\n@primaries 4E00..4FFF ; "
      "8000\n"
      "@uncovered 0100..26FF\n@uncovered 2800..4DFF\n@uncovered 5000..FFFF\n002D ; [*0001.0000.0000]\n"
      "0061 ; [.0200.0001.0001]\n0041 ; [.0200.0001.0002]\n00C6 ; [.0200.0002.0002][.0201.0001.0001]\n"
      "00E6 ; [.0200.0002.0001][.0201.0001.0001]\n0062 0063 ; [.0203.0001.0001]\n0062 0064 ; "
      "[.0204.0001.0001]\n");
  const ObjectName sort_name{ObjectType::kSort, 1, "S", 0};
  const struct {
    ObjectName name;
    std::vector<ByteVector> sections;
  } objects[] = {{{ObjectType::kLanguage, 1, "L", 0}, {lx::test::payload_of(lx::kBuiltInLanguage)}},
                 {{ObjectType::kTerritory, 1, "T", 0}, {lx::test::payload_of(lx::kBuiltInTerritory)}},
                 {{ObjectType::kCodepage, 1, "C", 0}, lx::test::tiny_euc().file.sections},
                 {sort_name, read_object(compile_object(sort, "sort", sort_name, {}).bytes, "sort").sections}};
  for (const auto& object : objects) {
    const ByteVector sound = write_object({object.sections, 2, ""});
    size_t refused = 0;
    const auto use = [&](const ByteVector& bytes) {
      try {
        std::istringstream source(dump_object(read_object(bytes, "object"), object.name, nullptr, "object"));
        if (object.name.type != ObjectType::kSort) return;
        const CompiledObject again = compile_object(source, "source", object.name, {});
        EXPECT_EQ(dump_object(read_object(again.bytes, "again"), object.name, nullptr, "again"), source.str());
      } catch (const SourceError&) {
        ++refused;
      }
    };
    use(sound);
    EXPECT_EQ(refused, 0u) << object.name.name;
    uint32_t step = 0;
    for (size_t at = 0; at < sound.size(); at += 1 + step % 23, ++step) {
      for (const uint8_t value : {static_cast<uint8_t>(sound[at] ^ (1U << step % 8)), uint8_t{0xFF}}) {
        ByteVector bytes = sound;
        bytes[at] = value;
        use(bytes);
      }
    }
    for (size_t size = 0; size < sound.size(); size += 1 + size / 16)
      use(ByteVector(sound.begin(), sound.begin() + static_cast<std::ptrdiff_t>(size)));
    EXPECT_GT(refused, 0u) << object.name.name;
  }
}

TEST_F(Objects, SourcesRefuseTextThatCannotBeReadBack) {
  for (const char* text : {"a \"quoted\" word", "two\nlines"}) {
    CodepageSource source;
    source.source = text;
    std::ostringstream out;
    EXPECT_THROW(write_ucm(out, source), SourceError) << text;
  }
}

}  // namespace
}  // namespace lexicor_data
