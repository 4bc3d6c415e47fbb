/* Lexicor: locale items: every text and number that a locale can be asked for, and those that it can be given.
 */
#ifndef LX_ITEM_H
#define LX_ITEM_H

#include "lx/base.h"

#ifdef __cplusplus
extern "C" {
#endif

/* Items. In the order of the numbers: those marked # are numbers, all others texts; those marked * can be
 * set. A range stands as its first item; the n-th after it is its first item plus n. */
enum LXItem {
  LX_ITEM_LANGUAGE_ID = 1,             /* #* identifier of the language object */
  LX_ITEM_LANGUAGE = 2,                /* * its name */
  LX_ITEM_LANGUAGE_ABBREVIATION = 3,   /* */
  LX_ITEM_LANGUAGE_NAME = 4,           /* full name, in the language itself */
  LX_ITEM_TERRITORY_ID = 5,            /* #* */
  LX_ITEM_TERRITORY = 6,               /* * */
  LX_ITEM_TERRITORY_ABBREVIATION = 7,  /* */
  LX_ITEM_TERRITORY_NAME = 8,          /* full name */
  LX_ITEM_CODEPAGE_ID = 9,             /* #* */
  LX_ITEM_CODEPAGE = 10,               /* * */
  LX_ITEM_SORT_ID = 11,                /* #* 0: binary order */
  LX_ITEM_SORT = 12,                   /* * "Binary" for binary order */
  LX_ITEM_DEFAULT_TERRITORY = 13,      /* names of the language's defaults */
  LX_ITEM_DEFAULT_CODEPAGE = 14,       /* */
  LX_ITEM_DEFAULT_SORT = 15,           /* */
  LX_ITEM_DAY = 16,                    /* 16-22: days, Sunday first */
  LX_ITEM_SHORT_DAY = 23,              /* 23-29: abbreviated */
  LX_ITEM_MONTH = 30,                  /* 30-42: 13 months, the last empty in calendars of twelve */
  LX_ITEM_SHORT_MONTH = 43,            /* 43-55: abbreviated */
  LX_ITEM_MORNING = 56,                /* marker of the hours before noon */
  LX_ITEM_AFTERNOON = 57,              /* */
  LX_ITEM_FLAG_58 = 58,                /* # 0 or 1, a territory flag */
  LX_ITEM_DECIMAL = 59,                /* * separators are single characters */
  LX_ITEM_THOUSANDS = 60,              /* * */
  LX_ITEM_LIST = 61,                   /* * */
  LX_ITEM_GROUPING = 62,               /* * group sizes from the right, "3;0": threes throughout */
  LX_ITEM_DIGITS = 63,                 /* #* fraction digits of a number */
  LX_ITEM_CURRENCY = 64,               /* * local currency symbol */
  LX_ITEM_INTERNATIONAL_CURRENCY = 65, /* */
  LX_ITEM_MONETARY_DECIMAL = 66,       /* * */
  LX_ITEM_MONETARY_THOUSANDS = 67,     /* * */
  LX_ITEM_MONETARY_GROUPING = 68,      /* * */
  LX_ITEM_CURRENCY_DIGITS = 69,        /* #* fraction digits of a local currency amount */
  LX_ITEM_INTERNATIONAL_DIGITS = 70,   /* #* fraction digits of an international currency amount */
  LX_ITEM_POSITIVE_SIGN = 71,          /* * */
  LX_ITEM_NEGATIVE_SIGN = 72,          /* * */
  LX_ITEM_POSITIVE_PRECEDES = 73,      /* #* 1: the currency symbol precedes a positive amount */
  LX_ITEM_POSITIVE_SPACE = 74,         /* #* 1: a space between symbol and positive amount */
  LX_ITEM_NEGATIVE_PRECEDES = 75,      /* #* the same for negative amounts */
  LX_ITEM_NEGATIVE_SPACE = 76,         /* #* */
  LX_ITEM_POSITIVE_POSITION = 77,      /* #* place of the sign: 0 parentheses, 1 before everything, 2 after */
  LX_ITEM_NEGATIVE_POSITION = 78,      /*    everything, 3 before the symbol, 4 behind it */
  LX_ITEM_TIME_FORMAT = 79,            /* * */
  LX_ITEM_SHORT_DATE_FORMAT = 80,      /* * */
  LX_ITEM_LONG_DATE_FORMAT = 81,       /* * */
  LX_ITEM_FLAG_82 = 82,                /* #* 0 or 1, territory flags */
  LX_ITEM_FLAG_83 = 83,                /* #* */
  LX_ITEM_VALUE_84 = 84,               /* # a number of the territory */
  LX_ITEM_CODEPAGE_WIDTH = 85,         /* # bytes of a character: the longest, or in the double-byte state */
  LX_ITEM_CODEPAGE_ASCII = 86,         /* # 1: invariant ASCII characters have their ASCII byte values */
  LX_ITEM_CODEPAGE_SHIFT = 87,         /* # 1: the codepage is shift-sensitive */
  LX_ITEM_LOCALE_STRING = 88           /* language_territory.codepage@sort */
};

/* An item whose locale has a copy of its own (those that can be set, from 59 on) is read from the locale's
 * current value, or with LX_TERRITORY_VALUES from the territory. Day and month names, names of objects and
 * so on have one value only. */

/* The value of a number item, or -1 with last error LX_E_ITEM (not a number item) or LX_E_INVALID (flags other
 * than LX_TERRITORY_VALUES). */
LX_API int32_t LXGetLocaleNumInfo(LXLocale* locale, int32_t item, int32_t flags);

/* Sets a number item of this locale alone. A new LX_ITEM_TERRITORY_ID recomputes the values that the caller has
 * not set, a new LX_ITEM_CODEPAGE_ID converts all of them. Returns 1, or 0 with last error LX_E_ITEM (not a number
 * item, or one that cannot be set), LX_E_NOT_FOUND (value refused, no such object), LX_E_SEPARATOR (a separator has
 * no single byte in the new codepage) or LX_E_MEMORY; the locale is then as it was. */
LX_API int32_t LXSetLocaleNumInfo(LXLocale* locale, int32_t item, int32_t value);

/* Copies a text item into `buffer` of `size` bytes in the locale's codepage, cut at a whole character and
 * always null-terminated. With LX_CHARACTERS `size` counts characters with the null, and `buffer` must hold the
 * bytes that those can take. Separators take part with one character; one that has no single byte in the
 * codepage reads as an empty text. Returns the bytes (characters) written with the null; 0 when `size` is 0; -1
 * with last error LX_E_ITEM (no such text item; LX_ITEM_DEFAULT_TERRITORY to LX_ITEM_DEFAULT_SORT: the
 * directory has no such object) or LX_E_INVALID (other flags than LX_TERRITORY_VALUES and LX_CHARACTERS). */
LX_API int32_t LXGetLocaleTextInfo(LXLocale* locale, int32_t item, char* buffer, int32_t size, int32_t flags);
/* As LXGetLocaleTextInfo; writes packed codes, `size` and the result count codes. LX_CHARACTERS is ignored. */
LX_API int32_t LXGetLocaleTextInfoW(LXLocale* locale, int32_t item, LXWChar* buffer, int32_t size,
                                    int32_t flags);
/* As LXGetLocaleTextInfo; writes 16-bit Unicode, `size` and the result count units. LX_CHARACTERS is
 * ignored. */
LX_API int32_t LXGetLocaleTextInfoU(LXLocale* locale, int32_t item, LXUChar* buffer, int32_t size,
                                    int32_t flags);
/* As LXGetLocaleTextInfo for a shift-sensitive codepage: the text begins in the given state, shift bytes are
 * written where they are due, and it ends in the single-byte state. */
LX_API int32_t LXGetLocaleTextInfoEx(LXLocale* locale, int32_t item, char* buffer, LXShiftState state,
                                     int32_t size, int32_t flags);

/* Sets a text item of this locale alone. `text` is in the locale's codepage; `length` counts bytes, with
 * LX_CHARACTERS characters; below 0: null-terminated; 0: nothing is changed. LX_ITEM_LANGUAGE,
 * LX_ITEM_TERRITORY, LX_ITEM_CODEPAGE and LX_ITEM_SORT take the name of an object. LX_ITEM_DECIMAL,
 * LX_ITEM_THOUSANDS, LX_ITEM_MONETARY_DECIMAL and LX_ITEM_MONETARY_THOUSANDS take their first byte, which may
 * be neither a digit nor the other separator of the pair. Returns 1, or 0 with last error LX_E_INVALID (flags
 * other than LX_CHARACTERS), LX_E_ITEM (no such text item, or one that cannot be set), LX_E_NOT_FOUND (value
 * refused, no such object), LX_E_SEPARATOR (a separator has no single byte in the new codepage) or LX_E_MEMORY;
 * the locale is then as it was. */
LX_API int32_t LXSetLocaleTextInfo(LXLocale* locale, int32_t item, const char* text, int32_t length,
                                   int32_t flags);
/* As LXSetLocaleTextInfo; `text` is packed codes, `length` counts codes. */
LX_API int32_t LXSetLocaleTextInfoW(LXLocale* locale, int32_t item, const LXWChar* text, int32_t length,
                                    int32_t flags);
/* As LXSetLocaleTextInfo; `text` is 16-bit Unicode of fewer than 264 units (else LX_E_NOT_FOUND), `length`
 * counts units. The text itself is kept as the item's Unicode form. A separator must be exactly one unit (else
 * LX_E_NOT_FOUND). */
LX_API int32_t LXSetLocaleTextInfoU(LXLocale* locale, int32_t item, const LXUChar* text, int32_t length,
                                    int32_t flags);
/* As LXSetLocaleTextInfo for a shift-sensitive codepage; a shift byte at the start of `text` sets the state.
 * Names and separators must be in the single-byte state (else LX_E_NOT_FOUND). */
LX_API int32_t LXSetLocaleTextInfoEx(LXLocale* locale, int32_t item, const char* text, LXShiftState state,
                                     int32_t length, int32_t flags);

/* What the set functions do to the values of a locale; the objects must be loaded. Fills every value that the
 * caller has not set from the territory. Returns, and leaves as the last error, LX_OK, or LX_E_MEMORY with the
 * locale as it was; LX_E_NOT_INITIALIZED, as the two below, when there is no locale. The Unicode texts that are
 * replaced stay readable until the locale is released. */
LX_API int32_t LXLocaleSetModifiable(LXLocale* locale);
/* Moves a locale to another territory. Returns, and leaves as the last error, LX_OK, or LX_E_NOT_FOUND (no
 * loaded territory) or LX_E_MEMORY with the locale as it was. The Unicode texts that are replaced stay readable
 * until the locale is released. */
LX_API int32_t LXLocaleChangeTerritory(LXLocale* locale, LXObject* territory);
/* Converts a locale's values to another codepage. Returns, and leaves as the last error, LX_OK, or
 * LX_E_NOT_FOUND (no loaded codepage), LX_E_SEPARATOR or LX_E_MEMORY with the locale as it was. */
LX_API int32_t LXLocaleChangeCodePage(LXLocale* locale, LXObject* codepage);

#ifdef __cplusplus
}
#endif
#endif
