// Every character of every shipped codepage, as its source maps it: to Unicode and back, and to UTF-8 and back
// through a stream.
#include <gtest/gtest.h>

#include <map>
#include <random>
#include <string>
#include <vector>

#include "directory/directory_codepages.h"
#include "support/library.h"

namespace lx::test {
namespace {

using Units = std::vector<LXUChar>;

void append_utf8(std::string* text, uint16_t u) {
  if (u < 0x80) {
    *text += static_cast<char>(u);
  } else if (u < 0x800) {
    *text += static_cast<char>(0xC0 | u >> 6);
    *text += static_cast<char>(0x80 | (u & 0x3F));
  } else {
    *text += static_cast<char>(0xE0 | u >> 12);
    *text += static_cast<char>(0x80 | (u >> 6 & 0x3F));
    *text += static_cast<char>(0x80 | (u & 0x3F));
  }
}

/// Characters one after the other in the codepage's bytes, in Unicode and in UTF-8.
struct Text {
  std::string bytes;
  Units units;
  std::string utf8;
  bool double_byte = false;

  void add(const ShippedCodepage& codepage, const lexicor_data::Mapping& mapping) {
    if (codepage.shift() && (mapping.bytes > 1) != double_byte) switch_state();
    for (size_t i = mapping.bytes; i-- > 0;) bytes += static_cast<char>(mapping.code >> 8 * i);
    units.push_back(static_cast<LXUChar>(mapping.unicode));
    append_utf8(&utf8, static_cast<uint16_t>(mapping.unicode));
  }
  void close() {
    if (double_byte) switch_state();
  }

