// Mapping of strings in all forms against one model that works on Unicode values: random texts with runs of
// ASCII, special mappings of one and two characters, every mode and every output size.
#include <gtest/gtest.h>

#include <random>

#include "codepage/lxcodepage.h"
#include "codepage/lxunicode.h"
#include "support/tiny_codepages.h"

namespace {

using lx::test::ByteString;
using lx::test::CodepageBuilder;
using lx::test::TinyCharacter;
using lx::test::TinyCodepage;
using lx::test::TinyLibrary;
namespace fmt = lx::format::codepage;

using Units = std::vector<uint16_t>;
constexpr uint32_t kModes[] = {LX_MAP_FULL_WIDTH, LX_MAP_HALF_WIDTH,   LX_MAP_COPY,         LX_MAP_LOWER,
                               LX_MAP_UPPER,      LX_MAP_LOWER_SIMPLE, LX_MAP_UPPER_SIMPLE, LX_MAP_DIGITS};

struct Special {
  uint16_t first, second, result1, result2;
};
// U+2603 is in no codepage.
const std::vector<Special> kUpperSpecials{{0xDF, 0, 'S', 'S'},      {'i', 'j', 'A', 0},
                                          {'q', 'q', 'R', 'Q'},     {'r', 0, 0x2603, 0},
                                          {0x3042, 0, 'H', 0x3041}, {'h', 0x3043, 0x3044, 0}};
const std::vector<Special> kLowerSpecials{{'I', 'J', 'a', 'b'}, {'Q', 0, 0x3041, 0}};

/// Fills the width tables of a multibyte codepage by the Unicode rule.
TinyCodepage with_widths(TinyCodepage cp) {
  ByteString& payload = cp.file.sections[0];
  const size_t table = lx::le16(payload.data() + fmt::kFullWidth);
  lx::put_le16(payload.data() + fmt::kPairs, static_cast<uint16_t>(payload.size()));
  uint16_t pairs = 0;
  for (const TinyCharacter& c : cp.characters) {
    const uint16_t full = lx::unicode_half_to_full(c.unicode);
    if (full == c.unicode || cp.find(full) == nullptr) continue;
    const uint32_t code = cp.find(full)->code;
    if (c.code <= 0xFF) {
      lx::put_le32(payload.data() + table + 4 * c.code, code);
      continue;
    }
    payload.resize(payload.size() + fmt::WidthPair::kBytes);
    fmt::WidthPair{c.code, code}.write(payload.data() + payload.size() - fmt::WidthPair::kBytes);
    lx::put_le16(payload.data() + fmt::kPairCount, ++pairs);
  }
  return cp;
}

TinyCodepage sjis() {
  return with_widths(CodepageBuilder(9002, "TINY-SJIS", 2)
                         .lead(0x81, 0x9F, 2)
                         .ascii()
                         .map(0xA1, 0xFF61, 63)
                         .map(0x824F, 0xFF10, 10)
                         .map(0x8260, 0xFF21, 26)
                         .map(0x8281, 0xFF41, 26)
                         .map(0x829F, 0x3041, 83)
                         .map(0x8340, 0x30A1, 63)
                         .map(0x8440, 0xFFE8, 7)
                         .map(0x84A0, 0x2502)
                         .build());
}
TinyCodepage shift() {
  return with_widths(CodepageBuilder(9005, "TINY-SHIFT", 2)
                         .shift(0x0E, 0x0F)
                         .substitution(0x6F)
                         .map(0, 0)
                         .map(0x6F, '?')
                         .map(0x81, 'a', 9)
                         .map(0x91, 'j', 9)
                         .map(0xC1, 'A', 9)
                         .map(0xD1, 'J', 9)
                         .map(0xF0, '0', 10)
                         .map(0x4281, 0xFF41, 9)
                         .map(0x42C1, 0xFF21, 9)
                         .map(0x42F0, 0xFF10, 10)
                         .map(0x4447, 0x3041, 83)
                         .build());
}
TinyCodepage utf8() {
  return with_widths(CodepageBuilder(fmt::kUtf8Id, "TINY-UTF8", 3)
                         .ascii()
                         .lead(0xC0, 0xDF, 2)
                         .lead(0xE0, 0xFF, 3)
                         .map(0xC39F, 0xDF, 33)
                         .map(0xC480, 0x100, 0x40)
                         .map(0xE29883, 0x2603)
                         .map(0xE38181, 0x3041, 63)
                         .map(0xEFBC90, 0xFF10, 10)
                         .map(0xEFBCA1, 0xFF21, 26)
                         .map(0xEFBD81, 0xFF41, 26)
                         .build());
}

/// One character of the result, and the last character of the input that it comes from.
struct Piece {
  uint16_t unicode, source;
};

class Map : public testing::Test {
 protected:
  void TearDown() override {
    for (const auto& [locale, language] : languages_) locale->language = language;
    EXPECT_TRUE(library_.close());
  }

