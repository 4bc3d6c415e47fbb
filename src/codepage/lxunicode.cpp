// Character types, case, width and digits of Unicode values. Each function is its list of ranges: fixed
// results, and tables generated from the Unicode character database. The ranges are those that existing data
// and programs rely on. They win over a newer database, and they are not symmetric: Georgian capitals have
// small letters, say, but no small letter leads back to them.
#include "codepage/lxunicode.h"

#include <cstddef>

#include "codepage/lxunicode_tables.inc"
#include "core/lxbytes.h"

namespace lx {

namespace {

constexpr bool in(uint16_t u, uint16_t first, uint16_t last) {
  return first <= u && u <= last;
}

constexpr uint16_t moved(uint16_t u, int32_t delta) {
  return static_cast<uint16_t>(u + delta);
}

/// The entry of `u`, at most kLast, in a table whose first entry stands for kBase and whose last for kLast.
template <uint16_t kBase, uint16_t kLast, typename T, size_t kEntries>
constexpr T entry(const T (&table)[kEntries], uint16_t u) {
  static_assert(kEntries == kLast - kBase + 1, "the table does not fit its range");
  return table[u - kBase];
}

// Type words of the ranges that have no table.
constexpr uint32_t kIdeograph = 0x40000801;         // alphabetic, left-to-right, ideograph
constexpr uint32_t kHangulSyllable = 0x00000801;    // alphabetic, left-to-right
constexpr uint32_t kArabicForm = 0x00001001;        // alphabetic, right-to-left
constexpr uint32_t kMathOperator = 0x02200020;      // punctuation, other neutral, symbol
constexpr uint32_t kMinusOrMinusPlus = 0x02008020;  // punctuation, European terminator, symbol
constexpr uint32_t kInfinity = 0x00200020;          // punctuation, other neutral; no symbol

constexpr uint32_t math_operator_type(uint16_t u) {
  if (u == 0x2212 || u == 0x2213) return kMinusOrMinusPlus;
  if (u == 0x221E) return kInfinity;
  return kMathOperator;
}

/// U+FBE9 and U+FCE1 are letters like their neighbours, but callers rely on their being unassigned.
constexpr uint32_t arabic_form_type(uint16_t u) {
  return u == 0xFBE9 || u == 0xFCE1 ? kTypeUnassigned : kArabicForm;
}

constexpr uint16_t lower_by_range(uint16_t u) {
  if (in(u, 0x0041, 0x005A)) return moved(u, 0x20);
  if (u < 0x00C0) return u;  // the rest of ASCII need not walk the list
  if (in(u, 0x00C0, 0x00DE)) return u == 0x00D7 ? u : moved(u, 0x20);
  if (in(u, 0x0100, 0x01FE)) return entry<0x0100, 0x01FE>(LX_UNICODE_Lower1, u);
  if (in(u, 0x0200, 0x0275)) return entry<0x0200, 0x0275>(LX_UNICODE_Lower2, u);
  if (in(u, 0x0386, 0x03EE)) return entry<0x0380, 0x03EE>(LX_UNICODE_Lower3, u);
  if (in(u, 0x0401, 0x04F8)) return entry<0x0400, 0x04F8>(LX_UNICODE_Lower4, u);
  if (in(u, 0x0531, 0x0556)) return moved(u, 0x30);
  if (in(u, 0x10A0, 0x10C5)) return moved(u, 0x30);
  if (in(u, 0x1E00, 0x1EF8)) return entry<0x1E00, 0x1EF8>(LX_UNICODE_Lower5, u);
  if (in(u, 0x1F08, 0x1FFC)) return entry<0x1F00, 0x1FFC>(LX_UNICODE_Lower6, u);
  if (in(u, 0x2160, 0x216F)) return moved(u, 0x10);
  if (in(u, 0x24B6, 0x24CF)) return moved(u, 0x1A);
  if (in(u, 0xFF21, 0xFF3A)) return moved(u, 0x20);
  return u;
}

constexpr uint16_t upper_by_range(uint16_t u) {
  if (in(u, 0x0061, 0x007A)) return moved(u, -0x20);
  if (u < 0x00E0) return u;  // the rest of ASCII need not walk the list
  if (in(u, 0x00E0, 0x00FE)) return u == 0x00F7 ? u : moved(u, -0x20);
  if (u == 0x00FF) return 0x0178;
  if (in(u, 0x0101, 0x01FF)) return entry<0x0100, 0x01FF>(LX_UNICODE_Upper1, u);
  if (in(u, 0x0200, 0x0292)) return entry<0x0200, 0x0292>(LX_UNICODE_Upper2, u);
  if (in(u, 0x03AC, 0x03F1)) return entry<0x03A0, 0x03F1>(LX_UNICODE_Upper3, u);
  if (in(u, 0x0430, 0x04F9)) return entry<0x0430, 0x04F9>(LX_UNICODE_Upper4, u);
  if (in(u, 0x0561, 0x0586)) return moved(u, -0x30);
  if (in(u, 0x1E01, 0x1EF9)) return entry<0x1E00, 0x1EF9>(LX_UNICODE_Upper5, u);
  if (in(u, 0x1F00, 0x1FF3)) return entry<0x1F00, 0x1FF3>(LX_UNICODE_Upper6, u);
  if (in(u, 0x2170, 0x217F)) return moved(u, -0x10);
  if (in(u, 0x24D0, 0x24E9)) return moved(u, -0x1A);
  if (in(u, 0xFF41, 0xFF5A)) return moved(u, -0x20);
  return u;
}

/// The pages that the ranges of case lie in.
constexpr uint8_t kCasePages[] = {0x00, 0x01, 0x02, 0x03, 0x04, 0x05, 0x10, 0x1E, 0x1F, 0x21, 0x24, 0xFF};

constexpr CaseTable make_case_table(bool upper) {
  static_assert(sizeof(kCasePages) + 1 == sizeof(CaseTable::delta) / sizeof(CaseTable::delta[0]));
  CaseTable table{};
  unsigned row = 0;  // the first one moves nothing
  for (const uint8_t page : kCasePages) {
    table.page[page] = static_cast<uint8_t>(++row);
    for (unsigned low = 0; low <= 0xFF; ++low) {
      const auto u = static_cast<uint16_t>(unsigned{page} << 8 | low);
      table.delta[row][low] = static_cast<uint16_t>((upper ? upper_by_range(u) : lower_by_range(u)) - u);
    }
  }
  return table;
}

}  // namespace

uint32_t unicode_type(uint16_t u) {
  // In the order of the values; each line ends its range.
  if (u <= 0x06F9) return entry<0x0000, 0x06F9>(LX_UNICODE_Ctype1, u);
  if (u <= 0x0900) return kTypeUnassigned;
  if (u <= 0x0EDD) return entry<0x0901, 0x0EDD>(LX_UNICODE_Ctype2, u);
  if (u <= 0x109F) return kTypeUnassigned;
  if (u <= 0x11F9) return entry<0x10A0, 0x11F9>(LX_UNICODE_Ctype3, u);
  if (u <= 0x1DFF) return kTypeUnassigned;
  if (u <= 0x21FF) return entry<0x1E00, 0x21FF>(LX_UNICODE_Ctype4, u);
  if (u <= 0x22F1) return math_operator_type(u);
  if (u <= 0x27BE) return entry<0x22F2, 0x27BE>(LX_UNICODE_Ctype5, u);
  if (u <= 0x2FFF) return kTypeUnassigned;
  if (u <= 0x33FE) return entry<0x3000, 0x33FE>(LX_UNICODE_Ctype6, u);
  if (u <= 0x4DFF) return kTypeUnassigned;
  if (u <= 0x9FA5) return kIdeograph;
  if (u <= 0xABFF) return kTypeUnassigned;
  if (u <= 0xD7A3) return kHangulSyllable;
  if (u <= 0xF8FF) return kTypeUnassigned;  // surrogates and private use included
  if (u <= 0xFA2D) return kIdeograph;
  if (u <= 0xFAFF) return kTypeUnassigned;
  if (u <= 0xFBD2) return entry<0xFB00, 0xFBD2>(LX_UNICODE_Ctype7, u);
  if (u <= 0xFD3D) return arabic_form_type(u);
  return entry<0xFD3E, 0xFFFF>(LX_UNICODE_Ctype8, u);
}

constexpr CaseTable kCaseTables[2] = {make_case_table(false), make_case_table(true)};

uint16_t unicode_half_to_full(uint16_t u) {
  if (in(u, 0x0021, 0x007E)) return moved(u, 0xFEE0);
  if (in(u, 0x00A2, 0x00AF)) return entry<0x00A0, 0x00AF>(LX_UNICODE_H2F1, u);
  if (in(u, 0xFF61, 0xFFEE)) return entry<0xFF60, 0xFFEE>(LX_UNICODE_H2F2, u);
  if (u == 0x0020) return 0x3000;
  if (u == 0x20A9) return 0xFFE6;
  return u;
}

uint16_t unicode_full_to_half(uint16_t u) {
  if (in(u, 0xFF01, 0xFF5E)) return moved(u, -0xFEE0);
  if (in(u, 0x2190, 0x2193)) return moved(u, 0xFFE9 - 0x2190);
  if (in(u, 0x2502, 0x25CB)) return entry<0x2500, 0x25CB>(LX_UNICODE_F2H1, u);
  if (in(u, 0x3000, 0x30FC)) return entry<0x3000, 0x30FC>(LX_UNICODE_F2H2, u);
  if (in(u, 0x3131, 0x3164)) return entry<0x3130, 0x3164>(LX_UNICODE_F2H3, u);
  if (in(u, 0xFFE0, 0xFFE6)) return entry<0xFFE0, 0xFFE6>(LX_UNICODE_F2H4, u);
  return u;
}

uint16_t unicode_digit(uint16_t u) {
  constexpr size_t kDigits = sizeof(LXDigits) / sizeof(LXDigits[0]);
  const size_t at = lower_bound(kDigits, [u](size_t i) { return LXDigits[i][0] < u; });
  return at != kDigits && LXDigits[at][0] == u ? LXDigits[at][1] : 0;
}

}  // namespace lx
