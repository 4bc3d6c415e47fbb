// Mapping of strings in all forms against one model that works on Unicode values: random texts with runs of
// ASCII, special mappings of one and two characters, every mode and every output size.
#include "codepage/lxunicode.h"
#include "core/lxrecords.h"
#include "support/case_test.h"
#include "support/chosen_vectors.h"
#include "support/conversion.h"
#include "support/slowness.h"

namespace lx::test {
namespace {

constexpr uint32_t kMappings[] = {LX_MAP_FULL_WIDTH, LX_MAP_HALF_WIDTH,   LX_MAP_COPY,         LX_MAP_LOWER,
                                  LX_MAP_UPPER,      LX_MAP_LOWER_SIMPLE, LX_MAP_UPPER_SIMPLE, LX_MAP_DIGITS};

/// One character of the result, and the first and the last character of the input that it comes from.
struct Piece {
  LXUChar unicode, first, source;
};

using lexicor_data::SpecialMapping;

class Map : public CaseTest {
 protected:
  LXLocale* locale(const TinyCodepage& cp) { return library.locale(cp, "Special"); }

  Units random_text(const TinyCodepage* cp) {
    const Units often{'i', 'j', 'q',  'r',    'I', 'J',    'Q',    'a',
                      'z', '7', 0xDF, 0x3042, 'h', 0x3043, 0xFF21, 0xFF41};
    Units text;
    const size_t length = below(70);
    while (text.size() < length) {
      LXUChar u = static_cast<LXUChar>(any(4) == 0 ? random() : 'a' + below(9));
      if (any(3) == 0) u = any_of(often);
      if (cp != nullptr && any(8) == 0) u = any_of(cp->characters).unicode;
      if (u != 0 && (cp == nullptr || cp->find(u) != nullptr)) text.push_back(u);
    }
    return text;
  }

  /// `cp` null: Unicode itself.
  static std::vector<Piece> mapped(const TinyCodepage* cp, const Units& text, uint32_t mode) {
    static const std::vector<SpecialMapping> none;
    const auto& specials = mode == LX_MAP_UPPER   ? special_language().special_upper
                           : mode == LX_MAP_LOWER ? special_language().special_lower
                                                  : none;
    std::vector<Piece> pieces;
    for (size_t i = 0; i < text.size(); ++i) {
      const SpecialMapping* match = nullptr;
      for (const bool pair : {false, true})
        for (const SpecialMapping& s : specials)
          if (match == nullptr && s.from[0] == text[i] && (s.from[1] != 0) == pair &&
              (!pair || (i + 1 < text.size() && s.from[1] == text[i + 1])))
            match = &s;
      if (match == nullptr) {
        const LXUChar u = alone(text[i], mode, cp != nullptr && cp->width == 1);
        // The tables of UTF-8 are those of all Unicode.
        const bool utf8 = cp != nullptr && cp->file.name == "UTF8";
        bool has = cp == nullptr || utf8 || cp->find(u) != nullptr;
        // A character of one byte has its other case among these, one of several between shift bytes too.
        const auto one_byte = [&](LXUChar c) { return utf8 ? c < 0x80 : cp->find(c)->code <= 0xFF; };
        if (cp != nullptr && has && (mode & 4) != 0)
          has = one_byte(text[i]) ? one_byte(u) : !cp->shift || !one_byte(u);
        pieces.push_back({has ? u : text[i], text[i], text[i]});
        continue;
      }
      if (match->from[1] != 0) ++i;
      pieces.push_back({match->to[0], match->from[0], text[i]});
      if (match->to[1] != 0) pieces.push_back({match->to[1], text[i], text[i]});
    }
    return pieces;
  }
  static LXUChar alone(LXUChar u, uint32_t mode, bool single_byte) {
    const bool digit = (unicode_type(u) & LX_C1_DIGIT) != 0 && unicode_digit(u) != 0;
    if (mode == LX_MAP_DIGITS) return digit ? unicode_digit(u) : u;
    if (mode == LX_MAP_FULL_WIDTH) return single_byte ? u : unicode_half_to_full(u);
    if (mode == LX_MAP_HALF_WIDTH) return single_byte ? u : unicode_full_to_half(u);
    if (mode == LX_MAP_LOWER || mode == LX_MAP_LOWER_SIMPLE) return unicode_lower(u);
    return mode == LX_MAP_COPY ? u : unicode_upper(u);
  }

