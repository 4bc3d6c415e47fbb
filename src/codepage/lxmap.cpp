// Mapping of text to upper and lower case, to full and half width, to ASCII digits. One loop for all kinds of
// text: a text gives one character after the other and takes the mapped ones. What a character maps to is said
// twice: by the fixed rules of Unicode, and by the tables of a codepage.
#include <string.h>

#include "codepage/lxcopy.h"
#include "codepage/lxmaptext.h"
#include "codepage/lxunicode.h"
#include "codepage/lxwidth.h"
#include "core/lxcall.h"

namespace {

namespace fmt = lx::format::codepage;
using lx::ByteChar;
using lx::bytes_of;
using lx::Call;
using lx::Codepage;
using lx::codepage_of;
using lx::CodeText;
using lx::Form;
using lx::HalfWidthIndex;
using lx::LeadByteText;
using lx::ShiftText;
using lx::Specials;
using lx::UnicodeChar;
using lx::UnicodeText;
using lx::WidthTables;

RAS1_Unit unit = RAS1_UNIT("lxmap");

constexpr size_t kWorkBytes = 512;  // mapped in character mode, at most
constexpr size_t kWorkBytesPerChar = 6;
constexpr unsigned kAscii = 0x80;
constexpr size_t kLongText = 2 * lx::kBlock;  // units from which on preparing a faster way pays

enum class Kind { kCase, kFullWidth, kHalfWidth, kCopy, kDigits };

struct Mode {
  Kind kind;
  bool upper;
  bool specials;
};

/// False for a mode that is not listed.
bool parse_mode(uint32_t given, Mode* mode) {
  switch (given & ~uint32_t{LX_CHARACTERS}) {
    case LX_MAP_FULL_WIDTH:
      *mode = {Kind::kFullWidth, false, false};
      return true;
    case LX_MAP_HALF_WIDTH:
      *mode = {Kind::kHalfWidth, false, false};
      return true;
    case LX_MAP_COPY:
      *mode = {Kind::kCopy, false, false};
      return true;
    case LX_MAP_LOWER:
    case LX_MAP_LOWER_SIMPLE:
      *mode = {Kind::kCase, false, (given & 0x2000) == 0};
      return true;
    case LX_MAP_UPPER:
    case LX_MAP_UPPER_SIMPLE:
      *mode = {Kind::kCase, true, (given & 0x2000) == 0};
      return true;
    case LX_MAP_DIGITS:
      *mode = {Kind::kDigits, false, false};
      return true;
    default:
      return false;
  }
}

uint16_t ascii_digit(uint16_t u) {
  return (lx::unicode_type(u) & LX_C1_DIGIT) != 0 ? lx::unicode_digit(u) : 0;
}

/// The special mappings that a call uses, and which characters may begin one: below U+0100 exactly, above by
/// their low byte.
class SpecialFilter {
 public:
  SpecialFilter(const LXObject& language, const Mode& mode)
      : specials_(mode.specials ? lx::specials_of(language, mode.upper) : Specials{nullptr, 0}) {
    const uint8_t* entry = specials_.entries;
    for (size_t i = 0; i < specials_.count; ++i, entry += lx::format::language::kSpecialBytes) {
      const unsigned slot = slot_of(lx::le16(entry));
      bits_[slot / 32] |= 1u << slot % 32;
    }
  }
  bool any() const { return specials_.count != 0; }
  bool any_ascii() const { return (bits_[0] | bits_[1] | bits_[2] | bits_[3]) != 0; }
  bool may_begin(uint16_t u) const {
    const unsigned slot = slot_of(u);
    return (bits_[slot / 32] >> slot % 32 & 1) != 0;
  }
  const Specials& specials() const { return specials_; }