  /// A locale with the special mappings and with case deltas in the type records.
  LXLocale* locale(const TinyCodepage& cp) {
    LXLocale* locale = library_.locale(cp);
    languages_.emplace_back(locale, locale->language);
    if (language_.section[0] == nullptr) make_language(*locale->language);
    locale->language = &language_;
    for (const TinyCharacter& c : cp.characters) {
      if (c.code <= 0xFF) continue;
      const uint16_t upper = lx::unicode_upper(c.unicode);
      const uint16_t other = upper != c.unicode ? upper : lx::unicode_lower(c.unicode);
      auto* record = const_cast<uint8_t*>(LXGetMbCtypeW(locale->codepage, c.code));
      const uint32_t delta = cp.find(other) != nullptr ? cp.find(other)->code - c.code : 0;
      fmt::TypeRecord{fmt::TypeRecord::read(record).type, delta}.write(record);
    }
    return locale;
  }

  static Units random_text(const TinyCodepage* cp, std::mt19937* random) {
    const Units often{'i', 'j', 'q',  'r',    'I', 'J',    'Q',    'a',
                      'z', '7', 0xDF, 0x3042, 'h', 0x3043, 0xFF21, 0xFF41};
    Units text;
    const size_t length = (*random)() % 70;
    while (text.size() < length) {
      uint16_t u = static_cast<uint16_t>((*random)() % 4 == 0 ? (*random)() : 'a' + (*random)() % 9);
      if ((*random)() % 3 == 0) u = often[(*random)() % often.size()];
      if (cp != nullptr && (*random)() % 8 == 0)
        u = cp->characters[(*random)() % cp->characters.size()].unicode;
      if (u != 0 && (cp == nullptr || cp->find(u) != nullptr)) text.push_back(u);
    }
    return text;
  }

  /// `cp` null: Unicode itself.
  static std::vector<Piece> mapped(const TinyCodepage* cp, const Units& text, uint32_t mode) {
    const std::vector<Special> none;
    const auto& specials = mode == LX_MAP_UPPER ? kUpperSpecials : mode == LX_MAP_LOWER ? kLowerSpecials : none;
    std::vector<Piece> pieces;
    for (size_t i = 0; i < text.size(); ++i) {
      const Special* match = nullptr;
      for (const bool pair : {false, true})
        for (const Special& s : specials)
          if (match == nullptr && s.first == text[i] && (s.second != 0) == pair &&
              (!pair || (i + 1 < text.size() && s.second == text[i + 1])))
            match = &s;
      if (match == nullptr) {
        const uint16_t u = alone(text[i], mode, cp != nullptr && cp->width == 1);
        pieces.push_back({cp == nullptr || cp->find(u) != nullptr ? u : text[i], text[i]});
        continue;
      }
      if (match->second != 0) ++i;
      pieces.push_back({match->result1, text[i]});
      if (match->result2 != 0) pieces.push_back({match->result2, text[i]});
    }
    return pieces;
  }
  static uint16_t alone(uint16_t u, uint32_t mode, bool single_byte) {
    const bool digit = (lx::unicode_type(u) & LX_C1_DIGIT) != 0 && lx::unicode_digit(u) != 0;
    if (mode == LX_MAP_DIGITS) return digit ? lx::unicode_digit(u) : u;
    if (mode == LX_MAP_FULL_WIDTH) return single_byte ? u : lx::unicode_half_to_full(u);
    if (mode == LX_MAP_HALF_WIDTH) return single_byte ? u : lx::unicode_full_to_half(u);
    if (mode == LX_MAP_LOWER || mode == LX_MAP_LOWER_SIMPLE) return lx::unicode_lower(u);
    return mode == LX_MAP_COPY ? u : lx::unicode_upper(u);
  }

