// The directives of time formats: one table says what each writes and reads, and three say by which byte a
// format names it.
#pragma once

#include <cstddef>
#include <cstdint>

#include "lx.h"

namespace lx {

/// Date and time formats are the only items with directives, so that what is nested deeper expands itself.
inline constexpr int kMostNestedFormats = 3;

/// A field of the time record with the values that can be written.
struct TimeField {
  int32_t LXTime::*member;
  int32_t least, most;

  bool in_range(const LXTime& time) const { return time.*member >= least && time.*member <= most; }
};

namespace time_field {
inline constexpr TimeField kSeconds{&LXTime::seconds, 0, 59};
inline constexpr TimeField kMinutes{&LXTime::minutes, 0, 59};
inline constexpr TimeField kHours{&LXTime::hours, 0, 23};
inline constexpr TimeField kDay{&LXTime::day, 0, 31};
inline constexpr TimeField kMonth{&LXTime::month, 0, 11};
inline constexpr TimeField kYear{&LXTime::year, INT32_MIN, INT32_MAX};
inline constexpr TimeField kWeekday{&LXTime::weekday, 0, 6};
inline constexpr TimeField kDayOfYear{&LXTime::day_of_year, 0, 365};
}  // namespace time_field

enum class TimeAction : uint8_t {
  kNone,     // no directive
  kPercent,  // begins a directive; the directive %%
  kFlag,     // may stand before a directive
  kDate,     // nested formats
  kTime,
  kDateTime,
  kWord,  // the rest uses the field
  kMarker,
  kNumber,
  kHour12,
  kWeek,  // `write_added`: the first day of the week; cannot be read
};

struct TimeDirective {
  char letter;
  TimeAction action;
  TimeField field;
  uint8_t first_item;  // words
  uint8_t items;
  uint8_t digits;       // numbers
  int16_t write_added;  // to the field
  int16_t read_added;   // the same for reading: taken from the number
  int16_t read_most;
};

constexpr TimeDirective time_directive(char letter, TimeAction action) {
  return {letter, action, {nullptr, 0, 0}, 0, 0, 0, 0, 0, 0};
}
constexpr TimeDirective time_word(char letter, TimeField field, uint8_t first_item, uint8_t items,
                                  TimeAction action = TimeAction::kWord) {
  return {letter, action, field, first_item, items, 0, 0, 0, 0};
}
constexpr TimeDirective time_number(char letter, TimeField field, uint8_t digits, int16_t write_added,
                                    int16_t read_added, int16_t read_most,
                                    TimeAction action = TimeAction::kNumber) {
  return {letter, action, field, 0, 0, digits, write_added, read_added, read_most};
}

inline constexpr TimeDirective kTimeDirectives[] = {
    time_directive('\0', TimeAction::kNone),
    time_directive('%', TimeAction::kPercent),
    time_directive('#', TimeAction::kFlag),
    time_word('a', time_field::kWeekday, LX_ITEM_SHORT_DAY, 7),
    time_word('A', time_field::kWeekday, LX_ITEM_DAY, 7),
    time_word('b', time_field::kMonth, LX_ITEM_SHORT_MONTH, 12),
    time_word('B', time_field::kMonth, LX_ITEM_MONTH, 12),
    time_directive('c', TimeAction::kDateTime),
    time_number('d', time_field::kDay, 2, 0, 0, 31),
    time_number('H', time_field::kHours, 2, 0, 0, 23),
    time_number('I', time_field::kHours, 2, 0, 0, 12, TimeAction::kHour12),
    time_number('j', time_field::kDayOfYear, 3, 0, 0, 366),
    time_number('m', time_field::kMonth, 2, 1, 1, 12),
    time_number('M', time_field::kMinutes, 2, 0, 0, 59),
    time_word('p', time_field::kHours, LX_ITEM_MORNING, 2, TimeAction::kMarker),
    time_number('S', time_field::kSeconds, 2, 0, 0, 59),
    time_number('U', time_field::kWeekday, 2, 0, 0, 0, TimeAction::kWeek),
    time_number('w', time_field::kWeekday, 1, 0, 0, 6),
    time_number('W', time_field::kWeekday, 2, 1, 0, 0, TimeAction::kWeek),
    time_directive('x', TimeAction::kDate),
    time_directive('X', TimeAction::kTime),
    time_number('y', time_field::kYear, 2, 1900, 0, 99),
    time_number('Y', time_field::kYear, 4, 1900, 1900, 9999),
};

// Where the letters stand.
constexpr uint8_t ascii_letter(char c) {
  return static_cast<uint8_t>(c);
}
constexpr uint8_t ebcdic_letter(char c) {
  if (c == '%') return 0x6C;
  if (c == '#') return 0x7B;
  const int lower = c >= 'a' ? c : c - 'A' + 'a';
  const int code = lower <= 'i' ? 0x81 + lower - 'a' : lower <= 'r' ? 0x91 + lower - 'j' : 0xA2 + lower - 's';
  return static_cast<uint8_t>(c >= 'a' ? code : code + 0x40);
}
/// Codepage 930, which has katakana where others have small letters.
constexpr uint8_t katakana_letter(char c) {
  if (c < 'a') return ebcdic_letter(c);
  const int code = c <= 'h'   ? 0x62 + c - 'a'
                   : c <= 'p' ? 0x71 + c - 'i'
                   : c <= 's' ? 0x8B + 0x10 * (c - 'q')
                              : 0xB3 + c - 't';
  return static_cast<uint8_t>(code);
}
inline constexpr uint16_t kKatakanaCodepage = 930;

/// What a format needs to know of a codepage: directives by byte, digits, the space.
struct TimeSymbols {
  uint8_t directives[256] = {};  // indexes of kTimeDirectives
  uint8_t percent;
  uint8_t zero;
  uint8_t space;

  constexpr TimeSymbols(uint8_t (*letter)(char), uint8_t zero_digit, uint8_t blank)
      : percent(letter('%')), zero(zero_digit), space(blank) {
    for (size_t i = 1; i < sizeof(kTimeDirectives) / sizeof(kTimeDirectives[0]); ++i)
      directives[letter(kTimeDirectives[i].letter)] = static_cast<uint8_t>(i);
  }
  const TimeDirective& directive(uint32_t code) const {
    return kTimeDirectives[code < sizeof(directives) ? directives[code] : 0];
  }
};
inline constexpr TimeSymbols kAsciiTime(ascii_letter, 0x30, 0x20);
inline constexpr TimeSymbols kEbcdicTime(ebcdic_letter, 0xF0, 0x40);
inline constexpr TimeSymbols kKatakanaTime(katakana_letter, 0xF0, 0x40);

}  // namespace lx
