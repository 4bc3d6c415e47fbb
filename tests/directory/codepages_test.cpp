// Every shipped object holds what its source says; codepages by the library's look-ups as well, and texts of their
// characters are converted whole and in runs.
#include <gtest/gtest.h>

#include <algorithm>
#include <bitset>
#include <random>
#include <set>
#include <sstream>
#include <tuple>

#include "codepage/lxunicode.h"
#include "codepage/lxwidth.h"
#include "directory/directory_codepages.h"
#include "locale/lxlocale.h"
#include "support/forms.h"
#include "support/library.h"
#include "support/slowness.h"

namespace lx::test {
namespace {

using namespace lexicor_data;
namespace cp = format::codepage;

/// A text from Unicode, and a whole one to it, with shift bytes where the codepage has them.
inline std::string from_unicode(LXLocale* l, const Units& text) {
  const auto encode_closed = [&](char* to, int32_t room) {
    return LXUnicodeToStringEx(l, to, LX_SHIFT_SINGLE, room, text.data(), count_of(text), LX_TERMINATE) - 1;
  };
  return made<char>(encode_closed, 5 * text.size() + 2);
}
inline Units to_unicode(LXLocale* l, const std::string& bytes) {
  return decode(kEx, l, bytes);
}

bool is_control(uint32_t u) {
  return u < 0x20 || (u >= 0x7F && u <= 0x9F);
}

/// A codepage of the library beside the characters that it should hold.
class Comparison {
 public:
  Comparison(const ShippedCodepage& codepage, const CompiledObject& compiled, LXLocale* l)
      : codepage_(codepage), compiled_(compiled), l_(l) {}

  void run() const {
    check_single_bytes();
    check_from_unicode();
    check_characters();
    if (!model_.is_multibyte()) return;
    for (size_t field : {cp::kFullWidth, cp::kPairs, cp::kTypeTrie, cp::kTypeRecords})
      EXPECT_EQ(u16(field) % 4, 0U);
    check_other_sequences();
  }

 private:
  const ByteVector& payload() const { return codepage_.object.sections[0]; }
  uint32_t u16(size_t field) const { return le16(&payload()[field]); }

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
    const uint32_t full = form(code, unicode_half_to_full(u), true);
    return full == code ? 0 : full;
  }

  void check_single_bytes() const {
    const Codepage& codepage = codepage_of(*object_);
    for (uint32_t byte = 0; byte < 256; ++byte) {
      const uint16_t u = model_.value_of(byte);
      ASSERT_EQ(payload()[cp::kLengths + byte], model_.header.leads[byte]) << byte;
      ASSERT_EQ(u16(cp::kUnicode + 2 * byte), u) << byte;
      ASSERT_EQ(payload()[cp::kUpper + byte], form(byte, unicode_upper(u), false)) << byte;
      ASSERT_EQ(payload()[cp::kLower + byte], form(byte, unicode_lower(u), false)) << byte;
      ASSERT_EQ(codepage.type(static_cast<uint8_t>(byte)), u == kNoValue ? 0 : unicode_type(u)) << byte;
      ASSERT_EQ(WidthTables(codepage).full_of_byte(byte), full_width(byte)) << byte;
    }
  }

  void check_from_unicode() const {
    for (uint32_t u = 0; u < 0x10000; ++u) {
      const uint32_t code = model_.from_unicode[u], written = code != kNoCode ? code : model_.substitution();
      const auto unit = static_cast<LXUChar>(u);
      ASSERT_EQ(LXCpUnicodeToCharW(object_, unit), written) << std::hex << u;
      if (code == kNoCode && u % 32 != 0) continue;
      ASSERT_EQ(from_unicode(l_, {unit}), codepage_.text_of(written)) << std::hex << u;
      ASSERT_FALSE(!is_control(u) && code != kNoCode && is_control(model_.value_of(code)))
          << "a graphic character becomes a control: " << std::hex << u;
    }
  }

