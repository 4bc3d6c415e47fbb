// Times: what each directive writes and reads, the kept rules one by one, and over random formats, records,
// sizes and texts that all forms say the same characters, in every kind of codepage.
#include <algorithm>
#include <random>

#include "core/library_fixture.h"
#include "core/lxformat.h"
#include "core/lxobjtypes.h"
#include "support/tiny_codepages.h"

namespace lx::test {
namespace {

using Units = std::vector<LXUChar>;

/// ASCII; a char beyond it stands for kana.
Units units(const std::string& text) {
  Units out;
  for (char c : text) out.push_back(static_cast<LXUChar>(c < 0 ? 0x3041 + (c & 0x3F) : c));
  return out;
}
template <class Text>
int32_t length_of(const Text& text) {
  return static_cast<int32_t>(text.size());
}
template <class Text>
Text first(const Text& text, size_t count) {
  return Text(text.begin(), text.begin() + static_cast<ptrdiff_t>(std::min(count, text.size())));
}

/// 4 July 2003, 14:05:09, a Friday.
constexpr LXTime kSample{9, 5, 14, 4, 6, 103, 5, 184};
constexpr LXTime kUntouched{-1, -2, -3, -4, -5, -6, -7, -8};

LXTime with(const LXTime& time, int32_t LXTime::*member, int32_t value) {
  LXTime changed = time;
  changed.*member = value;
  return changed;
}
bool same(const LXTime& a, const LXTime& b) {
  return memcmp(&a, &b, sizeof(LXTime)) == 0;
}

/// The functions of a form; those with shift states begin in the single-byte state.
template <class U>
struct Form {
  using Unit = U;
  int32_t (*encode)(LXLocale*, Unit*, int32_t, const LXUChar*, int32_t, int32_t);
  int32_t (*decode)(LXUChar*, int32_t, LXLocale*, const Unit*, int32_t, int32_t);
  int32_t (*write)(LXLocale*, const LXTime*, Unit*, int32_t, const Unit*, int32_t, uint32_t);
  int32_t (*read)(LXLocale*, LXTime*, const Unit*, int32_t, const Unit*, int32_t, uint32_t);
};
constexpr Form<char> kPlainForm{LXUnicodeToString, LXStringToUnicode, LXTimeToString, LXStringToTime};
constexpr Form<LXWChar> kWideForm{LXUnicodeToStringW, LXStringToUnicodeW, LXTimeToStringW, LXStringToTimeW};
constexpr Form<LXUChar> kUnicodeForm{nullptr, nullptr, LXTimeToStringU, LXStringToTimeU};
constexpr Form<char> kShiftForm{
    [](LXLocale* locale, char* to, int32_t size, const LXUChar* from, int32_t n, int32_t flags) {
      return LXUnicodeToStringEx(locale, to, 0, size, from, n, flags);
    },
    [](LXUChar* to, int32_t size, LXLocale* locale, const char* from, int32_t n, int32_t flags) {
      return LXStringToUnicodeEx(to, size, locale, from, 0, n, flags);
    },
    [](LXLocale* locale, const LXTime* time, char* to, int32_t size, const char* format, int32_t n,
       uint32_t flags) { return LXTimeToStringEx(locale, time, to, 0, size, format, 0, n, flags); },
    [](LXLocale* locale, LXTime* time, const char* text, int32_t n, const char* format, int32_t m,
       uint32_t flags) { return LXStringToTimeEx(locale, time, text, 0, n, format, 0, m, flags); }};

enum class Kind { kPlain, kShift, kWide, kUnicode };
constexpr Kind kKinds[] = {Kind::kPlain, Kind::kShift, Kind::kWide, Kind::kUnicode};
template <class Body>
auto with_form(Kind kind, const Body& body) {
  return kind == Kind::kPlain   ? body(kPlainForm)
         : kind == Kind::kShift ? body(kShiftForm)
         : kind == Kind::kWide  ? body(kWideForm)
                                : body(kUnicodeForm);
}

/// A text in the units of a form, in a block of its exact size, so that reading behind it is seen.
template <class Unit>
std::vector<Unit> encode(const Form<Unit>& form, LXLocale* locale, const Units& text) {
  if constexpr (sizeof(Unit) == sizeof(LXUChar)) return text;
  std::vector<Unit> room(6 * text.size() + 1);
  const int32_t n = form.encode(locale, room.data(), length_of(room), text.data(), length_of(text), 0);
  return std::vector<Unit>(room.begin(), room.begin() + n);
}
template <class Unit>
Units decode(const Form<Unit>& form, LXLocale* locale, const std::vector<Unit>& text) {
  if constexpr (sizeof(Unit) == sizeof(LXUChar)) return text;
  Units out(text.size() + 1);
  const int32_t n = form.decode(out.data(), length_of(out), locale, text.data(), length_of(text), 0);
  return first(out, static_cast<size_t>(std::max(n, 0)));
}
struct Result {
  int32_t code;
  int32_t count;
  Units text;   // written, without the null
  LXTime time;  // read
};

/// Formats into `size` units (characters: the bytes that they can take) before a margin that must stay.
Result written(LXLocale* locale, Kind kind, const LXTime& time, const Units& format, int32_t size = 2000,
               uint32_t flags = 0) {
  return with_form(kind, [&](const auto& form) {
    using Unit = typename std::decay_t<decltype(form)>::Unit;
    const bool characters = (flags & LX_CHARACTERS) != 0 && sizeof(Unit) == 1;
    const auto in = encode(form, locale, format);
    const size_t room = static_cast<size_t>(std::max(size, 0)) * (characters ? 6 : 1);
    std::vector<Unit> buffer(room + 8, 0x5A);
    const int32_t length = characters ? length_of(format) : length_of(in);
    const int32_t count = form.write(locale, &time, buffer.data(), size, in.data(), length, flags);
    Result out{LXGetError(locale), count, {}, time};
    EXPECT_LE(count, std::max(size, 0));
    EXPECT_EQ(std::count(buffer.begin() + static_cast<ptrdiff_t>(room), buffer.end(), 0x5A), 8);
    const bool null = count > 0 && (flags & LX_TERMINATE) != 0;
    int32_t units = std::max(count, 0) - null;
    if constexpr (sizeof(Unit) == 1) {
      if (characters) units = LXCpStrCharToByteLen(locale->codepage, buffer.data(), 0, units);
    }
    EXPECT_TRUE(!null || buffer[static_cast<size_t>(units)] == 0);
    out.text = decode(form, locale, first(buffer, static_cast<size_t>(units)));
    return out;
  });
}

Result parsed(LXLocale* locale, Kind kind, const Units& text, const Units& format, uint32_t flags = 0,
              const LXTime& before = kUntouched) {
  return with_form(kind, [&](const auto& form) {
    const bool characters = (flags & LX_CHARACTERS) != 0;
    const auto in = encode(form, locale, text), by = encode(form, locale, format);
    Result out{0, 0, {}, before};
    out.count = form.read(locale, &out.time, in.data(), characters ? length_of(text) : length_of(in), by.data(),
                          characters ? length_of(format) : length_of(by), flags);
    out.code = LXGetError(locale);
    return out;
  });
}

/// EBCDIC with two-byte kana; small letters where 930 has them, or where all others do.
TinyCodepage ebcdic(uint16_t id, const char* name, bool katakana) {
  CodepageBuilder builder(id, name, 2);
  builder.shift(0x0E, 0x0F).substitution(0x6F).map(0, 0).map(0x40, ' ').map(0x6C, '%').map(0x7B, '#');
  builder.map(0x6F, '?').map(0x6B, ',').map(0x61, '/').map(0x7A, ':').map(0x4B, '.').map(0x60, '-');
  builder.map(0x5E, ';').map(0x5B, '$').map(0xF0, '0', 10).map(0x4447, 0x3041, 83);
  builder.map(0xC1, 'A', 9).map(0xD1, 'J', 9).map(0xE2, 'S', 8);
  if (katakana)
    builder.map(0x62, 'a', 8).map(0x71, 'i', 8).map(0x8B, 'q').map(0x9B, 'r').map(0xAB, 's').map(0xB3, 't', 7);
  else
    builder.map(0x81, 'a', 9).map(0x91, 'j', 9).map(0xA2, 's', 8);
  return builder.build();
}

class TimeTest : public LibraryTest {
 protected:
  void open_built_in() {
    ASSERT_EQ(init("/nonexistent"), LX_W_DEFAULTS);
    add("");
  }
  /// Codepages of every kind, the first one without kana; names of days and months begin with kana, and with
  /// `long_names` the days run together, and afternoon is called like morning.
  void open(bool long_names = false) {
    std::vector<TinyCodepage> all{tiny_single(), tiny_shift_jis(), tiny_euc(), tiny_utf8()};
    all.push_back(ebcdic(9010, "TINY-EBCDIC", false));
    all.push_back(ebcdic(930, "TINY-930", true));
    std::vector<ScratchDirectory::Codepage> files{{367, "US-ASCII", ascii_codepage()}};
    for (const TinyCodepage& codepage : all) files.push_back(codepage.file);
    std::sort(files.begin(), files.end(), [](const auto& a, const auto& b) { return a.id < b.id; });
    directory.write_locale(files);
    const Bytes built_in = kBuiltInLanguage.sections.section[0];
    ByteString payload(built_in.data, built_in.data + built_in.size);
    for (unsigned word = 7; word < 47; ++word) {
      uint8_t* name = payload.data() + le16(payload.data() + 2 * word);
      if (le16(name) != 0) put_le16(name, static_cast<uint16_t>(0x3041 + word));
      if (long_names && word > 7 && word < 14) put_le16(name - 2, 'x');
    }
    if (long_names) put_le16(payload.data() + le16(payload.data() + 2 * 48), 'A');
    directory.write("la_00001.nls", object_file({payload}));
    ASSERT_EQ(init(directory.path().c_str(), LX_NO_DEFAULTS), LX_OK);
    for (const TinyCodepage& codepage : all) add("English_UnitedStates." + codepage.file.name);
  }
  void TearDown() override {
    for (LXLocale* locale : locales) LXReleaseLocale(locale);
    LibraryTest::TearDown();
  }
  void add(const std::string& name) {
    locales.push_back(LXGetLocale(name.c_str(), 0, nullptr));
    ASSERT_NE(locales.back(), nullptr) << name;
  }
  void set(int32_t item, const std::string& text) {
    EXPECT_EQ(LXSetLocaleTextInfoU(locale(), item, units(text).data(), length_of(text), 0), 1);
  }
  /// The kinds that can say all characters of the locale; the plain one cannot where shift bytes are due.
  static std::vector<Kind> kinds(const LXLocale* locale) {
    const bool shift = (locale->flags & kLocaleShift) != 0;
    return std::vector<Kind>(std::begin(kKinds) + shift, std::end(kKinds));
  }
  LXLocale* locale() const { return locales.front(); }