 private:
  static unsigned slot_of(uint16_t u) { return (u & 0xFFu) | (u > 0xFF ? 0x100u : 0); }
  Specials specials_;
  uint32_t bits_[16] = {};
};

// Mappers: what one character maps to by itself. alone() is false when it stays as it is.

template <Kind kKind>
struct UnicodeMapper {
  static constexpr bool kCase = kKind == Kind::kCase;
  const Mode& mode;
  using Value = LXUChar;

  uint16_t unicode(UnicodeChar c) const { return c.u; }
  LXUChar value(uint16_t u) const { return u; }
  bool alone(UnicodeChar c, LXUChar* mapped) const {
    if constexpr (kKind == Kind::kCase) {
      if (c.u >= 0x24EA && c.u < 0xFF21) return false;  // no case, which the lists say last
      *mapped = mode.upper ? lx::unicode_upper(c.u) : lx::unicode_lower(c.u);
    } else if constexpr (kKind == Kind::kFullWidth) {
      *mapped = lx::unicode_half_to_full(c.u);
    } else if constexpr (kKind == Kind::kHalfWidth) {
      *mapped = lx::unicode_full_to_half(c.u);
    } else {
      *mapped = ascii_digit(c.u);
      return *mapped != 0;
    }
    return true;
  }
};

template <Kind kKind>
struct CodepageMapper {
  static constexpr bool kCase = kKind == Kind::kCase;  // characters keep their width, and with it their state
  const Codepage& cp;
  const uint8_t* table;  // the case of single bytes
  uint32_t mask;
  const WidthTables& widths;
  const HalfWidthIndex* halves;  // where the kind is half width
  using Value = LXWChar;

