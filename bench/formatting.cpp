// Numbers, amounts and times written and read, beside ICU and glibc: some hundred values of all sizes, one call
// each. ICU works on UTF-16 in every row, and its formats stay open; glibc works in a locale of the language.
#include <monetary.h>
#include <time.h>

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <random>

#include "codepages.h"
#include "families.h"
#include "icu.h"
#include "system.h"

namespace bench {
namespace {

constexpr int32_t kRoomUnits = 128;  // for one text

enum class Form { kCodepage, kUtf8, kUtf16 };

struct Text {
  const char* label;
  const char* locale;
  Form form;  // kCodepage or kUtf16: the form that is called
  const char* icu;
  const char* glibc;  // null: no peer
  char decimal;
  const char16_t* icu_date_time;  // what %c makes
};
constexpr Text kTexts[] = {
    {"English/Latin1", "English_UnitedStates.Latin1", Form::kCodepage, "en_US", "en_US.UTF-8", '.',
     u"M/d/yy h:mm:ss a"},
    {"German/UTF-8", "German_Germany.UTF-8", Form::kCodepage, "de_DE", "de_DE.UTF-8", ',',
     u"dd.MM.yy HH:mm:ss"},
    {"German/UTF-16", "German_Germany.UTF-8", Form::kUtf16, "de_DE", nullptr, ',', u"dd.MM.yy HH:mm:ss"},
};

/// A format of times as each library writes it.
struct Pattern {
  const char* label;
  const char* ours;
  const char* glibc;
  const char16_t* icu;  // null: the text's icu_date_time
  bool to_the_second;
};
constexpr Pattern kWritten[] = {
    {"time_short", "%H:%M:%S", "%H:%M:%S", u"HH:mm:ss", true},
    {"time_numbers", "%Y-%m-%d %H:%M:%S", "%Y-%m-%d %H:%M:%S", u"yyyy-MM-dd HH:mm:ss", true},
    {"time_names", "%A, %d. %B %Y", "%A, %d. %B %Y", u"EEEE, dd. MMMM yyyy", false},
    {"time_c", "%c", "%x %X", nullptr, true},  // glibc's %c has more fields
};
constexpr Pattern kRead[] = {kWritten[1], kWritten[2]};

struct Values {
  std::vector<int32_t> integers;
  std::vector<double> amounts;  // in quarters: two fraction digits are all there are
  std::vector<double> positive_amounts;
  std::vector<double> precise;  // with 17 digits
  std::vector<LXTime> times;
  std::vector<tm> system_times;
  std::vector<double> dates;  // milliseconds since 1970
};

Values make_values() {
  std::mt19937 random(1);
  Values values;
  for (size_t i = 0; i < kManyPieces; ++i) {
    const int digits = static_cast<int>(random() % 9) + 1;
    const auto integer = static_cast<int32_t>(random() % static_cast<uint32_t>(std::pow(10, digits)));
    values.integers.push_back(random() % 4 == 0 ? -integer : integer);
    values.amounts.push_back(values.integers.back() + static_cast<uint32_t>(random() % 4) * 0.25);
    values.positive_amounts.push_back(std::fabs(values.amounts.back()));
    values.precise.push_back(std::uniform_real_distribution<double>(0, 1000)(random));
    const auto seconds = static_cast<time_t>(random() & INT32_MAX);
    tm system{};
    gmtime_r(&seconds, &system);
    values.system_times.push_back(system);
    values.times.push_back({system.tm_sec, system.tm_min, system.tm_hour, system.tm_mday, system.tm_mon,
                            system.tm_year, system.tm_wday, system.tm_yday});
    values.dates.push_back(static_cast<double>(seconds) * 1000);
  }
  return values;
}

std::string printed(const char* format, double value, char decimal) {
  char text[64];
  std::snprintf(text, sizeof(text), format, value);
  std::replace(text, text + sizeof(text), '.', decimal);
  return text;
}

const LXUChar* lx_units(const std::u16string& text) {
  return reinterpret_cast<const LXUChar*>(text.data());
}
LXUChar* lx_units(char* text) {
  return reinterpret_cast<LXUChar*>(text);
}
/// What is read, for each library.
struct Inputs {
  std::vector<std::string> codepage, utf8;
  std::vector<std::u16string> utf16;

