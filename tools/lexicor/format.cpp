// lexicor format and lexicor parse: numbers, amounts of money and times as a locale writes them, and back.
#include <lx.h>

#include <algorithm>
#include <charconv>
#include <cmath>
#include <cstdio>
#include <map>
#include <memory>

#include "arguments.h"
#include "command.h"
#include "locale.h"
#include "moment.h"
#include "output.h"
#include "report.h"
#include "session.h"
#include "text_locale.h"

namespace lexicor_cli {

namespace {

// The digits of the largest double, each with a separator, and signs and symbols beside them.
constexpr size_t kNumberUnits = 2048;
constexpr char kNoNumber[] = "reading stopped: not a number as the locale writes it";
constexpr char kTooLarge[] = "a number that a double cannot hold";
constexpr char kTooLong[] = "a double cannot hold this number to the last digit before the point";
constexpr char kNoAmount[] = "reading stopped: not an amount as the locale writes it";

struct ValueOptions {
  std::string kind;
  std::string locale;  // empty: the user's
  std::string format;  // empty: kDefaultFormat
  bool international = false;
  bool json = false;
  std::string text;
};

std::string written_text(const TextLocale& locale, const Units& units, int32_t written) {
  const int32_t code = LXGetError(locale.locale());
  if (written < 0 || code != LX_OK)
    throw Failure(kDataError, "the value cannot be written: " + describe_code(code));
  return locale.text(units, static_cast<size_t>(written));
}

/// Reads the beginning of a text as a C number.
template <typename Number>
std::errc read_c_number(const std::string& text, Number* value, size_t* stop) {
  const std::from_chars_result result = std::from_chars(text.data(), text.data() + text.size(), *value);
  *stop = static_cast<size_t>(result.ptr - text.data());
  return result.ec;
}

/// Whether a C number has digits only, with a sign or without one.
bool is_whole(const std::string& text) {
  return text.find_first_not_of("0123456789", text[0] == '-' ? 1 : 0) == std::string::npos;
}

/// Whether the digits of a C number before its point are those of the double that was read from it; of a number with an
/// exponent there is no telling.
bool is_exact(const std::string& text, double value) {
  const std::string whole = text.substr(0, text.find('.'));
  if (!is_whole(whole) || text.find_first_of("eE") != std::string::npos) return true;
  char digits[512];
  std::snprintf(digits, sizeof digits, "%.0f", std::trunc(std::fabs(value)));
  const size_t first = whole.find_first_not_of("-0");
  return (first == std::string::npos ? "0" : whole.substr(first)) == digits;
}

double c_double(const TextLocale& locale, const std::string& text) {
  double value = 0;
  size_t stop;
  const std::errc error = read_c_number(text, &value, &stop);
  const Units units = locale.units(text);
  if (error == std::errc::result_out_of_range || !std::isfinite(value))
    throw locale.pointing(kDataError, kTooLarge, units, 0);
  if (error != std::errc() || stop < text.size())
    throw locale.pointing(kDataError, "reading stopped: not a number like -1234.56", units, stop);
  if (!is_exact(text, value)) throw locale.pointing(kDataError, kTooLong, units, 0);
  return value;
}

std::string format_number(const TextLocale& locale, const ValueOptions& options) {
  Units units(kNumberUnits);
  int32_t integer = 0;
  size_t stop;
  if (read_c_number(options.text, &integer, &stop) == std::errc() && stop == options.text.size())
    return written_text(locale, units,
                        LXLongToStringU(locale.locale(), integer, units.data(), kNumberUnits, 0));
  const double value = c_double(locale, options.text);
  const bool whole = is_whole(options.text);
  if (whole) LXSetLocaleNumInfo(locale.locale(), LX_ITEM_DIGITS, 0);
  int32_t written = LXDoubleToStringU(locale.locale(), value, units.data(), kNumberUnits, 0);
  // The separator is written also where no digits follow.
  const Units separator = locale.units(text_item(locale.locale(), LX_ITEM_DECIMAL).value_or(""));
  if (whole && written > 0 && !separator.empty() && units[static_cast<size_t>(written) - 1] == separator[0])
    --written;
  return written_text(locale, units, written);
}

std::string format_money(const TextLocale& locale, const ValueOptions& options) {
  Units units(kNumberUnits);
  const double value = c_double(locale, options.text);
  return written_text(locale, units,
                      LXCurrencyToStringU(locale.locale(), value, units.data(), kNumberUnits,
                                          options.international ? LX_INTERNATIONAL : 0));
}

int32_t class_of(LXLocale* locale, LXUChar unit) {
  return LXStrGetDigitU(locale, &unit, 1, nullptr, nullptr, nullptr, nullptr, nullptr, 1, LX_NATIONAL_DIGITS);
}

bool is_digit(LXLocale* locale, LXUChar unit) {
  const int32_t value = class_of(locale, unit);
  return value >= 0 && value <= 9;
}

/// Reads the part of a text from `begin` to `end`. A thousands separator that is white space ends a number for
/// the library, so those between digits are left out. Throws a Failure that points at where reading stopped.
double read_double(const TextLocale& locale, const Units& text, size_t begin, size_t end, bool monetary) {
  LXLocale* const handle = locale.locale();
  const Units separator =
      locale.units(text_item(handle, monetary ? LX_ITEM_MONETARY_THOUSANDS : LX_ITEM_THOUSANDS).value_or(""));
  const bool blank = !separator.empty() && class_of(handle, separator[0]) == LX_CLASS_SPACE;
  Units units;
  std::vector<size_t> places;
  for (size_t i = begin; i < end; ++i) {
    if (blank && text[i] == separator[0] && i > begin && i + 1 < end && is_digit(handle, text[i - 1]) &&
        is_digit(handle, text[i + 1]))
      continue;
    units.push_back(text[i]);
    places.push_back(i);
  }
  places.push_back(end);
  const LXUChar* stop = units.data();
  const double value = LXStringToDoubleU(handle, units.data(), static_cast<int32_t>(units.size()), &stop,
                                         LX_NATIONAL_DIGITS | (monetary ? LX_MONETARY : 0));
  const size_t read = static_cast<size_t>(stop - units.data());
  bool digits = false;
  for (size_t i = 0; i < read; ++i) digits |= is_digit(handle, units[i]);
  if (!digits || read < units.size())
    throw locale.pointing(kDataError, monetary ? kNoAmount : kNoNumber, text, places[read]);
  if (!std::isfinite(value)) throw locale.pointing(kDataError, kTooLarge, text, begin);
  return value;
}

/// An amount without what stands around its digits.
class Amount {
 public:
  Amount(const TextLocale& locale, const Units& text) : locale_(locale), text_(text), end_(text.size()) {}

