// Translation of strings between codepages by number: random texts against the conversions between locales, for
// every pair of kinds and every size; then what only translation does, row by row; then refusals. What it says
// in the trace shows in tests/cases/cli/translate.txt.
#include <random>

#include "core/library_fixture.h"
#include "nls1.h"
#include "support/case_rows.h"
#include "support/tiny_codepages.h"

namespace lx::test {
namespace {

constexpr int32_t kTerm = LX_TERMINATE, kChars = LX_CHARACTERS;

// In a block of its size, so that whoever reads or writes beyond it is seen.
using Bytes = std::vector<char>;

struct Translated {
  Bytes output;
  int32_t result = 0, consumed = 9999;
  uint32_t rc = 99;
};
Translated translate(int32_t to, int32_t from, const Bytes& input, int32_t length, int32_t size, int32_t flags,
                     size_t room) {
  Translated t{Bytes(room, '\xA5')};
  t.result =
      NLS1_TranslateString(to, from, t.output.data(), size, input.data(), length, &t.consumed, flags, &t.rc);
  return t;
}

/// Two codepages, null for UTF-16, and a text.
struct Pair {
  TinyLibrary& library;
  const TinyCodepage* to;
  const TinyCodepage* from;
  Bytes input;

  static int32_t number(const TinyCodepage* cp) { return cp != nullptr ? cp->file.id : NLS1_UTF16; }

  /// What the conversion of the core gives, counted as the translation counts.
  int32_t convert(const Bytes& text, int32_t length, int32_t size, int32_t flags, char* out) const {
    const int32_t unit = (flags & kChars) != 0 ? 1 : 2;
    const auto* const units = reinterpret_cast<const LXUChar*>(text.data());
    LXLocale* const target = to != nullptr ? library.locale(*to) : nullptr;
    if (from == nullptr)
      return LXUnicodeToStringEx(target, out, 0, size, units, length < 0 ? -1 : length / unit, flags);
    LXLocale* const source = library.locale(*from);
    if (to != nullptr) return LXConvertStringEx(target, out, 0, size, source, text.data(), 0, length, flags);
    return unit * LXStringToUnicodeEx(reinterpret_cast<LXUChar*>(out), size / unit, source, text.data(), 0,
                                      length, flags);
  }

  Bytes output_of(const Bytes& text) const {
    Translated t = translate(number(to), number(from), text, static_cast<int32_t>(text.size()), 4000, 0, 4000);
    t.output.resize(static_cast<size_t>(t.result));
    return t.output;
  }