  /// The values of characters; the type, the case and the width of longer ones.
  void check_characters() const {
    size_t retyped = 0;
    for (const auto [code, u] : model_.to_unicode) {
      ASSERT_EQ(to_unicode(l_, codepage_.text_of(code)), Units{u}) << std::hex << code;
      if (code <= 0xFF) continue;
      ASSERT_EQ(LXCpMbToUnicodeW(object_, code), u) << std::hex << code;
      ASSERT_EQ(LXCpMbHalfToFullW(object_, code), full_width(code)) << std::hex << code;
      const auto record = cp::TypeRecord::read(LXGetMbCtypeW(object_, code));
      const uint32_t type = unicode_type(u);
      if (compiled_.type_rows == TypeRows::kLoose && record.type != 0x400 && type == 0x400) {
        ++retyped;
        continue;
      }
      const uint16_t other = (type & LX_C1_UPPER) != 0   ? unicode_lower(u)
                             : (type & LX_C1_LOWER) != 0 ? unicode_upper(u)
                                                         : u;
      ASSERT_EQ(record.type, type) << std::hex << code;
      uint32_t other_code = form(code, other, true);
      if (other_code == code && !model_.is_shift()) other_code = form(code, other, false);
      ASSERT_EQ(record.case_delta, other_code - code) << std::hex << code;
    }
    EXPECT_EQ(retyped, compiled_.retyped_chars);
  }

  /// All two-byte sequences, and longer ones with every third byte, over any bytes at all: what is no character
  /// has no value, and type 0 where the rows say so. UTF-8 follows the formula, whatever the trail bytes.
  void check_other_sequences() const {
    std::bitset<256> trails;
    for (const auto [code, u] : model_.to_unicode)
      for (uint32_t rest = code; rest > 0xFF; rest >>= 8) trails.set(rest & 0xFF);
    for (uint32_t prefix = 0; prefix < 0x10000; ++prefix) {
      const size_t count = model_.is_shift() ? model_.header.width : model_.header.leads[prefix >> 8];
      for (uint32_t third = 0; count > 1 && third < (count > 2 ? 256 : 1); third += 3) {
        const uint8_t bytes[4] = {static_cast<uint8_t>(prefix >> 8), static_cast<uint8_t>(prefix),
                                  static_cast<uint8_t>(third), 0xA1};
        const auto* const text = reinterpret_cast<const char*>(bytes);
        const auto record = cp::TypeRecord::read(LXGetMbCtype(object_, text));
        const uint32_t code = pack(bytes, count);
        const bool utf8 = model_.header.utf8,
                   shift_bytes = model_.is_shift() && std::min(bytes[0], bytes[1]) < 0x40;
        if (!utf8 && model_.value_of(code) != kNoValue) continue;
        const uint32_t computed = count == 2
                                      ? (prefix >> 8 & 0x1F) << 6 | (prefix & 0x3F)
                                      : (prefix >> 8 & 0x0F) << 12 | (prefix & 0x3F) << 6 | (third & 0x3F);
        const auto u = static_cast<LXUChar>(utf8 ? computed : kNoUnicode);
        bool all_trails = compiled_.type_rows == TypeRows::kShared;
        for (size_t i = 1; i < count; ++i) all_trails = all_trails && trails[bytes[i]];
        ASSERT_EQ(LXCpMbToUnicode(object_, text), u) << std::hex << code;
        ASSERT_TRUE(shift_bytes || to_unicode(l_, codepage_.text_of(code))[0] == u) << std::hex << code;
        const bool zero = all_trails || compiled_.type_rows == TypeRows::kExact;
        ASSERT_TRUE(utf8 ? record.type == unicode_type(u) : !zero || record.type == 0) << std::hex << code;
      }
    }
  }

