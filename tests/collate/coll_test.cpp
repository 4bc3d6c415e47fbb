// Collation and sort keys over sort objects that the test makes: the rules one by one, and over random sorts
// and texts that keys, comparison and all forms agree.
#include <algorithm>
#include <random>
#include <tuple>

#include "core/library_fixture.h"
#include "support/sort_builder.h"
#include "support/tiny_codepages.h"

namespace lx::test {
namespace {

using Text = std::vector<LXUChar>;

Text text(const std::string& ascii) {
  return Text(ascii.begin(), ascii.end());
}

int sign(int32_t value) {
  return (value > 0) - (value < 0);
}

TestWeight letter(uint16_t primary, uint8_t secondary = 1, uint8_t tertiary = 1,
                  uint8_t char_class = kAppendAll) {
  return {{primary, secondary, tertiary, 0}, char_class};
}
TestWeight special(uint16_t weight, uint8_t char_class = kAppendAll) {
  return {{0, 0, 0, weight}, char_class};
}

class CollateTest : public LibraryTest {
 protected:
  /// English under the tiny codepages, sorted by the sort given.
  void open(const SortBuilder& sort) {
    terminate();
    std::vector<ScratchDirectory::Codepage> files;
    for (const TinyCodepage& codepage : tiny_codepages()) files.push_back(codepage.file);
    std::sort(files.begin(), files.end(), [](const auto& a, const auto& b) { return a.id < b.id; });
    directory.write_locale(files);
    std::vector<ControlRecord> records{{1, LX_LANGUAGE, "English"}, {840, LX_TERRITORY, "UnitedStates"}};
    for (const auto& file : files) records.push_back({file.id, LX_CODEPAGE, file.name});
    records.push_back({1, LX_SORT, "Test"});
    directory.write("control.nls", control_file(records));
    directory.write("so_00001.nls", object_file({sort.payload()}));
    ASSERT_EQ(init(directory.path().c_str(), LX_NO_DEFAULTS), LX_OK);
    ASSERT_EQ(LXSetLocale("English.TINY-UTF8@Test", 0), LX_OK);
  }

