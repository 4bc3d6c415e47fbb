// Types, case, width and digits of all 65,536 values against ICU, which takes them from the same version of
// Unicode by another way. What the library does differently stands here as rules, each with its reason.
#include <gtest/gtest.h>
#include <unicode/uchar.h>
#include <unicode/unorm2.h>
#include <unicode/uscript.h>

#include <map>
#include <string>

#include "codepage/lxunicode.h"
#include "lx/codepage.h"

namespace {

struct Span {
  uint32_t first, last;
};

template <size_t kSpans>
bool in(const Span (&spans)[kSpans], uint32_t u) {
  for (const Span& span : spans)
    if (span.first <= u && u <= span.last) return true;
  return false;
}

/// Compares all values, and shows the first that differ.
template <class Got, class Expected>
void expect_all(const char* what, Got got, Expected expected) {
  int32_t differences = 0;
  for (uint32_t u = 0; u <= 0xFFFF; ++u) {
    const uint32_t value = got(static_cast<uint16_t>(u)), wanted = expected(u);
    if (value != wanted && ++differences <= 20)
      ADD_FAILURE() << what << std::hex << " U+" << u << ": " << value << " instead of " << wanted;
  }
  EXPECT_EQ(differences, 0) << what;
}

// Whole blocks without types: those that Unicode filled later, and scripts that the tables never covered. Among
// them are also surrogates and the private use area.
constexpr Span kWithoutTypes[] = {{0x06FA, 0x0900}, {0x0EDE, 0x109F}, {0x11FA, 0x1DFF}, {0x27BF, 0x2FFF},
                                  {0x33FF, 0x4DFF}, {0x9FA6, 0xABFF}, {0xD7A4, 0xF8FF}, {0xFA2E, 0xFAFF}};

bool has_type(uint32_t u) {
  const bool exception = u == 0xFBE9 || u == 0xFCE1;  // letters that callers know as unassigned
  return u_isdefined(static_cast<UChar32>(u)) && !in(kWithoutTypes, u) && !exception;
}

bool is(uint32_t u, UProperty property) {
  return u_hasBinaryProperty(static_cast<UChar32>(u), property);
}

int32_t value(uint32_t u, UProperty property) {
  return u_getIntPropertyValue(static_cast<UChar32>(u), property);
}

bool is_mapped_digit(uint32_t u) {
  const int32_t decomposition = value(u, UCHAR_DECOMPOSITION_TYPE);
  if (decomposition == U_DT_SUPER || decomposition == U_DT_SUB)
    return value(u, UCHAR_NUMERIC_TYPE) == U_NT_DIGIT;
  UVersionInfo age;
  u_charAge(static_cast<UChar32>(u), age);
  // Digits of scripts that came after Unicode 2.0 have no ASCII digit.
  return u_charType(static_cast<UChar32>(u)) == U_DECIMAL_DIGIT_NUMBER &&
         (age[0] < 2 || (age[0] == 2 && !age[1]));
}

uint32_t classification(uint32_t u) {
  const auto c = static_cast<UChar32>(u);
  const uint32_t mask = U_MASK(u_charType(c));
  const bool alphabetic = is(u, UCHAR_ALPHABETIC);  // circled letters and many vowel signs included
  // The soft hyphen and the number signs of Arabic are format characters that show.
  const bool visible_format = u == 0x00AD || is(u, UCHAR_PREPENDED_CONCATENATION_MARK);
  uint32_t bits = u < 0x80 ? LX_C1_ASCII : 0;
  if (alphabetic) bits |= LX_C1_ALPHA;
  if (is(u, UCHAR_UPPERCASE)) bits |= LX_C1_UPPER;
  if (is(u, UCHAR_LOWERCASE)) bits |= LX_C1_LOWER;
  if (is_mapped_digit(u))
    bits |= LX_C1_DIGIT;
  else if (!alphabetic && (mask & (U_GC_P_MASK | U_GC_S_MASK | U_GC_N_MASK)))
    bits |= LX_C1_PUNCT;
  if (is(u, UCHAR_HEX_DIGIT)) bits |= LX_C1_XDIGIT;
  if (is(u, UCHAR_WHITE_SPACE)) bits |= LX_C1_SPACE;
  if (u_isblank(c)) bits |= LX_C1_BLANK;
  if (visible_format) bits |= LX_C1_PUNCT;
  if ((mask & (U_GC_CC_MASK | U_GC_CF_MASK | U_GC_ZL_MASK | U_GC_ZP_MASK)) && !visible_format)
    bits |= LX_C1_CNTRL;
  return bits;
}

uint32_t bidi_category(uint32_t u) {
  // The assignment in which the solidus separates numbers, and plus and minus end them.
  if (u == '/' || u == 0xFF0F) return LX_C2_EUROPEAN_SEPARATOR;
  static const std::map<UCharDirection, uint32_t> categories = {
      {U_LEFT_TO_RIGHT, LX_C2_LEFT_TO_RIGHT},
      {U_RIGHT_TO_LEFT, LX_C2_RIGHT_TO_LEFT},
      {U_RIGHT_TO_LEFT_ARABIC, LX_C2_RIGHT_TO_LEFT},
      {U_EUROPEAN_NUMBER, LX_C2_EUROPEAN_NUMBER},
      {U_EUROPEAN_NUMBER_SEPARATOR, LX_C2_EUROPEAN_TERMINATOR},
      {U_EUROPEAN_NUMBER_TERMINATOR, LX_C2_EUROPEAN_TERMINATOR},
      {U_ARABIC_NUMBER, LX_C2_ARABIC_NUMBER},
      {U_COMMON_NUMBER_SEPARATOR, LX_C2_COMMON_SEPARATOR},
      {U_BLOCK_SEPARATOR, LX_C2_BLOCK_SEPARATOR},
      {U_SEGMENT_SEPARATOR, LX_C2_SEGMENT_SEPARATOR},
      {U_WHITE_SPACE_NEUTRAL, LX_C2_WHITE_SPACE},
      {U_OTHER_NEUTRAL, LX_C2_OTHER_NEUTRAL},
      // No category of their own: marks and isolates act as neutrals, embeddings and overrides as nothing.
      {U_DIR_NON_SPACING_MARK, LX_C2_OTHER_NEUTRAL},
      {U_FIRST_STRONG_ISOLATE, LX_C2_OTHER_NEUTRAL},
      {U_LEFT_TO_RIGHT_ISOLATE, LX_C2_OTHER_NEUTRAL},
      {U_RIGHT_TO_LEFT_ISOLATE, LX_C2_OTHER_NEUTRAL},
      {U_POP_DIRECTIONAL_ISOLATE, LX_C2_OTHER_NEUTRAL}};
  const auto found = categories.find(u_charDirection(static_cast<UChar32>(u)));
  return found != categories.end() ? found->second : uint32_t{LX_C2_NONE};
}

/// Whether the canonical decomposition of a letter holds a mark.
bool is_accented_letter(uint32_t u) {
  if (!u_isalpha(static_cast<UChar32>(u))) return false;
  UErrorCode error = U_ZERO_ERROR;
  UChar parts[16];
  const int32_t units =
      unorm2_getDecomposition(unorm2_getNFDInstance(&error), static_cast<UChar32>(u), parts, 16, &error);
  for (int32_t n = 0; n < units; ++n)
    if (U_MASK(u_charType(parts[n])) & (U_GC_MN_MASK | U_GC_ME_MASK)) return true;
  return false;
}

bool is_vowel_mark(uint32_t u) {
  const uint8_t ccc = u_getCombiningClass(static_cast<UChar32>(u));
  return value(u, UCHAR_INDIC_SYLLABIC_CATEGORY) == U_INSC_VOWEL_DEPENDENT ||
         (10 <= ccc && ccc <= 20) ||                          // Hebrew sheva to qubuts
         (27 <= ccc && ccc <= 32) || ccc == 34 || ccc == 35;  // Arabic, without shadda (33)
}

/// The bits of the kana scripts, for characters that are used with nothing else.
uint32_t kana(uint32_t u) {
  UErrorCode error = U_ZERO_ERROR;
  UScriptCode scripts[32];
  const int32_t count = uscript_getScriptExtensions(static_cast<UChar32>(u), scripts, 32, &error);
  uint32_t bits = 0;
  for (int32_t n = 0; n < count; ++n) {
    if (scripts[n] == USCRIPT_KATAKANA)
      bits |= LX_C3_KATAKANA;
    else if (scripts[n] == USCRIPT_HIRAGANA)
      bits |= LX_C3_HIRAGANA;
    else
      return 0;
  }
  return bits;
}

uint32_t text_properties(uint32_t u) {
  const uint32_t mask = U_MASK(u_charType(static_cast<UChar32>(u)));
  const int32_t width = value(u, UCHAR_EAST_ASIAN_WIDTH);
  const bool ascii_accent = u == '^' || u == '`' || u == 0xFF3E || u == 0xFF40;  // plain punctuation
  uint32_t bits = kana(u);
  if ((mask & (U_GC_MN_MASK | U_GC_ME_MASK)) || is_accented_letter(u))
    bits |= LX_C3_NON_SPACING | LX_C3_DIACRITIC;
  if (is(u, UCHAR_DIACRITIC) && !ascii_accent) bits |= LX_C3_DIACRITIC;
  if (is_vowel_mark(u)) bits |= LX_C3_VOWEL_MARK;
  // Infinity is the one operator that programs do not find among the symbols.
  if ((classification(u) & LX_C1_PUNCT || mask & U_GC_ZS_MASK) && u != 0x221E) bits |= LX_C3_SYMBOL;
  if (width == U_EA_NARROW || width == U_EA_HALFWIDTH) bits |= LX_C3_HALF_WIDTH;
  if (width == U_EA_FULLWIDTH) bits |= LX_C3_FULL_WIDTH;
  if (is(u, UCHAR_IDEOGRAPHIC)) bits |= LX_C3_IDEOGRAPH;
  if (u == 0x0640) bits |= LX_C3_KASHIDA;
  return bits;
}

TEST(UnicodeOracle, VersionIsTheSame) {
  UVersionInfo version;
  u_getUnicodeVersion(version);
  ASSERT_EQ(version[0], 15) << "the tables and ICU follow different versions of Unicode";
}

TEST(UnicodeOracle, Types) {
  const auto known = [](auto rule, uint32_t otherwise) {
    return [=](uint32_t u) { return has_type(u) ? rule(u) : otherwise; };
  };
  expect_all(
      "classification", [](uint16_t u) { return lx::unicode_type(u) & 0x3FF; }, known(classification, 0));
  expect_all(
      "bidirectional category", [](uint16_t u) { return lx::unicode_type(u) >> 10 & 0xFFF; },
      known(bidi_category, LX_C2_NONE));
  expect_all(
      "text properties", [](uint16_t u) { return lx::unicode_type(u) >> 22; }, known(text_properties, 0));
}

TEST(UnicodeOracle, Case) {
  // Outside these ranges nothing has a case: neither alphabets that got one later nor letter-like signs.
  const Span lowered[] = {{0x0041, 0x005A}, {0x00C0, 0x0275}, {0x0386, 0x03EE}, {0x0401, 0x04F8},
                          {0x0531, 0x0556}, {0x1E00, 0x1EF8}, {0x1F08, 0x1FFC}, {0x2160, 0x216F},
                          {0x24B6, 0x24CF}, {0xFF21, 0xFF3A}};
  const Span raised[] = {{0x0061, 0x007A}, {0x00E0, 0x0292}, {0x03AC, 0x03F1}, {0x0430, 0x04F9},
                         {0x0561, 0x0586}, {0x1E01, 0x1EF9}, {0x1F00, 0x1FF3}, {0x2170, 0x217F},
                         {0x24D0, 0x24E9}, {0xFF41, 0xFF5A}};
  // Old Georgian capitals go to the modern letters; ICU sends them to the small letters of their own kind.
  const Span georgian[] = {{0x10A0, 0x10C5}};
  expect_all("lower case", lx::unicode_lower, [&](uint32_t u) {
    const auto c = static_cast<UChar32>(u);
    return in(georgian, u) ? u + 0x30 : in(lowered, u) ? static_cast<uint32_t>(u_tolower(c)) : u;
  });
  expect_all("upper case", lx::unicode_upper, [&](uint32_t u) {
    return in(raised, u) ? static_cast<uint32_t>(u_toupper(static_cast<UChar32>(u))) : u;
  });
}

TEST(UnicodeOracle, Width) {
  UErrorCode error = U_ZERO_ERROR;
  const UNormalizer2* nfkc = unorm2_getNFKCInstance(&error);
  ASSERT_TRUE(U_SUCCESS(error));
  static uint32_t to_full[0x10000], to_half[0x10000];
  for (uint32_t u = 0; u <= 0xFFFF; ++u) to_full[u] = to_half[u] = u;
  for (uint32_t u = 0; u <= 0xFFFF; ++u) {
    if (u == 0xFF5F || u == 0xFF60) continue;  // white parentheses: their other form came later
    UChar other[4];
    const int32_t type = value(u, UCHAR_DECOMPOSITION_TYPE);
    if (type != U_DT_WIDE && type != U_DT_NARROW) continue;
    ASSERT_EQ(unorm2_getRawDecomposition(nfkc, static_cast<UChar32>(u), other, 4, &error), 1);
    to_full[type == U_DT_WIDE ? other[0] : u] = type == U_DT_WIDE ? u : other[0];
    to_half[type == U_DT_WIDE ? u : other[0]] = type == U_DT_WIDE ? other[0] : u;
  }
  expect_all("half to full width", lx::unicode_half_to_full, [](uint32_t u) { return to_full[u]; });
  expect_all("full to half width", lx::unicode_full_to_half, [](uint32_t u) { return to_half[u]; });
}

TEST(UnicodeOracle, Digits) {
  expect_all("digits", lx::unicode_digit, [](uint32_t u) {
    const auto number = static_cast<uint32_t>(u_getNumericValue(static_cast<UChar32>(u)));
    return is_mapped_digit(u) ? '0' + number : 0;
  });
}

}  // namespace
