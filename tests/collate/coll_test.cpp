// Collation and sort keys over sort objects that the test makes: weights, the buffers of keys, sorts that are
// refused, and over random sorts and texts that keys, comparison and all forms agree.
#include <algorithm>
#include <memory>
#include <random>
#include <tuple>

#include "core/library_fixture.h"
#include "support/case_library.h"
#include "support/forms.h"

namespace lx::test {
namespace {

int sign(int32_t value) {
  return (value > 0) - (value < 0);
}

class CollateTest : public ::testing::Test {
 protected:
  /// English in UTF-8 with the sort given.
  void open(const SortBuilder& sort) {
    library.reset();
    library = std::make_unique<CaseLibrary>(sort);
    in = library->locale(case_codepage("UTF8"), "English", "Test");
  }
  void TearDown() override { EXPECT_TRUE(library->close()); }

  template <class F>
  int compare(const F& form, const Units& a, const Units& b) {
    const auto x = encode(form, in, a), y = encode(form, in, b);
    return sign(form.coll(in, x.data(), count_of(x), y.data(), count_of(y), 0));
  }
  int compare(const char* a, const char* b) { return compare(kUnicode, units(a), units(b)); }
  template <class Unit, class Transform>
  ByteString key(const Text<Unit>& text, Transform transform) {
    alignas(4) uint8_t buffer[2048];
    const int32_t bytes = transform(in, buffer, int32_t{sizeof(buffer)}, text.data(), count_of(text), 0);
    EXPECT_GE(bytes, 0);
    return ByteString(buffer, buffer + std::max(bytes, 0));
  }

