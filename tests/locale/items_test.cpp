// Locale items: what the built-in objects say in every form, buffers of every size, what may be set to what,
// and that whatever fails leaves the locale as it was.
#include <algorithm>

#include "core/tiny_directory.h"
#include "support/case_rows.h"

namespace lx::test {
namespace {

using Units = std::vector<LXUChar>;

Units units(const std::string& ascii) {
  return Units(ascii.begin(), ascii.end());
}

/// Room for every text of these tests, with a margin that must stay as it is.
template <class Unit>
struct Buffer {
  static constexpr int32_t kRoom = 200;
  std::vector<Unit> data = std::vector<Unit>(kRoom + 8, Unit{0x5A});

  /// Up to the null that the result counts; fails where the result and the text, or the margin, disagree.
  std::basic_string<Unit> text(int32_t result, int32_t size) const {
    EXPECT_TRUE(std::all_of(data.begin() + size, data.end(), [](Unit u) { return u == 0x5A; }));
    if (result < 1) return {};
    EXPECT_LE(result, size);
    EXPECT_EQ(data[static_cast<size_t>(result) - 1], 0);
    return std::basic_string<Unit>(data.data(), static_cast<size_t>(result) - 1);
  }
};

std::string plain(LXLocale* locale, int32_t item, int32_t flags = 0, int32_t size = Buffer<char>::kRoom) {
  Buffer<char> buffer;
  return buffer.text(LXGetLocaleTextInfo(locale, item, buffer.data.data(), size, flags), size);
}
Units unicode(LXLocale* locale, int32_t item, int32_t flags = 0, int32_t size = Buffer<LXUChar>::kRoom) {
  Buffer<LXUChar> buffer;
  const auto text = buffer.text(LXGetLocaleTextInfoU(locale, item, buffer.data.data(), size, flags), size);
  return Units(text.begin(), text.end());
}
/// The W and Ex forms, turned into Unicode.
Units wide(LXLocale* locale, int32_t item, int32_t flags = 0, int32_t size = Buffer<LXWChar>::kRoom) {
  Buffer<LXWChar> buffer;
  const auto text = buffer.text(LXGetLocaleTextInfoW(locale, item, buffer.data.data(), size, flags), size);
  Units result(text.size());
  LXStringToUnicodeW(result.data(), Buffer<LXWChar>::kRoom, locale, text.data(),
                     static_cast<int32_t>(text.size()), 0);
  return result;
}
Units decode(LXLocale* locale, const std::string& text, LXShiftState state = LX_SHIFT_SINGLE) {
  Units result(text.size());
  const int32_t count = LXStringToUnicodeEx(result.data(), static_cast<int32_t>(text.size()), locale,
                                            text.data(), state, static_cast<int32_t>(text.size()), 0);
  result.resize(static_cast<size_t>(count));
  return result;
}
std::string shifted(LXLocale* locale, int32_t item, LXShiftState state, int32_t flags, int32_t size) {
  Buffer<char> buffer;
  return buffer.text(LXGetLocaleTextInfoEx(locale, item, buffer.data.data(), state, size, flags), size);
}

class ItemTest : public LibraryTest {
 protected:
  void open() {
    write_tiny_directory(directory);
    ASSERT_EQ(init(), LX_OK);
  }
  static LXLocale* create(const TinyCodepage& codepage) {
    return LXGetLocale(("English_UnitedStates." + codepage.file.name).c_str(), 0, nullptr);
  }
  static int32_t set_territory(LXLocale* locale, int32_t id) { return LXSetLocaleNumInfo(locale, 5, id); }
  /// Every item in the forms that show all of it.
  static std::string snapshot(LXLocale* locale) {
    std::string all;
    for (int32_t item = 1; item <= 88; ++item) {
      all += plain(locale, item) + '|' + std::to_string(LXGetLocaleNumInfo(locale, item, 0)) + '|';
      for (uint16_t unit : unicode(locale, item)) all += std::to_string(unit) + ' ';
    }
    return all + std::to_string(locale->changed) + ' ' + std::to_string(locale->flags);
  }
};

TEST_F(ItemTest, BuiltInValues) {
  ASSERT_EQ(init("/nonexistent"), LX_W_DEFAULTS);
  ASSERT_EQ(LXSetLocale("", 0), LX_OK);
  char buffer[4] = "abc";
  for (const CaseRow& row : case_rows("locale/built_in_items.txt")) {
    SCOPED_TRACE(row.where);
    const int32_t item = row.number(0);
    const bool is_text = row[1] == "text";
    for (int32_t flags : {0, int32_t{LX_TERRITORY_VALUES}}) {
      EXPECT_EQ(LXGetLocaleNumInfo(nullptr, item, flags), is_text ? -1 : row.number(2));
      EXPECT_EQ(LXGetError(nullptr), is_text ? LX_E_ITEM : LX_OK);
      if (!is_text) {
        EXPECT_EQ(LXGetLocaleTextInfo(nullptr, item, buffer, 4, flags), -1);
        EXPECT_EQ(LXGetError(nullptr), LX_E_ITEM);
        continue;
      }
      EXPECT_EQ(plain(nullptr, item, flags), row[2]);
      EXPECT_EQ(plain(nullptr, item, flags | LX_CHARACTERS), row[2]);
      EXPECT_EQ(unicode(nullptr, item, flags), units(row[2]));
      EXPECT_EQ(wide(nullptr, item, flags | LX_CHARACTERS), units(row[2]));
    }
  }
  for (int32_t item : {-1, 0, 89, INT32_MAX, INT32_MIN}) {
    EXPECT_EQ(LXGetLocaleNumInfo(nullptr, item, 0), -1);
    EXPECT_EQ(LXGetError(nullptr), LX_E_ITEM);
  }
  for (int32_t flags : {2, 8, -1}) {
    EXPECT_EQ(LXGetLocaleTextInfo(nullptr, 2, buffer, 4, flags), -1);
    EXPECT_EQ(LXGetError(nullptr), LX_E_INVALID);
    EXPECT_EQ(LXGetLocaleNumInfo(nullptr, 1, flags), -1);
    EXPECT_EQ(LXSetLocaleTextInfo(nullptr, 999, "x", 1, flags), 0);
    EXPECT_EQ(LXGetError(nullptr), LX_E_INVALID);
  }
  EXPECT_EQ(LXGetLocaleTextInfo(nullptr, 999, buffer, 0, 0), 0);
  EXPECT_STREQ(buffer, "abc");
}

// In every codepage and every form, a text of any characters comes out cut at a whole one, closed, terminated,
// and never beyond the size.
TEST_F(ItemTest, FormsAndSizes) {
  open();
  const Units any{'A', 0x3041, 0x4E9C, 'J', 0x20AC, 0xE0, 0x3042};
  for (const TinyCodepage& codepage : tiny_codepages()) {
    SCOPED_TRACE(codepage.file.name);
    LXLocale* locale = create(codepage);
    ASSERT_NE(locale, nullptr);
    ASSERT_EQ(LXSetLocaleTextInfoU(locale, 64, any.data(), static_cast<int32_t>(any.size()), 0), 1);
    EXPECT_EQ(unicode(locale, 64), any) << "the caller's own text";
    const Units whole = decode(locale, shifted(locale, 64, 0, 0, 60));
    EXPECT_EQ(whole.size(), any.size());
    EXPECT_EQ(wide(locale, 64), whole);
    for (int32_t size = 1; size < 30; ++size) {
      SCOPED_TRACE(size);
      const auto is_start = [&](const Units& part) {
        return part.size() < static_cast<size_t>(size) && std::equal(part.begin(), part.end(), whole.begin());
      };
      for (LXShiftState state : {0u, 1u}) {
        if (state == 1 && !codepage.shift) continue;
        const std::string bytes = shifted(locale, 64, state, 0, size);
        EXPECT_TRUE(is_start(decode(locale, bytes, state)));
        if (codepage.shift && !bytes.empty()) {
          EXPECT_EQ(decode(locale, bytes + '\xC1', state).back(), 'A') << "it ends closed";
        }
      }
      EXPECT_TRUE(is_start(wide(locale, 64, 0, size)));
      if (!codepage.shift) {
        EXPECT_TRUE(is_start(decode(locale, plain(locale, 64, 0, size))));
      }
      if (!codepage.shift && size <= 8) {
        Buffer<char> buffer;
        EXPECT_EQ(LXGetLocaleTextInfo(locale, 64, buffer.data.data(), size, LX_CHARACTERS), size);
      }
      EXPECT_EQ(unicode(locale, 64, 0, size).size(), std::min<size_t>(static_cast<size_t>(size) - 1, 7));
      EXPECT_EQ(plain(locale, 59, 0, size).size(), size > 1 ? 1u : 0u) << "a separator";
    }
    EXPECT_EQ(unicode(locale, 10), units(codepage.file.name)) << "also where the codepage has no ASCII";
    EXPECT_EQ(wide(locale, 10), decode(locale, shifted(locale, 10, 0, 0, 60)));
    EXPECT_EQ(LXReleaseLocale(locale), 0);
  }
}

TEST_F(ItemTest, ShiftBytesAreWrittenWhereTheyAreDue) {
  open();
  LXLocale* locale = create(tiny_shift());
  const auto set = [&](const std::string& text, LXShiftState state, int32_t flags, int32_t length) {
    return LXSetLocaleTextInfoEx(locale, 64, text.data(), state, length, flags);
  };
  ASSERT_EQ(set("\x0E\x44\x47\x0F\xC1", 0, 0, -1), 1);
  EXPECT_EQ(unicode(locale, 64), (Units{0x3041, 'A'}));
  EXPECT_EQ(shifted(locale, 64, 0, 0, 20), "\x0E\x44\x47\x0F\xC1");
  EXPECT_EQ(shifted(locale, 64, 1, 0, 20), "\x44\x47\x0F\xC1") << "from the state that the text goes on in";
  EXPECT_EQ(shifted(locale, 64, 0, 0, 5), "\x0E\x44\x47\x0F") << "with the Shift-In";
  EXPECT_EQ(shifted(locale, 64, 0, 0, 4), "") << "no room for the character and its Shift-In";
  // A state to start in is stored with the text; a character count does not count shift bytes.
  ASSERT_EQ(set("\x44\x47\x44\x48\x0F\xC1", 1, LX_CHARACTERS, 2), 1);
  EXPECT_EQ(unicode(locale, 64), (Units{0x3041, 0x3042}));
  EXPECT_EQ(shifted(locale, 64, 0, 0, 20), "\x0E\x44\x47\x44\x48\x0F");
  EXPECT_EQ(set("\x0E", 0, 0, 1), 1) << "nothing but a shift byte";
  EXPECT_EQ(unicode(locale, 64), (Units{0x3041, 0x3042}));
  // Separators and names stand in the single-byte state.
  for (int32_t item : {59, 61, 2, 10}) {
    EXPECT_EQ(LXSetLocaleTextInfoEx(locale, item, "\x0E\x44\x47", 0, -1, 0), 0);
    EXPECT_EQ(LXGetError(locale), LX_E_NOT_FOUND);
  }
  const LXUChar ideographic_space[] = {0x3000, 0};
  EXPECT_EQ(LXSetLocaleTextInfoU(locale, 61, ideographic_space, -1, 0), 0);
  EXPECT_EQ(LXGetError(locale), LX_E_NOT_FOUND);
  // EBCDIC digits are no separators, and a name is converted; a Shift-Out inside it is refused.
  EXPECT_EQ(LXSetLocaleTextInfo(locale, 59, "\xF5", 1, 0), 0);
  EXPECT_EQ(LXSetLocaleTextInfo(locale, 59, "\x35", 1, 0), 1);
  EXPECT_EQ(LXSetLocaleTextInfo(locale, 2, "\xC1\x0E\xC1", 3, 0), 0);
  EXPECT_EQ(LXGetError(locale), LX_E_NOT_FOUND);
  EXPECT_EQ(LXSetLocaleTextInfo(locale, 10, "\xD6\xD3\xC4", -1, 0), 1);
  EXPECT_EQ(plain(locale, 10), "Old");
  EXPECT_EQ(LXReleaseLocale(locale), 0);
}

TEST_F(ItemTest, WhatCanBeSet) {
  open();
  LXLocale* locale = create(tiny_utf8());
  for (const CaseRow& row : case_rows("locale/settable_items.txt")) {
    SCOPED_TRACE(row.where);
    const int32_t item = row.number(0), code = row.number(3);
    const std::string before = snapshot(locale);
    if (row[1] == "is") {
      EXPECT_EQ(plain(locale, item), row[2]);
    } else if (row[1] == "number") {
      EXPECT_EQ(LXSetLocaleNumInfo(locale, item, row.number(2)), code == LX_OK);
      EXPECT_EQ(LXGetError(locale), code);
      if (code == LX_OK) {
        EXPECT_EQ(LXGetLocaleNumInfo(locale, item, 0), row.number(2) & 0xFFFF);
      }
    } else {
      EXPECT_EQ(LXSetLocaleTextInfo(locale, item, row[2].c_str(), 0, 0), 1) << "length 0 changes nothing";
      EXPECT_EQ(snapshot(locale), before);
      EXPECT_EQ(LXSetLocaleTextInfo(locale, item, row[2].c_str(), -1, 0), code == LX_OK);
      EXPECT_EQ(LXGetError(locale), code);
      const bool one_byte = item >= 59 && item <= 67 && item != 62 && item != 64;
      if (code == LX_OK && item > 12) {
        EXPECT_EQ(plain(locale, item), row[2].substr(0, one_byte ? 1 : std::string::npos));
      }
    }
    if (code != LX_OK) {
      EXPECT_EQ(snapshot(locale), before);
    }
  }
  EXPECT_EQ(plain(locale, 64, LX_TERRITORY_VALUES), "$");
  EXPECT_EQ(LXReleaseLocale(locale), 0);
}

TEST_F(ItemTest, FormsOfSetting) {
  open();
  LXLocale* locale = create(tiny_utf8());
  // Cut at a whole character; the Unicode form follows; with a length in characters too.
  EXPECT_EQ(LXSetLocaleTextInfo(locale, 64, "\xC3\xA0\xE3\x81\x81", 4, 0), 1);
  EXPECT_EQ(unicode(locale, 64), Units{0xE0});
  EXPECT_EQ(LXSetLocaleTextInfo(locale, 64, "\xC3\xA0\xE3\x81\x81yz", 3, LX_CHARACTERS), 1);
  EXPECT_EQ(unicode(locale, 64), (Units{0xE0, 0x3041, 'y'}));
  EXPECT_EQ(LXSetLocaleTextInfo(locale, 64, "a\0b", 3, 0), 1) << "it ends at a null";
  EXPECT_EQ(plain(locale, 64), "a");
  const LXWChar codes[] = {0xC3A0, 'x', 0};
  EXPECT_EQ(LXSetLocaleTextInfoW(locale, 64, codes, -1, 0), 1);
  EXPECT_EQ(plain(locale, 64), "\xC3\xA0x");
  EXPECT_EQ(LXSetLocaleTextInfoW(locale, 10, codes + 1, -1, 0), 0);
  EXPECT_EQ(LXGetError(locale), LX_E_NOT_FOUND);
  // Longer than every text before, and than the work buffer.
  std::vector<LXUChar> longest(264, 0x3042);
  EXPECT_EQ(LXSetLocaleTextInfoU(locale, 81, longest.data(), 263, 0), 1);
  EXPECT_EQ(strlen(locale->texts[7]), 3u * 263);
  const std::string before = snapshot(locale);
  EXPECT_EQ(LXSetLocaleTextInfoU(locale, 81, longest.data(), 264, 0), 0);
  EXPECT_EQ(LXGetError(locale), LX_E_NOT_FOUND);
  const LXUChar two[] = {'x', 'y', 0};
  EXPECT_EQ(LXSetLocaleTextInfoU(locale, 61, two, -1, 0), 0) << "a separator is exactly one unit";
  EXPECT_EQ(LXGetError(locale), LX_E_NOT_FOUND);
  EXPECT_EQ(snapshot(locale), before);
  EXPECT_EQ(LXSetLocaleTextInfoU(locale, 61, two, 1, 0), 1);
  EXPECT_EQ(locale->changed, 0x822000u);
  EXPECT_EQ(locale->changed_unicode, 0x1004u);
  const auto traced = messages(RAS1_LEVEL_INPUT, [&] { LXSetLocaleTextInfo(locale, 64, "EUR!", 3, 0); });
  EXPECT_EQ(traced, std::vector<std::string>{"type = 64, buffer size = 3, data = EUR"});
  EXPECT_EQ(plain(locale, 64) + plain(locale, 64, LX_TERRITORY_VALUES), "EUR$");
  EXPECT_EQ(LXReleaseLocale(locale), 0);
}

TEST_F(ItemTest, OtherTerritoryAndCodepage) {
  open();
  LXLocale* locale = create(tiny_single());
  ASSERT_EQ(LXSetLocaleTextInfo(locale, 68, "2;0", -1, 0), 1);
  ASSERT_EQ(LXSetLocaleNumInfo(locale, 63, 7), 1);
  ASSERT_EQ(set_territory(locale, 276), 1);
  EXPECT_EQ(plain(locale, 59) + plain(locale, 61) + plain(locale, 67), ",;\xE0");
  EXPECT_EQ(plain(locale, 68) + std::to_string(LXGetLocaleNumInfo(locale, 63, 0)), "2;07") << "kept";
  EXPECT_EQ(LXGetLocaleNumInfo(locale, 73, 0), 0);
  EXPECT_EQ(plain(locale, 64), "?");
  EXPECT_EQ(unicode(locale, 64), Units{0x3041});

  // A separator that has no single byte there: refused by number and by name, with everything as it was.
  const std::string before = snapshot(locale);
  EXPECT_EQ(LXSetLocaleNumInfo(locale, 9, 57352), 0);
  EXPECT_EQ(LXGetError(locale), LX_E_SEPARATOR);
  EXPECT_EQ(LXSetLocaleTextInfo(locale, 10, "TINY-UTF8", -1, 0), 0);
  EXPECT_EQ(LXGetError(locale), LX_E_SEPARATOR);
  EXPECT_EQ(snapshot(locale), before);
  // A territory's separator without a single byte leaves the byte that was there.
  ASSERT_EQ(set_territory(locale, 840), 1);
  ASSERT_EQ(LXSetLocaleNumInfo(locale, 9, 57352), 1);
  ASSERT_EQ(set_territory(locale, 276), 1);
  EXPECT_EQ(plain(locale, 67) + plain(locale, 67, LX_TERRITORY_VALUES), ",");
  EXPECT_EQ(unicode(locale, 67), Units{0xE0});
  // The locale's own values move from codepage to codepage, shift bytes included.
  const LXUChar currency[] = {0x3041, 'A', 0};
  ASSERT_EQ(LXSetLocaleTextInfoU(locale, 64, currency, -1, 0), 1);
  for (const TinyCodepage& codepage : {tiny_shift(), tiny_utf8(), tiny_shift_jis(), tiny_shift()}) {
    SCOPED_TRACE(codepage.file.name);
    ASSERT_EQ(LXSetLocaleNumInfo(locale, 9, codepage.file.id), 1);
    EXPECT_EQ(decode(locale, shifted(locale, 64, 0, 0, 20)), (Units{0x3041, 'A'}));
    EXPECT_EQ(unicode(locale, 64), (Units{0x3041, 'A'}));
    EXPECT_EQ(LXGetLocaleNumInfo(locale, 87, 0), codepage.shift);
    EXPECT_EQ(LXGetLocaleNumInfo(locale, 86, 0), !codepage.shift);
  }
  EXPECT_EQ(LXReleaseLocale(locale), 0);
}

}  // namespace
}  // namespace lx::test
