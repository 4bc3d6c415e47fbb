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

struct DefaultPayload {
  uint8_t bytes[fmt::kFixedBytes] = {};
};

constexpr DefaultPayload make_default_payload() {
  DefaultPayload p;
  p.bytes[fmt::kSubstitution] = kQuestionMark;
  const uint8_t line_ends[] = {0x0A, 0x0D, 0x0A, 0x0A};
  for (size_t i = 0; i < sizeof(line_ends); ++i) p.bytes[fmt::kLineEnds + i] = line_ends[i];
  p.bytes[fmt::kWidth] = 1;
  for (size_t b = 0; b < kRow; ++b) {
    const bool ascii = b < 0x80;
    const bool upper = b >= 'A' && b <= 'Z';
    const bool lower = b >= 'a' && b <= 'z';
    p.bytes[fmt::kLengths + b] = 1;
    p.bytes[fmt::kUpper + b] = static_cast<uint8_t>(lower ? b - 0x20 : b);
    p.bytes[fmt::kLower + b] = static_cast<uint8_t>(upper ? b + 0x20 : b);
    put_le16(p.bytes + fmt::kUnicode + 2 * b, static_cast<uint16_t>(ascii ? b : kNoUnicode));
    put_le32(p.bytes + fmt::kTypes + 4 * b, ascii ? LX_UNICODE_Ctype1[b] : 0);
    fmt::PageEntry page;
    if (b == 0) page = {fmt::kKindByte, 0xFF, 0x00, 0xFF, 0, 0};
    page.write(p.bytes + fmt::kPages + b * fmt::PageEntry::kBytes);
  }
  put_le16(p.bytes + fmt::kFlags, fmt::kFlagAscii);
  return p;
}

struct DefaultLow {
  uint8_t bytes[kDefaultLowBytes] = {};
};

constexpr DefaultLow make_default_low() {
  DefaultLow low;
  for (size_t b = 0; b < kRow; ++b) low.bytes[b] = static_cast<uint8_t>(b < 0x80 ? b : kQuestionMark);
  low.bytes[256] = 0x0A;
  low.bytes[257] = 0x0A;
  low.bytes[258] = kQuestionMark;
  return low;
}

constexpr DefaultPayload LXDefCp = make_default_payload();
constexpr DefaultLow LXDefCp3 = make_default_low();

struct DefaultCodes {
  uint16_t rows[2][kRow] = {};  // a page that maps nothing, and page 0
};

constexpr DefaultCodes make_default_codes() {
  DefaultCodes codes;
  for (size_t b = 0; b < kRow; ++b) {
    codes.rows[0][b] = kQuestionMark;
    codes.rows[1][b] = LXDefCp3.bytes[b];
  }
  return codes;
}

constexpr DefaultCodes kDefaultCodes = make_default_codes();

constexpr Codepage make_default_codepage() {
  Codepage cp{};
  cp.payload = LXDefCp.bytes;
  cp.pages = {LXDefCp.bytes, LXDefCp3.bytes, nullptr};
  cp.codes16 = kDefaultCodes.rows[0];
  for (size_t b = 0; b < kRow; ++b) cp.unicode[b] = le16(LXDefCp.bytes + fmt::kUnicode + 2 * b);
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

const BuiltIn kBuiltInCodepage{
    "US-ASCII",
    {{{LXDefCp.bytes, sizeof(LXDefCp.bytes)}, {}, {LXDefCp3.bytes, sizeof(LXDefCp3.bytes)}, {}}},
    &kDefaultCodepage};

}  // namespace lx