  const ShippedCodepage& codepage_;
  const CodepageModel& model_ = codepage_.model;
  const CompiledObject& compiled_;
  LXLocale* const l_;
  const LXObject* const object_ = l_->codepage;
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
  for (uint32_t control = 0; header.ascii && control < 0x20; ++control) {
    const bool letter = (unicode_type(model.value_of(control)) & LX_C1_UPPER) != 0;  // of Vietnamese
    EXPECT_EQ(code[control], letter ? kNoCode : control);
  }
}

/// What a source says without the characters that were left out, as it is written.
std::string kept(CodepageSource source, const CompiledObject& object) {
  std::set<std::tuple<uint32_t, uint32_t, int>> gone;
  std::set<uint32_t> lost;
  for (const auto& [m, reason] : object.left_out) {
    gone.insert({m.unicode, m.code, m.precision});
    if (m.unicode <= 0xFFFF) lost.insert(m.unicode);
  }
  EXPECT_EQ(lost.size(), source.name == "EUC-TW" ? 6568U : source.name == "IBM1388" ? 1010U : 0U);
  std::vector<Mapping> mappings;
  for (const Mapping& m : source.mappings)
    if (gone.count({m.unicode, m.code, m.precision}) == 0) mappings.push_back(m);
  source.mappings = mappings;
  std::vector<LeftOut> none;
  std::ostringstream text;
  CodepageSource rest = to_source(to_model(source, "kept", none));
  rest.source = source.source;
  write_ucm(text, rest);
  return text.str();
}

/// All characters that map both ways as one text.
void check_whole_text(const CodepageModel& model, LXLocale* l) {
  Units units;
  for (uint32_t u = 0; u < kNoValue; ++u)
    if (model.round_trip(static_cast<uint16_t>(u)) != kNoCode) units.push_back(static_cast<LXUChar>(u));
  EXPECT_TRUE(to_unicode(l, from_unicode(l, units)) == units);
}

/// They are mapped in runs as each is alone.
void check_mapped_text(const CodepageModel& model, LXLocale* l) {
  if (!model.is_multibyte() || model.is_shift()) return;
  for (const auto& [mode, mask] :
       {std::pair{LX_MAP_UPPER_SIMPLE, LX_C1_LOWER}, {LX_MAP_LOWER_SIMPLE, LX_C1_UPPER}}) {
    std::string text, expected;
    for (uint32_t u = ' '; u < kNoValue; ++u) {
      if (model.round_trip(static_cast<uint16_t>(u)) == kNoCode) continue;
      const std::string bytes = encode(kPlain, l, {static_cast<LXUChar>(u)});
      char out[8];
      const int32_t count = bytes.size() == 1
                                ? LXMapString(l, out, 8, bytes.data(), 1, mode)
                                : LXCpMbCaseConv(l->codepage, bytes.data(), out, static_cast<uint32_t>(mask));
      text += bytes;
      expected.append(out, static_cast<size_t>(count));
    }
    std::string mapped(2 * text.size(), '\0');
    const int32_t bytes = LXMapString(l, mapped.data(), static_cast<int32_t>(mapped.size()), text.data(),
                                      static_cast<int32_t>(text.size()), mode);
    mapped.resize(static_cast<size_t>(bytes));
    EXPECT_TRUE(mapped == expected) << mode;
  }
}

/// Between codepages a long text becomes what it becomes by way of Unicode.
void check_pivot(LXLocale* from, LXLocale* to, uint16_t id) {
  std::mt19937 random(id);
  std::string text(2000, ' ');
  for (char& byte : text) byte = static_cast<char>(random() % 0x100);
  const std::string expected = encode(kPlain, to, decode(kPlain, from, text));
  std::string converted(4 * text.size(), '\0');
  converted.resize(
      static_cast<size_t>(LXConvertString(to, converted.data(), static_cast<int32_t>(converted.size()), from,
                                          text.data(), static_cast<int32_t>(text.size()), 0)));
  EXPECT_TRUE(converted == expected);
}

/// Long texts are moved in runs, short ones character by character: random bytes and units, well formed or not, must
/// come out the same both ways.
void check_runs(LXLocale* l, uint16_t id) {
  std::mt19937 random(id);
  for (int round = 0; round < 20; ++round) {
    SCOPED_TRACE(round);
    // Rounds differ in how far bytes and values range, so that runs of all lengths come about.
    const unsigned reach = round % 4 == 0 ? 0x80 : 0x100;
    std::string bytes(300, ' ');
    for (char& byte : bytes)
      if (random() % 3 != 0 || round % 2 == 0) byte = static_cast<char>(random() % reach);
    Units units(300, 'a');
    for (LXUChar& unit : units)
      if (random() % 5 != 0) unit = static_cast<LXUChar>(random() % (round % 4 == 1 ? 0x600 : 0x10000));

    Units parts;
    for (size_t at = 0; at < bytes.size();) {
      const size_t length = static_cast<size_t>(LXByteLength(l, &bytes[at]));
      const Units unit = decode(kPlain, l, bytes.substr(at, length));
      if (at + length > bytes.size() || unit.size() != 1) break;
      parts += unit;
      at += length;
    }
    ASSERT_EQ(decode(kPlain, l, bytes), parts);

    std::string joined;
    for (LXUChar unit : units) joined += encode(kPlain, l, {unit});
    ASSERT_EQ(encode(kPlain, l, units), joined);
  }
}

// The dump of an object says what its source said, so that it compiles to the same object; of one that lacks
// characters too.
TEST(EveryCodepage, HoldsWhatItsSourceSaysAndConverts) {
  const Library library(LEXICOR_LOCALE_DIR);
  LocalePtr before = locale_with("Latin1");
  for (const ShippedCodepage& codepage : shipped_codepages()) {
    SCOPED_TRACE(codepage.name.name);
    const std::string path = source_path(LEXICOR_DATA_DIR, codepage.name);
    std::ifstream source(path);
    const CompiledObject compiled = compile_object(source, path, codepage.name, {});
    EXPECT_TRUE(compiled.bytes == write_object(codepage.object));
    std::istringstream dump(dump_object(codepage.object, codepage.name, nullptr, "object"));
    EXPECT_TRUE(dump.str() == kept(codepage.source, compiled));
    EXPECT_TRUE(compiled.left_out.empty() ||
                compile_object(dump, "dump", codepage.name, {}).bytes == compiled.bytes);
    check_formatting_characters(codepage.model);

    LocalePtr locale = locale_with(codepage.source.name);
    check_pivot(locale.get(), before.get(), codepage.name.id);
    Comparison(codepage, compiled, locale.get()).run();
    check_whole_text(codepage.model, locale.get());
    check_mapped_text(codepage.model, locale.get());
    check_runs(locale.get(), codepage.name.id);
    before = std::move(locale);
  }
}

// Those of languages and territories are kept as they are dumped. What a sort is dumped as compiles to the same object.
TEST(EverySource, IsTheDumpOfItsObject) {
  const Control control = read_source_control(LEXICOR_DATA_DIR);
  for (const ObjectName& name : control.objects) {
    if (name.type == lexicor_data::ObjectType::kCodepage) continue;
    const ObjectFile object =
        read_object(read_file(LEXICOR_LOCALE_DIR "/" + object_file_name(name)), name.name);
    if (name.type == lexicor_data::ObjectType::kSort) {
      if (name.id % kSlowness != 0) continue;
      std::istringstream dump(dump_object(object, name, &control, name.name));
      EXPECT_TRUE(compile_object(dump, "dump.txt", name, control).bytes == write_object(object)) << name.name;
      continue;
    }
    const ByteVector source = read_file(source_path(LEXICOR_DATA_DIR, name));
    const std::string text(source.begin(), source.end());
    EXPECT_EQ(dump_object(object, name, &control, name.name), text) << name.name;
  }
}

}  // namespace
}  // namespace lx::test
