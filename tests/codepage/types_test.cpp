// Character types through the doors, the type records, and the tables of the built-in codepage.
#include "codepage/lxcodepage.h"
#include "codepage/lxunicode.h"
#include "support/case_test.h"

namespace lx::test {
namespace {

namespace fmt = format::codepage;

using Types = CaseTest;

TEST_F(Types, EveryCharacterInEveryForm) {
  const struct {
    uint32_t selector, shift, mask;
    int32_t error;
  } selectors[] = {{0x80000010, 0, 0x3FF, LX_OK},     {0x80000011, 10, 0xFFF, LX_OK},
                   {0x80000012, 22, 0x3FF, LX_OK},    {0x80000013, 0, 0x3FF, LX_E_INVALID},
                   {0x12345, 0, 0x3FF, LX_E_INVALID}, {0, 0, 0x3FF, LX_E_INVALID}};
  for (const TinyCodepage& cp : case_codepages()) {
    SCOPED_TRACE(cp.file.name);
    LXLocale* locale = library.locale(cp);
    for (const TinyCharacter& c : cp.characters) {
      const std::vector<char> text(c.bytes.begin(), c.bytes.end());
      const LXShiftState state = cp.shift && text.size() > 1 ? LX_SHIFT_DOUBLE : LX_SHIFT_SINGLE;
      for (const auto& s : selectors) {
        const auto expect = [&](uint32_t got) {
          EXPECT_EQ(got, unicode_type(c.unicode) >> s.shift & s.mask) << std::hex << c.code;
          EXPECT_EQ(LXGetError(locale), s.error);
        };
        expect(LXGetCharTypeEx(locale, text.data(), state, s.selector));
        expect(LXGetCharTypeW(locale, c.code, s.selector));
        expect(LXGetCharTypeU(locale, c.unicode, s.selector));
        if (state != LX_SHIFT_DOUBLE) expect(LXGetCharType(locale, text.data(), s.selector));
      }
    }
  }
}

TEST_F(Types, BytesWithoutACharacterAndShiftBytes) {
  LXLocale* single = library.locale(case_codepage("SINGLE"));
  EXPECT_EQ(LXGetCharType(single, "\x80", LX_CTYPE1), 0u);
  EXPECT_EQ(LXGetCharTypeW(single, 0x80, LX_CTYPE2), 0u);
  EXPECT_EQ(LXGetCharTypeEx(single, "A", 1, LX_CTYPE1), 0x213u);
  EXPECT_EQ(LXGetMbCtype(single->codepage, "A"), nullptr);
  // A lead byte on its own is a single byte when it comes as a code.
  LXLocale* sjis = library.locale(case_codepage("SJIS"));
  EXPECT_EQ(LXGetCharTypeW(sjis, 0x82, LX_CTYPE1), 0u);
  EXPECT_EQ(LXGetCharTypeW(sjis, 0x100, LX_CTYPE1), 0u);
  EXPECT_EQ(LXGetCharType(sjis, "\x82\x20", LX_CTYPE2), 0u) << "a pair without a character";

  LXLocale* shift = library.locale(case_codepage("SHIFT"));
  for (LXShiftState state : {LX_SHIFT_SINGLE, LX_SHIFT_DOUBLE}) {
    EXPECT_EQ(LXGetCharTypeEx(shift, "\x0E\x44\x47", state, LX_CTYPE3), unicode_type(0x3041) >> 22);
    EXPECT_EQ(LXGetCharTypeEx(shift, "\x0F\xC1", state, LX_CTYPE3), unicode_type('A') >> 22);
  }
}

/// As the compiler packs it, but for page 0, which has all its bytes, and for the two line ends and the
/// substitution behind the low array.
TEST(BuiltInCodepage, Payload) {
  const std::vector<ByteString> built_in = ascii_codepage();
  ByteString packed = CodepageBuilder(1, "US-ASCII", 1).ascii().build().file.sections[0];
  fmt::PageEntry{fmt::kKindByte, 0xFF, 0x00, 0xFF, 0, 0}.write(&packed[fmt::kPages]);
  EXPECT_EQ(built_in[0], packed);
  ByteString low;
  for (unsigned b = 0; b < 256; ++b) low.push_back(b < 0x80 ? static_cast<uint8_t>(b) : '?');
  low.insert(low.end(), {0x0A, 0x0A, '?'});
  EXPECT_EQ(built_in[2], low);
}

/// In force when there is no directory; its derived data are compiled in and must be what loading would derive.
TEST(BuiltInCodepage, DerivedData) {
  const TinyLibrary library({tiny_single()});  // gives memory
  const auto values = [](const void* data) {
    const Codepage& c = *static_cast<const Codepage*>(data);
    std::vector<uint32_t> all{c.width,        c.substitution,    c.shift_out, c.shift_in,
                              c.single_byte,  c.shift_sensitive, c.utf8,      c.two_level_rows,
                              c.plain_digits, c.same_below};
    all.insert(all.end(), c.unicode, c.unicode + 256);
    all.insert(all.end(), c.caseless, c.caseless + 256);
    all.insert(all.end(), c.page_start, c.page_start + 256);
    all.insert(all.end(), c.codes16, c.codes16 + 512);
    all.insert(all.end(), {c.rows != nullptr, c.codes32 != nullptr});
    return all;
  };
  const CodepageObject loaded(1, ascii_codepage());
  ASSERT_EQ(loaded.code(), LX_OK);
  EXPECT_EQ(values(loaded.object()->derived), values(kBuiltInCodepage.derived));
  EXPECT_EQ(LXCpMbToUnicode(loaded.object(), "A"), kNoUnicode) << "it has no characters of several bytes";
}

}  // namespace
}  // namespace lx::test
