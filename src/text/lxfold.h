// What comparison, collation, keys and search may be asked to leave out of account: letter case, width, blanks
// at the end. The options, and what a character is folded to.
//
//                          options that fold    case                          width
//   LXStrcmp, Ex           any bits             small letters (1)             half-width forms
//   LXWcscmp               case                 small letters (1)             -
//   LXStrcmpU              any bits             capitals (1)                  half-width forms
//   LXStrcoll, LXStrxfrm,
//   Ex and W               case or width        small letters, special (2)    half-width forms (3)
//   U                      case or width        capitals, special (2)         half-width forms
//   LXStrstr and forms     any bits             capitals, special (2)         half-width forms
//
// any bits: all three bits of LX_WIDTH_INSENSITIVE are width, some of them are case.
// (1) Where the language has special mappings: the whole text in capitals, by LXMapString.
// (2) What a special mapping of the language gives, in capitals, comes first.
// (3) Of characters of several bytes alone.
//
// Existing keys, and the order that callers see, depend on each of these.
#pragma once

#include "codepage/lxtext.h"
#include "codepage/lxunicode.h"
#include "codepage/lxwidth.h"
#include "core/lxrecords.h"
#include "locale/lxlocale.h"
#include "lx/compare.h"
#include "text/lxequal.h"

namespace lx {

enum class Fold { kNone, kCase, kWidth };

/// The fold that options ask for, whatever else they hold: some but not all of its bits mean case.
inline Fold fold_of(uint32_t options) {
  const uint32_t fold = options & LX_WIDTH_INSENSITIVE;
  return fold == 0 ? Fold::kNone : fold == LX_WIDTH_INSENSITIVE ? Fold::kWidth : Fold::kCase;
}
/// Whether options are a whole fold, or none, and nothing else.
inline bool is_fold(uint32_t options) {
  return options == 0 || options == LX_CASE_INSENSITIVE || options == LX_WIDTH_INSENSITIVE;
}

/// A character of a text of such units: its packed code, or its Unicode value.
template <class Unit>
struct CharOf {
  using Type = LXWChar;
};
template <>
struct CharOf<LXUChar> {
  using Type = LXUChar;
};

// One character of either kind. What has no counterpart stays as it is.

inline LXUChar unicode_of(const Codepage& cp, LXWChar code) {
  return code_to_unicode(cp, code);
}
inline LXUChar unicode_of(const Codepage&, LXUChar u) {
  return u;
}
inline void put_unicode(const Codepage& cp, LXUChar u, LXWChar* code) {
  *code = unicode_to_code(cp, u);
}
inline void put_unicode(const Codepage&, LXUChar u, LXUChar* to) {
  *to = u;
}

inline const uint8_t* lower_table(const Codepage& cp) {
  return cp.payload + format::codepage::kLower;
}
inline LXWChar small_letter(const Codepage& cp, LXWChar code) {
  return code <= 0xFF ? lower_table(cp)[code] : other_case(type_record_of_code(cp, code), code, LX_C1_UPPER);
}
LXWChar capital(const Codepage& cp, LXWChar code);
inline LXUChar capital(const Codepage&, LXUChar u) {
  if (u >= 0x80) return unicode_upper(u);
  return static_cast<LXUChar>(u - (u >= 'a' && u <= 'z' ? 0x20 : 0));
}

inline LXWChar half_width(const Codepage& cp, LXWChar code) {
  const LXWChar half = WidthTables(cp).to_half(code);
  return half != 0 ? half : code;
}
inline LXUChar half_width(const Codepage&, LXUChar u) {
  return unicode_full_to_half(u);
}

/// A character in capitals, by the special mappings of a language or else alone, or in half width: one
/// character or two.
template <class Char>
struct Folded {
  Char values[2];
  int32_t count;

  Folded(const LXLocale& locale, Char c, Fold fold) : values{c, 0}, count(1) {
    const Codepage& cp = codepage_of(*locale.codepage);
    if (fold == Fold::kWidth) values[0] = half_width(cp, c);
    if (fold != Fold::kCase) return;
    LXUChar results[2] = {};
    count = specials_of(*locale.language, true).find(unicode_of(cp, c), 0, &results[0], &results[1]);
    for (int32_t i = 0; i < count; ++i) put_unicode(cp, results[i], &values[i]);
    if (count != 0) return;
    values[0] = capital(cp, c);
    count = 1;
  }
  bool same_as(const Folded& other) const {
    return count == other.count && values[0] == other.values[0] && (count == 1 || values[1] == other.values[1]);
  }
};

/// Whether a trace shows what the functions of comparison by code value do.
bool comparison_is_traced();

// Blanks.

inline uint8_t blank_of(const LXLocale& locale) {
  return keeps_ascii(locale) ? 0x20 : 0x40;
}
/// The full-width blank, or the blank where there is none, as a packed code and in Unicode.
void find_full_width_blank(const LXLocale& locale, LXWChar* code);
void find_full_width_blank(const LXLocale& locale, LXUChar* u);

/// The units before the blanks at the end, which are of two kinds, or of the same twice.
template <class Unit>
size_t without_blanks(const Unit* text, size_t units, Unit blank, Unit other) {
  while (units != 0 && (text[units - 1] == blank || text[units - 1] == other)) --units;
  return units;
}

/// Takes the blanks at the end out of the lengths of both texts, as truncating copies of them tells, `flags`
/// being those of LXTruncateString. Without memory for a copy, or where its size cannot be told, blanks count.
/// `second_as_long`: of the second text no more is looked at than the first one has left; what follows does not
/// count. Existing results depend on it.
void drop_blanks(LXLocale* locale, Form form, CountedText<uint8_t>* text1, CountedText<uint8_t>* text2,
                 uint32_t flags, bool second_as_long);

}  // namespace lx
