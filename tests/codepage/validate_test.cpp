// What loading refuses, what it must not refuse, and that after it has accepted a codepage no function leaves
// the sections or reads beyond a character, whatever the bytes, and that what loading derives says what the
// tables of the file say.
#include <gtest/gtest.h>

#include <random>

#include "codepage/lxcodepage.h"
#include "core/lxformat.h"
#include "support/case_library.h"
#include "support/case_rows.h"
#include "support/conversion.h"
#include "support/damage.h"
#include "support/slowness.h"
#include "support/tiny_codepages.h"
#include "support/use_codepage.h"

namespace lx::test {
namespace {

namespace fmt = format::codepage;
using S = std::vector<ByteString>;  // sections

/// The Unicode value of a sequence by the trie as it is laid down.
uint16_t walked(const S& s, const uint8_t* p) {
  for (size_t index = 0;; ++p) {
    const auto node = fmt::UnicodeNode::read(&s[1][index * fmt::UnicodeNode::kBytes]);
    if (*p < node.lowest || *p > node.highest) return kNoUnicode;
    index = node.next(*p);
    if (node.leaf != 0) return le16(&s[1][le16(&s[0][fmt::kUnicodeValues]) + 2 * index]);
  }
}

/// What loading derived says what the tables say: every value, or some of every page, and many sequences.
void compare(const S& s, CodepageObject* made, std::mt19937* random, unsigned step) {
  const LXObject* const object = made->object();
  Units units;
  std::string text;
  for (uint32_t u = 0; u <= 0xFFFF; u += step < 100 ? 1 : 7) {
    uint8_t bytes[kMaxCharBytes];
    const int32_t count = LXCpUnicodeToChar(object, static_cast<uint16_t>(u), reinterpret_cast<char*>(bytes));
    const uint32_t code = without_zero_bytes(LXCpUnicodeToCharW(object, static_cast<uint16_t>(u)));
    ASSERT_EQ(pack(bytes, static_cast<size_t>(count)), code) << std::hex << u;
    units.push_back(static_cast<LXUChar>(u));
    text.append(reinterpret_cast<char*>(bytes), static_cast<size_t>(count));
  }
  if ((s[0][fmt::kFlags] & fmt::kFlagShift) == 0) {
    EXPECT_TRUE(encode(kPlain, made->locale(), units) == text) << "runs are not what their characters are";
  }
  if (s[0][fmt::kWidth] == 1 || object->disk.id == fmt::kUtf8Id) return;
  for (uint32_t pair = 0; pair <= 0xFFFF; pair += 1 + static_cast<uint32_t>((*random)() % step)) {
    const uint32_t tail = static_cast<uint32_t>((*random)()) & ((*random)() % 8 == 0 ? 0x00FFu : 0xFFFFu);
    uint8_t bytes[kMaxCharBytes];
    store_code(bytes, pair << 16 | tail, sizeof(bytes));
    ASSERT_EQ(LXCpMbToUnicode(object, reinterpret_cast<const char*>(bytes)), walked(s, bytes))
        << std::hex << pair;
  }
}

/// Everything, and a stream.
void use_everything(LXLocale* locale, unsigned step) {
  look_up(locale, step);
  use_text(locale, step);
  std::string all;
  for (int b = 0; b < 512; ++b) all.push_back(static_cast<char>(b < 256 ? b : 511 - b));
  Conversion conversion(locale, locale);
  size_t at = 0;
  for (int steps = 0; steps < 5000 && at < all.size(); ++steps)
    at += conversion.call(all.substr(at, 5), 8).taken;
  EXPECT_EQ(at, all.size()) << "the stream stands still";
}

class Validate : public testing::Test {
 protected:
  void TearDown() override { EXPECT_TRUE(library_.close()); }

  TinyLibrary library_{{tiny_single()}};
};

TEST_F(Validate, RefusedWithItsReasonOrSafe) {
  std::mt19937 random(5);
  for (const CaseRow& row : case_rows("codepage/damage.txt")) {
    SCOPED_TRACE(row.where + " " + row[0]);
    TinyCodepage cp = case_codepage(row[1]);
    S& sections = cp.file.sections;
    change_sections(&sections, row[2]);
    CodepageObject made(cp.file.id, sections);
    EXPECT_EQ(made.reason(), row[3]);
    if (!row[3].empty()) continue;
    ASSERT_EQ(made.code(), LX_OK);
    use_everything(made.locale(), 3);
    compare(sections, &made, &random, 20);
  }
}

TEST_F(Validate, WholeAndEveryTruncation) {
  std::mt19937 random(4);
  for (const TinyCodepage& cp : tiny_codepages()) {
    SCOPED_TRACE(cp.file.name);
    CodepageObject whole(cp.file.id, cp.file.sections);
    ASSERT_EQ(whole.code(), LX_OK);
    use_everything(whole.locale(), 1);
    compare(cp.file.sections, &whole, &random, 1);
    for (size_t section = 0; section < cp.file.sections.size(); ++section) {
      const size_t size = cp.file.sections[section].size();
      for (size_t cut = size; cut-- > 0; cut -= cut > 64 && size - cut > 64 ? 61 : 0) {
        S sections = cp.file.sections;
        sections[section].resize(cut);
        CodepageObject made(cp.file.id, sections);
        EXPECT_TRUE(section != 0 || made.code() == LX_E_CORRUPT) << cut;
        if (made.code() == LX_OK) look_up(made.locale(), 997);
      }
    }
  }
}

/// Bytes changed at random where offsets, counts, masks and nodes stand: refused, or safe and walked alike.
TEST_F(Validate, RandomDamage) {
  std::mt19937 random(6);
  for (const TinyCodepage& cp : tiny_codepages()) {
    SCOPED_TRACE(cp.file.name);
    int accepted = 0, refused = 0;
    for (int round = 0; round < 400 / kSlowness; ++round) {
      S sections = cp.file.sections;
      const size_t nodes = le16(&sections[0][fmt::kUnicodeValues]);
      for (size_t n = 1 + random() % 3; n > 0; --n) {
        ByteString& p = sections[0];
        const uint8_t value = static_cast<uint8_t>(random() % 3 == 0 ? random() % 4 : random());
        const size_t behind = p.size() > 5500 ? random() % (p.size() - fmt::kFixedBytes) : 0;
        const size_t places[] = {fmt::kWidth + random() % 5, fmt::kLengths + random() % 256,
                                 fmt::kPages + random() % 2048, fmt::kFlags + random() % 12,
                                 fmt::kFixedBytes - 1 + behind};
        const size_t place = random() % 6;
        if (place < 5)
          p[places[place]] = value;
        else if (nodes != 0)
          sections[1][random() % nodes] = value;
      }
      CodepageObject made(cp.file.id, sections);
      ASSERT_TRUE(made.code() == LX_OK || made.code() == LX_E_CORRUPT);
      ++(made.code() == LX_OK ? accepted : refused);
      if (made.code() != LX_OK) continue;
      use_everything(made.locale(), 251);
      compare(sections, &made, &random, 500);
      if (HasFatalFailure()) return;
    }
    EXPECT_GT(accepted, 0);
    EXPECT_GT(refused, 0);
  }
}

}  // namespace
}  // namespace lx::test