  uint16_t unicode(const ByteChar& c) const {
    return c.length == 1 ? cp.unicode[*c.p] : lx::multibyte_unicode(cp, c.p);
  }
  LXWChar value(uint16_t u) const { return lx::unicode_to_code(cp, u); }
  bool alone(const ByteChar& c, LXWChar* mapped) const {
    if constexpr (kKind == Kind::kCase) {
      if (c.length == 1) {
        *mapped = table[*c.p];
        return true;
      }
      if (cp.caseless[*c.p] != 0) return false;
      const uint8_t* record = lx::type_record(cp, c.p);  // none where the codepage has no such codes
      if (record == nullptr || (lx::le32(record) & mask) == 0) return false;
      *mapped = lx::pack(c.p, c.length) + lx::le32(record + 4);
      return true;
    } else if constexpr (kKind == Kind::kFullWidth) {
      *mapped = c.length == 1 ? widths.full_of_byte(*c.p) : widths.to_full(lx::pack(c.p, c.length));
    } else if constexpr (kKind == Kind::kHalfWidth) {
      *mapped = halves->to_half(lx::pack(c.p, c.length));
    } else {
      const uint16_t digit = ascii_digit(unicode(c));
      *mapped = digit != 0 ? lx::unicode_to_code(cp, digit) : 0;
    }
    return *mapped != 0;
  }
};

// Runs of characters of one unit whose case one table tells.

struct AsciiTable {
  uint8_t to[kAscii];
  constexpr explicit AsciiTable(bool upper) : to() {
    for (unsigned c = 0; c < kAscii; ++c) to[c] = static_cast<uint8_t>(c ^ (is_other(c, upper) ? 0x20 : 0));
  }
  static constexpr bool is_other(unsigned c, bool upper) { return upper ? c - 'a' < 26 : c - 'A' < 26; }
};
constexpr AsciiTable kAsciiCase[2] = {AsciiTable(false), AsciiTable(true)};

struct Runs {
  const uint8_t* table;
  unsigned below;  // units under this are characters, and the table has their case
  bool blocks;     // ... under 0x80 the case of ASCII, and none of these is special
  bool upper;
};

Runs runs_of(const UnicodeText&, const SpecialFilter& filter, bool upper) {
  return {kAsciiCase[upper].to, kAscii, !filter.any_ascii(), upper};
}
Runs runs_of(const LeadByteText& text, const SpecialFilter& filter, bool upper) {
  const uint8_t* table = text.cp.payload + (upper ? fmt::kUpper : fmt::kLower);
  if (text.cp.single_byte) return {table, 0x100, false, upper};
  if (text.cp.same_below < kAscii) return {table, 0, false, upper};
  const bool blocks =
      !filter.any_ascii() && text.most() >= kLongText && memcmp(table, kAsciiCase[upper].to, kAscii) == 0;
  return {table, kAscii, blocks, upper};
}

uint16_t unicode_of(const UnicodeText&, uint16_t u) {
  return u;
}
uint16_t unicode_of(const LeadByteText& text, uint8_t byte) {
  return text.cp.unicode[byte];
}

/// The letters of a block of ASCII; input and output may be the same.
template <class Unit>
void case_block(Unit* to, const Unit* from, bool upper) {
  Unit block[lx::kBlock];
  memcpy(block, from, sizeof(block));
  const Unit first = upper ? 'a' : 'A';
  for (Unit& c : block) {
    const Unit above = static_cast<Unit>(c - first);
    c = static_cast<Unit>(c ^ (above < 26 ? 0x20 : 0));
  }
  memcpy(to, block, sizeof(block));
}

template <class Text>
void map_run(Text& text, const Runs& runs, const SpecialFilter& filter) {
  const auto* const from = text.p;
  auto* const to = text.out;
  const size_t n = text.most();
  size_t i = 0;
  if (runs.blocks)
    for (; n - i >= lx::kBlock && lx::is_same_block(from + i, kAscii); i += lx::kBlock)
      case_block(to + i, from + i, runs.upper);
  if (filter.any()) {
    for (; i < n && from[i] < runs.below && !filter.may_begin(unicode_of(text, from[i])); ++i)
      to[i] = runs.table[from[i]];
  } else {
    for (; i < n && from[i] < runs.below; ++i) to[i] = runs.table[from[i]];
  }
  text.p += i;
  text.out += i;
}

/// Copies the characters of several bytes that have no case, as far as they are whole and fit.
void copy_caseless(LeadByteText& text) {
  const uint8_t* const p = text.p;
  const uint8_t* const lengths = text.cp.caseless;
  const size_t n = text.most();
  size_t i = 0;
  while (i < n) {
    const size_t length = lengths[p[i]];
    if (length == 0 || length > n - i) break;
    i += length;
    // Mostly the next ones are as long: then no look-up waits for the one before it.
    while (n - i >= 4 * length && lengths[p[i]] == length && lengths[p[i + length]] == length &&
           lengths[p[i + 2 * length]] == length && lengths[p[i + 3 * length]] == length)
      i += 4 * length;
  }
  if (i == 0) return;
  memmove(text.out, text.p, i);
  text.p += i;
  text.out += i;
}
void copy_caseless(UnicodeText&) {}

/// Looks for the character that was just taken, then for it and the next one, which is taken too when the pair
/// is there: the number of results.
template <class Text, class Mapper>
int32_t find_special(Text* text, const Mapper& mapper, const Specials& specials, typename Text::Char* c,
                     LXUChar results[2]) {
  const uint16_t u = mapper.unicode(*c);
  int32_t count = specials.find(u, 0, &results[0], &results[1]);
  if (count != 0) return count;
  Text ahead = *text;
  typename Text::Char next;
  if (!ahead.take(&next)) return 0;
  count = specials.find(u, mapper.unicode(next), &results[0], &results[1]);
  if (count == 0) return 0;
  skip_to(text, ahead);
  set_state(c, state_of(next));
  return count;
}

/// Maps up to the end, a cut character, or the first one that does not fit.
template <class Text, class Mapper>
void map_all(Text& text, const Mapper& mapper, const SpecialFilter& filter, const Runs& runs) {
  LXShiftState reached = LX_SHIFT_SINGLE;
  for (;;) {
    if constexpr (Text::kRuns && Mapper::kCase) {
      if (text.p != text.end && *text.p < runs.below) map_run(text, runs, filter);
      if (!filter.any()) copy_caseless(text);
    }
    typename Text::Char c;
    if (!text.take(&c)) break;
    bool written = true;
    LXUChar results[2];
    const bool maybe = filter.any() && filter.may_begin(mapper.unicode(c));
    const int32_t count = maybe ? find_special(&text, mapper, filter.specials(), &c, results) : 0;
    if (count != 0) {
      written = text.put(mapper.value(results[0]), c);
      if (written) reached = state_of(c);
      set_state(&c, state_of(c));
      if (count == 2) written = written && text.put(mapper.value(results[1]), c);
    } else {
      typename Mapper::Value value{};
      written = mapper.alone(c, &value) ? text.put(value, c) : text.copy(c);
    }
    if (!written) {
      if constexpr (Mapper::kCase) reached = pass_before(text, reached);
      text.p = text.end;  // nothing that follows is passed through
      break;
    }
    reached = state_of(c);
  }
  text.finish(reached);
}

void map_unicode(UnicodeText& text, const SpecialFilter& filter, const Mode& mode) {
  const Runs runs = runs_of(text, filter, mode.upper);
  switch (mode.kind) {
    case Kind::kCase:
      return map_all(text, UnicodeMapper<Kind::kCase>{mode}, filter, runs);
    case Kind::kFullWidth:
      return map_all(text, UnicodeMapper<Kind::kFullWidth>{mode}, filter, runs);
    case Kind::kHalfWidth:
      return map_all(text, UnicodeMapper<Kind::kHalfWidth>{mode}, filter, runs);
    default:
      return map_all(text, UnicodeMapper<Kind::kDigits>{mode}, filter, runs);
  }
}

template <class Text>
[[gnu::noinline]] void map_half_width(Text& text, const SpecialFilter& filter, const WidthTables& widths) {
  const HalfWidthIndex index(widths, lx::room(text.p, text.end) >= kLongText);
  map_all(text, CodepageMapper<Kind::kHalfWidth>{text.cp, nullptr, 0, widths, &index}, filter, Runs{});
}

/// The text after it is mapped: where its output ends.
template <class Text>
auto map_codepage(Text text, const SpecialFilter& filter, const Mode& mode) {
  const WidthTables widths(text.cp);
  Runs runs{};
  if constexpr (Text::kRuns)
    if (mode.kind == Kind::kCase) runs = runs_of(text, filter, mode.upper);
  const uint8_t* const table = text.cp.payload + (mode.upper ? fmt::kUpper : fmt::kLower);
  const uint32_t mask = mode.upper ? LX_C1_LOWER : LX_C1_UPPER;
  if (mode.kind == Kind::kCase)
    map_all(text, CodepageMapper<Kind::kCase>{text.cp, table, mask, widths, nullptr}, filter, runs);
  else if (mode.kind == Kind::kFullWidth)
    map_all(text, CodepageMapper<Kind::kFullWidth>{text.cp, table, mask, widths, nullptr}, filter, runs);
  else if (mode.kind == Kind::kHalfWidth)
    map_half_width(text, filter, widths);
  else
    map_all(text, CodepageMapper<Kind::kDigits>{text.cp, table, mask, widths, nullptr}, filter, runs);
  return text.out;
}

size_t map_bytes_to(const LXLocale& locale, uint8_t* output, size_t size, const uint8_t* input, size_t bytes,
                    const Mode& mode, Form form) {
  const Codepage& cp = codepage_of(*locale.codepage);
  const SpecialFilter filter(*locale.language, mode);
  uint8_t* const out_end = lx::end_of(output, size);
  const uint8_t* const end =
      form == Form::kEx && cp.shift_sensitive
          ? map_codepage(ShiftText{cp, input, input + bytes, output, out_end}, filter, mode)
          : map_codepage(LeadByteText{cp, input, input + bytes, output, out_end}, filter, mode);
  return static_cast<size_t>(end - output);
}

int32_t map_bytes(LXLocale* given, char* output, int32_t size, const char* input, int32_t length,
                  uint32_t given_mode, Form form) {
  Call call(unit, given);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, -1);
  Mode mode;
  if (!parse_mode(given_mode, &mode)) return call.fail(LX_E_INVALID, -1);
  if (size < 1 || length == 0) return call.exit(0);
  const Codepage& cp = codepage_of(call.codepage());
  const uint8_t* const text = bytes_of(input);
  const bool characters = (given_mode & LX_CHARACTERS) != 0;
  if (mode.kind == Kind::kCopy) {
    const lx::Copied copied = lx::whole_bytes(cp, form, text, LX_SHIFT_SINGLE, length, size, characters);
    memmove(output, input, copied.units);
    return call.exit(static_cast<int32_t>(characters ? copied.chars : copied.units));
  }
  const size_t bytes = length < 0   ? lx::units_with_null(text)
                       : characters ? lx::bytes_of_chars(cp, text, LX_SHIFT_SINGLE, length)
                                    : static_cast<size_t>(length);
  const size_t room = static_cast<size_t>(size);
  if (!characters)
    return call.exit(
        static_cast<int32_t>(map_bytes_to(*call.locale(), bytes_of(output), room, text, bytes, mode, form)));
  uint8_t work[kWorkBytes];
  const size_t work_bytes = room < kWorkBytes / kWorkBytesPerChar ? room * kWorkBytesPerChar : kWorkBytes;
  size_t mapped = map_bytes_to(*call.locale(), work, work_bytes, text, bytes, mode, form);
  int32_t chars = lx::chars_in_bytes(cp, work, LX_SHIFT_SINGLE, mapped);
  if (chars > size) {
    chars = size;
    mapped = lx::bytes_of_chars(cp, work, LX_SHIFT_SINGLE, chars, mapped);
  }
  memcpy(output, work, mapped);
  return call.exit(chars);
}

