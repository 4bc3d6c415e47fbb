/* Lexicor: times as text: formatting and parsing by a format with directives and the locale's names.
 */
#ifndef LX_TIME_H
#define LX_TIME_H

#include "lx/base.h"

#ifdef __cplusplus
extern "C" {
#endif

/* A broken-down time, laid out like the first eight fields of a struct tm. */
typedef struct LXTime {
  int32_t seconds;     /* 0-59 */
  int32_t minutes;     /* 0-59 */
  int32_t hours;       /* 0-23 */
  int32_t day;         /* of the month, 0-31 */
  int32_t month;       /* 0-11 */
  int32_t year;        /* since 1900 */
  int32_t weekday;     /* 0-6, Sunday first */
  int32_t day_of_year; /* 0-365 */
} LXTime;

/* Directives. "%#" in place of "%" sets the flag #.
 *
 *      writes                                            reads
 *  %%  %                                                 %
 *  %a  abbreviated name of the weekday                   the longest of the names that the text has, case
 *  %A  its name                                          and all
 *  %b  abbreviated name of the month                     the same, of the first twelve
 *  %B  its name                                          the same
 *  %c  %x, a space and %X; %#c: %#x first                %x, any one character, %X; text after %x is needed
 *  %d  day of the month, 2 digits                        up to 2 digits, up to 31
 *  %H  hour, 2 digits                                    up to 2 digits, up to 23
 *  %I  hour of twelve, 2 digits                          up to 2 digits, up to 12, which is stored as 0
 *  %j  day of the year as it is stored, from 000         up to 3 digits, up to 366
 *  %m  month from 1, 2 digits                            up to 2 digits, up to 12; 0 is month -1
 *  %M  minute, 2 digits                                  up to 2 digits, up to 59
 *  %p  morning marker below 12 hours, else afternoon     one of the two; at the end of the format that it
 *                                                        stands in (of %c or %X: that one) an hour below 12
 *                                                        gets 12 more when the last was the afternoon's
 *  %S  second, 2 digits                                  up to 2 digits, up to 59
 *  %U  week of the year from Sunday on, 2 digits         -
 *  %w  weekday, 1 digit                                  1 digit, up to 6
 *  %W  week of the year from Monday on, 2 digits         -
 *  %x  item LX_ITEM_SHORT_DATE_FORMAT, %#x               the same
 *      LX_ITEM_LONG_DATE_FORMAT, expanded
 *  %X  item LX_ITEM_TIME_FORMAT, expanded                the same
 *  %y  last two digits of the year                       up to 2 digits: 03 is 1903
 *  %Y  year, 4 digits                                    up to 4 digits
 *
 * With the flag a number is written without leading zeros: %#m of July gives 7. The whole year is the value of
 * %y: %#y of 2003 gives 03. Of a number with more digits the last ones are written, of a year before 0 those of
 * its magnitude.
 *
 * Names and the formats of %c, %x and %X are used up to 31 bytes (codes in the W forms, units in the U forms).
 * Formats are expanded three deep: one that expands itself gives LX_E_FORMAT. The date of %c, and %x and %X as
 * a whole, are written from the START OF THE BUFFER and not behind what is there; the text goes on behind the
 * sum of both lengths. Use them at the start of a format only. */

/* Writes `time` by `format` into `buffer` of `size` bytes. `format_length` counts bytes; below 0:
 * null-terminated. `flags`: LX_TERRITORY_VALUES reads the formats from the territory; LX_TERMINATE ends the
 * text with a null. Returns the bytes written, the null counted. With LX_CHARACTERS `size`, `format_length` and
 * the result count characters: at most 512 bytes are worked on, what is beyond `size` characters (the null one
 * of them) is dropped without a code, and `buffer` must hold the bytes that `size` characters can take.
 *
 * Last errors: LX_E_INVALID, result -1, for other flags; LX_E_SIZE when the buffer is full, also where the last
 * digit of a number just fitted; LX_E_SIZE, result 0, for a size below 1; LX_E_NOT_FOUND for a field that a
 * directive uses and that is out of its range; LX_E_FORMAT for a "%" or "%#" at the end, an unknown directive,
 * or a character that the end of the format cuts. With the last three the buffer holds whole characters up to
 * the failure, which the result counts. */
LX_API int32_t LXTimeToString(LXLocale* locale, const LXTime* time, char* buffer, int32_t size,
                              const char* format, int32_t format_length, uint32_t flags);
/* As LXTimeToString; packed codes, lengths and result count codes. LX_CHARACTERS is ignored. */
LX_API int32_t LXTimeToStringW(LXLocale* locale, const LXTime* time, LXWChar* buffer, int32_t size,
                               const LXWChar* format, int32_t format_length, uint32_t flags);
/* As LXTimeToString; 16-bit Unicode, lengths and result count units. LX_CHARACTERS is ignored. */
LX_API int32_t LXTimeToStringU(LXLocale* locale, const LXTime* time, LXUChar* buffer, int32_t size,
                               const LXUChar* format, int32_t format_length, uint32_t flags);
/* As LXTimeToString for a shift-sensitive codepage: the text and the format begin in the states given. Shift
 * bytes are written where they are due; a double-byte character is written only where a Shift-In fits behind
 * it, and the text ends in the single-byte state. With LX_CHARACTERS `buffer` must hold 6 bytes a character. */
LX_API int32_t LXTimeToStringEx(LXLocale* locale, const LXTime* time, char* buffer, LXShiftState state,
                                int32_t size, const char* format, LXShiftState format_state,
                                int32_t format_length, uint32_t flags);

/* Reads `text` of `length` bytes by `format` of `format_length` bytes (below 0: null-terminated) into the
 * fields of `time` that the directives name; the others stay. A character that is no directive must be the same
 * in the text. Reading ends where the text or the format ends, which is no error. Returns the bytes read, or
 * -1. A length of 0 gives 0. `flags`: LX_TERRITORY_VALUES; with LX_CHARACTERS lengths and result count
 * characters.
 *
 * Last errors: LX_E_INVALID for other flags; LX_E_NOT_FOUND when the text does not match, or a number is above
 * its maximum; LX_E_FORMAT for a "%" or "%#" at the end of the format, or a directive that cannot be read.
 * Fields that were read before the failure keep their new values, a number above its maximum is stored too, and
 * without a digit the field stays. */
LX_API int32_t LXStringToTime(LXLocale* locale, LXTime* time, const char* text, int32_t length,
                              const char* format, int32_t format_length, uint32_t flags);
/* As LXStringToTime; packed codes, lengths and result count codes. LX_CHARACTERS is ignored. */
LX_API int32_t LXStringToTimeW(LXLocale* locale, LXTime* time, const LXWChar* text, int32_t length,
                               const LXWChar* format, int32_t format_length, uint32_t flags);
/* As LXStringToTime; 16-bit Unicode, lengths and result count units. LX_CHARACTERS is ignored. */
LX_API int32_t LXStringToTimeU(LXLocale* locale, LXTime* time, const LXUChar* text, int32_t length,
                               const LXUChar* format, int32_t format_length, uint32_t flags);
/* As LXStringToTime for a shift-sensitive codepage: text and format begin in the states given. A Shift-In
 * behind the last character that was read is read with it. */
LX_API int32_t LXStringToTimeEx(LXLocale* locale, LXTime* time, const char* text, LXShiftState state,
                                int32_t length, const char* format, LXShiftState format_state,
                                int32_t format_length, uint32_t flags);

#ifdef __cplusplus
}
#endif
#endif
