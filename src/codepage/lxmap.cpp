// Mapping of text to upper and lower case, to full and half width, to ASCII digits. One loop for all kinds of
// text: a text gives one character after the other and takes the mapped ones. What a character maps to is said
// twice: by the fixed rules of Unicode, and by the tables of a codepage.
#include "codepage/lxmapruns.h"
#include "codepage/lxprimitive.h"
#include "codepage/lxunicode.h"
#include "codepage/lxwidth.h"
#include "core/lxcall.h"

using namespace lx;

namespace {

namespace fmt = format::codepage;

RAS1_Unit unit = RAS1_UNIT("lxmap");

constexpr size_t kWorkBytes = 512;  // mapped in character mode, at most
constexpr size_t kWorkBytesPerChar = 6;

enum class Kind { kCase, kFullWidth, kHalfWidth, kCopy, kDigits };

struct Mode {
  Kind kind;
  bool upper;
  bool specials;
};

constexpr struct {
  uint32_t given;
  Mode mode;
} kModes[] = {
    {LX_MAP_UPPER, {Kind::kCase, true, true}},
    {LX_MAP_LOWER, {Kind::kCase, false, true}},
    {LX_MAP_UPPER_SIMPLE, {Kind::kCase, true, false}},
    {LX_MAP_LOWER_SIMPLE, {Kind::kCase, false, false}},
    {LX_MAP_FULL_WIDTH, {Kind::kFullWidth, false, false}},
    {LX_MAP_HALF_WIDTH, {Kind::kHalfWidth, false, false}},
    {LX_MAP_DIGITS, {Kind::kDigits, false, false}},
    {LX_MAP_COPY, {Kind::kCopy, false, false}},
};

/// False for a mode that is not listed.
bool parse_mode(uint32_t given, Mode* mode) {
  for (const auto& row : kModes) {
    if (row.given != (given & ~uint32_t{LX_CHARACTERS})) continue;
    *mode = row.mode;
    return true;
  }
  return false;
}

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
      *mapped = kCaseTables[mode.upper].other(c.u);
    } else if constexpr (kKind == Kind::kFullWidth) {
      *mapped = unicode_half_to_full(c.u);
    } else if constexpr (kKind == Kind::kHalfWidth) {
      *mapped = unicode_full_to_half(c.u);
    } else {
      *mapped = digit_of(c.u);
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
  using Value = LXWChar;

  uint16_t unicode(const ByteChar& c) const {
    return c.length == 1 ? cp.unicode[*c.p] : multibyte_unicode(cp, c.p);
  }
  LXWChar value(uint16_t u) const { return unicode_to_code(cp, u); }
  bool alone(const ByteChar& c, LXWChar* mapped) const {
    if constexpr (kKind == Kind::kCase) {
      if (c.length == 1) {
        *mapped = table[*c.p];
        return true;
      }
      if (cp.caseless[*c.p] != 0) return false;
      const uint8_t* record = type_record(cp, c.p);  // none where the codepage has no such codes
      if (record == nullptr) return false;
      const auto type = format::codepage::TypeRecord::read(record);
      if ((type.type & mask) == 0) return false;
      *mapped = pack(c.p, c.length) + type.case_delta;
      return code_bytes(*mapped) <= cp.width;
    } else if constexpr (kKind == Kind::kFullWidth) {
      *mapped = c.length == 1 ? widths.full_of_byte(*c.p) : widths.to_full(pack(c.p, c.length));
    } else if constexpr (kKind == Kind::kHalfWidth) {
      *mapped = widths.to_half(pack(c.p, c.length));
    } else {
      const uint16_t digit = digit_of(unicode(c));
      *mapped = digit != 0 ? unicode_to_code(cp, digit) : 0;
    }
    return *mapped != 0;
  }
};

/// The results for the character just taken, or for it and the next one, which is then taken too: how many.
template <class Text, class Mapper>
int32_t find_special(Text* text, const Mapper& mapper, const Specials& specials, typename Text::Char* c,
                     LXUChar results[2]) {
  const uint16_t u = mapper.unicode(*c);
  int32_t count = specials.find(u, 0, &results[0], &results[1]);
  if (count != 0) return count;
  typename Text::Cursor ahead(text->in);
  typename Text::Char next;
  if (!Text::take_from(ahead, &next)) return 0;
  count = specials.find(u, mapper.unicode(next), &results[0], &results[1]);
  if (count != 0) text->skip_to(ahead, next, c);
  return count;
}

