// The library writes %c, %x and %X at the start of its buffer; the formats that they stand for take their place
// before it sees them, so that they can be anywhere.
#include "moment.h"

#include <cstdio>
#include <cstring>

#include "locale.h"

namespace lexicor_cli {

namespace {

constexpr char kWritten[] = "%aAbBcdHIjmMpSUwWxXyY";
constexpr char kRead[] = "%aAbBcdHIjmMpSwxXyY";
constexpr size_t kDirectiveUnits = 31;  // of what a directive writes, at most
constexpr int32_t kFirstYear = 1900;    // of LXTime
constexpr int32_t kUnset = -1000000;    // a field that no directive has read; %p may add 12 to it

bool is_leap(int32_t year) {
  return year % 4 == 0 && (year % 100 != 0 || year % 400 == 0);
}

/// `month` from 0.
int32_t month_days(int32_t year, int32_t month) {
  constexpr int32_t kDays[] = {31, 28, 31, 30, 31, 30, 31, 31, 30, 31, 30, 31};
  return kDays[month] + (month == 1 && is_leap(year) ? 1 : 0);
}

/// Sets the fields that follow from the others.
void complete(LXTime* time) {
  const int32_t year = time->year + kFirstYear;
  time->day_of_year = time->day - 1;
  for (int32_t month = 0; month < time->month; ++month) time->day_of_year += month_days(year, month);
  // The whole years before this one; 400 more, in which the weekdays come round, keep that above 0.
  const int32_t years = year + 399;
  time->weekday = (1 + years * 365 + years / 4 - years / 100 + years / 400 + time->day_of_year) % 7;
}

LXTime read_iso(const TextLocale& locale, const std::string& iso) {
  constexpr char kForm[] = "0000-00-00T00:00:00";
  constexpr size_t kLengths[] = {10, 16, 19};
  const Units units = locale.units(iso);
  const auto fail = [&](size_t at) {
    return locale.pointing(kDataError, "a time has the form YYYY-MM-DD[THH:MM[:SS]]", units, at);
  };
  size_t at = 0;
  for (; at < units.size() && at < sizeof kForm - 1; ++at) {
    const bool digit = units[at] >= '0' && units[at] <= '9';
    if (kForm[at] == '0' ? !digit : units[at] != static_cast<LXUChar>(kForm[at])) throw fail(at);
  }
  if (at < units.size() || (at != kLengths[0] && at != kLengths[1] && at != kLengths[2])) throw fail(at);

  LXTime time = {};
  const auto field = [&](size_t begin, size_t digits, int32_t least, int32_t most) {
    if (begin >= units.size()) return 0;
    int32_t value = 0;
    for (size_t i = 0; i < digits; ++i) value = value * 10 + units[begin + i] - '0';
    if (value >= least && value <= most) return value;
    throw locale.pointing(kDataError, "there is no such time", units, begin);
  };
  const int32_t year = field(0, 4, 0, 9999);
  time.year = year - kFirstYear;
  time.month = field(5, 2, 1, 12) - 1;
  time.day = field(8, 2, 1, month_days(year, time.month));
  time.hours = field(11, 2, 0, 23);
  time.minutes = field(14, 2, 0, 59);
  time.seconds = field(17, 2, 0, 59);
  complete(&time);
  return time;
}

/// The format with those of the locale in place of %c, %x and %X. Throws a Failure that points at a directive
/// that is not one of `known`.
Units expanded(const TextLocale& locale, const std::string& format, const char* known) {
  const auto item = [&](int32_t number) { return text_item(locale.locale(), number).value_or(""); };
  std::string text;
  for (size_t i = 0, begin; i < format.size(); ++i) {
    if (format[i] != '%') {
      text += format[i];
      continue;
    }
    begin = i++;
    const bool flag = i < format.size() && format[i] == '#';
    i += flag ? 1 : 0;
    if (i >= format.size() || std::strchr(known, format[i]) == nullptr)
      throw locale.pointing(kUsageError, "a format has no such directive", locale.units(format),
                            locale.units(format.substr(0, begin)).size());
    const std::string date = item(flag ? LX_ITEM_LONG_DATE_FORMAT : LX_ITEM_SHORT_DATE_FORMAT);
    const std::string hours = item(LX_ITEM_TIME_FORMAT);
    switch (format[i]) {
      case 'c':
        text += date + " " + hours;
        break;
      case 'x':
        text += date;
        break;
      case 'X':
        text += hours;
        break;
      default:
        text.append(format, begin, i - begin + 1);
    }
  }
  return locale.units(text);
}

/// How far reading gets in a text that does not match: as far as its longest beginning that does.
size_t stop_of(const TextLocale& locale, const Units& text, const Units& format) {
  size_t length = text.size();
  LXTime time = {};
  while (length > 0 && LXStringToTimeU(locale.locale(), &time, text.data(), static_cast<int32_t>(length),
                                       format.data(), static_cast<int32_t>(format.size()), 0) < 0)
    --length;
  return length;
}

/// Fields that were not read, or cannot be, are missing.
std::string iso_text(const TextLocale& locale, const LXTime& time, const Units& text) {
  const auto fail = [&](const char* message) {
    return locale.pointing(kDataError, message, text, text.size());
  };
  const bool has_month = time.month >= 0, has_day = time.day > 0;
  std::string iso;
  char part[64];
  if (time.year != kUnset || has_month || has_day) {
    if (time.year == kUnset) throw fail("the text has a date without a year");
    if (!has_month) throw fail("the text has a date without a month");
    if (!has_day) throw fail("the text has a date without a day of the month");
    const int32_t year = time.year + kFirstYear;
    if (time.day > month_days(year, time.month)) throw fail("the month has no such day");
    std::snprintf(part, sizeof part, "%04d-%02d-%02d", static_cast<int>(year), time.month + 1, time.day);
    iso = part;
  }
  if (time.hours >= 0) {
    std::snprintf(part, sizeof part, "%02d:%02d:%02d", time.hours, time.minutes, time.seconds);
    iso += (iso.empty() ? "" : "T") + std::string(part);
  }
  if (iso.empty()) throw fail("the text has neither a date nor an hour");
  return iso;
}

}  // namespace

std::string format_moment(const TextLocale& locale, const std::string& iso, const std::string& format) {
  const LXTime time = read_iso(locale, iso);
  const Units directives = expanded(locale, format, kWritten);
  if (directives.empty()) return {};
  Units text((directives.size() + 1) * kDirectiveUnits);
  const int32_t written =
      LXTimeToStringU(locale.locale(), &time, text.data(), static_cast<int32_t>(text.size()), directives.data(),
                      static_cast<int32_t>(directives.size()), 0);
  const int32_t code = LXGetError(locale.locale());
  if (written < 0 || code != LX_OK)
    throw Failure(kDataError, "the time cannot be written: " + describe_code(code));
  return locale.text(text, static_cast<size_t>(written));
}

std::string parse_moment(const TextLocale& locale, const std::string& text, const std::string& format) {
  const Units units = locale.units(text);
  const Units directives = expanded(locale, format, kRead);
  LXTime time = {0, 0, kUnset, kUnset, kUnset, kUnset, 0, 0};
  const int32_t read = LXStringToTimeU(locale.locale(), &time, units.data(), static_cast<int32_t>(units.size()),
                                       directives.data(), static_cast<int32_t>(directives.size()), 0);
  const int32_t code = LXGetError(locale.locale());
  if (read < 0 && code != LX_E_NOT_FOUND)
    throw Failure(kDataError, "the time cannot be read: " + describe_code(code));
  const size_t stop = read < 0 ? stop_of(locale, units, directives) : static_cast<size_t>(read);
  if (stop < units.size() || read < 0)
    throw locale.pointing(
        kDataError, "reading stopped: not a time in the format " + locale.text(directives, directives.size()),
        units, stop);
  return iso_text(locale, time, units);
}

}  // namespace lexicor_cli
