// Every shipped codepage maps as its source says: each character alone, all of them as one text, through a stream
// that cuts characters everywhere, and random text in runs as its characters one by one.
#include <gtest/gtest.h>

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

/// Calls `use(codepage, locale)` with every shipped codepage.
template <class Use>
void for_each_codepage(Use use) {
  const Library library(LEXICOR_LOCALE_DIR);
  for (const ShippedCodepage& codepage : shipped_codepages()) {
    SCOPED_TRACE(codepage.source.name);
    use(codepage, locale_with(codepage.source.name).get());
  }
}

// Each character alone, and all that map both ways as one text. Objects have no room for some, as the compiler
// says.
TEST(EveryCodepage, MapsAsItsSourceSaysAndStreamsToUtf8AndBack) {
  for_each_codepage([](const ShippedCodepage& codepage, LXLocale* l) {
    std::set<uint32_t> left_out;
    Units units;
    for (const lexicor_data::Mapping& mapping : codepage.source.mappings) {
      if (mapping.unicode > 0xFFFF) continue;
      const Units unit{static_cast<LXUChar>(mapping.unicode)};
      const std::string bytes = text_of_code(codepage, mapping.code, mapping.bytes);
      const bool reads = mapping.precision == 1 || to_unicode(l, bytes) == unit;
      const bool writes = mapping.precision == 3 || from_unicode(l, unit) == bytes;
      if (!reads || !writes) left_out.insert(mapping.unicode);
      if (reads && writes && mapping.precision == 0) units += unit;
    }
    const auto& name = codepage.source.name;
    EXPECT_EQ(left_out.size(), name == "EUC-TW" ? 6568U : name == "IBM1388" ? 1010U : 0U);
    const LocalePtr utf8 = locale_with("UTF-8");
    const std::string bytes = from_unicode(l, units), in_utf8 = from_unicode(utf8.get(), units);
    EXPECT_TRUE(to_unicode(l, bytes) == units);
    EXPECT_TRUE(stream(utf8.get(), l, bytes) == in_utf8);
    // A stream leaves the double-byte state of its target open.
    std::string back = stream(l, utf8.get(), in_utf8);
    if (bytes.size() == back.size() + 1 && codepage.shift()) back += static_cast<char>(lexicor_data::kShiftIn);
    EXPECT_TRUE(back == bytes);
  });
}

// Long texts are moved in runs, short ones character by character: random bytes and units, well formed or not,
// must come out the same both ways.
TEST(EveryCodepage, ConvertsLongTextsAsTheirCharacters) {
  for_each_codepage([](const ShippedCodepage& codepage, LXLocale* l) {
    std::mt19937 random(codepage.id);
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
  });
}

}  // namespace
}  // namespace lx::test