  double read() {
    peel_blanks();
    const bool parentheses = number_item(locale_.locale(), LX_ITEM_NEGATIVE_POSITION) == 0 &&
                             end_ - begin_ >= 2 && text_[begin_] == '(' && text_[end_ - 1] == ')';
    if (parentheses) {
      ++begin_;
      --end_;
      peel_blanks();
    }
    // A sign stands outside or inside of the symbol, and only once.
    int32_t sign = parentheses ? -1 : peel_sign();
    peel_currency();
    const size_t inner = begin_;
    const int32_t inner_sign = peel_sign();
    if (sign == 0)
      sign = inner_sign;
    else if (inner_sign != 0)
      throw locale_.pointing(kDataError, kNoAmount, text_, begin_ > inner ? inner : end_);
    if (sign != 0 && begin_ < end_ && (text_[begin_] == '+' || text_[begin_] == '-'))
      throw locale_.pointing(kDataError, kNoAmount, text_, begin_);
    const double value = read_double(locale_, text_, begin_, end_, true);
    return sign < 0 ? -value : value;
  }

 private:
  Units item(int32_t number) const { return locale_.units(text_item(locale_.locale(), number).value_or("")); }

  bool is_blank(LXUChar unit) const { return class_of(locale_.locale(), unit) == LX_CLASS_SPACE; }

  void peel_blanks() {
    while (begin_ < end_ && is_blank(text_[begin_])) ++begin_;
    while (begin_ < end_ && is_blank(text_[end_ - 1])) --end_;
  }

  /// Takes a sign off: -1, 1, or 0 where there is none.
  int32_t peel_sign() {
    return peel(item(LX_ITEM_NEGATIVE_SIGN)) ? -1 : peel(item(LX_ITEM_POSITIVE_SIGN)) ? 1 : 0;
  }

  /// Takes the symbol or the international code off, the longer one first: SOS begins and ends with S.
  void peel_currency() {
    const Units symbol = item(LX_ITEM_CURRENCY), code = item(LX_ITEM_INTERNATIONAL_CURRENCY);
    const bool code_first = code.size() > symbol.size();
    if (!peel(code_first ? code : symbol)) peel(code_first ? symbol : code);
  }

  /// Takes a part off the beginning or the end, and the white space behind it.
  bool peel(const Units& part) {
    if (part.empty() || part.size() > end_ - begin_) return false;
    const auto at = [&](size_t place) {
      return std::equal(part.begin(), part.end(), text_.begin() + static_cast<ptrdiff_t>(place));
    };
    if (at(begin_))
      begin_ += part.size();
    else if (at(end_ - part.size()))
      end_ -= part.size();
    else
      return false;
    peel_blanks();
    return true;
  }

