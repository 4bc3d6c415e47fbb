// lexicor.hpp: that its results are those of the C functions, whatever their length and however a text is cut; that
// errors come as they were asked for; and that what callers give, comparators and transfers, fits the standard library.
#include <gtest/gtest.h>

#include <algorithm>
#include <map>

#include "lexicor.hpp"
#include "support/catalog_builder.h"

namespace lexicor {
namespace {

class CppTest : public testing::Test {
 protected:
  static std::string repeated(const std::string& text, size_t times) {
    std::string all;
    for (size_t i = 0; i < times; ++i) all += text;
    return all;
  }
  const Library library_{LEXICOR_LOCALE_DIR, LX_NO_DEFAULTS};
  const Locale host_{"Japanese.IBM930"}, utf8_{"Japanese.UTF-8"}, german_{"German_Germany.UTF-8"};
};

TEST_F(CppTest, ErrorsAreThrownOrStored) {
  std::error_code error;
  EXPECT_FALSE(Locale("Klingon", 0, error));
  EXPECT_EQ(error, code(LX_E_NO_LANGUAGE));
  EXPECT_STREQ(error.category().name(), "lexicor");
  EXPECT_EQ(error.message(), LXGetErrorText(LX_E_NO_LANGUAGE));
  EXPECT_TRUE(german_.compare("a", "b", 0, error) < 0 && !error);
  german_.compare("a", "b", 0x10, error);
  EXPECT_EQ(error, std::errc::invalid_argument);
  try {
    german_.format(1.0, 0x10);
    FAIL();
  } catch (const std::system_error& thrown) {
    EXPECT_EQ(thrown.code(), code(LX_E_INVALID));
  }
  EXPECT_THROW(german_.text(LX_ITEM_DIGITS), std::system_error);
  EXPECT_THROW(Catalog(german_, "/nowhere.cat"), std::system_error);
  EXPECT_THROW(Stream(german_, 1, nullptr), std::system_error);
  EXPECT_THROW(Locale::native("xx_XX"), std::system_error);
}

TEST_F(CppTest, Owns) {
  Locale first("German.Latin1"), second = std::move(first);
  EXPECT_FALSE(first);
  first = std::move(second);
  EXPECT_EQ(first.name(), "German_Germany.Latin1@Default");
  Library other(LEXICOR_LOCALE_DIR), moved = std::move(other);
  EXPECT_TRUE(moved && !other && !moved.built_in());
  EXPECT_EQ(Library::names(LX_LANGUAGE).size(), 126u);
  first.set(LX_ITEM_CURRENCY, "DM");
  first.set(LX_ITEM_CURRENCY_DIGITS, 0);
  EXPECT_EQ(first.text(LX_ITEM_CURRENCY) + std::to_string(first.number(LX_ITEM_CURRENCY_DIGITS)), "DM0");
  first.set(LX_ITEM_CURRENCY, "");
  EXPECT_EQ(first.text(LX_ITEM_CURRENCY), "");
  EXPECT_EQ(Locale::native("de_DE.UTF-8").name(), Locale::native("de_DE.utf8").name());
  EXPECT_NE(first.digest(LX_CODEPAGE), german_.digest(LX_CODEPAGE));
  EXPECT_EQ(first.digest(LX_SORT), german_.digest(LX_SORT));
}

// Results of every length around those that are tried first.
TEST_F(CppTest, SizesAreFound) {
  const Locale latin("German.Latin1");
  for (size_t n : {0u, 1u, 60u, 63u, 64u, 65u, 127u, 128u, 129u, 250u, 255u, 257u, 100000u}) {
    const std::string text = repeated("ß", n), digits(n, '1');
    EXPECT_EQ(german_.upper(text), repeated("SS", n)) << n;
    EXPECT_EQ(host_.map(convert(host_, utf8_, repeated("ｱ", n)), LX_MAP_FULL_WIDTH),
              convert(host_, utf8_, repeated("ア", n)))
        << n;
    EXPECT_EQ(german_.from_unicode(german_.to_unicode(text)), text) << n;
    EXPECT_EQ(latin.from_unicode(std::u16string(n, u'ß')), repeated("\xDF", n)) << n;
    std::string key(4 * n + 16, '\0');
    key.resize(static_cast<size_t>(LXStrxfrm(german_.get(), reinterpret_cast<uint8_t*>(key.data()),
                                             static_cast<int32_t>(key.size()), digits.data(),
                                             static_cast<int32_t>(n), 0)));
    EXPECT_EQ(german_.key(digits), key) << n;
    if (n >= 1000) continue;
    EXPECT_EQ(german_.format(LXTime{}, repeated("ß", n) + "%S"), repeated("ß", n) + "00") << n;
  }
}

TEST_F(CppTest, WritesAndReads) {
  EXPECT_EQ(german_.format(-1234567), "-1.234.567");
  EXPECT_EQ(german_.format(1234.5), "1.234,50");
  EXPECT_EQ(german_.format_currency(1234.5), "1.234,50 €");
  const LXTime time{5, 9, 14, 21, 10, 126, 6, 324};
  EXPECT_EQ(german_.format(time, "%A, %d. %B %Y"), "Samstag, 21. November 2026");
  std::tm calendar{};
  calendar.tm_mon = 2, calendar.tm_mday = 1;
  EXPECT_EQ(german_.format(calendar, "%d. %B"), "01. März");
  const auto read = german_.parse_time("21. November 2026!", "%d. %B %Y");
  EXPECT_EQ(read.value.month + read.value.year + read.value.day, 10 + 126 + 21);
  EXPECT_EQ(read.bytes, 17u);
  EXPECT_EQ(german_.parse_number("1.234,5 kg").value, 1234.5);
  EXPECT_EQ(german_.parse_number("1.234,5 kg").bytes, 7u);
  EXPECT_EQ(german_.parse_integer("x").bytes, 0u);
  EXPECT_EQ(german_.parse_integer("0xff", 0).value, 255);
}

TEST_F(CppTest, OrdersInTheStandardLibrary) {
  std::vector<std::string> words = {"zebra", "Äpfel", "apfel", "Zaun", "äpfel", "Apfel"}, by_key = words;
  std::sort(words.begin(), words.end(), Less(german_));
  EXPECT_EQ(words, (std::vector<std::string>{"apfel", "Apfel", "äpfel", "Äpfel", "Zaun", "zebra"}));
  const Key key(german_);
  std::sort(by_key.begin(), by_key.end(), [&](const auto& a, const auto& b) { return key(a) < key(b); });
  EXPECT_EQ(by_key, words);
  std::map<std::u16string, int, Less> map{Less(german_, LX_CASE_INSENSITIVE)};
  map[u"Äpfel"] = 1;
  map[u"äpfel"] = 2;
  EXPECT_EQ(map.size(), 1u);
  EXPECT_NE(map.find(std::u16string_view(u"ÄPFEL")), map.end());
  const Less narrow(utf8_, LX_WIDTH_INSENSITIVE);
  EXPECT_TRUE(narrow("ab", "abc") && !narrow("abc", "ab") && !narrow("ｱ", "ア") && !narrow("ア", "ｱ"));
}

// A text in pieces of every length becomes what it is as a whole, there and back, in all shift states.
TEST_F(CppTest, ConvertsPieces) {
  const std::string text = "a日本b語ｱ\nc€", whole = convert(host_, utf8_, text);
  for (size_t piece = 1; piece <= text.size(); ++piece) {
    std::string there, back;
    Conversion to(host_, utf8_), from(utf8_, host_);
    for (size_t i = 0; i < text.size(); i += piece) to.convert(std::string_view(text).substr(i, piece), there);
    to.finish(there);
    EXPECT_EQ(there, whole) << piece;
    for (size_t i = 0; i < there.size(); i += piece)
      from.convert(std::string_view(there).substr(i, piece), back);
    from.finish(back);
    EXPECT_EQ(back, convert(utf8_, host_, whole)) << piece;
  }
  std::error_code error;
  std::string output;
  Conversion cut(host_, utf8_);
  for (const char* const next : {"", "\xA5"}) {
    cut.convert("日\xE6\x97", output), cut.convert(next, output);
    cut.finish(output, error);
    EXPECT_EQ(error == code(LX_E_INPUT_CUT), *next == '\0');
  }
  EXPECT_EQ(output, convert(host_, utf8_, "日") + convert(host_, utf8_, "日日"));
  const Conversion moved = std::move(cut);
  cut.convert("a", output, error);
  EXPECT_EQ(error, code(LX_E_INVALID));
}

TEST_F(CppTest, Streams) {
  const std::string text = convert(host_, utf8_, "日本\n語\n\nend");
  std::string taken;
  Stream writer(host_, LX_STREAM_WRITE, [&](const char* bytes, size_t count) {
    taken.append(bytes, std::min<size_t>(count, 1));
    return std::min<size_t>(count, 1);
  });
  Stream out = std::move(writer);
  out.write(text);
  out.write(convert(host_, utf8_, "日"));
  out.close();
  EXPECT_THROW(out.write("a"), std::system_error);
  EXPECT_EQ(convert(utf8_, host_, taken), "日本\n語\n\nend日");
  EXPECT_EQ(taken.back(), '\x0F');

  size_t at = 0;
  Stream reader(host_, LX_STREAM_READ, [&](char* bytes, size_t count) {
    if (at > text.size() + 1) throw std::runtime_error("over");
    count = text.copy(bytes, count, std::min(at, text.size()));
    at += std::max<size_t>(count, 1);
    return count;
  });
  std::vector<std::string> lines;
  while (const auto line = reader.line()) lines.push_back(convert(utf8_, host_, *line));
  EXPECT_EQ(lines, (std::vector<std::string>{"日本\n", "語\n", "\n", "end"}));
  EXPECT_THROW(reader.line(), std::runtime_error);
}

// Messages of any length, also those that fill what is tried first but a byte.
TEST_F(CppTest, Messages) {
  const lx::test::ScratchDirectory directory;
  std::map<uint32_t, std::string> messages;
  for (uint32_t bytes = 1; bytes <= 1100; bytes += bytes < 240 || bytes > 260 ? 83 : 1)
    messages[bytes] = std::string(bytes, 'x');
  directory.write("app.cat", lx::test::catalog_file({{1, messages}}));
  const Catalog catalog(german_, directory.file("app.cat"));
  for (const auto& [bytes, text] : messages) EXPECT_EQ(catalog.message(1, bytes), text) << bytes;
  EXPECT_EQ(catalog.message(2, 1, "otherwise"), "otherwise");
  EXPECT_THROW(catalog.message(2, 1), std::system_error);
}

}  // namespace
}  // namespace lexicor