  std::vector<LXLocale*> locales;
  std::mt19937 random{20030704};
  int below(int n) { return static_cast<int>(random() % static_cast<unsigned>(n)); }

  LXTime random_time() {
    LXTime time{below(60), below(60), below(24), below(32), below(12), below(100), below(7), below(366)};
    if (below(8) == 0) time.hours = 24;
    return time;
  }
  /// Directives, letters, kana, mistakes; nested formats at the start only, where forms agree on their place.
  std::string random_format(int most) {
    static const char kLetters[] = "aAbBdHIjmMpSUwWyYaAbBdHIjmMpSwyY%";
    std::string format = below(4) == 0 ? std::string(below(2) == 0 ? "%" : "%#") + "cxX"[below(3)] : "";
    for (int n = below(most); n > 0; --n) {
      const int what = below(12);
      if (what < 7)
        format += std::string(what < 5 ? "%" : "%#") + kLetters[below(sizeof(kLetters) - 1)];
      else
        format += static_cast<char>(what < 9 ? 'd' + below(16) : what < 11 ? 0x80 + below(63) : '%');
    }
    return format;
  }
};

TEST_F(TimeTest, Written) {
  open_built_in();
  struct Case {
    std::string format, text;
    int32_t code = 0;
    int32_t size = 99;
    LXTime time = kSample;
  };
  const LXTime new_year{0, 0, 0, 1, 0, 104, 4, 0};
  // A number says that the buffer is full also when it just fitted.
  // clang-format off
  std::vector<Case> cases{
      {"%X", "2:05:09 PM"}, {"%x", "7/4/03"}, {"%c", "7/4/03 2:05:09 PM"}, {"", ""},
      {"%#c", "Friday, July 04, 2003 2:05:09 PM"},
      {"%a %A %b %B %d %H %I %j %m %M", "Fri Friday Jul July 04 14 02 184 07 05"},
      {"%p %S %U %w %W %y %Y 100%% %#%", "PM 09 26 5 26 03 2003 100% %"},
      {"%#d %#H %#I %#j %#m %#M %#S %#U %#y %#Y", "4 14 2 184 7 5 9 26 03 2003"},
      {"%#d %#H %#I %j %#j %I %#y %#U %W %p", "1 0 12 000 0 12 04 0 00 AM", 0, 99, new_year},
      {"%U %W", "27 26", 0, 99, with(kSample, &LXTime::weekday, 0)},
      {"%I %p", "12 PM", 0, 99, with(kSample, &LXTime::hours, 12)},
      {"%y %Y %#y %#Y", "00 0000 0 0", 0, 99, with(kSample, &LXTime::year, -1900)},
      {"%y %Y %#y", "12 0012 12", 0, 99, with(kSample, &LXTime::year, -1912)},
      {"%y %Y", "48 1748", 0, 99, with(kSample, &LXTime::year, INT32_MIN)},
      {"%c", "7/", 37, 99, with(kSample, &LXTime::day, -1)},
      {"ab%S", "ab", 40, 2, with(kSample, &LXTime::seconds, 60)},
      {"%d", "04", 0, 3}, {"%d", "04", 40, 2}, {"%Y", "2003", 40, 4},
      {"%d", "0", 40, 1}, {"%d", "", 40, 0}, {"%d", "", 40, -1},
      {"%A", "Friday", 0, 6}, {"%A", "Frida", 40, 5}, {"abc", "abc", 0, 3}, {"ab%", "ab", 40, 2},
      {"%x", "7/4/03", 40, 6}, {"%c", "7/4/03 ", 40, 7}, {"%c", "7/4/03 2", 40, 8},
      {"%c", "7/4/03 2:05:09 PM", 0, 17}};
  // clang-format on
  for (const char* bad : {"a%", "a%#", "a%Z", "a%z", "a%##d", "a% d"}) cases.push_back({bad, "a", 51});
  struct Field {
    int32_t LXTime::*member;
    int32_t most;
    const char* directives;
  };
  for (const Field& field : {Field{&LXTime::seconds, 59, "S"},
                             {&LXTime::minutes, 59, "M"},
                             {&LXTime::hours, 23, "HIp"},
                             {&LXTime::day, 31, "d"},
                             {&LXTime::month, 11, "bBm"},
                             {&LXTime::weekday, 6, "aAwUW"},
                             {&LXTime::day_of_year, 365, "jUW"}})
    for (const char* letter = field.directives; *letter != 0; ++letter) {
      const std::string format = std::string("%") + *letter;
      for (int32_t value : {-1, field.most + 1})
        cases.push_back({format, "", 37, 99, with(kSample, field.member, value)});
      EXPECT_EQ(written(locale(), Kind::kWide, with(kSample, field.member, field.most), units(format)).code, 0);
    }
  for (const Case& c : cases)
    for (Kind kind : kKinds)
      for (uint32_t null : {0u, uint32_t{LX_TERMINATE}}) {
        SCOPED_TRACE(testing::Message() << c.format << " kind " << int(kind));
        const int32_t extra = null != 0 && c.size > 0 ? 1 : 0;
        const Result out = written(locale(), kind, c.time, units(c.format), c.size + extra, null);
        EXPECT_EQ(out.text, units(c.text));
        EXPECT_EQ(out.code, c.code);
        EXPECT_EQ(out.count, length_of(c.text) + extra);
      }
  EXPECT_EQ(written(locale(), Kind::kUnicode, kSample, {'%', 0x164}).code, 51) << "its low byte is a letter";
}

TEST_F(TimeTest, NestedFormats) {
  open_built_in();
  // They go to the start of the buffer, whose work copy by characters is cleared.
  for (const auto& [format, text] : {std::pair("on %x.", "7/4/03~~~."),
                                     {"At %X!", "2:05:09 PM~~~!"},
                                     {"Week %W%c", "7/4/036~~~~~~ 2:05:09 PM"}})
    for (uint32_t flags : {0u, uint32_t{LX_CHARACTERS}}) {
      std::string buffer(40, '~'), expected = text;
      if (flags != 0) std::replace(expected.begin(), expected.end(), '~', '\0');
      const int32_t count = LXTimeToString(locale(), &kSample, buffer.data(), 40, format, -1, flags);
      EXPECT_EQ(first(buffer, static_cast<size_t>(count)), expected);
    }
  for (Kind kind : kKinds) {
    set(LX_ITEM_TIME_FORMAT, "a%X");
    EXPECT_EQ(written(locale(), kind, kSample, units("%X")).code, 51);
    EXPECT_EQ(parsed(locale(), kind, units("aaaaaaaa"), units("%X")).code, 51);
    EXPECT_EQ(written(locale(), kind, kSample, units("%X"), 99, LX_TERRITORY_VALUES).text, units("2:05:09 PM"));
    set(LX_ITEM_TIME_FORMAT, "%x");
    set(LX_ITEM_SHORT_DATE_FORMAT, "%#x");
    set(LX_ITEM_LONG_DATE_FORMAT, "%d");
    EXPECT_EQ(written(locale(), kind, kSample, units("%X")).text, units("04")) << "three deep";
    EXPECT_EQ(parsed(locale(), kind, units("17"), units("%X")).time.day, 17);
    set(LX_ITEM_LONG_DATE_FORMAT, "123456789012345678901234567890%d");
    EXPECT_EQ(written(locale(), kind, kSample, units("%#x")).code, 51) << "cut to 31 units, behind the %";
  }
}

TEST_F(TimeTest, LongAndEqualNames) {
  open(true);
  for (LXLocale* in : locales)
    for (Kind kind : kinds(in)) {
      const bool bytes = kind < Kind::kWide && in != locale();  // three for a kana at most, and shift bytes
      const Result out = written(in, kind, with(kSample, &LXTime::weekday, 0), units("%A."));
      EXPECT_TRUE(bytes ? out.text.size() < 31 && out.count >= 28 : out.count == 32) << out.count;
      EXPECT_EQ(out.text.back(), '.');
      for (int32_t size = 1; size < 28; ++size)
        EXPECT_EQ(written(in, kind, with(kSample, &LXTime::weekday, 0), units("%A"), size).code, 40);
      EXPECT_EQ(parsed(in, kind, units("9AM"), units("%I%p")).time.hours, 9) << "the first of equal names";
    }
}

TEST_F(TimeTest, Parsed) {
  open_built_in();
  struct Case {
    const char* text;
    const char* format;
    int32_t count;
    LXTime time = kUntouched;
    int32_t code = 0;
  };
  const auto only = [](int32_t LXTime::*member, int32_t value) { return with(kUntouched, member, value); };
  const LXTime date = with(with(only(&LXTime::month, 6), &LXTime::day, 4), &LXTime::year, 3);
  const LXTime five = only(&LXTime::seconds, 5);
  // clang-format off
  const Case cases[] = {
      {"7/4/03", "%#m/%#d/%y", 6, date}, {"7/4/03", "%c", -1, date, 37}, {"7/4/03 ", "%c", 7, date},
      {"2:05:09 PM", "%X", 10, {9, 5, 14, -4, -5, -6, -7, -8}},
      {"12:00:00 AM", "%X", 11, {0, 0, 0, -4, -5, -6, -7, -8}},
      {"12:30:00 PM", "%X", 11, {0, 30, 12, -4, -5, -6, -7, -8}},
      {"7/4/03 2:05:09 PM", "%c", 17, {9, 5, 14, 4, 6, 3, -7, -8}},
      {"Friday, July 04, 2003T2:05:09 AM", "%#c", 32, {9, 5, 2, 4, 6, 103, 5, -8}},
      {"Mayday", "%B", 3, only(&LXTime::month, 4)}, {"sun", "%a", -1, kUntouched, 37},
      {"32", "%d", -1, only(&LXTime::day, 32), 37}, {"123", "%d", 2, only(&LXTime::day, 12)},
      {"0", "%m", 1, only(&LXTime::month, -1)}, {"13", "%m", -1, only(&LXTime::month, 12), 37},
      {"x", "%d", -1, kUntouched, 37}, {"366", "%j", 3, only(&LXTime::day_of_year, 366)},
      {"7", "%w", -1, only(&LXTime::weekday, 7), 37}, {"1", "%Y", 1, only(&LXTime::year, -1899)},
      {"13", "%I", -1, only(&LXTime::hours, 13), 37}, {"PM2AM", "%p%I%p", 5, only(&LXTime::hours, 2)},
      {"AM2PM", "%p%I%p", 5, only(&LXTime::hours, 14)}, {"PM15", "%p%H", 4, only(&LXTime::hours, 15)},
      {"5%x", "%S%%%", -1, five, 51}, {"5%", "%S%%%", 2, five}, {"5x", "%S%#", -1, five, 51},
      {"5x", "%S%%", -1, five, 37}, {"5x", "%Sy", -1, five, 37}, {"5", "%U", -1, kUntouched, 51},
      {"5", "%W", -1, kUntouched, 51}, {"5", "%z", -1, kUntouched, 51}, {"", "%d", 0}, {"5", "", 0}};
  // clang-format on
  for (const Case& c : cases)
    for (Kind kind : kKinds)
      for (uint32_t flags : {0u, uint32_t{LX_TERRITORY_VALUES}, uint32_t{LX_CHARACTERS}}) {
        SCOPED_TRACE(testing::Message() << c.text << " by " << c.format << " kind " << int(kind));
        const Result out = parsed(locale(), kind, units(c.text), units(c.format), flags);
        EXPECT_EQ(out.count, c.count);
        EXPECT_EQ(out.code, c.code);
        EXPECT_TRUE(same(out.time, c.time));
      }
  for (Kind kind : kKinds)
    for (const Result& refused :
         {written(locale(), kind, kSample, units("%d"), 9, 0x10), parsed(locale(), kind, {}, {}, LX_TERMINATE)})
      EXPECT_TRUE(refused.count == -1 && refused.code == 2);
}

TEST_F(TimeTest, FormsWriteTheSame) {
  open();
  for (int round = 0; round < 3000; ++round) {
    LXLocale* in = locales[static_cast<size_t>(below(length_of(locales)))];
    const LXTime time = random_time();
    const Units format = units(random_format(8));
    const Result whole = written(in, Kind::kUnicode, time, format);
    for (Kind kind : kinds(in)) {
      SCOPED_TRACE(testing::Message() << round << " " << in->codepage->disk.name << " kind " << int(kind));
      // In the codepage's characters.
      const Units text =
          with_form(kind, [&](const auto& f) { return decode(f, in, encode(f, in, whole.text)); });
      const Result out = written(in, kind, time, format);
      ASSERT_TRUE(out.text == text && out.code == whole.code);
      const int32_t size = below(24);
      const Result cut = written(in, kind, time, format, size, below(2) == 0 ? 0 : LX_TERMINATE);
      ASSERT_EQ(cut.text, first(text, cut.text.size())) << "whole characters";
      ASSERT_TRUE(cut.code == 40 || (cut.text == text && cut.code == whole.code));
      ASSERT_TRUE(cut.code != 40 || kind < Kind::kWide || cut.count == size);
      // By characters: as many as asked for, without a code, where the work buffer held everything.
      const Result chars = written(in, kind, time, format, size, LX_CHARACTERS | LX_TERMINATE);
      const int32_t work = kind < Kind::kWide ? 6 * size : size;
      ASSERT_EQ(chars.text, first(text, chars.text.size()));
      ASSERT_TRUE(chars.code != 40 || out.count + 4 > work);
      ASSERT_TRUE(chars.code == 40 || chars.count == std::min(size, length_of(text) + 1));
    }
  }
}

TEST_F(TimeTest, FormsReadTheSameAndWhatWasWritten) {
  open();
  int read_back = 0;
  for (int round = 0; round < 4000; ++round) {
    LXLocale* in = locales[1 + static_cast<size_t>(below(length_of(locales) - 1))];
    const std::string format_text = random_format(6);
    const Units format = units(format_text);
    const LXTime time = random_time();
    const Result original = written(in, Kind::kUnicode, time, format);
    // A character that the end cuts is read differently where characters are bytes: no text ends in one.
    Units text = original.text;
    text.insert(text.end(), 4, 'z');
    const bool changed = below(2) == 0;
    if (changed)
      text[static_cast<size_t>(below(length_of(text) - 3))] = units(
          "7%\x91"
          "a")[static_cast<size_t>(below(4))];
    const Result whole = parsed(in, Kind::kUnicode, text, format, LX_CHARACTERS, time);
    for (Kind kind : kinds(in)) {
      SCOPED_TRACE(testing::Message() << round << " " << in->codepage->disk.name << " kind " << int(kind));
      const Result out = parsed(in, kind, text, format, LX_CHARACTERS, time);
      ASSERT_TRUE(out.code == whole.code && out.count == whole.count && same(out.time, whole.time));
    }
    if (changed || original.code != 0 || whole.code != 0 ||
        format_text.find_first_of("#I") != std::string::npos)
      continue;
    ASSERT_EQ(whole.count, length_of(original.text));
    ASSERT_EQ(written(in, Kind::kUnicode, whole.time, format).text, original.text);
    ++read_back;
  }
  EXPECT_GT(read_back, 200);
}

TEST_F(TimeTest, ShiftStatesAndLetters) {
  open();
  LXLocale *const utf8 = locales[3], *const ebcdic = locales[4], *const katakana = locales[5];
  struct Case {
    std::string format;
    LXShiftState state, format_state;
    std::string text;
    int32_t code, size = 9;
    uint32_t flags = 0;
  };
  // clang-format off
  const Case cases[] = {
      {"\x0E\x44\x47\x0F\x6C\x84", 0, 0, "\x0E\x44\x47\x0F\xF0\xF4", 0},
      {"\x44\x47\x0F\xC1", 0, 1, "\x0E\x44\x47\x0F\xC1", 0},
      {"\x44\x47", 1, 1, "\x44\x47\x0F", 0}, {"\x6C\x84", 1, 0, "\x0F\xF0\xF4", 0},
      {"\x0E\x44\x47\x44\x48", 0, 0, "\x0E\x44\x47\x0F", 40, 5},
      {"\x0E\x44\x47\x44", 0, 0, "\x0E\x44\x47\x0F", 51},
      {{"\x0E\0\x6C\0\x84", 5}, 0, 0, {"\x0E\0\x6C\0\x84\x0F", 6}, 0},
      {"\x0E\x44\x47\x44\x48", 0, 0, "\x0E\x44\x47\x0F", 0, 1, LX_CHARACTERS}};
  // clang-format on
  for (const Case& c : cases) {
    std::string buffer(9, '~');
    const bool characters = c.flags != 0;
    const int32_t count = LXTimeToStringEx(ebcdic, &kSample, buffer.data(), c.state, c.size, c.format.data(),
                                           c.format_state, characters ? 2 : length_of(c.format), c.flags);
    EXPECT_EQ(count, characters ? c.size : length_of(c.text));
    EXPECT_EQ(buffer, c.text + std::string(9 - c.text.size(), '~'));
    EXPECT_EQ(LXGetError(ebcdic), c.code);
  }
  // A Shift-In behind the last character is read with it, and one at the very end is no text left.
  LXTime time{};
  EXPECT_EQ(LXStringToTimeEx(ebcdic, &time, "\x0E\x44\x47\x0F\xF5", 0, 5, "\x0E\x44\x47", 0, 3, 0), 4);
  EXPECT_EQ(LXStringToTimeEx(ebcdic, &time, "\x44\x47\x0F", 1, 3, "\x44\x47\x0F\x6C\x84", 1, 5, 0), 3);
  EXPECT_EQ(LXStringToTimeEx(ebcdic, &time, "\x0E\xF0\xF4", 0, 3, "\x6C\x84", 0, 2, 0), -1);
  EXPECT_EQ(LXStringToTimeEx(ebcdic, &time, "\x44\x47", 0, 2, "\x0E\x44\x47", 0, 3, 0), -1);
  // The plain form has the letters of 930 where other EBCDIC has them; the other forms know better, above.
  char buffer[9];
  EXPECT_EQ(LXTimeToString(katakana, &kSample, buffer, 9, "\x6C\x84", -1, 0), 2);
  EXPECT_EQ(LXStringToTime(katakana, &time, "\xF4", -1, "\x6C\x84", -1, 0), 1);
  EXPECT_EQ(LXTimeToString(katakana, &kSample, buffer, 9, "\x6C\x65", -1, 0), 0);
  EXPECT_EQ(LXStringToTime(katakana, &time, "\xF4", -1, "\x6C\x65", -1, 0), -1);
  // Characters cut by an end, in a full buffer too.
  for (int32_t size : {1, 3}) {
    EXPECT_EQ(LXTimeToString(utf8, &kSample, buffer, size, "a\xE3\x81", 3, 0), 1);
    EXPECT_EQ(LXGetError(utf8), 51);
  }
  EXPECT_EQ(LXStringToTime(utf8, &time, "a\xE3\x81", 3, "a\xE3\x81\x81", 4, 0), 1);
  EXPECT_EQ(LXStringToTime(utf8, &time, "ab", 2, "a\xE3", 2, 0), 1);
  EXPECT_EQ(LXGetError(utf8), 0);
}

}  // namespace
}  // namespace lx::test