  void add(LXLocale* locale, const std::string& text) {
    utf8.push_back(text);
    utf16.push_back(to_utf16(text));
    std::string bytes(4 * text.size(), '\0');
    bytes.resize(count(LXUnicodeToString(locale, bytes.data(), length(bytes.size()), lx_units(utf16.back()),
                                         length(utf16.back().size()), 0)));
    codepage.push_back(bytes);
  }
};

/// The time that fields name, as one number.
template <class Fields, class... Member>
double key_of(const Fields& fields, Member... member) {
  double key = 0;
  ((key = key * 366 + fields.*member), ...);
  return key;
}
double key_of(const LXTime& t) {
  return key_of(t, &LXTime::year, &LXTime::month, &LXTime::day, &LXTime::hours, &LXTime::minutes,
                &LXTime::seconds);
}
double key_of(const tm& t) {
  return key_of(t, &tm::tm_year, &tm::tm_mon, &tm::tm_mday, &tm::tm_hour, &tm::tm_min, &tm::tm_sec);
}

class RowMaker {
 public:
  explicit RowMaker(Table* table) : table_(*table) {}

  bool start(std::string name, LXLocale* locale) {
    if (!table_.wants(name)) return false;
    row_ = {std::move(name), {}, 0, kManyPieces, kRoomUnits * sizeof(LXUChar), Same::kNothing};
    locale_ = locale;
    texts_.clear();
    return true;
  }

  /// A peer that writes value `i` with `call(i, output)`, which gives the bytes. `same`: its texts are those of
  /// the first peer.
  template <class Call>
  void writer(const char* name, locale_t system, Form form, bool same, Call call) {
    const locale_t before = uselocale(system);
    std::vector<std::u16string> texts;
    for (size_t i = 0; i < kManyPieces; ++i) {
      alignas(char16_t) char out[sizeof(char16_t) * kRoomUnits];
      texts.push_back(decoded(std::string(out, call(i, out)), form));
      if (same && !texts_.empty() && texts[i] != texts_[i]) stop(name, i);
    }
    uselocale(before);
    if (texts_.empty()) set_input(texts);
    add(name, system, call);
  }

  /// A peer that reads text `i` with `call(i)`, which gives a number for what it read: `expected`.
  template <class Call>
  void reader(const char* name, locale_t system, const std::vector<double>& expected, Call call) {
    const locale_t before = uselocale(system);
    for (size_t i = 0; i < kManyPieces; ++i)
      if (!(std::fabs(call(i) - expected[i]) <= std::fabs(expected[i]) * 1e-14)) stop(name, i);
    uselocale(before);
    add(name, system, [call](size_t i, char*) { return static_cast<size_t>(static_cast<int64_t>(call(i))); });
  }

  void set_input(const std::vector<std::u16string>& texts) {
    for (const std::u16string& text : texts) row_.chars += text.size();
    texts_ = texts;
  }

  void finish() { table_.add(row_); }

 private:
  template <class Call>
  void add(const char* name, locale_t system, Call call) {
    row_.peers.push_back({name, [system, call](char* out) {
                            const locale_t before = uselocale(system);
                            size_t sum = 0;
                            for (size_t i = 0; i < kManyPieces; ++i) sum += call(i, out);
                            uselocale(before);
                            return sum;
                          }});
  }

  /// ICU writes spaces that do not break.
  std::u16string decoded(const std::string& bytes, Form form) const {
    std::u16string text(bytes.size(), u'\0');
    if (form == Form::kUtf8)
      text = to_utf16(bytes);
    else if (form == Form::kUtf16)
      text.assign(reinterpret_cast<const char16_t*>(bytes.data()), bytes.size() / 2);
    else
      text.resize(count(LXStringToUnicode(lx_units(reinterpret_cast<char*>(text.data())), length(text.size()),
                                          locale_, bytes.data(), length(bytes.size()), 0)));
    for (char16_t& c : text)
      if (c == u'\u00A0' || c == u'\u202F') c = u' ';
    return text;
  }

  [[noreturn]] void stop(const char* peer, size_t i) const {
    std::fprintf(stderr, "%s: %s gives something else for value %zu\n", row_.name.c_str(), peer, i);
    std::exit(1);
  }

  Table& table_;
  LXLocale* locale_ = nullptr;
  std::vector<std::u16string> texts_;
  Row row_{};
};

/// The rows of one text.
class TextRows {
 public:
  TextRows(RowMaker* make, const Text& text, const std::shared_ptr<LXLocale>& locale, const Values& values)
      : make_(*make), text_(text), owner_(locale), locale_(locale.get()), values_(values) {
    if (text.glibc != nullptr) system_ = open_system_locale(text.glibc);
  }