  const TextLocale& locale_;
  const Units& text_;
  size_t begin_ = 0, end_;
};

/// Without the digits that adding fraction digits one by one leaves inexact; whole numbers to the last digit.
std::string c_text(double value) {
  constexpr double kExactWholes = 9007199254740992;  // 2 to the power of 53
  char text[32];
  std::snprintf(text, sizeof text,
                std::trunc(value) == value && std::fabs(value) <= kExactWholes ? "%.0f" : "%.15g", value);
  return text;
}

std::string format_time(const TextLocale& locale, const ValueOptions& options) {
  return format_moment(locale, options.text, options.format.empty() ? kDefaultFormat : options.format);
}

std::string parse_number(const TextLocale& locale, const ValueOptions& options) {
  const Units units = locale.units(options.text);
  return c_text(read_double(locale, units, 0, units.size(), false));
}

std::string parse_money(const TextLocale& locale, const ValueOptions& options) {
  const Units units = locale.units(options.text);
  return c_text(Amount(locale, units).read());
}

std::string parse_time(const TextLocale& locale, const ValueOptions& options) {
  return parse_moment(locale, options.text, options.format.empty() ? kDefaultFormat : options.format);
}

using Work = std::string (*)(const TextLocale&, const ValueOptions&);
using Works = std::map<std::string, Work>;

const Works kFormats = {{"number", format_number}, {"money", format_money}, {"time", format_time}};
const Works kParses = {{"number", parse_number}, {"money", parse_money}, {"time", parse_time}};

/// A time is a text in JSON too.
std::string json_value(const ValueOptions& options, const std::string& value) {
  const bool number = options.kind != "time" && Json::accept(value);
  return json_text(
      {{"kind", options.kind}, {"text", options.text}, {"value", number ? Json::parse(value) : Json(value)}});
}

Run declare_values(Arguments& command, const CommonOptions& common, const Works& works, const char* text_name,
                   const char* text_help, const std::shared_ptr<ValueOptions>& options) {
  command.add_option("KIND", options->kind, "number, money or time")
      .required()
      .type_name("")
      .one_of(keys_of(works));
  command.add_option(text_name, options->text, text_help).required().type_name("");
  command.add_option("--locale", options->locale, "locale by whose conventions; else the user's")
      .type_name("LOCALE");
  command.add_option("--format", options->format, "of a time: a text with directives; else '%x %X'")
      .type_name("FORMAT");
  return [options, &common, &works] {
    if (!options->format.empty() && options->kind != "time")
      throw Failure(kUsageError, "--format is for times");
    if (options->international && options->kind != "money")
      throw Failure(kUsageError, "--international is for money");
    const Session session(common);
    const TextLocale locale(session, options->locale);
    const std::string value = works.at(options->kind)(locale, *options);
    Output().write(options->json ? json_value(*options, value) : value + "\n");
    return static_cast<int>(kDone);
  };
}

}  // namespace

Run declare_format(Arguments& command, const CommonOptions& common) {
  const auto options = std::make_shared<ValueOptions>();
  command.add_flag("--international", options->international,
                   "of money: the international symbol and its fraction digits");
  command.footer(
      "A VALUE is a number like -1234.56, or a time like 2026-11-21T14:05:09. A whole number is written "
      "without "
      "a\n"
      "fraction; other digits are cut behind the locale's fraction digits, not rounded. A number\n"
      "that a double cannot hold to the last digit before its point is refused.\n"
      "\n"
      "Examples:\n"
      "  lexicor format number 1234567.891 --locale German\n"
      "  lexicor format money -1234.5 --locale Japanese --international\n"
      "  lexicor format time 2026-11-21T14:05:09 --locale French --format '%#x'");
  return declare_values(command, common, kFormats, "VALUE", "a number, or a time in ISO 8601", options);
}

Run declare_parse(Arguments& command, const CommonOptions& common) {
  const auto options = std::make_shared<ValueOptions>();
  command.add_flag("--json", options->json, "print JSON");
  command.footer(
      "Prints a number like -1234.56, or what the text gives of a time like 2026-11-21T14:05:09. A year of "
      "two\n"
      "digits is one of the 1900s. A TEXT that begins with - and no digit goes behind --.\n"
      "\n"
      "Examples:\n"
      "  lexicor parse number 1.234.567,89 --locale German\n"
      "  lexicor parse money --locale English_UnitedStates -- -'$1,234.50'\n"
      "  lexicor parse time '21. November 2026' --locale German --format '%d. %B %Y'");
  return declare_values(command, common, kParses, "TEXT", "what the locale writes, in UTF-8", options);
}

}  // namespace lexicor_cli