/// Maps up to the end, a cut character, or the first one that does not fit.
template <class Text, class Mapper>
void map_all(Text& text, const Mapper& mapper, const SpecialFilter& filter, const Runs& runs) {
  const bool special = filter.any();
  for (;;) {
    if constexpr (Text::kRuns && Mapper::kCase) {
      if constexpr (std::is_same_v<Text, LeadByteText>)
        if (most_units(text) >= runs.utf8_from) map_utf8(text, runs, filter);
      if (text.in.p != text.in.end && *text.in.p < runs.below) map_run(text, runs, filter);
      if (map_rest(text, runs, filter)) continue;
    }
    typename Text::Char c;
    if (!text.take(&c)) break;
    bool written = true;
    LXUChar results[2];
    const bool maybe = special && filter.may_begin(mapper.unicode(c));
    const int32_t count = maybe ? find_special(&text, mapper, filter.specials(), &c, results) : 0;
    if (count != 0) {
      written = text.put(mapper.value(results[0]), c);
      if (written) text.note_written(&c);
      if (count == 2) written = written && text.put(mapper.value(results[1]), c);
    } else {
      typename Mapper::Value value{};
      written = mapper.alone(c, &value) ? text.put(value, c) : text.copy(c);
    }
    if (!written) {
      if constexpr (Mapper::kCase) text.pass_before();
      text.in.p = text.in.end;  // nothing that follows is passed through
      break;
    }
    text.note_written(&c);
  }
  text.finish();
}

/// Maps a text by the mapper of a kind, which is made of `parts`: where the output ends.
template <template <Kind> class Mapper, class Text, class... Parts>
auto map_by_kind(Text text, const Mode& mode, const SpecialFilter& filter, const Runs& runs,
                 const Parts&... parts) {
  if (mode.kind == Kind::kCase)
    map_all(text, Mapper<Kind::kCase>{parts...}, filter, runs);
  else if (mode.kind == Kind::kFullWidth)
    map_all(text, Mapper<Kind::kFullWidth>{parts...}, filter, runs);
  else if (mode.kind == Kind::kHalfWidth)
    map_all(text, Mapper<Kind::kHalfWidth>{parts...}, filter, runs);
  else
    map_all(text, Mapper<Kind::kDigits>{parts...}, filter, runs);
  return text.out.p;
}

template <class Text>
auto map_codepage(const Text& text, const SpecialFilter& filter, const Mode& mode) {
  const Codepage& cp = text.in.cp;
  Runs runs{};
  if constexpr (Text::kRuns)
    if (mode.kind == Kind::kCase) runs = runs_of(text, filter, mode.upper);
  const uint8_t* const table = cp.payload + (mode.upper ? fmt::kUpper : fmt::kLower);
  const uint32_t mask = mode.upper ? LX_C1_LOWER : LX_C1_UPPER;
  return map_by_kind<CodepageMapper>(text, mode, filter, runs, cp, table, mask, WidthTables(cp));
}

/// Maps to `size` units: the units written.
template <class Unit>
size_t map_to(const LXLocale& locale, Form form, Unit* output, size_t size, const Unit* input, size_t units,
              const Mode& mode) {
  const Codepage& cp = codepage_of(*locale.codepage);
  const SpecialFilter filter(*locale.language, mode.specials, mode.upper);
  const Unit* const end = input + units;
  Unit* const out_end = end_of(output, size);
  if constexpr (std::is_same_v<Unit, LXUChar>) {
    const UnicodeText text{{input, end}, {output, out_end}};
    return room(output,
                map_by_kind<UnicodeMapper>(text, mode, filter, runs_of(text, filter, mode.upper), mode));
  } else if constexpr (std::is_same_v<Unit, LXWChar>) {
    return room(output, map_codepage(WideText{{cp, input, end}, {cp, output, out_end}}, filter, mode));
  } else if (form == Form::kEx && cp.shift_sensitive) {
    const ShiftText text{{cp, input, end, LX_SHIFT_SINGLE}, {cp, output, out_end, LX_SHIFT_SINGLE}};
    return room(output, map_codepage(text, filter, mode));
  } else {
    return room(output, map_codepage(LeadByteText{{cp, input, end}, {cp, output, out_end}}, filter, mode));
  }
}

