/* Lexicor: integers, doubles and currency amounts as text, by the conventions of a locale, and text read as
 * integers and doubles. */
#ifndef LX_NUMBER_H
#define LX_NUMBER_H

#include "lx/base.h"

#ifdef __cplusplus
extern "C" {
#endif

/* Flags of this header, beside those of lx/base.h. */
enum {
  LX_NATIONAL_DIGITS = 0x0010, /* reading: decimal digits of any script count as digits (LX_MAP_DIGITS) */
  LX_MONETARY = 0x0020,        /* reading: monetary separators, and the locale's sign texts */
  LX_INTERNATIONAL = 0x0040,   /* writing currency: international symbol and fraction digits */
  LX_UNSIGNED = 0x0080         /* integers: 32 bits without a sign */
};

/* Writing. Common to the functions of this half:
 *  size        bytes of `buffer`, with LX_CHARACTERS characters; in the W forms codes, in the U forms 16-bit
 *              units, and LX_CHARACTERS is ignored. LX_TERMINATE keeps one of them for a null, which is
 *              always stored.
 *  result      what was written, counted like the size, the null included; 0 with last error LX_E_SIZE when
 *              `size` is 0 or less; -1 with last error LX_E_INVALID for flags that a function does not list,
 *              with `buffer` untouched.
 *  too small   `buffer` holds the beginning of the text, as many whole characters as fit, and the last error
 *              is LX_E_SIZE.
 *  separators  one that has no single byte in the codepage is left out of byte strings; packed codes and
 *              16-bit Unicode have it.
 *  values      LX_TERRITORY_VALUES takes separators, grouping, digits, symbols, signs and their places from
 *              the territory and not from the locale's current values.
 *  W           the characters of the codepage as packed codes.
 *  U           digits, signs and parentheses are those of ASCII in any codepage.
 *  Ex          for a shift-sensitive codepage: the text begins in the given state, shift bytes are written
 *              where they are due, and it ends in the single-byte state; a character is written when a
 *              Shift-In that it makes due fits too. Shift bytes are no characters. */

/* Writes an integer with LX_ITEM_THOUSANDS and LX_ITEM_GROUPING of the locale. Flags: LX_TERRITORY_VALUES,
 * LX_TERMINATE, LX_UNSIGNED, LX_CHARACTERS. */
LX_API int32_t LXLongToString(LXLocale* locale, int32_t value, char* buffer, int32_t size, uint32_t flags);
/* As LXLongToString for a shift-sensitive codepage, from `state` on. */
LX_API int32_t LXLongToStringEx(LXLocale* locale, int32_t value, char* buffer, LXShiftState state, int32_t size,
                                uint32_t flags);
/* As LXLongToString; packed codes, `size` and the result count codes. */
LX_API int32_t LXLongToStringW(LXLocale* locale, int32_t value, LXWChar* buffer, int32_t size, uint32_t flags);
/* As LXLongToString; 16-bit Unicode, `size` and the result count units. */
LX_API int32_t LXLongToStringU(LXLocale* locale, int32_t value, LXUChar* buffer, int32_t size, uint32_t flags);

/* Writes a double with LX_ITEM_DECIMAL, LX_ITEM_THOUSANDS, LX_ITEM_GROUPING and LX_ITEM_DIGITS of the locale.
 * Its digits are those of printf's "%f", cut behind the fraction digits and not rounded again: 1.239 with 2
 * gives 1.23. More than 6 fraction digits give the first 5 of "%f" and then zeros, one digit less than asked
 * for. The decimal separator is written also without fraction digits. Minus zero has no sign; a negative value
 * that comes out as zero has one. Values that are not finite give inf, -inf and nan. Flags:
 * LX_TERRITORY_VALUES, LX_TERMINATE, LX_CHARACTERS. */
LX_API int32_t LXDoubleToString(LXLocale* locale, double value, char* buffer, int32_t size, uint32_t flags);
/* As LXDoubleToString for a shift-sensitive codepage, from `state` on. */
LX_API int32_t LXDoubleToStringEx(LXLocale* locale, double value, char* buffer, LXShiftState state,
                                  int32_t size, uint32_t flags);
/* As LXDoubleToString; packed codes, `size` and the result count codes. */
LX_API int32_t LXDoubleToStringW(LXLocale* locale, double value, LXWChar* buffer, int32_t size, uint32_t flags);
/* As LXDoubleToString; 16-bit Unicode, `size` and the result count units. */
LX_API int32_t LXDoubleToStringU(LXLocale* locale, double value, LXUChar* buffer, int32_t size, uint32_t flags);

/* Writes a currency amount: a double as LXDoubleToString writes it, with LX_ITEM_MONETARY_DECIMAL,
 * LX_ITEM_MONETARY_THOUSANDS and LX_ITEM_MONETARY_GROUPING, the currency symbol and its fraction digits
 * (LX_ITEM_CURRENCY, LX_ITEM_CURRENCY_DIGITS; with LX_INTERNATIONAL LX_ITEM_INTERNATIONAL_CURRENCY,
 * LX_ITEM_INTERNATIONAL_DIGITS), and the sign text (LX_ITEM_POSITIVE_SIGN, LX_ITEM_NEGATIVE_SIGN), all placed
 * as the items LX_ITEM_POSITIVE_PRECEDES to LX_ITEM_NEGATIVE_POSITION say for positive or for negative amounts;
 * a value that is not a number takes those for negative ones. A sign position above 4 is 4. Flags:
 * LX_TERRITORY_VALUES, LX_TERMINATE, LX_INTERNATIONAL, LX_CHARACTERS.
 *
 * With LX_CHARACTERS the text is made in six bytes for each character of `size`, at most 512, and then cut to
 * `size` characters (with LX_TERMINATE to one less and the null). The last error is LX_E_SIZE only when it did
 * not fit before the cut. `buffer` must have room for the bytes that `size` characters can take. */
LX_API int32_t LXCurrencyToString(LXLocale* locale, double value, char* buffer, int32_t size, uint32_t flags);
/* As LXCurrencyToString for a shift-sensitive codepage, from `state` on. */
LX_API int32_t LXCurrencyToStringEx(LXLocale* locale, double value, char* buffer, LXShiftState state,
                                    int32_t size, uint32_t flags);
/* As LXCurrencyToString; packed codes, `size` and the result count codes. */
LX_API int32_t LXCurrencyToStringW(LXLocale* locale, double value, LXWChar* buffer, int32_t size,
                                   uint32_t flags);
/* As LXCurrencyToString; 16-bit Unicode, `size` and the result count units. */
LX_API int32_t LXCurrencyToStringU(LXLocale* locale, double value, LXUChar* buffer, int32_t size,
                                   uint32_t flags);

/* Reads the first group size of a grouping text, the form of LX_ITEM_GROUPING and LX_ITEM_MONETARY_GROUPING:
 * decimal sizes with ";" between them, from the decimal point leftward; 0 repeats the size before it, and
 * behind the last one no group ends. `*remaining` is the number of bytes of the text. Returns the size
 * (2147483647 for a larger one); `*next` receives the place behind the ";", and `*remaining` is reduced by the
 * digits, not by the ";": a text without a null needs that taken off by the caller. At the end of the text
 * `*next` becomes null and `*remaining` 0. Returns -1, with both as they were, when the text is null or empty
 * or has another character. The last error becomes LX_OK. */
LX_API int32_t LXStrGroupingSize(LXLocale* locale, const char* text, int32_t* remaining, const char** next);
/* As LXStrGroupingSize; packed codes, `*remaining` counts codes. */
LX_API int32_t LXStrGroupingSizeW(LXLocale* locale, const LXWChar* text, int32_t* remaining,
                                  const LXWChar** next);
/* As LXStrGroupingSize; 16-bit Unicode, `*remaining` counts units. */
LX_API int32_t LXStrGroupingSizeU(LXLocale* locale, const LXUChar* text, int32_t* remaining,
                                  const LXUChar** next);

/* Reading. Common to the functions of this half:
 *  length       bytes, with LX_CHARACTERS characters; below 0: null-terminated. In the W forms codes, in the U
 *               forms 16-bit units, and LX_CHARACTERS is ignored. Nothing behind the text is read, but for the
 *               byte behind a text of so many characters of a shift-sensitive codepage.
 *  end          may be null; receives the place of the character or run of white space that ended the number,
 *               or the end of the text. With last error LX_E_INVALID or LX_E_BASE the beginning.
 *  white space  goes before everything: a thousands separator that is white space, such as U+00A0, ends the
 *               number.
 *  Ex           for a shift-sensitive codepage: the text begins in the state given behind its pointer. Shift
 *               bytes belong to the character behind them. */

/* Reads an integer: white space, a sign ("+" or "-", with LX_MONETARY LX_ITEM_POSITIVE_SIGN or
 * LX_ITEM_NEGATIVE_SIGN), digits of `base` and thousands separators (LX_ITEM_THOUSANDS, or
 * LX_ITEM_MONETARY_THOUSANDS) anywhere among them. A base of 0 is 16 where the digits begin with 0x, 8 where
 * they begin with 0, else 10. In base 16 a leading 0x is passed over, and so is one leading 0; what stands
 * behind it must be a digit, or the number is 0. Returns the number. A text without one gives 0, with `end` at
 * what stands in its place. A number beyond 32 bits gives the nearest value; with LX_UNSIGNED the result is to
 * be taken as a uint32_t, and a negative sign gives 0. The last error becomes LX_OK, LX_E_BASE (base neither 0
 * nor 2 to 36; the result is 0) or LX_E_INVALID (flags other than LX_TERRITORY_VALUES, LX_NATIONAL_DIGITS,
 * LX_MONETARY, LX_UNSIGNED and LX_CHARACTERS; the result is 0). */
LX_API int32_t LXStringToLong(LXLocale* locale, const char* text, int32_t length, const char** end,
                              int32_t base, uint32_t flags);
/* As LXStringToLong for a shift-sensitive codepage; the text begins in `state`. */
LX_API int32_t LXStringToLongEx(LXLocale* locale, const char* text, LXShiftState state, int32_t length,
                                const char** end, int32_t base, uint32_t flags);
/* As LXStringToLong; packed codes, `length` counts codes. */
LX_API int32_t LXStringToLongW(LXLocale* locale, const LXWChar* text, int32_t length, const LXWChar** end,
                               int32_t base, uint32_t flags);
/* As LXStringToLong; 16-bit Unicode, `length` counts units. */
LX_API int32_t LXStringToLongU(LXLocale* locale, const LXUChar* text, int32_t length, const LXUChar** end,
                               int32_t base, uint32_t flags);

/* Reads a double: white space, a sign as LXStringToLong does, digits with single thousands separators
 * (LX_ITEM_THOUSANDS, with LX_MONETARY LX_ITEM_MONETARY_THOUSANDS) among them, the decimal separator
 * (LX_ITEM_DECIMAL, or LX_ITEM_MONETARY_DECIMAL), fraction digits, and then an exponent: D, d, E or e, a sign
 * and digits. An exponent is read only behind a decimal separator: 1E5 is 1, and 1.E5 is 100000. Fraction
 * digits are added one by one, so that the last bit may differ from the nearest double. The last error becomes
 * LX_OK, or LX_E_INVALID (flags other than LX_TERRITORY_VALUES, LX_NATIONAL_DIGITS, LX_MONETARY and
 * LX_CHARACTERS; the result is 0). */
LX_API double LXStringToDouble(LXLocale* locale, const char* text, int32_t length, const char** end,
                               uint32_t flags);
/* As LXStringToDouble for a shift-sensitive codepage; the text begins in `state`. */
LX_API double LXStringToDoubleEx(LXLocale* locale, const char* text, LXShiftState state, int32_t length,
                                 const char** end, uint32_t flags);
/* As LXStringToDouble; packed codes, `length` counts codes. */
LX_API double LXStringToDoubleW(LXLocale* locale, const LXWChar* text, int32_t length, const LXWChar** end,
                                uint32_t flags);
/* As LXStringToDouble; 16-bit Unicode, `length` counts units. */
LX_API double LXStringToDoubleU(LXLocale* locale, const LXUChar* text, int32_t length, const LXUChar** end,
                                uint32_t flags);

/* What LXStrGetDigit finds, beside 0 to 35 for a digit or a letter and -1 for anything else. */
enum {
  LX_CLASS_POSITIVE = 40,  /* the positive sign */
  LX_CLASS_NEGATIVE = 41,  /* the negative sign */
  LX_CLASS_THOUSANDS = 42, /* the thousands separator */
  LX_CLASS_DECIMAL = 43,   /* the decimal separator */
  LX_CLASS_SPACE = 44      /* a run of white space */
};

/* The class of what stands at the beginning of `remaining` bytes (below 0: null-terminated) of text;
 * `new_position`, which may be null, receives the place behind it. With -1 nothing is consumed. Separators and
 * signs are null-terminated; of a separator the first byte counts, and a null pointer or an empty text matches
 * nothing. `ascii_compatible` 0: digits and letters are those of EBCDIC. `mode` is 0 or LX_NATIONAL_DIGITS; any
 * other value gives -1 and last error LX_E_INVALID. */
LX_API int32_t LXStrGetDigit(LXLocale* locale, const char* text, int32_t remaining, const char** new_position,
                             const char* thousands, const char* decimal, const char* positive,
                             const char* negative, int32_t ascii_compatible, uint32_t mode);
/* As LXStrGetDigit for a shift-sensitive codepage; the text begins in `state`. */
LX_API int32_t LXStrGetDigitEx(LXLocale* locale, const char* text, LXShiftState state, int32_t remaining,
                               const char** new_position, const char* thousands, const char* decimal,
                               const char* positive, const char* negative, int32_t ascii_compatible,
                               uint32_t mode);
/* As LXStrGetDigit; packed codes, `remaining` counts codes. */
LX_API int32_t LXStrGetDigitW(LXLocale* locale, const LXWChar* text, int32_t remaining,
                              const LXWChar** new_position, const LXWChar* thousands, const LXWChar* decimal,
                              const LXWChar* positive, const LXWChar* negative, int32_t ascii_compatible,
                              uint32_t mode);
/* As LXStrGetDigit; 16-bit Unicode, `remaining` counts units. `ascii_compatible` is ignored. */
LX_API int32_t LXStrGetDigitU(LXLocale* locale, const LXUChar* text, int32_t remaining,
                              const LXUChar** new_position, const LXUChar* thousands, const LXUChar* decimal,
                              const LXUChar* positive, const LXUChar* negative, int32_t ascii_compatible,
                              uint32_t mode);

/* One step of reading a double: from `state` (0 at first) by a class to the next state, or -1 where the number
 * ends. Begin with a value of 0, signs of 1 and exponents of 0. The number is `mantissa_sign` times `value`
 * times ten to the power of `exponent_sign` times `exponent`. */
LX_API int32_t LXStrDoubleNextState(int32_t state, int32_t char_class, double* value, int32_t* mantissa_sign,
                                    int32_t* fraction_exponent, int32_t* exponent_sign, int32_t* exponent);

#ifdef __cplusplus
}
#endif
#endif