  /// Compares for every size, of the input with its null, in a block of its own size.
  template <class Unit, class Call>
  static void check(const std::vector<std::vector<Unit>>& pieces, const Call& call) {
    size_t needed = 0;
    for (const auto& piece : pieces) needed += piece.size();
    for (size_t size = 0; size <= needed + 1; ++size) {
      std::vector<Unit> expected, output(size);
      for (const auto& piece : pieces) {
        if (expected.size() + piece.size() > size) break;
        expected.insert(expected.end(), piece.begin(), piece.end());
      }
      const int32_t result = call(output.data(), static_cast<int32_t>(size));
      ASSERT_EQ(result, static_cast<int32_t>(expected.size())) << "size " << size;
      output.resize(expected.size());
      ASSERT_EQ(output, expected) << "size " << size;
    }
  }

  void make_language(const LXObject& english) {
    namespace words = lx::format::language;
    payload_.assign(english.section[0], english.section[0] + 578);
    const auto add = [&](size_t count, size_t table, const std::vector<Special>& specials) {
      lx::put_le16(payload_.data() + 2 * count, static_cast<uint16_t>(specials.size()));
      lx::put_le16(payload_.data() + 2 * table, static_cast<uint16_t>(payload_.size()));
      for (const Special& s : specials)
        for (const uint16_t u : {s.first, s.second, s.result1, s.result2}) {
          payload_.push_back(static_cast<uint8_t>(u));
          payload_.push_back(static_cast<uint8_t>(u >> 8));
        }
    };
    add(words::kUpperSpecials, words::kUpperSpecialTable, kUpperSpecials);
    add(words::kLowerSpecials, words::kLowerSpecialTable, kLowerSpecials);
    language_ = english;
    language_.section[0] = payload_.data();
  }