  void add() {
    write_numbers(
        "integer", values_.integers, LXLongToString, LXLongToStringU,
        [](char* out, int32_t value) { return std::snprintf(out, kRoomUnits, "%'d", value); },
        icu::integer_writer);
    write_numbers(
        "double", values_.amounts, LXDoubleToString, LXDoubleToStringU,
        [](char* out, double value) { return std::snprintf(out, kRoomUnits, "%'.2f", value); },
        icu::double_writer);
    // Not negative: the territories write the others in different ways.
    write_numbers(
        "currency", values_.positive_amounts, LXCurrencyToString, LXCurrencyToStringU,
        [](char* out, double value) { return static_cast<int32_t>(strfmon(out, kRoomUnits, "%n", value)); },
        icu::currency_writer);
    for (const Pattern& pattern : kWritten) write_times(pattern);
    read_integers();
    read_doubles("double", "%.2f", values_.amounts);
    read_doubles("double_17", "%.17g", values_.precise);
    for (const Pattern& pattern : kRead) read_times(pattern);
  }

 private:
  bool start(const char* work, const char* label) {
    return make_.start(std::string(work) + "/" + text_.label + "/" + label, locale_);
  }

  /// Our writer in the form of the text.
  template <class Bytes, class Units>
  void ours(Bytes bytes, Units units) {
    if (text_.form == Form::kUtf16)
      make_.writer(kOurs, nullptr, Form::kUtf16, true, [owner = owner_, units](size_t i, char* out) {
        return 2 * count(units(owner.get(), i, lx_units(out)));
      });
    else
      make_.writer(kOurs, nullptr, Form::kCodepage, true,
                   [owner = owner_, bytes](size_t i, char* out) { return count(bytes(owner.get(), i, out)); });
  }
  /// `exact`: the texts are ours.
  template <class Call>
  void glibc(bool exact, Call call) {
    if (system_ != nullptr) make_.writer(kGlibc, system_.get(), Form::kUtf8, exact, call);
  }
  template <class Value>
  void icu_peer(const icu::Writer<Value>& writer, const std::vector<Value>& values) {
    if (!writer) return;
    make_.writer(kIcu, nullptr, Form::kUtf16, true, [writer, &values](size_t i, char* out) {
      return 2 * count(writer(values[i], reinterpret_cast<char16_t*>(out), kRoomUnits));
    });
  }

  /// `system(output, value)` is glibc's.
  template <class Value, class Bytes, class Units, class System>
  void write_numbers(const char* label, const std::vector<Value>& values, Bytes bytes, Units units,
                     System system, icu::Writer<Value> (*icu_writer)(const char*)) {
    if (!start("write", label)) return;
    ours([&values, bytes](LXLocale* locale, size_t i,
                          char* out) { return bytes(locale, values[i], out, kRoomUnits, 0); },
         [&values, units](LXLocale* locale, size_t i, LXUChar* out) {
           return units(locale, values[i], out, kRoomUnits, 0);
         });
    glibc(true, [&values, system](size_t i, char* out) { return count(system(out, values[i])); });
    icu_peer(icu_writer(text_.icu), values);
    make_.finish();
  }

  void write_times(const Pattern& pattern) {
    if (!start("write", pattern.label)) return;
    Inputs format;
    format.add(locale_, pattern.ours);
    ours(
        [format = format.codepage[0], &values = values_.times](LXLocale* locale, size_t i, char* out) {
          return LXTimeToString(locale, &values[i], out, kRoomUnits, format.data(), length(format.size()), 0);
        },
        [format = format.utf16[0], &values = values_.times](LXLocale* locale, size_t i, LXUChar* out) {
          return LXTimeToStringU(locale, &values[i], out, kRoomUnits, lx_units(format), length(format.size()),
                                 0);
        });
    const bool exact = pattern.icu != nullptr;
    glibc(exact, [format = pattern.glibc, &values = values_.system_times](size_t i, char* out) {
      return strftime(out, kRoomUnits, format, &values[i]);
    });
    icu_peer(icu::time_writer(text_.icu, pattern.icu != nullptr ? pattern.icu : text_.icu_date_time),
             values_.dates);
    make_.finish();
  }