  static int compare(const Text& a, const Text& b, uint32_t options = 0) {
    return sign(LXStrcollU(nullptr, a.data(), static_cast<int32_t>(a.size()), b.data(),
                           static_cast<int32_t>(b.size()), options));
  }
  static int compare(const char* a, const char* b, uint32_t options = 0) {
    return compare(text(a), text(b), options);
  }
  static ByteString key(const Text& units, uint32_t options = 0) {
    alignas(4) uint8_t buffer[2048];
    const int32_t bytes =
        LXStrxfrmU(nullptr, buffer, sizeof(buffer), units.data(), static_cast<int32_t>(units.size()), options);
    EXPECT_GE(bytes, 0);
    return ByteString(buffer, buffer + std::max(bytes, 0));
  }
  static std::string to_utf8(const Text& units) {
    std::string bytes(3 * units.size() + 1, '\0');
    const int32_t count = LXUnicodeToString(nullptr, bytes.data(), static_cast<int32_t>(bytes.size()),
                                            units.data(), static_cast<int32_t>(units.size()), 0);
    bytes.resize(static_cast<size_t>(std::max(count, 0)));
    return bytes;
  }
};

/// a to c, A above a on the tertiary level, an acute accent, a hyphen that is special, "ch" after c, "ae" as an
/// expansion, and z and y that are inserted.
SortBuilder example() {
  SortBuilder sort;
  sort.characters = {{'a', letter(0x200)},
                     {'A', letter(0x200, 1, 2)},
                     {'b', letter(0x201)},
                     {'c', letter(0x202)},
                     {'h', letter(0x210)},
                     {'e', letter(0x208)},
                     {0x301, letter(0, 5, 1)},
                     {'-', special(7)},
                     {'+', special(9)},
                     {'y', letter(0x220, 1, 1, 7)},
                     {'z', letter(0x221, 1, 1, 7)},
                     {'1', letter(0x100, 2, 3, 8)},
                     {'2', letter(0x101, 4, 5, 8)}};
  sort.expansions = {{0xE6, {letter(0x200, 2, 1), {0x208, 1, 1, 0}}}};
  sort.pairs = {{'c', 'h', letter(0x203)}, {'c', 'h', letter(0x999)}};
  sort.computed = {
      {0x4E, {2, kAppendAll, 0x3000}}, {0x4F, {2, kAppendAll, 0x3100}}, {0x20, {4, kAppendAll, 0x50}}};
  return sort;
}

TEST_F(CollateTest, Weights) {
  open(example());
  int32_t rc = LX_OK;
  const LXObject* sort = LXGetObjFromName(nullptr, LX_SORT, "Test", 4, LX_FIND_AND_LOAD, &rc);
  ASSERT_NE(sort, nullptr);
  LXWeights first{}, second{};
  uint8_t char_class = 0;
  const auto found = [&](LXUChar u) {
    first = second = {};
    return LXSortGetWeights(sort, u, &first.primary, &first.secondary, &first.tertiary, &first.special,
                            &second.primary, &second.secondary, &second.tertiary, &second.special, &char_class);
  };
  const auto pair = [&](LXUChar u, LXUChar v) {
    return LXSortGetCombination(sort, u, v, &first.primary, &first.secondary, &first.tertiary, &first.special,
                                &char_class);
  };
  EXPECT_EQ(found('z'), 1);
  EXPECT_EQ(first.primary, 0x221);
  EXPECT_EQ(char_class, 7);
  EXPECT_EQ(found(0xE6), 2);
  EXPECT_EQ(first.secondary, 2);
  EXPECT_EQ(second.primary, 0x208);
  EXPECT_EQ(found('-'), 1);
  EXPECT_EQ(first.special, 7);
  EXPECT_EQ(found(0x4E05), 1);
  EXPECT_EQ(first.primary, 0x3005);
  EXPECT_EQ(found(0x2010), 1);
  EXPECT_EQ(first.special, 0x60);
  EXPECT_EQ(found(0x0401), 0) << "a page that is not covered";
  EXPECT_EQ(pair('c', 'h'), 1);
  EXPECT_EQ(first.primary, 0x203) << "the first record counts";
  EXPECT_EQ(pair('h', 'c'), 0);
  // Step by step: what was read ahead counts one unit, and a character cut by the end ends the text.
  const char* at = "ca\xC3\xA6";
  const char* const start = at;
  int32_t left = 3;
  uint16_t counter = 0;
  LXUChar ahead = LX_NO_LOOK_AHEAD;
  const auto step = [&] {
    return LXStrGetNextWeight(nullptr, &at, &left, &counter, &first, &second, &char_class, &ahead);
  };
  EXPECT_EQ(step(), 1);
  EXPECT_EQ(std::tie(at, left, counter, ahead), std::make_tuple(start + 2, 2, 1, LXUChar{'a'}));
  EXPECT_EQ(step(), 1);
  EXPECT_EQ(std::tie(at, left, counter, ahead), std::make_tuple(start + 2, 1, 2, LX_NO_LOOK_AHEAD));
  EXPECT_EQ(step(), 0);
  EXPECT_EQ(std::tie(at, left, counter), std::make_tuple(start + 2, 0, 2));
  // A character is read ahead whether a pair begins with the one before it or not. U+FFFF, which stands for
  // none, is left where it is.
  const LXUChar units[] = {'a', 'b', 0xFFFF};
  const LXUChar* unit_at = units;
  int32_t units_left = 3;
  for (const LXUChar wanted : {LXUChar{'b'}, LX_NO_LOOK_AHEAD}) {
    LXStrGetNextWeightU(nullptr, &unit_at, &units_left, &counter, &first, &second, &char_class, &ahead);
    EXPECT_EQ(std::tie(unit_at, ahead), std::make_tuple(units + 2, wanted));
  }
  EXPECT_EQ(units_left, 1);
}

/// The key of a text as a caller makes it who takes the weights one element at a time.
template <class Unit, class Next>
ByteString stepped_key(const std::basic_string<Unit>& text, Next next) {
  uint16_t primaries[512], specials[512];
  uint8_t secondaries[512], tertiaries[512];
  uint16_t *primary_at = primaries, *primary_end = primaries, *special_at = specials, *special_end = specials;
  uint8_t *secondary_at = secondaries, *secondary_end = secondaries;
  uint8_t *tertiary_at = tertiaries, *tertiary_end = tertiaries;
  const Unit* p = text.data();
  auto left = static_cast<int32_t>(text.size());
  uint16_t counter = 0;
  LXUChar ahead = LX_NO_LOOK_AHEAD;
  while (left > 0) {
    LXWeights sets[2];
    uint8_t char_class = 0;
    const int32_t count = next(&p, &left, &counter, &sets[0], &sets[1], &char_class, &ahead);
    for (int32_t i = 0; i < count; ++i)
      LXStrInsertWeights(sets[i].primary, &primary_at, &primary_end, sets[i].secondary, &secondary_at,
                         &secondary_end, sets[i].tertiary, &tertiary_at, &tertiary_end, sets[i].special,
                         &special_at, &special_end, counter, char_class);
  }
  while (secondary_end > secondaries && secondary_end[-1] == 1) --secondary_end;
  while (tertiary_end > tertiaries && tertiary_end[-1] == 1) --tertiary_end;
  ByteString made;
  const auto put = [&](const uint16_t* from, const uint16_t* to, int step) {
    for (; from < to; from += step) made.insert(made.end(), {uint8_t(*from >> 8), uint8_t(*from)});
  };
  put(primaries, primary_end, 1);
  made.push_back(0);
  made.insert(made.end(), secondaries, secondary_end);
  made.push_back(0);
  made.insert(made.end(), tertiaries, tertiary_end);
  made.push_back(0);
  const bool positions = made.size() > 3;
  put(specials + !positions, special_end, positions ? 1 : 2);
  return made;
}

TEST_F(CollateTest, Rules) {
  open(example());
  const struct {
    const char* a;
    const char* b;
    int result;
  } cases[] = {
      {"", "", 0},
      {"", "a", -1},
      {"a", "b", -1},
      {"ab", "abc", -1},
      {"abc", "ab", 1},
      {"a", "A", -1},
      {"Ab", "ab", 1},
      {"Aa", "ab", -1},
      {"cz", "ch", -1},
      {"ch", "cc", 1},
      {"ch", "h", -1},
      {"cch", "cch", 0},
      {"ab", "a?b", 0},
      {"ab", "a-b", -1},
      {"a-b", "ab-", -1},
      {"a-b", "a+b", -1},
      {"-", "+", -1},
      {"?", "", 0},
      {"a-", "b", -1},
      {"--b", "a", 1},
      // An inserted primary goes ahead of the run: "zy" sorts as y, z. A beginning does not decide.
      {"zy", "yz", -1},
      {"az", "ab", 1},
      {"ayz", "azy", 1},
      {"z?", "z", 0},
      // In the tail of the longer text even an inserted primary decides at once.
      {"az", "a", 1},
      {"a", "az", -1},
  };
  for (const auto& c : cases) {
    EXPECT_EQ(compare(c.a, c.b), c.result) << c.a << " " << c.b;
    EXPECT_EQ(compare(c.b, c.a), -c.result) << c.b << " " << c.a;
  }
  EXPECT_EQ(compare(Text{0xE6}, text("ae")), 1) << "equal primaries, another secondary";
  EXPECT_EQ(compare(Text{0xE6}, text("af")), compare("ae", "af"));
  EXPECT_EQ(compare(Text{'a', 0x301}, text("b")), -1);
  EXPECT_EQ(compare(Text{'a', 0x301}, text("a")), 1);
  EXPECT_EQ(compare(Text{0x4E10}, Text{0x4F00}), -1);
  EXPECT_EQ(compare(Text{0xFFFF, 'a'}, text("a")), 0) << "an ordinary character without weights";
  // A beginning with equal primaries does not decide where one was inserted; keys say otherwise.
  EXPECT_EQ(compare("z?a", "z"), 1);
}

TEST_F(CollateTest, KeyLayout) {
  open(example());
  const struct {
    Text text;
    ByteString key;
  } cases[] = {
      {{}, {0, 0, 0}},
      {text("aB"), {2, 0, 0, 0, 0}},
      {text("aA"), {2, 0, 2, 0, 0, 0, 1, 2, 0}},
      {{'a', 0x301, 'b'}, {2, 0, 2, 1, 0, 1, 5, 0, 0}},
      {text("a-b+"), {2, 0, 2, 1, 0, 0, 0, 0, 2, 0, 7, 0, 4, 0, 9}},
      {text("-+"), {0, 0, 0, 0, 7, 0, 9}},
      {text("ch-"), {2, 3, 0, 0, 0, 0, 3, 0, 7}},
      {{0xE6}, {2, 0, 2, 8, 0, 2, 0, 0}},
      {text("ayz"), {2, 0, 2, 0x21, 2, 0x20, 0, 0, 0}},
      {text("1a2"), {1, 0, 2, 0, 1, 1, 0, 2, 1, 4, 0, 3, 1, 5, 0}},
      {text("12a"), {1, 0, 1, 1, 2, 0, 0, 4, 2, 0, 5, 3, 0}},
  };
  for (const auto& c : cases) EXPECT_EQ(key(c.text), c.key) << to_utf8(c.text);

  // The buffer counts from an aligned address on; the rest of one that is large enough is cleared.
  alignas(4) uint8_t buffer[64];
  const auto transform = [&](size_t at, int32_t size) {
    memset(buffer, 0x5A, sizeof(buffer));
    return LXStrxfrm(nullptr, buffer + at, size, "ab", -1, 0);
  };
  EXPECT_EQ(transform(0, 6), 7);
  EXPECT_EQ(buffer[0], 0x5A);
  EXPECT_EQ(transform(0, 7), 7);
  EXPECT_EQ(buffer[0], 2);
  EXPECT_EQ(buffer[7], 0x5A);
  EXPECT_EQ(transform(1, 9), 7);
  EXPECT_EQ(buffer[1], 0x5A) << "three bytes are lost to the alignment";
  EXPECT_EQ(transform(1, 10), 7);
  EXPECT_EQ(buffer[1], 2);
  EXPECT_EQ(transform(0, 36), 7);
  EXPECT_EQ(buffer[35], 0);
  EXPECT_EQ(transform(0, 35), 7);
  EXPECT_EQ(buffer[34], 0x5A) << "less than the work area";
  // The work area is that of the characters, however many bytes they take; none need none, at any address.
  memset(buffer, 0x5A, sizeof(buffer));
  EXPECT_EQ(LXStrxfrm(nullptr, buffer, 20, "\xC3\xA6", 2, 0), 8);
  EXPECT_EQ(buffer[19], 0);
  memset(buffer, 0x5A, sizeof(buffer));
  EXPECT_EQ(LXStrxfrm(nullptr, buffer + 1, 3, "\xC3", 1, 0), 3);
  EXPECT_EQ(std::count(buffer, buffer + 8, 0), 3);
  for (int32_t size : {0, 1, 2, 3}) {
    memset(buffer, 0x5A, sizeof(buffer));
    EXPECT_EQ(LXStrxfrm(nullptr, buffer, size, "", -1, 0), size == 0 ? 0 : 3);
    EXPECT_EQ(std::count(buffer, buffer + 8, 0), size);
    EXPECT_EQ(LXStrGenSortKey(nullptr, buffer + 16, size, nullptr, 0), 3);
    EXPECT_EQ(std::count(buffer + 16, buffer + 32, 0), size == 3 ? 3 : 0);
  }
  for (uint32_t options : {1u, 0x40u, 0x80000001u, LX_IGNORE_BLANKS}) {
    EXPECT_EQ(LXStrxfrm(nullptr, buffer, 64, "a", 1, options), -1);
    EXPECT_EQ(LXGetError(nullptr), LX_E_INVALID);
  }
  EXPECT_EQ(compare("a", "b", LX_IGNORE_BLANKS), -1);
  EXPECT_EQ(LXStrcoll(nullptr, "a", 1, "b", 1, LX_IGNORE_BLANKS), 0) << "bytes: only beside the width option";
  EXPECT_EQ(LXGetError(nullptr), LX_E_INVALID);
  EXPECT_EQ(compare("a", "b", LX_CHARACTERS), 0);
  EXPECT_EQ(LXGetError(nullptr), LX_E_INVALID);
}

TEST_F(CollateTest, Options) {
  open(example());
  EXPECT_EQ(compare("aA", "Aa", LX_CASE_INSENSITIVE), 0);
  EXPECT_EQ(compare(Text{0xFF21}, text("A"), LX_WIDTH_INSENSITIVE), 0);
  EXPECT_EQ(compare("a ", "a", LX_IGNORE_BLANKS), 0);
  const auto bytes = [](const char* a, int32_t length1, const char* b, int32_t length2, uint32_t options) {
    return sign(LXStrcoll(nullptr, a, length1, b, length2, options));
  };
  EXPECT_EQ(bytes("ab  ", -1, "ab", -1, LX_WIDTH_INSENSITIVE), 0);
  EXPECT_EQ(bytes("ab", -1, "ab  ", -1, LX_WIDTH_INSENSITIVE), 0);
  EXPECT_EQ(bytes("ab", -1, "abb", -1, LX_WIDTH_INSENSITIVE), 0)
      << "no more than the first text's length counts";
  EXPECT_EQ(bytes("abb", -1, "ab", -1, LX_WIDTH_INSENSITIVE), 1);
  EXPECT_EQ(bytes("a\xC3\xA6z", 2, "a\xC3\xA6y", 2, LX_CHARACTERS), 0);
  EXPECT_EQ(bytes("a\xC3\xA6", 2, "a", -1, 0), 0) << "a cut character is dropped";
  // Binary order is comparison by code value, error codes included.
  ASSERT_EQ(LXSetLocale("English.TINY-UTF8@Binary", 0), LX_OK);
  EXPECT_EQ(LXStrcoll(nullptr, "B", -1, "b", -1, 0), 'B' - 'b');
  EXPECT_EQ(LXStrcoll(nullptr, "B", -1, "b", -1, LX_CASE_INSENSITIVE), 0);
  EXPECT_EQ(LXStrcoll(nullptr, "B", -1, "b", -1, 0x100), 0);
  EXPECT_EQ(LXGetError(nullptr), LX_E_INVALID);
  uint8_t buffer[8];
  EXPECT_EQ(LXStrxfrm(nullptr, buffer, 8, "Ab", -1, 0), 2);
  EXPECT_EQ(memcmp(buffer, "Ab", 2), 0);
  EXPECT_EQ(LXStrxfrm(nullptr, buffer, 8, "AbC", -1, LX_CASE_INSENSITIVE), 3);
  EXPECT_EQ(memcmp(buffer, "abc", 3), 0);
  EXPECT_EQ(LXStrxfrmU(nullptr, buffer, 8, text("Ab").data(), 2, LX_CASE_INSENSITIVE), 4);
  EXPECT_EQ(memcmp(buffer, "A\0B", 4), 0) << "the Unicode form folds to upper case";
}

/// A sort of random weights that keeps the rules for data: the defaults are the lowest in use. `inserting` is
/// the share of characters, in percent, that insert on some level.
SortBuilder random_sort(std::mt19937* random, unsigned inserting) {
  const auto below = [&](unsigned n) { return static_cast<unsigned>((*random)() % n); };
  SortBuilder sort;
  const auto weight = [&] {
    TestWeight w = letter(static_cast<uint16_t>(0x200 + below(6)), static_cast<uint8_t>(1 + below(3)),
                          static_cast<uint8_t>(1 + below(3)));
    if (below(100) < inserting) w.char_class = static_cast<uint8_t>(below(8) | 8 * (below(4) != 0));
    return w;
  };
  for (LXUChar u : text("abcdefgh")) sort.characters[u] = weight();
  sort.characters[0x301] = letter(0, static_cast<uint8_t>(4 + below(3)), 0);
  sort.characters[0x302] = letter(0, 0, static_cast<uint8_t>(4 + below(3)));
  for (LXUChar u : text("-+")) sort.characters[u] = special(static_cast<uint16_t>(1 + below(9)));
  sort.expansions[0xE6] = {weight(), weight().weights};
  for (int i = 0; i < 3; ++i)
    sort.pairs.push_back(
        {static_cast<LXUChar>('a' + below(4)), static_cast<LXUChar>('a' + below(4)), weight()});
  sort.computed[0x4E] = {2, kAppendAll, static_cast<uint16_t>(0x300 - 0x50)};
  return sort;
}

TEST_F(CollateTest, KeysOrderAsComparisonDoes) {
  std::mt19937 random(1);
  const Text alphabet{'a',   'b',   'c', 'd', 'e',  'f',    'g',    'h',
                      0x301, 0x302, '-', '+', 0xE6, 0x4E51, 0x4E52, '?'};
  int equal = 0, different = 0;
  for (unsigned round = 0; round < 60; ++round) {
    const bool inserts = round % 2 != 0;
    ASSERT_NO_FATAL_FAILURE(open(random_sort(&random, inserts ? 30 : 0)));
    std::vector<Text> texts;
    for (int i = 0; i < 60; ++i) {
      Text t(random() % (i == 0 ? 200 : 9));
      for (LXUChar& u : t) u = alphabet[random() % alphabet.size()];
      if (i % 2 != 0 && !texts.back().empty()) {  // differs from another one in a character
        t = texts.back();
        t[random() % t.size()] = alphabet[random() % alphabet.size()];
      }
      texts.push_back(t);
    }
    for (const Text& t : texts) {
      const auto in = [](auto door) { return [=](auto... out) { return door(nullptr, out...); }; };
      LXShiftState state = 0;
      std::vector<LXWChar> codes(t.size() + 1);
      LXUnicodeToStringW(nullptr, codes.data(), int32_t(t.size()), t.data(), int32_t(t.size()), 0);
      ASSERT_EQ(stepped_key<LXUChar>({t.begin(), t.end()}, in(LXStrGetNextWeightU)), key(t));
      ASSERT_EQ(stepped_key<LXWChar>({codes.begin(), codes.end() - 1}, in(LXStrGetNextWeightW)), key(t));
      ASSERT_EQ(stepped_key(to_utf8(t), in(LXStrGetNextWeight)), key(t));
      ASSERT_EQ(
          stepped_key(to_utf8(t),
                      [&](auto p, auto... out) { return LXStrGetNextWeightEx(nullptr, p, &state, out...); }),
          key(t));
    }
    for (const Text& a : texts)
      for (const Text& b : texts) {
        const ByteString key_a = key(a), key_b = key(b);
        const int by_key = (key_a > key_b) - (key_a < key_b);
        const int direct = compare(a, b);
        ASSERT_EQ(compare(b, a), -direct);
        // Two exceptions, which are kept: without any other weight keys have no positions, and among inserted
        // primaries comparison does not count a longer run as greater.
        const auto primaries = [](const ByteString& k) {
          size_t n = 0;
          while (k[n] != 0) n += 2;
          return n;
        };
        const bool only_specials = primaries(key_a) == 0 && primaries(key_b) == 0;
        const bool another_count = inserts && primaries(key_a) != primaries(key_b);
        if (!only_specials && !another_count) {
          ASSERT_EQ(direct, by_key) << to_utf8(a) << " " << to_utf8(b);
        }
        (direct == 0 ? equal : different)++;
        // The byte form, plain and shift-stateful, through UTF-8.
        const std::string bytes_a = to_utf8(a), bytes_b = to_utf8(b);
        const auto size_a = static_cast<int32_t>(bytes_a.size()), size_b = static_cast<int32_t>(bytes_b.size());
        ASSERT_EQ(sign(LXStrcoll(nullptr, bytes_a.data(), size_a, bytes_b.data(), size_b, 0)), direct);
        ASSERT_EQ(sign(LXStrcollEx(nullptr, bytes_a.data(), 0, size_a, bytes_b.data(), 0, size_b, 0)), direct);
      }
  }
  // Damaged text: a lead byte takes the bytes behind it, whatever they are.
  open(random_sort(&random, 0));
  const auto damaged = [&] {
    std::string bytes(1 + random() % 6, 'a');
    for (char& c : bytes) c = "aefgh\xC3\xE4"[random() % 7];
    return bytes;
  };
  const auto byte_key = [](const std::string& bytes) {
    uint8_t buffer[64];
    const int32_t size =
        LXStrxfrm(nullptr, buffer, sizeof buffer, bytes.data(), static_cast<int32_t>(bytes.size()), 0);
    return ByteString(buffer, buffer + size);
  };
  for (int i = 0; i < 4000; ++i) {
    const std::string a = damaged(), b = damaged();
    const ByteString key_a = byte_key(a), key_b = byte_key(b);
    ASSERT_EQ(sign(LXStrcoll(nullptr, a.data(), static_cast<int32_t>(a.size()), b.data(),
                             static_cast<int32_t>(b.size()), 0)),
              (key_a > key_b) - (key_a < key_b))
        << a << " " << b;
  }
  EXPECT_GT(equal, 3600);
  EXPECT_GT(different, 100000);
}

TEST_F(CollateTest, SpecialsBehindPairs) {
  SortBuilder sort = example();
  for (LXUChar inserted : text("yz12")) sort.characters.erase(inserted);
  sort.characters['x'] = letter(0x203);  // as "ch"
  open(sort);
  EXPECT_EQ(compare("ch", "x"), 0);
  EXPECT_EQ(compare("ch-", "x-"), 1) << "the third character, not the second";
  EXPECT_EQ(compare("ch-a", "x-b"), -1);
}

TEST_F(CollateTest, ShiftStatefulAndPackedForms) {
  SortBuilder sort = example();
  sort.characters[0xFF21] = letter(0x200);
  sort.computed[0x4E].char_class = 7;
  open(sort);
  LXLocale* locale = LXGetLocale("English.TINY-SHIFT@Test", 0, nullptr);
  ASSERT_NE(locale, nullptr);
  const auto compare_ex = [&](const std::string& a, LXShiftState state, const std::string& b) {
    return sign(LXStrcollEx(locale, a.data(), state, static_cast<int32_t>(a.size()), b.data(), 0,
                            static_cast<int32_t>(b.size()), 0));
  };
  EXPECT_EQ(compare_ex("\x81\x82", 0, "\x81\x83"), -1);
  EXPECT_EQ(compare_ex("\x0E\x44\x47\x0F\x81", 0, "\x81"), 0)
      << "a character without weights between shift bytes";
  EXPECT_EQ(compare_ex("\x44\x47\x0F\x81", 1, "\x82"), -1) << "from the double-byte state";
  EXPECT_EQ(compare_ex("\x0E\x42\xC1\x0F", 0, "\x0E\x42\xC1\x45\x41"), -1)
      << "before a last shift byte a text has ended, so that what is inserted in the other one is left over";
  const LXWChar ab[] = {0x81, 0x82, 0}, ac[] = {0x81, 0x83, 0}, blanks[] = {0x81, 0x82, 0x40, 0x4040, 0};
  EXPECT_EQ(sign(LXWcscoll(locale, ab, -1, ac, -1, 0)), -1);
  EXPECT_EQ(LXWcscoll(locale, ab, -1, blanks, 3, LX_IGNORE_BLANKS), 0);
  uint8_t key_w[32], key_ex[32];
  const int32_t bytes = LXWcsxfrm(locale, key_w, 32, ac, -1, 0);
  EXPECT_EQ(bytes, LXStrxfrmEx(locale, key_ex, 32, "\x81\x83", 0, -1, 0));
  EXPECT_EQ(memcmp(key_w, key_ex, static_cast<size_t>(bytes)), 0);
  EXPECT_EQ(LXReleaseLocale(locale), 0);
}

TEST_F(CollateTest, MemoryAndBadSorts) {
  open(example());
  const Text lower(300, 'a'), upper(300, 'A');
  compare(lower, upper);
  hooks.fail_at(1, true);
  EXPECT_EQ(compare(lower, upper), 0);
  EXPECT_EQ(LXGetError(nullptr), LX_E_MEMORY);
  uint8_t buffer[16];
  EXPECT_EQ(LXStrxfrmU(nullptr, buffer, 16, lower.data(), 300, 0), -1);
  EXPECT_EQ(LXGetError(nullptr), LX_E_MEMORY);
  EXPECT_EQ(LXStrGenSortKey(nullptr, buffer, 16, lower.data(), 300), -1);
  hooks.fail_at(0);
  EXPECT_EQ(compare(lower, upper), -1);
  // Every table lies inside the payload, or the sort is refused.
  const ByteString good = example().payload();
  for (size_t field : {2, 4, 8, 8 + 4 * 0x4E, 1030, 1032, 1034}) {
    ByteString bad = good;
    bad[field] = bad[field + 1] = 0xFF;
    directory.write("so_00001.nls", object_file({bad}));
    terminate();
    ASSERT_EQ(init(directory.path().c_str(), LX_NO_DEFAULTS), LX_OK);
    const bool base_of_computed_page = field == 8 + 4 * 0x4E;
    EXPECT_EQ(LXSetLocale("English.TINY-UTF8@Test", 0), base_of_computed_page ? LX_OK : LX_E_NOT_INITIALIZED)
        << field;
  }
  for (size_t bytes = 0; bytes < good.size(); bytes += 97) {
    directory.write("so_00001.nls",
                    object_file({ByteString(good.begin(), good.begin() + static_cast<long>(bytes))}));
    terminate();
    ASSERT_EQ(init(directory.path().c_str(), LX_NO_DEFAULTS), LX_OK);
    EXPECT_EQ(LXSetLocale("English.TINY-UTF8@Test", 0), LX_E_NOT_INITIALIZED) << bytes;
  }
}

}  // namespace
}  // namespace lx::test