LXUChar mapped_alone(LXLocale* given, LXUChar u, uint16_t (*map)(uint16_t)) {
  LXLocale* locale = lx::locale_of(given);
  if (locale != nullptr) locale->last_error = LX_OK;
  return map(u);
}

int32_t store_code_bytes(char* output, LXWChar code) {
  const uint32_t stored = lx::without_zero_bytes(code);
  const size_t count = lx::code_bytes(stored);
  lx::store_code(bytes_of(output), stored, count);
  return static_cast<int32_t>(count);
}

/// Stores a character in its other case. A walk may go beyond a single byte, so it stands in a longer text.
int32_t store_other_case(const Codepage& cp, const char* text, size_t length, char* output, uint32_t mask) {
  uint8_t bytes[lx::kMaxCharBytes] = {};
  memcpy(bytes, text, length);
  const uint32_t code = lx::pack(bytes, length);
  const uint32_t other = lx::other_case(lx::type_record(cp, bytes), code, mask);
  if (other != code && lx::code_bytes(other) <= cp.width) return store_code_bytes(output, other);
  memmove(output, text, length);
  return static_cast<int32_t>(length);
}

}  // namespace

extern "C" {

LXUChar LXUnicodeToLower(LXLocale* locale, LXUChar unicode) {
  return mapped_alone(locale, unicode, lx::unicode_lower);
}

LXUChar LXUnicodeToUpper(LXLocale* locale, LXUChar unicode) {
  return mapped_alone(locale, unicode, lx::unicode_upper);
}

LXUChar LXUnicodeToH2F(LXLocale* locale, LXUChar unicode) {
  return mapped_alone(locale, unicode, lx::unicode_half_to_full);
}

LXUChar LXUnicodeToF2H(LXLocale* locale, LXUChar unicode) {
  return mapped_alone(locale, unicode, lx::unicode_full_to_half);
}

LXWChar LXCpMbCaseConvW(const LXObject* codepage, LXWChar code, uint32_t mask) {
  if (!lx::initialized()) return code;
  return lx::other_case(lx::type_record_of_code(codepage_of(*codepage), code), code, mask);
}

int32_t LXCpMbCaseConv(const LXObject* codepage, const char* text, char* output, uint32_t mask) {
  if (!lx::initialized()) return 0;
  const Codepage& cp = codepage_of(*codepage);
  return store_other_case(cp, text, cp.length(bytes_of(text)[0]), output, mask);
}

int32_t LXCpMbCaseConvS(const LXObject* codepage, const char* text, char* output, uint32_t mask) {
  if (!lx::initialized()) return 0;
  const Codepage& cp = codepage_of(*codepage);
  return store_other_case(cp, text, cp.width, output, mask);
}

LXWChar LXCpMbHalfToFullW(const LXObject* codepage, LXWChar code) {
  return lx::initialized() ? WidthTables(codepage_of(*codepage)).to_full(code) : 0;
}

LXWChar LXCpFullToHalfW(const LXObject* codepage, LXWChar code) {
  return lx::initialized() ? WidthTables(codepage_of(*codepage)).to_half(code) : 0;
}

int32_t LXMapString(LXLocale* locale, char* output, int32_t size, const char* input, int32_t length,
                    uint32_t mode) {
  return map_bytes(locale, output, size, input, length, mode, Form::kPlain);
}

int32_t LXMapStringEx(LXLocale* locale, char* output, int32_t size, const char* input, int32_t length,
                      uint32_t mode) {
  return map_bytes(locale, output, size, input, length, mode, Form::kEx);
}

int32_t LXMapStringW(LXLocale* locale, LXWChar* output, int32_t size, const LXWChar* input, int32_t length,
                     uint32_t mode) {
  Call call(unit, locale);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, -1);
  Mode parsed;
  if (!parse_mode(mode, &parsed)) return call.fail(LX_E_INVALID, -1);
  if (size < 1 || length == 0) return call.exit(0);
  if (parsed.kind == Kind::kCopy) {
    const lx::Copied copied = lx::whole_units(input, length, size);
    memmove(output, input, copied.units * sizeof(LXWChar));
    return call.exit(static_cast<int32_t>(copied.units));
  }
  const size_t codes = length < 0 ? lx::units_with_null(input) : static_cast<size_t>(length);
  const LXWChar* const end = map_codepage(CodeText{codepage_of(call.codepage()), input, input + codes, output,
                                                   lx::end_of(output, static_cast<size_t>(size))},
                                          SpecialFilter(*call.locale()->language, parsed), parsed);
  return call.exit(static_cast<int32_t>(end - output));
}

int32_t LXMapStringU(LXLocale* locale, LXUChar* output, int32_t size, const LXUChar* input, int32_t length,
                     uint32_t mode) {
  Call call(unit, locale);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, -1);
  Mode parsed{Kind::kCopy, false, false};
  if ((mode & ~uint32_t{LX_CHARACTERS}) != 0 && !parse_mode(mode, &parsed)) return call.fail(LX_E_INVALID, -1);
  if (size < 1 || length == 0) return call.exit(0);
  if (parsed.kind == Kind::kCopy) {
    const lx::Copied copied = lx::whole_units(input, length, size);
    memmove(output, input, copied.units * sizeof(LXUChar));
    return call.exit(static_cast<int32_t>(copied.units));
  }
  const size_t units = length < 0 ? lx::units_with_null(input) : static_cast<size_t>(length);
  UnicodeText text{input, input + units, output, lx::end_of(output, static_cast<size_t>(size))};
  map_unicode(text, SpecialFilter(*call.locale()->language, parsed), parsed);
  return call.exit(static_cast<int32_t>(text.out - output));
}

}  // extern "C"