  TinyLibrary library_{{lx::test::tiny_single(), sjis(), shift(), utf8()}};
  ByteString payload_;
  LXObject language_{};
  std::vector<std::pair<LXLocale*, LXObject*>> languages_;
};

TEST_F(Map, PlainAndWideFollowTheModel) {
  std::mt19937 random(1);
  for (const TinyCodepage& cp : {lx::test::tiny_single(), sjis(), utf8()}) {
    LXLocale* const in = locale(cp);
    for (int n = 0; n < 320 && !HasFatalFailure(); ++n) {
      const uint32_t mode = kModes[n % 8];
      Units text = random_text(&cp, &random);
      const std::string bytes = cp.encode(text);
      text.push_back(0);
      std::vector<LXWChar> codes;
      for (uint16_t u : text) codes.push_back(cp.find(u)->code);
      std::vector<std::vector<char>> pieces;
      std::vector<std::vector<LXWChar>> code_pieces;
      for (const Piece& piece : mapped(&cp, text, mode)) {
        const std::string one = cp.encode({piece.unicode});
        pieces.emplace_back(one.begin(), one.end());
        code_pieces.push_back({lx::pack(lx::bytes_of(one.data()), one.size())});
      }
      SCOPED_TRACE(cp.file.name + " mode " + std::to_string(mode) + " " + testing::PrintToString(text));
      check<char>(pieces,
                  [&](char* out, int32_t size) { return LXMapString(in, out, size, bytes.c_str(), -1, mode); });
      check<char>(pieces, [&](char* out, int32_t size) {
        return LXMapStringEx(in, out, size, bytes.c_str(), -1, mode);
      });
      check<LXWChar>(code_pieces, [&](LXWChar* out, int32_t size) {
        return LXMapStringW(in, out, size, codes.data(), -1, mode);
      });
      // In characters, within the bytes that are mapped that way.
      std::vector<char> out(1024);
      const size_t chars = std::min<size_t>(pieces.size(), 9);
      EXPECT_EQ(
          LXMapString(in, out.data(), static_cast<int32_t>(chars), bytes.c_str(), -1, mode | LX_CHARACTERS),
          static_cast<int32_t>(chars));
      std::string expected;
      for (size_t i = 0; i < chars; ++i) expected.append(pieces[i].begin(), pieces[i].end());
      EXPECT_EQ(std::string(out.data(), expected.size()), expected);
      EXPECT_EQ(out[expected.size()], 0);
    }
  }
}

TEST_F(Map, UnicodeFollowsTheModel) {
  std::mt19937 random(2);
  LXLocale* const in = locale(utf8());
  for (int n = 0; n < 320 && !HasFatalFailure(); ++n) {
    const uint32_t mode = kModes[n % 8];
    const Units text = random_text(nullptr, &random);
    std::vector<std::vector<uint16_t>> pieces;
    for (const Piece& piece : mapped(nullptr, text, mode)) pieces.push_back({piece.unicode});
    SCOPED_TRACE(testing::PrintToString(text) + " mode " + std::to_string(mode));
    check<uint16_t>(pieces, [&](LXUChar* out, int32_t size) {
      return LXMapStringU(in, out, size, text.data(), static_cast<int32_t>(text.size()), mode);
    });
  }
}

/// Every output is the longest valid text that fits and returns to the state of the input.
TEST_F(Map, ShiftStatesStayValid) {
  std::mt19937 random(3);
  const TinyCodepage cp = shift();
  LXLocale* const in = locale(cp);
  for (int n = 0; n < 400 && !HasFatalFailure(); ++n) {
    const uint32_t mode = kModes[n % 8];
    if (mode == LX_MAP_COPY) continue;
    const Units text = random_text(&cp, &random);
    LXShiftState input_end = LX_SHIFT_SINGLE;
    std::string input = cp.encode(text, &input_end);
    if (input_end == LX_SHIFT_DOUBLE && n % 2 == 0) input.push_back('\x0F'), input_end = LX_SHIFT_SINGLE;
    const std::vector<Piece> pieces = mapped(&cp, text, mode);
    SCOPED_TRACE(testing::PrintToString(text) + " mode " + std::to_string(mode));
    for (size_t size = 0; size < input.size() * 4 + 4; ++size) {
      std::string out(size, '\0');
      out.resize(static_cast<size_t>(LXMapStringEx(in, out.data(), static_cast<int32_t>(size), input.data(),
                                                   static_cast<int32_t>(input.size()), mode)));
      const size_t chars =
          static_cast<size_t>(LXNumCharsEx(in, out.data(), 0, static_cast<int32_t>(out.size())));
      ASSERT_LE(chars, pieces.size());
      Units expected;
      for (size_t i = 0; i < chars; ++i) expected.push_back(pieces[i].unicode);
      LXShiftState state = LX_SHIFT_SINGLE, wanted = LX_SHIFT_SINGLE;
      std::string bytes = cp.encode(expected, &state);
      if (chars != 0 && cp.find(pieces[chars - 1].source)->code > 0xFF) wanted = LX_SHIFT_DOUBLE;
      const bool last_fits = chars == pieces.size() && bytes.size() + (state != input_end) <= size;
      if (last_fits) wanted = input_end;
      // Where characters keep their width, a Shift-In goes before a character that does not fit.
      const bool cases = (mode & 4) != 0;
      if (cases && chars < pieces.size() && wanted == state && state == LX_SHIFT_DOUBLE &&
          cp.find(pieces[chars].source)->code <= 0xFF && bytes.size() < size)
        wanted = LX_SHIFT_SINGLE;
      if (state != wanted) bytes.push_back(wanted == LX_SHIFT_DOUBLE ? '\x0E' : '\x0F');
      ASSERT_EQ(testing::PrintToString(out), testing::PrintToString(bytes)) << "size " << size;
      ASSERT_TRUE(chars == pieces.size() || out.size() + 4 > size);
    }
  }
}

TEST_F(Map, CopyTakesWholeCharacters) {
  LXLocale* const in = locale(shift());
  const std::string text = "\xC1\x0E\x44\x47\x44\x48\x0F\xC2";
  const size_t copied[] = {0, 1, 1, 1, 4, 4, 6, 7, 8};  // by size; the Shift-Out does not come alone
  for (size_t size = 0; size < std::size(copied); ++size) {
    char out[16];
    EXPECT_EQ(LXMapStringEx(in, out, static_cast<int32_t>(size), text.data(), 8, LX_MAP_COPY),
              static_cast<int32_t>(copied[size]));
    EXPECT_EQ(text.compare(0, copied[size], out, copied[size]), 0);
  }
  char out[16];
  EXPECT_EQ(LXMapStringEx(in, out, 3, text.data(), -1, LX_MAP_COPY | LX_CHARACTERS), 3);
  EXPECT_EQ(std::string(out, 7), text.substr(0, 7));
}

TEST_F(Map, CodepageDoors) {
  locale(sjis());
  const LXObject* cp = library_.object(sjis());
  char out[4] = {};
  EXPECT_EQ(LXCpMbCaseConvW(cp, 0x8281, LX_C1_LOWER), 0x8260u);
  EXPECT_EQ(LXCpMbCaseConvW(cp, 0x8281, LX_C1_UPPER), 0x8281u);
  EXPECT_EQ(LXCpMbCaseConv(cp, "\x82\x60", out, LX_C1_UPPER), 2);
  EXPECT_STREQ(out, "\x82\x81");
  EXPECT_EQ(LXCpMbCaseConvS(cp, "\x82\x81", out, LX_C1_LOWER), 2);
  EXPECT_STREQ(out, "\x82\x60");
  EXPECT_EQ(LXCpMbHalfToFullW(cp, 0x8440), 0x84A0u);
  EXPECT_EQ(LXCpMbHalfToFullW(cp, 0x84A0), 0u);
  EXPECT_EQ(LXCpFullToHalfW(cp, 0x84A0), 0x8440u);
  EXPECT_EQ(LXCpFullToHalfW(cp, 0x8260), 'A');
  EXPECT_EQ(LXCpFullToHalfW(library_.object(lx::test::tiny_single()), 0x8260), 0u);
  LXLocale* const in = library_.locale(lx::test::tiny_single());
  const LXWChar given[] = {'a', 0x8140, 0};
  LXWChar mapped[3] = {};
  EXPECT_EQ(LXMapStringW(in, mapped, 3, given, 2, LX_MAP_UPPER_SIMPLE), 2);
  EXPECT_EQ(mapped[1], 0x8140u) << "what the codepage has not is copied";
}

TEST_F(Map, RefusedCallsTouchNothing) {
  LXLocale* const in = locale(sjis());
  char out[] = "x";
  for (uint32_t mode : {0u, 0x80000026u, 0x80002021u, 17u, 0x8000u}) {
    EXPECT_EQ(LXMapString(in, out, 1, "a", 1, mode), -1) << mode;
    EXPECT_EQ(LXGetError(in), LX_E_INVALID);
  }
  EXPECT_EQ(LXMapString(in, out, 1, "\x82", 1, LX_MAP_UPPER), 0);  // cut
  EXPECT_EQ(LXGetError(in), LX_OK);
  const LXUChar unit = 'a';
  LXUChar copy = 0;
  EXPECT_EQ(LXMapStringU(in, &copy, 1, &unit, 1, 0), 1);
  EXPECT_EQ(copy, 'a');
  EXPECT_EQ(LXUnicodeToUpper(in, 0xFF), 0x178);
  EXPECT_EQ(LXUnicodeToF2H(nullptr, LXUnicodeToH2F(nullptr, 'A')), 'A');
  for (const auto& [locale, language] : languages_) locale->language = language;
  languages_.clear();
  EXPECT_TRUE(library_.close());
  EXPECT_EQ(LXMapString(nullptr, out, 1, "a", 1, LX_MAP_UPPER), -1);
  EXPECT_STREQ(out, "x");
}

}  // namespace