template <class Unit>
int32_t map_text(LXLocale* given, Form form, Unit* output, int32_t size, const Text<Unit>& text,
                 uint32_t given_mode) {
  Call call(unit, given);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, -1);
  const LXLocale& locale = *call.locale();
  const Codepage& cp = codepage_of(*locale.codepage);
  Mode mode{Kind::kCopy, false, false};
  const bool no_mode = std::is_same_v<Unit, LXUChar> && (given_mode & ~uint32_t{LX_CHARACTERS}) == 0;
  if (!no_mode && !parse_mode(given_mode, &mode)) return call.fail(LX_E_INVALID, -1);
  if (size < 1 || text.length == 0) return call.exit(0);
  const bool characters = sizeof(Unit) == 1 && (given_mode & LX_CHARACTERS) != 0;
  if (mode.kind == Kind::kCopy) {
    const Part copied = part_that_fits(cp, form, text, size, characters);
    memmove(output, text.p, copied.units * sizeof(Unit));
    return call.exit(static_cast<int32_t>(characters ? copied.chars : copied.units));
  }
  const size_t units = units_of(cp, text, characters) + (text.length < 0 ? 1 : 0);
  const size_t room = static_cast<size_t>(size);
  if constexpr (sizeof(Unit) == 1) {
    if (characters) {
      uint8_t work[kWorkBytes];
      const size_t bytes = room < kWorkBytes / kWorkBytesPerChar ? room * kWorkBytesPerChar : kWorkBytes;
      size_t mapped = map_to(locale, form, work, bytes, text.p, units, mode);
      int32_t chars = chars_in_bytes(cp, work, LX_SHIFT_SINGLE, mapped);
      if (chars > size) {
        chars = size;
        mapped = bytes_of_chars(cp, work, LX_SHIFT_SINGLE, chars, mapped);
      }
      memcpy(output, work, mapped);
      return call.exit(chars);
    }
  }
  return call.exit(static_cast<int32_t>(map_to(locale, form, output, room, text.p, units, mode)));
}

LXUChar mapped_alone(LXLocale* locale, LXUChar u, uint16_t (*map)(uint16_t)) {
  const Primitive in(locale);
  return map(u);
}

/// Stores a character in its other case. A walk may go beyond a single byte, so it stands in a longer text.
int32_t store_other_case(const Codepage& cp, const char* text, size_t length, char* output, uint32_t mask) {
  uint8_t bytes[kMaxCharBytes] = {};
  memcpy(bytes, text, length);
  const uint32_t code = pack(bytes, length);
  const uint32_t other = other_case(type_record(cp, bytes), code, mask);
  if (other != code && code_bytes(other) <= cp.width)
    return static_cast<int32_t>(store_packed(bytes_of(output), other));
  memmove(output, text, length);
  return static_cast<int32_t>(length);
}

}  // namespace

extern "C" {

LXUChar LXUnicodeToLower(LXLocale* locale, LXUChar unicode) {
  return mapped_alone(locale, unicode, unicode_lower);
}

LXUChar LXUnicodeToUpper(LXLocale* locale, LXUChar unicode) {
  return mapped_alone(locale, unicode, unicode_upper);
}

LXUChar LXUnicodeToH2F(LXLocale* locale, LXUChar unicode) {
  return mapped_alone(locale, unicode, unicode_half_to_full);
}

LXUChar LXUnicodeToF2H(LXLocale* locale, LXUChar unicode) {
  return mapped_alone(locale, unicode, unicode_full_to_half);
}

LXWChar LXCpMbCaseConvW(const LXObject* codepage, LXWChar code, uint32_t mask) {
  if (!initialized()) return code;
  return other_case(type_record_of_code(codepage_of(*codepage), code), code, mask);
}

int32_t LXCpMbCaseConv(const LXObject* codepage, const char* text, char* output, uint32_t mask) {
  if (!initialized()) return 0;
  const Codepage& cp = codepage_of(*codepage);
  return store_other_case(cp, text, cp.length(bytes_of(text)[0]), output, mask);
}

int32_t LXCpMbCaseConvS(const LXObject* codepage, const char* text, char* output, uint32_t mask) {
  if (!initialized()) return 0;
  const Codepage& cp = codepage_of(*codepage);
  return store_other_case(cp, text, cp.width, output, mask);
}

LXWChar LXCpMbHalfToFullW(const LXObject* codepage, LXWChar code) {
  return initialized() ? WidthTables(codepage_of(*codepage)).to_full(code) : 0;
}

LXWChar LXCpFullToHalfW(const LXObject* codepage, LXWChar code) {
  return initialized() ? WidthTables(codepage_of(*codepage)).to_half(code) : 0;
}

int32_t LXMapString(LXLocale* locale, char* output, int32_t size, const char* input, int32_t length,
                    uint32_t mode) {
  return map_text(locale, Form::kPlain, bytes_of(output), size, text_of(input, length), mode);
}

int32_t LXMapStringEx(LXLocale* locale, char* output, int32_t size, const char* input, int32_t length,
                      uint32_t mode) {
  return map_text(locale, Form::kEx, bytes_of(output), size, text_of(input, length), mode);
}

int32_t LXMapStringW(LXLocale* locale, LXWChar* output, int32_t size, const LXWChar* input, int32_t length,
                     uint32_t mode) {
  return map_text(locale, Form::kWide, output, size, text_of(input, length), mode);
}

int32_t LXMapStringU(LXLocale* locale, LXUChar* output, int32_t size, const LXUChar* input, int32_t length,
                     uint32_t mode) {
  return map_text(locale, Form::kUnicode, output, size, text_of(input, length), mode);
}

}  // extern "C"