 private:
  void switch_state() {
    double_byte = !double_byte;
    bytes += static_cast<char>(double_byte ? lexicor_data::kShiftOut : lexicor_data::kShiftIn);
  }
};

/// The characters that map in a direction: both ways (0), and one way only (1 from Unicode, 3 to Unicode).
Text text_of(const ShippedCodepage& codepage, std::initializer_list<int> precisions) {
  Text text;
  for (const lexicor_data::Mapping& mapping : codepage.source.mappings) {
    if (mapping.unicode > 0xFFFF || codepage.left_out.count(mapping.unicode) != 0) continue;
    for (int precision : precisions)
      if (mapping.precision == precision) text.add(codepage, mapping);
  }
  text.close();
  return text;
}

Units to_unicode(LXLocale* locale, const std::string& bytes) {
  Units units(bytes.size() + 1);
  const int32_t n = LXStringToUnicodeEx(units.data(), static_cast<int32_t>(units.size()), locale, bytes.data(),
                                        LX_SHIFT_SINGLE, static_cast<int32_t>(bytes.size()), 0);
  units.resize(n > 0 ? static_cast<size_t>(n) : 0);
  return units;
}

std::string from_unicode(LXLocale* locale, const Units& units) {
  std::string bytes(units.size() * 5 + 2, '\0');
  const int32_t n =
      LXUnicodeToStringEx(locale, bytes.data(), LX_SHIFT_SINGLE, static_cast<int32_t>(bytes.size()),
                          units.data(), static_cast<int32_t>(units.size()), LX_TERMINATE);
  bytes.resize(n > 0 ? static_cast<size_t>(n) - 1 : 0);
  return bytes;
}

/// Through a conversion handle, in pieces that cut characters everywhere.
std::string stream(LXLocale* target, LXLocale* source, const std::string& text) {
  LXConversion* conversion = LXOpenConversion(target, source);
  std::string result;
  const char* in = text.data();
  size_t left = text.size();
  int32_t piece_left = 0;
  for (size_t piece = 1;; piece = piece % 97 + 1) {
    char buffer[61];
    char* out = buffer;
    int32_t out_left = sizeof(buffer);
    if (piece_left == 0) piece_left = static_cast<int32_t>(left < piece ? left : piece);
    left -= static_cast<size_t>(piece_left);
    const int32_t rc = LXConvertBuffer(conversion, &out, &out_left, &in, &piece_left);
    left += static_cast<size_t>(piece_left);
    result.append(buffer, out);
    if (rc == LX_OK && left == 0) break;
    if (rc != LX_OK && rc != LX_E_OUTPUT_FULL && rc != LX_E_INPUT_CUT) return "code " + std::to_string(rc);
    if (rc == LX_E_INPUT_CUT && left == 0) return "cut";
    if (rc == LX_OK) piece_left = 0;
  }
  EXPECT_EQ(LXCloseConversion(conversion), LX_OK);
  return result;
}

/// Equality that names the first difference of long texts.
template <class Sequence>
testing::AssertionResult same(const Sequence& got, const Sequence& expected) {
  if (got == expected) return testing::AssertionSuccess();
  size_t i = 0;
  while (i < got.size() && i < expected.size() && got[i] == expected[i]) ++i;
  auto result = testing::AssertionFailure()
                << std::hex << "at " << i << " of " << expected.size() << " (got " << got.size() << "):";
  const auto show = [&](const Sequence& text) {
    for (size_t k = i < 4 ? 0 : i - 4; k < text.size() && k < i + 8; ++k)
      result << ' ' << (static_cast<unsigned>(text[k]) & (sizeof(text[k]) == 1 ? 0xFF : 0xFFFF));
  };
  show(got);
  result << " instead of";
  show(expected);
  return result;
}

class EveryCodepage : public testing::TestWithParam<size_t> {
 protected:
  const ShippedCodepage& codepage() const { return shipped_codepages()[GetParam()]; }
  Library library{LEXICOR_LOCALE_DIR};
};

TEST_P(EveryCodepage, MapsAsItsSourceSays) {
  const LocalePtr locale = locale_with(codepage().source.name);
  const Text both = text_of(codepage(), {0});
  EXPECT_TRUE(same(to_unicode(locale.get(), both.bytes), both.units));
  EXPECT_TRUE(same(from_unicode(locale.get(), both.units), both.bytes));

  // U+FFFD and the substitution byte stand for "none", whatever a source maps to them one way.
  for (const lexicor_data::Mapping& mapping : codepage().source.mappings) {
    if (mapping.precision == 0 || mapping.unicode > 0xFFFF || codepage().left_out.count(mapping.unicode) != 0)
      continue;
    const std::string bytes = text_of_code(codepage(), mapping.code, mapping.bytes);
    const Units units{static_cast<LXUChar>(mapping.unicode)};
    if (mapping.precision == 3) {
      EXPECT_EQ(to_unicode(locale.get(), bytes), units) << mapping.code;
    } else {
      EXPECT_EQ(from_unicode(locale.get(), units), bytes) << mapping.unicode;
    }
  }
}

TEST_P(EveryCodepage, StreamsToUtf8AndBack) {
  const LocalePtr locale = locale_with(codepage().source.name);
  const LocalePtr utf8 = locale_with("UTF-8");
  const Text both = text_of(codepage(), {0});
  EXPECT_TRUE(same(stream(utf8.get(), locale.get(), both.bytes), both.utf8));
  // A stream leaves the double-byte state of its target open.
  std::string back = stream(locale.get(), utf8.get(), both.utf8);
  if (both.bytes.size() == back.size() + 1 && codepage().shift())
    back += static_cast<char>(lexicor_data::kShiftIn);
  EXPECT_TRUE(same(back, both.bytes));
}

/// Long texts are moved in runs, short ones character by character: random bytes and units, well formed or not,
/// must come out the same both ways.
TEST_P(EveryCodepage, LongTextsConvertAsTheirCharacters) {
  const LocalePtr locale = locale_with(codepage().source.name);
  std::mt19937 random(codepage().id);
  for (int round = 0; round < 20; ++round) {
    // Rounds differ in how far bytes and values range, so that runs of all lengths come about.
    const unsigned reach = round % 4 == 0 ? 0x80 : 0x100;
    std::string bytes(300, ' ');
    for (char& byte : bytes)
      if (random() % 3 != 0 || round % 2 == 0) byte = static_cast<char>(random() % reach);
    Units units(300, 'a');
    for (LXUChar& unit : units)
      if (random() % 5 != 0) unit = static_cast<LXUChar>(random() % (round % 4 == 1 ? 0x600 : 0x10000));

    Units whole(bytes.size()), parts;
    const auto size = static_cast<int32_t>(bytes.size());
    whole.resize(
        static_cast<size_t>(LXStringToUnicode(whole.data(), size, locale.get(), bytes.data(), size, 0)));
    for (const char *p = bytes.data(), *end = p + bytes.size(); p < end;) {
      const int32_t length = LXByteLength(locale.get(), p);
      LXUChar unit = 0;
      if (length > end - p || LXStringToUnicode(&unit, 1, locale.get(), p, length, 0) != 1) break;
      parts.push_back(unit);
      p += length;
    }
    ASSERT_TRUE(same(whole, parts)) << "round " << round;

    std::string joined;
    for (LXUChar unit : units) {
      char text[8];
      const int32_t n = LXUnicodeToString(locale.get(), text, sizeof(text), &unit, 1, 0);
      joined.append(text, static_cast<size_t>(n));
    }
    std::string all(units.size() * 4, '\0');
    all.resize(static_cast<size_t>(LXUnicodeToString(locale.get(), all.data(), static_cast<int32_t>(all.size()),
                                                     units.data(), static_cast<int32_t>(units.size()), 0)));
    ASSERT_TRUE(same(all, joined)) << "round " << round;
  }
}

bool is_control(uint32_t u) {
  return u < 0x20 || (u >= 0x7F && u <= 0x9F);
}

/// Every value that the source does not map becomes the question mark, and every single byte U+FFFD. No
/// graphic character becomes a control.
TEST_P(EveryCodepage, HasNothingBesides) {
  if (codepage().source.utf8) return;
  const LocalePtr locale = locale_with(codepage().source.name);
  std::vector<bool> mapped(0x10000, false);
  std::vector<bool> byte_mapped(0x100, false);
  for (const lexicor_data::Mapping& mapping : codepage().source.mappings) {
    if (mapping.precision != 3 && mapping.unicode <= 0xFFFF) mapped[mapping.unicode] = true;
    if (mapping.precision != 1 && mapping.bytes == 1) byte_mapped[mapping.code] = true;
  }
  const std::string substitution(1, static_cast<char>(codepage().source.substitution));
  EXPECT_EQ(to_unicode(locale.get(), substitution), Units{'?'});
  for (uint32_t u = 0; u <= 0xFFFF; ++u) {
    const std::string bytes = from_unicode(locale.get(), {static_cast<LXUChar>(u)});
    ASSERT_TRUE(mapped[u] || bytes == substitution) << u;
    ASSERT_FALSE(!is_control(u) && is_control(to_unicode(locale.get(), bytes).at(0))) << u;
  }
  for (uint32_t b = 0; b <= 0xFF; ++b) {
    const bool shift_byte = codepage().shift() && (b == lexicor_data::kShiftOut || b == lexicor_data::kShiftIn);
    if (byte_mapped[b] || shift_byte || codepage().source.leads[b] != 1) continue;
    ASSERT_EQ(to_unicode(locale.get(), std::string(1, static_cast<char>(b))), Units{0xFFFD}) << b;
  }
}

std::string test_name(const testing::TestParamInfo<size_t>& parameter) {
  std::string name = shipped_codepages()[parameter.param].source.name;
  for (char& c : name)
    if (isalnum(static_cast<unsigned char>(c)) == 0) c = '_';
  return name;
}

INSTANTIATE_TEST_SUITE_P(Directory, EveryCodepage, testing::Range(size_t{0}, shipped_codepages().size()),
                         test_name);

TEST(Directory, HasTheCodepagesThatEverybodyAsksFor) {
  const std::map<std::string, uint16_t> known = {
      {"US-ASCII", 367},   {"Latin1", 819},     {"ISO-8859-2", 912}, {"ISO-8859-5", 915}, {"ISO-8859-6", 1089},
      {"ISO-8859-7", 813}, {"ISO-8859-8", 916}, {"ISO-8859-9", 920}, {"MS1251", 1251},    {"MS874", 874},
      {"MS932", 932},      {"MS936", 936},      {"MS949", 949},      {"MS950", 950},      {"JapanEUC", 33722},
      {"EUC-TW", 964},     {"UTF-8", 57352},    {"IBM930", 930},     {"IBM939", 939},     {"IBM1047", 1047},
  };
  std::map<std::string, uint16_t> shipped;
  for (const ShippedCodepage& codepage : shipped_codepages()) shipped[codepage.source.name] = codepage.id;
  EXPECT_GE(shipped.size(), 100u);
  for (const auto& [name, id] : known) EXPECT_EQ(shipped[name], id) << name;

  // No shipped table has all that IBM's form of JapanEUC has.
  const Library library(LEXICOR_LOCALE_DIR);
  EXPECT_STREQ(LXGetCodepageFromAlias(nullptr, "eucjp"), "JapanEUC");
  EXPECT_EQ(LXGetCodepageFromAlias(nullptr, "ibm-eucjp"), nullptr);
}

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