  std::unique_ptr<CaseLibrary> library;
  LXLocale* in = nullptr;
};

TEST_F(CollateTest, Weights) {
  open(example_sort());
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
    return LXStrGetNextWeight(in, &at, &left, &counter, &first, &second, &char_class, &ahead);
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
    LXStrGetNextWeightU(in, &unit_at, &units_left, &counter, &first, &second, &char_class, &ahead);
    EXPECT_EQ(std::tie(unit_at, ahead), std::make_tuple(units + 2, wanted));
  }
  EXPECT_EQ(units_left, 1);
}

/// The key of a text as a caller makes it who takes the weights one element at a time.
template <class F>
ByteString stepped_key(const F& form, LXLocale* in, const Units& units) {
  uint16_t primaries[512], specials[512];
  uint8_t secondaries[512], tertiaries[512];
  uint16_t *primary_at = primaries, *primary_end = primaries, *special_at = specials, *special_end = specials;
  uint8_t *secondary_at = secondaries, *secondary_end = secondaries;
  uint8_t *tertiary_at = tertiaries, *tertiary_end = tertiaries;
  const auto text = encode(form, in, units);
  const typename F::Unit* p = text.data();
  int32_t left = count_of(text);
  uint16_t counter = 0;
  LXUChar ahead = LX_NO_LOOK_AHEAD;
  while (left > 0) {
    LXWeights sets[2];
    uint8_t char_class = 0;
    const int32_t count = form.next_weight(in, &p, &left, &counter, &sets[0], &sets[1], &char_class, &ahead);
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

/// The buffer counts from an aligned address on; the rest of one that is large enough is cleared.
TEST_F(CollateTest, KeyBuffers) {
  open(example_sort());
  alignas(4) uint8_t buffer[64];
  const auto transform = [&](size_t at, int32_t size) {
    memset(buffer, 0x5A, sizeof(buffer));
    return LXStrxfrm(in, buffer + at, size, "ab", -1, 0);
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
  EXPECT_EQ(LXStrxfrm(in, buffer, 20, "\xC3\xA6", 2, 0), 8);
  EXPECT_EQ(buffer[19], 0);
  memset(buffer, 0x5A, sizeof(buffer));
  EXPECT_EQ(LXStrxfrm(in, buffer + 1, 3, "\xC3", 1, 0), 3);
  EXPECT_EQ(std::count(buffer, buffer + 8, 0), 3);
  for (int32_t size : {0, 1, 2, 3}) {
    memset(buffer, 0x5A, sizeof(buffer));
    EXPECT_EQ(LXStrxfrm(in, buffer, size, "", -1, 0), size == 0 ? 0 : 3);
    EXPECT_EQ(std::count(buffer, buffer + 8, 0), size);
    EXPECT_EQ(LXStrGenSortKey(in, buffer + 16, size, nullptr, 0), 3);
    EXPECT_EQ(std::count(buffer + 16, buffer + 32, 0), size == 3 ? 3 : 0);
  }
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
  for (LXUChar u : units("abcdefgh")) sort.characters[u] = weight();
  sort.characters[0x301] = letter(0, static_cast<uint8_t>(4 + below(3)), 0);
  sort.characters[0x302] = letter(0, 0, static_cast<uint8_t>(4 + below(3)));
  for (LXUChar u : units("-+")) sort.characters[u] = special(static_cast<uint16_t>(1 + below(9)));
  sort.expansions[0xE6] = {weight(), weight().weights};
  for (int i = 0; i < 3; ++i)
    sort.pairs.push_back(
        {static_cast<LXUChar>('a' + below(4)), static_cast<LXUChar>('a' + below(4)), weight()});
  sort.computed[0x4E] = {2, kAppendAll, static_cast<uint16_t>(0x300 - 0x50)};
  return sort;
}

TEST_F(CollateTest, KeysOrderAsComparisonDoes) {
  std::mt19937 random(1);
  const Units alphabet{'a',   'b',   'c', 'd', 'e',  'f',    'g',    'h',
                       0x301, 0x302, '-', '+', 0xE6, 0x4E51, 0x4E52, '?'};
  int equal = 0, different = 0;
  for (unsigned round = 0; round < 60; ++round) {
    const bool inserts = round % 2 != 0;
    open(random_sort(&random, inserts ? 30 : 0));
    std::vector<Units> texts;
    for (int i = 0; i < 60; ++i) {
      Units t(random() % (i == 0 ? 200 : 9), 0);
      for (LXUChar& u : t) u = alphabet[random() % alphabet.size()];
      if (i % 2 != 0 && !texts.back().empty()) {  // differs from another one in a character
        t = texts.back();
        t[random() % t.size()] = alphabet[random() % alphabet.size()];
      }
      texts.push_back(t);
    }
    for (const Units& t : texts)
      in_all_forms([&](const auto& form) { ASSERT_EQ(stepped_key(form, in, t), key(t, LXStrxfrmU)); });
    for (const Units& a : texts)
      for (const Units& b : texts) {
        const ByteString key_a = key(a, LXStrxfrmU), key_b = key(b, LXStrxfrmU);
        const int by_key = (key_a > key_b) - (key_a < key_b);
        const int direct = compare(kUnicode, a, b);
        ASSERT_EQ(compare(kUnicode, b, a), -direct);
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
          ASSERT_EQ(direct, by_key) << shown(a) << " " << shown(b);
        }
        (direct == 0 ? equal : different)++;
        in_all_forms([&](const auto& form) { ASSERT_EQ(compare(form, a, b), direct); });
      }
  }
  // Damaged text: a lead byte takes the bytes behind it, whatever they are.
  open(random_sort(&random, 0));
  const auto damaged = [&] {
    std::string bytes(1 + random() % 6, 'a');
    for (char& c : bytes) c = "aefgh\xC3\xE4"[random() % 7];
    return bytes;
  };
  for (int i = 0; i < 4000; ++i) {
    const std::string a = damaged(), b = damaged();
    const ByteString key_a = key(a, LXStrxfrm), key_b = key(b, LXStrxfrm);
    ASSERT_EQ(sign(LXStrcoll(in, a.data(), count_of(a), b.data(), count_of(b), 0)),
              (key_a > key_b) - (key_a < key_b))
        << a << " " << b;
  }
  EXPECT_GT(equal, 3600);
  EXPECT_GT(different, 100000);
}

TEST_F(CollateTest, SpecialsBehindPairs) {
  SortBuilder sort = example_sort();
  for (LXUChar inserted : units("yz12")) sort.characters.erase(inserted);
  sort.characters['x'] = letter(0x203);  // as "ch"
  open(sort);
  EXPECT_EQ(compare("ch", "x"), 0);
  EXPECT_EQ(compare("ch-", "x-"), 1) << "the third character, not the second";
  EXPECT_EQ(compare("ch-a", "x-b"), -1);
}

/// Every table lies inside the payload, or the sort is refused.
TEST_F(LibraryTest, BadSorts) {
  directory.write_locale({{367, "US-ASCII", ascii_codepage()}});
  directory.write("control.nls", control_file({{1, LX_LANGUAGE, "English"},
                                               {840, LX_TERRITORY, "UnitedStates"},
                                               {367, LX_CODEPAGE, "US-ASCII"},
                                               {1, LX_SORT, "Test"}}));
  const auto code_of = [&](const ByteString& payload) {
    directory.write("so_00001.nls", object_file({payload}));
    terminate();
    EXPECT_EQ(init(directory.path().c_str(), LX_NO_DEFAULTS), LX_OK);
    return LXSetLocale("English.US-ASCII@Test", 0);
  };
  const ByteString good = example_sort().payload();
  for (size_t field : {2, 4, 8, 8 + 4 * 0x4E, 1030, 1032, 1034}) {
    ByteString bad = good;
    bad[field] = bad[field + 1] = 0xFF;
    const bool base_of_computed_page = field == 8 + 4 * 0x4E;
    EXPECT_EQ(code_of(bad), base_of_computed_page ? LX_OK : LX_E_NOT_INITIALIZED) << field;
  }
  for (size_t bytes = 0; bytes < good.size(); bytes += 97)
    EXPECT_EQ(code_of({good.begin(), good.begin() + static_cast<ptrdiff_t>(bytes)}), LX_E_NOT_INITIALIZED)
        << bytes;
}

}  // namespace
}  // namespace lx::test
