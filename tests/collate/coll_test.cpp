// Collation and sort keys over sort objects that the test makes: weights, the buffers of keys, sorts that are
// refused, and over random sorts and texts that keys, comparison and all forms agree.
#include <memory>
#include <tuple>

#include "collate/lxsort.h"
#include "support/case_test.h"
#include "support/damage.h"
#include "support/slowness.h"

namespace lx::test {
namespace {

class CollateTest : public ::testing::Test {
 protected:
  /// English in UTF-8 with the sort given.
  void open(const SortBuilder& sort) {
    library.reset();
    library = std::make_unique<CaseLibrary>(sort);
    in = library->locale(case_codepage("UTF8"), "English", "Test");
  }
  void TearDown() override { EXPECT_TRUE(library == nullptr || library->close()); }

  template <class F>
  int compare(const F& form, const Units& a, const Units& b) {
    const auto x = encode(form, in, a), y = encode(form, in, b);
    return sign(form.coll(in, x.data(), count_of(x), y.data(), count_of(y), 0));
  }
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

/// A character is read ahead whether a pair begins with the one before it or not. U+FFFF, which stands for none,
/// is left where it is.
TEST_F(CollateTest, TheValueOfNoneIsNotReadAhead) {
  open(example_sort());
  const LXUChar units[] = {'a', 'b', 0xFFFF};
  const LXUChar* at = units;
  int32_t left = 3;
  uint16_t counter = 0;
  LXUChar ahead = LX_NO_LOOK_AHEAD;
  LXWeights first{}, second{};
  uint8_t char_class = 0;
  for (const LXUChar wanted : {LXUChar{'b'}, LX_NO_LOOK_AHEAD}) {
    LXStrGetNextWeightU(in, &at, &left, &counter, &first, &second, &char_class, &ahead);
    EXPECT_EQ(std::tie(at, ahead), std::make_tuple(units + 2, wanted));
  }
  EXPECT_EQ(left, 1);
}

/// The key of a text as a caller makes it who takes the weights one element at a time.
template <class F>
ByteString stepped_key(const F& form, LXLocale* in, const Text<typename F::Unit>& text) {
  uint16_t primaries[512], specials[512];
  uint8_t secondaries[512], tertiaries[512];
  uint16_t *primary_at = primaries, *primary_end = primaries, *special_at = specials, *special_end = specials;
  uint8_t *secondary_at = secondaries, *secondary_end = secondaries;
  uint8_t *tertiary_at = tertiaries, *tertiary_end = tertiaries;
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

/// The buffer counts from an aligned address on; the rest of one that is large enough for the work area, which
/// is that of the characters, is cleared. No characters need none, at any address.
TEST_F(CollateTest, KeyBuffers) {
  open(example_sort());
  const struct {
    std::string text;
    size_t at;
    int32_t size, bytes;
    ptrdiff_t zeros;  // of bytes that were none before
  } rows[] = {{"ab", 0, 6, 7, 0},         {"ab", 0, 7, 7, 4},   {"ab", 1, 9, 7, 0},   {"ab", 1, 10, 7, 4},
              {"ab", 0, 36, 7, 33},       {"ab", 0, 35, 7, 4},  {"ch", 0, 36, 5, 34}, {"ch", 0, 35, 5, 3},
              {"\xC3\xA6", 0, 20, 8, 16}, {"\xC3", 1, 3, 3, 3}, {"", 0, 0, 0, 0},     {"", 0, 1, 3, 1},
              {"", 0, 2, 3, 2},           {"", 0, 3, 3, 3}};
  for (const auto& row : rows) {
    SCOPED_TRACE(testing::Message() << row.text << ' ' << row.at << ' ' << row.size);
    alignas(4) uint8_t buffer[64];
    memset(buffer, 0x5A, sizeof(buffer));
    EXPECT_EQ(LXStrxfrm(in, buffer + row.at, row.size, row.text.data(), count_of(row.text), 0), row.bytes);
    EXPECT_EQ(std::count(std::begin(buffer), std::end(buffer), 0), row.zeros);
    memset(buffer, 0x5A, sizeof(buffer));
    if (!row.text.empty()) continue;
    EXPECT_EQ(LXStrGenSortKey(in, buffer, row.size, nullptr, 0), 3);
    EXPECT_EQ(std::count(std::begin(buffer), std::end(buffer), 0), row.size == 3 ? 3 : 0);
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
    sort.pairs.push_back({static_cast<LXUChar>('a' + below(4)),
                          below(4) == 0 ? LXUChar{0x4E51} : static_cast<LXUChar>('a' + below(4)), weight()});
  sort.computed[0x4E] = {lexicor_data::SortPageKind::kPrimary, 0x300 - 0x50, kAppendAll, {}};
  return sort;
}

TEST_F(CollateTest, KeysOrderAsComparisonDoes) {
  std::mt19937 random(1);
  const Units alphabet{'a',   'b',   'c', 'd', 'e',  'f',    'g',    'h',
                       0x301, 0x302, '-', '+', 0xE6, 0x4E51, 0x4E52, '?'};
  int equal = 0, different = 0;
  for (unsigned round = 0; round < 60u / kSlowness; ++round) {
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
    std::vector<ByteString> keys;
    for (const Units& t : texts) {
      keys.push_back(key(t, LXStrxfrmU));
      in_all_forms(
          [&](const auto& form) { ASSERT_EQ(stepped_key(form, in, encode(form, in, t)), keys.back()); });
    }
    for (size_t i = 0; i < texts.size(); ++i)
      for (size_t j = 0; j < texts.size(); ++j) {
        const Units &a = texts[i], &b = texts[j];
        const ByteString &key_a = keys[i], &key_b = keys[j];
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
    ASSERT_EQ(stepped_key(kPlain, in, a), key_a) << testing::PrintToString(a);
    ASSERT_EQ(sign(LXStrcoll(in, a.data(), count_of(a), b.data(), count_of(b), 0)),
              (key_a > key_b) - (key_a < key_b))
        << a << " " << b;
  }
  // Half a character is none, and is not given a work area either.
  ByteString buffer(64, 0x5A), expected(3, 0);
  expected.resize(buffer.size(), 0x5A);
  EXPECT_EQ(LXStrxfrm(in, buffer.data(), count_of(buffer), "\xC3", 1, 0), 3);
  EXPECT_EQ(buffer, expected);
  EXPECT_GT(equal * kSlowness, 3600);
  EXPECT_GT(different * kSlowness, 100000);
}

/// Every table lies inside the payload, or the sort is refused.
TEST_F(CollateTest, BadSorts) {
  const auto refused = [](const std::string& changes) {
    std::vector<ByteString> sorts{example_sort().payload()};
    change_sections(&sorts, changes);
    Sections sections{};
    sections.section[0] = {sorts[0].data(), sorts[0].size()};
    return static_cast<bool>(kSortType.validate(1, sections));
  };
  EXPECT_FALSE(refused(""));
  EXPECT_FALSE(refused("0:320 = 65535")) << "any base of a computed page will do";
  // The weights of the first page begin inside with 600.
  for (const char* bad : {"0:2 = 65535", "0:4 = 65535", "0:8 = 65535", "0:8 = 600", "0:1030 = 65535",
                          "0:1032 = 65535", "0:1034 = 65535", "0:size = size0-1"})
    EXPECT_TRUE(refused(bad)) << bad;
  for (size_t bytes = 0; bytes < 1400; bytes += 97)
    EXPECT_TRUE(refused("0:size = " + std::to_string(bytes))) << bytes;
}

}  // namespace
}  // namespace lx::test
