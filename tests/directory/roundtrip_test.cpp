// Every shipped codepage maps as its source says: each 16-bit value and each character alone, all of them as
// one text, through a stream that cuts characters everywhere, and random text in runs as its characters one by
// one.
#include <gtest/gtest.h>

#include <map>
#include <random>
#include <set>

#include "directory/directory_codepages.h"
#include "support/conversion.h"
#include "support/library.h"

namespace lx::test {
namespace {

/// Through a conversion handle, in pieces that cut characters everywhere.
std::string stream(LXLocale* target, LXLocale* source, const std::string& text) {
  Conversion conversion(target, source);
  std::string result;
  Conversion::Step step{LX_OK, "", 0};
  for (size_t at = 0, piece = 1; at < text.size() || step.code == LX_E_OUTPUT_FULL; piece = piece % 97 + 1) {
    step = conversion.call(text.substr(at, piece), 61);
    at += step.taken;
    result += step.output;
    if (step.code != LX_OK && step.code != LX_E_OUTPUT_FULL && step.code != LX_E_INPUT_CUT) break;
  }
  EXPECT_EQ(step.code, LX_OK);
  return result;
}

class EveryCodepage : public testing::TestWithParam<size_t> {
 protected:
  const ShippedCodepage& codepage() const { return shipped_codepages()[GetParam()]; }
  Library library{LEXICOR_LOCALE_DIR};
  LocalePtr locale = locale_with(codepage().source.name);
};

bool is_control(uint32_t u) {
  return u < 0x20 || (u >= 0x7F && u <= 0x9F);
}

// What the source does not map becomes the substitution byte, which is a question mark, and a single byte
// U+FFFD. No graphic character becomes a control.
TEST_P(EveryCodepage, MapsAsItsSourceSaysAndNothingBesides) {
  std::map<uint32_t, std::string> bytes_of;
  std::set<uint32_t> left_out;
  std::vector<bool> byte_mapped(0x100, false);
  for (const lexicor_data::Mapping& mapping : codepage().source.mappings) {
    if (mapping.precision != 1 && mapping.bytes == 1) byte_mapped[mapping.code] = true;
    if (mapping.unicode > 0xFFFF) continue;
    const std::string bytes = text_of_code(codepage(), mapping.code, mapping.bytes);
    const auto u = static_cast<LXUChar>(mapping.unicode);
    if (mapping.precision != 3) bytes_of[u] = bytes;
    if (mapping.precision != 1 && to_unicode(locale.get(), bytes) != Units{u}) left_out.insert(u);
  }
  if (codepage().source.utf8) return;
  const std::string substitution(1, static_cast<char>(codepage().source.substitution));
  EXPECT_EQ(to_unicode(locale.get(), substitution), Units{'?'});
  for (uint32_t u = 0; u <= 0xFFFF; ++u) {
    const std::string bytes = from_unicode(locale.get(), {static_cast<LXUChar>(u)});
    const auto mapped = bytes_of.find(u);
    if (mapped == bytes_of.end() || bytes != mapped->second) {
      ASSERT_EQ(bytes, substitution) << u;
      if (mapped != bytes_of.end()) left_out.insert(u);
    } else {
      ASSERT_FALSE(!is_control(u) && is_control(to_unicode(locale.get(), bytes).at(0))) << u;
    }
  }
  // Objects have no room for all of these, as the compiler says.
  const auto& name = codepage().source.name;
  EXPECT_EQ(left_out.size(), name == "EUC-TW" ? 6568U : name == "IBM1388" ? 1010U : 0U);
  for (uint32_t b = 0; b <= 0xFF; ++b) {
    const bool shift_byte = codepage().shift() && (b == lexicor_data::kShiftOut || b == lexicor_data::kShiftIn);
    if (byte_mapped[b] || shift_byte || codepage().source.leads[b] != 1) continue;
    ASSERT_EQ(to_unicode(locale.get(), std::string(1, static_cast<char>(b))), Units{0xFFFD}) << b;
  }
}

// All characters that map both ways alone, as one text.
TEST_P(EveryCodepage, StreamsToUtf8AndBack) {
  Units units;
  for (const lexicor_data::Mapping& mapping : codepage().source.mappings) {
    const auto u = static_cast<LXUChar>(mapping.unicode);
    if (mapping.precision == 0 && mapping.unicode <= 0xFFFF &&
        from_unicode(locale.get(), {u}) == text_of_code(codepage(), mapping.code, mapping.bytes))
      units.push_back(u);
  }
  const LocalePtr utf8 = locale_with("UTF-8");
  const std::string bytes = from_unicode(locale.get(), units), in_utf8 = from_unicode(utf8.get(), units);
  EXPECT_TRUE(to_unicode(locale.get(), bytes) == units);
  EXPECT_TRUE(stream(utf8.get(), locale.get(), bytes) == in_utf8);
  // A stream leaves the double-byte state of its target open.
  std::string back = stream(locale.get(), utf8.get(), in_utf8);
  if (bytes.size() == back.size() + 1 && codepage().shift()) back += static_cast<char>(lexicor_data::kShiftIn);
  EXPECT_TRUE(back == bytes);
}

// Long texts are moved in runs, short ones character by character: random bytes and units, well formed or not,
// must come out the same both ways.
TEST_P(EveryCodepage, LongTextsConvertAsTheirCharacters) {
  std::mt19937 random(codepage().id);
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
      const size_t length = static_cast<size_t>(LXByteLength(locale.get(), &bytes[at]));
      const Units unit = decode(kPlain, locale.get(), bytes.substr(at, length));
      if (at + length > bytes.size() || unit.size() != 1) break;
      parts += unit;
      at += length;
    }
    ASSERT_EQ(decode(kPlain, locale.get(), bytes), parts);

    std::string joined;
    for (LXUChar unit : units) joined += encode(kPlain, locale.get(), {unit});
    ASSERT_EQ(encode(kPlain, locale.get(), units), joined);
  }
}

std::string test_name(const testing::TestParamInfo<size_t>& parameter) {
  std::string name = shipped_codepages()[parameter.param].source.name;
  std::replace(name.begin(), name.end(), '-', '_');
  return name;
}

INSTANTIATE_TEST_SUITE_P(Directory, EveryCodepage, testing::Range(size_t{0}, shipped_codepages().size()),
                         test_name);

TEST(Utf8, BytesThatBeginNoCharacterAreOneByteWithoutAValue) {
  const Library library(LEXICOR_LOCALE_DIR);
  const LocalePtr utf8 = locale_with("UTF-8");
  // U+1F600 in four bytes: no value of 16 bits, so never a wrong character.
  EXPECT_EQ(to_unicode(utf8.get(), "a\xF0\x9F\x98\x80z"), (Units{'a', 0xFFFD, 0xFFFD, 0xFFFD, 0xFFFD, 'z'}));
  for (unsigned b = 0x80; b <= 0xFF; ++b) {
    const char byte = static_cast<char>(b);
    const int32_t length = b >= 0xC2 && b <= 0xDF ? 2 : b >= 0xE0 && b <= 0xEF ? 3 : 1;
    EXPECT_EQ(LXByteLength(utf8.get(), &byte), length) << b;
  }
}

}  // namespace
}  // namespace lx::test
