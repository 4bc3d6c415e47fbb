// The built-in US-ASCII codepage, in force without a locale directory: 7-bit ASCII, and "?" for everything
// else. Payload, arrays and derived data are laid out at compile time.
#include "codepage/lxcodepage.h"
#include "codepage/lxunicode_tables.inc"

using namespace lx;

namespace {

namespace fmt = format::codepage;

constexpr uint32_t kRow = 256;
constexpr size_t kDefaultLowBytes = 259;
constexpr uint8_t kQuestionMark = 0x3F;

/// An array that a function can give.
template <class T, size_t kCount>
struct Table {
  T at[kCount] = {};
};

constexpr auto make_default_payload() {
  Table<uint8_t, fmt::kFixedBytes> p;
  p.at[fmt::kSubstitution] = kQuestionMark;
  const uint8_t line_ends[] = {0x0A, 0x0D, 0x0A, 0x0A};
  for (size_t i = 0; i < sizeof(line_ends); ++i) p.at[fmt::kLineEnds + i] = line_ends[i];
  p.at[fmt::kWidth] = 1;
  for (size_t b = 0; b < kRow; ++b) {
    const bool ascii = b < 0x80;
    const bool upper = b >= 'A' && b <= 'Z';
    const bool lower = b >= 'a' && b <= 'z';
    p.at[fmt::kLengths + b] = 1;
    p.at[fmt::kUpper + b] = static_cast<uint8_t>(lower ? b - 0x20 : b);
    p.at[fmt::kLower + b] = static_cast<uint8_t>(upper ? b + 0x20 : b);
    put_le16(p.at + fmt::kUnicode + 2 * b, static_cast<uint16_t>(ascii ? b : kNoUnicode));
    put_le32(p.at + fmt::kTypes + 4 * b, ascii ? LX_UNICODE_Ctype1[b] : 0);
    fmt::PageEntry page;
    if (b == 0) page = {fmt::kKindByte, 0xFF, 0x00, 0xFF, 0, 0};
    page.write(p.at + fmt::kPages + b * fmt::PageEntry::kBytes);
  }
  put_le16(p.at + fmt::kFlags, fmt::kFlagAscii);
  return p;
}

constexpr auto make_default_low() {
  Table<uint8_t, kDefaultLowBytes> low;
  for (size_t b = 0; b < kRow; ++b) low.at[b] = static_cast<uint8_t>(b < 0x80 ? b : kQuestionMark);
  low.at[256] = 0x0A;
  low.at[257] = 0x0A;
  low.at[258] = kQuestionMark;
  return low;
}

constexpr auto LXDefCp = make_default_payload();
constexpr auto LXDefCp3 = make_default_low();

/// A row of a page that maps nothing, and that of page 0.
constexpr auto make_default_codes() {
  Table<uint16_t, 2 * kRow> codes;
  for (size_t b = 0; b < kRow; ++b) {
    codes.at[b] = kQuestionMark;
    codes.at[kRow + b] = LXDefCp3.at[b];
  }
  return codes;
}

constexpr auto kDefaultCodes = make_default_codes();

constexpr Codepage make_default_codepage() {
  Codepage cp{};
  cp.payload = LXDefCp.at;
  cp.pages = {LXDefCp.at, LXDefCp3.at, nullptr};
  cp.codes16 = kDefaultCodes.at;
  for (size_t b = 0; b < kRow; ++b) cp.unicode[b] = le16(LXDefCp.at + fmt::kUnicode + 2 * b);
  cp.page_start[0] = kRow;
  cp.width = 1;
  cp.substitution = kQuestionMark;
  cp.single_byte = true;
  cp.plain_digits = true;
  cp.same_below = 0x80;
  return cp;
}

constexpr Codepage kDefaultCodepage = make_default_codepage();

}  // namespace

namespace lx {

const BuiltIn kBuiltInCodepage{"US-ASCII",
                               {{{LXDefCp.at, sizeof(LXDefCp.at)}, {}, {LXDefCp3.at, sizeof(LXDefCp3.at)}, {}}},
                               &kDefaultCodepage};

}  // namespace lx