  /// The peers that read a row's texts: `bytes` and `units` are ours, in the form of the text; the others are
  /// left out where the text has no such peer.
  template <class Bytes, class Units, class System, class Icu>
  void readers(const std::shared_ptr<const Inputs>& in, const std::vector<double>& expected,
               const std::vector<double>& icu_expected, Bytes bytes, Units units, System system,
               const Icu& icu_reader) {
    make_.set_input(in->utf16);
    if (text_.form == Form::kUtf16)
      make_.reader(kOurs, nullptr, expected,
                   [owner = owner_, in, units](size_t i) { return units(owner.get(), in->utf16[i]); });
    else
      make_.reader(kOurs, nullptr, expected,
                   [owner = owner_, in, bytes](size_t i) { return bytes(owner.get(), in->codepage[i]); });
    if (system_ != nullptr)
      make_.reader(kGlibc, system_.get(), expected,
                   [in, system](size_t i) { return system(in->utf8[i].c_str()); });
    if (icu_reader)
      make_.reader(kIcu, nullptr, icu_expected,
                   [in, icu_reader](size_t i) { return static_cast<double>(icu_reader(in->utf16[i])); });
    make_.finish();
  }

  void read_integers() {
    if (!start("read", "integer")) return;
    const auto in = std::make_shared<Inputs>();
    for (const int32_t value : values_.integers) in->add(locale_, std::to_string(value));
    const std::vector<double> expected(values_.integers.begin(), values_.integers.end());
    readers(
        in, expected, expected,
        [](LXLocale* locale, const std::string& text) -> double {
          return LXStringToLong(locale, text.data(), length(text.size()), nullptr, 10, 0);
        },
        [](LXLocale* locale, const std::u16string& text) -> double {
          return LXStringToLongU(locale, lx_units(text), length(text.size()), nullptr, 10, 0);
        },
        [](const char* text) { return static_cast<double>(std::strtol(text, nullptr, 10)); },
        icu::integer_reader(text_.icu));
  }

  void read_doubles(const char* label, const char* printf_format, const std::vector<double>& values) {
    if (!start("read", label)) return;
    const auto in = std::make_shared<Inputs>();
    for (const double value : values) in->add(locale_, printed(printf_format, value, text_.decimal));
    readers(
        in, values, values,
        [](LXLocale* locale, const std::string& text) {
          return LXStringToDouble(locale, text.data(), length(text.size()), nullptr, 0);
        },
        [](LXLocale* locale, const std::u16string& text) {
          return LXStringToDoubleU(locale, lx_units(text), length(text.size()), nullptr, 0);
        },
        [](const char* text) { return std::strtod(text, nullptr); }, icu::double_reader(text_.icu));
  }

  void read_times(const Pattern& pattern) {
    if (!start("read", pattern.label)) return;
    const auto in = std::make_shared<Inputs>();
    std::vector<double> expected, icu_expected;
    for (size_t i = 0; i < kManyPieces; ++i) {
      LXUChar text[kRoomUnits];
      const std::u16string format = to_utf16(pattern.ours);
      const size_t units = count(LXTimeToStringU(locale_, &values_.times[i], text, kRoomUnits, lx_units(format),
                                                 length(format.size()), 0));
      in->add(locale_, to_utf8(std::u16string(text, text + units)));
      LXTime time = values_.times[i];
      if (!pattern.to_the_second) time.hours = time.minutes = time.seconds = 0;
      expected.push_back(key_of(time));
      icu_expected.push_back(values_.dates[i] -
                             (pattern.to_the_second ? 0 : std::fmod(values_.dates[i], 86400e3)));
    }
    Inputs format;
    format.add(locale_, pattern.ours);
    readers(
        in, expected, icu_expected,
        [format = format.codepage[0]](LXLocale* locale, const std::string& text) {
          LXTime time{};
          LXStringToTime(locale, &time, text.data(), length(text.size()), format.data(), length(format.size()),
                         0);
          return key_of(time);
        },
        [format = format.utf16[0]](LXLocale* locale, const std::u16string& text) {
          LXTime time{};
          LXStringToTimeU(locale, &time, lx_units(text), length(text.size()), lx_units(format),
                          length(format.size()), 0);
          return key_of(time);
        },
        [format = pattern.glibc](const char* text) {
          tm time{};
          strptime(text, format, &time);
          return key_of(time);
        },
        icu::time_reader(text_.icu, pattern.icu));
  }

  RowMaker& make_;
  const Text& text_;
  std::shared_ptr<LXLocale> owner_;
  LXLocale* locale_;
  const Values& values_;
  SystemLocale system_;
};

}  // namespace

void add_formatting_rows(Table* table) {
  static const Values values = make_values();  // the rows refer to them
  RowMaker make(table);
  for (const Text& text : kTexts) {
    if (!table->wants_some(std::string("write/") + text.label + "/") &&
        !table->wants_some(std::string("read/") + text.label + "/"))
      continue;
    const LocalePointer locale = open_locale(text.locale);
    if (locale != nullptr) TextRows(&make, text, locale, values).add();
  }
}

}  // namespace bench