  /// Compares for every size, of the input with its null, in a block of its own size. The Unicode form knows
  /// no codepage.
  template <class F>
  void follow_model(const F& form, const TinyCodepage& cp, Units text, uint32_t mode) {
    using Unit = typename F::Unit;
    SCOPED_TRACE(cp.file.name + " " + form.name + " mode " + std::to_string(mode) + " " + shown(text));
    text.push_back(0);
    const std::vector<Unit> input = Encoded<F>(cp, text).units;
    OutputModel<Unit> model;
    model.null_terminated = model.null_converted = true;
    for (const Piece& piece : mapped(std::is_same_v<F, Unicode> ? nullptr : &cp, text, mode))
      model.pieces.push_back(Encoded<F>(cp, {piece.unicode}).units);
    expect_at_every_size(model, 0, [&](Unit* out, int32_t size, int32_t) {
      return form.map(locale(cp), out, size, input.data(), -1, mode);
    });
    if constexpr (!std::is_same_v<F, Plain>) return;
    // In characters, within the bytes that are mapped that way.
    std::vector<Unit> expected, out(1024);
    const size_t chars = std::min<size_t>(model.pieces.size(), 9);
    for (size_t i = 0; i < chars; ++i)
      expected.insert(expected.end(), model.pieces[i].begin(), model.pieces[i].end());
    const auto size = static_cast<int32_t>(chars);
    EXPECT_EQ(form.map(locale(cp), out.data(), size, input.data(), -1, mode | LX_CHARACTERS), size);
    EXPECT_EQ(out[expected.size()], 0);
    out.resize(expected.size());
    EXPECT_EQ(out, expected);
  }
};

TEST_F(Map, EveryFormFollowsTheModel) {
  for (const TinyCodepage& cp : case_codepages()) {
    if (cp.shift || cp.file.name == "ODD") continue;
    for (int n = 0; n < 320 / kSlowness && !HasFatalFailure(); ++n) {
      const uint32_t mode = kMappings[n % 8];
      const ChosenVectors vectors(static_cast<size_t>(n / 8));
      const Units text = random_text(&cp);
      follow_model(kPlain, cp, text, mode);
      follow_model(kEx, cp, text, mode);
      follow_model(kWide, cp, text, mode);
      if (cp.file.name == "UTF8") follow_model(kUnicode, cp, random_text(nullptr), mode);
    }
  }
}

/// A block of UTF-8 knows one special mapping of a character of two bytes: Kana has two. Those of Long are of characters
/// whose first bytes begin none that has case.
TEST_F(Map, SpecialMappingsInLongText) {
  const std::string run(40, 'B'), other(40, 'b');
  const std::pair<const char*, std::string> cases[] = {{"Kana", run + "\u00C4" + run + "\u00D6" + run},
                                                       {"Long", run + "\u05D0" + run + "\u3042" + run}};
  for (const auto& [language, text] : cases)
    for (size_t n = 0; n < kMostVectors; ++n) {
      const ChosenVectors vectors(n);
      char out[200] = {};
      LXMapString(library.locale(case_codepage("UTF8"), language), out, 200, text.c_str(), -1, LX_MAP_LOWER);
      EXPECT_EQ(out, other + 'q' + other + 'w' + other) << language;
    }
}

/// Every output is the longest valid text that fits and returns to the state of the input.
TEST_F(Map, ShiftStatesStayValid) {
  const TinyCodepage& cp = case_codepage("SHIFT");
  LXLocale* const in = locale(cp);
  for (int n = 0; n < 400 / kSlowness && !HasFatalFailure(); ++n) {
    const uint32_t mode = kMappings[n % 8];
    if (mode == LX_MAP_COPY) continue;
    const Units text = random_text(&cp);
    LXShiftState input_end = LX_SHIFT_SINGLE;
    std::string input = cp.encode({text.begin(), text.end()}, &input_end);
    if (input_end == LX_SHIFT_DOUBLE && n % 2 == 0) input.push_back('\x0F'), input_end = LX_SHIFT_SINGLE;
    const std::vector<Piece> pieces = mapped(&cp, text, mode);
    SCOPED_TRACE(shown(text) + " mode " + std::to_string(mode));
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
      std::string bytes = cp.encode({expected.begin(), expected.end()}, &state);
      if (chars != 0 && cp.find(pieces[chars - 1].source)->code > 0xFF) wanted = LX_SHIFT_DOUBLE;
      const bool last_fits = chars == pieces.size() && bytes.size() + (state != input_end) <= size;
      if (last_fits) wanted = input_end;
      // Where characters keep their width, a Shift-In goes before a character that does not fit.
      const bool cases = (mode & 4) != 0;
      if (cases && chars < pieces.size() && wanted == state && state == LX_SHIFT_DOUBLE &&
          cp.find(pieces[chars].first)->code <= 0xFF && bytes.size() < size)
        wanted = LX_SHIFT_SINGLE;
      if (state != wanted) bytes.push_back(wanted == LX_SHIFT_DOUBLE ? '\x0E' : '\x0F');
      ASSERT_EQ(testing::PrintToString(out), testing::PrintToString(bytes)) << "size " << size;
      ASSERT_TRUE(chars == pieces.size() || out.size() + 4 > size);
    }
  }
}

TEST_F(Map, CodepageDoors) {
  const LXObject* const cp = locale(case_codepage("SJIS"))->codepage;
  LXLocale* const single = locale(case_codepage("SINGLE"));
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
  EXPECT_EQ(LXCpFullToHalfW(single->codepage, 0x8260), 0u);
  const LXWChar given[] = {'a', 0x8140, 0};
  LXWChar mapped[3] = {};
  EXPECT_EQ(LXMapStringW(single, mapped, 3, given, 2, LX_MAP_UPPER_SIMPLE), 2);
  EXPECT_EQ(mapped[1], 0x8140u) << "what the codepage has not is copied";
  EXPECT_EQ(LXUnicodeToUpper(single, 0xFF), 0x178);
  EXPECT_EQ(LXUnicodeToF2H(single, LXUnicodeToH2F(single, 'A')), 'A');
}

/// With LX_CHARACTERS at most 512 bytes are mapped, and six for each character of the size.
TEST_F(Map, WorkBufferOfCharacters) {
  LXLocale* const in = locale(case_codepage("SINGLE"));
  const std::string text(600, 'a');
  char out[700];
  EXPECT_EQ(LXMapString(in, out, 600, text.c_str(), -1, LX_MAP_UPPER | LX_CHARACTERS), 512);
  EXPECT_EQ(std::string(out, 512), std::string(512, 'A'));
}

}  // namespace
}  // namespace lx::test