  void check(const Bytes& text, int32_t length, int32_t size, int32_t flags) const {
    SCOPED_TRACE(testing::Message() << number(from) << " to " << number(to) << ": " << length << ' ' << size
                                    << ' ' << flags);
    const size_t room = static_cast<size_t>(size) * ((flags & kChars) != 0 ? 5 : 1);
    const Translated t = translate(number(to), number(from), text, length, size, flags, room);
    const bool closes = to != nullptr && to->shift, units = to == nullptr && from == nullptr;
    Bytes expected(room, '\xA5');
    const int32_t result = units ? t.result : convert(text, length, size, flags, expected.data());
    if (closes && flags == 0 && length > 0) {
      const auto before_shift = t.output.begin() + std::max(t.result - 1, 0);
      ASSERT_TRUE(std::equal(t.output.begin(), before_shift, expected.begin()));
    } else if (!closes && !units) {
      ASSERT_EQ(t.result, result);
      ASSERT_EQ(t.output, expected);
    }
    if ((flags & kChars) != 0) return;
    const auto at = input.begin() + t.consumed;
    EXPECT_EQ(t.rc, at == input.end() ? LX_OK : LX_E_SIZE);
    if (closes ||
        (from != nullptr && from->shift &&
         std::count(input.begin(), at, from->shift_out) != std::count(input.begin(), at, from->shift_in)))
      return;
    // What was consumed and what was not give the whole, each on its own.
    Bytes parts = output_of({input.begin(), at});
    EXPECT_TRUE(std::equal(parts.begin(), parts.end(), t.output.begin()));
    for (char byte : output_of({at, input.end()})) parts.push_back(byte);
    EXPECT_EQ(parts, output_of(input));
  }
};

TEST(Translate, AgreesWithConversion) {
  expect_in_child("random texts", _exit, [] {
    TinyLibrary library;
    const std::vector<TinyCodepage> all = tiny_codepages();
    std::mt19937 random(8);
    for (size_t i = 0; i < 4 * (all.size() + 1) * (all.size() + 1); ++i) {
      const size_t f = i / 4 % (all.size() + 1), t = i / 4 / (all.size() + 1);
      const auto& characters = all[f < all.size() ? f : random() % all.size()].characters;
      const int32_t chars = std::initializer_list<int32_t>{1, 3, 9, 70}.begin()[i % 4];
      std::vector<uint16_t> text(static_cast<size_t>(chars));
      for (size_t at = 0; at < text.size(); ++at)
        while (text[at] == 0)
          text[at] = at % 20 > 3 ? text[at - 1] : characters[random() % characters.size()].unicode;
      std::string bytes(reinterpret_cast<const char*>(text.data()), 2 * text.size());
      if (f < all.size()) bytes = all[f].encode(text);
      const Pair pair{library,
                      t < all.size() ? &all[t] : nullptr,
                      f < all.size() ? &all[f] : nullptr,
                      {bytes.begin(), bytes.end()}};
      const Bytes with_null(bytes.c_str(), bytes.c_str() + bytes.size() + 1);
      Bytes ended = with_null;
      if (pair.from == nullptr) ended.push_back('\0');
      for (int32_t flags : {0, kTerm, kChars, kTerm | kChars}) {
        for (int32_t size = pair.to == nullptr ? 2 : 1; size < 3 * chars + 6; size += 1 + size / 40) {
          // A count of characters takes in the shift byte behind them: the byte there must be readable.
          if ((flags & kChars) != 0)
            pair.check(with_null, chars, size, flags);
          else
            pair.check(pair.input, static_cast<int32_t>(bytes.size()), size, flags);
          pair.check(ended, -1, size, flags);
        }
      }
    }
  });
}

/// The codepage of a letter, or the flags of some.
int32_t number_of(const std::string& letters) {
  static const std::map<char, int32_t> numbers{{'S', 9001},
                                               {'J', 9002},
                                               {'V', 57352},
                                               {'H', 9005},
                                               {'U', NLS1_UTF16},
                                               {'p', NLS1_PAD},
                                               {'d', NLS1_DROP_BLANKS},
                                               {'c', kChars},
                                               {'t', kTerm},
                                               {'1', 1},
                                               {'!', 0x100}};
  int32_t sum = 0;
  for (char letter : letters) sum |= numbers.at(letter);
  return sum;
}

TEST(Translate, Ends) {
  expect_in_child("rows", _exit, [] {
    // A single-byte codepage has no shift states, whatever it says.
    std::vector<TinyCodepage> codepages = tiny_codepages();
    codepages[0].file.sections[0][format::codepage::kShiftOut] = 'a';
    codepages[0].file.sections[0][format::codepage::kFlags] = format::codepage::kFlagShift;
    TinyLibrary library(codepages);
    for (const CaseRow& row : case_rows("nls1/translation_ends.txt")) {
      SCOPED_TRACE(row.where);
      const Bytes input(row[4].begin(), row[4].end()), output(row[5].begin(), row[5].end());
      const int32_t size = row.number(2), flags = number_of(row[3]), consumed = row.number(6);
      const int32_t length = row.fields.size() > 8 ? row.number(8) : static_cast<int32_t>(input.size());
      const bool by_chars = (flags & kChars) != 0;
      // One byte more where a character is taken back for the shift byte.
      const size_t room = by_chars ? output.size() + 1 : static_cast<size_t>(std::max(size, 0));
      Translated t = translate(number_of(row[0]), number_of(row[1]), input, length, size, flags, room);
      EXPECT_EQ(t.result, by_chars || consumed < 0 ? consumed : static_cast<int32_t>(output.size()));
      EXPECT_EQ(t.consumed, std::max(consumed, 0));
      EXPECT_EQ(t.rc, static_cast<uint32_t>(row.number(7)));
      t.output.resize(output.size());
      EXPECT_EQ(t.output, output);
    }
  });
}

class TranslateTest : public LibraryTest {};

// Built-in data may serve a locale whose codepage has no file; a translation is refused each time.
TEST_F(TranslateTest, CodepagesThatCannotBeHad) {
  directory.write_locale(
      {{367, "US-ASCII", ascii_codepage()}, {954, "NoFile", ascii_codepage()}, {955, "Bad", ascii_codepage()}});
  unlink(directory.file("cp_00954.nls").c_str());
  directory.write_text("cp_00955.nls", std::string(100, 'x'));
  setenv("NLS1_LOCALEDIR", directory.path().c_str(), 1);
  expect_in_child("codepages", _exit, [] {
    const int32_t cases[][3] = {{367, 954, LX_E_NO_CODEPAGE},    {954, 367, LX_E_NO_CODEPAGE},
                                {367, 955, LX_E_CORRUPT},        {955, 367, LX_E_NO_CODEPAGE},
                                {367, 1, LX_E_NOT_FOUND},        {65536 + 367, 367, LX_E_NOT_FOUND},
                                {-1, NLS1_UTF16, LX_E_NOT_FOUND}};
    char out = '#';
    uint32_t rc = 99;
    for (const auto& [to, from, code] : cases) {
      EXPECT_EQ(NLS1_TranslateString(to, from, &out, 1, "a", 1, nullptr, 1, &rc), -1);
      EXPECT_EQ(rc, static_cast<uint32_t>(code)) << from << " to " << to;
    }
    EXPECT_EQ(out, '#');
    const auto fail = [] { NLS1_TranslateString(1, 2, nullptr, 0, "a", 1, nullptr, 0, nullptr); };
    EXPECT_EQ(messages(RAS1_LEVEL_ERRORS, fail),
              (std::vector<std::string>{"Unable to locate codepage 2", "Unable to locate codepage 1"}));
    const auto translate = [&] {
      EXPECT_EQ(NLS1_TranslateString(367, 367, &out, 1, "a", -1, nullptr, 0, nullptr), 1);
    };
    EXPECT_EQ(messages(RAS1_LEVEL_DETAIL, translate).back(), "Source length = 1");
  });
  unsetenv("NLS1_LOCALEDIR");
}

}  // namespace
}  // namespace lx::test
